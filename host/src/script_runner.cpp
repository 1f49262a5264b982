// Running scripts: one instance per script, a transcript line per step, and the first failure
// reported as file:line: message.
#include <iomanip>
#include <stdexcept>
#include <type_traits>

#include "script_internal.h"

namespace hv::script {

Session::Session(Module& module, std::ostream& output, bool withLayer)
    : out(output), layer(withLayer), module_(module) {
    freshInstance();
}

void Session::freshInstance() {
    instance_.reset();
    last_.reset();
    eventCalls = {0, 0};
    instance_ = std::make_unique<Instance>(module_);
}

void Session::show(const Step& step, const std::string& detail) {
    bool event = std::holds_alternative<Event>(step.command);
    out << std::setw(5) << step.line << "  " << (event ? "" : "  ") << step.source;
    out << "   " << detail << '\n';
}

void Session::skip(const Step& step, const std::string& why) {
    ++skipped;
    show(step, "skipped " + why);
}

void Session::checked(const Step& step, const std::string& why) {
    ++expectations;
    refuseIf(why);
    show(step, "ok");
}

const Outcome& Session::lastEvent() const {
    if (!last_) refuse("expect with no event before it");
    return *last_;
}

void Session::remember(EventKind kind, Outcome outcome) {
    lastKind_ = kind;
    last_ = std::move(outcome);
}

namespace {

// The registry's default view is a 32-bit process's: the portable layer's model, which plays
// the process the module ships for, and 32-bit Windows.
const bool DefaultView32 = LayerBuilt || sizeof(void*) == 4;

// Why a build without the layer's test control skips a line.
template <typename T>
std::string layerSkipNote(const T&) {
    if constexpr (std::is_base_of_v<LayerControl, T>)
        return std::string("needs the portable layer's ") + T::Needs;
    else
        return "holds only with the portable layer";
}

// A build without the layer skips the layer's own lines before they run, and has no run
// functions for them.
template <typename T>
void runLine(Session& session, const Step& step, const T& line) {
    if constexpr (std::is_base_of_v<LayerControl, T> && !LayerBuilt)
        refuse("this build has no portable layer");
    else
        run(session, step, line);
}

}  // namespace

bool runScript(Module& module, const Script& script, std::ostream& out, std::ostream& err,
               bool layer) {
    layer = layer && LayerBuilt;
    out << "== " << script.file << '\n';
    std::unique_ptr<Session> session;
    try {
        session = std::make_unique<Session>(module, out, layer);
    } catch (const std::exception& e) {
        out.flush();
        err << script.file << ": cannot create an instance: " << e.what() << std::endl;
        return false;
    }
    for (const Step& step : script.steps) {
        if (step.process32Only && !DefaultView32) {
            session->skip(step, "in a 64-bit process: its default registry view is the 64-bit one");
            continue;
        }
        if (step.layerOnly && !layer) {
            std::string why =
                std::visit([](const auto& l) { return layerSkipNote(l); }, step.command);
            session->skip(step, "under Windows: " + why);
            continue;
        }
        try {
            std::visit([&](const auto& l) { runLine(*session, step, l); }, step.command);
        } catch (const std::exception& e) {
            out.flush();  // keeps the transcript before the message when both go to one terminal
            err << script.file << ":" << step.line << ": " << e.what() << std::endl;
            undoLayer(*session);
            out << "== " << script.file << ": FAILED at line " << step.line << "\n\n";
            return false;
        }
    }
    undoLayer(*session);
    out << "== " << script.file << ": passed (" << session->events << " events, "
        << session->expectations << " expectations";
    if (session->skipped) out << ", " << session->skipped << " lines skipped";
    out << ")\n\n";
    return true;
}

}  // namespace hv::script
