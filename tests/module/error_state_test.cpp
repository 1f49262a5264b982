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

// The system's text for a code, written down as each system words it: Windows' (which the
// portable layer reproduces) and Wine's own shorter one.
struct SystemText {
    uint32_t code;
    const char16_t* windows;
    const char16_t* wine;
};
const SystemText SystemTexts[] = {
    {0, u"The operation completed successfully.\r\n", u"Success.\r\n"},
    {2, u"The system cannot find the file specified.\r\n", u"File not found.\r\n"},
    {5, u"Access is denied.\r\n", u"Access denied.\r\n"},
    {6, u"The handle is invalid.\r\n", u"Invalid handle.\r\n"},
    {87, u"The parameter is incorrect.\r\n", u"Invalid parameter.\r\n"},
    {161, u"The specified path is invalid.\r\n", u"Path is invalid.\r\n"},
    {234, u"More data is available.\r\n", u"More data available.\r\n"},
    {259, u"No more data is available.\r\n", u"No more data available.\r\n"},
    {1010, u"The configuration registry key is invalid.\r\n", u"Invalid key.\r\n"},
    {1018, u"Illegal operation attempted on a registry key that has been marked for deletion.\r\n",
     u"Key deleted.\r\n"},
};
#ifdef _WIN32
const bool UnderWine = true;  // the Windows builds run only under Wine here
#else
const bool UnderWine = false;
#endif

TEST_F(ErrorState, NewInstanceReportsSuccess) {
    EXPECT_EQ(instance.condition(LastActionSuccessful).asCondition(), 1);
    auto code = instance.expression(LastErrorCode);
    EXPECT_FALSE(code.isText);
    EXPECT_EQ(code.asInteger(), 0);
    auto message = instance.expression(LastErrorMessage);
    EXPECT_TRUE(message.isText);
    EXPECT_EQ(message.text, UnderWine ? SystemTexts[0].wine : SystemTexts[0].windows)
        << hvtest::show(message.text);
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
    ::testing::Values(OwnMessage{40, u"Invalid parameters."},
                      OwnMessage{41, u"The value you try to read from is not a DWORD value."},
                      OwnMessage{42, u"The value you try to read from is not a string value."}));

TEST_F(ErrorState, SystemCodesGetTheSystemsTextWithItsLineEnd) {
    for (const SystemText& row : SystemTexts) {
        SCOPED_TRACE(row.code);
        instance.setLastError(row.code);
        auto message = instance.expression(LastErrorMessage);
        EXPECT_EQ(message.text, UnderWine ? row.wine : row.windows) << hvtest::show(message.text);
        EXPECT_TRUE(message.sentinelsIntact) << message.damage;
    }
}

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
