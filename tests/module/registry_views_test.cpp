// The object's view flag against the registry's two copies of HKEY_LOCAL_MACHINE\SOFTWARE. The
// module ships as a 32-bit program: its default view is the 32-bit copy, which the 64-bit view
// sees as SOFTWARE\Wow6432Node; the flag reaches the 64-bit copy. The 32-bit Windows build
// checks this against Wine's registry in a 32-bit process, the Linux builds against the portable
// layer, which plays that process. A 64-bit Windows process has the 64-bit copy as its default
// view, so it runs only the cases that do not depend on the default.
#include "registry_fixture.h"

namespace hvreg {
namespace {

const HKEY Machine = HKEY_LOCAL_MACHINE;
constexpr REGSAM View64 = KEY_WOW64_64KEY;
constexpr REGSAM View32 = KEY_WOW64_32KEY;
constexpr uint32_t MachineIndex = 1;  // HKEY_LOCAL_MACHINE's root index

// Deletes `path` with its subkeys in one view; a missing key is no fault.
void deleteTree(HKEY root, const std::u16string& path, REGSAM view) {
    HKEY key = nullptr;
    if (RegOpenKeyExW(root, wstr(path), 0, KEY_ENUMERATE_SUB_KEYS | view, &key)) return;
    WCHAR name[256];
    DWORD length = 256;
    while (RegEnumKeyExW(key, 0, name, &length, nullptr, nullptr, nullptr, nullptr) == 0) {
        deleteTree(key, std::u16string(reinterpret_cast<const char16_t*>(name), length), view);
        length = 256;
    }
    RegCloseKey(key);
    RegDeleteKeyExW(root, wstr(path), view, 0);
}

class RegistryViews : public RegistryFixture {
protected:
    void TearDown() override {
        for (REGSAM view : {View32, View64}) deleteTree(Machine, software(), view);
        RegistryFixture::TearDown();
    }
    // The test's own key below SOFTWARE, and the path under which the 64-bit view sees its
    // 32-bit copy.
    std::u16string software(const std::u16string& sub = u"") const {
        return u"SOFTWARE\\" + scratchName() + (sub.empty() ? u"" : u"\\" + sub);
    }
    std::u16string wow6432(const std::u16string& sub = u"") const {
        return u"SOFTWARE\\Wow6432Node\\" + scratchName() + (sub.empty() ? u"" : u"\\" + sub);
    }
    static bool defaultViewIs32Bit() { return Layer || sizeof(void*) == 4; }

