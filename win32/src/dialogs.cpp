// Windows of the portable layer: modal dialogs built from classic templates, their controls
// (push buttons, list boxes, anything else as a plain window with a text), the dialog
// manager's keyboard and default handling, posted messages and timers.
//
// Time here is virtual: a modal loop delivers posted messages first and, when none is left,
// fires the timer that is due next at once, advancing the clock. A loop that has neither while
// its dialog is still open would wait for ever on Windows; here it ends the dialog with -1,
// last error ERROR_TIMEOUT, and journals "ModalLoopStalled".
#include <algorithm>
#include <cstring>
#include <deque>
#include <map>
#include <memory>
#include <unistd.h>
#include <sys/syscall.h>

#include "dialog_template.h"
#include "internal.h"
#include "resources.h"

namespace {

// Slots of a dialog's extra window bytes: message result, dialog procedure, user data.
constexpr size_t dialogExtraBytes = 3 * sizeof(void*);
// Timer ticks one loop may deliver; a dialog still open after them counts as stalled.
constexpr unsigned maxTicks = 100000;

enum class Kind { Dialog, Button, ListBox, Other };

struct Window {
    HWND handle = nullptr;
    Kind kind = Kind::Other;
    std::u16string className;
    std::u16string text;
    DWORD style = 0;
    int id = 0;
    HWND parent = nullptr;  // the owner of a dialog, the dialog of a control
    DWORD thread = 0;
    BYTE extra[dialogExtraBytes] = {};
    std::vector<std::u16string> items;  // list box
    int selection = LB_ERR;             // list box
    bool ended = false;                 // dialog
    bool shown = false;                 // dialog, once its procedure has been initialised
    int defaultId = 0;                  // dialog: the default button DM_GETDEFID names
    INT_PTR endResult = 0;              // dialog
    std::vector<HWND> children;         // dialog, in template order
};

struct Message {
    HWND window;
    UINT message;
    WPARAM wParam;
    LPARAM lParam;
    DWORD thread;
};

struct Timer {
    HWND window;
    UINT_PTR id;
    UINT elapse;
    TIMERPROC proc;
    uint64_t due;
    DWORD thread;
};

struct State {
    std::map<HWND, std::unique_ptr<Window>> windows;
    std::vector<HWND> topLevel;  // dialogs, oldest first
    std::deque<Message> posted;
    std::vector<Timer> timers;
    uint64_t clock = 0;
    uintptr_t nextHandle = 0x10000;
    UINT_PTR nextThreadTimer = 0x7F00;
    std::map<DWORD, HWND> focus;  // per thread
};

State& state() {
    static State* s = new State;  // never destroyed, like the rest of the layer's state
    return *s;
}

// Removes the elements that match; returns how many.
template <typename T, typename Pred>
size_t eraseIf(std::vector<T>& v, Pred pred) {
    auto end = std::remove_if(v.begin(), v.end(), pred);
    size_t removed = static_cast<size_t>(v.end() - end);
    v.erase(end, v.end());
    return removed;
}

Window* find(HWND handle) {
    if (!handle) return nullptr;
    auto it = state().windows.find(handle);
    return it == state().windows.end() ? nullptr : it->second.get();
}

Window* findOrFail(HWND handle) {
    Window* w = find(handle);
    if (!w) SetLastError(ERROR_INVALID_WINDOW_HANDLE);
    return w;
}

DWORD currentThread() { return static_cast<DWORD>(syscall(SYS_gettid)); }

DLGPROC dialogProc(const Window& w) {
    DLGPROC proc = nullptr;
    std::memcpy(&proc, w.extra + DWLP_DLGPROC, sizeof proc);
    return proc;
}

LRESULT messageResult(const Window& w) {
    LRESULT result = 0;
    std::memcpy(&result, w.extra + DWLP_MSGRESULT, sizeof result);
    return result;
}

HWND newHandle() {
    // Never reused, so a destroyed window's handle stays invalid.
    State& s = state();
    s.nextHandle += 4;
    return reinterpret_cast<HWND>(s.nextHandle);
}

Window* createWindow(Kind kind, std::u16string className, HWND parent) {
    auto w = std::make_unique<Window>();
    w->handle = newHandle();
    w->kind = kind;
    w->className = std::move(className);
    w->parent = parent;
    w->thread = currentThread();
    Window* raw = w.get();
    state().windows[raw->handle] = std::move(w);
    return raw;
}

// The class of a template item: the predefined ordinals, or the name as written.
void classOf(const w32::TemplateId& id, Kind* kind, std::u16string* name) {
    static const std::pair<WORD, const char16_t*> predefined[] = {
        {0x80, u"Button"}, {0x81, u"Edit"}, {0x82, u"Static"},
        {0x83, u"ListBox"}, {0x84, u"ScrollBar"}, {0x85, u"ComboBox"}};
    *name = id.text;
    for (auto [ordinal, className] : predefined)
        if (id.isOrdinal && id.ordinal == ordinal) *name = className;
    *kind = Kind::Other;
    if (w32_wcsicmp(name->c_str(), u"Button") == 0) *kind = Kind::Button;
    if (w32_wcsicmp(name->c_str(), u"ListBox") == 0) *kind = Kind::ListBox;
}

LRESULT dispatch(HWND handle, UINT message, WPARAM wParam, LPARAM lParam);

void notifyParent(const Window& control, WORD code) {
    dispatch(control.parent, WM_COMMAND, MAKEWPARAM(control.id, code),
             reinterpret_cast<LPARAM>(control.handle));
}

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
    auto text = reinterpret_cast<LPCWSTR>(lParam);
    switch (message) {
        case LB_ADDSTRING: {
            if (!text) return LB_ERR;
            auto at = w.items.end();
            if (w.style & LBS_SORT)
                at = std::find_if(w.items.begin(), w.items.end(), [&](const std::u16string& s) {
                    return w32_wcsicmp(s.c_str(), text) > 0;
                });
            at = w.items.insert(at, std::u16string(text));
            int added = static_cast<int>(at - w.items.begin());
            if (w.selection >= added) ++w.selection;
            return added;
        }
        case LB_INSERTSTRING: {
            if (!text || index > count) return LB_ERR;
            if (index < 0) index = count;
            w.items.insert(w.items.begin() + index, std::u16string(text));
            if (w.selection >= index) ++w.selection;
            return index;
        }
        case LB_DELETESTRING:
            if (index < 0 || index >= count) return LB_ERR;
            w.items.erase(w.items.begin() + index);
            if (w.selection == index) w.selection = LB_ERR;
            if (w.selection > index) --w.selection;
            return count - 1;
        case LB_RESETCONTENT: w.items.clear(); w.selection = LB_ERR; return 0;
        case LB_SETCURSEL:
            // -1 clears the selection and answers LB_ERR; another index out of range changes
            // nothing (as in Wine, in both process kinds; the documentation does not say).
            if (index >= count || index < -1) return LB_ERR;
            w.selection = index >= 0 ? index : LB_ERR;
            return w.selection;
        case LB_GETCURSEL: return w.selection;
        case LB_GETCOUNT: return count;
        case LB_GETTEXTLEN:
            return index >= 0 && index < count ? static_cast<LRESULT>(w.items[index].size()) : LB_ERR;
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

LRESULT buttonMessage(Window& w, UINT message) {
    if (message == BM_CLICK && !(w.style & WS_DISABLED)) notifyParent(w, BN_CLICKED);
    return 0;
}

// Text messages every window answers.
LRESULT defaultMessage(Window& w, UINT message, WPARAM wParam, LPARAM lParam) {
    switch (message) {
        case WM_GETTEXT:
            return copyText(w.text, reinterpret_cast<LPWSTR>(lParam), static_cast<int>(wParam));
        case WM_GETTEXTLENGTH: return static_cast<LRESULT>(w.text.size());
        case WM_SETTEXT:
            w.text = lParam ? reinterpret_cast<LPCWSTR>(lParam) : u"";
            return TRUE;
        default: return 0;
    }
}

HWND childWithId(const Window& dialog, int id) {
    for (HWND child : dialog.children)
        if (find(child)->id == id) return child;
    return nullptr;
}

// The default push button's identifier, as DM_GETDEFID answers it when the procedure does not.
LRESULT defaultButton(const Window& dialog) {
    return dialog.defaultId ? MAKELONG(dialog.defaultId, DC_HASDEFID) : 0;
}

bool isPushButton(const Window* w) {
    DWORD type = w ? w->style & BS_TYPEMASK : ~0u;
    return w && w->kind == Kind::Button && (type == BS_PUSHBUTTON || type == BS_DEFPUSHBUTTON);
}

// The dialog manager moves the focus: a push button that gets it looks like the default one,
// any other control gives that look back to the dialog's default button. A plain SetFocus
// does not do this, so Enter on a button focused that way still clicks the default button.
void moveDefault(Window& dialog, HWND focused) {
    const Window* f = find(focused);
    int id = isPushButton(f) ? f->id : dialog.defaultId;
    for (HWND child : dialog.children) {
        Window& c = *find(child);
        if (!isPushButton(&c)) continue;
        c.style = (c.style & ~BS_TYPEMASK) | (c.id == id ? BS_DEFPUSHBUTTON : BS_PUSHBUTTON);
    }
}

// Gives `to` the thread's keyboard focus; a list box that loses or gets it tells its dialog.
void changeFocus(DWORD thread, HWND to) {
    HWND from = state().focus[thread];
    if (from == to) return;
    state().focus[thread] = to;
    if (Window* w = find(from); w && w->kind == Kind::ListBox) notifyParent(*w, LBN_KILLFOCUS);
    if (Window* w = find(to); w && w->kind == Kind::ListBox) notifyParent(*w, LBN_SETFOCUS);
}

void postMessage(HWND window, UINT message, WPARAM wParam, LPARAM lParam) {
    state().posted.push_back(Message{window, message, wParam, lParam, currentThread()});
}

// What the dialog manager does with a message the procedure left unhandled.
LRESULT defaultDialogMessage(Window& w, UINT message, WPARAM wParam, LPARAM lParam) {
    switch (message) {
        case WM_SYSCOMMAND:
            if ((wParam & 0xFFF0) == SC_CLOSE) dispatch(w.handle, WM_CLOSE, 0, 0);
            return 0;
        case WM_CLOSE: {
            // The close box acts as the Cancel button, unless that button is disabled.
            HWND cancel = childWithId(w, IDCANCEL);
            if (!cancel || !(find(cancel)->style & WS_DISABLED))
                postMessage(w.handle, WM_COMMAND, MAKEWPARAM(IDCANCEL, BN_CLICKED),
                            reinterpret_cast<LPARAM>(cancel));
            return 0;
        }
        case DM_GETDEFID: return defaultButton(w);
        default: return defaultMessage(w, message, wParam, lParam);
    }
}

LRESULT dialogMessage(Window& w, UINT message, WPARAM wParam, LPARAM lParam) {
    HWND handle = w.handle;
    DLGPROC proc = dialogProc(w);
    INT_PTR handled = proc ? proc(handle, message, wParam, lParam) : FALSE;
    Window* still = find(handle);
    if (!still) return 0;
    if (!handled) return defaultDialogMessage(*still, message, wParam, lParam);
    // These few answer with the procedure's own value; the rest with DWLP_MSGRESULT.
    if (message == WM_INITDIALOG) return handled;
    return messageResult(*still);
}

LRESULT dispatch(HWND handle, UINT message, WPARAM wParam, LPARAM lParam) {
    Window* w = find(handle);
    if (!w) return 0;
    switch (w->kind) {
        case Kind::Dialog: return dialogMessage(*w, message, wParam, lParam);
        case Kind::ListBox:
            if (message >= LB_ADDSTRING && message <= LB_GETCOUNT)
                return listBoxMessage(*w, message, wParam, lParam);
            return defaultMessage(*w, message, wParam, lParam);
        case Kind::Button:
            if (message == BM_CLICK) return buttonMessage(*w, message);
            return defaultMessage(*w, message, wParam, lParam);
        default: return defaultMessage(*w, message, wParam, lParam);
    }
}

// The dialog a window belongs to: itself, or its parent dialog.
Window* dialogOf(HWND handle) {
    Window* w = find(handle);
    if (w && w->kind != Kind::Dialog) w = find(w->parent);
    return w && w->kind == Kind::Dialog ? w : nullptr;
}

// The dialog manager's keyboard: Enter and Escape become commands, Tab moves the focus.
bool dialogKey(Window& dialog, const Message& m) {
    if (m.message == WM_KEYUP || m.message == WM_CHAR) return true;
    if (m.message != WM_KEYDOWN) return false;
    HWND focused = state().focus[m.thread];
    Window* f = find(focused);
    if (m.wParam == VK_RETURN) {
        int id = IDOK;
        if (isPushButton(f) && f->parent == dialog.handle &&
            (f->style & BS_TYPEMASK) == BS_DEFPUSHBUTTON) {
            id = f->id;
        } else if (LRESULT def = dispatch(dialog.handle, DM_GETDEFID, 0, 0);
                   HIWORD(def) == DC_HASDEFID) {
            id = LOWORD(def);
        }
        dispatch(dialog.handle, WM_COMMAND, MAKEWPARAM(id, BN_CLICKED),
                 reinterpret_cast<LPARAM>(childWithId(dialog, id)));
        return true;
    }
    if (m.wParam == VK_ESCAPE) {
        dispatch(dialog.handle, WM_COMMAND, MAKEWPARAM(IDCANCEL, BN_CLICKED),
                 reinterpret_cast<LPARAM>(childWithId(dialog, IDCANCEL)));
        return true;
    }
    if (m.wParam == VK_TAB) {
        std::vector<HWND> stops;
        for (HWND child : dialog.children)
            if ((find(child)->style & (WS_TABSTOP | WS_DISABLED)) == WS_TABSTOP) stops.push_back(child);
        if (stops.empty()) return true;
        auto at = std::find(stops.begin(), stops.end(), focused);
        HWND next = at == stops.end() || at + 1 == stops.end() ? stops[0] : *(at + 1);
        changeFocus(m.thread, next);
        moveDefault(dialog, next);
        return true;
    }
    return false;
}

void deliver(const Message& m) {
    if (m.message == WM_TIMER && m.lParam) {
        reinterpret_cast<TIMERPROC>(m.lParam)(m.window, WM_TIMER, m.wParam,
                                              static_cast<DWORD>(state().clock));
        return;
    }
    if (Window* dialog = dialogOf(m.window))
        if (dialogKey(*dialog, m)) return;
    dispatch(m.window, m.message, m.wParam, m.lParam);
}

// Takes the next posted message of this thread, if there is one.
bool takePosted(DWORD thread, Message* out) {
    auto& posted = state().posted;
    for (auto it = posted.begin(); it != posted.end(); ++it) {
        if (it->thread != thread) continue;
        *out = *it;
        posted.erase(it);
        return true;
    }
    return false;
}

// Fires this thread's timer that is due first: a WM_TIMER message, with its procedure.
bool fireTimer(DWORD thread, Message* out) {
    State& s = state();
    Timer* next = nullptr;
    for (Timer& t : s.timers)
        if (t.thread == thread && (!next || t.due < next->due)) next = &t;
    if (!next) return false;
    s.clock = std::max(s.clock, next->due);
    next->due = s.clock + next->elapse;
    *out = Message{next->window, WM_TIMER, next->id,
                   reinterpret_cast<LPARAM>(next->proc), thread};
    return true;
}

void destroyWindow(HWND handle) {
    State& s = state();
    Window* w = find(handle);
    if (!w) return;
    if (w->kind == Kind::Dialog) {
        if (dialogOf(s.focus[w->thread]) == w) changeFocus(w->thread, nullptr);
        dispatch(handle, WM_DESTROY, 0, 0);
    }
    for (HWND child : std::vector<HWND>(w->children)) destroyWindow(child);
    eraseIf(s.timers, [&](const Timer& t) { return t.window == handle; });
    eraseIf(s.topLevel, [&](HWND h) { return h == handle; });
    for (auto& [thread, focused] : s.focus)
        if (focused == handle) focused = nullptr;
    s.windows.erase(handle);
}

Window* buildDialog(const w32::DialogTemplate& t, HWND owner, DLGPROC proc) {
    std::u16string className = u"#32770";
    if (!t.windowClass.isOrdinal && !t.windowClass.text.empty()) className = t.windowClass.text;
    Window* dialog = createWindow(Kind::Dialog, className, owner);
    dialog->style = t.style;
    dialog->text = t.title;
    std::memcpy(dialog->extra + DWLP_DLGPROC, &proc, sizeof proc);
    for (const w32::DialogItemTemplate& item : t.items) {
        Kind kind;
        std::u16string name;
        classOf(item.windowClass, &kind, &name);
        Window* control = createWindow(kind, name, dialog->handle);
        control->style = item.style;
        control->id = item.id;
        control->text = item.title.isOrdinal ? u"" : item.title.text;
        if (kind == Kind::Button && (item.style & BS_TYPEMASK) == BS_DEFPUSHBUTTON &&
            !dialog->defaultId)
            dialog->defaultId = item.id;
        dialog->children.push_back(control->handle);
    }
    state().topLevel.push_back(dialog->handle);
    return dialog;
}

HWND firstTabStop(const Window& dialog) {
    for (HWND child : dialog.children)
        if ((find(child)->style & (WS_TABSTOP | WS_DISABLED | WS_VISIBLE)) == (WS_TABSTOP | WS_VISIBLE))
            return child;
    return nullptr;
}

// Runs the modal loop of `dialog` until it ends; returns its end value.
INT_PTR modalLoop(HWND dialog) {
    DWORD thread = currentThread();
    for (unsigned ticks = 0;;) {
        Window* w = find(dialog);
        if (!w) return -1;
        if (w->ended) return w->endResult;
        Message m;
        if (takePosted(thread, &m)) {
            deliver(m);
            continue;
        }
        if (ticks < maxTicks && fireTimer(thread, &m)) {
            ++ticks;
            deliver(m);
            continue;
        }
        w32::record("ModalLoopStalled", {w32::arg(dialog)}, -1);
        SetLastError(ERROR_TIMEOUT);
        return -1;
    }
}

INT_PTR dialogBox(HINSTANCE instance, LPCWSTR name, HWND owner, DLGPROC proc, LPARAM param) {
    if (auto code = w32::takeFault("DialogBoxParamW")) {
        SetLastError(static_cast<DWORD>(*code));
        return -1;
    }
    // "If the function fails because the hWndParent parameter is invalid, the return value is
    // zero", for compatibility with earlier versions; other failures are -1.
    if (owner && !findOrFail(owner)) return 0;
    const BYTE* data = nullptr;
    size_t size = 0;
    if (!IS_INTRESOURCE(name)) {
        SetLastError(ERROR_RESOURCE_NAME_NOT_FOUND);  // the module's templates are numbered
        return -1;
    }
    auto number = static_cast<WORD>(reinterpret_cast<ULONG_PTR>(name));
    if (!w32::findResource(instance, w32::resourceTypeDialog, number, w32::languageUsEnglish,
                           &data, &size))
        return -1;
    w32::DialogTemplate t;
    if (w32::readDialogTemplate(data, size, &t) != w32::TemplateStatus::ok) {
        SetLastError(ERROR_INVALID_PARAMETER);
        return -1;
    }
    Window* dialog = buildDialog(t, owner, proc);
    HWND handle = dialog->handle;
    HWND first = firstTabStop(*dialog);
    bool focusFirst = dispatch(handle, WM_INITDIALOG, reinterpret_cast<WPARAM>(first), param);
    // Shown after its initialisation, the dialog is active; the focus goes to the first tab
    // stop unless the procedure returned FALSE and put it on a control of its own.
    if (Window* shown = find(handle)) {
        shown->shown = true;
        if (focusFirst || dialogOf(GetFocus()) != shown) {
            changeFocus(currentThread(), first);
            moveDefault(*shown, first);
        }
    }
    INT_PTR result = modalLoop(handle);
    destroyWindow(handle);
    return result;
}

// The extra bytes of a dialog, or the few negative indices every window answers.
bool readLong(HWND handle, int index, void* out, size_t size) {
    Window* w = findOrFail(handle);
    if (!w) return false;
    LONG_PTR value = 0;
    if (index == GWL_STYLE) value = static_cast<LONG>(w->style);
    else if (index == GWLP_ID) value = w->id;
    if (index < 0) {
        std::memcpy(out, &value, size);
        return index == GWL_STYLE || index == GWLP_ID;
    }
    if (w->kind != Kind::Dialog || static_cast<size_t>(index) + size > dialogExtraBytes) {
        SetLastError(ERROR_INVALID_INDEX);
        return false;
    }
    std::memcpy(out, w->extra + index, size);
    return true;
}

bool writeLong(HWND handle, int index, const void* value, void* old, size_t size) {
    if (!readLong(handle, index, old, size) || index < 0) return false;
    std::memcpy(find(handle)->extra + index, value, size);
    return true;
}

}  // namespace

INT_PTR WINAPI DialogBoxParamW(HINSTANCE instance, LPCWSTR name, HWND owner, DLGPROC proc,
                               LPARAM param) {
    INT_PTR result = dialogBox(instance, name, owner, proc, param);
    w32::record("DialogBoxParamW", {w32::arg(instance), w32::arg(name), w32::arg(owner),
                                    w32::arg(proc), static_cast<uint64_t>(param)}, result);
    return result;
}

BOOL WINAPI EndDialog(HWND dialog, INT_PTR result) {
    Window* w = findOrFail(dialog);
    BOOL ok = w && w->kind == Kind::Dialog;
    if (ok) {
        w->ended = true;
        w->endResult = result;
    }
    w32::record("EndDialog", {w32::arg(dialog), static_cast<uint64_t>(result)}, ok);
    return ok;
}

HWND WINAPI GetDlgItem(HWND dialog, int id) {
    Window* w = findOrFail(dialog);
    HWND found = w ? childWithId(*w, id) : nullptr;
    if (w && !found) SetLastError(ERROR_CONTROL_ID_NOT_FOUND);
    w32::record("GetDlgItem", {w32::arg(dialog), static_cast<uint64_t>(id)},
                static_cast<int64_t>(reinterpret_cast<intptr_t>(found)));
    return found;
}

int WINAPI GetDlgCtrlID(HWND window) {
    Window* w = findOrFail(window);
    return w ? w->id : 0;
}

LRESULT WINAPI SendMessageW(HWND window, UINT message, WPARAM wParam, LPARAM lParam) {
    LRESULT result = findOrFail(window) ? dispatch(window, message, wParam, lParam) : 0;
    w32::record("SendMessageW", {w32::arg(window), message, wParam, static_cast<uint64_t>(lParam)},
                result);
    return result;
}

BOOL WINAPI PostMessageW(HWND window, UINT message, WPARAM wParam, LPARAM lParam) {
    BOOL ok = findOrFail(window) != nullptr;
    if (ok) postMessage(window, message, wParam, lParam);
    w32::record("PostMessageW", {w32::arg(window), message, wParam, static_cast<uint64_t>(lParam)},
                ok);
    return ok;
}

LONG WINAPI GetWindowLongW(HWND window, int index) {
    LONG value = 0;
    readLong(window, index, &value, sizeof value);
    w32::record("GetWindowLongW", {w32::arg(window), static_cast<uint64_t>(index)}, value);
    return value;
}

LONG WINAPI SetWindowLongW(HWND window, int index, LONG value) {
    LONG old = 0;
    writeLong(window, index, &value, &old, sizeof value);
    w32::record("SetWindowLongW", {w32::arg(window), static_cast<uint64_t>(index),
                                   static_cast<uint64_t>(value)}, old);
    return old;
}

#if defined(__x86_64__)
LONG_PTR WINAPI GetWindowLongPtrW(HWND window, int index) {
    LONG_PTR value = 0;
    readLong(window, index, &value, sizeof value);
    w32::record("GetWindowLongPtrW", {w32::arg(window), static_cast<uint64_t>(index)}, value);
    return value;
}

LONG_PTR WINAPI SetWindowLongPtrW(HWND window, int index, LONG_PTR value) {
    LONG_PTR old = 0;
    writeLong(window, index, &value, &old, sizeof value);
    w32::record("SetWindowLongPtrW", {w32::arg(window), static_cast<uint64_t>(index),
                                      static_cast<uint64_t>(value)}, old);
    return old;
}
#endif

BOOL WINAPI IsWindow(HWND window) { return find(window) != nullptr; }

// A control's dialog; for a dialog, its owner when it is a popup, as on Windows.
HWND WINAPI GetParent(HWND window) {
    Window* w = findOrFail(window);
    if (!w || (w->kind == Kind::Dialog && !(w->style & WS_POPUP))) return nullptr;
    return w->parent;
}

int WINAPI GetWindowTextW(HWND window, LPWSTR text, int maxCount) {
    Window* w = findOrFail(window);
    if (!w) {
        if (text && maxCount > 0) text[0] = 0;
        return 0;
    }
    return copyText(w->text, text, maxCount);
}

int WINAPI GetClassNameW(HWND window, LPWSTR className, int maxCount) {
    Window* w = findOrFail(window);
    return w ? copyText(w->className, className, maxCount) : 0;
}

HWND WINAPI GetFocus(void) {
    auto& focus = state().focus;
    auto it = focus.find(currentThread());
    return it == focus.end() ? nullptr : it->second;
}

HWND WINAPI SetFocus(HWND window) {
    HWND previous = GetFocus();
    if (window && !findOrFail(window)) return nullptr;
    changeFocus(currentThread(), window);
    return previous;
}

// The thread's most recent dialog on show stands in for the active and the foreground window.
HWND WINAPI GetActiveWindow(void) {
    const auto& top = state().topLevel;
    for (auto it = top.rbegin(); it != top.rend(); ++it)
        if (find(*it)->thread == currentThread() && find(*it)->shown) return *it;
    return nullptr;
}

HWND WINAPI GetForegroundWindow(void) { return GetActiveWindow(); }

// Top-level windows of the thread, the most recent first, as in z-order.
BOOL WINAPI EnumThreadWindows(DWORD threadId, WNDENUMPROC enumProc, LPARAM lParam) {
    std::vector<HWND> found;
    const auto& top = state().topLevel;
    for (auto it = top.rbegin(); it != top.rend(); ++it)
        if (find(*it)->thread == threadId) found.push_back(*it);
    for (HWND window : found)
        if (find(window) && !enumProc(window, lParam)) return FALSE;
    return !found.empty();
}

DWORD WINAPI GetCurrentThreadId(void) { return currentThread(); }

UINT_PTR WINAPI SetTimer(HWND window, UINT_PTR id, UINT elapse, TIMERPROC timerProc) {
    State& s = state();
    UINT_PTR result = 0;
    if (!window || findOrFail(window)) {
        // Windows raises elapses below 10 ms to 10 ms.
        UINT wait = std::max<UINT>(elapse, 10);
        if (!window) id = ++s.nextThreadTimer;
        eraseIf(s.timers, [&](const Timer& t) { return t.window == window && t.id == id; });
        s.timers.push_back(Timer{window, id, wait, timerProc, s.clock + wait, currentThread()});
        result = window && id == 0 ? 1 : id;
    }
    w32::record("SetTimer", {w32::arg(window), id, elapse, w32::arg(timerProc)},
                static_cast<int64_t>(result));
    return result;
}

BOOL WINAPI KillTimer(HWND window, UINT_PTR id) {
    BOOL ok = eraseIf(state().timers, [&](const Timer& t) {
                  return t.window == window && t.id == id;
              }) > 0;
    w32::record("KillTimer", {w32::arg(window), id}, ok);
    return ok;
}

namespace w32test {

std::vector<HWND> liveWindows() {
    std::vector<HWND> out;
    for (const auto& [handle, window] : state().windows) out.push_back(handle);
    return out;
}

size_t pendingTimers() { return state().timers.size(); }

void resetWindows() {
    // Dropped without WM_DESTROY: their procedures may belong to a test that has ended.
    State& s = state();
    s.windows.clear();
    s.topLevel.clear();
    s.posted.clear();
    s.timers.clear();
    s.focus.clear();
}

}  // namespace w32test
