// Test control of the registry: a fresh registry, open handles, denied rights, hidden exports.
#include "registry.h"
#include "registry_model.h"

#include <set>

using namespace w32::reg;

namespace {

struct HiddenExports {
    std::mutex lock;
    std::set<std::string, std::less<>> names;
};

HiddenExports& hiddenExports() {
    static HiddenExports* h = new HiddenExports;  // never destroyed, like the registry
    return *h;
}

}  // namespace

namespace w32 {

bool exportHidden(const char* name) {
    // Small values are ordinals, not names; none is hidden.
    if (reinterpret_cast<uintptr_t>(name) < 0x10000) return false;
    HiddenExports& h = hiddenExports();
    std::lock_guard<std::mutex> guard(h.lock);
    return h.names.count(std::string_view(name)) != 0;
}

}  // namespace w32

namespace w32test {

void resetRegistry() {
    Registry& r = registry();
    {
        std::lock_guard<std::mutex> guard(r.lock);
        rebuild(r);
    }
    {
        HiddenExports& h = hiddenExports();
        std::lock_guard<std::mutex> guard(h.lock);
        h.names.clear();
    }
    w32::resetVersionSettings();
}

size_t openHandleCount() {
    Registry& r = registry();
    std::lock_guard<std::mutex> guard(r.lock);
    return r.handles.size();
}

void denyAccess(HKEY root, std::u16string path, DWORD rights) {
    Registry& r = registry();
    std::lock_guard<std::mutex> guard(r.lock);
    Bound start;
    Names names;
    if (!isPredefined(root) || bind(r, root, start) || splitPath(path.c_str(), names)) return;
    Route way = route(r, *start.key, names, rights);
    Key* key = nullptr;
    bool created = false;
    if (createPath(*way.from, way.names, key, created) == ERROR_SUCCESS)
        key->denied = requestedRights(rights & ~kViewBits, 0);
}

void hideExport(const char* name, bool hidden) {
    HiddenExports& h = hiddenExports();
    std::lock_guard<std::mutex> guard(h.lock);
    if (hidden)
        h.names.insert(name);
    else
        h.names.erase(std::string(name));
}

}  // namespace w32test
