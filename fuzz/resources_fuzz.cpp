// Feeds arbitrary bytes to the reader of compiled resource images, as the layer finds them in a
// loaded library: record walk, lookups by type and name, string-table blocks.
#include <w32/testctl.h>
#include <windows.h>

#include <stddef.h>
#include <stdint.h>

#include "resources.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    w32test::setJournal(false);
    w32::ResourceReader reader(data, size);
    w32::ResourceRecord record;
    while (reader.next(&record)) {
        // Every record's data must lie inside the image.
        if (record.data < data || record.data + record.size > data + size) __builtin_trap();
    }
    const WORD types[] = {w32::ResourceTypeMenu, w32::ResourceTypeDialog, w32::ResourceTypeString,
                          2, 10};
    for (WORD type : types) {
        for (WORD name : {1, 2, 9, 63, 101, 200, 400, 438, 20000}) {
            const BYTE* found = nullptr;
            size_t foundSize = 0;
            if (w32::lookupResource(data, size, type, name, w32::LanguageUsEnglish, &found,
                                    &foundSize) != w32::ResourceStatus::Found)
                continue;
            if (type != w32::ResourceTypeString) continue;
            for (unsigned i = 0; i < 16; ++i) {
                WORD length = 0;
                const BYTE* text = w32::blockString(found, foundSize, i, &length);
                if (length && (text < found || text + 2 * length > found + foundSize))
                    __builtin_trap();
            }
        }
    }
    return 0;
}
