// The standard run of every routine in both views: its outcome, the root and masks of its
// registry calls, and each of those calls made to fail in turn.
#include "registry_fixture.h"

#include <map>

namespace hvreg {
namespace {

std::string hex(uint64_t value) {
    std::ostringstream out;
    out << std::hex << value;
    return out.str();
}

// The calls that open, create or delete keys, with their masks: " open 20019 ...".
std::string keyCalls(const std::vector<w32test::Call>& journal) {
    std::string out;
    for (const w32test::Call& c : journal) {
        const std::vector<uint64_t>& a = c.args;
        if (c.function == "RegOpenKeyExW") out += " open " + hex(a[3]) + (a[2] ? " options" : "");
        if (c.function == "RegCreateKeyExW") {
            out += " create " + hex(a[5]) + (a[2] | a[3] | a[4] | a[6] | a[8] ? " extras" : "");
        }
        if (c.function == "RegDeleteKeyExW") out += " deleteEx " + hex(a[2]) + " " + hex(a[3]);
        if (c.function == "RegDeleteKeyW") out += " delete";
    }
    return out;
}

class RegistryStandardRun : public RegistryFixture, public ::testing::WithParamInterface<ViewCase> {
protected:
    const Op& op = ops()[std::get<0>(GetParam())];
    const bool view = std::get<1>(GetParam());

    // A fresh standard scene in the case's view; returns the fields the routine must keep.
    std::string prepare() {
        w32test::reset();
        standardScene();
        view64(view);
        instance.setLastError(Untouched);
        return fields();
    }
    // Reads with KEY_READ, writes and deletes values with full access, walks a tree with
    // DELETE and enumeration only, K and then its subkey C; all with the view's flag.
    std::string expectedKeyCalls() const {
        const uint32_t v = view ? KEY_WOW64_64KEY : 0;
        const std::string walk = " open " + hex(DELETE | KEY_ENUMERATE_SUB_KEYS | v);
        const std::string deletion = view ? " deleteEx 100 0" : " delete";
        switch (op.group) {
            case Group::Writer: return " create " + hex(KEY_ALL_ACCESS | v);
            case Group::ValueDelete: return " open " + hex(KEY_ALL_ACCESS | v);
            case Group::KeyDelete: return walk + walk + deletion + deletion;
            default: return " open " + hex(KEY_READ | v);
        }
    }
};

TEST_P(RegistryStandardRun, SucceedsWithItsRootAndMasks) {
    const std::string before = prepare();
    w32test::clearJournal();
    hv::Outcome o = runOp(op, standardParams(op));
    const std::vector<w32test::Call> journal = w32test::journal();
    expectSucceeded(op, o);
    expectFetches(op, o);
    EXPECT_EQ(fields(), before);
    if (!Layer) return;
    EXPECT_EQ(keyCalls(journal), expectedKeyCalls());
    const char* first = op.group == Group::Writer ? "RegCreateKeyExW" : "RegOpenKeyExW";
    EXPECT_EQ(callsOf(journal, first).at(0).args[0], handleValue(CurrentUser));
    const bool tree = op.group == Group::KeyDelete;
    EXPECT_EQ(callsOf(journal, "GetVersionExW").size(), tree ? 1u : 0u);
    EXPECT_EQ(callsOf(journal, "LoadLibraryW").size(), tree && view ? 1u : 0u);
    EXPECT_EQ(callsOf(journal, "FreeLibrary").size(), tree && view ? 1u : 0u);
}

// Failed closes and the string writers' failed type probe do not count; every other failure
// is the outcome, and nothing changed unless a write came before it.
TEST_P(RegistryStandardRun, EachFailingCallGivesItsCodeOrIsIgnored) {
    HV_NEEDS_TEST_CONTROL();
    prepare();
    const std::string scene = sceneState();
    w32test::clearJournal();
    runOp(op, standardParams(op));
    std::vector<std::string> sequence;
    for (const w32test::Call& c : w32test::journal()) {
        if (c.function.rfind("Reg", 0) == 0) sequence.push_back(c.function);
    }
    std::map<std::string, unsigned> seen;
    bool written = false;
    for (const std::string& function : sequence) {
        const unsigned nth = ++seen[function];
        const bool ignored = function == "RegCloseKey" ||
                             (op.group == Group::Writer && function == "RegQueryValueExW");
        const bool secondRead = op.group == Group::StringReader && nth == 2;  // of the value
        for (long code : {2L, 5L, 8L}) {
            SCOPED_TRACE(function + " #" + std::to_string(nth) + " fails with " +
                         std::to_string(code));
            const std::string before = prepare();
            w32test::failCall(function, nth, code);
            handlesLeftOpen = function == "RegCloseKey";  // the layer keeps what it failed to close
            hv::Outcome o = runOp(op, standardParams(op));
            handlesLeftOpen = 0;
            if (ignored) {
                expectSucceeded(op, o);
            } else {
                expectFailed(op, o, DWORD(code), secondRead);
            }
            if (!ignored && !written) {
                EXPECT_EQ(sceneState(), scene);
            }
            EXPECT_EQ(fields(), before);
        }
        written = written || function == "RegSetValueExW" || function.rfind("RegDelete", 0) == 0;
    }
}

INSTANTIATE_TEST_SUITE_P(All, RegistryStandardRun,
                         ::testing::Combine(::testing::Range<size_t>(0, ops().size()),
                                            ::testing::Bool()),
                         viewCaseName);

}  // namespace
}  // namespace hvreg
