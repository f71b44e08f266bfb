//===-- bench/CountingNew.cpp - a global operator new that counts bytes ---------===//
//
// Replacing the global allocation functions in the program replaces them for every
// shared library it loads, so the library's own allocations are counted too. The
// nothrow forms (the property factories use them) are replaced as well: left to the
// runtime, they could hand out memory that our operator delete then frees with the
// wrong allocator, which the sanitizer build reports.
//
//===------------------------------------------------------------------------------===//
#include "Harness.h"

#include <atomic>
#include <cstdlib>
#include <malloc.h>
#include <new>

namespace {
std::atomic<std::uint64_t> g_bytes{0};
// What the heap holds for the program now, as malloc counts it (its rounding included).
std::atomic<std::int64_t> g_live{0};

void* Counted(void* p) {
    if (p != nullptr) {
        g_live.fetch_add(static_cast<std::int64_t>(malloc_usable_size(p)),
                         std::memory_order_relaxed);
    }
    return p;
}

void Free(void* p) {
    if (p != nullptr) {
        g_live.fetch_sub(static_cast<std::int64_t>(malloc_usable_size(p)),
                         std::memory_order_relaxed);
        std::free(p);
    }
}

void* Allocate(std::size_t size) {
    g_bytes.fetch_add(size, std::memory_order_relaxed);
    if (void* p = Counted(std::malloc(size == 0 ? 1 : size))) {
        return p;
    }
    throw std::bad_alloc();
}
} // namespace

std::uint64_t VnBench::AllocatedBytes() {
    return g_bytes.load(std::memory_order_relaxed);
}

std::int64_t VnBench::LiveBytes() {
    return g_live.load(std::memory_order_relaxed);
}

void* operator new(std::size_t size) {
    return Allocate(size);
}
void* operator new[](std::size_t size) {
    return Allocate(size);
}
void* operator new(std::size_t size, const std::nothrow_t&) noexcept {
    g_bytes.fetch_add(size, std::memory_order_relaxed);
    return Counted(std::malloc(size == 0 ? 1 : size));
}
void* operator new[](std::size_t size, const std::nothrow_t&) noexcept {
    g_bytes.fetch_add(size, std::memory_order_relaxed);
    return Counted(std::malloc(size == 0 ? 1 : size));
}
void operator delete(void* p) noexcept {
    Free(p);
}
void operator delete[](void* p) noexcept {
    Free(p);
}
void operator delete(void* p, std::size_t) noexcept {
    Free(p);
}
void operator delete[](void* p, std::size_t) noexcept {
    Free(p);
}
void operator delete(void* p, const std::nothrow_t&) noexcept {
    Free(p);
}
void operator delete[](void* p, const std::nothrow_t&) noexcept {
    Free(p);
}
