// The editor's side of the event catalogue: menus, entries, texts and filled-in sentences.
#include <hivelet/catalogue.h>
#include <hivelet/param_editor.h>

#include <stdexcept>

#include "guarded.h"
#include "internal.h"

namespace hv {

namespace {

typedef HMENU(WINAPI* MenuFn)(void*, Slot, Slot);
typedef short(WINAPI* CodeFn)(void*, Slot);
typedef const int16_t*(WINAPI* InfosFn)(void*, Slot);
typedef void(WINAPI* StringFn)(void*, Slot, LPWSTR, Slot);
typedef void(WINAPI* TitleFn)(void*, Slot, Slot, LPWSTR, Slot);
typedef void(WINAPI* ExpressionTitleFn)(void*, Slot, LPWSTR, Slot);
typedef void(WINAPI* ObjInfosFn)(Slot, Slot, LPWSTR, LPWSTR, LPWSTR, LPWSTR, LPWSTR);

// The entry point Get<Kind><what>: GetConditionMenu, GetActionInfos, GetExpressionString ...
std::string exportName(EventKind kind, const char* what) {
    const char* const kinds[] = {"Condition", "Action", "Expression"};
    return std::string("Get") + kinds[static_cast<int>(kind)] + what;
}

// A buffer of `capacity` characters lent to one entry point: it starts empty, and after the
// call its guards are checked.
class TextBuffer {
public:
    TextBuffer(const std::string& entryPoint, int capacity)
        : block_(entryPoint + "'s buffer", 2 * static_cast<size_t>(capacity > 0 ? capacity : 0) + 2,
                 0) {}
    LPWSTR data() { return reinterpret_cast<LPWSTR>(block_.data()); }
    // The text up to its terminator (or the capacity, if the module left none).
    std::u16string text() {
        std::string damage = block_.damage();
        if (!damage.empty()) throw std::runtime_error(damage);
        const char16_t* p = reinterpret_cast<const char16_t*>(block_.data());
        size_t n = 0;
        while (n < block_.size() / 2 - 1 && p[n]) ++n;
        return std::u16string(p, n);
    }

private:
    Guarded block_;
};

// Calls the text entry point `name` as the editor does: the editor structure, `args`, then a
// lent buffer of `capacity` characters and the capacity; the text it left there.
template <typename Entry, typename... Args>
std::u16string textFrom(Module& module, Editor& editor, const std::string& name, int capacity,
                        Args... args) {
    TextBuffer buffer(name, capacity);
    module.entry<Entry>(name.c_str())(editor.structure(), args..., buffer.data(), capacity);
    return buffer.text();
}

// Every item of `menu`, nested popups included.
std::vector<MenuEntry> readMenu(HMENU menu, int depth = 0) {
    std::vector<MenuEntry> items;
    WCHAR text[256];
    int count = GetMenuItemCount(menu);
    for (int position = 0; position < count; ++position) {
        MenuEntry entry;
        UINT id = GetMenuItemID(menu, position);
        HMENU popup = GetSubMenu(menu, position);
        text[0] = 0;
        GetMenuStringW(menu, static_cast<UINT>(position), text, 256, MF_BYPOSITION);
        entry.text = fromWide(text);
        if (popup) {
            entry.kind = MenuEntry::Kind::Popup;
            if (depth < 16) entry.items = readMenu(popup, depth + 1);
        } else if (id == 0) {
            entry.kind = MenuEntry::Kind::Separator;
        } else {
            entry.id = id;
            entry.state = GetMenuState(menu, static_cast<UINT>(position), MF_BYPOSITION);
        }
        items.push_back(std::move(entry));
    }
    return items;
}

}  // namespace

HMENU Catalogue::menu(EventKind kind) {
    auto fn = module_.entry<MenuFn>(exportName(kind, "Menu").c_str());
    return fn(editor_.structure(), 0, 0);
}

std::optional<std::vector<MenuEntry>> Catalogue::menuItems(EventKind kind) {
    HMENU handle = menu(kind);
    if (!handle) return std::nullopt;
    std::vector<MenuEntry> items = readMenu(handle);
    DestroyMenu(handle);
    return items;
}

int Catalogue::codeFromMenu(EventKind kind, uint32_t id) {
    auto fn = module_.entry<CodeFn>(exportName(kind, "CodeFromMenu").c_str());
    return fn(editor_.structure(), static_cast<Slot>(id));
}

const int16_t* Catalogue::infos(EventKind kind, int code) {
    auto fn = module_.entry<InfosFn>(exportName(kind, "Infos").c_str());
    return fn(editor_.structure(), code);
}

std::optional<EventEntry> Catalogue::entry(EventKind kind, int code) {
    const int16_t* words = infos(kind, code);
    if (!words) return std::nullopt;
    EventEntry e;
    e.menuId = static_cast<uint16_t>(words[-2]);
    e.stringId = static_cast<uint16_t>(words[-1]);
    e.code = words[0];
    e.flags = words[1];
    int16_t count = words[2];
    for (int16_t i = 0; i < count && i < 16; ++i) {
        e.types.push_back(words[3 + i]);
        e.titleIds.push_back(words[3 + count + i]);
    }
    return e;
}

std::u16string Catalogue::displayText(EventKind kind, int code, int capacity) {
    return textFrom<StringFn>(module_, editor_, exportName(kind, "String"), capacity, code);
}

// An expression has one title, which takes no index.
std::u16string Catalogue::title(EventKind kind, int code, int index, int capacity) {
    std::string name = exportName(kind, "Title");
    if (kind != EventKind::Expression)
        return textFrom<TitleFn>(module_, editor_, name, capacity, code, index);
    if (index != 0) return std::u16string();
    return textFrom<ExpressionTitleFn>(module_, editor_, "GetExpressionTitle", capacity, code);
}

std::u16string Catalogue::expressionParam(int code, int index, int capacity) {
    return textFrom<TitleFn>(module_, editor_, "GetExpressionParam", capacity, code, index);
}

std::vector<std::u16string> Catalogue::identity() {
    TextBuffer name("GetObjInfos", 256), maker("GetObjInfos", 256), copyright("GetObjInfos", 256),
        description("GetObjInfos", 1024), web("GetObjInfos", 256);
    module_.entry<ObjInfosFn>("GetObjInfos")(0, 0, name.data(), maker.data(), copyright.data(),
                                             description.data(), web.data());
    return {name.text(), maker.text(), copyright.text(), description.text(), web.text()};
}

std::u16string Catalogue::parameterText(const Param& param) {
    switch (param.kind) {
        case Param::Kind::Text: return u"\"" + param.text + u"\"";
        case Param::Kind::Integer: return fromUtf8(std::to_string(param.integer));
        case Param::Kind::RootKey: {
            ParamEditor editor(module_, editor_);
            editor.setRecord(param.rootIndex);
            ParamEditor::Text name = editor.string(64);
            if (!name.intact) throw std::runtime_error("GetParameterString wrote past its buffer");
            // An index past the table leaves the buffer alone: there is no name to show.
            return name.untouched ? std::u16string() : name.text;
        }
        case Param::Kind::Null: return u"(null)";
        default: return u"?";
    }
}

std::u16string Catalogue::sentence(EventKind kind, int code, const std::vector<Param>& params) {
    std::u16string format = displayText(kind, code);
    std::u16string out;
    if (kind == EventKind::Expression) {
        out = format;
        for (size_t i = 0; i < params.size(); ++i)
            out += (i ? u", " : u"") + parameterText(params[i]);
        return out + u")";
    }
    for (size_t i = 0; i < format.size(); ++i) {
        char16_t next = i + 1 < format.size() ? format[i + 1] : 0;
        if (format[i] == u'%' && next >= u'0' && next <= u'3') {
            size_t index = static_cast<size_t>(next - u'0');
            out += index < params.size() ? parameterText(params[index])
                                         : u"%" + std::u16string(1, next);
            ++i;
        } else if (format[i] == u'%' && next == u'o') {
            out += identity()[0];
            ++i;
        } else {
            out += format[i];
        }
    }
    return out;
}

}  // namespace hv
