// What the registry routines share: the key an operation works on and the outcome protocol.
#pragma once

#include "../runtime/error_state.h"
#include "../runtime/host_services.h"
#include "../runtime/key_selection.h"

// The instance's current key under its current root, when it has a usable one.
inline bool CurrentKeyIsUsable(const RunObjectData* instance) {
    return instance->currentKey && instance->rootKeyIndex < RootKeyCount;
}

inline HKEY CurrentRoot(const RunObjectData* instance) {
    return RootKeyTable[instance->rootKeyIndex].handle;
}

inline const WCHAR* Text(HostValue value) { return reinterpret_cast<const WCHAR*>(value); }

inline const RootKeyParam* RootParam(HostValue value) {
    return reinterpret_cast<const RootKeyParam*>(value);
}
