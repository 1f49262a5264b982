// State lines: saving an instance's state to a file, loading a state file into it, and writing
// and checking the bytes of a file.
#include <fstream>
#include <iterator>

#include "script_internal.h"

namespace hv::script {

// save "FILE" / load "FILE": one quoted file name.
std::string parseStateFile(Operands& in, Command& command, bool save) {
    std::u16string path;
    if (in.left() != 1 || !in.text(path))
        return std::string(save ? "save" : "load") + " needs a file name in quotes";
    command = StateFile{save, toUtf8(path)};
    return std::string();
}

// file "FILE" "hex" and expect file "FILE" "hex": the file's whole content.
std::string parseFileBytes(Operands& in, Command& command, bool check) {
    FileBytes line;
    line.check = check;
    std::u16string path, hex;
    if (in.left() != 2 || !in.text(path) || !in.text(hex))
        return std::string(check ? "expect file" : "file") +
               " needs a file name and hex bytes, both in quotes";
    line.path = toUtf8(path);
    std::string error = parseHex(hex, line.bytes);
    command = std::move(line);
    return error;
}

// Runs SaveRunObject or LoadRunObject; its result becomes the last result, for `expect 1`.
std::string run(Session& session, const Step& step, const StateFile& line) {
    std::string error;
    Instance& instance = session.instance();
    int result = line.save ? instance.saveState(line.path, &error)
                           : instance.loadState(line.path, &error);
    if (result < 0) return error;
    ++session.events;
    session.show(step, "=> " + std::to_string(result) + "   (lastError " +
                           std::to_string(instance.lastError()) + ")");
    Outcome outcome;
    outcome.raw = result;
    session.remember(EventKind::Condition, std::move(outcome));
    return std::string();
}

std::string run(Session& session, const Step& step, const FileBytes& line) {
    if (line.check) {
        std::ifstream in(line.path, std::ios::binary);
        std::vector<uint8_t> bytes((std::istreambuf_iterator<char>(in)),
                                   std::istreambuf_iterator<char>());
        std::string why;
        if (!in)
            why = "cannot read " + line.path;
        else if (bytes != line.bytes)
            why = "expected " + line.path + " to hold " + hexList(line.bytes) + ", it holds " +
                  hexList(bytes);
        return session.checked(step, why);
    }
    std::ofstream out(line.path, std::ios::binary | std::ios::trunc);
    out.write(reinterpret_cast<const char*>(line.bytes.data()),
              static_cast<std::streamsize>(line.bytes.size()));
    if (!out) return "cannot write " + line.path;
    session.show(step, "written: " + std::to_string(line.bytes.size()) + " bytes");
    return std::string();
}

}  // namespace hv::script
