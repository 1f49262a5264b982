// The module's instance handle and the editor compatibility gate.
#pragma once

#include "../runtime/record.h"

// Set once when the library is attached to the process; every resource load uses it.
extern HINSTANCE moduleInstance;

// True when the editor is recent enough for this object.
bool CheckHostVersion(const EditorStructure* editor);
