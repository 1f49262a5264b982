// Expressions that read one DWORD or string value, from the current key or from a key named
// by root-key name and path. The outcome is left in lastError; a failed read gives 0 or an
// empty text.
#include <string.h>

#include "../runtime/routines.h"
#include "key_access.h"

namespace {

// Reads a DWORD value of the open key, then closes the key. A value shorter than four bytes
// leaves the high bytes of the result zero, not undefined.
LONG ReadDword(RunObjectData* instance, HKEY key, const WCHAR* name) {
    DWORD value = 0, type = 0, size = sizeof(value);
    LONG result =
        RegQueryValueExW(key, name, nullptr, &type, reinterpret_cast<BYTE*>(&value), &size);
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

// Reads a string value of the open key as the expression's text result, then closes the key.
HostValue ReadString(RunObjectData* instance, HKEY key, const WCHAR* name) {
    const WCHAR* text = ReadStringFromKey(instance, key, name);
    RegCloseKey(key);
    return TextResult(instance, text);
}

// The named-key readers' arguments, all fetched before anything is tested.
struct NamedValue {
    const WCHAR* rootName;
    const WCHAR* path;
    const WCHAR* name;
};

NamedValue FetchNamedValue(RunObjectData* instance, HostValue hostValue) {
    NamedValue v;
    v.rootName = Text(FirstExpressionParameter(instance, hostValue));
    v.path = Text(NextExpressionParameter(instance, hostValue));
    v.name = Text(NextExpressionParameter(instance, hostValue));
    return v;
}

bool ReachNamedValue(RunObjectData* instance, const NamedValue& v, TargetKey* key) {
    return ReachKeyByRootName(instance, v.rootName, v.path, key, v.name != nullptr);
}

}  // namespace

HostValue WINAPI ExpGetCurrentDword(RunObjectData* instance, HostValue hostValue) {
    const WCHAR* name = Text(FirstExpressionParameter(instance, hostValue));
    TargetKey key;
    if (!ReachCurrentKey(instance, KeyUse::Read, &key, name != nullptr)) return 0;
    return ReadDword(instance, key.handle, name);
}

HostValue WINAPI ExpGetCurrentString(RunObjectData* instance, HostValue hostValue) {
    const WCHAR* name = Text(FirstExpressionParameter(instance, hostValue));
    TargetKey key;
    if (!ReachCurrentKey(instance, KeyUse::Read, &key, name != nullptr))
        return TextResult(instance, EmptyString);
    return ReadString(instance, key.handle, name);
}

HostValue WINAPI ExpGetDword(RunObjectData* instance, HostValue hostValue) {
    NamedValue v = FetchNamedValue(instance, hostValue);
    TargetKey key;
    if (!ReachNamedValue(instance, v, &key)) return 0;
    return ReadDword(instance, key.handle, v.name);
}

HostValue WINAPI ExpGetString(RunObjectData* instance, HostValue hostValue) {
    NamedValue v = FetchNamedValue(instance, hostValue);
    TargetKey key;
    if (!ReachNamedValue(instance, v, &key)) return TextResult(instance, EmptyString);
    return ReadString(instance, key.handle, v.name);
}
