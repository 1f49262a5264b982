// What other parts of the layer need from the registry's test control.
#pragma once

#include <windows.h>

namespace w32 {

// Whether a test has hidden this export of the system libraries from GetProcAddress.
bool exportHidden(const char* name);

// Returns GetVersionExW's test settings to a plain Windows NT system.
void resetVersionSettings();

}  // namespace w32