    Param root() const { return Param::rootKey(MachineIndex); }
    Param key(const std::u16string& sub = u"") const { return Param::str(software(sub)); }
    static Param text(const char16_t* s) { return Param::str(s); }
    void selectMachineKey() {
        act(SetRootKey, {root()});
        act(SetCurrentKey, {key()});
    }
    int32_t dword(const char16_t* name) {
        return expr(GetDword, {Param::str(RootNames[MachineIndex]), key(), text(name)}).asInteger();
    }
    std::u16string string(const char16_t* name) {
        return expr(GetString, {Param::str(RootNames[MachineIndex]), key(), text(name)}).text;
    }
    // The two copies of the test's key: "32" and "64" each hold a value of their own, and "v"
    // holds 32 in the 32-bit copy and 64 in the 64-bit one; the 32-bit copy has the subkey T.
    void twins() {
        view64(false);
        act(SetDword, {root(), key(), text(u"v"), Param::integerValue(32)});
        act(SetString, {root(), key(), text(u"32"), text(u"only in 32")});
        act(CreateKey, {root(), key(u"T")});
        view64(true);
        act(SetDword, {root(), key(), text(u"v"), Param::integerValue(64)});
        act(SetString, {root(), key(), text(u"64"), text(u"only in 64")});
        EXPECT_EQ(instance.lastError(), 0u);
    }
};

// Where a default-view write lands: in the 32-bit copy, which a 64-bit reader finds only under
// SOFTWARE\Wow6432Node, with the raw registry calls and with the module's own 64-bit reader.
TEST_F(RegistryViews, DefaultViewWritesLandUnderWow6432Node) {
    if (!defaultViewIs32Bit()) GTEST_SKIP() << "a 64-bit process's default view is the 64-bit copy";
    act(SetDword, {root(), key(), text(u"v"), Param::integerValue(32)});
    ASSERT_EQ(instance.lastError(), 0u);
    EXPECT_EQ(stored(Machine, software(), u"v", View32), "4: 20 00 00 00");
    EXPECT_EQ(stored(Machine, wow6432(), u"v", View64), "4: 20 00 00 00");
    EXPECT_EQ(stored(Machine, software(), u"v", View64), "error 2");
    view64(true);
    EXPECT_EQ(dword(u"v"), 0);
    EXPECT_EQ(instance.lastError(), 2u);
    EXPECT_EQ(
        expr(GetDword, {Param::str(RootNames[MachineIndex]), Param::str(wow6432()), text(u"v")})
            .asInteger(),
        32);
    EXPECT_EQ(cond(KeyExists, {root(), Param::str(wow6432())}).asCondition(), 1);
    EXPECT_EQ(cond(KeyExists, {root(), key()}).asCondition(), 0);
}

// With the flag every write goes to the 64-bit copy and the 32-bit copy stays without it; this
// holds in a process of either kind.
TEST_F(RegistryViews, The64BitViewWritesLandInThe64BitCopy) {
    view64(true);
    act(SetString, {root(), key(u"Sub"), text(u"s"), text(u"wide")});
    act(CreateKey, {root(), key(u"Made")});
    EXPECT_EQ(instance.lastError(), 0u);
    EXPECT_EQ(stored(Machine, software(u"Sub"), u"s", View64), shown(REG_SZ, u"wide"));
    EXPECT_TRUE(exists(Machine, software(u"Made"), View64));
    EXPECT_EQ(stored(Machine, software(u"Sub"), u"s", View32), "error 2");
    EXPECT_FALSE(exists(Machine, software(u"Made"), View32));
    EXPECT_FALSE(exists(Machine, wow6432(), View64));
}

// Each kind of routine, on a named key and on the current key, sees only the copy of its view.
TEST_F(RegistryViews, ExistenceReadersAndWritersEachHonourTheView) {
    if (!defaultViewIs32Bit()) GTEST_SKIP() << "a 64-bit process's default view is the 64-bit copy";
    twins();
    selectMachineKey();
    for (bool on : {false, true}) {
        SCOPED_TRACE(on ? "64-bit view" : "default view");
        view64(on);
        const char16_t* mine = on ? u"64" : u"32";
        const char16_t* theirs = on ? u"32" : u"64";
        EXPECT_EQ(cond(KeyExists, {root(), key()}).asCondition(), 1);
        EXPECT_EQ(cond(KeyExists, {root(), key(u"T")}).asCondition(), on ? 0 : 1);
        EXPECT_EQ(cond(ValueExists, {root(), key(), text(mine)}).asCondition(), 1);
        EXPECT_EQ(cond(ValueExists, {root(), key(), text(theirs)}).asCondition(), 0);
        EXPECT_EQ(cond(CurrentKeyExists).asCondition(), 1);
        EXPECT_EQ(cond(CurrentValueExists, {text(theirs)}).asCondition(), 0);
        EXPECT_EQ(dword(u"v"), on ? 64 : 32);
        EXPECT_EQ(expr(GetCurrentDword, {text(u"v")}).asInteger(), on ? 64 : 32);
        EXPECT_EQ(string(mine), on ? u"only in 64" : u"only in 32");
        EXPECT_EQ(expr(GetCurrentString, {text(theirs)}).text, u"");
        EXPECT_EQ(instance.lastError(), 2u);
        act(SetCurrentDword, {text(u"w"), Param::integerValue(on ? 640 : 320)});
        act(DeleteCurrentValue, {text(mine)});
        EXPECT_EQ(instance.lastError(), 0u);
    }
    EXPECT_EQ(stored(Machine, software(), u"w", View32), "4: 40 01 00 00");
    EXPECT_EQ(stored(Machine, software(), u"w", View64), "4: 80 02 00 00");
    for (REGSAM view : {View32, View64}) {
        EXPECT_EQ(stored(Machine, software(), u"32", view), "error 2");
        EXPECT_EQ(stored(Machine, software(), u"64", view), "error 2");
    }
    view64(true);
    act(DeleteValue, {root(), key(), text(u"v")});
    EXPECT_EQ(stored(Machine, software(), u"v", View64), "error 2");
    EXPECT_EQ(stored(Machine, software(), u"v", View32), "4: 20 00 00 00");
}

// Deleting a tree in one view leaves the other view's twin, subkeys and values, intact.
TEST_F(RegistryViews, TreeDeletionInOneViewLeavesTheOtherViewsTwin) {
    if (!defaultViewIs32Bit()) GTEST_SKIP() << "a 64-bit process's default view is the 64-bit copy";
    twins();
    view64(true);
    act(CreateKey, {root(), key(u"W\\Deep")});
    act(DeleteKey, {root(), key()});
    EXPECT_EQ(instance.lastError(), 0u);
    EXPECT_FALSE(exists(Machine, software(), View64));
    EXPECT_TRUE(exists(Machine, software(u"T"), View32));
    EXPECT_EQ(stored(Machine, software(), u"32", View32), shown(REG_SZ, u"only in 32"));
    view64(false);
    selectMachineKey();
    act(DeleteCurrentKey);
    EXPECT_EQ(instance.lastError(), 0u);
    EXPECT_FALSE(exists(Machine, software(), View32));
    EXPECT_FALSE(exists(Machine, wow6432(), View64));
}

// HKEY_CURRENT_USER\Software is shared: what one view writes, the other reads and deletes.
TEST_F(RegistryViews, SharedKeysAreOneKeyInBothViews) {
    const Param user = Param::rootKey(User), path = Param::str(at(u"Shared"));
    view64(true);
    act(SetDword, {user, path, text(u"v"), Param::integerValue(5)});
    view64(false);
    EXPECT_EQ(expr(GetDword, {Param::str(RootNames[User]), path, text(u"v")}).asInteger(), 5);
    EXPECT_EQ(stored(CurrentUser, at(u"Shared"), u"v", View32), "4: 05 00 00 00");
    act(DeleteKey, {user, path});
    EXPECT_EQ(instance.lastError(), 0u);
    view64(true);
    EXPECT_EQ(cond(KeyExists, {user, path}).asCondition(), 0);
    EXPECT_FALSE(exists(CurrentUser, at(u"Shared"), View64));
}

}  // namespace
}  // namespace hvreg
