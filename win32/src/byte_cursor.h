// Little-endian reads of resource bytes (compiled resources, menu and dialog templates),
// bytewise since the bytes need not be aligned in memory; no read passes their end.
#pragma once

#include "internal.h"

#include <algorithm>
#include <string>

namespace w32 {

// A TYPE, NAME, menu, class or title field: an ordinal (0xFFFF, n) or a text (possibly empty).
struct TemplateId {
    bool isOrdinal = false;
    WORD ordinal = 0;
    std::u16string text;
};

class Cursor {
public:
    Cursor(const BYTE* data, size_t size) : data_(data), size_(size) {}
    bool word(WORD* out) {
        if (size_ - at_ < 2) return false;
        *out = static_cast<WORD>(data_[at_] | (data_[at_ + 1] << 8));
        at_ += 2;
        return true;
    }
    bool dword(DWORD* out) {
        WORD low = 0, high = 0;
        if (!word(&low) || !word(&high)) return false;
        *out = low | static_cast<DWORD>(high) << 16;
        return true;
    }
    // A zero-terminated UTF-16 text.
    bool text(std::u16string* out) {
        out->clear();
        for (WORD c = 0; word(&c);) {
            if (c == 0) return true;
            out->push_back(static_cast<char16_t>(c));
        }
        return false;
    }
    // A field that is empty (0), an ordinal (0xFFFF then the number) or a text.
    bool id(TemplateId* out) {
        *out = {};
        if (size_ - at_ < 2) return false;
        WORD first = static_cast<WORD>(data_[at_] | (data_[at_ + 1] << 8));
        if (first == 0xFFFF) {
            at_ += 2;
            out->isOrdinal = true;
            return word(&out->ordinal);
        }
        return text(&out->text);
    }
    bool skip(size_t bytes) {
        if (size_ - at_ < bytes) return false;
        at_ += bytes;
        return true;
    }
    // Fields and items start on a DWORD boundary; the last one's padding may be missing.
    void alignToDword() { at_ = std::min(size_, (at_ + 3) & ~static_cast<size_t>(3)); }
    // Bytes read so far.
    size_t at() const { return at_; }

private:
    const BYTE* data_;
    size_t size_;
    size_t at_ = 0;
};

}  // namespace w32
