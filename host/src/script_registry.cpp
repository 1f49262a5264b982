// Registry lines: set-up and checks that go through the Win32 registry functions themselves, so
// that one script runs alike against the portable layer and against a real registry.
#include <iterator>

#include "internal.h"
#include "script_internal.h"

namespace hv::script {

namespace {

using Form = Registry::Form;

// The forms as lines write them after `reg`, in the order of Registry::Form.
const char* const FormNames[] = {"key create",   "key delete", "value set",
                                 "value delete", "expect key", "expect value"};

std::string formName(Form form) { return FormNames[static_cast<size_t>(form)]; }

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

// The type word of `bytes`: a name of TypeNames.
uint32_t parseTypeWord(const std::string& word) {
    for (const TypeName& t : TypeNames)
        if (word == t.word) return t.type;
    refuse("unknown value type '" + word +
           "' (none, sz, expand_sz, binary, dword, dword_be, link, multi_sz or qword)");
}

// The data of a value: a type word and what that type takes. sz and expand_sz take one text,
// multi_sz a list, each stored with its terminator; dword a 32-bit integer, qword a 64-bit one,
// stored little-endian; binary hex bytes; bytes a type and hex bytes, for data no other form
// writes.
void parseData(Operands& in, Registry& reg) {
    std::string kind = in.word();
    if (kind == "multi_sz") {
        reg.type = REG_MULTI_SZ;
        while (in.left() && in.peek()->quoted) appendText(reg.data, in.next()->text);
        appendText(reg.data, u"");  // the empty text that ends the list
    } else if (kind == "sz" || kind == "expand_sz") {
        reg.type = kind == "sz" ? REG_SZ : REG_EXPAND_SZ;
        appendText(reg.data, in.text(kind + " needs one text in quotes"));
    } else if (kind == "dword" || kind == "qword") {
        std::string number = in.word();
        if (number.empty()) refuse(kind + " needs an integer");
        int bits = kind == "dword" ? 32 : 64;
        uint64_t value = 0;
        reg.type = bits == 32 ? REG_DWORD : REG_QWORD;
        refuseIf(parseInteger(number, bits, value));
        for (int i = 0; i < bits / 8; ++i)
            reg.data.push_back(static_cast<uint8_t>(value >> (8 * i)));
    } else if (kind == "binary" || kind == "bytes") {
        std::string type = kind == "bytes" ? in.word() : "binary";
        if (type.empty()) refuse("bytes needs a value type and hex bytes in quotes");
        reg.type = parseTypeWord(type);
        reg.data = parseHex(in.text(kind + " needs hex bytes in quotes"));
    } else {
        refuse("reg " + formName(reg.form) + " needs " +
               (reg.form == Form::ExpectValue ? "missing or " : "") +
               "a value type: sz, expand_sz, multi_sz, dword, qword, binary or bytes" +
               (kind.empty() ? std::string() : ", not '" + kind + "'"));
    }
}

// The forms after `reg`: "key create", "value set", "expect key" ...
Form parseForm(Operands& in) {
    std::string first = in.word();
    const char* seconds = first == "key"      ? "create or delete"
                          : first == "value"  ? "set or delete"
                          : first == "expect" ? "key or value"
                                              : nullptr;
    if (!seconds) refuse("reg takes key, value or expect");
    std::string form = first + " " + in.word();
    for (size_t i = 0; i < std::size(FormNames); ++i)
        if (form == FormNames[i]) return static_cast<Form>(i);
    refuse("reg " + first + " takes " + seconds);
}

// The key as messages name it: HKEY_CURRENT_USER "Software\\X" view64.
std::string keyText(const RegistryKey& key) {
    std::string view = key.view == KEY_WOW64_64KEY   ? " view64"
                       : key.view == KEY_WOW64_32KEY ? " view32"
                                                     : "";
    return std::string(rootKeyName(key.root)) + " " + quote(key.path) + view;
}

std::string valueText(const Registry& reg) {
    return "value " + quote(reg.name) + " of " + keyText(reg.key);
}

// Refuses with a registry call's failure, as a line reports it.
[[noreturn]] void callFailed(const Registry& reg, const char* function, LONG code) {
    refuse("reg " + formName(reg.form) + ": " + function + " gave " + std::to_string(code) +
           " for " + keyText(reg.key));
}

// Opens the key in the line's view with `rights`: 0, 2 for a missing key, or another failure.
LONG openKey(const RegistryKey& key, REGSAM rights, HKEY* handle) {
    return RegOpenKeyExW(rootKeyHandle(key.root), wide(key.path), 0, key.view | rights, handle);
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

// No rights are asked for: the line only makes sure that the key is there.
void createKey(Session& session, const Step& step, const Registry& reg) {
    HKEY key = nullptr;
    DWORD disposition = 0;
    LONG result = RegCreateKeyExW(rootKeyHandle(reg.key.root), wide(reg.key.path), 0, nullptr, 0,
                                  reg.key.view, nullptr, &key, &disposition);
    if (result != ERROR_SUCCESS) callFailed(reg, "RegCreateKeyExW", result);
    RegCloseKey(key);
    session.show(step, disposition == REG_CREATED_NEW_KEY ? "created" : "was there");
}

// Whether the key is there: 0, 2 for a missing key, or another failure. It is opened asking for
// no rights, so a key whose rights are denied still counts.
LONG probe(const RegistryKey& key) {
    HKEY handle = nullptr;
    LONG result = openKey(key, 0, &handle);
    if (result == ERROR_SUCCESS) RegCloseKey(handle);
    return result;
}

void deleteKey(Session& session, const Step& step, const Registry& reg) {
    if (probe(reg.key) == ERROR_FILE_NOT_FOUND) return session.show(step, "was not there");
    const char* failed = "";
    LONG result = deleteTree(rootKeyHandle(reg.key.root), reg.key.path, reg.key.view, &failed);
    if (result != ERROR_SUCCESS) callFailed(reg, failed, result);
    session.show(step, "deleted");
}

// Writes the value's bytes exactly: two nonzero bytes follow them in memory, since Windows adds
// a terminator to a string whose size leaves it out when the next character happens to be zero.
void setValue(Session& session, const Step& step, const Registry& reg) {
    HKEY key = nullptr;
    LONG result = RegCreateKeyExW(rootKeyHandle(reg.key.root), wide(reg.key.path), 0, nullptr, 0,
                                  reg.key.view | KEY_SET_VALUE, nullptr, &key, nullptr);
    if (result != ERROR_SUCCESS) callFailed(reg, "RegCreateKeyExW", result);
    std::vector<uint8_t> padded(reg.data);
    padded.insert(padded.end(), {0xFF, 0xFF, 0xFF});
    result = RegSetValueExW(key, wide(reg.name), 0, reg.type, padded.data(),
                            static_cast<DWORD>(reg.data.size()));
    RegCloseKey(key);
    if (result != ERROR_SUCCESS) callFailed(reg, "RegSetValueExW", result);
    session.show(
        step, "written: " + typeName(reg.type) + ", " + std::to_string(reg.data.size()) + " bytes");
}

void deleteValue(Session& session, const Step& step, const Registry& reg) {
    HKEY key = nullptr;
    LONG result = openKey(reg.key, KEY_SET_VALUE, &key);
    if (result == ERROR_SUCCESS) {
        result = RegDeleteValueW(key, wide(reg.name));
        RegCloseKey(key);
        if (result != ERROR_SUCCESS && result != ERROR_FILE_NOT_FOUND)
            callFailed(reg, "RegDeleteValueW", result);
    } else if (result != ERROR_FILE_NOT_FOUND) {
        callFailed(reg, "RegOpenKeyExW", result);
    }
    session.show(step, result == ERROR_SUCCESS ? "deleted" : "was not there");
}

// Why the key is not as expected, or "".
std::string keyWhy(const Registry& reg) {
    LONG result = probe(reg.key);
    if (result != ERROR_SUCCESS && result != ERROR_FILE_NOT_FOUND)
        return "cannot tell whether the key " + keyText(reg.key) + " exists: RegOpenKeyExW gave " +
               std::to_string(result);
    bool exists = result == ERROR_SUCCESS;
    if (exists == reg.exists) return std::string();
    return "expected the key " + keyText(reg.key) + (reg.exists ? " to exist" : " to be missing") +
           (exists ? ", it exists" : ", it is missing");
}

// Reads a value's type and bytes; 0, 2 when the key or the value is missing, or another code
// with the failing function in `failed`.
LONG readValue(const Registry& reg, uint32_t& type, std::vector<uint8_t>& data,
               const char** failed) {
    HKEY key = nullptr;
    *failed = "RegOpenKeyExW";
    LONG result = openKey(reg.key, KEY_QUERY_VALUE, &key);
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

// Why the value is not as expected, or "".
std::string valueWhy(const Registry& reg) {
    uint32_t type = 0;
    std::vector<uint8_t> data;
    const char* failed = "";
    LONG result = readValue(reg, type, data, &failed);
    if (result != ERROR_SUCCESS && result != ERROR_FILE_NOT_FOUND)
        return "cannot read the " + valueText(reg) + ": " + failed + " gave " +
               std::to_string(result);
    bool found = result == ERROR_SUCCESS;
    if (reg.exists ? found && type == reg.type && data == reg.data : !found) return std::string();
    std::string wanted = reg.exists ? typeName(reg.type) + " " + hexList(reg.data) : "none";
    std::string seen = found ? typeName(type) + " " + hexList(data)
                       : std::string(failed) == "RegOpenKeyExW" ? "no key"
                                                                : "no value";
    return "expected the " + valueText(reg) + " to be " + wanted + ", found " + seen;
}

}  // namespace

Command parseRegistry(Operands& in) {
    Registry reg;
    reg.key.view = takeView(in);
    reg.form = parseForm(in);
    std::string form = "reg " + formName(reg.form);
    if (reg.form == Form::ExpectKey) {
        std::string state = in.word();
        if (state != "exists" && state != "missing")
            refuse("reg expect key takes exists or missing");
        reg.exists = state == "exists";
    }
    reg.key.root =
        parseRootName(in.next(), form + " needs a root key name (HKEY_CURRENT_USER ...)");
    reg.key.path = in.text(form + " needs a key path in quotes");
    if (reg.form == Form::SetValue || reg.form == Form::DeleteValue ||
        reg.form == Form::ExpectValue)
        reg.name = in.text(form + " needs a value name in quotes");
    const Token* t = in.peek();
    if (reg.form == Form::ExpectValue && t && !t->quoted && t->word == "missing") {
        in.word();
        reg.exists = false;
    } else if (reg.form == Form::ExpectValue || reg.form == Form::SetValue) {
        parseData(in, reg);
    }
    in.end();
    return reg;
}

void run(Session& session, const Step& step, const Registry& reg) {
    switch (reg.form) {
        case Form::CreateKey: return createKey(session, step, reg);
        case Form::DeleteKey: return deleteKey(session, step, reg);
        case Form::SetValue: return setValue(session, step, reg);
        case Form::DeleteValue: return deleteValue(session, step, reg);
        case Form::ExpectKey: return session.checked(step, keyWhy(reg));
        default: return session.checked(step, valueWhy(reg));
    }
}

}  // namespace hv::script
