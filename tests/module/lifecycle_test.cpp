// Instance lifecycle and the RunObjectInfos block, called through the exact shapes the host uses.
#include "support.h"

namespace {

using hv::Slot;
typedef short(WINAPI* DataSizeFn)(Slot, Slot);
typedef short(WINAPI* CreateFn)(void*, Slot, Slot);
typedef short(WINAPI* DestroyFn)(void*, Slot);
typedef short(WINAPI* OneArgFn)(void*);
typedef short(WINAPI* InfosFn)(Slot, void*);

const size_t Ptr = sizeof(void*);

// Offsets of the RunObjectInfos fields after the three table pointers.
size_t countsAt() { return 3 * Ptr; }

TEST(Lifecycle, RecordSizeIs200BytesIn32Bits) {
    auto size = hvtest::module().entry<DataSizeFn>("GetRunObjectDataSize")(0, 0);
    EXPECT_EQ(size, Ptr == 4 ? 200 : 208);
}

TEST(Lifecycle, CreateSetsTheFourFieldsWhateverTheHostLeftThere) {
    std::vector<uint8_t> record(256, 0xEE);
    EXPECT_EQ(hvtest::module().entry<CreateFn>("CreateRunObject")(record.data(), 7, 9), 0);
    uint32_t root, error, view;
    void* key;
    memcpy(&root, &record[hv::BuildLayout.rootKeyIndex], 4);
    memcpy(&key, &record[hv::BuildLayout.currentKey], Ptr);
    memcpy(&error, &record[hv::BuildLayout.lastError], 4);
    memcpy(&view, &record[hv::BuildLayout.use64BitView], 4);
    EXPECT_EQ(root, 0u);
    EXPECT_EQ(key, nullptr);
    EXPECT_EQ(error, 0u);
    EXPECT_EQ(view, 0u);
    // The host's header is the host's.
    for (size_t i = 0; i < 184; ++i) ASSERT_EQ(record[i], 0xEE) << "header byte " << i;
    for (size_t i = hv::BuildLayout.use64BitView + 4; i < record.size(); ++i)
        ASSERT_EQ(record[i], 0xEE) << "byte " << i << " after the record";
}

TEST(Lifecycle, DestroyFreesTheKeyOnceAndIsHarmlessTwice) {
    hv::Instance instance(hvtest::module());
    instance.action(1, {hv::Param::str(u"Software\\Demo")});
    auto destroy = hvtest::module().entry<DestroyFn>("DestroyRunObject");
#if HV_HAS_TEST_CONTROL
    size_t live = w32test::liveAllocations();
    EXPECT_EQ(destroy(instance.record(), 0), 0);
    EXPECT_EQ(w32test::liveAllocations(), live - 1);
#else
    EXPECT_EQ(destroy(instance.record(), 0), 0);
#endif
    EXPECT_EQ(instance.currentKey(), nullptr);
    EXPECT_EQ(destroy(instance.record(), 0), 0);
    EXPECT_EQ(instance.currentKey(), nullptr);
}

TEST(Lifecycle, HandlePauseContinueDisplayAnswerFixedValues) {
    hv::Instance instance(hvtest::module());
    EXPECT_EQ(hvtest::module().entry<OneArgFn>("HandleRunObject")(instance.record()), 1);
    for (const char* name : {"PauseRunObject", "ContinueRunObject", "DisplayRunObject"}) {
        SCOPED_TRACE(name);
        EXPECT_EQ(hvtest::module().entry<OneArgFn>(name)(instance.record()), 0);
    }
    // One routine answers all three.
    EXPECT_EQ(hvtest::module().address("PauseRunObject"),
              hvtest::module().address("ContinueRunObject"));
    EXPECT_EQ(hvtest::module().address("PauseRunObject"),
              hvtest::module().address("DisplayRunObject"));
}

TEST(Lifecycle, InfosBlockHoldsTheTablesCountsAndConstants) {
    std::vector<uint8_t> block(64, 0x5A);
    auto infos = hvtest::module().entry<InfosFn>("GetRunObjectInfos");
    ASSERT_EQ(infos(0, block.data()), 1);
    size_t c = countsAt();
    auto u16 = [&](size_t at) { return static_cast<unsigned>(block[at] | block[at + 1] << 8); };
    EXPECT_EQ(u16(c), 5u);
    EXPECT_EQ(u16(c + 2), 13u);
    EXPECT_EQ(u16(c + 4), 8u);
    EXPECT_EQ(u16(c + 6), 20u);
    EXPECT_EQ(std::vector<uint8_t>(&block[c + 8], &block[c + 12]), std::vector<uint8_t>(4, 0));
    EXPECT_EQ(block[c + 12], 100);
    EXPECT_EQ(block[c + 13], 0x5A) << "the host's byte must stay as it was";
    EXPECT_EQ(u16(c + 14), 0u);
    EXPECT_EQ(std::vector<uint8_t>(&block[c + 16], &block[c + 20]),
              (std::vector<uint8_t>{0x54, 0x4C, 0x56, 0x48}));
    EXPECT_EQ(u16(c + 20), 1u);
    for (size_t i = c + 22; i < block.size(); ++i) ASSERT_EQ(block[i], 0x5A) << "byte " << i;

    // The same tables and values on every call.
    std::vector<uint8_t> again(64, 0x5A);
    infos(0, again.data());
    EXPECT_EQ(block, again);
}

TEST(Lifecycle, RoutineTablesEndWithANullEntry) {
    const auto& t = hvtest::module().tables();
    EXPECT_EQ(t.conditions.size(), 5u);
    EXPECT_EQ(t.actions.size(), 13u);
    EXPECT_EQ(t.expressions.size(), 8u);
    EXPECT_TRUE(t.conditionsEnd);
    EXPECT_TRUE(t.actionsEnd);
    EXPECT_TRUE(t.expressionsEnd);
    for (Slot r : t.conditions) EXPECT_NE(r, 0);
    for (Slot r : t.actions) EXPECT_NE(r, 0);
    for (Slot r : t.expressions) EXPECT_NE(r, 0);
}

// Every routine is called through its exact shape; on 32-bit builds a routine that removed the
// wrong number of argument bytes would corrupt the caller's stack right here.
TEST(Lifecycle, EveryRoutineHasTheHostsCallingShape) {
    hv::Instance instance(hvtest::module());
    const auto& t = hvtest::module().tables();
    for (size_t code = 0; code < t.conditions.size(); ++code) {
        auto r = instance.condition(static_cast<int>(code),
                                    {hv::Param::null(), hv::Param::null(), hv::Param::null()});
        EXPECT_TRUE(r.asCondition() == 0 || r.asCondition() == 1) << "condition " << code;
    }
    for (size_t code = 0; code < t.actions.size(); ++code) {
        auto r = instance.action(static_cast<int>(code), {hv::Param::null(), hv::Param::null(),
                                                          hv::Param::null(), hv::Param::null()});
        EXPECT_EQ(r.asAction(), 0) << "action " << code;
        EXPECT_TRUE(r.sentinelsIntact) << r.damage;
    }
    for (size_t code = 0; code < t.expressions.size(); ++code) {
        auto r = instance.expression(static_cast<int>(code),
                                     {hv::Param::null(), hv::Param::null(), hv::Param::null()});
        EXPECT_TRUE(r.sentinelsIntact) << "expression " << code << ": " << r.damage;
    }
}

}  // namespace
