// The event catalogue the editor reads: for every condition, action and expression its menu item,
// display text, flags, parameter types and parameter titles, and the menus the author picks from.
#include <hivelet_events.h>

#include "module_entry.h"

#include "../resources/resource.h"

namespace {

// Parameter types, as the editor knows them.
const short ParamRootKey = 1000;      // a RootKeyParam record, edited with the root-key dialog
const short ParamText = 45;           // a text: key path, value name or string value
const short ParamInteger = 22;        // a 32-bit integer
const short ParamExpressionText = 3;  // a text argument of an expression

// A parameter title of 0: the event's own menu text serves as the title.
const short TitleFromMenu = 0;

// Event flags.
const short ConditionFlags = 0x0220;
const short ActionFlags = 0;
const short ReturnsText = 0x0001;
const short ReturnsInteger = 0;

// EventInfo entries: menuId, stringId, code, flags, paramCount, the parameter types, then the
// parameter titles. Entries follow each other without gaps, in code order; the editor sees each
// entry from its code on.
// clang-format off
constexpr short ConditionInfoTable[] = {
    IDM_CND_KEY_EXISTS, IDS_CND_KEY_EXISTS, 0, ConditionFlags, 2,
        ParamRootKey, ParamText, IDS_TITLE_ROOT_KEY, IDS_TITLE_KEY_NAME,
    IDM_CND_VALUE_EXISTS, IDS_CND_VALUE_EXISTS, 1, ConditionFlags, 3,
        ParamRootKey, ParamText, ParamText,
        IDS_TITLE_ROOT_KEY, IDS_TITLE_KEY_NAME, IDS_TITLE_VALUE_NAME,
    IDM_CND_CURRENT_KEY_EXISTS, IDS_CND_CURRENT_KEY_EXISTS, 2, ConditionFlags, 0,
    IDM_CND_CURRENT_VALUE_EXISTS, IDS_CND_CURRENT_VALUE_EXISTS, 3, ConditionFlags, 1,
        ParamText, IDS_TITLE_VALUE_NAME,
    IDM_CND_LAST_ACTION_SUCCESSFUL, IDS_CND_LAST_ACTION_SUCCESSFUL, 4, ConditionFlags, 0,
};

constexpr short ActionInfoTable[] = {
    IDM_ACT_SET_ROOT_KEY, IDS_ACT_SET_ROOT_KEY, 0, ActionFlags, 1,
        ParamRootKey, IDS_TITLE_ROOT_KEY,
    IDM_ACT_SET_CURRENT_KEY, IDS_ACT_SET_CURRENT_KEY, 1, ActionFlags, 1,
        ParamText, IDS_TITLE_KEY_NAME,
    IDM_ACT_SET_CURRENT_DWORD, IDS_ACT_SET_CURRENT_DWORD, 2, ActionFlags, 2,
        ParamText, ParamInteger, IDS_TITLE_VALUE_NAME, TitleFromMenu,
    IDM_ACT_SET_CURRENT_STRING, IDS_ACT_SET_CURRENT_STRING, 3, ActionFlags, 2,
        ParamText, ParamText, IDS_TITLE_VALUE_NAME, TitleFromMenu,
    IDM_ACT_SET_DWORD, IDS_ACT_SET_DWORD, 4, ActionFlags, 4,
        ParamRootKey, ParamText, ParamText, ParamInteger,
        IDS_TITLE_ROOT_KEY, IDS_TITLE_KEY_NAME, IDS_TITLE_VALUE_NAME, TitleFromMenu,
    IDM_ACT_SET_STRING, IDS_ACT_SET_STRING, 5, ActionFlags, 4,
        ParamRootKey, ParamText, ParamText, ParamText,
        IDS_TITLE_ROOT_KEY, IDS_TITLE_KEY_NAME, IDS_TITLE_VALUE_NAME, TitleFromMenu,
    IDM_ACT_DELETE_CURRENT_KEY, IDS_ACT_DELETE_CURRENT_KEY, 6, ActionFlags, 0,
    IDM_ACT_DELETE_CURRENT_VALUE, IDS_ACT_DELETE_CURRENT_VALUE, 7, ActionFlags, 1,
        ParamText, IDS_TITLE_VALUE_NAME,
    IDM_ACT_DELETE_KEY, IDS_ACT_DELETE_KEY, 8, ActionFlags, 2,
        ParamRootKey, ParamText, IDS_TITLE_ROOT_KEY, IDS_TITLE_KEY_NAME,
    IDM_ACT_DELETE_VALUE, IDS_ACT_DELETE_VALUE, 9, ActionFlags, 3,
        ParamRootKey, ParamText, ParamText,
        IDS_TITLE_ROOT_KEY, IDS_TITLE_KEY_NAME, IDS_TITLE_VALUE_NAME,
    IDM_ACT_CREATE_CURRENT_KEY, IDS_ACT_CREATE_CURRENT_KEY, 10, ActionFlags, 0,
    IDM_ACT_CREATE_KEY, IDS_ACT_CREATE_KEY, 11, ActionFlags, 2,
        ParamRootKey, ParamText, IDS_TITLE_ROOT_KEY, IDS_TITLE_KEY_NAME,
    IDM_ACT_SET_64BIT_MODE, IDS_ACT_SET_64BIT_MODE, 12, ActionFlags, 1,
        ParamInteger, IDS_TITLE_64BIT_MODE,
};

constexpr short ExpressionInfoTable[] = {
    IDM_EXP_GET_CURRENT_ROOT_KEY, IDS_EXP_GET_CURRENT_ROOT_KEY, 0, ReturnsText, 0,
    IDM_EXP_GET_CURRENT_KEY, IDS_EXP_GET_CURRENT_KEY, 1, ReturnsText, 0,
    IDM_EXP_GET_CURRENT_DWORD, IDS_EXP_GET_CURRENT_DWORD, 2, ReturnsInteger, 1,
        ParamExpressionText, IDS_TITLE_VALUE_NAME,
    IDM_EXP_GET_CURRENT_STRING, IDS_EXP_GET_CURRENT_STRING, 3, ReturnsText, 1,
        ParamExpressionText, IDS_TITLE_VALUE_NAME,
    IDM_EXP_GET_DWORD, IDS_EXP_GET_DWORD, 4, ReturnsInteger, 3,
        ParamExpressionText, ParamExpressionText, ParamExpressionText,
        IDS_TITLE_ROOT_KEY, IDS_TITLE_KEY_NAME, IDS_TITLE_VALUE_NAME,
    IDM_EXP_GET_STRING, IDS_EXP_GET_STRING, 5, ReturnsText, 3,
        ParamExpressionText, ParamExpressionText, ParamExpressionText,
        IDS_TITLE_ROOT_KEY, IDS_TITLE_KEY_NAME, IDS_TITLE_VALUE_NAME,
    IDM_EXP_LAST_ERROR_CODE, IDS_EXP_LAST_ERROR_CODE, 6, ReturnsInteger, 0,
    IDM_EXP_LAST_ERROR_MESSAGE, IDS_EXP_LAST_ERROR_MESSAGE, 7, ReturnsText, 0,
};
// clang-format on

// Word positions inside an entry.
const int MenuIdWord = 0;
const int StringIdWord = 1;
const int CodeWord = 2;
const int ParamCountWord = 4;
const int ParamTypesWord = 5;

// Words of an entry with `paramCount` parameters.
constexpr size_t EntryWords(short paramCount) { return 5 + 2 * static_cast<size_t>(paramCount); }

// How many parameters the event list gives each event, in code order.
#define HV_PARAMETERS(code, routine, parameters) parameters,
constexpr short ConditionParameters[] = {HV_CONDITIONS(HV_PARAMETERS)};
constexpr short ActionParameters[] = {HV_ACTIONS(HV_PARAMETERS)};
constexpr short ExpressionParameters[] = {HV_EXPRESSIONS(HV_PARAMETERS)};
#undef HV_PARAMETERS

// Checks at build time that a table holds one well-formed entry per event of the list, in code
// order, each with the list's number of parameters, and nothing after them.
template <size_t N, size_t Events>
constexpr bool MatchesEventList(const short (&table)[N], const short (&parameters)[Events]) {
    size_t at = 0;
    for (size_t code = 0; code < Events; ++code) {
        if (at + EntryWords(0) > N || table[at + CodeWord] != static_cast<short>(code))
            return false;
        short count = parameters[code];
        if (count < 0 || count > 4 || table[at + ParamCountWord] != count) return false;
        at += EntryWords(count);
    }
    return at == N;
}

static_assert(MatchesEventList(ConditionInfoTable, ConditionParameters), "condition table");
static_assert(MatchesEventList(ActionInfoTable, ActionParameters), "action table");
static_assert(MatchesEventList(ExpressionInfoTable, ExpressionParameters), "expression table");

const int ConditionCount = sizeof(ConditionParameters) / sizeof(ConditionParameters[0]);
const int ActionCount = sizeof(ActionParameters) / sizeof(ActionParameters[0]);
const int ExpressionCount = sizeof(ExpressionParameters) / sizeof(ExpressionParameters[0]);

// One table with its size and its menu.
struct Catalogue {
    const short* table;
    int count;
    UINT menu;
};

const Catalogue Conditions = {ConditionInfoTable, ConditionCount, IDR_CONDITION_MENU};
const Catalogue Actions = {ActionInfoTable, ActionCount, IDR_ACTION_MENU};
const Catalogue Expressions = {ExpressionInfoTable, ExpressionCount, IDR_EXPRESSION_MENU};

// The entry whose code equals `code` as a 16-bit value, or null when the table has none.
const short* FindEventInfo(const Catalogue& catalogue, HostValue code) {
    const short* entry = catalogue.table;
    for (int i = 0; i < catalogue.count; ++i) {
        if (static_cast<WORD>(entry[CodeWord]) == static_cast<WORD>(code)) return entry;
        entry += EntryWords(entry[ParamCountWord]);
    }
    return nullptr;
}

// The parameter title at `index` of the entry for `code`; false when there is no such entry or
// parameter.
bool ParamTitle(const Catalogue& catalogue, HostValue code, HostValue index, short* title) {
    const short* entry = FindEventInfo(catalogue, code);
    if (!entry) return false;
    WORD param = static_cast<WORD>(index);
    short count = entry[ParamCountWord];
    if (param >= count) return false;
    *title = entry[ParamTypesWord + count + param];
    return true;
}

// Loads string `id` into the buffer, cut to the capacity less one and terminated. A capacity
// below 1 has no room even for the terminator; the buffer is left alone then (LoadStringW would
// store a pointer in a buffer of capacity 0). A capacity of 1 holds just the terminator, which
// LoadStringW does not write.
void LoadText(UINT id, LPWSTR buffer, int capacity) {
    if (capacity < 1) return;
    if (capacity == 1) {
        buffer[0] = 0;
        return;
    }
    LoadStringW(moduleInstance, id, buffer, capacity);
}

// Copies the items of `source` into `destination`, popups and all. False when a popup cannot
// be created or an item cannot be added.
bool CopyMenuItems(HMENU destination, HMENU source) {
    WCHAR text[80];
    int count = GetMenuItemCount(source);
    for (int position = 0; position < count; ++position) {
        UINT id = GetMenuItemID(source, position);
        if (id == 0) {
            if (!AppendMenuW(destination, MF_SEPARATOR, 0, nullptr)) return false;
            continue;
        }
        text[0] = 0;
        GetMenuStringW(source, static_cast<UINT>(position), text, 80, MF_BYPOSITION);
        if (id == 0xFFFFFFFF) {
            HMENU popup = CreatePopupMenu();
            if (!popup) return false;
            if (!AppendMenuW(destination, MF_POPUP, reinterpret_cast<UINT_PTR>(popup), text)) {
                DestroyMenu(popup);
                return false;
            }
            if (!CopyMenuItems(popup, GetSubMenu(source, position))) return false;
        } else {
            UINT state = GetMenuState(source, static_cast<UINT>(position), MF_BYPOSITION);
            if (!AppendMenuW(destination, state, id, text)) return false;
        }
    }
    return true;
}

// A fresh popup with the contents of the menu resource's first popup, or null.
HMENU LoadEventMenu(const Catalogue& catalogue) {
    HMENU loaded = LoadMenuW(moduleInstance, MAKEINTRESOURCEW(catalogue.menu));
    if (!loaded) return nullptr;
    HMENU result = nullptr;
    if (HMENU source = GetSubMenu(loaded, 0)) {
        result = CreatePopupMenu();
        if (result && !CopyMenuItems(result, source)) {
            DestroyMenu(result);
            result = nullptr;
        }
    }
    DestroyMenu(loaded);
    return result;
}

HMENU EventMenu(const EditorStructure* editor, const Catalogue& catalogue) {
    if (!CheckHostVersion(editor)) return nullptr;
    return LoadEventMenu(catalogue);
}

short CodeFromMenu(const Catalogue& catalogue, HostValue menuId) {
    const short* entry = catalogue.table;
    for (int i = 0; i < catalogue.count; ++i) {
        if (static_cast<WORD>(entry[MenuIdWord]) == static_cast<WORD>(menuId))
            return entry[CodeWord];
        entry += EntryWords(entry[ParamCountWord]);
    }
    return -1;
}

const short* Infos(const Catalogue& catalogue, HostValue code) {
    const short* entry = FindEventInfo(catalogue, code);
    return entry ? entry + CodeWord : nullptr;
}

void DisplayText(const EditorStructure* editor, const Catalogue& catalogue, HostValue code,
                 LPWSTR buffer, HostValue capacity) {
    if (!CheckHostVersion(editor)) return;
    if (const short* entry = FindEventInfo(catalogue, code))
        LoadText(static_cast<WORD>(entry[StringIdWord]), buffer, static_cast<short>(capacity));
}

// A parameter's title: its string, or the event's menu text for a title of 0.
void LoadParameterTitle(const Catalogue& catalogue, HostValue code, HostValue index, LPWSTR buffer,
                        HostValue capacity) {
    short title = 0;
    if (!ParamTitle(catalogue, code, index, &title)) return;
    int room = static_cast<WORD>(capacity);
    if (title != TitleFromMenu) {
        LoadText(static_cast<WORD>(title), buffer, room);
        return;
    }
    if (room < 1) return;
    HMENU menu = LoadMenuW(moduleInstance, MAKEINTRESOURCEW(catalogue.menu));
    if (!menu) return;
    const short* entry = FindEventInfo(catalogue, code);
    GetMenuStringW(menu, static_cast<WORD>(entry[MenuIdWord]), buffer, room, MF_BYCOMMAND);
    DestroyMenu(menu);
}

}  // namespace

