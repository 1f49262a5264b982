// Dialogs over the module's dialog 101: DialogBoxParamW's failures, the messages a procedure
// gets, list-box and button semantics, the dialog manager's keys and close box, the focus; over
// the layer also its template reader and a modal loop left with nothing to deliver.
#include <functional>

#include "module_path.h"

#if HV_OVER_LAYER
#include "dialog_template.h"
#include "resources.h"
#endif

namespace {

const int ListId = 1001;
// Under Windows a dialog that nobody closes would wait for ever: a window timer ends it.
const UINT_PTR Watchdog = 0x5AFE;
const INT_PTR NobodyClosed = -2;

struct Command {
    int id, code;
    LPARAM from;
};

// What the test procedure does and saw; one dialog at a time.
struct Script {
    std::function<void(HWND)> onInit = [](HWND) {};
    INT_PTR initResult = TRUE;
    bool endOnOkOrCancel = true;
    WPARAM initWParam = 0;
    LPARAM initLParam = 0;
    std::vector<Command> commands;
    HWND dialog = nullptr;
} script;

INT_PTR CALLBACK testProc(HWND dialog, UINT message, WPARAM wParam, LPARAM lParam) {
    if (message == WM_TIMER && wParam == Watchdog) return EndDialog(dialog, NobodyClosed);
    if (message == WM_INITDIALOG) {
        if (!HV_OVER_LAYER) SetTimer(dialog, Watchdog, 5000, nullptr);
        script.dialog = dialog;
        script.initWParam = wParam;
        script.initLParam = lParam;
        script.onInit(dialog);
        return script.initResult;
    }
    if (message != WM_COMMAND) return FALSE;
    script.commands.push_back({LOWORD(wParam), HIWORD(wParam), lParam});
    if (script.endOnOkOrCancel && (LOWORD(wParam) == IDOK || LOWORD(wParam) == IDCANCEL))
        EndDialog(dialog, 100 + LOWORD(wParam));
    return TRUE;
}

class Dialogs : public testing::Test {
protected:
    static void SetUpTestSuite() { module = LoadLibraryW(modulePath().c_str()); }
    static void TearDownTestSuite() { FreeLibrary(module); }
    void SetUp() override {
        ASSERT_NE(module, nullptr);
#if HV_OVER_LAYER
        w32test::reset();
#endif
        script = Script{};
    }
    // No window of this thread outlives its dialog.
    void TearDown() override {
        int count = 0;
        EnumThreadWindows(GetCurrentThreadId(), countWindow, reinterpret_cast<LPARAM>(&count));
        EXPECT_EQ(count, 0);
    }
    static BOOL CALLBACK countWindow(HWND, LPARAM count) {
        ++*reinterpret_cast<int*>(count);
        return TRUE;
    }
    static BOOL CALLBACK firstWindow(HWND window, LPARAM found) {
        *reinterpret_cast<HWND*>(found) = window;
        return FALSE;
    }
    static INT_PTR run(WORD id = 101, HWND owner = nullptr) {
        return DialogBoxParamW(module, MAKEINTRESOURCEW(id), owner, testProc, 0x5EED);
    }
    static HMODULE module;
};
HMODULE Dialogs::module = nullptr;

TEST_F(Dialogs, TemplateReaderAndItsBounds) {
    HV_LAYER_ONLY("the layer's template reader");
#if HV_OVER_LAYER
    const BYTE* data = nullptr;
    size_t size = 0;
    ASSERT_TRUE(w32::findResource(module, w32::ResourceTypeDialog, 101, 0x409, &data, &size));
    w32::DialogTemplate t;
    ASSERT_EQ(w32::readDialogTemplate(data, size, &t), w32::TemplateStatus::Ok);
    EXPECT_EQ(t.style, 0x80C800C0u);
    EXPECT_EQ(t.title, TEXT("Select a root key"));
    ASSERT_EQ(t.items.size(), 3u);
    EXPECT_EQ(t.items[2].id, ListId);
    EXPECT_EQ(t.items[2].windowClass.ordinal, 0x83);
    EXPECT_EQ(t.items[0].title.text, TEXT("OK"));
    // Every cut of the template is refused without reading past it.
    for (size_t cut = 0; cut + 3 < size; ++cut) {
        std::vector<BYTE> prefix(data, data + cut);
        EXPECT_EQ(w32::readDialogTemplate(prefix.data(), prefix.size(), &t),
                  w32::TemplateStatus::Truncated)
            << cut;
    }
    const BYTE extended[] = {1, 0, 0xFF, 0xFF, 0, 0, 0, 0};
    EXPECT_EQ(w32::readDialogTemplate(extended, sizeof extended, &t),
              w32::TemplateStatus::Extended);
#endif
}

// -1, except for an invalid owner: "the return value is zero", for compatibility.
TEST_F(Dialogs, FailuresReturnMinusOneOrZeroAndCreateNothing) {
    int dummy = 0;
    const struct {
        std::function<INT_PTR()> call;
        INT_PTR result;
        DWORD error;
    } cases[] = {
        {[] { return run(999); }, -1, ERROR_RESOURCE_NAME_NOT_FOUND},
        {[] { return DialogBoxParamW(module, TEXT("ROOT"), nullptr, testProc, 0); }, -1,
         ERROR_RESOURCE_NAME_NOT_FOUND},
        {[] { return DialogBoxParamW(nullptr, MAKEINTRESOURCEW(101), nullptr, testProc, 0); }, -1,
         ERROR_RESOURCE_DATA_NOT_FOUND},
        {[&] { return run(101, reinterpret_cast<HWND>(&dummy)); }, 0, ERROR_INVALID_WINDOW_HANDLE},
#if HV_OVER_LAYER
        {[] {
             w32test::failCall("DialogBoxParamW", 1, 8);
             return run();
         },
         -1, 8},
#endif
    };
    for (size_t i = 0; i < std::size(cases); ++i) {
        SCOPED_TRACE(i);
        SetLastError(0);
        EXPECT_EQ(cases[i].call(), cases[i].result);
        EXPECT_EQ(GetLastError(), cases[i].error);
        EXPECT_EQ(script.dialog, nullptr);
    }
}

TEST_F(Dialogs, InitialisationUserSlotAndWindows) {
    HWND ok = nullptr;
    script.onInit = [&](HWND dialog) {
        ok = GetDlgItem(dialog, IDOK);
        EXPECT_EQ(SetWindowLongPtrW(dialog, DWLP_USER, 0x1234), 0);
        EXPECT_EQ(GetWindowLongPtrW(dialog, DWLP_USER), 0x1234);
        WCHAR text[32];
        EXPECT_EQ(GetClassNameW(dialog, text, 32), 6);
        EXPECT_EQ(WString(text), TEXT("#32770"));
        EXPECT_EQ(GetWindowTextW(dialog, text, 7), 6);
        EXPECT_EQ(WString(text), TEXT("Select"));
        EXPECT_EQ(GetDlgCtrlID(GetDlgItem(dialog, ListId)), ListId);
        EXPECT_EQ(GetParent(GetDlgItem(dialog, ListId)), dialog);
        HWND found = nullptr;  // the thread's one top-level window, where the walk stops
        EXPECT_FALSE(
            EnumThreadWindows(GetCurrentThreadId(), firstWindow, reinterpret_cast<LPARAM>(&found)));
        EXPECT_EQ(found, dialog);
        EXPECT_NE(GetDlgItem(dialog, IDCANCEL), nullptr);
        EXPECT_EQ(GetDlgItem(dialog, 77), nullptr);
        PostMessageW(dialog, WM_COMMAND, IDCANCEL, 0);
    };
    EXPECT_EQ(run(), 100 + IDCANCEL);
    EXPECT_EQ(script.initLParam, 0x5EED);
    EXPECT_EQ(reinterpret_cast<HWND>(script.initWParam), ok);  // the first tab stop
    EXPECT_EQ(script.commands.size(), 1u);
    EXPECT_EQ(GetDlgCtrlID(script.dialog), 0);  // gone
    EXPECT_EQ(GetLastError(), DWORD(ERROR_INVALID_WINDOW_HANDLE));
}

TEST_F(Dialogs, ListBoxFollowsWindowsSemantics) {
    script.onInit = [](HWND dialog) {
        HWND list = GetDlgItem(dialog, ListId);
        auto send = [&](UINT m, WPARAM w, LPARAM l = 0) { return SendMessageW(list, m, w, l); };
        EXPECT_EQ(send(LB_GETCURSEL, 0), LB_ERR);
        for (const WCHAR* name : {TEXT("b"), TEXT("a"), TEXT("c")})
            send(LB_ADDSTRING, 0, reinterpret_cast<LPARAM>(name));
        EXPECT_EQ(send(LB_GETCOUNT, 0), 3);
        WCHAR text[8];
        EXPECT_EQ(send(LB_GETTEXT, 1, reinterpret_cast<LPARAM>(text)), 1);
        EXPECT_EQ(WString(text), TEXT("a"));  // no LBS_SORT: order of adding
        EXPECT_EQ(send(LB_GETTEXTLEN, 3), LB_ERR);
        // -1 clears the selection; an index out of range leaves it (the documentation does
        // not say; Wine's answer in both process kinds).
        const struct {
            WPARAM index;
            LRESULT result, selected;
        } selections[] = {{2, 2, 2}, {WPARAM(-1), LB_ERR, LB_ERR},
                          {1, 1, 1}, {3, LB_ERR, 1},
                          {0, 0, 0}, {99, LB_ERR, 0}};
        for (auto [index, result, selected] : selections) {
            EXPECT_EQ(send(LB_SETCURSEL, index), result) << index;
            EXPECT_EQ(send(LB_GETCURSEL, 0), selected) << index;
        }
        EndDialog(dialog, 7);
    };
    EXPECT_EQ(run(), 7);
}

// The commands the procedure got from buttons (BN_CLICKED), leaving out the list's.
std::vector<int> buttonCommands() {
    std::vector<int> ids;
    for (const Command& c : script.commands)
        if (c.id != ListId) ids.push_back(c.code == BN_CLICKED ? c.id : -c.code);
    return ids;
}

// Each case: what happens after initialisation, and the one button command that follows.
TEST_F(Dialogs, ButtonsKeysAndCloseBox) {
    const struct {
        const char* name;
        std::function<void(HWND)> act;
        int id;
    } cases[] = {
        {"BM_CLICK", [](HWND d) { SendMessageW(GetDlgItem(d, IDCANCEL), BM_CLICK, 0, 0); },
         IDCANCEL},
        {"Enter on OK", [](HWND d) { PostMessageW(GetDlgItem(d, IDOK), WM_KEYDOWN, VK_RETURN, 0); },
         IDOK},
        {"Enter on the list",  // the default button, not the control the key went to
         [](HWND d) { PostMessageW(GetDlgItem(d, ListId), WM_KEYDOWN, VK_RETURN, 0); }, IDOK},
        {"Escape", [](HWND d) { PostMessageW(GetDlgItem(d, ListId), WM_KEYDOWN, VK_ESCAPE, 0); },
         IDCANCEL},
        {"close box", [](HWND d) { PostMessageW(d, WM_SYSCOMMAND, SC_CLOSE, 0); }, IDCANCEL},
        {"WM_CLOSE", [](HWND d) { SendMessageW(d, WM_CLOSE, 0, 0); }, IDCANCEL},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.name);
        script = Script{};
        script.onInit = c.act;
        EXPECT_EQ(run(), 100 + c.id);
        EXPECT_EQ(buttonCommands(), std::vector<int>{c.id});
    }
}

