// Feeds arbitrary bytes to the layer's menu-template reader, then walks whatever menu it built
// the way the module copies its event menus, and destroys it.
#include <w32/testctl.h>
#include <windows.h>

#include <stddef.h>
#include <stdint.h>

#include "menus.h"

namespace {

void walk(HMENU menu, unsigned depth) {
    WCHAR text[80];
    int count = GetMenuItemCount(menu);
    for (int i = 0; i < count; ++i) {
        GetMenuItemID(menu, i);
        GetMenuStringW(menu, static_cast<UINT>(i), text, 80, MF_BYPOSITION);
        GetMenuState(menu, static_cast<UINT>(i), MF_BYPOSITION);
        if (HMENU sub = GetSubMenu(menu, i)) {
            if (depth > w32::MenuDepthLimit) __builtin_trap();
            walk(sub, depth + 1);
        }
    }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    w32test::setJournal(false);
    HMENU menu = w32::menuFromTemplate(data, size);
    if (!menu) {
        if (w32test::menuObjectCount() != 0) __builtin_trap();  // a failed read keeps nothing
        return 0;
    }
    walk(menu, 0);
    WCHAR text[16];
    GetMenuStringW(menu, 1, text, 16, MF_BYCOMMAND);
    DestroyMenu(menu);
    if (w32test::menuObjectCount() != 0) __builtin_trap();
    return 0;
}
