// Menus: LoadMenuW over the compiled menu templates, the popup functions the module's event
// menus use, and the test control that lists the menus still alive.
#include "menus.h"

#include <cstring>
#include <map>
#include <memory>
#include <mutex>

#include "internal.h"
#include "resources.h"

namespace {

struct Item {
    UINT flags = 0;  // type and state bits as GetMenuState reports them; MF_POPUP for a popup
    UINT id = 0;
    HMENU popup = nullptr;
    bool hasText = false;
    std::u16string text;
};

struct Menu {
    bool isPopup = false;
    HMENU owner = nullptr;  // the menu whose popup item holds this one, if any
    std::vector<Item> items;
};

// The bits of AppendMenuW's flags that an item keeps; the others say how to find an item.
constexpr UINT keptFlags = MF_GRAYED | MF_DISABLED | MF_BITMAP | MF_CHECKED | MF_POPUP |
                           MF_MENUBARBREAK | MF_MENUBREAK | MF_HILITE | MF_OWNERDRAW |
                           MF_SEPARATOR | MF_DEFAULT | MF_HELP;

struct Menus {
    std::recursive_mutex lock;
    std::map<HMENU, Menu> alive;
    uintptr_t next = 0x10000;  // handles are never reused, so a stale one stays invalid
};

Menus& menus() {
    static Menus* m = new Menus;  // never destroyed: menus may be released during exit
    return *m;
}

using Guard = std::lock_guard<std::recursive_mutex>;

HMENU newMenu(Menus& m, bool isPopup) {
    auto handle = reinterpret_cast<HMENU>(m.next);
    m.next += 4;
    m.alive[handle].isPopup = isPopup;
    return handle;
}

Menu* find(Menus& m, HMENU handle) {
    auto it = m.alive.find(handle);
    return it == m.alive.end() ? nullptr : &it->second;
}

void destroy(Menus& m, HMENU handle) {
    auto it = m.alive.find(handle);
    if (it == m.alive.end()) return;
    std::vector<Item> items = std::move(it->second.items);
    m.alive.erase(it);
    for (const Item& item : items)
        if (item.popup) destroy(m, item.popup);
}

// The item at `item` in `menu`, by position or by command identifier (searched through nested
// popups, the first match in item order); `holder` receives the menu that holds it.
Item* locate(Menus& m, Menu& menu, UINT item, UINT flags, Menu** holder, unsigned depth = 0) {
    if (flags & MF_BYPOSITION) {
        if (item >= menu.items.size()) return nullptr;
        *holder = &menu;
        return &menu.items[item];
    }
    for (Item& candidate : menu.items) {
        if (!candidate.popup && !(candidate.flags & MF_SEPARATOR) && candidate.id == item) {
            *holder = &menu;
            return &candidate;
        }
        if (candidate.popup && depth < w32::menuDepthLimit) {
            if (Menu* sub = find(m, candidate.popup))
                if (Item* found = locate(m, *sub, item, flags, holder, depth + 1)) return found;
        }
    }
    return nullptr;
}

// Reads a standard menu template into `menu`, one level at a time.
class TemplateReader {
public:
    TemplateReader(Menus& m, const BYTE* data, size_t size) : m_(m), data_(data), size_(size) {}

    bool read(HMENU menu) {
        if (size_ < 4) return false;
        WORD version = word(0), offset = word(2);
        if (version != 0) return false;  // extended templates are not supported
        at_ = 4 + size_t{offset};
        return level(menu, 0);
    }

private:
    Menus& m_;
    const BYTE* data_;
    size_t size_;
    size_t at_ = 0;

    WORD word(size_t at) const { return static_cast<WORD>(data_[at] | (data_[at + 1] << 8)); }

    bool readWord(WORD* value) {
        if (at_ > size_ || size_ - at_ < 2) return false;
        *value = word(at_);
        at_ += 2;
        return true;
    }

    bool readText(std::u16string* text) {
        for (WORD c = 0;;) {
            if (!readWord(&c)) return false;
            if (c == 0) return true;
            text->push_back(static_cast<char16_t>(c));
        }
    }

