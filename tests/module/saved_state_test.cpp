// Saving and loading an instance's state: the exact bytes, what a damaged file leaves behind,
// and failing or short file calls at each step.
#include <atomic>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <random>

#include "support.h"

namespace {

using hv::Param;
using Bytes = std::vector<uint8_t>;
enum { SetCurrentKey = 1, Set64BitMode = 12, GetCurrentRootKey = 0, LastActionSuccessful = 4 };

void put32(Bytes& b, uint32_t v) {
    for (int i = 0; i < 4; ++i) b.push_back(static_cast<uint8_t>(v >> (8 * i)));
}

// A fresh file name in the system's temporary folder; test programs run side by side, so the
// name carries a random part besides the serial.
std::string temporaryPath() {
    static const unsigned process = std::random_device{}();
    static std::atomic<unsigned> serial{0};
    auto name =
        "hivelet-state-" + std::to_string(process) + "-" + std::to_string(++serial) + ".bin";
    return (std::filesystem::temp_directory_path() / name).u8string();
}

// SaveRunObject through a temporary file: its result, and the bytes the module wrote.
int saveBytes(hv::Instance& instance, Bytes& bytes) {
    std::string path = temporaryPath();
    int result = instance.saveState(path);
    std::ifstream in(std::filesystem::u8path(path), std::ios::binary);
    bytes.assign(std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>());
    in.close();
    std::filesystem::remove(std::filesystem::u8path(path));
    return result;
}

// LoadRunObject on a temporary file that holds these bytes.
int loadBytes(hv::Instance& instance, const Bytes& bytes) {
    std::string path = temporaryPath();
    {
        std::ofstream out(std::filesystem::u8path(path), std::ios::binary);
        out.write(reinterpret_cast<const char*>(bytes.data()),
                  static_cast<std::streamsize>(bytes.size()));
    }
    int result = instance.loadState(path);
    std::filesystem::remove(std::filesystem::u8path(path));
    return result;
}

// A record as the format lays it out; `keyBytes` overrides the stored length when given.
Bytes record(uint32_t root, uint32_t error, const char16_t* key, int keyBytes = -1) {
    Bytes b;
    put32(b, 1);
    put32(b, root);
    put32(b, error);
    std::u16string k = key ? key : u"";
    size_t length = key ? 2 * (k.size() + 1) : 0;
    if (keyBytes >= 0) length = static_cast<size_t>(keyBytes);
    b.push_back(static_cast<uint8_t>(length));
    b.push_back(static_cast<uint8_t>(length >> 8));
    if (key)
        for (char16_t c : k + u'\0') {
            b.push_back(static_cast<uint8_t>(c));
            b.push_back(static_cast<uint8_t>(c >> 8));
        }
    return b;
}

Bytes prefix(const Bytes& b, size_t n) { return Bytes(b.begin(), b.begin() + n); }

void setKey(hv::Instance& instance, const char16_t* key) {
    if (key) instance.action(SetCurrentKey, {Param::str(key)});
}

std::u16string keyOf(const hv::Instance& instance) {
    return instance.currentKey() ? instance.currentKey() : u"<null>";
}

// An instance in a known state that a load must either keep or replace.
struct Before : ::testing::Test {
    hv::Instance instance{hvtest::module()};
    void SetUp() override {
        instance.setRootKeyIndex(4);
        setKey(instance, u"Old\\Key");
        instance.setLastError(5);
        instance.action(Set64BitMode, {Param::integerValue(1)});
    }
    void expectUnchanged() {
        EXPECT_EQ(instance.rootKeyIndex(), 4u);
        EXPECT_EQ(instance.lastError(), 5u);
        EXPECT_EQ(keyOf(instance), u"Old\\Key");
        EXPECT_EQ(instance.use64BitView(), 1u);
    }
    void expectHeaderOnly(uint32_t root, uint32_t error) {
        EXPECT_EQ(instance.rootKeyIndex(), root);
        EXPECT_EQ(instance.lastError(), error);
        EXPECT_EQ(instance.currentKey(), nullptr);
        EXPECT_EQ(instance.use64BitView(), 1u);
    }
};

TEST(SavedState, SavesTheExactBytes) {
    const struct {
        uint32_t root, error;
        const char16_t* key;
        size_t size;
    } rows[] = {
        {2, 0, nullptr, 14},
        {2, 0, u"Software", 32},
        {2, 0, u"", 16},
        {9, 2, u"A\\B", 22},
        {0xFFFFFFFF, 0x80070005, nullptr, 14},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(hvtest::show(row.key ? row.key : u"<null>"));
        hv::Instance instance(hvtest::module());
        setKey(instance, row.key);
        instance.setRootKeyIndex(row.root);
        instance.setLastError(row.error);
        Bytes saved;
        EXPECT_EQ(saveBytes(instance, saved), 1);
        EXPECT_EQ(saved.size(), row.size);
        EXPECT_EQ(saved, record(row.root, row.error, row.key));
        EXPECT_EQ(instance.rootKeyIndex(), row.root) << "a save changes nothing";
    }
    // The two examples, spelt out.
    Bytes none = {1, 0, 0, 0, 2, 0, 0, 0, 0, 0, 0, 0, 0, 0};
    EXPECT_EQ(record(2, 0, nullptr), none);
    EXPECT_EQ(record(2, 0, u"Software")[12], 0x12);
}

TEST(SavedState, RoundTripKeepsRootErrorAndKeyButNotTheView) {
    const char16_t* keys[] = {nullptr, u"", u"Software", u"Software\\\u00e9\u4e2d\\x"};
    for (const char16_t* key : keys) {
        SCOPED_TRACE(hvtest::show(key ? key : u"<null>"));
        hv::Instance from(hvtest::module()), to(hvtest::module());
        setKey(from, key);
        from.setRootKeyIndex(3);
        from.setLastError(2);
        from.action(Set64BitMode, {Param::integerValue(1)});
        setKey(to, u"Other");
        Bytes saved;
        ASSERT_EQ(saveBytes(from, saved), 1);
        EXPECT_EQ(loadBytes(to, saved), 1);
        EXPECT_EQ(to.rootKeyIndex(), 3u);
        EXPECT_EQ(to.lastError(), 2u);
        EXPECT_EQ(to.use64BitView(), 0u) << "the view is not part of the state";
        EXPECT_EQ(keyOf(to), keyOf(from));
        EXPECT_EQ(to.condition(LastActionSuccessful).asCondition(), 0);
    }
}

// The longest key the 16-bit length can hold is saved; one more character is refused before
// anything is written, since a cut key would load as another key.
TEST(SavedState, KeyLongerThanTheFormatHoldsIsRefused) {
    for (size_t length : {32766u, 32767u, 40000u}) {
        SCOPED_TRACE(length);
        hv::Instance instance(hvtest::module());
        std::u16string key(length, u'k');
        setKey(instance, key.c_str());
        Bytes saved;
        bool fits = length <= 32766;
        EXPECT_EQ(saveBytes(instance, saved), fits ? 1 : 0);
        EXPECT_EQ(saved.size(), fits ? 14 + 2 * (length + 1) : 0u);
        if (fits) {
            hv::Instance back(hvtest::module());
            EXPECT_EQ(loadBytes(back, saved), 1);
            EXPECT_EQ(keyOf(back), key);
        }
    }
}

TEST_F(Before, DamagedRecords) {
    Bytes header = record(9, 2, nullptr);
    header.resize(12);
    Bytes version2 = record(1, 0, u"New");
    version2[0] = 2;
    Bytes odd = record(1, 3, u"AB", 5);
    odd.pop_back();
    Bytes unterminated = record(1, 3, u"AB");
    unterminated[18] = 'C';
    Bytes cut = record(1, 3, u"ABC");
    cut.resize(cut.size() - 1);
    const struct {
        const char* name;
        Bytes bytes;
        bool headerInForce;
    } rows[] = {
        {"empty file", {}, false},
        {"11 bytes", prefix(record(1, 3, u"A"), 11), false},
        {"version 2", version2, false},
        {"only the header", header, true},
        {"header and one length byte", prefix(record(9, 2, u"A"), 13), true},
        {"odd key length", odd, true},
        {"no terminating zero", unterminated, true},
        {"key text cut short", cut, true},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.name);
        SetUp();
        EXPECT_EQ(loadBytes(instance, row.bytes), 0);
        if (row.headerInForce)
            expectHeaderOnly(row.bytes[4], row.bytes[8]);
        else
            expectUnchanged();
    }
}

