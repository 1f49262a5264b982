// FormatMessageW for system messages: Windows' English texts, buffer sizes and failures.
#include "pattern_buffer.h"

#include <w32/testctl.h>

namespace {

constexpr DWORD fromSystem = FORMAT_MESSAGE_FROM_SYSTEM | FORMAT_MESSAGE_IGNORE_INSERTS;
constexpr DWORD unchanged = 0xBEEF;

struct Format {
    DWORD code;
    DWORD result;
    const char16_t* text;  // what the buffer starts with; null: the buffer is not written
    DWORD error = unchanged;
    DWORD flags = fromSystem;
    DWORD language = 0;
    DWORD size = 512;
};

void PrintTo(const Format& format, std::ostream* out) {
    *out << std::hex << "code 0x" << format.code << ", flags 0x" << format.flags
         << ", language 0x" << format.language << std::dec << ", size " << format.size;
}

class FormatMessage : public testing::TestWithParam<Format> {};

TEST_P(FormatMessage, WritesExactlyTheMessage) {
    const Format& c = GetParam();
    PatternBuffer buffer;
    SetLastError(unchanged);
    EXPECT_EQ(FormatMessageW(c.flags, nullptr, c.code, c.language, buffer.data(), c.size, nullptr),
              c.result);
    EXPECT_EQ(GetLastError(), c.error);
    buffer.expectHolds(c.text);
}

INSTANTIATE_TEST_SUITE_P(
    Succeeding, FormatMessage,
    testing::Values(
        Format{2, 44, u"The system cannot find the file specified.\r\n"},
        Format{0x80070002, 44, u"The system cannot find the file specified.\r\n"},
        Format{1018, 82,
               u"Illegal operation attempted on a registry key that has been marked for "
               u"deletion.\r\n"},
        Format{317, 89,  // inserts stay as they are
               u"The system cannot find message text for message number 0x%1 in the message "
               u"file for %2.\r\n"},
        Format{5, 18, u"Access is denied. ", unchanged, fromSystem | FORMAT_MESSAGE_MAX_WIDTH_MASK},
        Format{5, 18, u"Access is denied. ", unchanged, fromSystem | 80},  // wider than the text
        // Lines break at spaces within the width.
        Format{5, 19, u"Access is\r\ndenied. ", unchanged, fromSystem | 10},
        Format{5, 20, u"Access\r\nis\r\ndenied. ", unchanged, fromSystem | 8},
        Format{5, 19, u"Access is denied.\r\n", unchanged, FORMAT_MESSAGE_FROM_SYSTEM},
        Format{5, 19, u"Access is denied.\r\n", unchanged, fromSystem, 0x0409},
        Format{5, 19, u"Access is denied.\r\n", unchanged, fromSystem, 0x0400},  // user default
        Format{5, 19, u"Access is denied.\r\n", unchanged, fromSystem, 0, 20}));

INSTANTIATE_TEST_SUITE_P(
    Failing, FormatMessage,
    testing::Values(
        Format{40, 0, nullptr, ERROR_MR_MID_NOT_FOUND}, Format{42, 0, nullptr, 317},
        Format{0x2000FFFF, 0, nullptr, 317}, Format{0xFFFFFFFF, 0, nullptr, 317},
        Format{2, 0, nullptr, ERROR_INSUFFICIENT_BUFFER, fromSystem, 0, 0},
        Format{2, 0, u"The syste", ERROR_INSUFFICIENT_BUFFER, fromSystem, 0, 10},
        Format{5, 0, u"Access is denied.\r", ERROR_INSUFFICIENT_BUFFER, fromSystem, 0, 19},
        Format{2, 0, nullptr, 15100, fromSystem, 0x0407},  // no German texts
        Format{2, 0, nullptr, ERROR_INVALID_PARAMETER, FORMAT_MESSAGE_IGNORE_INSERTS},
        Format{2, 0, nullptr, 87, fromSystem | FORMAT_MESSAGE_FROM_HMODULE},
        Format{2, 0, nullptr, 87, fromSystem | FORMAT_MESSAGE_FROM_STRING},
        Format{2, 0, nullptr, 87, fromSystem | FORMAT_MESSAGE_ALLOCATE_BUFFER},
        Format{317, 0, nullptr, 87, FORMAT_MESSAGE_FROM_SYSTEM}));  // inserts cannot be filled

// Every code the registry functions, the module's host or this layer may report has Windows'
// sentence; where Windows' length is known (the sentence plus CR LF), it matches.
TEST(FormatMessageTexts, CoverTheCodesInUse) {
    const std::pair<DWORD, DWORD> codes[] = {
        {0, 39},   {2, 44},    {3, 44},    {5, 19},    {6, 24},    {8, 58},    {87, 29},
        {161, 32}, {234, 25},  {259, 28},  {1010, 44}, {1018, 82}, {1020, 85}, {1021, 60},
        {14, 0},   {120, 0},   {122, 0},   {126, 0},   {127, 0},   {998, 0},   {1012, 0},
        {1013, 0}, {1014, 0},  {1015, 0},  {1016, 0},  {1017, 0},  {1019, 0},  {1114, 0},
        {1400, 0}, {1812, 0},  {1813, 0},  {1814, 0},  {15100, 0}};
    for (auto [code, length] : codes) {
        WCHAR buffer[512];
        DWORD result = FormatMessageW(fromSystem, nullptr, code, 0, buffer, 512, nullptr);
        ASSERT_GT(result, 3u) << code;
        EXPECT_EQ(std::u16string(buffer + result - 3), u".\r\n") << code;
        if (length) {
            EXPECT_EQ(result, length) << code;
        }
    }
}

TEST(FormatMessageCalls, AreJournaledAndCanBeMadeToFail) {
    w32test::reset();
    WCHAR buffer[64];
    w32test::failCall("FormatMessageW", 2, ERROR_NOT_ENOUGH_MEMORY);
    EXPECT_EQ(FormatMessageW(fromSystem, nullptr, 5, 0, buffer, 64, nullptr), 19u);
    EXPECT_EQ(FormatMessageW(fromSystem, nullptr, 5, 0, buffer, 64, nullptr), 0u);
    EXPECT_EQ(GetLastError(), ERROR_NOT_ENOUGH_MEMORY);
    EXPECT_EQ(FormatMessageW(fromSystem, nullptr, 5, 0, nullptr, 64, nullptr), 0u);
    EXPECT_EQ(GetLastError(), ERROR_INVALID_PARAMETER);
    auto calls = w32test::callsOf("FormatMessageW");
    ASSERT_EQ(calls.size(), 3u);
    EXPECT_EQ(calls[0].args, (std::vector<uint64_t>{fromSystem, 0, 5, 0,
                                                    reinterpret_cast<uintptr_t>(buffer), 64, 0}));
    EXPECT_EQ(calls[0].result, 19);
}

}  // namespace
