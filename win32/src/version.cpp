// GetVersionExW as Windows 8.1 and later answer a program without a compatibility manifest; the
// test control may report another platform or make the query fail.
#include "internal.h"

#include <cstring>

namespace {

BOOL failWith(DWORD code) {
    SetLastError(code);
    return FALSE;
}

BOOL query(OSVERSIONINFOW* info) {
    if (auto code = w32::takeFault("GetVersionExW")) return failWith(static_cast<DWORD>(*code));
    // The record the module passes; a size that is not its own is refused before any write.
    if (info->dwOSVersionInfoSize != sizeof(OSVERSIONINFOW))
        return failWith(ERROR_INSUFFICIENT_BUFFER);
    std::memset(info, 0, sizeof *info);
    info->dwOSVersionInfoSize = sizeof *info;
    info->dwMajorVersion = 6;  // an unmanifested program is told 6.2 build 9200
    info->dwMinorVersion = 2;
    info->dwBuildNumber = 9200;
    info->dwPlatformId =
        w32::control.platformId ? w32::control.platformId() : VER_PLATFORM_WIN32_NT;
    return TRUE;
}

}  // namespace

BOOL WINAPI GetVersionExW(LPOSVERSIONINFOW lpVersionInformation) {
    BOOL ok = query(lpVersionInformation);
    w32::record("GetVersionExW", {w32::arg(lpVersionInformation)}, ok);
    return ok;
}
