// user32 of the portable Win32 layer: string resources, menus, wsprintfW, and modal dialogs
// from classic DLGTEMPLATE resources with the dialog manager's default handling and keyboard,
// list boxes, push buttons, thread timers and posted messages.
#pragma once

#include "windef.h"

W32_API int WINAPI LoadStringW(HINSTANCE instance, UINT id, LPWSTR buffer, int bufferMax);

// Menus. Flags of AppendMenuW, GetMenuState and GetMenuStringW.
#define MF_BYCOMMAND 0x0000
#define MF_POPUP 0x0010
#define MF_END 0x0080
#define MF_BYPOSITION 0x0400
#define MF_SEPARATOR 0x0800

W32_API HMENU WINAPI LoadMenuW(HINSTANCE instance, LPCWSTR name);
W32_API HMENU WINAPI CreatePopupMenu(void);
W32_API BOOL WINAPI DestroyMenu(HMENU menu);
W32_API HMENU WINAPI GetSubMenu(HMENU menu, int position);
W32_API int WINAPI GetMenuItemCount(HMENU menu);
W32_API UINT WINAPI GetMenuItemID(HMENU menu, int position);
W32_API int WINAPI GetMenuStringW(HMENU menu, UINT item, LPWSTR buffer, int bufferMax, UINT flags);
W32_API UINT WINAPI GetMenuState(HMENU menu, UINT item, UINT flags);
W32_API BOOL WINAPI AppendMenuW(HMENU menu, UINT flags, UINT_PTR idNewItem, LPCWSTR text);

// wsprintfW is cdecl (the caller removes its arguments). It serves %s, the only field the
// module's formats hold; output stops at 1023 characters plus the terminator, whatever the
// buffer; %s of a null address gives "(null)".
W32_API int wsprintfW(LPWSTR buffer, LPCWSTR format, ...);

typedef INT_PTR(CALLBACK* DLGPROC)(HWND, UINT, WPARAM, LPARAM);
typedef void(CALLBACK* TIMERPROC)(HWND, UINT, UINT_PTR, DWORD);
typedef BOOL(CALLBACK* WNDENUMPROC)(HWND, LPARAM);

#define MAKEWPARAM(l, h) ((WPARAM)(DWORD)MAKELONG(l, h))

#define IDOK 1
#define IDCANCEL 2

// Styles the dialog manager reads from a template.
#define WS_TABSTOP 0x00010000L
#define DS_SETFONT 0x40L
#define BS_DEFPUSHBUTTON 0x1L
#define BS_TYPEMASK 0xFL

// Window messages and keys.
#define WM_CLOSE 0x0010
#define WM_KEYDOWN 0x0100
#define WM_KEYUP 0x0101
#define WM_INITDIALOG 0x0110
#define WM_COMMAND 0x0111
#define WM_SYSCOMMAND 0x0112
#define WM_TIMER 0x0113
#define SC_CLOSE 0xF060
#define VK_RETURN 0x0D
#define VK_ESCAPE 0x1B

// Dialog manager.
#define DM_GETDEFID 0x0400  // WM_USER + 0
#define DC_HASDEFID 0x534B
#define DWLP_MSGRESULT 0
#define DWLP_DLGPROC (DWLP_MSGRESULT + (int)sizeof(LRESULT))
#define DWLP_USER (DWLP_DLGPROC + (int)sizeof(DLGPROC))

// Buttons and list boxes.
#define BM_CLICK 0x00F5
#define BN_CLICKED 0
#define LB_ADDSTRING 0x0180
#define LB_SETCURSEL 0x0186
#define LB_GETCURSEL 0x0188
#define LB_GETTEXT 0x0189
#define LB_GETTEXTLEN 0x018A
#define LB_GETCOUNT 0x018B
#define LB_ERR (-1)
#define LBN_SELCHANGE 1
#define LBN_DBLCLK 2

W32_API INT_PTR WINAPI DialogBoxParamW(HINSTANCE instance, LPCWSTR templateName, HWND owner,
                                       DLGPROC dialogProc, LPARAM initParam);
W32_API BOOL WINAPI EndDialog(HWND dialog, INT_PTR result);
W32_API HWND WINAPI GetDlgItem(HWND dialog, int id);
W32_API int WINAPI GetDlgCtrlID(HWND window);
W32_API LRESULT WINAPI SendMessageW(HWND window, UINT message, WPARAM wParam, LPARAM lParam);
W32_API BOOL WINAPI PostMessageW(HWND window, UINT message, WPARAM wParam, LPARAM lParam);
#if defined(__x86_64__)
W32_API LONG_PTR WINAPI GetWindowLongPtrW(HWND window, int index);
W32_API LONG_PTR WINAPI SetWindowLongPtrW(HWND window, int index, LONG_PTR value);
#else
// As in Windows' own headers, 32-bit code has only the LONG forms.
W32_API LONG WINAPI GetWindowLongW(HWND window, int index);
W32_API LONG WINAPI SetWindowLongW(HWND window, int index, LONG value);
#define GetWindowLongPtrW GetWindowLongW
#define SetWindowLongPtrW SetWindowLongW
#endif
W32_API HWND WINAPI GetParent(HWND window);
W32_API int WINAPI GetWindowTextW(HWND window, LPWSTR text, int maxCount);
W32_API int WINAPI GetClassNameW(HWND window, LPWSTR className, int maxCount);
W32_API HWND WINAPI GetFocus(void);
W32_API BOOL WINAPI EnumThreadWindows(DWORD threadId, WNDENUMPROC enumProc, LPARAM lParam);
W32_API UINT_PTR WINAPI SetTimer(HWND window, UINT_PTR id, UINT elapse, TIMERPROC timerProc);
W32_API BOOL WINAPI KillTimer(HWND window, UINT_PTR id);
