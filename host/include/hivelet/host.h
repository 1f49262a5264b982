// The host simulator: plays the authoring host for the module. It loads the module by path,
// resolves its exports by name, lays out the host's structures with the host's byte offsets,
// offers the host services and runs events. Tests, the scenario runner and hivelet-host use it.
#pragma once

#include <windows.h>

#include <hivelet/layout.h>

#include <cstdint>
#include <memory>
#include <string>
#include <utility>
#include <vector>

namespace hv {

// A value in a pointer-sized slot: parameter values, the expression host value, results.
using Slot = intptr_t;

// Byte patterns the host fills its memory with, so that tests can tell a byte the module wrote
// from one it left alone.
namespace Fill {
constexpr uint8_t Record = 0xCC;           // the instance record before CreateRunObject
constexpr uint8_t RunHeader = 0xEE;        // the run header around its services
constexpr uint8_t Infos = 0xA5;            // the RunObjectInfos block before GetRunObjectInfos
constexpr uint8_t Buffer = 0xBE;           // a lent string buffer
constexpr uint8_t HostBytes = 0xAB;        // host-owned bytes of a RootKeyParam record
constexpr uint8_t EditorStructure = 0xED;  // the editor structure around its fields
constexpr uint8_t Guard = 0xFD;            // sentinels around records and buffers
constexpr size_t GuardSize = 16;
}  // namespace Fill

// One parameter of an event, as the editor stored it.
struct Param {
    enum class Kind { Null, Text, Integer, RootKey, Address };
    Kind kind = Kind::Null;
    std::u16string text;     // Text
    int32_t integer = 0;     // Integer
    uint32_t rootIndex = 0;  // RootKey: the u32 at byte 6 of a RootKeyParam record
    Slot address = 0;        // Address: passed as is (a text the module returned earlier)

    static Param null() { return Param{}; }
    static Param str(std::u16string text) { return {Kind::Text, std::move(text)}; }
    static Param integerValue(int32_t value) { return {Kind::Integer, {}, value}; }
    static Param rootKey(uint32_t index) { return {Kind::RootKey, {}, 0, index}; }
    static Param rawAddress(const void* address) {
        return {Kind::Address, {}, 0, 0, reinterpret_cast<Slot>(address)};
    }
};

// What an event gave back, and what the host saw while it ran.
struct Outcome {
    Slot raw = 0;         // the routine's result slot, unconverted
    bool isText = false;  // StringResultFlag was set by the routine
    std::u16string text;  // the text at `raw` when isText
    const void* textAddress = nullptr;
    unsigned parameterFetches = 0;       // GetNextParameter calls
    unsigned expressionFetches = 0;      // GetFirstExpressionParameter + GetNextExpressionParameter
    std::vector<size_t> bufferRequests;  // sizes asked of GetStringBuffer, in bytes
    bool sentinelsIntact = true;         // nothing written past a lent buffer or the record
    std::string damage;                  // which sentinel was hit, when one was
    // Misuse of the host's services seen during the event (wrong constant arguments, more
    // fetches than parameters, a foreign record address, an unterminated text result ...).
    std::vector<std::string> violations;
    // Where a text result lives.
    enum class TextSource { None, LentBuffer, CurrentKey, Elsewhere };
    TextSource textSource = TextSource::None;

    // Nothing was damaged and the services were used as the host expects.
    bool clean() const { return sentinelsIntact && violations.empty(); }

    // Result as each routine kind returns it.
    int32_t asCondition() const { return static_cast<int32_t>(raw); }
    int16_t asAction() const { return static_cast<int16_t>(raw); }
    int32_t asInteger() const { return static_cast<int32_t>(raw); }
};

enum class EventKind { Condition, Action, Expression };

// The module, loaded with LoadLibraryW and released with FreeLibrary.
class Module {
public:
    // Loads the module; on failure returns null and describes why in `error`.
    static std::unique_ptr<Module> load(const std::string& path, std::string* error);
    ~Module();
    Module(const Module&) = delete;
    Module& operator=(const Module&) = delete;

