// LoadStringW and resource lookup over the module's own compiled resources.
#include "module_path.h"
#include "pattern_buffer.h"
#include "resources.h"


namespace {

constexpr DWORD unchanged = 0xBEEF;
const char16_t description[] =
    u"The Hivelet object allows you to retrieve or write values from or to the registry.";

class ModuleResources : public testing::Test {
protected:
    static void SetUpTestSuite() { module = LoadLibraryW(modulePath().c_str()); }
    static void TearDownTestSuite() { FreeLibrary(module); }
    void SetUp() override {
        ASSERT_NE(module, nullptr);
        w32test::reset();
        SetLastError(unchanged);
    }
    static HMODULE module;
};
HMODULE ModuleResources::module = nullptr;

struct Load {
    UINT id;
    int capacity;
    int result;
    const char16_t* text;  // what the buffer starts with; null: the buffer is not written
    DWORD error = unchanged;
};

void PrintTo(const Load& load, std::ostream* out) {
    *out << "id " << load.id << ", capacity " << load.capacity;
}

class LoadString : public ModuleResources, public testing::WithParamInterface<Load> {};

TEST_P(LoadString, WritesExactlyTheString) {
    const Load& c = GetParam();
    PatternBuffer buffer;
    EXPECT_EQ(LoadStringW(module, c.id, buffer.data(), c.capacity), c.result);
    EXPECT_EQ(GetLastError(), c.error);
    buffer.expectHolds(c.text);
}

INSTANTIATE_TEST_SUITE_P(
    Module, LoadString,
    testing::Values(Load{131, 512, 82, description}, Load{1, 64, 3, u"HZ2"},
                    Load{1005, 64, 19, u"Invalid parameters."},
                    Load{1005, 20, 19, u"Invalid parameters."},
                    Load{1005, 19, 18, u"Invalid parameters"}, Load{1005, 10, 9, u"Invalid p"},
                    Load{1005, 2, 1, u"I"}, Load{1005, 1, 0, nullptr},
                    Load{0x10000 + 1005, 64, 19, u"Invalid parameters."},  // ids are 16-bit
                    Load{1005, -1, 0, nullptr},
                    Load{133, 64, 0, u""},  // block 9 exists, entry 133 is empty
                    Load{133, 1, 0, nullptr},
                    Load{3000, 64, 0, nullptr, ERROR_RESOURCE_NAME_NOT_FOUND}));

TEST_F(ModuleResources, CapacityZeroHandsOutAPointerToTheText) {
    const WCHAR* text = nullptr;
    EXPECT_EQ(LoadStringW(module, 131, reinterpret_cast<LPWSTR>(&text), 0), 82);
    ASSERT_NE(text, nullptr);
    EXPECT_EQ(std::u16string(text, 82), description);
    EXPECT_EQ(LoadStringW(module, 131, nullptr, 0), 0);
    EXPECT_EQ(LoadStringW(module, 131, nullptr, 64), 0);
}

TEST_F(ModuleResources, LoadStringIsJournaledAndCanBeMadeToFail) {
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
}

// Lookups fail with FindResourceW's reasons; the menus and the dialog are there to be found.
TEST_F(ModuleResources, FindsResourcesAsFindResourceWould) {
    const BYTE* data = nullptr;
    size_t size = 0;
    for (WORD menu : {20000, 20001, 20002})
        EXPECT_TRUE(w32::findResource(module, w32::resourceTypeMenu, menu, 0x409, &data, &size));
    EXPECT_TRUE(w32::findResource(module, w32::resourceTypeDialog, 101, 0x409, &data, &size));
    EXPECT_FALSE(w32::findResource(module, w32::resourceTypeMenu, 20003, 0x409, &data, &size));
    EXPECT_EQ(GetLastError(), ERROR_RESOURCE_NAME_NOT_FOUND);
    EXPECT_FALSE(w32::findResource(module, 0x7FFF, 1, 0x409, &data, &size));
    EXPECT_EQ(GetLastError(), ERROR_RESOURCE_TYPE_NOT_FOUND);
    EXPECT_FALSE(w32::findResource(nullptr, w32::resourceTypeString, 1, 0x409, &data, &size));
    EXPECT_EQ(GetLastError(), ERROR_RESOURCE_DATA_NOT_FOUND);
}

}  // namespace
