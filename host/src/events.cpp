// What the host knows about the object's events, from the module's event list: routine names
// in code order and how many parameters the editor stores for each.
#include <hivelet/host.h>
#include <hivelet_events.h>

#include <algorithm>

namespace hv {

const std::vector<std::string>& routineNames(EventKind kind) {
#define HV_NAME(code, routine, parameters) #routine,
    static const std::vector<std::string> Names[] = {
        {HV_CONDITIONS(HV_NAME)}, {HV_ACTIONS(HV_NAME)}, {HV_EXPRESSIONS(HV_NAME)}};
#undef HV_NAME
    return Names[static_cast<int>(kind)];
}

int eventCode(EventKind kind, const std::string& routineName) {
    const std::vector<std::string>& names = routineNames(kind);
    auto found = std::find(names.begin(), names.end(), routineName);
    return found == names.end() ? -1 : static_cast<int>(found - names.begin());
}

int parameterCount(EventKind kind, int code) {
#define HV_COUNT(code, routine, parameters) parameters,
    static const std::vector<int> Counts[] = {
        {HV_CONDITIONS(HV_COUNT)}, {HV_ACTIONS(HV_COUNT)}, {HV_EXPRESSIONS(HV_COUNT)}};
#undef HV_COUNT
    const std::vector<int>& table = Counts[static_cast<int>(kind)];
    return code < 0 || static_cast<size_t>(code) >= table.size() ? -1
                                                                 : table[static_cast<size_t>(code)];
}

const char* kindName(EventKind kind) {
    static const char* const Names[] = {"condition", "action", "expression"};
    return Names[static_cast<int>(kind)];
}

std::vector<uint8_t> rootKeyRecord(uint32_t index) {
    std::vector<uint8_t> bytes(BuildLayout.rootParamSize, Fill::HostBytes);
    bytes[0] = 16;
    bytes[1] = 0;
    for (int i = 0; i < 4; ++i)
        bytes[BuildLayout.rootParamIndex + i] = static_cast<uint8_t>(index >> (8 * i));
    return bytes;
}

}  // namespace hv
