// Selecting the root key, the current key and the registry view, and reading them back.
#include "support.h"

namespace {

using hv::Param;
enum { SetRootKey = 0, SetCurrentKey = 1, Set64BitMode = 12 };
enum { GetCurrentRootKey = 0, GetCurrentKey = 1 };
enum { LastActionSuccessful = 4 };

const char16_t* const RootNames[] = {u"HKEY_CLASSES_ROOT", u"HKEY_LOCAL_MACHINE",
                                     u"HKEY_CURRENT_USER", u"HKEY_CURRENT_CONFIG", u"HKEY_USERS"};

class KeySelection : public ::testing::Test {
protected:
    hv::Instance instance{hvtest::module()};
};

TEST_F(KeySelection, EachValidRootIndexIsSelectedAndNamed) {
    for (uint32_t index = 0; index < 5; ++index) {
        SCOPED_TRACE(index);
        instance.setLastError(99);
        instance.action(SetRootKey, {Param::rootKey(index)});
        EXPECT_EQ(instance.rootKeyIndex(), index);
        EXPECT_EQ(instance.lastError(), 0u);
        auto name = instance.expression(GetCurrentRootKey);
        EXPECT_TRUE(name.isText);
        EXPECT_EQ(name.text, RootNames[index]);
    }
}

TEST_F(KeySelection, InvalidRootIndexKeepsTheOldRoot) {
    instance.action(SetRootKey, {Param::rootKey(4)});
    for (uint32_t bad : {5u, 7u, 0x80000000u, 0xFFFFFFFFu}) {
        SCOPED_TRACE(bad);
        instance.action(SetRootKey, {Param::rootKey(bad)});
        EXPECT_EQ(instance.rootKeyIndex(), 4u);
        EXPECT_EQ(instance.lastError(), 40u);
        EXPECT_EQ(instance.condition(LastActionSuccessful).asCondition(), 0);
    }
    instance.action(SetRootKey, {Param::null()});
    EXPECT_EQ(instance.rootKeyIndex(), 4u);
    EXPECT_EQ(instance.lastError(), 40u);
}

TEST_F(KeySelection, RootChangeKeepsTheCurrentKeyPath) {
    instance.action(SetCurrentKey, {Param::str(u"Software\\Demo")});
    instance.action(SetRootKey, {Param::rootKey(2)});
    EXPECT_EQ(hvtest::text(reinterpret_cast<const WCHAR*>(instance.currentKey())),
              u"Software\\Demo");
}

TEST_F(KeySelection, CurrentKeyIsTheInstancesOwnCopy) {
    std::u16string path = u"Software\\Demo\\ \u00e9t\u00e9/x";
    auto set = instance.action(SetCurrentKey, {Param::str(path)});
    EXPECT_TRUE(set.sentinelsIntact);
    EXPECT_EQ(instance.lastError(), 0u);
    auto got = instance.expression(GetCurrentKey);
    EXPECT_TRUE(got.isText);
    EXPECT_EQ(got.text, path);
    EXPECT_EQ(got.textAddress, static_cast<const void*>(instance.currentKey()));
}

TEST_F(KeySelection, EmptyCurrentKeyIsAKeyNotTheEmptyString) {
    auto none = instance.expression(GetCurrentKey);
    EXPECT_EQ(none.text, u"");
    instance.action(SetCurrentKey, {Param::str(u"")});
    EXPECT_EQ(instance.lastError(), 0u);
    ASSERT_NE(instance.currentKey(), nullptr);
    auto empty = instance.expression(GetCurrentKey);
    EXPECT_EQ(empty.text, u"");
    EXPECT_EQ(empty.textAddress, static_cast<const void*>(instance.currentKey()));
    EXPECT_NE(empty.textAddress, none.textAddress) << "an empty key is not the static empty text";
}

TEST_F(KeySelection, TheReturnedKeyCanBeSetAgain) {
    instance.action(SetCurrentKey, {Param::str(u"A\\B")});
    auto got = instance.expression(GetCurrentKey);
    // Hand the module its own text back, as an event sheet does with RegCurKey$( ).
    typedef short(WINAPI * Action)(void*, hv::Slot, hv::Slot);
    auto routine = reinterpret_cast<Action>(hvtest::module().tables().actions[SetCurrentKey]);
    routine(instance.record(), reinterpret_cast<hv::Slot>(got.textAddress), 0);
    EXPECT_EQ(hvtest::text(reinterpret_cast<const WCHAR*>(instance.currentKey())), u"A\\B");
    EXPECT_EQ(instance.lastError(), 0u);
}

TEST_F(KeySelection, NullPathKeepsTheCurrentKey) {
    instance.action(SetCurrentKey, {Param::str(u"Keep")});
    instance.action(SetCurrentKey, {Param::null()});
    EXPECT_EQ(instance.lastError(), 40u);
    EXPECT_EQ(instance.expression(GetCurrentKey).text, u"Keep");
}

// Running out of memory must neither lose the author's key nor pass for success.
TEST_F(KeySelection, FailedCopyKeepsTheOldKeyAndReportsNoMemory) {
    HV_NEEDS_TEST_CONTROL();
#if HV_HAS_TEST_CONTROL
    instance.action(SetCurrentKey, {Param::str(u"Old\\Key")});
    const void* before = instance.currentKey();
    w32test::failCall("calloc", 1, 0);
    w32test::failCall("malloc", 1, 0);
    instance.action(SetCurrentKey, {Param::str(u"New\\Key")});
    w32test::clearFaults();
    EXPECT_EQ(instance.lastError(), 8u);
    EXPECT_EQ(static_cast<const void*>(instance.currentKey()), before);
    EXPECT_EQ(instance.expression(GetCurrentKey).text, u"Old\\Key");
    EXPECT_EQ(instance.condition(LastActionSuccessful).asCondition(), 0);
#endif
}

TEST_F(KeySelection, ViewFlagIsNormalisedAndLeavesTheErrorAlone) {
    instance.action(SetRootKey, {Param::rootKey(9)});  // leaves lastError 40
    for (int32_t value : {2, -1, 1, 0x10000}) {
        instance.action(Set64BitMode, {Param::integerValue(value)});
        EXPECT_EQ(instance.use64BitView(), 1u) << value;
    }
    instance.action(Set64BitMode, {Param::integerValue(0)});
    EXPECT_EQ(instance.use64BitView(), 0u);
    EXPECT_EQ(instance.lastError(), 40u);
}

TEST_F(KeySelection, InvalidLoadedRootIndexReadsAsEmptyName) {
    for (uint32_t bad : {5u, 9u, 0xFFFFFFFFu}) {
        instance.setRootKeyIndex(bad);
        auto name = instance.expression(GetCurrentRootKey);
        EXPECT_TRUE(name.isText);
        EXPECT_EQ(name.text, u"") << bad;
    }
}

TEST_F(KeySelection, TextResultsOnlyAddTheStringFlag) {
    instance.setHeaderFlags(0x0101);
    auto r = instance.expression(GetCurrentRootKey);
    EXPECT_TRUE(r.isText);
    EXPECT_EQ(instance.headerFlags(), 0x8101);
}

TEST_F(KeySelection, ReportingExpressionsDoNotTouchTheError) {
    instance.setLastError(1234);
    instance.expression(GetCurrentRootKey);
    instance.expression(GetCurrentKey);
    EXPECT_EQ(instance.lastError(), 1234u);
}

}  // namespace
