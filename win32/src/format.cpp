// wsprintfW and wvsprintfW of user32: the field syntax %[-][#][0][width][.precision]type with
// the types c, d, i, u, x, X, p, s and S (size prefixes h, l, w), Windows' output limit of 1024
// characters including the terminator, and "(null)" for a null text.
#include "internal.h"

#include <string>

namespace {

const size_t OutputLimit = 1024;  // characters, terminator included

struct Field {
    bool left = false, alternate = false, zeros = false;
    unsigned width = 0;
    int precision = -1;  // -1: none
    char size = 0;       // 'h' narrow, 'l' or 'w' wide, 0 default
};

// Output kept to one character past what fits, which is all the limit needs to know.
class Output {
public:
    void put(char16_t c) {
        if (text_.size() < OutputLimit) text_ += c;
    }
    void pad(size_t count, char16_t c) {
        for (size_t i = 0; i < count && text_.size() < OutputLimit; ++i) text_ += c;
    }
    const std::u16string& text() const { return text_; }

private:
    std::u16string text_;
};

// Writes `body` (already cut to the precision) padded to the field's width.
void emit(Output& out, const Field& f, const std::u16string& prefix, const std::u16string& body,
          char16_t padChar) {
    size_t length = prefix.size() + body.size();
    size_t padding = f.width > length ? f.width - length : 0;
    if (!f.left && padChar == u' ') out.pad(padding, u' ');
    for (char16_t c : prefix) out.put(c);
    if (!f.left && padChar == u'0') out.pad(padding, u'0');
    for (char16_t c : body) out.put(c);
    if (f.left) out.pad(padding, u' ');
}

std::u16string digits(uint32_t value, unsigned base, bool upper) {
    const char* set = upper ? "0123456789ABCDEF" : "0123456789abcdef";
    std::u16string s;
    do {
        s.insert(s.begin(), static_cast<char16_t>(set[value % base]));
        value /= base;
    } while (value);
    return s;
}

void number(Output& out, const Field& f, char type, uint32_t bits) {
    bool negative = (type == 'd' || type == 'i') && static_cast<int32_t>(bits) < 0;
    uint32_t magnitude = negative ? 0u - bits : bits;
    bool hex = type == 'x' || type == 'X' || type == 'p';
    std::u16string body = digits(magnitude, hex ? 16 : 10, type != 'x');
    if (f.precision >= 0 && body.size() < static_cast<size_t>(f.precision))
        body.insert(0, static_cast<size_t>(f.precision) - body.size(), u'0');
    std::u16string prefix = negative ? u"-" : u"";
    if (f.alternate && type == 'x') prefix = u"0x";
    if (f.alternate && type == 'X') prefix = u"0X";
    emit(out, f, prefix, body, f.zeros && !f.left ? u'0' : u' ');
}

void text(Output& out, const Field& f, bool narrow, const void* address) {
    std::u16string body;
    size_t limit = f.precision >= 0 ? static_cast<size_t>(f.precision) : OutputLimit;
    if (!address) {
        body = u"(null)";
    } else if (narrow) {
        for (auto* p = static_cast<const unsigned char*>(address); *p && body.size() < limit; ++p)
            body += static_cast<char16_t>(*p);
    } else {
        for (auto* p = static_cast<const char16_t*>(address); *p && body.size() < limit; ++p)
            body += *p;
    }
    if (body.size() > limit) body.resize(limit);
    emit(out, f, u"", body, u' ');
}

// Reads one field after its '%'; returns the position after the type character.
const WCHAR* field(Output& out, const WCHAR* p, va_list& args) {
    Field f;
    for (;; ++p) {
        if (*p == u'-') f.left = true;
        else if (*p == u'#') f.alternate = true;
        else if (*p == u'0') f.zeros = true;
        else break;
    }
    for (; *p >= u'0' && *p <= u'9'; ++p) f.width = f.width * 10 + static_cast<unsigned>(*p - u'0');
    if (f.width > OutputLimit) f.width = OutputLimit;
    if (*p == u'.') {
        f.precision = 0;
        for (++p; *p >= u'0' && *p <= u'9'; ++p)
            if (f.precision < static_cast<int>(OutputLimit)) f.precision = f.precision * 10 + (*p - u'0');
    }
    if (*p == u'h' || *p == u'l' || *p == u'w') f.size = static_cast<char>(*p++);
    WCHAR type = *p;
    if (type == 0) return p;
    switch (type) {
        case u'd': case u'i': case u'u': case u'x': case u'X':
            number(out, f, static_cast<char>(type), static_cast<uint32_t>(va_arg(args, int)));
            break;
        case u'p':
            number(out, f, 'p', static_cast<uint32_t>(reinterpret_cast<uintptr_t>(va_arg(args, void*))));
            break;
        case u'c': case u'C': {
            auto c = static_cast<unsigned>(va_arg(args, int));
            bool narrow = f.size == 'h' || (type == u'C' && f.size == 0);
            emit(out, f, u"", std::u16string(1, static_cast<char16_t>(narrow ? c & 0xFF : c & 0xFFFF)), u' ');
            break;
        }
        case u's': case u'S':
            text(out, f, f.size == 'h' || (type == u'S' && f.size == 0), va_arg(args, const void*));
            break;
        default: out.put(type);  // an unknown type is copied without its '%'
    }
    return p + 1;
}

}  // namespace

namespace {

// One implementation behind both calling styles; the journal names the one called.
int format(const char* name, LPWSTR buffer, LPCWSTR pattern, va_list arguments) {
    Output out;
    va_list args;
    va_copy(args, arguments);
    for (const WCHAR* p = pattern; p && *p;) {
        if (*p != u'%') {
            out.put(*p++);
        } else if (p[1] == u'%') {
            out.put(u'%');
            p += 2;
        } else {
            p = field(out, p + 1, args);
        }
    }
    va_end(args);
    const std::u16string& s = out.text();
    size_t kept = s.size() < OutputLimit - 1 ? s.size() : OutputLimit - 1;
    s.copy(buffer, kept);
    buffer[kept] = 0;
    // Wine reports 1024 for an output that reached the limit, although 1023 were written.
    int result = s.size() >= OutputLimit - 1 ? static_cast<int>(OutputLimit) : static_cast<int>(kept);
    w32::record(name, {w32::arg(buffer), w32::arg(pattern)}, result);
    return result;
}

}  // namespace

int WINAPI wvsprintfW(LPWSTR buffer, LPCWSTR form, va_list arguments) {
    return format("wvsprintfW", buffer, form, arguments);
}

int WINAPIV wsprintfW(LPWSTR buffer, LPCWSTR form, ...) {
    va_list args;
    va_start(args, form);
    int result = format("wsprintfW", buffer, form, args);
    va_end(args);
    return result;
}
