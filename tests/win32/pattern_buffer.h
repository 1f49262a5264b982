// A text buffer filled with a pattern, to see exactly which characters a function wrote.
#pragma once

#include <windows.h>

#include <gtest/gtest.h>

#include <string>
#include <vector>

struct PatternBuffer {
    static constexpr WCHAR pattern = 0xA5A5;
    std::vector<WCHAR> chars = std::vector<WCHAR>(600, pattern);

    WCHAR* data() { return chars.data(); }

    // Expects `text` and its terminator at the start (nothing at all when `text` is null) and
    // the pattern everywhere after them.
    void expectHolds(const char16_t* text) const {
        size_t written = 0;
        if (text) {
            written = std::char_traits<char16_t>::length(text) + 1;
            EXPECT_EQ(std::u16string(chars.data(), written), std::u16string(text, written));
        }
        for (size_t i = written; i < chars.size(); ++i) ASSERT_EQ(chars[i], pattern) << "at " << i;
    }
};
