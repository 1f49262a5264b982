// State lines: saving an instance's state to a file, loading a state file into it, writing and
// checking the bytes of a file, and the debugger's lines.
#include <fstream>
#include <iterator>

#include "internal.h"
#include "script_internal.h"

namespace hv::script {

namespace {

std::vector<uint8_t> readFile(const std::string& path, bool* ok) {
    std::ifstream in(path, std::ios::binary);
    *ok = static_cast<bool>(in);
    return std::vector<uint8_t>(std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>());
}

// The debugger line as the transcript shows it: quoted, and whether the buffer was touched.
std::string shownLine(const Instance::DebugLine& line) {
    return line.written ? quote(line.text()) : "(buffer untouched)";
}

// What a debugger line must look like: the text, zeros up to the 256th character.
bool lineIs(const Instance::DebugLine& line, const std::u16string& text) {
    if (!line.written || text.size() >= Instance::DebugLineChars) return false;
    std::vector<char16_t> wanted(Instance::DebugLineChars, 0);
    std::copy(text.begin(), text.end(), wanted.begin());
    return line.buffer == wanted;
}

}  // namespace

// save "FILE" / load "FILE": one quoted file name.
std::string parseStateFile(const std::vector<Token>& operands, Step& step) {
    if (operands.size() != 1 || !operands[0].quoted)
        return step.command + " needs a file name in quotes";
    step.text = toUtf8(operands[0].text);
    return std::string();
}

// Runs SaveRunObject or LoadRunObject; its result becomes the last result, for `expect 1`.
bool runStateFile(Session& session, const Step& step) {
    std::string error;
    Instance& instance = session.instance();
    int result = step.command == "save" ? instance.saveState(step.text, &error)
                                        : instance.loadState(step.text, &error);
    if (result < 0) return session.fail(step, error);
    ++session.events;
    session.show(step, "=> " + std::to_string(result) + "   (lastError " +
                           std::to_string(instance.lastError()) + ")");
    Outcome outcome;
    outcome.raw = result;
    session.remember(EventKind::Condition, std::move(outcome));
    return true;
}

// file "FILE" "hex": the file's whole content.
std::string parseFileBytes(const std::vector<Token>& operands, Step& step) {
    if (operands.size() != 2 || !operands[0].quoted || !operands[1].quoted)
        return "file needs a file name and hex bytes, both in quotes";
    step.text = toUtf8(operands[0].text);
    return parseHex(operands[1].text, step.registry.data);
}

bool runFileBytes(Session& session, const Step& step) {
    std::ofstream out(step.text, std::ios::binary | std::ios::trunc);
    out.write(reinterpret_cast<const char*>(step.registry.data.data()),
              static_cast<std::streamsize>(step.registry.data.size()));
    if (!out) return session.fail(step, "cannot write " + step.text);
    session.show(step, "written: " + std::to_string(step.registry.data.size()) + " bytes");
    return true;
}

// debug: both lines of the debugger.
bool runDebug(Session& session, const Step& step) {
    std::string shown;
    for (int item : {0, 1}) {
        Instance::DebugLine line = session.instance().debugLine(item);
        if (!line.sentinelsIntact)
            return session.fail(step, "sentinel hit: GetDebugItem wrote past the 256-character line");
        shown += (item ? " | " : "") + shownLine(line);
    }
    session.show(step, "=> " + shown);
    return true;
}

// expect debug ITEM "text" | untouched.
std::string parseDebugExpect(const std::vector<Token>& operands, Step& step) {
    if (operands.size() != 2 || operands[0].quoted ||
        (!operands[1].quoted && operands[1].word != "untouched"))
        return "expect debug takes an item number and a text in quotes or untouched";
    Value item;
    item.kind = Value::Kind::Integer;
    std::string error = parseInteger(operands[0].word, item.integer);
    step.values.push_back(item);
    Value line;
    line.kind = operands[1].quoted ? Value::Kind::Text : Value::Kind::Word;
    line.text = operands[1].text;
    line.word = operands[1].word;
    step.values.push_back(line);
    return error;
}

bool checkDebug(Session& session, const Step& step, std::string& why) {
    auto item = static_cast<int>(static_cast<int32_t>(step.values[0].integer));
    Instance::DebugLine line = session.instance().debugLine(item);
    const Value& wanted = step.values[1];
    if (!line.sentinelsIntact) {
        why = "GetDebugItem wrote past the 256-character line";
        return false;
    }
    bool same = wanted.kind == Value::Kind::Text ? lineIs(line, wanted.text) : !line.written;
    if (!same)
        why = "expected the debugger line " +
              (wanted.kind == Value::Kind::Text ? quote(wanted.text) + " padded with zeros"
                                                : std::string("buffer untouched")) +
              ", got " + shownLine(line);
    return same;
}

// expect file "FILE" "hex".
std::string parseFileExpect(const std::vector<Token>& operands, Step& step) {
    if (operands.size() != 2 || !operands[0].quoted || !operands[1].quoted)
        return "expect file needs a file name and hex bytes, both in quotes";
    step.text = toUtf8(operands[0].text);
    return parseHex(operands[1].text, step.registry.data);
}

bool checkFile(Session&, const Step& step, std::string& why) {
    bool readable = false;
    std::vector<uint8_t> bytes = readFile(step.text, &readable);
    if (!readable) {
        why = "cannot read " + step.text;
        return false;
    }
    if (bytes == step.registry.data) return true;
    why = "expected " + step.text + " to hold " + hexList(step.registry.data) + ", it holds " +
          hexList(bytes);
    return false;
}

}  // namespace hv::script
