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
