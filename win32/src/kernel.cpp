// Kernel functions of the portable Win32 layer: the last-error slot and libraries loaded over
// the dynamic loader. A library's resources are the compiled resource file that its build
// embedded as the symbol W32ResourceSection; its entry function is its exported DllMain.
#include "internal.h"
#include "resources.h"

#include <dlfcn.h>

#include <cctype>
#include <map>
#include <mutex>
#include <string>

namespace {

thread_local DWORD lastError = 0;

struct LoadedLibrary {
    void* dl;     // dlopen handle
    bool system;  // one of the system libraries, served by this layer itself
    unsigned references;
    const BYTE* resources;  // compiled .res image, or null
    size_t resourceSize;
};

std::mutex libraryLock;
std::map<void*, LoadedLibrary*> loaded;  // by dlopen handle, so a second load shares the first

// The system library the module loads; its functions are this layer's own.
bool isSystemLibrary(std::string name) {
    for (char& c : name) c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
    return name == "advapi32.dll" || name == "advapi32";
}

void* layerHandle() {
    Dl_info info{};
    if (!dladdr(reinterpret_cast<void*>(&GetLastError), &info) || !info.dli_fname) return nullptr;
    return dlopen(info.dli_fname, RTLD_NOW | RTLD_NOLOAD);
}

typedef BOOL(WINAPI* EntryFunction)(HINSTANCE, DWORD, LPVOID);

// Registers a library the dynamic loader has opened and runs its entry function the first time.
LoadedLibrary* attach(void* dl, bool system) {
    std::lock_guard<std::mutex> guard(libraryLock);
    auto found = loaded.find(dl);
    if (found != loaded.end()) {
        dlclose(dl);  // the dynamic loader counted this open too
        ++found->second->references;
        return found->second;
    }
    auto* image = static_cast<const BYTE*>(dlsym(dl, "W32ResourceSection"));
    auto* imageSize = static_cast<const size_t*>(dlsym(dl, "W32ResourceSectionSize"));
    auto* lib = new LoadedLibrary{dl, system, 1, image, imageSize ? *imageSize : 0};
    void* entry = system ? nullptr : dlsym(dl, "DllMain");
    if (entry && !reinterpret_cast<EntryFunction>(entry)(reinterpret_cast<HINSTANCE>(lib),
                                                         DLL_PROCESS_ATTACH, nullptr)) {
        dlclose(dl);
        delete lib;
        SetLastError(ERROR_DLL_INIT_FAILED);
        return nullptr;
    }
    loaded[dl] = lib;
    return lib;
}

}  // namespace

namespace w32 {

Control control;

std::string toUtf8(const WCHAR* text) {
    std::string out;
    for (; text && *text; ++text) {
        uint32_t c = *text;
        if (c >= 0xD800 && c <= 0xDBFF && text[1] >= 0xDC00 && text[1] <= 0xDFFF) {
            c = 0x10000 + ((c - 0xD800) << 10) + (text[1] - 0xDC00);
            ++text;
        }
        if (c < 0x80) {
            out += static_cast<char>(c);
        } else if (c < 0x800) {
            out += static_cast<char>(0xC0 | (c >> 6));
            out += static_cast<char>(0x80 | (c & 0x3F));
        } else if (c < 0x10000) {
            out += static_cast<char>(0xE0 | (c >> 12));
            out += static_cast<char>(0x80 | ((c >> 6) & 0x3F));
            out += static_cast<char>(0x80 | (c & 0x3F));
        } else {
            out += static_cast<char>(0xF0 | (c >> 18));
            out += static_cast<char>(0x80 | ((c >> 12) & 0x3F));
            out += static_cast<char>(0x80 | ((c >> 6) & 0x3F));
            out += static_cast<char>(0x80 | (c & 0x3F));
        }
    }
    return out;
}

bool resourceImage(HINSTANCE instance, const BYTE** data, size_t* size) {
    auto* lib = reinterpret_cast<LoadedLibrary*>(instance);
    if (!lib || !lib->resources) return false;
    *data = lib->resources;
    *size = lib->resourceSize;
    return true;
}

}  // namespace w32

DWORD WINAPI GetLastError(void) { return lastError; }

void WINAPI SetLastError(DWORD code) { lastError = code; }

HMODULE WINAPI LoadLibraryW(LPCWSTR fileName) {
    std::string name = w32::toUtf8(fileName);
    const bool system = isSystemLibrary(name);
    LoadedLibrary* lib = nullptr;
    if (auto code = w32::takeFault("LoadLibraryW")) {
        SetLastError(static_cast<DWORD>(*code));
    } else if (void* dl = system ? layerHandle() : dlopen(name.c_str(), RTLD_NOW | RTLD_LOCAL)) {
        lib = attach(dl, system);
    } else {
        SetLastError(ERROR_MOD_NOT_FOUND);
    }
    w32::record("LoadLibraryW", {w32::arg(fileName)}, w32::arg(lib));
    return reinterpret_cast<HMODULE>(lib);
}

FARPROC WINAPI GetProcAddress(HMODULE module, LPCSTR procName) {
    auto* lib = reinterpret_cast<LoadedLibrary*>(module);
    void* symbol = nullptr;
    if (auto code = w32::takeFault("GetProcAddress")) {
        SetLastError(static_cast<DWORD>(*code));
    } else if (!lib || !procName) {
        SetLastError(ERROR_INVALID_HANDLE);
    } else if (lib->system && w32::control.exportHidden && w32::control.exportHidden(procName)) {
        SetLastError(ERROR_PROC_NOT_FOUND);  // a test made the system library lack it
    } else if (!(symbol = dlsym(lib->dl, procName))) {
        SetLastError(ERROR_PROC_NOT_FOUND);
    }
    w32::record("GetProcAddress", {w32::arg(module), w32::arg(procName)}, w32::arg(symbol));
    return reinterpret_cast<FARPROC>(symbol);
}

BOOL WINAPI FreeLibrary(HMODULE module) {
    auto* lib = reinterpret_cast<LoadedLibrary*>(module);
    BOOL ok = FALSE;
    if (!lib) {
        SetLastError(ERROR_INVALID_HANDLE);
    } else {
        ok = TRUE;
        if (--lib->references == 0) {
            if (!lib->system) {
                if (void* entry = dlsym(lib->dl, "DllMain"))
                    reinterpret_cast<EntryFunction>(entry)(reinterpret_cast<HINSTANCE>(lib),
                                                           DLL_PROCESS_DETACH, nullptr);
            }
            std::lock_guard<std::mutex> guard(libraryLock);
            loaded.erase(lib->dl);
            dlclose(lib->dl);
            delete lib;
        }
    }
    w32::record("FreeLibrary", {w32::arg(module)}, ok);
    return ok;
}
