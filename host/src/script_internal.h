// The parts of the script language shared by its parser and its runner: tokens and how the
// command parsers read them, the state of a running script, and each command's run function.
#pragma once

#include <hivelet/script.h>

#include <memory>
#include <optional>
#include <ostream>
#include <stdexcept>

namespace hv::script {

// Why a line is malformed, or why running it failed. Parsers and run functions throw it; the
// parser and the runner report it as "file:line: message".
struct Refusal : std::runtime_error {
    using std::runtime_error::runtime_error;
};

[[noreturn]] inline void refuse(const std::string& why) { throw Refusal(why); }

// Refuses with `error` unless it is empty.
inline void refuseIf(const std::string& error) {
    if (!error.empty()) refuse(error);
}

// Why an expectation does not hold: "" when it holds, else "expected WANTED, got GOT".
inline std::string unless(bool holds, const std::string& wanted, const std::string& got) {
    return holds ? std::string() : "expected " + wanted + ", got " + got;
}

// A token of a line: a quoted text (escapes resolved) or a bare word.
struct Token {
    bool quoted = false;
    std::u16string text;
    std::string word;
};

// Splits `line` from `pos` into tokens up to its end or a comment; `end` receives where the
// tokens stop (the comment's start or the line's end).
std::vector<Token> lex(const std::string& line, size_t pos, size_t* end = nullptr);

// A command's operands, read front to back.
class Operands {
public:
    explicit Operands(std::vector<Token> tokens) : tokens_(std::move(tokens)) {}
    size_t left() const { return tokens_.size() - at_; }
    // The operand `ahead` places on, or null past the end.
    const Token* peek(size_t ahead = 0) const {
        return at_ + ahead < tokens_.size() ? &tokens_[at_ + ahead] : nullptr;
    }
    // Takes the next operand, or gives null at the end.
    const Token* next() { return at_ < tokens_.size() ? &tokens_[at_++] : nullptr; }
    // The next operand when it is a bare word, else "" (nothing is taken).
    std::string word();
    // The next operand, which must be a quoted text; else refuses with `usage`.
    std::u16string text(const std::string& usage);
    // The next operand, which must be a bare 32-bit integer; else refuses with `usage`.
    int64_t integer(const std::string& usage);
    // Takes the last operand when it is this bare word.
    bool takeLast(const char* word);
    // Refuses the first operand left over.
    void end() const;

private:
    std::vector<Token> tokens_;
    size_t at_ = 0;
};

// Reads an integer of `bits` bits (32 or 64) written in decimal, possibly negative, or 0x hex;
// a negative value comes back as its two's complement. Returns an error or "".
std::string parseInteger(const std::string& word, int bits, uint64_t& value);
// The same for 32 bits, as written: -2147483648 to 4294967295.
std::string parseInteger(const std::string& word, int64_t& value);
// Reads an event parameter.
Argument parseArgument(const Token& token);
// Takes a view word off the end of a registry line: KEY_WOW64_64KEY for view64,
// KEY_WOW64_32KEY for view32, or 0 for the default view.
uint32_t takeView(Operands& in);
// Reads one of the five root key names (no root:N) for a registry line; refuses with `usage`.
uint32_t parseRootName(const Token* token, const std::string& usage);
// Hex bytes written as pairs of digits, blanks allowed between whole bytes: "01 02ff".
std::vector<uint8_t> parseHex(const std::u16string& text);
// Bytes as "[61 00 ff]".
std::string hexList(const std::vector<uint8_t>& bytes);
// The name of a predefined root by its index (HKEY_CLASSES_ROOT ...), or "" past the fifth.
const char* rootKeyName(uint32_t index);
// The predefined handle of a root by its index, below 5.
HKEY rootKeyHandle(uint32_t index);

// The command parsers, by the word that starts their lines.
using Parser = Command (*)(Operands& in);
Command parseExpect(Operands& in);
Command parseRegistry(Operands& in);
Command parseLayer(Operands& in);
Command parseParam(Operands& in);
FileBytes parseFileBytes(Operands& in, bool check);
// The parser of the command named `name`, or null.
Parser findCommand(const std::string& name);
// Whether `word`, after `layer`, starts a line of the layer's own (deny, fail ...); `next` is
// the word after it.
bool isLayerVerb(const std::string& word, const std::string& next);

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
    Session(Module& module, std::ostream& out, bool layer);
    Instance& instance() { return *instance_; }
    Module& module() { return module_; }
    void freshInstance();
    // Prints a transcript line for `step`.
    void show(const Step& step, const std::string& detail);
    // Shows a line that this build cannot run, with the reason.
    void skip(const Step& step, const std::string& why);
    // Counts an expectation; shows it when it holds, or refuses with why it does not.
    void checked(const Step& step, const std::string& why);
    void remember(EventKind kind, Outcome outcome);
    const Outcome* last() const { return last_ ? &*last_ : nullptr; }
    // The last event's outcome; refuses when no event ran on this instance.
    const Outcome& lastEvent() const;
    EventKind lastKind() const { return lastKind_; }
    // The root-key parameter record, made when a param line first runs.
    ParamState& param();

