// The script runner and the hivelet-host command line, against the real module: transcripts,
// the first failure reported as file:line and stopping its script, and the exit statuses.
#include <gtest/gtest.h>
#include <hivelet/script.h>

#include <fstream>
#include <sstream>
#include <stdexcept>

// The scripts below keep one script line per source line, as a script file would show them.
// clang-format off
namespace {

hv::Module& hivelet() {
    static std::unique_ptr<hv::Module> loaded = [] {
        std::string error;
        auto m = hv::Module::load(hv::pathBesideProgram("Hivelet.hzx"), &error);
        if (!m) throw std::runtime_error(error);
        return m;
    }();
    return *loaded;
}

struct Ran {
    bool passed;
    std::string out, err;
};

Ran run(const std::string& text, hv::Module& module = hivelet()) {
    hv::script::ParseResult parsed = hv::script::parse("t.hvs", text);
    EXPECT_TRUE(parsed.ok()) << parsed.error;
    std::ostringstream out, err;
    bool passed = hv::script::runScript(module, parsed.script, out, err);
    return {passed, out.str(), err.str()};
}

// Runs a script as a build without the portable layer does.
Ran runWithoutLayer(const std::string& text) {
    hv::script::ParseResult parsed = hv::script::parse("t.hvs", text);
    EXPECT_TRUE(parsed.ok()) << parsed.error;
    std::ostringstream out, err;
    bool passed = hv::script::runScript(hivelet(), parsed.script, out, err, false);
    return {passed, out.str(), err.str()};
}

bool contains(const std::string& text, const std::string& part) {
    return text.find(part) != std::string::npos;
}

TEST(ScriptRunner, PassingScriptShowsEachEvent) {
    Ran r =
        run("echo selecting\n"
            "act ActSetRootKey HKEY_CURRENT_USER\n"
            "exp ExpGetCurrentRootKey\n"
            "expect \"HKEY_CURRENT_USER\"\n"
            "expect address elsewhere\n"
            "act ActSetCurrentKey \"A\\\\B\"\n"
            "exp ExpGetCurrentKey\n"
            "expect address currentKey\n"
            "act ActSetCurrentKey result   # the module's own text handed back\n"
            "expect currentKey \"A\\\\B\"\n"
            "cnd CndLastActionSuccessful\n"
            "expect true\n"
            "expect error 0\n");
    EXPECT_TRUE(r.passed) << r.err;
    EXPECT_EQ(r.err, "");
    EXPECT_TRUE(contains(r.out, "selecting\n")) << r.out;
    EXPECT_TRUE(contains(r.out, "act ActSetRootKey HKEY_CURRENT_USER   => 0   (lastError 0)"))
        << r.out;
    EXPECT_TRUE(contains(r.out, "exp ExpGetCurrentKey   => \"A\\\\B\"")) << r.out;
    EXPECT_TRUE(contains(r.out, "== t.hvs: passed (6 events, 6 expectations)")) << r.out;
}

TEST(ScriptRunner, FirstFailureStopsTheScript) {
    Ran r = run("act ActSetRootKey root:7\nexpect error 40\nexpect error 0\necho not reached\n");
    EXPECT_FALSE(r.passed);
    EXPECT_EQ(r.err, "t.hvs:3: expected lastError 0, got 40\n");
    EXPECT_FALSE(contains(r.out, "not reached"));
    EXPECT_TRUE(contains(r.out, "== t.hvs: FAILED at line 3")) << r.out;
}

TEST(ScriptRunner, MismatchMessagesNameBothSides) {
    const std::pair<const char*, const char*> table[] = {
        {"expect 1", "t.hvs:1: expect with no event before it"},
        {"exp ExpLastErrorCode\nexpect address buffer",
         "t.hvs:2: expected the text result in a lent buffer, got no text result"},
        {"exp ExpGetCurrentRootKey\nexpect \"HKEY_USERS\"",
         "t.hvs:2: expected \"HKEY_USERS\", got the text \"HKEY_CLASSES_ROOT\""},
        {"exp ExpLastErrorCode\nexpect \"0\"",
         "t.hvs:2: expected \"0\", got the expression result 0"},
        {"exp ExpLastErrorCode\nexpect true",
         "t.hvs:2: expected true, got the expression result 0"},
        {"cnd CndLastActionSuccessful\nexpect false",
         "t.hvs:2: expected false, got the condition result 1"},
        {"exp ExpLastErrorCode\nexpect fetches 1", "t.hvs:2: expected parameter fetches 1, got 0"},
        {"exp ExpLastErrorCode\nexpect buffers 1024",
         "t.hvs:2: expected buffer requests [1024], got []"},
        {"exp ExpGetCurrentKey\nexpect address currentKey",
         "t.hvs:2: expected the text result in currentKey, found it elsewhere"},
        {"exp ExpLastErrorCode\nact ActSetCurrentKey result",
         "t.hvs:2: 'result' needs a text result from the event before"},
        {"expect currentKey \"x\"", "t.hvs:1: expected currentKey \"x\", got null"},
        {"act ActSet64BitMode 2\nexpect use64BitView 0", "t.hvs:2: expected use64BitView 0, got 1"},
    };
    for (auto [script, message] : table) {
        Ran r = run(script);
        EXPECT_FALSE(r.passed) << script;
        EXPECT_EQ(r.err, std::string(message) + "\n") << script;
    }
}

// The message expectation compares with the system's own text, whatever system this is.
TEST(ScriptRunner, MessagesAndLentBuffers) {
    Ran r = run(
        "exp ExpLastErrorMessage\nexpect message 0\nexpect buffers 1024\nexpect address buffer\n"
        "buffers off\nexp ExpLastErrorMessage\nexpect \"\"\nexpect buffers 1024\n"
        "new\nexp ExpLastErrorMessage\nexpect address buffer\n"
        "poke lastError 2\nexp ExpLastErrorMessage\nexpect message 2\n"
        // A lent buffer outlives its event: the module can be handed the text it wrote there.
        "poke lastError 40\nexp ExpLastErrorMessage\nact ActSetCurrentKey result\n"
        "expect currentKey \"Invalid parameters.\"\n");
    EXPECT_TRUE(r.passed) << r.err;
}

// A module that writes into a RootKeyParam record fails the script at that event.
TEST(ScriptRunner, SentinelHitFailsTheScript) {
    std::string error;
    auto fake = hv::Module::load(hv::pathBesideProgram("fake.hzx"), &error);
    ASSERT_TRUE(fake) << error;
    Ran r = run("act ActSetRootKey HKEY_USERS\necho not reached\n", *fake);
    EXPECT_FALSE(r.passed);
    EXPECT_EQ(r.err, "t.hvs:1: sentinel hit: RootKeyParam of parameter 1: byte 2 was written\n");
    Ran misuse =
        run("act ActSetDword null null null null\n", *fake);  // action 4 passes bad constants
    EXPECT_EQ(misuse.err,
              "t.hvs:1: host services misused: GetNextParameter: arguments 0, 0, not -1, 0\n");
}

// The scratch key of these tests, as scripts write it. Under Wine the registry persists, so
// every test deletes it at both ends.
const std::string Scratch = "\"Software\\\\HiveletScenarios\\\\host_tests";
const std::string CleanUp = "reg key delete HKEY_CURRENT_USER " + Scratch + "\"\n";

// A registry line as a script writes it: HKEY_CURRENT_USER and a path below the scratch key.
std::string at(const std::string& below) {
    return "HKEY_CURRENT_USER " + Scratch + below + "\"";
}

// Set-up and checks go through the registry functions, so they meet what the module wrote.
TEST(ScriptRunner, RegistryLinesMeetTheModulesWrites) {
    Ran r = run(CleanUp +
                "reg value set " + at("") + " \"S\" bytes sz \"41 00 42 00\"\n"
                "reg expect value " + at("") + " \"S\" bytes sz \"41 00 42 00\"\n"
                "exp ExpGetString \"HKEY_CURRENT_USER\" " + Scratch + "\" \"S\"\n"
                "expect \"AB\"\n"
                "act ActSetDword " + at("\\\\Deep") + " \"D\" -2\n"
                "reg expect value " + at("\\\\Deep") + " \"D\" bytes dword \"fe ff ff ff\"\n"
                "reg key create " + at("\\\\Deep") + "\n"
                "reg value delete " + at("") + " \"S\"\n"
                "reg expect value " + at("") + " \"S\" missing\n"
                "reg value delete " + at("") + " \"S\"\n"
                "reg value delete " + at("\\\\None") + " \"S\"\n" +
                CleanUp +
                "reg expect key missing " + at("") + "\n" +
                CleanUp);
    EXPECT_TRUE(r.passed) << r.err;
    EXPECT_TRUE(contains(r.out, "\"S\" bytes sz \"41 00 42 00\"   written: REG_SZ, 4 bytes"))
        << r.out;
    EXPECT_TRUE(contains(r.out, "reg key create " + at("\\\\Deep") + "   was there")) << r.out;
    EXPECT_TRUE(contains(r.out, "reg value delete " + at("") + " \"S\"   deleted")) << r.out;
    EXPECT_TRUE(contains(r.out, "reg value delete " + at("\\\\None") + " \"S\"   was not there"))
        << r.out;
    EXPECT_TRUE(contains(r.out, CleanUp.substr(0, CleanUp.size() - 1) + "   was not there"))
        << r.out;
    EXPECT_TRUE(contains(r.out, "passed (2 events, 5 expectations)")) << r.out;
}

TEST(ScriptRunner, RegistryMismatchesNameBothSides) {
    std::string key = "HKEY_CURRENT_USER " + Scratch + "\"";
    const std::pair<std::string, std::string> table[] = {
        {"reg expect key exists " + at("\\\\None"),
         "expected the key " + at("\\\\None") + " to exist, it is missing"},
        {"reg expect key missing " + at(""), "expected the key " + key + " to be missing, it exists"},
        {"reg expect key missing " + at("") + " view32",
         "expected the key " + key + " view32 to be missing, it exists"},
        {"reg expect value " + at("") + " \"D\" sz \"x\"",
         "expected the value \"D\" of " + key +
             " to be REG_SZ [78 00 00 00], found REG_DWORD [01 00 00 00]"},
        {"reg expect value " + at("") + " \"D\" bytes dword \"01 00\"",
         "expected the value \"D\" of " + key +
             " to be REG_DWORD [01 00], found REG_DWORD [01 00 00 00]"},
        {"reg expect value " + at("") + " \"D\" missing",
         "expected the value \"D\" of " + key + " to be none, found REG_DWORD [01 00 00 00]"},
        {"reg expect value " + at("") + " \"E\" bytes link \"\"",
         "expected the value \"E\" of " + key + " to be REG_LINK [], found no value"},
        {"reg expect value " + at("\\\\None") + " \"D\" qword 1",
         "expected the value \"D\" of " + at("\\\\None") +
             " to be REG_QWORD [01 00 00 00 00 00 00 00], found no key"},
    };
    for (const auto& [line, message] : table) {
        Ran r = run(CleanUp + "reg value set " + at("") + " \"D\" dword 1\n" + line + "\n" +
                    "echo not reached\n");
        EXPECT_FALSE(r.passed) << line;
        EXPECT_EQ(r.err, "t.hvs:3: " + message + "\n") << line;
        EXPECT_FALSE(contains(r.out, "not reached")) << line;
    }
    EXPECT_TRUE(run(CleanUp).passed);
}

// Without the layer every layer line shows why it was skipped, and nothing of it runs: the
// wrong expectations in it do not fail the script.
TEST(ScriptRunner, LayerLinesAreSkippedWithANote) {
    Ran r = runWithoutLayer(
        "layer deny HKEY_CURRENT_USER \"Software\" 0x1\n"
        "layer fail RegOpenKeyExW 1 5\n"
        "layer hide RegDeleteKeyExW\n"
        "layer version fail\n"
        "layer expect handles 3\n"
        "layer expect calls RegOpenKeyExW 9\n"
        "layer act ActSetRootKey root:9\n"
        "layer {\n"
        "  expect error 7\n"
        "  reg expect key missing HKEY_CURRENT_USER \"Software\"\n"
        "}\n"
        "act ActSetRootKey HKEY_USERS\n"
        "expect error 0\n");
    EXPECT_TRUE(r.passed) << r.err;
    const char* const lines[] = {
        "layer deny HKEY_CURRENT_USER \"Software\" 0x1   skipped under Windows: needs the portable "
        "layer's access control",
        "layer fail RegOpenKeyExW 1 5   skipped under Windows: needs the portable layer's fault "
        "injection",
        "layer hide RegDeleteKeyExW   skipped under Windows: needs the portable layer's hidden "
        "exports",
        "layer version fail   skipped under Windows: needs the portable layer's GetVersionExW "
        "settings",
        "layer expect handles 3   skipped under Windows: needs the portable layer's handle count",
        "layer expect calls RegOpenKeyExW 9   skipped under Windows: needs the portable layer's "
        "call journal",
        "   7  layer act ActSetRootKey root:9   skipped under Windows: holds only with the portable "
        "layer",
        "   9    expect error 7   skipped under Windows: holds only with the portable layer",
        "reg expect key missing HKEY_CURRENT_USER \"Software\"   skipped under Windows: holds only "
        "with the portable layer",
        "passed (1 events, 1 expectations, 9 lines skipped)",
    };
    for (const char* line : lines) EXPECT_TRUE(contains(r.out, line)) << line << "\n" << r.out;
}

// process32 lines hold where the registry's default view is a 32-bit process's: with the
// portable layer and in 32-bit Windows; a 64-bit Windows process skips them with the reason.
TEST(ScriptRunner, Process32LinesRunOnlyWhereTheDefaultViewIs32Bit) {
    Ran r = run(
        "reg key delete HKEY_LOCAL_MACHINE \"SOFTWARE\\\\HiveletRunnerTest\" view32\n"
        "reg key create HKEY_LOCAL_MACHINE \"SOFTWARE\\\\HiveletRunnerTest\" view32\n"
        "process32 {\n"
        "  cnd CndKeyExists HKEY_LOCAL_MACHINE \"SOFTWARE\\\\HiveletRunnerTest\"\n"
        "  expect true\n"
        "}\n"
        "reg key delete HKEY_LOCAL_MACHINE \"SOFTWARE\\\\HiveletRunnerTest\" view32\n");
    EXPECT_TRUE(r.passed) << r.err;
#ifdef _WIN32
    const bool skipped = sizeof(void*) == 8;
#else
    const bool skipped = false;
#endif
    EXPECT_EQ(contains(r.out, "expect true   skipped in a 64-bit process: its default registry "
                              "view is the 64-bit one"),
              skipped)
        << r.out;
    EXPECT_EQ(contains(r.out, "2 lines skipped"), skipped) << r.out;
}

// Against the layer: rights denied, calls failed, the journal read; and whatever a script
// armed is undone when it ends, passed or failed.
TEST(ScriptRunner, LayerLinesDriveThePortableLayer) {
#ifdef _WIN32
    GTEST_SKIP() << "needs the portable layer's test control";
#endif
    Ran armed = run(CleanUp +
                    "reg key create " + at("\\\\Locked") + "\n"
                    "layer deny " + at("\\\\Locked") + " 0x1\n"
                    "cnd CndKeyExists " + at("\\\\Locked") + "\n"
                    "expect false\n"
                    "layer expect calls RegOpenKeyExW mask 0x20019\n"
                    "layer expect calls RegCloseKey 0\n"
                    "layer fail RegOpenKeyExW 1 1021\n"
                    "exp ExpGetDword \"HKEY_CURRENT_USER\" " + Scratch + "\" \"x\"\n"
                    "expect error 1021\n"
                    "layer fail RegQueryValueExW 1 5\n"
                    "layer hide RegDeleteKeyExW\n"
                    "layer version platform 1\n"
                    "layer expect handles 0\n"
                    "layer expect handles 1\n");
    EXPECT_FALSE(armed.passed);
    EXPECT_EQ(armed.err, "t.hvs:15: expected 1 registry handles open, got 0\n");
    Ran undone = run("cnd CndKeyExists " + at("\\\\Locked") + "\n"
                     "expect true\n"
                     "exp ExpGetDword \"HKEY_CURRENT_USER\" " + Scratch + "\" \"x\"\n"
                     "expect error 2\n"
                     "act ActSet64BitMode 1\n"
                     "act ActDeleteKey " + at("\\\\Locked") + "\n"
                     "expect error 0\n"
                     "layer expect calls RegDeleteKeyExW 1\n" +
                     CleanUp);
    EXPECT_TRUE(undone.passed) << undone.err;
}

TEST(ScriptRunner, LayerMismatchesNameBothSides) {
#ifdef _WIN32
    GTEST_SKIP() << "needs the portable layer's test control";
#endif
    std::string probe = "cnd CndKeyExists HKEY_CURRENT_USER \"Software\"\n";
    const std::pair<std::string, std::string> table[] = {
        {"layer expect calls RegOpenKeyExW 1", "t.hvs:1: expect with no event before it"},
        {probe + "layer expect calls RegOpenKeyExW 2",
         "t.hvs:2: expected 2 calls of RegOpenKeyExW in the last event, got 1"},
        {probe + "layer expect calls RegOpenKeyExW mask 0x20119",
         "t.hvs:2: expected every RegOpenKeyExW of the last event to ask for 0x20119, call 1 "
         "asked for 0x20019"},
        {probe + "layer expect calls RegCreateKeyExW mask 0xF003F",
         "t.hvs:2: expected calls of RegCreateKeyExW, the last event made none"},
        {probe + "new\nlayer expect calls RegOpenKeyExW 1", "t.hvs:3: expect with no event before it"},
    };
    for (const auto& [script, message] : table) {
        Ran r = run(script);
        EXPECT_FALSE(r.passed) << script;
        EXPECT_EQ(r.err, message + "\n") << script;
    }
}

// Writes a script file for the command-line tests.
std::string scriptFile(const std::string& name, const std::string& text) {
    std::string path = testing::TempDir() + name;
    std::ofstream(path, std::ios::binary) << text;
    return path;
}

int command(std::vector<std::string> args, std::string* out = nullptr, std::string* err = nullptr) {
    std::ostringstream o, e;
    int status = hv::script::commandLine(args, o, e);
    if (out) *out = o.str();
    if (err) *err = e.str();
    return status;
}

TEST(CommandLine, ExitStatuses) {
    std::string module = hv::pathBesideProgram("Hivelet.hzx");
    std::string good = scriptFile("good.hvs", "act ActSetRootKey HKEY_USERS\nexpect error 0\n");
    std::string failing = scriptFile("failing.hvs", "act ActSetRootKey root:5\nexpect error 0\n");
    std::string malformed = scriptFile("malformed.hvs", "# x\nact ActSetRootKey HKEY_USERS\"\n");
    std::string out, err;
    EXPECT_EQ(command({"run", "--module", module, good}, &out), 0);
    EXPECT_TRUE(contains(out, "1 script(s), 0 failed")) << out;
    EXPECT_EQ(command({"run", "--module", module, failing, good}, &out, &err), 1);
    EXPECT_TRUE(contains(out, "2 script(s), 1 failed")) << out;
    EXPECT_EQ(err, failing + ":2: expected lastError 0, got 40\n");
    EXPECT_EQ(command({"run", "--module", module, malformed}, &out, &err), 1);
    EXPECT_EQ(err, malformed + ":2: stray quote in 'HKEY_USERS\"'\n");
    EXPECT_EQ(command({"run", "--module", module, testing::TempDir() + "absent.hvs"}, &out, &err),
              1);
    EXPECT_TRUE(contains(err, "absent.hvs: cannot read the script")) << err;
}

TEST(CommandLine, UsageErrors) {
    std::string out, err;
    EXPECT_EQ(command({"--help"}, &out), 0);
    EXPECT_TRUE(contains(out, "usage: hivelet-host run [--module PATH] SCRIPT...")) << out;
    EXPECT_EQ(command({}), 2);
    EXPECT_EQ(command({"walk"}), 2);
    EXPECT_EQ(command({"run"}, &out, &err), 2);
    EXPECT_TRUE(contains(err, "run needs at least one script")) << err;
    EXPECT_EQ(command({"run", "--verbose", "x.hvs"}), 2);
    EXPECT_EQ(command({"run", "--module"}), 2);
    EXPECT_EQ(command({"run", "--module", testing::TempDir() + "none.hzx", "x.hvs"}, &out, &err),
              2);
    EXPECT_TRUE(contains(err, "cannot load the module")) << err;
}

// dump-state prints a state file readably and refuses a malformed one with its reason.
TEST(CommandLine, DumpState) {
    const std::string header = std::string("\x01\0\0\0\x02\0\0\0\x05\0\0\0", 12);
    const struct {
        std::string bytes;
        int status;
        std::string shown;  // standard output, or the reason after "FILE: "
    } rows[] = {
        {header + std::string("\x06\0A\0B\0\0\0", 8), 0,
         "version 1\nroot key index 2 (HKEY_CURRENT_USER)\nlast error 5\nkey \"AB\"\n"},
        {header + std::string("\0\0", 2), 0,
         "version 1\nroot key index 2 (HKEY_CURRENT_USER)\nlast error 5\nno current key\n"},
        {std::string("\x01\0\0\0\x09\0\0\0\0\0\0\0\0\0", 14), 0,
         "version 1\nroot key index 9 (invalid)\nlast error 0\nno current key\n"},
        {header.substr(0, 11), 1, "too short for the 12-byte header (11 bytes)"},
        {"\x02" + header.substr(1) + std::string("\0\0", 2), 1, "format version 2, not 1"},
        {header, 1, "the key byte length is missing"},
        {header + std::string("\x03\0A\0\0", 5), 1, "odd key byte length 3"},
        {header + std::string("\x04\0A\0B\0", 6), 1, "the key text lacks its terminating zero"},
        {header + std::string("\x06\0A\0", 4), 1, "the key text is cut short (2 of 6 bytes)"},
        {header + std::string("\0\0\xde", 3), 1, "bytes after the record (1)"},
    };
    for (const auto& row : rows) {
        std::string path = scriptFile("state.bin", row.bytes);
        std::string out, err;
        EXPECT_EQ(command({"dump-state", path}, &out, &err), row.status) << row.shown;
        EXPECT_EQ(row.status ? err : out, row.status ? path + ": " + row.shown + "\n" : row.shown);
    }
    std::string err;
    EXPECT_EQ(command({"dump-state", testing::TempDir() + "absent.bin"}, nullptr, &err), 1);
    EXPECT_TRUE(contains(err, "absent.bin: cannot read the file")) << err;
    EXPECT_EQ(command({"dump-state"}), 2);
}

}  // namespace
