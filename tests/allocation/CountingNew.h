// Allocation counts, read from the replaced global operator new of this program.
#pragma once

namespace VnTest {

/// Allocations made by this thread so far.
long AllocationCount();

/// Allocations made by one call of run.
template <class F> long AllocationsOf(F&& run) {
    const long before = AllocationCount();
    run();
    return AllocationCount() - before;
}

} // namespace VnTest
