// The root-key parameter of conditions and actions: a new record, the dialog that picks a root
// key, and the name the event sheet shows.
#include <string.h>
#include <wchar.h>

#include "../resources/resource.h"
#include "../runtime/key_selection.h"
#include "module_entry.h"

namespace {

// Fills the list with the root names in table order and selects the record's root.
void InitRootKeyDialog(HWND dialog, BYTE* rootIndex) {
    SetWindowLongPtrW(dialog, DWLP_USER, reinterpret_cast<LONG_PTR>(rootIndex));
    HWND list = GetDlgItem(dialog, IDC_ROOT_KEY_LIST);
    for (const RootKey* root = RootKeyTable; root->name; ++root)
        SendMessageW(list, LB_ADDSTRING, 0, reinterpret_cast<LPARAM>(root->name));
    DWORD index = LoadRootIndex(rootIndex);
    // Without a valid index nothing is selected; -1 also clears any selection.
    WPARAM position = RootKeyAt(index) ? index : static_cast<WPARAM>(-1);
    SendMessageW(list, LB_SETCURSEL, position, 0);
}

// OK keeps the dialog open until a name is selected.
void AcceptRootKey(HWND dialog) {
    LRESULT selected = SendMessageW(GetDlgItem(dialog, IDC_ROOT_KEY_LIST), LB_GETCURSEL, 0, 0);
    if (selected == LB_ERR) return;
    auto* rootIndex = reinterpret_cast<BYTE*>(GetWindowLongPtrW(dialog, DWLP_USER));
    StoreRootIndex(rootIndex, static_cast<DWORD>(selected));
    EndDialog(dialog, 1);
}

}  // namespace

INT_PTR CALLBACK RootKeyDialogProc(HWND dialog, UINT message, WPARAM wParam, LPARAM lParam) {
    if (message == WM_INITDIALOG) {
        InitRootKeyDialog(dialog, reinterpret_cast<RootKeyParam*>(lParam)->rootIndex);
        return TRUE;
    }
    if (message != WM_COMMAND) return FALSE;
    switch (LOWORD(wParam)) {
        case IDOK: AcceptRootKey(dialog); return TRUE;
        case IDCANCEL: EndDialog(dialog, 0); return TRUE;
        default: return FALSE;
    }
}

HV_EXPORT void WINAPI InitParameter(HostValue, HostValue, RootKeyParam* param) {
    param->size = 16;
    StoreRootIndex(param->rootIndex, 0);
}

HV_EXPORT INT_PTR WINAPI EditParameter(const EditorStructure* editor, HostValue,
                                       RootKeyParam* param) {
    return DialogBoxParamW(moduleInstance, MAKEINTRESOURCEW(IDD_ROOT_KEY), editor->window,
                           RootKeyDialogProc, reinterpret_cast<LPARAM>(param));
}

// A capacity too small for the name and its terminator still gets a terminated (cut) name:
// the last character of the capacity is always zero, and nothing is written past it.
HV_EXPORT void WINAPI GetParameterString(HostValue, HostValue, const RootKeyParam* param,
                                         LPWSTR buffer, HostValue capacity) {
    const RootKey* root = RootKeyAt(RootIndexOf(param));
    if (!root) return;
    auto count = static_cast<short>(static_cast<WORD>(capacity));
    if (count <= 0) return;
    wcsncpy(buffer, root->name, static_cast<size_t>(count));
    buffer[count - 1] = 0;
}
