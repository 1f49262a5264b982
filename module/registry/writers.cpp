// Actions that create keys and write DWORD and string values. The key is created when missing
// and opened when present; lastError takes the create's code, then the write's.
#include <wchar.h>

#include "../runtime/routines.h"
#include "registry_access.h"

namespace {

// What to write once the key is open; returns the write's result.
typedef LONG (*ValueWrite)(HKEY key, const WCHAR* name, HostValue value);

LONG WriteDword(HKEY key, const WCHAR* name, HostValue value) {
    DWORD data = static_cast<DWORD>(value);
    return RegSetValueExW(key, name, 0, REG_DWORD, reinterpret_cast<const BYTE*>(&data),
                          sizeof(data));
}

// Keeps the type of an existing REG_SZ or REG_EXPAND_SZ value; anything else becomes REG_SZ.
LONG WriteString(HKEY key, const WCHAR* name, HostValue value) {
    const WCHAR* text = Text(value);
    DWORD type = REG_SZ, size = 0;
    RegQueryValueExW(key, name, nullptr, &type, nullptr, &size);
    if (type != REG_SZ && type != REG_EXPAND_SZ) type = REG_SZ;
    DWORD count = static_cast<DWORD>(wcslen(text)) + 1;
    return RegSetValueExW(key, name, 0, type, reinterpret_cast<const BYTE*>(text),
                          count * sizeof(WCHAR));
}

// Creates or opens the key with write access and, if given, writes one value into it.
void CreateAndWrite(RunObjectData* instance, HKEY root, const WCHAR* path, ValueWrite write,
                    const WCHAR* name, HostValue value) {
    HKEY key;
    LONG result = RegCreateKeyExW(root, path, 0, nullptr, 0, WriteAccess(instance), nullptr, &key,
                                  nullptr);
    instance->lastError = static_cast<DWORD>(result);
    if (result != ERROR_SUCCESS) return;
    if (write) instance->lastError = static_cast<DWORD>(write(key, name, value));
    RegCloseKey(key);
}

void WriteToCurrentKey(RunObjectData* instance, ValueWrite write, const WCHAR* name,
                       HostValue value) {
    CreateAndWrite(instance, CurrentRoot(instance), instance->currentKey, write, name, value);
}

void WriteToRootOf(RunObjectData* instance, const RootKeyParam* param, const WCHAR* path,
                   ValueWrite write, const WCHAR* name, HostValue value) {
    CreateAndWrite(instance, RootKeyTable[RootIndexOf(param)].handle, path, write, name, value);
}

}  // namespace

short WINAPI ActSetCurrentDword(RunObjectData* instance, HostValue valueName, HostValue value) {
    const WCHAR* name = Text(valueName);
    instance->lastError = ERR_INVALID_PARAMETERS;
    if (!instance->currentKey || !name || instance->rootKeyIndex >= RootKeyCount) return 0;
    WriteToCurrentKey(instance, WriteDword, name, value);
    return 0;
}

short WINAPI ActSetCurrentString(RunObjectData* instance, HostValue valueName, HostValue text) {
    const WCHAR* name = Text(valueName);
    instance->lastError = ERR_INVALID_PARAMETERS;
    if (!instance->currentKey || !name || !Text(text) ||
        instance->rootKeyIndex >= RootKeyCount)
        return 0;
    WriteToCurrentKey(instance, WriteString, name, text);
    return 0;
}

short WINAPI ActSetDword(RunObjectData* instance, HostValue, HostValue) {
    const RootKeyParam* param = RootParam(NextParameter(instance));
    const WCHAR* path = Text(NextParameter(instance));
    const WCHAR* name = Text(NextParameter(instance));
    HostValue value = NextParameter(instance);
    instance->lastError = ERR_INVALID_PARAMETERS;
    if (!param || !path || !name || RootIndexOf(param) >= RootKeyCount) return 0;
    WriteToRootOf(instance, param, path, WriteDword, name, value);
    return 0;
}

short WINAPI ActSetString(RunObjectData* instance, HostValue, HostValue) {
    const RootKeyParam* param = RootParam(NextParameter(instance));
    const WCHAR* path = Text(NextParameter(instance));
    const WCHAR* name = Text(NextParameter(instance));
    HostValue text = NextParameter(instance);
    instance->lastError = ERR_INVALID_PARAMETERS;
    if (!param || !path || !name || !Text(text) || RootIndexOf(param) >= RootKeyCount) return 0;
    WriteToRootOf(instance, param, path, WriteString, name, text);
    return 0;
}

short WINAPI ActCreateCurrentKey(RunObjectData* instance, HostValue, HostValue) {
    instance->lastError = ERR_INVALID_PARAMETERS;
    if (!CurrentKeyIsUsable(instance)) return 0;
    WriteToCurrentKey(instance, nullptr, nullptr, 0);
    return 0;
}

short WINAPI ActCreateKey(RunObjectData* instance, HostValue, HostValue) {
    const RootKeyParam* param = RootParam(NextParameter(instance));
    const WCHAR* path = Text(NextParameter(instance));
    instance->lastError = ERR_INVALID_PARAMETERS;
    if (!param || !path || RootIndexOf(param) >= RootKeyCount) return 0;
    WriteToRootOf(instance, param, path, nullptr, nullptr, 0);
    return 0;
}
