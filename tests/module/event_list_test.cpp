// The object's events as the host must find them: every code of each kind with its routine's
// name and the number of parameters the editor stores, written down here on their own, checked
// against the names the host simulator looks routines up by, the routine tables the module
// hands over and the module's catalogue entries.
#include <hivelet/catalogue.h>

#include "support.h"

namespace {

using hv::EventKind;

struct Event {
    EventKind kind;
    int code;
    const char* routine;
    int parameters;
};

constexpr EventKind C = EventKind::Condition, A = EventKind::Action, E = EventKind::Expression;

const Event Events[] = {
    {C, 0, "CndKeyExists", 2},
    {C, 1, "CndValueExists", 3},
    {C, 2, "CndCurrentKeyExists", 0},
    {C, 3, "CndCurrentValueExists", 1},
    {C, 4, "CndLastActionSuccessful", 0},
    {A, 0, "ActSetRootKey", 1},
    {A, 1, "ActSetCurrentKey", 1},
    {A, 2, "ActSetCurrentDword", 2},
    {A, 3, "ActSetCurrentString", 2},
    {A, 4, "ActSetDword", 4},
    {A, 5, "ActSetString", 4},
    {A, 6, "ActDeleteCurrentKey", 0},
    {A, 7, "ActDeleteCurrentValue", 1},
    {A, 8, "ActDeleteKey", 2},
    {A, 9, "ActDeleteValue", 3},
    {A, 10, "ActCreateCurrentKey", 0},
    {A, 11, "ActCreateKey", 2},
    {A, 12, "ActSet64BitMode", 1},
    {E, 0, "ExpGetCurrentRootKey", 0},
    {E, 1, "ExpGetCurrentKey", 0},
    {E, 2, "ExpGetCurrentDword", 1},
    {E, 3, "ExpGetCurrentString", 1},
    {E, 4, "ExpGetDword", 3},
    {E, 5, "ExpGetString", 3},
    {E, 6, "ExpLastErrorCode", 0},
    {E, 7, "ExpLastErrorMessage", 0},
};

size_t eventsOf(EventKind kind) {
    size_t n = 0;
    for (const Event& e : Events) n += e.kind == kind;
    return n;
}

TEST(EventList, EveryRoutineIsFoundAtItsCodeWithItsParameterCount) {
    for (const Event& e : Events) {
        SCOPED_TRACE(e.routine);
        EXPECT_EQ(hv::eventCode(e.kind, e.routine), e.code);
        EXPECT_EQ(hv::parameterCount(e.kind, e.code), e.parameters);
        ASSERT_LT(static_cast<size_t>(e.code), hv::routineNames(e.kind).size());
        EXPECT_EQ(hv::routineNames(e.kind)[static_cast<size_t>(e.code)], e.routine);
    }
    // A routine is found only under its own kind.
    EXPECT_EQ(hv::eventCode(A, "CndKeyExists"), -1);
    EXPECT_EQ(hv::eventCode(C, "ExpGetString"), -1);
    EXPECT_EQ(hv::eventCode(A, "actsetrootkey"), -1);
}

TEST(EventList, TheModuleHandsOverOneRoutineAndOneEntryPerEvent) {
    const hv::Module::Tables& t = hvtest::module().tables();
    EXPECT_EQ(t.conditions.size(), eventsOf(C));
    EXPECT_EQ(t.actions.size(), eventsOf(A));
    EXPECT_EQ(t.expressions.size(), eventsOf(E));
    for (EventKind kind : {C, A, E}) EXPECT_EQ(hv::routineNames(kind).size(), eventsOf(kind));

    hv::Editor editor;
    hv::Catalogue catalogue(hvtest::module(), editor);
    for (const Event& e : Events) {
        SCOPED_TRACE(e.routine);
        auto entry = catalogue.entry(e.kind, e.code);
        ASSERT_TRUE(entry);
        EXPECT_EQ(entry->code, e.code);
        EXPECT_EQ(static_cast<int>(entry->types.size()), e.parameters);
    }
}

}  // namespace
