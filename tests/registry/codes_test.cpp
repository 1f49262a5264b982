// One call, one Windows result code: path syntax, name limits, arguments and handles.
#include "registry_fixture.h"

namespace {

// HKCU\Scene (value "v", subkeys Child\Grandchild and Empty) and HKCU\Été; the calls get
// Scene with full access as `k` and with KEY_READ as `r`.
class RegistryCodes : public RegistryTest,
                      public ::testing::WithParamInterface<
                          std::tuple<const char*, LONG, LONG (*)(HKEY, HKEY)>> {
protected:
    void SetUp() override {
        RegistryTest::SetUp();
        key = create(kUser, u"Scene");
        readOnly = create(kUser, u"Scene", KEY_READ);
        setDword(key, u"v", 1);
        make(key, u"Child\\Grandchild");
        make(key, u"Empty");
        make(kUser, u"\u00C9t\u00E9");
    }
    HKEY key = nullptr, readOnly = nullptr;
};

TEST_P(RegistryCodes, CallGivesWindowsCode) {
    auto [what, expected, call] = GetParam();
    EXPECT_EQ(call(key, readOnly), expected) << what;
}

// One case: what it is about, Windows' code, and the call (k: Scene, r: Scene read-only).
#define ROW(what, code, call)                                                          \
    std::make_tuple(what, LONG(code), +[](HKEY k, HKEY r) -> LONG {                    \
        return (void)k, (void)r, call;                                                 \
    })

const HKEY kBogus = reinterpret_cast<HKEY>(uintptr_t(0xdeadbee0));
const HKEY kUndefinedRoot = reinterpret_cast<HKEY>(uintptr_t(0x80000010));
DWORD gWord = 0;
BYTE gByte = 0;

std::u16string chars(size_t n) { return std::u16string(n, u'n'); }

LONG openWith(HKEY key, DWORD options) {
    HKEY out = nullptr;
    LONG code = RegOpenKeyExW(key, u"Child", options, KEY_READ, &out);
    RegCloseKey(out);
    return code;
}

LONG createWith(HKEY key, DWORD reserved, DWORD options) {
    HKEY out = nullptr;
    LONG code = RegCreateKeyExW(key, u"N", reserved, nullptr, options, KEY_READ, nullptr, &out,
                                nullptr);
    RegCloseKey(out);
    return code;
}

LONG enumWith(HKEY key, DWORD* reserved) {
    WCHAR name[9];
    DWORD length = 9;
    return RegEnumKeyExW(key, 0, name, &length, reserved, nullptr, nullptr, nullptr);
}

LONG deleteThroughNewHandle(HKEY root) {
    HKEY again = create(root, u"");
    LONG code = RegDeleteKeyW(again, u"");
    RegCloseKey(again);
    return code;
}

INSTANTIATE_TEST_SUITE_P(
    Paths, RegistryCodes,
    ::testing::Values(
        ROW("case-insensitive", 0, probe(kUser, u"sCENE\\cHILD")),
        ROW("folding beyond ASCII", 0, probe(kUser, u"\u00E9T\u00C9")),
        ROW("doubled backslash", 0, probe(kUser, u"Scene\\\\Child")),
        ROW("trailing backslashes", 0, probe(kUser, u"Scene\\Child\\\\")),
        ROW("leading backslash", 161, probe(kUser, u"\\Scene")),
        ROW("backslash alone", 161, probe(kUser, u"\\")),
        ROW("leading backslash, create", 161, tryCreate(k, u"\\New")),
        ROW("HKCR takes a leading backslash", 0, probe(HKEY_CLASSES_ROOT, u"\\")),
        ROW("slash is a name character", 2, probe(kUser, u"Scene/Child")),
        ROW("dot-dot is a name", 2, probe(k, u"Child\\..\\..")),
        ROW("trailing space counts", 2, probe(kUser, u"Scene ")),
        ROW("intermediate missing", 2, probe(kUser, u"None\\Child")),
        ROW("255-character name, absent", 2, probe(k, chars(255).c_str())),
        ROW("256-character name", 87, probe(k, chars(256).c_str())),
        ROW("255-character name, create", 0, tryCreate(k, chars(255))),
        ROW("256-character name, create", 87, tryCreate(k, chars(256)))));

INSTANTIATE_TEST_SUITE_P(
    Arguments, RegistryCodes,
    ::testing::Values(
        ROW("open NULL handle", 6, probe(nullptr, u"")),
        ROW("open bogus handle", 6, probe(kBogus, u"x")),
        ROW("open undefined root", 6, probe(kUndefinedRoot, u"")),
        ROW("open without out handle", 87, RegOpenKeyExW(k, u"Child", 0, KEY_READ, nullptr)),
        ROW("open with both views", 87, probe(k, u"Child", KEY_READ | k64 | k32)),
        ROW("open, options ignored", 0, openWith(k, REG_OPTION_OPEN_LINK | 1)),
        ROW("create, Reserved 1", 87, createWith(k, 1, 0)),
        ROW("create, undefined option bit", 0, createWith(k, 0, 0x80)),
        ROW("create with both views", 87, tryCreate(k, u"N", k64 | k32)),
        ROW("value name of 16383", 0, setDword(k, chars(16383).c_str(), 1)),
        ROW("value name of 16384", 87, setDword(k, chars(16384).c_str(), 1)),
        ROW("backslash in a value name", 0, setDword(k, u"a\\b/c", 1)),
        ROW("set from NULL data", 998, RegSetValueExW(k, u"n", 0, REG_BINARY, nullptr, 4)),
        ROW("set nothing from NULL", 0, RegSetValueExW(k, u"n", 1, REG_BINARY, nullptr, 0)),
        ROW("set, NULL handle", 6, setDword(nullptr, u"n", 1)),
        ROW("query, lpReserved", 87, RegQueryValueExW(k, u"v", &gWord, 0, 0, 0)),
        ROW("query, data without size", 87, RegQueryValueExW(k, u"v", 0, 0, &gByte, 0)),
        ROW("query, other case", 0, RegQueryValueExW(k, u"V", 0, 0, 0, 0)),
        ROW("query, NULL handle", 6, RegQueryValueExW(nullptr, u"v", 0, 0, 0, &gWord)),
        ROW("query a predefined root", 2, RegQueryValueExW(kUser, u"v", 0, 0, 0, &gWord)),
        ROW("delete value, other case", 0, RegDeleteValueW(k, u"V")),
        ROW("delete value, missing", 2, RegDeleteValueW(k, chars(400).c_str())),
        ROW("delete value, NULL handle", 6, RegDeleteValueW(nullptr, u"v")),
        ROW("enumerate, lpReserved", 87, enumWith(k, &gWord)),
        ROW("enumerate, NULL handle", 6, enumWith(nullptr, nullptr)),
        ROW("close NULL", 6, RegCloseKey(nullptr)),
        // Windows' answer is recorded nowhere; Wine answers 0 for every value from 0x80000000
        // up in both process kinds.
        ROW("close bogus", 0, RegCloseKey(kBogus)),
        ROW("close a predefined root", 0, RegCloseKey(kMachine)),
        ROW("close HKEY_PERFORMANCE_DATA", 0, RegCloseKey(HKEY_PERFORMANCE_DATA))));

// Windows refuses to delete a key with subkeys (5); the parent handle's rights do not matter.
INSTANTIATE_TEST_SUITE_P(
    Deletion, RegistryCodes,
    ::testing::Values(
        ROW("key with subkeys", 5, RegDeleteKeyW(k, u"Child")),
        ROW("own key with subkeys", 5, RegDeleteKeyW(k, u"")),
        ROW("leaf in other case", 0, RegDeleteKeyW(kUser, u"scene\\CHILD\\grandchild\\")),
        ROW("through a KEY_READ parent", 0, RegDeleteKeyW(r, u"Empty")),
        ROW("leading backslash", 161, RegDeleteKeyW(kUser, u"\\Scene\\Empty")),
        ROW("missing", 2, RegDeleteKeyW(k, u"None")),
        ROW("NULL subkey", 87, RegDeleteKeyW(k, nullptr)),
        ROW("NULL handle", 6, RegDeleteKeyW(nullptr, u"Scene")),
        ROW("both views", 87, RegDeleteKeyExW(k, u"Empty", k32 | k64, 0)),
        ROW("Ex, other bits, Reserved 1", 0, RegDeleteKeyExW(k, u"Empty", KEY_READ | k64, 1)),
        ROW("HKCU itself", 5, RegDeleteKeyW(kUser, u"")),
        ROW("empty HKCC itself", 5, RegDeleteKeyW(HKEY_CURRENT_CONFIG, u"")),
        ROW("HKU through a handle", 5, deleteThroughNewHandle(HKEY_USERS))));

}  // namespace
