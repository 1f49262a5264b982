// What the module's registry routines cost on top of the registry calls they make, and how the
// key tree deletion scales. Each routine runs through a bare host (bench_host.h) beside the
// same sequence of registry calls made directly on the Win32 layer, in one run, and a table of
// module/raw ratios follows Google Benchmark's own report. The layer's call journal is off
// while anything is timed.
#include "bench_host.h"
#include "block_clock.h"
#include "ratio_report.h"

#include <benchmark/benchmark.h>
#include <w32/testctl.h>

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <functional>
#include <iostream>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include <time.h>

using bench::Slot;
using bench::textSlot;

namespace {

constexpr double PairTarget = 1.10;    // module time / raw time per routine, side by side
constexpr double ScalingTarget = 1.5;  // time per key, 50,000 subkeys / 5,000 subkeys
constexpr uint32_t CurrentUser = 2;    // HKEY_CURRENT_USER's index among the root keys
constexpr REGSAM ReadAccess = KEY_READ;
constexpr REGSAM WriteAccess = KEY_ALL_ACCESS;
constexpr REGSAM WalkAccess = DELETE | KEY_ENUMERATE_SUB_KEYS;

const WCHAR RootName[] = TEXT("HKEY_CURRENT_USER");
const WCHAR Settings[] = TEXT("Software\\HiveletBench\\Settings");
const WCHAR Wide[] = TEXT("Software\\HiveletBench\\Wide");
const WCHAR Deep[] = TEXT("HiveletBenchDeep");  // one level below the root
const WCHAR DwordName[] = TEXT("Count");
const WCHAR StringName[] = TEXT("Title");
const WCHAR DwordTarget[] = TEXT("Counter");
const WCHAR StringTarget[] = TEXT("Label");
const WCHAR Title[] = TEXT("Hivelet benchmark: a title of forty chars");
const WCHAR Label[] = TEXT("written by the benchmark");
constexpr DWORD Count = 42;
constexpr DWORD InvalidParameters = 40;  // lastError of a routine refusing its parameters
constexpr Slot WrittenDword = 7;

// Deepest key the registry allows: 512 levels below a root.
constexpr unsigned DeepLevels = 512;

template <typename T>
size_t length(const T* text) {
    return std::char_traits<T>::length(text);
}

// ---- the raw sequences: the registry calls a routine makes, made directly ----------------

LONG rawReadDword(HKEY root, const WCHAR* path, const WCHAR* name, DWORD* out) {
    HKEY key;
    LONG code = RegOpenKeyExW(root, path, 0, ReadAccess, &key);
    if (code != ERROR_SUCCESS) return code;
    DWORD type = 0, size = sizeof(*out);
    code = RegQueryValueExW(key, name, nullptr, &type, reinterpret_cast<BYTE*>(out), &size);
    RegCloseKey(key);
    return code;
}

LONG rawReadString(HKEY root, const WCHAR* path, const WCHAR* name, WCHAR* buffer) {
    HKEY key;
    LONG code = RegOpenKeyExW(root, path, 0, ReadAccess, &key);
    if (code != ERROR_SUCCESS) return code;
    DWORD type = 0, size = 0;
    code = RegQueryValueExW(key, name, nullptr, &type, nullptr, &size);
    if (code == ERROR_SUCCESS)
        code = RegQueryValueExW(key, name, nullptr, &type, reinterpret_cast<BYTE*>(buffer), &size);
    RegCloseKey(key);
    return code;
}

LONG rawWriteDword(HKEY root, const WCHAR* path, const WCHAR* name, DWORD value) {
    HKEY key;
    LONG code = RegCreateKeyExW(root, path, 0, nullptr, 0, WriteAccess, nullptr, &key, nullptr);
    if (code != ERROR_SUCCESS) return code;
    code = RegSetValueExW(key, name, 0, REG_DWORD, reinterpret_cast<const BYTE*>(&value),
                          sizeof(value));
    RegCloseKey(key);
    return code;
}

LONG rawWriteString(HKEY root, const WCHAR* path, const WCHAR* name, const WCHAR* text) {
    HKEY key;
    LONG code = RegCreateKeyExW(root, path, 0, nullptr, 0, WriteAccess, nullptr, &key, nullptr);
    if (code != ERROR_SUCCESS) return code;
    DWORD type = REG_SZ, size = 0;
    RegQueryValueExW(key, name, nullptr, &type, nullptr, &size);
    code = RegSetValueExW(key, name, 0, REG_SZ, reinterpret_cast<const BYTE*>(text),
                          static_cast<DWORD>((length(text) + 1) * sizeof(WCHAR)));
    RegCloseKey(key);
    return code;
}

LONG rawCreateKey(HKEY root, const WCHAR* path) {
    HKEY key;
    LONG code = RegCreateKeyExW(root, path, 0, nullptr, 0, WriteAccess, nullptr, &key, nullptr);
    if (code == ERROR_SUCCESS) RegCloseKey(key);
    return code;
}

// The walk the module makes to delete a key tree, first subkey first, without the module.
LONG rawDeleteTree(HKEY parent, const WCHAR* path) {
    HKEY key;
    LONG code = RegOpenKeyExW(parent, path, 0, WalkAccess, &key);
    if (code != ERROR_SUCCESS) return code;
    WCHAR name[1024];
    for (;;) {
        DWORD chars = 1024;
        code = RegEnumKeyExW(key, 0, name, &chars, nullptr, nullptr, nullptr, nullptr);
        if (code == ERROR_NO_MORE_ITEMS) {
            code = RegDeleteKeyW(parent, path);
            break;
        }
        if (code != ERROR_SUCCESS) break;
        if ((code = rawDeleteTree(key, name)) != ERROR_SUCCESS) break;
    }
    RegCloseKey(key);
    return code;
}

// ---- registry set-up, made outside every timed region ------------------------------------

bool prepareValues() {
    HKEY key;
    if (RegCreateKeyExW(HKEY_CURRENT_USER, Settings, 0, nullptr, 0, WriteAccess, nullptr, &key,
                        nullptr) != ERROR_SUCCESS)
        return false;
    DWORD count = Count;
    bool ok = RegSetValueExW(key, DwordName, 0, REG_DWORD, reinterpret_cast<BYTE*>(&count),
                             sizeof(count)) == ERROR_SUCCESS;
    ok = ok && RegSetValueExW(key, StringName, 0, REG_SZ, reinterpret_cast<const BYTE*>(Title),
                              static_cast<DWORD>((length(Title) + 1) * sizeof(WCHAR))) == 0;
    // A few neighbours, so that the values looked up are not alone in their key.
    const WCHAR* others[] = {TEXT("Width"), TEXT("Height"), TEXT("Left"),
                             TEXT("Top"),   TEXT("Theme"),  TEXT("Language")};
    for (const WCHAR* other : others)
        ok = ok && RegSetValueExW(key, other, 0, REG_DWORD, reinterpret_cast<BYTE*>(&count),
                                  sizeof(count)) == ERROR_SUCCESS;
    RegCloseKey(key);
    return ok;
}

std::vector<std::u16string> subkeyNames(unsigned count) {
    std::vector<std::u16string> names;
    names.reserve(count);
    for (unsigned i = 0; i < count; ++i) {
        char text[16];
        std::snprintf(text, sizeof(text), "Item%05u", i);
        names.emplace_back(text, text + std::strlen(text));
    }
    return names;
}

// `path` below HKEY_CURRENT_USER with one level of `names` below it.
bool buildWide(const WCHAR* path, const std::vector<std::u16string>& names) {
    HKEY parent;
    if (RegCreateKeyExW(HKEY_CURRENT_USER, path, 0, nullptr, 0, WriteAccess, nullptr, &parent,
                        nullptr) != ERROR_SUCCESS)
        return false;
    bool ok = true;
    for (const std::u16string& name : names) {
        HKEY child;
        ok = ok && RegCreateKeyExW(parent, reinterpret_cast<const WCHAR*>(name.c_str()), 0, nullptr,
                                   0, WriteAccess, nullptr, &child, nullptr) == ERROR_SUCCESS;
        if (ok) RegCloseKey(child);
    }
    RegCloseKey(parent);
    return ok;
}

// A chain of `levels` keys from `path` (directly below HKEY_CURRENT_USER) down.
bool buildDeep(const WCHAR* path, unsigned levels) {
    HKEY key;
    if (RegCreateKeyExW(HKEY_CURRENT_USER, path, 0, nullptr, 0, WriteAccess, nullptr, &key,
                        nullptr) != ERROR_SUCCESS)
        return false;
    bool ok = true;
    for (unsigned level = 2; ok && level <= levels; ++level) {
        HKEY child;
        ok = RegCreateKeyExW(key, TEXT("Level"), 0, nullptr, 0, WriteAccess, nullptr, &child,
                             nullptr) == ERROR_SUCCESS;
        RegCloseKey(key);
        key = child;
    }
    if (ok) RegCloseKey(key);
    return ok;
}

bool keyExists(const WCHAR* path) {
    HKEY key;
    if (RegOpenKeyExW(HKEY_CURRENT_USER, path, 0, ReadAccess, &key) != ERROR_SUCCESS) return false;
    RegCloseKey(key);
    return true;
}

// ---- the benchmarks ----------------------------------------------------------------------

// Everything the benchmarks share: the module, one instance whose current key is the settings
// key under HKEY_CURRENT_USER, and a RootKeyParam record for that root.
struct Fixture {
    hv::Module& module;
    bench::Instance instance;
    bench::RootKeyRecord currentUser{CurrentUser};
    WCHAR rawBuffer[256] = {};

