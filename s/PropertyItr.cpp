//===-- s/PropertyItr.cpp -------------------------------------------------------===//
#include "Port/UnitStartup.h"

#include "s/PropertyItr.h"

#include "CommonI/TRefCountHelper.h"
#include "s/internal/Shapes.h"

namespace Vn::Eng {

namespace PropertyItrImp {

struct Record {
    Record(PropertyItr* owner, const PropertyItr::Slots* slots, bool showInvisible)
        : m_properties(slots), m_shouldShowInvisible(showInvisible), m_xIRefCount(owner) {}

    const PropertyItr::Slots* m_properties; // not owned
    std::size_t m_itr = 0;
    bool m_shouldShowInvisible;
    CommonI::TRefCountHelper<PropertyItr, 0> m_xIRefCount;

    bool Shown(std::size_t slot) const {
        const auto& property = (*m_properties)[slot];
        return property && (m_shouldShowInvisible || property->IsVisible());
    }
    void SkipHidden() {
        while (m_itr < m_properties->size() && !Shown(m_itr)) {
            ++m_itr;
        }
    }
};

} // namespace PropertyItrImp

CommonI::RefCountPtr<VnI::IPropertyItr> PropertyItr::CreateInstance(const Slots* slots,
                                                                    bool shouldShowInvisible) {
    return detail::AdoptCreated<VnI::IPropertyItr>(new PropertyItr(slots, shouldShowInvisible));
}

PropertyItr::PropertyItr(const Slots* slots, bool shouldShowInvisible)
    : m_imp(new PropertyItrImp::Record(this, slots, shouldShowInvisible)) {}

PropertyItr::~PropertyItr() {
    delete m_imp;
}

CitI::IInterface* PropertyItr::GetInterface(const Port::XUID& id) {
    return detail::AnswerCountedRecord<VnI::IPropertyItr>(this, &m_imp->m_xIRefCount, id);
}

CommonI::RefCountPtr<VnI::IProperty> PropertyItr::CurrentItem() {
    if (IsEnd()) {
        return nullptr;
    }
    return (*m_imp->m_properties)[m_imp->m_itr];
}

std::int64_t PropertyItr::First() {
    if (m_imp->m_properties == nullptr) {
        return 0;
    }
    m_imp->m_itr = 0;
    m_imp->SkipHidden();
    return 1;
}

std::int64_t PropertyItr::Next() {
    if (IsEnd()) {
        return 0;
    }
    ++m_imp->m_itr;
    m_imp->SkipHidden();
    return 1;
}

bool PropertyItr::IsEnd() const {
    return m_imp->m_properties == nullptr || m_imp->m_itr >= m_imp->m_properties->size();
}

} // namespace Vn::Eng
