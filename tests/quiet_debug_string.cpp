// Windows test programs only. GoogleTest copies every failure and skip message to
// OutputDebugStringA, which raises an exception that the system then handles itself; in a
// 32-bit Wine process under qemu-user that handling unwinds into a crash and the test program
// dies. The message is on standard output already, so the import is routed to a function that
// does nothing: the test programs never raise an exception of their own.
#include <windows.h>

namespace {
void WINAPI ignoreDebugString(LPCSTR) {}
}  // namespace

#ifdef _WIN64
extern "C" void(WINAPI* const outputDebugStringImport)(LPCSTR) asm("__imp_OutputDebugStringA") =
    ignoreDebugString;
#else
extern "C" void(WINAPI* const outputDebugStringImport)(LPCSTR) asm("__imp__OutputDebugStringA@4") =
    ignoreDebugString;
#endif
