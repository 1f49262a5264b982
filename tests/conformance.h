// What the tests of the Win32 layer share. The same rows run over the portable layer (Linux
// builds) and over the system's own functions (Windows builds, run under Wine in 64- and 32-bit
// processes), so that each row is also checked against an implementation written elsewhere.
#pragma once

#include <windows.h>

#include <gtest/gtest.h>

#include <cstdlib>
#include <string>

#ifdef _WIN32
#define HV_OVER_LAYER 0
#else
#define HV_OVER_LAYER 1
#include <w32/testctl.h>
#endif

// UTF-16 text: char16_t over the layer, wchar_t on Windows; literals are written TEXT("...").
using WString = std::basic_string<WCHAR>;

namespace conf {

// Whether the system functions are Wine's: its ntdll exports wine_get_version.
inline bool underWine() {
#ifdef _WIN32
    static const bool wine =
        GetProcAddress(GetModuleHandleW(L"ntdll.dll"), "wine_get_version") != nullptr;
    return wine;
#else
    return false;
#endif
}

// Whether rows where Wine is known to differ run all the same (HV_WINE_DIFFERENCES=run), to see
// whether a newer Wine still differs.
inline bool runWineDifferences() {
    const char* setting = std::getenv("HV_WINE_DIFFERENCES");
    return setting && std::string(setting) == "run";
}

// Whether calls without a view flag see HKLM\SOFTWARE's 32-bit view: in a 32-bit process, as
// the shipped module runs, and over the layer, which models that process.
constexpr bool DefaultView32 = HV_OVER_LAYER || sizeof(void*) == 4;

// ASCII text (paths of the build tree) as UTF-16.
inline WString widen(const std::string& ascii) { return WString(ascii.begin(), ascii.end()); }

}  // namespace conf

// Skips a test, or a row, that needs the layer's test control (call journal, fault injection,
// handle counts, settings): over Windows there is nothing to drive.
#define HV_LAYER_ONLY(why)                                              \
    do {                                                                \
        if (!HV_OVER_LAYER) GTEST_SKIP() << "needs the layer: " << why; \
    } while (0)

// Skips a row where Wine is known to answer otherwise than Windows; the assertion stays for the
// layer and for Windows itself.
#define HV_WINE_DIFFERS(why)                                  \
    do {                                                      \
        if (conf::underWine() && !conf::runWineDifferences()) \
            GTEST_SKIP() << "Wine differs: " << why;          \
    } while (0)

// Skips a row whose call Wine does not survive (a page fault ends the test program).
#define HV_WINE_CRASHES(why)                                            \
    do {                                                                \
        if (conf::underWine()) GTEST_SKIP() << "Wine crashes: " << why; \
    } while (0)
