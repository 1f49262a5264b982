// The process the tests run in is the one their build stands for. The windows-i686 build is the
// host's own case, a 32-bit process on 64-bit Windows (WOW64) that loads the shipped i686 DLL;
// a build that silently produced 64-bit code would prove nothing about it.
#include "support.h"

#ifndef HV_PROCESS_BITS
#define HV_PROCESS_BITS 0  // a build configured without a preset: nothing to compare with
#endif

namespace {

TEST(Process, IsThePresetsKindOfProcess) {
    if (HV_PROCESS_BITS == 0) GTEST_SKIP() << "configured without a preset's HV_PROCESS_BITS";
    EXPECT_EQ(sizeof(void*) * 8, size_t(HV_PROCESS_BITS));
#ifdef _WIN32
    BOOL wow64 = FALSE;
    ASSERT_TRUE(IsWow64Process(GetCurrentProcess(), &wow64));
    EXPECT_EQ(wow64 != FALSE, HV_PROCESS_BITS == 32) << "a 32-bit process on 64-bit Windows";
    // The module in memory is the build's own kind of PE image.
    auto base = reinterpret_cast<const BYTE*>(hvtest::module().handle());
    auto dos = reinterpret_cast<const IMAGE_DOS_HEADER*>(base);
    auto nt = reinterpret_cast<const IMAGE_NT_HEADERS*>(base + dos->e_lfanew);
    EXPECT_EQ(nt->FileHeader.Machine,
              HV_PROCESS_BITS == 32 ? IMAGE_FILE_MACHINE_I386 : IMAGE_FILE_MACHINE_AMD64);
#endif
}

}  // namespace
