//===-- s/PropertyHolderItr.cpp -------------------------------------------------===//
#include "Port/UnitStartup.h"

#include "s/PropertyHolderItr.h"

#include "s/internal/ListCursor.h"
#include "s/internal/Lookahead.h"
#include "s/internal/Shapes.h"

#include <typeinfo>

namespace Vn::Eng {

namespace {
const char kRevision[] = "$Revision: 1.3 $";
const detail::Unit kUnit{"../s/PropertyHolderItr", kRevision};
} // namespace

namespace PropertyHolderItrImp {
struct Record : detail::ListCursor<PropertyHolderItr, VnI::IPropertyHolder> {
    using ListCursor::ListCursor;
};
} // namespace PropertyHolderItrImp

const PropertyHolderList* detail::WalkedList(VnI::IPropertyHolderItr& itr,
                                             PropertyHolderList::const_iterator& at) {
    // Exactly this class: a subclass may step differently.
    if (typeid(itr) != typeid(PropertyHolderItr)) {
        return nullptr;
    }
    const auto& cursor = *static_cast<PropertyHolderItr&>(itr).m_imp;
    if (cursor.IsEnd()) {
        return nullptr;
    }
    at = cursor.m_itr;
    return cursor.m_list;
}

CommonI::RefCountPtr<VnI::IPropertyHolderItr>
PropertyHolderItr::CreateInstance(const PropertyHolderList* list) {
    return detail::AdoptCreated<VnI::IPropertyHolderItr>(new PropertyHolderItr(list));
}

PropertyHolderItr::PropertyHolderItr(const PropertyHolderList* list)
    : m_imp(new PropertyHolderItrImp::Record(this, list)) {}

PropertyHolderItr::~PropertyHolderItr() {
    delete m_imp;
}

CitI::IInterface* PropertyHolderItr::GetInterface(const Port::XUID& id) {
    return detail::AnswerCountedRecord<VnI::IPropertyHolderItr>(this, &m_imp->m_counter, id);
}

VnI::IPropertyHolder* PropertyHolderItr::CurrentItem() const {
    return m_imp->CurrentItem();
}
std::int64_t PropertyHolderItr::First() {
    return m_imp->First();
}
std::int64_t PropertyHolderItr::Next() {
    return m_imp->Next();
}
bool PropertyHolderItr::IsEnd() const {
    return m_imp->IsEnd();
}

void PropertyHolderItr::Dump() const {
    detail::DumpLine(kUnit, __LINE__, "Vn::Eng::PropertyHolderItr::m_imp->m_propertyHolders = %x\n",
                     detail::AddressArg(m_imp->m_list));
    detail::DumpLine(kUnit, __LINE__, "Vn::Eng::PropertyHolderItr::m_imp->m_itr = %x\n",
                     detail::AddressArg(&m_imp->m_itr));
}

} // namespace Vn::Eng
