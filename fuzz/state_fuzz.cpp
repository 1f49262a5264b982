// Feeds arbitrary bytes to LoadRunObject through a file handle, on an instance without and one
// with a current key. After every input: the result is 1 only for a complete, well-formed
// record; a current key is terminated inside its own block; a refused header changes nothing;
// the debugger's line stays inside the host's buffer. The state-file reader of hivelet-host
// dump-state sees the same bytes.
#include <hivelet/host.h>
#include <sys/mman.h>
#include <unistd.h>
#include <w32/testctl.h>

#include <stddef.h>
#include <stdint.h>

#include <algorithm>
#include <memory>
#include <string>
#include <vector>

namespace {

using LoadEntry = BOOL(WINAPI*)(void* record, HANDLE file);

hv::Module& module() {
    static std::unique_ptr<hv::Module> loaded = [] {
        std::string error;
        auto m = hv::Module::load(hv::defaultModulePath(), &error);
        if (!m) {
            fprintf(stderr, "fuzz_state: %s\n", error.c_str());
            abort();
        }
        return m;
    }();
    return *loaded;
}

// A handle on a memory file holding the input, positioned at its start.
HANDLE handleOver(const uint8_t* data, size_t size) {
    int fd = memfd_create("state", MFD_CLOEXEC);
    if (fd < 0) abort();
    if (size && write(fd, data, size) != static_cast<ssize_t>(size)) abort();
    lseek(fd, 0, SEEK_SET);
    return w32test::fileHandleFromDescriptor(fd);
}

void check(bool holds) {
    if (!holds) __builtin_trap();
}

// The record the module reads is at most the header, the length and that many bytes.
std::vector<uint8_t> ownRecord(const uint8_t* data, size_t size) {
    size_t length = size >= 14 ? 14 + (data[12] | data[13] << 8) : size;
    return std::vector<uint8_t>(data, data + std::min(size, length));
}

void loadInto(hv::Instance& instance, const uint8_t* data, size_t size) {
    const char16_t* before = instance.currentKey();
    std::u16string oldKey = before ? before : u"";
    uint32_t oldRoot = instance.rootKeyIndex(), oldError = instance.lastError();
    HANDLE file = handleOver(data, size);
    BOOL result = module().entry<LoadEntry>("LoadRunObject")(instance.record(), file);
    CloseHandle(file);

    hv::SavedState state;
    bool wellFormed = hv::readSavedState(ownRecord(data, size), state, nullptr);
    check((result == 1) == wellFormed);
    bool headerRead = size >= 12 && data[0] == 1 && !data[1] && !data[2] && !data[3];
    const char16_t* key = instance.currentKey();
    if (!headerRead) {
        check(instance.rootKeyIndex() == oldRoot && instance.lastError() == oldError);
        check(before ? key == before && oldKey == key : key == nullptr);
        return;
    }
    check(instance.rootKeyIndex() ==
          (data[4] | data[5] << 8 | data[6] << 16 | static_cast<uint32_t>(data[7]) << 24));
    if (key) {
        // The block is the stored length: a zero must come within it (ASan guards the rest).
        size_t units = (data[12] | data[13] << 8) / 2, i = 0;
        while (i < units && key[i]) ++i;
        check(i < units);
        check(result == 1 && std::u16string(key) == state.key);
    } else {
        check(result == 0 || !state.hasKey);
    }
    hv::Instance::DebugLine line = instance.debugLine(1);
    check(line.sentinelsIntact && line.buffer.back() == 0);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    w32test::setJournal(false);
    {
        hv::Instance fresh(module());
        loadInto(fresh, data, size);
    }
    {
        hv::Instance keyed(module());
        keyed.action(1, {hv::Param::str(u"Previous\\Key")});
        keyed.setRootKeyIndex(3);
        keyed.setLastError(17);
        loadInto(keyed, data, size);
    }
    hv::SavedState whole;
    std::string error;
    if (!hv::readSavedState(std::vector<uint8_t>(data, data + size), whole, &error))
        check(!error.empty());
    return 0;
}
