// Text at the host's edges: UTF-8 scripts and transcripts, UTF-16 for the module, and the
// system's messages.
#include "internal.h"

namespace hv {

namespace {

// Length of the UTF-8 sequence that starts with `lead`, or 0 when `lead` cannot start one.
size_t sequenceLength(unsigned char lead) {
    if (lead < 0x80) return 1;
    if (lead >= 0xC2 && lead <= 0xDF) return 2;
    if (lead >= 0xE0 && lead <= 0xEF) return 3;
    if (lead >= 0xF0 && lead <= 0xF4) return 4;
    return 0;
}

// Decodes one sequence at `i`, advancing it; U+FFFD for a malformed one.
char32_t decode(const std::string& s, size_t& i) {
    auto lead = static_cast<unsigned char>(s[i]);
    size_t n = sequenceLength(lead);
    if (n == 0 || i + n > s.size()) {
        ++i;
        return 0xFFFD;
    }
    char32_t c = n == 1 ? lead : lead & (0x7F >> n);
    for (size_t k = 1; k < n; ++k) {
        auto b = static_cast<unsigned char>(s[i + k]);
        if ((b & 0xC0) != 0x80) {
            ++i;
            return 0xFFFD;
        }
        c = (c << 6) | (b & 0x3F);
    }
    i += n;
    bool overlong = (n == 3 && c < 0x800) || (n == 4 && c < 0x10000);
    if (overlong || c > 0x10FFFF || (c >= 0xD800 && c <= 0xDFFF)) return 0xFFFD;
    return c;
}

// Appends one code point as UTF-8: a lead byte, then six bits per continuation byte.
void appendUtf8(std::string& out, char32_t c) {
    static const unsigned char Leads[] = {0, 0xC0, 0xE0, 0xF0};
    int more = c < 0x80 ? 0 : c < 0x800 ? 1 : c < 0x10000 ? 2 : 3;
    out += static_cast<char>(Leads[more] | (c >> (6 * more)));
    for (int k = more - 1; k >= 0; --k) out += static_cast<char>(0x80 | ((c >> (6 * k)) & 0x3F));
}

}  // namespace

std::u16string fromUtf8(const std::string& text) {
    std::u16string out;
    for (size_t i = 0; i < text.size();) {
        char32_t c = decode(text, i);
        if (c >= 0x10000) {
            c -= 0x10000;
            out += static_cast<char16_t>(0xD800 + (c >> 10));
            out += static_cast<char16_t>(0xDC00 + (c & 0x3FF));
        } else {
            out += static_cast<char16_t>(c);
        }
    }
    return out;
}

// A lone surrogate has no UTF-8 form: it becomes U+FFFD.
std::string toUtf8(const std::u16string& text) {
    std::string out;
    for (size_t i = 0; i < text.size(); ++i) {
        char32_t c = text[i];
        bool high = c >= 0xD800 && c <= 0xDBFF;
        if (high && i + 1 < text.size() && text[i + 1] >= 0xDC00 && text[i + 1] <= 0xDFFF) {
            c = 0x10000 + ((c - 0xD800) << 10) + (text[++i] - 0xDC00);
        } else if (c >= 0xD800 && c <= 0xDFFF) {
            c = 0xFFFD;
        }
        appendUtf8(out, c);
    }
    return out;
}

std::u16string systemMessage(uint32_t code) {
    WCHAR buffer[512];
    DWORD length = FormatMessageW(FORMAT_MESSAGE_FROM_SYSTEM | FORMAT_MESSAGE_IGNORE_INSERTS,
                                  nullptr, code, 0, buffer, 512, nullptr);
    if (length == 0 || length >= 512) return std::u16string();
    return std::u16string(reinterpret_cast<const char16_t*>(buffer), length);
}

long firstDifference(const uint8_t* data, const uint8_t* expected, size_t size) {
    for (size_t i = 0; i < size; ++i)
        if (data[i] != expected[i]) return static_cast<long>(i);
    return -1;
}

long firstNotPattern(const uint8_t* data, uint8_t pattern, size_t size) {
    for (size_t i = 0; i < size; ++i)
        if (data[i] != pattern) return static_cast<long>(i);
    return -1;
}

// A number in hex, for messages.
std::string hex(uint64_t value) {
    static const char Digits[] = "0123456789ABCDEF";
    std::string out;
    do {
        out.insert(out.begin(), Digits[value & 15]);
        value >>= 4;
    } while (value);
    return "0x" + out;
}

}  // namespace hv
