// Parameter lines: the root-key parameter as the editor handles it, on one 16-byte record per
// script. `param init`, `param record`, `param fill`, `param edit STEPS`, `param string N` and
// `param expect ...`; docs/scripts.md describes them.
#include <hivelet/param_editor.h>

#include <algorithm>
#include <iterator>

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

ParamState& Session::param() {
    if (!param_) param_ = std::make_shared<ParamState>(module_);
    return *param_;
}

namespace {

// An integer operand.
int64_t integerOperand(const Token* t) {
    if (t->quoted) refuse("expected an integer, not " + quote(t->text));
    int64_t value = 0;
    refuseIf(parseInteger(t->word, value));
    return value;
}

// The words of the scripted user's steps.
const std::pair<const char*, UserStep::Action> StepWords[] = {
    {"select", UserStep::Action::Select}, {"double", UserStep::Action::DoubleClick},
    {"wait", UserStep::Action::Wait},     {"ok", UserStep::Action::Ok},
    {"cancel", UserStep::Action::Cancel}, {"enter", UserStep::Action::Enter},
    {"escape", UserStep::Action::Escape}, {"close", UserStep::Action::CloseBox}};

// param edit STEP...: select N, double N, ok, cancel, enter, escape, close, wait MS.
Command parseEdit(Operands& in) {
    ParamEdit edit;
    while (const Token* t = in.next()) {
        if (t->quoted) refuse("a dialog step is a word, not " + quote(t->text));
        const std::string& w = t->word;
        auto known = std::find_if(std::begin(StepWords), std::end(StepWords),
                                  [&](const auto& s) { return w == s.first; });
        if (known == std::end(StepWords))
            refuse("unknown dialog step '" + w +
                   "' (select N, double N, ok, cancel, enter, escape, close or wait MS)");
        UserStep step{known->second, 0};
        if (w == "select" || w == "double" || w == "wait") {
            const Token* n = in.next();
            if (!n) refuse(w + (w == "wait" ? " needs milliseconds" : " needs a list position"));
            step.index = static_cast<int>(integerOperand(n));
        }
        edit.steps.push_back(step);
    }
    return edit;
}

const char* const ExpectUsage =
    "param expect takes index N, result N, selection N|none, items \"...\"..., caption \"...\", "
    "open yes|no..., ranout yes|no, text \"...\", untouched or bytes \"hex\"";

const std::pair<const char*, ParamExpect::What> ExpectWords[] = {
    {"index", ParamExpect::What::Index},         {"result", ParamExpect::What::Result},
    {"selection", ParamExpect::What::Selection}, {"items", ParamExpect::What::Items},
    {"caption", ParamExpect::What::Caption},     {"text", ParamExpect::What::Text},
    {"bytes", ParamExpect::What::Bytes},         {"open", ParamExpect::What::Open},
    {"ranout", ParamExpect::What::RanOut},       {"untouched", ParamExpect::What::Untouched}};

// The operands of `param expect WHAT`, by the kind of value WHAT takes.
void parseExpectOperands(Operands& in, const std::string& what, ParamExpect& line) {
    using What = ParamExpect::What;
    size_t n = in.left();
    switch (line.what) {
        case What::Index:
        case What::Result:
        case What::Selection:
            if (n != 1) refuse(ExpectUsage);
            if (line.what == What::Selection && in.peek()->word == "none" && !in.peek()->quoted)
                line.number = LB_ERR;
            else
                line.number = integerOperand(in.next());
            return;
        case What::Items:
        case What::Caption:
        case What::Text:
        case What::Bytes:
            if (n == 0 || (line.what != What::Items && n != 1)) refuse(ExpectUsage);
            while (in.left()) line.texts.push_back(in.text(what + " takes texts in quotes"));
            if (line.what == What::Bytes) line.bytes = parseHex(line.texts[0]);
            return;
        case What::Open:
        case What::RanOut:
            if (n == 0 || (line.what == What::RanOut && n != 1)) refuse(ExpectUsage);
            for (std::string w; in.left(); line.flags.push_back(w == "yes"))
                if (w = in.word(); w != "yes" && w != "no") refuse(what + " takes yes or no");
            return;
        default:
            if (n) refuse(ExpectUsage);
    }
}

Command parseExpectLine(Operands& in) {
    std::string what = in.word();
    auto known = std::find_if(std::begin(ExpectWords), std::end(ExpectWords),
                              [&](const auto& w) { return what == w.first; });
    if (known == std::end(ExpectWords)) refuse(ExpectUsage);
    ParamExpect line;
    line.what = known->second;
    parseExpectOperands(in, what, line);
    return line;
}

std::string whatWord(ParamExpect::What what) {
    for (auto [word, known] : ExpectWords)
        if (known == what) return word;
    return std::string();
}

std::string texts(const std::vector<std::u16string>& items) {
    std::string out;
    for (const auto& t : items) out += (out.empty() ? "" : " ") + quote(t);
    return out;
}

std::string yesNo(const std::vector<bool>& flags) {
    std::string out;
    for (bool f : flags) out += (out.empty() ? "" : " ") + std::string(f ? "yes" : "no");
    return out.empty() ? "(no step)" : out;
}

std::string selectionText(int64_t selection) {
    return selection == LB_ERR ? "none" : std::to_string(selection);
}

// Why the record, the dialog or the name copy is not as expected, or "".
std::string why(const ParamExpect& line, const ParamState& s) {
    using What = ParamExpect::What;
    const DialogSeen& seen = s.seen;
    const ParamEditor& param = s.param;
    switch (line.what) {
        case What::Index:
            return unless(param.rootIndex() == static_cast<uint32_t>(line.number),
                          "the record's index " +
                              std::to_string(static_cast<uint32_t>(line.number)),
                          std::to_string(param.rootIndex()));
        case What::Bytes:
            return unless(param.recordBytes() == line.bytes, "the record " + hexList(line.bytes),
                          hexList(param.recordBytes()));
        case What::Text:
        case What::Untouched:
            if (!s.copied)
                return "param expect " + whatWord(line.what) +
                       " needs a param string line before it";
            if (line.what == What::Untouched)
                return unless(s.text.untouched, "the buffer untouched", quote(s.text.text));
            if (s.text.untouched)
                return "expected " + quote(line.texts[0]) + ", the buffer was untouched";
            return unless(s.text.text == line.texts[0], quote(line.texts[0]), quote(s.text.text));
        default: break;
    }
    if (!s.edited)
        return "param expect " + whatWord(line.what) + " needs a param edit line before it";
    switch (line.what) {
        case What::Result:
            return unless(s.result == line.number,
                          "the dialog's result " + std::to_string(line.number),
                          std::to_string(s.result));
        case What::Selection:
            return unless(seen.initialSelection == line.number,
                          "the initial selection " + selectionText(line.number),
                          selectionText(seen.initialSelection));
        case What::Caption:
            return unless(seen.caption == line.texts[0], "the caption " + quote(line.texts[0]),
                          quote(seen.caption));
        case What::Items:
            return unless(seen.items == line.texts, "the items " + texts(line.texts),
                          texts(seen.items));
        case What::Open:
            return unless(seen.openAfter == line.flags,
                          "open after each step: " + yesNo(line.flags), yesNo(seen.openAfter));
        default:
            return unless(seen.ranOut == line.flags[0], "ranout " + yesNo(line.flags),
                          yesNo({seen.ranOut}));
    }
}

}  // namespace

