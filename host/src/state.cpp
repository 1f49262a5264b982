// The host's side of an instance's saved state and debugger lines, and the reader of state
// files that hivelet-host dump-state uses.
#include <algorithm>

#include "internal.h"

namespace hv {

namespace {

using StateEntry = BOOL(WINAPI*)(void* record, HANDLE file);
using DebugItemEntry = void(WINAPI*)(LPWSTR line, void* record, int item);

const char16_t LineFill = 0xBEBE;
const size_t HeaderBytes = 12;

// Calls SaveRunObject or LoadRunObject with a handle on the file that the host opens for it and
// closes after; -1, and why in `error`, when the file cannot be opened.
int runState(Module& module, const char* entry, void* record, const std::string& path, bool writing,
             std::string* error) {
    auto call = module.entry<StateEntry>(entry);
    HANDLE file = CreateFileW(wide(fromUtf8(path)), writing ? GENERIC_WRITE : GENERIC_READ,
                              FILE_SHARE_READ, nullptr, writing ? CREATE_ALWAYS : OPEN_EXISTING,
                              FILE_ATTRIBUTE_NORMAL, nullptr);
    if (file == INVALID_HANDLE_VALUE) {
        if (error)
            *error = "cannot open " + path + " (error " + std::to_string(GetLastError()) + ")";
        return -1;
    }
    int result = call(record, file) ? 1 : 0;
    CloseHandle(file);
    return result;
}

uint32_t u32At(const std::vector<uint8_t>& b, size_t at) {
    return b[at] | b[at + 1] << 8 | b[at + 2] << 16 | static_cast<uint32_t>(b[at + 3]) << 24;
}

}  // namespace

int Instance::saveState(const std::string& path, std::string* error) {
    return runState(module_, "SaveRunObject", record_, path, true, error);
}

int Instance::loadState(const std::string& path, std::string* error) {
    return runState(module_, "LoadRunObject", record_, path, false, error);
}

std::u16string Instance::DebugLine::text() const {
    return std::u16string(buffer.begin(), std::find(buffer.begin(), buffer.end(), u'\0'));
}

Instance::DebugLine Instance::debugLine(int item) {
    auto get = module_.entry<DebugItemEntry>("GetDebugItem");
    std::vector<char16_t> store(DebugLineChars + Fill::GuardSize, LineFill);
    get(reinterpret_cast<LPWSTR>(store.data()), record_, item);
    DebugLine line;
    line.buffer.assign(store.begin(), store.begin() + DebugLineChars);
    for (char16_t c : line.buffer) line.written = line.written || c != LineFill;
    for (size_t i = DebugLineChars; i < store.size(); ++i)
        line.sentinelsIntact = line.sentinelsIntact && store[i] == LineFill;
    return line;
}

bool readSavedState(const std::vector<uint8_t>& b, SavedState& state, std::string* error) {
    auto refuse = [error](const std::string& why) {
        if (error) *error = why;
        return false;
    };
    if (b.size() < HeaderBytes)
        return refuse("too short for the 12-byte header (" + std::to_string(b.size()) + " bytes)");
    state.version = u32At(b, 0);
    state.rootKeyIndex = u32At(b, 4);
    state.lastError = u32At(b, 8);
    if (state.version != 1)
        return refuse("format version " + std::to_string(state.version) + ", not 1");
    if (b.size() < HeaderBytes + 2) return refuse("the key byte length is missing");
    size_t keyBytes = b[12] | b[13] << 8;
    size_t end = HeaderBytes + 2 + keyBytes;
    if (keyBytes % 2) return refuse("odd key byte length " + std::to_string(keyBytes));
    if (b.size() < end)
        return refuse("the key text is cut short (" + std::to_string(b.size() - HeaderBytes - 2) +
                      " of " + std::to_string(keyBytes) + " bytes)");
    if (b.size() > end)
        return refuse("bytes after the record (" + std::to_string(b.size() - end) + ")");
    state.hasKey = keyBytes != 0;
    state.key.clear();
    if (!state.hasKey) return true;
    if (b[end - 1] != 0 || b[end - 2] != 0)
        return refuse("the key text lacks its terminating zero");
    for (size_t at = HeaderBytes + 2; at + 2 <= end; at += 2) {
        char16_t unit = static_cast<char16_t>(b[at] | b[at + 1] << 8);
        if (unit == 0) break;
        state.key += unit;
    }
    return true;
}

}  // namespace hv
