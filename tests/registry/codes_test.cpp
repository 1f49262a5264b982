// One call, one Windows result code: path syntax, name limits, arguments and handles.
#include "registry_fixture.h"

namespace {

// The keys a row works on: `u` the test's scratch key, `k` its subkey Scene (value "v",
// subkeys Child\Grandchild and Empty) with full access, `r` Scene with KEY_READ; beside Scene,
// a key named Été.
struct Scene {
    HKEY u, k, r;
};

struct Row {
    const char* what;
    LONG code;  // Windows' code
    LONG (*call)(const Scene&);
    const char* wineDiffers;  // why Wine gives another code, or null
    bool wineCrashes;         // Wine does not survive the call
};
void PrintTo(const Row& row, std::ostream* os) { *os << row.what; }

class RegistryCodes : public RegistryTest, public ::testing::WithParamInterface<Row> {
protected:
    void SetUp() override {
        RegistryTest::SetUp();
        scene = {user, create(user, TEXT("Scene")), create(user, TEXT("Scene"), KEY_READ)};
        setDword(scene.k, TEXT("v"), 1);
        make(scene.k, TEXT("Child\\Grandchild"));
        make(scene.k, TEXT("Empty"));
        make(user, TEXT("\u00C9t\u00E9"));
    }
    void TearDown() override {
        RegCloseKey(scene.k);
        RegCloseKey(scene.r);
        RegistryTest::TearDown();
    }
    Scene scene{};
};

TEST_P(RegistryCodes, CallGivesWindowsCode) {
    const Row& row = GetParam();
    if (row.wineCrashes) HV_WINE_CRASHES(row.wineDiffers);
    if (row.wineDiffers) HV_WINE_DIFFERS(row.wineDiffers);
    EXPECT_EQ(row.call(scene), row.code) << row.what;
}

// clang-format off
#define CALL(call) +[](const Scene& s) -> LONG {       \
    [[maybe_unused]] HKEY u = s.u, k = s.k, r = s.r;   \
    return call;                                       \
}
// A row: what it is about, Windows' code and the call.
#define ROW(what, code, call) Row{what, LONG(code), CALL(call), nullptr, false}
// A row where Wine answers otherwise, and why.
#define WINE_ROW(why, what, code, call) Row{what, LONG(code), CALL(call), why, false}
// A row whose call Wine does not survive; Windows' answer is recorded nowhere: the layer's.
#define CRASH_ROW(why, what, code, call) Row{what, LONG(code), CALL(call), why, true}
// clang-format on

const HKEY Bogus = reinterpret_cast<HKEY>(uintptr_t(0xdeadbee0));
const HKEY UndefinedRoot = reinterpret_cast<HKEY>(uintptr_t(0x80000010));
DWORD gWord = 0;
WCHAR gName[9];

WString chars(size_t n) { return WString(n, TEXT('n')); }

LONG createWith(HKEY key, DWORD options) {
    HKEY out = nullptr;
    LONG code =
        RegCreateKeyExW(key, TEXT("N"), 0, nullptr, options, KEY_READ, nullptr, &out, nullptr);
    RegCloseKey(out);
    return code;
}

LONG enumWith(HKEY key) {
    gWord = 9;
    return RegEnumKeyExW(key, 0, gName, &gWord, nullptr, nullptr, nullptr, nullptr);
}

LONG deleteThroughNewHandle(HKEY root) {
    HKEY again = create(root, TEXT(""));
    LONG code = RegDeleteKeyW(again, TEXT(""));
    RegCloseKey(again);
    return code;
}

const char NullPointer[] = "page fault on this NULL pointer, in both process kinds";

INSTANTIATE_TEST_SUITE_P(
    Paths, RegistryCodes,
    ::testing::Values(
        ROW("case-insensitive", 0, probe(u, TEXT("sCENE\\cHILD"))),
        ROW("folding beyond ASCII", 0, probe(u, TEXT("\u00E9T\u00C9"))),
        ROW("doubled backslash", 0, probe(u, TEXT("Scene\\\\Child"))),
        ROW("trailing backslashes", 0, probe(u, TEXT("Scene\\Child\\\\"))),
        ROW("leading backslash", 161, probe(u, TEXT("\\Scene"))),
        ROW("leading backslash on a root", 161, probe(CurrentUser, TEXT("\\Software"))),
        ROW("backslash alone", 161, probe(CurrentUser, TEXT("\\"))),
        ROW("leading backslash, create", 161, tryCreate(k, TEXT("\\New"))),
        ROW("HKCR takes a leading backslash", 0, probe(HKEY_CLASSES_ROOT, TEXT("\\"))),
        ROW("slash is a name character", 2, probe(u, TEXT("Scene/Child"))),
        ROW("dot-dot is a name", 2, probe(k, TEXT("Child\\..\\.."))),
        ROW("trailing space counts", 2, probe(u, TEXT("Scene "))),
        ROW("intermediate missing", 2, probe(u, TEXT("None\\Child"))),
        ROW("255-character name, absent", 2, probe(k, chars(255))),
        WINE_ROW("accepts 256-character names", "256-character name", 87, probe(k, chars(256))),
        ROW("255-character name, create", 0, tryCreate(k, chars(255))),
        WINE_ROW("accepts 256-character names", "256-character name, create", 87,
                 tryCreate(k, chars(256)))));

