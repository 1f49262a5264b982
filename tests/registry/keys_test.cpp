// Keys: predefined roots, what a create reports, the spelling kept, and the tree's limits.
#include "registry_fixture.h"

#include <algorithm>

namespace {

using RegistryKeys = RegistryTest;

TEST_F(RegistryKeys, PredefinedRootsOpenAsThemselvesButCreateNewHandles) {
    for (HKEY root :
         {HKEY_CLASSES_ROOT, CurrentUser, LocalMachine, HKEY_USERS, HKEY_CURRENT_CONFIG}) {
        HKEY same = nullptr, alsoSame = nullptr;
        EXPECT_EQ(RegOpenKeyExW(root, TEXT(""), 0, KEY_READ, &same), 0);
        EXPECT_EQ(RegOpenKeyExW(root, nullptr, 0, KEY_READ, &alsoSame), 0);
        EXPECT_EQ(same, root);  // Windows hands back the predefined value itself
        EXPECT_EQ(alsoSame, root);
        HKEY fresh = create(root, TEXT(""));  // while RegCreateKeyExW makes a new handle
        EXPECT_NE(fresh, root);
        EXPECT_EQ(RegCloseKey(fresh), 0);
        EXPECT_EQ(RegCloseKey(fresh), 6);
        EXPECT_EQ(RegCloseKey(root), 0);
        // Still usable: a missing value is missing (2), not a closed handle (6).
        EXPECT_EQ(RegQueryValueExW(root, id.c_str(), nullptr, nullptr, nullptr, nullptr), 2);
    }
}

TEST_F(RegistryKeys, FirstCreatorsSpellingWinsAndDispositionTellsNewFromExisting) {
    DWORD disposition = 0;
    EXPECT_EQ(tryCreate(user, TEXT("Parent\\MixedCase"), KEY_READ, &disposition), 0);
    EXPECT_EQ(disposition, DWORD(REG_CREATED_NEW_KEY));
    EXPECT_EQ(tryCreate(user, TEXT("PARENT\\MIXEDCASE\\"), KEY_READ, &disposition), 0);
    EXPECT_EQ(disposition, DWORD(REG_OPENED_EXISTING_KEY));
    HKEY parent = create(user, TEXT("parent"));
    EXPECT_EQ(subkeyAt(parent, 0), TEXT("MixedCase"));
    HKEY again = reinterpret_cast<HKEY>(1);
    EXPECT_EQ(RegOpenKeyExW(parent, TEXT(""), 0, KEY_READ, &again), 0);  // a new handle
    EXPECT_NE(again, parent);
    EXPECT_EQ(subkeyAt(again, 0), TEXT("MixedCase"));
    RegCloseKey(again);
    RegCloseKey(parent);
}

// "" and NULL open the key itself, which existed: REG_OPENED_EXISTING_KEY by the definition of
// the two dispositions.
TEST_F(RegistryKeys, CreatingTheKeyItselfOpensIt) {
    HV_WINE_DIFFERS("reports REG_CREATED_NEW_KEY for \"\" and NULL, in both process kinds");
    for (const WCHAR* path : {TEXT(""), static_cast<const WCHAR*>(nullptr)}) {
        DWORD disposition = 0;
        HKEY same = nullptr;
        EXPECT_EQ(
            RegCreateKeyExW(user, path, 0, nullptr, 0, KEY_READ, nullptr, &same, &disposition), 0);
        EXPECT_EQ(disposition, DWORD(REG_OPENED_EXISTING_KEY));
        RegCloseKey(same);
    }
}

// Windows documents 512 levels and 32 new levels per call; the code it gives beyond them is
// recorded nowhere, and Wine enforces neither (700 levels, 600 in one call). 87 here, as for
// names too long.
TEST_F(RegistryKeys, TreeIsAtMost512LevelsAndOneCallCreatesAtMost32) {
    HV_WINE_DIFFERS("enforces neither the 512-level depth nor 32 new levels per call");
    HKEY key = create(user, TEXT(""));
    for (unsigned depth = 3; depth < 512;) {  // user is 3 levels below HKEY_CURRENT_USER
        unsigned step = std::min(32u, 512 - depth);
        HKEY deeper = create(key, levels(step, TEXT("d")));
        RegCloseKey(key);
        key = deeper;
        depth += step;
    }
    HKEY extra = reinterpret_cast<HKEY>(1);
    EXPECT_EQ(RegCreateKeyExW(key, TEXT("d"), 0, nullptr, 0, KEY_READ, nullptr, &extra, nullptr),
              87);
    EXPECT_EQ(extra, nullptr);
    EXPECT_EQ(probe(key, TEXT("d")), 2);
    RegCloseKey(key);
    EXPECT_EQ(tryCreate(user, levels(33, TEXT("e"))), 87);
    EXPECT_EQ(probe(user, TEXT("e")), 2);  // nothing half-created
}

}  // namespace
