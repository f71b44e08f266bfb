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

#include <algorithm>
#include <atomic>
#include <cstdlib>
#include <malloc.h>
#include <new>

namespace {
std::atomic<std::uint64_t> g_bytes{0};
// What the heap holds for the program now, as malloc counts it (its rounding included).
std::atomic<std::int64_t> g_live{0};

// Blocks allocated on the thread that opened a count of rounded bytes, each with the
// size malloc gives its request in a heap of its own. Fixed room: no allocation of its own.
struct Rounded {
    static constexpr std::size_t kRoom = 4096;
    void* block[kRoom];
    std::int64_t bytes[kRoom];
    std::size_t used = 0;
    std::int64_t live = 0;
    bool overflowed = false;
};
Rounded g_rounded;
thread_local bool t_rounding = false;

// glibc's rule: the request plus one size word, rounded up to 16, at least 32 bytes in
// all; the size word is not usable. Larger blocks, which malloc hands out when the free
// block it finds is too small to split, depend on what ran before and are left out.
std::int64_t RoundedSize(std::size_t size) {
    const std::size_t chunk = std::max<std::size_t>(32, (size + 8 + 15) & ~std::size_t{15});
    return static_cast<std::int64_t>(chunk - 8);
}

void NoteRounded(void* p, std::size_t size) {
    if (!t_rounding || p == nullptr) {
        return;
    }
    if (g_rounded.used == Rounded::kRoom) {
        g_rounded.overflowed = true;
        return;
    }
    g_rounded.block[g_rounded.used] = p;
    g_rounded.bytes[g_rounded.used] = RoundedSize(size == 0 ? 1 : size);
    g_rounded.live += g_rounded.bytes[g_rounded.used];
    ++g_rounded.used;
}

void ForgetRounded(void* p) {
    if (!t_rounding) {
        return;
    }
    for (std::size_t i = g_rounded.used; i-- > 0;) {
        if (g_rounded.block[i] == p) {
            g_rounded.live -= g_rounded.bytes[i];
            g_rounded.block[i] = g_rounded.block[g_rounded.used - 1];
            g_rounded.bytes[i] = g_rounded.bytes[g_rounded.used - 1];
            --g_rounded.used;
            return;
        }
    }
}

void* Counted(void* p, std::size_t size) {
    NoteRounded(p, size);
    if (p != nullptr) {
        g_live.fetch_add(static_cast<std::int64_t>(malloc_usable_size(p)),
                         std::memory_order_relaxed);
    }
    return p;
}

void Free(void* p) {
    if (p != nullptr) {
        ForgetRounded(p);
        g_live.fetch_sub(static_cast<std::int64_t>(malloc_usable_size(p)),
                         std::memory_order_relaxed);
        std::free(p);
    }
}

void* Allocate(std::size_t size) {
    g_bytes.fetch_add(size, std::memory_order_relaxed);
    if (void* p = Counted(std::malloc(size == 0 ? 1 : size), size)) {
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

void VnBench::StartRoundedBytes() {
    g_rounded.used = 0;
    g_rounded.live = 0;
    g_rounded.overflowed = false;
    t_rounding = true;
}

std::int64_t VnBench::StopRoundedBytes() {
    t_rounding = false;
    return g_rounded.overflowed ? -1 : g_rounded.live;
}

void* operator new(std::size_t size) {
    return Allocate(size);
}
void* operator new[](std::size_t size) {
    return Allocate(size);
}
void* operator new(std::size_t size, const std::nothrow_t&) noexcept {
    g_bytes.fetch_add(size, std::memory_order_relaxed);
    return Counted(std::malloc(size == 0 ? 1 : size), size);
}
void* operator new[](std::size_t size, const std::nothrow_t&) noexcept {
    g_bytes.fetch_add(size, std::memory_order_relaxed);
    return Counted(std::malloc(size == 0 ? 1 : size), size);
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
