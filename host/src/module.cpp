// Loading the module and reading the routine tables it hands to the host.
#include "internal.h"

#include <cstdlib>
#include <stdexcept>

#ifndef _WIN32
#include <unistd.h>
#endif

namespace hv {

namespace {

using GetRunObjectInfosEntry = short(WINAPI*)(Slot host, void* infos);

// The loader's path for a module path. The dynamic loader searches its library path for a name
// without a slash; the host means a file, as Windows does.
std::string loaderPath(const std::string& path) {
#ifdef _WIN32
    return path;
#else
    return path.find('/') == std::string::npos ? "./" + path : path;
#endif
}

// A system error code with its message, for load failures.
std::string describeError(DWORD code) {
    std::string text = toUtf8(systemMessage(code));
    while (!text.empty() && (text.back() == '\n' || text.back() == '\r' || text.back() == ' '))
        text.pop_back();
    std::string number = "error " + std::to_string(code);
    return text.empty() ? number : text + " (" + number + ")";
}

// The entries of the routine table whose address and count the block holds at these offsets,
// and whether a null entry ends it.
std::vector<Slot> readTable(const uint8_t* block, size_t at, size_t countAt, bool* ended) {
    auto address = readAt<Slot>(block, at);
    auto count = readAt<uint16_t>(block, countAt);
    std::vector<Slot> entries;
    *ended = false;
    if (!address) return entries;
    const auto* table = reinterpret_cast<const Slot*>(address);
    entries.assign(table, table + count);
    *ended = table[count] == 0;
    return entries;
}

// The folder of the running program, with its separator, or "" when it cannot be found.
std::string programFolder() {
#ifdef _WIN32
    WCHAR path[32768];
    DWORD length = GetModuleFileNameW(nullptr, path, 32768);
    if (length == 0 || length >= 32768) return std::string();
    std::string text = toUtf8(std::u16string(reinterpret_cast<const char16_t*>(path), length));
    size_t slash = text.find_last_of("\\/");
#else
    char path[4096];
    ssize_t length = readlink("/proc/self/exe", path, sizeof path - 1);
    if (length <= 0) return std::string();
    std::string text(path, static_cast<size_t>(length));
    size_t slash = text.find_last_of('/');
#endif
    return slash == std::string::npos ? std::string() : text.substr(0, slash + 1);
}

}  // namespace

std::unique_ptr<Module> Module::load(const std::string& path, std::string* error) {
    std::string ignored;
    if (!error) error = &ignored;
    HMODULE handle = LoadLibraryW(wide(fromUtf8(loaderPath(path))));
    if (!handle) {
        *error = "cannot load the module " + path + ": " + describeError(GetLastError());
        return nullptr;
    }
    std::unique_ptr<Module> module(new Module(handle));
    if (!module->readTables(error)) return nullptr;
    return module;
}

Module::~Module() { FreeLibrary(handle_); }

FARPROC Module::address(const char* name) const { return GetProcAddress(handle_, name); }

FARPROC Module::require(const char* name) const {
    FARPROC found = address(name);
    if (!found) throw std::runtime_error(std::string("the module has no export ") + name);
    return found;
}

// Hands the module a block filled with a pattern, with guard bytes after it, so that bytes it
// must leave alone can be told from the ones it wrote.
bool Module::readTables(std::string* error) {
    const HostLayout& l = BuildLayout;
    size_t blockSize = alignUp(l.infoSize, l.pointerSize);
    tables_.block.assign(blockSize + Fill::GuardSize, Fill::Infos);
    try {
        auto infos = entry<GetRunObjectInfosEntry>("GetRunObjectInfos");
        tables_.infosResult = infos(0, tables_.block.data());
    } catch (const std::exception& e) {
        *error = e.what();
        return false;
    }
    if (firstNotPattern(tables_.block.data() + blockSize, Fill::Infos, Fill::GuardSize) >= 0) {
        *error = "GetRunObjectInfos wrote past the end of the RunObjectInfos block";
        return false;
    }
    const uint8_t* b = tables_.block.data();
    tables_.conditions =
        readTable(b, l.infoConditions, l.infoConditionCount, &tables_.conditionsEnd);
    tables_.actions = readTable(b, l.infoActions, l.infoActionCount, &tables_.actionsEnd);
    tables_.expressions =
        readTable(b, l.infoExpressions, l.infoExpressionCount, &tables_.expressionsEnd);
    return true;
}

std::string defaultModulePath() {
    const char* chosen = std::getenv("HIVELET_MODULE");
    if (chosen && *chosen) return chosen;
    return pathBesideProgram("Hivelet.hzx");
}

std::string pathBesideProgram(const std::string& fileName) { return programFolder() + fileName; }

}  // namespace hv
