// Registry views as a process sees them on 64-bit Windows: HKLM\SOFTWARE has a 32-bit copy in
// Wow6432Node, except the shared keys; the other roots are shared. A call without a view flag
// sees the process's own view: the 32-bit one in a 32-bit process, as the module runs and as the
// layer models it, the 64-bit one in a 64-bit process.
#include "registry_fixture.h"

namespace {

using RegistryViews = RegistryTest;

constexpr REGSAM OwnView = conf::DefaultView32 ? View32 : View64;
constexpr REGSAM OtherView = conf::DefaultView32 ? View64 : View32;

// Whether the key at `path` (opened with `sam`) has a subkey named `name`.
bool hasSubkey(HKEY root, const WString& path, REGSAM sam, const WString& name) {
    HKEY key = nullptr;
    if (RegOpenKeyExW(root, path.c_str(), 0, sam, &key) != ERROR_SUCCESS) return false;
    bool found = false;
    for (DWORD i = 0; !found; ++i) {
        WString child = subkeyAt(key, i);
        if (child.empty()) break;
        found = _wcsicmp(child.c_str(), name.c_str()) == 0;
    }
    RegCloseKey(key);
    return found;
}

TEST_F(RegistryViews, WithoutAFlagACallSeesItsProcesssView) {
    WString probePath = machinePath + TEXT("\\Probe");
    make(LocalMachine, probePath);
    EXPECT_EQ(probe(LocalMachine, probePath, KEY_READ | OwnView), 0);
    EXPECT_EQ(probe(LocalMachine, probePath, KEY_READ | OtherView), 2);
    // The 32-bit copy lives in Wow6432Node, which the 64-bit view shows.
    WString below = probePath.substr(probePath.find(TEXT('\\')));
    EXPECT_EQ(probe(LocalMachine, TEXT("software\\wow6432node") + below, KEY_READ | View64),
              conf::DefaultView32 ? 0 : 2);
    // SOFTWARE itself is redirected: its 32-bit view is Wow6432Node.
    for (REGSAM view : {REGSAM(0), View32, View64})
        EXPECT_EQ(hasSubkey(LocalMachine, TEXT("SOFTWARE"), KEY_READ | view, TEXT("Wow6432Node")),
                  view == View64 || (view == 0 && !conf::DefaultView32))
            << "view 0x" << std::hex << view;
}

TEST_F(RegistryViews, AValueWrittenInOneViewIsAbsentInTheOther) {
    HKEY wide = create(LocalMachine, machinePath, KEY_ALL_ACCESS | View64);
    HKEY narrow = create(LocalMachine, machinePath, KEY_ALL_ACCESS | View32);
    ASSERT_EQ(setDword(wide, TEXT("bits"), 64), 0);
    EXPECT_EQ(RegQueryValueExW(narrow, TEXT("bits"), nullptr, nullptr, nullptr, nullptr), 2);
    ASSERT_EQ(setDword(narrow, TEXT("bits"), 32), 0);
    // RegDeleteKeyW has no view flag: it deletes the process's own copy; RegDeleteKeyExW
    // reaches either.
    HKEY own = conf::DefaultView32 ? narrow : wide, other = conf::DefaultView32 ? wide : narrow;
    EXPECT_EQ(RegDeleteKeyW(LocalMachine, machinePath.c_str()), 0);
    EXPECT_EQ(RegQueryValueExW(own, TEXT("bits"), nullptr, nullptr, nullptr, nullptr), 1018);
    EXPECT_EQ(RegQueryValueExW(other, TEXT("bits"), nullptr, nullptr, nullptr, nullptr), 0);
    EXPECT_EQ(RegDeleteKeyExW(LocalMachine, machinePath.c_str(), OwnView, 0), 2);
    EXPECT_EQ(RegDeleteKeyExW(LocalMachine, machinePath.c_str(), OtherView, 0), 0);
    EXPECT_EQ(setDword(other, TEXT("bits"), 1), 1018);
    RegCloseKey(wide);
    RegCloseKey(narrow);
}

struct ViewCase {
    const WCHAR* parent;  // below HKLM\SOFTWARE; the row's key is created there in the 32-bit view
    const WCHAR* leaf;    // its name, or null for the test's own name
    LONG seenFrom64;      // 0: shared, 2: redirected
    const char* wineDiffers = nullptr;
};
void PrintTo(const ViewCase& c, std::ostream* os) {
    WString leaf = c.leaf ? c.leaf : TEXT("<test>");
    *os << ::testing::PrintToString(WString(c.parent) + TEXT("\\") + leaf);
}

class RegistrySharedKeys : public RegistryTest, public ::testing::WithParamInterface<ViewCase> {};

TEST_P(RegistrySharedKeys, OnlySharedKeysAreTheSameInBothViews) {
    const ViewCase& c = GetParam();
    if (c.wineDiffers) HV_WINE_DIFFERS(c.wineDiffers);
    WString path = TEXT("SOFTWARE\\") + WString(c.parent);
    path += (c.parent[0] ? TEXT("\\") : TEXT("")) + (c.leaf ? c.leaf : id);
    for (REGSAM view : {View32, View64}) own(LocalMachine, path, view);
    make(LocalMachine, path, KEY_ALL_ACCESS | View32);
    EXPECT_EQ(probe(LocalMachine, path, KEY_READ | View64), c.seenFrom64);
}

// Wine shares keys through links from Wow6432Node, made from a list of its own.
const char WineLinksMicrosoftClients[] = "its shared Clients is SOFTWARE\\Microsoft\\Clients";
const char WineHasNoLink[] = "RegisteredApplications is not among its shared keys";
// In a 64-bit process Wine puts a key made below Classes with KEY_WOW64_32KEY into
// Classes\Wow6432Node, where the 64-bit view does not see it; in a 32-bit process it does not.
const char* const WineRedirectsClasses =
    sizeof(void*) == 8 ? "a 64-bit process's KEY_WOW64_32KEY keys below Classes are a copy"
                       : nullptr;

INSTANTIATE_TEST_SUITE_P(
    Views, RegistrySharedKeys,
    ::testing::Values(ViewCase{TEXT("Classes"), nullptr, 0, WineRedirectsClasses},
                      ViewCase{TEXT("Classes\\CLSID"), nullptr, 2},
                      ViewCase{TEXT("Clients"), nullptr, 0, WineLinksMicrosoftClients},
                      ViewCase{TEXT("Policies"), nullptr, 0},
                      ViewCase{TEXT("RegisteredApplications"), nullptr, 0, WineHasNoLink},
                      ViewCase{TEXT("Microsoft\\OLE"), nullptr, 0},
                      ViewCase{TEXT("Microsoft\\Windows NT\\CurrentVersion\\Fonts"), nullptr, 0},
                      ViewCase{TEXT("Microsoft\\Windows\\CurrentVersion\\App Paths"), nullptr, 0},
                      ViewCase{TEXT("Microsoft\\Windows\\CurrentVersion\\Run"), nullptr, 2},
                      ViewCase{TEXT("Microsoft"), TEXT("OLE Hivelet"),
                               2},  // shared is OLE, not a prefix
                      ViewCase{TEXT(""), TEXT("Classes Hivelet"), 2}));

// A handle stands for one copy; paths below it are redirected by the flag of each call.
TEST_F(RegistryViews, WalksFromAHandleUseTheFlagOfTheCall) {
    if (!conf::DefaultView32) GTEST_SKIP() << "about a 32-bit process's calls without a flag";
    HV_WINE_DIFFERS("a path below a KEY_WOW64_64KEY handle stays 64-bit without the flag");
    WString shared = TEXT("SOFTWARE\\Microsoft\\OLE\\") + id;
    WString mine = TEXT("SOFTWARE\\Microsoft\\") + id;
    for (REGSAM view : {View32, View64}) {
        own(LocalMachine, shared, view);
        own(LocalMachine, mine, view);
    }
    make(LocalMachine, shared, KEY_ALL_ACCESS | View64);
    HKEY microsoft32 = create(LocalMachine, TEXT("SOFTWARE\\Microsoft"), KEY_READ);
    EXPECT_EQ(probe(microsoft32, TEXT("OLE\\") + id), 0);  // a 32-bit handle reaches shared keys
    make(microsoft32, id);  // and stays in the 32-bit copy, whatever flag a later call has
    EXPECT_EQ(probe(microsoft32, id, KEY_READ | View64), 0);
    EXPECT_EQ(probe(LocalMachine, mine, KEY_READ | View64), 2);
    RegCloseKey(microsoft32);
    // Children of a 64-bit handle need the flag again, or they are redirected.
    HKEY software64 = create(LocalMachine, TEXT("SOFTWARE"), KEY_READ | View64);
    EXPECT_EQ(probe(software64, TEXT("Microsoft\\") + id), 0);
    EXPECT_EQ(probe(software64, TEXT("Microsoft\\") + id, KEY_READ | View64), 2);
    RegCloseKey(software64);
}

struct RootCase {
    HKEY root;
    const WCHAR* parent;  // the row's key is created there, in the 32-bit view
    const char* wineDiffers = nullptr;
};
void PrintTo(const RootCase& c, std::ostream* os) {
    *os << std::hex << reinterpret_cast<uintptr_t>(c.root) << " "
        << ::testing::PrintToString(WString(c.parent));
}

class RegistrySharedRoots : public RegistryTest, public ::testing::WithParamInterface<RootCase> {};

// Nothing outside HKLM\SOFTWARE has a 32-bit copy, HKEY_CLASSES_ROOT's own keys included.
TEST_P(RegistrySharedRoots, KeysAreTheSameInBothViews) {
    const RootCase& c = GetParam();
    if (c.wineDiffers) HV_WINE_DIFFERS(c.wineDiffers);
    WString parent = c.parent[0] ? WString(c.parent) + TEXT("\\") : WString();
    for (REGSAM view : {View32, View64}) own(c.root, parent + id, view);
    make(c.root, parent + id, KEY_ALL_ACCESS | View32);
    EXPECT_EQ(probe(c.root, parent + id, KEY_READ | View64), 0);
    EXPECT_EQ(probe(c.root, parent + TEXT("Wow6432Node\\") + id, KEY_READ | View64), 2);
}

INSTANTIATE_TEST_SUITE_P(Roots, RegistrySharedRoots,
                         ::testing::Values(RootCase{CurrentUser, TEXT("Software")},
                                           RootCase{HKEY_CLASSES_ROOT, TEXT(""),
                                                    WineRedirectsClasses},
                                           RootCase{HKEY_USERS, TEXT(".DEFAULT\\Software")},
                                           RootCase{HKEY_CURRENT_CONFIG, TEXT("Software")},
                                           RootCase{LocalMachine, TEXT("SYSTEM")}));

}  // namespace
