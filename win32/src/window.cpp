// Window objects and their messages: push buttons, list boxes, and the functions that find
// windows, read their texts and slots, and send them messages.
#include "window.h"

#include <sys/syscall.h>
#include <unistd.h>

#include <algorithm>
#include <cstring>

namespace w32 {

WindowState& windowState() {
    static WindowState* s = new WindowState;  // never destroyed, like the rest of the layer's state
    return *s;
}

DWORD currentThread() { return static_cast<DWORD>(syscall(SYS_gettid)); }

Window* findWindow(HWND handle) {
    if (!handle) return nullptr;
    auto& windows = windowState().windows;
    auto it = windows.find(handle);
    return it == windows.end() ? nullptr : it->second.get();
}

Window* findOrFail(HWND handle) {
    Window* w = findWindow(handle);
    if (!w) SetLastError(ERROR_INVALID_WINDOW_HANDLE);
    return w;
}

Window* createWindow(Kind kind, std::u16string className, HWND parent) {
    WindowState& s = windowState();
    auto w = std::make_unique<Window>();
    // Handles are never reused, so a destroyed window's handle stays invalid.
    s.nextHandle += 4;
    w->handle = reinterpret_cast<HWND>(s.nextHandle);
    w->kind = kind;
    w->className = std::move(className);
    w->parent = parent;
    w->thread = currentThread();
    Window* raw = w.get();
    s.windows[raw->handle] = std::move(w);
    return raw;
}

void destroyWindow(HWND handle) {
    WindowState& s = windowState();
    Window* w = findWindow(handle);
    if (!w) return;
    for (HWND child : std::vector<HWND>(w->children)) destroyWindow(child);
    s.topLevel.erase(std::remove(s.topLevel.begin(), s.topLevel.end(), handle), s.topLevel.end());
    for (auto& [thread, focused] : s.focus)
        if (focused == handle) focused = nullptr;
    s.windows.erase(handle);
}

HWND childWithId(const Window& dialog, int id) {
    for (HWND child : dialog.children)
        if (findWindow(child)->id == id) return child;
    return nullptr;
}

Window* dialogOf(HWND handle) {
    Window* w = findWindow(handle);
    if (w && w->kind != Kind::Dialog) w = findWindow(w->parent);
    return w && w->kind == Kind::Dialog ? w : nullptr;
}

}  // namespace w32

using namespace w32;

namespace {

// Copies a text into a caller's buffer of `capacity` characters, cut and terminated.
int copyText(const std::u16string& text, LPWSTR buffer, int capacity) {
    if (!buffer || capacity <= 0) return 0;
    int n = std::min(static_cast<int>(text.size()), capacity - 1);
    std::memcpy(buffer, text.data(), static_cast<size_t>(n) * sizeof(WCHAR));
    buffer[n] = 0;
    return n;
}

LRESULT listBoxMessage(Window& w, UINT message, WPARAM wParam, LPARAM lParam) {
    auto index = static_cast<int>(wParam);
    int count = static_cast<int>(w.items.size());
    switch (message) {
        case LB_ADDSTRING:
            if (!lParam) return LB_ERR;
            w.items.emplace_back(reinterpret_cast<LPCWSTR>(lParam));
            return count;
        case LB_SETCURSEL:
            // -1 clears the selection and answers LB_ERR; another index out of range changes
            // nothing (as in Wine, in both process kinds; the documentation does not say).
            if (index >= count || index < -1) return LB_ERR;
            w.selection = index >= 0 ? index : LB_ERR;
            return w.selection;
        case LB_GETCURSEL: return w.selection;
        case LB_GETCOUNT: return count;
        case LB_GETTEXTLEN:
            return index >= 0 && index < count ? static_cast<LRESULT>(w.items[index].size())
                                               : LB_ERR;
        case LB_GETTEXT: {
            if (index < 0 || index >= count || !lParam) return LB_ERR;
            // Like Windows, the caller's buffer is taken to be large enough (LB_GETTEXTLEN + 1).
            const std::u16string& item = w.items[index];
            std::memcpy(reinterpret_cast<WCHAR*>(lParam), item.c_str(),
                        (item.size() + 1) * sizeof(WCHAR));
            return static_cast<LRESULT>(item.size());
        }
        default: return 0;
    }
}

// A click tells the button's dialog.
LRESULT buttonMessage(Window& w, UINT message) {
    if (message == BM_CLICK)
        dispatch(w.parent, WM_COMMAND, MAKEWPARAM(w.id, BN_CLICKED),
                 reinterpret_cast<LPARAM>(w.handle));
    return 0;
}

// A dialog's extra bytes; negative indices name slots the layer's windows do not keep.
bool readLong(HWND handle, int index, void* out, size_t size) {
    Window* w = findOrFail(handle);
    if (!w) return false;
    bool inSlots = index >= 0 && static_cast<size_t>(index) + size <= DialogExtraBytes;
    if (w->kind != Kind::Dialog || !inSlots) {
        SetLastError(ERROR_INVALID_INDEX);
        return false;
    }
    std::memcpy(out, w->extra + index, size);
    return true;
}

bool writeLong(HWND handle, int index, const void* value, void* old, size_t size) {
    if (!readLong(handle, index, old, size)) return false;
    std::memcpy(findWindow(handle)->extra + index, value, size);
    return true;
}

}  // namespace

