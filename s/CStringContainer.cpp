//===-- s/CStringContainer.cpp --------------------------------------------------===//
#include "Port/UnitStartup.h"

#include "s/CStringContainer.h"

#include "CommonI/TRefCountHelper.h"
#include "s/internal/Shapes.h"

#include <algorithm>
#include <vector>

namespace Vn::Eng {

namespace {
const char kRevision[] = "$Revision: 1.3 $";
const detail::Unit kUnit{"../s/CStringContainer", kRevision};
} // namespace

namespace StringContainerImpl {

// Both interface objects point at the record and reach the owner through its back
// pointer, so every interface of the container answers GetInterface alike.
CitI::IInterface* AskOwner(Record* record, const Port::XUID& id);

class CStringContainer_IStringContainer final : public VnI::IStringContainer {
public:
    explicit CStringContainer_IStringContainer(Record* record) : m_record(record) {}
    CitI::IInterface* GetInterface(const Port::XUID& id) override { return AskOwner(m_record, id); }

    std::int64_t AddString(const Port::StringBase<char>& text) override;
    std::int64_t RemoveString(const CommonI::RefCountPtr<VnI::IStringIterator>& at) override;
    std::int64_t GetStringIterator(CommonI::RefCountPtr<VnI::IStringIterator>& out) override;
    int GetNumStrings() const override;
    std::int64_t ClearStrings() override;

private:
    Record* m_record;
};

class CStringContainer_IStringIterator final : public VnI::IStringIterator {
public:
    explicit CStringContainer_IStringIterator(Record* record) : m_record(record) {}
    CitI::IInterface* GetInterface(const Port::XUID& id) override { return AskOwner(m_record, id); }

    Port::StringBase<char> CurrentItem() const override;
    std::int64_t First() override;
    std::int64_t Next() override;
    bool IsEnd() const override;

private:
    Record* m_record;
};

struct Record {
    explicit Record(CStringContainer* owner)
        : m_owner(owner), m_xIStringContainer(this), m_xIStringIterator(this), m_xIRefCount(owner) {
    }

    CStringContainer* m_owner;
    CStringContainer_IStringContainer m_xIStringContainer;
    CStringContainer_IStringIterator m_xIStringIterator;
    CommonI::TRefCountHelper<CStringContainer, 0> m_xIRefCount;
    std::vector<Port::StringBase<char>> m_vec;
    // An index rather than a vector iterator: growth of m_vec never leaves it dangling,
    // and a cursor past the end after a removal simply reads as the end.
    size_t m_iter = 0;
};

CitI::IInterface* AskOwner(Record* record, const Port::XUID& id) {
    return record->m_owner != nullptr ? record->m_owner->GetInterface(id) : nullptr;
}

std::int64_t CStringContainer_IStringContainer::AddString(const Port::StringBase<char>& text) {
    m_record->m_vec.push_back(text);
    return 1;
}

std::int64_t CStringContainer_IStringContainer::RemoveString(
    const CommonI::RefCountPtr<VnI::IStringIterator>& at) {
    if (!at || at->IsEnd()) {
        return 1;
    }
    const Port::StringBase<char> wanted = at->CurrentItem();
    auto& vec = m_record->m_vec;
    const auto found = std::find(vec.begin(), vec.end(), wanted);
    if (found != vec.end()) {
        vec.erase(found);
    }
    return 1;
}

std::int64_t CStringContainer_IStringContainer::GetStringIterator(
    CommonI::RefCountPtr<VnI::IStringIterator>& out) {
    out = CommonI::RefCountPtr<VnI::IStringIterator>(static_cast<VnI::IStringIterator*>(
        m_record->m_xIStringIterator.GetInterface(VnI::IID_IStringIterator)));
    return 1;
}

int CStringContainer_IStringContainer::GetNumStrings() const {
    return static_cast<int>(m_record->m_vec.size());
}

std::int64_t CStringContainer_IStringContainer::ClearStrings() {
    m_record->m_vec.clear();
    return 1;
}

Port::StringBase<char> CStringContainer_IStringIterator::CurrentItem() const {
    return IsEnd() ? Port::StringBase<char>() : m_record->m_vec[m_record->m_iter];
}

std::int64_t CStringContainer_IStringIterator::First() {
    m_record->m_iter = 0;
    return 1;
}

std::int64_t CStringContainer_IStringIterator::Next() {
    if (!IsEnd()) {
        ++m_record->m_iter;
    }
    return 1;
}

bool CStringContainer_IStringIterator::IsEnd() const {
    return m_record->m_iter >= m_record->m_vec.size();
}

} // namespace StringContainerImpl

CommonI::RefCountPtr<VnI::IStringContainer> CStringContainer::CreateInstance() {
    return detail::AdoptCreated<VnI::IStringContainer>(new CStringContainer());
}

CStringContainer::CStringContainer() : m_pImpl(new StringContainerImpl::Record(this)) {}

CStringContainer::~CStringContainer() {
    delete m_pImpl;
}

CitI::IInterface* CStringContainer::GetInterface(const Port::XUID& id) {
    if (m_pImpl == nullptr) {
        return nullptr;
    }
    if (id == VnI::IID_IStringContainer) {
        return &m_pImpl->m_xIStringContainer;
    }
    if (id == VnI::IID_IStringIterator) {
        return &m_pImpl->m_xIStringIterator;
    }
    if (id == CommonI::IID_IRefCount || id == CitI::IID_IInterface) {
        return &m_pImpl->m_xIRefCount;
    }
    return nullptr;
}

void CStringContainer::Dump() const {
    using detail::AddressArg;
    detail::DumpLine(kUnit, 263, "CStringContainer::m_pImpl->m_vec = %x\n",
                     AddressArg(&m_pImpl->m_vec));
    detail::DumpLine(kUnit, 264, "CStringContainer::m_pImpl->m_iter = %x\n",
                     AddressArg(&m_pImpl->m_iter));
    detail::DumpLine(kUnit, 265, "CStringContainer::m_pImpl->m_xIRefCount = %x\n",
                     AddressArg(&m_pImpl->m_xIRefCount));
    detail::DumpLine(kUnit, 267, "CStringContainer::m_pImpl->m_xIStringContainer = %x\n",
                     AddressArg(&m_pImpl->m_xIStringContainer));
    detail::DumpLine(kUnit, 269, "CStringContainer::m_pImpl->m_xIStringIterator = %x\n",
                     AddressArg(&m_pImpl->m_xIStringIterator));
}

} // namespace Vn::Eng
