// State lines: saving an instance's state to a file, loading a state file into it, and writing
// and checking the bytes of a file.
#include <fstream>
#include <iterator>

#include "script_internal.h"

namespace hv::script {

// save "FILE" / load "FILE": one quoted file name.
StateFile parseStateFile(Operands& in, bool save) {
    std::string usage = std::string(save ? "save" : "load") + " needs a file name in quotes";
    if (in.left() != 1) refuse(usage);
    return StateFile{save, toUtf8(in.text(usage))};
}

// file "FILE" "hex" and expect file "FILE" "hex": the file's whole content.
FileBytes parseFileBytes(Operands& in, bool check) {
    std::string usage = std::string(check ? "expect file" : "file") +
                        " needs a file name and hex bytes, both in quotes";
    if (in.left() != 2 || !in.peek(1)->quoted) refuse(usage);
    std::string path = toUtf8(in.text(usage));
    return FileBytes{check, path, parseHex(in.text(usage))};
}

// Runs SaveRunObject or LoadRunObject; its result becomes the last result, for `expect 1`.
void run(Session& session, const Step& step, const StateFile& line) {
    std::string error;
    Instance& instance = session.instance();
    int result =
        line.save ? instance.saveState(line.path, &error) : instance.loadState(line.path, &error);
    if (result < 0) refuse(error);
    ++session.events;
    session.show(step, "=> " + std::to_string(result) + "   (lastError " +
                           std::to_string(instance.lastError()) + ")");
    Outcome outcome;
    outcome.raw = result;
    session.remember(EventKind::Condition, std::move(outcome));
}

void run(Session& session, const Step& step, const FileBytes& line) {
    if (line.check) {
        std::ifstream in(line.path, std::ios::binary);
        std::vector<uint8_t> bytes((std::istreambuf_iterator<char>(in)),
                                   std::istreambuf_iterator<char>());
        if (!in) refuse("cannot read " + line.path);
        return session.checked(
            step, unless(bytes == line.bytes, line.path + " to hold " + hexList(line.bytes),
                         hexList(bytes)));
    }
    std::ofstream out(line.path, std::ios::binary | std::ios::trunc);
    out.write(reinterpret_cast<const char*>(line.bytes.data()),
              static_cast<std::streamsize>(line.bytes.size()));
    if (!out) refuse("cannot write " + line.path);
    session.show(step, "written: " + std::to_string(line.bytes.size()) + " bytes");
}

}  // namespace hv::script
