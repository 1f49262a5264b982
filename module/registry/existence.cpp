// Conditions that tell whether a key or a value exists. They only read: every failure, access
// denied included, counts as absence, and lastError is never touched.
#include "../runtime/routines.h"
#include "registry_access.h"

namespace {

bool KeyExists(const RunObjectData* instance, HKEY root, const WCHAR* path) {
    HKEY key;
    if (RegOpenKeyExW(root, path, 0, ReadAccess(instance), &key) != ERROR_SUCCESS) return false;
    RegCloseKey(key);
    return true;
}

// Asks only whether the value is there: no data buffer, whatever its type and size.
bool ValueExists(const RunObjectData* instance, HKEY root, const WCHAR* path, const WCHAR* name) {
    HKEY key;
    if (RegOpenKeyExW(root, path, 0, ReadAccess(instance), &key) != ERROR_SUCCESS) return false;
    DWORD type, size;
    LONG result = RegQueryValueExW(key, name, nullptr, &type, nullptr, &size);
    RegCloseKey(key);
    return result == ERROR_SUCCESS;
}

}  // namespace

LONG WINAPI CndKeyExists(RunObjectData* instance, HostValue rootKey, HostValue keyPath) {
    const RootKeyParam* param = RootParam(rootKey);
    const WCHAR* path = Text(keyPath);
    if (!param || !path) return 0;
    DWORD index = RootIndexOf(param);
    if (index >= RootKeyCount) return 0;
    return KeyExists(instance, RootKeyTable[index].handle, path) ? 1 : 0;
}

LONG WINAPI CndValueExists(RunObjectData* instance, HostValue, HostValue) {
    const RootKeyParam* param = RootParam(NextParameter(instance));
    const WCHAR* path = Text(NextParameter(instance));
    const WCHAR* name = Text(NextParameter(instance));
    if (!param || !path || !name) return 0;
    DWORD index = RootIndexOf(param);
    if (index >= RootKeyCount) return 0;
    return ValueExists(instance, RootKeyTable[index].handle, path, name) ? 1 : 0;
}

LONG WINAPI CndCurrentKeyExists(RunObjectData* instance, HostValue, HostValue) {
    if (!CurrentKeyIsUsable(instance)) return 0;
    return KeyExists(instance, CurrentRoot(instance), instance->currentKey) ? 1 : 0;
}

LONG WINAPI CndCurrentValueExists(RunObjectData* instance, HostValue valueName, HostValue) {
    const WCHAR* name = Text(valueName);
    if (!instance->currentKey || !name || instance->rootKeyIndex >= RootKeyCount) return 0;
    return ValueExists(instance, CurrentRoot(instance), instance->currentKey, name) ? 1 : 0;
}
