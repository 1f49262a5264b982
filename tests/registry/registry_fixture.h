// Shared fixture of the registry tests. Each test works below scratch keys of its own, which it
// deletes in every view, so that the tests also run against a real, persistent registry in any
// order; over the layer the registry is besides fresh for every test.
#pragma once

#include "conformance.h"

#include <string>
#include <vector>

constexpr BYTE Sentinel = 0xCC;
constexpr REGSAM TreeWalk = DELETE | KEY_ENUMERATE_SUB_KEYS;  // 0x10008
constexpr REGSAM View64 = KEY_WOW64_64KEY;
constexpr REGSAM View32 = KEY_WOW64_32KEY;
const HKEY CurrentUser = HKEY_CURRENT_USER;
const HKEY LocalMachine = HKEY_LOCAL_MACHINE;

// Result of RegCreateKeyExW; the handle, if any, is closed again.
inline LONG tryCreate(HKEY root, const WString& path, REGSAM sam = KEY_ALL_ACCESS,
                      DWORD* disposition = nullptr) {
    HKEY key = nullptr;
    LONG code = RegCreateKeyExW(root, path.c_str(), 0, nullptr, 0, sam, nullptr, &key, disposition);
    if (key) RegCloseKey(key);
    return code;
}

// A handle to `path`, created if missing; the test fails if that does not work.
inline HKEY create(HKEY root, const WString& path, REGSAM sam = KEY_ALL_ACCESS) {
    HKEY key = nullptr;
    EXPECT_EQ(RegCreateKeyExW(root, path.c_str(), 0, nullptr, 0, sam, nullptr, &key, nullptr), 0);
    return key;
}

inline void make(HKEY root, const WString& path, REGSAM sam = KEY_ALL_ACCESS) {
    EXPECT_EQ(tryCreate(root, path, sam), 0);
}

// Result of RegOpenKeyExW; the handle, if any, is closed again.
inline LONG probe(HKEY root, const WCHAR* path, REGSAM sam = KEY_READ) {
    HKEY key = nullptr;
    LONG code = RegOpenKeyExW(root, path, 0, sam, &key);
    if (code == ERROR_SUCCESS && key != root) RegCloseKey(key);
    return code;
}
inline LONG probe(HKEY root, const WString& path, REGSAM sam = KEY_READ) {
    return probe(root, path.c_str(), sam);
}

inline LONG setDword(HKEY key, const WCHAR* name, DWORD value) {
    return RegSetValueExW(key, name, 0, REG_DWORD, reinterpret_cast<const BYTE*>(&value), 4);
}

// Name of the subkey at `index`, or "" when RegEnumKeyExW fails.
inline WString subkeyAt(HKEY key, DWORD index) {
    WCHAR name[300];
    DWORD length = 300;
    if (RegEnumKeyExW(key, index, name, &length, nullptr, nullptr, nullptr, nullptr) != 0)
        return WString();
    return WString(name, length);
}

// `count` levels of keys named `name`, as one path.
inline WString levels(unsigned count, const WString& name) {
    WString path;
    for (unsigned i = 0; i < count; ++i) path += name + TEXT("\\");
    return path;
}

// Deletes the key at `path` with all its subkeys as the module does: open with DELETE |
// KEY_ENUMERATE_SUB_KEYS, take subkey 0 until 259, delete each key through its parent while its
// own handle is still open, then close that handle. `view` is a KEY_WOW64_* flag or 0.
LONG deleteTree(HKEY root, const WString& path, REGSAM view = 0);

class RegistryTest : public ::testing::Test {
protected:
    void SetUp() override;
    void TearDown() override;
    // Makes the key at `path` the test's own in `view`: from its first component missing now,
    // it is deleted after the test (a leftover of an interrupted run is deleted at once).
    void own(HKEY root, const WString& path, REGSAM view);

    WString id;           // "HiveletConformance <suite>.<test>": unique among the tests
    WString userPath;     // Software\HiveletConformance\<suite>.<test> below HKEY_CURRENT_USER
    WString machinePath;  // SOFTWARE\HiveletConformance\<suite>.<test> below HKLM, either view
    HKEY user = nullptr;  // userPath, created for the test, with full access

private:
    struct Owned {
        HKEY root;
        WString path;
        REGSAM view;
    };
    std::vector<Owned> owned_;
};
