// What the host simulator notices: a stand-in module (fake.hzx) damages host memory or misuses
// a service in exactly one way per routine, and each fault must show in the event's outcome.
#include <gtest/gtest.h>
#include <hivelet/host.h>

#include <cstring>
#include <stdexcept>

#ifndef _WIN32
#include <unistd.h>
#endif

namespace {

using hv::EventKind;
using hv::Param;

hv::Module& fake() {
    static std::unique_ptr<hv::Module> loaded = [] {
        std::string error;
        auto m = hv::Module::load(hv::pathBesideProgram("fake.hzx"), &error);
        if (!m) throw std::runtime_error(error);
        return m;
    }();
    return *loaded;
}

TEST(HostModule, ReadsTheTablesFromABlockItPrefilled) {
    const hv::Module::Tables& t = fake().tables();
    EXPECT_EQ(t.infosResult, 1);
    EXPECT_EQ(t.conditions.size(), 4u);
    EXPECT_EQ(t.actions.size(), 8u);
    EXPECT_EQ(t.expressions.size(), 8u);
    EXPECT_TRUE(t.conditionsEnd && t.actionsEnd && t.expressionsEnd);
    // The stand-in writes only the pointers and counts: everything else keeps the host's fill.
    EXPECT_EQ(t.block[hv::BuildLayout.infoHostByte], hv::Fill::Infos);
    EXPECT_EQ(t.block[hv::BuildLayout.infoIdentifier], hv::Fill::Infos);
    EXPECT_EQ(t.block.back(), hv::Fill::Infos);
}

TEST(HostModule, LoadFailuresNameTheirCause) {
    std::string error;
    EXPECT_EQ(hv::Module::load(hv::pathBesideProgram("fake_noinfos.hzx"), &error), nullptr);
    EXPECT_EQ(error, "the module has no export GetRunObjectInfos");
    EXPECT_EQ(hv::Module::load(hv::pathBesideProgram("no-such-module.hzx"), &error), nullptr);
    EXPECT_NE(error.find("cannot load the module"), std::string::npos) << error;
    EXPECT_NE(error.find("no-such-module.hzx"), std::string::npos) << error;
    try {
        fake().entry<FARPROC>("NoSuchExport");
        ADD_FAILURE() << "a missing export must throw";
    } catch (const std::runtime_error& e) {
        EXPECT_STREQ(e.what(), "the module has no export NoSuchExport");
    }
}

// The record: the host's header with the run header at byte 8 and its services in place; the
// guard bytes after the record's last byte.
TEST(HostInstance, LaysOutTheRecordAndRunHeader) {
    hv::Instance instance(fake());
    const hv::HostLayout& l = hv::BuildLayout;
    ASSERT_EQ(instance.recordSize(), l.recordSize);
    uint8_t* runHeader;
    std::memcpy(&runHeader, instance.record() + l.runHeader, sizeof runHeader);
    for (size_t offset : {l.getStringBuffer, l.getFirstExpressionParameter,
                          l.getNextExpressionParameter, l.getNextParameter}) {
        void* service;
        std::memcpy(&service, runHeader + offset, sizeof service);
        EXPECT_NE(service, nullptr) << "service at " << offset;
    }
    EXPECT_EQ(runHeader[0], hv::Fill::RunHeader);
    EXPECT_EQ(runHeader[l.getNextParameter - 1], hv::Fill::RunHeader);
    EXPECT_EQ(instance.record()[100], hv::Fill::Record);
    EXPECT_EQ(instance.record()[l.recordSize], hv::Fill::Guard);
}

TEST(HostInstance, PassesParametersAsTheRoutinesArguments) {
    hv::Instance instance(fake());
    EXPECT_EQ(
        instance.condition(0, {Param::integerValue(-5), Param::integerValue(9)}).asCondition(), -5);
    EXPECT_EQ(instance.condition(1, {Param::integerValue(7), Param::integerValue(9)}).asCondition(),
              9);
    EXPECT_EQ(instance.action(7).asAction(), -2);
    // Three parameters queued: the routine fetches as many as its first argument says.
    hv::Outcome all = instance.condition(
        2, {Param::integerValue(3), Param::integerValue(5), Param::integerValue(11)});
    EXPECT_EQ(all.asCondition(), 11);
    EXPECT_EQ(all.parameterFetches, 3u);
    EXPECT_TRUE(all.clean()) << all.damage;
}

TEST(HostInstance, ExpressionParametersAndTextResults) {
    hv::Instance instance(fake());
    hv::Outcome echo = instance.expression(2, {Param::str(u"h\u00e9llo"), Param::str(u"x")});
    EXPECT_TRUE(echo.clean()) << echo.damage;
    EXPECT_TRUE(echo.isText);
    EXPECT_EQ(echo.text, u"h\u00e9llo");
    EXPECT_EQ(echo.expressionFetches, 2u);
    EXPECT_EQ(echo.textSource, hv::Outcome::TextSource::Elsewhere);
    // The flag the last expression set is cleared first, so an integer result stays one.
    hv::Outcome integer = instance.expression(5);
    EXPECT_FALSE(integer.isText);
    EXPECT_NE(integer.asInteger(), 0);
    EXPECT_TRUE(integer.clean());
}

struct Fault {
    EventKind kind;
    int code;
    std::vector<Param> params;
    std::string damage;     // expected Outcome::damage, or ""
    std::string violation;  // expected start of the first violation, or ""
};

const EventKind Cnd = EventKind::Condition, Act = EventKind::Action, Exp = EventKind::Expression;

// One row per routine of the stand-in: the damage or the misuse it commits.
std::vector<Fault> faults() {
    std::string n = std::to_string(hv::BuildLayout.recordSize);
    std::string tail = "record: byte " + n + ", past its " + n + " bytes, was written";
    std::string overFetch = "fetched parameter 2 of an event with 1";
    std::vector<Param> text{Param::str(u"a")}, null{Param::null()};
    return {
        {Act, 0, {Param::rootKey(2)}, "RootKeyParam of parameter 1: byte 2 was written", ""},
        {Act, 1, {}, tail, ""},
        {Act, 2, {}, "record header: headerFlags bits 0x4 were cleared", ""},
        {Act, 3, {}, "record header: byte 40 was written", ""},
        {Act, 6, text, "text of parameter 1: byte 0 was written", ""},
        {Exp, 0, {}, "lent buffer 1 (8 bytes): byte 8, past its 8 bytes, was written", ""},
        {Exp, 7, {}, "lent buffer 1 (4 bytes): byte 1 before its start was written", ""},
        {Act, 4, null, "", "GetNextParameter: arguments 0, 0, not -1, 0"},
        {Act, 5, null, "", "GetNextParameter was given no instance record"},
        {Cnd, 3, {}, "", "a condition set StringResultFlag"},
        {Cnd, 2, {Param::integerValue(2)}, "", "GetNextParameter " + overFetch},
        {Exp, 1, {}, "", "the text result has no terminator within its block"},
        {Exp, 3, text, "", "GetNextExpressionParameter " + overFetch},
        {Exp, 4, text, "", "GetFirstExpressionParameter: host value 0x"},
        {Exp, 6, {}, "", "the text result is a null address"},
    };
}

void PrintTo(const Fault& f, std::ostream* os) { *os << hv::kindName(f.kind) << " " << f.code; }

class HostFault : public testing::TestWithParam<Fault> {};

TEST_P(HostFault, ShowsInTheOutcome) {
    const Fault& f = GetParam();
    hv::Instance instance(fake());
    hv::Outcome o = instance.run(f.kind, f.code, f.params);
    EXPECT_EQ(o.damage, f.damage);
    EXPECT_EQ(o.sentinelsIntact, f.damage.empty());
    if (f.violation.empty()) {
        EXPECT_TRUE(o.violations.empty()) << o.violations[0];
    } else {
        ASSERT_FALSE(o.violations.empty());
        EXPECT_EQ(o.violations[0].rfind(f.violation, 0), 0u) << o.violations[0];
    }
    EXPECT_FALSE(o.clean());
}

INSTANTIATE_TEST_SUITE_P(FakeModule, HostFault, testing::ValuesIn(faults()),
                         [](const testing::TestParamInfo<Fault>& row) {
                             return std::string(hv::kindName(row.param.kind)) +
                                    std::to_string(row.param.code);
                         });

// Damage is reported by the event that did it, once; a lent buffer is the host's again after
// its event, so a later write into it is damage too.
TEST(HostInstance, DamageBelongsToTheEventThatDidIt) {
    hv::Instance instance(fake());
    EXPECT_FALSE(instance.action(0, {Param::rootKey(1)}).sentinelsIntact);
    hv::Outcome next = instance.action(7);
    EXPECT_TRUE(next.clean()) << next.damage;
    hv::Outcome lent = instance.expression(1);  // four characters, no terminator
    ASSERT_EQ(lent.textSource, hv::Outcome::TextSource::LentBuffer);
    EXPECT_EQ(lent.text, u"xxxx");
    hv::Outcome late = instance.action(6, {Param::rawAddress(lent.textAddress)});
    EXPECT_EQ(late.damage, "previous event's lent buffer 1 (8 bytes): byte 0 was written");
}

#ifndef _WIN32
// The dynamic loader would search its library path for a bare name; the host means a file.
TEST(HostModule, BareNameIsAFileInTheCurrentFolder) {
    std::string folder = hv::pathBesideProgram("");
    char* was = getcwd(nullptr, 0);
    ASSERT_EQ(chdir(folder.c_str()), 0);
    std::string error;
    auto module = hv::Module::load("fake.hzx", &error);
    EXPECT_TRUE(module) << error;
    EXPECT_EQ(chdir(was), 0);
    free(was);
}
#endif

TEST(HostInstance, UnknownRoutineCodeThrows) {
    hv::Instance instance(fake());
    EXPECT_THROW(instance.condition(4), std::out_of_range);
    EXPECT_THROW(instance.expression(-1), std::out_of_range);
}

// GetHostVersion has no arguments: it answers for the editor whose structure was used last.
TEST(HostEditor, ServicesAtTheirOffsets) {
    typedef DWORD(WINAPI * Version)();
    typedef void(WINAPI * Insert)(hv::Slot, int, const void*, int, int);
    const hv::HostLayout& l = hv::BuildLayout;
    hv::Editor first, second;
    first.setHostVersion(0x1111);
    second.setHostVersion(0x2222);
    auto* bytes = static_cast<uint8_t*>(first.structure());
    Version version;
    Insert insert;
    std::memcpy(&version, bytes + l.getHostVersion, sizeof version);
    std::memcpy(&insert, bytes + l.insertProperties, sizeof insert);
    EXPECT_EQ(version(), 0x1111u);
    second.structure();
    EXPECT_EQ(version(), 0x2222u);
    EXPECT_EQ(first.hostVersionCalls(), 1u);
    insert(77, 1, bytes, 2, 3);
    ASSERT_EQ(second.inserts().size(), 1u);
    EXPECT_EQ(second.inserts()[0].hostValue, 77);
    EXPECT_EQ(second.inserts()[0].c, 2);
    first.setWindow(reinterpret_cast<HWND>(0x1234));
    HWND window;
    std::memcpy(&window, bytes + l.editorWindow, sizeof window);
    EXPECT_EQ(window, reinterpret_cast<HWND>(0x1234));
    first.setHostVersion(5, false);
    std::memcpy(&version, bytes + l.getHostVersion, sizeof version);
    EXPECT_EQ(version, nullptr);
}

}  // namespace
