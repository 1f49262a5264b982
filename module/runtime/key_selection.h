// The instance's key selection: root key, current key path and registry view.
#pragma once

#include "record.h"

const DWORD RootKeyCount = 5;

struct RootKey {
    const WCHAR* name;
    HKEY handle;
    size_t length;  // characters of the name
};

// The five predefined roots, in index order; the names end with a null entry.
extern const RootKey RootKeyTable[RootKeyCount + 1];

// The root index stored in a RootKeyParam record (any value; callers compare it with 5).
DWORD RootIndexOf(const RootKeyParam* param);

// Index of the root whose display name equals `name` ignoring case, or RootKeyCount if none.
DWORD RootKeyByName(const WCHAR* name);

// The access masks of every registry open and create, with the instance's view added.
REGSAM ReadAccess(const RunObjectData* instance);
REGSAM WriteAccess(const RunObjectData* instance);
