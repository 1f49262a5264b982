// Expectations: what an `expect` line can check, how its operands are read and how it is checked.
#include "script_internal.h"

namespace hv::script {

namespace {

// Reads exactly one integer operand (a non-negative one when `count` says it is a count).
std::string oneInteger(const std::vector<Token>& operands, Step& step, bool count) {
    std::string what = "expect " + step.subject;
    if (operands.empty() || operands[0].quoted) return what + " needs an integer";
    if (operands.size() > 1) return "stray text after " + what + " " + operands[0].word;
    Value value;
    value.kind = Value::Kind::Integer;
    std::string error = parseInteger(operands[0].word, value.integer);
    if (error.empty() && count && value.integer < 0) error = what + " needs a count";
    step.values.push_back(value);
    return error;
}

// Subjects with one integer, and with one count or a list of counts.
std::string parseInteger1(const std::vector<Token>& operands, Step& step) {
    return oneInteger(operands, step, false);
}

std::string parseCount(const std::vector<Token>& operands, Step& step) {
    return oneInteger(operands, step, true);
}

std::string parseCounts(const std::vector<Token>& operands, Step& step) {
    for (const Token& t : operands) {
        std::vector<Token> one{t};
        std::string error = oneInteger(one, step, true);
        if (!error.empty()) return error;
    }
    return std::string();
}

// A result value: a text, true, false or an integer.
std::string parseResult(const std::vector<Token>& operands, Step& step) {
    if (operands.empty()) return "expect result needs a value";
    if (operands.size() > 1)
        return "stray text '" + (operands[1].quoted ? quote(operands[1].text) : operands[1].word) +
               "'";
    Value value;
    const Token& t = operands[0];
    if (t.quoted) {
        value.kind = Value::Kind::Text;
        value.text = t.text;
    } else if (t.word == "true" || t.word == "false") {
        value.kind = Value::Kind::Boolean;
        value.boolean = t.word == "true";
    } else {
        value.kind = Value::Kind::Integer;
        std::string error = parseInteger(t.word, value.integer);
        if (!error.empty())
            return "expect takes a text, an integer, true, false or one of: error, message, "
                   "fetches, buffers, address, rootKeyIndex, currentKey, use64BitView, debug, file; not '" +
                   t.word + "'";
    }
    step.values.push_back(value);
    return std::string();
}

const char* const Places[] = {"currentKey", "buffer", "elsewhere"};

// One of the places a text result can lie in.
std::string parsePlace(const std::vector<Token>& operands, Step& step) {
    bool known = false;
    if (operands.size() == 1 && !operands[0].quoted)
        for (const char* p : Places) known = known || operands[0].word == p;
    if (!known) return "expect address takes currentKey, buffer or elsewhere";
    Value value;
    value.kind = Value::Kind::Word;
    value.word = operands[0].word;
    step.values.push_back(value);
    return std::string();
}

// A text, or null for none.
std::string parseTextOrNull(const std::vector<Token>& operands, Step& step) {
    bool ok = operands.size() == 1 && (operands[0].quoted || operands[0].word == "null");
    if (!ok) return "expect " + step.subject + " takes a text or null";
    Value value;
    value.kind = operands[0].quoted ? Value::Kind::Text : Value::Kind::Null;
    value.text = operands[0].text;
    step.values.push_back(value);
    return std::string();
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

// The last event returned exactly this text.
bool checkText(Session& s, const std::u16string& wanted, const std::string& what,
               std::string& why) {
    const Outcome& o = *s.last();
    if (o.isText && o.text == wanted) return true;
    why = "expected " + what + ", got " + got(s);
    return false;
}

// Integers compare at the width of the routine's result: 16 bits for actions, 32 otherwise.
bool checkResult(Session& s, const Step& step, std::string& why) {
    const Value& v = step.values[0];
    const Outcome& o = *s.last();
    if (v.kind == Value::Kind::Text) return checkText(s, v.text, quote(v.text), why);
    if (v.kind == Value::Kind::Boolean) {
        if (s.lastKind() == EventKind::Condition && o.asCondition() == (v.boolean ? 1 : 0))
            return true;
        why = std::string("expected ") + (v.boolean ? "true" : "false") + ", got " + got(s);
        return false;
    }
    auto wanted = static_cast<uint32_t>(v.integer);
    bool same = s.lastKind() == EventKind::Action
                    ? static_cast<uint16_t>(o.asAction()) == static_cast<uint16_t>(wanted)
                    : !o.isText && static_cast<uint32_t>(o.asInteger()) == wanted;
    if (!same) why = "expected " + std::to_string(v.integer) + ", got " + got(s);
    return same;
}

// A 32-bit field or count against the expected value.
bool checkNumber(const char* what, int64_t wanted, uint64_t actual, std::string& why) {
    if (static_cast<uint64_t>(static_cast<uint32_t>(wanted)) == actual) return true;
    why = std::string("expected ") + what + " " + std::to_string(wanted) + ", got " +
          std::to_string(actual);
    return false;
}

// The record fields, read at this build's offsets.
bool checkError(Session& s, const Step& step, std::string& why) {
    return checkNumber("lastError", step.values[0].integer, s.instance().lastError(), why);
}

bool checkRootKeyIndex(Session& s, const Step& step, std::string& why) {
    return checkNumber("rootKeyIndex", step.values[0].integer, s.instance().rootKeyIndex(), why);
}

bool checkUse64BitView(Session& s, const Step& step, std::string& why) {
    return checkNumber("use64BitView", step.values[0].integer, s.instance().use64BitView(), why);
}

// The host asks the system itself, so the check holds for every system's texts.
bool checkMessage(Session& s, const Step& step, std::string& why) {
    auto code = static_cast<uint32_t>(step.values[0].integer);
    std::u16string wanted = systemMessage(code);
    return checkText(
        s, wanted, "the system's message for " + std::to_string(code) + ", " + quote(wanted), why);
}

bool checkFetches(Session& s, const Step& step, std::string& why) {
    const Outcome& o = *s.last();
    return checkNumber("parameter fetches", step.values[0].integer,
                       o.parameterFetches + o.expressionFetches, why);
}

// Buffer sizes as "[1024 8]".
std::string listed(const std::vector<size_t>& sizes) {
    std::string out;
    for (size_t n : sizes) out += (out.empty() ? "" : " ") + std::to_string(n);
    return "[" + out + "]";
}

// The sizes asked of GetStringBuffer, in order.
bool checkBuffers(Session& s, const Step& step, std::string& why) {
    std::vector<size_t> wanted;
    for (const Value& v : step.values) wanted.push_back(static_cast<size_t>(v.integer));
    const std::vector<size_t>& asked = s.last()->bufferRequests;
    if (asked == wanted) return true;
    why = "expected buffer requests " + listed(wanted) + ", got " + listed(asked);
    return false;
}

// Which host or module block the text result lies in.
bool checkAddress(Session& s, const Step& step, std::string& why) {
    const Outcome& o = *s.last();
    static const char* const names[] = {"", "buffer", "currentKey", "elsewhere"};
    static const char* const phrases[] = {"", "in a lent buffer", "in currentKey", "elsewhere"};
    auto source = static_cast<size_t>(o.textSource);
    if (step.values[0].word == names[source]) return true;
    size_t wanted = 1;
    while (wanted < 3 && step.values[0].word != names[wanted]) ++wanted;
    why = std::string("expected the text result ") + phrases[wanted] + ", " +
          (o.isText ? std::string("found it ") + phrases[source] : "got no text result");
    return false;
}

// The record's current key, compared as text.
bool checkCurrentKey(Session& s, const Step& step, std::string& why) {
    const char16_t* key = s.instance().currentKey();
    const Value& v = step.values[0];
    bool same = v.kind == Value::Kind::Null ? key == nullptr : key && v.text == key;
    if (!same) why = "expected currentKey " + describe(v) + ", got " + (key ? quote(key) : "null");
    return same;
}

// A text operand.
std::string parseText(const std::vector<Token>& operands, Step& step) {
    if (operands.size() != 1 || !operands[0].quoted) return "expect " + step.subject + " needs a text";
    Value value;
    value.kind = Value::Kind::Text;
    value.text = operands[0].text;
    step.values.push_back(value);
    return std::string();
}

bool checkSentence(Session& s, const Step& step, std::string& why) {
    if (!s.sentence) {
        why = "expect sentence with no show line before it";
        return false;
    }
    bool same = *s.sentence == step.values[0].text;
    if (!same) why = "expected the sentence " + quote(step.values[0].text) + ", got " + quote(*s.sentence);
    return same;
}

const Subject Subjects[] = {
    {"result", true, parseResult, checkResult},
    {"error", false, parseInteger1, checkError},
    {"message", true, parseInteger1, checkMessage},
    {"fetches", true, parseCount, checkFetches},
    {"buffers", true, parseCounts, checkBuffers},
    {"address", true, parsePlace, checkAddress},
    {"rootKeyIndex", false, parseInteger1, checkRootKeyIndex},
    {"use64BitView", false, parseInteger1, checkUse64BitView},
    {"currentKey", false, parseTextOrNull, checkCurrentKey},
    {"sentence", false, parseText, checkSentence},
    {"debug", false, parseDebugExpect, checkDebug},
    {"file", false, parseFileExpect, checkFile},
};

}  // namespace

const Subject* findSubject(const std::string& name) {
    for (const Subject& s : Subjects)
        if (name == s.name) return &s;
    return nullptr;
}

}  // namespace hv::script
