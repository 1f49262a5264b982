// Every condition, action and expression routine, in the order of its event code. The host
// reaches them only through the routine tables.
#pragma once

#include "record.h"

LONG WINAPI CndKeyExists(RunObjectData* instance, HostValue rootKey, HostValue keyPath);
LONG WINAPI CndValueExists(RunObjectData* instance, HostValue, HostValue);
LONG WINAPI CndCurrentKeyExists(RunObjectData* instance, HostValue, HostValue);
LONG WINAPI CndCurrentValueExists(RunObjectData* instance, HostValue valueName, HostValue);
LONG WINAPI CndLastActionSuccessful(RunObjectData* instance, HostValue, HostValue);

short WINAPI ActSetRootKey(RunObjectData* instance, HostValue rootKey, HostValue);
short WINAPI ActSetCurrentKey(RunObjectData* instance, HostValue keyPath, HostValue);
short WINAPI ActSetCurrentDword(RunObjectData* instance, HostValue valueName, HostValue value);
short WINAPI ActSetCurrentString(RunObjectData* instance, HostValue valueName, HostValue text);
short WINAPI ActSetDword(RunObjectData* instance, HostValue, HostValue);
short WINAPI ActSetString(RunObjectData* instance, HostValue, HostValue);
short WINAPI ActDeleteCurrentKey(RunObjectData* instance, HostValue, HostValue);
short WINAPI ActDeleteCurrentValue(RunObjectData* instance, HostValue valueName, HostValue);
short WINAPI ActDeleteKey(RunObjectData* instance, HostValue rootKey, HostValue keyPath);
short WINAPI ActDeleteValue(RunObjectData* instance, HostValue, HostValue);
short WINAPI ActCreateCurrentKey(RunObjectData* instance, HostValue, HostValue);
short WINAPI ActCreateKey(RunObjectData* instance, HostValue, HostValue);
short WINAPI ActSet64BitMode(RunObjectData* instance, HostValue value, HostValue);

HostValue WINAPI ExpGetCurrentRootKey(RunObjectData* instance, HostValue hostValue);
HostValue WINAPI ExpGetCurrentKey(RunObjectData* instance, HostValue hostValue);
HostValue WINAPI ExpGetCurrentDword(RunObjectData* instance, HostValue hostValue);
HostValue WINAPI ExpGetCurrentString(RunObjectData* instance, HostValue hostValue);
HostValue WINAPI ExpGetDword(RunObjectData* instance, HostValue hostValue);
HostValue WINAPI ExpGetString(RunObjectData* instance, HostValue hostValue);
HostValue WINAPI ExpLastErrorCode(RunObjectData* instance, HostValue hostValue);
HostValue WINAPI ExpLastErrorMessage(RunObjectData* instance, HostValue hostValue);
