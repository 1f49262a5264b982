// Every registry routine fetches all of its parameters, then refuses a missing one, an invalid
// root or a missing current key before it touches the registry.
#include "registry_fixture.h"

namespace hvreg {
namespace {

struct Guard {
    enum What { Null, RootIndex, RootName, NoCurrentKey, CurrentRoot } what;
    size_t op;
    size_t arg = 0;                  // the parameter refused
    uint32_t index = 0;              // RootIndex, CurrentRoot
    const char16_t* name = nullptr;  // RootName
};
const char* const GuardNames[] = {"Null", "RootIndex", "RootName", "NoCurrentKey", "CurrentRoot"};
void PrintTo(const Guard& g, std::ostream* os) {
    *os << ops()[g.op].routine << " " << GuardNames[g.what];
}
std::string guardName(const ::testing::TestParamInfo<Guard>& row) {
    return ops()[row.param.op].routine + ("_" + std::string(GuardNames[row.param.what])) + "_" +
           std::to_string(row.index);
}

std::vector<Guard> guards() {
    std::vector<Guard> out;
    for (size_t i = 0; i < ops().size(); ++i) {
        const Op& op = ops()[i];
        for (size_t a = 0; a < op.args.size(); ++a) {
            if (op.args[a] != Arg::Dword) out.push_back({Guard::Null, i, a});  // 0 is a value
            for (uint32_t bad : {5u, 0xFFFFFFFFu}) {
                if (op.args[a] == Arg::Root) out.push_back({Guard::RootIndex, i, a, bad});
            }
            // An abbreviation, a trailing blank, an empty text and a longer name match no root.
            for (const char16_t* bad : {u"HKLM", u"HKEY_CURRENT_USER ", u"", u"HKEY_USERSX"}) {
                if (op.args[a] == Arg::RootName) out.push_back({Guard::RootName, i, a, 0, bad});
            }
        }
        if (!op.current()) continue;
        out.push_back({Guard::NoCurrentKey, i});
        for (uint32_t bad : {5u, 0xFFFFFFFFu}) out.push_back({Guard::CurrentRoot, i, 0, bad});
    }
    return out;
}

class RegistryGuards : public RegistryFixture, public ::testing::WithParamInterface<Guard> {};

TEST_P(RegistryGuards, RefuseBeforeAnyRegistryCall) {
    const Guard& g = GetParam();
    const Op& op = ops()[g.op];
    standardScene(g.what != Guard::NoCurrentKey);
    std::vector<Param> params = standardParams(op);
    if (g.what == Guard::Null) params[g.arg] = Param::null();
    if (g.what == Guard::RootIndex) params[g.arg] = Param::rootKey(g.index);
    if (g.what == Guard::RootName) params[g.arg] = Param::str(g.name);
    if (g.what == Guard::NoCurrentKey) act(SetRootKey, {Param::rootKey(User)});
    if (g.what == Guard::CurrentRoot) instance.setRootKeyIndex(g.index);
    instance.setLastError(Untouched);
    const std::string scene = sceneState(), before = fields();
    w32test::clearJournal();
    hv::Outcome o = runOp(op, params);
    EXPECT_EQ(layerCalls(), "");
    expectFailed(op, o, 40);
    expectFetches(op, o);
    EXPECT_EQ(fields(), before);
    EXPECT_EQ(sceneState(), scene);
}

INSTANTIATE_TEST_SUITE_P(All, RegistryGuards, ::testing::ValuesIn(guards()), guardName);

}  // namespace
}  // namespace hvreg
