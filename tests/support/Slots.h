//===-- tests/support/Slots.h - virtual slot numbers from the compiler, for the contract -===//
//
// Under the Itanium C++ ABI a pointer to a virtual member function holds 1 + the byte
// offset of its slot in the vtable. A virtual destructor takes two slots (complete and
// deleting), so for an interface whose slots are GetInterface, ~, Op the slot numbers are
// GetInterface 0, Op 3. Tests compare these numbers with the published order, so
// reordering a declaration fails a test.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>

namespace VnTest {

template <class MemberFunction> std::ptrdiff_t SlotOf(MemberFunction f) {
    static_assert(sizeof(MemberFunction) == 2 * sizeof(void*), "Itanium ABI member pointer");
    std::uintptr_t raw[2];
    std::memcpy(raw, &f, sizeof raw);
    if ((raw[0] & 1u) == 0) {
        return -1; // not virtual
    }
    return static_cast<std::ptrdiff_t>((raw[0] - 1) / sizeof(void*));
}

} // namespace VnTest
