// The object's 26 events in one list: for each kind, every event's code, the routine that runs
// it and the number of parameters the editor stores for it. The module's routine tables and
// routine declarations and the host simulator's lookup of routines by name are all made from
// it, so an event is added or changed here and nowhere else.
//
// Each list expands a macro of the caller's, EVENT(code, routine, parameters), once per event in
// code order. The header needs nothing else, so that the host simulator can include it without
// the module's internals.
#pragma once

#define HV_CONDITIONS(EVENT)           \
    EVENT(0, CndKeyExists, 2)          \
    EVENT(1, CndValueExists, 3)        \
    EVENT(2, CndCurrentKeyExists, 0)   \
    EVENT(3, CndCurrentValueExists, 1) \
    EVENT(4, CndLastActionSuccessful, 0)

#define HV_ACTIONS(EVENT)              \
    EVENT(0, ActSetRootKey, 1)         \
    EVENT(1, ActSetCurrentKey, 1)      \
    EVENT(2, ActSetCurrentDword, 2)    \
    EVENT(3, ActSetCurrentString, 2)   \
    EVENT(4, ActSetDword, 4)           \
    EVENT(5, ActSetString, 4)          \
    EVENT(6, ActDeleteCurrentKey, 0)   \
    EVENT(7, ActDeleteCurrentValue, 1) \
    EVENT(8, ActDeleteKey, 2)          \
    EVENT(9, ActDeleteValue, 3)        \
    EVENT(10, ActCreateCurrentKey, 0)  \
    EVENT(11, ActCreateKey, 2)         \
    EVENT(12, ActSet64BitMode, 1)

#define HV_EXPRESSIONS(EVENT)         \
    EVENT(0, ExpGetCurrentRootKey, 0) \
    EVENT(1, ExpGetCurrentKey, 0)     \
    EVENT(2, ExpGetCurrentDword, 1)   \
    EVENT(3, ExpGetCurrentString, 1)  \
    EVENT(4, ExpGetDword, 3)          \
    EVENT(5, ExpGetString, 3)         \
    EVENT(6, ExpLastErrorCode, 0)     \
    EVENT(7, ExpLastErrorMessage, 0)
