// A scripted user in front of a modal dialog: it waits for the dialog to appear on its own
// thread, looks at it, performs its steps one by one, and notes what it saw. It uses only
// calls that Windows and the portable layer both offer: a thread timer set before the dialog
// runs, whose ticks the dialog's modal loop delivers; each tick finds the thread's dialog
// (class "#32770") with EnumThreadWindows and does the next step.
#pragma once

#include <windows.h>

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

// "select 4", "ok", "enter", "close" ...; the words a script writes.
std::string describe(const UserStep& step);

// What the user saw.
struct DialogSeen {
    bool appeared = false;
    std::u16string caption;
    std::u16string className;
    std::vector<std::u16string> items;  // the list's items at the first look
    int initialSelection = LB_ERR;      // the list's selection at the first look
    int initialFocus = 0;               // identifier of the control with the focus, 0 if none
    std::vector<bool> openAfter;        // after each step performed: was the dialog still open
    int lastSelection = LB_ERR;         // the list's selection at the last look
    bool ranOut = false;  // the steps ran out while the dialog was open: the user pressed Cancel
    bool forced = false;  // it stayed open even after Cancel: ended with EndDialog(-2)

    size_t stepsDone() const { return openAfter.size(); }
    bool closedByLastStep() const { return !openAfter.empty() && !openAfter.back(); }
};

// Usage: ScriptedUser user({UserStep::select(4), UserStep::ok()});
//        auto result = user.run([&] { return EditParameter(...); });
//        user.seen().initialSelection ...
// One user at a time per thread. `listId` is the control the select steps work on.
class ScriptedUser {
public:
    explicit ScriptedUser(std::vector<UserStep> steps, int listId = 1001);
    ~ScriptedUser();
    ScriptedUser(const ScriptedUser&) = delete;
    ScriptedUser& operator=(const ScriptedUser&) = delete;

    // Runs `showDialog`, which runs a modal dialog on this thread, with the user at work.
    template <typename F>
    auto run(F&& showDialog) {
        start();
        auto result = showDialog();
        finish();
        return result;
    }
    // The two halves of run(): set the timer, and after the dialog, stop and conclude.
    void start();
    void finish();

    const DialogSeen& seen() const { return seen_; }

private:
    static void CALLBACK onTick(HWND, UINT, UINT_PTR, DWORD);
    void tick();
    void look(HWND dialog);
    void perform(HWND dialog, const UserStep& step);

    std::vector<UserStep> steps_;
    int listId_;
    size_t next_ = 0;
    UINT_PTR timer_ = 0;
    HWND dialog_ = nullptr;
    bool cancelled_ = false;
    int idleTicks_ = 0;  // ticks left of a Wait step
    DialogSeen seen_;
};

}  // namespace hv
