//===-- bench/Harness.h - sizes, allocation counting and the verdict table ------===//
#pragma once

#include <benchmark/benchmark.h>

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

namespace VnBench {

/// Problem sizes. The tiny set lets the test suite run every benchmark once, quickly,
/// so the suite cannot rot; the ratios mean something only at full size.
struct Sizes {
    std::size_t large = 1000000; // a large device's sites and pins
    std::size_t small = 10000;
    std::size_t medium = 100000;       // the quadratic baselines stop here
    std::size_t regexBaseline = 20000; // compiling std::regex per item is that slow
    std::size_t holders = 1000;        // holders cycled through by the look-up benchmarks
    bool tiny = false;
};

const Sizes& GetSizes();

/// Bytes handed out by operator new since the process started (the benchmark program
/// replaces the global operator new to count them).
std::uint64_t AllocatedBytes();
/// Bytes the heap holds for operator new's blocks now, as malloc rounds them.
std::int64_t LiveBytes();
/// Starts counting, on this thread, the blocks allocated from now on that are still live,
/// each as malloc rounds its request in a fresh heap. Unlike LiveBytes this does not
/// depend on what earlier benchmarks left in the heap.
void StartRoundedBytes();
/// Stops the count and returns its bytes; -1 when there were too many blocks to follow.
std::int64_t StopRoundedBytes();

/// The sixteen property names the look-up measurements use, ours and the baselines alike.
std::vector<std::string> SixteenNames();

void RegisterBaselines();
void RegisterLibraryBenchmarks();
void RegisterHolderBenchmarks();
void RegisterDesignBenchmarks();

/// The whole table is measured this many times; the repetitions of every benchmark are
/// dealt round-robin into the runs.
constexpr int kRuns = 3;

/// A per-call measurement: many short repetitions rather than a few long ones, five to each
/// run, so that a burst of noise from a neighbour on a shared machine spoils few of them
/// (the fastest counts).
inline void PerCall(benchmark::internal::Benchmark* benchmark) {
    constexpr int kRepetitionsPerRun = 5;
    if (!GetSizes().tiny) {
        benchmark->MinTime(0.12)->Repetitions(kRepetitionsPerRun * kRuns);
    }
}

/// A measurement that passes over many items (a search of a million resources, one side of
/// a million-against-ten-thousand comparison): each repetition times `iterations` passes,
/// and each run gets five repetitions, the fastest of which counts. A pass at a million
/// items takes a fraction of a second and probes memory far larger than the caches, so one
/// slow pass (a neighbour's burst on the memory bus, or the first pass in the process, which
/// grows the heap while the other benchmarks find it grown) must not decide a run's verdict.
inline void Passes(benchmark::internal::Benchmark* benchmark,
                   benchmark::IterationCount iterations) {
    constexpr int kPassesPerRun = 5;
    if (GetSizes().tiny) {
        benchmark->Iterations(1);
    } else {
        benchmark->Iterations(iterations)->Repetitions(kPassesPerRun * kRuns);
    }
}

/// Reports ns per item through the items-per-second counter.
inline void SetItems(benchmark::State& state, std::size_t perIteration) {
    state.SetItemsProcessed(static_cast<std::int64_t>(state.iterations()) *
                            static_cast<std::int64_t>(perIteration));
}

} // namespace VnBench
