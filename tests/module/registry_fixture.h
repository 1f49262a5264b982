// Shared fixture of the registry routines' tests: a fresh registry (Linux) or a scratch key
// (Windows), raw Win32 helpers to set up and inspect it, checked events, and one table of every
// registry routine so that guards, masks and faults are tested over all of them.
#pragma once

#include "support.h"

#include <sstream>
#include <string>
#include <tuple>
#include <vector>

#if !HV_HAS_TEST_CONTROL
// Windows builds have no layer to control. These stand-ins only let the Linux-only tests
// compile: HV_NEEDS_TEST_CONTROL() skips them before any is reached.
namespace w32test {
struct Call {
    std::string function;
    std::vector<uint64_t> args;
};
inline void reset() {}
inline void clearJournal() {}
inline std::vector<Call> journal() { return {}; }
inline size_t count(const char*) { return 0; }
inline void failCall(const std::string&, unsigned, long) {}
inline void denyAccess(HKEY, const std::u16string&, DWORD) {}
inline void hideExport(const char*, bool) {}
inline void setVersionFault(bool) {}
inline void setPlatformId(DWORD) {}
inline size_t liveAllocations() { return 0; }
inline size_t openHandleCount() { return 0; }
}  // namespace w32test
#endif

namespace hvreg {

using hv::Param;
using Bytes = std::vector<BYTE>;

enum { KeyExists, ValueExists, CurrentKeyExists, CurrentValueExists, LastActionSuccessful };
enum {
    SetRootKey,
    SetCurrentKey,
    SetCurrentDword,
    SetCurrentString,
    SetDword,
    SetString,
    DeleteCurrentKey,
    DeleteCurrentValue,
    DeleteKey,
    DeleteValue,
    CreateCurrentKey,
    CreateKey,
    Set64BitMode
};
enum { GetCurrentKey = 1, GetCurrentDword, GetCurrentString, GetDword, GetString };

constexpr bool Layer = HV_HAS_TEST_CONTROL;  // the portable layer, with journal and faults
constexpr uint32_t User = 2;                 // HKEY_CURRENT_USER's root index
constexpr uint32_t Untouched = 0x5A5A;       // a lastError no routine sets
const HKEY CurrentUser = HKEY_CURRENT_USER;
const char16_t* const RootNames[5] = {u"HKEY_CLASSES_ROOT", u"HKEY_LOCAL_MACHINE",
                                      u"HKEY_CURRENT_USER", u"HKEY_CURRENT_CONFIG", u"HKEY_USERS"};

inline LPCWSTR wstr(const std::u16string& s) { return hvtest::wide(s.c_str()); }
inline uint64_t handleValue(HKEY root) { return reinterpret_cast<uintptr_t>(root); }
inline Bytes textBytes(const std::u16string& text, bool terminated = true) {
    Bytes out;
    for (char16_t c : text) out.insert(out.end(), {BYTE(c), BYTE(c >> 8)});
    if (terminated) out.insert(out.end(), {0, 0});
    return out;
}
// A value as the tests compare it: "type: hex bytes", or "error code".
inline std::string shown(LONG code, DWORD type, const Bytes& data) {
    std::string out = code ? "error " + std::to_string(code) : std::to_string(type) + ":";
    for (BYTE b : data) out += {' ', "0123456789abcdef"[b >> 4], "0123456789abcdef"[b & 15]};
    return out;
}
inline std::string shown(DWORD type, const std::u16string& text) {
    return shown(0, type, textBytes(text));
}

// One registry routine: the event's parameters and how the routine gets them.
enum class Arg { Root, RootName, Path, Name, Dword, Text };
enum class Group { Condition, DwordReader, StringReader, Writer, KeyDelete, ValueDelete };
struct Op {
    const char* routine;
    hv::EventKind kind;
    int code;
    Group group;
    std::vector<Arg> args;
    bool fetched;           // takes its parameters through GetNextParameter
    const char16_t* value;  // the standard scene's value it reads, writes or deletes
    bool current() const {  // works on the instance's current key
        for (Arg a : args)
            if (a == Arg::Root || a == Arg::RootName) return false;
        return true;
    }
};
inline const std::vector<Op>& ops() {
    using A = Arg;
    using G = Group;
    const auto C = hv::EventKind::Condition, X = hv::EventKind::Action,
               E = hv::EventKind::Expression;
    static const std::vector<Op> table = {
        {"CndKeyExists", C, KeyExists, G::Condition, {A::Root, A::Path}, false, nullptr},
        {"CndValueExists", C, ValueExists, G::Condition, {A::Root, A::Path, A::Name}, true, u"s"},
        {"CndCurrentKeyExists", C, CurrentKeyExists, G::Condition, {}, false, nullptr},
        {"CndCurrentValueExists", C, CurrentValueExists, G::Condition, {A::Name}, false, u"d"},
        {"ExpGetCurrentDword", E, GetCurrentDword, G::DwordReader, {A::Name}, false, u"d"},
        {"ExpGetCurrentString", E, GetCurrentString, G::StringReader, {A::Name}, false, u"s"},
        {"ExpGetDword", E, GetDword, G::DwordReader, {A::RootName, A::Path, A::Name}, false, u"d"},
        {"ExpGetString",
         E,
         GetString,
         G::StringReader,
         {A::RootName, A::Path, A::Name},
         false,
         u"s"},
        {"ActSetCurrentDword", X, SetCurrentDword, G::Writer, {A::Name, A::Dword}, false, u"d"},
        {"ActSetCurrentString", X, SetCurrentString, G::Writer, {A::Name, A::Text}, false, u"s"},
        {"ActSetDword", X, SetDword, G::Writer, {A::Root, A::Path, A::Name, A::Dword}, true, u"d"},
        {"ActSetString", X, SetString, G::Writer, {A::Root, A::Path, A::Name, A::Text}, true, u"s"},
        {"ActCreateCurrentKey", X, CreateCurrentKey, G::Writer, {}, false, nullptr},
        {"ActCreateKey", X, CreateKey, G::Writer, {A::Root, A::Path}, true, nullptr},
        {"ActDeleteCurrentKey", X, DeleteCurrentKey, G::KeyDelete, {}, false, nullptr},
        {"ActDeleteCurrentValue", X, DeleteCurrentValue, G::ValueDelete, {A::Name}, false, u"s"},
        {"ActDeleteKey", X, DeleteKey, G::KeyDelete, {A::Root, A::Path}, false, nullptr},
        {"ActDeleteValue", X, DeleteValue, G::ValueDelete, {A::Root, A::Path, A::Name}, true, u"d"},
    };
    return table;
}
using ViewCase = std::tuple<size_t, bool>;  // a routine of ops(), the 64-bit view
inline std::string viewCaseName(const ::testing::TestParamInfo<ViewCase>& info) {
    return ops()[std::get<0>(info.param)].routine +
           std::string(std::get<1>(info.param) ? "_view64" : "_default");
}

// The journal's calls other than allocations, as "Name Name ...".
inline std::string layerCalls() {
    std::string out;
    for (const w32test::Call& c : w32test::journal())
        if (c.function != "calloc" && c.function != "malloc" && c.function != "free")
            out += (out.empty() ? "" : " ") + c.function;
    return out;
}
// One function's calls in a copy of the journal: tests copy it right after the event, since
// their own inspection of the registry is journaled too.
inline std::vector<w32test::Call> callsOf(const std::vector<w32test::Call>& journal,
                                          const char* name) {
    std::vector<w32test::Call> out;
    for (const w32test::Call& c : journal)
        if (c.function == name) out.push_back(c);
    return out;
}

class RegistryFixture : public ::testing::Test {
protected:
    void SetUp() override {
        w32test::reset();
        name_ = u"HiveletTests";
#if !HV_HAS_TEST_CONTROL
        const auto* test = ::testing::UnitTest::GetInstance()->current_test_info();
        for (char c : "-" + std::to_string(GetCurrentProcessId()) + "-" + test->test_suite_name() +
                          "." + test->name())
            name_ += c == '/' ? u'_' : char16_t(c);
        base_ = u"Software\\" + name_;
        makeKey(CurrentUser, base_);
#endif
    }
    void TearDown() override {
#if !HV_HAS_TEST_CONTROL
        RegDeleteTreeW(CurrentUser, wstr(base_));
        RegDeleteKeyW(CurrentUser, wstr(base_));
        RegDeleteValueW(CurrentUser, wstr(name_));
#endif
    }