    HMODULE handle() const { return handle_; }
    // The export's address, or null when the module lacks it.
    FARPROC address(const char* name) const;
    // The export's address as a function pointer type; throws std::runtime_error naming the
    // export when it is missing.
    template <typename F>
    F entry(const char* name) const {
        return reinterpret_cast<F>(reinterpret_cast<void*>(require(name)));
    }

    // The routine tables, read from a RunObjectInfos block the module filled.
    struct Tables {
        std::vector<Slot> conditions, actions, expressions;  // each without its null end
        bool conditionsEnd, actionsEnd, expressionsEnd;      // a null entry follows the last one
        // The whole block as the module left it (filled with Fill::Infos before), followed by
        // Fill::GuardSize bytes that the module must not write.
        std::vector<uint8_t> block;
        int16_t infosResult;  // what GetRunObjectInfos returned
    };
    const Tables& tables() const { return tables_; }

private:
    explicit Module(HMODULE handle) : handle_(handle) {}
    FARPROC require(const char* name) const;
    HMODULE handle_;
    Tables tables_{};
    bool readTables(std::string* error);
};

// Default path of the module: Hivelet.hzx beside the running program, unless the environment
// variable HIVELET_MODULE names another.
std::string defaultModulePath();
// A file in the running program's folder.
std::string pathBesideProgram(const std::string& fileName);

// The code of a routine by its name (CndKeyExists, ActSetRootKey, ExpGetCurrentKey ...), or -1.
int eventCode(EventKind kind, const std::string& routineName);
const std::vector<std::string>& routineNames(EventKind kind);
// How many parameters the editor stores for the routine with this code, or -1.
int parameterCount(EventKind kind, int code);
// "condition", "action" or "expression".
const char* kindName(EventKind kind);

// The system's message for an error code, as FormatMessageW gives it to a module (from the
// system, inserts ignored, language 0, at most 512 characters); empty when there is none.
std::u16string systemMessage(uint32_t code);

class Guarded;

// One object instance: a record of GetRunObjectDataSize bytes with the host's header, created
// with CreateRunObject and destroyed with DestroyRunObject.
class Instance {
public:
    explicit Instance(Module& module);
    ~Instance();
    Instance(const Instance&) = delete;
    Instance& operator=(const Instance&) = delete;

    // Runs one event. The first two parameter values are the routine's arguments; all of them
    // are queued for GetNextParameter (conditions, actions) or the expression services.
    // Parameter copies and lent buffers live until the end of the next event, so a text result
    // can be handed back (Param::rawAddress). Throws std::out_of_range when the module's table
    // has no routine with this code.
    Outcome run(EventKind kind, int code, const std::vector<Param>& params);
    Outcome condition(int code, const std::vector<Param>& params = {}) {
        return run(EventKind::Condition, code, params);
    }
    Outcome action(int code, const std::vector<Param>& params = {}) {
        return run(EventKind::Action, code, params);
    }
    Outcome expression(int code, const std::vector<Param>& params = {}) {
        return run(EventKind::Expression, code, params);
    }

    // The record as the module sees it.
    uint8_t* record() { return record_; }
    size_t recordSize() const { return recordSize_; }
    uint32_t rootKeyIndex() const { return readAt<uint32_t>(record_, BuildLayout.rootKeyIndex); }
    const char16_t* currentKey() const {
        return readAt<const char16_t*>(record_, BuildLayout.currentKey);
    }
    uint32_t lastError() const { return readAt<uint32_t>(record_, BuildLayout.lastError); }
    uint32_t use64BitView() const { return readAt<uint32_t>(record_, BuildLayout.use64BitView); }
    uint16_t headerFlags() const { return readAt<uint16_t>(record_, BuildLayout.headerFlags); }
    void setRootKeyIndex(uint32_t value) { writeAt(record_, BuildLayout.rootKeyIndex, value); }
    void setLastError(uint32_t value) { writeAt(record_, BuildLayout.lastError, value); }
    void setHeaderFlags(uint16_t value) { writeAt(record_, BuildLayout.headerFlags, value); }

