// Layer lines: what only the portable Win32 layer can do (deny rights, fail calls, hide exports,
// change what GetVersionExW says, count handles and calls), through its test control. Windows
// builds skip them with a note.
#include <cctype>

#include "internal.h"
#include "script_internal.h"

#ifndef _WIN32
#include <w32/testctl.h>
#endif

namespace hv::script {

namespace {

// The functions whose calls the layer can make fail.
const char* const FailableFunctions[] = {
    "RegOpenKeyExW",   "RegCreateKeyExW", "RegQueryValueExW", "RegSetValueExW",
    "RegDeleteKeyW",   "RegDeleteKeyExW", "RegDeleteValueW",  "RegEnumKeyExW",
    "RegCloseKey",     "GetVersionExW",   "LoadLibraryW",     "GetProcAddress",
    "FormatMessageW",  "LoadStringW",     "calloc",           "malloc",
    "ReadFile",        "WriteFile",       "DialogBoxParamW",
};

// The access-mask argument of the calls that take one, by position in the journal.
const std::pair<const char*, size_t> MaskArguments[] = {
    {"RegOpenKeyExW", 3}, {"RegCreateKeyExW", 5}, {"RegDeleteKeyExW", 2}};

// A name as C spells it: an export or a function of the layer.
bool isName(const std::string& word) {
    if (word.empty() || std::isdigit(static_cast<unsigned char>(word[0]))) return false;
    for (char c : word)
        if (!std::isalnum(static_cast<unsigned char>(c)) && c != '_') return false;
    return true;
}

// Reads the next operand as an integer; `usage` when it is missing or quoted.
std::string integer(Operands& in, const std::string& usage, int64_t& value) {
    std::string word = in.word();
    return word.empty() ? usage : parseInteger(word, value);
}

// layer deny ROOT "path" RIGHTS [view64|view32]
std::string parseDeny(Operands& in, Command& command) {
    const char* usage = "layer deny takes a root key name, a key path in quotes and the rights";
    Deny deny;
    deny.key.view = takeView(in);
    if (std::string error = parseRootName(in.next(), usage, deny.key.root); !error.empty())
        return error;
    int64_t rights = 0;
    if (!in.text(deny.key.path)) return usage;
    if (std::string error = integer(in, usage, rights); !error.empty()) return error;
    deny.rights = static_cast<uint32_t>(rights);
    command = std::move(deny);
    return in.rest();
}

// layer fail FUNCTION NTH|always CODE
std::string parseFail(Operands& in, Command& command) {
    const char* usage = "layer fail takes a function, which call (1 for the next, or always) "
                        "and the code";
    if (in.left() < 3 || in.peek()->quoted || in.peek(1)->quoted) return usage;
    Fail fail;
    fail.function = in.word();
    bool known = false;
    for (const char* f : FailableFunctions) known = known || fail.function == f;
    if (!known) return "the layer cannot fail '" + fail.function + "'";
    std::string nth = in.word();
    int64_t n = 0;
    if (nth != "always") {
        if (std::string error = parseInteger(nth, n); !error.empty()) return error;
        if (n < 1) return "layer fail counts calls from 1";
    }
    fail.nth = static_cast<unsigned>(n);
    if (std::string error = integer(in, usage, n); !error.empty()) return error;
    fail.code = static_cast<int32_t>(n);
    command = std::move(fail);
    return in.rest();
}

// layer hide NAME / layer unhide NAME
std::string parseHide(Operands& in, Command& command, bool hide) {
    std::string name = in.word();
    if (!isName(name)) return std::string("layer ") + (hide ? "hide" : "unhide") + " takes an export name";
    Hide line;
    line.name = name;
    line.hide = hide;
    command = std::move(line);
    return in.rest();
}

// layer version fail | normal | platform N
std::string parseVersion(Operands& in, Command& command) {
    const char* usage = "layer version takes fail, normal or platform and a number";
    std::string how = in.word();
    Version version;
    version.how = how == "fail" ? Version::How::Fail : how == "normal" ? Version::How::Normal
                                                                       : Version::How::Platform;
    if (how != "fail" && how != "normal" && how != "platform") return usage;
    int64_t id = 0;
    if (how == "platform")
        if (std::string error = integer(in, usage, id); !error.empty()) return error;
    version.platform = static_cast<uint32_t>(id);
    command = version;
    return in.rest();
}

// layer expect handles N / layer expect calls FUNCTION N / layer expect calls FUNCTION mask M
std::string parseLayerExpect(Operands& in, Command& command) {
    if (in.word() == "handles") {
        const char* usage = "layer expect handles needs a count";
        int64_t n = 0;
        if (std::string error = integer(in, usage, n); !error.empty()) return error;
        if (n < 0) return usage;
        Handles handles;
        handles.count = static_cast<size_t>(n);
        command = handles;
        return in.rest();
    }
    const char* usage = "layer expect calls takes a function and a count, or mask and a mask";
    if (in.left() < 2 || in.peek()->quoted || !isName(in.peek()->word)) return usage;
    Calls calls;
    calls.function = in.word();
    const Token* t = in.peek();
    if (!t->quoted && t->word == "mask") {
        bool masked = false;
        for (auto [function, index] : MaskArguments) masked = masked || calls.function == function;
        if (!masked) return calls.function + " takes no access mask";
        in.word();
        calls.mask = true;
    }
    int64_t n = 0;
    if (std::string error = integer(in, usage, n); !error.empty()) return error;
    if (n < 0 && !calls.mask) return usage;
    calls.number = calls.mask ? static_cast<uint32_t>(n) : static_cast<uint64_t>(n);
    command = std::move(calls);
    return in.rest();
}

}  // namespace

bool isLayerVerb(const std::string& word, const std::string& next) {
    if (word == "expect") return next == "handles" || next == "calls";
    for (const char* verb : {"deny", "fail", "hide", "unhide", "version", "clear"})
        if (word == verb) return true;
    return false;
}

std::string parseLayer(Operands& in, Command& command) {
    const Token* next = in.peek(1);
    std::string verb = in.word();
    if (!isLayerVerb(verb, next && !next->quoted ? next->word : ""))
        return "layer needs a command, {, or one of: deny, fail, hide, unhide, version, clear, "
               "expect handles, expect calls";
    if (verb == "clear") command = Clear{};
    if (verb == "deny") return parseDeny(in, command);
    if (verb == "fail") return parseFail(in, command);
    if (verb == "hide" || verb == "unhide") return parseHide(in, command, verb == "hide");
    if (verb == "version") return parseVersion(in, command);
    if (verb == "expect") return parseLayerExpect(in, command);
    return in.rest();
}

#ifndef _WIN32

std::string run(Session& session, const Step& step, const Deny& line) {
    w32test::denyAccess(rootKeyHandle(line.key.root), line.key.path, line.rights | line.key.view);
    session.layerChanges.denials.push_back(line.key);
    session.show(step, line.rights ? "denied" : "lifted");
    return std::string();
}

std::string run(Session& session, const Step& step, const Fail& line) {
    if (line.nth)
        w32test::failCall(line.function, line.nth, line.code);
    else
        w32test::failAlways(line.function, line.code);
    session.layerChanges.faults = true;
    session.show(step, "armed");
    return std::string();
}

std::string run(Session& session, const Step& step, const Clear&) {
    w32test::clearFaults();
    session.show(step, "no call fails");
    return std::string();
}

std::string run(Session& session, const Step& step, const Hide& line) {
    w32test::hideExport(line.name.c_str(), line.hide);
    if (line.hide) session.layerChanges.hidden.push_back(line.name);
    session.show(step, line.hide ? "hidden" : "found again");
    return std::string();
}

std::string run(Session& session, const Step& step, const Version& line) {
    w32test::setVersionFault(line.how == Version::How::Fail);
    if (line.how == Version::How::Normal) w32test::setPlatformId(VER_PLATFORM_WIN32_NT);
    if (line.how == Version::How::Platform) w32test::setPlatformId(line.platform);
    session.layerChanges.version = true;
    const char* const shown[] = {"GetVersionExW fails", "GetVersionExW answers as usual",
                                 "GetVersionExW reports this platform"};
    session.show(step, shown[static_cast<size_t>(line.how)]);
    return std::string();
}

std::string run(Session& session, const Step& step, const Handles& line) {
    size_t open = w32test::openHandleCount();
    std::string why;
    if (open != line.count)
        why = "expected " + std::to_string(line.count) + " registry handles open, got " +
              std::to_string(open);
    return session.checked(step, why);
}

// Counts the calls of the last event, or checks that every one carried the mask.
std::string run(Session& session, const Step& step, const Calls& line) {
    if (!session.last()) return session.checked(step, "expect with no event before it");
    std::vector<uint64_t> masks;
    for (const LayerCall& c : session.eventCalls) {
        if (c.function != line.function) continue;
        masks.push_back(0);
        for (auto [function, index] : MaskArguments)
            if (c.function == function && index < c.args.size()) masks.back() = c.args[index];
    }
    std::string why;
    if (!line.mask && masks.size() != line.number)
        why = "expected " + std::to_string(line.number) + " calls of " + line.function +
              " in the last event, got " + std::to_string(masks.size());
    if (line.mask && masks.empty())
        why = "expected calls of " + line.function + ", the last event made none";
    for (size_t i = 0; line.mask && i < masks.size() && why.empty(); ++i)
        if (masks[i] != line.number)
            why = "expected every " + line.function + " of the last event to ask for " +
                  hex(line.number) + ", call " + std::to_string(i + 1) + " asked for " +
                  hex(masks[i]);
    return session.checked(step, why);
}

#endif

size_t journalMark() {
#ifndef _WIN32
    return w32test::journal().size();
#else
    return 0;
#endif
}

std::vector<LayerCall> journalSince(size_t mark) {
    std::vector<LayerCall> calls;
#ifndef _WIN32
    const std::vector<w32test::Call>& journal = w32test::journal();
    for (size_t i = mark; i < journal.size(); ++i)
        calls.push_back(LayerCall{journal[i].function, journal[i].args});
#else
    (void)mark;
#endif
    return calls;
}

// Denials are lifted only from keys still there: lifting one from a deleted key would create it
// again.
void undoLayer(Session& session) {
    LayerChanges& changes = session.layerChanges;
#ifndef _WIN32
    if (changes.faults) w32test::clearFaults();
    if (changes.version) {
        w32test::setVersionFault(false);
        w32test::setPlatformId(VER_PLATFORM_WIN32_NT);
    }
    for (const std::string& name : changes.hidden) w32test::hideExport(name.c_str(), false);
    for (const RegistryKey& key : changes.denials) {
        HKEY handle = nullptr;
        HKEY root = rootKeyHandle(key.root);
        if (RegOpenKeyExW(root, wide(key.path), 0, key.view, &handle) != ERROR_SUCCESS) continue;
        RegCloseKey(handle);
        w32test::denyAccess(root, key.path, key.view);
    }
#endif
    changes = LayerChanges();
}

}  // namespace hv::script
