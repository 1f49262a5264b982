// A scripted user in front of a modal dialog: it waits for the dialog to appear on its own
// thread, looks at it, performs its steps one by one, and notes what it saw. It uses only
// calls that Windows and the portable layer both offer: a thread timer set before the dialog
// runs, whose ticks the dialog's modal loop delivers; each tick finds the thread's dialog
// (class "#32770") with EnumThreadWindows and does the next step.
#pragma once

#include <windows.h>

#include <cstdint>
#include <functional>
#include <string>
#include <vector>

namespace hv {

struct UserStep {
    enum class Action { Select, DoubleClick, Ok, Cancel, Enter, Escape, CloseBox, Wait };
    Action action = Action::Ok;
    int index = 0;  // list position, for Select and DoubleClick; milliseconds, for Wait

    static UserStep select(int index) { return {Action::Select, index}; }
    static UserStep doubleClick(int index) { return {Action::DoubleClick, index}; }
    static UserStep ok() { return {Action::Ok, 0}; }
    static UserStep cancel() { return {Action::Cancel, 0}; }
    static UserStep enter() { return {Action::Enter, 0}; }
    static UserStep escape() { return {Action::Escape, 0}; }
    static UserStep closeBox() { return {Action::CloseBox, 0}; }
    // Does nothing for about this long (a whole number of ticks), e.g. to show the dialog.
    static UserStep wait(int milliseconds) { return {Action::Wait, milliseconds}; }
};

// What the user saw.
struct DialogSeen {
    bool appeared = false;
    std::u16string caption;
    std::u16string className;
    std::vector<std::u16string> items;  // the list's items at the first look
    int initialSelection = LB_ERR;      // the list's selection at the first look
    int initialFocus = 0;               // identifier of the control with the focus, 0 if none
    std::vector<bool> openAfter;        // after each step performed: was the dialog still open
    bool ranOut = false;  // the steps ran out while the dialog was open: the user pressed Cancel
    bool forced = false;  // it stayed open even after Cancel: ended with EndDialog(-2)
};

// Calls `showDialog`, which runs a modal dialog on this thread, with the user at work: the user
// performs `steps` (the select steps on the list box `listId`) and notes in `seen` what it saw.
// Returns what `showDialog` returned. One user at a time per thread.
intptr_t withUser(const std::vector<UserStep>& steps, int listId, DialogSeen& seen,
                  const std::function<intptr_t()>& showDialog);

}  // namespace hv