TEST_F(Before, InvalidRootIndexLoadsAsStoredAndShowsNoName) {
    EXPECT_EQ(loadBytes(instance, record(9, 0, u"Software")), 1);
    EXPECT_EQ(instance.rootKeyIndex(), 9u);
    EXPECT_EQ(instance.expression(GetCurrentRootKey).text, u"");
    EXPECT_EQ(instance.debugLine(0).text(), u"Current Root Key = ");
    EXPECT_EQ(keyOf(instance), u"Software");
}

// A record followed by other bytes of the host's file: the module reads only its own.
TEST_F(Before, ReadsOnlyItsOwnRecord) {
    Bytes bytes = record(1, 0, u"K");
    bytes.insert(bytes.end(), {0xDE, 0xAD});
    EXPECT_EQ(loadBytes(instance, bytes), 1);
    EXPECT_EQ(keyOf(instance), u"K");
}

// ---- File calls that fail or come up short (portable layer only) ----------------------------

struct FileFaults : Before {
    void SetUp() override {
        HV_NEEDS_TEST_CONTROL();
#if HV_HAS_TEST_CONTROL
        w32test::reset();
        Before::SetUp();
#endif
    }
    void TearDown() override {
#if HV_HAS_TEST_CONTROL
        w32test::clearFaults();
        w32test::reset();
#endif
    }
};

