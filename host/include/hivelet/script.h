// Event scripts: lines that run the module's conditions, actions and expressions on an
// instance and check what comes back. The language is described in docs/scripts.md.
#pragma once

#include <hivelet/dialog_user.h>
#include <hivelet/host.h>

#include <iosfwd>
#include <optional>
#include <string>
#include <variant>
#include <vector>

namespace hv::script {

// An event parameter as written: a value for the routine, or `result`.
struct Argument {
    Param value;
    bool lastResult = false;  // `result`: the last text result itself, found when the line runs
};

// cnd, act, exp: runs a routine of the module with its parameters.
struct Event {
    EventKind kind = EventKind::Condition;
    int code = -1;
    std::vector<Argument> arguments;
};

// show cnd|act|exp ...: the event as the event sheet shows it; nothing runs.
struct Show {
    Event event;
};

struct Echo {
    std::string text;
};

// new: a fresh instance.
struct New {};

// buffers on|off.
struct Buffers {
    bool lend = true;
};

// poke FIELD N: writes a field of the record at its offset in this build.
struct Poke {
    size_t offset = 0;
    uint32_t value = 0;
};

// expect VALUE: the last event's result, as written (integers within 32 bits).
struct ExpectResult {
    std::variant<int64_t, bool, std::u16string> value;
};

// expect error|message|fetches|rootKeyIndex|use64BitView N.
struct ExpectNumber {
    enum class Of { LastError, Message, Fetches, RootKeyIndex, Use64BitView };
    Of of = Of::LastError;
    int64_t value = 0;
};

// expect buffers N...: the sizes asked of GetStringBuffer, in order.
struct ExpectBuffers {
    std::vector<size_t> sizes;
};

// expect address currentKey|buffer|elsewhere.
struct ExpectAddress {
    Outcome::TextSource place = Outcome::TextSource::Elsewhere;
};

// expect currentKey "text"|null, expect sentence "text": the record's current key, or what the
// last show line printed.
struct ExpectText {
    bool sentence = false;
    std::string wanted;  // quoted as scripts write texts, or null
};

// expect debug ITEM "text"|untouched.
struct ExpectDebug {
    int32_t item = 0;
    std::optional<std::u16string> text;  // none: the line must stay untouched
};

// A key as a registry line names it.
struct RegistryKey {
    uint32_t root = 0;    // 0 HKEY_CLASSES_ROOT ... 4 HKEY_USERS
    std::u16string path;  // below the root
    uint32_t view = 0;    // KEY_WOW64_64KEY, KEY_WOW64_32KEY, or 0 for the default view
};

// reg ...: sets up or checks the registry through the Win32 registry functions.
struct Registry {
    enum class Form { CreateKey, DeleteKey, SetValue, DeleteValue, ExpectKey, ExpectValue };
    Form form = Form::CreateKey;
    RegistryKey key;
    std::u16string name;        // the value's name
    bool exists = true;         // expect: the key or value must be there (false: be missing)
    uint32_t type = 0;          // set, and expect value unless missing: REG_SZ, REG_DWORD ...
    std::vector<uint8_t> data;  // the value's bytes exactly as stored
};

// The lines of the portable layer's own test control; `Needs` says why a build without it
// skips them.
struct LayerControl {};

struct Deny : LayerControl {
    static constexpr const char* Needs = "access control";
    RegistryKey key;
    uint32_t rights = 0;
};

struct Fail : LayerControl {
    static constexpr const char* Needs = "fault injection";
    std::string function;
    unsigned nth = 1;  // 1 for the next call
    long code = 0;
};

// layer hide|unhide NAME.
struct Hide : LayerControl {
    static constexpr const char* Needs = "hidden exports";
    std::string name;
    bool hide = true;
};

// layer version fail|normal|platform N: normal is platform 2 (NT), as at start; fail leaves the
// platform as it is.
struct Version : LayerControl {
    static constexpr const char* Needs = "GetVersionExW settings";
    bool fail = false;
    uint32_t platform = 2;
};

// layer expect handles N.
struct Handles : LayerControl {
    static constexpr const char* Needs = "handle count";
    size_t count = 0;
};

// layer expect calls FUNCTION N | FUNCTION mask M.
struct Calls : LayerControl {
    static constexpr const char* Needs = "call journal";
    std::string function;
    bool mask = false;
    uint64_t number = 0;  // the count, or the mask every call must carry
};

// save "FILE" / load "FILE".
struct StateFile {
    bool save = true;
    std::string path;
};

// file "FILE" "hex" writes the bytes; expect file "FILE" "hex" checks them.
struct FileBytes {
    bool check = false;
    std::string path;
    std::vector<uint8_t> bytes;
};

// debug: both debugger lines.
struct Debug {};

// param fill BYTE / param record ROOT.
struct ParamRecord {
    bool fill = false;
    uint32_t value = 0;
};

struct ParamInit {};

struct ParamEdit {
    std::vector<UserStep> steps;
};

struct ParamString {
    Slot capacity = 0;
};

// param expect ...: what the last param edit or param string left.
struct ParamExpect {
    enum class What {
        Index,
        Bytes,
        Result,
        Selection,
        Items,
        Caption,
        Open,
        RanOut,
        Text,
        Untouched
    };
    What what = What::Index;
    std::string wanted;  // as the transcript shows it: "4", "none", "[10 00 ab]", "yes no" ...
};

using Command = std::variant<Event, Show, Echo, New, Buffers, Poke, ExpectResult, ExpectNumber,
                             ExpectBuffers, ExpectAddress, ExpectText, ExpectDebug, Registry, Deny,
                             Fail, Hide, Version, Handles, Calls, StateFile, FileBytes, Debug,
                             ParamRecord, ParamInit, ParamEdit, ParamString, ParamExpect>;

// One line of a script, parsed.
struct Step {
    int line = 0;
    std::string source;  // the line without its comment, trimmed
    Command command;
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

// Runs a parsed script on a fresh instance of the module, writing its transcript to `out` and
// its first failure, which stops it, to `err`; true when every line passed. Layer lines run
// where the portable layer's test control is there (Linux builds) unless `layer` is false;
// without it each is skipped with a note, as on Windows builds.
bool runScript(Module& module, const Script& script, std::ostream& out, std::ostream& err,
               bool layer = true);

// The hivelet-host command line (without the program name); returns the exit status:
// 0 when every script passed, 1 when one failed, 2 for a usage error or a module that cannot
// be loaded.
int commandLine(const std::vector<std::string>& args, std::ostream& out, std::ostream& err);

}  // namespace hv::script
