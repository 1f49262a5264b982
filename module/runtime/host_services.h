// The host's services, reached through the instance's run header, and string results.
#pragma once

#include "record.h"

// The module's one static empty text, returned wherever a text result has nothing to show.
extern const WCHAR EmptyString[1];

// The next parameter of the running condition or action, from the first on.
HostValue NextParameter(RunObjectData* instance);

// The running expression's first argument, then each further one in order.
HostValue FirstExpressionParameter(RunObjectData* instance, HostValue hostValue);
HostValue NextExpressionParameter(RunObjectData* instance, HostValue hostValue);

// A buffer of at least `bytes` bytes lent by the host for a text result, or null.
LPWSTR BorrowStringBuffer(RunObjectData* instance, int bytes);

// Marks the expression's result as text and returns it in the routine's result slot.
HostValue TextResult(RunObjectData* instance, const WCHAR* text);
