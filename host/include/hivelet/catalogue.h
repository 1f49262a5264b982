// The editor's side of the module's event catalogue: the menus an author picks events from, the
// code of a picked item, each event's entry, display text and parameter titles, and the event
// as the event sheet shows it with its parameters filled in.
#pragma once

#include <hivelet/host.h>

#include <optional>
#include <string>
#include <vector>

namespace hv {

// An item of a menu, read with the platform's menu functions.
struct MenuEntry {
    enum class Kind { Separator, Command, Popup };
    Kind kind = Kind::Command;
    std::u16string text;
    uint32_t id = 0;               // Command: the command identifier
    uint32_t state = 0;            // Command: the state flags GetMenuState reports
    std::vector<MenuEntry> items;  // Popup: its items
};

// One event's entry, as the Infos entry point gives it, with the two words before it.
struct EventEntry {
    uint16_t menuId = 0, stringId = 0;
    int16_t code = 0, flags = 0;
    std::vector<int16_t> types, titleIds;
};

// The catalogue entry points of a loaded module, called as the editor calls them. Texts are read
// into guarded buffers; a write past one throws std::runtime_error naming the entry point.
class Catalogue {
public:
    Catalogue(Module& module, Editor& editor) : module_(module), editor_(editor) {}

    // The Menu entry point's popup; the caller destroys it. Null when the module gave none.
    HMENU menu(EventKind kind);
    // The menu's items, the popup destroyed afterwards; nullopt when the module gave no menu.
    std::optional<std::vector<MenuEntry>> menuItems(EventKind kind);
    // The CodeFromMenu entry point's 16-bit answer, sign-extended (-1: no such item).
    int codeFromMenu(EventKind kind, uint32_t id);
    // The Infos entry point's answer: the address of the entry's code word, or null.
    const int16_t* infos(EventKind kind, int code);
    // The entry for `code` read from that address; nullopt when the module gave null.
    std::optional<EventEntry> entry(EventKind kind, int code);
    // The String, Title and Param entry points, with a buffer of `capacity` characters that
    // starts empty; the text up to its terminator.
    std::u16string displayText(EventKind kind, int code, int capacity = 1024);
    std::u16string title(EventKind kind, int code, int index, int capacity = 256);
    std::u16string expressionParam(int code, int index, int capacity = 256);

    // The event as the event sheet shows it: the display text with %0 to %3 replaced by the
    // parameters (root keys by the module's own parameter text, texts quoted, integers in
    // decimal) and %o by the object's name; an expression's parameters follow its name, then
    // the closing parenthesis.
    std::u16string sentence(EventKind kind, int code, const std::vector<Param>& params);
    // The five identity strings of GetObjInfos: name, maker, copyright, description, web address.
    std::vector<std::u16string> identity();

private:
    Module& module_;
    Editor& editor_;
    std::u16string parameterText(const Param& param);
};

}  // namespace hv
