// Identity, the compatibility gate, the editor frame and the entry points with fixed answers,
// each called with exactly the number of arguments the host pushes.
#include "support.h"

namespace {

using hv::Slot;

TEST(ModuleEntry, InfoCodesAnswerTheirConstants) {
    typedef DWORD(WINAPI * Fn)(Slot);
    auto getInfos = hvtest::module().entry<Fn>("GetInfos");
    const std::pair<Slot, DWORD> table[] = {{0, 0x300}, {1, 0}, {2, 0x100},     {3, 0},
                                            {4, 0},     {5, 0}, {6, 2},         {7, 292},
                                            {8, 1},     {9, 0}, {0xFFFFFFFF, 0}};
    for (auto [code, value] : table) EXPECT_EQ(getInfos(code), value) << "code " << code;
}

TEST(ModuleEntry, CompatibilityGate) {
    typedef int(WINAPI * Fn)(void*, Slot, Slot);
    auto create = hvtest::module().entry<Fn>("CreateObject");
    const std::pair<uint32_t, int> table[] = {
        {0x020000F2, 0},  {0x02000FFF, 0},  {0x02010100, 0},  {0xFFFF0FFF, 0},
        {0x020000F1, -1}, {0x01FF00F2, -1}, {0x02000000, -1}, {0x00000FFF, -1},
    };
    for (auto [version, expected] : table) {
        hv::Editor editor;
        editor.setHostVersion(version);
        EXPECT_EQ(create(editor.structure(), 0, 0), expected) << std::hex << version;
    }
    hv::Editor missing;
    missing.setHostVersion(0x02000100, false);
    EXPECT_EQ(create(missing.structure(), 0, 0), -1);
    EXPECT_EQ(missing.hostVersionCalls(), 0u);
}

TEST(ModuleEntry, ObjectRectIs32By32FromItsCorner) {
    typedef void(WINAPI * Fn)(Slot, RECT*, Slot, Slot);
    RECT r[2] = {{10, 20, 0, 0}, {0x7A7A7A7A, 0x7A7A7A7A, 0x7A7A7A7A, 0x7A7A7A7A}};
    hvtest::module().entry<Fn>("GetObjectRect")(0, &r[0], 0, 0);
    EXPECT_EQ(r[0].left, 10);
    EXPECT_EQ(r[0].top, 20);
    EXPECT_EQ(r[0].right, 42);
    EXPECT_EQ(r[0].bottom, 52);
    EXPECT_EQ(r[1].left, 0x7A7A7A7A);
    RECT negative = {-40, -5, 99, 99};
    hvtest::module().entry<Fn>("GetObjectRect")(0, &negative, 0, 0);
    EXPECT_EQ(negative.right, -8);
    EXPECT_EQ(negative.bottom, 27);
}

TEST(ModuleEntry, IdentityStringsFillTheirBuffers) {
    typedef void(WINAPI * Fn)(Slot, Slot, LPWSTR, LPWSTR, LPWSTR, LPWSTR, LPWSTR);
    hvtest::Guarded<char16_t> name(255), maker(255), copyright(255), description(1024), web(255);
    hvtest::module().entry<Fn>("GetObjInfos")(
        0, 0, hvtest::wide(name.data()), hvtest::wide(maker.data()), hvtest::wide(copyright.data()),
        hvtest::wide(description.data()), hvtest::wide(web.data()));
    EXPECT_EQ(std::u16string(name.data()), u"Hivelet");
    EXPECT_EQ(std::u16string(description.data()),
              u"The Hivelet object allows you to retrieve or write values from or to the "
              u"registry.");
    EXPECT_EQ(std::u16string(maker.data()), u"The Hivelet developers");
    EXPECT_EQ(std::u16string(copyright.data()), u"Copyright (C) 2026 The Hivelet developers");
    EXPECT_EQ(std::u16string(web.data()), u"https://hivelet.invalid/");
    for (auto* b : {&name, &maker, &copyright, &description, &web}) EXPECT_TRUE(b->intact());
}

TEST(ModuleEntry, HelpFileNameIsOneStaticText) {
    typedef LPCWSTR(WINAPI * Fn)();
    auto help = hvtest::module().entry<Fn>("GetHelpFileName");
    LPCWSTR first = help();
    EXPECT_EQ(hvtest::text(first), u"Help\\Hivelet.chm");
    EXPECT_EQ(help(), first);
}

TEST(ModuleEntry, PropertiesInsertTheEmptyList) {
    typedef DWORD(WINAPI * Fn)(void*, Slot, Slot);
    hv::Editor editor;
    EXPECT_EQ(hvtest::module().entry<Fn>("GetProperties")(editor.structure(), 0x1234, 77), 1u);
    ASSERT_EQ(editor.inserts().size(), 1u);
    const auto& call = editor.inserts()[0];
    EXPECT_EQ(call.hostValue, 0x1234);
    EXPECT_EQ(call.a, 1);
    EXPECT_EQ(call.c, 1);
    EXPECT_EQ(call.d, 1);
    ASSERT_NE(call.properties, nullptr);
    EXPECT_EQ(std::vector<uint8_t>(static_cast<const uint8_t*>(call.properties),
                                   static_cast<const uint8_t*>(call.properties) + 24),
              std::vector<uint8_t>(24, 0));
}

// The entry points the object has no use for, grouped by argument count.
struct Inert {
    const char* name;
    int arguments;
    int answer;  // -1: no result
};

class InertEntries : public ::testing::TestWithParam<Inert> {};

TEST_P(InertEntries, AnswerTheirFixedValue) {
    const Inert& e = GetParam();
    FARPROC p = hvtest::module().address(e.name);
    ASSERT_NE(p, nullptr) << e.name << " is not exported";
    void* f = reinterpret_cast<void*>(p);
    Slot r = 0;
    switch (e.arguments) {
        case 0: r = reinterpret_cast<Slot(WINAPI*)()>(f)(); break;
        case 1: r = reinterpret_cast<DWORD(WINAPI*)(Slot)>(f)(1); break;
        case 2: r = reinterpret_cast<DWORD(WINAPI*)(Slot, Slot)>(f)(1, 2); break;
        case 3: r = reinterpret_cast<DWORD(WINAPI*)(Slot, Slot, Slot)>(f)(1, 2, 3); break;
        case 4: r = reinterpret_cast<DWORD(WINAPI*)(Slot, Slot, Slot, Slot)>(f)(1, 2, 3, 4); break;
        case 5:
            r = reinterpret_cast<DWORD(WINAPI*)(Slot, Slot, Slot, Slot, Slot)>(f)(1, 2, 3, 4, 5);
            break;
    }
    if (e.answer >= 0) {
        EXPECT_EQ(static_cast<DWORD>(r), static_cast<DWORD>(e.answer)) << e.name;
    }
}

INSTANTIATE_TEST_SUITE_P(
    All, InertEntries,
    ::testing::Values(
        Inert{"GetDependencies", 0, 0}, Inert{"Free", 1, 0}, Inert{"Initialize", 2, 0},
        Inert{"UsesFile", 2, 0}, Inert{"GetTextCaps", 2, 0}, Inert{"GetTextAlignment", 2, 0},
        Inert{"GetTextClr", 2, 0}, Inert{"UpdateEditStructure", 2, 0}, Inert{"StartApp", 2, -1},
        Inert{"EndApp", 2, -1}, Inert{"GetPropValue", 3, 0}, Inert{"GetPropCheck", 3, 0},
        Inert{"GetPropCreateParam", 3, 0}, Inert{"EditProp", 3, 0}, Inert{"IsPropEnabled", 3, 1},
        Inert{"UnloadObject", 3, -1}, Inert{"PrepareToWriteObject", 3, -1},
        Inert{"CreateFromFile", 3, -1}, Inert{"DuplicateObject", 3, -1},
        Inert{"SetTextAlignment", 3, -1}, Inert{"SetTextClr", 3, -1}, Inert{"StartFrame", 3, -1},
        Inert{"EndFrame", 3, -1}, Inert{"ReleaseProperties", 3, -1}, Inert{"LoadObject", 4, 0},
        Inert{"GetFilters", 4, 0}, Inert{"SetTextFont", 4, 1}, Inert{"PutObject", 4, -1},
        Inert{"RemoveObject", 4, -1}, Inert{"UpdateFileNames", 4, -1}, Inert{"SetPropValue", 4, -1},
        Inert{"SetPropCheck", 4, -1}, Inert{"ReleasePropCreateParam", 4, -1},
        Inert{"GetTextFont", 5, 1}, Inert{"IsTransparent", 5, 0}),
    [](const ::testing::TestParamInfo<Inert>& p) { return std::string(p.param.name); });

#ifndef _WIN32
// The entry function keeps the instance handle from the process attach only.
TEST(ModuleEntry, EntryFunctionAnswersTrueAndKeepsTheInstance) {
    typedef BOOL(WINAPI * Fn)(HINSTANCE, DWORD, LPVOID);
    auto entry = hvtest::module().entry<Fn>("DllMain");
    auto* stranger = reinterpret_cast<HINSTANCE>(0x1000);
    for (DWORD reason : {DLL_PROCESS_DETACH, DLL_THREAD_ATTACH, DLL_THREAD_DETACH})
        EXPECT_EQ(entry(stranger, reason, nullptr), TRUE) << reason;
    // Resources still load through the module's own handle.
    hv::Instance instance(hvtest::module());
    instance.setLastError(40);
    EXPECT_EQ(instance.expression(7).text, u"Invalid parameters.");
}
#endif

}  // namespace