    std::ostream& out;
    unsigned events = 0;
    unsigned expectations = 0;
    unsigned skipped = 0;
    const bool layer;                        // the portable layer's test control is there
    std::pair<size_t, size_t> eventCalls;    // the layer's journal entries of the last event
    std::optional<std::u16string> sentence;  // what the last `show` line printed
    LayerChanges layerChanges;

private:
    Module& module_;
    std::unique_ptr<Instance> instance_;
    std::optional<Outcome> last_;
    EventKind lastKind_ = EventKind::Condition;
    std::shared_ptr<ParamState> param_;
};

// What running a line does; a failure is thrown.
void run(Session& s, const Step& step, const Event& line);
void run(Session& s, const Step& step, const Show& line);
void run(Session& s, const Step& step, const Echo& line);
void run(Session& s, const Step& step, const New& line);
void run(Session& s, const Step& step, const Buffers& line);
void run(Session& s, const Step& step, const Poke& line);
void run(Session& s, const Step& step, const ExpectResult& line);
void run(Session& s, const Step& step, const ExpectNumber& line);
void run(Session& s, const Step& step, const ExpectBuffers& line);
void run(Session& s, const Step& step, const ExpectAddress& line);
void run(Session& s, const Step& step, const ExpectText& line);
void run(Session& s, const Step& step, const ExpectDebug& line);
void run(Session& s, const Step& step, const Registry& line);
void run(Session& s, const Step& step, const Deny& line);
void run(Session& s, const Step& step, const Fail& line);
void run(Session& s, const Step& step, const Hide& line);
void run(Session& s, const Step& step, const Version& line);
void run(Session& s, const Step& step, const Handles& line);
void run(Session& s, const Step& step, const Calls& line);
void run(Session& s, const Step& step, const StateFile& line);
void run(Session& s, const Step& step, const FileBytes& line);
void run(Session& s, const Step& step, const Debug& line);
void run(Session& s, const Step& step, const ParamRecord& line);
void run(Session& s, const Step& step, const ParamInit& line);
void run(Session& s, const Step& step, const ParamEdit& line);
void run(Session& s, const Step& step, const ParamString& line);
void run(Session& s, const Step& step, const ParamExpect& line);

// Where the layer's journal stands (0 without the layer): the calls an event made lie between
// the marks before and after it.
size_t journalMark();
// Undoes what the script's layer lines armed: faults, version settings, hidden exports, denials.
void undoLayer(Session& session);

#ifdef _WIN32
constexpr bool LayerBuilt = false;
#else
constexpr bool LayerBuilt = true;
#endif

}  // namespace hv::script