    explicit Fixture(hv::Module& m) : module(m), instance(m) {}

    bool selectSettings() {
        auto setRootKey = bench::actionRoutine(module, "ActSetRootKey");
        auto setCurrentKey = bench::actionRoutine(module, "ActSetCurrentKey");
        if (!setRootKey || !setCurrentKey) return false;
        setRootKey(instance.record(), currentUser.slot(), 0);
        if (instance.lastError() != 0) return false;
        setCurrentKey(instance.record(), textSlot(Settings), 0);
        return instance.lastError() == 0;
    }
};

// One call of a routine as the host makes it, with the routine's address taken once.
struct ExpressionCall {
    bench::Instance* instance;
    bench::ExpressionRoutine routine;
    Slot operator()() const {
        instance->clearFlags();
        return routine(instance->record(), 0);
    }
};

struct ActionCall {
    bench::Instance* instance;
    bench::ActionRoutine routine;
    Slot first, second;  // the routine's arguments; the other parameters are fetched
    Slot operator()() const {
        instance->rewind();
        return routine(instance->record(), first, second);
    }
};

// Keeps a result alive for the optimiser. Only the read-only form of DoNotOptimize is used: with
// GCC the read-write form lost a routine's result in the sanitized build.
inline void keep(const Slot& value) { benchmark::DoNotOptimize(value); }

// What a routine left behind when it did not do what it should.
template <typename Call>
std::string failure(const Call& call, Slot result) {
    return "the routine did not do what it should (lastError " +
           std::to_string(call.instance->lastError()) + ", result " + std::to_string(result) + ")";
}

using Prepare = std::function<void()>;    // parameters for the host's services
using Check = std::function<bool(Slot)>;  // the last call's result and lastError

// The routine alone, timed in blocks of `block` calls (BlockClock).
template <typename Call>
void registerModule(const std::string& name, Prepare prepare, Call call, Check check,
                    unsigned block) {
    benchmark::RegisterBenchmark(name.c_str(), [=](benchmark::State& state) {
        prepare();
        Slot result = 0;
        bench::BlockClock clock(block);
        for (auto _ : state) {
            result = call();
            keep(result);
            clock.tick();
        }
        clock.report(state);
        if (!check(result)) state.SkipWithError(failure(call, result).c_str());
    });
}

// The raw sequence alone, timed like the routine.
template <typename RawCall>
void registerRaw(const std::string& name, RawCall raw) {
    benchmark::RegisterBenchmark(name.c_str(), [raw](benchmark::State& state) {
        LONG failures = 0;
        bench::BlockClock clock;
        for (auto _ : state) {
            failures |= raw();
            clock.tick();
        }
        clock.report(state);
        if (failures != ERROR_SUCCESS) state.SkipWithError("a registry call failed");
    });
}

constexpr unsigned SideBlock = 32;  // calls per block of each side

template <typename Op>
double timeBlock(Op op) {
    auto start = std::chrono::steady_clock::now();
    for (unsigned k = 0; k < SideBlock; ++k) op();
    auto stop = std::chrono::steady_clock::now();
    return std::chrono::duration<double, std::nano>(stop - start).count();
}

double median(std::vector<double> values) {
    if (values.empty()) return 0;
    auto middle = values.begin() + static_cast<long>(values.size() / 2);
    std::nth_element(values.begin(), middle, values.end());
    return *middle;
}

// The routine and its raw sequence in alternating blocks, so that whatever else the machine
// does in the meantime weighs on both alike. Each iteration times one block of each, in turns
// module first and raw first; the counters are the medians of the blocks' time per call and
// of the ratio of the two blocks of an iteration.
template <typename Call, typename RawCall>
void registerSideBySide(const std::string& name, Prepare prepare, Call call, RawCall raw,
                        Check check) {
    benchmark::RegisterBenchmark(name.c_str(), [=](benchmark::State& state) {
        prepare();
        Slot result = 0;
        LONG failures = 0;
        std::vector<double> moduleNs, rawNs, ratios;
        moduleNs.reserve(state.max_iterations);
        rawNs.reserve(state.max_iterations);
        ratios.reserve(state.max_iterations);
        bool moduleFirst = true;
        auto runModule = [&] {
            return timeBlock([&] {
                result = call();
                keep(result);
            });
        };
        auto runRaw = [&] { return timeBlock([&] { failures |= raw(); }); };
        for (auto _ : state) {
            double m, r;
            if (moduleFirst) {
                m = runModule();
                r = runRaw();
            } else {
                r = runRaw();
                m = runModule();
            }
            moduleFirst = !moduleFirst;
            moduleNs.push_back(m / SideBlock);
            rawNs.push_back(r / SideBlock);
            ratios.push_back(m / r);
        }
        if (!ratios.empty()) {
            state.counters["module_ns"] = median(moduleNs);
            state.counters["raw_ns"] = median(rawNs);
            state.counters["ratio"] = median(ratios);
        }
        if (!check(result))
            state.SkipWithError(failure(call, result).c_str());
        else if (failures != ERROR_SUCCESS)
            state.SkipWithError("a raw registry call failed");
    });
}

// The registry calls one operation makes, as the journal saw them: each function's name with
// the access mask of opens and creates.
std::vector<std::string> callsOf(const std::function<void()>& operation) {
    w32test::clearJournal();
    w32test::setJournal(true);
    operation();
    w32test::setJournal(false);
    std::vector<std::string> calls;
    for (const w32test::Call& c : w32test::journal()) {
        std::string entry = c.function;
        size_t maskAt = c.function == "RegOpenKeyExW" ? 3 : c.function == "RegCreateKeyExW" ? 5 : 0;
        if (maskAt && c.args.size() > maskAt) {
            char mask[24];
            std::snprintf(mask, sizeof(mask), "(0x%llX)",
                          static_cast<unsigned long long>(c.args[maskAt]));
            entry += mask;
        }
        calls.push_back(entry);
    }
    w32test::clearJournal();
    return calls;
}

std::string joined(const std::vector<std::string>& calls) {
    std::string out;
    for (const std::string& c : calls) out += (out.empty() ? "" : " ") + c;
    return out;
}

// The calling thread's CPU time. A deletion of 50,000 keys lasts longer than a scheduler time
// slice; on a machine that runs other work the thread's own clock leaves out the slices that
// went to others, which the wall clock would count.
double threadSeconds() {
    timespec now;
    clock_gettime(CLOCK_THREAD_CPUTIME_ID, &now);
    return static_cast<double>(now.tv_sec) + static_cast<double>(now.tv_nsec) * 1e-9;
}

// Tree deletion through the module: each iteration builds the tree untimed and times one
// "Delete Key" on its top key.
void registerDeletion(Fixture& f, bench::RatioReporter& reporter, const std::string& name,
                      const std::string& label, unsigned keys, int iterations,
                      std::function<bool()> build, const WCHAR* path) {
    bench::Instance* instance = &f.instance;
    bench::ActionRoutine deleteKey = bench::actionRoutine(f.module, "ActDeleteKey");
    Slot root = f.currentUser.slot();
    benchmark::RegisterBenchmark(
        name.c_str(),
        [=](benchmark::State& state) {
            double total = 0, fastest = 0;
            for (auto _ : state) {
                if (!build()) {
                    state.SkipWithError("cannot build the key tree");
                    break;
                }
                double start = threadSeconds();
                deleteKey(instance->record(), root, textSlot(path));
                double seconds = threadSeconds() - start;
                state.SetIterationTime(seconds);
                total += seconds;
                if (fastest == 0 || seconds < fastest) fastest = seconds;
                if (instance->lastError() != 0 || keyExists(path)) {
                    state.SkipWithError("the tree was not deleted");
                    break;
                }
            }
            state.counters["keys"] = keys;
            if (state.iterations() > 0) {
                state.counters["ns_per_key"] =
                    total * 1e9 / (static_cast<double>(state.iterations()) * keys);
                state.counters["fast_ns"] = fastest * 1e9;  // the fastest deletion of the tree
            }
        })
        ->UseManualTime()
        ->Iterations(iterations)
        ->Repetitions(5)
        ->Unit(benchmark::kMillisecond);
    reporter.perUnit(name, label, keys);
}

void registerRawDeletion(bench::RatioReporter& reporter, const std::string& name,
                         const std::string& label, unsigned keys, int iterations,
                         std::function<bool()> build, const WCHAR* path) {
    benchmark::RegisterBenchmark(name.c_str(),
                                 [=](benchmark::State& state) {
                                     double fastest = 0;
                                     for (auto _ : state) {
                                         if (!build()) {
                                             state.SkipWithError("cannot build the key tree");
                                             break;
                                         }
                                         double start = threadSeconds();
                                         LONG code = rawDeleteTree(HKEY_CURRENT_USER, path);
                                         double seconds = threadSeconds() - start;
                                         state.SetIterationTime(seconds);
                                         if (fastest == 0 || seconds < fastest) fastest = seconds;
                                         if (code != ERROR_SUCCESS) {
                                             state.SkipWithError("the tree was not deleted");
                                             break;
                                         }
                                     }
                                     state.counters["keys"] = keys;
                                     if (state.iterations() > 0)
                                         state.counters["fast_ns"] = fastest * 1e9;
                                 })
        ->UseManualTime()
        ->Iterations(iterations)
        ->Repetitions(5)
        ->Unit(benchmark::kMillisecond);
    reporter.perUnit(name, label, keys);
}

// A routine the module's tables must have; the program stops when they lack it.
template <typename Routine>
Routine found(Routine routine, const char* name) {
    if (!routine) {
        std::cerr << "hivelet_bench: the module has no routine " << name << "\n";
        std::exit(1);
    }
    return routine;
}

// Google Benchmark's flags as this program uses them by default; the command line comes after
// them and so overrides any of them.
std::vector<char*> withDefaults(int argc, char** argv, std::vector<std::string>& storage) {
    storage = {"--benchmark_repetitions=9", "--benchmark_enable_random_interleaving=true",
               "--benchmark_display_aggregates_only=true", "--benchmark_min_time=0.1"};
    std::vector<char*> args{argv[0]};
    for (std::string& s : storage) args.push_back(s.data());
    for (int i = 1; i < argc; ++i) args.push_back(argv[i]);
    args.push_back(nullptr);
    return args;
}

// Checks that a routine succeeds and makes exactly the registry calls of its raw sequence, then
// registers its benchmarks.
template <typename Call, typename RawCall>
bool addRoutine(bench::RatioReporter& reporter, const std::string& name, const std::string& rawName,
                Prepare prepare, Call call, RawCall raw, Check check) {
    prepare();
    Slot result = 0;
    std::vector<std::string> moduleCalls = callsOf([&] { result = call(); });
    std::vector<std::string> rawCalls = callsOf([&] { raw(); });
    bool ok = true;
    if (!check(result)) {
        std::cerr << "hivelet_bench: " << name << " did not do what it should\n";
        ok = false;
    }
    if (moduleCalls != rawCalls) {
        std::cerr << "hivelet_bench: " << name << " calls " << joined(moduleCalls)
                  << "\n  but the raw sequence is " << joined(rawCalls) << "\n";
        ok = false;
    }
    registerModule("Module/" + name, prepare, call, check, 64);
    registerSideBySide("SideBySide/" + name, prepare, call, raw, check);
    reporter.comparePair(name, "Module/" + name, "Raw/" + rawName, "SideBySide/" + name);
    return ok;
}

// The routine with one parameter null, so that it stops at its guards after fetching and
// checking everything: its own work, without a registry call. A call takes some nanoseconds,
// so the blocks are longer.
template <typename Call>
bool addOwnWork(bench::RatioReporter& reporter, bench::Instance& in, const std::string& name,
                Prepare prepare, Call call) {
    auto refused = [&in](Slot) { return in.lastError() == InvalidParameters; };
    prepare();
    std::vector<std::string> calls = callsOf([&] { call(); });
    if (!calls.empty() || !refused(0)) {
        std::cerr << "hivelet_bench: " << name << " with a null parameter made the calls "
                  << joined(calls) << " and left lastError " << in.lastError() << "\n";
        return false;
    }
    registerModule("ModuleOnly/" + name, prepare, call, refused, 1024);
    reporter.ownWork(name, "ModuleOnly/" + name);
    return true;
}

}  // namespace

