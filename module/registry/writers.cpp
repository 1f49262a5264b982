// Actions that create keys and write DWORD and string values. The key is created when missing
// and opened when present; lastError takes the create's code, then the write's.
#include <wchar.h>

#include "../runtime/routines.h"
#include "key_access.h"

namespace {

LONG WriteDword(HKEY key, const WCHAR* name, HostValue value) {
    DWORD data = static_cast<DWORD>(value);
    return RegSetValueExW(key, name, 0, REG_DWORD, reinterpret_cast<const BYTE*>(&data),
                          sizeof(data));
}

// Keeps the type of an existing REG_SZ or REG_EXPAND_SZ value; anything else becomes REG_SZ.
LONG WriteString(HKEY key, const WCHAR* name, const WCHAR* text) {
    DWORD type = REG_SZ, size = 0;
    RegQueryValueExW(key, name, nullptr, &type, nullptr, &size);
    if (type != REG_SZ && type != REG_EXPAND_SZ) type = REG_SZ;
    DWORD count = static_cast<DWORD>(wcslen(text)) + 1;
    return RegSetValueExW(key, name, 0, type, reinterpret_cast<const BYTE*>(text),
                          count * sizeof(WCHAR));
}

// Records the write's result and closes the key, whatever the write gave.
void Finish(RunObjectData* instance, const TargetKey& key, LONG written) {
    instance->lastError = static_cast<DWORD>(written);
    RegCloseKey(key.handle);
}

}  // namespace

short WINAPI ActSetCurrentDword(RunObjectData* instance, HostValue valueName, HostValue value) {
    const WCHAR* name = Text(valueName);
    TargetKey key;
    if (ReachCurrentKey(instance, KeyUse::Write, &key, name != nullptr))
        Finish(instance, key, WriteDword(key.handle, name, value));
    return 0;
}

short WINAPI ActSetCurrentString(RunObjectData* instance, HostValue valueName, HostValue text) {
    const WCHAR* name = Text(valueName);
    TargetKey key;
    if (ReachCurrentKey(instance, KeyUse::Write, &key, name && Text(text)))
        Finish(instance, key, WriteString(key.handle, name, Text(text)));
    return 0;
}

short WINAPI ActSetDword(RunObjectData* instance, HostValue, HostValue) {
    HostValue rootKey = NextParameter(instance);
    HostValue keyPath = NextParameter(instance);
    const WCHAR* name = Text(NextParameter(instance));
    HostValue value = NextParameter(instance);
    TargetKey key;
    if (ReachNamedKey(instance, KeyUse::Write, rootKey, keyPath, &key, name != nullptr))
        Finish(instance, key, WriteDword(key.handle, name, value));
    return 0;
}

short WINAPI ActSetString(RunObjectData* instance, HostValue, HostValue) {
    HostValue rootKey = NextParameter(instance);
    HostValue keyPath = NextParameter(instance);
    const WCHAR* name = Text(NextParameter(instance));
    const WCHAR* text = Text(NextParameter(instance));
    TargetKey key;
    if (ReachNamedKey(instance, KeyUse::Write, rootKey, keyPath, &key, name && text))
        Finish(instance, key, WriteString(key.handle, name, text));
    return 0;
}

// Creating a key alone leaves lastError with the create's result.
short WINAPI ActCreateCurrentKey(RunObjectData* instance, HostValue, HostValue) {
    TargetKey key;
    if (ReachCurrentKey(instance, KeyUse::Write, &key)) RegCloseKey(key.handle);
    return 0;
}

short WINAPI ActCreateKey(RunObjectData* instance, HostValue, HostValue) {
    HostValue rootKey = NextParameter(instance);
    HostValue keyPath = NextParameter(instance);
    TargetKey key;
    if (ReachNamedKey(instance, KeyUse::Write, rootKey, keyPath, &key)) RegCloseKey(key.handle);
    return 0;
}
