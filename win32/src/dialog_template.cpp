// The classic dialog-template reader: header, optional font, then DWORD-aligned items.
#include "dialog_template.h"

#include <algorithm>

namespace {

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
    bool shortValue(short* out) {
        WORD w = 0;
        if (!word(&w)) return false;
        *out = static_cast<short>(w);
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
    bool id(w32::TemplateId* out) {
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
    // Items start on a DWORD boundary; the last one's padding may be missing.
    void alignToDword() { at_ = std::min(size_, (at_ + 3) & ~static_cast<size_t>(3)); }

private:
    const BYTE* data_;
    size_t size_;
    size_t at_ = 0;
};

bool readRect(Cursor& c, short* x, short* y, short* cx, short* cy) {
    return c.shortValue(x) && c.shortValue(y) && c.shortValue(cx) && c.shortValue(cy);
}

bool readItem(Cursor& c, w32::DialogItemTemplate* item) {
    c.alignToDword();
    return c.dword(&item->style) && c.dword(&item->exStyle) &&
           readRect(c, &item->x, &item->y, &item->cx, &item->cy) && c.word(&item->id) &&
           c.id(&item->windowClass) && c.id(&item->title) && c.word(&item->extraBytes) &&
           c.skip(item->extraBytes);
}

}  // namespace

namespace w32 {

TemplateStatus readDialogTemplate(const BYTE* data, size_t size, DialogTemplate* out) {
    *out = {};
    if (!data) return TemplateStatus::truncated;
    Cursor c(data, size);
    WORD count = 0;
    if (!c.dword(&out->style)) return TemplateStatus::truncated;
    if (out->style == 0xFFFF0001) return TemplateStatus::extended;  // dlgVer 1, signature 0xFFFF
    if (!c.dword(&out->exStyle) || !c.word(&count) ||
        !readRect(c, &out->x, &out->y, &out->cx, &out->cy) || !c.id(&out->menu) ||
        !c.id(&out->windowClass) || !c.text(&out->title))
        return TemplateStatus::truncated;
    if ((out->style & DS_SETFONT) && !(c.word(&out->pointSize) && c.text(&out->fontName)))
        return TemplateStatus::truncated;
    for (WORD i = 0; i < count; ++i) {
        DialogItemTemplate item;
        if (!readItem(c, &item)) return TemplateStatus::truncated;
        out->items.push_back(std::move(item));
    }
    return TemplateStatus::ok;
}

}  // namespace w32