INSTANTIATE_TEST_SUITE_P(
    Arguments, RegistryCodes,
    ::testing::Values(
        ROW("open NULL handle", 6, probe(nullptr, TEXT(""))),
        ROW("open bogus handle", 6, probe(Bogus, TEXT("x"))),
        ROW("open undefined root", 6, probe(UndefinedRoot, TEXT(""))),
        ROW("open without out handle", 87, RegOpenKeyExW(k, TEXT("Child"), 0, KEY_READ, nullptr)),
        ROW("create, undefined option bit", 0, createWith(k, 0x80)),
        CRASH_ROW(NullPointer, "create without out handle", 87,
                  RegCreateKeyExW(k, TEXT("N"), 0, nullptr, 0, KEY_READ, nullptr, nullptr,
                                  nullptr)),
        ROW("value name of 16383", 0, setDword(k, chars(16383).c_str(), 1)),
        ROW("value name of 16384", 87, setDword(k, chars(16384).c_str(), 1)),
        ROW("backslash in a value name", 0, setDword(k, TEXT("a\\b/c"), 1)),
        ROW("set nothing from NULL", 0, RegSetValueExW(k, TEXT("n"), 1, REG_BINARY, nullptr, 0)),
        ROW("set, NULL handle", 6, setDword(nullptr, TEXT("n"), 1)),
        ROW("query, other case", 0, RegQueryValueExW(k, TEXT("V"), 0, 0, 0, 0)),
        ROW("query, NULL handle", 6, RegQueryValueExW(nullptr, TEXT("v"), 0, 0, 0, &gWord)),
        ROW("query a predefined root", 2,
            RegQueryValueExW(CurrentUser, TEXT("Hivelet absent"), 0, 0, 0, &gWord)),
        ROW("delete value, other case", 0, RegDeleteValueW(k, TEXT("V"))),
        ROW("delete value, missing", 2, RegDeleteValueW(k, chars(400).c_str())),
        ROW("delete value, NULL handle", 6, RegDeleteValueW(nullptr, TEXT("v"))),
        ROW("enumerate, NULL handle", 6, enumWith(nullptr)),
        ROW("close NULL", 6, RegCloseKey(nullptr)),
        // Windows' answer is recorded nowhere; Wine answers 0 for every value from 0x80000000
        // up in both process kinds, and 6 for a small value that is no handle.
        ROW("close bogus", 0, RegCloseKey(Bogus)),
        ROW("close a predefined root", 0, RegCloseKey(LocalMachine))));

// Windows refuses to delete a key with subkeys (5); the parent handle's rights do not matter.
INSTANTIATE_TEST_SUITE_P(
    Deletion, RegistryCodes,
    ::testing::Values(ROW("key with subkeys", 5, RegDeleteKeyW(k, TEXT("Child"))),
                      ROW("own key with subkeys", 5, RegDeleteKeyW(k, TEXT(""))),
                      ROW("leaf in other case", 0,
                          RegDeleteKeyW(u, TEXT("scene\\CHILD\\grandchild\\"))),
                      ROW("through a KEY_READ parent", 0, RegDeleteKeyW(r, TEXT("Empty"))),
                      ROW("leading backslash", 161, RegDeleteKeyW(u, TEXT("\\Scene\\Empty"))),
                      ROW("missing", 2, RegDeleteKeyW(k, TEXT("None"))),
                      ROW("NULL subkey", 87, RegDeleteKeyW(k, nullptr)),
                      ROW("NULL handle", 6, RegDeleteKeyW(nullptr, TEXT("Scene"))),
                      ROW("Ex, other bits, Reserved 1", 0,
                          RegDeleteKeyExW(k, TEXT("Empty"), KEY_READ | View64, 1)),
                      ROW("HKCU itself", 5, RegDeleteKeyW(CurrentUser, TEXT(""))),
                      ROW("HKCC itself", 5, RegDeleteKeyW(HKEY_CURRENT_CONFIG, TEXT(""))),
                      ROW("HKU through a handle", 5, deleteThroughNewHandle(HKEY_USERS))));

}  // namespace
