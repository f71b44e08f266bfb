//===-- s/GenericPropertyHolder.cpp ---------------------------------------------===//
#include "Port/UnitStartup.h"

#include "s/GenericPropertyHolder.h"

#include "s/PropertyNameList.h"

namespace Vn::Eng {

namespace GenericPropertyHolderImp {

struct Record {
    Record()
        : m_propertyNameList(static_cast<VnI::IPropertyNameList*>(
              m_list.GetInterface(VnI::IID_IPropertyNameList))) {}

    // The list lives and dies with the holder, in the same block: one allocation fewer
    // per holder. The interface pointer handed out is borrowed.
    PropertyNameList m_list;
    VnI::IPropertyNameList* m_propertyNameList;
};

} // namespace GenericPropertyHolderImp

GenericPropertyHolder::GenericPropertyHolder() : m_imp(new GenericPropertyHolderImp::Record()) {}

GenericPropertyHolder::~GenericPropertyHolder() {
    delete m_imp;
}

std::int64_t
GenericPropertyHolder::AddProperty(const Port::StringBase<char>& name,
                                   const CommonI::RefCountPtr<VnI::IProperty>& property,
                                   bool visible) {
    // A class derived from this one may answer a list of another kind.
    if (!property || GetPropertyNames() != m_imp->m_propertyNameList) {
        return PropertyHolder::AddProperty(name, property, visible);
    }
    const int index =
        detail::PositionAddingName(m_imp->m_list, name, *property, visible, detail::kMaxSlot);
    if (index < 0 || index > detail::kMaxSlot) {
        return 0;
    }
    return detail::StoreProperty(*this, index, m_imp->m_list.GetNumNames(), property);
}

Port::StringBase<char> GenericPropertyHolder::GetName() {
    return {};
}

VnI::IPropertyNameList* GenericPropertyHolder::GetPropertyNames() {
    return m_imp->m_propertyNameList;
}

int GenericPropertyHolder::GetType() const {
    return VnI::GENERIC_HOLDER_TYPE;
}

} // namespace Vn::Eng
