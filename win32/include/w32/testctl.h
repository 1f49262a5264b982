// Test control of the portable Win32 layer: a journal of the calls the layer served and fault
// injection. Linux builds only; tests that need it skip themselves on Windows builds.
#pragma once

#include <windows.h>

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#define W32_TEST_API __attribute__((visibility("default")))

namespace w32test {

// One served call: the function's Windows name, its integer arguments (pointers as addresses,
// masks and codes as numbers) and its result.
struct Call {
    std::string function;
    std::vector<uint64_t> args;
    int64_t result = 0;
};

// Forgets the journal and every armed fault, and returns the layer to its initial state.
W32_TEST_API void reset();

W32_TEST_API const std::vector<Call>& journal();
W32_TEST_API void clearJournal();
// Number of journal entries for one function.
W32_TEST_API size_t count(std::string_view function);
// The journal entries for one function, in call order.
W32_TEST_API std::vector<Call> callsOf(std::string_view function);

// Makes the nth call (1 = the next one) of `function` from now on fail with `code`. For the
// allocation functions ("calloc", "malloc") the failure is a null result and the code is ignored.
W32_TEST_API void failCall(std::string_view function, unsigned nth, long code);
// Makes every call of `function` from now on fail with `code`.
W32_TEST_API void failAlways(std::string_view function, long code);
W32_TEST_API void clearFaults();

// Blocks handed out by calloc/malloc through the layer and not yet freed.
W32_TEST_API size_t liveAllocations();

}  // namespace w32test
