//===-- tests/allocation/CountingNew.cpp - counts allocations per thread, fails one on cue -===//
//
// The counting allocator shared by the allocation suites: every plain form of the global
// operator new and delete is replaced, and each allocation is counted per thread.
//
//===------------------------------------------------------------------------------===//
#include "CountingNew.h"

#include <cstdlib>
#include <new>

namespace {
thread_local long t_allocations = 0;
thread_local long t_failAt = 0; // the count at which to fail; 0: never
thread_local bool t_failed = false;
} // namespace

long VnTest::AllocationCount() {
    return t_allocations;
}

void VnTest::FailAllocation(long n) {
    t_failAt = n > 0 ? t_allocations + n : 0;
    t_failed = false;
}

bool VnTest::AllocationFailed() {
    return t_failed;
}

// Default visibility: the library's own calls to operator new must land here too. Every
// plain form is replaced, so nothing allocated by one allocator is freed by another (the
// sanitizers tell the forms apart).
#define VN_REPLACED __attribute__((visibility("default")))

VN_REPLACED void* operator new(std::size_t size, const std::nothrow_t&) noexcept {
    ++t_allocations;
    if (t_allocations == t_failAt) {
        t_failAt = 0;
        t_failed = true;
        return nullptr;
    }
    return std::malloc(size != 0 ? size : 1);
}
VN_REPLACED void* operator new(std::size_t size) {
    if (void* p = operator new(size, std::nothrow)) {
        return p;
    }
    throw std::bad_alloc();
}
VN_REPLACED void* operator new[](std::size_t size) {
    return operator new(size);
}
VN_REPLACED void* operator new[](std::size_t size, const std::nothrow_t& tag) noexcept {
    return operator new(size, tag);
}
VN_REPLACED void operator delete(void* p) noexcept {
    std::free(p);
}
VN_REPLACED void operator delete(void* p, std::size_t) noexcept {
    std::free(p);
}
VN_REPLACED void operator delete(void* p, const std::nothrow_t&) noexcept {
    std::free(p);
}
VN_REPLACED void operator delete[](void* p) noexcept {
    std::free(p);
}
VN_REPLACED void operator delete[](void* p, std::size_t) noexcept {
    std::free(p);
}
VN_REPLACED void operator delete[](void* p, const std::nothrow_t&) noexcept {
    std::free(p);
}
