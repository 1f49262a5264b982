// Expectations: what an `expect` line can check, how its operands are read and how it is checked.
#include <algorithm>

#include "internal.h"
#include "script_internal.h"

namespace hv::script {

namespace {

// Reads exactly one integer operand (a non-negative one when `count` says it is a count).
std::string oneInteger(Operands& in, const std::string& what, bool count, int64_t& value) {
    const Token* t = in.peek();
    if (!t || t->quoted) return what + " needs an integer";
    if (in.left() > 1) return "stray text after " + what + " " + t->word;
    std::string error = parseInteger(in.word(), value);
    if (error.empty() && count && value < 0) error = what + " needs a count";
    return error;
}

// expect [result] VALUE: a text, true, false or an integer.
std::string parseResult(Operands& in, Command& command) {
    const Token* t = in.next();
    if (!t) return "expect result needs a value";
    if (in.left()) return in.rest();
    ExpectResult line;
    if (t->quoted) {
        line.value = t->text;
    } else if (t->word == "true" || t->word == "false") {
        line.value = t->word == "true";
    } else if (int64_t n = 0; parseInteger(t->word, n).empty()) {
        line.value = n;
    } else {
        return "expect takes a text, an integer, true, false or one of: error, message, "
               "fetches, buffers, address, rootKeyIndex, currentKey, use64BitView, debug, file; "
               "not '" + t->word + "'";
    }
    command = std::move(line);
    return std::string();
}

// expect buffers N...
std::string parseBuffers(Operands& in, Command& command) {
    ExpectBuffers line;
    while (in.left()) {
        Operands one({*in.next()});
        int64_t size = 0;
        if (std::string error = oneInteger(one, "expect buffers", true, size); !error.empty())
            return error;
        line.sizes.push_back(static_cast<size_t>(size));
    }
    command = std::move(line);
    return std::string();
}

const std::pair<const char*, Outcome::TextSource> Places[] = {
    {"currentKey", Outcome::TextSource::CurrentKey},
    {"buffer", Outcome::TextSource::LentBuffer},
    {"elsewhere", Outcome::TextSource::Elsewhere}};

// expect address currentKey|buffer|elsewhere
std::string parseAddress(Operands& in, Command& command) {
    std::string word = in.left() == 1 ? in.word() : "";
    for (auto [name, place] : Places)
        if (word == name) {
            command = ExpectAddress{place};
            return std::string();
        }
    return "expect address takes currentKey, buffer or elsewhere";
}

// expect currentKey "text" | null
std::string parseCurrentKey(Operands& in, Command& command) {
    const Token* t = in.left() == 1 ? in.next() : nullptr;
    if (!t || (!t->quoted && t->word != "null")) return "expect currentKey takes a text or null";
    ExpectCurrentKey line;
    if (t->quoted) line.key = t->text;
    command = std::move(line);
    return std::string();
}

// expect sentence "text"
std::string parseSentence(Operands& in, Command& command) {
    ExpectSentence line;
    if (in.left() != 1 || !in.text(line.text)) return "expect sentence needs a text";
    command = std::move(line);
    return std::string();
}

// expect debug ITEM "text" | untouched
std::string parseDebug(Operands& in, Command& command) {
    const Token* item = in.peek();
    const Token* text = in.peek(1);
    if (in.left() != 2 || item->quoted || (!text->quoted && text->word != "untouched"))
        return "expect debug takes an item number and a text in quotes or untouched";
    ExpectDebug line;
    int64_t n = 0;
    std::string error = parseInteger(item->word, n);
    line.item = static_cast<int32_t>(n);
    if (text->quoted) line.text = text->text;
    command = std::move(line);
    return error;
}

using SubjectParser = std::string (*)(Operands& in, Command& command);

const std::pair<const char*, SubjectParser> Subjects[] = {
    {"result", parseResult},        {"buffers", parseBuffers}, {"address", parseAddress},
    {"currentKey", parseCurrentKey}, {"sentence", parseSentence}, {"debug", parseDebug},
    {"file", [](Operands& in, Command& c) { return parseFileBytes(in, c, true); }},
};

// The subjects that take one integer.
const std::pair<const char*, ExpectNumber::Of> Numbers[] = {
    {"error", ExpectNumber::Of::LastError},
    {"message", ExpectNumber::Of::Message},
    {"fetches", ExpectNumber::Of::Fetches},
    {"rootKeyIndex", ExpectNumber::Of::RootKeyIndex},
    {"use64BitView", ExpectNumber::Of::Use64BitView}};

// The last event's outcome, or null with why the expectation cannot hold.
const Outcome* lastEvent(Session& s, std::string& why) {
    if (!s.last()) why = "expect with no event before it";
    return s.last();
}

// What the last event gave, for messages.
std::string got(Session& s) {
    const Outcome& o = *s.last();
    if (o.isText) return "the text " + quote(o.text);
    if (s.lastKind() == EventKind::Action)
        return "the action result " + std::to_string(o.asAction());
    return "the " + std::string(kindName(s.lastKind())) + " result " +
           std::to_string(o.asInteger());
}

// Why the last event did not return exactly this text, or "".
std::string textWhy(Session& s, const std::u16string& wanted, const std::string& what) {
    const Outcome& o = *s.last();
    return o.isText && o.text == wanted ? "" : "expected " + what + ", got " + got(s);
}

// A 32-bit field or count against the expected value.
std::string numberWhy(const char* what, int64_t wanted, uint64_t actual) {
    if (static_cast<uint64_t>(static_cast<uint32_t>(wanted)) == actual) return std::string();
    return std::string("expected ") + what + " " + std::to_string(wanted) + ", got " +
           std::to_string(actual);
}

// Integers compare at the width of the routine's result: 16 bits for actions, 32 otherwise.
std::string resultWhy(Session& s, const ExpectResult& line) {
    const Outcome& o = *s.last();
    if (auto* text = std::get_if<std::u16string>(&line.value)) return textWhy(s, *text, quote(*text));
    if (auto* truth = std::get_if<bool>(&line.value)) {
        if (s.lastKind() == EventKind::Condition && o.asCondition() == (*truth ? 1 : 0)) return "";
        return std::string("expected ") + (*truth ? "true" : "false") + ", got " + got(s);
    }
    int64_t n = std::get<int64_t>(line.value);
    auto wanted = static_cast<uint32_t>(n);
    bool same = s.lastKind() == EventKind::Action
                    ? static_cast<uint16_t>(o.asAction()) == static_cast<uint16_t>(wanted)
                    : !o.isText && static_cast<uint32_t>(o.asInteger()) == wanted;
    return same ? "" : "expected " + std::to_string(n) + ", got " + got(s);
}

// The system's message is asked for here, so the check holds for every system's texts.
std::string fieldWhy(Session& s, const ExpectNumber& line) {
    Instance& instance = s.instance();
    switch (line.of) {
        case ExpectNumber::Of::LastError:
            return numberWhy("lastError", line.value, instance.lastError());
        case ExpectNumber::Of::RootKeyIndex:
            return numberWhy("rootKeyIndex", line.value, instance.rootKeyIndex());
        case ExpectNumber::Of::Use64BitView:
            return numberWhy("use64BitView", line.value, instance.use64BitView());
        default: break;
    }
    std::string why;
    const Outcome* o = lastEvent(s, why);
    if (!o) return why;
    if (line.of == ExpectNumber::Of::Fetches)
        return numberWhy("parameter fetches", line.value,
                         o->parameterFetches + o->expressionFetches);
    auto code = static_cast<uint32_t>(line.value);
    std::u16string wanted = systemMessage(code);
    return textWhy(s, wanted,
                   "the system's message for " + std::to_string(code) + ", " + quote(wanted));
}

// Buffer sizes as "[1024 8]".
std::string listed(const std::vector<size_t>& sizes) {
    std::string out;
    for (size_t n : sizes) out += (out.empty() ? "" : " ") + std::to_string(n);
    return "[" + out + "]";
}

// Where a text result lies, as messages say it.
const char* placePhrase(Outcome::TextSource place) {
    static const char* const phrases[] = {"", "in a lent buffer", "in currentKey", "elsewhere"};
    return phrases[static_cast<size_t>(place)];
}

// The debugger line as the transcript shows it: quoted, and whether the buffer was touched.
std::string shownLine(const Instance::DebugLine& line) {
    return line.written ? quote(line.text()) : "(buffer untouched)";
}

// What a debugger line must look like: the text, zeros up to the 256th character.
bool lineIs(const Instance::DebugLine& line, const std::u16string& text) {
    if (!line.written || text.size() >= Instance::DebugLineChars) return false;
    std::vector<char16_t> wanted(Instance::DebugLineChars, 0);
    std::copy(text.begin(), text.end(), wanted.begin());
    return line.buffer == wanted;
}

}  // namespace

// An expectation names its subject, or checks the result when its first operand is a value.
std::string parseExpect(Operands& in, Command& command) {
    if (!in.left()) return "expect needs a value";
    std::string word = in.peek()->quoted ? "" : in.peek()->word;
    for (auto [name, of] : Numbers)
        if (word == name) {
            in.word();
            ExpectNumber line;
            line.of = of;
            std::string error = oneInteger(in, "expect " + word, of == ExpectNumber::Of::Fetches,
                                           line.value);
            command = line;
            return error;
        }
    for (auto [name, parser] : Subjects)
        if (word == name) {
            in.word();
            return parser(in, command);
        }
    return parseResult(in, command);
}

std::string run(Session& s, const Step& step, const ExpectResult& line) {
    std::string why;
    if (lastEvent(s, why)) why = resultWhy(s, line);
    return s.checked(step, why);
}

std::string run(Session& s, const Step& step, const ExpectNumber& line) {
    return s.checked(step, fieldWhy(s, line));
}

std::string run(Session& s, const Step& step, const ExpectBuffers& line) {
    std::string why;
    const Outcome* o = lastEvent(s, why);
    if (o && o->bufferRequests != line.sizes)
        why = "expected buffer requests " + listed(line.sizes) + ", got " +
              listed(o->bufferRequests);
    return s.checked(step, why);
}

std::string run(Session& s, const Step& step, const ExpectAddress& line) {
    std::string why;
    const Outcome* o = lastEvent(s, why);
    if (o && o->textSource != line.place)
        why = std::string("expected the text result ") + placePhrase(line.place) + ", " +
              (o->isText ? std::string("found it ") + placePhrase(o->textSource)
                         : "got no text result");
    return s.checked(step, why);
}

std::string run(Session& s, const Step& step, const ExpectCurrentKey& line) {
    const char16_t* key = s.instance().currentKey();
    bool same = line.key ? key && *line.key == key : key == nullptr;
    std::string why;
    if (!same)
        why = "expected currentKey " + (line.key ? quote(*line.key) : "null") + ", got " +
              (key ? quote(key) : "null");
    return s.checked(step, why);
}

std::string run(Session& s, const Step& step, const ExpectSentence& line) {
    std::string why;
    if (!s.sentence)
        why = "expect sentence with no show line before it";
    else if (*s.sentence != line.text)
        why = "expected the sentence " + quote(line.text) + ", got " + quote(*s.sentence);
    return s.checked(step, why);
}

std::string run(Session& s, const Step& step, const ExpectDebug& line) {
    Instance::DebugLine shown = s.instance().debugLine(line.item);
    std::string why;
    if (!shown.sentinelsIntact)
        why = "GetDebugItem wrote past the 256-character line";
    else if (line.text ? !lineIs(shown, *line.text) : shown.written)
        why = "expected the debugger line " +
              (line.text ? quote(*line.text) + " padded with zeros" : "buffer untouched") +
              ", got " + shownLine(shown);
    return s.checked(step, why);
}

// debug: both lines of the debugger.
std::string run(Session& s, const Step& step, const Debug&) {
    std::string shown;
    for (int item : {0, 1}) {
        Instance::DebugLine line = s.instance().debugLine(item);
        if (!line.sentinelsIntact)
            return "sentinel hit: GetDebugItem wrote past the 256-character line";
        shown += (item ? " | " : "") + shownLine(line);
    }
    s.show(step, "=> " + shown);
    return std::string();
}

}  // namespace hv::script
