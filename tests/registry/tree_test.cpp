// Enumerating subkeys, and deleting whole trees bottom-up through index 0.
#include "registry_fixture.h"

#include <cstring>

namespace {

using RegistryTree = RegistryTest;

struct EnumCase {
    DWORD index, capacity;
    LONG expected;
};
void PrintTo(const EnumCase& c, std::ostream* os) {
    *os << "index " << c.index << ", capacity " << c.capacity;
}

class RegistryEnumName : public RegistryTest, public ::testing::WithParamInterface<EnumCase> {};

// A 10-character name needs 11 WCHARs; short of that nothing is written, the count included.
TEST_P(RegistryEnumName, WritesTheNameOnlyWithItsTerminator) {
    const EnumCase& c = GetParam();
    HKEY key = create(kUser, u"E");
    make(key, u"0123456789");
    WCHAR name[16];
    std::memset(name, kSentinel, sizeof name);
    DWORD length = c.capacity;
    EXPECT_EQ(RegEnumKeyExW(key, c.index, name, &length, nullptr, nullptr, nullptr, nullptr),
              c.expected);
    bool ok = c.expected == ERROR_SUCCESS;
    EXPECT_EQ(length, ok ? 10 : c.capacity);
    EXPECT_EQ(std::u16string(name, ok ? 11 : 0), ok ? std::u16string(u"0123456789", 11) : u"");
    auto* bytes = reinterpret_cast<const BYTE*>(name);
    for (size_t i = ok ? 22 : 0; i < sizeof name; ++i) ASSERT_EQ(bytes[i], kSentinel) << i;
    RegCloseKey(key);
}

INSTANTIATE_TEST_SUITE_P(
    Capacities, RegistryEnumName,
    ::testing::Values(EnumCase{0, 0, 234}, EnumCase{0, 5, 234}, EnumCase{0, 10, 234},
                      EnumCase{0, 11, 0}, EnumCase{0, 16, 0}, EnumCase{1, 16, 259},
                      EnumCase{0xFFFFFFFF, 16, 259}));

TEST_F(RegistryTree, EnumerationIsInCaseInsensitiveOrder) {
    HKEY key = create(kUser, u"Order");
    for (auto name : {u"c", u"B2", u"a b", u"10", u"Z", u"_u", u"aa", u"9", u"b", u"A",
                      u"\u00C9E2", u"\u00E9e"})
        make(key, name);
    // Windows promises no order and its order is recorded nowhere; Wine's, in both process
    // kinds: the names compare in lower case, so '_' comes before the letters.
    const std::vector<std::u16string> expected = {u"10", u"9", u"_u", u"A",  u"a b", u"aa",
                                                  u"b",  u"B2", u"c", u"Z",  u"\u00E9e",
                                                  u"\u00C9E2"};
    std::vector<std::u16string> seen;
    for (DWORD i = 0; i < expected.size(); ++i) seen.push_back(subkeyAt(key, i));
    EXPECT_EQ(seen, expected);
    RegCloseKey(key);
}

// What Windows warns about: deleting while the index grows skips every other child.
TEST_F(RegistryTree, IncreasingTheIndexWhileDeletingSkipsEveryOtherChild) {
    HKEY key = create(kUser, u"Kids");
    for (auto name : {u"k0", u"k1", u"k2", u"k3", u"k4", u"k5"}) make(key, name);
    for (DWORD i = 0; i < 6; ++i) {
        std::u16string name = subkeyAt(key, i);
        if (!name.empty()) RegDeleteKeyW(key, name.c_str());
    }
    EXPECT_EQ(subkeyAt(key, 0) + subkeyAt(key, 1) + subkeyAt(key, 2), u"k1k3k5");
    RegCloseKey(key);
}

// The deletion walk: open with DELETE | KEY_ENUMERATE_SUB_KEYS, take subkey 0 until 259, delete
// each key through its parent while its own handle is still open, then close that handle.
LONG deleteTree(HKEY root, const std::u16string& path) {
    struct Level {
        HKEY parent, key;
        std::u16string name;
    };
    std::vector<Level> stack{{root, nullptr, path}};
    if (LONG code = RegOpenKeyExW(root, path.c_str(), 0, kTreeWalk, &stack[0].key)) return code;
    while (!stack.empty()) {
        WCHAR name[1024];
        DWORD length = 1024;
        HKEY top = stack.back().key, child = nullptr;
        LONG code = RegEnumKeyExW(top, 0, name, &length, nullptr, nullptr, nullptr, nullptr);
        if (code == ERROR_SUCCESS) code = RegOpenKeyExW(top, name, 0, kTreeWalk, &child);
        if (code == ERROR_SUCCESS) {
            stack.push_back({top, child, name});
            continue;
        }
        if (code == ERROR_NO_MORE_ITEMS)
            code = RegDeleteKeyW(stack.back().parent, stack.back().name.c_str());
        RegCloseKey(top);
        stack.pop_back();
        if (code) return code;
    }
    return ERROR_SUCCESS;
}

TEST_F(RegistryTree, A512LevelTreeDeletesBottomUpThroughIndexZero) {
    std::u16string levels32;
    for (int i = 0; i < 32; ++i) levels32 += u"L\\";
    HKEY key = create(kUser, u"Deep\\Side\\Branch");
    RegCloseKey(key);
    key = create(kUser, u"Deep");
    for (int call = 0; call < 16; ++call) {  // levels 2 to 512
        HKEY deeper = create(key, call == 15 ? levels32.substr(2) : levels32);
        RegCloseKey(key);
        key = deeper;
    }
    RegCloseKey(key);
    EXPECT_EQ(deleteTree(kUser, u"Deep"), 0);
    EXPECT_EQ(probe(kUser, u"Deep"), 2);
    EXPECT_EQ(w32test::openHandleCount(), 0u);
}

// A wide key empties child by child through index 0; how fast is the benchmarks' business.
TEST_F(RegistryTree, FiftyThousandChildrenDeleteOneByOne) {
    HKEY key = create(kUser, u"Wide");
    for (int i = 0; i < 50000; ++i) {
        std::string digits = std::to_string(i);
        make(key, u"child" + std::u16string(digits.begin(), digits.end()));
    }
    RegCloseKey(key);
    w32test::clearJournal();
    EXPECT_EQ(deleteTree(kUser, u"Wide"), 0);
    EXPECT_EQ(w32test::count("RegDeleteKeyW"), 50001u);
}

}  // namespace
