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

// Parses one line into `step`; returns an error, or "" (with an empty command for a line
// that holds nothing to do).
std::string parseLine(const std::string& line, Step& step) {
    size_t start = line.find_first_not_of(" \t");
    if (start == std::string::npos || line[start] == '#') return std::string();
    size_t stop = line.find_first_of(" \t#\"", start);
    if (stop == std::string::npos) stop = line.size();
    step.command = line.substr(start, stop - start);
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

}  // namespace

ParseResult parse(const std::string& file, const std::string& text) {
    ParseResult result;
    result.script.file = file;
    std::istringstream lines(text);
    std::string line;
    for (int number = 1; std::getline(lines, line); ++number) {
        if (number == 1 && line.compare(0, 3, "\xEF\xBB\xBF") == 0) line.erase(0, 3);
        if (!line.empty() && line.back() == '\r') line.pop_back();
        Step step;
        step.line = number;
        std::string error = parseLine(line, step);
        if (!error.empty()) {
            result.error = file + ":" + std::to_string(number) + ": " + error;
            return result;
        }
        if (!step.command.empty()) result.script.steps.push_back(std::move(step));
    }
    return result;
}

}  // namespace hv::script
