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

// The root at `index`, or null for an index of 5 or more: a loaded saved state or a
// RootKeyParam record may hold any value, so every use of an index goes through here.
inline const RootKey* RootKeyAt(DWORD index) {
    return index < RootKeyCount ? &RootKeyTable[index] : nullptr;
}

// The root's display name, or EmptyString for an invalid index.
const WCHAR* RootNameAt(DWORD index);

// The root index of a RootKeyParam record: a little-endian u32 at an odd place, read and
// written bytewise.
DWORD LoadRootIndex(const BYTE* field);
void StoreRootIndex(BYTE* field, DWORD index);
inline DWORD RootIndexOf(const RootKeyParam* param) { return LoadRootIndex(param->rootIndex); }

// Index of the root whose display name equals `name` ignoring case, or RootKeyCount if none.
DWORD RootKeyByName(const WCHAR* name);
