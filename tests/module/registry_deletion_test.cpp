// Deleting keys with their subtrees, and values: the walk's order and where it stops, the
// platform and view fallbacks, memory and stack, and what deletion leaves of the current key.
#include "registry_fixture.h"

#include <algorithm>
#include <functional>
#include <map>
#ifndef _WIN32
#include <pthread.h>
#endif

namespace hvreg {
namespace {

using Keys = std::vector<std::u16string>;
// The tree at K in the order the walk deletes it: deepest first, always the first subkey.
const Keys Tree = {u"K\\A\\A1", u"K\\A", u"K\\B\\B1", u"K\\B\\B2\\B2x",
                   u"K\\B\\B2", u"K\\B", u"K\\C",     u"K"};

class RegistryDeletion : public RegistryFixture {
protected:
    void plantTree() {
        for (const std::u16string& k : Tree) makeKey(CurrentUser, at(k));
        put(CurrentUser, at(u"K\\B"), u"v", REG_SZ, textBytes(u"x"));
        makeKey(CurrentUser, at(u"Sibling"));
    }
    Keys remaining() {  // the tree's keys still there, in deletion order
        Keys out;
        for (const std::u16string& k : Tree) {
            if (exists(CurrentUser, at(k))) out.push_back(k);
        }
        return out;
    }
    void deleteKey(const std::u16string& path) {
        act(DeleteKey, {Param::rootKey(User), Param::str(path)});
    }
};

class RegistryDeletionOrder : public RegistryDeletion,
                              public ::testing::WithParamInterface<bool> {};

// Making the n-th deletion fail shows the order: the keys before it are gone, the rest stay.
TEST_P(RegistryDeletionOrder, DeepestFirstAndAFailureStopsTheWalk) {
    for (size_t n = Layer ? 1 : Tree.size() + 1; n <= Tree.size() + 1; ++n) {
        SCOPED_TRACE(n);
        w32test::reset();
        plantTree();
        view64(GetParam());
        w32test::failCall(GetParam() ? "RegDeleteKeyExW" : "RegDeleteKeyW", unsigned(n), 5);
        deleteKey(at(u"K"));
        EXPECT_EQ(instance.lastError(), n <= Tree.size() ? 5u : 0u);
        EXPECT_EQ(remaining(), Keys(Tree.begin() + long(n) - 1, Tree.end()));
        EXPECT_TRUE(exists(CurrentUser, at(u"Sibling")));
    }
}

std::string viewName(const ::testing::TestParamInfo<bool>& row) {
    return row.param ? "view64" : "defaultView";
}
INSTANTIATE_TEST_SUITE_P(Views, RegistryDeletionOrder, ::testing::Bool(), viewName);

TEST_F(RegistryDeletion, EmptyMissingAndSeveralComponentPaths) {
    plantTree();
    w32test::clearJournal();
    deleteKey(u"");
    EXPECT_EQ(instance.lastError(), 1010u);
    EXPECT_EQ(layerCalls(), Layer ? "GetVersionExW" : "") << "refused before any open";
    select(u"");
    act(DeleteCurrentKey);
    EXPECT_EQ(instance.lastError(), 1010u);
    deleteKey(at(u"Missing"));
    EXPECT_EQ(instance.lastError(), 2u);
    EXPECT_EQ(remaining(), Tree);
    deleteKey(at(u"K\\B"));  // only the last component goes
    EXPECT_EQ(instance.lastError(), 0u);
    EXPECT_EQ(remaining(), (Keys{u"K\\A\\A1", u"K\\A", u"K\\C", u"K"}));
}

TEST_F(RegistryDeletion, TheCurrentKeyOutlivesItsKeyAndCanBeCreatedAgain) {
    standardScene();
    const std::string before = fields();
    act(DeleteCurrentKey);
    EXPECT_EQ(instance.lastError(), 0u);
    EXPECT_EQ(fields(), before);
    EXPECT_EQ(cond(CurrentKeyExists).asCondition(), 0);
    act(CreateCurrentKey);
    EXPECT_EQ(instance.lastError(), 0u);
    EXPECT_EQ(cond(CurrentKeyExists).asCondition(), 1);
    EXPECT_EQ(sceneState(), "10 d error 2, s error 2");
}

TEST_F(RegistryDeletion, ValuesGoOnlyFromKeysThatExist) {
    standardScene();
    put(CurrentUser, at(u"K"), u"", REG_SZ, textBytes(u"default"));
    const Param root = Param::rootKey(User), key = Param::str(at(u"K")), none = Param::str(u"");
    const std::string scene = sceneState();
    act(DeleteValue, {root, key, none});  // the default value, and only it
    EXPECT_EQ(instance.lastError(), 0u);
    EXPECT_EQ(stored(CurrentUser, at(u"K"), u""), "error 2");
    EXPECT_EQ(sceneState(), scene);
    act(DeleteCurrentValue, {none});
    EXPECT_EQ(instance.lastError(), 2u);
    act(DeleteValue, {root, Param::str(at(u"Gone")), none});
    EXPECT_EQ(instance.lastError(), 2u);
    select(at(u"Gone2"));
    act(DeleteCurrentValue, {none});
    EXPECT_EQ(instance.lastError(), 2u);
    EXPECT_FALSE(exists(CurrentUser, at(u"Gone")) || exists(CurrentUser, at(u"Gone2")));
}

// Off NT, or when the version is unknown, one RegDeleteKeyW without a view is all there is.
TEST_F(RegistryDeletion, OffNtOneDeletionWithoutAWalk) {
    HV_NEEDS_TEST_CONTROL();
    const struct {
        bool versionFails;
        DWORD id;
        bool view;
    } platforms[] = {{true, 2, false}, {true, 2, true}, {false, 1, false}, {false, 0, true}};
    for (const auto& p : platforms) {
        SCOPED_TRACE(testing::Message() << p.versionFails << " " << p.id << " " << p.view);
        w32test::reset();
        plantTree();
        view64(p.view);
        w32test::setVersionFault(p.versionFails);
        w32test::setPlatformId(p.id);
        w32test::clearJournal();
        deleteKey(at(u"K"));
        EXPECT_EQ(layerCalls(), "GetVersionExW RegDeleteKeyW");
        EXPECT_EQ(callsOf(w32test::journal(), "RegDeleteKeyW").at(0).args[0],
                  handleValue(CurrentUser));
        EXPECT_EQ(instance.lastError(), 5u) << "a key with subkeys cannot go in one call";
        EXPECT_EQ(remaining(), Tree);
        deleteKey(at(u"K\\C"));
        EXPECT_EQ(instance.lastError(), 0u);
    }
}

TEST_F(RegistryDeletion, WithoutRegDeleteKeyExTheWalkKeepsItsViewAndFallsBack) {
    HV_NEEDS_TEST_CONTROL();
    for (bool hidden : {true, false}) {
        SCOPED_TRACE(hidden ? "export hidden" : "advapi32 not loaded");
        w32test::reset();
        plantTree();
        view64(true);
        if (hidden) w32test::hideExport("RegDeleteKeyExW", true);
        if (!hidden) w32test::failCall("LoadLibraryW", 1, 126);
        w32test::clearJournal();
        deleteKey(at(u"K"));
        const std::vector<w32test::Call> journal = w32test::journal();
        EXPECT_EQ(instance.lastError(), 0u);
        EXPECT_EQ(remaining(), Keys{});
        EXPECT_EQ(callsOf(journal, "RegDeleteKeyExW").size(), 0u);
        EXPECT_EQ(callsOf(journal, "RegDeleteKeyW").size(), Tree.size());
        EXPECT_EQ(callsOf(journal, "FreeLibrary").size(), hidden ? 1u : 0u);
        for (const w32test::Call& c : callsOf(journal, "RegOpenKeyExW")) {
            EXPECT_EQ(c.args[3], uint64_t(DELETE | KEY_ENUMERATE_SUB_KEYS | KEY_WOW64_64KEY));
        }
    }
}

// The walk keeps its levels on the heap: running out of memory there ends it cleanly.
TEST_F(RegistryDeletion, RunningOutOfMemoryInTheWalkGives8AndClosesEverything) {
    HV_NEEDS_TEST_CONTROL();
    plantTree();
    w32test::clearJournal();
    deleteKey(at(u"K"));
    ASSERT_EQ(instance.lastError(), 0u);
    const std::map<std::string, size_t> made = {{"calloc", w32test::count("calloc")},
                                                {"malloc", w32test::count("malloc")}};
    EXPECT_GT(made.at("calloc") + made.at("malloc"), 0u) << "the walk allocated nothing";
    for (const auto& [function, total] : made) {
        for (unsigned n = 1; n <= total; ++n) {
            SCOPED_TRACE(function + " #" + std::to_string(n));
            w32test::reset();
            plantTree();
            const size_t live = w32test::liveAllocations();
            w32test::failCall(function, n, 0);
            deleteKey(at(u"K"));
            EXPECT_EQ(instance.lastError(), 8u);
            EXPECT_EQ(w32test::liveAllocations(), live);
            EXPECT_TRUE(exists(CurrentUser, at(u"K")));
        }
    }
}

#ifdef _WIN32
DWORD WINAPI runBody(LPVOID body) {
#else
void* runBody(void* body) {
#endif
    (*static_cast<std::function<void()>*>(body))();
    return 0;
}

// Runs `body` on a thread with a 64 KiB stack.
void onSmallStack(std::function<void()> body) {
    const size_t stack = 64 * 1024;
#ifdef _WIN32
    HANDLE thread =
        CreateThread(nullptr, stack, runBody, &body, STACK_SIZE_PARAM_IS_A_RESERVATION, nullptr);
    ASSERT_NE(thread, nullptr);
    WaitForSingleObject(thread, INFINITE);
    CloseHandle(thread);
#else
    pthread_attr_t attributes;
    pthread_t thread;
    pthread_attr_init(&attributes);
    ASSERT_EQ(pthread_attr_setstacksize(&attributes, stack), 0);
    ASSERT_EQ(pthread_create(&thread, &attributes, runBody, &body), 0);
    pthread_join(thread, nullptr);
    pthread_attr_destroy(&attributes);
#endif
}

// The deepest tree the registry permits, 512 levels (below the root on Linux), created at most
// 32 levels per call as Windows allows.
TEST_F(RegistryDeletion, A512LevelTreeGoesOnA64KiBStack) {
    const unsigned levels = 512;
    HKEY key = created(CurrentUser, at(u"Deep"));
    for (unsigned made = 1; made < levels;) {
        const unsigned count = std::min(32u, levels - made);
        std::u16string chunk = u"L";
        for (unsigned i = 1; i < count; ++i) chunk += u"\\L";
        HKEY next = created(key, chunk);
        RegCloseKey(key);
        key = next;
        made += count;
    }
    RegCloseKey(key);
    w32test::clearJournal();
    const std::vector<Param> params = {Param::rootKey(User), Param::str(at(u"Deep"))};
    hv::Outcome o;
    onSmallStack([&] { o = instance.action(DeleteKey, params); });
    EXPECT_TRUE(o.clean()) << o.damage;
    EXPECT_EQ(instance.lastError(), 0u);
    EXPECT_EQ(w32test::count("RegDeleteKeyW"), Layer ? levels : 0u);
    EXPECT_EQ(w32test::openHandleCount(), 0u);
    EXPECT_FALSE(exists(CurrentUser, at(u"Deep")));
}

}  // namespace
}  // namespace hvreg
