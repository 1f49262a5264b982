// Enumerating subkeys, and deleting whole trees bottom-up through index 0.
#include "registry_fixture.h"

#include <algorithm>
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
    HKEY key = create(user, TEXT("E"));
    make(key, TEXT("0123456789"));
    WCHAR name[16];
    std::memset(name, Sentinel, sizeof name);
    DWORD length = c.capacity;
    EXPECT_EQ(RegEnumKeyExW(key, c.index, name, &length, nullptr, nullptr, nullptr, nullptr),
              c.expected);
    bool ok = c.expected == ERROR_SUCCESS;
    EXPECT_EQ(length, ok ? 10 : c.capacity);
    EXPECT_EQ(WString(name, ok ? 11 : 0), ok ? WString(TEXT("0123456789"), 11) : TEXT(""));
    auto* bytes = reinterpret_cast<const BYTE*>(name);
    for (size_t i = ok ? 22 : 0; i < sizeof name; ++i) ASSERT_EQ(bytes[i], Sentinel) << i;
    RegCloseKey(key);
}

INSTANTIATE_TEST_SUITE_P(Capacities, RegistryEnumName,
                         ::testing::Values(EnumCase{0, 0, 234}, EnumCase{0, 5, 234},
                                           EnumCase{0, 10, 234}, EnumCase{0, 11, 0},
                                           EnumCase{0, 16, 0}, EnumCase{1, 16, 259},
                                           EnumCase{0xFFFFFFFF, 16, 259}));

// Windows documents no order, but a hive keeps each key's subkey list sorted by the names'
// upper case (so '_' comes after the letters), and enumeration follows that list.
TEST_F(RegistryTree, EnumerationIsInCaseInsensitiveOrder) {
    HV_WINE_DIFFERS("Wine orders subkeys by their lower case, '_' before the letters");
    HKEY key = create(user, TEXT("Order"));
    const WCHAR* names[] = {TEXT("c"), TEXT("B2"), TEXT("a b"),      TEXT("10"),
                            TEXT("Z"), TEXT("_u"), TEXT("aa"),       TEXT("9"),
                            TEXT("b"), TEXT("A"),  TEXT("\u00C9E2"), TEXT("\u00E9e")};
    for (const WCHAR* name : names) make(key, name);
    const std::vector<WString> expected = {
        TEXT("10"), TEXT("9"), TEXT("A"), TEXT("a b"), TEXT("aa"),      TEXT("b"),
        TEXT("B2"), TEXT("c"), TEXT("Z"), TEXT("_u"),  TEXT("\u00E9e"), TEXT("\u00C9E2")};
    std::vector<WString> seen;
    for (DWORD i = 0; i < expected.size(); ++i) seen.push_back(subkeyAt(key, i));
    EXPECT_EQ(seen, expected);
    RegCloseKey(key);
}

// What Windows warns about: deleting while the index grows skips every other child.
TEST_F(RegistryTree, IncreasingTheIndexWhileDeletingSkipsEveryOtherChild) {
    HKEY key = create(user, TEXT("Kids"));
    for (auto name : {TEXT("k0"), TEXT("k1"), TEXT("k2"), TEXT("k3"), TEXT("k4"), TEXT("k5")})
        make(key, name);
    for (DWORD i = 0; i < 6; ++i) {
        WString name = subkeyAt(key, i);
        if (!name.empty()) RegDeleteKeyW(key, name.c_str());
    }
    EXPECT_EQ(subkeyAt(key, 0) + subkeyAt(key, 1) + subkeyAt(key, 2), TEXT("k1k3k5"));
    RegCloseKey(key);
}

// The module's deletion walk (deleteTree) takes a tree as deep as Windows allows.
TEST_F(RegistryTree, A512LevelTreeDeletesBottomUpThroughIndexZero) {
    make(user, TEXT("Deep\\Side\\Branch"));
    HKEY key = create(user, TEXT("Deep"));
    for (unsigned depth = 4; depth < 512;) {  // Deep is 4 levels below HKEY_CURRENT_USER
        unsigned step = std::min(32u, 512 - depth);
        HKEY deeper = create(key, levels(step, TEXT("L")));
        RegCloseKey(key);
        key = deeper;
        depth += step;
    }
    RegCloseKey(key);
    EXPECT_EQ(deleteTree(user, TEXT("Deep")), 0);
    EXPECT_EQ(probe(user, TEXT("Deep")), 2);
}

// A wide key empties child by child through index 0; how fast is the benchmarks' business.
TEST_F(RegistryTree, FiftyThousandChildrenDeleteOneByOne) {
    HV_LAYER_ONLY("counts calls in the journal; 50,000 keys take minutes under Wine");
#if HV_OVER_LAYER
    HKEY key = create(user, TEXT("Wide"));
    for (int i = 0; i < 50000; ++i) make(key, TEXT("child") + conf::widen(std::to_string(i)));
    RegCloseKey(key);
    w32test::clearJournal();
    EXPECT_EQ(deleteTree(user, TEXT("Wide")), 0);
    EXPECT_EQ(w32test::count("RegDeleteKeyW"), 50001u);
#endif
}

}  // namespace
