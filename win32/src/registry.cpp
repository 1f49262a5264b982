// The registry functions of advapi32, with Windows' results, over the in-memory model.
#include "registry_model.h"

#include <cstring>
#include <new>

using namespace w32::reg;
using w32::arg;

namespace {

bool isEmptyPath(const WCHAR* path) { return !path || !path[0]; }

std::u16string_view valueName(const WCHAR* name) {
    return name ? std::u16string_view(name) : std::u16string_view();
}

// Runs one registry call: an injected fault answers first and touches nothing but the out
// handle; otherwise the call runs under the registry's lock and running out of memory is a code.
template <typename Body>
LONG run(std::string_view function, HKEY* outHandle, Body body) {
    if (auto code = w32::takeFault(function)) {
        if (outHandle) *outHandle = nullptr;
        return static_cast<LONG>(*code);
    }
    Registry& r = registry();
    std::lock_guard<std::mutex> guard(r.lock);
    try {
        return body(r);
    } catch (const std::bad_alloc&) {
        return ERROR_OUTOFMEMORY;
    }
}

// Runs the call and journals it with its arguments, in Windows' order.
template <typename Body>
LONG serve(std::string_view function, std::initializer_list<uint64_t> args, HKEY* outHandle,
           Body body) {
    LONG code = run(function, outHandle, body);
    w32::record(function, args, code);
    return code;
}

// A new handle to `key` if the key grants what `sam` asks for (the view bits ask for nothing).
LONG grant(Registry& r, Key& key, REGSAM sam, HKEY* out) {
    DWORD rights = sam & KEY_ALL_ACCESS;
    if (rights & key.denied) return ERROR_ACCESS_DENIED;
    *out = addHandle(r, key, rights);
    return ERROR_SUCCESS;
}

// The checks open, create and delete make on the start key and the path, in Windows' order;
// `way` receives the walk the path takes in the view of `sam`.
LONG startWalk(Registry& r, const Bound& start, const WCHAR* path, REGSAM sam, Route& way) {
    if (LONG code = checkLeading(path, start)) return code;
    if (start.key->deleted) return ERROR_KEY_DELETED;
    Names names;
    if (LONG code = splitPath(path, names)) return code;
    way = route(r, *start.key, names, sam);
    return ERROR_SUCCESS;
}

LONG openKey(Registry& r, HKEY parent, const WCHAR* path, REGSAM sam, HKEY* out) {
    if (!out) return ERROR_INVALID_PARAMETER;
    Bound start;
    if (LONG code = bind(r, parent, start)) return code;  // *out untouched, as on Windows
    // "" or NULL on a predefined root hands back the predefined value itself.
    if (start.predefined && isEmptyPath(path)) {
        *out = parent;
        return ERROR_SUCCESS;
    }
    *out = nullptr;
    Route way;
    if (LONG code = startWalk(r, start, path, sam, way)) return code;
    Key* key = findKey(*way.from, way.names);
    if (!key) return ERROR_FILE_NOT_FOUND;
    return grant(r, *key, sam, out);
}

LONG createKey(Registry& r, HKEY parent, const WCHAR* path, REGSAM sam, HKEY* out,
               DWORD* disposition) {
    // A NULL out pointer: Windows' answer is recorded nowhere and Wine crashes (both process
    // kinds); 87, as RegOpenKeyExW answers.
    if (!out) return ERROR_INVALID_PARAMETER;
    Bound start;
    if (LONG code = bind(r, parent, start)) return code;
    *out = nullptr;
    // A NULL path, documented as not allowed, names the key itself as "" does (Wine: 0).
    Route way;
    if (LONG code = startWalk(r, start, path, sam, way)) return code;
    Key* key = nullptr;
    bool created = false;
    if (LONG code = createPath(*way.from, way.names, key, created)) return code;
    if (LONG code = grant(r, *key, sam, out)) return code;
    // "" or NULL opens the key itself, which existed: 2 by the documented meaning (Wine: 1).
    if (disposition) *disposition = created ? REG_CREATED_NEW_KEY : REG_OPENED_EXISTING_KEY;
    return ERROR_SUCCESS;
}

LONG deleteKey(Registry& r, HKEY parent, const WCHAR* path, REGSAM sam) {
    if (!path) return ERROR_INVALID_PARAMETER;
    Bound start;
    if (LONG code = bind(r, parent, start)) return code;
    // The parent handle's rights do not matter: Windows opens the subkey itself with DELETE.
    Route way;
    if (LONG code = startWalk(r, start, path, sam, way)) return code;
    Key* key = findKey(*way.from, way.names);
    return key ? removeKey(*key) : ERROR_FILE_NOT_FOUND;
}

bool isText(DWORD type) { return type == REG_SZ || type == REG_EXPAND_SZ || type == REG_MULTI_SZ; }

// Windows adds the terminator a string value's size left out when the caller's next character
// is one; it reads that character past cbData, as Windows does.
DWORD storedSize(DWORD type, const BYTE* data, DWORD size) {
    if (!isText(type) || size < sizeof(WCHAR) || size % sizeof(WCHAR) != 0) return size;
    WCHAR last = 0, next = 0;
    std::memcpy(&last, data + size - sizeof(WCHAR), sizeof(WCHAR));
    if (last == 0) return size;
    std::memcpy(&next, data + size, sizeof(WCHAR));
    return next == 0 ? size + static_cast<DWORD>(sizeof(WCHAR)) : size;
}

LONG setValue(Registry& r, HKEY handle, const WCHAR* name, DWORD type, const BYTE* data,
              DWORD size) {
    Bound at;
    if (LONG code = bindFor(r, handle, KEY_SET_VALUE, at)) return code;
    std::u16string_view label = valueName(name);
    if (label.size() > MaxValueNameLength) return ERROR_INVALID_PARAMETER;
    if (data) size = storedSize(type, data, size);
    auto found = at.key->values.find(RawName{label});
    if (found == at.key->values.end()) found = at.key->values.emplace(fold(label), Value()).first;
    Value& value = found->second;
    value.type = type;
    value.data.clear();
    if (data) value.data.assign(data, data + size);
    touch(*at.key);
    return ERROR_SUCCESS;
}

// String data that does not end in a zero character gets one when two bytes of the buffer are
// left: Wine does so in both process kinds, as its comments say NT does (and as Wine's tests
// assert for RegQueryValueExA on Windows). The size reported stays the data's.
void terminate(const Value& value, BYTE* data, DWORD capacity) {
    size_t n = value.data.size();
    if (!isText(value.type) || capacity - n < sizeof(WCHAR)) return;
    if (value.data[n - 1] == 0 && (n == 1 || value.data[n - 2] == 0)) return;
    data[n] = data[n + 1] = 0;
}

LONG queryValue(Registry& r, HKEY handle, const WCHAR* name, DWORD* type, BYTE* data, DWORD* size) {
    Bound at;
    if (LONG code = bindFor(r, handle, KEY_QUERY_VALUE, at)) return code;
    auto it = at.key->values.find(RawName{valueName(name)});
    if (it == at.key->values.end()) {
        if (!data && size) *size = 0;
        return ERROR_FILE_NOT_FOUND;
    }
    const Value& value = it->second;
    auto needed = static_cast<DWORD>(value.data.size());
    if (type) *type = value.type;
    if (!size) return ERROR_SUCCESS;
    // A buffer too small is not written at all: only the size it would need is reported.
    LONG code = (data && *size < needed) ? ERROR_MORE_DATA : ERROR_SUCCESS;
    if (data && code == ERROR_SUCCESS && needed) {
        std::memcpy(data, value.data.data(), needed);
        terminate(value, data, *size);
    }
    *size = needed;
    return code;
}

LONG deleteValue(Registry& r, HKEY handle, const WCHAR* name) {
    Bound at;
    if (LONG code = bindFor(r, handle, KEY_SET_VALUE, at)) return code;
    auto it = at.key->values.find(RawName{valueName(name)});
    if (it == at.key->values.end()) return ERROR_FILE_NOT_FOUND;
    at.key->values.erase(it);
    touch(*at.key);
    return ERROR_SUCCESS;
}

// Only the name is served: callers ask for no class and no time of the last write.
LONG enumKey(Registry& r, HKEY handle, DWORD index, WCHAR* name, DWORD* length) {
    Bound at;
    if (LONG code = bindFor(r, handle, KEY_ENUMERATE_SUB_KEYS, at)) return code;
    const Key* child = childAt(*at.key, index);
    if (!child) return ERROR_NO_MORE_ITEMS;
    // The name must fit with its terminator; if not, neither buffer nor count is written.
    if (*length <= child->name.size()) return ERROR_MORE_DATA;
    std::memcpy(name, child->name.data(), child->name.size() * sizeof(WCHAR));
    name[child->name.size()] = 0;
    *length = static_cast<DWORD>(child->name.size());
    return ERROR_SUCCESS;
}

LONG closeKey(Registry& r, HKEY handle) {
    if (!handle) return ERROR_INVALID_HANDLE;
    // Windows never closes predefined values, defined or not (0x8000000n). For other values
    // from 0x80000000 up its answer is recorded nowhere; Wine's is 0 in both process kinds.
    if (reinterpret_cast<uintptr_t>(handle) >= 0x80000000u) return ERROR_SUCCESS;
    bool open = r.handles.erase(reinterpret_cast<uintptr_t>(handle)) != 0;
    return open ? ERROR_SUCCESS : ERROR_INVALID_HANDLE;
}

}  // namespace

