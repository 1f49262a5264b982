// Reading classic dialog templates (DLGTEMPLATE and its DLGITEMTEMPLATE entries) from resource
// bytes. The reader never reads outside the bytes it is given and rejects a template that runs
// past them; extended templates (DLGTEMPLATEEX) are not read.
#pragma once

#include <w32/testctl.h>

#include <string>
#include <vector>

namespace w32 {

// A menu, class or title field: an ordinal (0xFFFF, n) or a text (possibly empty).
struct TemplateId {
    bool isOrdinal = false;
    WORD ordinal = 0;
    std::u16string text;
};

struct DialogItemTemplate {
    DWORD style = 0;
    DWORD exStyle = 0;
    short x = 0, y = 0, cx = 0, cy = 0;
    WORD id = 0;
    TemplateId windowClass;
    TemplateId title;
    WORD extraBytes = 0;  // creation data that follows the item, skipped
};

struct DialogTemplate {
    DWORD style = 0;
    DWORD exStyle = 0;
    short x = 0, y = 0, cx = 0, cy = 0;
    TemplateId menu;
    TemplateId windowClass;
    std::u16string title;
    WORD pointSize = 0;  // with DS_SETFONT only
    std::u16string fontName;
    std::vector<DialogItemTemplate> items;
};

enum class TemplateStatus { ok, truncated, extended };

// Reads a template at the start of `data` (which the resource image aligns to a DWORD).
W32_TEST_API TemplateStatus readDialogTemplate(const BYTE* data, size_t size,
                                               DialogTemplate* out);

}  // namespace w32