    // A scratch key's path: below the test's own key on Windows, at the root on Linux.
    std::u16string at(const std::u16string& sub) const {
        return base_.empty() ? sub : base_ + u"\\" + sub;
    }
    // A name of the test's own, for a value stored directly under HKEY_CURRENT_USER.
    const std::u16string& scratchName() const { return name_; }

    static HKEY created(HKEY root, const std::u16string& path, REGSAM view = 0) {
        HKEY key = nullptr;
        EXPECT_EQ(RegCreateKeyExW(root, wstr(path), 0, nullptr, 0, KEY_ALL_ACCESS | view, nullptr,
                                  &key, nullptr),
                  0);
        return key;
    }
    static void makeKey(HKEY root, const std::u16string& path) { RegCloseKey(created(root, path)); }
    // Stores exactly `data`: the bytes after it are not zero, so no terminator gets added.
    static void put(HKEY root, const std::u16string& path, const std::u16string& name, DWORD type,
                    Bytes data) {
        HKEY key = created(root, path);
        data.insert(data.end(), {0x7A, 0x7A});
        EXPECT_EQ(RegSetValueExW(key, wstr(name), 0, type, data.data(), DWORD(data.size() - 2)), 0);
        RegCloseKey(key);
    }
    static std::string stored(HKEY root, const std::u16string& path, const std::u16string& name,
                              REGSAM view = 0) {
        HKEY key = nullptr;
        DWORD type = 0, size = 0;
        LONG code = RegOpenKeyExW(root, wstr(path), 0, KEY_QUERY_VALUE | view, &key);
        if (!code) code = RegQueryValueExW(key, wstr(name), nullptr, &type, nullptr, &size);
        Bytes data(code ? 0 : size);
        if (!code && size)
            code = RegQueryValueExW(key, wstr(name), nullptr, &type, data.data(), &size);
        if (key && key != root) RegCloseKey(key);
        return shown(code, type, code ? Bytes() : data);
    }
    static bool exists(HKEY root, const std::u16string& path, REGSAM view = 0) {
        HKEY key = nullptr;
        if (RegOpenKeyExW(root, wstr(path), 0, KEY_QUERY_VALUE | view, &key)) return false;
        if (key != root) RegCloseKey(key);
        return true;
    }

