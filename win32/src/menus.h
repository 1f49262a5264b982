// Menus of the portable Win32 layer: menu objects behind HMENU handles, built from the menu
// templates the resource compiler writes or item by item with AppendMenuW.
//
// A standard menu template is a 4-byte header (version 0, offset of the first item from the end
// of the header), then items: a WORD of flags, a WORD command identifier unless the item opens a
// popup, and a zero-terminated UTF-16 text. A popup's items follow it directly; MF_END marks the
// last item of each level. An item with identifier 0 and an empty text is a separator.
#pragma once

#include <w32/testctl.h>

namespace w32 {

// Builds a menu bar from a template; null when the template is malformed (any item running past
// the end, a level without its MF_END item, nesting deeper than menuDepthLimit).
W32_TEST_API HMENU menuFromTemplate(const BYTE* data, size_t size);

// Popups nested deeper than this make a template malformed.
constexpr unsigned menuDepthLimit = 32;

}  // namespace w32
