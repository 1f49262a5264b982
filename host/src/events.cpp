// What the host knows about the object's events, from the module's event list: routine names
// in code order and how many parameters the editor stores for each; the parameter values it
// builds.
#include <hivelet/host.h>
#include <hivelet_events.h>

#include <utility>

namespace hv {

namespace {

struct Routine {
    const char* name;
    int parameters;
};

// The routines of one kind in code order, with the number of parameters of each, as the
// module's event list gives them.
const std::vector<Routine>& routines(EventKind kind) {
#define HV_ROUTINE(code, routine, parameters) {#routine, parameters},
    static const std::vector<Routine> conditions = {HV_CONDITIONS(HV_ROUTINE)};
    static const std::vector<Routine> actions = {HV_ACTIONS(HV_ROUTINE)};
    static const std::vector<Routine> expressions = {HV_EXPRESSIONS(HV_ROUTINE)};
#undef HV_ROUTINE
    switch (kind) {
        case EventKind::Condition: return conditions;
        case EventKind::Action: return actions;
        default: return expressions;
    }
}

// The names of one kind's routines, in code order.
std::vector<std::string> namesOf(EventKind kind) {
    std::vector<std::string> names;
    for (const Routine& r : routines(kind)) names.push_back(r.name);
    return names;
}

}  // namespace

Param Param::null() {
    return Param{};
}

Param Param::str(std::u16string text) {
    Param p;
    p.kind = Kind::Text;
    p.text = std::move(text);
    return p;
}

Param Param::integerValue(int32_t value) {
    Param p;
    p.kind = Kind::Integer;
    p.integer = value;
    return p;
}

Param Param::rootKey(uint32_t index) {
    Param p;
    p.kind = Kind::RootKey;
    p.rootIndex = index;
    return p;
}

Param Param::rawAddress(const void* address) {
    Param p;
    p.kind = Kind::Address;
    p.address = reinterpret_cast<Slot>(address);
    return p;
}

int eventCode(EventKind kind, const std::string& routineName) {
    const auto& table = routines(kind);
    for (size_t code = 0; code < table.size(); ++code)
        if (routineName == table[code].name) return static_cast<int>(code);
    return -1;
}

const std::vector<std::string>& routineNames(EventKind kind) {
    static const std::vector<std::string> conditions = namesOf(EventKind::Condition);
    static const std::vector<std::string> actions = namesOf(EventKind::Action);
    static const std::vector<std::string> expressions = namesOf(EventKind::Expression);
    switch (kind) {
        case EventKind::Condition: return conditions;
        case EventKind::Action: return actions;
        default: return expressions;
    }
}

int parameterCount(EventKind kind, int code) {
    const auto& table = routines(kind);
    if (code < 0 || static_cast<size_t>(code) >= table.size()) return -1;
    return table[static_cast<size_t>(code)].parameters;
}

const char* kindName(EventKind kind) {
    switch (kind) {
        case EventKind::Condition: return "condition";
        case EventKind::Action: return "action";
        default: return "expression";
    }
}

std::vector<uint8_t> rootKeyRecord(uint32_t index) {
    std::vector<uint8_t> bytes(hostLayout.rootParamSize, fill::hostBytes);
    bytes[0] = 16;
    bytes[1] = 0;
    for (int i = 0; i < 4; ++i)
        bytes[hostLayout.rootParamIndex + i] = static_cast<uint8_t>(index >> (8 * i));
    return bytes;
}

}  // namespace hv
