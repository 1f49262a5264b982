// The commands of the script language: how each line is read and what running it does.
#include <hivelet/catalogue.h>

#include <cstring>

#include "internal.h"
#include "script_internal.h"

namespace hv::script {

namespace {

// "1 parameter", "2 parameters".
std::string plural(int n, const char* word) {
    return std::to_string(n) + " " + word + (n == 1 ? "" : "s");
}

// The routine name and parameters of an event line.
std::string parseEvent(const std::vector<Token>& operands, Step& step, EventKind kind) {
    step.kind = kind;
    if (operands.empty() || operands[0].quoted) return step.command + " needs a routine name";
    step.routine = operands[0].word;
    step.code = eventCode(kind, step.routine);
    if (step.code < 0) {
        for (EventKind other : {EventKind::Condition, EventKind::Action, EventKind::Expression})
            if (eventCode(other, step.routine) >= 0)
                return step.routine + " is " + withArticle(other) + ", not " + withArticle(kind);
        return std::string("unknown ") + kindName(kind) + " '" + step.routine + "'";
    }
    for (size_t i = 1; i < operands.size(); ++i) {
        Value value;
        std::string error = parseParameter(operands[i], value);
        if (!error.empty()) return error;
        step.values.push_back(std::move(value));
    }
    int wanted = parameterCount(kind, step.code);
    int given = static_cast<int>(step.values.size());
    if (given != wanted)
        return step.routine + " takes " + plural(wanted, "parameter") + ", not " +
               std::to_string(given);
    return std::string();
}

std::string parseCondition(const std::vector<Token>& operands, Step& step) {
    return parseEvent(operands, step, EventKind::Condition);
}

std::string parseAction(const std::vector<Token>& operands, Step& step) {
    return parseEvent(operands, step, EventKind::Action);
}

std::string parseExpression(const std::vector<Token>& operands, Step& step) {
    return parseEvent(operands, step, EventKind::Expression);
}

// The value of a parameter in the slot the routine receives; `result` is the last text result.
bool toParam(Session& session, const Step& step, const Value& value, Param& param) {
    switch (value.kind) {
        case Value::Kind::Text: param = Param::str(value.text); return true;
        case Value::Kind::Integer:
            param = Param::integerValue(static_cast<int32_t>(static_cast<uint32_t>(value.integer)));
            return true;
        case Value::Kind::RootKey:
            param = Param::rootKey(static_cast<uint32_t>(value.integer));
            return true;
        case Value::Kind::LastResult: {
            const Outcome* last = session.last();
            if (!last || !last->isText)
                return session.fail(step, "'result' needs a text result from the event before");
            param = Param::rawAddress(last->textAddress);
            return true;
        }
        default: param = Param::null(); return true;
    }
}

// The result as the transcript shows it.
std::string resultText(EventKind kind, const Outcome& o) {
    if (o.isText) return quote(o.text);
    if (kind == EventKind::Condition && (o.raw == 0 || o.raw == 1)) return o.raw ? "true" : "false";
    return std::to_string(kind == EventKind::Action ? o.asAction() : o.asInteger());
}

// Messages joined for one line.
std::string joined(const std::vector<std::string>& parts) {
    std::string out;
    for (const std::string& p : parts) out += (out.empty() ? "" : "; ") + p;
    return out;
}

// Runs an event line, shows it, and fails on damage or misuse whatever the script expects.
bool runEvent(Session& session, const Step& step) {
    std::vector<Param> params(step.values.size());
    for (size_t i = 0; i < params.size(); ++i)
        if (!toParam(session, step, step.values[i], params[i])) return false;
    size_t mark = session.layer ? journalMark() : 0;
    Outcome outcome = session.instance().run(step.kind, step.code, params);
    if (session.layer) session.eventCalls = journalSince(mark);
    ++session.events;
    session.show(step, "=> " + resultText(step.kind, outcome) + "   (lastError " +
                           std::to_string(session.instance().lastError()) + ")");
    bool intact = outcome.sentinelsIntact;
    std::string damage = outcome.damage, violations = joined(outcome.violations);
    session.remember(step.kind, std::move(outcome));
    if (!intact) return session.fail(step, "sentinel hit: " + damage);
    if (!violations.empty()) return session.fail(step, "host services misused: " + violations);
    return true;
}

// An expectation names its subject, or checks the result when its first operand is a value.
std::string parseExpect(const std::vector<Token>& operands, Step& step) {
    if (operands.empty()) return "expect needs a value";
    const Subject* named = operands[0].quoted ? nullptr : findSubject(operands[0].word);
    const Subject* subject = named ? named : findSubject("result");
    step.subject = subject->name;
    std::vector<Token> rest(operands.begin() + (named ? 1 : 0), operands.end());
    return subject->parse(rest, step);
}

// Checks an expectation; a mismatch fails the script with the subject's reason.
bool runExpect(Session& session, const Step& step) {
    const Subject* subject = findSubject(step.subject);
    ++session.expectations;
    if (subject->needsEvent && !session.last())
        return session.fail(step, "expect with no event before it");
    std::string why;
    if (!subject->check(session, step, why)) return session.fail(step, why);
    session.show(step, "ok");
    return true;
}

// show cnd|act|exp ROUTINE PARAMETERS...: the event as the event sheet shows it.
std::string parseShow(const std::vector<Token>& operands, Step& step) {
    const std::pair<const char*, EventKind> kinds[] = {{"cnd", EventKind::Condition},
                                                       {"act", EventKind::Action},
                                                       {"exp", EventKind::Expression}};
    if (!operands.empty() && !operands[0].quoted)
        for (auto [word, kind] : kinds)
            if (operands[0].word == word)
                return parseEvent(std::vector<Token>(operands.begin() + 1, operands.end()), step,
                                  kind);
    return "show takes cnd, act or exp, a routine name and its parameters";
}

bool runShow(Session& session, const Step& step) {
    std::vector<Param> params(step.values.size());
    for (size_t i = 0; i < params.size(); ++i)
        if (!toParam(session, step, step.values[i], params[i])) return false;
    Editor editor;
    Catalogue catalogue(session.module(), editor);
    try {
        session.sentence = catalogue.sentence(step.kind, step.code, params);
    } catch (const std::exception& e) {
        return session.fail(step, e.what());
    }
    session.show(step, toUtf8(*session.sentence));
    return true;
}

// echo takes the rest of its line as it is.
std::string parseEcho(const std::vector<Token>&, Step&) {
    return std::string();
}

bool runEcho(Session& session, const Step& step) {
    session.out << step.text << '\n';
    return true;
}

// For commands without operands.
std::string parseNothing(const std::vector<Token>& operands, Step& step) {
    if (!operands.empty())
        return operands[0].quoted ? step.command + " takes nothing after it"
                                  : "stray text '" + operands[0].word + "'";
    return std::string();
}

// Replaces the instance with a fresh one.
bool runNew(Session& session, const Step& step) {
    session.freshInstance();
    session.show(step, "a fresh instance");
    return true;
}

// buffers on | off.
std::string parseBuffers(const std::vector<Token>& operands, Step& step) {
    if (operands.size() != 1 || operands[0].quoted ||
        (operands[0].word != "on" && operands[0].word != "off"))
        return "buffers takes on or off";
    step.subject = operands[0].word;
    return std::string();
}

// Switches the lending of string buffers for this instance.
bool runBuffers(Session& session, const Step& step) {
    session.instance().lendNoBuffer(step.subject == "off");
    session.show(step, step.subject == "off" ? "GetStringBuffer lends nothing" : "buffers lent");
    return true;
}

// The record fields a script may overwrite, as a loaded saved state could.
const char* const PokeFields[] = {"rootKeyIndex", "lastError", "use64BitView"};

// poke FIELD INTEGER.
std::string parsePoke(const std::vector<Token>& operands, Step& step) {
    bool known = false;
    if (!operands.empty() && !operands[0].quoted)
        for (const char* field : PokeFields) known = known || operands[0].word == field;
    if (!known) return "poke takes rootKeyIndex, lastError or use64BitView and an integer";
    step.subject = operands[0].word;
    if (operands.size() < 2 || operands[1].quoted)
        return "poke " + step.subject + " needs an integer";
    if (operands.size() > 2) return "stray text after poke " + step.subject;
    Value value;
    value.kind = Value::Kind::Integer;
    std::string error = parseInteger(operands[1].word, value.integer);
    step.values.push_back(value);
    return error;
}

// Writes the field into the record directly.
bool runPoke(Session& session, const Step& step) {
    auto value = static_cast<uint32_t>(step.values[0].integer);
    Instance& instance = session.instance();
    if (step.subject == "rootKeyIndex") instance.setRootKeyIndex(value);
    if (step.subject == "lastError") instance.setLastError(value);
    if (step.subject == "use64BitView")
        std::memcpy(instance.record() + Instance::use64BitViewOffset(), &value, sizeof value);
    session.show(step, "written");
    return true;
}

const Command Commands[] = {
    {"cnd", false, parseCondition, runEvent},     {"act", false, parseAction, runEvent},
    {"exp", false, parseExpression, runEvent},    {"expect", false, parseExpect, runExpect},
    {"echo", true, parseEcho, runEcho},           {"new", false, parseNothing, runNew},
    {"buffers", false, parseBuffers, runBuffers}, {"poke", false, parsePoke, runPoke},
    {"reg", false, parseRegistry, runRegistry},   {"layer", false, parseLayer, runLayer},
    {"show", false, parseShow, runShow},
    {"save", false, parseStateFile, runStateFile}, {"load", false, parseStateFile, runStateFile},
    {"file", false, parseFileBytes, runFileBytes}, {"debug", false, parseNothing, runDebug},
    {"param", false, parseParam, runParam},
};

}  // namespace

const Command* findCommand(const std::string& name) {
    for (const Command& c : Commands)
        if (name == c.name) return &c;
    return nullptr;
}

}  // namespace hv::script
