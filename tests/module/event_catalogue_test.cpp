// The event catalogue as the editor reads it: every entry's words and texts, the three menus,
// codes from menu identifiers, the compatibility gate, and buffers cut to their capacity.
#include <hivelet/catalogue.h>

#include <functional>
#include <tuple>

#include "support.h"

namespace {

using hv::EventKind;
using hv::MenuEntry;
using hv::Slot;

struct Param {
    int16_t type;
    int16_t titleId;
    std::u16string title;
};

struct Event {
    int code;
    uint16_t menuId;
    std::u16string menuText;
    uint16_t stringId;
    std::u16string display;
    int16_t flags;
    std::vector<Param> params;
};

const Param RootKey = {1000, 1000, u"Root key"};
const Param KeyName = {45, 1001, u"Key name"};
const Param ValueName = {45, 1002, u"Value name"};
const Param ArgRootKey = {3, 1000, u"Root key"};
const Param ArgKeyName = {3, 1001, u"Key name"};
const Param ArgValueName = {3, 1002, u"Value name"};

// clang-format off
const std::vector<Event> Conditions = {
    {0, 26000, u"Key exists", 6000, u"%o: key %0\\%1 exists", 0x0220, {RootKey, KeyName}},
    {1, 26001, u"Value exists", 6001, u"%o: value %2 of key %0\\%1 exists", 0x0220,
     {RootKey, KeyName, ValueName}},
    {2, 26002, u"Current key exists", 6002, u"%o: current key exists", 0x0220, {}},
    {3, 26003, u"Value exists in current key", 6003, u"%o: value %0 of current key exists",
     0x0220, {ValueName}},
    {4, 26004, u"Last action successful", 6004, u"%o: last action successful", 0x0220, {}},
};

const std::vector<Event> Actions = {
    {0, 25000, u"Set Current Root Key", 5000, u"Set root key to %0", 0, {RootKey}},
    {1, 25001, u"Set Current Key", 5001, u"Set current key to %0", 0, {KeyName}},
    {2, 25002, u"Set DWORD Value", 5002, u"Set value %0 of current key to %1", 0,
     {ValueName, {22, 0, u"Set DWORD Value"}}},
    {3, 25003, u"Set String Value", 5003, u"Set value %0 of current key to %1", 0,
     {ValueName, {45, 0, u"Set String Value"}}},
    {4, 25004, u"Set DWORD Value", 5004, u"Set value %2 of key %0\\%1 to %3", 0,
     {RootKey, KeyName, ValueName, {22, 0, u"Set DWORD Value"}}},
    {5, 25005, u"Set String Value", 5005, u"Set value %2 of key %0\\%1 to %3", 0,
     {RootKey, KeyName, ValueName, {45, 0, u"Set String Value"}}},
    {6, 25006, u"Delete Current Key", 5006, u"Delete current key", 0, {}},
    {7, 25007, u"Delete Value", 5007, u"Delete value %0 of current key", 0, {ValueName}},
    {8, 25008, u"Delete Key", 5008, u"Delete key %0\\%1", 0, {RootKey, KeyName}},
    {9, 25009, u"Delete Value", 5009, u"Delete value %2 of key %0\\%1", 0,
     {RootKey, KeyName, ValueName}},
    {10, 25010, u"Create Current Key", 5010, u"Create current key", 0, {}},
    {11, 25011, u"Create Key", 5011, u"Create key %0\\%1", 0, {RootKey, KeyName}},
    {12, 25012, u"Set 64-bit mode", 5012, u"Set 64-bit mode to %0", 0,
     {{22, 1008, u"0=32-bit, 1=64-bit"}}},
};

const std::vector<Event> Expressions = {
    {0, 27000, u"Get Current Root Key", 7000, u"RegCurRootKey$(", 1, {}},
    {1, 27001, u"Get Current Key", 7001, u"RegCurKey$(", 1, {}},
    {2, 27002, u"Get DWORD Value", 7002, u"RegCurKeyDW(", 0, {ArgValueName}},
    {3, 27003, u"Get String Value", 7003, u"RegCurKeySZ$(", 1, {ArgValueName}},
    {4, 27004, u"Get DWORD Value", 7004, u"RegKeyDW(", 0, {ArgRootKey, ArgKeyName, ArgValueName}},
    {5, 27005, u"Get String Value", 7005, u"RegKeySZ$(", 1, {ArgRootKey, ArgKeyName, ArgValueName}},
    {6, 27006, u"Last error code", 7006, u"RegErrCode(", 0, {}},
    {7, 27007, u"Last error message", 7007, u"RegErrText$(", 1, {}},
};
// clang-format on

const std::pair<EventKind, const std::vector<Event>*> Kinds[] = {
    {EventKind::Condition, &Conditions},
    {EventKind::Action, &Actions},
    {EventKind::Expression, &Expressions}};

// A menu as nested lines: "text id", "-" for a separator, "text >" with its items indented.
void flatten(const std::vector<MenuEntry>& items, const std::string& indent,
             std::vector<std::string>& lines) {
    for (const MenuEntry& item : items) {
        if (item.kind == MenuEntry::Kind::Separator) {
            lines.push_back(indent + "-");
        } else if (item.kind == MenuEntry::Kind::Popup) {
            lines.push_back(indent + hv::toUtf8(item.text) + " >");
            flatten(item.items, indent + "  ", lines);
        } else {
            lines.push_back(indent + hv::toUtf8(item.text) + " " + std::to_string(item.id) +
                            (item.state ? " state " + std::to_string(item.state) : ""));
        }
    }
}

class Catalogue : public ::testing::Test {
protected:
    void SetUp() override {
#if HV_HAS_TEST_CONTROL
        w32test::reset();
#endif
    }
    hv::Editor editor;
    hv::Catalogue catalogue{hvtest::module(), editor};

