// The dialog manager: modal dialogs built from classic templates, what it does with a message
// the dialog procedure leaves unhandled, and its keyboard (Enter and Escape).
#include "dialog_template.h"
#include "resources.h"
#include "window.h"

#include <cstring>

using namespace w32;

namespace {

// The class of a template item: Button and ListBox by their ordinals, any other as written.
Window* createControl(const DialogItemTemplate& item, HWND dialog) {
    Kind kind = Kind::Other;
    std::u16string name = item.windowClass.text;
    if (item.windowClass.isOrdinal && item.windowClass.ordinal == 0x80) {
        kind = Kind::Button;
        name = u"Button";
    } else if (item.windowClass.isOrdinal && item.windowClass.ordinal == 0x83) {
        kind = Kind::ListBox;
        name = u"ListBox";
    }
    return createWindow(kind, name, dialog);
}

Window* buildDialog(const DialogTemplate& t, HWND owner, DLGPROC proc) {
    Window* dialog = createWindow(Kind::Dialog, u"#32770", owner);
    dialog->style = t.style;
    dialog->text = t.title;
    dialog->proc = proc;
    for (const DialogItemTemplate& item : t.items) {
        Window* control = createControl(item, dialog->handle);
        control->style = item.style;
        control->id = item.id;
        control->text = item.title.isOrdinal ? u"" : item.title.text;
        if (control->kind == Kind::Button && (item.style & BS_TYPEMASK) == BS_DEFPUSHBUTTON &&
            !dialog->defaultId)
            dialog->defaultId = item.id;
        dialog->children.push_back(control->handle);
    }
    windowState().topLevel.push_back(dialog->handle);
    return dialog;
}

HWND firstTabStop(const Window& dialog) {
    for (HWND child : dialog.children)
        if (findWindow(child)->style & WS_TABSTOP) return child;
    return nullptr;
}

// Sends a button's command to its dialog, as a click on it would.
void command(Window& dialog, int id) {
    dispatch(dialog.handle, WM_COMMAND, MAKEWPARAM(id, BN_CLICKED),
             reinterpret_cast<LPARAM>(childWithId(dialog, id)));
}

// What the dialog manager does with a message the procedure left unhandled.
LRESULT defaultDialogMessage(Window& w, UINT message, WPARAM wParam) {
    switch (message) {
        case WM_SYSCOMMAND:
            if ((wParam & 0xFFF0) == SC_CLOSE) dispatch(w.handle, WM_CLOSE, 0, 0);
            return 0;
        case WM_CLOSE:
            // The close box acts as the Cancel button.
            postMessage(w.handle, WM_COMMAND, MAKEWPARAM(IDCANCEL, BN_CLICKED),
                        reinterpret_cast<LPARAM>(childWithId(w, IDCANCEL)));
            return 0;
        case DM_GETDEFID: return w.defaultId ? MAKELONG(w.defaultId, DC_HASDEFID) : 0;
        default: return 0;
    }
}

INT_PTR dialogBox(HINSTANCE instance, LPCWSTR name, HWND owner, DLGPROC proc, LPARAM param) {
    if (auto code = takeFault("DialogBoxParamW")) {
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
    if (!findResource(instance, ResourceTypeDialog, number, LanguageUsEnglish, &data, &size))
        return -1;
    DialogTemplate t;
    if (readDialogTemplate(data, size, &t) != TemplateStatus::Ok) {
        SetLastError(ERROR_INVALID_PARAMETER);
        return -1;
    }
    Window* dialog = buildDialog(t, owner, proc);
    HWND handle = dialog->handle;
    HWND first = firstTabStop(*dialog);
    dispatch(handle, WM_INITDIALOG, reinterpret_cast<WPARAM>(first), param);
    // Shown after its initialisation, the dialog gives the focus to its first tab stop.
    windowState().focus[currentThread()] = first;
    INT_PTR result = modalLoop(handle);
    destroyWindow(handle);
    return result;
}

}  // namespace

LRESULT w32::dialogMessage(Window& w, UINT message, WPARAM wParam, LPARAM lParam) {
    HWND handle = w.handle;
    INT_PTR handled = w.proc ? w.proc(handle, message, wParam, lParam) : FALSE;
    Window* still = findWindow(handle);
    if (!still) return 0;
    if (!handled) return defaultDialogMessage(*still, message, wParam);
    // A procedure that handled the message answers with DWLP_MSGRESULT.
    LRESULT result = 0;
    std::memcpy(&result, still->extra + DWLP_MSGRESULT, sizeof result);
    return result;
}

// Enter clicks the default button (IDOK when there is none), Escape the Cancel button; the
// key's release is swallowed with it.
bool w32::dialogKey(Window& dialog, const Message& m) {
    if (m.message == WM_KEYUP) return true;
    if (m.message != WM_KEYDOWN) return false;
    if (m.wParam == VK_RETURN) {
        LRESULT def = dispatch(dialog.handle, DM_GETDEFID, 0, 0);
        command(dialog, HIWORD(def) == DC_HASDEFID ? LOWORD(def) : IDOK);
        return true;
    }
    if (m.wParam == VK_ESCAPE) {
        command(dialog, IDCANCEL);
        return true;
    }
    return false;
}

INT_PTR WINAPI DialogBoxParamW(HINSTANCE instance, LPCWSTR name, HWND owner, DLGPROC proc,
                               LPARAM param) {
    INT_PTR result = dialogBox(instance, name, owner, proc, param);
    record("DialogBoxParamW",
           {arg(instance), arg(name), arg(owner), arg(proc), static_cast<uint64_t>(param)}, result);
    return result;
}

BOOL WINAPI EndDialog(HWND dialog, INT_PTR result) {
    Window* w = findOrFail(dialog);
    BOOL ok = w && w->kind == Kind::Dialog;
    if (ok) {
        w->ended = true;
        w->endResult = result;
    }
    record("EndDialog", {arg(dialog), static_cast<uint64_t>(result)}, ok);
    return ok;
}
