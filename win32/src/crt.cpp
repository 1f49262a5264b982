// The module's allocation functions, reached through the linker's --wrap so that tests can make
// them fail and count the blocks still held.
#include "internal.h"

W32_API void* __wrap_calloc(size_t count, size_t size) {
    void* block = w32::takeFault("calloc") ? nullptr : calloc(count, size);
    w32::record("calloc", {count, size}, w32::arg(block));
    return block;
}

W32_API void* __wrap_malloc(size_t size) {
    void* block = w32::takeFault("malloc") ? nullptr : malloc(size);
    w32::record("malloc", {size}, w32::arg(block));
    return block;
}

W32_API void __wrap_free(void* block) {
    w32::record("free", {w32::arg(block)}, 0);
    free(block);
}
