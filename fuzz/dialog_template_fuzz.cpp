// Feeds arbitrary bytes to the dialog-template reader, as DialogBoxParamW finds them in a
// library's resources.
#include <windows.h>

#include <stddef.h>
#include <stdint.h>

#include "dialog_template.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    w32::DialogTemplate t;
    if (w32::readDialogTemplate(data, size, &t) != w32::TemplateStatus::Ok) return 0;
    // Each item took at least its fixed 18 bytes of the input.
    if (t.items.size() * 18 > size) __builtin_trap();
    return 0;
}
