// Shared helpers of the tests: the loaded module, guarded buffers and UTF-16 text.
#pragma once

#include <gtest/gtest.h>
#include <hivelet/host.h>
#include <windows.h>

#include <cstring>
#include <memory>
#include <string>
#include <vector>

#ifndef _WIN32
#include <w32/testctl.h>
#define HV_HAS_TEST_CONTROL 1
#else
#define HV_HAS_TEST_CONTROL 0
#endif

namespace hvtest {

// The module under test, loaded once for the whole test program.
hv::Module& module();

// Skips the current test where the portable layer's fault injection is not available.
#define HV_NEEDS_TEST_CONTROL()                                                         \
    do {                                                                                \
        if (!HV_HAS_TEST_CONTROL)                                                       \
            GTEST_SKIP() << "needs the portable Win32 layer's fault injection (Linux)"; \
    } while (0)

// A buffer of `capacity` elements followed by sentinel elements; everything starts as `fill`.
template <typename T>
class Guarded {
public:
    explicit Guarded(size_t capacity, T fill = static_cast<T>(0xA5A5), size_t guard = 16)
        : capacity_(capacity), store_(capacity + guard, fill), fill_(fill) {}
    T* data() { return store_.data(); }
    size_t capacity() const { return capacity_; }
    T& operator[](size_t i) { return store_[i]; }
    // True when nothing past the capacity was written.
    bool intact() const {
        for (size_t i = capacity_; i < store_.size(); ++i)
            if (store_[i] != fill_) return false;
        return true;
    }
    // True when not a single element changed.
    bool untouched() const {
        for (const T& e : store_)
            if (e != fill_) return false;
        return true;
    }

private:
    size_t capacity_;
    std::vector<T> store_;
    T fill_;
};

inline std::u16string text(const WCHAR* p) {
    return p ? std::u16string(reinterpret_cast<const char16_t*>(p)) : std::u16string();
}
inline LPWSTR wide(char16_t* p) { return reinterpret_cast<LPWSTR>(p); }
inline LPCWSTR wide(const char16_t* p) { return reinterpret_cast<LPCWSTR>(p); }

// Gtest prints UTF-16 text readably.
std::string show(const std::u16string& s);

}  // namespace hvtest
