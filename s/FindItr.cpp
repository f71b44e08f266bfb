//===-- s/FindItr.cpp -----------------------------------------------------------===//
#include "Port/UnitStartup.h"

#include "s/FindItr.h"

#include "CommonI/TRefCountHelper.h"
#include "s/internal/Lookahead.h"
#include "s/internal/Shapes.h"
#include "s/internal/TextSearch.h"

#include <iterator>

namespace Vn::Eng {

namespace {
const char kRevision[] = "$Revision: 1.4 $";
const detail::Unit kUnit{"../s/FindItr", kRevision};
} // namespace

namespace FindItrImp {

struct Record {
    Record(FindItr* owner, const CommonI::RefCountPtr<VnI::IPropertyHolderItr>& itr,
           const Port::StringBase<char>& name,
           const CommonI::RefCountPtr<const VnI::IProperty>& property, int flags)
        : m_flags(flags), m_propNameToMatch(name), m_propertyToMatch(property),
          m_propHolderItr(itr), m_xIRefCount(owner), m_textMatch(property.Get(), flags) {}

    int m_flags;
    Port::StringBase<char> m_propNameToMatch;
    CommonI::RefCountPtr<const VnI::IProperty> m_propertyToMatch;
    CommonI::RefCountPtr<VnI::IPropertyHolderItr> m_propHolderItr;
    CommonI::TRefCountHelper<FindItr, 0> m_xIRefCount;
    // Holds a borrowed pointer to the property above, which outlives it.
    detail::PreparedTextMatch m_textMatch;

    bool Matches(VnI::IPropertyHolder* holder) const {
        if (holder == nullptr) {
            return false;
        }
        const CommonI::RefCountPtr<VnI::IProperty> candidate =
            holder->GetPropertyByName(m_propNameToMatch);
        if (!candidate) {
            return false;
        }
        if (m_textMatch.Answers(*candidate)) {
            return m_textMatch.Matches(*candidate);
        }
        return candidate->Equals(m_propertyToMatch, m_flags);
    }

    void Rewind() {
        if (m_propHolderItr) {
            m_propHolderItr->First();
            MatchStep();
        }
    }

    // Never moves past a match: it starts by testing the holder it stands on.
    void MatchStep() {
        VnI::IPropertyHolderItr* itr = m_propHolderItr.Get();
        if (itr == nullptr || !m_propertyToMatch) {
            return;
        }
        if (PropertyHolderList::const_iterator at; detail::WalkedList(*itr, at) != nullptr) {
            MatchStepLookingAhead(*itr);
            return;
        }
        while (!itr->IsEnd() && !Matches(itr->CurrentItem())) {
            itr->Next();
        }
    }

    // The same steps over a list of holders, asking for memory before the calls that
    // need it: the next two holders, and the current holder's record, which the holder's
    // own calls would otherwise reach only after its name list has answered. Reaching
    // further ahead made searches slower, not faster: it reads list nodes that are not at
    // hand yet. The position is read afresh at every step, so nothing is kept across the
    // holders' own calls, which may change the list.
    void MatchStepLookingAhead(VnI::IPropertyHolderItr& itr) {
        PropertyHolderList::const_iterator at;
        while (const PropertyHolderList* list = detail::WalkedList(itr, at)) {
            const auto end = list->end();
            if (auto ahead = std::next(at); ahead != end) {
                detail::Hint(*ahead);
                if (++ahead != end) {
                    detail::Hint(*ahead);
                }
            }
            VnI::IPropertyHolder* holder = *at;
            if (const PropertyHolder* own = m_own.Of(holder)) {
                detail::HintRecord(*own);
            }
            if (Matches(holder)) {
                return;
            }
            itr.Next();
        }
    }

    detail::OwnHolders m_own;
};

} // namespace FindItrImp

CommonI::RefCountPtr<VnI::IPropertyHolderItr>
FindItr::CreateInstance(const CommonI::RefCountPtr<VnI::IPropertyHolderItr>& itr,
                        const Port::StringBase<char>& name,
                        const CommonI::RefCountPtr<const VnI::IProperty>& property, int flags) {
    return detail::AdoptCreated<VnI::IPropertyHolderItr>(new FindItr(itr, name, property, flags));
}

FindItr::FindItr(const CommonI::RefCountPtr<VnI::IPropertyHolderItr>& itr,
                 const Port::StringBase<char>& name,
                 const CommonI::RefCountPtr<const VnI::IProperty>& property, int flags)
    : m_imp(new FindItrImp::Record(this, itr, name, property, flags)) {
    m_imp->Rewind();
}

FindItr::~FindItr() {
    delete m_imp;
}

CitI::IInterface* FindItr::GetInterface(const Port::XUID& id) {
    return detail::AnswerCountedRecord<VnI::IPropertyHolderItr>(this, &m_imp->m_xIRefCount, id);
}

VnI::IPropertyHolder* FindItr::CurrentItem() const {
    if (IsEnd()) {
        return nullptr;
    }
    return m_imp->m_propHolderItr->CurrentItem();
}

std::int64_t FindItr::First() {
    m_imp->Rewind();
    return 1;
}

std::int64_t FindItr::Next() {
    if (m_imp->m_propHolderItr && !m_imp->m_propHolderItr->IsEnd()) {
        m_imp->m_propHolderItr->Next();
        m_imp->MatchStep();
    }
    return 1;
}

bool FindItr::IsEnd() const {
    return !m_imp->m_propHolderItr || m_imp->m_propHolderItr->IsEnd();
}

void FindItr::Dump() const {
    using detail::AddressArg;
    detail::DumpLine(kUnit, __LINE__, "Vn::Eng::FindItr::m_imp->m_flags = %d\n", m_imp->m_flags);
    detail::DumpLine(kUnit, __LINE__, "Vn::Eng::FindItr::m_imp->m_propNameToMatch = %s\n",
                     m_imp->m_propNameToMatch.c_str());
    detail::DumpLine(kUnit, __LINE__, "Vn::Eng::FindItr::m_imp->m_propertyToMatch = %x\n",
                     AddressArg(m_imp->m_propertyToMatch.Get()));
    detail::DumpLine(kUnit, __LINE__, "Vn::Eng::FindItr::m_imp->m_propHolderItr = %x\n",
                     AddressArg(m_imp->m_propHolderItr.Get()));
}

} // namespace Vn::Eng
