// Access to the compiled resources of a library loaded through LoadLibraryW.
#pragma once

#include <windows.h>

namespace w32 {

// The .res image embedded in `instance`, as the resource compiler wrote it; false if it has none.
bool resourceImage(HINSTANCE instance, const BYTE** data, size_t* size);

}  // namespace w32
