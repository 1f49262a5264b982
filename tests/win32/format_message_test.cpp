// FormatMessageW for system messages: Windows' English texts, buffer sizes and failures.
#include "pattern_buffer.h"

namespace {

constexpr DWORD FromSystem = FORMAT_MESSAGE_FROM_SYSTEM | FORMAT_MESSAGE_IGNORE_INSERTS;
constexpr DWORD Unchanged = 0xBEEF;
const char WineTexts[] = "its system message texts are its own short sentences";

// The system's own text for a code, as a plain call gives it.
WString systemText(DWORD code) {
    WCHAR buffer[512];
    DWORD n = FormatMessageW(FromSystem, nullptr, code, 0, buffer, 512, nullptr);
    return WString(buffer, n);
}

// What a call writes, relative to the system's text for the code.
enum class Written { whole, cut, nothing };
// Buffer sizes relative to that text: room for it and its terminator, or one less.
constexpr int Fits = -1, OneShort = -2;

struct Format {
    DWORD code;
    Written written;
    DWORD error = Unchanged;
    int size = 512;
};

void PrintTo(const Format& format, std::ostream* out) {
    *out << std::hex << "code 0x" << format.code << std::dec << ", size " << format.size;
}

class FormatMessages : public testing::TestWithParam<Format> {};

// The rows hold for any text, so they run against Wine's texts too.
TEST_P(FormatMessages, WritesExactlyTheMessage) {
    const Format& c = GetParam();
    WString text = systemText(c.code);
    auto size = static_cast<DWORD>(c.size >= 0 ? c.size : int(text.size()) + 2 + c.size);
    WString expected = c.written == Written::cut ? text.substr(0, size - 1) : text;
    bool succeeds = c.written == Written::whole;
    PatternBuffer buffer;
    SetLastError(Unchanged);
    EXPECT_EQ(FormatMessageW(FromSystem, nullptr, c.code, 0, buffer.data(), size, nullptr),
              succeeds ? expected.size() : 0u);
    EXPECT_EQ(GetLastError(), c.error);
    buffer.expectHolds(c.written == Written::nothing ? nullptr : expected.c_str());
}

INSTANTIATE_TEST_SUITE_P(Succeeding, FormatMessages,
                         testing::Values(Format{2, Written::whole}, Format{1018, Written::whole},
                                         Format{5, Written::whole, Unchanged, Fits}));

INSTANTIATE_TEST_SUITE_P(
    Failing, FormatMessages,
    testing::Values(Format{40, Written::nothing, ERROR_MR_MID_NOT_FOUND},
                    Format{42, Written::nothing, 317}, Format{0x2000FFFF, Written::nothing, 317},
                    Format{0xFFFFFFFF, Written::nothing, 317},
                    Format{2, Written::nothing, ERROR_INSUFFICIENT_BUFFER, 0},
                    Format{2, Written::cut, ERROR_INSUFFICIENT_BUFFER, 10},
                    Format{5, Written::cut, ERROR_INSUFFICIENT_BUFFER, OneShort}));

// A code's text is the same as its HRESULT's: the system looks the low word up.
TEST(FormatMessageTexts, AnHresultOfTheWin32FacilityHasItsCodesText) {
    EXPECT_EQ(systemText(0x80070002), systemText(2));
}

// Every code the registry functions, the module's host or this layer may report has a text,
// a sentence that ends in CR LF.
TEST(FormatMessageTexts, CoverTheCodesInUse) {
    for (DWORD code : {0,    2,    3,    5,    6,    8,    14,   87,   120,  122,  126,
                       127,  161,  234,  259,  998,  1010, 1012, 1013, 1014, 1015, 1016,
                       1017, 1018, 1019, 1020, 1021, 1114, 1400, 1812, 1813, 1814}) {
        WString text = systemText(code);
        ASSERT_GT(text.size(), 3u) << code;
        EXPECT_EQ(text.substr(text.size() - 3), TEXT(".\r\n")) << code;
    }
}

// Windows' sentences, as the documentation prints them, and the CR LF after them.
TEST(FormatMessageTexts, AreWindowsEnglishSentences) {
    HV_WINE_DIFFERS(WineTexts);
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

// Other sources, filled inserts, other languages and allocated buffers are not served.
TEST(FormatMessageCalls, OnlySystemMessagesIntoTheCallersBuffer) {
    HV_LAYER_ONLY("Windows serves them all; the layer only what the module and host use");
    const std::pair<DWORD, DWORD> calls[] = {
        {FORMAT_MESSAGE_IGNORE_INSERTS, 0}, {FORMAT_MESSAGE_FROM_SYSTEM, 0}, {FromSystem, 0x0409}};
    for (auto [flags, language] : calls) {
        PatternBuffer buffer;
        SetLastError(Unchanged);
        EXPECT_EQ(FormatMessageW(flags, nullptr, 2, language, buffer.data(), 512, nullptr), 0u);
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
    EXPECT_EQ(FormatMessageW(FromSystem, nullptr, 5, 0, buffer, 64, nullptr), 19u);
    EXPECT_EQ(FormatMessageW(FromSystem, nullptr, 5, 0, buffer, 64, nullptr), 0u);
    EXPECT_EQ(GetLastError(), ERROR_NOT_ENOUGH_MEMORY);
    EXPECT_EQ(FormatMessageW(FromSystem, nullptr, 5, 0, nullptr, 64, nullptr), 0u);
    EXPECT_EQ(GetLastError(), ERROR_INVALID_PARAMETER);
    auto calls = w32test::callsOf("FormatMessageW");
    ASSERT_EQ(calls.size(), 3u);
    EXPECT_EQ(calls[0].args, (std::vector<uint64_t>{FromSystem, 0, 5, 0,
                                                    reinterpret_cast<uintptr_t>(buffer), 64, 0}));
    EXPECT_EQ(calls[0].result, 19);
#endif
}

}  // namespace
