// The registry as a 32-bit process on 64-bit Windows sees it: HKLM\SOFTWARE has a 32-bit
// copy in Wow6432Node, except the shared keys; the other roots are shared.
#include "registry_fixture.h"

namespace {

using RegistryViews = RegistryTest;

TEST_F(RegistryViews, DefaultViewOfSoftwareIsWow6432Node) {
    make(kMachine, u"Software\\Probe");  // no flag: the 32-bit view
    EXPECT_EQ(probe(kMachine, u"SOFTWARE\\Wow6432Node\\Probe", KEY_READ | k64), 0);
    EXPECT_EQ(probe(kMachine, u"software\\probe", KEY_READ | k32), 0);
    EXPECT_EQ(probe(kMachine, u"Software\\Probe", KEY_READ | k64), 2);
    HKEY software = create(kMachine, u"SOFTWARE", KEY_READ);  // SOFTWARE itself is redirected
    EXPECT_EQ(subkeyAt(software, 0), u"Probe");
    RegCloseKey(software);
}

TEST_F(RegistryViews, AValueWrittenInOneViewIsAbsentInTheOther) {
    HKEY wide = create(kMachine, u"SOFTWARE\\Both", KEY_ALL_ACCESS | k64);
    HKEY narrow = create(kMachine, u"SOFTWARE\\Both");
    ASSERT_EQ(setDword(wide, u"bits", 64), 0);
    EXPECT_EQ(RegQueryValueExW(narrow, u"bits", nullptr, nullptr, nullptr, nullptr), 2);
    // RegDeleteKeyW has no view: it deletes the 32-bit copy; RegDeleteKeyExW reaches either.
    EXPECT_EQ(RegDeleteKeyW(kMachine, u"SOFTWARE\\Both"), 0);
    EXPECT_EQ(RegQueryValueExW(wide, u"bits", nullptr, nullptr, nullptr, nullptr), 0);
    EXPECT_EQ(RegDeleteKeyExW(kMachine, u"SOFTWARE\\Both", k32, 0), 2);
    EXPECT_EQ(RegDeleteKeyExW(kMachine, u"SOFTWARE\\Both", k64, 0), 0);
    EXPECT_EQ(setDword(wide, u"bits", 64), 1018);
    RegCloseKey(wide);
    RegCloseKey(narrow);
}

struct ViewCase {
    const char16_t* below;  // path below HKLM\SOFTWARE, created in the 32-bit view
    LONG seenFrom64;
};
void PrintTo(const ViewCase& c, std::ostream* os) {
    *os << ::testing::PrintToString(std::u16string(c.below));
}

class RegistrySharedKeys : public RegistryTest, public ::testing::WithParamInterface<ViewCase> {};

TEST_P(RegistrySharedKeys, OnlySharedKeysAreTheSameInBothViews) {
    std::u16string path = std::u16string(u"SOFTWARE\\") + GetParam().below;
    make(kMachine, path);
    EXPECT_EQ(probe(kMachine, path.c_str(), KEY_READ | k64), GetParam().seenFrom64);
}

INSTANTIATE_TEST_SUITE_P(
    Views, RegistrySharedKeys,
    ::testing::Values(ViewCase{u"Classes\\P", 0}, ViewCase{u"Classes\\CLSID\\P", 2},
                      ViewCase{u"CLIENTS\\P", 0},
                      ViewCase{u"Policies\\P", 0}, ViewCase{u"RegisteredApplications", 0},
                      ViewCase{u"Microsoft\\OLE\\P", 0},
                      ViewCase{u"Microsoft\\Windows NT\\CurrentVersion\\Fonts", 0},
                      ViewCase{u"Microsoft\\Windows\\CurrentVersion\\App Paths\\P", 0},
                      ViewCase{u"Microsoft\\Windows\\CurrentVersion\\Run", 2},
                      ViewCase{u"Microsoft\\OLEX", 2}, ViewCase{u"ClassesX", 2}));

TEST_F(RegistryViews, WalksFromAHandleUseTheFlagOfTheCall) {
    make(kMachine, u"SOFTWARE\\Microsoft\\OLE\\Shared", KEY_ALL_ACCESS | k64);
    HKEY microsoft32 = create(kMachine, u"SOFTWARE\\Microsoft", KEY_READ);
    EXPECT_EQ(probe(microsoft32, u"OLE\\Shared"), 0);  // a 32-bit handle reaches shared keys
    make(microsoft32, u"Mine");
    EXPECT_EQ(probe(microsoft32, u"Mine", KEY_READ | k64), 0);  // and stays in the 32-bit copy
    RegCloseKey(microsoft32);
    // Children of a 64-bit handle need the flag again, or they are redirected.
    HKEY software64 = create(kMachine, u"SOFTWARE", KEY_READ | k64);
    EXPECT_EQ(probe(software64, u"Microsoft\\Mine"), 0);
    EXPECT_EQ(probe(software64, u"Microsoft\\Mine", KEY_READ | k64), 2);
    RegCloseKey(software64);
}

TEST_F(RegistryViews, OtherRootsAreShared) {
    for (HKEY root : {kUser, HKEY_CLASSES_ROOT, HKEY_USERS, HKEY_CURRENT_CONFIG, kMachine}) {
        make(root, u"System\\Probe", KEY_ALL_ACCESS | k32);
        EXPECT_EQ(probe(root, u"System\\Probe", KEY_READ | k64), 0);
    }
    make(kUser, u"Software\\Probe", KEY_ALL_ACCESS | k32);
    EXPECT_EQ(probe(kUser, u"Software\\Probe", KEY_READ | k64), 0);
    EXPECT_EQ(probe(kUser, u"Software\\Wow6432Node"), 2);
}

}  // namespace
