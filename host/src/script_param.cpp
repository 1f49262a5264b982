// Parameter lines: the root-key parameter as the editor handles it, on one 16-byte record per
// script. `param init`, `param record`, `param fill`, `param edit STEPS`, `param string N` and
// `param expect ...`; docs/scripts.md describes them.
#include <hivelet/param_editor.h>

#include <cctype>
#include <cstdio>

#include "internal.h"
#include "script_internal.h"

namespace hv::script {

// The record, the editor structure and what the last dialog and name copy gave.
struct ParamState {
    explicit ParamState(Module& module) : param(module, editor) {}
    Editor editor;
    ParamEditor param;
    bool edited = false;
    Slot result = 0;
    DialogSeen seen;
    bool copied = false;
    ParamEditor::Text text;
};

namespace {

Value word(const std::string& w) {
    Value v;
    v.kind = Value::Kind::Word;
    v.word = w;
    return v;
}

std::string integerOperand(const Token& t, Value& out) {
    out.kind = Value::Kind::Integer;
    if (t.quoted) return "expected an integer, not " + quote(t.text);
    return parseInteger(t.word, out.integer);
}

// Steps of the scripted user: select N, double N, ok, cancel, enter, escape, close.
std::string parseSteps(const std::vector<Token>& ops, size_t from, Step& step) {
    for (size_t i = from; i < ops.size(); ++i) {
        const std::string& w = ops[i].word;
        if (ops[i].quoted) return "a dialog step is a word, not " + quote(ops[i].text);
        step.values.push_back(word(w));
        if (w == "select" || w == "double" || w == "wait") {
            if (++i == ops.size()) return w + (w == "wait" ? " needs milliseconds" : " needs a list position");
            Value n;
            if (std::string e = integerOperand(ops[i], n); !e.empty()) return e;
            step.values.push_back(n);
        } else if (w != "ok" && w != "cancel" && w != "enter" && w != "escape" && w != "close") {
            return "unknown dialog step '" + w +
                   "' (select N, double N, ok, cancel, enter, escape, close or wait MS)";
        }
    }
    return std::string();
}

std::vector<UserStep> stepsOf(const Step& step) {
    std::vector<UserStep> steps;
    for (size_t i = 0; i < step.values.size(); ++i) {
        const std::string& w = step.values[i].word;
        if (w == "select" || w == "double" || w == "wait") {
            auto n = static_cast<int>(step.values[++i].integer);
            steps.push_back(w == "select" ? UserStep::select(n)
                            : w == "double" ? UserStep::doubleClick(n) : UserStep::wait(n));
        }
        if (w == "ok") steps.push_back(UserStep::ok());
        if (w == "cancel") steps.push_back(UserStep::cancel());
        if (w == "enter") steps.push_back(UserStep::enter());
        if (w == "escape") steps.push_back(UserStep::escape());
        if (w == "close") steps.push_back(UserStep::closeBox());
    }
    return steps;
}

// Hex bytes written in pairs, blanks between them allowed.
std::string parseBytes(const std::u16string& text, std::vector<uint8_t>& out) {
    std::string digits;
    for (char16_t c : text) {
        if (c == u' ') continue;
        if (c > 0x7F || !std::isxdigit(static_cast<int>(c))) return "bad hex digit in bytes";
        digits.push_back(static_cast<char>(c));
    }
    if (digits.size() % 2) return "bytes take pairs of hex digits";
    for (size_t i = 0; i < digits.size(); i += 2)
        out.push_back(static_cast<uint8_t>(std::stoi(digits.substr(i, 2), nullptr, 16)));
    return std::string();
}

const char* const ExpectUsage =
    "param expect takes index N, result N, selection N|none, items \"...\"..., caption \"...\", "
    "open yes|no..., ranout yes|no, text \"...\", untouched or bytes \"hex\"";

std::string parseExpectLine(const std::vector<Token>& ops, Step& step) {
    if (ops.size() < 2 || ops[1].quoted) return ExpectUsage;
    step.text = ops[1].word;
    const std::string& what = step.text;
    std::vector<Token> rest(ops.begin() + 2, ops.end());
    if (what == "index" || what == "result") {
        if (rest.size() != 1) return ExpectUsage;
        Value n;
        std::string e = integerOperand(rest[0], n);
        step.values.push_back(n);
        return e;
    }
    if (what == "selection") {
        if (rest.size() != 1) return ExpectUsage;
        if (!rest[0].quoted && rest[0].word == "none") {
            step.values.push_back(integerValue(LB_ERR));
            return std::string();
        }
        Value n;
        std::string e = integerOperand(rest[0], n);
        step.values.push_back(n);
        return e;
    }
    if (what == "items" || what == "caption" || what == "text" || what == "bytes") {
        if (rest.empty() || (what != "items" && rest.size() != 1)) return ExpectUsage;
        for (const Token& t : rest) {
            if (!t.quoted) return what + " takes texts in quotes";
            Value v;
            v.kind = Value::Kind::Text;
            v.text = t.text;
            step.values.push_back(v);
        }
        std::vector<uint8_t> ignored;
        return what == "bytes" ? parseBytes(rest[0].text, ignored) : std::string();
    }
    if (what == "open" || what == "ranout") {
        if (rest.empty() || (what == "ranout" && rest.size() != 1)) return ExpectUsage;
        for (const Token& t : rest) {
            if (t.quoted || (t.word != "yes" && t.word != "no")) return what + " takes yes or no";
            step.values.push_back(word(t.word));
        }
        return std::string();
    }
    if (what == "untouched") return rest.empty() ? std::string() : ExpectUsage;
    return ExpectUsage;
}

ParamState& stateOf(Session& session) {
    if (!session.param) session.param = std::make_shared<ParamState>(session.module());
    return *session.param;
}

std::string hexBytes(const std::vector<uint8_t>& bytes) {
    std::string out;
    char two[4];
    for (uint8_t b : bytes) {
        std::snprintf(two, sizeof two, "%02x", b);
        out += (out.empty() ? "" : " ") + std::string(two);
    }
    return out;
}

std::string yesNo(const std::vector<bool>& flags) {
    std::string out;
    for (bool f : flags) out += (out.empty() ? "" : " ") + std::string(f ? "yes" : "no");
    return out.empty() ? "(no step)" : out;
}

std::string texts(const std::vector<std::u16string>& items) {
    std::string out;
    for (const auto& t : items) out += (out.empty() ? "" : " ") + quote(t);
    return out;
}

std::string selectionText(int selection) {
    return selection == LB_ERR ? "none" : std::to_string(selection);
}

bool runEdit(Session& session, const Step& step, ParamState& s) {
    s.result = s.param.edit(stepsOf(step), &s.seen);
    s.edited = true;
    const DialogSeen& seen = s.seen;
    std::string detail = "=> " + std::to_string(s.result) + "   (index " +
                         std::to_string(s.param.rootIndex());
    if (seen.appeared)
        detail += "; saw " + quote(seen.caption) + ", " + std::to_string(seen.items.size()) +
                  " items, selection " + selectionText(seen.initialSelection) +
                  "; open after each step: " + yesNo(seen.openAfter);
    else
        detail += "; no dialog appeared";
    if (seen.ranOut) detail += "; steps ran out, left with Cancel";
    session.show(step, detail + ")");
    if (seen.forced) return session.fail(step, "the dialog stayed open after Cancel");
    if (!s.param.recordIntact()) return session.fail(step, "sentinel hit after the record");
    return true;
}

bool runString(Session& session, const Step& step, ParamState& s) {
    s.text = s.param.string(static_cast<Slot>(step.values[0].integer));
    s.copied = true;
    session.show(step, s.text.untouched ? "=> buffer untouched" : "=> " + quote(s.text.text));
    if (!s.text.intact) return session.fail(step, "sentinel hit: written past the capacity");
    return true;
}

// The check of one `param expect` line; "" when it holds.
std::string check(const Step& step, ParamState& s) {
    const std::string& what = step.text;
    const std::vector<Value>& v = step.values;
    if (what == "index") {
        auto want = static_cast<uint32_t>(v[0].integer);
        if (s.param.rootIndex() != want)
            return "expected the record's index " + std::to_string(want) + ", got " +
                   std::to_string(s.param.rootIndex());
        return std::string();
    }
    if (what == "bytes") {
        std::vector<uint8_t> want;
        parseBytes(v[0].text, want);
        if (s.param.recordBytes() != want)
            return "expected the record [" + hexBytes(want) + "], got [" +
                   hexBytes(s.param.recordBytes()) + "]";
        return std::string();
    }
    if (what == "text" || what == "untouched") {
        if (!s.copied) return "param expect " + what + " needs a param string line before it";
        if (what == "untouched")
            return s.text.untouched ? std::string() : "expected the buffer untouched, got " +
                                                          quote(s.text.text);
        if (s.text.untouched) return "expected " + quote(v[0].text) + ", the buffer was untouched";
        return s.text.text == v[0].text ? std::string()
                                        : "expected " + quote(v[0].text) + ", got " +
                                              quote(s.text.text);
    }
    if (!s.edited) return "param expect " + what + " needs a param edit line before it";
    const DialogSeen& seen = s.seen;
    if (what == "result")
        return s.result == v[0].integer ? std::string()
                                        : "expected the dialog's result " +
                                              std::to_string(v[0].integer) + ", got " +
                                              std::to_string(s.result);
    if (what == "selection")
        return seen.initialSelection == v[0].integer
                   ? std::string()
                   : "expected the initial selection " +
                         selectionText(static_cast<int>(v[0].integer)) + ", saw " +
                         selectionText(seen.initialSelection);
    if (what == "caption")
        return seen.caption == v[0].text ? std::string()
                                         : "expected the caption " + quote(v[0].text) +
                                               ", saw " + quote(seen.caption);
    if (what == "items") {
        std::vector<std::u16string> want;
        for (const Value& t : v) want.push_back(t.text);
        return seen.items == want ? std::string()
                                  : "expected the items " + texts(want) + ", saw " +
                                        texts(seen.items);
    }
    if (what == "open") {
        std::vector<bool> want;
        for (const Value& f : v) want.push_back(f.word == "yes");
        return seen.openAfter == want ? std::string()
                                      : "expected open after each step: " + yesNo(want) +
                                            ", got " + yesNo(seen.openAfter);
    }
    bool ranOut = v[0].word == "yes";
    return seen.ranOut == ranOut ? std::string()
                                 : std::string("expected the steps ") +
                                       (ranOut ? "to run out" : "not to run out") +
                                       ", they did" + (seen.ranOut ? "" : " not");
}

}  // namespace

std::string parseParam(const std::vector<Token>& ops, Step& step) {
    const char* usage = "param takes init, record, fill, edit, string or expect";
    if (ops.empty() || ops[0].quoted) return usage;
    step.subject = ops[0].word;
    const std::string& verb = step.subject;
    if (verb == "init") return ops.size() == 1 ? std::string() : "stray text after param init";
    if (verb == "edit") return parseSteps(ops, 1, step);
    if (verb == "expect") return parseExpectLine(ops, step);
    if (verb == "record" || verb == "fill" || verb == "string") {
        if (ops.size() != 2) return "param " + verb + " takes one value";
        Value v;
        std::string e = verb == "record" ? parseParameter(ops[1], v) : integerOperand(ops[1], v);
        if (!e.empty()) return e;
        if (verb == "record" && v.kind != Value::Kind::RootKey && v.kind != Value::Kind::Integer)
            return "param record takes a root key name or an index";
        step.values.push_back(v);
        return std::string();
    }
    return usage;
}

bool runParam(Session& session, const Step& step) {
    ParamState& s = stateOf(session);
    const std::string& verb = step.subject;
    if (verb == "init") {
        s.param.init();
        session.show(step, "=> [" + hexBytes(s.param.recordBytes()) + "]");
        return s.param.recordIntact() || session.fail(step, "sentinel hit after the record");
    }
    if (verb == "record" || verb == "fill") {
        auto n = static_cast<uint32_t>(step.values[0].integer);
        if (verb == "record") s.param.setRecord(n);
        else s.param.fillRecord(static_cast<uint8_t>(n));
        session.show(step, "[" + hexBytes(s.param.recordBytes()) + "]");
        return true;
    }
    if (verb == "edit") return runEdit(session, step, s);
    if (verb == "string") return runString(session, step, s);
    ++session.expectations;
    std::string why = check(step, s);
    if (!why.empty()) return session.fail(step, why);
    session.show(step, "ok");
    return true;
}

}  // namespace hv::script