HV_EXPORT HMENU WINAPI GetConditionMenu(const EditorStructure* editor, HostValue, HostValue) {
    return EventMenu(editor, Conditions);
}
HV_EXPORT HMENU WINAPI GetActionMenu(const EditorStructure* editor, HostValue, HostValue) {
    return EventMenu(editor, Actions);
}
HV_EXPORT HMENU WINAPI GetExpressionMenu(const EditorStructure* editor, HostValue, HostValue) {
    return EventMenu(editor, Expressions);
}

HV_EXPORT short WINAPI GetConditionCodeFromMenu(const EditorStructure*, HostValue menuId) {
    return CodeFromMenu(Conditions, menuId);
}
HV_EXPORT short WINAPI GetActionCodeFromMenu(const EditorStructure*, HostValue menuId) {
    return CodeFromMenu(Actions, menuId);
}
HV_EXPORT short WINAPI GetExpressionCodeFromMenu(const EditorStructure*, HostValue menuId) {
    return CodeFromMenu(Expressions, menuId);
}

HV_EXPORT const short* WINAPI GetConditionInfos(const EditorStructure*, HostValue code) {
    return Infos(Conditions, code);
}
HV_EXPORT const short* WINAPI GetActionInfos(const EditorStructure*, HostValue code) {
    return Infos(Actions, code);
}
HV_EXPORT const short* WINAPI GetExpressionInfos(const EditorStructure*, HostValue code) {
    return Infos(Expressions, code);
}

