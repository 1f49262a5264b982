// A bare host for timing the module. The host library loads the module and reads its routine
// tables (hv::Module); this host lays out one instance record and its run header and answers
// the run header's services from values prepared before the timed loop. Unlike the host
// simulator's hv::Instance it checks nothing around a call, so what a benchmark times is the
// routine and the registry calls the routine makes.
#pragma once

#include <hivelet/host.h>

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

namespace bench {

using hv::Slot;

typedef short(WINAPI* ActionRoutine)(void* record, Slot first, Slot second);
typedef Slot(WINAPI* ExpressionRoutine)(void* record, Slot hostValue);

// The routine of that name from the module's tables, or null when there is none.
ActionRoutine actionRoutine(const hv::Module& module, const char* routine);
ExpressionRoutine expressionRoutine(const hv::Module& module, const char* routine);

// One object instance with its run header. The services read the instance back from the
// record's first host-owned bytes, so several instances can live side by side.
class Instance {
public:
    explicit Instance(hv::Module& module);
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
    typedef short(WINAPI* DataSizeEntry)(Slot, Slot);
    typedef short(WINAPI* CreateEntry)(void*, Slot, Slot);
    typedef short(WINAPI* DestroyEntry)(void*, Slot);

    static Slot WINAPI nextParameter(void* record, int allBits, int zero);
    static Slot WINAPI firstExpressionParameter(void* record, int one, Slot hostValue);
    static Slot WINAPI nextExpressionParameter(void* record, int one, Slot hostValue);
    static LPWSTR WINAPI stringBuffer(void* record, int zero, int bytes);
    static Instance* owner(void* record);
    Slot take();

    DestroyEntry destroy_;
    std::vector<uint8_t> record_;
    std::vector<uint8_t> runHeader_;
    uint16_t* flags_;
    static constexpr unsigned MaxParameters = 8;
    Slot parameters_[MaxParameters] = {};
    unsigned count_ = 0;
    unsigned next_ = 0;
    std::vector<WCHAR> buffer_;
};

// A RootKeyParam record as the editor stores it, for the root at `index`.
class RootKeyRecord {
public:
    explicit RootKeyRecord(uint32_t index) : bytes_(hv::rootKeyRecord(index)) {}
    Slot slot() const { return reinterpret_cast<Slot>(bytes_.data()); }

private:
    std::vector<uint8_t> bytes_;
};

inline Slot textSlot(const WCHAR* text) { return reinterpret_cast<Slot>(text); }

}  // namespace bench