#if HV_HAS_TEST_CONTROL
// The nth write fails or writes nothing: the save reports 0, the instance is as it was, and
// nothing is written after it.
TEST_F(FileFaults, WriteFailsOrWritesNothingAtEachStep) {
    const size_t sizes[] = {12, 2, 16};
    for (bool silent : {false, true}) {
        for (unsigned nth = 1; nth <= 3; ++nth) {
            SCOPED_TRACE(std::string(silent ? "silent" : "failed") + " write " +
                         std::to_string(nth));
            w32test::clearJournal();
            if (silent)
                w32test::silentWrite(nth);
            else
                w32test::failCall("WriteFile", nth, ERROR_DISK_FULL);
            Bytes saved;
            EXPECT_EQ(saveBytes(instance, saved), 0);
            auto writes = w32test::callsOf("WriteFile");
            ASSERT_EQ(writes.size(), nth);
            for (size_t i = 0; i < nth; ++i) EXPECT_EQ(writes[i].args[2], sizes[i]);
            EXPECT_EQ(saved, prefix(record(4, 5, u"Old\\Key"), nth == 1 ? 0 : nth == 2 ? 12 : 14));
            expectUnchanged();
        }
    }
}

// The nth read fails, comes up one byte short or delivers nothing.
TEST_F(FileFaults, ReadFailsOrComesUpShortAtEachStep) {
    const Bytes saved = record(2, 0, u"Software");
    enum Kind { Fails, OneShort, Nothing };
    for (Kind kind : {Fails, OneShort, Nothing}) {
        for (unsigned nth = 1; nth <= 3; ++nth) {
            SCOPED_TRACE("read " + std::to_string(nth) + " kind " + std::to_string(kind));
            Before::SetUp();
            size_t live = w32test::liveAllocations();
            if (kind == Fails) w32test::failCall("ReadFile", nth, ERROR_READ_FAULT);
            if (kind == OneShort) w32test::shortRead(nth, 1);
            if (kind == Nothing) w32test::shortRead(nth, 0xFFFFFFFF);
            EXPECT_EQ(loadBytes(instance, saved), 0);
            if (nth == 1)
                expectUnchanged();
            else
                expectHeaderOnly(2, 0);
            EXPECT_LE(w32test::liveAllocations(), live) << "a dropped key text is freed";
            w32test::clearFaults();
        }
    }
}

TEST_F(FileFaults, NoMemoryForTheKeyText) {
    w32test::failCall("malloc", 1, 0);
    EXPECT_EQ(loadBytes(instance, record(1, 7, u"Software")), 0);
    expectHeaderOnly(1, 7);
}

TEST_F(FileFaults, OneCallPerFieldGroup) {
    Bytes saved;
    w32test::clearJournal();
    ASSERT_EQ(saveBytes(instance, saved), 1);
    EXPECT_EQ(w32test::count("WriteFile"), 3u);
    EXPECT_EQ(loadBytes(instance, saved), 1);
    auto reads = w32test::callsOf("ReadFile");
    ASSERT_EQ(reads.size(), 3u);
    EXPECT_EQ(reads[0].args[2], 12u);
    EXPECT_EQ(reads[1].args[2], 2u);
    EXPECT_EQ(reads[2].args[2], 16u);
    for (const auto& r : reads) EXPECT_EQ(r.args[4], 0u) << "no overlapped structure";
    EXPECT_EQ(w32test::openFileCount(), 0u);
}
#endif

}  // namespace
