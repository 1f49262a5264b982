// The records the host and the module share at run time: the instance record, the host's run
// header with its services, the RunObjectInfos block and the routine shapes. Byte offsets are
// what the host reads and writes; 32-bit builds assert every one of them.
#pragma once

#include <windows.h>

#include <stddef.h>
#include <stdint.h>

#include "../exports.h"

// Values that travel in a pointer-sized slot: parameter values, the expression host value.
typedef INT_PTR HostValue;

struct RunObjectData;

typedef LPWSTR(WINAPI* GetStringBufferService)(RunObjectData* instance, int zero, int bytes);
typedef HostValue(WINAPI* ExpressionParameterService)(RunObjectData* instance, int one,
                                                      HostValue hostValue);
typedef HostValue(WINAPI* GetNextParameterService)(RunObjectData* instance, int allBits,
                                                   int zero);

// The host's run header: only the four services the module calls.
struct RunHeader {
    BYTE hostOwned0[872];
    GetStringBufferService getStringBuffer;
    ExpressionParameterService getFirstExpressionParameter;
    ExpressionParameterService getNextExpressionParameter;
    BYTE hostOwned1[928 - 872 - 3 * sizeof(void*)];
    GetNextParameterService getNextParameter;
};

// The host's part of every instance record.
struct ObjectHeader {
    BYTE hostOwned0[8];
    RunHeader* runHeader;
    BYTE hostOwned1[124 - 8 - sizeof(void*)];
    WORD headerFlags;
    BYTE hostOwned2[184 - 126];
};

const WORD StringResultFlag = 0x8000;

// One object instance: the host's header, then the module's four fields.
struct RunObjectData {
    ObjectHeader header;
    DWORD rootKeyIndex;
    WCHAR* currentKey;
    DWORD lastError;
    DWORD use64BitView;
};

typedef LONG(WINAPI* ConditionRoutine)(RunObjectData* instance, HostValue param1,
                                       HostValue param2);
typedef short(WINAPI* ActionRoutine)(RunObjectData* instance, HostValue param1, HostValue param2);
typedef HostValue(WINAPI* ExpressionRoutine)(RunObjectData* instance, HostValue hostValue);

// The block through which the host receives the routine tables.
struct RunObjectInfos {
    const ConditionRoutine* conditions;
    const ActionRoutine* actions;
    const ExpressionRoutine* expressions;
    WORD conditionCount;
    WORD actionCount;
    WORD expressionCount;
    WORD reserved20;
    DWORD reserved0;
    BYTE reserved100;
    BYTE hostByte;  // never written by the module
    WORD reserved0b;
    DWORD identifier;
    WORD reserved1;
};

// A root-key parameter as the host stores it in event data.
struct RootKeyParam {
    WORD size;       // 16 for a new parameter; never read
    BYTE hostOwned[4];
    BYTE rootIndex[4];  // u32, little-endian, not aligned
};

// The editor structure handed to the edit-time entry points.
typedef DWORD(WINAPI* GetHostVersionService)(void);
typedef void(WINAPI* InsertPropertiesService)(HostValue hostValue, int one, const void* properties,
                                              int one2, int one3);
struct EditorStructure {
    BYTE hostOwned0[sizeof(void*) == 4 ? 20 : 24];
    HWND window;
    BYTE hostOwned1[336 - (sizeof(void*) == 4 ? 20 : 24) - sizeof(void*)];
    GetHostVersionService getHostVersion;
    InsertPropertiesService insertProperties;
};

#if defined(_WIN64) || defined(__x86_64__)
static_assert(offsetof(RunObjectData, rootKeyIndex) == 184, "rootKeyIndex");
static_assert(offsetof(RunObjectData, currentKey) == 192, "currentKey");
static_assert(offsetof(RunObjectData, lastError) == 200, "lastError");
static_assert(offsetof(RunObjectData, use64BitView) == 204, "use64BitView");
static_assert(sizeof(RunObjectData) == 208, "RunObjectData size");
static_assert(offsetof(RunHeader, getFirstExpressionParameter) == 880, "first parameter");
static_assert(offsetof(RunHeader, getNextExpressionParameter) == 888, "next parameter");
static_assert(offsetof(EditorStructure, window) == 24, "window");
static_assert(offsetof(EditorStructure, insertProperties) == 344, "InsertProperties");
static_assert(offsetof(RunObjectInfos, conditionCount) == 24, "counts");
static_assert(offsetof(RunObjectInfos, identifier) == 40, "identifier");
#else
static_assert(sizeof(void*) == 4, "32-bit build");
static_assert(offsetof(ObjectHeader, runHeader) == 8, "runHeader");
static_assert(offsetof(ObjectHeader, headerFlags) == 124, "headerFlags");
static_assert(sizeof(ObjectHeader) == 184, "ObjectHeader size");
static_assert(offsetof(RunObjectData, rootKeyIndex) == 184, "rootKeyIndex");
static_assert(offsetof(RunObjectData, currentKey) == 188, "currentKey");
static_assert(offsetof(RunObjectData, lastError) == 192, "lastError");
static_assert(offsetof(RunObjectData, use64BitView) == 196, "use64BitView");
static_assert(sizeof(RunObjectData) == 200, "RunObjectData size");
static_assert(offsetof(RunHeader, getStringBuffer) == 872, "GetStringBuffer");
static_assert(offsetof(RunHeader, getFirstExpressionParameter) == 876, "first parameter");
static_assert(offsetof(RunHeader, getNextExpressionParameter) == 880, "next parameter");
static_assert(offsetof(RunHeader, getNextParameter) == 928, "GetNextParameter");
static_assert(offsetof(EditorStructure, window) == 20, "window");
static_assert(offsetof(EditorStructure, getHostVersion) == 336, "GetHostVersion");
static_assert(offsetof(EditorStructure, insertProperties) == 340, "InsertProperties");
static_assert(offsetof(RunObjectInfos, conditions) == 0, "conditions");
static_assert(offsetof(RunObjectInfos, actions) == 4, "actions");
static_assert(offsetof(RunObjectInfos, expressions) == 8, "expressions");
static_assert(offsetof(RunObjectInfos, conditionCount) == 12, "condition count");
static_assert(offsetof(RunObjectInfos, actionCount) == 14, "action count");
static_assert(offsetof(RunObjectInfos, expressionCount) == 16, "expression count");
static_assert(offsetof(RunObjectInfos, reserved20) == 18, "u16 20");
static_assert(offsetof(RunObjectInfos, reserved0) == 20, "u32 0");
static_assert(offsetof(RunObjectInfos, reserved100) == 24, "u8 100");
static_assert(offsetof(RunObjectInfos, hostByte) == 25, "host byte");
static_assert(offsetof(RunObjectInfos, reserved0b) == 26, "u16 0");
static_assert(offsetof(RunObjectInfos, identifier) == 28, "identifier");
static_assert(offsetof(RunObjectInfos, reserved1) == 32, "u16 1");
#endif
static_assert(offsetof(RootKeyParam, rootIndex) == 6, "RootKeyParam root index");
static_assert(sizeof(RootKeyParam) == 10, "RootKeyParam size");
