// Keys: predefined roots, what a create reports, the spelling kept, and the tree's limits.
#include "registry_fixture.h"

namespace {

using RegistryKeys = RegistryTest;

TEST_F(RegistryKeys, PredefinedRootsOpenAsThemselvesButCreateNewHandles) {
    for (HKEY root : {HKEY_CLASSES_ROOT, kUser, kMachine, HKEY_USERS, HKEY_CURRENT_CONFIG}) {
        HKEY same = nullptr, alsoSame = nullptr;
        EXPECT_EQ(RegOpenKeyExW(root, u"", 0, KEY_READ, &same), 0);
        EXPECT_EQ(RegOpenKeyExW(root, nullptr, 0, KEY_READ, &alsoSame), 0);
        EXPECT_EQ(same, root);  // Windows hands back the predefined value itself
        EXPECT_EQ(alsoSame, root);
        HKEY fresh = create(root, u"");  // while RegCreateKeyExW makes a new handle
        EXPECT_NE(fresh, root);
        EXPECT_EQ(w32test::openHandleCount(), 1u);
        EXPECT_EQ(RegCloseKey(fresh), 0);
        EXPECT_EQ(RegCloseKey(fresh), 6);
        EXPECT_EQ(RegCloseKey(root), 0);
        make(root, u"StillUsable");
    }
    EXPECT_EQ(w32test::openHandleCount(), 0u);
}

TEST_F(RegistryKeys, FirstCreatorsSpellingWinsAndDispositionTellsNewFromExisting) {
    DWORD disposition = 0;
    EXPECT_EQ(tryCreate(kUser, u"Parent\\MixedCase", KEY_READ, &disposition), 0);
    EXPECT_EQ(disposition, DWORD(REG_CREATED_NEW_KEY));
    EXPECT_EQ(tryCreate(kUser, u"PARENT\\MIXEDCASE\\", KEY_READ, &disposition), 0);
    EXPECT_EQ(disposition, DWORD(REG_OPENED_EXISTING_KEY));
    HKEY parent = create(kUser, u"parent");
    EXPECT_EQ(subkeyAt(parent, 0), u"MixedCase");
    HKEY again = reinterpret_cast<HKEY>(1);
    EXPECT_EQ(RegOpenKeyExW(parent, u"", 0, KEY_READ, &again), 0);  // a new handle, same key
    EXPECT_NE(again, parent);
    EXPECT_EQ(subkeyAt(again, 0), u"MixedCase");
    RegCloseKey(again);
    RegCloseKey(parent);
}

// Windows documents 512 levels and 32 new levels per call without naming the code; 87 here.
TEST_F(RegistryKeys, TreeIsAtMost512LevelsAndOneCallCreatesAtMost32) {
    std::u16string levels32;
    for (int i = 0; i < 32; ++i) levels32 += u"d\\";
    HKEY key = create(kUser, u"");
    for (int call = 0; call < 16; ++call) {  // 16 x 32 = 512 levels
        HKEY deeper = create(key, levels32);
        RegCloseKey(key);
        key = deeper;
    }
    HKEY extra = reinterpret_cast<HKEY>(1);
    EXPECT_EQ(RegCreateKeyExW(key, u"d", 0, nullptr, 0, KEY_READ, nullptr, &extra, nullptr), 87);
    EXPECT_EQ(extra, nullptr);
    EXPECT_EQ(probe(key, u"d"), 2);
    RegCloseKey(key);
    EXPECT_EQ(tryCreate(HKEY_USERS, levels32 + u"d"), 87);
    EXPECT_EQ(probe(HKEY_USERS, u"d"), 2);  // nothing half-created
}

}  // namespace
