// The run-time lifecycle of an instance and the routine tables handed to the host.
#include <stdlib.h>

#include "host_services.h"
#include "routines.h"

namespace {

// Each table holds the routines of one kind at their codes, and a null entry after them.
#define HV_ROUTINE(code, routine, parameters) routine,
const ConditionRoutine ConditionRoutines[] = {HV_CONDITIONS(HV_ROUTINE) nullptr};
const ActionRoutine ActionRoutines[] = {HV_ACTIONS(HV_ROUTINE) nullptr};
const ExpressionRoutine ExpressionRoutines[] = {HV_EXPRESSIONS(HV_ROUTINE) nullptr};
#undef HV_ROUTINE

// A routine's place in its table is its code, so the list must be written in code order.
#define HV_CODE(code, routine, parameters) code,
constexpr int ConditionCodes[] = {HV_CONDITIONS(HV_CODE)};
constexpr int ActionCodes[] = {HV_ACTIONS(HV_CODE)};
constexpr int ExpressionCodes[] = {HV_EXPRESSIONS(HV_CODE)};
#undef HV_CODE

template <size_t N>
constexpr bool InCodeOrder(const int (&codes)[N]) {
    for (size_t i = 0; i < N; ++i)
        if (codes[i] != static_cast<int>(i)) return false;
    return true;
}
static_assert(InCodeOrder(ConditionCodes), "conditions in code order");
static_assert(InCodeOrder(ActionCodes), "actions in code order");
static_assert(InCodeOrder(ExpressionCodes), "expressions in code order");

// The four-character code HVLT, first character in the most significant byte.
const DWORD ObjectIdentifier = 'H' << 24 | 'V' << 16 | 'L' << 8 | 'T';

}  // namespace

HV_EXPORT short WINAPI GetRunObjectDataSize(HostValue, HostValue) { return sizeof(RunObjectData); }

HV_EXPORT short WINAPI CreateRunObject(RunObjectData* instance, HostValue, HostValue) {
    instance->rootKeyIndex = 0;
    instance->currentKey = nullptr;
    instance->lastError = ERROR_SUCCESS;
    instance->use64BitView = 0;
    return 0;
}

HV_EXPORT short WINAPI DestroyRunObject(RunObjectData* instance, HostValue) {
    if (instance->currentKey) {
        free(instance->currentKey);
        instance->currentKey = nullptr;
    }
    return 0;
}

HV_EXPORT short WINAPI HandleRunObject(RunObjectData*) { return 1; }

// Pausing, continuing and displaying need nothing from this object: one routine answers all
// three, under the names that Hivelet.def gives it.
HV_EXPORT short WINAPI IdleRunObject(RunObjectData*) { return 0; }

// Writes every field of the block but the one byte that belongs to the host.
HV_EXPORT short WINAPI GetRunObjectInfos(HostValue, RunObjectInfos* infos) {
    infos->conditions = ConditionRoutines;
    infos->actions = ActionRoutines;
    infos->expressions = ExpressionRoutines;
    infos->conditionCount = sizeof(ConditionRoutines) / sizeof(ConditionRoutines[0]) - 1;
    infos->actionCount = sizeof(ActionRoutines) / sizeof(ActionRoutines[0]) - 1;
    infos->expressionCount = sizeof(ExpressionRoutines) / sizeof(ExpressionRoutines[0]) - 1;
    infos->reserved20 = 20;
    infos->reserved0 = 0;
    infos->reserved100 = 100;
    infos->reserved0b = 0;
    infos->identifier = ObjectIdentifier;
    infos->reserved1 = 1;
    return 1;
}
