// The catalogue as JSON, for the tools that describe the module to authors (the help file).
#include <hivelet/catalogue.h>

#include <iterator>
#include <stdexcept>

#include "internal.h"

namespace hv {

namespace {

typedef void(WINAPI* ObjInfosFn)(Slot, Slot, LPWSTR, LPWSTR, LPWSTR, LPWSTR, LPWSTR);
typedef LPCWSTR(WINAPI* HelpFileFn)();

// The module's own error codes, whose messages it keeps in its resources.
const uint32_t ownErrorCodes[] = {40, 41, 42};

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

// The five identity strings, in the buffers and capacities the editor lends.
void printIdentity(Module& module, std::ostream& out) {
    std::vector<WCHAR> buffers(4 * 256 + 1024, 0);
    WCHAR* b = buffers.data();
    module.entry<ObjInfosFn>("GetObjInfos")(0, 0, b, b + 256, b + 512, b + 768, b + 1792);
    const std::pair<const char*, WCHAR*> fields[] = {{"name", b},
                                                     {"maker", b + 256},
                                                     {"copyright", b + 512},
                                                     {"description", b + 768},
                                                     {"webAddress", b + 1792}};
    out << "  \"object\": {";
    for (size_t i = 0; i < 5; ++i)
        out << (i ? ", " : "") << '"' << fields[i].first << "\": " << json(fromWide(fields[i].second));
    out << "},\n  \"helpFile\": "
        << json(fromWide(module.entry<HelpFileFn>("GetHelpFileName")())) << ",\n";
}

void printEvent(Catalogue& catalogue, EventKind kind, const std::vector<std::u16string>& path,
                uint32_t id, bool& first, std::ostream& out) {
    int code = catalogue.codeFromMenu(kind, id);
    std::optional<EventEntry> entry = code >= 0 ? catalogue.entry(kind, code) : std::nullopt;
    if (!entry) throw std::runtime_error("menu item " + std::to_string(id) + " maps to no event");
    out << (first ? "" : ",\n") << "    {\"kind\": \"" << kindName(kind) << "\", \"code\": " << code
        << ", \"routine\": \"" << routineNames(kind).at(static_cast<size_t>(code))
        << "\", \"menuId\": " << id << ", \"menu\": [";
    for (size_t i = 0; i < path.size(); ++i) out << (i ? ", " : "") << json(path[i]);
    out << "], \"flags\": " << static_cast<uint16_t>(entry->flags)
        << ", \"text\": " << json(catalogue.displayText(kind, code)) << ", \"params\": [";
    for (size_t i = 0; i < entry->types.size(); ++i) {
        int index = static_cast<int>(i);
        std::u16string title = kind == EventKind::Expression ? catalogue.expressionParam(code, index)
                                                             : catalogue.title(kind, code, index);
        out << (i ? ", " : "") << "{\"type\": " << entry->types[i] << ", \"title\": " << json(title)
            << '}';
    }
    out << "]}";
    first = false;
}

// Every command item of a menu, depth first in menu order, with the popups above it.
void printItems(Catalogue& catalogue, EventKind kind, const std::vector<MenuEntry>& items,
                std::vector<std::u16string>& path, bool& first, std::ostream& out) {
    for (const MenuEntry& item : items) {
        if (item.kind == MenuEntry::Kind::Separator) continue;
        path.push_back(item.text);
        if (item.kind == MenuEntry::Kind::Popup)
            printItems(catalogue, kind, item.items, path, first, out);
        else
            printEvent(catalogue, kind, path, item.id, first, out);
        path.pop_back();
    }
}

}  // namespace

void printCatalogueJson(Module& module, Catalogue& catalogue, std::ostream& out) {
    out << "{\n";
    printIdentity(module, out);
    out << "  \"events\": [\n";
    bool first = true;
    for (EventKind kind : {EventKind::Condition, EventKind::Action, EventKind::Expression}) {
        std::optional<std::vector<MenuEntry>> items = catalogue.menuItems(kind);
        if (!items) throw std::runtime_error(std::string("the module gave no ") + kindName(kind) + " menu");
        std::vector<std::u16string> path;
        printItems(catalogue, kind, *items, path, first, out);
    }
    out << "\n  ],\n  \"messages\": [";
    // The texts an author reads through "RegErrText$(" when the last operation left these codes.
    Instance instance(module);
    int message = eventCode(EventKind::Expression, "ExpLastErrorMessage");
    for (size_t i = 0; i < std::size(ownErrorCodes); ++i) {
        instance.setLastError(ownErrorCodes[i]);
        Outcome outcome = instance.expression(message);
        if (!outcome.clean() || !outcome.isText) throw std::runtime_error("RegErrText$( misbehaved");
        out << (i ? ", " : "") << "{\"code\": " << ownErrorCodes[i]
            << ", \"text\": " << json(outcome.text) << '}';
    }
    out << "]\n}\n";
}

}  // namespace hv
