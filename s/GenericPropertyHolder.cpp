//===-- s/GenericPropertyHolder.cpp ---------------------------------------------===//
#include "Port/UnitStartup.h"

#include "s/GenericPropertyHolder.h"

#include "s/PropertyNameList.h"

#include <memory>

namespace Vn::Eng {

namespace GenericPropertyHolderImp {

struct Record {
    Record()
        : m_list(new PropertyNameList()), m_propertyNameList(static_cast<VnI::IPropertyNameList*>(
                                              m_list->GetInterface(VnI::IID_IPropertyNameList))) {}

    // The list is ours to delete, and it is deleted through its own class: the interface
    // pointer handed out is borrowed.
    std::unique_ptr<PropertyNameList> m_list;
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