    // Runs an event and checks that it damaged nothing, misused no host service and left no
    // handle open beyond `handlesLeftOpen`.
    hv::Outcome run(hv::EventKind kind, int code, const std::vector<Param>& params) {
        hv::Outcome o = instance.run(kind, code, params);
        EXPECT_TRUE(o.sentinelsIntact) << o.damage;
        for (const std::string& v : o.violations) ADD_FAILURE() << v;
        EXPECT_EQ(w32test::openHandleCount(), Layer ? handlesLeftOpen : 0) << "handles left open";
        return o;
    }
    hv::Outcome cond(int code, const std::vector<Param>& p = {}) {
        return run(hv::EventKind::Condition, code, p);
    }
    hv::Outcome act(int code, const std::vector<Param>& p = {}) {
        return run(hv::EventKind::Action, code, p);
    }
    hv::Outcome expr(int code, const std::vector<Param>& p) {
        return run(hv::EventKind::Expression, code, p);
    }
    void select(const std::u16string& path) {
        act(SetRootKey, {Param::rootKey(User)});
        act(SetCurrentKey, {Param::str(path)});
    }
    void view64(bool on) { act(Set64BitMode, {Param::integerValue(on)}); }
    std::string fields() {  // root index, current key (address and text) and view flag
        std::ostringstream out;
        const char16_t* key = instance.currentKey();
        out << instance.rootKeyIndex() << " " << static_cast<const void*>(key) << " "
            << hv::toUtf8(key ? key : u"") << " " << instance.use64BitView();
        return out.str();
    }
    static const void* emptyString() {  // the module's static empty text
        static const void* address =
            hv::Instance(hvtest::module()).expression(GetCurrentKey).textAddress;
        return address;
    }

