#include "key_access.h"

namespace {

// The access mask of an open or create, with the 64-bit view added when the instance asks for
// it. The flag is read at each open, so a change of view applies from the next operation on.
REGSAM AccessFor(const RunObjectData* instance, KeyUse use) {
    REGSAM access = use == KeyUse::Test || use == KeyUse::Read ? KEY_READ : KEY_ALL_ACCESS;
    return instance->use64BitView ? access | KEY_WOW64_64KEY : access;
}

LONG OpenOrCreate(const RunObjectData* instance, KeyUse use, TargetKey* key) {
    REGSAM access = AccessFor(instance, use);
    if (use == KeyUse::Write)
        return RegCreateKeyExW(key->root, key->path, 0, nullptr, 0, access, nullptr, &key->handle,
                               nullptr);
    return RegOpenKeyExW(key->root, key->path, 0, access, &key->handle);
}

// Takes the root at `rootIndex`, then opens the key below it as `use` asks.
bool Reach(RunObjectData* instance, KeyUse use, DWORD rootIndex, const WCHAR* path,
           TargetKey* key) {
    const RootKey* root = RootKeyAt(rootIndex);
    if (!root) return false;
    key->root = root->handle;
    key->path = path;
    key->handle = nullptr;
    if (use == KeyUse::Delete) return true;
    LONG result = OpenOrCreate(instance, use, key);
    if (use != KeyUse::Test) instance->lastError = static_cast<DWORD>(result);
    return result == ERROR_SUCCESS;
}

// Until a registry call answers, the outcome of a routine that reports is "invalid parameters".
void BeginReport(RunObjectData* instance, KeyUse use) {
    if (use != KeyUse::Test) instance->lastError = ERR_INVALID_PARAMETERS;
}

}  // namespace

bool ReachCurrentKey(RunObjectData* instance, KeyUse use, TargetKey* key, bool given) {
    BeginReport(instance, use);
    if (!instance->currentKey || !given) return false;
    return Reach(instance, use, instance->rootKeyIndex, instance->currentKey, key);
}

bool ReachNamedKey(RunObjectData* instance, KeyUse use, HostValue rootKey, HostValue keyPath,
                   TargetKey* key, bool given) {
    BeginReport(instance, use);
    const RootKeyParam* param = RootParam(rootKey);
    if (!param || !Text(keyPath) || !given) return false;
    return Reach(instance, use, RootIndexOf(param), Text(keyPath), key);
}

// The readers check the root name before the path and the value name.
bool ReachKeyByRootName(RunObjectData* instance, const WCHAR* rootName, const WCHAR* path,
                        TargetKey* key, bool given) {
    BeginReport(instance, KeyUse::Read);
    if (!rootName) return false;
    DWORD index = RootKeyByName(rootName);
    if (index >= RootKeyCount || !path || !given) return false;
    return Reach(instance, KeyUse::Read, index, path, key);
}
