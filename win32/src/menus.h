// Menus of the portable Win32 layer: menu objects behind HMENU handles, built from the menu
// templates the resource compiler writes or item by item with AppendMenuW.
//
// A standard menu template is a 4-byte header (version 0, offset of the first item from the end
// of the header), then items: a WORD of flags, a WORD command identifier unless the item opens a
// popup, and a zero-terminated UTF-16 text. A popup's items follow it directly; MF_END marks the
// last item of each level. An item with identifier 0 and an empty text is a separator.
#pragma once

#include "internal.h"

#include <map>
#include <mutex>
#include <vector>

namespace w32 {

struct MenuItem {
    UINT flags = 0;  // MF_POPUP or MF_SEPARATOR, as GetMenuState reports them
    UINT id = 0;
    HMENU popup = nullptr;
    bool hasText = false;
    std::u16string text;
};

struct Menu {
    HMENU owner = nullptr;  // the menu whose popup item holds this one, if any
    std::vector<MenuItem> items;
};

struct Menus {
    std::recursive_mutex lock;
    std::map<HMENU, Menu> alive;
    uintptr_t next = 0x10000;  // handles are never reused, so a stale one stays invalid
};
using MenuGuard = std::lock_guard<std::recursive_mutex>;

#pragma GCC visibility push(default)
// Every menu alive; the test control lists and forgets them.
Menus& menus();

// Builds a menu bar from a template; null when the template is malformed (any item running past
// the end, a level without its MF_END item, nesting deeper than MenuDepthLimit).
HMENU menuFromTemplate(const BYTE* data, size_t size);
#pragma GCC visibility pop

// Popups nested deeper than this make a template malformed.
constexpr unsigned MenuDepthLimit = 32;

}  // namespace w32
