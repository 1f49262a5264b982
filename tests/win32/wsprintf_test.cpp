// wsprintfW: the conversions a module uses, "(null)" for a null text, and the 1024-character
// limit with the result Windows gives at it.
#include "pattern_buffer.h"

#include <climits>
#include <functional>

namespace {

// Formats into a patterned buffer; the result must equal the text's length.
template <typename... Args>
std::u16string formatted(const char16_t* format, Args... args) {
    PatternBuffer out;
    int n = wsprintfW(out.data(), format, args...);
    std::u16string text(out.data());
    EXPECT_EQ(static_cast<size_t>(n), text.size()) << "for the format of " << text.size();
    return text;
}

TEST(Wsprintf, Conversions) {
    const char16_t* none = nullptr;
    const struct {
        std::function<std::u16string()> run;
        const char16_t* wanted;
    } rows[] = {
        {[&] { return formatted(u"Key = %s", none); }, u"Key = (null)"},
        {[] { return formatted(u"Key = %s", u""); }, u"Key = "},
        {[] { return formatted(u"%s|%ls", u"ab", u"cd"); }, u"ab|cd"},
        {[] { return formatted(u"%hs", "narrow"); }, u"narrow"},
        {[] { return formatted(u"%d %u", INT_MIN, 0xFFFFFFFFu); }, u"-2147483648 4294967295"},
        {[] { return formatted(u"%x %X %08X", 0xabc, 0xabc, 0xabc); }, u"abc ABC 00000ABC"},
        {[] { return formatted(u"%lu %ld", 4000000000u, -5); }, u"4000000000 -5"},
        {[] { return formatted(u"%c%%", u'Q'); }, u"Q%"},
        {[] { return formatted(u"[%5s][%-5s][%.3s]", u"ab", u"ab", u"abcdef"); },
         u"[   ab][ab   ][abc]"},
        {[] { return formatted(u"%yz"); }, u"yz"},
        {[] { return formatted(u"100%"); }, u"100"},
    };
    for (size_t i = 0; i < sizeof rows / sizeof rows[0]; ++i) {
        SCOPED_TRACE(i);
        EXPECT_EQ(rows[i].run(), rows[i].wanted);
    }
}

// Output stops at 1023 characters and the terminator; nothing is written at [1024]. From 1023
// characters on the result is 1024.
TEST(Wsprintf, LimitOf1024Characters) {
    const struct {
        size_t length;
        int result;
    } rows[] = {{1021, 1021}, {1022, 1022}, {1023, 1024}, {1024, 1024}, {1030, 1024}, {2999, 1024}};
    for (const auto& row : rows) {
        SCOPED_TRACE(row.length);
        std::u16string text(row.length, u'x');
        PatternBuffer out;
        out.chars.resize(3100, PatternBuffer::pattern);
        EXPECT_EQ(wsprintfW(out.data(), u"%s", text.c_str()), row.result);
        size_t kept = std::min<size_t>(row.length, 1023);
        EXPECT_EQ(std::u16string(out.data()).size(), kept);
        for (size_t i = kept + 1; i < out.chars.size(); ++i)
            ASSERT_EQ(out.chars[i], PatternBuffer::pattern) << "at " << i;
    }
}

}  // namespace