    bool level(HMENU handle, unsigned depth) {
        if (depth > w32::menuDepthLimit) return false;
        for (;;) {
            WORD option = 0, id = 0;
            Item item;
            if (!readWord(&option)) return false;
            if (!(option & MF_POPUP) && !readWord(&id)) return false;
            if (!readText(&item.text)) return false;
            item.hasText = true;
            item.id = id;
            item.flags = option & keptFlags & ~MF_HILITE;
            if (option & MF_POPUP) {
                item.popup = newMenu(m_, true);
                m_.alive[item.popup].owner = handle;
                // The popup joins its menu first, so that a failure below releases it too.
                m_.alive[handle].items.push_back(item);
                if (!level(item.popup, depth + 1)) return false;
            } else {
                if (id == 0 && item.text.empty()) {
                    item.flags |= MF_SEPARATOR;
                    item.hasText = false;
                }
                m_.alive[handle].items.push_back(item);
            }
            if (option & MF_END) return true;
        }
    }
};

template <typename T>
T failWith(long code, T result) {
    SetLastError(static_cast<DWORD>(code));
    return result;
}

HMENU loadMenu(HINSTANCE instance, LPCWSTR name) {
    if (auto code = w32::takeFault("LoadMenuW")) return failWith<HMENU>(*code, nullptr);
    // Only numbered menus exist in the images the layer reads.
    if (reinterpret_cast<uintptr_t>(name) >> 16) return failWith<HMENU>(1814, nullptr);
    const BYTE* data = nullptr;
    size_t size = 0;
    auto number = static_cast<WORD>(reinterpret_cast<uintptr_t>(name));
    if (!w32::findResource(instance, w32::resourceTypeMenu, number, w32::languageUsEnglish, &data,
                           &size))
        return nullptr;
    HMENU menu = w32::menuFromTemplate(data, size);
    if (!menu) SetLastError(1812);
    return menu;
}

HMENU createMenu(const char* function, bool isPopup) {
    if (auto code = w32::takeFault(function)) return failWith<HMENU>(*code, nullptr);
    Menus& m = menus();
    Guard guard(m.lock);
    return newMenu(m, isPopup);
}

BOOL appendMenu(HMENU handle, UINT flags, UINT_PTR idNewItem, LPCWSTR text) {
    if (auto code = w32::takeFault("AppendMenuW")) return failWith<BOOL>(*code, FALSE);
    Menus& m = menus();
    Guard guard(m.lock);
    Menu* menu = find(m, handle);
    if (!menu) return failWith<BOOL>(ERROR_INVALID_MENU_HANDLE, FALSE);
    Item item;
    item.flags = flags & keptFlags;
    if (flags & MF_POPUP) {
        auto popup = reinterpret_cast<HMENU>(idNewItem);
        Menu* sub = find(m, popup);
        if (!sub || popup == handle) return failWith<BOOL>(ERROR_INVALID_MENU_HANDLE, FALSE);
        item.popup = popup;
        sub->owner = handle;
        sub->isPopup = true;
        menu = find(m, handle);
    } else {
        item.id = static_cast<UINT>(idNewItem);
    }
    if (!(flags & (MF_SEPARATOR | MF_BITMAP | MF_OWNERDRAW))) {
        if (text) {
            item.hasText = true;
            item.text = text;
        } else if (!(flags & MF_POPUP)) {
            item.flags |= MF_SEPARATOR;  // a string item without a text shows as a separator
        }
    }
    menu->items.push_back(std::move(item));
    return TRUE;
}

// An item that is not there leaves the buffer as it was (Wine, in both process kinds; the
// documentation does not say); an item without a text empties it.
int menuString(HMENU handle, UINT item, LPWSTR buffer, int bufferMax, UINT flags) {
    Menus& m = menus();
    Guard guard(m.lock);
    Menu* menu = find(m, handle);
    if (!menu) return failWith(ERROR_INVALID_MENU_HANDLE, 0);
    Menu* holder = nullptr;
    Item* found = locate(m, *menu, item, flags, &holder);
    if (!found) return failWith(ERROR_MENU_ITEM_NOT_FOUND, 0);
    if (buffer && bufferMax > 0) buffer[0] = 0;
    if (!found->hasText) return 0;
    int length = static_cast<int>(found->text.size());
    if (!buffer || bufferMax <= 0) return length;
    int copied = length < bufferMax - 1 ? length : bufferMax - 1;
    std::memcpy(buffer, found->text.data(), static_cast<size_t>(copied) * sizeof(WCHAR));
    buffer[copied] = 0;
    return copied;
}

UINT menuState(HMENU handle, UINT item, UINT flags) {
    Menus& m = menus();
    Guard guard(m.lock);
    Menu* menu = find(m, handle);
    if (!menu) return failWith(ERROR_INVALID_MENU_HANDLE, ~0u);
    Menu* holder = nullptr;
    Item* found = locate(m, *menu, item, flags, &holder);
    if (!found) return ~0u;
    if (found->popup) {
        // A popup reports its item count in the high byte and its flags in the low one.
        Menu* sub = find(m, found->popup);
        UINT count = sub ? static_cast<UINT>(sub->items.size()) : 0;
        return (count << 8) | (found->flags & 0xFF);
    }
    return found->flags;
}

}  // namespace

