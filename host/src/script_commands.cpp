// The commands of the script language by their first word, and the events and simple commands:
// how each line is read and what running it does.
#include <hivelet/catalogue.h>

#include "internal.h"
#include "script_internal.h"

namespace hv::script {

namespace {

// "1 parameter", "2 parameters".
std::string plural(int n, const char* word) {
    return std::to_string(n) + " " + word + (n == 1 ? "" : "s");
}

// The routine name and parameters of an event line; `command` names the line in messages.
std::string parseEvent(Operands& in, Event& event, EventKind kind, const std::string& command) {
    event.kind = kind;
    std::string routine = in.word();
    if (routine.empty()) return command + " needs a routine name";
    event.code = eventCode(kind, routine);
    if (event.code < 0) {
        for (EventKind other : {EventKind::Condition, EventKind::Action, EventKind::Expression})
            if (eventCode(other, routine) >= 0)
                return routine + " is " + withArticle(other) + ", not " + withArticle(kind);
        return std::string("unknown ") + kindName(kind) + " '" + routine + "'";
    }
    while (const Token* t = in.next()) {
        Argument argument;
        if (std::string error = parseArgument(*t, argument); !error.empty()) return error;
        event.arguments.push_back(std::move(argument));
    }
    int wanted = parameterCount(kind, event.code);
    int given = static_cast<int>(event.arguments.size());
    if (given != wanted)
        return routine + " takes " + plural(wanted, "parameter") + ", not " + std::to_string(given);
    return std::string();
}

template <EventKind Kind>
std::string parseEventLine(Operands& in, Command& command) {
    const char* const words[] = {"cnd", "act", "exp"};
    Event event;
    std::string error = parseEvent(in, event, Kind, words[static_cast<int>(Kind)]);
    command = std::move(event);
    return error;
}

// show cnd|act|exp ROUTINE PARAMETERS...
std::string parseShow(Operands& in, Command& command) {
    const char* const words[] = {"cnd", "act", "exp"};
    std::string word = in.peek() && !in.peek()->quoted ? in.peek()->word : "";
    for (int kind = 0; kind < 3; ++kind) {
        if (word != words[kind]) continue;
        in.word();
        Show show;
        std::string error = parseEvent(in, show.event, static_cast<EventKind>(kind), "show");
        command = std::move(show);
        return error;
    }
    return "show takes cnd, act or exp, a routine name and its parameters";
}

// For commands without operands.
std::string nothingAfter(Operands& in, const std::string& command) {
    const Token* t = in.peek();
    if (t && t->quoted) return command + " takes nothing after it";
    return in.rest();
}

std::string parseNew(Operands& in, Command& command) {
    command = New{};
    return nothingAfter(in, "new");
}

std::string parseDebug(Operands& in, Command& command) {
    command = Debug{};
    return nothingAfter(in, "debug");
}

// buffers on | off.
std::string parseBuffers(Operands& in, Command& command) {
    std::string word = in.word();
    if (in.left() || (word != "on" && word != "off")) return "buffers takes on or off";
    command = Buffers{word == "on"};
    return std::string();
}

// poke FIELD INTEGER: the record fields a script may overwrite, as a loaded saved state could.
std::string parsePoke(Operands& in, Command& command) {
    const std::pair<const char*, size_t> fields[] = {{"rootKeyIndex", hostLayout.rootKeyIndex},
                                                     {"lastError", hostLayout.lastError},
                                                     {"use64BitView", hostLayout.use64BitView}};
    std::string field = in.word();
    Poke poke;
    for (auto [name, offset] : fields)
        if (field == name) poke.offset = offset;
    if (!poke.offset) return "poke takes rootKeyIndex, lastError or use64BitView and an integer";
    std::string number = in.word();
    if (number.empty()) return "poke " + field + " needs an integer";
    if (in.left()) return "stray text after poke " + field;
    int64_t value = 0;
    std::string error = parseInteger(number, value);
    poke.value = static_cast<uint32_t>(value);
    command = poke;
    return error;
}

const std::pair<const char*, Parser> Commands[] = {
    {"cnd", parseEventLine<EventKind::Condition>},
    {"act", parseEventLine<EventKind::Action>},
    {"exp", parseEventLine<EventKind::Expression>},
    {"expect", parseExpect},
    {"echo", [](Operands&, Command&) { return std::string(); }},  // the parser reads its text
    {"new", parseNew},
    {"buffers", parseBuffers},
    {"poke", parsePoke},
    {"reg", parseRegistry},
    {"layer", parseLayer},
    {"show", parseShow},
    {"save", [](Operands& in, Command& c) { return parseStateFile(in, c, true); }},
    {"load", [](Operands& in, Command& c) { return parseStateFile(in, c, false); }},
    {"file", [](Operands& in, Command& c) { return parseFileBytes(in, c, false); }},
    {"debug", parseDebug},
    {"param", parseParam},
};

// The parameters as the routine receives them; `result` is the last text result itself.
std::string resolve(Session& session, const std::vector<Argument>& arguments,
                    std::vector<Param>& params) {
    for (const Argument& a : arguments) {
        const Outcome* last = session.last();
        if (a.lastResult && (!last || !last->isText))
            return "'result' needs a text result from the event before";
        params.push_back(a.lastResult ? Param::rawAddress(last->textAddress) : a.value);
    }
    return std::string();
}

// The result as the transcript shows it.
std::string resultText(EventKind kind, const Outcome& o) {
    if (o.isText) return quote(o.text);
    if (kind == EventKind::Condition && (o.raw == 0 || o.raw == 1)) return o.raw ? "true" : "false";
    return std::to_string(kind == EventKind::Action ? o.asAction() : o.asInteger());
}

}  // namespace

Parser findCommand(const std::string& name) {
    for (auto [word, parser] : Commands)
        if (name == word) return parser;
    return nullptr;
}

// Runs an event line, shows it, and fails on damage or misuse whatever the script expects.
std::string run(Session& session, const Step& step, const Event& line) {
    std::vector<Param> params;
    if (std::string error = resolve(session, line.arguments, params); !error.empty())
        return error;
    size_t mark = session.layer ? journalMark() : 0;
    Outcome outcome = session.instance().run(line.kind, line.code, params);
    if (session.layer) session.eventCalls = journalSince(mark);
    ++session.events;
    session.show(step, "=> " + resultText(line.kind, outcome) + "   (lastError " +
                           std::to_string(session.instance().lastError()) + ")");
    std::string failure;
    for (const std::string& v : outcome.violations)
        failure += (failure.empty() ? "host services misused: " : "; ") + v;
    if (!outcome.sentinelsIntact) failure = "sentinel hit: " + outcome.damage;
    session.remember(line.kind, std::move(outcome));
    return failure;
}

std::string run(Session& session, const Step& step, const Show& line) {
    std::vector<Param> params;
    if (std::string error = resolve(session, line.event.arguments, params); !error.empty())
        return error;
    Editor editor;
    Catalogue catalogue(session.module(), editor);
    session.sentence = catalogue.sentence(line.event.kind, line.event.code, params);
    session.show(step, toUtf8(*session.sentence));
    return std::string();
}

std::string run(Session& session, const Step&, const Echo& line) {
    session.out << line.text << '\n';
    return std::string();
}

std::string run(Session& session, const Step& step, const New&) {
    session.freshInstance();
    session.show(step, "a fresh instance");
    return std::string();
}

std::string run(Session& session, const Step& step, const Buffers& line) {
    session.instance().lendNoBuffer(!line.lend);
    session.show(step, line.lend ? "buffers lent" : "GetStringBuffer lends nothing");
    return std::string();
}

std::string run(Session& session, const Step& step, const Poke& line) {
    writeAt(session.instance().record(), line.offset, line.value);
    session.show(step, "written");
    return std::string();
}

}  // namespace hv::script
