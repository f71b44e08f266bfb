//===-- s/HighlightManager.cpp --------------------------------------------------===//
#include "Port/UnitStartup.h"

#include "s/HighlightManager.h"

#include "s/DeviceResourceItr.h"
#include "s/internal/Shapes.h"

#include "s/internal/PointerIndex.h"

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

// The entries of one resource. Entries are only ever appended at the list's end and
// removed oldest first, so a queue keeps them in order; the oldest sits in the index
// itself, and only a resource highlighted more than once needs the queue.
struct Entries {
    List::iterator oldest;
    std::unique_ptr<std::deque<List::iterator>> later;
};

struct Record {
    explicit Record(HighlightManager* owner) : m_interface(owner) {}

    List m_highlightedItems;
    HighlightManager_IHighlightManager m_interface;
    detail::PointerIndex<VnI::IDeviceResource, Entries> m_index;
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
    // The list node is made in a list of its own and spliced in (which cannot fail) once
    // the index holds it, and the flag is set last: a failed allocation leaves list,
    // index and flag as they were.
    HighlightManagerImp::List staged;
    staged.push_back(resource);
    const HighlightManagerImp::List::iterator at = staged.begin();
    if (HighlightManagerImp::Entries* entries = m_imp->m_index.Find(resource)) {
        if (!entries->later) {
            entries->later = std::make_unique<std::deque<HighlightManagerImp::List::iterator>>();
        }
        entries->later->push_back(at);
    } else {
        m_imp->m_index.FindOrAdd(resource).oldest = at;
    }
    auto& list = m_imp->m_highlightedItems;
    list.splice(list.end(), staged);
    resource->SetHighlighted(true);
    return 1;
}

std::int64_t HighlightManager::RemoveHighlightedItem(VnI::IDeviceResource* resource) {
    HighlightManagerImp::Entries* entries = resource ? m_imp->m_index.Find(resource) : nullptr;
    if (entries == nullptr) {
        return 1;
    }
    resource->SetHighlighted(false);
    m_imp->m_highlightedItems.erase(entries->oldest);
    if (entries->later && !entries->later->empty()) {
        entries->oldest = entries->later->front();
        entries->later->pop_front();
    } else {
        m_imp->m_index.Erase(resource);
    }
    return 1;
}

std::int64_t HighlightManager::RemoveAll() {
    for (VnI::IDeviceResource* resource : m_imp->m_highlightedItems) {
        resource->SetHighlighted(false);
    }
    m_imp->m_highlightedItems.clear();
    m_imp->m_index.Clear();
    return 1;
}

CommonI::RefCountPtr<VnI::IDeviceResourceItr> HighlightManager::GetHighlightedItems() {
    return DeviceResourceItr::CreateInstance(&m_imp->m_highlightedItems);
}

} // namespace Vn::Eng
