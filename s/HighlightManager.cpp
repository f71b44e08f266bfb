//===-- s/HighlightManager.cpp --------------------------------------------------===//
#include "Port/UnitStartup.h"

#include "s/HighlightManager.h"

#include "s/DeviceResourceItr.h"
#include "s/internal/Shapes.h"

#include "s/internal/PointerIndex.h"
#include "s/internal/Spill.h"

#include <cstdint>
#include <deque>
#include <memory>

namespace Vn::Eng {

namespace HighlightManagerImp {

using List = DeviceResourceList;

class HighlightManager_IHighlightManager final
    : public detail::InterfaceObject<HighlightManager, VnI::IHighlightManager> {
public:
    using InterfaceObject::InterfaceObject;
    CommonI::RefCountPtr<VnI::IDeviceResourceItr> GetHighlightedItems() override {
        return m_owner->GetHighlightedItems();
    }
    std::int64_t AddHighlightedItem(VnI::IDeviceResource* resource) override {
        return m_owner->AddHighlightedItem(resource);
    }
    std::int64_t RemoveHighlightedItem(VnI::IDeviceResource* resource) override {
        return m_owner->RemoveHighlightedItem(resource);
    }
    std::int64_t RemoveAll() override { return m_owner->RemoveAll(); }
};

// The entries of a resource highlighted more than once, oldest first.
using Entries = detail::Spill<VnI::IDeviceResource, List::iterator>;

// One resource in the index, in eight bytes: the list node of its only entry with 16
// bits of its address's hash above the node's address (the node holds the resource,
// read only when the bits match), or, with the low bit set, its Entries.
class Slot {
public:
    using Bits = detail::IteratorBits<List::iterator>;

    bool Empty() const { return m_bits == 0; }
    bool Boxed() const { return (m_bits & 1) != 0; }
    // The slot is one word: a boxed entry is its pointer with the low bit set, so it must be
    // rebuilt from the integer.
    Entries* Box() const {
        return reinterpret_cast<Entries*>( // NOLINT(performance-no-int-to-ptr)
            m_bits & ~std::uint64_t{1});
    }
    List::iterator Only() const { return Bits::From(m_bits); }
    const VnI::IDeviceResource* KeyOf() const { return Boxed() ? Box()->GetKey() : *Only(); }
    bool Holds(const VnI::IDeviceResource* key, std::uint64_t hash) const {
        if (Boxed()) {
            return Box()->GetKey() == key;
        }
        return (m_bits >> 48) == (hash >> 48) && *Only() == key;
    }

    /// False when at cannot be packed; the slot is left as it was.
    bool SetOnly(List::iterator at, std::uint64_t hash) {
        if (!Bits::Packs(at)) {
            return false;
        }
        m_bits = Bits::Of(at) | (hash & ~std::uint64_t{0} << 48);
        return true;
    }
    void SetBox(Entries* box) { m_bits = reinterpret_cast<std::uintptr_t>(box) | 1; }

private:
    std::uint64_t m_bits = 0;
};
static_assert(sizeof(Slot) == 8);

using Index = detail::PointerIndex<VnI::IDeviceResource, Slot>;

struct Record {
    explicit Record(HighlightManager* owner) : m_interface(owner) {}
    ~Record() { FreeBoxes(); }
    Record(const Record&) = delete;
    Record& operator=(const Record&) = delete;

    void FreeBoxes() {
        m_index.ForEach([](Slot& slot) {
            if (slot.Boxed()) {
                delete slot.Box();
            }
        });
    }

    List m_highlightedItems;
    HighlightManager_IHighlightManager m_interface;
    Index m_index;
};

} // namespace HighlightManagerImp

HighlightManager::HighlightManager() : m_imp(new HighlightManagerImp::Record(this)) {}

HighlightManager::~HighlightManager() {
    for (VnI::IDeviceResource* resource : m_imp->m_highlightedItems) {
        resource->SetHighlighted(false);
    }
    delete m_imp;
}

CitI::IInterface* HighlightManager::GetInterface(const Port::XUID& id) {
    if (id == VnI::IID_IHighlightManager || id == CitI::IID_IInterface) {
        return &m_imp->m_interface;
    }
    return nullptr;
}

std::int64_t HighlightManager::AddHighlightedItem(VnI::IDeviceResource* resource) {
    if (resource == nullptr) {
        return 1;
    }
    m_imp->m_index.Prefetch(resource);
    // The list node is made in a list of its own and spliced in (which cannot fail) once
    // the index holds it, and the flag is set last: a failed allocation leaves list,
    // index and flag as they were.
    HighlightManagerImp::List staged;
    staged.push_back(resource);
    const HighlightManagerImp::List::iterator at = staged.begin();
    using HighlightManagerImp::Entries;
    auto& index = m_imp->m_index;
    const std::uint64_t hash = HighlightManagerImp::Index::Hash(resource);
    if (HighlightManagerImp::Slot* slot = index.Find(resource)) {
        if (slot->Boxed()) {
            slot->Box()->Append(at);
        } else {
            auto box = std::make_unique<Entries>(resource, slot->Only());
            box->Append(at);
            slot->SetBox(box.release());
        }
    } else {
        // A node that cannot be packed (never seen on the platforms we build for) is kept
        // in a box of its own.
        auto box = HighlightManagerImp::Slot::Bits::Packs(at)
                       ? nullptr
                       : std::make_unique<Entries>(resource, at);
        HighlightManagerImp::Slot& added = index.Add(resource);
        if (box) {
            added.SetBox(box.release());
        } else {
            added.SetOnly(at, hash);
        }
    }
    auto& list = m_imp->m_highlightedItems;
    list.splice(list.end(), staged);
    resource->SetHighlighted(true);
    return 1;
}

std::int64_t HighlightManager::RemoveHighlightedItem(VnI::IDeviceResource* resource) {
    HighlightManagerImp::Slot* slot = resource ? m_imp->m_index.Find(resource) : nullptr;
    if (slot == nullptr) {
        return 1;
    }
    resource->SetHighlighted(false);
    if (!slot->Boxed()) {
        m_imp->m_highlightedItems.erase(slot->Only());
        m_imp->m_index.Erase(slot);
        return 1;
    }
    HighlightManagerImp::Entries* entries = slot->Box();
    m_imp->m_highlightedItems.erase(entries->Oldest());
    if (!entries->DropOldest()) {
        delete entries;
        m_imp->m_index.Erase(slot);
    }
    return 1;
}

std::int64_t HighlightManager::RemoveAll() {
    for (VnI::IDeviceResource* resource : m_imp->m_highlightedItems) {
        resource->SetHighlighted(false);
    }
    m_imp->m_highlightedItems.clear();
    m_imp->FreeBoxes();
    m_imp->m_index.Clear();
    return 1;
}

CommonI::RefCountPtr<VnI::IDeviceResourceItr> HighlightManager::GetHighlightedItems() {
    return DeviceResourceItr::CreateInstance(&m_imp->m_highlightedItems);
}

} // namespace Vn::Eng
