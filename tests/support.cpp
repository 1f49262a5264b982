#include "support.h"

namespace hvtest {

hv::Module& module() {
    static std::unique_ptr<hv::Module> loaded = [] {
        std::string error;
        auto m = hv::Module::load(hv::defaultModulePath(), &error);
        if (!m) {
            fprintf(stderr, "cannot load the module: %s\n", error.c_str());
            abort();
        }
        return m;
    }();
    return *loaded;
}

std::u16string systemMessage(DWORD code) {
    WCHAR buffer[512];
    DWORD n = FormatMessageW(FORMAT_MESSAGE_FROM_SYSTEM | FORMAT_MESSAGE_IGNORE_INSERTS, nullptr,
                             code, 0, buffer, 512, nullptr);
    return std::u16string(reinterpret_cast<const char16_t*>(buffer), n);
}

std::string show(const std::u16string& s) { return hv::toUtf8(s); }

}  // namespace hvtest
