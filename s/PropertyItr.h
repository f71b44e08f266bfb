//===-- s/PropertyItr.h - walks one holder's property slots ---------------------===//
//
// \file
// The iterator PropertyHolder::GetProperties hands out. It reads the holder's slot
// vector in place and yields the occupied slots in slot order, skipping hidden
// properties unless told to show them. Its position is a slot number, not a vector
// iterator, so a holder that grows its slots while an iterator is out never leaves that
// iterator dangling; the holder itself must outlive it.
//
//   auto it = holder.GetProperties();          // count 1, standing on slot 0
//   for (it->First(); !it->IsEnd(); it->Next()) { use(it->CurrentItem()); }
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "VnI/IPropertyHolder.h"
#include "s/Export.h"

#include <cstddef>
#include <vector>

namespace Vn::Eng {

namespace PropertyItrImp {
struct Record;
}

class VENLOMER_API PropertyItr : public VnI::IPropertyItr {
public:
    using Slots = std::vector<CommonI::RefCountPtr<VnI::IProperty>>;

    /// A new iterator (count 1, adopted by the result) on `slots`, standing on slot 0.
    /// `slots` is not owned; a null vector gives an iterator that is always at its end.
    static CommonI::RefCountPtr<VnI::IPropertyItr> CreateInstance(const Slots* slots,
                                                                  bool shouldShowInvisible);

    PropertyItr(const Slots* slots, bool shouldShowInvisible);
    ~PropertyItr() override;
    PropertyItr(const PropertyItr&) = delete;
    PropertyItr& operator=(const PropertyItr&) = delete;

    /// VnI::IPropertyItr and CitI::IInterface give the iterator, CommonI::IRefCount its
    /// counter object; anything else null.
    CitI::IInterface* GetInterface(const Port::XUID& id) override;
    /// The property at the position (one new reference); null at the end.
    CommonI::RefCountPtr<VnI::IProperty> CurrentItem() override;
    /// Moves to the first shown slot. 0 without a vector, else 1.
    std::int64_t First() override;
    /// Moves to the next shown slot. 0 when already at the end, else 1.
    std::int64_t Next() override;
    bool IsEnd() const override;

private:
    PropertyItrImp::Record* m_imp;
};

} // namespace Vn::Eng
