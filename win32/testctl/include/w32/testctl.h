// Test control of the portable Win32 layer (library hvwin32_testctl): a journal of the calls the
// layer served and fault injection. The tests, the host simulator, the benchmarks and the fuzz
// targets link it; the module cannot. Linux builds only; tests that need it skip themselves on
// Windows builds.
#pragma once

#include <windows.h>

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#define W32_TEST_API __attribute__((visibility("default")))

namespace w32test {

// One served call: the function's Windows name, its integer arguments (pointers as addresses,
// masks and codes as numbers) and its result.
struct Call {
    std::string function;
    std::vector<uint64_t> args;
    int64_t result = 0;
};

// Forgets the journal and every armed fault, and returns the layer to its initial state
// (journal on).
W32_TEST_API void reset();

W32_TEST_API const std::vector<Call>& journal();
W32_TEST_API void clearJournal();
// Whether served calls are journaled: on at start and after reset(). Benchmarks switch it off,
// since the journal's own cost would hide what they measure.
W32_TEST_API void setJournal(bool on);
// Number of journal entries for one function.
W32_TEST_API size_t count(std::string_view function);
// The journal entries for one function, in call order.
W32_TEST_API std::vector<Call> callsOf(std::string_view function);

// Makes the nth call (1 = the next one) of `function` from now on fail with `code`. For the
// allocation functions ("calloc", "malloc") the failure is a null result and the code is ignored.
W32_TEST_API void failCall(std::string_view function, unsigned nth, long code);
// Makes every call of `function` from now on fail with `code`.
W32_TEST_API void failAlways(std::string_view function, long code);
// Disarms the fault of one function, or all of them.
W32_TEST_API void clearFault(std::string_view function);
W32_TEST_API void clearFaults();

// Blocks handed out by calloc/malloc through the layer and not yet freed.
W32_TEST_API size_t liveAllocations();

// Menus alive that no other menu holds: each is a menu bar or popup that someone must still
// destroy. A menu's popups are destroyed with it and are not listed.
W32_TEST_API std::vector<HMENU> liveMenus();
// Every menu object alive, held popups included.
W32_TEST_API size_t menuObjectCount();

// ---- Registry test control -------------------------------------------------------------
// Every registry call is journaled with its arguments in Windows' order, pointers as
// addresses: RegOpenKeyExW {hKey, lpSubKey, ulOptions, samDesired, phkResult};
// RegCreateKeyExW {hKey, lpSubKey, Reserved, lpClass, dwOptions, samDesired, lpSecurity-
// Attributes, phkResult, lpdwDisposition}; RegQueryValueExW {hKey, lpValueName, lpReserved,
// lpType, lpData, lpcbData}; RegSetValueExW {hKey, lpValueName, Reserved, dwType, lpData,
// cbData}; RegDeleteKeyW {hKey, lpSubKey}; RegDeleteKeyExW {hKey, lpSubKey, samDesired,
// Reserved}; RegDeleteValueW {hKey, lpValueName}; RegEnumKeyExW {hKey, dwIndex, lpName,
// lpcchName, lpReserved, lpClass, lpcchClass, lpftLastWriteTime}; RegCloseKey {hKey};
// GetVersionExW {lpVersionInformation}. failCall/failAlways with a registry function's name
// make it return that code and change nothing (a failed open or create sets *phkResult NULL).
// Denied rights and hidden exports plug into the layer when this library is loaded.

// An empty registry: the five roots, HKLM\SOFTWARE with Wow6432Node and Classes, and
// HKCU\Software; every handle closed, no right denied. Also unhides every export and gives
// GetVersionExW back its platform. reset() calls it. HKEY_CLASSES_ROOT is a root of its own,
// not an alias of HKLM\SOFTWARE\Classes; only HKLM\SOFTWARE has a 32-bit view.
W32_TEST_API void resetRegistry();
// Handles open now, predefined ones excluded.
W32_TEST_API size_t openHandleCount();
// Denies `rights` to everyone on the key at `path` below the predefined `root`, creating the
// key if it is missing; the view bits of `rights` choose the view as in RegCreateKeyExW (none:
// the 32-bit view). Replaces an earlier denial; 0 lifts it. Opening or creating the key with a
// mask that asks a denied right gives 5; denied DELETE keeps it from being deleted, denied
// KEY_CREATE_SUB_KEY from getting new subkeys.
W32_TEST_API void denyAccess(HKEY root, std::u16string path, DWORD rights);
// Makes GetProcAddress on the system libraries (advapi32 ...) find `name` or not.
W32_TEST_API void hideExport(const char* name, bool hidden);
// Makes GetVersionExW return 0 (last error 87) while `fail` is set; reset() clears it too.
W32_TEST_API void setVersionFault(bool fail);
// The dwPlatformId GetVersionExW reports; VER_PLATFORM_WIN32_NT (2) by default.
W32_TEST_API void setPlatformId(DWORD id);

// ---- File test control -----------------------------------------------------------------
// ReadFile and WriteFile are journaled as {hFile, lpBuffer, nNumberOfBytes, lpNumberOfBytes,
// lpOverlapped} with the BOOL result; CreateFileW as {lpFileName, dwDesiredAccess,
// dwCreationDisposition} with the handle; CloseHandle as {hObject}. failCall/failAlways with
// "ReadFile", "WriteFile" or "CreateFileW" make the call fail with that code (last error) and
// touch nothing: no byte is read or written and the reported count is 0.

// A file handle over an open descriptor (a pipe, a memfd, a temporary file); the handle owns
// it from now on, and CloseHandle closes it.
W32_TEST_API HANDLE fileHandleFromDescriptor(int fd);
// Makes the nth WriteFile (1 = the next one) report success and 0 bytes written, writing
// nothing.
W32_TEST_API void silentWrite(unsigned nth);
// Makes the nth ReadFile deliver `missing` bytes fewer than it asked for (all of them when
// `missing` is at least the request) and report success with the count it delivered; the file
// position moves only by what was delivered.
W32_TEST_API void shortRead(unsigned nth, DWORD missing);
// File handles open now.
W32_TEST_API size_t openFileCount();

// ---- Window test control -----------------------------------------------------------------
// DialogBoxParamW, EndDialog, GetDlgItem, SendMessageW, PostMessageW, the window-long functions,
// SetTimer and KillTimer are journaled with their arguments in Windows' order; failCall/
// failAlways("DialogBoxParamW", ...) make it return -1 with that last error and create nothing.
// A modal loop left with no message and no timer while its dialog is open journals
// "ModalLoopStalled" {dialog} and makes DialogBoxParamW return -1 (last error ERROR_TIMEOUT).

// Every window alive now (dialogs and their controls).
W32_TEST_API std::vector<HWND> liveWindows();
// Timers set and not yet killed.
W32_TEST_API size_t pendingTimers();

}  // namespace w32test
