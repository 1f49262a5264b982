// The commands of the script language by their first word, and the events, the simple commands
// and the state lines (saving an instance's state to a file, loading a state file into it, and
// writing and checking the bytes of a file): how each line is read and what running it does.
#include <hivelet/catalogue.h>

#include <fstream>
#include <iterator>

#include "internal.h"
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

namespace {

// "1 parameter", "2 parameters".
std::string plural(int n, const char* word) {
    return std::to_string(n) + " " + word + (n == 1 ? "" : "s");
}

// The routine name and parameters of an event line; `command` names the line in messages.
Event parseEvent(Operands& in, EventKind kind, const std::string& command) {
    Event event;
    event.kind = kind;
    std::string routine = in.word();
    if (routine.empty()) refuse(command + " needs a routine name");
    event.code = eventCode(kind, routine);
    for (EventKind other : {EventKind::Condition, EventKind::Action, EventKind::Expression})
        if (event.code < 0 && eventCode(other, routine) >= 0)
            refuse(routine + " is " + withArticle(other) + ", not " + withArticle(kind));
    if (event.code < 0) refuse(std::string("unknown ") + kindName(kind) + " '" + routine + "'");
    while (const Token* t = in.next()) event.arguments.push_back(parseArgument(*t));
    int wanted = parameterCount(kind, event.code);
    int given = static_cast<int>(event.arguments.size());
    if (given != wanted)
        refuse(routine + " takes " + plural(wanted, "parameter") + ", not " +
               std::to_string(given));
    return event;
}

const char* const EventWords[] = {"cnd", "act", "exp"};

template <EventKind Kind>
Command parseEventLine(Operands& in) {
    return parseEvent(in, Kind, EventWords[static_cast<int>(Kind)]);
}

// show cnd|act|exp ROUTINE PARAMETERS...
Command parseShow(Operands& in) {
    std::string word = in.word();
    for (int kind = 0; kind < 3; ++kind)
        if (word == EventWords[kind])
            return Show{parseEvent(in, static_cast<EventKind>(kind), "show")};
    refuse("show takes cnd, act or exp, a routine name and its parameters");
}

// A command without operands.
template <typename Line>
Command parseBare(Operands& in) {
    in.end();
    return Line{};
}

// buffers on | off.
Command parseBuffers(Operands& in) {
    std::string word = in.word();
    if (in.left() || (word != "on" && word != "off")) refuse("buffers takes on or off");
    return Buffers{word == "on"};
}

// poke FIELD INTEGER: the record fields a script may overwrite, as a loaded saved state could.
Command parsePoke(Operands& in) {
    const std::pair<const char*, size_t> fields[] = {{"rootKeyIndex", BuildLayout.rootKeyIndex},
                                                     {"lastError", BuildLayout.lastError}};
    std::string field = in.word();
    Poke poke;
    for (auto [name, offset] : fields)
        if (field == name) poke.offset = offset;
    if (!poke.offset) refuse("poke takes rootKeyIndex or lastError and an integer");
    if (in.left() > 1 && !in.peek()->quoted) refuse("stray text after poke " + field);
    poke.value = static_cast<uint32_t>(in.integer("poke " + field + " needs an integer"));
    return poke;
}

const std::pair<const char*, Parser> Commands[] = {
    {"cnd", parseEventLine<EventKind::Condition>},
    {"act", parseEventLine<EventKind::Action>},
    {"exp", parseEventLine<EventKind::Expression>},
    {"expect", parseExpect},
    {"new", parseBare<New>},
    {"buffers", parseBuffers},
    {"poke", parsePoke},
    {"reg", parseRegistry},
    {"layer", parseLayer},
    {"show", parseShow},
    {"save", [](Operands& in) -> Command { return parseStateFile(in, true); }},
    {"load", [](Operands& in) -> Command { return parseStateFile(in, false); }},
    {"file", [](Operands& in) -> Command { return parseFileBytes(in, false); }},
    {"debug", parseBare<Debug>},
    {"param", parseParam},
};

// The parameters as the routine receives them; `result` is the last text result itself.
std::vector<Param> resolve(Session& session, const std::vector<Argument>& arguments) {
    std::vector<Param> params;
    for (const Argument& a : arguments) {
        const Outcome* last = session.last();
        if (a.lastResult && (!last || !last->isText))
            refuse("'result' needs a text result from the event before");
        params.push_back(a.lastResult ? Param::rawAddress(last->textAddress) : a.value);
    }
    return params;
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
void run(Session& session, const Step& step, const Event& line) {
    std::vector<Param> params = resolve(session, line.arguments);
    size_t mark = journalMark();
    Outcome outcome = session.instance().run(line.kind, line.code, params);
    session.eventCalls = {mark, journalMark()};
    ++session.events;
    session.show(step, "=> " + resultText(line.kind, outcome) + "   (lastError " +
                           std::to_string(session.instance().lastError()) + ")");
    std::string misuse;
    for (const std::string& v : outcome.violations)
        misuse += (misuse.empty() ? "host services misused: " : "; ") + v;
    std::string damage = outcome.damage;
    bool intact = outcome.sentinelsIntact;
    session.remember(line.kind, std::move(outcome));
    if (!intact) refuse("sentinel hit: " + damage);
    refuseIf(misuse);
}

void run(Session& session, const Step& step, const Show& line) {
    Editor editor;
    Catalogue catalogue(session.module(), editor);
    session.sentence = catalogue.sentence(line.event.kind, line.event.code,
                                          resolve(session, line.event.arguments));
    session.show(step, toUtf8(*session.sentence));
}

void run(Session& session, const Step&, const Echo& line) { session.out << line.text << '\n'; }

void run(Session& session, const Step& step, const New&) {
    session.freshInstance();
    session.show(step, "a fresh instance");
}

void run(Session& session, const Step& step, const Buffers& line) {
    session.instance().lendNoBuffer(!line.lend);
    session.show(step, line.lend ? "buffers lent" : "GetStringBuffer lends nothing");
}

void run(Session& session, const Step& step, const Poke& line) {
    writeAt(session.instance().record(), line.offset, line.value);
    session.show(step, "written");
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
