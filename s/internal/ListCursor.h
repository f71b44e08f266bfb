//===-- s/internal/ListCursor.h - the record of the two list iterators ----------===//
//
// Both list iterators keep the same record: the list walked (not owned), the position
// in it and the counter object, in that order. List positions stay valid while other
// elements are added or removed, which is why the owners keep std::list.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "CommonI/TRefCountHelper.h"

#include <cstdint>
#include <list>

namespace Vn::Eng::detail {

template <class Owner, class Element> struct ListCursor {
    using List = std::list<Element*>;

    ListCursor(Owner* owner, const List* list)
        : m_list(list), m_itr(list != nullptr ? list->begin() : typename List::const_iterator()),
          m_counter(owner) {}

    Element* CurrentItem() const { return IsEnd() ? nullptr : *m_itr; }
    std::int64_t First() {
        if (m_list != nullptr) {
            m_itr = m_list->begin();
        }
        return 1;
    }
    std::int64_t Next() {
        if (!IsEnd()) {
            ++m_itr;
        }
        return 1;
    }
    bool IsEnd() const { return m_list == nullptr || m_itr == m_list->end(); }

    const List* m_list;
    typename List::const_iterator m_itr;
    CommonI::TRefCountHelper<Owner, 0> m_counter;
};

} // namespace Vn::Eng::detail
