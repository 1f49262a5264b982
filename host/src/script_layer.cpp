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
    "RegOpenKeyExW",   "RegCreateKeyExW", "RegQueryValueExW", "RegSetValueExW",  "RegDeleteKeyW",
    "RegDeleteKeyExW", "RegDeleteValueW", "RegEnumKeyExW",    "RegCloseKey",     "GetVersionExW",
    "LoadLibraryW",    "GetProcAddress",  "FormatMessageW",   "LoadStringW",     "calloc",
    "malloc",          "ReadFile",        "WriteFile",        "DialogBoxParamW",
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

// layer deny ROOT "path" RIGHTS [view64|view32]
Command parseDeny(Operands& in) {
    const char* usage = "layer deny takes a root key name, a key path in quotes and the rights";
    Deny deny;
    deny.key.view = takeView(in);
    deny.key.root = parseRootName(in.next(), usage);
    deny.key.path = in.text(usage);
    deny.rights = static_cast<uint32_t>(in.integer(usage));
    in.end();
    return deny;
}

// layer fail FUNCTION NTH CODE
Command parseFail(Operands& in) {
    const char* usage = "layer fail takes a function, which call (1 for the next) and the code";
    if (in.left() < 3 || in.peek()->quoted || in.peek(1)->quoted) refuse(usage);
    Fail fail;
    fail.function = in.word();
    bool known = false;
    for (const char* f : FailableFunctions) known = known || fail.function == f;
    if (!known) refuse("the layer cannot fail '" + fail.function + "'");
    int64_t n = in.integer(usage);
    if (n < 1) refuse("layer fail counts calls from 1");
    fail.nth = static_cast<unsigned>(n);
    fail.code = static_cast<int32_t>(in.integer(usage));
    in.end();
    return fail;
}

// layer hide NAME / layer unhide NAME
Command parseHide(Operands& in, bool hide) {
    Hide line;
    line.name = in.word();
    line.hide = hide;
    if (!isName(line.name))
        refuse(std::string("layer ") + (hide ? "hide" : "unhide") + " takes an export name");
    in.end();
    return line;
}

// layer version fail | normal | platform N
Command parseVersion(Operands& in) {
    const char* usage = "layer version takes fail, normal or platform and a number";
    std::string how = in.word();
    if (how != "fail" && how != "normal" && how != "platform") refuse(usage);
    Version version;
    version.fail = how == "fail";
    if (how == "platform") version.platform = static_cast<uint32_t>(in.integer(usage));
    in.end();
    return version;
}

// layer expect handles N / layer expect calls FUNCTION N / layer expect calls FUNCTION mask M
Command parseLayerExpect(Operands& in) {
    if (in.word() == "handles") {
        const char* usage = "layer expect handles needs a count";
        Handles handles;
        int64_t n = in.integer(usage);
        if (n < 0) refuse(usage);
        handles.count = static_cast<size_t>(n);
        in.end();
        return handles;
    }
    const char* usage = "layer expect calls takes a function and a count, or mask and a mask";
    if (in.left() < 2 || in.peek()->quoted || !isName(in.peek()->word)) refuse(usage);
    Calls calls;
    calls.function = in.word();
    if (!in.peek()->quoted && in.peek()->word == "mask") {
        bool masked = false;
        for (auto [function, index] : MaskArguments) masked = masked || calls.function == function;
        if (!masked) refuse(calls.function + " takes no access mask");
        in.word();
        calls.mask = true;
    }
    int64_t n = in.integer(usage);
    if (n < 0 && !calls.mask) refuse(usage);
    calls.number = calls.mask ? static_cast<uint32_t>(n) : static_cast<uint64_t>(n);
    in.end();
    return calls;
}

}  // namespace

bool isLayerVerb(const std::string& word, const std::string& next) {
    if (word == "expect") return next == "handles" || next == "calls";
    for (const char* verb : {"deny", "fail", "hide", "unhide", "version"})
        if (word == verb) return true;
    return false;
}

Command parseLayer(Operands& in) {
    const Token* next = in.peek(1);
    std::string verb = in.word();
    if (!isLayerVerb(verb, next && !next->quoted ? next->word : ""))
        refuse(
            "layer needs a command, {, or one of: deny, fail, hide, unhide, version, "
            "expect handles, expect calls");
    if (verb == "deny") return parseDeny(in);
    if (verb == "fail") return parseFail(in);
    if (verb == "hide" || verb == "unhide") return parseHide(in, verb == "hide");
    if (verb == "version") return parseVersion(in);
    return parseLayerExpect(in);
}

#ifndef _WIN32

void run(Session& session, const Step& step, const Deny& line) {
    w32test::denyAccess(rootKeyHandle(line.key.root), line.key.path, line.rights | line.key.view);
    session.layerChanges.denials.push_back(line.key);
    session.show(step, line.rights ? "denied" : "lifted");
}

void run(Session& session, const Step& step, const Fail& line) {
    w32test::failCall(line.function, line.nth, line.code);
    session.layerChanges.faults = true;
    session.show(step, "armed");
}

void run(Session& session, const Step& step, const Hide& line) {
    w32test::hideExport(line.name.c_str(), line.hide);
    if (line.hide) session.layerChanges.hidden.push_back(line.name);
    session.show(step, line.hide ? "hidden" : "found again");
}

void run(Session& session, const Step& step, const Version& line) {
    w32test::setVersionFault(line.fail);
    if (!line.fail) w32test::setPlatformId(line.platform);
    session.layerChanges.version = true;
    std::string platform = "GetVersionExW reports platform " + std::to_string(line.platform);
    session.show(step, line.fail ? "GetVersionExW fails" : platform);
}

void run(Session& session, const Step& step, const Handles& line) {
    size_t open = w32test::openHandleCount();
    session.checked(
        step, unless(open == line.count, std::to_string(line.count) + " registry handles open",
                     std::to_string(open)));
}

// Counts the calls of the last event, or checks that every one carried the mask.
void run(Session& session, const Step& step, const Calls& line) {
    session.lastEvent();  // refuses when no event ran
    const std::vector<w32test::Call>& journal = w32test::journal();
    std::vector<uint64_t> masks;
    for (size_t i = session.eventCalls.first; i < session.eventCalls.second; ++i) {
        const w32test::Call& c = journal.at(i);
        if (c.function != line.function) continue;
        masks.push_back(0);
        for (auto [function, index] : MaskArguments)
            if (c.function == function && index < c.args.size()) masks.back() = c.args[index];
    }
    std::string why;
    if (!line.mask)
        why = unless(
            masks.size() == line.number,
            std::to_string(line.number) + " calls of " + line.function + " in the last event",
            std::to_string(masks.size()));
    if (line.mask && masks.empty())
        why = "expected calls of " + line.function + ", the last event made none";
    for (size_t i = 0; line.mask && i < masks.size() && why.empty(); ++i)
        if (masks[i] != line.number)
            why = "expected every " + line.function + " of the last event to ask for " +
                  hex(line.number) + ", call " + std::to_string(i + 1) + " asked for " +
                  hex(masks[i]);
    session.checked(step, why);
}

#endif

size_t journalMark() {
#ifndef _WIN32
    return w32test::journal().size();
#else
    return 0;
#endif
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
