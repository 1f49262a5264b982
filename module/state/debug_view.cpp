// The debugger's view of an instance: one line with the current root key and one with the
// current key, formatted from the module's string resources into the host's line buffer.
#include <stdlib.h>

#include "../edittime/module_entry.h"
#include "../resources/resource.h"
#include "../runtime/host_services.h"
#include "../runtime/key_selection.h"

namespace {

enum : WORD { DEBUG_ITEM_ROOT_KEY = 0, DEBUG_ITEM_CURRENT_KEY = 1, DEBUG_TREE_END = 0xFFFF };

const WORD DebugTree[] = {DEBUG_ITEM_ROOT_KEY, DEBUG_ITEM_CURRENT_KEY, DEBUG_TREE_END};

const size_t WorkBufferChars = 520;
const size_t HostLineChars = 256;

// The text that an item's %s stands for.
const WCHAR* ItemArgument(const RunObjectData* instance, WORD item) {
    if (item == DEBUG_ITEM_ROOT_KEY) return RootNameAt(instance->rootKeyIndex);
    return instance->currentKey ? instance->currentKey : EmptyString;
}

// Formats the line so that it can never pass the line buffer, however long the argument: the
// argument is cut to what fits, and the cut copy lives in the format buffer's unused tail.
// Every '%' of the format may stand for the whole argument, so each one gets an equal share.
void FormatBounded(WCHAR* line, WCHAR* format, const WCHAR* argument) {
    size_t formatLength = wcslen(format);
    // A format that fills its buffer leaves no room: its %s then stands for nothing.
    if (formatLength + 2 > WorkBufferChars) {
        wsprintfW(line, format, EmptyString);
        return;
    }
    size_t percents = 0;
    for (const WCHAR* p = format; *p; ++p) percents += *p == '%';
    // Room after the format's terminator, less the cut copy's own terminator.
    size_t room = WorkBufferChars - formatLength - 2;
    size_t share = percents ? room / percents : 0;
    WCHAR* cut = format + formatLength + 1;
    size_t i = 0;
    for (; i < share && argument[i]; ++i) cut[i] = argument[i];
    cut[i] = 0;
    wsprintfW(line, format, cut);
}

}  // namespace

HV_EXPORT const WORD* WINAPI GetDebugTree(HostValue) { return DebugTree; }

// Items other than the two lines, and a work buffer that cannot be had, leave the host's
// buffer as it was.
HV_EXPORT void WINAPI GetDebugItem(LPWSTR hostLine, RunObjectData* instance, int item) {
    WCHAR* format = static_cast<WCHAR*>(calloc(WorkBufferChars, sizeof(WCHAR)));
    WCHAR* line = static_cast<WCHAR*>(calloc(WorkBufferChars, sizeof(WCHAR)));
    UINT formatId = item == DEBUG_ITEM_ROOT_KEY      ? IDS_DEBUG_ROOT_KEY_FORMAT
                    : item == DEBUG_ITEM_CURRENT_KEY ? IDS_DEBUG_CURRENT_KEY_FORMAT
                                                     : 0;
    if (format && line && formatId) {
        LoadStringW(moduleInstance, formatId, format, static_cast<int>(WorkBufferChars));
        FormatBounded(line, format, ItemArgument(instance, static_cast<WORD>(item)));
        wcsncpy(hostLine, line, HostLineChars);
        hostLine[HostLineChars - 1] = 0;
    }
    free(format);
    free(line);
}

HV_EXPORT void WINAPI EditDebugItem(HostValue, HostValue) {}
