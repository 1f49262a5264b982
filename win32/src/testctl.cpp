// Journal and fault injection of the portable Win32 layer.
#include "internal.h"

#include <atomic>
#include <map>
#include <mutex>

namespace {

struct Fault {
    unsigned remaining;  // calls to let through before failing; ignored when `always`
    long code;
    bool always;
};

struct State {
    std::mutex lock;
    std::vector<w32test::Call> journal;
    std::map<std::string, Fault, std::less<>> faults;
};

State& state() {
    static State* s = new State;  // never destroyed: the layer may be called during exit
    return *s;
}

// Read on every served call, so it is kept apart from the journal's lock.
std::atomic<bool> journalOn{true};

}  // namespace

namespace w32 {

void record(std::string_view function, std::initializer_list<uint64_t> args, int64_t result) {
    if (!journalOn.load(std::memory_order_relaxed)) return;
    State& s = state();
    std::lock_guard<std::mutex> guard(s.lock);
    s.journal.push_back(w32test::Call{std::string(function), std::vector<uint64_t>(args), result});
}

std::optional<long> takeFault(std::string_view function) {
    State& s = state();
    std::lock_guard<std::mutex> guard(s.lock);
    auto it = s.faults.find(function);
    if (it == s.faults.end()) return std::nullopt;
    Fault& f = it->second;
    if (f.always) return f.code;
    if (f.remaining > 0) {
        --f.remaining;
        return std::nullopt;
    }
    long code = f.code;
    s.faults.erase(it);
    return code;
}

}  // namespace w32

namespace w32test {

void resetAllocations();
void resetRegistry() __attribute__((weak));
void resetFiles();
void resetWindows() __attribute__((weak));

void reset() {
    setJournal(true);
    clearJournal();
    clearFaults();
    SetLastError(0);
    resetMenus();
    if (resetRegistry) resetRegistry();
    resetFiles();
    if (resetWindows) resetWindows();
}

const std::vector<Call>& journal() { return state().journal; }

void setJournal(bool on) { journalOn.store(on, std::memory_order_relaxed); }

void clearJournal() {
    State& s = state();
    std::lock_guard<std::mutex> guard(s.lock);
    s.journal.clear();
}

size_t count(std::string_view function) { return callsOf(function).size(); }

std::vector<Call> callsOf(std::string_view function) {
    State& s = state();
    std::lock_guard<std::mutex> guard(s.lock);
    std::vector<Call> out;
    for (const Call& c : s.journal)
        if (c.function == function) out.push_back(c);
    return out;
}

void failCall(std::string_view function, unsigned nth, long code) {
    if (nth == 0) return;
    State& s = state();
    std::lock_guard<std::mutex> guard(s.lock);
    s.faults[std::string(function)] = Fault{nth - 1, code, false};
}

void failAlways(std::string_view function, long code) {
    State& s = state();
    std::lock_guard<std::mutex> guard(s.lock);
    s.faults[std::string(function)] = Fault{0, code, true};
}

void clearFaults() {
    State& s = state();
    std::lock_guard<std::mutex> guard(s.lock);
    s.faults.clear();
}

}  // namespace w32test
