// Splitting script lines into tokens, and the values, integers and bytes that tokens stand for.
#include <cctype>

#include "script_internal.h"

namespace hv::script {

namespace {

bool isBlank(char c) { return c == ' ' || c == '\t'; }

bool isHex(char c) { return std::isxdigit(static_cast<unsigned char>(c)) != 0; }

// Resolves the escape after a backslash at `pos`.
void escape(const std::string& line, size_t& pos, std::u16string& text) {
    char c = line[pos];
    switch (c) {
        case '\\': text += u'\\'; break;
        case '"': text += u'"'; break;
        case 'n': text += u'\n'; break;
        case 'r': text += u'\r'; break;
        case 'u': {
            std::string digits = line.substr(pos + 1, 4);
            size_t valid = 0;
            while (valid < digits.size() && isHex(digits[valid])) ++valid;
            if (valid < 4)
                refuse("bad escape \\u" + digits.substr(0, valid) + " (\\u takes four hex digits)");
            text += static_cast<char16_t>(std::stoul(digits, nullptr, 16));
            pos += 4;
            break;
        }
        default: refuse(std::string("bad escape \\") + c);
    }
    ++pos;
}

// Reads a quoted text whose opening quote is at `pos`.
void quoted(const std::string& line, size_t& pos, Token& token) {
    std::string run;  // UTF-8 bytes since the last escape
    for (++pos; pos < line.size() && line[pos] != '"'; ++pos) {
        if (line[pos] != '\\') {
            run += line[pos];
            continue;
        }
        if (++pos == line.size()) break;
        token.text += fromUtf8(run);
        run.clear();
        escape(line, pos, token.text);
        --pos;
    }
    if (pos >= line.size()) refuse("missing closing quote");
    token.text += fromUtf8(run);
    ++pos;
    if (pos < line.size() && !isBlank(line[pos]) && line[pos] != '#')
        refuse("text after a closing quote");
    token.quoted = true;
}

// Reads a bare word starting at `pos`.
void bare(const std::string& line, size_t& pos, Token& token) {
    size_t start = pos;
    while (pos < line.size() && !isBlank(line[pos]) && line[pos] != '#') ++pos;
    token.word = line.substr(start, pos - start);
    if (token.word.find('"') != std::string::npos) refuse("stray quote in '" + token.word + "'");
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

std::vector<Token> lex(const std::string& line, size_t pos, size_t* end) {
    std::vector<Token> tokens;
    while (true) {
        while (pos < line.size() && isBlank(line[pos])) ++pos;
        if (pos >= line.size() || line[pos] == '#') break;
        Token token;
        line[pos] == '"' ? quoted(line, pos, token) : bare(line, pos, token);
        tokens.push_back(std::move(token));
    }
    if (end) *end = pos;
    return tokens;
}

std::string Operands::word() {
    const Token* t = peek();
    if (!t || t->quoted) return std::string();
    ++at_;
    return t->word;
}

std::u16string Operands::text(const std::string& usage) {
    const Token* t = peek();
    if (!t || !t->quoted) refuse(usage);
    ++at_;
    return t->text;
}

int64_t Operands::integer(const std::string& usage) {
    std::string number = word();
    if (number.empty()) refuse(usage);
    int64_t value = 0;
    refuseIf(parseInteger(number, value));
    return value;
}

bool Operands::takeLast(const char* word) {
    bool found = left() && !tokens_.back().quoted && tokens_.back().word == word;
    if (found) tokens_.pop_back();
    return found;
}

void Operands::end() const {
    if (const Token* t = peek())
        refuse("stray text '" + (t->quoted ? quote(t->text) : t->word) + "'");
}

std::string parseInteger(const std::string& word, int bits, uint64_t& value) {
    bool hex = word.size() > 2 && word[0] == '0' && (word[1] == 'x' || word[1] == 'X');
    bool negative = !hex && !word.empty() && word[0] == '-';
    std::string digits = word.substr(hex ? 2 : negative ? 1 : 0);
    bool ok = !digits.empty();
    for (char c : digits) ok = ok && (hex ? isHex(c) : std::isdigit(static_cast<unsigned char>(c)));
    if (!ok) return "bad integer '" + word + "'";
    const uint64_t base = hex ? 16 : 10, largest = bits == 64 ? UINT64_MAX : UINT32_MAX;
    uint64_t magnitude = 0;
    for (char c : digits) {
        auto digit = static_cast<uint64_t>(std::stoi(std::string(1, c), nullptr, 16));
        if (magnitude > (largest - digit) / base) return "integer out of range '" + word + "'";
        magnitude = magnitude * base + digit;
    }
    if (negative && magnitude > largest / 2 + 1) return "integer out of range '" + word + "'";
    value = negative ? 0 - magnitude : magnitude;
    return std::string();
}

std::string parseInteger(const std::string& word, int64_t& value) {
    uint64_t bits = 0;
    std::string error = parseInteger(word, 32, bits);
    value = static_cast<int64_t>(bits);
    return error;
}

Argument parseArgument(const Token& token) {
    const std::string& w = token.word;
    Argument argument;
    Param& p = argument.value;
    int64_t n = 0;
    if (token.quoted) {
        p = Param::str(token.text);
    } else if (w == "null") {
        p = Param::null();
    } else if (w == "result") {
        argument.lastResult = true;
    } else if (w.compare(0, 5, "root:") == 0) {
        std::string number = w.substr(5);
        if (number.empty() || number[0] == '-' || !parseInteger(number, n).empty())
            refuse("bad root index '" + w + "' (root:N takes 0 to 4294967295)");
        p = Param::rootKey(static_cast<uint32_t>(n));
    } else if (looksNumeric(w)) {
        refuseIf(parseInteger(w, n));
        p = Param::integerValue(static_cast<int32_t>(static_cast<uint32_t>(n)));
    } else if (rootIndexOf(w) >= 0) {
        p = Param::rootKey(static_cast<uint32_t>(rootIndexOf(w)));
    } else if (w.compare(0, 5, "HKEY_") == 0) {
        refuse("unknown root key name '" + w + "'");
    } else {
        refuse("stray text '" + w + "'");
    }
    return argument;
}

uint32_t takeView(Operands& in) {
    if (in.takeLast("view64")) return KEY_WOW64_64KEY;
    return in.takeLast("view32") ? KEY_WOW64_32KEY : 0;
}

uint32_t parseRootName(const Token* token, const std::string& usage) {
    int index = token && !token->quoted ? rootIndexOf(token->word) : -1;
    if (index < 0 && token && !token->quoted && token->word.compare(0, 5, "HKEY_") == 0)
        refuse("unknown root key name '" + token->word + "'");
    if (index < 0) refuse(usage);
    return static_cast<uint32_t>(index);
}

std::vector<uint8_t> parseHex(const std::u16string& text) {
    std::string ascii;
    for (char16_t c : text) ascii += c < 0x80 ? static_cast<char>(c) : '?';
    std::vector<uint8_t> data;
    for (size_t i = 0; i < ascii.size(); ++i) {
        if (isBlank(ascii[i])) continue;
        if (i + 1 >= ascii.size() || !isHex(ascii[i]) || !isHex(ascii[i + 1]))
            refuse("bad hex bytes '" + ascii +
                   "' (pairs of hex digits, blanks only between bytes)");
        data.push_back(static_cast<uint8_t>(std::stoul(ascii.substr(i++, 2), nullptr, 16)));
    }
    return data;
}

std::string hexList(const std::vector<uint8_t>& bytes) {
    static const char Digits[] = "0123456789abcdef";
    std::string out;
    for (uint8_t b : bytes) {
        if (!out.empty()) out += ' ';
        out += Digits[b >> 4];
        out += Digits[b & 15];
    }
    return "[" + out + "]";
}

const char* rootKeyName(uint32_t index) { return index < 5 ? RootNames[index] : ""; }

HKEY rootKeyHandle(uint32_t index) {
    static const HKEY Roots[] = {HKEY_CLASSES_ROOT, HKEY_LOCAL_MACHINE, HKEY_CURRENT_USER,
                                 HKEY_CURRENT_CONFIG, HKEY_USERS};
    return Roots[index];
}

std::string quote(const std::u16string& text) {
    static const char Digits[] = "0123456789abcdef";
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
        } else if (c == u'\n' || c == u'\r') {
            out += c == u'\n' ? u"\\n" : u"\\r";
        } else if (c < 0x20 || c == 0x7F || (c >= 0xD800 && c <= 0xDFFF)) {
            out += u"\\u";
            for (int shift = 12; shift >= 0; shift -= 4)
                out += static_cast<char16_t>(Digits[(c >> shift) & 15]);
        } else {
            out += c;
        }
    }
    return toUtf8(out + u"\"");
}

}  // namespace hv::script
