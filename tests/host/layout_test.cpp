// The byte offsets the host simulator lays its structures out with, for 32- and 64-bit modules,
// written down here rather than taken from the module's own structures.
#include <gtest/gtest.h>
#include <hivelet/host.h>

namespace {

struct Expected {
    size_t pointer;
    size_t rootKeyIndex, currentKey, lastError, use64BitView, recordSize;
    size_t getStringBuffer, firstParameter, nextParameter, getNextParameter;
    size_t window, getHostVersion, insertProperties;
    size_t conditions, actions, expressions;
    size_t counts[3], hostByte, identifier, size;
};

const Expected HostOffsets[] = {
    {4,  184, 188, 192, 196, 200, 872,          876, 880, 928,
     20, 336, 340, 0,   4,   8,   {12, 14, 16}, 25,  28,  34},
    {8,  184, 192, 200, 204, 208, 872,          880, 888, 928,
     24, 336, 344, 0,   8,   16,  {24, 26, 28}, 37,  40,  46},
};

void PrintTo(const Expected& e, std::ostream* os) { *os << e.pointer * 8 << "-bit"; }

class Layout : public testing::TestWithParam<Expected> {};

TEST_P(Layout, MatchesTheHostsOffsets) {
    const Expected& e = GetParam();
    const hv::HostLayout l = hv::layoutFor(e.pointer);
    EXPECT_EQ(l.runHeader, 8u);
    EXPECT_EQ(l.headerFlags, 124u);
    EXPECT_EQ(l.headerSize, 184u);
    EXPECT_EQ(l.rootKeyIndex, e.rootKeyIndex);
    EXPECT_EQ(l.currentKey, e.currentKey);
    EXPECT_EQ(l.lastError, e.lastError);
    EXPECT_EQ(l.use64BitView, e.use64BitView);
    EXPECT_EQ(l.recordSize, e.recordSize);
    EXPECT_EQ(l.getStringBuffer, e.getStringBuffer);
    EXPECT_EQ(l.getFirstExpressionParameter, e.firstParameter);
    EXPECT_EQ(l.getNextExpressionParameter, e.nextParameter);
    EXPECT_EQ(l.getNextParameter, e.getNextParameter);
    EXPECT_EQ(l.editorWindow, e.window);
    EXPECT_EQ(l.getHostVersion, e.getHostVersion);
    EXPECT_EQ(l.insertProperties, e.insertProperties);
    EXPECT_EQ(l.infoConditions, e.conditions);
    EXPECT_EQ(l.infoActions, e.actions);
    EXPECT_EQ(l.infoExpressions, e.expressions);
    EXPECT_EQ(l.infoConditionCount, e.counts[0]);
    EXPECT_EQ(l.infoActionCount, e.counts[1]);
    EXPECT_EQ(l.infoExpressionCount, e.counts[2]);
    EXPECT_EQ(l.infoHostByte, e.hostByte);
    EXPECT_EQ(l.infoIdentifier, e.identifier);
    EXPECT_EQ(l.infoSize, e.size);
    EXPECT_EQ(l.rootParamIndex, 6u);
}

INSTANTIATE_TEST_SUITE_P(PointerSizes, Layout, testing::ValuesIn(HostOffsets),
                         [](const testing::TestParamInfo<Expected>& row) {
                             return std::to_string(row.param.pointer * 8) + "bit";
                         });

// The build's own layout is the one for its pointer size.
TEST(Layout, ThisBuildUsesItsPointerSize) {
    const Expected& mine = HostOffsets[sizeof(void*) == 4 ? 0 : 1];
    EXPECT_EQ(hv::BuildLayout.pointerSize, sizeof(void*));
    EXPECT_EQ(hv::BuildLayout.currentKey, mine.currentKey);
    EXPECT_EQ(hv::BuildLayout.use64BitView, mine.use64BitView);
}

// The root index sits unaligned at byte 6, little-endian; the host's own bytes keep a pattern.
TEST(Layout, RootKeyRecordBytes) {
    std::vector<uint8_t> r = hv::rootKeyRecord(0x04030201);
    ASSERT_EQ(r.size(), 16u);
    EXPECT_EQ(r[0], 16);
    EXPECT_EQ(r[1], 0);
    for (int i : {2, 3, 4, 5, 10, 15}) EXPECT_EQ(r[i], hv::Fill::HostBytes) << "byte " << i;
    EXPECT_EQ((std::vector<uint8_t>(r.begin() + 6, r.begin() + 10)),
              (std::vector<uint8_t>{1, 2, 3, 4}));
}

}  // namespace
