// The registry's in-memory model: a tree of keys per predefined root, a handle table that keeps
// each handle's granted access, subkey paths and the WOW64 view of a 32-bit process.
#pragma once

#include "internal.h"

#include <map>
#include <memory>
#include <mutex>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

namespace w32::reg {

#pragma GCC visibility push(default)  // the test control reaches the model

constexpr size_t MaxKeyNameLength = 255;      // documented limit of one key name component
constexpr size_t MaxValueNameLength = 16383;  // documented limit of a value name
constexpr unsigned MaxDepth = 512;            // levels below a root
constexpr unsigned MaxNewLevels = 32;         // keys one RegCreateKeyExW call may create
constexpr unsigned RootCount = 5;
constexpr unsigned MachineRoot = 2;  // index of HKEY_LOCAL_MACHINE among the roots

using Names = std::vector<std::u16string_view>;

// Case-insensitive form of a name, also its sort key among its siblings.
std::u16string fold(std::u16string_view name);
bool sameName(std::u16string_view a, std::u16string_view b);
// <0, 0 or >0 as a folded name sorts before, with or after a name not yet folded.
int compareFolded(std::u16string_view folded, std::u16string_view raw);

// A name as the caller spelt it, looked up among folded names without folding a copy.
struct RawName {
    std::u16string_view text;
};

// Order of folded names, able to compare them with raw ones.
struct FoldedOrder {
    using is_transparent = void;
    bool operator()(const std::u16string& a, const std::u16string& b) const { return a < b; }
    bool operator()(const std::u16string& a, RawName b) const {
        return compareFolded(a, b.text) < 0;
    }
    bool operator()(RawName a, const std::u16string& b) const {
        return compareFolded(b, a.text) > 0;
    }
};

// Values are found by their folded name; no caller lists them, so their spelling is not kept.
struct Value {
    DWORD type = REG_NONE;
    std::vector<BYTE> data;
};

struct Key;
using KeyRef = std::shared_ptr<Key>;
using Children = std::map<std::u16string, KeyRef, FoldedOrder>;  // by folded name

struct Key : std::enable_shared_from_this<Key> {
    std::u16string name;    // first creator's spelling
    Key* parent = nullptr;  // null for a root and for a deleted key
    unsigned root = 0;
    unsigned depth = 0;  // levels below the root
    bool deleted = false;
    DWORD denied = 0;  // rights refused to everyone
    Children children;
    std::map<std::u16string, Value, FoldedOrder> values;  // by folded name
    // Where the last enumeration stopped, so that walking the children by index stays linear.
    size_t cursorIndex = 0;
    Children::const_iterator cursor;
    bool cursorValid = false;
};

// An open handle: the key it was bound to when opened and the rights it was granted.
struct OpenHandle {
    KeyRef key;
    DWORD granted = 0;
};

struct Registry {
    std::mutex lock;
    KeyRef roots[RootCount];
    std::unordered_map<uintptr_t, OpenHandle> handles;
    uintptr_t nextHandle = 0x100;
};

Registry& registry();
// Replaces the tree with the empty registry of a fresh system and forgets every handle.
void rebuild(Registry& r);

// ---- handles ----

// The key a handle stands for, with the rights the handle carries.
struct Bound {
    Key* key = nullptr;
    DWORD granted = 0;
    bool predefined = false;
    bool classesRoot = false;  // the predefined HKEY_CLASSES_ROOT handle itself
};

bool isPredefined(HKEY handle);
// 6 for a handle that is neither an open handle nor a predefined root.
LONG bind(Registry& r, HKEY handle, Bound& out);
// bind, then the checks of every operation on the key's own contents: rights, then deletion.
LONG bindFor(Registry& r, HKEY handle, DWORD needed, Bound& out);
HKEY addHandle(Registry& r, Key& key, DWORD granted);

// ---- paths and views ----

// 161 for a leading backslash where Windows refuses one.
LONG checkLeading(const WCHAR* path, const Bound& start);
// The path's components; backslash runs are one separator. 87 for an over-long component.
LONG splitPath(const WCHAR* path, Names& out);
// The walk a path takes from `start` in the view of the call's mask.
struct Route {
    Key* from = nullptr;
    Names names;
};
Route route(Registry& r, Key& start, const Names& names, REGSAM sam);

// ---- tree ----

Key* findChild(const Key& parent, std::u16string_view name);
Key* findKey(Key& from, const Names& names);
// Opens or creates the keys along `names`: 87 past the depth or per-call limits, 5 where the
// parent refuses new children. `created` says whether any key was new.
LONG createPath(Key& from, const Names& names, Key*& out, bool& created);
// Deletes a key that has no subkeys; handles to it go stale.
LONG removeKey(Key& key);
// The child at `index` in case-insensitive order, or null past the end.
const Key* childAt(Key& parent, size_t index);
// Notes that a key's children or values changed.
void touch(Key& key);

#pragma GCC visibility pop

}  // namespace w32::reg
