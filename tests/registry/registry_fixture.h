// Shared fixture of the registry tests: a fresh registry per test and a few short helpers.
#pragma once

#include <gtest/gtest.h>
#include <w32/testctl.h>
#include <windows.h>

#include <string>
#include <vector>

constexpr BYTE kSentinel = 0xCC;
constexpr REGSAM kTreeWalk = DELETE | KEY_ENUMERATE_SUB_KEYS;  // 0x10008
constexpr REGSAM k64 = KEY_WOW64_64KEY;
constexpr REGSAM k32 = KEY_WOW64_32KEY;
const HKEY kUser = HKEY_CURRENT_USER;
const HKEY kMachine = HKEY_LOCAL_MACHINE;

class RegistryTest : public ::testing::Test {
protected:
    void SetUp() override { w32test::reset(); }
};

// Result of RegCreateKeyExW; the handle, if any, is closed again.
inline LONG tryCreate(HKEY root, const std::u16string& path, REGSAM sam = KEY_ALL_ACCESS,
                      DWORD* disposition = nullptr) {
    HKEY key = nullptr;
    LONG code =
        RegCreateKeyExW(root, path.c_str(), 0, nullptr, 0, sam, nullptr, &key, disposition);
    if (key) RegCloseKey(key);
    return code;
}

// A handle to `path`, created if missing; the test fails if that does not work.
inline HKEY create(HKEY root, const std::u16string& path, REGSAM sam = KEY_ALL_ACCESS) {
    HKEY key = nullptr;
    EXPECT_EQ(RegCreateKeyExW(root, path.c_str(), 0, nullptr, 0, sam, nullptr, &key, nullptr), 0);
    return key;
}

inline void make(HKEY root, const std::u16string& path, REGSAM sam = KEY_ALL_ACCESS) {
    EXPECT_EQ(tryCreate(root, path, sam), 0);
}

// Result of RegOpenKeyExW; the handle, if any, is closed again.
inline LONG probe(HKEY root, const WCHAR* path, REGSAM sam = KEY_READ) {
    HKEY key = nullptr;
    LONG code = RegOpenKeyExW(root, path, 0, sam, &key);
    if (code == ERROR_SUCCESS && key != root) RegCloseKey(key);
    return code;
}

inline LONG setDword(HKEY key, const WCHAR* name, DWORD value) {
    return RegSetValueExW(key, name, 0, REG_DWORD, reinterpret_cast<const BYTE*>(&value), 4);
}

// Name of the subkey at `index`, or "" when RegEnumKeyExW fails.
inline std::u16string subkeyAt(HKEY key, DWORD index) {
    WCHAR name[300];
    DWORD length = 300;
    if (RegEnumKeyExW(key, index, name, &length, nullptr, nullptr, nullptr, nullptr) != 0)
        return u"";
    return std::u16string(name, length);
}
