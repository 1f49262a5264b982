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

// param expect WHAT VALUE...: the value is kept as `shown` below writes what it checks, so that
// one comparison serves every check.
Command parseExpectLine(Operands& in) {
    using What = ParamExpect::What;
    std::string what = in.word();
    auto known = std::find_if(std::begin(ExpectWords), std::end(ExpectWords),
                              [&](const auto& w) { return what == w.first; });
    if (known == std::end(ExpectWords)) refuse(ExpectUsage);
    ParamExpect line{known->second, "untouched"};
    size_t n = in.left();
    std::vector<std::u16string> list;
    std::vector<bool> flags;
    switch (line.what) {
        case What::Index:
        case What::Result:
        case What::Selection:
            if (n != 1) refuse(ExpectUsage);
            if (line.what == What::Selection && !in.peek()->quoted && in.peek()->word == "none")
                line.wanted = "none";
            else if (int64_t number = integerOperand(in.next()); line.what == What::Index)
                line.wanted = std::to_string(static_cast<uint32_t>(number));
            else
                line.wanted =
                    line.what == What::Result ? std::to_string(number) : selectionText(number);
            break;
        case What::Items:
        case What::Caption:
        case What::Text:
        case What::Bytes:
            if (n == 0 || (line.what != What::Items && n != 1)) refuse(ExpectUsage);
            while (in.left()) list.push_back(in.text(what + " takes texts in quotes"));
            line.wanted = line.what == What::Bytes ? hexList(parseHex(list[0])) : texts(list);
            break;
        case What::Open:
        case What::RanOut:
            if (n == 0 || (line.what == What::RanOut && n != 1)) refuse(ExpectUsage);
            for (std::string w; in.left(); flags.push_back(w == "yes"))
                if (w = in.word(); w != "yes" && w != "no") refuse(what + " takes yes or no");
            line.wanted = yesNo(flags);
            break;
        default:
            if (n) refuse(ExpectUsage);
    }
    return line;
}

// What the record, the dialog or the name copy shows, as a param expect line writes it.
std::string shown(ParamExpect::What what, const ParamState& s) {
    using What = ParamExpect::What;
    const DialogSeen& seen = s.seen;
    switch (what) {
        case What::Index: return std::to_string(s.param.rootIndex());
        case What::Bytes: return hexList(s.param.recordBytes());
        case What::Text:
        case What::Untouched: return s.text.untouched ? "untouched" : quote(s.text.text);
        case What::Result: return std::to_string(s.result);
        case What::Selection: return selectionText(seen.initialSelection);
        case What::Caption: return quote(seen.caption);
        case What::Items: return texts(seen.items);
        case What::Open: return yesNo(seen.openAfter);
        default: return yesNo({seen.ranOut});
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
    std::string detail =
        "=> " + std::to_string(s.result) + "   (index " + std::to_string(s.param.rootIndex());
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

// The checks of the name copy need a param string line before them, those of the dialog a param
// edit line; a text is checked as the name copy shows it, untouched or not.
void run(Session& session, const Step& step, const ParamExpect& line) {
    using What = ParamExpect::What;
    ParamState& s = session.param();
    bool copy = line.what == What::Text || line.what == What::Untouched;
    bool dialog = !copy && line.what != What::Index && line.what != What::Bytes;
    if ((copy && !s.copied) || (dialog && !s.edited))
        refuse("param expect " + whatWord(line.what) + " needs a param " +
               (copy ? "string" : "edit") + " line before it");
    std::string actual = shown(line.what, s);
    session.checked(step,
                    unless(actual == line.wanted,
                           (copy ? "text" : whatWord(line.what)) + " " + line.wanted, actual));
}

}  // namespace hv::script
