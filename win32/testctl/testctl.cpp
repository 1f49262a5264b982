// Journal and fault injection of the portable Win32 layer, plugged into its hooks when this
// library is loaded; and the allocation count, taken from the journal's calls.
#include <w32/testctl.h>

#include "internal.h"

#include <atomic>
#include <map>
#include <mutex>

namespace w32test {
// From registry_control.cpp and objects_control.cpp.
bool exportHidden(const char* name);
DWORD platformId();
void resetObjects();
}  // namespace w32test

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

// Read on every served call, so they are kept apart from the journal's lock.
std::atomic<bool> journalOn{true};
std::atomic<size_t> liveBlocks{0};

// Counts the blocks calloc and malloc hand out and free takes back, journaled or not.
void countBlocks(std::string_view function, std::initializer_list<uint64_t> args, int64_t result) {
    if ((function == "calloc" || function == "malloc") && result) ++liveBlocks;
    if (function == "free" && *args.begin()) --liveBlocks;
}

void record(std::string_view function, std::initializer_list<uint64_t> args, int64_t result) {
    countBlocks(function, args, result);
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

[[maybe_unused]] const bool Plugged = [] {
    w32::control.record = record;
    w32::control.takeFault = takeFault;
    w32::control.exportHidden = w32test::exportHidden;
    w32::control.platformId = w32test::platformId;
    return true;
}();

}  // namespace

namespace w32test {

void reset() {
    setJournal(true);
    clearJournal();
    clearFaults();
    SetLastError(0);
    resetRegistry();
    resetObjects();
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

void clearFault(std::string_view function) {
    State& s = state();
    std::lock_guard<std::mutex> guard(s.lock);
    s.faults.erase(std::string(function));
}

void clearFaults() {
    State& s = state();
    std::lock_guard<std::mutex> guard(s.lock);
    s.faults.clear();
}

size_t liveAllocations() { return liveBlocks.load(); }

}  // namespace w32test
