#include "error_state.h"

#include "../edittime/module_entry.h"
#include "../resources/resource.h"
#include "host_services.h"
#include "routines.h"

namespace {

const int MessageBufferChars = 512;

// The string resource that explains one of the module's own codes, or 0 for a system code.
UINT OwnMessageId(DWORD code) {
    switch (code) {
        case ERR_INVALID_PARAMETERS: return IDS_ERR_INVALID_PARAMETERS;
        case ERR_NOT_DWORD: return IDS_ERR_NOT_DWORD;
        case ERR_NOT_STRING: return IDS_ERR_NOT_STRING;
        default: return 0;
    }
}

}  // namespace

LONG WINAPI CndLastActionSuccessful(RunObjectData* instance, HostValue, HostValue) {
    return instance->lastError == ERROR_SUCCESS ? 1 : 0;
}

HostValue WINAPI ExpLastErrorCode(RunObjectData* instance, HostValue) {
    return static_cast<HostValue>(static_cast<LONG>(instance->lastError));
}

// A code without any text (the system knows none for it) gives an empty text rather than
// whatever the lent buffer held before.
HostValue WINAPI ExpLastErrorMessage(RunObjectData* instance, HostValue) {
    LPWSTR buffer = BorrowStringBuffer(instance, MessageBufferChars * sizeof(WCHAR));
    if (!buffer) return TextResult(instance, EmptyString);
    DWORD code = instance->lastError;
    int length;
    if (UINT id = OwnMessageId(code)) {
        length = LoadStringW(moduleInstance, id, buffer, MessageBufferChars);
    } else {
        length = static_cast<int>(
            FormatMessageW(FORMAT_MESSAGE_FROM_SYSTEM | FORMAT_MESSAGE_IGNORE_INSERTS, nullptr,
                           code, 0, buffer, MessageBufferChars, nullptr));
    }
    if (length <= 0) buffer[0] = 0;
    return TextResult(instance, buffer);
}
