// Entry points the host requires but this object has no use for; each gives its fixed answer.
#include "../runtime/record.h"

#define ANSWER(name, result, ...) \
    HV_EXPORT DWORD WINAPI name(__VA_ARGS__) { return result; }
#define NOTHING(name, ...) \
    HV_EXPORT void WINAPI name(__VA_ARGS__) {}
#define A2 HostValue, HostValue
#define A3 HostValue, HostValue, HostValue
#define A4 HostValue, HostValue, HostValue, HostValue
#define A5 HostValue, HostValue, HostValue, HostValue, HostValue

HV_EXPORT void* WINAPI GetDependencies(void) { return nullptr; }
ANSWER(Free, 0, HostValue)

ANSWER(Initialize, 0, A2)
ANSWER(UsesFile, 0, A2)
ANSWER(GetTextCaps, 0, A2)
ANSWER(GetTextAlignment, 0, A2)
ANSWER(GetTextClr, 0, A2)
ANSWER(UpdateEditStructure, 0, A2)
NOTHING(StartApp, A2)
NOTHING(EndApp, A2)

ANSWER(GetPropValue, 0, A3)
ANSWER(GetPropCheck, 0, A3)
ANSWER(GetPropCreateParam, 0, A3)
ANSWER(EditProp, 0, A3)
ANSWER(IsPropEnabled, 1, A3)
NOTHING(UnloadObject, A3)
NOTHING(PrepareToWriteObject, A3)
NOTHING(CreateFromFile, A3)
NOTHING(DuplicateObject, A3)
NOTHING(SetTextAlignment, A3)
NOTHING(SetTextClr, A3)
NOTHING(StartFrame, A3)
NOTHING(EndFrame, A3)
NOTHING(ReleaseProperties, A3)

ANSWER(LoadObject, 0, A4)
ANSWER(GetFilters, 0, A4)
ANSWER(SetTextFont, 1, A4)
NOTHING(PutObject, A4)
NOTHING(RemoveObject, A4)
NOTHING(UpdateFileNames, A4)
NOTHING(SetPropValue, A4)
NOTHING(SetPropCheck, A4)
NOTHING(ReleasePropCreateParam, A4)

ANSWER(GetTextFont, 1, A5)