HV_EXPORT void WINAPI GetConditionString(const EditorStructure* editor, HostValue code,
                                         LPWSTR buffer, HostValue capacity) {
    DisplayText(editor, Conditions, code, buffer, capacity);
}
HV_EXPORT void WINAPI GetActionString(const EditorStructure* editor, HostValue code, LPWSTR buffer,
                                      HostValue capacity) {
    DisplayText(editor, Actions, code, buffer, capacity);
}
HV_EXPORT void WINAPI GetExpressionString(const EditorStructure* editor, HostValue code,
                                          LPWSTR buffer, HostValue capacity) {
    DisplayText(editor, Expressions, code, buffer, capacity);
}

HV_EXPORT void WINAPI GetConditionTitle(const EditorStructure*, HostValue code, HostValue index,
                                        LPWSTR buffer, HostValue capacity) {
    LoadParameterTitle(Conditions, code, index, buffer, capacity);
}
HV_EXPORT void WINAPI GetActionTitle(const EditorStructure*, HostValue code, HostValue index,
                                     LPWSTR buffer, HostValue capacity) {
    LoadParameterTitle(Actions, code, index, buffer, capacity);
}
HV_EXPORT void WINAPI GetExpressionTitle(const EditorStructure*, HostValue code, LPWSTR buffer,
                                         HostValue capacity) {
    LoadParameterTitle(Expressions, code, 0, buffer, capacity);
}

HV_EXPORT void WINAPI GetExpressionParam(const EditorStructure*, HostValue code, HostValue index,
                                         LPWSTR buffer, HostValue capacity) {
    short title = 0;
    if (!ParamTitle(Expressions, code, index, &title)) return;
    int room = static_cast<short>(capacity);
    if (title == TitleFromMenu) {
        if (room >= 1) buffer[0] = 0;
        return;
    }
    LoadText(static_cast<WORD>(title), buffer, room);
}
