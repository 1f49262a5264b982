// The scripted user: one look or one step per timer tick.
#include <hivelet/dialog_user.h>

namespace hv {

namespace {

// The user's steps and where it stands in them.
struct User {
    const std::vector<UserStep>& steps;
    int listId;
    DialogSeen& seen;
    size_t next = 0;
    bool cancelled = false;
    int idleTicks = 0;  // ticks left of a Wait step
};

// The user at work on this thread; a thread timer's procedure gets no context of its own.
thread_local User* activeUser = nullptr;

// The tick period, in milliseconds: a user that needs a few ticks finishes in well under a second.
const UINT TickPeriod = 10;

// A window's text or class name, as `get` (GetWindowTextW or GetClassNameW) gives it.
std::u16string textOf(HWND window, int(WINAPI* get)(HWND, LPWSTR, int) = GetWindowTextW) {
    WCHAR buffer[256] = {};
    int n = get(window, buffer, 256);
    return std::u16string(reinterpret_cast<const char16_t*>(buffer), n > 0 ? n : 0);
}

BOOL CALLBACK findDialog(HWND window, LPARAM found) {
    if (textOf(window, GetClassNameW) != u"#32770") return TRUE;
    *reinterpret_cast<HWND*>(found) = window;
    return FALSE;
}

std::vector<std::u16string> listItems(HWND list) {
    std::vector<std::u16string> items;
    auto count = static_cast<int>(SendMessageW(list, LB_GETCOUNT, 0, 0));
    for (int i = 0; i < count; ++i) {
        auto length = SendMessageW(list, LB_GETTEXTLEN, static_cast<WPARAM>(i), 0);
        if (length < 0) break;
        std::vector<WCHAR> text(static_cast<size_t>(length) + 1);
        SendMessageW(list, LB_GETTEXT, static_cast<WPARAM>(i),
                     reinterpret_cast<LPARAM>(text.data()));
        items.emplace_back(reinterpret_cast<const char16_t*>(text.data()),
                           static_cast<size_t>(length));
    }
    return items;
}

// A key pressed and released where the keyboard focus is, as the dialog manager receives it.
void pressKey(HWND dialog, WPARAM key, UINT scanCode) {
    HWND focus = GetFocus();
    HWND target = focus && (focus == dialog || GetParent(focus) == dialog) ? focus : dialog;
    auto down = static_cast<LPARAM>(1 | scanCode << 16);
    auto up = static_cast<LPARAM>(static_cast<DWORD>(down) | 0xC0000000u);
    PostMessageW(target, WM_KEYDOWN, key, down);
    PostMessageW(target, WM_KEYUP, key, up);
}

void clickButton(HWND dialog, int id) {
    if (HWND button = GetDlgItem(dialog, id)) SendMessageW(button, BM_CLICK, 0, 0);
}

// A click on a list item: the selection moves, and the list box tells its dialog.
void clickItem(HWND dialog, int listId, int index, bool twice) {
    HWND list = GetDlgItem(dialog, listId);
    if (!list) return;
    SendMessageW(list, LB_SETCURSEL, static_cast<WPARAM>(index), 0);
    auto from = reinterpret_cast<LPARAM>(list);
    SendMessageW(dialog, WM_COMMAND, MAKEWPARAM(listId, LBN_SELCHANGE), from);
    if (twice) SendMessageW(dialog, WM_COMMAND, MAKEWPARAM(listId, LBN_DBLCLK), from);
}

void look(User& user, HWND dialog) {
    DialogSeen& seen = user.seen;
    seen.appeared = true;
    seen.caption = textOf(dialog);
    seen.className = textOf(dialog, GetClassNameW);
    if (HWND list = GetDlgItem(dialog, user.listId)) {
        seen.items = listItems(list);
        seen.initialSelection = static_cast<int>(SendMessageW(list, LB_GETCURSEL, 0, 0));
    }
    HWND focus = GetFocus();
    seen.initialFocus = focus && GetParent(focus) == dialog ? GetDlgCtrlID(focus) : 0;
}

void perform(User& user, HWND dialog, const UserStep& step) {
    switch (step.action) {
        case UserStep::Action::Select: clickItem(dialog, user.listId, step.index, false); break;
        case UserStep::Action::DoubleClick: clickItem(dialog, user.listId, step.index, true); break;
        case UserStep::Action::Ok: clickButton(dialog, IDOK); break;
        case UserStep::Action::Cancel: clickButton(dialog, IDCANCEL); break;
        case UserStep::Action::Enter: pressKey(dialog, VK_RETURN, 0x1C); break;
        case UserStep::Action::Escape: pressKey(dialog, VK_ESCAPE, 0x01); break;
        case UserStep::Action::CloseBox: PostMessageW(dialog, WM_SYSCOMMAND, SC_CLOSE, 0); break;
        case UserStep::Action::Wait:
            user.idleTicks = step.index / static_cast<int>(TickPeriod);
            break;
    }
}

// One look or one step per tick.
void CALLBACK onTick(HWND, UINT, UINT_PTR, DWORD) {
    HWND dialog = nullptr;  // the thread's dialog on top
    if (activeUser)
        EnumThreadWindows(GetCurrentThreadId(), findDialog, reinterpret_cast<LPARAM>(&dialog));
    if (!dialog) return;
    User& user = *activeUser;
    DialogSeen& seen = user.seen;
    if (!seen.appeared) look(user, dialog);
    if (user.next > seen.openAfter.size()) seen.openAfter.push_back(true);
    if (user.idleTicks > 0) {
        --user.idleTicks;
    } else if (user.next < user.steps.size()) {
        perform(user, dialog, user.steps[user.next++]);
    } else if (!user.cancelled) {
        // Nothing left to do, and the dialog is still there: leave it as Cancel would.
        seen.ranOut = true;
        user.cancelled = true;
        SendMessageW(dialog, WM_COMMAND, MAKEWPARAM(IDCANCEL, BN_CLICKED),
                     reinterpret_cast<LPARAM>(GetDlgItem(dialog, IDCANCEL)));
    } else {
        seen.forced = true;
        EndDialog(dialog, -2);
    }
}

}  // namespace

intptr_t withUser(const std::vector<UserStep>& steps, int listId, DialogSeen& seen,
                  const std::function<intptr_t()>& showDialog) {
    seen = DialogSeen();
    User user{steps, listId, seen};
    activeUser = &user;
    UINT_PTR timer = SetTimer(nullptr, 0, TickPeriod, onTick);
    intptr_t result = showDialog();
    KillTimer(nullptr, timer);
    activeUser = nullptr;
    // A step that was not followed by another look closed the dialog.
    if (user.next > seen.openAfter.size()) seen.openAfter.push_back(false);
    return result;
}

}  // namespace hv
