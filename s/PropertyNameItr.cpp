//===-- s/PropertyNameItr.cpp ---------------------------------------------------===//
#include "Port/UnitStartup.h"

#include "s/PropertyNameItr.h"

#include "CommonI/TRefCountHelper.h"
#include "s/internal/Shapes.h"

#include <new>

namespace Vn::Eng {

namespace {
const char kRevision[] = "$Revision: 1.3 $";
const detail::Unit kUnit{"../s/PropertyNameItr", kRevision};
} // namespace

namespace PropertyNameItrImp {

struct Record {
    Record(PropertyNameItr* owner, const PropertyNameItr::Names* names)
        : m_propertyNames(names), m_xIRefCount(owner) {}

    const PropertyNameItr::Names* m_propertyNames; // not owned; may be null
    std::size_t m_itr = 0;
    CommonI::TRefCountHelper<PropertyNameItr, 0> m_xIRefCount;
};

} // namespace PropertyNameItrImp

CommonI::RefCountPtr<VnI::IPropertyNameItr> PropertyNameItr::CreateInstance(const Names* names) {
    return detail::AdoptCreated<VnI::IPropertyNameItr>(new (std::nothrow) PropertyNameItr(names));
}

PropertyNameItr::PropertyNameItr(const Names* names)
    : m_imp(new PropertyNameItrImp::Record(this, names)) {}

PropertyNameItr::~PropertyNameItr() {
    delete m_imp;
}

CitI::IInterface* PropertyNameItr::GetInterface(const Port::XUID& id) {
    return detail::AnswerCountedRecord<VnI::IPropertyNameItr>(this, &m_imp->m_xIRefCount, id);
}

VnI::IPropertyName* PropertyNameItr::CurrentItem() const {
    return IsEnd() ? nullptr : (*m_imp->m_propertyNames)[m_imp->m_itr].Get();
}

std::int64_t PropertyNameItr::First() {
    if (m_imp->m_propertyNames != nullptr) {
        m_imp->m_itr = 0;
    }
    return 0;
}

std::int64_t PropertyNameItr::Next() {
    if (!IsEnd()) {
        ++m_imp->m_itr;
    }
    return 0;
}

bool PropertyNameItr::IsEnd() const {
    // A list cleared under the cursor reads as finished.
    return m_imp->m_propertyNames == nullptr || m_imp->m_itr >= m_imp->m_propertyNames->size();
}

void PropertyNameItr::Dump() const {
    using detail::AddressArg;
    detail::DumpLine(kUnit, 116, "Vn::Eng::PropertyNameItr::m_imp->m_propertyNames = %x\n",
                     AddressArg(m_imp->m_propertyNames));
    detail::DumpLine(kUnit, 118, "Vn::Eng::PropertyNameItr::m_imp->m_itr = %x\n",
                     AddressArg(&m_imp->m_itr));
}

} // namespace Vn::Eng
