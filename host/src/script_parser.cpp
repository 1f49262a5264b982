// Reading a script: lines, their command word, and the command's own parser.
#include <sstream>

#include "script_internal.h"

namespace hv::script {

namespace {

// The text without leading and trailing blanks.
std::string trimmed(const std::string& text) {
    size_t first = text.find_first_not_of(" \t");
    if (first == std::string::npos) return std::string();
    size_t last = text.find_last_not_of(" \t");
    return text.substr(first, last - first + 1);
}

// The bare word that starts at or after `pos`, and where it ends.
std::string wordAt(const std::string& line, size_t pos, size_t* stop) {
    size_t start = line.find_first_not_of(" \t", pos);
    if (start == std::string::npos) start = line.size();
    *stop = line.find_first_of(" \t#\"", start);
    if (*stop == std::string::npos) *stop = line.size();
    return line.substr(start, *stop - start);
}

// Parses the line from `pos` into `step`; returns an error, or "" (with an empty command for a
// line that holds nothing to do). A `layer` before an ordinary command marks that line as one
// for the portable layer only, a `process32` as one for a 32-bit process's registry view.
std::string parseLine(const std::string& line, size_t pos, Step& step) {
    size_t start = line.find_first_not_of(" \t", pos);
    if (start == std::string::npos || line[start] == '#') return std::string();
    size_t stop = 0;
    step.command = wordAt(line, start, &stop);
    if (step.command == "layer") {
        size_t afterVerb = 0, unused = 0;
        std::string verb = wordAt(line, stop, &afterVerb);
        if (verb == "layer") return "layer is written once";
        if (verb == "}") return "} stands alone on its line";
        if (!verb.empty() && !isLayerVerb(verb, wordAt(line, afterVerb, &unused))) {
            step.layerOnly = true;
            return parseLine(line, stop, step);
        }
    }
    if (step.command == "process32") {
        size_t afterGuard = 0;
        std::string next = wordAt(line, stop, &afterGuard);
        if (next == "process32") return "process32 is written once";
        if (next != "{") {
            step.process32Only = true;
            return parseLine(line, stop, step);
        }
        step.subject = "{";
        stop = afterGuard;
    }
    if (step.command == "}" || step.subject == "{") {
        std::vector<Token> rest;
        size_t end = 0;
        std::string error = lex(line, stop, rest, &end);
        step.source = step.command == "}" ? "}" : step.command + " {";
        if (error.empty() && !rest.empty()) error = "stray text after " + step.source;
        return error;
    }
    const Command* command = findCommand(step.command);
    if (!command) {
        std::string word = step.command.empty() ? line.substr(start, 1) : step.command;
        step.command.clear();
        return "unknown command '" + word + "'";
    }
    if (command->rawText) {
        step.text = line.substr(std::min(line.size(), stop + 1));
        step.source = trimmed(line);
        return command->parse({}, step);
    }
    std::vector<Token> tokens;
    size_t end = 0;
    std::string error = lex(line, stop, tokens, &end);
    if (!error.empty()) return error;
    step.source = trimmed(line.substr(0, end));
    return command->parse(tokens, step);
}

// An open `layer {` or `process32 {` block: where it began and which guard it puts on its lines.
struct Block {
    int line = 0;
    std::string guard;
};

// Keeps track of `layer {` ... `}` and `process32 {` ... `}`: the lines between them carry the
// block's guard. Returns an error, or "" with `keep` false for the block's own lines.
std::string trackBlock(Step& step, Block& block, bool& keep) {
    bool opens = step.subject == "{" && (step.command == "layer" || step.command == "process32");
    keep = !opens && step.command != "}";
    if (opens && block.line)
        return "blocks do not nest (" + block.guard + " { is open since line " +
               std::to_string(block.line) + ")";
    if (opens) block = Block{step.line, step.command};
    if (step.command == "}" && !block.line) return "} without layer { or process32 {";
    if (step.command == "}") block = Block();
    if (keep && block.guard == "layer") step.layerOnly = true;
    if (keep && block.guard == "process32") step.process32Only = true;
    return std::string();
}

}  // namespace

ParseResult parse(const std::string& file, const std::string& text) {
    ParseResult result;
    result.script.file = file;
    std::istringstream lines(text);
    std::string line;
    Block block;
    for (int number = 1; std::getline(lines, line); ++number) {
        if (number == 1 && line.compare(0, 3, "\xEF\xBB\xBF") == 0) line.erase(0, 3);
        if (!line.empty() && line.back() == '\r') line.pop_back();
        Step step;
        step.line = number;
        std::string error = parseLine(line, 0, step);
        bool keep = false;
        if (error.empty() && !step.command.empty()) error = trackBlock(step, block, keep);
        if (!error.empty()) {
            result.error = file + ":" + std::to_string(number) + ": " + error;
            return result;
        }
        if (keep) result.script.steps.push_back(std::move(step));
    }
    if (block.line)
        result.error = file + ":" + std::to_string(block.line) + ": " + block.guard +
                       " { is not closed";
    return result;
}

}  // namespace hv::script
