//===-- s/GenericPropertyHolder.h - a holder with a name list of its own --------===//
//
// \file
// A ready-to-use holder of type 11 whose name list belongs to it alone, so arbitrary
// properties can be attached without a shared schema: every AddProperty under a new name
// appends to this holder's list, and slot positions are this holder's own.
//
// The holder owns its list and destroys it with itself; the pointer GetPropertyNames
// hands out is borrowed and valid while the holder lives.
//
//   GenericPropertyHolder h;
//   h.AddProperty("Note", CommonI::RefCountPtr<VnI::IProperty>::Adopt(
//                             PropertyFactory::CreateStringProperty("spare", true)));
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "s/Export.h"
#include "s/PropertyHolder.h"

namespace Vn::Eng {

namespace GenericPropertyHolderImp {
struct Record;
}

class VENLOMER_API GenericPropertyHolder : public PropertyHolder {
public:
    /// A holder with a new, empty name list.
    GenericPropertyHolder();
    /// Destroys the name list with the holder.
    ~GenericPropertyHolder() override;
    GenericPropertyHolder(const GenericPropertyHolder&) = delete;
    GenericPropertyHolder& operator=(const GenericPropertyHolder&) = delete;

    using PropertyHolder::AddProperty;
    /// As PropertyHolder::AddProperty; on this holder's own list the name is found, or
    /// added, with one look-up.
    std::int64_t AddProperty(const Port::StringBase<char>& name,
                             const CommonI::RefCountPtr<VnI::IProperty>& property,
                             bool visible) override;

    /// Empty: a generic holder has no name of its own.
    Port::StringBase<char> GetName() override;
    /// This holder's own list, borrowed.
    VnI::IPropertyNameList* GetPropertyNames() override;
    /// 11.
    int GetType() const override;

private:
    GenericPropertyHolderImp::Record* m_imp;
};

} // namespace Vn::Eng
