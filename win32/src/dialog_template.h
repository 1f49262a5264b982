// Reading classic dialog templates (DLGTEMPLATE and its DLGITEMTEMPLATE entries) from resource
// bytes. The reader never reads outside the bytes it is given and rejects a template that runs
// past them; extended templates (DLGTEMPLATEEX) are not read.
#pragma once

#include "byte_cursor.h"

#include <string>
#include <vector>

namespace w32 {

// The fields the layer's dialogs use; positions, sizes, extended styles, the menu, the class
// and the font are read past.
struct DialogItemTemplate {
    DWORD style = 0;
    WORD id = 0;
    TemplateId windowClass;
    TemplateId title;
};

struct DialogTemplate {
    DWORD style = 0;
    std::u16string title;
    std::vector<DialogItemTemplate> items;
};

enum class TemplateStatus { Ok, Truncated, Extended };

// Reads a template at the start of `data` (which the resource image aligns to a DWORD).
W32_INTERNAL TemplateStatus readDialogTemplate(const BYTE* data, size_t size, DialogTemplate* out);

}  // namespace w32
