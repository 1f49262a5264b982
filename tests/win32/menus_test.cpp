// Menus: templates as the resource compiler writes them, item lookups by position and by
// command through nested popups, texts cut to a capacity, and ownership.
#include "module_path.h"

#include <algorithm>
#include <vector>

#if HV_OVER_LAYER
#include "menus.h"
#endif

namespace {

// Builds a standard menu template: a 4-byte header, then items.
class Template {
public:
    Template() { words_ = {0, 0}; }
    Template& item(WORD flags, WORD id, WString text) {
        words_.push_back(flags);
        words_.push_back(id);
        return textOf(text);
    }
    Template& popup(WORD flags, WString text) {
        words_.push_back(static_cast<WORD>(flags | MF_POPUP));
        return textOf(text);
    }
    std::vector<BYTE> bytes(size_t cut = 0) const {
        std::vector<BYTE> b;
        for (WORD w : words_) {
            b.push_back(static_cast<BYTE>(w));
            b.push_back(static_cast<BYTE>(w >> 8));
        }
        b.resize(b.size() - cut);
        return b;
    }

private:
    Template& textOf(const WString& text) {
        for (WCHAR c : text) words_.push_back(c);
        words_.push_back(0);
        return *this;
    }
    std::vector<WORD> words_;
};

// The text GetMenuStringW leaves in a buffer of `capacity` characters filled with '#'.
WString textOf(HMENU menu, UINT item, UINT flags, int capacity = 64) {
    WString buffer(static_cast<size_t>(capacity), TEXT('#'));
    GetMenuStringW(menu, item, &buffer[0], capacity, flags);
    return buffer.c_str();
}

// A menu from a template; the layer's reader is told the template's size, Windows is not.
HMENU fromTemplate(const std::vector<BYTE>& bytes) {
#if HV_OVER_LAYER
    return w32::menuFromTemplate(bytes.data(), bytes.size());
#else
    return LoadMenuIndirectW(bytes.data());
#endif
}

// One bar with a popup "File" (Open 10, separator, popup "Recent" with "One" 11, "Save" 12) and a
// last item "Help" 13.
HMENU sample() {
    Template t;
    t.popup(0, TEXT("File"))
        .item(0, 10, TEXT("Open"))
        .item(0, 0, TEXT(""))
        .popup(0, TEXT("Recent"))
        .item(MF_END, 11, TEXT("One"))
        .item(MF_END, 12, TEXT("Save"))
        .item(MF_END, 13, TEXT("Help"));
    return fromTemplate(t.bytes());
}

class Menus : public ::testing::Test {
#if HV_OVER_LAYER
protected:
    void SetUp() override { w32test::reset(); }
    void TearDown() override { w32test::reset(); }
#endif
};

TEST_F(Menus, TemplateItemsByPositionAndByCommand) {
    HMENU bar = sample();
    ASSERT_NE(bar, nullptr);
    ASSERT_EQ(GetMenuItemCount(bar), 2);
    HMENU file = GetSubMenu(bar, 0);
    ASSERT_NE(file, nullptr);
    EXPECT_EQ(GetSubMenu(bar, 1), nullptr);
    EXPECT_EQ(GetMenuItemID(bar, 0), 0xFFFFFFFFu);  // opens a popup
    EXPECT_EQ(GetMenuItemID(bar, 1), 13u);
    EXPECT_EQ(GetMenuItemID(bar, 2), 0xFFFFFFFFu);  // no such position
    ASSERT_EQ(GetMenuItemCount(file), 4);
    EXPECT_EQ(GetMenuItemID(file, 1), 0u);  // separator
    EXPECT_EQ(GetMenuState(file, 2, MF_BYPOSITION), (1u << 8) | MF_POPUP);
    EXPECT_EQ(GetMenuState(file, 3, MF_BYPOSITION), 0u);
    EXPECT_EQ(GetMenuState(file, 4, MF_BYPOSITION), 0xFFFFFFFFu);

    EXPECT_EQ(textOf(bar, 0, MF_BYPOSITION), TEXT("File"));
    EXPECT_EQ(textOf(file, 2, MF_BYPOSITION), TEXT("Recent"));
    // By command the search goes through every nested popup.
    EXPECT_EQ(textOf(bar, 11, MF_BYCOMMAND), TEXT("One"));
    EXPECT_EQ(textOf(bar, 12, MF_BYCOMMAND), TEXT("Save"));
    EXPECT_EQ(GetMenuState(bar, 12, MF_BYCOMMAND), 0u);
    // Not found: 0, the buffer as it was, the reason in the last error (the documentation
    // says 0 only; Wine leaves the buffer, in both process kinds).
    EXPECT_EQ(textOf(bar, 99, MF_BYCOMMAND, 8), TEXT("########"));
    EXPECT_EQ(GetLastError(), DWORD{ERROR_MENU_ITEM_NOT_FOUND});
    EXPECT_TRUE(DestroyMenu(bar));
}

TEST_F(Menus, ASeparatorsStateIsMfSeparator) {
    HV_WINE_DIFFERS("a separator's state is 0x803");
    HMENU bar = sample();
    EXPECT_EQ(GetMenuState(GetSubMenu(bar, 0), 1, MF_BYPOSITION), UINT{MF_SEPARATOR});
    DestroyMenu(bar);
}

TEST_F(Menus, TextsAreCutToTheCapacityAndTerminated) {
    HMENU bar = sample();
    HMENU file = GetSubMenu(bar, 0);
    WCHAR buffer[8];
    std::fill(std::begin(buffer), std::end(buffer), TEXT('#'));
    EXPECT_EQ(GetMenuStringW(file, 0, reinterpret_cast<LPWSTR>(buffer), 3, MF_BYPOSITION), 2);
    EXPECT_EQ(WString(buffer, 4), WString(TEXT("Op\0#"), 4));
    EXPECT_EQ(GetMenuStringW(file, 0, nullptr, 0, MF_BYPOSITION), 4);  // the length alone
    std::fill(std::begin(buffer), std::end(buffer), TEXT('#'));
    EXPECT_EQ(GetMenuStringW(file, 1, reinterpret_cast<LPWSTR>(buffer), 8, MF_BYPOSITION), 0);
    EXPECT_EQ(buffer[0], TEXT('\0'));  // a separator has no text
    DestroyMenu(bar);
}

// Windows reads a template without knowing its size, and extended templates too.
TEST_F(Menus, MalformedTemplatesGiveNoMenuAndLeaveNothingAlive) {
    HV_LAYER_ONLY("the layer's template reader, its limits and its menu count");
#if HV_OVER_LAYER
    Template good;
    good.popup(MF_END, TEXT("P")).item(MF_END, 1, TEXT("A"));
    std::vector<BYTE> whole = good.bytes();
    for (size_t cut = 1; cut < whole.size() - 4; ++cut) {
        std::vector<BYTE> b = good.bytes(cut);
        EXPECT_EQ(w32::menuFromTemplate(b.data(), b.size()), nullptr) << "cut " << cut;
    }
    Template noEnd;
    noEnd.item(0, 1, TEXT("A"));
    std::vector<BYTE> b = noEnd.bytes();
    EXPECT_EQ(w32::menuFromTemplate(b.data(), b.size()), nullptr);
    Template deep;
    for (unsigned i = 0; i <= w32::MenuDepthLimit + 1; ++i) deep.popup(MF_END, TEXT("x"));
    deep.item(MF_END, 1, TEXT("A"));
    b = deep.bytes();
    EXPECT_EQ(w32::menuFromTemplate(b.data(), b.size()), nullptr);
    const BYTE extended[] = {1, 0, 4, 0, 0, 0, 0, 0};
    EXPECT_EQ(w32::menuFromTemplate(extended, sizeof extended), nullptr);
    EXPECT_EQ(w32test::menuObjectCount(), 0u);
#endif
}

// The menus nobody holds: over the layer, which counts them; Windows keeps no such list.
void expectLiveMenus(std::vector<HMENU> menus) {
#if HV_OVER_LAYER
    std::vector<HMENU> live = w32test::liveMenus();
    std::sort(live.begin(), live.end());
    std::sort(menus.begin(), menus.end());
    EXPECT_EQ(live, menus);
    EXPECT_EQ(w32test::menuObjectCount() == 0, menus.empty());
#else
    (void)menus;
#endif
}

TEST_F(Menus, AppendedPopupsBelongToTheirMenuAndDieWithIt) {
    HMENU top = CreatePopupMenu();
    HMENU sub = CreatePopupMenu();
    expectLiveMenus({top, sub});
    ASSERT_TRUE(AppendMenuW(top, MF_POPUP, reinterpret_cast<UINT_PTR>(sub), TEXT("Sub")));
    ASSERT_TRUE(AppendMenuW(sub, 0, 7, TEXT("Seven")));
    ASSERT_TRUE(AppendMenuW(top, MF_SEPARATOR, 0, nullptr));
    expectLiveMenus({top});
    EXPECT_EQ(GetSubMenu(top, 0), sub);
    EXPECT_EQ(GetMenuItemID(top, 1), 0u);
    EXPECT_EQ(textOf(top, 7, MF_BYCOMMAND), TEXT("Seven"));
    EXPECT_EQ(GetMenuState(top, 7, MF_BYCOMMAND), 0u);
    EXPECT_TRUE(DestroyMenu(top));
    expectLiveMenus({});
    // Stale handles stay invalid.
    EXPECT_FALSE(DestroyMenu(sub));
    EXPECT_FALSE(DestroyMenu(top));
    EXPECT_EQ(GetMenuItemCount(top), -1);
    EXPECT_FALSE(AppendMenuW(top, 0, 1, TEXT("x")));
}

// A destroyed menu cannot become another menu's popup: it would be used after its end.
TEST_F(Menus, ADestroyedMenuIsNoPopup) {
    HV_WINE_DIFFERS("it appends a destroyed menu as a popup");
    HMENU gone = CreatePopupMenu();
    ASSERT_TRUE(DestroyMenu(gone));
    HMENU menu = CreatePopupMenu();
    EXPECT_FALSE(AppendMenuW(menu, MF_POPUP, reinterpret_cast<UINT_PTR>(gone), TEXT("x")));
    EXPECT_EQ(GetMenuItemCount(menu), 0);
    DestroyMenu(menu);
}

// The module's own template: the conditions' menu, one popup of seven items.
TEST_F(Menus, LoadMenuReadsTheModulesTemplates) {
    HMODULE module = LoadLibraryW(modulePath().c_str());
    ASSERT_NE(module, nullptr);
    HMENU menu = LoadMenuW(module, MAKEINTRESOURCEW(20001));
    ASSERT_NE(menu, nullptr);
    HMENU popup = GetSubMenu(menu, 0);
    EXPECT_EQ(GetMenuItemCount(popup), 7);
    EXPECT_EQ(textOf(popup, 6, MF_BYPOSITION), TEXT("Last action successful"));
    EXPECT_TRUE(DestroyMenu(menu));
    SetLastError(0);
    EXPECT_EQ(LoadMenuW(module, MAKEINTRESOURCEW(999)), nullptr);
    EXPECT_EQ(GetLastError(), DWORD{ERROR_RESOURCE_NAME_NOT_FOUND});
    FreeLibrary(module);
}

TEST_F(Menus, InjectedFaults) {
    HV_LAYER_ONLY("fault injection");
#if HV_OVER_LAYER
    w32test::failCall("CreatePopupMenu", 1, 8);
    EXPECT_EQ(CreatePopupMenu(), nullptr);
    EXPECT_EQ(GetLastError(), 8u);
    HMENU menu = CreatePopupMenu();
    w32test::failCall("AppendMenuW", 1, 8);
    EXPECT_FALSE(AppendMenuW(menu, 0, 1, TEXT("x")));
    EXPECT_EQ(GetMenuItemCount(menu), 0);
#endif
}

}  // namespace
