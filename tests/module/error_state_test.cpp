// The last operation's outcome as a condition, a code and a message.
#include "support.h"

namespace {

using hv::Param;
enum { LastActionSuccessful = 4 };
enum { LastErrorCode = 6, LastErrorMessage = 7 };

class ErrorState : public ::testing::Test {
protected:
    hv::Instance instance{hvtest::module()};
};

TEST_F(ErrorState, NewInstanceReportsSuccess) {
    EXPECT_EQ(instance.condition(LastActionSuccessful).asCondition(), 1);
    auto code = instance.expression(LastErrorCode);
    EXPECT_FALSE(code.isText);
    EXPECT_EQ(code.asInteger(), 0);
    auto message = instance.expression(LastErrorMessage);
    EXPECT_TRUE(message.isText);
    EXPECT_EQ(message.text, hvtest::systemMessage(0)) << hvtest::show(message.text);
    EXPECT_FALSE(message.text.empty());
}

TEST_F(ErrorState, ConditionIsTrueExactlyForZero) {
    for (uint32_t code : {1u, 2u, 40u, 0x80000000u, 0xFFFFFFFFu}) {
        instance.setLastError(code);
        EXPECT_EQ(instance.condition(LastActionSuccessful).asCondition(), 0) << code;
        EXPECT_EQ(static_cast<uint32_t>(instance.expression(LastErrorCode).asInteger()), code);
    }
    instance.setLastError(0);
    EXPECT_EQ(instance.condition(LastActionSuccessful).asCondition(), 1);
}

struct OwnMessage {
    uint32_t code;
    const char16_t* text;
};

class OwnMessages : public ErrorState, public ::testing::WithParamInterface<OwnMessage> {};

TEST_P(OwnMessages, ModuleCodesHaveTheirOwnTexts) {
    instance.setLastError(GetParam().code);
    auto message = instance.expression(LastErrorMessage);
    EXPECT_TRUE(message.isText);
    EXPECT_EQ(message.text, GetParam().text);
    EXPECT_EQ(message.bufferRequests, std::vector<size_t>{1024});
    EXPECT_TRUE(message.sentinelsIntact) << message.damage;
    EXPECT_EQ(instance.lastError(), GetParam().code);
}

INSTANTIATE_TEST_SUITE_P(
    Codes, OwnMessages,
    ::testing::Values(
        OwnMessage{40, u"Invalid parameters."},
        OwnMessage{41, u"The value you try to read from is not a DWORD value."},
        OwnMessage{42, u"The value you try to read from is not a string value."}));

TEST_F(ErrorState, SystemCodesGetTheSystemsTextWithItsLineEnd) {
    for (uint32_t code : {2u, 5u, 6u, 87u, 161u, 234u, 259u, 1010u, 1018u}) {
        SCOPED_TRACE(code);
        instance.setLastError(code);
        auto message = instance.expression(LastErrorMessage);
        EXPECT_EQ(message.text, hvtest::systemMessage(code)) << hvtest::show(message.text);
        ASSERT_GE(message.text.size(), 3u);
        EXPECT_EQ(message.text.substr(message.text.size() - 2), u"\r\n");
        EXPECT_TRUE(message.sentinelsIntact) << message.damage;
    }
}

#ifndef _WIN32
// Windows' own wording, as the portable layer reproduces it.
TEST_F(ErrorState, FileNotFoundReadsAsOnWindows) {
    instance.setLastError(2);
    EXPECT_EQ(instance.expression(LastErrorMessage).text,
              u"The system cannot find the file specified.\r\n");
}
#endif

// A code the system has no text for must not show what the lent buffer held before.
TEST_F(ErrorState, CodeWithoutTextGivesAnEmptyText) {
    for (uint32_t code : {43u, 0x2000FFFFu, 0xFFFFFFFFu}) {
        SCOPED_TRACE(code);
        instance.setLastError(code);
        auto message = instance.expression(LastErrorMessage);
        EXPECT_TRUE(message.isText);
        EXPECT_EQ(message.text, u"");
        EXPECT_EQ(message.bufferRequests.size(), 1u);
        EXPECT_TRUE(message.sentinelsIntact) << message.damage;
    }
}

TEST_F(ErrorState, NoBufferFromTheHostGivesTheEmptyText) {
    instance.setLastError(40);
    instance.lendNoBuffer(true);
    auto message = instance.expression(LastErrorMessage);
    EXPECT_TRUE(message.isText);
    EXPECT_EQ(message.text, u"");
    EXPECT_EQ(instance.lastError(), 40u);
}

TEST_F(ErrorState, ReadingTheErrorNeverChangesIt) {
    instance.action(0, {Param::rootKey(7)});
    for (int i = 0; i < 3; ++i) {
        instance.expression(LastErrorMessage);
        instance.expression(LastErrorCode);
        instance.condition(LastActionSuccessful);
    }
    EXPECT_EQ(instance.lastError(), 40u);
    instance.action(12, {Param::integerValue(1)});
    EXPECT_EQ(instance.condition(LastActionSuccessful).asCondition(), 0);
}

}  // namespace
