// Access: the rights a handle carries, stale handles, denied rights, faults and the journal.
#include "registry_fixture.h"

namespace {

using RegistryAccess = RegistryTest;

struct MaskCase {
    REGSAM sam;
    LONG query, set, enumerate, deleteValue;
};
void PrintTo(const MaskCase& c, std::ostream* os) { *os << "samDesired 0x" << std::hex << c.sam; }

class RegistryMasks : public RegistryTest, public ::testing::WithParamInterface<MaskCase> {};

// Values and enumeration need the handle's rights; creating and deleting subkeys never do.
TEST_P(RegistryMasks, EachOperationChecksItsRight) {
    const MaskCase& c = GetParam();
    HKEY full = create(user, TEXT("Masked"));
    ASSERT_EQ(setDword(full, TEXT("v"), 1), 0);
    RegCloseKey(full);
    HKEY key = nullptr;
    ASSERT_EQ(RegOpenKeyExW(user, TEXT("Masked"), 0, c.sam, &key), 0);
    EXPECT_EQ(tryCreate(key, TEXT("Child"), KEY_READ), 0);
    EXPECT_EQ(RegQueryValueExW(key, TEXT("v"), nullptr, nullptr, nullptr, nullptr), c.query);
    EXPECT_EQ(setDword(key, TEXT("w"), 2), c.set);
    EXPECT_EQ(subkeyAt(key, 0) == TEXT("Child") ? 0 : 5, c.enumerate);
    EXPECT_EQ(RegDeleteValueW(key, TEXT("missing")), c.deleteValue);  // rights before existence
    EXPECT_EQ(RegDeleteKeyW(key, TEXT("Child")), 0);
    RegCloseKey(key);
}

INSTANTIATE_TEST_SUITE_P(Masks, RegistryMasks,
                         ::testing::Values(MaskCase{KEY_READ, 0, 5, 0, 5},
                                           MaskCase{0x20119, 0, 5, 0, 5},
                                           MaskCase{KEY_WRITE, 5, 0, 5, 2},
                                           MaskCase{KEY_QUERY_VALUE, 0, 5, 5, 5},
                                           MaskCase{TreeWalk, 5, 5, 0, 5}, MaskCase{0, 5, 5, 5, 5},
                                           MaskCase{KEY_ALL_ACCESS, 0, 0, 0, 2}));

TEST_F(RegistryAccess, HandlesToADeletedKeyStayStaleEvenAfterItsPathReturns) {
    HKEY stale = create(user, TEXT("Gone"));
    HKEY walker = create(user, TEXT("Gone"), TreeWalk);
    ASSERT_EQ(RegDeleteKeyW(user, TEXT("Gone")), 0);  // deleting with handles open is allowed
    EXPECT_EQ(probe(user, TEXT("Gone")), 2);
    EXPECT_EQ(subkeyAt(user, 0), TEXT(""));  // no longer enumerated
    make(user, TEXT("Gone"));
    HKEY out = reinterpret_cast<HKEY>(1);
    DWORD size = 0;
    EXPECT_EQ(RegQueryValueExW(stale, TEXT("v"), nullptr, nullptr, nullptr, &size), 1018);
    EXPECT_EQ(setDword(stale, TEXT("v"), 1), 1018);
    EXPECT_EQ(RegDeleteValueW(stale, TEXT("v")), 1018);
    EXPECT_EQ(tryCreate(stale, TEXT("s")), 1018);
    EXPECT_EQ(probe(stale, TEXT("s")), 1018);
    EXPECT_EQ(RegOpenKeyExW(stale, TEXT(""), 0, KEY_READ, &out), 1018);
    EXPECT_EQ(out, nullptr);
    WCHAR name[8];
    DWORD length = 8;
    EXPECT_EQ(RegEnumKeyExW(walker, 0, name, &length, nullptr, nullptr, nullptr, nullptr), 1018);
    EXPECT_EQ(RegDeleteKeyW(stale, TEXT("")), 1018);
    EXPECT_EQ(RegDeleteKeyExW(stale, TEXT("s"), View64, 0), 1018);
    EXPECT_EQ(probe(user, TEXT("Gone")), 0);  // the new key is untouched
    EXPECT_EQ(RegCloseKey(stale), 0);
    EXPECT_EQ(RegCloseKey(walker), 0);
}

TEST_F(RegistryAccess, DeniedRightsRefuseOpeningDeletingAndNewChildren) {
    HV_LAYER_ONLY("rights are denied through the layer's setting (and Wine enforces no ACL)");
#if HV_OVER_LAYER
    w32test::denyAccess(CurrentUser, TEXT("Locked"), KEY_SET_VALUE | DELETE | KEY_CREATE_SUB_KEY);
    HKEY key = reinterpret_cast<HKEY>(1);
    EXPECT_EQ(RegOpenKeyExW(CurrentUser, TEXT("Locked"), 0, KEY_ALL_ACCESS, &key), 5);
    EXPECT_EQ(key, nullptr);
    EXPECT_EQ(tryCreate(CurrentUser, TEXT("Locked"), KEY_WRITE), 5);
    EXPECT_EQ(probe(CurrentUser, TEXT("Locked"), KEY_READ | View64), 0);
    EXPECT_EQ(tryCreate(CurrentUser, TEXT("Locked\\Child"), KEY_READ), 5);
    EXPECT_EQ(RegDeleteKeyW(CurrentUser, TEXT("Locked")), 5);
    w32test::denyAccess(CurrentUser, TEXT(""),
                        KEY_SET_VALUE);  // on a root: the predefined handle too
    EXPECT_EQ(setDword(CurrentUser, TEXT("v"), 1), 5);
    w32test::denyAccess(CurrentUser, TEXT("Locked"), 0);
    EXPECT_EQ(RegDeleteKeyW(CurrentUser, TEXT("Locked")), 0);
#endif
}

TEST_F(RegistryAccess, InjectedFaultsChangeNothingAndCallsAreJournaled) {
    HV_LAYER_ONLY("fault injection, handle count and call journal");
#if HV_OVER_LAYER
    w32test::clearJournal();
    size_t open = w32test::openHandleCount();
    w32test::failCall("RegCreateKeyExW", 1, 1450);
    HKEY key = reinterpret_cast<HKEY>(1);
    EXPECT_EQ(
        RegCreateKeyExW(CurrentUser, TEXT("F"), 0, nullptr, 0, 0xF013F, nullptr, &key, nullptr),
        1450);
    EXPECT_EQ(key, nullptr);
    EXPECT_EQ(probe(CurrentUser, TEXT("F")), 2);
    key = create(CurrentUser, TEXT("F"));
    w32test::failCall("RegCloseKey", 1, 6);
    EXPECT_EQ(RegCloseKey(key), 6);
    EXPECT_EQ(w32test::openHandleCount(), open + 1);
    w32test::failAlways("RegDeleteKeyExW", 5);
    EXPECT_EQ(RegDeleteKeyExW(key, TEXT(""), View64, 0), 5);
    EXPECT_EQ(RegCloseKey(key), 0);
    EXPECT_EQ(probe(CurrentUser, TEXT("F"), 0x20119), 0);

    auto creates = w32test::callsOf("RegCreateKeyExW");
    ASSERT_EQ(creates.size(), 2u);
    EXPECT_EQ(creates[0].args[5], 0xF013Fu);
    EXPECT_EQ(creates[0].result, 1450);
    auto deletes = w32test::callsOf("RegDeleteKeyExW");
    ASSERT_EQ(deletes.size(), 1u);
    EXPECT_EQ(deletes[0].args[2], uint64_t(View64));
    EXPECT_EQ(deletes[0].args[3], 0u);
    EXPECT_EQ(w32test::callsOf("RegOpenKeyExW").back().args[3], 0x20119u);
#endif
}

}  // namespace