    // The standard scene: key K with the DWORD d = 7, the string s = "text" and a subkey C;
    // K under HKEY_CURRENT_USER is the current key unless `selectK` is false.
    void standardScene(bool selectK = true) {
        put(CurrentUser, at(u"K"), u"d", REG_DWORD, {7, 0, 0, 0});
        put(CurrentUser, at(u"K"), u"s", REG_SZ, textBytes(u"text"));
        makeKey(CurrentUser, at(u"K\\C"));
        if (selectK) select(at(u"K"));
    }
    std::string sceneState() {
        return std::to_string(exists(CurrentUser, at(u"K"))) +
               std::to_string(exists(CurrentUser, at(u"K\\C"))) + " d " +
               stored(CurrentUser, at(u"K"), u"d") + ", s " + stored(CurrentUser, at(u"K"), u"s");
    }
    std::vector<Param> standardParams(const Op& op) {
        std::vector<Param> p;
        for (Arg a : op.args) {
            p.push_back(a == Arg::Root       ? Param::rootKey(User)
                        : a == Arg::RootName ? Param::str(RootNames[User])
                        : a == Arg::Path     ? Param::str(at(u"K"))
                        : a == Arg::Name     ? Param::str(op.value)
                        : a == Arg::Dword    ? Param::integerValue(0x12345678)
                                             : Param::str(u"new"));
        }
        return p;
    }
    hv::Outcome runOp(const Op& op, const std::vector<Param>& p) {
        return run(op.kind, op.code, p);
    }

    // Expressions fetch every argument; conditions and actions only where the table says so.
    static void expectFetches(const Op& op, const hv::Outcome& o) {
        EXPECT_EQ(o.expressionFetches, op.kind == hv::EventKind::Expression ? op.args.size() : 0u);
        EXPECT_EQ(o.parameterFetches, op.fetched ? op.args.size() : 0u);
    }
    // Result, lastError and effect of the routine's standard run when it succeeds.
    void expectSucceeded(const Op& op, const hv::Outcome& o) {
        EXPECT_EQ(instance.lastError(), op.group == Group::Condition ? Untouched : 0u);
        const std::string value = op.value ? stored(CurrentUser, at(u"K"), op.value) : "";
        if (op.group == Group::Condition || op.group == Group::DwordReader) {
            EXPECT_EQ(o.isText ? -1 : o.raw, op.group == Group::Condition ? 1 : 7);
        } else if (op.group == Group::StringReader) {
            EXPECT_EQ(o.text, u"text");
            EXPECT_EQ(o.bufferRequests, std::vector<size_t>{22});
        } else if (op.group == Group::Writer && op.value) {
            EXPECT_EQ(value, op.value[0] == u'd' ? "4: 78 56 34 12" : shown(REG_SZ, u"new"));
        } else if (op.group == Group::Writer) {  // a create leaves an existing key's values
            EXPECT_EQ(stored(CurrentUser, at(u"K"), u"d"), "4: 07 00 00 00");
        } else if (op.group == Group::ValueDelete) {
            EXPECT_EQ(value, "error 2");
        }
        EXPECT_EQ(exists(CurrentUser, at(u"K")), op.group != Group::KeyDelete);
        EXPECT_EQ(exists(CurrentUser, at(u"K\\C")), op.group != Group::KeyDelete);
    }
    // Result and lastError after a failure with `code` (40 for a refused parameter).
    void expectFailed(const Op& op, const hv::Outcome& o, DWORD code, bool inLentBuffer = false) {
        EXPECT_EQ(instance.lastError(), op.group == Group::Condition ? Untouched : code);
        if (op.group == Group::DwordReader || op.kind != hv::EventKind::Expression) {
            EXPECT_EQ(o.isText ? -1 : o.raw, 0);
            return;
        }
        EXPECT_EQ(o.text, u"");
        EXPECT_EQ(o.textSource == hv::Outcome::TextSource::LentBuffer, inLentBuffer);
        EXPECT_EQ(o.textAddress == emptyString(), !inLentBuffer);
        EXPECT_EQ(o.bufferRequests.empty(), !inLentBuffer);
    }

    hv::Instance instance{hvtest::module()};
    size_t handlesLeftOpen = 0;

private:
    std::u16string name_, base_;
};

}  // namespace hvreg
