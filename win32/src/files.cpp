// Files of kernel32 over POSIX descriptors: CreateFileW, CloseHandle and synchronous ReadFile
// and WriteFile, with a journal and faults (a failing call, a write that writes nothing, a
// short read).
#include "internal.h"

#include <errno.h>
#include <fcntl.h>
#include <unistd.h>

#include <map>
#include <mutex>

namespace {

struct Files {
    std::mutex lock;
    std::map<uintptr_t, int> descriptors;  // handle value -> descriptor
    uintptr_t nextHandle = 0x1000;
    unsigned silentWriteIn = 0;  // countdown to the write that writes nothing; 0 = none
    unsigned shortReadIn = 0;    // countdown to the short read; 0 = none
    DWORD shortBy = 0;
};

Files& files() {
    static Files* f = new Files;  // never destroyed: the layer may be called during exit
    return *f;
}

// Handles step by 4, as Windows' do, and never collide with INVALID_HANDLE_VALUE.
HANDLE addDescriptor(int fd) {
    Files& f = files();
    std::lock_guard<std::mutex> guard(f.lock);
    uintptr_t value = f.nextHandle;
    f.nextHandle += 4;
    f.descriptors[value] = fd;
    return reinterpret_cast<HANDLE>(value);
}

int descriptorOf(HANDLE handle) {
    Files& f = files();
    std::lock_guard<std::mutex> guard(f.lock);
    auto it = f.descriptors.find(reinterpret_cast<uintptr_t>(handle));
    return it == f.descriptors.end() ? -1 : it->second;
}

// Consumes one step of a countdown; true when this call is the one it was set for.
bool countDown(unsigned& counter) {
    if (counter == 0) return false;
    return --counter == 0;
}

DWORD errnoCode(int error) {
    switch (error) {
        case ENOENT: return ERROR_FILE_NOT_FOUND;
        case ENOTDIR: return ERROR_PATH_NOT_FOUND;
        case EACCES: case EPERM: case EISDIR: return ERROR_ACCESS_DENIED;
        case EEXIST: return ERROR_FILE_EXISTS;
        case ENOSPC: return ERROR_DISK_FULL;
        case EBADF: return ERROR_INVALID_HANDLE;
        case ENOMEM: return ERROR_NOT_ENOUGH_MEMORY;
        default: return ERROR_ACCESS_DENIED;
    }
}

int openFlags(DWORD access, DWORD disposition) {
    bool reading = access & (GENERIC_READ | GENERIC_ALL);
    bool writing = access & (GENERIC_WRITE | GENERIC_ALL);
    int flags = O_CLOEXEC | (reading && writing ? O_RDWR : writing ? O_WRONLY : O_RDONLY);
    switch (disposition) {
        case CREATE_NEW: return flags | O_CREAT | O_EXCL;
        case CREATE_ALWAYS: return flags | O_CREAT | O_TRUNC;
        case OPEN_EXISTING: return flags;
        case OPEN_ALWAYS: return flags | O_CREAT;
        case TRUNCATE_EXISTING: return flags | O_TRUNC;
        default: return -1;
    }
}

// Reads or writes the whole request unless the file ends; a signal does not cut it short.
template <typename Io, typename Pointer>
ssize_t transfer(Io io, int fd, Pointer buffer, size_t size) {
    size_t done = 0;
    while (done < size) {
        ssize_t n = io(fd, buffer + done, size - done);
        if (n < 0 && errno == EINTR) continue;
        if (n < 0) return done ? static_cast<ssize_t>(done) : -1;
        if (n == 0) break;
        done += static_cast<size_t>(n);
    }
    return static_cast<ssize_t>(done);
}

BOOL fail(DWORD code, LPDWORD count) {
    if (count) *count = 0;
    SetLastError(code);
    return FALSE;
}

}  // namespace

HANDLE WINAPI CreateFileW(LPCWSTR name, DWORD access, DWORD, LPSECURITY_ATTRIBUTES,
                          DWORD disposition, DWORD, HANDLE) {
    HANDLE handle = INVALID_HANDLE_VALUE;
    int flags = openFlags(access, disposition);
    if (auto code = w32::takeFault("CreateFileW")) {
        SetLastError(static_cast<DWORD>(*code));
    } else if (!name || flags < 0) {
        SetLastError(ERROR_INVALID_PARAMETER);
    } else {
        int fd = open(w32::toUtf8(name).c_str(), flags, 0644);
        if (fd < 0) {
            SetLastError(errnoCode(errno));
        } else {
            handle = addDescriptor(fd);
            SetLastError(ERROR_SUCCESS);
        }
    }
    w32::record("CreateFileW", {w32::arg(name), access, disposition}, w32::arg(handle));
    return handle;
}

