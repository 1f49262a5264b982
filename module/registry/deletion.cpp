// Actions that delete values, and keys together with their whole subtree.
#include <stdlib.h>
#include <string.h>
#include <wchar.h>

#include "../runtime/routines.h"
#include "key_access.h"

namespace {

typedef LONG(WINAPI* DeleteKeyExFunction)(HKEY parent, LPCWSTR path, REGSAM view, DWORD reserved);

const REGSAM TreeWalkAccess = DELETE | KEY_ENUMERATE_SUB_KEYS;
const DWORD SubkeyNameChars = 1024;

// One open key of the walk: the handle, and the parent and name through which it is deleted.
struct WalkLevel {
    WalkLevel* up;
    HKEY key;
    HKEY parent;
    const WCHAR* name;
};

// Opens `name` below `parent` and makes it the walk's new deepest level. The name is copied,
// since the enumeration buffer is reused at every level.
LONG Descend(WalkLevel** top, HKEY parent, const WCHAR* name, REGSAM view, bool copyName) {
    if (!name || !name[0]) return ERROR_BADKEY;
    HKEY key;
    LONG result = RegOpenKeyExW(parent, name, 0, view | TreeWalkAccess, &key);
    if (result != ERROR_SUCCESS) return result;
    size_t nameBytes = copyName ? (wcslen(name) + 1) * sizeof(WCHAR) : 0;
    auto* level = static_cast<WalkLevel*>(malloc(sizeof(WalkLevel) + nameBytes));
    if (!level) {
        RegCloseKey(key);
        return ERROR_NOT_ENOUGH_MEMORY;
    }
    level->up = *top;
    level->key = key;
    level->parent = parent;
    level->name = name;
    if (copyName) {
        auto* copy = reinterpret_cast<WCHAR*>(level + 1);
        memcpy(copy, name, nameBytes);
        level->name = copy;
    }
    *top = level;
    return ERROR_SUCCESS;
}

// Closes the deepest level's handle and forgets the level.
void Ascend(WalkLevel** top) {
    WalkLevel* level = *top;
    RegCloseKey(level->key);
    *top = level->up;
    free(level);
}

LONG DeleteThroughParent(const WalkLevel* level, REGSAM view, DeleteKeyExFunction deleteEx) {
    return deleteEx ? deleteEx(level->parent, level->name, view, 0)
                    : RegDeleteKeyW(level->parent, level->name);
}

// Deletes `path` below `parent` with everything under it, deepest keys first, always the first
// subkey first, stopping at the first failure. Each level is deleted through its parent while
// its own handle is still open, and closed afterwards. The walk keeps its levels on the heap
// and one name buffer for all of them, so a tree as deep as the registry allows costs the
// thread's stack no more than a flat key.
LONG DeleteKeyTree(HKEY parent, const WCHAR* path, REGSAM view, DeleteKeyExFunction deleteEx) {
    WCHAR name[SubkeyNameChars];
    WalkLevel* top = nullptr;
    LONG result = Descend(&top, parent, path, view, false);
    while (top && result == ERROR_SUCCESS) {
        DWORD length = SubkeyNameChars;
        result = RegEnumKeyExW(top->key, 0, name, &length, nullptr, nullptr, nullptr, nullptr);
        if (result == ERROR_SUCCESS) {
            result = Descend(&top, top->key, name, view, true);
        } else if (result == ERROR_NO_MORE_ITEMS) {
            result = DeleteThroughParent(top, view, deleteEx);
            Ascend(&top);
        }
    }
    while (top) Ascend(&top);
    return result;
}

// The tree deletion in the view the flag selects; the view-aware deletion function is looked up
// at run time, since older systems lack it.
LONG DeleteKeyWithView(HKEY root, const WCHAR* path, DWORD use64) {
    REGSAM view = 0;
    HMODULE library = nullptr;
    DeleteKeyExFunction deleteEx = nullptr;
    if (use64) {
        view = KEY_WOW64_64KEY;
        library = LoadLibraryW(TEXT("advapi32.dll"));
        if (library)
            deleteEx = reinterpret_cast<DeleteKeyExFunction>(
                reinterpret_cast<void*>(GetProcAddress(library, "RegDeleteKeyExW")));
    }
    LONG result = DeleteKeyTree(root, path, view, deleteEx);
    if (library) FreeLibrary(library);
    return result;
}

bool IsWindowsNt() {
    OSVERSIONINFOW version;
    memset(&version, 0, sizeof(version));
    version.dwOSVersionInfoSize = sizeof(version);
    return GetVersionExW(&version) && version.dwPlatformId == VER_PLATFORM_WIN32_NT;
}

void DeleteKey(RunObjectData* instance, const TargetKey& key) {
    LONG result = IsWindowsNt() ? DeleteKeyWithView(key.root, key.path, instance->use64BitView)
                                : RegDeleteKeyW(key.root, key.path);
    instance->lastError = static_cast<DWORD>(result);
}

// Deletes one value of the key opened for it, and closes the key.
void DeleteValue(RunObjectData* instance, const TargetKey& key, const WCHAR* name) {
    instance->lastError = static_cast<DWORD>(RegDeleteValueW(key.handle, name));
    RegCloseKey(key.handle);
}

}  // namespace

short WINAPI ActDeleteCurrentKey(RunObjectData* instance, HostValue, HostValue) {
    TargetKey key;
    if (ReachCurrentKey(instance, KeyUse::Delete, &key)) DeleteKey(instance, key);
    return 0;
}

short WINAPI ActDeleteCurrentValue(RunObjectData* instance, HostValue valueName, HostValue) {
    const WCHAR* name = Text(valueName);
    TargetKey key;
    if (ReachCurrentKey(instance, KeyUse::Change, &key, name != nullptr))
        DeleteValue(instance, key, name);
    return 0;
}

short WINAPI ActDeleteKey(RunObjectData* instance, HostValue rootKey, HostValue keyPath) {
    TargetKey key;
    if (ReachNamedKey(instance, KeyUse::Delete, rootKey, keyPath, &key)) DeleteKey(instance, key);
    return 0;
}

short WINAPI ActDeleteValue(RunObjectData* instance, HostValue, HostValue) {
    HostValue rootKey = NextParameter(instance);
    HostValue keyPath = NextParameter(instance);
    const WCHAR* name = Text(NextParameter(instance));
    TargetKey key;
    if (ReachNamedKey(instance, KeyUse::Change, rootKey, keyPath, &key, name != nullptr))
        DeleteValue(instance, key, name);
    return 0;
}
