// Menus: LoadMenuW over the compiled menu templates and the popup functions the module's event
// menus use.
#include "menus.h"

#include <cstring>

#include "byte_cursor.h"
#include "resources.h"

using namespace w32;

namespace {

using Guard = MenuGuard;
using Item = MenuItem;

HMENU newMenu(Menus& m) {
    auto handle = reinterpret_cast<HMENU>(m.next);
    m.next += 4;
    m.alive[handle];
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
// popups, the first match in item order).
Item* locate(Menus& m, Menu& menu, UINT item, UINT flags, unsigned depth = 0) {
    if (flags & MF_BYPOSITION) return item < menu.items.size() ? &menu.items[item] : nullptr;
    for (Item& candidate : menu.items) {
        if (!candidate.popup && !(candidate.flags & MF_SEPARATOR) && candidate.id == item)
            return &candidate;
        if (candidate.popup && depth < MenuDepthLimit) {
            if (Menu* sub = find(m, candidate.popup))
                if (Item* found = locate(m, *sub, item, flags, depth + 1)) return found;
        }
    }
    return nullptr;
}

// The item at `position` of a menu, if both are there.
const Item* itemAt(Menus& m, HMENU handle, int position) {
    Menu* menu = find(m, handle);
    return position >= 0 && menu ? locate(m, *menu, static_cast<UINT>(position), MF_BYPOSITION)
                                 : nullptr;
}

// Reads a standard menu template into `menu`, one level at a time.
class TemplateReader {
public:
    TemplateReader(Menus& m, const BYTE* data, size_t size) : m_(m), c_(data, size) {}

    bool read(HMENU menu) {
        WORD version = 0, offset = 0;
        if (!c_.word(&version) || !c_.word(&offset)) return false;
        if (version != 0) return false;  // extended templates are not supported
        return c_.skip(offset) && level(menu, 0);
    }

private:
    Menus& m_;
    Cursor c_;

    bool level(HMENU handle, unsigned depth) {
        if (depth > MenuDepthLimit) return false;
        for (;;) {
            WORD option = 0, id = 0;
            Item item;
            if (!c_.word(&option)) return false;
            if (!(option & MF_POPUP) && !c_.word(&id)) return false;
            if (!c_.text(&item.text)) return false;
            item.hasText = true;
            item.id = id;
            item.flags = option & MF_POPUP;
            if (option & MF_POPUP) {
                item.popup = newMenu(m_);
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
    if (auto code = takeFault("LoadMenuW")) return failWith<HMENU>(*code, nullptr);
    // Only numbered menus exist in the images the layer reads.
    if (!IS_INTRESOURCE(name)) return failWith<HMENU>(ERROR_RESOURCE_NAME_NOT_FOUND, nullptr);
    const BYTE* data = nullptr;
    size_t size = 0;
    auto number = static_cast<WORD>(reinterpret_cast<uintptr_t>(name));
    if (!findResource(instance, ResourceTypeMenu, number, LanguageUsEnglish, &data, &size))
        return nullptr;
    HMENU menu = menuFromTemplate(data, size);
    if (!menu) SetLastError(ERROR_RESOURCE_DATA_NOT_FOUND);
    return menu;
}

BOOL appendMenu(HMENU handle, UINT flags, UINT_PTR idNewItem, LPCWSTR text) {
    if (auto code = takeFault("AppendMenuW")) return failWith<BOOL>(*code, FALSE);
    Menus& m = menus();
    Guard guard(m.lock);
    Menu* menu = find(m, handle);
    if (!menu) return failWith<BOOL>(ERROR_INVALID_MENU_HANDLE, FALSE);
    Item item;
    item.flags = flags & (MF_POPUP | MF_SEPARATOR);
    if (flags & MF_POPUP) {
        auto popup = reinterpret_cast<HMENU>(idNewItem);
        Menu* sub = find(m, popup);
        if (!sub || popup == handle) return failWith<BOOL>(ERROR_INVALID_MENU_HANDLE, FALSE);
        item.popup = popup;
        sub->owner = handle;
        menu = find(m, handle);
    } else {
        item.id = static_cast<UINT>(idNewItem);
    }
    if (!(flags & MF_SEPARATOR) && text) {
        item.hasText = true;
        item.text = text;
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
    Item* found = locate(m, *menu, item, flags);
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
    Item* found = locate(m, *menu, item, flags);
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

Menus& w32::menus() {
    static Menus* m = new Menus;  // never destroyed: menus may be released during exit
    return *m;
}

HMENU w32::menuFromTemplate(const BYTE* data, size_t size) {
    Menus& m = menus();
    Guard guard(m.lock);
    HMENU menu = newMenu(m);
    if (TemplateReader(m, data, size).read(menu)) return menu;
    destroy(m, menu);
    return nullptr;
}

HMENU WINAPI LoadMenuW(HINSTANCE instance, LPCWSTR name) {
    HMENU result = loadMenu(instance, name);
    record("LoadMenuW", {arg(instance), arg(name)}, arg(result));
    return result;
}

HMENU WINAPI CreatePopupMenu(void) {
    HMENU result = nullptr;
    if (auto code = takeFault("CreatePopupMenu")) {
        SetLastError(static_cast<DWORD>(*code));
    } else {
        Menus& m = menus();
        Guard guard(m.lock);
        result = newMenu(m);
    }
    record("CreatePopupMenu", {}, arg(result));
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
    record("DestroyMenu", {arg(handle)}, result);
    return result;
}

HMENU WINAPI GetSubMenu(HMENU handle, int position) {
    HMENU result = nullptr;
    {
        Menus& m = menus();
        Guard guard(m.lock);
        if (const Item* item = itemAt(m, handle, position)) result = item->popup;
    }
    record("GetSubMenu", {arg(handle), arg(position)}, arg(result));
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
    record("GetMenuItemCount", {arg(handle)}, result);
    return result;
}

UINT WINAPI GetMenuItemID(HMENU handle, int position) {
    UINT result = ~0u;  // no such item, or one that opens a popup
    {
        Menus& m = menus();
        Guard guard(m.lock);
        const Item* item = itemAt(m, handle, position);
        if (item && !item->popup) result = item->id;
    }
    record("GetMenuItemID", {arg(handle), arg(position)}, result);
    return result;
}

int WINAPI GetMenuStringW(HMENU handle, UINT item, LPWSTR buffer, int bufferMax, UINT flags) {
    int result = menuString(handle, item, buffer, bufferMax, flags);
    record("GetMenuStringW", {arg(handle), item, arg(buffer), arg(bufferMax), flags}, result);
    return result;
}

UINT WINAPI GetMenuState(HMENU handle, UINT item, UINT flags) {
    UINT result = menuState(handle, item, flags);
    record("GetMenuState", {arg(handle), item, flags}, result);
    return result;
}

BOOL WINAPI AppendMenuW(HMENU handle, UINT flags, UINT_PTR idNewItem, LPCWSTR text) {
    BOOL result = appendMenu(handle, flags, idNewItem, text);
    record("AppendMenuW", {arg(handle), flags, idNewItem, arg(text)}, result);
    return result;
}