LRESULT w32::dispatch(HWND handle, UINT message, WPARAM wParam, LPARAM lParam) {
    Window* w = findWindow(handle);
    if (!w) return 0;
    switch (w->kind) {
        case Kind::Dialog: return dialogMessage(*w, message, wParam, lParam);
        case Kind::ListBox: return listBoxMessage(*w, message, wParam, lParam);
        case Kind::Button: return buttonMessage(*w, message);
        default: return 0;
    }
}

HWND WINAPI GetDlgItem(HWND dialog, int id) {
    Window* w = findOrFail(dialog);
    HWND found = w ? childWithId(*w, id) : nullptr;
    if (w && !found) SetLastError(ERROR_CONTROL_ID_NOT_FOUND);
    record("GetDlgItem", {arg(dialog), static_cast<uint64_t>(id)}, arg(found));
    return found;
}

int WINAPI GetDlgCtrlID(HWND window) {
    Window* w = findOrFail(window);
    return w ? w->id : 0;
}

LRESULT WINAPI SendMessageW(HWND window, UINT message, WPARAM wParam, LPARAM lParam) {
    LRESULT result = findOrFail(window) ? dispatch(window, message, wParam, lParam) : 0;
    record("SendMessageW", {arg(window), message, wParam, static_cast<uint64_t>(lParam)}, result);
    return result;
}

// 64-bit code calls the LONG_PTR forms, 32-bit code the LONG forms that the LONG_PTR names
// stand for there (winuser.h): one pair is served, with the width of a pointer, and journaled
// under the name that the macros leave.
#define JOURNAL_NAME(function) NAME_TEXT(function)
#define NAME_TEXT(function) #function

LONG_PTR WINAPI GetWindowLongPtrW(HWND window, int index) {
    LONG_PTR value = 0;
    readLong(window, index, &value, sizeof value);
    record(JOURNAL_NAME(GetWindowLongPtrW), {arg(window), static_cast<uint64_t>(index)}, value);
    return value;
}

LONG_PTR WINAPI SetWindowLongPtrW(HWND window, int index, LONG_PTR value) {
    LONG_PTR old = 0;
    writeLong(window, index, &value, &old, sizeof value);
    record(JOURNAL_NAME(SetWindowLongPtrW),
           {arg(window), static_cast<uint64_t>(index), static_cast<uint64_t>(value)}, old);
    return old;
}

// A control's dialog; for a dialog, its owner (the layer's dialogs are popups, as on Windows).
HWND WINAPI GetParent(HWND window) {
    Window* w = findOrFail(window);
    return w ? w->parent : nullptr;
}

// An invalid window's text is empty.
int WINAPI GetWindowTextW(HWND window, LPWSTR text, int maxCount) {
    Window* w = findOrFail(window);
    return copyText(w ? w->text : std::u16string(), text, maxCount);
}

int WINAPI GetClassNameW(HWND window, LPWSTR className, int maxCount) {
    Window* w = findOrFail(window);
    return w ? copyText(w->className, className, maxCount) : 0;
}

HWND WINAPI GetFocus(void) {
    auto& focus = windowState().focus;
    auto it = focus.find(currentThread());
    return it == focus.end() ? nullptr : it->second;
}

// Top-level windows of the thread, the most recent first, as in z-order.
BOOL WINAPI EnumThreadWindows(DWORD threadId, WNDENUMPROC enumProc, LPARAM lParam) {
    std::vector<HWND> found;
    const auto& top = windowState().topLevel;
    for (auto it = top.rbegin(); it != top.rend(); ++it)
        if (findWindow(*it)->thread == threadId) found.push_back(*it);
    for (HWND window : found)
        if (findWindow(window) && !enumProc(window, lParam)) return FALSE;
    return !found.empty();
}

DWORD WINAPI GetCurrentThreadId(void) { return currentThread(); }
