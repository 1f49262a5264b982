#include "bench_host.h"

#include <hivelet/layout.h>

#include <algorithm>
#include <cstring>

namespace bench {

namespace {

constexpr const hv::HostLayout& L = hv::BuildLayout;

template <typename T>
void store(std::vector<uint8_t>& bytes, size_t offset, T value) {
    std::memcpy(bytes.data() + offset, &value, sizeof(value));
}

template <typename T>
T load(const uint8_t* bytes, size_t offset) {
    T value;
    std::memcpy(&value, bytes + offset, sizeof(value));
    return value;
}

// The table entry at the routine's code, or 0.
Slot routineAt(const std::vector<Slot>& table, hv::EventKind kind, const char* routine) {
    int code = hv::eventCode(kind, routine);
    return code >= 0 && static_cast<size_t>(code) < table.size() ? table[code] : 0;
}

}  // namespace

ActionRoutine actionRoutine(const hv::Module& module, const char* routine) {
    return reinterpret_cast<ActionRoutine>(
        routineAt(module.tables().actions, hv::EventKind::Action, routine));
}

ExpressionRoutine expressionRoutine(const hv::Module& module, const char* routine) {
    return reinterpret_cast<ExpressionRoutine>(
        routineAt(module.tables().expressions, hv::EventKind::Expression, routine));
}

// The record is at least as large as the module asks; the host's services lead back to this
// object through its first bytes.
Instance::Instance(hv::Module& module)
    : destroy_(module.entry<DestroyEntry>("DestroyRunObject")),
      record_(std::max<size_t>(
                  static_cast<uint16_t>(module.entry<DataSizeEntry>("GetRunObjectDataSize")(0, 0)),
                  L.recordSize),
              0),
      runHeader_(L.runHeaderSize, 0),
      buffer_(4096, 0) {
    store(runHeader_, L.getStringBuffer, &Instance::stringBuffer);
    store(runHeader_, L.getFirstExpressionParameter, &Instance::firstExpressionParameter);
    store(runHeader_, L.getNextExpressionParameter, &Instance::nextExpressionParameter);
    store(runHeader_, L.getNextParameter, &Instance::nextParameter);
    store(record_, 0, this);
    store(record_, L.runHeader, runHeader_.data());
    flags_ = reinterpret_cast<uint16_t*>(record_.data() + L.headerFlags);
    module.entry<CreateEntry>("CreateRunObject")(record(), 0, 0);
}

Instance::~Instance() { destroy_(record(), 0); }

void Instance::setParameters(const std::vector<Slot>& values) {
    count_ = 0;
    for (Slot v : values)
        if (count_ < MaxParameters) parameters_[count_++] = v;
    next_ = 0;
}

uint32_t Instance::lastError() const { return load<uint32_t>(record_.data(), L.lastError); }

bool Instance::textResult() const { return (*flags_ & 0x8000) != 0; }

Instance* Instance::owner(void* record) {
    return load<Instance*>(static_cast<const uint8_t*>(record), 0);
}

Slot Instance::take() { return next_ < count_ ? parameters_[next_++] : 0; }

Slot WINAPI Instance::nextParameter(void* record, int, int) { return owner(record)->take(); }

Slot WINAPI Instance::firstExpressionParameter(void* record, int, Slot) {
    Instance* self = owner(record);
    self->next_ = 0;
    return self->take();
}

Slot WINAPI Instance::nextExpressionParameter(void* record, int, Slot) {
    return owner(record)->take();
}

LPWSTR WINAPI Instance::stringBuffer(void* record, int, int bytes) {
    Instance* self = owner(record);
    size_t chars = (static_cast<size_t>(bytes) + 1) / sizeof(WCHAR);
    if (self->buffer_.size() < chars) self->buffer_.resize(chars);
    return self->buffer_.data();
}

}  // namespace bench
