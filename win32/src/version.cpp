// GetVersionExW as Windows 8.1 and later answer a program without a compatibility manifest,
// with test settings to make it fail or report another platform.
#include "internal.h"
#include "registry.h"

#include <atomic>
#include <cstring>

namespace {

std::atomic<bool> failing{false};
std::atomic<DWORD> platform{VER_PLATFORM_WIN32_NT};

void fill(OSVERSIONINFOW* info) {
    DWORD size = info->dwOSVersionInfoSize;
    std::memset(info, 0, size);
    info->dwOSVersionInfoSize = size;
    info->dwMajorVersion = 6;  // an unmanifested program is told 6.2 build 9200
    info->dwMinorVersion = 2;
    info->dwBuildNumber = 9200;
    info->dwPlatformId = platform.load();
    if (size == sizeof(OSVERSIONINFOEXW)) {
        auto* ex = reinterpret_cast<OSVERSIONINFOEXW*>(info);
        ex->wSuiteMask = VER_SUITE_SINGLEUSERTS;
        ex->wProductType = VER_NT_WORKSTATION;
    }
}

BOOL failWith(DWORD code) {
    SetLastError(code);
    return FALSE;
}

BOOL query(OSVERSIONINFOW* info) {
    if (auto code = w32::takeFault("GetVersionExW")) return failWith(static_cast<DWORD>(*code));
    // A NULL record: Windows' answer is recorded nowhere and Wine crashes; a bad pointer (998).
    if (!info) return failWith(ERROR_NOACCESS);
    if (failing.load()) return failWith(ERROR_INVALID_PARAMETER);
    DWORD size = info->dwOSVersionInfoSize;
    if (size != sizeof(OSVERSIONINFOW) && size != sizeof(OSVERSIONINFOEXW))
        return failWith(ERROR_INSUFFICIENT_BUFFER);
    fill(info);
    return TRUE;
}

}  // namespace

namespace w32 {

void resetVersionSettings() {
    failing = false;
    platform = VER_PLATFORM_WIN32_NT;
}

}  // namespace w32

namespace w32test {

void setVersionFault(bool fail) { failing = fail; }

void setPlatformId(DWORD id) { platform = id; }

}  // namespace w32test

BOOL WINAPI GetVersionExW(LPOSVERSIONINFOW lpVersionInformation) {
    BOOL ok = query(lpVersionInformation);
    w32::record("GetVersionExW", {w32::arg(lpVersionInformation)}, ok);
    return ok;
}