Command parseParam(Operands& in) {
    std::string verb = in.word();
    if (verb == "init" && in.left()) refuse("stray text after param init");
    if (verb == "init") return ParamInit{};
    if (verb == "edit") return parseEdit(in);
    if (verb == "expect") return parseExpectLine(in);
    if (verb != "record" && verb != "fill" && verb != "string")
        refuse("param takes init, record, fill, edit, string or expect");
    if (in.left() != 1) refuse("param " + verb + " takes one value");
    if (verb == "fill") return ParamRecord{true, static_cast<uint32_t>(integerOperand(in.peek()))};
    if (verb == "string") return ParamString{static_cast<Slot>(integerOperand(in.peek()))};
    Argument value = parseArgument(*in.peek());
    if (value.lastResult || value.value.kind != Param::Kind::RootKey)
        refuse("param record takes a root key name or root:N");
    return ParamRecord{false, value.value.rootIndex};
}

void run(Session& session, const Step& step, const ParamInit&) {
    ParamEditor& param = session.param().param;
    param.init();
    session.show(step, "=> " + hexList(param.recordBytes()));
    if (!param.recordIntact()) refuse("sentinel hit after the record");
}

void run(Session& session, const Step& step, const ParamRecord& line) {
    ParamEditor& param = session.param().param;
    if (line.fill)
        param.fillRecord(static_cast<uint8_t>(line.value));
    else
        param.setRecord(line.value);
    session.show(step, hexList(param.recordBytes()));
}

void run(Session& session, const Step& step, const ParamEdit& line) {
    ParamState& s = session.param();
    s.result = s.param.edit(line.steps, &s.seen);
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
    if (seen.forced) refuse("the dialog stayed open after Cancel");
    if (!s.param.recordIntact()) refuse("sentinel hit after the record");
}

void run(Session& session, const Step& step, const ParamString& line) {
    ParamState& s = session.param();
    s.text = s.param.string(line.capacity);
    s.copied = true;
    session.show(step, s.text.untouched ? "=> buffer untouched" : "=> " + quote(s.text.text));
    if (!s.text.intact) refuse("sentinel hit: written past the capacity");
}

void run(Session& session, const Step& step, const ParamExpect& line) {
    session.checked(step, why(line, session.param()));
}

}  // namespace hv::script
