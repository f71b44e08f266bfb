//===-- s/PossibleEnumValuesItr.cpp ---------------------------------------------===//
#include "Port/UnitStartup.h"

#include "s/PossibleEnumValuesItr.h"

#include "CommonI/TRefCountHelper.h"
#include "s/internal/Shapes.h"

#include <new>

namespace Vn::Eng {

namespace PossibleEnumValuesItrImp {

struct Record {
    Record(PossibleEnumValuesItr* owner, const std::vector<Port::StringBase<char>>* values)
        : m_xIRefCount(owner), m_possibleValues(values) {}

    CommonI::TRefCountHelper<PossibleEnumValuesItr, 0> m_xIRefCount;
    const std::vector<Port::StringBase<char>>* m_possibleValues; // not owned; may be null
    std::size_t m_itr = 0;
};

} // namespace PossibleEnumValuesItrImp

CommonI::RefCountPtr<VnI::IPossibleEnumValuesItr>
PossibleEnumValuesItr::CreateInstance(const std::vector<Port::StringBase<char>>* values) {
    return detail::AdoptCreated<VnI::IPossibleEnumValuesItr>(new (std::nothrow)
                                                                 PossibleEnumValuesItr(values));
}

PossibleEnumValuesItr::PossibleEnumValuesItr(const std::vector<Port::StringBase<char>>* values)
    : m_imp(new PossibleEnumValuesItrImp::Record(this, values)) {}

PossibleEnumValuesItr::~PossibleEnumValuesItr() {
    delete m_imp;
}

CitI::IInterface* PossibleEnumValuesItr::GetInterface(const Port::XUID& id) {
    return detail::AnswerCountedRecord<VnI::IPossibleEnumValuesItr>(this, &m_imp->m_xIRefCount, id);
}

Port::StringBase<char> PossibleEnumValuesItr::CurrentItem() const {
    return IsEnd() ? Port::StringBase<char>() : (*m_imp->m_possibleValues)[m_imp->m_itr];
}

std::int64_t PossibleEnumValuesItr::First() {
    if (m_imp->m_possibleValues != nullptr) {
        m_imp->m_itr = 0;
    }
    return 1;
}

std::int64_t PossibleEnumValuesItr::Next() {
    if (!IsEnd()) {
        ++m_imp->m_itr;
    }
    return 1;
}

bool PossibleEnumValuesItr::IsEnd() const {
    // A list that shrank below the cursor reads as finished.
    return m_imp->m_possibleValues == nullptr || m_imp->m_itr >= m_imp->m_possibleValues->size();
}

} // namespace Vn::Eng
