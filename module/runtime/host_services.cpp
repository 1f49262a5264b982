#include "host_services.h"

const WCHAR EmptyString[1] = {0};

HostValue NextParameter(RunObjectData* instance) {
    return instance->header.runHeader->getNextParameter(instance, -1, 0);
}

HostValue FirstExpressionParameter(RunObjectData* instance, HostValue hostValue) {
    return instance->header.runHeader->getFirstExpressionParameter(instance, 1, hostValue);
}

HostValue NextExpressionParameter(RunObjectData* instance, HostValue hostValue) {
    return instance->header.runHeader->getNextExpressionParameter(instance, 1, hostValue);
}

LPWSTR BorrowStringBuffer(RunObjectData* instance, int bytes) {
    return instance->header.runHeader->getStringBuffer(instance, 0, bytes);
}

HostValue TextResult(RunObjectData* instance, const WCHAR* text) {
    instance->header.headerFlags |= StringResultFlag;
    return reinterpret_cast<HostValue>(text);
}
