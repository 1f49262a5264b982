#include "key_selection.h"

#include <stdlib.h>
#include <string.h>
#include <wchar.h>

#include "error_state.h"
#include "host_services.h"
#include "routines.h"

#define ROOT(name) {TEXT(#name), name, sizeof(#name) - 1}
const RootKey RootKeyTable[RootKeyCount + 1] = {
    ROOT(HKEY_CLASSES_ROOT),   ROOT(HKEY_LOCAL_MACHINE), ROOT(HKEY_CURRENT_USER),
    ROOT(HKEY_CURRENT_CONFIG), ROOT(HKEY_USERS),         {nullptr, nullptr, 0},
};
#undef ROOT

const RootKey* RootKeyAt(DWORD index) {
    return index < RootKeyCount ? &RootKeyTable[index] : nullptr;
}

const WCHAR* RootNameAt(DWORD index) {
    const RootKey* root = RootKeyAt(index);
    return root ? root->name : EmptyString;
}

DWORD LoadRootIndex(const BYTE* field) {
    return static_cast<DWORD>(field[0]) | static_cast<DWORD>(field[1]) << 8 |
           static_cast<DWORD>(field[2]) << 16 | static_cast<DWORD>(field[3]) << 24;
}

void StoreRootIndex(BYTE* field, DWORD index) {
    for (int i = 0; i < 4; ++i) field[i] = static_cast<BYTE>(index >> (8 * i));
}

// Case folding maps each character to one character, so only a name of the same length can be
// equal: the length test spares the comparison for the other entries, and a long text is never
// read past the longest name.
DWORD RootKeyByName(const WCHAR* name) {
    const size_t longest = sizeof("HKEY_CURRENT_CONFIG") - 1;
    size_t length = 0;
    while (length <= longest && name[length]) ++length;
    DWORD index = 0;
    for (; RootKeyTable[index].name; ++index) {
        if (RootKeyTable[index].length == length && _wcsicmp(name, RootKeyTable[index].name) == 0)
            break;
    }
    return index;
}

short WINAPI ActSetRootKey(RunObjectData* instance, HostValue param, HostValue) {
    instance->lastError = ERR_INVALID_PARAMETERS;
    const auto* record = reinterpret_cast<const RootKeyParam*>(param);
    if (!record) return 0;
    DWORD index = RootIndexOf(record);
    if (!RootKeyAt(index)) return 0;
    instance->lastError = ERROR_SUCCESS;
    instance->rootKeyIndex = index;
    return 0;
}

// The copy is made before the old key is freed, so the text of ExpGetCurrentKey can come back.
// When no copy can be had the old key stays and the failure is reported, not hidden.
short WINAPI ActSetCurrentKey(RunObjectData* instance, HostValue param, HostValue) {
    instance->lastError = ERR_INVALID_PARAMETERS;
    const auto* text = reinterpret_cast<const WCHAR*>(param);
    if (!text) return 0;
    auto* copy = static_cast<WCHAR*>(calloc(wcslen(text) + 1, sizeof(WCHAR)));
    if (!copy) {
        instance->lastError = ERROR_NOT_ENOUGH_MEMORY;
        return 0;
    }
    wcscpy(copy, text);
    free(instance->currentKey);
    instance->currentKey = copy;
    instance->lastError = ERROR_SUCCESS;
    return 0;
}

short WINAPI ActSet64BitMode(RunObjectData* instance, HostValue param, HostValue) {
    instance->use64BitView = static_cast<DWORD>(param) != 0 ? 1 : 0;
    return 0;
}

HostValue WINAPI ExpGetCurrentRootKey(RunObjectData* instance, HostValue) {
    return TextResult(instance, RootNameAt(instance->rootKeyIndex));
}

HostValue WINAPI ExpGetCurrentKey(RunObjectData* instance, HostValue) {
    return TextResult(instance, instance->currentKey ? instance->currentKey : EmptyString);
}