HWND focusSeen = nullptr;
HWND okSeen = nullptr;

// A timer tick, after initialisation: notes the focus and leaves.
void CALLBACK noteFocusAndCancel(HWND, UINT, UINT_PTR id, DWORD) {
    KillTimer(nullptr, id);
    focusSeen = GetFocus();
    okSeen = GetDlgItem(script.dialog, IDOK);
    SendMessageW(script.dialog, WM_COMMAND, IDCANCEL, 0);
}

// Once shown, the dialog has the focus on its first tab stop, whatever WM_INITDIALOG returned
// (the procedure set no focus of its own).
TEST_F(Dialogs, FocusAfterInitialisation) {
    for (INT_PTR initResult : {TRUE, FALSE}) {
        SCOPED_TRACE(initResult);
        script = Script{};
        script.initResult = initResult;
        script.onInit = [](HWND) { SetTimer(nullptr, 0, 50, noteFocusAndCancel); };
        EXPECT_EQ(run(), 100 + IDCANCEL);
        EXPECT_EQ(focusSeen, okSeen);
#if HV_OVER_LAYER
        EXPECT_EQ(w32test::pendingTimers(), 0u);
#endif
    }
}

#if HV_OVER_LAYER
void CALLBACK doNothing(HWND, UINT, UINT_PTR, DWORD) {}
#endif

TEST_F(Dialogs, LoopWithNothingToDeliverEndsTheDialog) {
    HV_LAYER_ONLY("the layer's own stall detection; Windows waits for ever");
#if HV_OVER_LAYER
    script.endOnOkOrCancel = false;
    SetLastError(0);
    EXPECT_EQ(run(), -1);
    EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_TIMEOUT));
    EXPECT_EQ(w32test::count("ModalLoopStalled"), 1u);
    // A timer that never ends the dialog counts as nothing to deliver, too.
    script = Script{};
    script.endOnOkOrCancel = false;
    script.onInit = [](HWND) { SetTimer(nullptr, 0, 10, doNothing); };
    EXPECT_EQ(run(), -1);
    EXPECT_EQ(w32test::count("ModalLoopStalled"), 2u);
#endif
}

}  // namespace
