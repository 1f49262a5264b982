// Times a benchmark loop in blocks of calls and reports a low percentile of the time per call.
// A block that the scheduler interrupted, or that ran beside a busy neighbour, only ever gets
// slower, so the fast blocks show what the calls cost on a quiet machine; the mean that Google
// Benchmark reports takes in every interruption. Both sides of a comparison are timed alike.
#pragma once

#include <benchmark/benchmark.h>

#include <algorithm>
#include <chrono>
#include <vector>

namespace bench {

class BlockClock {
public:
    static constexpr double Percentile = 0.10;

    // `block` calls per block: enough for some microseconds, so that reading the clock once a
    // block costs little beside them.
    explicit BlockClock(unsigned block = 64) : block_(block) {
        blocks_.reserve(8192);
        start_ = Clock::now();
    }

    // Counts one call; closes the block after `block` of them.
    void tick() {
        if (++count_ == block_) lap();
    }

    // Sets the counter "fast_ns": the time per call of the fast blocks.
    void report(benchmark::State& state) {
        if (blocks_.empty()) return;
        auto at = blocks_.begin() + static_cast<long>(Percentile * (blocks_.size() - 1));
        std::nth_element(blocks_.begin(), at, blocks_.end());
        state.counters["fast_ns"] = *at;
    }

private:
    using Clock = std::chrono::steady_clock;

    __attribute__((noinline)) void lap() {
        Clock::time_point now = Clock::now();
        blocks_.push_back(std::chrono::duration<double, std::nano>(now - start_).count() / block_);
        start_ = now;
        count_ = 0;
    }

    const unsigned block_;
    Clock::time_point start_;
    unsigned count_ = 0;
    std::vector<double> blocks_;
};

}  // namespace bench
