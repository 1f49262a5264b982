// The catalogue printed for people (hivelet-host menus) and, as JSON, for the tools that
// describe the module to authors (the help file).
#include <hivelet/catalogue.h>

#include <functional>
#include <iterator>
#include <stdexcept>

#include "internal.h"

namespace hv {

namespace {

typedef LPCWSTR(WINAPI* HelpFileFn)();

const std::pair<EventKind, const char*> Menus[] = {{EventKind::Condition, "Conditions"},
                                                   {EventKind::Action, "Actions"},
                                                   {EventKind::Expression, "Expressions"}};

// The module's own error codes, whose messages it keeps in its resources.
const uint32_t OwnErrorCodes[] = {40, 41, 42};

// "root key", "text", "integer", "text argument", or the number.
std::string paramTypeName(int16_t type) {
    switch (type) {
        case paramType::rootKey: return "root key";
        case paramType::text: return "text";
        case paramType::integer: return "integer";
        case paramType::expressionText: return "text argument";
        default: return "type " + std::to_string(type);
    }
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

// A JSON string: quotes, backslashes and control characters escaped, the rest as UTF-8.
std::string json(const std::u16string& text) {
    std::string out = "\"";
    static const char digits[] = "0123456789abcdef";
    for (char c : toUtf8(text)) {
        unsigned byte = static_cast<unsigned char>(c);
        if (c == '"' || c == '\\') {
            out += '\\';
            out += c;
        } else if (byte < 0x20) {
            out += "\\u00";
            out += digits[byte >> 4];
            out += digits[byte & 15];
        } else {
            out += c;
        }
    }
    return out + '"';
}

// Texts as a JSON list.
std::string jsonList(const std::vector<std::u16string>& texts) {
    std::string out;
    for (const std::u16string& t : texts) out += (out.empty() ? "" : ", ") + json(t);
    return "[" + out + "]";
}

void printEventJson(Catalogue& catalogue, EventKind kind, const MenuEntry& item,
                    std::vector<std::u16string> path, bool& first, std::ostream& out) {
    int code = 0;
    std::optional<MenuEvent> event = eventOf(catalogue, kind, item.id, code);
    if (!event)
        throw std::runtime_error("menu item " + std::to_string(item.id) + " maps to no event");
    path.push_back(item.text);
    out << (first ? "" : ",\n") << "    {\"kind\": \"" << kindName(kind) << "\", \"code\": " << code
        << ", \"routine\": \"" << routineAt(kind, code) << "\", \"menuId\": " << item.id
        << ", \"menu\": " << jsonList(path)
        << ", \"flags\": " << static_cast<uint16_t>(event->entry.flags)
        << ", \"text\": " << json(event->text) << ", \"params\": [";
    for (size_t i = 0; i < event->titles.size(); ++i)
        out << (i ? ", " : "") << "{\"type\": " << event->entry.types[i]
            << ", \"title\": " << json(event->titles[i]) << '}';
    out << "]}";
    first = false;
}

}  // namespace

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

void printCatalogueJson(Module& module, Catalogue& catalogue, std::ostream& out) {
    const char* const fields[] = {"name", "maker", "copyright", "description", "webAddress"};
    std::vector<std::u16string> identity = catalogue.identity();
    out << "{\n  \"object\": {";
    for (size_t i = 0; i < 5; ++i)
        out << (i ? ", " : "") << '"' << fields[i] << "\": " << json(identity[i]);
    out << "},\n  \"helpFile\": " << json(fromWide(module.entry<HelpFileFn>("GetHelpFileName")()))
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
            << ", \"text\": " << json(outcome.text) << '}';
    }
    out << "]\n}\n";
}

}  // namespace hv
