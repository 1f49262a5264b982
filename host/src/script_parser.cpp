// Reading a script: lines, their guards and blocks, their command word, and the command's own
// parser.
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

// What a line holds: a step, a block's opening or closing brace, or nothing to do.
struct LineShape {
    bool step = false;
    std::string opens;  // "layer" or "process32"
    bool closes = false;
};

// Nothing but a comment may follow a brace; `what` names the brace in the message, or is empty
// for the message of any other stray operand.
void braceOnly(const std::string& line, size_t pos, const std::string& what) {
    Operands rest(lex(line, pos));
    if (what.empty()) rest.end();
    if (rest.left()) refuse("stray text after " + what);
}

// Parses the line from `pos` into `step`. A `layer` before an ordinary command marks that line
// as one for the portable layer only, a `process32` as one for a 32-bit process's registry view.
void parseLine(const std::string& line, size_t pos, Step& step, LineShape& shape) {
    size_t start = line.find_first_not_of(" \t", pos);
    if (start == std::string::npos || line[start] == '#') return;
    size_t stop = 0, next = 0, unused = 0;
    std::string word = wordAt(line, start, &stop);
    if (word == "layer") {
        std::string verb = wordAt(line, stop, &next);
        if (verb == "layer") refuse("layer is written once");
        if (verb == "}") refuse("} stands alone on its line");
        if (verb == "{") {
            shape.opens = word;
            return braceOnly(line, next, "");
        }
        step.layerOnly = true;
        if (!verb.empty() && !isLayerVerb(verb, wordAt(line, next, &unused)))
            return parseLine(line, stop, step, shape);
    }
    if (word == "process32") {
        std::string after = wordAt(line, stop, &next);
        if (after == "process32") refuse("process32 is written once");
        if (after != "{") {
            step.process32Only = true;
            return parseLine(line, stop, step, shape);
        }
        shape.opens = word;
        return braceOnly(line, next, "process32 {");
    }
    if (word == "}") {
        shape.closes = true;
        return braceOnly(line, stop, "}");
    }
    shape.step = true;
    if (word == "echo") {  // takes the rest of its line as it is
        step.source = trimmed(line);
        step.command = Echo{line.substr(std::min(line.size(), stop + 1))};
        return;
    }
    Parser parser = findCommand(word);
    if (!parser) refuse("unknown command '" + (word.empty() ? line.substr(start, 1) : word) + "'");
    size_t end = 0;
    Operands operands(lex(line, stop, &end));
    step.source = trimmed(line.substr(0, end));
    step.command = parser(operands);
}

// An open `layer {` or `process32 {` block: where it began and which guard it puts on its lines.
struct Block {
    int line = 0;
    std::string guard;
};

// Opens or closes a block at a brace line.
void trackBlock(const LineShape& shape, int number, Block& block) {
    if (!shape.opens.empty() && block.line)
        refuse("blocks do not nest (" + block.guard + " { is open since line " +
               std::to_string(block.line) + ")");
    if (!shape.opens.empty()) block = Block{number, shape.opens};
    if (shape.closes && !block.line) refuse("} without layer { or process32 {");
    if (shape.closes) block = Block();
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
        LineShape shape;
        try {
            parseLine(line, 0, step, shape);
            trackBlock(shape, number, block);
        } catch (const Refusal& refusal) {
            result.error = file + ":" + std::to_string(number) + ": " + refusal.what();
            return result;
        }
        if (!shape.step) continue;
        step.layerOnly = step.layerOnly || block.guard == "layer";
        step.process32Only = step.process32Only || block.guard == "process32";
        result.script.steps.push_back(std::move(step));
    }
    if (block.line)
        result.error =
            file + ":" + std::to_string(block.line) + ": " + block.guard + " { is not closed";
    return result;
}

}  // namespace hv::script
