//===-- s/PropertyHolderItr.h - walks a list of holders in place ----------------===//
//
// \file
// The iterator reads the list it was given where it stands: an element added ahead of
// the position is seen; removing the element at the position, or destroying the list,
// invalidates the iterator. Owners hand these out for immediate use.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "VnI/IPropertyHolder.h"
#include "s/Export.h"

#include <list>

namespace Vn::Eng {

using PropertyHolderList = std::list<VnI::IPropertyHolder*>;

namespace PropertyHolderItrImp {
struct Record;
}

namespace detail {
// The list walked and the position, for a walk that looks ahead (s/internal/Lookahead.h).
const PropertyHolderList* WalkedList(VnI::IPropertyHolderItr& itr,
                                     PropertyHolderList::const_iterator& at);
} // namespace detail

class VENLOMER_API PropertyHolderItr : public VnI::IPropertyHolderItr {
public:
    /// A new iterator standing on the list's first element (count 1, adopted). A null list
    /// gives an iterator that is always at its end.
    static CommonI::RefCountPtr<VnI::IPropertyHolderItr>
    CreateInstance(const PropertyHolderList* list);

    explicit PropertyHolderItr(const PropertyHolderList* list);
    ~PropertyHolderItr() override;
    PropertyHolderItr(const PropertyHolderItr&) = delete;
    PropertyHolderItr& operator=(const PropertyHolderItr&) = delete;

    CitI::IInterface* GetInterface(const Port::XUID& id) override;
    VnI::IPropertyHolder* CurrentItem() const override;
    std::int64_t First() override;
    std::int64_t Next() override;
    bool IsEnd() const override;

    void Dump() const;

private:
    friend const PropertyHolderList* detail::WalkedList(VnI::IPropertyHolderItr& itr,
                                                        PropertyHolderList::const_iterator& at);

    PropertyHolderItrImp::Record* m_imp;
};

} // namespace Vn::Eng
