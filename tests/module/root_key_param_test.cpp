// The root-key parameter: a new record, the dialog driven by a scripted user (the portable
// layer's dialogs on Linux, Wine's user32 on windows-x64) and the name shown for a record.
#include <hivelet/param_editor.h>

#include "support.h"

namespace {

using hv::UserStep;

const std::vector<std::u16string> RootNames = {u"HKEY_CLASSES_ROOT", u"HKEY_LOCAL_MACHINE",
                                               u"HKEY_CURRENT_USER", u"HKEY_CURRENT_CONFIG",
                                               u"HKEY_USERS"};

class RootKeyParam : public ::testing::Test {
protected:
    void SetUp() override {
#if HV_HAS_TEST_CONTROL
        w32test::reset();
#endif
    }
    hv::Editor editor;
    hv::ParamEditor param{hvtest::module(), editor};
};

TEST_F(RootKeyParam, InitWritesOnlyTheSizeAndTheIndex) {
    param.fillRecord(0xFF);
    param.init();
    const std::vector<uint8_t> expected = {0x10, 0x00, 0xFF, 0xFF, 0xFF, 0xFF, 0,    0,
                                           0,    0,    0xFF, 0xFF, 0xFF, 0xFF, 0xFF, 0xFF};
    EXPECT_EQ(param.recordBytes(), expected);
    EXPECT_TRUE(param.recordIntact());
}

// One row per user: the record's index before, the steps, the result and the index after.
struct EditCase {
    const char* name;
    uint32_t before;
    std::vector<UserStep> steps;
    hv::Slot result;
    uint32_t after;
    std::vector<bool> openAfter;
};

TEST_F(RootKeyParam, DialogOutcomes) {
    const EditCase cases[] = {
        {"OK unchanged", 2, {UserStep::ok()}, 1, 2, {false}},
        {"select HKEY_USERS, OK", 2, {UserStep::select(4), UserStep::ok()}, 1, 4, {true, false}},
        {"change, Cancel", 1, {UserStep::select(3), UserStep::cancel()}, 0, 1, {true, false}},
        {"change, Escape", 1, {UserStep::select(3), UserStep::escape()}, 0, 1, {true, false}},
        {"change, close box", 0, {UserStep::select(2), UserStep::closeBox()}, 0, 0, {true, false}},
        {"change, Enter", 0, {UserStep::select(3), UserStep::enter()}, 1, 3, {true, false}},
        {"double click only selects",
         0,
         {UserStep::doubleClick(4), UserStep::ok()},
         1,
         4,
         {true, false}},
        {"index 7, OK waits for a name",
         7,
         {UserStep::ok(), UserStep::enter(), UserStep::select(1), UserStep::ok()},
         1,
         1,
         {true, true, true, false}},
    };
    for (const EditCase& c : cases) {
        SCOPED_TRACE(c.name);
        param.setRecord(c.before);
        std::vector<uint8_t> before = param.recordBytes();
        hv::DialogSeen seen;
        EXPECT_EQ(param.edit(c.steps, &seen), c.result);
        EXPECT_EQ(param.rootIndex(), c.after);
        EXPECT_EQ(seen.openAfter, c.openAfter);
        EXPECT_FALSE(seen.ranOut);
        // Only the index may change.
        std::vector<uint8_t> after = param.recordBytes();
        for (size_t i : {6, 7, 8, 9}) after[i] = before[i];
        EXPECT_EQ(after, before);
        EXPECT_TRUE(param.recordIntact());
    }
}

TEST_F(RootKeyParam, DialogShowsTheNamesInTableOrder) {
    for (uint32_t index : {2u, 0u, 4u, 5u, 7u, 0xFFFFFFFFu}) {
        SCOPED_TRACE(index);
        param.setRecord(index);
        hv::DialogSeen seen;
        EXPECT_EQ(param.edit({UserStep::cancel()}, &seen), 0);
        EXPECT_TRUE(seen.appeared);
        EXPECT_EQ(seen.caption, u"Select a root key");
        EXPECT_EQ(seen.className, u"#32770");
        EXPECT_EQ(seen.items, RootNames);
        EXPECT_EQ(seen.initialSelection, index < 5 ? static_cast<int>(index) : LB_ERR);
        // Where the display can tell, the focus starts on OK, the first tab stop.
        if (HV_HAS_TEST_CONTROL || seen.initialFocus) {
            EXPECT_EQ(seen.initialFocus, IDOK);
        }
    }
}

TEST_F(RootKeyParam, StepsThatRunOutLeaveWithCancel) {
    param.setRecord(3);
    hv::DialogSeen seen;
    EXPECT_EQ(param.edit({UserStep::select(0)}, &seen), 0);
    EXPECT_TRUE(seen.ranOut);
    EXPECT_FALSE(seen.forced);
    EXPECT_EQ(param.rootIndex(), 3u);
}

TEST_F(RootKeyParam, DialogThatCannotBeCreated) {
    HV_NEEDS_TEST_CONTROL();
#if HV_HAS_TEST_CONTROL
    w32test::failCall("DialogBoxParamW", 1, ERROR_NOT_ENOUGH_MEMORY);
    editor.setWindow(reinterpret_cast<HWND>(0x5A5A0));
    param.setRecord(2);
    std::vector<uint8_t> before = param.recordBytes();
    hv::DialogSeen seen;
    EXPECT_EQ(param.edit({UserStep::select(4), UserStep::ok()}, &seen), -1);
    EXPECT_FALSE(seen.appeared);
    EXPECT_EQ(param.recordBytes(), before);
    EXPECT_TRUE(w32test::liveWindows().empty());
    EXPECT_EQ(w32test::pendingTimers(), 0u);
    // The dialog is owned by the editor's window, with the record as creation parameter.
    auto calls = w32test::callsOf("DialogBoxParamW");
    ASSERT_EQ(calls.size(), 1u);
    EXPECT_EQ(calls[0].args[1], 101u);
    EXPECT_EQ(calls[0].args[2], 0x5A5A0u);
    EXPECT_EQ(calls[0].args[4], reinterpret_cast<uintptr_t>(param.record()));
#endif
}

// The procedure keeps the address of the record's index (byte 6) in the user slot and adds the
// names one by one; 32-bit code has only SetWindowLongW, whose index 8 is that slot.
TEST_F(RootKeyParam, DialogKeepsTheIndexAddressAndAddsTheNames) {
    HV_NEEDS_TEST_CONTROL();
#if HV_HAS_TEST_CONTROL
    param.setRecord(1);
    EXPECT_EQ(param.edit({UserStep::cancel()}), 0);
    const char* setter = sizeof(void*) == 4 ? "SetWindowLongW" : "SetWindowLongPtrW";
    auto sets = w32test::callsOf(setter);
    ASSERT_EQ(sets.size(), 1u);
    EXPECT_EQ(sets[0].args[1], static_cast<uint64_t>(sizeof(void*) == 4 ? 8 : 16));
    // Signed values are journaled sign-extended; an address is compared at its own width.
    EXPECT_EQ(static_cast<uintptr_t>(sets[0].args[2]),
              reinterpret_cast<uintptr_t>(param.record() + 6));
    std::vector<std::u16string> added;
    for (const w32test::Call& c : w32test::callsOf("SendMessageW"))
        if (c.args[1] == LB_ADDSTRING)
            added.push_back(
                hvtest::text(reinterpret_cast<const WCHAR*>(static_cast<uintptr_t>(c.args[3]))));
    EXPECT_EQ(added, RootNames);
#endif
}

TEST_F(RootKeyParam, NameIsCopiedOverTheWholeCapacity) {
    param.setRecord(1);
    hv::ParamEditor::Text t = param.string(64);
    EXPECT_EQ(t.text, u"HKEY_LOCAL_MACHINE");
    std::vector<char16_t> expected(64, 0);
    std::copy(RootNames[1].begin(), RootNames[1].end(), expected.begin());
    EXPECT_EQ(t.written, expected);
    EXPECT_TRUE(t.intact);
    for (uint32_t index = 0; index < 5; ++index) {
        param.setRecord(index);
        EXPECT_EQ(param.string(64).text, RootNames[index]);
    }
}

// A capacity too small for the name still ends inside it with a zero; 0 and negative
// capacities, and invalid indices, write nothing.
TEST_F(RootKeyParam, SmallCapacitiesAndInvalidIndices) {
    const struct {
        uint32_t index;
        hv::Slot capacity;
        std::u16string text;
    } cases[] = {
        {3, 1, u""},
        {3, 5, u"HKEY"},
        {3, 19, u"HKEY_CURRENT_CONFI"},
        {3, 20, u"HKEY_CURRENT_CONFIG"},
        {1, 18, u"HKEY_LOCAL_MACHIN"},
        {1, 19, u"HKEY_LOCAL_MACHINE"},
        {3, 0x10005, u"HKEY"},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.capacity);
        param.setRecord(c.index);
        hv::ParamEditor::Text t = param.string(c.capacity);
        EXPECT_EQ(t.text, c.text);
        EXPECT_EQ(t.written.back(), 0);
        EXPECT_TRUE(t.intact);
    }
    const std::pair<uint32_t, hv::Slot> nothing[] = {{1, 0},      {1, -1},         {1, 0xFFFF},
                                                     {1, 0x8000}, {1, 0x10000},    {5, 64},
                                                     {7, 64},     {0xFFFFFFFF, 64}};
    for (auto [index, capacity] : nothing) {
        SCOPED_TRACE(capacity);
        param.setRecord(index);
        EXPECT_TRUE(param.string(capacity).untouched);
    }
}

}  // namespace
