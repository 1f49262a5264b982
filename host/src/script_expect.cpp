// Expectations: what an `expect` line can check, how its operands are read and how it is checked.
#include <algorithm>

#include "internal.h"
#include "script_internal.h"

namespace hv::script {

namespace {

// Reads exactly one integer operand (a non-negative one when `count` says it is a count).
int64_t oneInteger(Operands& in, const std::string& what, bool count) {
    if (in.left() > 1 && !in.peek()->quoted) refuse("stray text after " + what + " " + in.word());
    int64_t value = in.integer(what + " needs an integer");
    if (count && value < 0) refuse(what + " needs a count");
    return value;
}

// expect VALUE: a text, true, false or an integer.
Command parseResult(Operands& in) {
    const Token* t = in.next();
    in.end();
    ExpectResult line;
    int64_t n = 0;
    if (t->quoted)
        line.value = t->text;
    else if (t->word == "true" || t->word == "false")
        line.value = t->word == "true";
    else if (parseInteger(t->word, n).empty())
        line.value = n;
    else
        refuse(
            "expect takes a text, an integer, true, false or one of: error, message, fetches, "
            "buffers, address, rootKeyIndex, currentKey, use64BitView, debug, file; not '" +
            t->word + "'");
    return line;
}

// expect buffers N...
Command parseBuffers(Operands& in) {
    ExpectBuffers line;
    while (in.left()) {
        Operands one({*in.next()});
        line.sizes.push_back(static_cast<size_t>(oneInteger(one, "expect buffers", true)));
    }
    return line;
}

const std::pair<const char*, Outcome::TextSource> Places[] = {
    {"currentKey", Outcome::TextSource::CurrentKey},
    {"buffer", Outcome::TextSource::LentBuffer},
    {"elsewhere", Outcome::TextSource::Elsewhere}};

// expect address currentKey|buffer|elsewhere
Command parseAddress(Operands& in) {
    std::string word = in.left() == 1 ? in.word() : "";
    for (auto [name, place] : Places)
        if (word == name) return ExpectAddress{place};
    refuse("expect address takes currentKey, buffer or elsewhere");
}

// expect currentKey "text" | null, expect sentence "text"
Command parseText(Operands& in, bool sentence) {
    const Token* t = in.left() == 1 ? in.next() : nullptr;
    if (!t || (!t->quoted && (sentence || t->word != "null")))
        refuse(sentence ? "expect sentence needs a text"
                        : "expect currentKey takes a text or null");
    return ExpectText{sentence, t->quoted ? quote(t->text) : "null"};
}

// expect debug ITEM "text" | untouched
Command parseDebug(Operands& in) {
    const Token* item = in.peek();
    const Token* text = in.peek(1);
    if (in.left() != 2 || item->quoted || (!text->quoted && text->word != "untouched"))
        refuse("expect debug takes an item number and a text in quotes or untouched");
    ExpectDebug line;
    line.item = static_cast<int32_t>(in.integer(""));
    if (text->quoted) line.text = text->text;
    return line;
}

const std::pair<const char*, Parser> Subjects[] = {
    {"buffers", parseBuffers},
    {"address", parseAddress},
    {"currentKey", [](Operands& in) { return parseText(in, false); }},
    {"sentence", [](Operands& in) { return parseText(in, true); }},
    {"debug", parseDebug},
    {"file", [](Operands& in) -> Command { return parseFileBytes(in, true); }},
};

// The subjects that take one integer.
const std::pair<const char*, ExpectNumber::Of> Numbers[] = {
    {"error", ExpectNumber::Of::LastError},
    {"message", ExpectNumber::Of::Message},
    {"fetches", ExpectNumber::Of::Fetches},
    {"rootKeyIndex", ExpectNumber::Of::RootKeyIndex},
    {"use64BitView", ExpectNumber::Of::Use64BitView}};

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
    const Outcome& o = s.lastEvent();
    return unless(o.isText && o.text == wanted, what, got(s));
}

// A 32-bit field or count against the expected value.
std::string numberWhy(const char* what, int64_t wanted, uint64_t actual) {
    return unless(static_cast<uint64_t>(static_cast<uint32_t>(wanted)) == actual,
                  what + (" " + std::to_string(wanted)), std::to_string(actual));
}

// Buffer sizes as "[1024 8]".
std::string listed(const std::vector<size_t>& sizes) {
    std::string out;
    for (size_t n : sizes) out += (out.empty() ? "" : " ") + std::to_string(n);
    return "[" + out + "]";
}

// Where a text result lies, as messages say it.
const char* placePhrase(Outcome::TextSource place) {
    static const char* const Phrases[] = {"", "in a lent buffer", "in currentKey", "elsewhere"};
    return Phrases[static_cast<size_t>(place)];
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
Command parseExpect(Operands& in) {
    if (!in.left()) refuse("expect needs a value");
    std::string word = in.peek()->quoted ? "" : in.peek()->word;
    for (auto [name, of] : Numbers)
        if (word == name) {
            in.word();
            return ExpectNumber{of,
                                oneInteger(in, "expect " + word, of == ExpectNumber::Of::Fetches)};
        }
    for (auto [name, parser] : Subjects)
        if (word == name) {
            in.word();
            return parser(in);
        }
    return parseResult(in);
}

// Integers compare at the width of the routine's result: 16 bits for actions, 32 otherwise.
void run(Session& s, const Step& step, const ExpectResult& line) {
    const Outcome& o = s.lastEvent();
    if (auto* text = std::get_if<std::u16string>(&line.value))
        return s.checked(step, textWhy(s, *text, quote(*text)));
    if (auto* truth = std::get_if<bool>(&line.value))
        return s.checked(step, unless(s.lastKind() == EventKind::Condition &&
                                          o.asCondition() == (*truth ? 1 : 0),
                                      *truth ? "true" : "false", got(s)));
    int64_t n = std::get<int64_t>(line.value);
    auto wanted = static_cast<uint32_t>(n);
    bool same = s.lastKind() == EventKind::Action
                    ? static_cast<uint16_t>(o.asAction()) == static_cast<uint16_t>(wanted)
                    : !o.isText && static_cast<uint32_t>(o.asInteger()) == wanted;
    return s.checked(step, unless(same, std::to_string(n), got(s)));
}

// The system's message is asked for here, so the check holds for every system's texts.
void run(Session& s, const Step& step, const ExpectNumber& line) {
    Instance& instance = s.instance();
    switch (line.of) {
        case ExpectNumber::Of::LastError:
            return s.checked(step, numberWhy("lastError", line.value, instance.lastError()));
        case ExpectNumber::Of::RootKeyIndex:
            return s.checked(step, numberWhy("rootKeyIndex", line.value, instance.rootKeyIndex()));
        case ExpectNumber::Of::Use64BitView:
            return s.checked(step, numberWhy("use64BitView", line.value, instance.use64BitView()));
        case ExpectNumber::Of::Fetches: {
            const Outcome& o = s.lastEvent();
            return s.checked(step, numberWhy("parameter fetches", line.value,
                                             o.parameterFetches + o.expressionFetches));
        }
        default: break;
    }
    auto code = static_cast<uint32_t>(line.value);
    std::u16string wanted = systemMessage(code);
    return s.checked(
        step, textWhy(s, wanted,
                      "the system's message for " + std::to_string(code) + ", " + quote(wanted)));
}

void run(Session& s, const Step& step, const ExpectBuffers& line) {
    const std::vector<size_t>& asked = s.lastEvent().bufferRequests;
    s.checked(step,
              unless(asked == line.sizes, "buffer requests " + listed(line.sizes), listed(asked)));
}

void run(Session& s, const Step& step, const ExpectAddress& line) {
    const Outcome& o = s.lastEvent();
    std::string why;
    if (o.textSource != line.place)
        why = std::string("expected the text result ") + placePhrase(line.place) + ", " +
              (o.isText ? std::string("found it ") + placePhrase(o.textSource)
                        : "got no text result");
    s.checked(step, why);
}

void run(Session& s, const Step& step, const ExpectText& line) {
    const char16_t* key = s.instance().currentKey();
    if (line.sentence && !s.sentence) refuse("expect sentence with no show line before it");
    std::string actual = line.sentence ? quote(*s.sentence) : key ? quote(key) : "null";
    s.checked(step,
              unless(actual == line.wanted,
                     (line.sentence ? "the sentence " : "currentKey ") + line.wanted, actual));
}

void run(Session& s, const Step& step, const ExpectDebug& line) {
    Instance::DebugLine shown = s.instance().debugLine(line.item);
    if (!shown.sentinelsIntact) refuse("GetDebugItem wrote past the 256-character line");
    bool same = line.text ? lineIs(shown, *line.text) : !shown.written;
    std::string wanted = line.text ? quote(*line.text) + " padded with zeros" : "buffer untouched";
    s.checked(step, unless(same, "the debugger line " + wanted, shownLine(shown)));
}

// debug: both lines of the debugger.
void run(Session& s, const Step& step, const Debug&) {
    std::string shown;
    for (int item : {0, 1}) {
        Instance::DebugLine line = s.instance().debugLine(item);
        if (!line.sentinelsIntact)
            refuse("sentinel hit: GetDebugItem wrote past the 256-character line");
        shown += (item ? " | " : "") + shownLine(line);
    }
    s.show(step, "=> " + shown);
}

}  // namespace hv::script
