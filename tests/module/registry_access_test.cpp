// The masks and roots of the routines proven by their effect: keys that refuse one right, and
// each root by index and by name. The view flag has its own tests (registry_views_test.cpp).
#include "registry_fixture.h"

namespace hvreg {
namespace {

struct Denial {
    DWORD rights;
    int seen;  // "Key exists", "Value exists", "Current key exists"
    DWORD read, write, deleteValue, deleteKey;
};
void PrintTo(const Denial& d, std::ostream* os) { *os << "denied " << std::hex << d.rights; }

class RegistryDenials : public RegistryFixture, public ::testing::WithParamInterface<Denial> {};

// Reads ask exactly KEY_READ, writes and value deletions full access, the tree walk only
// DELETE and enumeration.
TEST_P(RegistryDenials, EachRoutineNeedsExactlyItsRights) {
    HV_NEEDS_TEST_CONTROL();
    const Denial& d = GetParam();
    standardScene();
    const std::string scene = sceneState();
    w32test::denyAccess(CurrentUser, at(u"K"), d.rights);
    const Param root = Param::rootKey(User), key = Param::str(at(u"K")), d7 = Param::str(u"d");
    EXPECT_EQ(cond(KeyExists, {root, key}).asCondition(), d.seen);
    EXPECT_EQ(cond(ValueExists, {root, key, d7}).asCondition(), d.seen);
    EXPECT_EQ(cond(CurrentKeyExists).asCondition(), d.seen);
    EXPECT_EQ(expr(GetDword, {Param::str(RootNames[User]), key, d7}).asInteger(), d.read ? 0 : 7);
    EXPECT_EQ(instance.lastError(), d.read);
    act(SetDword, {root, key, d7, Param::integerValue(9)});
    EXPECT_EQ(instance.lastError(), d.write);
    act(DeleteValue, {root, key, Param::str(u"s")});
    EXPECT_EQ(instance.lastError(), d.deleteValue);
    w32test::denyAccess(CurrentUser, at(u"K"), 0);
    EXPECT_EQ(sceneState(), scene) << "refused writes change nothing";
    w32test::denyAccess(CurrentUser, at(u"K"), d.rights);
    act(DeleteKey, {root, key});
    EXPECT_EQ(instance.lastError(), d.deleteKey);
    w32test::denyAccess(CurrentUser, at(u"K"), 0);  // recreates K if it went
    EXPECT_EQ(exists(CurrentUser, at(u"K\\C")), d.deleteKey != 0);
}

INSTANTIATE_TEST_SUITE_P(
    Rights, RegistryDenials,
    ::testing::Values(Denial{KEY_QUERY_VALUE, 0, 5, 5, 5, 0}, Denial{KEY_SET_VALUE, 1, 0, 5, 5, 0},
                      Denial{KEY_CREATE_SUB_KEY, 1, 0, 5, 5, 0},
                      Denial{KEY_ENUMERATE_SUB_KEYS, 0, 5, 5, 5, 5},
                      Denial{KEY_NOTIFY, 0, 5, 5, 5, 0}, Denial{KEY_CREATE_LINK, 1, 0, 5, 5, 0},
                      Denial{READ_CONTROL, 0, 5, 5, 5, 0}, Denial{DELETE, 1, 0, 5, 5, 5}));

using RegistryRootTable = RegistryFixture;
const HKEY RootHandles[5] = {HKEY_CLASSES_ROOT, HKEY_LOCAL_MACHINE, HKEY_CURRENT_USER,
                             HKEY_CURRENT_CONFIG, HKEY_USERS};

TEST_F(RegistryRootTable, EachIndexAndEachNameInAnyCaseReachesItsOwnRoot) {
    put(CurrentUser, at(u"P"), u"v", REG_DWORD, {77, 0, 0, 0});
    instance.setLastError(Untouched);
    for (uint32_t i = 0; i < 5; ++i) {
        SCOPED_TRACE(i);
        w32test::clearJournal();
        // An empty path opens the root itself.
        EXPECT_EQ(cond(KeyExists, {Param::rootKey(i), Param::str(u"")}).asCondition(), 1);
        if (Layer) {
            EXPECT_EQ(callsOf(w32test::journal(), "RegOpenKeyExW").at(0).args[0],
                      handleValue(RootHandles[i]));
        }
        EXPECT_EQ(cond(KeyExists, {Param::rootKey(i), Param::str(at(u"P"))}).asCondition(),
                  i == User);
    }
    EXPECT_EQ(instance.lastError(), Untouched) << "conditions leave the error alone";
    act(CreateKey, {Param::rootKey(User), Param::str(u"")});  // the root itself
    EXPECT_EQ(instance.lastError(), 0u);
    for (uint32_t i = 0; i < 5; ++i) {
        std::u16string lower = RootNames[i];
        for (char16_t& c : lower) c = c >= u'A' && c <= u'Z' ? char16_t(c + 32) : c;
        auto o = expr(GetDword, {Param::str(lower), Param::str(at(u"P")), Param::str(u"v")});
        EXPECT_EQ(o.asInteger(), i == User ? 77 : 0) << i;
        EXPECT_EQ(instance.lastError(), i == User ? 0u : 2u) << i;  // not 40: the name matched
    }
}

// A root-key name selects the root whose display name it equals ignoring the case of A to Z,
// and nothing else: names of equal length, names that end alike, prefixes and longer names.
struct RootName {
    const char16_t* name;
    int root;  // the root index it selects, or -1
};
void PrintTo(const RootName& r, std::ostream* os) { *os << hvtest::show(r.name); }

class RegistryRootNames : public RegistryFixture, public ::testing::WithParamInterface<RootName> {};

TEST_P(RegistryRootNames, SelectExactlyTheirRoot) {
    const RootName& r = GetParam();
    put(CurrentUser, at(u"P"), u"v", REG_DWORD, {77, 0, 0, 0});
    w32test::clearJournal();
    auto o = expr(GetDword, {Param::str(r.name), Param::str(at(u"P")), Param::str(u"v")});
    EXPECT_EQ(o.asInteger(), r.root == int(User) ? 77 : 0);
    // 40: no root; 2: a root without the key.
    EXPECT_EQ(instance.lastError(), r.root < 0 ? 40u : r.root == int(User) ? 0u : 2u);
    if (Layer) {
        auto opens = callsOf(w32test::journal(), "RegOpenKeyExW");
        ASSERT_EQ(opens.size(), r.root < 0 ? 0u : 1u);
        if (r.root >= 0) {
            EXPECT_EQ(opens[0].args[0], handleValue(RootHandles[r.root]));
        }
    }
}

INSTANTIATE_TEST_SUITE_P(
    Names, RegistryRootNames,
    ::testing::Values(RootName{u"HKEY_CLASSES_ROOT", 0}, RootName{u"HKEY_LOCAL_MACHINE", 1},
                      RootName{u"HKEY_CURRENT_USER", 2}, RootName{u"HKEY_CURRENT_CONFIG", 3},
                      RootName{u"HKEY_USERS", 4}, RootName{u"Hkey_Current_User", 2},
                      RootName{u"HKEY_CURRENT_USEr", 2}, RootName{u"hkey_classes_rooT", 0},
                      RootName{u"HKEY_CLASSES_ROOR", -1}, RootName{u"HKEY_CURRENT_USET", -1},
                      RootName{u"HKEY_CURRENT_USE", -1}, RootName{u"HKEY_CURRENT_USERS", -1},
                      RootName{u"HKEY_CURRENT_CONFIGURATION_OF_THE_MACHINE", -1},
                      RootName{u"HKEY_USER", -1}, RootName{u"HKEY_USERS_", -1}));

}  // namespace
}  // namespace hvreg
