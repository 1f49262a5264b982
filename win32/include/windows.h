// Portable Win32 layer: the subset of <windows.h> that the module and the host simulator use,
// for Linux builds, one header per system library as Windows' own headers are organised.
#pragma once

#include <stdlib.h>
#include <string.h>
#include <wchar.h>

#include "windef.h"
#include "winbase.h"
#include "winreg.h"
#include "winuser.h"
