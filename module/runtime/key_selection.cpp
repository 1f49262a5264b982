#include "key_selection.h"

#include <stdlib.h>
#include <string.h>
#include <wchar.h>

#include "error_state.h"
#include "host_services.h"
#include "routines.h"

#define ROOT(name) \
    { TEXT(#name), name, sizeof(#name) - 1 }
const RootKey RootKeyTable[RootKeyCount + 1] = {
    ROOT(HKEY_CLASSES_ROOT),   ROOT(HKEY_LOCAL_MACHINE), ROOT(HKEY_CURRENT_USER),
    ROOT(HKEY_CURRENT_CONFIG), ROOT(HKEY_USERS),         {nullptr, nullptr, 0},
};
#undef ROOT

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

namespace {

const size_t LongestRootName = sizeof("HKEY_CURRENT_CONFIG") - 1;

// The characters of `name`, counted no further than one past the longest root name. Two at a
// time, which halves the loop's turns: the count is on the path of every named-key reader, and
// one character a turn cost a third of the whole lookup.
size_t BoundedLength(const WCHAR* name) {
    size_t length = 0;
    while (length < LongestRootName && name[length] && name[length + 1]) length += 2;
    while (length <= LongestRootName && name[length]) ++length;
    return length;
}

// True when `name`, of `length` characters, is spelt exactly as the root's name. The last
// characters tell apart the names of equal length, so at most one whole comparison is made.
bool SpeltAs(const WCHAR* name, size_t length, const RootKey& root) {
    return root.length == length && name[length - 1] == root.name[length - 1] &&
           memcmp(name, root.name, length * sizeof(WCHAR)) == 0;
}

}  // namespace

// A name spelt as the table spells it, the usual case (the editor shows the names so,
// ExpGetCurrentRootKey gives them back so), is found without a case-insensitive comparison; it
// cannot equal an earlier entry ignoring case, since no two names do. Any other spelling is
// compared with _wcsicmp. Case folding maps each character to one character, so only a name of
// the same length can be equal, and a long text is never read past the longest name.
DWORD RootKeyByName(const WCHAR* name) {
    size_t length = BoundedLength(name);
    for (DWORD index = 0; index < RootKeyCount; ++index)
        if (SpeltAs(name, length, RootKeyTable[index])) return index;
    for (DWORD index = 0; index < RootKeyCount; ++index) {
        const RootKey& root = RootKeyTable[index];
        if (root.length == length && _wcsicmp(name, root.name) == 0) return index;
    }
    return RootKeyCount;
}

short WINAPI ActSetRootKey(RunObjectData* instance, HostValue param, HostValue) {
    instance->lastError = ERR_INVALID_PARAMETERS;
    const RootKeyParam* record = RootParam(param);
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
    const WCHAR* text = Text(param);
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
