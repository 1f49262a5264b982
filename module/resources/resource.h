/* Resource identifiers of the Hivelet module (its version numbers are in the configured
 * version.h, made from the project's version).
 *
 * Included by Hivelet.rc (through windres' C preprocessor) and by the module's C++ code, so it
 * holds nothing but plain #defines: one numeric range per kind of resource. */
#ifndef HIVELET_RESOURCE_H
#define HIVELET_RESOURCE_H

/* Who makes the module: shared by strings 129/130 and the version block. */
#define HIVELET_MAKER_TEXT "The Hivelet developers"
#define HIVELET_COPYRIGHT_TEXT "Copyright (C) 2026 The Hivelet developers"
#define HIVELET_WEB_ADDRESS_TEXT "https://hivelet.invalid/"

/* Strings read by the host from the file itself. */
#define IDS_HOST_PRODUCT_CODE 1
#define IDS_HOST_OBJECT_NAME 2

/* Identity strings (128-132). */
#define IDS_OBJECT_NAME 128
#define IDS_MAKER 129
#define IDS_COPYRIGHT 130
#define IDS_DESCRIPTION 131
#define IDS_WEB_ADDRESS 132

/* Parameter titles, debugger line formats and the module's own error messages (1000-1008). */
#define IDS_TITLE_ROOT_KEY 1000
#define IDS_TITLE_KEY_NAME 1001
#define IDS_TITLE_VALUE_NAME 1002
#define IDS_DEBUG_ROOT_KEY_FORMAT 1003
#define IDS_DEBUG_CURRENT_KEY_FORMAT 1004
#define IDS_ERR_INVALID_PARAMETERS 1005
#define IDS_ERR_NOT_DWORD 1006
#define IDS_ERR_NOT_STRING 1007
#define IDS_TITLE_64BIT_MODE 1008

/* Display texts of the actions (5000 + action code). */
#define IDS_ACT_BASE 5000
#define IDS_ACT_SET_ROOT_KEY 5000
#define IDS_ACT_SET_CURRENT_KEY 5001
#define IDS_ACT_SET_CURRENT_DWORD 5002
#define IDS_ACT_SET_CURRENT_STRING 5003
#define IDS_ACT_SET_DWORD 5004
#define IDS_ACT_SET_STRING 5005
#define IDS_ACT_DELETE_CURRENT_KEY 5006
#define IDS_ACT_DELETE_CURRENT_VALUE 5007
#define IDS_ACT_DELETE_KEY 5008
#define IDS_ACT_DELETE_VALUE 5009
#define IDS_ACT_CREATE_CURRENT_KEY 5010
#define IDS_ACT_CREATE_KEY 5011
#define IDS_ACT_SET_64BIT_MODE 5012

/* Display texts of the conditions (6000 + condition code). */
#define IDS_CND_BASE 6000
#define IDS_CND_KEY_EXISTS 6000
#define IDS_CND_VALUE_EXISTS 6001
#define IDS_CND_CURRENT_KEY_EXISTS 6002
#define IDS_CND_CURRENT_VALUE_EXISTS 6003
#define IDS_CND_LAST_ACTION_SUCCESSFUL 6004

/* Names of the expressions (7000 + expression code). */
#define IDS_EXP_BASE 7000
#define IDS_EXP_GET_CURRENT_ROOT_KEY 7000
#define IDS_EXP_GET_CURRENT_KEY 7001
#define IDS_EXP_GET_CURRENT_DWORD 7002
#define IDS_EXP_GET_CURRENT_STRING 7003
#define IDS_EXP_GET_DWORD 7004
#define IDS_EXP_GET_STRING 7005
#define IDS_EXP_LAST_ERROR_CODE 7006
#define IDS_EXP_LAST_ERROR_MESSAGE 7007

/* Menus (20000-20002). */
#define IDR_ACTION_MENU 20000
#define IDR_CONDITION_MENU 20001
#define IDR_EXPRESSION_MENU 20002

/* Action menu commands (25000 + action code). */
#define IDM_ACT_BASE 25000
#define IDM_ACT_SET_ROOT_KEY 25000
#define IDM_ACT_SET_CURRENT_KEY 25001
#define IDM_ACT_SET_CURRENT_DWORD 25002
#define IDM_ACT_SET_CURRENT_STRING 25003
#define IDM_ACT_SET_DWORD 25004
#define IDM_ACT_SET_STRING 25005
#define IDM_ACT_DELETE_CURRENT_KEY 25006
#define IDM_ACT_DELETE_CURRENT_VALUE 25007
#define IDM_ACT_DELETE_KEY 25008
#define IDM_ACT_DELETE_VALUE 25009
#define IDM_ACT_CREATE_CURRENT_KEY 25010
#define IDM_ACT_CREATE_KEY 25011
#define IDM_ACT_SET_64BIT_MODE 25012

/* Condition menu commands (26000 + condition code). */
#define IDM_CND_BASE 26000
#define IDM_CND_KEY_EXISTS 26000
#define IDM_CND_VALUE_EXISTS 26001
#define IDM_CND_CURRENT_KEY_EXISTS 26002
#define IDM_CND_CURRENT_VALUE_EXISTS 26003
#define IDM_CND_LAST_ACTION_SUCCESSFUL 26004

/* Expression menu commands (27000 + expression code). */
#define IDM_EXP_BASE 27000
#define IDM_EXP_GET_CURRENT_ROOT_KEY 27000
#define IDM_EXP_GET_CURRENT_KEY 27001
#define IDM_EXP_GET_CURRENT_DWORD 27002
#define IDM_EXP_GET_CURRENT_STRING 27003
#define IDM_EXP_GET_DWORD 27004
#define IDM_EXP_GET_STRING 27005
#define IDM_EXP_LAST_ERROR_CODE 27006
#define IDM_EXP_LAST_ERROR_MESSAGE 27007

/* Root-key dialog and its list box. */
#define IDD_ROOT_KEY 101
#define IDC_ROOT_KEY_LIST 1001

/* Raw data read by the host from the file itself. */
#define IDR_HOST_DATA 200

/* The object's pictures. */
#define IDB_OBJECT_PICTURE 400
#define IDB_OBJECT_PICTURE_ALT 401

#endif /* HIVELET_RESOURCE_H */
