// How the module's entry points are declared: C linkage and the Windows calling convention.
// Which of them are exported, and under which names, is Hivelet.def's business: the Windows
// builds link it, the Linux builds an ELF version script made from it.
#pragma once

#define HV_EXPORT extern "C"
