// Helpers shared by the host simulator's sources.
#pragma once

#include <hivelet/host.h>

#include <cstring>
#include <string>

namespace hv {

// A UTF-16 text as the platform's wide string (wchar_t on Windows, char16_t on Linux).
inline LPCWSTR wide(const std::u16string& text) { return reinterpret_cast<LPCWSTR>(text.c_str()); }

// A zero-terminated platform wide string as UTF-16 text.
inline std::u16string fromWide(const WCHAR* text) {
    return std::u16string(reinterpret_cast<const char16_t*>(text));
}

// A number in hex ("0x1F"), for messages about flags, masks and host values.
std::string hex(uint64_t value);

// "a condition", "an action", "an expression".
inline std::string withArticle(EventKind kind) {
    return (kind == EventKind::Condition ? "a " : "an ") + std::string(kindName(kind));
}

// The first byte of [data, data + size) that differs from `expected`, or -1.
long firstDifference(const uint8_t* data, const uint8_t* expected, size_t size);
// The first byte of [data, data + size) that is not `pattern`, or -1.
long firstNotPattern(const uint8_t* data, uint8_t pattern, size_t size);

}  // namespace hv
