// The script parser: values as scripts write them, and every malformed line refused with its
// file:line and a message that names the fault.
#include <gtest/gtest.h>
#include <hivelet/script.h>

namespace {

using hv::script::Step;
using hv::script::Value;
using Kind = hv::script::Value::Kind;

// The steps of a script that must parse.
std::vector<Step> steps(const std::string& text) {
    hv::script::ParseResult r = hv::script::parse("t.hvs", text);
    EXPECT_TRUE(r.ok()) << r.error;
    return r.script.steps;
}

Step only(const std::string& line) {
    std::vector<Step> s = steps(line);
    return s.size() == 1 ? s[0] : Step{};
}

TEST(ScriptParser, TextEscapes) {
    Step s = only(R"(act ActSetCurrentKey "a\\b\"c\n\r\t\u20AC\u00e9 # kept")");
    ASSERT_EQ(s.values.size(), 1u);
    EXPECT_EQ(s.values[0].kind, Kind::Text);
    EXPECT_EQ(s.values[0].text, u"a\\b\"c\n\r\t\u20AC\u00e9 # kept");
    Step utf8 = only("act ActSetCurrentKey \"Software\\\\Caf\xC3\xA9 \xF0\x9F\x90\x9D\"");
    EXPECT_EQ(utf8.values[0].text, u"Software\\Caf\u00e9 \U0001F41D");
    EXPECT_EQ(hv::script::quote(u"a\\\"\r\n\x01\U0001F41D"),
              "\"a\\\\\\\"\\r\\n\\u0001\xF0\x9F\x90\x9D\"");
}

TEST(ScriptParser, ParameterKinds) {
    Step s = only("act ActSetDword HKEY_CURRENT_USER null \"\" -2147483648");
    ASSERT_EQ(s.values.size(), 4u);
    EXPECT_EQ(s.values[0].kind, Kind::RootKey);
    EXPECT_EQ(s.values[0].integer, 2);
    EXPECT_EQ(s.values[1].kind, Kind::Null);
    EXPECT_EQ(s.values[2].kind, Kind::Text);
    EXPECT_EQ(s.values[2].text, u"");
    EXPECT_EQ(s.values[3].integer, INT32_MIN);
    EXPECT_EQ(s.kind, hv::EventKind::Action);
    EXPECT_EQ(s.code, 4);
}

TEST(ScriptParser, IntegersAndRootIndices) {
    const std::pair<const char*, int64_t> table[] = {{"0", 0},
                                                     {"2", 2},
                                                     {"-1", -1},
                                                     {"0x10", 16},
                                                     {"0XfF", 255},
                                                     {"0xFFFFFFFF", 0xFFFFFFFF},
                                                     {"4294967295", 4294967295},
                                                     {"-2147483648", INT32_MIN},
                                                     {"000000000007", 7}};
    for (auto [text, value] : table) {
        Step s = only(std::string("act ActSet64BitMode ") + text);
        ASSERT_EQ(s.values.size(), 1u) << text;
        EXPECT_EQ(s.values[0].kind, Kind::Integer) << text;
        EXPECT_EQ(s.values[0].integer, value) << text;
    }
    const char* const names[] = {"HKEY_CLASSES_ROOT", "HKEY_LOCAL_MACHINE", "HKEY_CURRENT_USER",
                                 "HKEY_CURRENT_CONFIG", "HKEY_USERS"};
    for (int i = 0; i < 5; ++i)
        EXPECT_EQ(only(std::string("act ActSetRootKey ") + names[i]).values[0].integer, i);
    EXPECT_EQ(only("act ActSetRootKey root:7").values[0].integer, 7);
    EXPECT_EQ(only("act ActSetRootKey root:0xFFFFFFFF").values[0].integer, 0xFFFFFFFF);
    EXPECT_EQ(only("act ActSetCurrentKey result").values[0].kind, Kind::LastResult);
}

TEST(ScriptParser, ExpectationForms) {
    std::vector<Step> s = steps(
        "expect \"x\"\nexpect 5\nexpect true\nexpect false\nexpect error 40\n"
        "expect message 0\nexpect fetches 4\nexpect buffers\nexpect buffers 1024 8\n"
        "expect address currentKey\nexpect rootKeyIndex 4\nexpect currentKey null\n"
        "expect currentKey \"k\"\nexpect use64BitView 1\nexpect result \"y\"\n");
    ASSERT_EQ(s.size(), 15u);
    const char* const subjects[] = {"result",     "result",       "result",       "result",
                                    "error",      "message",      "fetches",      "buffers",
                                    "buffers",    "address",      "rootKeyIndex", "currentKey",
                                    "currentKey", "use64BitView", "result"};
    for (size_t i = 0; i < s.size(); ++i) EXPECT_EQ(s[i].subject, subjects[i]) << "line " << i + 1;
    EXPECT_EQ(s[2].values[0].kind, Kind::Boolean);
    EXPECT_TRUE(s[2].values[0].boolean);
    EXPECT_FALSE(s[3].values[0].boolean);
    EXPECT_TRUE(s[7].values.empty());
    EXPECT_EQ(s[8].values.size(), 2u);
    EXPECT_EQ(s[11].values[0].kind, Kind::Null);
    EXPECT_EQ(s[14].values[0].text, u"y");
}

// Line numbers count every line; comments, blank lines, CR LF endings and a BOM are ignored;
// echo keeps its text exactly, quotes and hashes included.
TEST(ScriptParser, LinesCommentsAndEcho) {
    std::vector<Step> s = steps(
        "\xEF\xBB\xBF# title\r\n\r\n  act ActSetRootKey HKEY_USERS   # trailing\r\n"
        "echo say \"hi\" # not a comment\r\nnew\nbuffers off\npoke rootKeyIndex 9\n");
    ASSERT_EQ(s.size(), 5u);
    EXPECT_EQ(s[0].line, 3);
    EXPECT_EQ(s[0].source, "act ActSetRootKey HKEY_USERS");
    EXPECT_EQ(s[1].text, "say \"hi\" # not a comment");
    EXPECT_EQ(s[2].command, "new");
    EXPECT_EQ(s[3].subject, "off");
    EXPECT_EQ(s[4].subject, "rootKeyIndex");
    EXPECT_EQ(s[4].values[0].integer, 9);
}

struct Malformed {
    const char* line;
    const char* message;
};

const Malformed MalformedLines[] = {
    {"frobnicate", "unknown command 'frobnicate'"},
    {"act", "act needs a routine name"},
    {"act \"ActSetRootKey\"", "act needs a routine name"},
    {"act ActNoSuch", "unknown action 'ActNoSuch'"},
    {"cnd ActSetRootKey HKEY_USERS", "ActSetRootKey is an action, not a condition"},
    {"act ExpGetCurrentKey", "ExpGetCurrentKey is an expression, not an action"},
    {"act ActSetCurrentKey \"a\\qb\"", "bad escape \\q"},
    {"act ActSetCurrentKey \"\\u12g4\"", "bad escape \\u12 (\\u takes four hex digits)"},
    {"act ActSetCurrentKey \"abc", "missing closing quote"},
    {"act ActSetCurrentKey \"abc\\\"", "missing closing quote"},
    {"act ActSetCurrentKey \"abc\"def", "text after a closing quote"},
    {"act ActSetCurrentKey ab\"c", "stray quote in 'ab\"c'"},
    {"act ActSetRootKey HKEY_NOWHERE", "unknown root key name 'HKEY_NOWHERE'"},
    {"act ActSetRootKey hkey_users", "stray text 'hkey_users'"},
    {"act ActSetRootKey root:x", "bad root index 'root:x' (root:N takes 0 to 4294967295)"},
    {"act ActSetRootKey root:-1", "bad root index 'root:-1' (root:N takes 0 to 4294967295)"},
    {"act ActSet64BitMode 4294967296", "integer out of range '4294967296'"},
    {"act ActSet64BitMode -2147483649", "integer out of range '-2147483649'"},
    {"act ActSet64BitMode 12ab", "bad integer '12ab'"},
    {"act ActSet64BitMode two", "stray text 'two'"},
    {"act ActSetRootKey HKEY_USERS extra", "stray text 'extra'"},
    {"act ActSetRootKey HKEY_USERS HKEY_USERS", "ActSetRootKey takes 1 parameter, not 2"},
    {"act ActSetString HKEY_USERS \"k\" \"v\"", "ActSetString takes 4 parameters, not 3"},
    {"cnd CndLastActionSuccessful 1", "CndLastActionSuccessful takes 0 parameters, not 1"},
    {"expect", "expect needs a value"},
    {"expect result", "expect result needs a value"},
    {"expect \"a\" \"b\"", "stray text '\"b\"'"},
    {"expect error", "expect error needs an integer"},
    {"expect error \"0\"", "expect error needs an integer"},
    {"expect error 0 1", "stray text after expect error 0"},
    {"expect fetches -1", "expect fetches needs a count"},
    {"expect address nowhere", "expect address takes currentKey, buffer or elsewhere"},
    {"expect currentKey 5", "expect currentKey takes a text or null"},
    {"new now", "stray text 'now'"},
    {"buffers maybe", "buffers takes on or off"},
    {"poke colour 1", "poke takes rootKeyIndex, lastError or use64BitView and an integer"},
    {"poke lastError", "poke lastError needs an integer"},
};

// Keeps the quotes and backslashes of a row out of the generated test names.
void PrintTo(const Malformed&, std::ostream* os) {
    *os << "row";
}

class MalformedLine : public testing::TestWithParam<Malformed> {};

// The faulty line is the third of its script; a later faulty line is not reported.
TEST_P(MalformedLine, IsRefusedWithFileAndLine) {
    SCOPED_TRACE(GetParam().line);
    std::string script = "# header\n\n" + std::string(GetParam().line) + "\nfrobnicate\n";
    hv::script::ParseResult r = hv::script::parse("dir/t.hvs", script);
    EXPECT_EQ(r.error, std::string("dir/t.hvs:3: ") + GetParam().message);
}

INSTANTIATE_TEST_SUITE_P(Lines, MalformedLine, testing::ValuesIn(MalformedLines));

TEST(ScriptParser, ExpectTakesKnownWordsOnly) {
    hv::script::ParseResult r = hv::script::parse("t.hvs", "expect maybe\n");
    EXPECT_EQ(r.error.rfind("t.hvs:1: expect takes a text, an integer, true, false", 0), 0u)
        << r.error;
}

}  // namespace