LSTATUS WINAPI RegOpenKeyExW(HKEY hKey, LPCWSTR lpSubKey, DWORD ulOptions, REGSAM samDesired,
                             PHKEY phkResult) {
    return serve("RegOpenKeyExW", {arg(hKey), arg(lpSubKey), ulOptions, samDesired, arg(phkResult)},
                 phkResult,
                 [&](Registry& r) { return openKey(r, hKey, lpSubKey, samDesired, phkResult); });
}

LSTATUS WINAPI RegCreateKeyExW(HKEY hKey, LPCWSTR lpSubKey, DWORD Reserved, LPWSTR lpClass,
                               DWORD dwOptions, REGSAM samDesired,
                               LPSECURITY_ATTRIBUTES lpSecurityAttributes, PHKEY phkResult,
                               LPDWORD lpdwDisposition) {
    return serve("RegCreateKeyExW",
                 {arg(hKey), arg(lpSubKey), Reserved, arg(lpClass), dwOptions, samDesired,
                  arg(lpSecurityAttributes), arg(phkResult), arg(lpdwDisposition)},
                 phkResult, [&](Registry& r) {
                     return createKey(r, hKey, lpSubKey, samDesired, phkResult, lpdwDisposition);
                 });
}

LSTATUS WINAPI RegQueryValueExW(HKEY hKey, LPCWSTR lpValueName, LPDWORD lpReserved, LPDWORD lpType,
                                LPBYTE lpData, LPDWORD lpcbData) {
    return serve(
        "RegQueryValueExW",
        {arg(hKey), arg(lpValueName), arg(lpReserved), arg(lpType), arg(lpData), arg(lpcbData)},
        nullptr,
        [&](Registry& r) { return queryValue(r, hKey, lpValueName, lpType, lpData, lpcbData); });
}