    // The saved state through SaveRunObject and LoadRunObject, on a file handle the host opens
    // (CreateFileW) and closes: the entry point's result, or -1 when the file cannot be opened
    // (`error` then says why).
    int saveState(const std::string& path, std::string* error = nullptr);
    int loadState(const std::string& path, std::string* error = nullptr);

    // One debugger line, as GetDebugItem leaves the host's 256-character line buffer: the
    // buffer starts filled with 0xBEBE characters and has sentinels after it.
    struct DebugLine {
        std::vector<char16_t> buffer;  // all 256 characters as the module left them
        bool written = false;          // some character changed
        bool sentinelsIntact = true;
        std::u16string text() const;  // up to the first zero, or all 256 without one
    };
    DebugLine debugLine(int item);
    static constexpr size_t DebugLineChars = 256;

    // Host behaviour for the next events: lend no string buffer (GetStringBuffer gives null).
    void lendNoBuffer(bool on) { lendNoBuffer_ = on; }

private:
    friend struct Services;
    Module& module_;
    std::unique_ptr<Guarded> block_;  // the record with sentinels around it
    uint8_t* record_ = nullptr;
    size_t recordSize_ = 0;
    std::vector<uint8_t> runHeader_;
    std::vector<uint8_t> runHeaderSealed_;  // the run header as the host laid it out
    bool lendNoBuffer_ = false;
    struct EventState;
    std::unique_ptr<EventState> event_;
    std::unique_ptr<EventState> previous_;  // its lent buffers live until the next event ends
    unsigned events_ = 0;
    bool created_ = false;

    void layOutHeader();
    void beginEvent(EventKind kind, const std::vector<Param>& params, Outcome& outcome);
    void endEvent();
    Slot prepareParameter(const Param& param);
    Slot routineAt(EventKind kind, int code) const;
    Slot call(EventKind kind, Slot routine);
    void readResult(EventKind kind, Outcome& outcome);
    size_t locateText(const uint8_t* text, Outcome& outcome) const;
    void checkSentinels(Outcome& outcome);
    std::string damageToHeader() const;
};

// A 16-byte RootKeyParam record as the editor stores it: u16 16 at 0, host bytes at 2 to 5,
// the u32 root index at 6, host bytes after it.
std::vector<uint8_t> rootKeyRecord(uint32_t index);

// The editor structure handed to edit-time entry points, laid out with the host's offsets.
class Editor {
public:
    Editor();
    // Version word that GetHostVersion answers; `present` false leaves the service pointer null.
    void setHostVersion(uint32_t version, bool present = true);
    unsigned hostVersionCalls() const { return hostVersionCalls_; }
    // Arguments of each InsertProperties call.
    struct Insert {
        Slot hostValue;
        int a, c, d;
        const void* properties;
    };
    const std::vector<Insert>& inserts() const { return inserts_; }
    // The structure's address; makes this the editor that GetHostVersion answers for.
    void* structure();
    void setWindow(HWND window);
    ~Editor();
    Editor(const Editor&) = delete;
    Editor& operator=(const Editor&) = delete;

private:
    friend struct EditorServices;
    std::vector<uint8_t> bytes_;
    uint32_t version_ = 0x02000100u | 242u;
    unsigned hostVersionCalls_ = 0;
    std::vector<Insert> inserts_;
};

// A saved-state record read back from bytes, as the module writes it: the 12-byte header
// (version, root key index, last error), the key's byte length, the key text with its
// terminator. `hasKey` false: the record holds no current key.
struct SavedState {
    uint32_t version = 0;
    uint32_t rootKeyIndex = 0;
    uint32_t lastError = 0;
    bool hasKey = false;
    std::u16string key;
};
// Reads a file that holds exactly one record. A malformed one (too short, a version other than
// 1, an odd key length, a key text without its final zero, bytes after the record) gives false
// and the reason in `error`. The key is the text up to its first zero, as the module reads it.
bool readSavedState(const std::vector<uint8_t>& bytes, SavedState& state, std::string* error);

// UTF-8 <-> UTF-16 at the edges (scripts, transcripts). Malformed UTF-8 becomes U+FFFD.
std::u16string fromUtf8(const std::string& text);
std::string toUtf8(const std::u16string& text);

}  // namespace hv
