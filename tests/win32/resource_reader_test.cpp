// The compiled-resource reader on hand-made images: lookup rules, alignment, and damaged bytes.
#include "resources.h"

#include <gtest/gtest.h>

#include <cstring>
#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace {

using Bytes = std::vector<BYTE>;
using w32::ResourceStatus;

void put16(Bytes& b, unsigned v) {
    b.push_back(static_cast<BYTE>(v));
    b.push_back(static_cast<BYTE>(v >> 8));
}
void put32(Bytes& b, uint32_t v) {
    put16(b, v & 0xFFFF);
    put16(b, v >> 16);
}
void pad(Bytes& b) { b.resize((b.size() + 3) / 4 * 4); }

// A TYPE or NAME field: a number, or a text when `text` is set.
struct Id {
    WORD number;
    const char16_t* text = nullptr;
};

// Appends a record as the resource compiler writes it.
void addRecord(Bytes& image, Id type, Id name, WORD language, const Bytes& data) {
    Bytes ids;
    for (const Id& id : {type, name}) {
        if (!id.text) {
            put16(ids, 0xFFFF);
            put16(ids, id.number);
            continue;
        }
        for (const char16_t* c = id.text; *c; ++c) put16(ids, *c);
        put16(ids, 0);
    }
    pad(ids);
    put32(image, static_cast<uint32_t>(data.size()));
    put32(image, static_cast<uint32_t>(8 + ids.size() + 16));
    image.insert(image.end(), ids.begin(), ids.end());
    // DataVersion, MemoryFlags and LanguageId, Version, Characteristics.
    for (uint32_t field : {0u, 0x1030u | static_cast<uint32_t>(language) << 16, 0u, 0u})
        put32(image, field);
    image.insert(image.end(), data.begin(), data.end());
    pad(image);
}

// The leading empty record, a text-typed record, a text-named one (odd length, padded), the
// same name in two languages and an odd-sized datum before a dialog.
Bytes sampleImage() {
    Bytes image;
    addRecord(image, {0}, {0}, 0, {});
    addRecord(image, {0, u"MYTYPE"}, {9}, 0x409, {'t'});
    addRecord(image, {6}, {0, u"ABC"}, 0x409, {'n'});
    addRecord(image, {6}, {9}, 0x407, {'d', 'e'});
    addRecord(image, {6}, {9}, 0x409, {'e', 'n'});
    addRecord(image, {6}, {10}, 0x407, {'x', 'y', 'z'});
    addRecord(image, {5}, {101}, 0x409, {'d', 'l', 'g'});
    return image;
}

// Looks a resource up in a heap copy that ends exactly where the image ends, so that the
// address sanitizer reports any read past it.
ResourceStatus lookup(const Bytes& image, WORD type, WORD name, WORD language = 0x409,
                      std::string* found = nullptr) {
    std::unique_ptr<BYTE[]> copy(new BYTE[image.size()]);
    std::copy(image.begin(), image.end(), copy.get());
    const BYTE* data = nullptr;
    size_t size = 0;
    ResourceStatus status =
        w32::lookupResource(copy.get(), image.size(), type, name, language, &data, &size);
    if (found && status == ResourceStatus::Found) found->assign(data, data + size);
    return status;
}

TEST(ResourceReader, FindsNumberedResourcesAcrossTextIdsAndPadding) {
    const Bytes image = sampleImage();
    std::string data;
    EXPECT_EQ(lookup(image, 6, 9, 0x409, &data), ResourceStatus::Found);
    EXPECT_EQ(data, "en");
    EXPECT_EQ(lookup(image, 6, 9, 0x40C, &data), ResourceStatus::Found);
    EXPECT_EQ(data, "de") << "without the wanted language, the first one in the file";
    EXPECT_EQ(lookup(image, 6, 10, 0x409, &data), ResourceStatus::Found);
    EXPECT_EQ(data, "xyz");
    EXPECT_EQ(lookup(image, 5, 101, 0x409, &data), ResourceStatus::Found);
    EXPECT_EQ(data, "dlg");
    EXPECT_EQ(lookup(image, 6, 11), ResourceStatus::NameNotFound);
    EXPECT_EQ(lookup(image, 4, 9), ResourceStatus::TypeNotFound);
    EXPECT_EQ(lookup(image, 0, 0), ResourceStatus::TypeNotFound) << "the leading record";
}

