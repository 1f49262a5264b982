// Shared plumbing of the portable Win32 layer: the hooks the test-control library
// (hvwin32_testctl) plugs in to journal calls and inject faults, and the few internals it reads.
#pragma once

#include <windows.h>

#include <initializer_list>
#include <optional>
#include <string>
#include <string_view>
#include <type_traits>

// Internals the test control, the tests and the fuzz targets reach; the module's build has no
// path to the headers that declare them.
#define W32_INTERNAL __attribute__((visibility("default")))

namespace w32 {

// What the test control plugs in. Without it nothing is journaled or failed, no export is
// hidden, and GetVersionExW reports Windows NT.
struct Control {
    void (*record)(std::string_view function, std::initializer_list<uint64_t> args,
                   int64_t result) = nullptr;
    std::optional<long> (*takeFault)(std::string_view function) = nullptr;
    bool (*exportHidden)(const char* name) = nullptr;
    DWORD (*platformId)() = nullptr;
};
W32_INTERNAL extern Control control;

// Records a served call in the journal.
inline void record(std::string_view function, std::initializer_list<uint64_t> args,
                   int64_t result) {
    if (control.record) control.record(function, args, result);
}

// If a fault is armed for this call of `function`, consumes it and returns its code.
inline std::optional<long> takeFault(std::string_view function) {
    return control.takeFault ? control.takeFault(function) : std::nullopt;
}

template <typename T>
uint64_t arg(T value) {
    if constexpr (std::is_pointer_v<T>) {
        return static_cast<uint64_t>(reinterpret_cast<uintptr_t>(value));
    } else {
        return static_cast<uint64_t>(value);
    }
}

// UTF-16 to UTF-8, at the edges of the layer (file names, library names).
std::string toUtf8(const WCHAR* text);

// A file handle over an open descriptor, and the number of file handles open.
W32_INTERNAL HANDLE addDescriptor(int fd);
W32_INTERNAL size_t openDescriptors();

}  // namespace w32
