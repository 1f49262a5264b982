// wsprintfW: the %s field the module uses, "(null)" for a null text, a '%' before anything else,
// and the 1024-character limit with the result Windows gives at it; and the runtime library's
// wide-string functions and the last error, which the module and the host use with it.
#include "pattern_buffer.h"

#include <functional>

namespace {

// Formats into a patterned buffer; the result must equal the text's length.
template <typename... Args>
WString formatted(const WCHAR* format, Args... args) {
    PatternBuffer out;
    int n = wsprintfW(out.data(), format, args...);
    WString text(out.data());
    EXPECT_EQ(static_cast<size_t>(n), text.size()) << "for the format of " << text.size();
    return text;
}

TEST(Wsprintf, Conversions) {
    const WCHAR* none = nullptr;
    const struct {
        std::function<WString()> run;
        const WCHAR* wanted;
    } rows[] = {
        {[&] { return formatted(TEXT("Key = %s"), none); }, TEXT("Key = (null)")},
        {[] { return formatted(TEXT("Key = %s"), TEXT("")); }, TEXT("Key = ")},
        {[] { return formatted(TEXT("Current Key = %s"), TEXT("A\\B")); },
         TEXT("Current Key = A\\B")},
        {[] { return formatted(TEXT("%s|%s"), TEXT("ab"), TEXT("cd")); }, TEXT("ab|cd")},
        {[] { return formatted(TEXT("%s%%"), TEXT("Q")); }, TEXT("Q%")},
        {[] { return formatted(TEXT("%yz")); }, TEXT("yz")},
        {[] { return formatted(TEXT("100%")); }, TEXT("100")},
    };
    for (size_t i = 0; i < sizeof rows / sizeof rows[0]; ++i) {
        SCOPED_TRACE(i);
        EXPECT_EQ(rows[i].run(), rows[i].wanted);
    }
}

// Output stops at 1023 characters and the terminator; nothing is written at [1024]. From 1023
// characters on the result is 1024. The documentation gives the limit as 1,024 bytes and no
// result at it; these are Wine's answers, the same in 32- and 64-bit processes.
TEST(Wsprintf, LimitOf1024Characters) {
    const struct {
        size_t length;
        int result;
    } rows[] = {{1021, 1021}, {1022, 1022}, {1023, 1024}, {1024, 1024}, {1030, 1024}, {2999, 1024}};
    for (const auto& row : rows) {
        SCOPED_TRACE(row.length);
        WString text(row.length, TEXT('x'));
        PatternBuffer out;
        out.chars.resize(3100, PatternBuffer::Pattern);
        EXPECT_EQ(wsprintfW(out.data(), TEXT("%s"), text.c_str()), row.result);
        size_t kept = std::min<size_t>(row.length, 1023);
        EXPECT_EQ(WString(out.data()).size(), kept);
        for (size_t i = kept + 1; i < out.chars.size(); ++i)
            ASSERT_EQ(out.chars[i], PatternBuffer::Pattern) << "at " << i;
    }
}

TEST(RuntimeText, WideStringFunctions) {
    WCHAR buffer[6];
    EXPECT_EQ(wcslen(TEXT("abc")), 3u);
    EXPECT_EQ(WString(wcscpy(buffer, TEXT("xyz"))), TEXT("xyz"));
    // wcsncpy pads with zeros up to the count and does not terminate a text it cuts.
    EXPECT_EQ(WString(wcsncpy(buffer, TEXT("ab"), 5), 5), WString(TEXT("ab\0\0\0"), 5));
    wcscpy(buffer, TEXT("xyzzy"));
    EXPECT_EQ(WString(wcsncpy(buffer, TEXT("abcdef"), 3)), TEXT("abczy"));
    EXPECT_EQ(_wcsicmp(TEXT("HKEY_Users"), TEXT("hkey_users")), 0);
    EXPECT_LT(_wcsicmp(TEXT("a"), TEXT("B")), 0);
}

TEST(LastError, KeepsWhatWasSet) {
    SetLastError(1234);
    EXPECT_EQ(GetLastError(), 1234u);
    SetLastError(0);
    EXPECT_EQ(GetLastError(), 0u);
}

}  // namespace
