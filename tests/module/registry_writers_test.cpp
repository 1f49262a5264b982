// The writers: the exact type and bytes they store over what was there, and the keys they
// create.
#include "registry_fixture.h"

namespace hvreg {
namespace {

struct Write {
    const char* label;
    DWORD oldType;  // REG_NONE: nothing stored before
    Bytes oldData;
    Param value;  // an integer for the DWORD writers, a text for the string writers
    const char16_t* name;
    std::string expected;
};
void PrintTo(const Write& w, std::ostream* os) { *os << w.label; }
using WriteCase = std::tuple<Write, bool>;  // the write, through the current key
std::string writeName(const ::testing::TestParamInfo<WriteCase>& row) {
    return std::get<0>(row.param).label + std::string(std::get<1>(row.param) ? "_current" : "_any");
}

class RegistryWriting : public RegistryFixture, public ::testing::WithParamInterface<WriteCase> {};

TEST_P(RegistryWriting, StoresExactTypeAndBytes) {
    const Write& w = std::get<0>(GetParam());
    const bool dword = w.value.kind == Param::Kind::Integer;
    const std::u16string key = at(u"W\\X\\Y");  // the missing keys along the path are created
    if (w.oldType != REG_NONE) put(CurrentUser, key, w.name, w.oldType, w.oldData);
    instance.setLastError(40);
    if (std::get<1>(GetParam())) {
        select(key);
        act(dword ? SetCurrentDword : SetCurrentString, {Param::str(w.name), w.value});
    } else {
        act(dword ? SetDword : SetString,
            {Param::rootKey(User), Param::str(key), Param::str(w.name), w.value});
    }
    EXPECT_EQ(instance.lastError(), 0u);
    EXPECT_EQ(stored(CurrentUser, key, w.name), w.expected);
}

const Param T = Param::str(u"t");
const std::string TAsText = shown(REG_SZ, u"t");

INSTANTIATE_TEST_SUITE_P(
    Values, RegistryWriting,
    ::testing::Combine(
        ::testing::Values(
            Write{"zero", REG_NONE, {}, Param::integerValue(0), u"v", "4: 00 00 00 00"},
            Write{"minusOne", REG_NONE, {}, Param::integerValue(-1), u"v", "4: ff ff ff ff"},
            Write{"dwordOverText",
                  REG_SZ,
                  {0x78, 0},
                  Param::integerValue(0x01020304),
                  u"v",
                  "4: 04 03 02 01"},
            Write{"defaultValue", REG_NONE, {}, Param::integerValue(9), u"", "4: 09 00 00 00"},
            // Three UTF-16 units, two of them a surrogate pair, and the terminator.
            Write{"threeUnits",
                  REG_NONE,
                  {},
                  Param::str(u"a\U0001F600"),
                  u"v",
                  "1: 61 00 3d d8 00 de 00 00"},
            Write{"emptyText", REG_NONE, {}, Param::str(u""), u"v", "1: 00 00"},
            Write{"keepsExpand", REG_EXPAND_SZ, textBytes(u"%A%"), Param::str(u"%B%"), u"v",
                  shown(REG_EXPAND_SZ, u"%B%")},
            Write{"overDword", REG_DWORD, {1, 0, 0, 0}, T, u"v", TAsText},
            Write{"overMulti", REG_MULTI_SZ, {0x78, 0, 0, 0, 0, 0}, T, u"v", TAsText},
            Write{"overBinary", REG_BINARY, {1}, T, u"v", TAsText}),
        ::testing::Bool()),
    writeName);

}  // namespace
}  // namespace hvreg