BOOL WINAPI CloseHandle(HANDLE handle) {
    int fd = -1;
    {
        Files& f = files();
        std::lock_guard<std::mutex> guard(f.lock);
        auto it = f.descriptors.find(reinterpret_cast<uintptr_t>(handle));
        if (it != f.descriptors.end()) {
            fd = it->second;
            f.descriptors.erase(it);
        }
    }
    BOOL ok = fd >= 0 && close(fd) == 0;
    if (fd < 0) SetLastError(ERROR_INVALID_HANDLE);
    w32::record("CloseHandle", {w32::arg(handle)}, ok);
    return ok;
}

BOOL WINAPI ReadFile(HANDLE handle, LPVOID buffer, DWORD size, LPDWORD delivered,
                     LPOVERLAPPED overlapped) {
    BOOL ok = FALSE;
    int fd = descriptorOf(handle);
    Files& f = files();
    DWORD missing = 0;
    {
        std::lock_guard<std::mutex> guard(f.lock);
        if (countDown(f.shortReadIn)) missing = f.shortBy;
    }
    if (auto code = w32::takeFault("ReadFile")) {
        fail(static_cast<DWORD>(*code), delivered);
    } else if (fd < 0) {
        fail(ERROR_INVALID_HANDLE, delivered);
    } else if (overlapped || (!buffer && size) || !delivered) {
        fail(ERROR_INVALID_PARAMETER, delivered);  // Windows would fault on a null count
    } else {
        DWORD ask = missing >= size ? 0 : size - missing;
        ssize_t n = transfer(::read, fd, static_cast<char*>(buffer), ask);
        ok = n >= 0 ? TRUE : fail(errnoCode(errno), delivered);
        if (ok) *delivered = static_cast<DWORD>(n);
    }
    w32::record("ReadFile", {w32::arg(handle), w32::arg(buffer), size, w32::arg(delivered),
                             w32::arg(overlapped)}, ok);
    return ok;
}

BOOL WINAPI WriteFile(HANDLE handle, LPCVOID buffer, DWORD size, LPDWORD written,
                      LPOVERLAPPED overlapped) {
    BOOL ok = FALSE;
    int fd = descriptorOf(handle);
    Files& f = files();
    bool silent;
    {
        std::lock_guard<std::mutex> guard(f.lock);
        silent = countDown(f.silentWriteIn);
    }
    if (auto code = w32::takeFault("WriteFile")) {
        fail(static_cast<DWORD>(*code), written);
    } else if (fd < 0) {
        fail(ERROR_INVALID_HANDLE, written);
    } else if (overlapped || (!buffer && size) || !written) {
        fail(ERROR_INVALID_PARAMETER, written);
    } else {
        ssize_t n = silent ? 0 : transfer(::write, fd, static_cast<const char*>(buffer), size);
        ok = n >= 0 ? TRUE : fail(errnoCode(errno), written);
        if (ok) *written = static_cast<DWORD>(n);
    }
    w32::record("WriteFile", {w32::arg(handle), w32::arg(buffer), size, w32::arg(written),
                              w32::arg(overlapped)}, ok);
    return ok;
}

namespace w32test {

HANDLE fileHandleFromDescriptor(int fd) { return fd < 0 ? INVALID_HANDLE_VALUE : addDescriptor(fd); }

void silentWrite(unsigned nth) {
    Files& f = files();
    std::lock_guard<std::mutex> guard(f.lock);
    f.silentWriteIn = nth;
}

void shortRead(unsigned nth, DWORD missing) {
    Files& f = files();
    std::lock_guard<std::mutex> guard(f.lock);
    f.shortReadIn = nth;
    f.shortBy = missing;
}

size_t openFileCount() {
    Files& f = files();
    std::lock_guard<std::mutex> guard(f.lock);
    return f.descriptors.size();
}

// Disarms the file faults; reset() calls it. Open handles stay open: their owners close them.
void resetFiles() {
    Files& f = files();
    std::lock_guard<std::mutex> guard(f.lock);
    f.silentWriteIn = 0;
    f.shortReadIn = 0;
    f.shortBy = 0;
}

}  // namespace w32test
