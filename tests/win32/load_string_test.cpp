// LoadStringW and resource lookup over the resources of the module file itself.
#include "module_path.h"
#include "pattern_buffer.h"
#if HV_OVER_LAYER
#include "resources.h"
#endif

namespace {

constexpr DWORD Unchanged = 0xBEEF;
const WCHAR Description[] =
    TEXT("The Hivelet object allows you to retrieve or write values from or to the registry.");

class ModuleResources : public testing::Test {
protected:
    static void SetUpTestSuite() { module = LoadLibraryW(modulePath().c_str()); }
    static void TearDownTestSuite() { FreeLibrary(module); }
    void SetUp() override {
        ASSERT_NE(module, nullptr);
#if HV_OVER_LAYER
        w32test::reset();
#endif
        SetLastError(Unchanged);
    }
    static HMODULE module;
};
HMODULE ModuleResources::module = nullptr;

struct Load {
    UINT id;
    int capacity;
    int result;
    const WCHAR* text;  // what the buffer starts with; null: the buffer is not written
    DWORD error = Unchanged;
    const char* wineDiffers = nullptr;
};

void PrintTo(const Load& load, std::ostream* out) {
    *out << "id " << load.id << ", capacity " << load.capacity;
}

class LoadStrings : public ModuleResources, public testing::WithParamInterface<Load> {};

TEST_P(LoadStrings, WritesExactlyTheString) {
    const Load& c = GetParam();
    if (c.wineDiffers) HV_WINE_DIFFERS(c.wineDiffers);
    PatternBuffer buffer;
    EXPECT_EQ(LoadStringW(module, c.id, buffer.data(), c.capacity), c.result);
    EXPECT_EQ(GetLastError(), c.error);
    buffer.expectHolds(c.text);
}

INSTANTIATE_TEST_SUITE_P(
    Module, LoadStrings,
    testing::Values(Load{131, 512, 82, Description}, Load{1, 64, 3, TEXT("HZ2")},
                    Load{1005, 64, 19, TEXT("Invalid parameters.")},
                    Load{1005, 20, 19, TEXT("Invalid parameters.")},
                    Load{1005, 19, 18, TEXT("Invalid parameters")},
                    Load{1005, 10, 9, TEXT("Invalid p")}, Load{1005, 2, 1, TEXT("I")},
                    Load{1005, 1, 0, nullptr},
                    Load{0x10000 + 1005, 64, 19, TEXT("Invalid parameters.")},  // ids are 16-bit
                    Load{1005, -1, 0, nullptr, Unchanged,
                         "a negative capacity gives capacity - 1, below the documented range"},
                    Load{133, 64, 0, TEXT("")},  // block 9 exists, entry 133 is empty
                    Load{133, 1, 0, nullptr},
                    Load{3000, 64, 0, nullptr, ERROR_RESOURCE_NAME_NOT_FOUND}));

TEST_F(ModuleResources, ANullBufferGetsNothing) {
    EXPECT_EQ(LoadStringW(module, 131, nullptr, 64), 0);
}

TEST_F(ModuleResources, LoadStringIsJournaledAndCanBeMadeToFail) {
    HV_LAYER_ONLY("fault injection and call journal");
#if HV_OVER_LAYER
    WCHAR buffer[8];
    w32test::failCall("LoadStringW", 2, ERROR_NOT_ENOUGH_MEMORY);
    EXPECT_EQ(LoadStringW(module, 1, buffer, 8), 3);
    EXPECT_EQ(LoadStringW(module, 1, buffer, 8), 0);
    EXPECT_EQ(GetLastError(), ERROR_NOT_ENOUGH_MEMORY);
    auto calls = w32test::callsOf("LoadStringW");
    ASSERT_EQ(calls.size(), 2u);
    EXPECT_EQ(calls[0].args, (std::vector<uint64_t>{reinterpret_cast<uintptr_t>(module), 1,
                                                    reinterpret_cast<uintptr_t>(buffer), 8}));
    EXPECT_EQ(calls[0].result, 3);
#endif
}

// Whether `module` holds the resource; the layer's lookup stands for FindResourceW.
bool found(HMODULE module, WORD type, WORD id) {
#if HV_OVER_LAYER
    const BYTE* data = nullptr;
    size_t size = 0;
    return w32::findResource(module, type, id, 0x409, &data, &size);
#else
    return FindResourceW(module, MAKEINTRESOURCEW(id), MAKEINTRESOURCEW(type)) != nullptr;
#endif
}

// Lookups fail with FindResourceW's reasons; the menus and the dialog are there to be found.
TEST_F(ModuleResources, FindsResourcesAsFindResourceWould) {
    const WORD menu = 4, dialog = 5, string = 6;  // RT_MENU, RT_DIALOG, RT_STRING
    for (WORD id : {20000, 20001, 20002}) EXPECT_TRUE(found(module, menu, id));
    EXPECT_TRUE(found(module, dialog, 101));
    EXPECT_FALSE(found(module, menu, 20003));
    EXPECT_EQ(GetLastError(), DWORD(ERROR_RESOURCE_NAME_NOT_FOUND));
    EXPECT_FALSE(found(module, 0x7FFF, 1));
    EXPECT_EQ(GetLastError(), DWORD(ERROR_RESOURCE_TYPE_NOT_FOUND));
    EXPECT_FALSE(found(nullptr, string, 1));  // the test program has no resources
    EXPECT_EQ(GetLastError(), DWORD(ERROR_RESOURCE_DATA_NOT_FOUND));
}

}  // namespace
