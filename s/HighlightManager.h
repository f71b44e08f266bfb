//===-- s/HighlightManager.h - the highlighted device resources -----------------===//
//
// \file
// Resources are listed in order of highlighting (a resource highlighted twice stands
// twice) and their highlighted flags kept in step. The manager keeps plain pointers and
// owns nothing: a resource must leave the list before it is destroyed.
//
// An index from each resource to its entries, oldest first, lets a removal find the
// first entry without scanning the list.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "VnI/IManagers.h"
#include "s/Export.h"

namespace Vn::Eng {

namespace HighlightManagerImp {
struct Record;
}

class VENLOMER_API HighlightManager {
public:
    HighlightManager();
    /// Clears the highlighted flag of every resource still listed.
    virtual ~HighlightManager();
    HighlightManager(const HighlightManager&) = delete;
    HighlightManager& operator=(const HighlightManager&) = delete;

    /// VnI::IHighlightManager and CitI::IInterface give the interface object; others null.
    CitI::IInterface* GetInterface(const Port::XUID& id);
    /// Flags and appends resource, even when it is listed already; null is ignored.
    /// Returns 1.
    std::int64_t AddHighlightedItem(VnI::IDeviceResource* resource);
    /// Removes the first entry of resource and clears its flag; nothing when absent.
    /// Returns 1.
    std::int64_t RemoveHighlightedItem(VnI::IDeviceResource* resource);
    /// Clears every flag in list order and empties the list. Returns 1.
    std::int64_t RemoveAll();
    /// An iterator over the list in order of highlighting.
    CommonI::RefCountPtr<VnI::IDeviceResourceItr> GetHighlightedItems();

private:
    HighlightManagerImp::Record* m_imp;
};

} // namespace Vn::Eng
