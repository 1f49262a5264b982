// GetVersionExW and the run-time lookup of RegDeleteKeyExW, with their test settings.
#include "registry_fixture.h"

#include <cstring>

namespace {

using RegistryPlatform = RegistryTest;

struct SizeCase {
    DWORD size;
    BOOL accepted;
};
void PrintTo(const SizeCase& c, std::ostream* os) { *os << "dwOSVersionInfoSize " << c.size; }

class RegistryVersionSize : public RegistryTest, public ::testing::WithParamInterface<SizeCase> {
protected:
    BOOL query() {
        std::memset(&info, Sentinel, sizeof info);
        info.dwOSVersionInfoSize = GetParam().size;
        SetLastError(0);
        return GetVersionExW(&info);
    }
    OSVERSIONINFOW info;
};

// Windows takes its record sizes only (the module's is 276); another size fails and writes
// nothing.
TEST_P(RegistryVersionSize, OnlyTheRecordSizesAreAccepted) {
    const SizeCase& c = GetParam();
    EXPECT_EQ(query(), c.accepted);
    EXPECT_EQ(info.dwPlatformId, c.accepted ? DWORD(VER_PLATFORM_WIN32_NT) : 0xCCCCCCCCu);
    if (c.accepted) {
        EXPECT_EQ(GetLastError(), 0u);
        return;
    }
    EXPECT_EQ(info.dwMajorVersion, 0xCCCCCCCCu);
    HV_WINE_DIFFERS("leaves the last error of a refused size untouched");
    EXPECT_EQ(GetLastError(), DWORD(ERROR_INSUFFICIENT_BUFFER));
}

INSTANTIATE_TEST_SUITE_P(Sizes, RegistryVersionSize,
                         ::testing::Values(SizeCase{276, TRUE}, SizeCase{0, FALSE},
                                           SizeCase{275, FALSE}, SizeCase{277, FALSE},
                                           SizeCase{0xFFFFFFFF, FALSE}));

// What Windows 8.1 and later tell a program without a compatibility manifest.
TEST_F(RegistryPlatform, AProgramWithoutManifestIsToldWindows8) {
    HV_WINE_DIFFERS("its prefix reports Windows 7 SP1, 6.1.7601");
    OSVERSIONINFOW info{};
    info.dwOSVersionInfoSize = sizeof info;
    ASSERT_TRUE(GetVersionExW(&info));
    EXPECT_EQ(info.dwMajorVersion, 6u);
    EXPECT_EQ(info.dwMinorVersion, 2u);
    EXPECT_EQ(info.dwBuildNumber, 9200u);
    EXPECT_EQ(info.szCSDVersion[0], 0);
}

TEST_F(RegistryPlatform, TestsCanChangeThePlatformOrMakeTheQueryFail) {
    HV_LAYER_ONLY("the platform id and the failure are the layer's settings");
#if HV_OVER_LAYER
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
#endif
}

TEST_F(RegistryPlatform, RegDeleteKeyExWIsFoundInAdvapi32) {
    HMODULE advapi = LoadLibraryW(TEXT("advapi32.dll"));
    ASSERT_NE(advapi, nullptr);
    EXPECT_EQ(reinterpret_cast<void*>(GetProcAddress(advapi, "RegDeleteKeyExW")),
              reinterpret_cast<void*>(&RegDeleteKeyExW));
    EXPECT_NE(GetProcAddress(advapi, "RegDeleteKeyW"), nullptr);
    SetLastError(0);
    EXPECT_EQ(GetProcAddress(advapi, "RegDeleteKeyExHivelet"), nullptr);
    EXPECT_EQ(GetLastError(), DWORD(ERROR_PROC_NOT_FOUND));
    EXPECT_TRUE(FreeLibrary(advapi));
}

TEST_F(RegistryPlatform, RegDeleteKeyExWCanBeHiddenFromGetProcAddress) {
    HV_LAYER_ONLY("hiding an export is the layer's setting");
#if HV_OVER_LAYER
    HMODULE advapi = LoadLibraryW(TEXT("advapi32.dll"));
    w32test::hideExport("RegDeleteKeyExW", true);
    EXPECT_EQ(GetProcAddress(advapi, "RegDeleteKeyExW"), nullptr);
    EXPECT_EQ(GetLastError(), DWORD(ERROR_PROC_NOT_FOUND));
    EXPECT_NE(GetProcAddress(advapi, "RegDeleteKeyW"), nullptr);
    w32test::reset();  // unhides it
    EXPECT_NE(GetProcAddress(advapi, "RegDeleteKeyExW"), nullptr);
    EXPECT_TRUE(FreeLibrary(advapi));
#endif
}

}  // namespace
