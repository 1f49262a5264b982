// Running scripts: one instance per script, a transcript line per step, and the first failure
// reported as file:line: message.
#include <fstream>
#include <iomanip>
#include <iterator>
#include <stdexcept>

#include "script_internal.h"

namespace hv::script {

Session::Session(Module& module, const std::string& file, std::ostream& output, std::ostream& err,
                 bool withLayer)
    : out(output), layer(withLayer), module_(module), file_(file), err_(err) {
    freshInstance();
}

void Session::freshInstance() {
    instance_.reset();
    last_.reset();
    eventCalls.clear();
    instance_ = std::make_unique<Instance>(module_);
}

bool Session::fail(const Step& step, const std::string& message) {
    out.flush();  // keeps the transcript before the message when both go to one terminal
    err_ << file_ << ":" << step.line << ": " << message << std::endl;
    return false;
}

void Session::show(const Step& step, const std::string& detail) {
    bool event = step.command == "cnd" || step.command == "act" || step.command == "exp";
    out << std::setw(5) << step.line << "  " << (event ? "" : "  ") << step.source;
    out << "   " << detail << '\n';
}

void Session::skip(const Step& step, const std::string& why) {
    ++skipped;
    show(step, "skipped " + why);
}

void Session::remember(EventKind kind, Outcome outcome) {
    lastKind_ = kind;
    last_ = std::move(outcome);
}

#ifdef _WIN32
const bool LayerBuilt = false;
#else
const bool LayerBuilt = true;
#endif
// The registry's default view is a 32-bit process's: the portable layer's model, which plays
// the process the module ships for, and 32-bit Windows.
const bool DefaultView32 = LayerBuilt || sizeof(void*) == 4;

Runner::Runner(Module& module, std::ostream& out, std::ostream& err)
    : module_(module), out_(out), err_(err), layer_(LayerBuilt) {}

Runner::~Runner() = default;

void Runner::setLayer(bool present) {
    layer_ = present && LayerBuilt;
}

bool Runner::run(const Script& script) {
    out_ << "== " << script.file << '\n';
    std::unique_ptr<Session> session;
    try {
        session = std::make_unique<Session>(module_, script.file, out_, err_, layer_);
    } catch (const std::exception& e) {
        out_.flush();
        err_ << script.file << ": cannot create an instance: " << e.what() << std::endl;
        return false;
    }
    for (const Step& step : script.steps) {
        if (step.process32Only && !DefaultView32) {
            session->skip(step, "in a 64-bit process: its default registry view is the 64-bit one");
            continue;
        }
        if (step.layerOnly && !layer_) {
            session->skip(step, "under Windows: " + layerSkipNote(step));
            continue;
        }
        bool passed = false;
        try {
            passed = findCommand(step.command)->run(*session, step);
        } catch (const std::exception& e) {
            passed = session->fail(step, e.what());
        }
        if (!passed) {
            undoLayer(*session);
            out_ << "== " << script.file << ": FAILED at line " << step.line << "\n\n";
            return false;
        }
    }
    undoLayer(*session);
    out_ << "== " << script.file << ": passed (" << session->events << " events, "
         << session->expectations << " expectations";
    if (session->skipped) out_ << ", " << session->skipped << " lines skipped";
    out_ << ")\n\n";
    return true;
}

bool Runner::runFile(const std::string& path) {
    std::ifstream file(path, std::ios::binary);
    std::string text((std::istreambuf_iterator<char>(file)), std::istreambuf_iterator<char>());
    if (!file || file.bad()) {
        out_.flush();
        err_ << path << ": cannot read the script" << std::endl;
        return false;
    }
    ParseResult parsed = parse(path, text);
    if (!parsed.ok()) {
        out_ << "== " << path << ": not run\n\n";
        out_.flush();
        err_ << parsed.error << std::endl;
        return false;
    }
    return run(parsed.script);
}

}  // namespace hv::script
