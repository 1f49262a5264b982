// The classic dialog-template reader: header, optional font, then DWORD-aligned items.
#include "dialog_template.h"

namespace {

// Extended style, then x, y, cx and cy.
constexpr size_t ExStyleAndRect = 4 + 4 * 2;

bool readItem(w32::Cursor& c, w32::DialogItemTemplate* item) {
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
