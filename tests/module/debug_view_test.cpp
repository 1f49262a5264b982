// The debugger's two lines: their exact text in the host's 256-character buffer, the cut of a
// long key, and the items and failures that leave the buffer as it was.
#include "support.h"

namespace {

using hv::Param;
enum { SetCurrentKey = 1 };
typedef const uint16_t*(WINAPI* DebugTreeFn)(hv::Slot);
typedef void(WINAPI* EditDebugItemFn)(hv::Slot, hv::Slot);

const char16_t* const RootNames[] = {u"HKEY_CLASSES_ROOT", u"HKEY_LOCAL_MACHINE",
                                     u"HKEY_CURRENT_USER", u"HKEY_CURRENT_CONFIG", u"HKEY_USERS"};

// The line is exactly `text`, then zeros up to the 256th character, and nothing past it.
::testing::AssertionResult lineIs(const hv::Instance::DebugLine& line, const std::u16string& text) {
    if (!line.sentinelsIntact) return ::testing::AssertionFailure() << "written past the buffer";
    std::vector<char16_t> wanted(hv::Instance::DebugLineChars, 0);
    std::copy(text.begin(), text.end(), wanted.begin());
    if (line.buffer != wanted)
        return ::testing::AssertionFailure() << "got " << hvtest::show(line.text());
    return ::testing::AssertionSuccess();
}

TEST(DebugView, RootKeyLine) {
    hv::Instance instance(hvtest::module());
    for (uint32_t index : {0u, 1u, 2u, 3u, 4u, 5u, 7u, 0xFFFFFFFFu}) {
        SCOPED_TRACE(index);
        instance.setRootKeyIndex(index);
        std::u16string name = index < 5 ? RootNames[index] : u"";
        EXPECT_TRUE(lineIs(instance.debugLine(0), u"Current Root Key = " + name));
    }
}

TEST(DebugView, CurrentKeyLine) {
    std::u16string k300(300, u'a'), k600(600, u'b');
    for (size_t i = 0; i < k300.size(); ++i) k300[i] = static_cast<char16_t>(u'A' + i % 26);
    const struct {
        const char16_t* key;
        std::u16string line;
    } rows[] = {
        {nullptr, u"Current Key = "},
        {u"", u"Current Key = "},
        {u"Software\\Demo", u"Current Key = Software\\Demo"},
        {k300.c_str(), u"Current Key = " + k300.substr(0, 241)},
        {k600.c_str(), u"Current Key = " + k600.substr(0, 241)},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(hvtest::show(row.key ? row.key : u"<null>"));
        hv::Instance instance(hvtest::module());
        if (row.key) instance.action(SetCurrentKey, {Param::str(row.key)});
        hv::Instance::DebugLine line = instance.debugLine(1);
        EXPECT_TRUE(lineIs(line, row.line));
        EXPECT_LE(row.line.size(), 255u);
    }
}

TEST(DebugView, OtherItemsLeaveTheBufferAsItWas) {
    hv::Instance instance(hvtest::module());
    instance.action(SetCurrentKey, {Param::str(u"Software")});
    for (int item : {2, 3, -1, 0xFFFF}) {
        SCOPED_TRACE(item);
        hv::Instance::DebugLine line = instance.debugLine(item);
        EXPECT_FALSE(line.written);
        EXPECT_TRUE(line.sentinelsIntact);
    }
}

TEST(DebugView, TreeIsOneStaticListAndEditingDoesNothing) {
    auto tree = hvtest::module().entry<DebugTreeFn>("GetDebugTree");
    const uint16_t* first = tree(0);
    ASSERT_NE(first, nullptr);
    EXPECT_EQ(first[0], 0);
    EXPECT_EQ(first[1], 1);
    EXPECT_EQ(first[2], 0xFFFF);
    EXPECT_EQ(tree(1), first);
    EXPECT_EQ(tree(-1), first);
    hvtest::module().entry<EditDebugItemFn>("EditDebugItem")(1, 2);
}

#if HV_HAS_TEST_CONTROL
// No work buffer: the host's buffer stays as it was and nothing is left allocated.
TEST(DebugView, WithoutWorkBuffersTheHostsBufferIsUntouched) {
    hv::Instance instance(hvtest::module());
    instance.action(SetCurrentKey, {Param::str(u"Software")});
    for (unsigned nth : {1u, 2u}) {
        SCOPED_TRACE(nth);
        w32test::reset();
        size_t live = w32test::liveAllocations();
        w32test::failCall("calloc", nth, 0);
        EXPECT_FALSE(instance.debugLine(1).written);
        EXPECT_EQ(w32test::liveAllocations(), live);
    }
    w32test::reset();
}

// The formatted line stays inside the 520-character work buffer whatever the key's length.
TEST(DebugView, FormattingStaysInsideTheWorkBuffer) {
    hv::Instance instance(hvtest::module());
    std::u16string key(30000, u'x');
    instance.action(SetCurrentKey, {Param::str(key)});
    w32test::reset();
    EXPECT_TRUE(lineIs(instance.debugLine(1), u"Current Key = " + key.substr(0, 241)));
    auto formats = w32test::callsOf("wsprintfW");
    ASSERT_EQ(formats.size(), 1u);
    EXPECT_LT(formats[0].result, 520);
    auto allocations = w32test::callsOf("calloc");
    ASSERT_EQ(allocations.size(), 2u);
    for (const auto& c : allocations) EXPECT_EQ(c.args, (std::vector<uint64_t>{520, 2}));
}
#endif

}  // namespace
