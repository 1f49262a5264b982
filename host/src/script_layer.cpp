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
    "ReadFile",        "WriteFile",
    "DialogBoxParamW",
};

// The access-mask argument of the calls that take one, by position in the journal.
struct MaskArgument {
    const char* function;
    size_t index;
};

const MaskArgument MaskArguments[] = {
    {"RegOpenKeyExW", 3}, {"RegCreateKeyExW", 5}, {"RegDeleteKeyExW", 2}};

// A name as C spells it: an export or a function of the layer.
bool isName(const std::string& word) {
    if (word.empty() || std::isdigit(static_cast<unsigned char>(word[0]))) return false;
    for (char c : word)
        if (!std::isalnum(static_cast<unsigned char>(c)) && c != '_') return false;
    return true;
}

Value wordValue(const std::string& word) {
    Value v;
    v.kind = Value::Kind::Word;
    v.word = word;
    return v;
}

// Reads one bare integer operand at `index`; `what` names it in the message.
std::string integerAt(const std::vector<Token>& operands, size_t index, const std::string& what,
                      int64_t& value) {
    if (index >= operands.size() || operands[index].quoted) return what;
    return parseInteger(operands[index].word, value);
}

// The first operand after `count` ones, as a stray-text message, or "".
std::string strayAfter(const std::vector<Token>& operands, size_t count) {
    if (operands.size() <= count) return std::string();
    const Token& t = operands[count];
    return "stray text '" + (t.quoted ? quote(t.text) : t.word) + "'";
}

// layer deny ROOT "path" RIGHTS [view64|view32]
std::string parseDeny(const std::vector<Token>& operands, Step& step) {
    const char* usage = "layer deny takes a root key name, a key path in quotes and the rights";
    std::vector<Token> rest(operands.begin() + 1, operands.end());
    RegistryLine& reg = step.registry;
    if (!rest.empty() && !rest.back().quoted) {
        if (rest.back().word == "view64") reg.view = KEY_WOW64_64KEY;
        if (rest.back().word == "view32") reg.view = KEY_WOW64_32KEY;
        if (reg.view) rest.pop_back();
    }
    Value root;
    if (rest.size() < 3 || rest[0].quoted || !parseParameter(rest[0], root).empty() ||
        root.kind != Value::Kind::RootKey || root.word.compare(0, 5, "root:") == 0 ||
        !rest[1].quoted)
        return usage;
    reg.root = static_cast<uint32_t>(root.integer);
    reg.path = rest[1].text;
    int64_t rights = 0;
    if (std::string error = integerAt(rest, 2, usage, rights); !error.empty()) return error;
    step.values.push_back(integerValue(rights));
    return strayAfter(rest, 3);
}

// layer fail FUNCTION NTH|always CODE
std::string parseFail(const std::vector<Token>& operands, Step& step) {
    const char* usage = "layer fail takes a function, which call (1 for the next, or always) "
                        "and the code";
    if (operands.size() < 4 || operands[1].quoted || operands[2].quoted) return usage;
    const std::string& function = operands[1].word;
    bool known = false;
    for (const char* f : FailableFunctions) known = known || function == f;
    if (!known) return "the layer cannot fail '" + function + "'";
    step.routine = function;
    if (operands[2].word == "always") {
        step.values.push_back(wordValue("always"));
    } else {
        int64_t nth = 0;
        if (std::string error = parseInteger(operands[2].word, nth); !error.empty()) return error;
        if (nth < 1) return "layer fail counts calls from 1";
        step.values.push_back(integerValue(nth));
    }
    int64_t code = 0;
    if (std::string error = integerAt(operands, 3, usage, code); !error.empty()) return error;
    step.values.push_back(integerValue(code));
    return strayAfter(operands, 4);
}

// layer hide NAME / layer unhide NAME
std::string parseHide(const std::vector<Token>& operands, Step& step) {
    if (operands.size() < 2 || operands[1].quoted || !isName(operands[1].word))
        return "layer " + step.subject + " takes an export name";
    step.routine = operands[1].word;
    return strayAfter(operands, 2);
}

