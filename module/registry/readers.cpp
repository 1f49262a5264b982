// Expressions that read one DWORD or string value, from the current key or from a key named
// by root-key name and path. The outcome is left in lastError; a failed read gives 0 or an
// empty text.
#include <string.h>

#include "../runtime/routines.h"
#include "registry_access.h"

namespace {

// Opens the key for reading; lastError takes the open's result.
bool OpenForReading(RunObjectData* instance, HKEY root, const WCHAR* path, HKEY* key) {
    instance->lastError = static_cast<DWORD>(
        RegOpenKeyExW(root, path, 0, ReadAccess(instance), key));
    return instance->lastError == ERROR_SUCCESS;
}

// A value shorter than four bytes leaves the high bytes of the result zero, not undefined.
LONG ReadDword(RunObjectData* instance, HKEY root, const WCHAR* path, const WCHAR* name) {
    HKEY key;
    if (!OpenForReading(instance, root, path, &key)) return 0;
    DWORD value = 0, type = 0, size = sizeof(value);
    LONG result = RegQueryValueExW(key, name, nullptr, &type, reinterpret_cast<BYTE*>(&value),
                                   &size);
    instance->lastError = static_cast<DWORD>(result);
    DWORD read = 0;
    if (result == ERROR_SUCCESS) {
        if (type == REG_DWORD)
            read = value;
        else
            instance->lastError = ERR_NOT_DWORD;
    }
    RegCloseKey(key);
    return static_cast<LONG>(read);
}

// Reads the value into a buffer lent by the host. The stored text may lack its terminator or
// have an odd size, so a zero character is put right after the data read: the result always
// ends inside the lent buffer.
const WCHAR* ReadStringFromKey(RunObjectData* instance, HKEY key, const WCHAR* name) {
    DWORD type = 0, size = 0;
    LONG result = RegQueryValueExW(key, name, nullptr, &type, nullptr, &size);
    instance->lastError = static_cast<DWORD>(result);
    if (result != ERROR_SUCCESS) return EmptyString;
    if (type != REG_SZ && type != REG_EXPAND_SZ) {
        instance->lastError = ERR_NOT_STRING;
        return EmptyString;
    }
    // A size the host's buffer request cannot express is treated like a refused buffer.
    if (size == 0 || size > 0x3FFFFFFF) return EmptyString;
    LPWSTR buffer = BorrowStringBuffer(instance, static_cast<int>(2 * size + 2));
    if (!buffer) return EmptyString;
    DWORD read = size;
    result = RegQueryValueExW(key, name, nullptr, &type, reinterpret_cast<BYTE*>(buffer), &read);
    instance->lastError = static_cast<DWORD>(result);
    if (result != ERROR_SUCCESS) {
        buffer[0] = 0;
    } else {
        DWORD end = read < size ? read : size;
        memset(reinterpret_cast<BYTE*>(buffer) + end, 0, (end & 1) + sizeof(WCHAR));
    }
    return buffer;
}

HostValue ReadString(RunObjectData* instance, HKEY root, const WCHAR* path, const WCHAR* name) {
    HKEY key;
    if (!OpenForReading(instance, root, path, &key)) return TextResult(instance, EmptyString);
    const WCHAR* text = ReadStringFromKey(instance, key, name);
    RegCloseKey(key);
    return TextResult(instance, text);
}

// The named-key readers' arguments, all fetched before anything is tested.
struct NamedKey {
    const WCHAR* rootName;
    const WCHAR* path;
    const WCHAR* name;
    DWORD index;
};

NamedKey FetchNamedKey(RunObjectData* instance, HostValue hostValue) {
    NamedKey k;
    k.rootName = Text(FirstExpressionParameter(instance, hostValue));
    k.path = Text(NextExpressionParameter(instance, hostValue));
    k.name = Text(NextExpressionParameter(instance, hostValue));
    k.index = RootKeyCount;
    return k;
}

// Checks in the readers' order: root name present, root name known, then path and value name.
bool NamedKeyIsUsable(NamedKey* k) {
    if (!k->rootName) return false;
    k->index = RootKeyByName(k->rootName);
    if (k->index >= RootKeyCount) return false;
    return k->path && k->name;
}

bool CurrentValueIsUsable(const RunObjectData* instance, const WCHAR* name) {
    return instance->currentKey && name && instance->rootKeyIndex < RootKeyCount;
}

}  // namespace

HostValue WINAPI ExpGetCurrentDword(RunObjectData* instance, HostValue hostValue) {
    const WCHAR* name = Text(FirstExpressionParameter(instance, hostValue));
    instance->lastError = ERR_INVALID_PARAMETERS;
    if (!CurrentValueIsUsable(instance, name)) return 0;
    return ReadDword(instance, CurrentRoot(instance), instance->currentKey, name);
}

HostValue WINAPI ExpGetCurrentString(RunObjectData* instance, HostValue hostValue) {
    const WCHAR* name = Text(FirstExpressionParameter(instance, hostValue));
    instance->lastError = ERR_INVALID_PARAMETERS;
    if (!CurrentValueIsUsable(instance, name)) return TextResult(instance, EmptyString);
    return ReadString(instance, CurrentRoot(instance), instance->currentKey, name);
}

HostValue WINAPI ExpGetDword(RunObjectData* instance, HostValue hostValue) {
    NamedKey k = FetchNamedKey(instance, hostValue);
    instance->lastError = ERR_INVALID_PARAMETERS;
    if (!NamedKeyIsUsable(&k)) return 0;
    return ReadDword(instance, RootKeyTable[k.index].handle, k.path, k.name);
}

HostValue WINAPI ExpGetString(RunObjectData* instance, HostValue hostValue) {
    NamedKey k = FetchNamedKey(instance, hostValue);
    instance->lastError = ERR_INVALID_PARAMETERS;
    if (!NamedKeyIsUsable(&k)) return TextResult(instance, EmptyString);
    return ReadString(instance, RootKeyTable[k.index].handle, k.path, k.name);
}
