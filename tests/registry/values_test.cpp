// Values: the bytes RegSetValueExW stores and what RegQueryValueExW writes back, or not.
#include "registry_fixture.h"

#include <cstring>

namespace {

class RegistryValues : public RegistryTest {
protected:
    void SetUp() override {
        RegistryTest::SetUp();
        key = create(user, TEXT("Probe"));
        buffer.assign(64, Sentinel);
    }
    void TearDown() override {
        RegCloseKey(key);
        RegistryTest::TearDown();
    }
    // Reads `name` into `buffer` with the given capacity.
    LONG read(const WCHAR* name, DWORD capacity) {
        size = capacity;
        return RegQueryValueExW(key, name, nullptr, &type, buffer.data(), &size);
    }
    // Whether the buffer is untouched from byte `from` on.
    ::testing::AssertionResult untouchedFrom(size_t from) {
        for (size_t i = from; i < buffer.size(); ++i)
            if (buffer[i] != Sentinel) return ::testing::AssertionFailure() << "byte " << i;
        return ::testing::AssertionSuccess();
    }
    HKEY key = nullptr;
    std::vector<BYTE> buffer;
    DWORD type = 0, size = 0;
};

struct StoreCase {
    DWORD type;
    WString source;  // the caller's characters, followed in memory by a NUL
    DWORD cbData, stored;
    DWORD terminator;  // zero bytes a read adds after the data when it has room: 0 or 2
    const char* wineDiffers = nullptr;
};
void PrintTo(const StoreCase& c, std::ostream* os) {
    *os << "type " << c.type << ", cbData " << c.cbData;
}

class RegistryStoredBytes : public RegistryValues,
                            public ::testing::WithParamInterface<StoreCase> {};

TEST_P(RegistryStoredBytes, SizeAndTypeAreKeptExactly) {
    const StoreCase& c = GetParam();
    if (c.wineDiffers) HV_WINE_DIFFERS(c.wineDiffers);
    auto* bytes = reinterpret_cast<const BYTE*>(c.source.c_str());
    ASSERT_EQ(RegSetValueExW(key, TEXT("v"), 0, c.type, bytes, c.cbData), 0);
    ASSERT_EQ(read(TEXT("v"), 64), 0);
    EXPECT_EQ(type, c.type);
    ASSERT_EQ(size, c.stored);
    EXPECT_EQ(std::memcmp(buffer.data(), bytes, c.stored), 0);
    auto after = buffer.begin() + c.stored;
    EXPECT_EQ(std::vector<BYTE>(after, after + c.terminator), std::vector<BYTE>(c.terminator, 0));
    EXPECT_TRUE(untouchedFrom(c.stored + c.terminator));
}

// One WCHAR short while the caller's next character is NUL: Windows stores the terminator too.
// Reading string data that does not end in a zero character adds one (Wine in both process
// kinds; Windows' answer is recorded for RegQueryValueExA only, which adds it too).
INSTANTIATE_TEST_SUITE_P(
    Windows, RegistryStoredBytes,
    ::testing::Values(
        StoreCase{REG_SZ, TEXT("abc"), 8, 8, 0}, StoreCase{REG_SZ, TEXT("abc"), 6, 8, 0},
        StoreCase{REG_EXPAND_SZ, TEXT("abc"), 6, 8, 0},
        StoreCase{REG_MULTI_SZ, WString(TEXT("a\0b"), 3), 6, 8, 0},
        StoreCase{REG_SZ, TEXT("abcd"), 6, 6, 2}, StoreCase{REG_BINARY, TEXT("abc"), 6, 6, 0},
        // An odd size is kept: nothing the caller did not hand over is stored.
        StoreCase{REG_SZ, TEXT("abc"), 7, 7, 0,
                  "adds 2 bytes to an odd size too (7 gives 9), one past the caller's NUL"},
        StoreCase{REG_SZ, TEXT("abc"), 1, 1, 2}, StoreCase{REG_SZ, TEXT("abc"), 0, 0, 0},
        StoreCase{REG_SZ, WString(TEXT("ab\0cd\0"), 6), 12, 12, 0},
        StoreCase{REG_DWORD, TEXT("abcd"), 3, 3, 0}, StoreCase{REG_DWORD, TEXT("abcd"), 8, 8, 0},
        StoreCase{12345, TEXT("ab"), 4, 4, 0}));

struct BufferCase {
    DWORD type, valueSize, capacity;
    LONG expected;
    const char* wineDiffers = nullptr;
};
void PrintTo(const BufferCase& c, std::ostream* os) {
    *os << "type " << c.type << ", size " << c.valueSize << ", capacity " << c.capacity;
}

class RegistryQueryBuffer : public RegistryValues,
                            public ::testing::WithParamInterface<BufferCase> {};

// Too small a buffer gets 234, the full size and not one byte; a fitting one the data only.
TEST_P(RegistryQueryBuffer, WritesAllOrNothing) {
    const BufferCase& c = GetParam();
    if (c.wineDiffers) HV_WINE_DIFFERS(c.wineDiffers);
    const WCHAR hello[] = TEXT("hello");
    ASSERT_EQ(RegSetValueExW(key, TEXT("v"), 0, c.type, reinterpret_cast<const BYTE*>(hello),
                             c.valueSize),
              0);
    EXPECT_EQ(read(TEXT("v"), c.capacity), c.expected);
    EXPECT_EQ(size, c.valueSize);
    EXPECT_EQ(type, c.type);
    EXPECT_TRUE(untouchedFrom(c.expected == 0 ? c.valueSize : 0));
}

INSTANTIATE_TEST_SUITE_P(
    Sizes, RegistryQueryBuffer,
    ::testing::Values(BufferCase{REG_SZ, 12, 0, 234}, BufferCase{REG_SZ, 12, 4, 234},
                      BufferCase{REG_SZ, 12, 11, 234}, BufferCase{REG_SZ, 12, 12, 0},
                      BufferCase{REG_SZ, 0, 1, 0}, BufferCase{REG_DWORD, 4, 2, 234},
                      BufferCase{REG_DWORD, 4, 0xFFFFFFFF, 0,
                                 "its size plus header overflows: 0xFFFFFFFF gives 122"}));

TEST_F(RegistryValues, MissingValueSetsSizeZeroOnlyWithoutABuffer) {
    type = 77;
    size = 50;
    EXPECT_EQ(RegQueryValueExW(key, TEXT("none"), nullptr, &type, nullptr, &size), 2);
    EXPECT_EQ(size, 0u);
    EXPECT_EQ(type, 77u);
    EXPECT_EQ(read(TEXT("none"), 8), 2);
    EXPECT_EQ(size, 8u);
    EXPECT_TRUE(untouchedFrom(0));
    EXPECT_EQ(RegQueryValueExW(key, TEXT("none"), nullptr, nullptr, nullptr, nullptr), 2);
}

// "Keys do not automatically have an unnamed or default value"; "" and NULL both name it.
TEST_F(RegistryValues, DefaultValueIsAbsentUntilWrittenAndNullMeansEmpty) {
    for (const WCHAR* name : {static_cast<const WCHAR*>(nullptr), TEXT("")}) {
        EXPECT_EQ(read(name, 64), 2);
        EXPECT_EQ(RegDeleteValueW(key, name), 2);
    }
    ASSERT_EQ(setDword(key, nullptr, 7), 0);
    EXPECT_EQ(read(TEXT(""), 64), 0);
    EXPECT_EQ(type, DWORD(REG_DWORD));
    EXPECT_EQ(RegDeleteValueW(key, TEXT("")), 0);
    EXPECT_EQ(read(nullptr, 64), 2);
}

TEST_F(RegistryValues, AnotherTypeOverwritesUnderAnyCaseOfTheName) {
    ASSERT_EQ(setDword(key, TEXT("ValName"), 1), 0);
    const WCHAR text[] = TEXT("xy");
    auto* bytes = reinterpret_cast<const BYTE*>(text);
    ASSERT_EQ(RegSetValueExW(key, TEXT("VALNAME"), 0, REG_SZ, bytes, 6), 0);
    EXPECT_EQ(read(TEXT("valname"), 64), 0);
    EXPECT_EQ(type, DWORD(REG_SZ));
    EXPECT_EQ(size, 6u);
}

}  // namespace
