//===-- s/FindItr.cpp -----------------------------------------------------------===//
#include "Port/UnitStartup.h"

#include "s/FindItr.h"

#include "CommonI/TRefCountHelper.h"
#include "s/internal/Lookahead.h"
#include "s/internal/Shapes.h"

#include <array>
#include <cstddef>

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
          m_propHolderItr(itr), m_xIRefCount(owner) {}

    int m_flags;
    Port::StringBase<char> m_propNameToMatch;
    CommonI::RefCountPtr<const VnI::IProperty> m_propertyToMatch;
    CommonI::RefCountPtr<VnI::IPropertyHolderItr> m_propHolderItr;
    CommonI::TRefCountHelper<FindItr, 0> m_xIRefCount;

    bool Matches(VnI::IPropertyHolder* holder) const {
        if (holder == nullptr) {
            return false;
        }
        const CommonI::RefCountPtr<VnI::IProperty> candidate =
            holder->GetPropertyByName(m_propNameToMatch);
        return candidate && candidate->Equals(m_propertyToMatch, m_flags);
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
        PropertyHolderList::const_iterator at;
        if (const PropertyHolderList* list = detail::WalkedList(*itr, at)) {
            MatchStepLookingAhead(*itr, *list, at);
            return;
        }
        while (!itr->IsEnd() && !Matches(itr->CurrentItem())) {
            itr->Next();
        }
    }

    // The same steps over a list of holders, asking for the memory of the holders ahead
    // in stages: a holder's record once the holder has arrived, its slot once the record
    // has, the property once the slot has (see s/internal/Lookahead.h).
    void MatchStepLookingAhead(VnI::IPropertyHolderItr& itr, const PropertyHolderList& list,
                               PropertyHolderList::const_iterator ahead) {
        constexpr std::size_t kRing = 16; // a power of two above kLead
        constexpr std::size_t kLead = 12;
        constexpr std::size_t kRecordAt = 9;
        constexpr std::size_t kSlotAt = 6;
        constexpr std::size_t kPropertyAt = 3;
        struct Ahead {
            VnI::IPropertyHolder* holder;
            const PropertyHolder* own;
        };
        std::array<Ahead, kRing> ring{};
        std::size_t position = 0; // of the holder itr stands on; ring[position % kRing]
        std::size_t known = 0;    // holders from there on read into the ring
        const std::size_t size = list.size();
        int slot = -1; // where the first holder keeps the name; most share its list
        bool slotKnown = false;
        auto at = [&](std::size_t distance) -> Ahead& {
            return ring[(position + distance) % kRing];
        };
        while (!itr.IsEnd()) {
            for (; known < kLead && ahead != list.end(); ++known, ++ahead) {
                at(known) = Ahead{*ahead, nullptr};
                detail::Hint(*ahead);
            }
            if (known > kRecordAt && at(kRecordAt).holder != nullptr) {
                Ahead& next = at(kRecordAt);
                next.own = m_own.Of(next.holder);
                if (next.own != nullptr) {
                    detail::HintRecord(*next.own);
                }
            }
            if (slotKnown && known > kSlotAt && at(kSlotAt).own != nullptr) {
                detail::HintSlot(*at(kSlotAt).own, slot);
            }
            if (slotKnown && known > kPropertyAt && at(kPropertyAt).own != nullptr) {
                detail::HintProperty(*at(kPropertyAt).own, slot);
            }
            VnI::IPropertyHolder* holder = itr.CurrentItem();
            if (!slotKnown && holder != nullptr) {
                VnI::IPropertyNameList* names = holder->GetPropertyNames();
                slot = names != nullptr ? names->Contains(m_propNameToMatch) : -1;
                slotKnown = true;
            }
            if (Matches(holder)) {
                return;
            }
            if (list.size() != size) {
                // The holders' own calls changed the list: the position ahead may be
                // gone. Read on without hints.
                itr.Next();
                while (!itr.IsEnd() && !Matches(itr.CurrentItem())) {
                    itr.Next();
                }
                return;
            }
            itr.Next();
            ++position;
            known = known > 0 ? known - 1 : 0;
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