TEST(ResourceReader, AcceptsAnImageWithoutTheLastRecordsPadding) {
    Bytes image = sampleImage();
    image.resize(image.size() - 1);  // "dlg" was padded by one byte
    EXPECT_EQ(lookup(image, 5, 101), ResourceStatus::Found);
}

// Every cut of a valid image is read without overrunning it; the cut-off resource is not found.
TEST(ResourceReader, ReadsEveryTruncationSafely) {
    const Bytes image = sampleImage();
    for (size_t size = 0; size + 1 < image.size(); ++size) {
        Bytes cut(image.begin(), image.begin() + static_cast<std::ptrdiff_t>(size));
        EXPECT_NE(lookup(cut, 5, 101), ResourceStatus::Found) << size;
    }
}

// A string-table block whose fourth entry claims more text than the block holds.
TEST(ResourceReader, ReadsStringBlocksWithinTheirSize) {
    Bytes block;
    for (unsigned length : {0, 2, 1, 40}) put16(block, length);
    block.insert(block.begin() + 4, {'a', 0, 'b', 0});
    block.insert(block.begin() + 10, {'c', 0});
    std::unique_ptr<BYTE[]> copy(new BYTE[block.size()]);
    std::copy(block.begin(), block.end(), copy.get());
    const std::pair<unsigned, std::u16string> entries[] = {
        {0, u""}, {1, u"ab"}, {2, u"c"}, {3, u""}, {15, u""}};
    for (const auto& [index, text] : entries) {
        WORD length = 99;
        const BYTE* at = w32::blockString(copy.get(), block.size(), index, &length);
        ASSERT_EQ(length, text.size()) << index;
        EXPECT_EQ(std::memcmp(at, text.data(), 2 * text.size()), 0) << index;
    }
}

struct Damage {
    const char* name;
    std::function<void(Bytes&)> apply;
};

void PrintTo(const Damage& damage, std::ostream* out) { *out << damage.name; }

class DamagedImage : public testing::TestWithParam<Damage> {};

// Offsets in sampleImage(): the empty record is 0-31, the "MYTYPE" record starts at 32 (header
// 44 bytes) and the next record at 80; the last record's DataSize is at image.size() - 36.
const Damage Damages[] = {
    {"Empty", [](Bytes& b) { b.clear(); }},
    {"NoLeadingEmptyRecord", [](Bytes& b) { b.erase(b.begin(), b.begin() + 32); }},
    {"EmptyRecordWithData", [](Bytes& b) { b[0] = 4; }},
    {"HeaderSizePastEnd", [](Bytes& b) { b[37] = 0xFF; }},
    {"DataSizePastEnd", [](Bytes& b) { b[b.size() - 36] = 5; }},
    {"DataSizeHuge", [](Bytes& b) { std::fill_n(b.end() - 36, 4, 0xFF); }},
    {"FieldsPastHeaderSize",  // a 48-byte header declared as 32 bytes, at the very end
     [](Bytes& b) {
         b.resize(32);
         addRecord(b, {6}, {0, u"LONGNAME"}, 0x409, {});
         b[36] = 32;
         b.resize(64);
     }},
    {"HeaderSizeNotDwordAligned", [](Bytes& b) { b[36] = 46; }},
    {"UnterminatedTextId", [](Bytes& b) { std::fill(b.begin() + 40, b.begin() + 76, 'A'); }},
    {"TrailingBytes", [](Bytes& b) { b.insert(b.end(), 5, 0); }},
};

TEST_P(DamagedImage, HasNoResources) {
    Bytes image = sampleImage();
    GetParam().apply(image);
    EXPECT_EQ(lookup(image, 6, 9), ResourceStatus::NoResources);
}

std::string damageName(const testing::TestParamInfo<Damage>& damage) { return damage.param.name; }

INSTANTIATE_TEST_SUITE_P(Malformed, DamagedImage, testing::ValuesIn(Damages), damageName);

}  // namespace
