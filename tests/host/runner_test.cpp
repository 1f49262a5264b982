// The script runner and the hivelet-host command line, against the real module: transcripts,
// the first failure reported as file:line and stopping its script, and the exit statuses.
#include <gtest/gtest.h>
#include <hivelet/script.h>

#include <fstream>
#include <sstream>
#include <stdexcept>

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
    hv::script::Runner runner(module, out, err);
    bool passed = runner.run(parsed.script);
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
    std::string module = "--module=" + hv::pathBesideProgram("Hivelet.hzx");
    std::string good = scriptFile("good.hvs", "act ActSetRootKey HKEY_USERS\nexpect error 0\n");
    std::string failing = scriptFile("failing.hvs", "act ActSetRootKey root:5\nexpect error 0\n");
    std::string malformed = scriptFile("malformed.hvs", "# x\nact ActSetRootKey HKEY_USERS\"\n");
    std::string out, err;
    EXPECT_EQ(command({"run", module, good}, &out), 0);
    EXPECT_TRUE(contains(out, "1 script(s), 0 failed")) << out;
    EXPECT_EQ(command({"run", module, failing, good}, &out, &err), 1);
    EXPECT_TRUE(contains(out, "2 script(s), 1 failed")) << out;
    EXPECT_EQ(err, failing + ":2: expected lastError 0, got 40\n");
    EXPECT_EQ(command({"run", module, malformed}, &out, &err), 1);
    EXPECT_EQ(err, malformed + ":2: stray quote in 'HKEY_USERS\"'\n");
    EXPECT_EQ(command({"check", good, malformed}, &out, &err), 1);
    EXPECT_EQ(command({"run", module, testing::TempDir() + "absent.hvs"}, &out, &err), 1);
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

}  // namespace
