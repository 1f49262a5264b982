// Shared plumbing of the portable Win32 layer: journal entries and armed faults.
#pragma once

#include <w32/testctl.h>

#include <initializer_list>
#include <optional>

namespace w32 {

// Records a served call in the journal.
void record(std::string_view function, std::initializer_list<uint64_t> args, int64_t result);

// If a fault is armed for this call of `function`, consumes it and returns its code.
std::optional<long> takeFault(std::string_view function);

template <typename T>
uint64_t arg(T value) {
    if constexpr (std::is_pointer_v<T>) {
        return static_cast<uint64_t>(reinterpret_cast<uintptr_t>(value));
    } else {
        return static_cast<uint64_t>(value);
    }
}

// UTF-8 <-> UTF-16 conversions used at the edges of the layer (file names, symbol names).
std::string toUtf8(const WCHAR* text);

}  // namespace w32