    std::vector<std::string> menuLines(EventKind kind) {
        std::vector<std::string> lines;
        auto items = catalogue.menuItems(kind);
        EXPECT_TRUE(items.has_value());
        if (items) flatten(*items, "", lines);
        return lines;
    }
};

TEST_F(Catalogue, EveryEntryHasItsWordsAndTexts) {
    for (auto [kind, events] : Kinds) {
        for (const Event& e : *events) {
            SCOPED_TRACE(std::string(hv::kindName(kind)) + " " + std::to_string(e.code));
            const int16_t* words = catalogue.infos(kind, e.code);
            ASSERT_NE(words, nullptr);
            std::vector<int16_t> expected = {
                static_cast<int16_t>(e.menuId), static_cast<int16_t>(e.stringId),
                static_cast<int16_t>(e.code), e.flags, static_cast<int16_t>(e.params.size())};
            for (const Param& p : e.params) expected.push_back(p.type);
            for (const Param& p : e.params) expected.push_back(p.titleId);
            EXPECT_EQ(std::vector<int16_t>(words - 2, words - 2 + expected.size()), expected);
            EXPECT_EQ(catalogue.displayText(kind, e.code), e.display);
            EXPECT_EQ(catalogue.codeFromMenu(kind, e.menuId), e.code);
            for (size_t i = 0; i < e.params.size(); ++i) {
                int index = static_cast<int>(i);
                if (kind == EventKind::Expression) {
                    EXPECT_EQ(catalogue.expressionParam(e.code, index), e.params[i].title);
                } else {
                    EXPECT_EQ(catalogue.title(kind, e.code, index), e.params[i].title);
                }
            }
        }
    }
    // Entries follow each other without gaps: entry k + 1 starts 10 + 4n bytes after entry k.
    for (auto [kind, events] : Kinds) {
        for (size_t k = 0; k + 1 < events->size(); ++k) {
            const int16_t* a = catalogue.infos(kind, static_cast<int>(k));
            const int16_t* b = catalogue.infos(kind, static_cast<int>(k + 1));
            EXPECT_EQ(b - a, static_cast<ptrdiff_t>(5 + 2 * (*events)[k].params.size()));
        }
    }
    // The example of a whole entry, word for word from its code on.
    const int16_t* setDword = catalogue.infos(EventKind::Action, 4);
    EXPECT_EQ(std::vector<int16_t>(setDword, setDword + 11),
              (std::vector<int16_t>{4, 0, 4, 1000, 45, 45, 22, 1000, 1001, 1002, 0}));
}

TEST_F(Catalogue, TablesMenusAndRoutinesAgree) {
    const hv::Module::Tables& tables = hvtest::module().tables();
    // 5 conditions, 13 actions and 8 expressions.
    const std::tuple<EventKind, size_t, size_t> routines[] = {
        {EventKind::Condition, tables.conditions.size(), 5},
        {EventKind::Action, tables.actions.size(), 13},
        {EventKind::Expression, tables.expressions.size(), 8}};
    for (auto [kind, count, events] : routines) {
        SCOPED_TRACE(hv::kindName(kind));
        EXPECT_EQ(count, events);
        // Every command of the menu belongs to exactly one entry, with the entry's menu text,
        // and every entry has exactly one item; the entry's parameters are those the routine
        // fetches.
        auto items = catalogue.menuItems(kind);
        ASSERT_TRUE(items);
        std::vector<std::pair<uint32_t, std::u16string>> commands;
        std::vector<const std::vector<MenuEntry>*> pending = {&*items};
        while (!pending.empty()) {
            const std::vector<MenuEntry>* level = pending.back();
            pending.pop_back();
            for (const MenuEntry& item : *level) {
                if (item.kind == MenuEntry::Kind::Popup) pending.push_back(&item.items);
                if (item.kind == MenuEntry::Kind::Command) commands.push_back({item.id, item.text});
            }
        }
        EXPECT_EQ(commands.size(), count);
        std::vector<bool> seen(count);
        for (auto& [id, text] : commands) {
            int code = catalogue.codeFromMenu(kind, id);
            ASSERT_GE(code, 0) << id;
            ASSERT_LT(static_cast<size_t>(code), count);
            EXPECT_FALSE(seen[static_cast<size_t>(code)]) << id;
            seen[static_cast<size_t>(code)] = true;
            auto entry = catalogue.entry(kind, code);
            ASSERT_TRUE(entry);
            EXPECT_EQ(entry->code, code);
            EXPECT_EQ(entry->menuId, id);
            EXPECT_EQ(entry->stringId, id - 20000);  // display texts are numbered like the items
            EXPECT_EQ(static_cast<int>(entry->types.size()), hv::parameterCount(kind, code));
        }
    }
}

TEST_F(Catalogue, MenusHaveTheirExactStructure) {
    EXPECT_EQ(menuLines(EventKind::Action),
              (std::vector<std::string>{"Current Key >",
                                        "  Set Current Root Key 25000",
                                        "  Set Current Key 25001",
                                        "  -",
                                        "  Create Current Key 25010",
                                        "  -",
                                        "  Set DWORD Value 25002",
                                        "  Set String Value 25003",
                                        "  -",
                                        "  Delete Current Key 25006",
                                        "  Delete Value 25007",
                                        "Any Key >",
                                        "  Create Key 25011",
                                        "  -",
                                        "  Set DWORD Value 25004",
                                        "  Set String Value 25005",
                                        "  -",
                                        "  Delete Key 25008",
                                        "  Delete Value 25009",
                                        "Set 64-bit mode 25012"}));
    EXPECT_EQ(menuLines(EventKind::Condition),
              (std::vector<std::string>{
                  "Current key exists 26002", "Value exists in current key 26003", "-",
                  "Key exists 26000", "Value exists 26001", "-", "Last action successful 26004"}));
    EXPECT_EQ(menuLines(EventKind::Expression),
              (std::vector<std::string>{"Current Key >", "  Get Current Root Key 27000",
                                        "  Get Current Key 27001", "  -", "  Get DWORD Value 27002",
                                        "  Get String Value 27003", "Any Key >",
                                        "  Get DWORD Value 27004", "  Get String Value 27005", "-",
                                        "Last error code 27006", "Last error message 27007"}));
}

TEST_F(Catalogue, CodesFromForeignIdentifiers) {
    const std::tuple<EventKind, uint32_t, int> table[] = {
        {EventKind::Action, 25012, 12},
        {EventKind::Condition, 26004, 4},
        {EventKind::Condition, 25000, -1},
        {EventKind::Expression, 0, -1},
        {EventKind::Action, 25013, -1},
        {EventKind::Expression, 27008, -1},
        {EventKind::Action, 0xFFFF, -1},
        {EventKind::Action, 0x10000 + 25012, 12},
        {EventKind::Expression, 0xABCD0000 + 27007, 7}};
    for (auto [kind, id, code] : table)
        EXPECT_EQ(catalogue.codeFromMenu(kind, id), code) << hv::kindName(kind) << " " << id;
}

// Menu and String entry points answer only an editor that passes the gate; the others answer
// every editor.
TEST_F(Catalogue, GateOnMenusAndDisplayTexts) {
    editor.setHostVersion(0x020000F1);
    for (auto [kind, events] : Kinds) {
        EXPECT_EQ(catalogue.menu(kind), nullptr);
        typedef void(WINAPI * Fn)(void*, Slot, LPWSTR, Slot);
        const char* name = kind == EventKind::Condition ? "GetConditionString"
                           : kind == EventKind::Action  ? "GetActionString"
                                                        : "GetExpressionString";
        hvtest::Guarded<char16_t> buffer(64);
        hvtest::module().entry<Fn>(name)(editor.structure(), 0, hvtest::wide(buffer.data()), 64);
        EXPECT_TRUE(buffer.untouched()) << name;
        EXPECT_NE(catalogue.infos(kind, 0), nullptr);
        EXPECT_EQ(catalogue.codeFromMenu(kind, (*events)[0].menuId), 0);
    }
    EXPECT_EQ(catalogue.title(EventKind::Action, 12, 0), u"0=32-bit, 1=64-bit");
    editor.setHostVersion(0x02000100, false);
    EXPECT_EQ(catalogue.menu(EventKind::Action), nullptr);
}

// Texts are cut to the capacity less one and terminated; nothing is written past the capacity,
// and capacities with no room for a terminator leave the buffer alone.
TEST_F(Catalogue, BuffersAreCutToTheirCapacity) {
    typedef void(WINAPI * StringFn)(void*, Slot, LPWSTR, Slot);
    typedef void(WINAPI * TitleFn)(void*, Slot, Slot, LPWSTR, Slot);
    auto string = hvtest::module().entry<StringFn>("GetConditionString");
    auto title = hvtest::module().entry<TitleFn>("GetConditionTitle");
    auto actionTitle = hvtest::module().entry<TitleFn>("GetActionTitle");
    auto param = hvtest::module().entry<TitleFn>("GetExpressionParam");
    struct Case {
        const char* what;
        std::function<void(LPWSTR, Slot)> call;
        size_t capacity;
        Slot passed;
        std::u16string expected;  // empty: the buffer must be untouched
    };
    void* ed = editor.structure();
    const Case cases[] = {
        {"title 5", [&](LPWSTR b, Slot c) { title(ed, 0, 1, b, c); }, 5, 5, u"Key "},
        {"title 1", [&](LPWSTR b, Slot c) { title(ed, 0, 1, b, c); }, 1, 1, std::u16string(1, 0)},
        {"title 0", [&](LPWSTR b, Slot c) { title(ed, 0, 1, b, c); }, 0, 0, u""},
        {"title 0x10005", [&](LPWSTR b, Slot c) { title(ed, 0, 1, b, c); }, 5, 0x10005, u"Key "},
        {"menu title 4", [&](LPWSTR b, Slot c) { actionTitle(ed, 5, 3, b, c); }, 4, 4, u"Set"},
        {"menu title 1", [&](LPWSTR b, Slot c) { actionTitle(ed, 5, 3, b, c); }, 1, 1,
         std::u16string(1, 0)},
        {"string 3", [&](LPWSTR b, Slot c) { string(ed, 1, b, c); }, 3, 3, u"%o"},
        {"string 0", [&](LPWSTR b, Slot c) { string(ed, 1, b, c); }, 0, 0, u""},
        {"string -1", [&](LPWSTR b, Slot c) { string(ed, 1, b, c); }, 0, 0xFFFF, u""},
        {"param 6", [&](LPWSTR b, Slot c) { param(ed, 5, 2, b, c); }, 6, 6, u"Value"},
        {"param 0", [&](LPWSTR b, Slot c) { param(ed, 5, 2, b, c); }, 0, 0, u""},
    };
    for (const Case& c : cases) {
        hvtest::Guarded<char16_t> buffer(c.capacity, u'\xA5A5');
        c.call(hvtest::wide(buffer.data()), c.passed);
        if (c.expected.empty()) {
            EXPECT_TRUE(buffer.untouched()) << c.what;
        } else {
            EXPECT_EQ(std::u16string(buffer.data()), c.expected.c_str()) << c.what;
            EXPECT_TRUE(buffer.intact()) << c.what;
        }
    }
}

// Codes outside a table, parameter indexes past an entry's count and expressions without
// parameters: Infos gives null, the others leave the buffer as it was.
TEST_F(Catalogue, NothingOutsideTheTables) {
    typedef void(WINAPI * StringFn)(void*, Slot, LPWSTR, Slot);
    typedef void(WINAPI * TitleFn)(void*, Slot, Slot, LPWSTR, Slot);
    void* ed = editor.structure();
    for (auto [kind, events] : Kinds) {
        Slot past = static_cast<Slot>(events->size());
        for (Slot code : {past, Slot{-1}, Slot{0x7FFF}})
            EXPECT_EQ(catalogue.infos(kind, static_cast<int>(code)), nullptr);
        // Only the low 16 bits of a code count.
        EXPECT_EQ(catalogue.infos(kind, 0x10000), catalogue.infos(kind, 0));
    }
    auto untouched = [](const std::function<void(LPWSTR)>& call) {
        hvtest::Guarded<char16_t> buffer(64);
        call(hvtest::wide(buffer.data()));
        return buffer.untouched();
    };
    auto string = hvtest::module().entry<StringFn>("GetActionString");
    auto title = hvtest::module().entry<TitleFn>("GetActionTitle");
    auto conditionTitle = hvtest::module().entry<TitleFn>("GetConditionTitle");
    auto expressionTitle = hvtest::module().entry<StringFn>("GetExpressionTitle");
    auto param = hvtest::module().entry<TitleFn>("GetExpressionParam");
    EXPECT_TRUE(untouched([&](LPWSTR b) { string(ed, 13, b, 64); }));
    EXPECT_TRUE(untouched([&](LPWSTR b) { title(ed, 13, 0, b, 64); }));
    EXPECT_TRUE(untouched([&](LPWSTR b) { title(ed, 6, 0, b, 64); }));
    EXPECT_TRUE(untouched([&](LPWSTR b) { title(ed, 4, 4, b, 64); }));
    EXPECT_TRUE(untouched([&](LPWSTR b) { conditionTitle(ed, 1, 3, b, 64); }));
    EXPECT_TRUE(untouched([&](LPWSTR b) { conditionTitle(ed, 0, 0xFFFF, b, 64); }));
    EXPECT_TRUE(untouched([&](LPWSTR b) { param(ed, 5, 3, b, 64); }));
    EXPECT_TRUE(untouched([&](LPWSTR b) { param(ed, 8, 0, b, 64); }));
    for (Slot code : {0, 1, 6, 7, 8})
        EXPECT_TRUE(untouched([&](LPWSTR b) { expressionTitle(ed, code, b, 64); })) << code;
    EXPECT_EQ(catalogue.title(EventKind::Expression, 4, 0), u"Root key");
    EXPECT_EQ(catalogue.title(EventKind::Expression, 3, 0), u"Value name");
}

#if HV_HAS_TEST_CONTROL
// Each Menu call loads the resource once, destroys that copy, and leaves exactly one menu alive:
// the popup it hands over. Failures on the way leave nothing alive.
TEST_F(Catalogue, MenusLeaveOnlyTheirPopupAlive) {
    for (auto [kind, events] : Kinds) {
        w32test::clearJournal();
        HMENU menu = catalogue.menu(kind);
        ASSERT_NE(menu, nullptr);
        EXPECT_EQ(w32test::liveMenus(), std::vector<HMENU>{menu});
        auto loads = w32test::callsOf("LoadMenuW");
        ASSERT_EQ(loads.size(), 1u);
        auto destroys = w32test::callsOf("DestroyMenu");
        ASSERT_EQ(destroys.size(), 1u);
        EXPECT_EQ(destroys[0].args[0], static_cast<uint64_t>(loads[0].result));
        EXPECT_TRUE(DestroyMenu(menu));
    }
    // A title taken from a menu text destroys the menu it loaded.
    EXPECT_EQ(catalogue.title(EventKind::Action, 2, 1), u"Set DWORD Value");
    EXPECT_TRUE(w32test::liveMenus().empty());

    const std::pair<const char*, unsigned> faults[] = {
        {"LoadMenuW", 1},       {"CreatePopupMenu", 1}, {"CreatePopupMenu", 2},
        {"CreatePopupMenu", 3}, {"AppendMenuW", 1},     {"AppendMenuW", 12}};
    for (auto [function, nth] : faults) {
        w32test::failCall(function, nth, 8);
        EXPECT_EQ(catalogue.menu(EventKind::Action), nullptr) << function << " " << nth;
        EXPECT_EQ(w32test::menuObjectCount(), 0u) << function << " " << nth;
        w32test::clearFaults();
    }
    w32test::failCall("LoadMenuW", 1, 8);
    hvtest::Guarded<char16_t> buffer(64);
    typedef void(WINAPI * TitleFn)(void*, Slot, Slot, LPWSTR, Slot);
    hvtest::module().entry<TitleFn>("GetActionTitle")(editor.structure(), 2, 1,
                                                      hvtest::wide(buffer.data()), 64);
    EXPECT_TRUE(buffer.untouched());
}
#endif

TEST_F(Catalogue, SentencesFillInTheParameters) {
    EXPECT_EQ(catalogue.sentence(EventKind::Condition, 3, {hv::Param::str(u"Name")}),
              u"Hivelet: value \"Name\" of current key exists");
    EXPECT_EQ(catalogue.sentence(EventKind::Action, 12, {hv::Param::integerValue(1)}),
              u"Set 64-bit mode to 1");
    EXPECT_EQ(catalogue.sentence(EventKind::Expression, 3, {hv::Param::str(u"Name")}),
              u"RegCurKeySZ$(\"Name\")");
}

}  // namespace
