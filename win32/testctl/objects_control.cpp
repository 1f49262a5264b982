// Test control of the layer's objects: menus, file handles, windows and timers.
#include <w32/testctl.h>

#include "menus.h"
#include "window.h"

namespace w32test {

std::vector<HMENU> liveMenus() {
    w32::Menus& m = w32::menus();
    w32::MenuGuard guard(m.lock);
    std::vector<HMENU> roots;
    for (const auto& [handle, menu] : m.alive)
        if (!menu.owner || !m.alive.count(menu.owner)) roots.push_back(handle);
    return roots;
}

size_t menuObjectCount() {
    w32::Menus& m = w32::menus();
    w32::MenuGuard guard(m.lock);
    return m.alive.size();
}

HANDLE fileHandleFromDescriptor(int fd) {
    return fd < 0 ? INVALID_HANDLE_VALUE : w32::addDescriptor(fd);
}

// ReadFile and WriteFile take these events as they take their faults, by name; the event's code
// is the count of bytes withheld.
void silentWrite(unsigned nth) { failCall("short WriteFile", nth, static_cast<long>(~DWORD{0})); }

void shortRead(unsigned nth, DWORD missing) {
    failCall("short ReadFile", nth, static_cast<long>(missing));
}

size_t openFileCount() { return w32::openDescriptors(); }

std::vector<HWND> liveWindows() {
    std::vector<HWND> out;
    for (const auto& [handle, window] : w32::windowState().windows) out.push_back(handle);
    return out;
}

size_t pendingTimers() { return w32::windowState().timers.size(); }

// Forgets every menu, window, posted message and timer; reset() calls it. Windows go without
// a message: their procedures may belong to a test that has ended. Open files stay open: their
// owners close them.
void resetObjects() {
    {
        w32::Menus& m = w32::menus();
        w32::MenuGuard guard(m.lock);
        m.alive.clear();
    }
    w32::WindowState& s = w32::windowState();
    s.windows.clear();
    s.topLevel.clear();
    s.posted.clear();
    s.timers.clear();
    s.focus.clear();
}

}  // namespace w32test