// layer version fail | normal | platform N
std::string parseVersion(const std::vector<Token>& operands, Step& step) {
    const char* usage = "layer version takes fail, normal or platform and a number";
    std::string how = operands.size() > 1 && !operands[1].quoted ? operands[1].word : "";
    if (how != "fail" && how != "normal" && how != "platform") return usage;
    step.values.push_back(wordValue(how));
    if (how != "platform") return strayAfter(operands, 2);
    int64_t id = 0;
    if (std::string error = integerAt(operands, 2, usage, id); !error.empty()) return error;
    step.values.push_back(integerValue(id));
    return strayAfter(operands, 3);
}

// layer expect handles N / layer expect calls FUNCTION N / layer expect calls FUNCTION mask M
std::string parseLayerExpect(const std::vector<Token>& operands, Step& step) {
    std::string what = operands[1].word;
    step.subject = "expect " + what;
    if (what == "handles") {
        int64_t n = 0;
        std::string error = integerAt(operands, 2, "layer expect handles needs a count", n);
        if (error.empty() && n < 0) error = "layer expect handles needs a count";
        if (!error.empty()) return error;
        step.values.push_back(integerValue(n));
        return strayAfter(operands, 3);
    }
    const char* usage = "layer expect calls takes a function and a count, or mask and a mask";
    if (operands.size() < 4 || operands[2].quoted || !isName(operands[2].word)) return usage;
    step.routine = operands[2].word;
    size_t at = 3;
    if (!operands[3].quoted && operands[3].word == "mask") {
        bool masked = false;
        for (const MaskArgument& m : MaskArguments) masked = masked || step.routine == m.function;
        if (!masked) return step.routine + " takes no access mask";
        step.values.push_back(wordValue("mask"));
        ++at;
    }
    int64_t n = 0;
    if (std::string error = integerAt(operands, at, usage, n); !error.empty()) return error;
    if (n < 0 && step.values.empty()) return usage;
    step.values.push_back(integerValue(n));
    return strayAfter(operands, at + 1);
}

#ifndef _WIN32

bool runDeny(Session& session, const Step& step) {
    const RegistryLine& reg = step.registry;
    auto rights = static_cast<DWORD>(step.values[0].integer);
    w32test::denyAccess(rootKeyHandle(reg.root), reg.path, rights | reg.view);
    session.layerChanges.denials.push_back(reg);
    session.show(step, rights ? "denied" : "lifted");
    return true;
}

bool runFail(Session& session, const Step& step) {
    auto code = static_cast<long>(static_cast<int32_t>(step.values[1].integer));
    if (step.values[0].kind == Value::Kind::Word)
        w32test::failAlways(step.routine, code);
    else
        w32test::failCall(step.routine, static_cast<unsigned>(step.values[0].integer), code);
    session.layerChanges.faults = true;
    session.show(step, "armed");
    return true;
}

bool runHide(Session& session, const Step& step) {
    bool hide = step.subject == "hide";
    w32test::hideExport(step.routine.c_str(), hide);
    if (hide) session.layerChanges.hidden.push_back(step.routine);
    session.show(step, hide ? "hidden" : "found again");
    return true;
}

bool runVersion(Session& session, const Step& step) {
    const std::string& how = step.values[0].word;
    w32test::setVersionFault(how == "fail");
    if (how == "normal") w32test::setPlatformId(VER_PLATFORM_WIN32_NT);
    if (how == "platform") w32test::setPlatformId(static_cast<DWORD>(step.values[1].integer));
    session.layerChanges.version = true;
    session.show(step, how == "fail"     ? "GetVersionExW fails"
                       : how == "normal" ? "GetVersionExW answers as usual"
                                         : "GetVersionExW reports this platform");
    return true;
}

bool runClear(Session& session, const Step& step) {
    w32test::clearFaults();
    session.show(step, "no call fails");
    return true;
}

// The journal's access mask of one call.
uint64_t maskOf(const LayerCall& call) {
    for (const MaskArgument& m : MaskArguments)
        if (call.function == m.function && m.index < call.args.size()) return call.args[m.index];
    return 0;
}

