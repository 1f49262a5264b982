// Registry lines: set-up and checks that go through the Win32 registry functions themselves, so
// that one script runs alike against the portable layer and against a real registry.
#include <cctype>

#include "internal.h"
#include "script_internal.h"

namespace hv::script {

// Bytes as "[61 00 ff]".
std::string hexList(const std::vector<uint8_t>& bytes) {
    static const char digits[] = "0123456789abcdef";
    std::string out;
    for (uint8_t b : bytes) {
        if (!out.empty()) out += ' ';
        out += digits[b >> 4];
        out += digits[b & 15];
    }
    return "[" + out + "]";
}

// Hex bytes written as pairs of digits, blanks allowed between whole bytes: "01 02ff".
std::string parseHex(const std::u16string& text, std::vector<uint8_t>& data) {
    std::string ascii;
    for (char16_t c : text) ascii += c < 0x80 ? static_cast<char>(c) : '?';
    std::string bad =
        "bad hex bytes '" + ascii + "' (pairs of hex digits, blanks only between bytes)";
    size_t i = 0;
    while (i < ascii.size()) {
        if (ascii[i] == ' ' || ascii[i] == '\t') {
            ++i;
            continue;
        }
        if (i + 1 >= ascii.size() || !std::isxdigit(static_cast<unsigned char>(ascii[i])) ||
            !std::isxdigit(static_cast<unsigned char>(ascii[i + 1])))
            return bad;
        data.push_back(static_cast<uint8_t>(std::stoul(ascii.substr(i, 2), nullptr, 16)));
        i += 2;
    }
    return std::string();
}

namespace {

// The operands of a line, read front to back.
class Operands {
public:
    explicit Operands(const std::vector<Token>& tokens) : tokens_(tokens), end_(tokens.size()) {}
    bool atEnd() const { return at_ >= end_; }
    const Token* peek() const { return atEnd() ? nullptr : &tokens_[at_]; }
    // The next operand when it is a bare word, else "" (nothing is taken).
    std::string word() {
        const Token* t = peek();
        if (!t || t->quoted) return std::string();
        ++at_;
        return t->word;
    }
    // The next operand when it is a quoted text.
    bool text(std::u16string& out) {
        const Token* t = peek();
        if (!t || !t->quoted) return false;
        out = t->text;
        ++at_;
        return true;
    }
    // Leaves the last operand out of the reading.
    void dropLast() { --end_; }
    // The message for the first operand left over, or "" when none is.
    std::string rest() const {
        const Token* t = peek();
        if (!t) return std::string();
        return "stray text '" + (t->quoted ? quote(t->text) : t->word) + "'";
    }

private:
    const std::vector<Token>& tokens_;
    size_t at_ = 0;
    size_t end_;
};

struct TypeName {
    const char* word;  // as scripts write it
    uint32_t type;
    const char* name;  // as Windows names it
};

const TypeName TypeNames[] = {
    {"none", REG_NONE, "REG_NONE"},
    {"sz", REG_SZ, "REG_SZ"},
    {"expand_sz", REG_EXPAND_SZ, "REG_EXPAND_SZ"},
    {"binary", REG_BINARY, "REG_BINARY"},
    {"dword", REG_DWORD, "REG_DWORD"},
    {"dword_be", REG_DWORD_BIG_ENDIAN, "REG_DWORD_BIG_ENDIAN"},
    {"link", REG_LINK, "REG_LINK"},
    {"multi_sz", REG_MULTI_SZ, "REG_MULTI_SZ"},
    {"qword", REG_QWORD, "REG_QWORD"},
};

// "REG_SZ", or "type 12345" for a type without a name.
std::string typeName(uint32_t type) {
    for (const TypeName& t : TypeNames)
        if (t.type == type) return t.name;
    return "type " + std::to_string(type);
}

// Appends UTF-16 text as little-endian bytes, with its terminator.
void appendText(std::vector<uint8_t>& data, const std::u16string& text) {
    for (char16_t unit : text) {
        data.push_back(static_cast<uint8_t>(unit & 0xFF));
        data.push_back(static_cast<uint8_t>(unit >> 8));
    }
    data.push_back(0);
    data.push_back(0);
}

void appendLittleEndian(std::vector<uint8_t>& data, uint64_t value, int bytes) {
    for (int i = 0; i < bytes; ++i) data.push_back(static_cast<uint8_t>(value >> (8 * i)));
}


// A 64-bit integer: decimal from -9223372036854775808 to 18446744073709551615, or 0x with up
// to sixteen hex digits.
std::string parseInteger64(const std::string& word, uint64_t& value) {
    IntegerDigits number;
    std::string error = scanInteger(word, number);
    if (!error.empty()) return error;
    const std::string& digits = number.digits;
    bool hex = number.hex, negative = number.negative;
    bool fits = hex ? digits.size() <= 16
                    : digits.size() < 20 ||
                          (digits.size() == 20 && digits <= "18446744073709551615");
    if (!fits) return "integer out of range '" + word + "'";
    unsigned long long magnitude = std::stoull(digits, nullptr, hex ? 16 : 10);
    if (negative && magnitude > 0x8000000000000000ull) return "integer out of range '" + word + "'";
    value = negative ? 0 - static_cast<uint64_t>(magnitude) : static_cast<uint64_t>(magnitude);
    return std::string();
}

// The type word of `bytes`: a name of TypeNames or a 32-bit number.
std::string parseTypeWord(const std::string& word, uint32_t& type) {
    for (const TypeName& t : TypeNames)
        if (word == t.word) {
            type = t.type;
            return std::string();
        }
    int64_t number = 0;
    if (word.empty() || !std::isdigit(static_cast<unsigned char>(word[0])) ||
        !parseInteger(word, number).empty())
        return "unknown value type '" + word +
               "' (none, sz, expand_sz, binary, dword, dword_be, link, multi_sz, qword or a "
               "number)";
    type = static_cast<uint32_t>(number);
    return std::string();
}

// sz and expand_sz take one text, multi_sz a list; each text is stored with its terminator.
std::string parseTexts(Operands& in, const std::string& kind, RegistryLine& reg) {
    std::u16string text;
    if (kind == "multi_sz") {
        reg.type = REG_MULTI_SZ;
        while (in.text(text)) appendText(reg.data, text);
        appendText(reg.data, u"");  // the empty text that ends the list
        return std::string();
    }
    if (!in.text(text)) return kind + " needs one text in quotes";
    reg.type = kind == "sz" ? REG_SZ : REG_EXPAND_SZ;
    appendText(reg.data, text);
    return std::string();
}

// dword takes a 32-bit integer, qword a 64-bit one; both are stored little-endian.
std::string parseNumber(Operands& in, const std::string& kind, RegistryLine& reg) {
    std::string number = in.word();
    if (number.empty()) return kind + " needs an integer";
    uint64_t value = 0;
    std::string error;
    if (kind == "dword") {
        int64_t dword = 0;
        error = parseInteger(number, dword);
        value = static_cast<uint64_t>(dword);
    } else {
        error = parseInteger64(number, value);
    }
    reg.type = kind == "dword" ? REG_DWORD : REG_QWORD;
    appendLittleEndian(reg.data, value, kind == "dword" ? 4 : 8);
    return error;
}

// binary takes hex bytes; bytes takes a type and hex bytes, for data no other form writes.
std::string parseBytes(Operands& in, const std::string& kind, RegistryLine& reg) {
    reg.type = REG_BINARY;
    if (kind == "bytes") {
        std::string type = in.word();
        if (type.empty()) return "bytes needs a value type and hex bytes in quotes";
        if (std::string error = parseTypeWord(type, reg.type); !error.empty()) return error;
    }
    std::u16string hex;
    if (!in.text(hex)) return kind + " needs hex bytes in quotes";
    return parseHex(hex, reg.data);
}

// The data of a value: a type word and what that type takes.
std::string parseData(Operands& in, const std::string& form, RegistryLine& reg) {
    std::string kind = in.word();
    reg.hasData = true;
    if (kind == "sz" || kind == "expand_sz" || kind == "multi_sz")
        return parseTexts(in, kind, reg);
    if (kind == "dword" || kind == "qword") return parseNumber(in, kind, reg);
    if (kind == "binary" || kind == "bytes") return parseBytes(in, kind, reg);
    return "reg " + form + " needs " + (form == "expect value" ? "missing or " : "") +
           "a value type: sz, expand_sz, multi_sz, dword, qword, binary or bytes" +
           (kind.empty() ? std::string() : ", not '" + kind + "'");
}

// The root key, key path and (for values) the value name of a line.
std::string parsePlace(Operands& in, const std::string& form, RegistryLine& reg, bool value) {
    const Token* t = in.peek();
    bool bare = t && !t->quoted;
    Value root;
    std::string error = bare ? parseParameter(*t, root) : std::string();
    if (!error.empty() && t->word.compare(0, 5, "HKEY_") == 0) return error;
    if (!bare || !error.empty() || root.kind != Value::Kind::RootKey ||
        root.word.compare(0, 5, "root:") == 0)
        return "reg " + form + " needs a root key name (HKEY_CURRENT_USER ...)";
    in.word();
    reg.root = static_cast<uint32_t>(root.integer);
    if (!in.text(reg.path)) return "reg " + form + " needs a key path in quotes";
    if (value && !in.text(reg.name)) return "reg " + form + " needs a value name in quotes";
    return std::string();
}

// Takes a view word off the end of the line: view64 or view32.
void takeView(const std::vector<Token>& operands, Operands& in, RegistryLine& reg) {
    if (operands.empty() || operands.back().quoted) return;
    const std::string& w = operands.back().word;
    if (w == "view64") reg.view = KEY_WOW64_64KEY;
    if (w == "view32") reg.view = KEY_WOW64_32KEY;
    if (reg.view) in.dropLast();
}

// The forms after `reg`, as "key create", "value set", "expect key" ...
std::string parseForm(Operands& in, Step& step) {
    std::string first = in.word();
    if (first == "expect") {
        std::string what = in.word();
        if (what != "key" && what != "value") return "reg expect takes key or value";
        step.subject = "expect " + what;
        return std::string();
    }
    if (first != "key" && first != "value") return "reg takes key, value or expect";
    std::string verb = in.word();
    const char* verbs = first == "key" ? "create" : "set";
    if (verb != verbs && verb != "delete")
        return "reg " + first + " takes " + verbs + " or delete";
    step.subject = first + " " + verb;
    return std::string();
}

// The key as messages name it: HKEY_CURRENT_USER "Software\\X" view64.
std::string keyText(const RegistryLine& reg) {
    std::string view = reg.view == KEY_WOW64_64KEY   ? " view64"
                       : reg.view == KEY_WOW64_32KEY ? " view32"
                                                     : "";
    return std::string(rootKeyName(reg.root)) + " " + quote(reg.path) + view;
}

std::string valueText(const RegistryLine& reg) {
    return "value " + quote(reg.name) + " of " + keyText(reg);
}

// A registry call's failure, as a line reports it.
bool callFailed(Session& session, const Step& step, const char* function, LONG code) {
    return session.fail(step, "reg " + step.subject + ": " + function + " gave " +
                                  std::to_string(code) + " for " + keyText(step.registry));
}

// Deletes a key with everything below it, deepest keys first, in the line's view. Each key is
// closed before it is deleted through its parent.
LONG deleteTree(HKEY parent, const std::u16string& path, REGSAM view, const char** failed) {
    HKEY key = nullptr;
    *failed = "RegOpenKeyExW";
    LONG result = RegOpenKeyExW(parent, wide(path), 0, view | KEY_ENUMERATE_SUB_KEYS, &key);
    if (result != ERROR_SUCCESS) return result;
    std::vector<WCHAR> name(1024);
    while (result == ERROR_SUCCESS) {
        auto length = static_cast<DWORD>(name.size());
        *failed = "RegEnumKeyExW";
        result = RegEnumKeyExW(key, 0, name.data(), &length, nullptr, nullptr, nullptr, nullptr);
        if (result == ERROR_SUCCESS) result = deleteTree(key, fromWide(name.data()), view, failed);
    }
    RegCloseKey(key);
    if (result != ERROR_NO_MORE_ITEMS) return result;
    *failed = view ? "RegDeleteKeyExW" : "RegDeleteKeyW";
    return view ? RegDeleteKeyExW(parent, wide(path), view, 0) : RegDeleteKeyW(parent, wide(path));
}

bool createKey(Session& session, const Step& step) {
    const RegistryLine& reg = step.registry;
    HKEY key = nullptr;
    DWORD disposition = 0;
    // No rights are asked for: the line only makes sure that the key is there.
    LONG result = RegCreateKeyExW(rootKeyHandle(reg.root), wide(reg.path), 0, nullptr, 0, reg.view,
                                  nullptr, &key, &disposition);
    if (result != ERROR_SUCCESS) return callFailed(session, step, "RegCreateKeyExW", result);
    RegCloseKey(key);
    session.show(step, disposition == REG_CREATED_NEW_KEY ? "created" : "was there");
    return true;
}

// Opens the key in the line's view with `rights`: 0, 2 for a missing key, or another failure.
LONG openKey(const RegistryLine& reg, REGSAM rights, HKEY* key) {
    return RegOpenKeyExW(rootKeyHandle(reg.root), wide(reg.path), 0, reg.view | rights, key);
}

bool deleteKey(Session& session, const Step& step) {
    const RegistryLine& reg = step.registry;
    HKEY key = nullptr;
    LONG result = openKey(reg, 0, &key);
    if (result == ERROR_FILE_NOT_FOUND) {
        session.show(step, "was not there");
        return true;
    }
    if (result == ERROR_SUCCESS) RegCloseKey(key);
    const char* failed = "";
    result = deleteTree(rootKeyHandle(reg.root), reg.path, reg.view, &failed);
    if (result != ERROR_SUCCESS) return callFailed(session, step, failed, result);
    session.show(step, "deleted");
    return true;
}

// Writes the value's bytes exactly: two nonzero bytes follow them in memory, since Windows adds
// a terminator to a string whose size leaves it out when the next character happens to be zero.
bool setValue(Session& session, const Step& step) {
    const RegistryLine& reg = step.registry;
    HKEY key = nullptr;
    LONG result = RegCreateKeyExW(rootKeyHandle(reg.root), wide(reg.path), 0, nullptr, 0,
                                  reg.view | KEY_SET_VALUE, nullptr, &key, nullptr);
    if (result != ERROR_SUCCESS) return callFailed(session, step, "RegCreateKeyExW", result);
    std::vector<uint8_t> padded(reg.data);
    padded.insert(padded.end(), {0xFF, 0xFF, 0xFF});
    result = RegSetValueExW(key, wide(reg.name), 0, reg.type, padded.data(),
                            static_cast<DWORD>(reg.data.size()));
    RegCloseKey(key);
    if (result != ERROR_SUCCESS) return callFailed(session, step, "RegSetValueExW", result);
    session.show(step, "written: " + typeName(reg.type) + ", " +
                           std::to_string(reg.data.size()) + " bytes");
    return true;
}

bool deleteValue(Session& session, const Step& step) {
    const RegistryLine& reg = step.registry;
    HKEY key = nullptr;
    LONG result = RegOpenKeyExW(rootKeyHandle(reg.root), wide(reg.path), 0,
                                reg.view | KEY_SET_VALUE, &key);
    if (result == ERROR_SUCCESS) {
        result = RegDeleteValueW(key, wide(reg.name));
        RegCloseKey(key);
        if (result != ERROR_SUCCESS && result != ERROR_FILE_NOT_FOUND)
            return callFailed(session, step, "RegDeleteValueW", result);
    } else if (result != ERROR_FILE_NOT_FOUND) {
        return callFailed(session, step, "RegOpenKeyExW", result);
    }
    session.show(step, result == ERROR_SUCCESS ? "deleted" : "was not there");
    return true;
}

bool expectKey(const Step& step, std::string& why) {
    const RegistryLine& reg = step.registry;
    HKEY key = nullptr;
    LONG result = openKey(reg, 0, &key);
    if (result == ERROR_SUCCESS) RegCloseKey(key);
    if (result != ERROR_SUCCESS && result != ERROR_FILE_NOT_FOUND) {
        why = "cannot tell whether the key " + keyText(reg) +
              " exists: RegOpenKeyExW gave " + std::to_string(result);
        return false;
    }
    bool exists = result == ERROR_SUCCESS;
    if (exists == reg.exists) return true;
    why = "expected the key " + keyText(reg) + (reg.exists ? " to exist" : " to be missing") +
          (exists ? ", it exists" : ", it is missing");
    return false;
}

// Reads a value's type and bytes; 0, 2 when the key or the value is missing, or another code
// with the failing function in `failed`.
LONG readValue(const RegistryLine& reg, uint32_t& type, std::vector<uint8_t>& data,
               const char** failed) {
    HKEY key = nullptr;
    *failed = "RegOpenKeyExW";
    LONG result = openKey(reg, KEY_QUERY_VALUE, &key);
    if (result != ERROR_SUCCESS) return result;
    *failed = "RegQueryValueExW";
    DWORD size = 0, kind = 0;
    result = RegQueryValueExW(key, wide(reg.name), nullptr, &kind, nullptr, &size);
    if (result == ERROR_SUCCESS) {
        data.assign(size + 2, 0);  // never a zero-sized buffer
        DWORD read = size;
        result = RegQueryValueExW(key, wide(reg.name), nullptr, &kind, data.data(), &read);
        data.resize(read);
        type = kind;
    }
    RegCloseKey(key);
    return result;
}

bool expectValue(const Step& step, std::string& why) {
    const RegistryLine& reg = step.registry;
    uint32_t type = 0;
    std::vector<uint8_t> data;
    const char* failed = "";
    LONG result = readValue(reg, type, data, &failed);
    if (result != ERROR_SUCCESS && result != ERROR_FILE_NOT_FOUND) {
        why = "cannot read the " + valueText(reg) + ": " + failed + " gave " +
              std::to_string(result);
        return false;
    }
    std::string wanted = reg.hasData ? typeName(reg.type) + " " + hexList(reg.data) : "none";
    std::string found = result == ERROR_SUCCESS ? typeName(type) + " " + hexList(data)
                        : std::string(failed) == "RegOpenKeyExW" ? "no key"
                                                                 : "no value";
    bool same = reg.hasData ? result == ERROR_SUCCESS && type == reg.type && data == reg.data
                            : result != ERROR_SUCCESS;
    if (!same) why = "expected the " + valueText(reg) + " to be " + wanted + ", found " + found;
    return same;
}

}  // namespace

HKEY rootKeyHandle(uint32_t index) {
    static const HKEY roots[] = {HKEY_CLASSES_ROOT, HKEY_LOCAL_MACHINE, HKEY_CURRENT_USER,
                                 HKEY_CURRENT_CONFIG, HKEY_USERS};
    return roots[index];
}

std::string parseRegistry(const std::vector<Token>& operands, Step& step) {
    Operands in(operands);
    RegistryLine& reg = step.registry;
    takeView(operands, in, reg);
    if (std::string error = parseForm(in, step); !error.empty()) return error;
    const std::string& form = step.subject;
    if (form == "expect key") {
        std::string state = in.word();
        if (state != "exists" && state != "missing")
            return "reg expect key takes exists or missing";
        reg.exists = state == "exists";
    }
    bool value = form == "value set" || form == "value delete" || form == "expect value";
    if (std::string error = parsePlace(in, form, reg, value); !error.empty()) return error;
    if (form == "expect value") {
        const Token* t = in.peek();
        if (t && !t->quoted && t->word == "missing") {
            in.word();
            reg.exists = false;
        } else if (std::string error = parseData(in, form, reg); !error.empty()) {
            return error;
        }
    }
    if (form == "value set")
        if (std::string error = parseData(in, form, reg); !error.empty()) return error;
    return in.rest();
}

bool runRegistry(Session& session, const Step& step) {
    const std::string& form = step.subject;
    if (form == "key create") return createKey(session, step);
    if (form == "key delete") return deleteKey(session, step);
    if (form == "value set") return setValue(session, step);
    if (form == "value delete") return deleteValue(session, step);
    ++session.expectations;
    std::string why;
    bool ok = form == "expect key" ? expectKey(step, why) : expectValue(step, why);
    if (!ok) return session.fail(step, why);
    session.show(step, "ok");
    return true;
}

}  // namespace hv::script
