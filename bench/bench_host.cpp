#include "bench_host.h"

#include <hivelet/layout.h>

#include <climits>
#include <cstdlib>
#include <cstring>
#include <unistd.h>

namespace bench {

namespace {

constexpr const hv::HostLayout& L = hv::hostLayout;

// Code points of a UTF-8 file name as UTF-16, for LoadLibraryW.
std::u16string toUtf16(const std::string& text) {
    std::u16string out;
    for (size_t i = 0; i < text.size();) {
        auto byte = static_cast<unsigned char>(text[i]);
        unsigned length = byte < 0x80 ? 1 : byte < 0xE0 ? 2 : byte < 0xF0 ? 3 : 4;
        uint32_t c = length == 1 ? byte : byte & (0x7F >> length);
        for (unsigned k = 1; k < length && i + k < text.size(); ++k)
            c = c << 6 | (static_cast<unsigned char>(text[i + k]) & 0x3F);
        i += length;
        if (c < 0x10000) {
            out += static_cast<char16_t>(c);
        } else {
            c -= 0x10000;
            out += static_cast<char16_t>(0xD800 + (c >> 10));
            out += static_cast<char16_t>(0xDC00 + (c & 0x3FF));
        }
    }
    return out;
}

template <typename F>
F exportOf(HMODULE module, const char* name) {
    return reinterpret_cast<F>(reinterpret_cast<void*>(GetProcAddress(module, name)));
}

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

}  // namespace

std::string defaultModulePath() {
    const char* chosen = std::getenv("HIVELET_MODULE");
    // A name without a slash is a file in the current folder, not one for the loader to search.
    if (chosen && *chosen) return std::strchr(chosen, '/') ? chosen : std::string("./") + chosen;
    char path[PATH_MAX];
    ssize_t length = readlink("/proc/self/exe", path, sizeof(path) - 1);
    if (length <= 0) return "Hivelet.hzx";
    std::string program(path, static_cast<size_t>(length));
    return program.substr(0, program.rfind('/') + 1) + "Hivelet.hzx";
}

Module::Module(const std::string& path) {
    std::u16string name = toUtf16(path);
    handle_ = LoadLibraryW(name.c_str());
    if (!handle_) {
        error_ = "cannot load " + path + " (error " + std::to_string(GetLastError()) + ")";
        return;
    }
    auto dataSize = exportOf<DataSizeEntry>(handle_, "GetRunObjectDataSize");
    auto infos = exportOf<InfosEntry>(handle_, "GetRunObjectInfos");
    create_ = exportOf<CreateEntry>(handle_, "CreateRunObject");
    destroy_ = exportOf<DestroyEntry>(handle_, "DestroyRunObject");
    if (!dataSize || !infos || !create_ || !destroy_) {
        error_ = path + " lacks a run-time entry point";
        return;
    }
    recordSize_ = static_cast<uint16_t>(dataSize(0, 0));
    if (recordSize_ < L.recordSize) {
        error_ = "record size " + std::to_string(recordSize_) + " is too small";
        return;
    }
    std::vector<uint8_t> block(L.infoSize, 0);
    infos(0, block.data());
    actions_ = load<const Slot*>(block.data(), L.infoActions);
    expressions_ = load<const Slot*>(block.data(), L.infoExpressions);
    actionCount_ = load<uint16_t>(block.data(), L.infoActionCount);
    expressionCount_ = load<uint16_t>(block.data(), L.infoExpressionCount);
    if (!actions_ || !expressions_) error_ = "GetRunObjectInfos gave no routine tables";
}

Module::~Module() {
    if (handle_) FreeLibrary(handle_);
}

ActionRoutine Module::action(int code) const {
    if (code < 0 || static_cast<unsigned>(code) >= actionCount_) return nullptr;
    return reinterpret_cast<ActionRoutine>(actions_[code]);
}

ExpressionRoutine Module::expression(int code) const {
    if (code < 0 || static_cast<unsigned>(code) >= expressionCount_) return nullptr;
    return reinterpret_cast<ExpressionRoutine>(expressions_[code]);
}

Instance::Instance(Module& module)
    : module_(module), record_(module.recordSize_, 0), runHeader_(L.runHeaderSize, 0),
      buffer_(4096, 0) {
    store(runHeader_, L.getStringBuffer, &Instance::stringBuffer);
    store(runHeader_, L.getFirstExpressionParameter, &Instance::firstExpressionParameter);
    store(runHeader_, L.getNextExpressionParameter, &Instance::nextExpressionParameter);
    store(runHeader_, L.getNextParameter, &Instance::nextParameter);
    // The first header bytes are the host's own: they lead the services back to this object.
    store(record_, 0, this);
    store(record_, L.runHeader, runHeader_.data());
    flags_ = reinterpret_cast<uint16_t*>(record_.data() + L.headerFlags);
    module_.create_(record(), 0, 0);
}

Instance::~Instance() { module_.destroy_(record(), 0); }

void Instance::setParameters(const std::vector<Slot>& values) {
    count_ = 0;
    for (Slot v : values)
        if (count_ < kMaxParameters) parameters_[count_++] = v;
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

RootKeyRecord::RootKeyRecord(uint32_t index) {
    std::memset(bytes_, 0xAB, sizeof(bytes_));
    bytes_[0] = 16;
    bytes_[1] = 0;
    std::memcpy(bytes_ + L.rootParamIndex, &index, sizeof(index));
}

}  // namespace bench
