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

std::string show(const std::u16string& s) { return hv::toUtf8(s); }

}  // namespace hvtest
