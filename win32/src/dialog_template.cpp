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

// Extended style, then x, y, cx and cy.
constexpr size_t ExStyleAndRect = 4 + 4 * 2;

bool readItem(Cursor& c, w32::DialogItemTemplate* item) {
    WORD extraBytes = 0;  // creation data that follows the item
    c.alignToDword();
    return c.dword(&item->style) && c.skip(ExStyleAndRect) && c.word(&item->id) &&
           c.id(&item->windowClass) && c.id(&item->title) && c.word(&extraBytes) &&
           c.skip(extraBytes);
}

}  // namespace

namespace w32 {

TemplateStatus readDialogTemplate(const BYTE* data, size_t size, DialogTemplate* out) {
    *out = {};
    if (!data) return TemplateStatus::Truncated;
    Cursor c(data, size);
    WORD count = 0;
    TemplateId menu, windowClass;
    std::u16string fontName;
    if (!c.dword(&out->style)) return TemplateStatus::Truncated;
    if (out->style == 0xFFFF0001) return TemplateStatus::Extended;  // dlgVer 1, signature 0xFFFF
    if (!c.skip(4) || !c.word(&count) || !c.skip(4 * 2) || !c.id(&menu) || !c.id(&windowClass) ||
        !c.text(&out->title))
        return TemplateStatus::Truncated;
    // DS_SETFONT: the point size, then the font's name.
    if ((out->style & DS_SETFONT) && !(c.skip(2) && c.text(&fontName)))
        return TemplateStatus::Truncated;
    for (WORD i = 0; i < count; ++i) {
        DialogItemTemplate item;
        if (!readItem(c, &item)) return TemplateStatus::Truncated;
        out->items.push_back(std::move(item));
    }
    return TemplateStatus::Ok;
}

}  // namespace w32