namespace w32 {

HMENU menuFromTemplate(const BYTE* data, size_t size) {
    Menus& m = menus();
    Guard guard(m.lock);
    HMENU menu = newMenu(m, false);
    if (TemplateReader(m, data, size).read(menu)) return menu;
    destroy(m, menu);
    return nullptr;
}

}  // namespace w32

HMENU WINAPI LoadMenuW(HINSTANCE instance, LPCWSTR name) {
    HMENU result = loadMenu(instance, name);
    w32::record("LoadMenuW", {w32::arg(instance), w32::arg(name)}, w32::arg(result));
    return result;
}

HMENU WINAPI CreatePopupMenu(void) {
    HMENU result = createMenu("CreatePopupMenu", true);
    w32::record("CreatePopupMenu", {}, w32::arg(result));
    return result;
}

HMENU WINAPI CreateMenu(void) {
    HMENU result = createMenu("CreateMenu", false);
    w32::record("CreateMenu", {}, w32::arg(result));
    return result;
}

BOOL WINAPI DestroyMenu(HMENU handle) {
    Menus& m = menus();
    BOOL result = FALSE;
    {
        Guard guard(m.lock);
        if (find(m, handle)) {
            destroy(m, handle);
            result = TRUE;
        } else {
            SetLastError(ERROR_INVALID_MENU_HANDLE);
        }
    }
    w32::record("DestroyMenu", {w32::arg(handle)}, result);
    return result;
}

BOOL WINAPI IsMenu(HMENU handle) {
    Menus& m = menus();
    Guard guard(m.lock);
    return find(m, handle) != nullptr;
}

HMENU WINAPI GetSubMenu(HMENU handle, int position) {
    HMENU result = nullptr;
    {
        Menus& m = menus();
        Guard guard(m.lock);
        Menu* menu = find(m, handle);
        if (menu && position >= 0 && static_cast<size_t>(position) < menu->items.size())
            result = menu->items[static_cast<size_t>(position)].popup;
    }
    w32::record("GetSubMenu", {w32::arg(handle), w32::arg(position)}, w32::arg(result));
    return result;
}

int WINAPI GetMenuItemCount(HMENU handle) {
    int result = -1;
    {
        Menus& m = menus();
        Guard guard(m.lock);
        if (Menu* menu = find(m, handle))
            result = static_cast<int>(menu->items.size());
        else
            SetLastError(ERROR_INVALID_MENU_HANDLE);
    }
    w32::record("GetMenuItemCount", {w32::arg(handle)}, result);
    return result;
}

UINT WINAPI GetMenuItemID(HMENU handle, int position) {
    UINT result = ~0u;  // no such item, or one that opens a popup
    {
        Menus& m = menus();
        Guard guard(m.lock);
        Menu* menu = find(m, handle);
        if (menu && position >= 0 && static_cast<size_t>(position) < menu->items.size()) {
            const Item& item = menu->items[static_cast<size_t>(position)];
            if (!item.popup) result = item.id;
        }
    }
    w32::record("GetMenuItemID", {w32::arg(handle), w32::arg(position)}, result);
    return result;
}

int WINAPI GetMenuStringW(HMENU handle, UINT item, LPWSTR buffer, int bufferMax, UINT flags) {
    int result = menuString(handle, item, buffer, bufferMax, flags);
    w32::record("GetMenuStringW",
                {w32::arg(handle), item, w32::arg(buffer), w32::arg(bufferMax), flags}, result);
    return result;
}

UINT WINAPI GetMenuState(HMENU handle, UINT item, UINT flags) {
    UINT result = menuState(handle, item, flags);
    w32::record("GetMenuState", {w32::arg(handle), item, flags}, result);
    return result;
}

BOOL WINAPI AppendMenuW(HMENU handle, UINT flags, UINT_PTR idNewItem, LPCWSTR text) {
    BOOL result = appendMenu(handle, flags, idNewItem, text);
    w32::record("AppendMenuW", {w32::arg(handle), flags, idNewItem, w32::arg(text)}, result);
    return result;
}

namespace w32test {

std::vector<HMENU> liveMenus() {
    Menus& m = menus();
    Guard guard(m.lock);
    std::vector<HMENU> roots;
    for (const auto& [handle, menu] : m.alive)
        if (!menu.owner || !find(m, menu.owner)) roots.push_back(handle);
    return roots;
}

size_t menuObjectCount() {
    Menus& m = menus();
    Guard guard(m.lock);
    return m.alive.size();
}

void resetMenus() {
    Menus& m = menus();
    Guard guard(m.lock);
    m.alive.clear();
}

}  // namespace w32test
