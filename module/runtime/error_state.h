// The outcome of the last operation, kept in the instance's lastError.
#pragma once

#include "record.h"

// The module's own codes; every other nonzero value is a Windows system error code.
const DWORD ERR_INVALID_PARAMETERS = 40;
const DWORD ERR_NOT_DWORD = 41;
const DWORD ERR_NOT_STRING = 42;
