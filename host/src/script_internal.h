// The parts of the script language shared by its parser and its runner: tokens, the state of a
// running script, and the tables of commands and expectation subjects.
#pragma once

#include <hivelet/script.h>

#include <optional>
#include <ostream>

namespace hv::script {

// A token of a line: a quoted text (escapes resolved) or a bare word.
struct Token {
    bool quoted = false;
    std::u16string text;
    std::string word;
};

// Splits `line` from `pos` into tokens up to its end or a comment; returns an error or "".
// `end` receives where the tokens stop (the comment's start or the line's end).
std::string lex(const std::string& line, size_t pos, std::vector<Token>& tokens, size_t* end);

// An integer word split into its form and its digits, leading zeros dropped.
struct IntegerDigits {
    bool hex = false;
    bool negative = false;
    std::string digits;
};
// Checks that `word` is decimal (possibly negative) or 0x hex digits; returns an error or "".
std::string scanInteger(const std::string& word, IntegerDigits& number);
// Reads a 32-bit integer written in decimal (possibly negative) or 0x hex; returns an error or "".
std::string parseInteger(const std::string& word, int64_t& value);
// An integer value, as a command's operand.
Value integerValue(int64_t n);
// Reads an event parameter; returns an error or "".
std::string parseParameter(const Token& token, Value& value);
// Bytes as "[61 00 ff]".
std::string hexList(const std::vector<uint8_t>& bytes);
// Hex bytes written as pairs of digits, blanks allowed between whole bytes: "01 02ff".
std::string parseHex(const std::u16string& text, std::vector<uint8_t>& data);
// A value as the script writes it.
std::string describe(const Value& value);
// The name of a predefined root by its index (HKEY_CLASSES_ROOT ...), or "" past the fifth.
const char* rootKeyName(uint32_t index);
// The predefined handle of a root by its index, below 5.
HKEY rootKeyHandle(uint32_t index);

// A call the portable layer served during an event, from its journal.
struct LayerCall {
    std::string function;
    std::vector<uint64_t> args;
};

// What a script's layer lines changed, so that it can be undone when the script ends.
struct LayerChanges {
    bool faults = false;
    bool version = false;
    std::vector<std::string> hidden;
    std::vector<RegistryLine> denials;
};

struct ParamState;

// The state of one running script: its instance and the last event's outcome.
class Session {
public:
    Session(Module& module, const std::string& file, std::ostream& out, std::ostream& err,
            bool layer);
    Instance& instance() { return *instance_; }
    Module& module() { return module_; }
    void freshInstance();
    // Reports a failure of `step` as "file:line: message"; returns false for the caller to pass on.
    bool fail(const Step& step, const std::string& message);
    // Prints a transcript line for `step`.
    void show(const Step& step, const std::string& detail);
    // Shows a line that this build cannot run, with the reason.
    void skip(const Step& step, const std::string& why);
    void remember(EventKind kind, Outcome outcome);
    const Outcome* last() const { return last_ ? &*last_ : nullptr; }
    EventKind lastKind() const { return lastKind_; }

    std::ostream& out;
    unsigned events = 0;
    unsigned expectations = 0;
    unsigned skipped = 0;
    const bool layer;                   // the portable layer's test control is there
    std::vector<LayerCall> eventCalls;  // what the layer served during the last event
    std::optional<std::u16string> sentence;  // what the last `show` line printed
    LayerChanges layerChanges;
    std::shared_ptr<ParamState> param;  // the root-key parameter record, once a param line ran

private:
    Module& module_;
    std::string file_;
    std::ostream& err_;
    std::unique_ptr<Instance> instance_;
    std::optional<Outcome> last_;
    EventKind lastKind_ = EventKind::Condition;
};

using ParseFunction = std::string (*)(const std::vector<Token>& operands, Step& step);
using RunFunction = bool (*)(Session& session, const Step& step);
// Checks an expectation; on a mismatch returns false and says why.
using CheckFunction = bool (*)(Session& session, const Step& step, std::string& why);

struct Command {
    const char* name;
    bool rawText;  // the rest of the line is taken as it is, not split into tokens
    ParseFunction parse;
    RunFunction run;
};

struct Subject {
    const char* name;
    bool needsEvent;  // checks the last event rather than the instance's state
    ParseFunction parse;
    CheckFunction check;
};

// The registry lines (script_registry.cpp) and the layer lines (script_layer.cpp).
std::string parseRegistry(const std::vector<Token>& operands, Step& step);
bool runRegistry(Session& session, const Step& step);
std::string parseLayer(const std::vector<Token>& operands, Step& step);
bool runLayer(Session& session, const Step& step);
// The state lines (script_state.cpp): save, load, file, debug, and their expectations.
std::string parseStateFile(const std::vector<Token>& operands, Step& step);
bool runStateFile(Session& session, const Step& step);
std::string parseFileBytes(const std::vector<Token>& operands, Step& step);
bool runFileBytes(Session& session, const Step& step);
bool runDebug(Session& session, const Step& step);
std::string parseDebugExpect(const std::vector<Token>& operands, Step& step);
bool checkDebug(Session& session, const Step& step, std::string& why);
std::string parseFileExpect(const std::vector<Token>& operands, Step& step);
bool checkFile(Session& session, const Step& step, std::string& why);
// The root-key parameter lines (script_param.cpp).
std::string parseParam(const std::vector<Token>& operands, Step& step);
bool runParam(Session& session, const Step& step);
// Whether `word`, after `layer`, starts a line of the layer's own (deny, fail ...); `next` is
// the word after it.
bool isLayerVerb(const std::string& word, const std::string& next);
// Why a Windows build skips a layer line.
std::string layerSkipNote(const Step& step);
// Marks where the layer's journal stands, and reads what it served since the mark.
size_t journalMark();
std::vector<LayerCall> journalSince(size_t mark);
// Undoes what the script's layer lines armed: faults, version settings, hidden exports, denials.
void undoLayer(Session& session);

// The command named `name`, or null.
const Command* findCommand(const std::string& name);
// The expectation subject named `name`, or null.
const Subject* findSubject(const std::string& name);

}  // namespace hv::script
