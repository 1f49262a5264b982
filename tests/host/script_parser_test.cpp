// The script parser: values as scripts write them, and every malformed line refused with its
// file:line and a message that names the fault.
#include <gtest/gtest.h>
#include <hivelet/script.h>

#include <cstdint>

namespace {

using namespace hv::script;
using hv::Param;

// The steps of a script that must parse.
std::vector<Step> steps(const std::string& text) {
    ParseResult r = parse("t.hvs", text);
    EXPECT_TRUE(r.ok()) << r.error;
    return r.script.steps;
}

Step only(const std::string& line) {
    std::vector<Step> s = steps(line);
    return s.size() == 1 ? s[0] : Step{};
}

// The line of a step, of the kind the test expects; a step of another kind fails the test.
template <typename T>
T as(const Step& step) {
    const T* line = std::get_if<T>(&step.command);
    EXPECT_TRUE(line) << "line " << step.line << ": " << step.source;
    return line ? *line : T{};
}

// The parameters of an event line.
std::vector<Param> params(const std::string& line) {
    std::vector<Param> out;
    for (const Argument& a : as<Event>(only(line)).arguments) out.push_back(a.value);
    return out;
}

TEST(ScriptParser, TextEscapes) {
    std::vector<Param> p = params(R"(act ActSetCurrentKey "a\\b\"c\n\r\u20AC\u00e9 # kept")");
    ASSERT_EQ(p.size(), 1u);
    EXPECT_EQ(p[0].kind, Param::Kind::Text);
    EXPECT_EQ(p[0].text, u"a\\b\"c\n\r\u20AC\u00e9 # kept");
    p = params("act ActSetCurrentKey \"Software\\\\Caf\xC3\xA9 \xF0\x9F\x90\x9D\"");
    EXPECT_EQ(p[0].text, u"Software\\Caf\u00e9 \U0001F41D");
    EXPECT_EQ(quote(u"a\\\"\r\n\x01\U0001F41D"), "\"a\\\\\\\"\\r\\n\\u0001\xF0\x9F\x90\x9D\"");
}

TEST(ScriptParser, ParameterKinds) {
    Event e = as<Event>(only("act ActSetDword HKEY_CURRENT_USER null \"\" -2147483648"));
    EXPECT_EQ(e.kind, hv::EventKind::Action);
    EXPECT_EQ(e.code, 4);
    ASSERT_EQ(e.arguments.size(), 4u);
    EXPECT_EQ(e.arguments[0].value.kind, Param::Kind::RootKey);
    EXPECT_EQ(e.arguments[0].value.rootIndex, 2u);
    EXPECT_EQ(e.arguments[1].value.kind, Param::Kind::Null);
    EXPECT_EQ(e.arguments[2].value.kind, Param::Kind::Text);
    EXPECT_EQ(e.arguments[2].value.text, u"");
    EXPECT_EQ(e.arguments[3].value.integer, INT32_MIN);
    EXPECT_FALSE(e.arguments[3].lastResult);
    EXPECT_TRUE(as<Event>(only("act ActSetCurrentKey result")).arguments[0].lastResult);
}

// Integers above 2147483647 wrap to negative 32-bit values.
TEST(ScriptParser, IntegersAndRootIndices) {
    const std::pair<const char*, int32_t> table[] = {{"0", 0},
                                                     {"2", 2},
                                                     {"-1", -1},
                                                     {"0x10", 16},
                                                     {"0XfF", 255},
                                                     {"0xFFFFFFFF", -1},
                                                     {"4294967295", -1},
                                                     {"2147483648", INT32_MIN},
                                                     {"-2147483648", INT32_MIN},
                                                     {"000000000007", 7}};
    for (auto [text, value] : table) {
        std::vector<Param> p = params(std::string("act ActSet64BitMode ") + text);
        ASSERT_EQ(p.size(), 1u) << text;
        EXPECT_EQ(p[0].kind, Param::Kind::Integer) << text;
        EXPECT_EQ(p[0].integer, value) << text;
    }
    const char* const names[] = {"HKEY_CLASSES_ROOT", "HKEY_LOCAL_MACHINE", "HKEY_CURRENT_USER",
                                 "HKEY_CURRENT_CONFIG", "HKEY_USERS"};
    for (uint32_t i = 0; i < 5; ++i)
        EXPECT_EQ(params(std::string("act ActSetRootKey ") + names[i])[0].rootIndex, i);
    EXPECT_EQ(params("act ActSetRootKey root:7")[0].rootIndex, 7u);
    EXPECT_EQ(params("act ActSetRootKey root:0xFFFFFFFF")[0].rootIndex, 0xFFFFFFFFu);
}

TEST(ScriptParser, ExpectationForms) {
    std::vector<Step> s = steps(
        "expect \"x\"\nexpect 5\nexpect true\nexpect false\nexpect error 40\n"
        "expect message 0\nexpect fetches 4\nexpect buffers\nexpect buffers 1024 8\n"
        "expect address currentKey\nexpect rootKeyIndex 4\nexpect currentKey null\n"
        "expect currentKey \"k\"\nexpect use64BitView 1\n"
        "expect debug 1 untouched\nexpect file \"f\" \"01\"\n");
    ASSERT_EQ(s.size(), 16u);
    EXPECT_EQ(std::get<std::u16string>(as<ExpectResult>(s[0]).value), u"x");
    EXPECT_EQ(std::get<int64_t>(as<ExpectResult>(s[1]).value), 5);
    EXPECT_TRUE(std::get<bool>(as<ExpectResult>(s[2]).value));
    EXPECT_FALSE(std::get<bool>(as<ExpectResult>(s[3]).value));
    const std::pair<size_t, ExpectNumber::Of> numbers[] = {{4, ExpectNumber::Of::LastError},
                                                           {5, ExpectNumber::Of::Message},
                                                           {6, ExpectNumber::Of::Fetches},
                                                           {10, ExpectNumber::Of::RootKeyIndex},
                                                           {13, ExpectNumber::Of::Use64BitView}};
    for (auto [index, of] : numbers) EXPECT_EQ(as<ExpectNumber>(s[index]).of, of) << index;
    EXPECT_EQ(as<ExpectNumber>(s[4]).value, 40);
    EXPECT_TRUE(as<ExpectBuffers>(s[7]).sizes.empty());
    EXPECT_EQ(as<ExpectBuffers>(s[8]).sizes, (std::vector<size_t>{1024, 8}));
    EXPECT_EQ(as<ExpectAddress>(s[9]).place, hv::Outcome::TextSource::CurrentKey);
    EXPECT_EQ(as<ExpectText>(s[11]).wanted, "null");
    EXPECT_EQ(as<ExpectText>(s[12]).wanted, "\"k\"");
    EXPECT_FALSE(as<ExpectDebug>(s[14]).text);
    EXPECT_TRUE(as<FileBytes>(s[15]).check);
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
    EXPECT_EQ(as<Echo>(s[1]).text, "say \"hi\" # not a comment");
    as<New>(s[2]);
    EXPECT_FALSE(as<Buffers>(s[3]).lend);
    EXPECT_EQ(as<Poke>(s[4]).offset, hv::BuildLayout.rootKeyIndex);
    EXPECT_EQ(as<Poke>(s[4]).value, 9u);
}

// The bytes a registry line stores or expects, for comparisons.
std::vector<uint8_t> bytes(std::initializer_list<int> list) {
    std::vector<uint8_t> out;
    for (int b : list) out.push_back(static_cast<uint8_t>(b));
    return out;
}

// Each data form gives the type and the exact bytes that go to RegSetValueExW.
TEST(ScriptParser, RegistryValueData) {
    struct Row {
        const char* data;
        uint32_t type;
        std::vector<uint8_t> bytes;
    };
    const Row table[] = {
        {"sz \"ab\"", REG_SZ, bytes({'a', 0, 'b', 0, 0, 0})},
        {"sz \"\"", REG_SZ, bytes({0, 0})},
        {"sz \"\u20ac\"", REG_SZ, bytes({0xAC, 0x20, 0, 0})},
        {"expand_sz \"%A%\"", REG_EXPAND_SZ, bytes({'%', 0, 'A', 0, '%', 0, 0, 0})},
        {"multi_sz \"a\" \"b\"", REG_MULTI_SZ, bytes({'a', 0, 0, 0, 'b', 0, 0, 0, 0, 0})},
        {"multi_sz", REG_MULTI_SZ, bytes({0, 0})},
        {"dword -1", REG_DWORD, bytes({0xFF, 0xFF, 0xFF, 0xFF})},
        {"dword 0x12345678", REG_DWORD, bytes({0x78, 0x56, 0x34, 0x12})},
        {"qword 5", REG_QWORD, bytes({5, 0, 0, 0, 0, 0, 0, 0})},
        {"qword -1", REG_QWORD, std::vector<uint8_t>(8, 0xFF)},
        {"qword 18446744073709551615", REG_QWORD, std::vector<uint8_t>(8, 0xFF)},
        {"qword -9223372036854775808", REG_QWORD, bytes({0, 0, 0, 0, 0, 0, 0, 0x80})},
        {"qword 0x0102030405060708", REG_QWORD, bytes({8, 7, 6, 5, 4, 3, 2, 1})},
        {"binary \"\"", REG_BINARY, {}},
        {"binary \"01 02ff\"", REG_BINARY, bytes({1, 2, 0xFF})},
        {"bytes sz \"41 00\"", REG_SZ, bytes({'A', 0})},
        {"bytes dword \"34 12\"", REG_DWORD, bytes({0x34, 0x12})},
        {"bytes none \"\"", REG_NONE, {}},
        {"bytes dword_be \"00\"", REG_DWORD_BIG_ENDIAN, bytes({0})},
        {"bytes link \"AB\"", REG_LINK, bytes({0xAB})},
    };
    for (const Row& row : table) {
        SCOPED_TRACE(row.data);
        Registry set =
            as<Registry>(only(std::string("reg value set HKEY_USERS \"k\" \"v\" ") + row.data));
        EXPECT_EQ(set.form, Registry::Form::SetValue);
        EXPECT_EQ(set.type, row.type);
        EXPECT_EQ(set.data, row.bytes);
        Registry e =
            as<Registry>(only(std::string("reg expect value HKEY_USERS \"k\" \"v\" ") + row.data));
        EXPECT_TRUE(e.exists);
        EXPECT_EQ(e.data, row.bytes);
    }
}

TEST(ScriptParser, RegistryLinePlacesAndViews) {
    std::vector<Step> s = steps(
        "reg key create HKEY_CURRENT_USER \"Software\\\\A\"\n"
        "reg key delete HKEY_LOCAL_MACHINE \"SOFTWARE\\\\A\" view64  # both copies\n"
        "reg value delete HKEY_CLASSES_ROOT \"\" \"\" view32\n"
        "reg expect key exists HKEY_CURRENT_CONFIG \"x\"\n"
        "reg expect key missing HKEY_USERS \"x\" view64\n"
        "reg expect value HKEY_CURRENT_USER \"k\" \"v\" missing\n"
        "reg expect value HKEY_CURRENT_USER \"k\" \"v\" dword 1 view32\n");
    ASSERT_EQ(s.size(), 7u);
    using Form = Registry::Form;
    const Form forms[] = {Form::CreateKey, Form::DeleteKey,   Form::DeleteValue, Form::ExpectKey,
                          Form::ExpectKey, Form::ExpectValue, Form::ExpectValue};
    std::vector<Registry> r;
    for (size_t i = 0; i < s.size(); ++i) {
        r.push_back(as<Registry>(s[i]));
        EXPECT_EQ(r[i].form, forms[i]) << "line " << i + 1;
        EXPECT_FALSE(s[i].layerOnly) << "line " << i + 1;
    }
    EXPECT_EQ(r[0].key.root, 2u);
    EXPECT_EQ(r[0].key.path, u"Software\\A");
    EXPECT_EQ(r[0].key.view, 0u);
    EXPECT_EQ(r[1].key.root, 1u);
    EXPECT_EQ(r[1].key.view, static_cast<uint32_t>(KEY_WOW64_64KEY));
    EXPECT_EQ(s[1].source, "reg key delete HKEY_LOCAL_MACHINE \"SOFTWARE\\\\A\" view64");
    EXPECT_EQ(r[2].key.root, 0u);
    EXPECT_EQ(r[2].name, u"");
    EXPECT_EQ(r[2].key.view, static_cast<uint32_t>(KEY_WOW64_32KEY));
    EXPECT_EQ(r[3].key.root, 3u);
    EXPECT_TRUE(r[3].exists);
    EXPECT_FALSE(r[4].exists);
    EXPECT_FALSE(r[5].exists);
    EXPECT_TRUE(r[5].data.empty());
    EXPECT_TRUE(r[6].exists);
    EXPECT_EQ(r[6].key.view, static_cast<uint32_t>(KEY_WOW64_32KEY));
}

// `layer` before a command marks that line; `layer {` ... `}` marks every line between; the
// layer's own lines are marked too. The braces are no steps of their own.
TEST(ScriptParser, LayerLinesAndBlocks) {
    std::vector<Step> s = steps(
        "layer deny HKEY_CURRENT_USER \"k\" 0x10000 view64\n"
        "layer fail RegOpenKeyExW 2 5\n"
        "layer fail GetVersionExW 3 87\n"
        "layer hide RegDeleteKeyExW\n"
        "layer version platform 1\n"
        "layer expect handles 0\n"
        "layer expect calls RegCreateKeyExW mask 0xF013F\n"
        "layer expect calls RegDeleteKeyW 3\n"
        "layer cnd CndKeyExists HKEY_USERS \"\"\n"
        "layer expect error 5\n"
        "layer echo only \"here\" # kept\n"
        "act ActSet64BitMode 1\n"
        "layer {   # a block\n"
        "  reg key create HKEY_USERS \"k\"\n"
        "  expect true\n"
        "}\n"
        "new\n");
    ASSERT_EQ(s.size(), 15u);
    for (size_t i = 0; i < s.size(); ++i) {
        bool marked = i != 11 && i != 14;
        EXPECT_EQ(s[i].layerOnly, marked) << "step " << i;
    }
    Deny deny = as<Deny>(s[0]);
    EXPECT_EQ(deny.key.path, u"k");
    EXPECT_EQ(deny.key.view, static_cast<uint32_t>(KEY_WOW64_64KEY));
    EXPECT_EQ(deny.rights, 0x10000u);
    EXPECT_EQ(as<Fail>(s[1]).function, "RegOpenKeyExW");
    EXPECT_EQ(as<Fail>(s[1]).nth, 2u);
    EXPECT_EQ(as<Fail>(s[1]).code, 5);
    EXPECT_EQ(as<Fail>(s[2]).nth, 3u);
    EXPECT_TRUE(as<Hide>(s[3]).hide);
    EXPECT_EQ(as<Version>(s[4]).platform, 1u);
    EXPECT_EQ(as<Handles>(s[5]).count, 0u);
    EXPECT_TRUE(as<Calls>(s[6]).mask);
    EXPECT_EQ(as<Calls>(s[6]).number, 0xF013Fu);
    EXPECT_FALSE(as<Calls>(s[7]).mask);
    EXPECT_EQ(as<Calls>(s[7]).number, 3u);
    EXPECT_EQ(as<Event>(s[8]).code, 0);
    EXPECT_EQ(s[8].source, "layer cnd CndKeyExists HKEY_USERS \"\"");
    EXPECT_EQ(as<ExpectNumber>(s[9]).of, ExpectNumber::Of::LastError);
    EXPECT_EQ(as<Echo>(s[10]).text, "only \"here\" # kept");
    as<Registry>(s[12]);
    EXPECT_EQ(s[12].line, 14);
}

// `process32` marks its line or its block's lines; a layer line may stand inside the block.
TEST(ScriptParser, Process32LinesAndBlocks) {
    std::vector<Step> s = steps(
        "process32 cnd CndKeyExists HKEY_LOCAL_MACHINE \"SOFTWARE\"\n"
        "process32 {\n"
        "  expect true\n"
        "  layer expect calls RegOpenKeyExW mask 0x20019\n"
        "}\n"
        "expect true\n");
    ASSERT_EQ(s.size(), 4u);
    const bool process32[] = {true, true, true, false};
    const bool layer[] = {false, false, true, false};
    for (size_t i = 0; i < s.size(); ++i) {
        EXPECT_EQ(s[i].process32Only, process32[i]) << "step " << i;
        EXPECT_EQ(s[i].layerOnly, layer[i]) << "step " << i;
    }
    EXPECT_EQ(s[0].source, "process32 cnd CndKeyExists HKEY_LOCAL_MACHINE \"SOFTWARE\"");
    EXPECT_EQ(as<Event>(s[0]).code, 0);
}

// The user's steps of param edit are read once, with their numbers; the checks keep their
// values.
TEST(ScriptParser, ParamLines) {
    std::vector<Step> s = steps(
        "param edit select 4 double 1 wait 50 ok cancel enter escape close\n"
        "param record HKEY_USERS\nparam record root:0xFFFFFFFF\nparam fill 0xFF\nparam string 64\n"
        "param expect selection none\nparam expect open yes no\n"
        "param expect bytes \"10 00 ab\"\n");
    ASSERT_EQ(s.size(), 8u);
    using Action = hv::UserStep::Action;
    const std::pair<Action, int> edit[] = {
        {Action::Select, 4}, {Action::DoubleClick, 1}, {Action::Wait, 50},  {Action::Ok, 0},
        {Action::Cancel, 0}, {Action::Enter, 0},       {Action::Escape, 0}, {Action::CloseBox, 0}};
    std::vector<hv::UserStep> steps = as<ParamEdit>(s[0]).steps;
    ASSERT_EQ(steps.size(), std::size(edit));
    for (size_t i = 0; i < steps.size(); ++i) {
        EXPECT_EQ(steps[i].action, edit[i].first) << i;
        EXPECT_EQ(steps[i].index, edit[i].second) << i;
    }
    EXPECT_EQ(as<ParamRecord>(s[1]).value, 4u);
    EXPECT_EQ(as<ParamRecord>(s[2]).value, 0xFFFFFFFFu);
    EXPECT_TRUE(as<ParamRecord>(s[3]).fill);
    EXPECT_EQ(as<ParamString>(s[4]).capacity, 64);
    EXPECT_EQ(as<ParamExpect>(s[5]).wanted, "none");
    EXPECT_EQ(as<ParamExpect>(s[6]).wanted, "yes no");
    EXPECT_EQ(as<ParamExpect>(s[7]).wanted, "[10 00 ab]");
}

// A block left open is reported at its own line; a closing brace needs an open block.
TEST(ScriptParser, LayerBlockErrors) {
    const std::pair<const char*, const char*> table[] = {
        {"act ActSet64BitMode 1\nlayer {\nnew\n", "t.hvs:2: layer { is not closed"},
        {"layer {\nlayer {\n}\n", "t.hvs:2: blocks do not nest (layer { is open since line 1)"},
        {"process32 {\nlayer {\n}\n",
         "t.hvs:2: blocks do not nest (process32 { is open since line 1)"},
        {"process32 {\nnew\n", "t.hvs:1: process32 { is not closed"},
        {"process32 { new\n}\n", "t.hvs:1: stray text after process32 {"},
        {"process32 process32 new\n", "t.hvs:1: process32 is written once"},
        {"new\n}\n", "t.hvs:2: } without layer { or process32 {"},
        {"layer {\n}\n}\n", "t.hvs:3: } without layer { or process32 {"},
        {"layer {\n} new\n", "t.hvs:2: stray text after }"},
    };
    for (auto [script, message] : table) {
        ParseResult r = parse("t.hvs", script);
        EXPECT_EQ(r.error, message) << script;
    }
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
    {"expect \"a\" \"b\"", "stray text '\"b\"'"},
    {"expect error", "expect error needs an integer"},
    {"expect error \"0\"", "expect error needs an integer"},
    {"expect error 0 1", "stray text after expect error 0"},
    {"expect fetches -1", "expect fetches needs a count"},
    {"expect address nowhere", "expect address takes currentKey, buffer or elsewhere"},
    {"expect currentKey 5", "expect currentKey takes a text or null"},
    {"new now", "stray text 'now'"},
    {"buffers maybe", "buffers takes on or off"},
    {"save state.bin", "save needs a file name in quotes"},
    {"load \"a\" \"b\"", "load needs a file name in quotes"},
    {"file \"a\" \"0g\"", "bad hex bytes '0g' (pairs of hex digits, blanks only between bytes)"},
    {"debug 1", "stray text '1'"},
    {"expect debug 1", "expect debug takes an item number and a text in quotes or untouched"},
    {"expect debug x \"y\"", "bad integer 'x'"},
    {"expect file \"a\"", "expect file needs a file name and hex bytes, both in quotes"},
    {"poke colour 1", "poke takes rootKeyIndex or lastError and an integer"},
    {"poke lastError", "poke lastError needs an integer"},
    {"reg", "reg takes key, value or expect"},
    {"reg keys create HKEY_USERS \"k\"", "reg takes key, value or expect"},
    {"reg key make HKEY_USERS \"k\"", "reg key takes create or delete"},
    {"reg value create HKEY_USERS \"k\" \"v\"", "reg value takes set or delete"},
    {"reg expect HKEY_USERS \"k\"", "reg expect takes key or value"},
    {"reg expect key HKEY_USERS \"k\"", "reg expect key takes exists or missing"},
    {"reg key create \"HKEY_USERS\" \"k\"",
     "reg key create needs a root key name (HKEY_CURRENT_USER ...)"},
    {"reg key create root:2 \"k\"", "reg key create needs a root key name (HKEY_CURRENT_USER ...)"},
    {"reg key create HKCU \"k\"", "reg key create needs a root key name (HKEY_CURRENT_USER ...)"},
    {"reg key delete HKEY_NOWHERE \"k\"", "unknown root key name 'HKEY_NOWHERE'"},
    {"reg key create HKEY_USERS", "reg key create needs a key path in quotes"},
    {"reg key create HKEY_USERS k", "reg key create needs a key path in quotes"},
    {"reg key create HKEY_USERS \"k\" \"v\"", "stray text '\"v\"'"},
    {"reg key create HKEY_USERS \"k\" view16", "stray text 'view16'"},
    {"reg key create HKEY_USERS \"k\" view64 view32", "stray text 'view64'"},
    {"reg value delete HKEY_USERS \"k\"", "reg value delete needs a value name in quotes"},
    {"reg value set HKEY_USERS \"k\" \"v\"",
     "reg value set needs a value type: sz, expand_sz, multi_sz, dword, qword, binary or bytes"},
    {"reg value set HKEY_USERS \"k\" \"v\" \"text\"",
     "reg value set needs a value type: sz, expand_sz, multi_sz, dword, qword, binary or bytes"},
    {"reg value set HKEY_USERS \"k\" \"v\" string \"t\"",
     "reg value set needs a value type: sz, expand_sz, multi_sz, dword, qword, binary or bytes, "
     "not 'string'"},
    {"reg value set HKEY_USERS \"k\" \"v\" sz", "sz needs one text in quotes"},
    {"reg value set HKEY_USERS \"k\" \"v\" sz \"a\" \"b\"", "stray text '\"b\"'"},
    {"reg value set HKEY_USERS \"k\" \"v\" expand_sz x", "expand_sz needs one text in quotes"},
    {"reg value set HKEY_USERS \"k\" \"v\" multi_sz \"a\" b", "stray text 'b'"},
    {"reg value set HKEY_USERS \"k\" \"v\" dword", "dword needs an integer"},
    {"reg value set HKEY_USERS \"k\" \"v\" dword \"1\"", "dword needs an integer"},
    {"reg value set HKEY_USERS \"k\" \"v\" dword 0x100000000",
     "integer out of range '0x100000000'"},
    {"reg value set HKEY_USERS \"k\" \"v\" dword 1 2", "stray text '2'"},
    {"reg value set HKEY_USERS \"k\" \"v\" qword 18446744073709551616",
     "integer out of range '18446744073709551616'"},
    {"reg value set HKEY_USERS \"k\" \"v\" qword -9223372036854775809",
     "integer out of range '-9223372036854775809'"},
    {"reg value set HKEY_USERS \"k\" \"v\" qword 0x10000000000000000",
     "integer out of range '0x10000000000000000'"},
    {"reg value set HKEY_USERS \"k\" \"v\" qword 1e3", "bad integer '1e3'"},
    {"reg value set HKEY_USERS \"k\" \"v\" binary", "binary needs hex bytes in quotes"},
    {"reg value set HKEY_USERS \"k\" \"v\" binary \"0g\"",
     "bad hex bytes '0g' (pairs of hex digits, blanks only between bytes)"},
    {"reg value set HKEY_USERS \"k\" \"v\" binary \"012\"",
     "bad hex bytes '012' (pairs of hex digits, blanks only between bytes)"},
    {"reg value set HKEY_USERS \"k\" \"v\" binary \"0 1\"",
     "bad hex bytes '0 1' (pairs of hex digits, blanks only between bytes)"},
    {"reg value set HKEY_USERS \"k\" \"v\" bytes \"00\"",
     "bytes needs a value type and hex bytes in quotes"},
    {"reg value set HKEY_USERS \"k\" \"v\" bytes text \"00\"",
     "unknown value type 'text' (none, sz, expand_sz, binary, dword, dword_be, link, multi_sz or "
     "qword)"},
    {"reg value set HKEY_USERS \"k\" \"v\" bytes sz", "bytes needs hex bytes in quotes"},
    {"reg expect value HKEY_USERS \"k\" \"v\"",
     "reg expect value needs missing or a value type: sz, expand_sz, multi_sz, dword, qword, "
     "binary or bytes"},
    {"reg expect value HKEY_USERS \"k\" \"v\" missing now", "stray text 'now'"},
    {"layer",
     "layer needs a command, {, or one of: deny, fail, hide, unhide, version, expect handles, "
     "expect calls"},
    {"layer # nothing",
     "layer needs a command, {, or one of: deny, fail, hide, unhide, version, expect handles, "
     "expect calls"},
    {"layer layer new", "layer is written once"},
    {"layer }", "} stands alone on its line"},
    {"layer frob", "unknown command 'frob'"},
    {"layer act ActNoSuch", "unknown action 'ActNoSuch'"},
    {"layer { now", "stray text 'now'"},
    {"layer deny HKEY_USERS \"k\"",
     "layer deny takes a root key name, a key path in quotes and the rights"},
    {"layer deny HKEY_USERS k 1",
     "layer deny takes a root key name, a key path in quotes and the rights"},
    {"layer deny root:1 \"k\" 1",
     "layer deny takes a root key name, a key path in quotes and the rights"},
    {"layer deny HKEY_USERS \"k\" read", "bad integer 'read'"},
    {"layer deny HKEY_USERS \"k\" 1 2", "stray text '2'"},
    {"layer fail RegOpenKeyExW 1",
     "layer fail takes a function, which call (1 for the next) and the code"},
    {"layer fail RegOpenKey 1 5", "the layer cannot fail 'RegOpenKey'"},
    {"layer fail RegOpenKeyExW 0 5", "layer fail counts calls from 1"},
    {"layer fail RegOpenKeyExW never 5", "bad integer 'never'"},
    {"layer fail RegOpenKeyExW 1 5 6", "stray text '6'"},
    {"layer hide", "layer hide takes an export name"},
    {"layer unhide \"RegDeleteKeyExW\"", "layer unhide takes an export name"},
    {"layer hide Reg-Delete", "layer hide takes an export name"},
    {"layer version", "layer version takes fail, normal or platform and a number"},
    {"layer version platform", "layer version takes fail, normal or platform and a number"},
    {"layer version fail now", "stray text 'now'"},
    {"layer expect handles", "layer expect handles needs a count"},
    {"layer expect handles -1", "layer expect handles needs a count"},
    {"layer expect calls RegOpenKeyExW",
     "layer expect calls takes a function and a count, or mask and a mask"},
    {"layer expect calls RegOpenKeyExW -1",
     "layer expect calls takes a function and a count, or mask and a mask"},
    {"layer expect calls RegCloseKey mask 1", "RegCloseKey takes no access mask"},
    {"layer expect calls RegOpenKeyExW mask",
     "layer expect calls takes a function and a count, or "
     "mask and a mask"},
    {"layer expect calls RegOpenKeyExW 1 2", "stray text '2'"},
    {"layer expect nothing",
     "expect takes a text, an integer, true, false or one of: error, "
     "message, fetches, buffers, address, rootKeyIndex, currentKey, "
     "use64BitView, debug, file; not 'nothing'"},
    {"}", "} without layer { or process32 {"},
    {"layer deny HKEY_NOWHERE \"k\" 1", "unknown root key name 'HKEY_NOWHERE'"},
    {"param", "param takes init, record, fill, edit, string or expect"},
    {"param init now", "stray text after param init"},
    {"param record null", "param record takes a root key name or root:N"},
    {"param record 4", "param record takes a root key name or root:N"},
    {"param string \"5\"", "expected an integer, not \"5\""},
    {"param fill 1 2", "param fill takes one value"},
    {"param edit select", "select needs a list position"},
    {"param edit wait x", "bad integer 'x'"},
    {"param edit \"ok\"", "a dialog step is a word, not \"ok\""},
    {"param edit ok frob",
     "unknown dialog step 'frob' (select N, double N, ok, cancel, enter, "
     "escape, close or wait MS)"},
    {"param expect open yes maybe", "open takes yes or no"},
    {"param expect items \"a\" b", "items takes texts in quotes"},
    {"param expect bytes \"0 1\"",
     "bad hex bytes '0 1' (pairs of hex digits, blanks only between bytes)"},
    {"param expect ranout yes no",
     "param expect takes index N, result N, selection N|none, items \"...\"..., caption \"...\", "
     "open yes|no..., ranout yes|no, text \"...\", untouched or bytes \"hex\""},
};

// Keeps the quotes and backslashes of a row out of the generated test names.
void PrintTo(const Malformed&, std::ostream* os) { *os << "row"; }

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
