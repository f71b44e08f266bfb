//===-- s/PropertyName.h - one entry of a property schema -----------------------===//
//
// \file
// A property name: the text holders store a property under, the type of its values,
// whether it is visible, and, for enumerations, the possible values (owned, copied at
// creation). Immutable once made; counted, and reached through VnI::IPropertyName.
//
//   auto bank = PropertyName::CreateInstance("Bank", VnI::INT_TYPE, true);  // count 1
//   auto it = bank->GetPossibleValues();     // must not be used after bank is released
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "CommonI/RefCountPtr.h"
#include "VnI/IPropertyName.h"
#include "s/Export.h"

namespace Vn::Eng {

namespace PropertyNameImp {
struct Record;
}

class VENLOMER_API PropertyName {
public:
    /// A new name without possible values, count 1, adopted by the returned pointer.
    static CommonI::RefCountPtr<VnI::IPropertyName>
    CreateInstance(const Port::StringBase<char>& name, VnI::PropertyType type, bool visible);
    /// The same with the values that values yields from where it stands (it is left at its
    /// end); a null iterator gives no values.
    static CommonI::RefCountPtr<VnI::IPropertyName>
    CreateInstance(const Port::StringBase<char>& name, VnI::PropertyType type,
                   const CommonI::RefCountPtr<VnI::IPossibleEnumValuesItr>& values, bool visible);

    PropertyName(const Port::StringBase<char>& name, VnI::PropertyType type, bool visible);
    PropertyName(const Port::StringBase<char>& name, VnI::PropertyType type,
                 const CommonI::RefCountPtr<VnI::IPossibleEnumValuesItr>& values, bool visible);
    PropertyName(const PropertyName&) = delete;
    PropertyName& operator=(const PropertyName&) = delete;

    virtual bool IsVisible() const;
    virtual ~PropertyName();

    /// IPropertyName and CitI::IInterface give the interface object; IRefCount the
    /// counter; anything else (or no record) null.
    CitI::IInterface* GetInterface(const Port::XUID& id);

    /// A copy of the text.
    Port::StringBase<char> GetName() const;
    /// The text without a copy.
    const Port::StringBase<char>& Name() const;
    VnI::PropertyType GetType() const;
    /// A new iterator over the possible values (one reference); it does not keep the name
    /// alive.
    CommonI::RefCountPtr<VnI::IPossibleEnumValuesItr> GetPossibleValues() const;

private:
    PropertyNameImp::Record* m_imp;
};

} // namespace Vn::Eng
