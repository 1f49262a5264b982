// Splitting script lines into tokens, and the values that tokens stand for.
#include <algorithm>
#include <cctype>

#include "script_internal.h"

namespace hv::script {

namespace {

bool isBlank(char c) {
    return c == ' ' || c == '\t';
}

// Resolves the escape after a backslash at `pos`; returns an error or "".
std::string escape(const std::string& line, size_t& pos, std::u16string& text) {
    char c = line[pos];
    switch (c) {
        case '\\': text += u'\\'; break;
        case '"': text += u'"'; break;
        case 'n': text += u'\n'; break;
        case 'r': text += u'\r'; break;
        case 't': text += u'\t'; break;
        case 'u': {
            std::string digits = line.substr(pos + 1, 4);
            size_t valid = 0;
            while (valid < digits.size() &&
                   std::isxdigit(static_cast<unsigned char>(digits[valid])))
                ++valid;
            if (valid < 4)
                return "bad escape \\u" + digits.substr(0, valid) + " (\\u takes four hex digits)";
            text += static_cast<char16_t>(std::stoul(digits, nullptr, 16));
            pos += 4;
            break;
        }
        default: return std::string("bad escape \\") + c;
    }
    ++pos;
    return std::string();
}

// Reads a quoted text whose opening quote is at `pos`.
std::string quoted(const std::string& line, size_t& pos, Token& token) {
    std::string run;  // UTF-8 bytes since the last escape
    for (++pos; pos < line.size() && line[pos] != '"'; ++pos) {
        if (line[pos] != '\\') {
            run += line[pos];
            continue;
        }
        if (++pos == line.size()) break;
        token.text += fromUtf8(run);
        run.clear();
        std::string error = escape(line, pos, token.text);
        if (!error.empty()) return error;
        --pos;
    }
    if (pos >= line.size()) return "missing closing quote";
    token.text += fromUtf8(run);
    ++pos;
    if (pos < line.size() && !isBlank(line[pos]) && line[pos] != '#')
        return "text after a closing quote";
    token.quoted = true;
    return std::string();
}

// Reads a bare word starting at `pos`.
std::string bare(const std::string& line, size_t& pos, Token& token) {
    size_t start = pos;
    while (pos < line.size() && !isBlank(line[pos]) && line[pos] != '#') ++pos;
    token.word = line.substr(start, pos - start);
    if (token.word.find('"') != std::string::npos) return "stray quote in '" + token.word + "'";
    return std::string();
}

const char* const RootNames[] = {"HKEY_CLASSES_ROOT", "HKEY_LOCAL_MACHINE", "HKEY_CURRENT_USER",
                                 "HKEY_CURRENT_CONFIG", "HKEY_USERS"};

// The root index of one of the five names, or -1.
int rootIndexOf(const std::string& name) {
    for (int i = 0; i < 5; ++i)
        if (name == RootNames[i]) return i;
    return -1;
}

// A word that is meant as a number: a digit, or a minus and a digit.
bool looksNumeric(const std::string& word) {
    size_t first = word[0] == '-' ? 1 : 0;
    return first < word.size() && std::isdigit(static_cast<unsigned char>(word[first]));
}

}  // namespace

std::string lex(const std::string& line, size_t pos, std::vector<Token>& tokens, size_t* end) {
    *end = line.size();
    while (true) {
        while (pos < line.size() && isBlank(line[pos])) ++pos;
        if (pos >= line.size()) return std::string();
        if (line[pos] == '#') {
            *end = pos;
            return std::string();
        }
        Token token;
        std::string error = line[pos] == '"' ? quoted(line, pos, token) : bare(line, pos, token);
        if (!error.empty()) return error;
        tokens.push_back(std::move(token));
    }
}

std::string scanInteger(const std::string& word, IntegerDigits& number) {
    number.hex = word.size() > 2 && word[0] == '0' && (word[1] == 'x' || word[1] == 'X');
    number.negative = !number.hex && !word.empty() && word[0] == '-';
    number.digits = word.substr(number.hex ? 2 : number.negative ? 1 : 0);
    bool ok = !number.digits.empty();
    for (char c : number.digits) {
        auto u = static_cast<unsigned char>(c);
        ok = ok && (number.hex ? std::isxdigit(u) : std::isdigit(u));
    }
    if (!ok) return "bad integer '" + word + "'";
    std::string& digits = number.digits;
    digits.erase(0, std::min(digits.find_first_not_of('0'), digits.size() - 1));
    return std::string();
}

std::string parseInteger(const std::string& word, int64_t& value) {
    IntegerDigits number;
    std::string error = scanInteger(word, number);
    if (!error.empty()) return error;
    const std::string& digits = number.digits;
    bool hex = number.hex, negative = number.negative;
    if (digits.size() > 10) return "integer out of range '" + word + "'";
    int64_t magnitude = std::stoll(digits, nullptr, hex ? 16 : 10);
    value = negative ? -magnitude : magnitude;
    if (value < INT32_MIN || value > static_cast<int64_t>(UINT32_MAX))
        return "integer out of range '" + word + "'";
    return std::string();
}

Value integerValue(int64_t n) {
    Value v;
    v.kind = Value::Kind::Integer;
    v.integer = n;
    return v;
}

std::string parseParameter(const Token& token, Value& value) {
    const std::string& w = token.word;
    if (token.quoted) {
        value.kind = Value::Kind::Text;
        value.text = token.text;
    } else if (w == "null") {
        value.kind = Value::Kind::Null;
    } else if (w == "result") {
        value.kind = Value::Kind::LastResult;
    } else if (w.compare(0, 5, "root:") == 0) {
        std::string number = w.substr(5);
        if (number.empty() || number[0] == '-' || !parseInteger(number, value.integer).empty())
            return "bad root index '" + w + "' (root:N takes 0 to 4294967295)";
        value.kind = Value::Kind::RootKey;
        value.word = w;
    } else if (looksNumeric(w)) {
        value.kind = Value::Kind::Integer;
        return parseInteger(w, value.integer);
    } else if (rootIndexOf(w) >= 0) {
        value.kind = Value::Kind::RootKey;
        value.integer = rootIndexOf(w);
        value.word = w;
    } else if (w.compare(0, 5, "HKEY_") == 0) {
        return "unknown root key name '" + w + "'";
    } else {
        return "stray text '" + w + "'";
    }
    return std::string();
}

const char* rootKeyName(uint32_t index) {
    return index < 5 ? RootNames[index] : "";
}

std::string describe(const Value& value) {
    switch (value.kind) {
        case Value::Kind::Null: return "null";
        case Value::Kind::Text: return quote(value.text);
        case Value::Kind::Integer: return std::to_string(value.integer);
        case Value::Kind::Boolean: return value.boolean ? "true" : "false";
        case Value::Kind::RootKey: return value.word;
        case Value::Kind::LastResult: return "result";
        default: return value.word;
    }
}

std::string quote(const std::u16string& text) {
    static const char digits[] = "0123456789abcdef";
    std::u16string out = u"\"";
    for (size_t i = 0; i < text.size(); ++i) {
        char16_t c = text[i];
        bool pair = c >= 0xD800 && c <= 0xDBFF && i + 1 < text.size() && text[i + 1] >= 0xDC00 &&
                    text[i + 1] <= 0xDFFF;
        if (pair) {
            out += text.substr(i++, 2);
        } else if (c == u'\\' || c == u'"') {
            out += u'\\';
            out += c;
        } else if (c == u'\n' || c == u'\r' || c == u'\t') {
            out += c == u'\n' ? u"\\n" : c == u'\r' ? u"\\r" : u"\\t";
        } else if (c < 0x20 || c == 0x7F || (c >= 0xD800 && c <= 0xDFFF)) {
            out += u"\\u";
            for (int shift = 12; shift >= 0; shift -= 4)
                out += static_cast<char16_t>(digits[(c >> shift) & 15]);
        } else {
            out += c;
        }
    }
    return toUtf8(out + u"\"");
}

}  // namespace hv::script
