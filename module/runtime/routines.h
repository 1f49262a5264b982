// Every condition, action and expression routine, declared from the event list in its kind's
// shape. The host reaches them only through the routine tables.
#pragma once

#include <hivelet_events.h>

#include "record.h"

#define HV_DECLARE_CONDITION(code, routine, parameters) \
    LONG WINAPI routine(RunObjectData* instance, HostValue first, HostValue second);
#define HV_DECLARE_ACTION(code, routine, parameters) \
    short WINAPI routine(RunObjectData* instance, HostValue first, HostValue second);
#define HV_DECLARE_EXPRESSION(code, routine, parameters) \
    HostValue WINAPI routine(RunObjectData* instance, HostValue hostValue);

HV_CONDITIONS(HV_DECLARE_CONDITION)
HV_ACTIONS(HV_DECLARE_ACTION)
HV_EXPRESSIONS(HV_DECLARE_EXPRESSION)

#undef HV_DECLARE_CONDITION
#undef HV_DECLARE_ACTION
#undef HV_DECLARE_EXPRESSION
