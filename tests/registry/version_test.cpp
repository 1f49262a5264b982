// GetVersionExW and the run-time lookup of RegDeleteKeyExW, with their test settings.
#include "registry_fixture.h"

#include <cstring>

namespace {

using RegistryPlatform = RegistryTest;

class RegistryVersionSize : public RegistryTest,
                            public ::testing::WithParamInterface<std::pair<DWORD, BOOL>> {};

// Windows takes the two record sizes only; anything else fails with 122 and writes nothing.
TEST_P(RegistryVersionSize, OnlyTheRecordSizesAreAccepted) {
    auto [size, accepted] = GetParam();
    OSVERSIONINFOEXW info;
    std::memset(&info, kSentinel, sizeof info);
    info.dwOSVersionInfoSize = size;
    SetLastError(0);
    EXPECT_EQ(GetVersionExW(reinterpret_cast<OSVERSIONINFOW*>(&info)), accepted);
    EXPECT_EQ(GetLastError(), accepted ? 0u : DWORD(ERROR_INSUFFICIENT_BUFFER));
    // What Windows 8.1 and later tell a program without a compatibility manifest.
    EXPECT_EQ(info.dwMajorVersion, accepted ? 6u : 0xCCCCCCCCu);
    EXPECT_EQ(info.dwMinorVersion, accepted ? 2u : 0xCCCCCCCCu);
    EXPECT_EQ(info.dwBuildNumber, accepted ? 9200u : 0xCCCCCCCCu);
    EXPECT_EQ(info.dwPlatformId, accepted ? 2u : 0xCCCCCCCCu);
    EXPECT_EQ(info.wServicePackMajor, size == 284 ? 0 : 0xCCCC);  // nothing past the record
}

INSTANTIATE_TEST_SUITE_P(Sizes, RegistryVersionSize,
                         ::testing::Values(std::pair<DWORD, BOOL>{276, TRUE},
                                           std::pair<DWORD, BOOL>{284, TRUE},
                                           std::pair<DWORD, BOOL>{0, FALSE},
                                           std::pair<DWORD, BOOL>{275, FALSE},
                                           std::pair<DWORD, BOOL>{277, FALSE},
                                           std::pair<DWORD, BOOL>{0xFFFFFFFF, FALSE}));

TEST_F(RegistryPlatform, TestsCanChangeThePlatformOrMakeTheQueryFail) {
    OSVERSIONINFOW info{};
    info.dwOSVersionInfoSize = sizeof info;
    w32test::setPlatformId(VER_PLATFORM_WIN32_WINDOWS);
    EXPECT_TRUE(GetVersionExW(&info));
    EXPECT_EQ(info.dwPlatformId, DWORD(VER_PLATFORM_WIN32_WINDOWS));
    w32test::setVersionFault(true);
    EXPECT_FALSE(GetVersionExW(&info));
    w32test::reset();
    EXPECT_TRUE(GetVersionExW(&info));
    EXPECT_EQ(info.dwPlatformId, DWORD(VER_PLATFORM_WIN32_NT));
    EXPECT_EQ(w32test::count("GetVersionExW"), 1u);
}

TEST_F(RegistryPlatform, RegDeleteKeyExWCanBeHiddenFromGetProcAddress) {
    HMODULE advapi = LoadLibraryW(u"advapi32.dll");
    ASSERT_NE(advapi, nullptr);
    EXPECT_EQ(reinterpret_cast<void*>(GetProcAddress(advapi, "RegDeleteKeyExW")),
              reinterpret_cast<void*>(&RegDeleteKeyExW));
    w32test::hideExport("RegDeleteKeyExW", true);
    EXPECT_EQ(GetProcAddress(advapi, "RegDeleteKeyExW"), nullptr);
    EXPECT_EQ(GetLastError(), DWORD(ERROR_PROC_NOT_FOUND));
    EXPECT_NE(GetProcAddress(advapi, "RegDeleteKeyW"), nullptr);
    w32test::reset();  // unhides it
    EXPECT_NE(GetProcAddress(advapi, "RegDeleteKeyExW"), nullptr);
    EXPECT_TRUE(FreeLibrary(advapi));
}

}  // namespace
