// Windows of the portable layer: the objects behind HWND handles, shared by the window messages
// (window.cpp), the dialog manager (dialog_manager.cpp) and the message loop (message_loop.cpp).
//
// The layer's windows belong to the thread that created them and are used from that thread only.
#pragma once

#include "internal.h"

#include <deque>
#include <map>
#include <memory>
#include <string>
#include <vector>

namespace w32 {

// Slots of a dialog's extra window bytes: message result, dialog procedure, user data.
constexpr size_t DialogExtraBytes = 3 * sizeof(void*);

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
    BYTE extra[DialogExtraBytes] = {};
    std::vector<std::u16string> items;  // list box
    int selection = LB_ERR;             // list box
    DLGPROC proc = nullptr;             // dialog
    bool ended = false;                 // dialog
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

// A thread timer: the only kind callers set.
struct Timer {
    UINT_PTR id;
    UINT elapse;
    TIMERPROC proc;
    uint64_t due;
    DWORD thread;
};

struct WindowState {
    std::map<HWND, std::unique_ptr<Window>> windows;
    std::vector<HWND> topLevel;  // dialogs, oldest first
    std::deque<Message> posted;
    std::vector<Timer> timers;
    uint64_t clock = 0;  // virtual milliseconds
    uintptr_t nextHandle = 0x10000;
    UINT_PTR nextTimer = 0x7F00;
    std::map<DWORD, HWND> focus;  // per thread
};

#pragma GCC visibility push(default)
// The windows, messages and timers of every thread; the test control reads and clears them.
WindowState& windowState();
#pragma GCC visibility pop

DWORD currentThread();
Window* findWindow(HWND handle);
// findWindow, with ERROR_INVALID_WINDOW_HANDLE for a handle that is no window.
Window* findOrFail(HWND handle);
Window* createWindow(Kind kind, std::u16string className, HWND parent);
// Destroys a window with its children, timers and focus.
void destroyWindow(HWND handle);
HWND childWithId(const Window& dialog, int id);
// The dialog a window belongs to: itself, or its parent dialog.
Window* dialogOf(HWND handle);
// Sends a message: the window's own handling, or its dialog procedure's.
LRESULT dispatch(HWND handle, UINT message, WPARAM wParam, LPARAM lParam);

// The dialog manager: a message to a dialog, through its procedure, and the keys it handles.
LRESULT dialogMessage(Window& dialog, UINT message, WPARAM wParam, LPARAM lParam);
bool dialogKey(Window& dialog, const Message& m);

void postMessage(HWND window, UINT message, WPARAM wParam, LPARAM lParam);
// Runs the modal loop of `dialog` until it ends; returns its end value.
INT_PTR modalLoop(HWND dialog);

}  // namespace w32