// Counts the calls of the last event, or checks that every one carried the mask.
bool checkCalls(Session& session, const Step& step, std::string& why) {
    std::vector<const LayerCall*> calls;
    for (const LayerCall& c : session.eventCalls)
        if (c.function == step.routine) calls.push_back(&c);
    if (step.values[0].kind == Value::Kind::Integer) {
        auto wanted = static_cast<size_t>(step.values[0].integer);
        if (calls.size() == wanted) return true;
        why = "expected " + std::to_string(wanted) + " calls of " + step.routine +
              " in the last event, got " + std::to_string(calls.size());
        return false;
    }
    auto wanted = static_cast<uint64_t>(static_cast<uint32_t>(step.values[1].integer));
    if (calls.empty()) why = "expected calls of " + step.routine + ", the last event made none";
    for (size_t i = 0; i < calls.size() && why.empty(); ++i)
        if (maskOf(*calls[i]) != wanted)
            why = "expected every " + step.routine + " of the last event to ask for " +
                  hex(wanted) + ", call " + std::to_string(i + 1) + " asked for " +
                  hex(maskOf(*calls[i]));
    return why.empty();
}

bool runLayerExpect(Session& session, const Step& step) {
    ++session.expectations;
    std::string why;
    if (step.subject == "expect handles") {
        size_t open = w32test::openHandleCount();
        if (open != static_cast<size_t>(step.values[0].integer))
            why = "expected " + std::to_string(step.values[0].integer) +
                  " registry handles open, got " + std::to_string(open);
    } else if (!session.last()) {
        why = "expect with no event before it";
    } else {
        checkCalls(session, step, why);
    }
    if (!why.empty()) return session.fail(step, why);
    session.show(step, "ok");
    return true;
}

#endif

}  // namespace

bool isLayerVerb(const std::string& word, const std::string& next) {
    if (word == "expect") return next == "handles" || next == "calls";
    for (const char* verb : {"{", "deny", "fail", "hide", "unhide", "version", "clear"})
        if (word == verb) return true;
    return false;
}

std::string parseLayer(const std::vector<Token>& operands, Step& step) {
    step.layerOnly = true;
    std::string verb = !operands.empty() && !operands[0].quoted ? operands[0].word : "";
    std::string next = operands.size() > 1 && !operands[1].quoted ? operands[1].word : "";
    if (!isLayerVerb(verb, next))
        return "layer needs a command, {, or one of: deny, fail, hide, unhide, version, clear, "
               "expect handles, expect calls";
    step.subject = verb;
    if (verb == "{" || verb == "clear") return strayAfter(operands, 1);
    if (verb == "deny") return parseDeny(operands, step);
    if (verb == "fail") return parseFail(operands, step);
    if (verb == "hide" || verb == "unhide") return parseHide(operands, step);
    if (verb == "version") return parseVersion(operands, step);
    return parseLayerExpect(operands, step);
}

bool runLayer(Session& session, const Step& step) {
#ifndef _WIN32
    const std::string& verb = step.subject;
    if (verb == "deny") return runDeny(session, step);
    if (verb == "fail") return runFail(session, step);
    if (verb == "hide" || verb == "unhide") return runHide(session, step);
    if (verb == "version") return runVersion(session, step);
    if (verb == "clear") return runClear(session, step);
    return runLayerExpect(session, step);
#else
    return session.fail(step, "this build has no portable layer");
#endif
}

std::string layerSkipNote(const Step& step) {
    if (step.command != "layer") return "holds only with the portable layer";
    const std::string& verb = step.subject;
    if (verb == "deny") return "needs the portable layer's access control";
    if (verb == "fail" || verb == "clear") return "needs the portable layer's fault injection";
    if (verb == "hide" || verb == "unhide") return "needs the portable layer's hidden exports";
    if (verb == "version") return "needs the portable layer's GetVersionExW settings";
    if (verb == "expect handles") return "needs the portable layer's handle count";
    return "needs the portable layer's call journal";
}

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
    for (const RegistryLine& reg : changes.denials) {
        HKEY key = nullptr;
        HKEY root = rootKeyHandle(reg.root);
        if (RegOpenKeyExW(root, wide(reg.path), 0, reg.view, &key) != ERROR_SUCCESS) continue;
        RegCloseKey(key);
        w32test::denyAccess(rootKeyHandle(reg.root), reg.path, reg.view);
    }
#endif
    changes = LayerChanges();
}

}  // namespace hv::script
