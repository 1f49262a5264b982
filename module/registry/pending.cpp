// Registry routines whose implementation has not landed yet. Each keeps its table slot and shape
// and answers honestly: conditions are false, the others report ERROR_CALL_NOT_IMPLEMENTED.
#include "../runtime/host_services.h"
#include "../runtime/routines.h"

namespace {
const DWORD ERROR_NOT_BUILT_YET = 120;  // ERROR_CALL_NOT_IMPLEMENTED

short NotYet(RunObjectData* instance) {
    instance->lastError = ERROR_NOT_BUILT_YET;
    return 0;
}
}  // namespace

LONG WINAPI CndKeyExists(RunObjectData*, HostValue, HostValue) { return 0; }
LONG WINAPI CndValueExists(RunObjectData*, HostValue, HostValue) { return 0; }
LONG WINAPI CndCurrentKeyExists(RunObjectData*, HostValue, HostValue) { return 0; }
LONG WINAPI CndCurrentValueExists(RunObjectData*, HostValue, HostValue) { return 0; }
short WINAPI ActSetCurrentDword(RunObjectData* i, HostValue, HostValue) { return NotYet(i); }
short WINAPI ActSetCurrentString(RunObjectData* i, HostValue, HostValue) { return NotYet(i); }
short WINAPI ActSetDword(RunObjectData* i, HostValue, HostValue) { return NotYet(i); }
short WINAPI ActSetString(RunObjectData* i, HostValue, HostValue) { return NotYet(i); }
short WINAPI ActDeleteCurrentKey(RunObjectData* i, HostValue, HostValue) { return NotYet(i); }
short WINAPI ActDeleteCurrentValue(RunObjectData* i, HostValue, HostValue) { return NotYet(i); }
short WINAPI ActDeleteKey(RunObjectData* i, HostValue, HostValue) { return NotYet(i); }
short WINAPI ActDeleteValue(RunObjectData* i, HostValue, HostValue) { return NotYet(i); }
short WINAPI ActCreateCurrentKey(RunObjectData* i, HostValue, HostValue) { return NotYet(i); }
short WINAPI ActCreateKey(RunObjectData* i, HostValue, HostValue) { return NotYet(i); }
HostValue WINAPI ExpGetCurrentDword(RunObjectData* i, HostValue) { return NotYet(i); }
HostValue WINAPI ExpGetCurrentString(RunObjectData* i, HostValue) {
    NotYet(i);
    return TextResult(i, EmptyString);
}
HostValue WINAPI ExpGetDword(RunObjectData* i, HostValue) { return NotYet(i); }
HostValue WINAPI ExpGetString(RunObjectData* i, HostValue) {
    NotYet(i);
    return TextResult(i, EmptyString);
}
