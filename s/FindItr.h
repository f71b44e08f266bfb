//===-- s/FindItr.h - yields the holders whose property matches a value ---------===//
//
// \file
// A find iterator drives the holder iterator it is given (not a copy: the caller's
// iterator moves with it) and stands only on holders whose property of the given name
// Equals the given property under the compare flags. The holder's property is the
// receiver of Equals, so the flags mean what they mean to that property's type. Without
// a property to match it yields every holder.
//
//   auto found = FindItr::CreateInstance(manager.GetAllSelectedItems(), "Bank", twelve,
//                                        VnI::MATCH_EXACT);      // on the first match
//   for (; !found->IsEnd(); found->Next()) { use(found->CurrentItem()); }
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "VnI/IPropertyHolder.h"
#include "s/Export.h"

namespace Vn::Eng {

namespace FindItrImp {
struct Record;
}

class VENLOMER_API FindItr : public VnI::IPropertyHolderItr {
public:
    /// A new find iterator (count 1, adopted by the result) standing on the first match.
    static CommonI::RefCountPtr<VnI::IPropertyHolderItr>
    CreateInstance(const CommonI::RefCountPtr<VnI::IPropertyHolderItr>& itr,
                   const Port::StringBase<char>& name,
                   const CommonI::RefCountPtr<const VnI::IProperty>& property, int flags);

    /// Holds itr and property (one reference each), rewinds itr and moves to the first
    /// match.
    FindItr(const CommonI::RefCountPtr<VnI::IPropertyHolderItr>& itr,
            const Port::StringBase<char>& name,
            const CommonI::RefCountPtr<const VnI::IProperty>& property, int flags);
    ~FindItr() override;
    FindItr(const FindItr&) = delete;
    FindItr& operator=(const FindItr&) = delete;

    /// VnI::IPropertyHolderItr and CitI::IInterface give the iterator, CommonI::IRefCount
    /// its counter object; anything else null.
    CitI::IInterface* GetInterface(const Port::XUID& id) override;
    /// The matching holder, borrowed; null at the end or without an iterator.
    VnI::IPropertyHolder* CurrentItem() const override;
    /// Rewinds to the first match. Returns 1.
    std::int64_t First() override;
    /// On to the next match. Returns 1.
    std::int64_t Next() override;
    bool IsEnd() const override;

    void Dump() const;

private:
    FindItrImp::Record* m_imp;
};

} // namespace Vn::Eng
