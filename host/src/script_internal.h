// The parts of the script language shared by its parser and its runner: tokens and how the
// command parsers read them, the state of a running script, and each command's run function.
#pragma once

#include <hivelet/script.h>

#include <memory>
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

// A command's operands, read front to back.
class Operands {
public:
    explicit Operands(std::vector<Token> tokens) : tokens_(std::move(tokens)) {}
    size_t left() const { return tokens_.size() - at_; }
    // The operand `ahead` places on, or null past the end.
    const Token* peek(size_t ahead = 0) const;
    // Takes the next operand, or gives null at the end.
    const Token* next() { return at_ < tokens_.size() ? &tokens_[at_++] : nullptr; }
    // The next operand when it is a bare word, else "" (nothing is taken).
    std::string word();
    // The next operand when it is a quoted text.
    bool text(std::u16string& out);
    // Takes the last operand when it is this bare word.
    bool takeLast(const char* word);
    // "stray text 'X'" for the first operand left over, or "" when none is.
    std::string rest() const;

private:
    std::vector<Token> tokens_;
    size_t at_ = 0;
};

// Reads an integer of `bits` bits (32 or 64) written in decimal, possibly negative, or 0x hex;
// a negative value comes back as its two's complement. Returns an error or "".
std::string parseInteger(const std::string& word, int bits, uint64_t& value);
// The same for 32 bits, as written: -2147483648 to 4294967295.
std::string parseInteger(const std::string& word, int64_t& value);
// Reads an event parameter; returns an error or "".
std::string parseArgument(const Token& token, Argument& argument);
// Takes a view word off the end of a registry line: KEY_WOW64_64KEY for view64,
// KEY_WOW64_32KEY for view32, or 0 for the default view.
uint32_t takeView(Operands& in);
// Reads one of the five root key names (no root:N) for a registry line; returns an error or "".
std::string parseRootName(const Token* token, const std::string& usage, uint32_t& root);
// Hex bytes written as pairs of digits, blanks allowed between whole bytes: "01 02ff".
std::string parseHex(const std::u16string& text, std::vector<uint8_t>& data);
// Bytes as "[61 00 ff]".
std::string hexList(const std::vector<uint8_t>& bytes);
// The name of a predefined root by its index (HKEY_CLASSES_ROOT ...), or "" past the fifth.
const char* rootKeyName(uint32_t index);
// The predefined handle of a root by its index, below 5.
HKEY rootKeyHandle(uint32_t index);

// The command parsers, by the word that starts their lines: each fills `command` and returns
// an error or "".
using Parser = std::string (*)(Operands& in, Command& command);
std::string parseExpect(Operands& in, Command& command);
std::string parseRegistry(Operands& in, Command& command);
std::string parseLayer(Operands& in, Command& command);
std::string parseStateFile(Operands& in, Command& command, bool save);
std::string parseFileBytes(Operands& in, Command& command, bool check);
std::string parseParam(Operands& in, Command& command);
// The parser of the command named `name`, or null.
Parser findCommand(const std::string& name);
// Whether `word`, after `layer`, starts a line of the layer's own (deny, fail ...); `next` is
// the word after it.
bool isLayerVerb(const std::string& word, const std::string& next);

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
    std::vector<RegistryKey> denials;
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
    // Reports a failure of `step` as "file:line: message".
    void fail(const Step& step, const std::string& message);
    // Prints a transcript line for `step`.
    void show(const Step& step, const std::string& detail);
    // Shows a line that this build cannot run, with the reason.
    void skip(const Step& step, const std::string& why);
    // Counts an expectation and shows it when it holds; passes on why it does not, or "".
    std::string checked(const Step& step, const std::string& why);
    void remember(EventKind kind, Outcome outcome);
    const Outcome* last() const { return last_ ? &*last_ : nullptr; }
    EventKind lastKind() const { return lastKind_; }
    // The root-key parameter record, made when a param line first runs.
    ParamState& param();

    std::ostream& out;
    unsigned events = 0;
    unsigned expectations = 0;
    unsigned skipped = 0;
    const bool layer;                   // the portable layer's test control is there
    std::vector<LayerCall> eventCalls;  // what the layer served during the last event
    std::optional<std::u16string> sentence;  // what the last `show` line printed
    LayerChanges layerChanges;

private:
    Module& module_;
    std::string file_;
    std::ostream& err_;
    std::unique_ptr<Instance> instance_;
    std::optional<Outcome> last_;
    EventKind lastKind_ = EventKind::Condition;
    std::shared_ptr<ParamState> param_;
};

// What running a line does: "" when it passed, or why it failed.
std::string run(Session& s, const Step& step, const Event& line);
std::string run(Session& s, const Step& step, const Show& line);
std::string run(Session& s, const Step& step, const Echo& line);
std::string run(Session& s, const Step& step, const New& line);
std::string run(Session& s, const Step& step, const Buffers& line);
std::string run(Session& s, const Step& step, const Poke& line);
std::string run(Session& s, const Step& step, const ExpectResult& line);
std::string run(Session& s, const Step& step, const ExpectNumber& line);
std::string run(Session& s, const Step& step, const ExpectBuffers& line);
std::string run(Session& s, const Step& step, const ExpectAddress& line);
std::string run(Session& s, const Step& step, const ExpectCurrentKey& line);
std::string run(Session& s, const Step& step, const ExpectSentence& line);
std::string run(Session& s, const Step& step, const ExpectDebug& line);
std::string run(Session& s, const Step& step, const Registry& line);
std::string run(Session& s, const Step& step, const Deny& line);
std::string run(Session& s, const Step& step, const Fail& line);
std::string run(Session& s, const Step& step, const Clear& line);
std::string run(Session& s, const Step& step, const Hide& line);
std::string run(Session& s, const Step& step, const Version& line);
std::string run(Session& s, const Step& step, const Handles& line);
std::string run(Session& s, const Step& step, const Calls& line);
std::string run(Session& s, const Step& step, const StateFile& line);
std::string run(Session& s, const Step& step, const FileBytes& line);
std::string run(Session& s, const Step& step, const Debug& line);
std::string run(Session& s, const Step& step, const ParamRecord& line);
std::string run(Session& s, const Step& step, const ParamInit& line);
std::string run(Session& s, const Step& step, const ParamEdit& line);
std::string run(Session& s, const Step& step, const ParamString& line);
std::string run(Session& s, const Step& step, const ParamExpect& line);

// Marks where the layer's journal stands, and reads what it served since the mark.
size_t journalMark();
std::vector<LayerCall> journalSince(size_t mark);
// Undoes what the script's layer lines armed: faults, version settings, hidden exports, denials.
void undoLayer(Session& session);

#ifdef _WIN32
constexpr bool LayerBuilt = false;
#else
constexpr bool LayerBuilt = true;
#endif

}  // namespace hv::script
