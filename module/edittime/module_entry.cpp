// Library entry, identity and the edit-time frame of the object.
#include "module_entry.h"

#include "../resources/resource.h"

HINSTANCE moduleInstance = nullptr;

namespace {

const WCHAR HelpFileName[] = TEXT("Help\\Hivelet.chm");

// A property table that holds no property: its first entry is the all-zero end mark.
const BYTE EmptyPropertyList[24] = {};

const DWORD MinimumBuild = 242;           // low 12 bits of the version word
const DWORD MinimumVersion = 0x02000000;  // high 16 bits

}  // namespace

// The library's entry function, which the system calls by this name.
extern "C" BOOL WINAPI DllMain(HINSTANCE instance, DWORD reason, LPVOID) {
    if (reason == DLL_PROCESS_ATTACH) moduleInstance = instance;
    return TRUE;
}

bool CheckHostVersion(const EditorStructure* editor) {
    if (!editor->getHostVersion) return false;
    if ((editor->getHostVersion() & 0xFFF) < MinimumBuild) return false;
    if ((editor->getHostVersion() & 0xFFFF0000) < MinimumVersion) return false;
    return true;
}

HV_EXPORT DWORD WINAPI GetInfos(HostValue code) {
    switch (static_cast<DWORD>(code)) {
        case 0: return 0x300;
        case 2: return 0x100;
        case 6: return 2;
        case 7: return 292;
        case 8: return 1;
        default: return 0;
    }
}

HV_EXPORT void WINAPI GetObjInfos(HostValue, HostValue, LPWSTR name, LPWSTR maker, LPWSTR copyright,
                                  LPWSTR description, LPWSTR webSite) {
    LoadStringW(moduleInstance, IDS_OBJECT_NAME, name, 255);
    LoadStringW(moduleInstance, IDS_MAKER, maker, 255);
    LoadStringW(moduleInstance, IDS_COPYRIGHT, copyright, 255);
    LoadStringW(moduleInstance, IDS_DESCRIPTION, description, 1024);
    LoadStringW(moduleInstance, IDS_WEB_ADDRESS, webSite, 255);
}

HV_EXPORT LPCWSTR WINAPI GetHelpFileName(void) { return HelpFileName; }

HV_EXPORT int WINAPI CreateObject(const EditorStructure* editor, HostValue, HostValue) {
    return CheckHostVersion(editor) ? 0 : -1;
}

// The object shows as a 32 x 32 frame in the editor.
HV_EXPORT void WINAPI GetObjectRect(HostValue, RECT* rect, HostValue, HostValue) {
    rect->right = rect->left + 32;
    rect->bottom = rect->top + 32;
}

HV_EXPORT DWORD WINAPI IsTransparent(HostValue, HostValue, HostValue, HostValue, HostValue) {
    return 0;
}

HV_EXPORT DWORD WINAPI GetProperties(const EditorStructure* editor, HostValue hostValue,
                                     HostValue) {
    if (editor->insertProperties) editor->insertProperties(hostValue, 1, EmptyPropertyList, 1, 1);
    return 1;
}
