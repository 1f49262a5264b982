// Test control of the registry and the system's answers about itself: a fresh registry, open
// handles, denied rights, hidden exports and what GetVersionExW says.
#include <w32/testctl.h>

#include "registry_model.h"

#include <atomic>
#include <set>

using namespace w32::reg;

namespace {

struct Settings {
    std::mutex lock;
    std::set<std::string, std::less<>> hidden;  // exports GetProcAddress does not find
};

Settings& settings() {
    static Settings* s = new Settings;  // never destroyed, like the registry
    return *s;
}

std::atomic<DWORD> platform{VER_PLATFORM_WIN32_NT};

}  // namespace

namespace w32test {

// The layer's hooks for GetProcAddress and GetVersionExW.
bool exportHidden(const char* name) {
    // Small values are ordinals, not names; none is hidden.
    if (reinterpret_cast<uintptr_t>(name) < 0x10000) return false;
    Settings& s = settings();
    std::lock_guard<std::mutex> guard(s.lock);
    return s.hidden.count(std::string_view(name)) != 0;
}

DWORD platformId() { return platform.load(); }

void resetRegistry() {
    Registry& r = registry();
    {
        std::lock_guard<std::mutex> guard(r.lock);
        rebuild(r);
    }
    {
        Settings& s = settings();
        std::lock_guard<std::mutex> guard(s.lock);
        s.hidden.clear();
    }
    platform = VER_PLATFORM_WIN32_NT;
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
        key->denied = rights & KEY_ALL_ACCESS;
}

void hideExport(const char* name, bool hidden) {
    Settings& s = settings();
    std::lock_guard<std::mutex> guard(s.lock);
    if (hidden)
        s.hidden.insert(name);
    else
        s.hidden.erase(std::string(name));
}

// A failing GetVersionExW is its fault armed for good (last error 87).
void setVersionFault(bool fail) {
    if (fail)
        failAlways("GetVersionExW", ERROR_INVALID_PARAMETER);
    else
        clearFault("GetVersionExW");
}

void setPlatformId(DWORD id) { platform = id; }

}  // namespace w32test
