//===-- s/internal/Lookahead.h - memory hints for a walk over many holders ------===//
//
// A search over a million holders spends most of its time waiting for memory: the list
// node, the holder, its record, its slots and the property are separate blocks, and each is a cache
// miss taken only once the block before it has arrived. A walk over a list knows the
// holders it visits next, so it asks for their blocks a few holders ahead while it
// compares the current one. Hints never change an outcome: they only read blocks of live
// holders of this library's own class.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "s/PropertyHolder.h"
#include "s/PropertyHolderItr.h"

#include <cstddef>
#include <cstring>

namespace Vn::Eng::detail {

/// The list a PropertyHolderItr walks, its position set in `at`; null for an iterator
/// at its end or of any other class (its steps could mean something else).
const PropertyHolderList* WalkedList(VnI::IPropertyHolderItr& itr,
                                     PropertyHolderList::const_iterator& at);

// HintRecord is declared with the holder.

inline void Hint(const void* address) {
    __builtin_prefetch(address);
}

/// Which holders walked are this library's PropertyHolder, and where in them: a walk
/// meets few holder classes, so the cast is worked out once per class and base. The key
/// is the holder's virtual-table pointer, which tells both the complete class and which
/// of its IPropertyHolder bases the pointer designates (the typeid names the class only).
class OwnHolders {
public:
    const PropertyHolder* Of(VnI::IPropertyHolder* holder) {
        if (holder == nullptr) {
            return nullptr;
        }
        const void* table = nullptr;
        std::memcpy(&table, static_cast<const void*>(holder), sizeof table);
        if (table != m_table) {
            const auto* own = dynamic_cast<const PropertyHolder*>(holder);
            m_table = table;
            m_own = own != nullptr;
            m_offset =
                m_own ? reinterpret_cast<const char*>(own) - reinterpret_cast<const char*>(holder)
                      : 0;
        }
        return m_own ? reinterpret_cast<const PropertyHolder*>(
                           reinterpret_cast<const char*>(holder) + m_offset)
                     : nullptr;
    }

private:
    const void* m_table = nullptr;
    bool m_own = false;
    std::ptrdiff_t m_offset = 0;
};

} // namespace Vn::Eng::detail