int main(int argc, char** argv) {
    w32test::setJournal(false);
    std::string error;
    std::unique_ptr<hv::Module> loaded = hv::Module::load(hv::defaultModulePath(), &error);
    if (!loaded) {
        std::cerr << "hivelet_bench: " << error << "\n";
        return 1;
    }
    hv::Module& module = *loaded;
    auto fixture = std::make_unique<Fixture>(module);
    Fixture& f = *fixture;
    if (!prepareValues() || !f.selectSettings()) {
        std::cerr << "hivelet_bench: cannot prepare the registry\n";
        return 1;
    }

    bench::Instance& in = f.instance;
    bench::Instance* instance = &in;
    const Slot root = f.currentUser.slot();
    WCHAR* rawBuffer = f.rawBuffer;
    auto expression = [&](const char* routine) {
        return ExpressionCall{instance, found(bench::expressionRoutine(module, routine), routine)};
    };
    auto action = [&](const char* routine, Slot first = 0, Slot second = 0) {
        return ActionCall{instance, found(bench::actionRoutine(module, routine), routine), first,
                          second};
    };
    auto parameters = [&in](std::vector<Slot> values) -> Prepare {
        return [&in, values] { in.setParameters(values); };
    };
    Prepare none = parameters({});
    Check dwordRead = [&in](Slot result) {
        return in.lastError() == 0 && static_cast<DWORD>(result) == Count;
    };
    Check stringRead = [&in](Slot result) {
        const auto* text = reinterpret_cast<const WCHAR*>(result);
        return in.lastError() == 0 && in.textResult() && text &&
               std::u16string_view(text) == std::u16string_view(Title);
    };
    Check succeeded = [&in](Slot) { return in.lastError() == 0; };

    // The raw sequences, each the registry calls of the routines that share it.
    auto readDword = [] {
        DWORD value = 0;
        return rawReadDword(HKEY_CURRENT_USER, Settings, DwordName, &value);
    };
    auto readString = [rawBuffer] {
        return rawReadString(HKEY_CURRENT_USER, Settings, StringName, rawBuffer);
    };
    auto writeDword = [] {
        return rawWriteDword(HKEY_CURRENT_USER, Settings, DwordTarget, WrittenDword);
    };
    auto writeString = [] {
        return rawWriteString(HKEY_CURRENT_USER, Settings, StringTarget, Label);
    };
    auto createKey = [] { return rawCreateKey(HKEY_CURRENT_USER, Settings); };

    bench::RatioReporter reporter;
    const Slot rootName = textSlot(RootName), path = textSlot(Settings);
    const Slot dwordName = textSlot(DwordName), stringName = textSlot(StringName);
    const Slot dwordTarget = textSlot(DwordTarget), stringTarget = textSlot(StringTarget);
    const Slot label = textSlot(Label);
    bool ok = true;
    ok &= addRoutine(reporter, "ExpGetCurrentDword", "OpenQueryDwordClose", parameters({dwordName}),
                     expression("ExpGetCurrentDword"), readDword, dwordRead);
    ok &= addRoutine(reporter, "ExpGetCurrentString", "OpenProbeQueryStringClose",
                     parameters({stringName}), expression("ExpGetCurrentString"), readString,
                     stringRead);
    ok &= addRoutine(reporter, "ExpGetDword", "OpenQueryDwordClose",
                     parameters({rootName, path, dwordName}), expression("ExpGetDword"), readDword,
                     dwordRead);
    ok &= addRoutine(reporter, "ExpGetString", "OpenProbeQueryStringClose",
                     parameters({rootName, path, stringName}), expression("ExpGetString"),
                     readString, stringRead);
    ok &=
        addRoutine(reporter, "ActSetCurrentDword", "CreateSetDwordClose", none,
                   action("ActSetCurrentDword", dwordTarget, WrittenDword), writeDword, succeeded);
    ok &= addRoutine(reporter, "ActSetCurrentString", "CreateProbeSetStringClose", none,
                     action("ActSetCurrentString", stringTarget, label), writeString, succeeded);
    ok &= addRoutine(reporter, "ActSetDword", "CreateSetDwordClose",
                     parameters({root, path, dwordTarget, WrittenDword}), action("ActSetDword"),
                     writeDword, succeeded);
    ok &= addRoutine(reporter, "ActSetString", "CreateProbeSetStringClose",
                     parameters({root, path, stringTarget, label}), action("ActSetString"),
                     writeString, succeeded);
    ok &= addRoutine(reporter, "ActCreateCurrentKey", "CreateClose", none,
                     action("ActCreateCurrentKey"), createKey, succeeded);
    ok &= addRoutine(reporter, "ActCreateKey", "CreateClose", parameters({root, path}),
                     action("ActCreateKey"), createKey, succeeded);
    registerRaw("Raw/OpenQueryDwordClose", readDword);
    registerRaw("Raw/OpenProbeQueryStringClose", readString);
    registerRaw("Raw/CreateSetDwordClose", writeDword);
    registerRaw("Raw/CreateProbeSetStringClose", writeString);
    registerRaw("Raw/CreateClose", createKey);

    ok &= addOwnWork(reporter, in, "ExpGetCurrentDword", parameters({0}),
                     expression("ExpGetCurrentDword"));
    ok &= addOwnWork(reporter, in, "ExpGetCurrentString", parameters({0}),
                     expression("ExpGetCurrentString"));
    ok &= addOwnWork(reporter, in, "ExpGetDword", parameters({rootName, 0, dwordName}),
                     expression("ExpGetDword"));
    ok &= addOwnWork(reporter, in, "ExpGetString", parameters({rootName, 0, stringName}),
                     expression("ExpGetString"));
    ok &= addOwnWork(reporter, in, "ActSetCurrentDword", none,
                     action("ActSetCurrentDword", 0, WrittenDword));
    ok &= addOwnWork(reporter, in, "ActSetCurrentString", none,
                     action("ActSetCurrentString", stringTarget, 0));
    ok &= addOwnWork(reporter, in, "ActSetDword", parameters({root, 0, dwordTarget, WrittenDword}),
                     action("ActSetDword"));
    ok &= addOwnWork(reporter, in, "ActSetString", parameters({root, 0, stringTarget, label}),
                     action("ActSetString"));
    ok &= addOwnWork(reporter, in, "ActCreateKey", parameters({root, 0}), action("ActCreateKey"));
    if (!ok) return 1;
    std::cout << "Checked: each routine makes the same registry calls as its raw sequence.\n";

    auto small = std::make_shared<std::vector<std::u16string>>(subkeyNames(5000));
    auto large = std::make_shared<std::vector<std::u16string>>(subkeyNames(50000));
    registerDeletion(
        f, reporter, "Module/DeleteKey/wide:5000", "wide, 5,000 subkeys", 5001, 20,
        [small] { return buildWide(Wide, *small); }, Wide);
    registerDeletion(
        f, reporter, "Module/DeleteKey/wide:50000", "wide, 50,000 subkeys", 50001, 4,
        [large] { return buildWide(Wide, *large); }, Wide);
    registerDeletion(
        f, reporter, "Module/DeleteKey/deep:512", "deep, 512 levels", DeepLevels, 100,
        [] { return buildDeep(Deep, DeepLevels); }, Deep);
    registerRawDeletion(
        reporter, "Raw/DeleteWalk/wide:5000", "raw walk, wide, 5,000 subkeys", 5001, 20,
        [small] { return buildWide(Wide, *small); }, Wide);
    reporter.scaling("time per key, 50,000 / 5,000 subkeys", "Module/DeleteKey/wide:50000",
                     "Module/DeleteKey/wide:5000", ScalingTarget);
    reporter.scaling("module / raw walk, 5,000 subkeys", "Module/DeleteKey/wide:5000",
                     "Raw/DeleteWalk/wide:5000", 0);

    std::vector<std::string> defaults;
    std::vector<char*> args = withDefaults(argc, argv, defaults);
    int count = static_cast<int>(args.size()) - 1;
    benchmark::Initialize(&count, args.data());
    if (benchmark::ReportUnrecognizedArguments(count, args.data())) return 1;
    benchmark::RunSpecifiedBenchmarks(&reporter);
    reporter.printSummary(std::cout, PairTarget);
    std::cout << "\n";
    reporter.printRatios(std::cout);
    benchmark::Shutdown();
    return 0;
}
