// The host's services, reached through the instance's run header, and string results. Every
// routine calls some of them, so they are inline: a call of a service is the host's call alone.
#pragma once

#include "record.h"

// The module's one static empty text, returned wherever a text result has nothing to show.
extern const WCHAR EmptyString[1];

// The next parameter of the running condition or action, from the first on.
inline HostValue NextParameter(RunObjectData* instance) {
    return instance->header.runHeader->getNextParameter(instance, -1, 0);
}

// A parameter value as what it carries: a text, or the address of a RootKeyParam record.
inline const WCHAR* Text(HostValue value) { return reinterpret_cast<const WCHAR*>(value); }
inline const RootKeyParam* RootParam(HostValue value) {
    return reinterpret_cast<const RootKeyParam*>(value);
}

// The running expression's first argument, then each further one in order.
inline HostValue FirstExpressionParameter(RunObjectData* instance, HostValue hostValue) {
    return instance->header.runHeader->getFirstExpressionParameter(instance, 1, hostValue);
}
inline HostValue NextExpressionParameter(RunObjectData* instance, HostValue hostValue) {
    return instance->header.runHeader->getNextExpressionParameter(instance, 1, hostValue);
}

// A buffer of at least `bytes` bytes lent by the host for a text result, or null.
inline LPWSTR BorrowStringBuffer(RunObjectData* instance, int bytes) {
    return instance->header.runHeader->getStringBuffer(instance, 0, bytes);
}

// Marks the expression's result as text and returns it in the routine's result slot.
inline HostValue TextResult(RunObjectData* instance, const WCHAR* text) {
    instance->header.headerFlags |= StringResultFlag;
    return reinterpret_cast<HostValue>(text);
}
