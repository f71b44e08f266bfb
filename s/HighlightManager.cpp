//===-- s/HighlightManager.cpp --------------------------------------------------===//
#include "Port/UnitStartup.h"

#include "s/HighlightManager.h"

#include "s/DeviceResourceItr.h"
#include "s/internal/Shapes.h"

#include <unordered_map>
#include <vector>

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

// The entries of one resource, oldest first from `head` on. Entries are only ever
// appended at the list's end and removed oldest first, so a queue keeps them in order.
struct Entries {
    std::vector<List::iterator> positions;
    size_t head = 0;
};

struct Record {
    explicit Record(HighlightManager* owner) : m_interface(owner) {}

    List m_highlightedItems;
    HighlightManager_IHighlightManager m_interface;
    std::unordered_map<VnI::IDeviceResource*, Entries> m_index;
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
    resource->SetHighlighted(true);
    auto& list = m_imp->m_highlightedItems;
    m_imp->m_index[resource].positions.push_back(list.insert(list.end(), resource));
    return 1;
}

std::int64_t HighlightManager::RemoveHighlightedItem(VnI::IDeviceResource* resource) {
    const auto found = m_imp->m_index.find(resource);
    if (found == m_imp->m_index.end()) {
        return 1;
    }
    HighlightManagerImp::Entries& entries = found->second;
    resource->SetHighlighted(false);
    m_imp->m_highlightedItems.erase(entries.positions[entries.head++]);
    if (entries.head == entries.positions.size()) {
        m_imp->m_index.erase(found);
    } else if (entries.head > 16 && entries.head * 2 > entries.positions.size()) {
        // Drop the consumed front so a resource highlighted many times stays compact.
        entries.positions.erase(entries.positions.begin(),
                                entries.positions.begin() +
                                    static_cast<std::ptrdiff_t>(entries.head));
        entries.head = 0;
    }
    return 1;
}

std::int64_t HighlightManager::RemoveAll() {
    for (VnI::IDeviceResource* resource : m_imp->m_highlightedItems) {
        resource->SetHighlighted(false);
    }
    m_imp->m_highlightedItems.clear();
    m_imp->m_index.clear();
    return 1;
}

CommonI::RefCountPtr<VnI::IDeviceResourceItr> HighlightManager::GetHighlightedItems() {
    return DeviceResourceItr::CreateInstance(&m_imp->m_highlightedItems);
}

} // namespace Vn::Eng
