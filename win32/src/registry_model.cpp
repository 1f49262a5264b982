// The registry tree, its handle table, subkey paths and the WOW64 view of a 32-bit process.
#include "registry_model.h"

#include <algorithm>

namespace w32::reg {

namespace {

// Lower-case ranges of the alphabets whose names the registry folds, with the distance to the
// upper case; `alternating` ranges pair each upper-case letter with the next code unit.
struct CaseRange {
    char16_t first, last;
    int delta;
    bool alternating;
};

const CaseRange CaseRanges[] = {
    {0x00E0, 0x00F6, -32, false}, {0x00F8, 0x00FE, -32, false}, {0x00FF, 0x00FF, 121, false},
    {0x0101, 0x012F, -1, true},   {0x0133, 0x0137, -1, true},   {0x013A, 0x0148, -1, true},
    {0x014B, 0x0177, -1, true},   {0x017A, 0x017E, -1, true},   {0x03AC, 0x03AC, -38, false},
    {0x03AD, 0x03AF, -37, false}, {0x03B1, 0x03C1, -32, false}, {0x03C2, 0x03C2, -31, false},
    {0x03C3, 0x03CB, -32, false}, {0x03CC, 0x03CC, -64, false}, {0x03CD, 0x03CE, -63, false},
    {0x03E3, 0x03EF, -1, true},   {0x0430, 0x044F, -32, false}, {0x0450, 0x045F, -80, false},
    {0x0461, 0x0481, -1, true},   {0x048B, 0x04BF, -1, true},   {0x04C2, 0x04CE, -1, true},
    {0x04D1, 0x052F, -1, true},   {0x0561, 0x0586, -48, false}, {0x1E01, 0x1E95, -1, true},
    {0x1EA1, 0x1EFF, -1, true},   {0xFF41, 0xFF5A, -32, false},
};

// Upper case of one UTF-16 unit, the form in which the registry compares and orders names.
// Windows folds with its own up-case table, not ASCII only (a key made as "Été" opens as "éTÉ");
// the simple mappings of these alphabets stand in for it.
char16_t upcase(char16_t c) {
    if (c < 0x80) return (c >= u'a' && c <= u'z') ? static_cast<char16_t>(c - 32) : c;
    for (const CaseRange& r : CaseRanges) {
        if (c < r.first || c > r.last) continue;
        if (r.alternating && (c - r.first) % 2 != 0) return c;
        return static_cast<char16_t>(c + r.delta);
    }
    return c;
}

// Keys below HKLM\SOFTWARE that a 32-bit process shares with 64-bit ones (Windows 7 and later);
// their subkeys are shared too. Every other key below SOFTWARE has a 32-bit copy in Wow6432Node.
const char16_t* const SharedBelowSoftware[] = {
    u"Classes",
    u"Clients",
    u"Policies",
    u"RegisteredApplications",
    u"Microsoft\\COM3",
    u"Microsoft\\Cryptography\\Calais\\Current",
    u"Microsoft\\Cryptography\\Calais\\Readers",
    u"Microsoft\\Cryptography\\Services",
    u"Microsoft\\CTF\\SystemShared",
    u"Microsoft\\CTF\\TIP",
    u"Microsoft\\DFS",
    u"Microsoft\\Driver Signing",
    u"Microsoft\\EnterpriseCertificates",
    u"Microsoft\\EventSystem",
    u"Microsoft\\MSMQ",
    u"Microsoft\\Non-Driver Signing",
    u"Microsoft\\Notepad\\DefaultFonts",
    u"Microsoft\\OLE",
    u"Microsoft\\RAS",
    u"Microsoft\\RPC",
    u"Microsoft\\Shared Tools\\MSInfo",
    u"Microsoft\\SystemCertificates",
    u"Microsoft\\TermServLicensing",
    u"Microsoft\\TransactionServer",
    u"Microsoft\\Windows\\CurrentVersion\\App Paths",
    u"Microsoft\\Windows\\CurrentVersion\\Control Panel\\Cursors\\Schemes",
    u"Microsoft\\Windows\\CurrentVersion\\Explorer\\AutoplayHandlers",
    u"Microsoft\\Windows\\CurrentVersion\\Explorer\\DriveIcons",
    u"Microsoft\\Windows\\CurrentVersion\\Explorer\\KindMap",
    u"Microsoft\\Windows\\CurrentVersion\\Group Policy",
    u"Microsoft\\Windows\\CurrentVersion\\Policies",
    u"Microsoft\\Windows\\CurrentVersion\\PreviewHandlers",
    u"Microsoft\\Windows\\CurrentVersion\\Setup",
    u"Microsoft\\Windows\\CurrentVersion\\Telephony\\Locations",
    u"Microsoft\\Windows NT\\CurrentVersion\\Console",
    u"Microsoft\\Windows NT\\CurrentVersion\\FontDpi",
    u"Microsoft\\Windows NT\\CurrentVersion\\FontLink",
    u"Microsoft\\Windows NT\\CurrentVersion\\FontMapper",
    u"Microsoft\\Windows NT\\CurrentVersion\\Fonts",
    u"Microsoft\\Windows NT\\CurrentVersion\\FontSubstitutes",
    u"Microsoft\\Windows NT\\CurrentVersion\\Gre_Initialize",
    u"Microsoft\\Windows NT\\CurrentVersion\\Image File Execution Options",
    u"Microsoft\\Windows NT\\CurrentVersion\\Language Pack",
    u"Microsoft\\Windows NT\\CurrentVersion\\NetworkCards",
    u"Microsoft\\Windows NT\\CurrentVersion\\Perflib",
    u"Microsoft\\Windows NT\\CurrentVersion\\Ports",
    u"Microsoft\\Windows NT\\CurrentVersion\\Print",
    u"Microsoft\\Windows NT\\CurrentVersion\\ProfileList",
    u"Microsoft\\Windows NT\\CurrentVersion\\Time Zones",
};

constexpr std::u16string_view SoftwareName = u"SOFTWARE";
constexpr std::u16string_view Wow6432NodeName = u"Wow6432Node";

Names splitTrusted(std::u16string_view path) {
    Names out;
    size_t start = 0;
    for (size_t i = 0; i <= path.size(); ++i) {
        if (i < path.size() && path[i] != u'\\') continue;
        if (i > start) out.push_back(path.substr(start, i - start));
        start = i + 1;
    }
    return out;
}

// Keys below the shared Classes key that have a 32-bit copy all the same (Windows 7 and later).
const char16_t* const RedirectedInShared[] = {
    u"Classes\\CLSID",      u"Classes\\DirectShow",      u"Classes\\Interface",
    u"Classes\\Media Type", u"Classes\\MediaFoundation",
};

template <size_t n>
std::vector<Names>* splitAll(const char16_t* const (&paths)[n]) {
    auto* table = new std::vector<Names>;
    for (const char16_t* path : paths) table->push_back(splitTrusted(path));
    return table;
}

// Whether `path` lies in one of the keys of `table`.
bool inAny(const std::vector<Names>& table, const Names& path) {
    for (const Names& entry : table) {
        if (entry.size() > path.size()) continue;
        bool match = true;
        for (size_t i = 0; match && i < entry.size(); ++i) match = sameName(entry[i], path[i]);
        if (match) return true;
    }
    return false;
}

// Whether a path below HKLM\SOFTWARE lies in one of the shared keys.
bool isShared(const Names& belowSoftware) {
    static const std::vector<Names>* shared = splitAll(SharedBelowSoftware);
    static const std::vector<Names>* redirected = splitAll(RedirectedInShared);
    return inAny(*shared, belowSoftware) && !inAny(*redirected, belowSoftware);
}

// Names from the root down to `key`, the key's own name last.
Names pathOf(const Key& key) {
    Names out(key.depth);
    for (const Key* k = &key; k && k->depth > 0; k = k->parent) out[k->depth - 1] = k->name;
    return out;
}

// The physical path of a path below HKLM that starts with SOFTWARE. In the 32-bit image every
// key below SOFTWARE but the shared ones lives under SOFTWARE\Wow6432Node; a path that already
// names Wow6432Node (given by the caller or reached through a handle) is in that image whatever
// the view, so nothing is redirected twice and a 32-bit handle still reaches the shared keys.
Names mapSoftware(const Names& full, bool view32) {
    Names tail(full.begin() + 1, full.end());
    bool image32 = view32;
    if (!tail.empty() && sameName(tail.front(), Wow6432NodeName)) {
        image32 = true;
        tail.erase(tail.begin());
    }
    Names out{full.front()};
    if (image32 && !isShared(tail)) out.push_back(Wow6432NodeName);
    out.insert(out.end(), tail.begin(), tail.end());
    return out;
}

KeyRef makeKey(std::u16string_view name, Key* parent, unsigned root) {
    auto key = std::make_shared<Key>();
    key->name = std::u16string(name);
    key->parent = parent;
    key->root = root;
    key->depth = parent ? parent->depth + 1 : 0;
    return key;
}

Key& addChild(Key& parent, std::u16string_view name) {
    KeyRef child = makeKey(name, &parent, parent.root);
    Key& made = *child;
    parent.children.emplace(fold(name), std::move(child));
    touch(parent);
    return made;
}

Key& ensurePath(Key& from, std::u16string_view path) {
    Key* k = &from;
    for (std::u16string_view name : splitTrusted(path)) {
        Key* next = findChild(*k, name);
        k = next ? next : &addChild(*k, name);
    }
    return *k;
}

}  // namespace

std::u16string fold(std::u16string_view name) {
    std::u16string out(name);
    for (char16_t& c : out) c = upcase(c);
    return out;
}

bool sameName(std::u16string_view a, std::u16string_view b) {
    if (a.size() != b.size()) return false;
    for (size_t i = 0; i < a.size(); ++i)
        if (upcase(a[i]) != upcase(b[i])) return false;
    return true;
}

int compareFolded(std::u16string_view folded, std::u16string_view raw) {
    size_t common = std::min(folded.size(), raw.size());
    for (size_t i = 0; i < common; ++i) {
        char16_t f = folded[i], r = upcase(raw[i]);
        if (f != r) return f < r ? -1 : 1;
    }
    return folded.size() < raw.size() ? -1 : folded.size() > raw.size() ? 1 : 0;
}

Registry& registry() {
    // Never destroyed: the layer may be called during exit.
    static Registry* r = [] {
        auto* fresh = new Registry;
        rebuild(*fresh);
        return fresh;
    }();
    return *r;
}

// HKEY_CLASSES_ROOT is a root of its own here, shared by both views. Windows shows there a merge
// of HKLM\SOFTWARE\Classes and HKCU\Software\Classes, and redirects its CLSID, Interface,
// DirectShow, Media Type and MediaFoundation subkeys for 32-bit processes; neither is modelled.
void rebuild(Registry& r) {
    r.handles.clear();
    for (unsigned i = 0; i < RootCount; ++i) r.roots[i] = makeKey(u"", nullptr, i);
    ensurePath(*r.roots[MachineRoot], u"SOFTWARE\\Wow6432Node");
    ensurePath(*r.roots[MachineRoot], u"SOFTWARE\\Classes");
    ensurePath(*r.roots[1], u"Software");
}

// ---- handles ----

namespace {

// Root index of a predefined handle value, or -1. Windows takes every value of the form
// 0x8000000n as predefined; the five it serves here are HKCR, HKCU, HKLM, HKU and HKCC.
int predefinedRoot(HKEY handle) {
    auto value = reinterpret_cast<uintptr_t>(handle);
    switch (value & 0xFFFFFFFFu) {
        case 0x80000000u: return 0;
        case 0x80000001u: return 1;
        case 0x80000002u: return 2;
        case 0x80000003u: return 3;
        case 0x80000005u: return 4;
        default: return -1;
    }
}

}  // namespace

bool isPredefined(HKEY handle) {
    return (reinterpret_cast<uintptr_t>(handle) & 0xF0000000u) == 0x80000000u;
}

LONG bind(Registry& r, HKEY handle, Bound& out) {
    int root = isPredefined(handle) ? predefinedRoot(handle) : -1;
    if (root >= 0) {
        Key& key = *r.roots[root];
        out = Bound{&key, KEY_ALL_ACCESS & ~key.denied, true, root == 0};
        return ERROR_SUCCESS;
    }
    auto it = r.handles.find(reinterpret_cast<uintptr_t>(handle));
    if (it == r.handles.end()) return ERROR_INVALID_HANDLE;
    out = Bound{it->second.key.get(), it->second.granted, false, false};
    return ERROR_SUCCESS;
}

LONG bindFor(Registry& r, HKEY handle, DWORD needed, Bound& out) {
    if (LONG code = bind(r, handle, out)) return code;
    // Windows checks the handle's rights when it references the handle, before the key's state.
    if ((out.granted & needed) != needed) return ERROR_ACCESS_DENIED;
    if (out.key->deleted) return ERROR_KEY_DELETED;
    return ERROR_SUCCESS;
}

HKEY addHandle(Registry& r, Key& key, DWORD granted) {
    uintptr_t value = r.nextHandle;
    r.nextHandle += 4;
    r.handles.emplace(value, OpenHandle{key.shared_from_this(), granted});
    return reinterpret_cast<HKEY>(value);
}

// ---- paths and views ----

LONG checkLeading(const WCHAR* path, const Bound& start) {
    // HKEY_CLASSES_ROOT accepts a leading backslash ("\\CLSID"), every other key refuses it.
    if (path && path[0] == u'\\' && !start.classesRoot) return ERROR_BAD_PATHNAME;
    return ERROR_SUCCESS;
}

LONG splitPath(const WCHAR* path, Names& out) {
    out = path ? splitTrusted(path) : Names{};
    for (std::u16string_view name : out)
        if (name.size() > MaxKeyNameLength) return ERROR_INVALID_PARAMETER;
    return ERROR_SUCCESS;
}

Route route(Registry& r, Key& start, const Names& names, REGSAM sam) {
    if (start.root != MachineRoot || names.empty()) return Route{&start, names};
    Names full = pathOf(start);
    full.insert(full.end(), names.begin(), names.end());
    if (!sameName(full.front(), SoftwareName)) return Route{&start, names};
    // A 32-bit process sees the 32-bit view unless the call asks for the 64-bit one.
    bool view32 = (sam & KEY_WOW64_64KEY) == 0;
    return Route{r.roots[MachineRoot].get(), mapSoftware(full, view32)};
}

// ---- tree ----

Key* findChild(const Key& parent, std::u16string_view name) {
    auto it = parent.children.find(RawName{name});
    return it == parent.children.end() ? nullptr : it->second.get();
}

Key* findKey(Key& from, const Names& names) {
    Key* k = &from;
    for (size_t i = 0; k && i < names.size(); ++i) k = findChild(*k, names[i]);
    return k;
}

LONG createPath(Key& from, const Names& names, Key*& out, bool& created) {
    Key* k = &from;
    size_t i = 0;
    for (Key* next; i < names.size() && (next = findChild(*k, names[i])); ++i) k = next;
    created = i < names.size();
    if (created) {
        // Windows documents both limits without the code it gives beyond them, and Wine
        // enforces neither; 87, as for the documented limits of names.
        if (from.depth + names.size() > MaxDepth) return ERROR_INVALID_PARAMETER;
        if (names.size() - i > MaxNewLevels) return ERROR_INVALID_PARAMETER;
        if (k->denied & KEY_CREATE_SUB_KEY) return ERROR_ACCESS_DENIED;
        for (; i < names.size(); ++i) k = &addChild(*k, names[i]);
    }
    out = k;
    return ERROR_SUCCESS;
}

LONG removeKey(Key& key) {
    Key* parent = key.parent;
    // Roots cannot be deleted; Windows refuses a key with subkeys with 5 as well.
    if (!parent || !key.children.empty() || (key.denied & DELETE)) return ERROR_ACCESS_DENIED;
    key.deleted = true;
    key.parent = nullptr;
    parent->children.erase(parent->children.find(RawName{key.name}));  // may destroy `key`
    touch(*parent);
    return ERROR_SUCCESS;
}

const Key* childAt(Key& parent, size_t index) {
    if (index >= parent.children.size()) return nullptr;
    if (!parent.cursorValid || parent.cursorIndex > index) {
        parent.cursor = parent.children.begin();
        parent.cursorIndex = 0;
        parent.cursorValid = true;
    }
    for (; parent.cursorIndex < index; ++parent.cursorIndex) ++parent.cursor;
    return parent.cursor->second.get();
}

void touch(Key& key) {
    key.cursorValid = false;  // the enumeration cursor may point at a child that is gone
}

}  // namespace w32::reg
