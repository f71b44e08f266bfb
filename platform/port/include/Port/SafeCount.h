//===-- Port/SafeCount.h - atomic reference-count steps -------------------------===//
//
// The counts of counted objects are plain ints changed only through these two calls,
// which are atomic (acquire/release). Each returns the value its own step produced, so
// that a Release can decide on destruction without a second, racy read.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include <atomic>

namespace Port {

inline int SafeIncr(int& count) {
    return std::atomic_ref<int>(count).fetch_add(1, std::memory_order_relaxed) + 1;
}

inline int SafeDecr(int& count) {
    return std::atomic_ref<int>(count).fetch_sub(1, std::memory_order_acq_rel) - 1;
}

inline int SafeRead(const int& count) {
    return std::atomic_ref<int>(const_cast<int&>(count)).load(std::memory_order_acquire);
}

} // namespace Port
