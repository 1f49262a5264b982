// Posted messages, thread timers and the modal loop that delivers them.
//
// Time here is virtual: a modal loop delivers posted messages first and, when none is left,
// fires the timer that is due next at once, advancing the clock. A loop that has neither while
// its dialog is still open would wait for ever on Windows; here it ends the dialog with -1,
// last error ERROR_TIMEOUT, and journals "ModalLoopStalled".
#include "window.h"

#include <algorithm>

using namespace w32;

namespace {

// Timer ticks one loop may deliver; a dialog still open after them counts as stalled.
constexpr unsigned MaxTicks = 100000;

// Takes the next posted message of this thread, if there is one.
bool takePosted(DWORD thread, Message* out) {
    auto& posted = windowState().posted;
    for (auto it = posted.begin(); it != posted.end(); ++it) {
        if (it->thread != thread) continue;
        *out = *it;
        posted.erase(it);
        return true;
    }
    return false;
}

// Fires this thread's timer that is due first: its procedure, or a WM_TIMER message.
bool fireTimer(DWORD thread) {
    WindowState& s = windowState();
    Timer* next = nullptr;
    for (Timer& t : s.timers)
        if (t.thread == thread && (!next || t.due < next->due)) next = &t;
    if (!next) return false;
    s.clock = std::max(s.clock, next->due);
    next->due = s.clock + next->elapse;
    if (next->proc) next->proc(nullptr, WM_TIMER, next->id, static_cast<DWORD>(s.clock));
    return true;
}

void deliver(const Message& m) {
    if (Window* dialog = dialogOf(m.window))
        if (dialogKey(*dialog, m)) return;
    dispatch(m.window, m.message, m.wParam, m.lParam);
}

}  // namespace

void w32::postMessage(HWND window, UINT message, WPARAM wParam, LPARAM lParam) {
    windowState().posted.push_back(Message{window, message, wParam, lParam, currentThread()});
}

INT_PTR w32::modalLoop(HWND dialog) {
    DWORD thread = currentThread();
    for (unsigned ticks = 0;;) {
        Window* w = findWindow(dialog);
        if (!w) return -1;
        if (w->ended) return w->endResult;
        Message m;
        if (takePosted(thread, &m)) {
            deliver(m);
        } else if (ticks < MaxTicks && fireTimer(thread)) {
            ++ticks;
        } else {
            record("ModalLoopStalled", {arg(dialog)}, -1);
            SetLastError(ERROR_TIMEOUT);
            return -1;
        }
    }
}

BOOL WINAPI PostMessageW(HWND window, UINT message, WPARAM wParam, LPARAM lParam) {
    BOOL ok = findOrFail(window) != nullptr;
    if (ok) postMessage(window, message, wParam, lParam);
    record("PostMessageW", {arg(window), message, wParam, static_cast<uint64_t>(lParam)}, ok);
    return ok;
}

// Thread timers: a window's timer is not served (0, ERROR_INVALID_WINDOW_HANDLE).
UINT_PTR WINAPI SetTimer(HWND window, UINT_PTR id, UINT elapse, TIMERPROC timerProc) {
    WindowState& s = windowState();
    UINT_PTR result = 0;
    if (window) {
        SetLastError(ERROR_INVALID_WINDOW_HANDLE);
    } else {
        UINT wait = std::max<UINT>(elapse, 10);  // Windows raises elapses below 10 ms to 10 ms
        result = ++s.nextTimer;
        s.timers.push_back(Timer{result, wait, timerProc, s.clock + wait, currentThread()});
    }
    record("SetTimer", {arg(window), id, elapse, arg(timerProc)}, static_cast<int64_t>(result));
    return result;
}

BOOL WINAPI KillTimer(HWND window, UINT_PTR id) {
    auto& timers = windowState().timers;
    auto kept = std::remove_if(timers.begin(), timers.end(),
                               [&](const Timer& t) { return !window && t.id == id; });
    BOOL ok = kept != timers.end();
    timers.erase(kept, timers.end());
    record("KillTimer", {arg(window), id}, ok);
    return ok;
}
