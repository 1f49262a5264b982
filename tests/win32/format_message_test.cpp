// FormatMessageW for system messages: Windows' English texts, buffer sizes and failures.
#include "pattern_buffer.h"

namespace {

constexpr DWORD fromSystem = FORMAT_MESSAGE_FROM_SYSTEM | FORMAT_MESSAGE_IGNORE_INSERTS;
constexpr DWORD unchanged = 0xBEEF;
const char kWineTexts[] = "its system message texts are its own short sentences";

// The system's own text for a code, as a plain call gives it.
WString systemText(DWORD code) {
    WCHAR buffer[512];
    DWORD n = FormatMessageW(fromSystem, nullptr, code, 0, buffer, 512, nullptr);
    return WString(buffer, n);
}

// What a call writes, relative to the system's text for the code.
enum class Written { whole, oneLine, cut, nothing };
// Buffer sizes relative to that text: room for it and its terminator, or one less.
constexpr int kFits = -1, kOneShort = -2;

struct Format {
    DWORD code;
    Written written;
    DWORD error = unchanged;
    DWORD flags = fromSystem;
    DWORD language = 0;
    int size = 512;
    const char* wineDiffers = nullptr;
};

void PrintTo(const Format& format, std::ostream* out) {
    *out << std::hex << "code 0x" << format.code << ", flags 0x" << format.flags
         << ", language 0x" << format.language << std::dec << ", size " << format.size;
}

class FormatMessages : public testing::TestWithParam<Format> {};

// The rows hold for any text, so they run against Wine's texts too.
TEST_P(FormatMessages, WritesExactlyTheMessage) {
    const Format& c = GetParam();
    if (c.wineDiffers) HV_WINE_DIFFERS(c.wineDiffers);
    WString text = systemText(c.code);
    auto size = static_cast<DWORD>(c.size >= 0 ? c.size : int(text.size()) + 2 + c.size);
    WString expected = c.written == Written::oneLine ? text.substr(0, text.size() - 2) + TEXT(" ")
                       : c.written == Written::cut   ? text.substr(0, size - 1)
                                                    : text;
    bool succeeds = c.written == Written::whole || c.written == Written::oneLine;
    PatternBuffer buffer;
    SetLastError(unchanged);
    EXPECT_EQ(FormatMessageW(c.flags, nullptr, c.code, c.language, buffer.data(), size, nullptr),
              succeeds ? expected.size() : 0u);
    EXPECT_EQ(GetLastError(), c.error);
    buffer.expectHolds(c.written == Written::nothing ? nullptr : expected.c_str());
}

INSTANTIATE_TEST_SUITE_P(
    Succeeding, FormatMessages,
    testing::Values(
        Format{2, Written::whole}, Format{1018, Written::whole},
        Format{5, Written::oneLine, unchanged, fromSystem | FORMAT_MESSAGE_MAX_WIDTH_MASK},
        Format{5, Written::oneLine, unchanged, fromSystem | 80},  // wider than the text
        Format{5, Written::whole, unchanged, FORMAT_MESSAGE_FROM_SYSTEM},
        Format{5, Written::whole, unchanged, fromSystem, 0x0409},
        Format{5, Written::whole, unchanged, fromSystem, 0x0400},  // user default
        Format{5, Written::whole, unchanged, fromSystem, 0, kFits}));

INSTANTIATE_TEST_SUITE_P(
    Failing, FormatMessages,
    testing::Values(
        Format{40, Written::nothing, ERROR_MR_MID_NOT_FOUND}, Format{42, Written::nothing, 317},
        Format{0x2000FFFF, Written::nothing, 317}, Format{0xFFFFFFFF, Written::nothing, 317},
        Format{2, Written::nothing, ERROR_INSUFFICIENT_BUFFER, fromSystem, 0, 0},
        Format{2, Written::cut, ERROR_INSUFFICIENT_BUFFER, fromSystem, 0, 10},
        Format{5, Written::cut, ERROR_INSUFFICIENT_BUFFER, fromSystem, 0, kOneShort},
        Format{2, Written::nothing, 15100, fromSystem, 0x0407, 512,  // no German texts
               "it has German texts"}));

// A code's text is the same as its HRESULT's: the system looks the low word up.
TEST(FormatMessageTexts, AnHresultOfTheWin32FacilityHasItsCodesText) {
    EXPECT_EQ(systemText(0x80070002), systemText(2));
}

// Every code the registry functions, the module's host or this layer may report has a text,
// a sentence that ends in CR LF.
TEST(FormatMessageTexts, CoverTheCodesInUse) {
    for (DWORD code : {0, 2, 3, 5, 6, 8, 14, 87, 120, 122, 126, 127, 161, 234, 259, 998, 1010,
                       1012, 1013, 1014, 1015, 1016, 1017, 1018, 1019, 1020, 1021, 1114, 1400,
                       1812, 1813, 1814}) {
        WString text = systemText(code);
        ASSERT_GT(text.size(), 3u) << code;
        EXPECT_EQ(text.substr(text.size() - 3), TEXT(".\r\n")) << code;
    }
}

// What a language without message texts reports (code 15100) has a text of its own.
TEST(FormatMessageTexts, CoverTheMissingLanguageCode) {
    HV_WINE_DIFFERS("it has no text for 15100");
    EXPECT_EQ(systemText(15100), TEXT("The resource loader failed to find MUI file.\r\n"));
}

// A maximum width breaks the lines at spaces; the text's own line break becomes a space.
TEST(FormatMessageTexts, LinesBreakAtSpacesWithinTheWidth) {
    HV_WINE_DIFFERS(kWineTexts);
    const std::pair<DWORD, const WCHAR*> widths[] = {
        {10, TEXT("Access is\r\ndenied. ")}, {9, TEXT("Access is\r\ndenied. ")},
        {8, TEXT("Access\r\nis\r\ndenied. ")}, {4, TEXT("Access\r\nis\r\ndenied. ")},
        {17, TEXT("Access is denied. ")}};
    for (auto [width, text] : widths) {
        WCHAR buffer[64];
        DWORD n = FormatMessageW(fromSystem | width, nullptr, 5, 0, buffer, 64, nullptr);
        EXPECT_EQ(WString(buffer, n), text) << width;
    }
}

// Windows' sentences, as the documentation prints them, and the CR LF after them.
TEST(FormatMessageTexts, AreWindowsEnglishSentences) {
    HV_WINE_DIFFERS(kWineTexts);
    const std::pair<DWORD, const WCHAR*> texts[] = {
        {0, TEXT("The operation completed successfully.")},
        {2, TEXT("The system cannot find the file specified.")},
        {3, TEXT("The system cannot find the path specified.")},
        {5, TEXT("Access is denied.")},
        {6, TEXT("The handle is invalid.")},
        {8, TEXT("Not enough storage is available to process this command.")},
        {87, TEXT("The parameter is incorrect.")},
        {161, TEXT("The specified path is invalid.")},
        {234, TEXT("More data is available.")},
        {259, TEXT("No more data is available.")},
        // Inserts stay as they are.
        {317, TEXT("The system cannot find message text for message number 0x%1 in the message ")
              TEXT("file for %2.")},
        {1010, TEXT("The configuration registry key is invalid.")},
        {1018, TEXT("Illegal operation attempted on a registry key that has been marked for ")
               TEXT("deletion.")},
        {1020, TEXT("Cannot create a symbolic link in a registry key that already has subkeys ")
               TEXT("or values.")},
        {1021, TEXT("Cannot create a stable subkey under a volatile parent key.")}};
    for (const auto& [code, text] : texts)
        EXPECT_EQ(systemText(code), text + WString(TEXT("\r\n"))) << code;
}

// Sources other than the system, allocated buffers and filled inserts are not served.
TEST(FormatMessageCalls, OnlySystemMessagesIntoTheCallersBuffer) {
    HV_LAYER_ONLY("Windows serves them all; the layer only what the module and host use");
    const std::pair<DWORD, DWORD> calls[] = {
        {FORMAT_MESSAGE_IGNORE_INSERTS, 2},
        {fromSystem | FORMAT_MESSAGE_FROM_HMODULE, 2},
        {fromSystem | FORMAT_MESSAGE_FROM_STRING, 2},
        {fromSystem | FORMAT_MESSAGE_ALLOCATE_BUFFER, 2},
        {FORMAT_MESSAGE_FROM_SYSTEM, 317}};  // its inserts cannot be filled
    for (auto [flags, code] : calls) {
        PatternBuffer buffer;
        SetLastError(unchanged);
        EXPECT_EQ(FormatMessageW(flags, nullptr, code, 0, buffer.data(), 512, nullptr), 0u);
        EXPECT_EQ(GetLastError(), DWORD(ERROR_INVALID_PARAMETER)) << std::hex << flags;
        buffer.expectHolds(nullptr);
    }
}

TEST(FormatMessageCalls, AreJournaledAndCanBeMadeToFail) {
    HV_LAYER_ONLY("fault injection and call journal");
#if HV_OVER_LAYER
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
#endif
}

}  // namespace
