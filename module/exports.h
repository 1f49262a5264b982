// How the module's entry points are exported: by name, C linkage, the Windows calling convention.
// The Windows builds name them in Hivelet.def; the Linux builds export them from the ELF image.
#pragma once

#ifdef _WIN32
#define HV_EXPORT extern "C"
#else
#define HV_EXPORT extern "C" __attribute__((visibility("default")))
#endif
