// Event scripts: lines that run the module's conditions, actions and expressions on an
// instance and check what comes back. The language is described in docs/scripts.md.
#pragma once

#include <hivelet/host.h>

#include <iosfwd>
#include <memory>
#include <string>
#include <vector>

namespace hv::script {

// A value written on a script line.
struct Value {
    enum class Kind { Null, Text, Integer, Boolean, RootKey, LastResult, Word };
    Kind kind = Kind::Null;
    std::u16string text;   // Text
    int64_t integer = 0;   // Integer as written (within 32 bits); RootKey: the root index
    bool boolean = false;  // Boolean
    std::string word;      // Word: a name the command gives a meaning to; RootKey: as written
};

// What a registry line (`reg ...`, `layer deny`) works on: a key, a value and its data.
struct RegistryLine {
    uint32_t root = 0;          // predefined root: 0 HKEY_CLASSES_ROOT ... 4 HKEY_USERS
    std::u16string path;        // key path below the root
    std::u16string name;        // value name
    uint32_t view = 0;          // KEY_WOW64_64KEY, KEY_WOW64_32KEY, or 0 for the default view
    bool exists = true;         // reg expect: the key or value must exist (false: be missing)
    bool hasData = false;       // reg value set / reg expect value with a type and data
    uint32_t type = 0;          // REG_SZ, REG_DWORD ...
    std::vector<uint8_t> data;  // the value's bytes exactly as stored
};

// One line of a script, parsed.
struct Step {
    int line = 0;
    std::string source;   // the line without its comment, trimmed
    std::string command;  // the line's first word
    // Events (cnd, act, exp): the routine and its parameters.
    EventKind kind = EventKind::Condition;
    int code = -1;
    std::string routine;
    // What a command checks or changes (expect, poke): "result" when an expectation names none.
    std::string subject;
    std::vector<Value> values;  // event parameters, or the command's operands
    std::string text;           // echo
    RegistryLine registry;      // reg, and layer deny
    // Runs only against the portable Win32 layer (a `layer` line, or a line in a layer block);
    // a Windows build skips it with a note.
    bool layerOnly = false;
    // Holds only where the registry's default view is a 32-bit process's (a `process32` line, or
    // a line in a process32 block): with the portable layer, which plays that process, and in
    // the 32-bit Windows build; the 64-bit Windows build skips it with a note.
    bool process32Only = false;
};

struct Script {
    std::string file;
    std::vector<Step> steps;
};

struct ParseResult {
    Script script;
    std::string error;  // "file:line: message" for the first malformed line, or ""
    bool ok() const { return error.empty(); }
};

// Parses a whole script; `file` names it in messages.
ParseResult parse(const std::string& file, const std::string& text);

// A text as a script would write it: quoted, with escapes for quotes, backslashes and controls.
std::string quote(const std::u16string& text);

// Runs scripts against one loaded module and writes a transcript. Each script gets a fresh
// instance; a failure stops its script.
class Runner {
public:
    Runner(Module& module, std::ostream& out, std::ostream& err);
    ~Runner();
    // Runs a parsed script; true when every line passed.
    bool run(const Script& script);
    // Reads, parses and runs a script file; true when every line passed.
    bool runFile(const std::string& path);
    // Whether the portable layer's test control is there to run layer lines: on Linux builds
    // by default. Without it every layer line is skipped with a note, as on Windows builds.
    void setLayer(bool present);

private:
    Module& module_;
    std::ostream& out_;
    std::ostream& err_;
    bool layer_;
};

// The hivelet-host command line (without the program name); returns the exit status:
// 0 when every script passed, 1 when one failed, 2 for a usage error or a module that cannot
// be loaded.
int commandLine(const std::vector<std::string>& args, std::ostream& out, std::ostream& err);

}  // namespace hv::script
