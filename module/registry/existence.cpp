// Conditions that tell whether a key or a value exists. They only read: every failure, access
// denied included, counts as absence, and lastError is never touched.
#include "../runtime/routines.h"
#include "key_access.h"

namespace {

// Asks only whether the value is there (no data buffer, whatever its type and size), then
// closes the key.
bool ValueIsThere(HKEY key, const WCHAR* name) {
    DWORD type, size;
    LONG result = RegQueryValueExW(key, name, nullptr, &type, nullptr, &size);
    RegCloseKey(key);
    return result == ERROR_SUCCESS;
}

}  // namespace

LONG WINAPI CndKeyExists(RunObjectData* instance, HostValue rootKey, HostValue keyPath) {
    TargetKey key;
    if (!ReachNamedKey(instance, KeyUse::Test, rootKey, keyPath, &key)) return 0;
    RegCloseKey(key.handle);
    return 1;
}

LONG WINAPI CndValueExists(RunObjectData* instance, HostValue, HostValue) {
    HostValue rootKey = NextParameter(instance);
    HostValue keyPath = NextParameter(instance);
    const WCHAR* name = Text(NextParameter(instance));
    TargetKey key;
    if (!ReachNamedKey(instance, KeyUse::Test, rootKey, keyPath, &key, name != nullptr)) return 0;
    return ValueIsThere(key.handle, name) ? 1 : 0;
}

LONG WINAPI CndCurrentKeyExists(RunObjectData* instance, HostValue, HostValue) {
    TargetKey key;
    if (!ReachCurrentKey(instance, KeyUse::Test, &key)) return 0;
    RegCloseKey(key.handle);
    return 1;
}

LONG WINAPI CndCurrentValueExists(RunObjectData* instance, HostValue valueName, HostValue) {
    const WCHAR* name = Text(valueName);
    TargetKey key;
    if (!ReachCurrentKey(instance, KeyUse::Test, &key, name != nullptr)) return 0;
    return ValueIsThere(key.handle, name) ? 1 : 0;
}
