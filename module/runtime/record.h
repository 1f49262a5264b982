// The records the host and the module share at run time: the instance record, the host's run
// header with its services, the RunObjectInfos block and the routine shapes. Byte offsets are
// what the host reads and writes; every build asserts them for its pointer size.
#pragma once

#include <windows.h>

#include <stddef.h>
#include <stdint.h>

#include "../exports.h"

// The host's offsets for this build's pointer size: the 32-bit ones are the shipped contract,
// the 64-bit ones follow from the same rule (pointers grow to 8 bytes and align to 8).
constexpr size_t ByPointerSize(size_t with4, size_t with8) {
    return sizeof(void*) == 4 ? with4 : with8;
}

// Values that travel in a pointer-sized slot: parameter values, the expression host value.
typedef INT_PTR HostValue;

struct RunObjectData;

typedef LPWSTR(WINAPI* GetStringBufferService)(RunObjectData* instance, int zero, int bytes);
typedef HostValue(WINAPI* ExpressionParameterService)(RunObjectData* instance, int one,
                                                      HostValue hostValue);
typedef HostValue(WINAPI* GetNextParameterService)(RunObjectData* instance, int allBits, int zero);

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

typedef LONG(WINAPI* ConditionRoutine)(RunObjectData* instance, HostValue param1, HostValue param2);
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
    WORD size;  // 16 for a new parameter; never read
    BYTE hostOwned[4];
    BYTE rootIndex[4];  // u32, little-endian, not aligned
};

// The editor structure handed to the edit-time entry points.
typedef DWORD(WINAPI* GetHostVersionService)(void);
typedef void(WINAPI* InsertPropertiesService)(HostValue hostValue, int one, const void* properties,
                                              int one2, int one3);
struct EditorStructure {
    BYTE hostOwned0[ByPointerSize(20, 24)];
    HWND window;
    BYTE hostOwned1[336 - ByPointerSize(20, 24) - sizeof(void*)];
    GetHostVersionService getHostVersion;
    InsertPropertiesService insertProperties;
};

static_assert(sizeof(void*) == 4 || sizeof(void*) == 8, "4- or 8-byte pointers");
static_assert(offsetof(ObjectHeader, runHeader) == 8, "runHeader");
static_assert(offsetof(ObjectHeader, headerFlags) == 124, "headerFlags");
static_assert(sizeof(ObjectHeader) == 184, "ObjectHeader size");
static_assert(offsetof(RunObjectData, rootKeyIndex) == 184, "rootKeyIndex");
static_assert(offsetof(RunObjectData, currentKey) == ByPointerSize(188, 192), "currentKey");
static_assert(offsetof(RunObjectData, lastError) == ByPointerSize(192, 200), "lastError");
static_assert(offsetof(RunObjectData, use64BitView) == ByPointerSize(196, 204), "use64BitView");
static_assert(sizeof(RunObjectData) == ByPointerSize(200, 208), "RunObjectData size");
static_assert(offsetof(RunHeader, getStringBuffer) == 872, "GetStringBuffer");
static_assert(offsetof(RunHeader, getFirstExpressionParameter) == ByPointerSize(876, 880),
              "first parameter");
static_assert(offsetof(RunHeader, getNextExpressionParameter) == ByPointerSize(880, 888),
              "next parameter");
static_assert(offsetof(RunHeader, getNextParameter) == 928, "GetNextParameter");
static_assert(offsetof(EditorStructure, window) == ByPointerSize(20, 24), "window");
static_assert(offsetof(EditorStructure, getHostVersion) == 336, "GetHostVersion");
static_assert(offsetof(EditorStructure, insertProperties) == ByPointerSize(340, 344),
              "InsertProperties");
static_assert(offsetof(RunObjectInfos, conditions) == 0, "conditions");
static_assert(offsetof(RunObjectInfos, actions) == ByPointerSize(4, 8), "actions");
static_assert(offsetof(RunObjectInfos, expressions) == ByPointerSize(8, 16), "expressions");
static_assert(offsetof(RunObjectInfos, conditionCount) == ByPointerSize(12, 24), "condition count");
static_assert(offsetof(RunObjectInfos, actionCount) == ByPointerSize(14, 26), "action count");
static_assert(offsetof(RunObjectInfos, expressionCount) == ByPointerSize(16, 28),
              "expression count");
static_assert(offsetof(RunObjectInfos, reserved20) == ByPointerSize(18, 30), "u16 20");
static_assert(offsetof(RunObjectInfos, reserved0) == ByPointerSize(20, 32), "u32 0");
static_assert(offsetof(RunObjectInfos, reserved100) == ByPointerSize(24, 36), "u8 100");
static_assert(offsetof(RunObjectInfos, hostByte) == ByPointerSize(25, 37), "host byte");
static_assert(offsetof(RunObjectInfos, reserved0b) == ByPointerSize(26, 38), "u16 0");
static_assert(offsetof(RunObjectInfos, identifier) == ByPointerSize(28, 40), "identifier");
static_assert(offsetof(RunObjectInfos, reserved1) == ByPointerSize(32, 44), "u16 1");
static_assert(offsetof(RootKeyParam, rootIndex) == 6, "RootKeyParam root index");
static_assert(sizeof(RootKeyParam) == 10, "RootKeyParam size");
