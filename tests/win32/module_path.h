// The module file, which the build puts beside the running test program: on the i686 build the
// very DLL that ships.
#pragma once

#include <hivelet/host.h>

#include "conformance.h"

inline WString modulePath() { return conf::widen(hv::pathBesideProgram("Hivelet.hzx")); }
