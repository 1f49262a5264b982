// The value readers: what each stored type and size reads as, through the current key and
// through a named key.
#include "registry_fixture.h"

namespace hvreg {
namespace {

struct Read {
    const char* label;
    DWORD type;  // REG_NONE with no data: nothing stored
    Bytes data;
    int32_t dword;
    DWORD dwordError;
    std::u16string text;
    DWORD textError;
    size_t request;  // the GetStringBuffer size; 0 when no buffer may be asked for
};
void PrintTo(const Read& r, std::ostream* os) { *os << r.label; }
std::string readName(const ::testing::TestParamInfo<Read>& row) { return row.param.label; }

class RegistryReading : public RegistryFixture, public ::testing::WithParamInterface<Read> {};

// The existence conditions see the value too, whatever its type and size.
TEST_P(RegistryReading, BothDwordAndBothStringReaders) {
    const Read& r = GetParam();
    const std::u16string key = at(u"R");
    makeKey(CurrentUser, key);
    if (r.type != REG_NONE || !r.data.empty()) put(CurrentUser, key, u"v", r.type, r.data);
    select(key);
    const Param name = Param::str(u"v"), root = Param::str(RootNames[User]);
    const int exists = r.type != REG_NONE || !r.data.empty();
    EXPECT_EQ(cond(ValueExists, {Param::rootKey(User), Param::str(key), name}).raw, exists);
    EXPECT_EQ(cond(CurrentValueExists, {name}).raw, exists);
    for (int code : {GetCurrentDword, GetDword, GetCurrentString, GetString}) {
        SCOPED_TRACE(code);
        const bool dword = code == GetCurrentDword || code == GetDword;
        instance.setLastError(40);  // a read after a failed action reports its own outcome
        auto o = expr(code, code == GetDword || code == GetString
                                ? std::vector<Param>{root, Param::str(key), name}
                                : std::vector<Param>{name});
        EXPECT_EQ(o.isText, !dword);
        EXPECT_EQ(instance.lastError(), dword ? r.dwordError : r.textError);
        if (dword) {
            EXPECT_EQ(o.asInteger(), r.dword);
            continue;
        }
        EXPECT_EQ(o.text, r.text) << hvtest::show(o.text);
        EXPECT_EQ(o.bufferRequests, std::vector<size_t>(r.request ? 1 : 0, r.request));
        EXPECT_EQ(o.textAddress == emptyString(), r.request == 0);
    }
}

const Bytes Abc = textBytes(u"abc", false);

INSTANTIATE_TEST_SUITE_P(
    Types, RegistryReading,
    ::testing::Values(
        Read{"absent", REG_NONE, {}, 0, 2, u"", 2, 0},
        Read{"dword", REG_DWORD, {0x78, 0x56, 0x34, 0x12}, 0x12345678, 0, u"", 42, 0},
        Read{"minusOne", REG_DWORD, {255, 255, 255, 255}, -1, 0, u"", 42, 0},
        // A REG_DWORD shorter than four bytes reads with its missing high bytes zero.
        Read{"dword2bytes", REG_DWORD, {0x34, 0x12}, 0x1234, 0, u"", 42, 0},
        Read{"dword0bytes", REG_DWORD, {}, 0, 0, u"", 42, 0},
        Read{"binary4", REG_BINARY, {1, 2, 3, 4}, 0, 41, u"", 42, 0},
        Read{"binary0", REG_BINARY, {}, 0, 41, u"", 42, 0},
        Read{"qword", REG_QWORD, Bytes(8, 1), 0, 234, u"", 42, 0},
        Read{"text2", REG_SZ, textBytes(u"ab"), 0, 234, u"ab", 0, 14},
        Read{"text1", REG_SZ, textBytes(u"a"), 0, 41, u"a", 0, 10},
        Read{"emptyData", REG_SZ, {}, 0, 41, u"", 0, 0},
        Read{"unterminated", REG_SZ, Abc, 0, 234, u"abc", 0, 14},
        Read{"expand", REG_EXPAND_SZ, textBytes(u"%TEMP%\\x"), 0, 234, u"%TEMP%\\x", 0, 38},
        Read{"multi", REG_MULTI_SZ, textBytes(std::u16string(u"a\0b\0", 4)), 0, 234, u"", 42, 0}),
    readName);

using RegistryReaders = RegistryFixture;

// The host's buffer is filled with a pattern: the text must still end inside it.
TEST_F(RegistryReaders, OddSizedUnterminatedTextEndsInsideTheBuffer) {
    Bytes odd = Abc;
    odd.push_back('d');
    put(CurrentUser, at(u"R"), u"v", REG_SZ, odd);
    auto o = expr(GetString, {Param::str(RootNames[User]), Param::str(at(u"R")), Param::str(u"v")});
    EXPECT_EQ(instance.lastError(), 0u);
    EXPECT_EQ(o.bufferRequests, std::vector<size_t>{16});
    EXPECT_EQ(o.text.substr(0, 3), u"abc");
    EXPECT_LE(o.text.size(), 4u) << hvtest::show(o.text);
    EXPECT_TRUE(o.text.size() < 4 || (o.text[3] & 0xFF) == 'd') << "the odd byte is kept";
}

TEST_F(RegistryReaders, DefaultValueValueAtTheRootAndNoLentBuffer) {
    put(CurrentUser, at(u"R"), u"", REG_SZ, textBytes(u"default"));
    put(CurrentUser, u"", scratchName(), REG_DWORD, {5, 0, 0, 0});
    select(at(u"R"));
    const Param root = Param::str(RootNames[User]);
    EXPECT_EQ(expr(GetCurrentString, {Param::str(u"")}).text, u"default");
    EXPECT_EQ(expr(GetString, {root, Param::str(at(u"R")), Param::str(u"")}).text, u"default");
    EXPECT_EQ(expr(GetDword, {root, Param::str(u""), Param::str(scratchName())}).asInteger(), 5);
    EXPECT_EQ(instance.lastError(), 0u);
    instance.lendNoBuffer(true);
    instance.setLastError(40);
    auto o = expr(GetCurrentString, {Param::str(u"")});
    EXPECT_EQ(o.textAddress, emptyString());
    EXPECT_EQ(o.bufferRequests, std::vector<size_t>{34});
    EXPECT_EQ(instance.lastError(), 0u);
}

}  // namespace
}  // namespace hvreg
