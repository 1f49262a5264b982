// The runtime-library functions the module uses: allocation (reached through the linker's
// --wrap, so it can be made to fail) and the wide-string functions on UTF-16 text.
#include "internal.h"

#include <atomic>

namespace {
std::atomic<size_t> liveBlocks{0};
}

namespace w32test {
size_t liveAllocations() { return liveBlocks.load(); }
}  // namespace w32test

extern "C" W32_TEST_API void* __wrap_calloc(size_t count, size_t size) {
    void* block = w32::takeFault("calloc") ? nullptr : calloc(count, size);
    if (block) ++liveBlocks;
    w32::record("calloc", {count, size}, w32::arg(block));
    return block;
}

extern "C" W32_TEST_API void* __wrap_malloc(size_t size) {
    void* block = w32::takeFault("malloc") ? nullptr : malloc(size);
    if (block) ++liveBlocks;
    w32::record("malloc", {size}, w32::arg(block));
    return block;
}

extern "C" W32_TEST_API void __wrap_free(void* block) {
    if (block) --liveBlocks;
    w32::record("free", {w32::arg(block)}, 0);
    free(block);
}

size_t w32_wcslen(const WCHAR* text) {
    const WCHAR* end = text;
    while (*end) ++end;
    return static_cast<size_t>(end - text);
}

WCHAR* w32_wcscpy(WCHAR* dest, const WCHAR* src) {
    WCHAR* out = dest;
    while ((*out++ = *src++) != 0) {
    }
    return dest;
}

// Copies at most `count` characters and pads with zeros up to `count`, like wcsncpy.
WCHAR* w32_wcsncpy(WCHAR* dest, const WCHAR* src, size_t count) {
    size_t i = 0;
    for (; i < count && src[i] != 0; ++i) dest[i] = src[i];
    for (; i < count; ++i) dest[i] = 0;
    return dest;
}

// Case-insensitive comparison folding A-Z to a-z only, as the C locale does.
int w32_wcsicmp(const WCHAR* a, const WCHAR* b) {
    auto fold = [](WCHAR c) -> int { return (c >= u'A' && c <= u'Z') ? c + (u'a' - u'A') : c; };
    for (;; ++a, ++b) {
        int ca = fold(*a), cb = fold(*b);
        if (ca != cb || ca == 0) return ca - cb;
    }
}
