//===-- s/PossibleEnumValuesItr.h - walks the choices of an enumeration ---------===//
//
// \file
// The iterator behind GetPossibleValues of enumerated properties and property names.
// It reads the owner's list in place and does not keep it alive. Its cursor is a
// position, so a list that grows under it never leaves it dangling; a list that shrinks
// simply ends earlier.
//
//   auto it = property->GetPossibleValues();               // count 1, adopted
//   for (it->First(); !it->IsEnd(); it->Next()) { use(it->CurrentItem()); }
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "CommonI/RefCountPtr.h"
#include "VnI/IProperty.h"
#include "s/Export.h"

#include <vector>

namespace Vn::Eng {

namespace PossibleEnumValuesItrImp {
struct Record;
}

class VENLOMER_API PossibleEnumValuesItr : public VnI::IPossibleEnumValuesItr {
public:
    /// A new iterator over values (null: an iterator that is at its end at once), count 1,
    /// adopted by the returned pointer.
    static CommonI::RefCountPtr<VnI::IPossibleEnumValuesItr>
    CreateInstance(const std::vector<Port::StringBase<char>>* values);

    ~PossibleEnumValuesItr() override;
    PossibleEnumValuesItr(const PossibleEnumValuesItr&) = delete;
    PossibleEnumValuesItr& operator=(const PossibleEnumValuesItr&) = delete;

    /// IPossibleEnumValuesItr and CitI::IInterface give the object; IRefCount the counter.
    CitI::IInterface* GetInterface(const Port::XUID& id) override;
    Port::StringBase<char> CurrentItem() const override;
    /// Returns 1.
    std::int64_t First() override;
    /// Returns 1; at the end it stays there.
    std::int64_t Next() override;
    bool IsEnd() const override;

private:
    explicit PossibleEnumValuesItr(const std::vector<Port::StringBase<char>>* values);

    PossibleEnumValuesItrImp::Record* m_imp;
};

} // namespace Vn::Eng
