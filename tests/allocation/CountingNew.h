//===-- tests/allocation/CountingNew.h - allocation counts; a switch that fails one on cue -===//
//
// Allocation counts, read from the replaced global operator new of this program, and a
// switch that makes one chosen allocation fail.
//
//===------------------------------------------------------------------------------===//
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

/// Makes the n-th allocation of this thread from now on fail (n >= 1): the throwing forms
/// throw std::bad_alloc, the nothrow forms return null. 0 disarms the switch.
void FailAllocation(long n);

/// True once the allocation chosen by FailAllocation has failed; cleared by the next
/// FailAllocation.
bool AllocationFailed();

/// Runs op with its k-th allocation failing, for k = 1, 2, ... until a run reaches no
/// failure. After every failed run, check(k) verifies the state the failure left; op
/// must then undo nothing itself. Returns the number of allocations of the run that
/// succeeded (the last k minus one), so that a caller can tell an operation that
/// allocates nothing from one that was never failed.
template <class Op, class Check> long FailEachAllocationInTurn(Op&& op, Check&& check) {
    for (long k = 1;; ++k) {
        FailAllocation(k);
        try {
            op();
        } catch (...) {
            // Both a thrown bad_alloc and a reported failure are checked below.
        }
        const bool failed = AllocationFailed();
        FailAllocation(0);
        if (!failed) {
            return k - 1;
        }
        check(k);
    }
}

} // namespace VnTest
