// A bare host for timing the module: it loads Hivelet.hzx as the host does, lays out one
// instance record and its run header, and answers the run header's services from values
// prepared before the timed loop. Unlike the host simulator it checks nothing around a call,
// so what a benchmark times is the routine and the registry calls the routine makes.
#pragma once

#include <windows.h>

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

namespace bench {

// A value in a pointer-sized slot: parameter values, the expression host value, results.
using Slot = intptr_t;

typedef short(WINAPI* ActionRoutine)(void* record, Slot first, Slot second);
typedef Slot(WINAPI* ExpressionRoutine)(void* record, Slot hostValue);

// Event codes of the routines the benchmarks call.
namespace action {
constexpr int SetRootKey = 0, SetCurrentKey = 1, SetCurrentDword = 2, SetCurrentString = 3,
              SetDword = 4, SetString = 5, DeleteKey = 8, CreateCurrentKey = 10, CreateKey = 11;
}
namespace expression {
constexpr int GetCurrentDword = 2, GetCurrentString = 3, GetDword = 4, GetString = 5;
}

// The module, loaded with LoadLibraryW and released with FreeLibrary.
class Module {
public:
    // Loads the module at `path`; on failure `ok()` is false and `error()` tells why.
    explicit Module(const std::string& path);
    ~Module();
    Module(const Module&) = delete;
    Module& operator=(const Module&) = delete;

    bool ok() const { return error_.empty(); }
    const std::string& error() const { return error_; }

    ActionRoutine action(int code) const;
    ExpressionRoutine expression(int code) const;

private:
    friend class Instance;
    typedef short(WINAPI* DataSizeEntry)(Slot, Slot);
    typedef short(WINAPI* CreateEntry)(void*, Slot, Slot);
    typedef short(WINAPI* DestroyEntry)(void*, Slot);
    typedef short(WINAPI* InfosEntry)(Slot, void*);

    HMODULE handle_ = nullptr;
    std::string error_;
    size_t recordSize_ = 0;
    CreateEntry create_ = nullptr;
    DestroyEntry destroy_ = nullptr;
    const Slot* actions_ = nullptr;
    const Slot* expressions_ = nullptr;
    unsigned actionCount_ = 0, expressionCount_ = 0;
};

// One object instance with its run header. The services read the instance back from the
// record's first host-owned bytes, so several instances can live side by side.
class Instance {
public:
    explicit Instance(Module& module);
    ~Instance();
    Instance(const Instance&) = delete;
    Instance& operator=(const Instance&) = delete;

    void* record() { return record_.data(); }

    // The values GetNextParameter or the expression-parameter services hand out, in order.
    void setParameters(const std::vector<Slot>& values);
    // Starts the next condition or action at its first parameter.
    void rewind() { next_ = 0; }
    // Clears the host flags before an expression, as the host does.
    void clearFlags() { *flags_ = 0; }

    uint32_t lastError() const;
    bool textResult() const;

private:
    static Slot WINAPI nextParameter(void* record, int allBits, int zero);
    static Slot WINAPI firstExpressionParameter(void* record, int one, Slot hostValue);
    static Slot WINAPI nextExpressionParameter(void* record, int one, Slot hostValue);
    static LPWSTR WINAPI stringBuffer(void* record, int zero, int bytes);
    static Instance* owner(void* record);
    Slot take();

    Module& module_;
    std::vector<uint8_t> record_;
    std::vector<uint8_t> runHeader_;
    uint16_t* flags_;
    static constexpr unsigned kMaxParameters = 8;
    Slot parameters_[kMaxParameters] = {};
    unsigned count_ = 0;
    unsigned next_ = 0;
    std::vector<WCHAR> buffer_;
};

// A RootKeyParam record as the editor stores it, for the root at `index`.
class RootKeyRecord {
public:
    explicit RootKeyRecord(uint32_t index);
    Slot slot() const { return reinterpret_cast<Slot>(bytes_); }

private:
    uint8_t bytes_[16];
};

// Hivelet.hzx beside the running program, unless HIVELET_MODULE names another file.
std::string defaultModulePath();

inline Slot textSlot(const WCHAR* text) { return reinterpret_cast<Slot>(text); }

}  // namespace bench
