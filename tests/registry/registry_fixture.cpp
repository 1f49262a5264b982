#include "registry_fixture.h"

namespace {

const WCHAR UserBase[] = TEXT("Software\\HiveletConformance");
const WCHAR MachineBase[] = TEXT("SOFTWARE\\HiveletConformance");

WString testName() {
    const ::testing::TestInfo* test = ::testing::UnitTest::GetInstance()->current_test_info();
    return conf::widen(std::string(test->test_suite_name()) + "." + test->name());
}

// Deletes a key and its subkeys if it exists; whatever is left of it fails the test.
void remove(HKEY root, const WString& path, REGSAM view) {
    LONG code = deleteTree(root, path, view);
    EXPECT_TRUE(code == ERROR_SUCCESS || code == ERROR_FILE_NOT_FOUND) << code;
    EXPECT_EQ(probe(root, path, KEY_READ | view), ERROR_FILE_NOT_FOUND);
}

}  // namespace

LONG deleteTree(HKEY root, const WString& path, REGSAM view) {
    struct Level {
        HKEY parent, key;
        WString name;
    };
    const REGSAM walk = TreeWalk | view;
    std::vector<Level> stack{{root, nullptr, path}};
    if (LONG code = RegOpenKeyExW(root, path.c_str(), 0, walk, &stack[0].key)) return code;
    while (!stack.empty()) {
        WCHAR name[1024];
        DWORD length = 1024;
        HKEY top = stack.back().key, child = nullptr;
        LONG code = RegEnumKeyExW(top, 0, name, &length, nullptr, nullptr, nullptr, nullptr);
        if (code == ERROR_SUCCESS) code = RegOpenKeyExW(top, name, 0, walk, &child);
        if (code == ERROR_SUCCESS) {
            stack.push_back({top, child, name});
            continue;
        }
        const Level& level = stack.back();
        if (code == ERROR_NO_MORE_ITEMS)
            code = view ? RegDeleteKeyExW(level.parent, level.name.c_str(), view, 0)
                        : RegDeleteKeyW(level.parent, level.name.c_str());
        RegCloseKey(top);
        stack.pop_back();
        if (code) return code;
    }
    return ERROR_SUCCESS;
}

void RegistryTest::SetUp() {
#if HV_OVER_LAYER
    w32test::reset();
#endif
    WString name = testName();
    id = TEXT("HiveletConformance ") + name;
    userPath = UserBase + (TEXT("\\") + name);
    machinePath = MachineBase + (TEXT("\\") + name);
    // Left over by a run that did not finish, the scratch keys go first.
    owned_ = {{CurrentUser, userPath, 0},
              {LocalMachine, machinePath, View32},
              {LocalMachine, machinePath, View64}};
    for (const Owned& o : owned_) remove(o.root, o.path, o.view);
    user = create(CurrentUser, userPath);
}

void RegistryTest::own(HKEY root, const WString& path, REGSAM view) {
    size_t end = 0;
    do {
        end = path.find(TEXT('\\'), end + 1);
        WString prefix = path.substr(0, end);
        if (probe(root, prefix, KEY_READ | view) == ERROR_FILE_NOT_FOUND) {
            owned_.push_back({root, prefix, view});
            return;
        }
    } while (end != WString::npos);
    remove(root, path, view);  // left over by a run that did not finish
    owned_.push_back({root, path, view});
}

void RegistryTest::TearDown() {
    RegCloseKey(user);
    for (auto it = owned_.rbegin(); it != owned_.rend(); ++it) remove(it->root, it->path, it->view);
    // The common parents go when the last test that used them is done; until then, 5.
    RegDeleteKeyW(CurrentUser, UserBase);
    for (REGSAM view : {View32, View64}) RegDeleteKeyExW(LocalMachine, MachineBase, view, 0);
#if HV_OVER_LAYER
    EXPECT_EQ(w32test::openHandleCount(), 0u) << "handles left open";
#endif
}
