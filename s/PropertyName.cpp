//===-- s/PropertyName.cpp ------------------------------------------------------===//
#include "Port/UnitStartup.h"

#include "s/PropertyName.h"

#include "CommonI/TRefCountHelper.h"
#include "s/PossibleEnumValuesItr.h"
#include "s/internal/Shapes.h"

#include <new>
#include <vector>

namespace Vn::Eng {

namespace PropertyNameImp {

class PropertyName_IPropertyName final
    : public detail::InterfaceObject<PropertyName, VnI::IPropertyName> {
public:
    using InterfaceObject::InterfaceObject;

    Port::StringBase<char> GetName() const override { return m_owner->GetName(); }
    VnI::PropertyType GetType() const override { return m_owner->GetType(); }
    CommonI::RefCountPtr<VnI::IPossibleEnumValuesItr> GetPossibleValues() const override {
        return m_owner->GetPossibleValues();
    }
    bool IsVisible() const override { return m_owner->IsVisible(); }
};

struct Record {
    Record(PropertyName* owner, const Port::StringBase<char>& name, VnI::PropertyType type,
           bool visible)
        : m_name(name), m_isVisible(visible), m_type(type), m_xIPropertyName(owner),
          m_xIRefCount(owner) {}

    Port::StringBase<char> m_name;
    bool m_isVisible;
    VnI::PropertyType m_type;
    std::vector<Port::StringBase<char>> m_possibleValues;
    PropertyName_IPropertyName m_xIPropertyName;
    CommonI::TRefCountHelper<PropertyName, 0> m_xIRefCount;
};

} // namespace PropertyNameImp

CommonI::RefCountPtr<VnI::IPropertyName>
PropertyName::CreateInstance(const Port::StringBase<char>& name, VnI::PropertyType type,
                             bool visible) {
    return detail::AdoptCreated<VnI::IPropertyName>(new (std::nothrow)
                                                        PropertyName(name, type, visible));
}

CommonI::RefCountPtr<VnI::IPropertyName>
PropertyName::CreateInstance(const Port::StringBase<char>& name, VnI::PropertyType type,
                             const CommonI::RefCountPtr<VnI::IPossibleEnumValuesItr>& values,
                             bool visible) {
    // The analyser loses the object in the values loop; its count owns it from here on.
    // NOLINTNEXTLINE(clang-analyzer-cplusplus.NewDeleteLeaks)
    return detail::AdoptCreated<VnI::IPropertyName>(new (std::nothrow)
                                                        PropertyName(name, type, values, visible));
}

PropertyName::PropertyName(const Port::StringBase<char>& name, VnI::PropertyType type, bool visible)
    : m_imp(new PropertyNameImp::Record(this, name, type, visible)) {}

PropertyName::PropertyName(const Port::StringBase<char>& name, VnI::PropertyType type,
                           const CommonI::RefCountPtr<VnI::IPossibleEnumValuesItr>& values,
                           bool visible)
    : PropertyName(name, type, visible) {
    if (!values) {
        return; // no iterator, no values
    }
    // Read from where the caller's iterator stands, without restarting it: callers may
    // skip values on purpose.
    for (; !values->IsEnd(); values->Next()) {
        m_imp->m_possibleValues.push_back(values->CurrentItem());
    }
}

PropertyName::~PropertyName() {
    delete m_imp;
}

bool PropertyName::IsVisible() const {
    return m_imp->m_isVisible;
}

CitI::IInterface* PropertyName::GetInterface(const Port::XUID& id) {
    if (m_imp == nullptr) {
        return nullptr;
    }
    if (id == VnI::IID_IPropertyName || id == CitI::IID_IInterface) {
        return &m_imp->m_xIPropertyName;
    }
    if (id == CommonI::IID_IRefCount) {
        return &m_imp->m_xIRefCount;
    }
    return nullptr;
}

Port::StringBase<char> PropertyName::GetName() const {
    return m_imp->m_name;
}
const Port::StringBase<char>& PropertyName::Name() const {
    return m_imp->m_name;
}
VnI::PropertyType PropertyName::GetType() const {
    return m_imp->m_type;
}

CommonI::RefCountPtr<VnI::IPossibleEnumValuesItr> PropertyName::GetPossibleValues() const {
    return PossibleEnumValuesItr::CreateInstance(&m_imp->m_possibleValues);
}

} // namespace Vn::Eng
