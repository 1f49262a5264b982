// Files of kernel32 over POSIX descriptors: CreateFileW, CloseHandle and synchronous ReadFile
// and WriteFile, with a journal and faults (a failing call, a write that writes nothing, a
// short read).
#include "internal.h"

#include <errno.h>
#include <fcntl.h>
#include <unistd.h>

#include <map>
#include <mutex>
#include <string>

namespace {

struct Files {
    std::mutex lock;
    std::map<uintptr_t, int> descriptors;  // handle value -> descriptor
    uintptr_t nextHandle = 0x1000;
};

Files& files() {
    static Files* f = new Files;  // never destroyed: the layer may be called during exit
    return *f;
}

// The descriptor behind a handle, or -1; `release` also forgets the handle.
int descriptorOf(HANDLE handle, bool release = false) {
    Files& f = files();
    std::lock_guard<std::mutex> guard(f.lock);
    auto it = f.descriptors.find(reinterpret_cast<uintptr_t>(handle));
    if (it == f.descriptors.end()) return -1;
    int fd = it->second;
    if (release) f.descriptors.erase(it);
    return fd;
}

DWORD errnoCode(int error) {
    switch (error) {
        case ENOENT: return ERROR_FILE_NOT_FOUND;
        case ENOTDIR: return ERROR_PATH_NOT_FOUND;
        case ENOSPC: return ERROR_DISK_FULL;
        case EBADF: return ERROR_INVALID_HANDLE;
        case ENOMEM: return ERROR_NOT_ENOUGH_MEMORY;
        default: return ERROR_ACCESS_DENIED;
    }
}

// The two dispositions the host opens its state files with.
int openFlags(DWORD access, DWORD disposition) {
    bool reading = access & GENERIC_READ;
    bool writing = access & GENERIC_WRITE;
    int flags = O_CLOEXEC | (reading && writing ? O_RDWR : writing ? O_WRONLY : O_RDONLY);
    switch (disposition) {
        case CREATE_ALWAYS: return flags | O_CREAT | O_TRUNC;
        case OPEN_EXISTING: return flags;
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

// ReadFile and WriteFile. A test event "short <function>" withholds its count of bytes from the
// transfer (all of them: a write that writes nothing); the call still succeeds.
template <typename Io, typename Pointer>
BOOL serveIo(const char* function, Io io, HANDLE handle, Pointer buffer, DWORD size, LPDWORD count,
             LPOVERLAPPED overlapped) {
    int fd = descriptorOf(handle);
    std::string event = std::string("short ") + function;
    auto withheld = static_cast<DWORD>(w32::takeFault(event).value_or(0));
    ssize_t n = -1;
    DWORD code = ERROR_INVALID_HANDLE;
    if (auto fault = w32::takeFault(function)) {
        code = static_cast<DWORD>(*fault);
    } else if (fd >= 0) {
        n = transfer(io, fd, buffer, withheld >= size ? 0 : size - withheld);
        code = errnoCode(errno);
    }
    BOOL ok = n >= 0;
    *count = ok ? static_cast<DWORD>(n) : 0;
    if (!ok) SetLastError(code);
    w32::record(function,
                {w32::arg(handle), w32::arg(buffer), size, w32::arg(count), w32::arg(overlapped)},
                ok);
    return ok;
}

}  // namespace

namespace w32 {

// Handles step by 4, as Windows' do, and never collide with INVALID_HANDLE_VALUE.
HANDLE addDescriptor(int fd) {
    Files& f = files();
    std::lock_guard<std::mutex> guard(f.lock);
    uintptr_t value = f.nextHandle;
    f.nextHandle += 4;
    f.descriptors[value] = fd;
    return reinterpret_cast<HANDLE>(value);
}

size_t openDescriptors() {
    Files& f = files();
    std::lock_guard<std::mutex> guard(f.lock);
    return f.descriptors.size();
}

}  // namespace w32

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
            handle = w32::addDescriptor(fd);
            SetLastError(ERROR_SUCCESS);
        }
    }
    w32::record("CreateFileW", {w32::arg(name), access, disposition}, w32::arg(handle));
    return handle;
}

BOOL WINAPI CloseHandle(HANDLE handle) {
    int fd = descriptorOf(handle, true);
    BOOL ok = fd >= 0 && close(fd) == 0;
    if (fd < 0) SetLastError(ERROR_INVALID_HANDLE);
    w32::record("CloseHandle", {w32::arg(handle)}, ok);
    return ok;
}

BOOL WINAPI ReadFile(HANDLE handle, LPVOID buffer, DWORD size, LPDWORD delivered,
                     LPOVERLAPPED overlapped) {
    return serveIo("ReadFile", ::read, handle, static_cast<char*>(buffer), size, delivered,
                   overlapped);
}

BOOL WINAPI WriteFile(HANDLE handle, LPCVOID buffer, DWORD size, LPDWORD written,
                      LPOVERLAPPED overlapped) {
    return serveIo("WriteFile", ::write, handle, static_cast<const char*>(buffer), size, written,
                   overlapped);
}
