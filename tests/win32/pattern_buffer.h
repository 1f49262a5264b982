// A text buffer filled with a pattern, to see exactly which characters a function wrote.
#pragma once

#include "conformance.h"

#include <vector>

struct PatternBuffer {
    static constexpr WCHAR Pattern = WCHAR(0xA5A5);
    std::vector<WCHAR> chars = std::vector<WCHAR>(600, Pattern);

    WCHAR* data() { return chars.data(); }

    // Expects `text` and its terminator at the start (nothing at all when `text` is null) and
    // the pattern everywhere after them.
    void expectHolds(const WCHAR* text) const {
        size_t written = 0;
        if (text) {
            written = std::char_traits<WCHAR>::length(text) + 1;
            EXPECT_EQ(WString(chars.data(), written), WString(text, written));
        }
        for (size_t i = written; i < chars.size(); ++i) ASSERT_EQ(chars[i], Pattern) << "at " << i;
    }
};