// Reserved is ignored: Windows stores the value with Reserved 1 too.
LSTATUS WINAPI RegSetValueExW(HKEY hKey, LPCWSTR lpValueName, DWORD Reserved, DWORD dwType,
                              const BYTE* lpData, DWORD cbData) {
    return serve(
        "RegSetValueExW", {arg(hKey), arg(lpValueName), Reserved, dwType, arg(lpData), cbData},
        nullptr,
        [&](Registry& r) { return setValue(r, hKey, lpValueName, dwType, lpData, cbData); });
}

// No view flag: the process's default view, the 32-bit one.
LSTATUS WINAPI RegDeleteKeyW(HKEY hKey, LPCWSTR lpSubKey) {
    return serve("RegDeleteKeyW", {arg(hKey), arg(lpSubKey)}, nullptr,
                 [&](Registry& r) { return deleteKey(r, hKey, lpSubKey, 0); });
}

// Reserved is ignored, as Windows does; only the view bits of samDesired count.
LSTATUS WINAPI RegDeleteKeyExW(HKEY hKey, LPCWSTR lpSubKey, REGSAM samDesired, DWORD Reserved) {
    return serve("RegDeleteKeyExW", {arg(hKey), arg(lpSubKey), samDesired, Reserved}, nullptr,
                 [&](Registry& r) { return deleteKey(r, hKey, lpSubKey, samDesired); });
}

LSTATUS WINAPI RegDeleteValueW(HKEY hKey, LPCWSTR lpValueName) {
    return serve("RegDeleteValueW", {arg(hKey), arg(lpValueName)}, nullptr,
                 [&](Registry& r) { return deleteValue(r, hKey, lpValueName); });
}

LSTATUS WINAPI RegEnumKeyExW(HKEY hKey, DWORD dwIndex, LPWSTR lpName, LPDWORD lpcchName,
                             LPDWORD lpReserved, LPWSTR lpClass, LPDWORD lpcchClass,
                             PFILETIME lpftLastWriteTime) {
    return serve("RegEnumKeyExW",
                 {arg(hKey), dwIndex, arg(lpName), arg(lpcchName), arg(lpReserved), arg(lpClass),
                  arg(lpcchClass), arg(lpftLastWriteTime)},
                 nullptr,
                 [&](Registry& r) { return enumKey(r, hKey, dwIndex, lpName, lpcchName); });
}

LSTATUS WINAPI RegCloseKey(HKEY hKey) {
    return serve("RegCloseKey", {arg(hKey)}, nullptr,
                 [&](Registry& r) { return closeKey(r, hKey); });
}
