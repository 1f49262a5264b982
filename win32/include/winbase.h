// kernel32 of the portable Win32 layer: error codes, the last error, libraries, system messages,
// files, the version query, and the runtime library's wide-string functions on UTF-16 text.
#pragma once

#include "windef.h"

// Library entry reasons.
#define DLL_PROCESS_DETACH 0
#define DLL_PROCESS_ATTACH 1
#define DLL_THREAD_ATTACH 2
#define DLL_THREAD_DETACH 3

// System error codes the module, the host and the layer use.
#define ERROR_SUCCESS 0L
#define ERROR_FILE_NOT_FOUND 2L
#define ERROR_PATH_NOT_FOUND 3L
#define ERROR_ACCESS_DENIED 5L
#define ERROR_INVALID_HANDLE 6L
#define ERROR_NOT_ENOUGH_MEMORY 8L
#define ERROR_OUTOFMEMORY 14L
#define ERROR_READ_FAULT 30L
#define ERROR_INVALID_PARAMETER 87L
#define ERROR_DISK_FULL 112L
#define ERROR_INSUFFICIENT_BUFFER 122L
#define ERROR_MOD_NOT_FOUND 126L
#define ERROR_PROC_NOT_FOUND 127L
#define ERROR_BAD_PATHNAME 161L
#define ERROR_MORE_DATA 234L
#define ERROR_NO_MORE_ITEMS 259L
#define ERROR_MR_MID_NOT_FOUND 317L
#define ERROR_NOACCESS 998L
#define ERROR_BADKEY 1010L
#define ERROR_KEY_DELETED 1018L
#define ERROR_DLL_INIT_FAILED 1114L
#define ERROR_INVALID_WINDOW_HANDLE 1400L
#define ERROR_INVALID_MENU_HANDLE 1401L
#define ERROR_INVALID_INDEX 1413L
#define ERROR_CONTROL_ID_NOT_FOUND 1421L
#define ERROR_MENU_ITEM_NOT_FOUND 1456L
#define ERROR_TIMEOUT 1460L
#define ERROR_RESOURCE_DATA_NOT_FOUND 1812L
#define ERROR_RESOURCE_TYPE_NOT_FOUND 1813L
#define ERROR_RESOURCE_NAME_NOT_FOUND 1814L

W32_API DWORD WINAPI GetLastError(void);
W32_API void WINAPI SetLastError(DWORD code);
W32_API DWORD WINAPI GetCurrentThreadId(void);

W32_API HMODULE WINAPI LoadLibraryW(LPCWSTR fileName);
W32_API FARPROC WINAPI GetProcAddress(HMODULE module, LPCSTR procName);
W32_API BOOL WINAPI FreeLibrary(HMODULE module);

// System messages: English texts, inserts left as they are, into the caller's buffer.
#define FORMAT_MESSAGE_IGNORE_INSERTS 0x00000200
#define FORMAT_MESSAGE_FROM_SYSTEM 0x00001000
W32_API DWORD WINAPI FormatMessageW(DWORD flags, LPCVOID source, DWORD messageId, DWORD languageId,
                                    LPWSTR buffer, DWORD size, void* arguments);

// Synchronous files over POSIX descriptors: no overlapped I/O, no sharing modes enforced.
#define INVALID_HANDLE_VALUE ((HANDLE)(LONG_PTR)-1)
#define GENERIC_READ 0x80000000L
#define GENERIC_WRITE 0x40000000L
#define CREATE_ALWAYS 2
#define OPEN_EXISTING 3
#define FILE_SHARE_READ 0x00000001
#define FILE_ATTRIBUTE_NORMAL 0x00000080

typedef struct _OVERLAPPED OVERLAPPED, *LPOVERLAPPED;

W32_API HANDLE WINAPI CreateFileW(LPCWSTR lpFileName, DWORD dwDesiredAccess, DWORD dwShareMode,
                                  LPSECURITY_ATTRIBUTES lpSecurityAttributes,
                                  DWORD dwCreationDisposition, DWORD dwFlagsAndAttributes,
                                  HANDLE hTemplateFile);
W32_API BOOL WINAPI CloseHandle(HANDLE hObject);
W32_API BOOL WINAPI ReadFile(HANDLE hFile, LPVOID lpBuffer, DWORD nNumberOfBytesToRead,
                             LPDWORD lpNumberOfBytesRead, LPOVERLAPPED lpOverlapped);
W32_API BOOL WINAPI WriteFile(HANDLE hFile, LPCVOID lpBuffer, DWORD nNumberOfBytesToWrite,
                              LPDWORD lpNumberOfBytesWritten, LPOVERLAPPED lpOverlapped);

#define VER_PLATFORM_WIN32_WINDOWS 1
#define VER_PLATFORM_WIN32_NT 2

typedef struct _OSVERSIONINFOW {
    DWORD dwOSVersionInfoSize;
    DWORD dwMajorVersion;
    DWORD dwMinorVersion;
    DWORD dwBuildNumber;
    DWORD dwPlatformId;
    WCHAR szCSDVersion[128];
} OSVERSIONINFOW, *LPOSVERSIONINFOW;

static_assert(sizeof(OSVERSIONINFOW) == 276, "OSVERSIONINFOW is 276 bytes on Windows");

W32_API BOOL WINAPI GetVersionExW(LPOSVERSIONINFOW lpVersionInformation);

// The module's calloc, malloc and free reach the layer through the linker (--wrap), so tests
// can make allocation fail without the module's sources knowing.

// The runtime library's wide-string functions, as overloads on UTF-16 text.
inline size_t wcslen(const WCHAR* text) {
    const WCHAR* end = text;
    while (*end) ++end;
    return static_cast<size_t>(end - text);
}

inline WCHAR* wcscpy(WCHAR* dest, const WCHAR* src) {
    WCHAR* out = dest;
    while ((*out++ = *src++) != 0) {
    }
    return dest;
}

// Copies at most `count` characters and pads with zeros up to `count`, like wcsncpy.
inline WCHAR* wcsncpy(WCHAR* dest, const WCHAR* src, size_t count) {
    size_t i = 0;
    for (; i < count && src[i] != 0; ++i) dest[i] = src[i];
    for (; i < count; ++i) dest[i] = 0;
    return dest;
}

// Case-insensitive comparison folding A-Z to a-z only, as the C locale does.
inline int _wcsicmp(const WCHAR* a, const WCHAR* b) {
    auto fold = [](WCHAR c) -> int { return (c >= u'A' && c <= u'Z') ? c + (u'a' - u'A') : c; };
    for (;; ++a, ++b) {
        int ca = fold(*a), cb = fold(*b);
        if (ca != cb || ca == 0) return ca - cb;
    }
}
