// The hivelet-host command line, and what its commands print: the editor's view of the
// catalogue for people (menus) and as JSON for the tools that describe the module to authors
// (catalogue, read by the help file's generator).
#include <hivelet/catalogue.h>

#include <fstream>
#include <functional>
#include <iterator>
#include <ostream>
#include <stdexcept>

#include "internal.h"
#include "script_internal.h"

namespace hv::script {

namespace {

typedef LPCWSTR(WINAPI* HelpFileFn)();

const std::pair<EventKind, const char*> Menus[] = {{EventKind::Condition, "Conditions"},
                                                   {EventKind::Action, "Actions"},
                                                   {EventKind::Expression, "Expressions"}};

// The module's own error codes, whose messages it keeps in its resources.
const uint32_t OwnErrorCodes[] = {40, 41, 42};

// The name of a parameter type of the catalogue, or "type N".
std::string paramTypeName(int16_t type) {
    const std::pair<int16_t, const char*> names[] = {
        {1000, "root key"}, {45, "text"}, {22, "integer"}, {3, "text argument"}};
    for (auto [code, name] : names)
        if (type == code) return name;
    return "type " + std::to_string(type);
}

// Visits every item of a menu tree depth first, each with the texts of the popups above it.
using Visit = std::function<void(const MenuEntry&, const std::vector<std::u16string>& path)>;

void walk(const std::vector<MenuEntry>& items, std::vector<std::u16string>& path,
          const Visit& visit) {
    for (const MenuEntry& item : items) {
        visit(item, path);
        if (item.kind != MenuEntry::Kind::Popup) continue;
        path.push_back(item.text);
        walk(item.items, path, visit);
        path.pop_back();
    }
}

// The event a command item leads to, with its parameter titles; nullopt when the item maps to
// none (`code` then holds what the module answered).
struct MenuEvent {
    EventEntry entry;
    std::u16string text;
    std::vector<std::u16string> titles;
};

std::optional<MenuEvent> eventOf(Catalogue& catalogue, EventKind kind, uint32_t id, int& code) {
    code = catalogue.codeFromMenu(kind, id);
    std::optional<EventEntry> entry = code >= 0 ? catalogue.entry(kind, code) : std::nullopt;
    if (!entry) return std::nullopt;
    MenuEvent event{*entry, catalogue.displayText(kind, code), {}};
    for (int i = 0; i < static_cast<int>(entry->types.size()); ++i)
        event.titles.push_back(kind == EventKind::Expression ? catalogue.expressionParam(code, i)
                                                             : catalogue.title(kind, code, i));
    return event;
}

// The routine at a code, or "?" past the table.
std::string routineAt(EventKind kind, int code) {
    const std::vector<std::string>& names = routineNames(kind);
    return static_cast<size_t>(code) < names.size() ? names[static_cast<size_t>(code)] : "?";
}

void printItem(Catalogue& catalogue, EventKind kind, const MenuEntry& item, size_t depth,
               std::ostream& out) {
    std::string indent(2 * depth, ' ');
    if (item.kind != MenuEntry::Kind::Command) {
        out << indent << (item.kind == MenuEntry::Kind::Popup ? toUtf8(item.text) + " >" : "----")
            << '\n';
        return;
    }
    int code = 0;
    std::optional<MenuEvent> event = eventOf(catalogue, kind, item.id, code);
    out << indent << toUtf8(item.text) << "  [" << item.id << "]";
    if (!event) {
        out << "  no event (code " << code << ")\n";
        return;
    }
    out << "  code " << code << ' ' << routineAt(kind, code) << ", flags "
        << hex(static_cast<uint16_t>(event->entry.flags)) << ": \"" << toUtf8(event->text)
        << "\"\n";
    for (size_t i = 0; i < event->titles.size(); ++i)
        out << indent << "    %" << i << " " << paramTypeName(event->entry.types[i]) << ": \""
            << toUtf8(event->titles[i]) << "\"\n";
}

void printEventJson(Catalogue& catalogue, EventKind kind, const MenuEntry& item,
                    std::vector<std::u16string> path, bool& first, std::ostream& out) {
    int code = 0;
    std::optional<MenuEvent> event = eventOf(catalogue, kind, item.id, code);
    if (!event)
        throw std::runtime_error("menu item " + std::to_string(item.id) + " maps to no event");
    path.push_back(item.text);
    std::string menu;
    for (const std::u16string& t : path) menu += (menu.empty() ? "" : ", ") + quote(t);
    out << (first ? "" : ",\n") << "    {\"kind\": \"" << kindName(kind) << "\", \"code\": " << code
        << ", \"routine\": \"" << routineAt(kind, code) << "\", \"menuId\": " << item.id
        << ", \"menu\": [" << menu << "]"
        << ", \"flags\": " << static_cast<uint16_t>(event->entry.flags)
        << ", \"text\": " << quote(event->text) << ", \"params\": [";
    for (size_t i = 0; i < event->titles.size(); ++i)
        out << (i ? ", " : "") << "{\"type\": " << event->entry.types[i]
            << ", \"title\": " << quote(event->titles[i]) << '}';
    out << "]}";
    first = false;
}

// The three menus as trees, each event with its code, display text and parameter titles, as the
// editor lists them.
void printEditorView(Catalogue& catalogue, std::ostream& out) {
    for (auto [kind, heading] : Menus) {
        out << heading << '\n';
        std::optional<std::vector<MenuEntry>> items = catalogue.menuItems(kind);
        if (!items) out << "  (the module gave no menu)\n";
        std::vector<std::u16string> path;
        if (items)
            walk(*items, path, [&, k = kind](const MenuEntry& item, const auto& above) {
                printItem(catalogue, k, item, above.size() + 1, out);
            });
    }
}

// The catalogue as data for tools such as the help file's generator, in JSON: the object's
// identity strings and help file name, every event in menu order with its menu path, code,
// routine, flags, display text and parameters, and the texts of the module's own error codes as
// "RegErrText$(" gives them; a text quoted as a script writes it is a JSON string too.
void printCatalogueJson(Module& module, Catalogue& catalogue, std::ostream& out) {
    const char* const fields[] = {"name", "maker", "copyright", "description", "webAddress"};
    std::vector<std::u16string> identity = catalogue.identity();
    out << "{\n  \"object\": {";
    for (size_t i = 0; i < 5; ++i)
        out << (i ? ", " : "") << '"' << fields[i] << "\": " << quote(identity[i]);
    out << "},\n  \"helpFile\": " << quote(fromWide(module.entry<HelpFileFn>("GetHelpFileName")()))
        << ",\n";
    out << "  \"events\": [\n";
    bool first = true;
    for (auto [kind, heading] : Menus) {
        std::optional<std::vector<MenuEntry>> items = catalogue.menuItems(kind);
        if (!items)
            throw std::runtime_error(std::string("the module gave no ") + kindName(kind) + " menu");
        std::vector<std::u16string> path;
        walk(*items, path, [&, k = kind](const MenuEntry& item, const auto& above) {
            if (item.kind == MenuEntry::Kind::Command)
                printEventJson(catalogue, k, item, above, first, out);
        });
    }
    out << "\n  ],\n  \"messages\": [";
    // The texts an author reads through "RegErrText$(" when the last operation left these codes.
    Instance instance(module);
    int message = eventCode(EventKind::Expression, "ExpLastErrorMessage");
    for (size_t i = 0; i < std::size(OwnErrorCodes); ++i) {
        instance.setLastError(OwnErrorCodes[i]);
        Outcome outcome = instance.expression(message);
        if (!outcome.clean() || !outcome.isText)
            throw std::runtime_error("RegErrText$( misbehaved");
        out << (i ? ", " : "") << "{\"code\": " << OwnErrorCodes[i]
            << ", \"text\": " << quote(outcome.text) << '}';
    }
    out << "]\n}\n";
}

const char Usage[] =
    "usage: hivelet-host run [--module PATH] SCRIPT...\n"
    "       hivelet-host menus [--module PATH]\n"
    "       hivelet-host catalogue [--module PATH]\n"
    "       hivelet-host dump-state FILE\n"
    "       hivelet-host --help\n"
    "\n"
    "Plays the authoring host for the Hivelet module: loads it, creates an instance per\n"
    "script and runs the script's conditions, actions and expressions, printing each event\n"
    "with its result and lastError, and checking the script's expectations.\n"
    "\n"
    "  run         run the scripts; exit status 0 when all passed, 1 when one failed\n"
    "  menus       print the editor's view of the events: menus, codes, texts, titles\n"
    "  catalogue   print the same as JSON for tools, with identity strings and messages\n"
    "  dump-state  print a saved-state file; a malformed one gives exit status 1\n"
    "  --module PATH  the module; default $HIVELET_MODULE, else Hivelet.hzx beside the program\n"
    "\n"
    "Exit status 2: a usage error or a module that cannot be loaded.\n"
    "The script language is described in docs/scripts.md.\n";

// Reads, parses and runs a script file; true when every line passed.
bool runFile(Module& module, const std::string& path, std::ostream& out, std::ostream& err) {
    std::ifstream file(path, std::ios::binary);
    std::string text((std::istreambuf_iterator<char>(file)), std::istreambuf_iterator<char>());
    if (!file || file.bad()) {
        out.flush();
        err << path << ": cannot read the script" << std::endl;
        return false;
    }
    ParseResult parsed = parse(path, text);
    if (!parsed.ok()) {
        out << "== " << path << ": not run\n\n";
        out.flush();
        err << parsed.error << std::endl;
        return false;
    }
    return runScript(module, parsed.script, out, err);
}

// Reports a usage error with the usage text; the exit status for it.
int usageError(std::ostream& err, const std::string& message) {
    err << "hivelet-host: " << message << "\n\n" << Usage;
    return 2;
}

// What follows a command that loads the module: --module PATH, and the operands.
struct Arguments {
    std::string module;
    std::vector<std::string> operands;
};

// Splits the arguments after the command; returns a usage error or "".
std::string split(const std::vector<std::string>& args, Arguments& parsed) {
    for (size_t i = 1; i < args.size(); ++i) {
        const std::string& a = args[i];
        if (a == "--module") {
            if (++i == args.size()) return "--module needs a path";
            parsed.module = args[i];
        } else if (a.size() > 1 && a[0] == '-') {
            return "unknown option " + a;
        } else {
            parsed.operands.push_back(a);
        }
    }
    if (parsed.module.empty()) parsed.module = defaultModulePath();
    return std::string();
}

// `run`, `menus` and `catalogue`: each loads the module once. `run` runs every script on a
// fresh instance; the other two print the editor's view of the module's events, for people or
// for tools.
int moduleCommand(const std::vector<std::string>& args, std::ostream& out, std::ostream& err) {
    Arguments parsed;
    std::string error = split(args, parsed);
    bool run = args[0] == "run";
    if (error.empty() && run && parsed.operands.empty()) error = "run needs at least one script";
    if (error.empty() && !run && !parsed.operands.empty())
        error = args[0] + " takes no argument " + parsed.operands[0];
    if (!error.empty()) return usageError(err, error);
    std::unique_ptr<Module> module = Module::load(parsed.module, &error);
    if (!module) {
        err << "hivelet-host: " << error << std::endl;
        return 2;
    }
    if (run) {
        unsigned failed = 0;
        for (const std::string& script : parsed.operands)
            failed += runFile(*module, script, out, err) ? 0 : 1;
        out << parsed.operands.size() << " script(s), " << failed << " failed" << std::endl;
        return failed ? 1 : 0;
    }
    Editor editor;
    Catalogue catalogue(*module, editor);
    try {
        if (args[0] == "menus")
            printEditorView(catalogue, out);
        else
            printCatalogueJson(*module, catalogue, out);
    } catch (const std::exception& e) {
        err << "hivelet-host: " << e.what() << std::endl;
        return 1;
    }
    return 0;
}

// `dump-state`: a saved-state file, readably, or why it is not one.
int dumpStateCommand(const std::vector<std::string>& args, std::ostream& out, std::ostream& err) {
    if (args.size() != 2) return usageError(err, "dump-state needs one file");
    const std::string& path = args[1];
    std::ifstream file(path, std::ios::binary);
    std::vector<uint8_t> bytes((std::istreambuf_iterator<char>(file)),
                               std::istreambuf_iterator<char>());
    SavedState state;
    std::string error;
    if (!file) error = "cannot read the file";
    if (error.empty() && readSavedState(bytes, state, &error)) {
        const char* root = rootKeyName(state.rootKeyIndex);
        out << "version " << state.version << "\nroot key index " << state.rootKeyIndex << " ("
            << (*root ? root : "invalid") << ")\nlast error " << state.lastError << "\n"
            << (state.hasKey ? "key " + quote(state.key) : std::string("no current key"))
            << std::endl;
        return 0;
    }
    err << path << ": " << error << std::endl;
    return 1;
}

}  // namespace

int commandLine(const std::vector<std::string>& args, std::ostream& out, std::ostream& err) {
    if (args.empty()) return usageError(err, "no command given");
    const std::string& command = args[0];
    if (command == "--help") {
        out << Usage;
        return 0;
    }
    if (command == "run" || command == "menus" || command == "catalogue")
        return moduleCommand(args, out, err);
    if (command == "dump-state") return dumpStateCommand(args, out, err);
    return usageError(err, "unknown command " + command);
}

}  // namespace hv::script
