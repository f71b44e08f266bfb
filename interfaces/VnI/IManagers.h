//===-- VnI/IManagers.h - the selection and highlight managers ------------------===//
//
// Slot orders (binary contract, do not reorder):
//   ISelectionManager: GetInterface, ~, GetNumCategories, GetSelectedItems,
//                      GetAllSelectedItems, AddSelectedItem, RemoveSelectedItem, RemoveAll
//   IHighlightManager: GetInterface, ~, GetHighlightedItems, AddHighlightedItem,
//                      RemoveHighlightedItem, RemoveAll
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "VnI/IDeviceResource.h"

namespace VnI {

class VN_INTERFACE ISelectionManager : public CitI::IInterface {
public:
    static constexpr const Port::XUID& kIID = IID_ISelectionManager;

    virtual int GetNumCategories() const = 0;
    /// The holders selected in one category, in order of selection; null when the
    /// category does not exist.
    virtual CommonI::RefCountPtr<IPropertyHolderItr> GetSelectedItems(int category) = 0;
    virtual CommonI::RefCountPtr<IPropertyHolderItr> GetAllSelectedItems() = 0;
    virtual std::int64_t AddSelectedItem(IPropertyHolder* holder, bool withChildren) = 0;
    virtual std::int64_t RemoveSelectedItem(IPropertyHolder* holder, bool withChildren) = 0;
    virtual std::int64_t RemoveAll() = 0;
};

class VN_INTERFACE IHighlightManager : public CitI::IInterface {
public:
    static constexpr const Port::XUID& kIID = IID_IHighlightManager;

    virtual CommonI::RefCountPtr<IDeviceResourceItr> GetHighlightedItems() = 0;
    virtual std::int64_t AddHighlightedItem(IDeviceResource* resource) = 0;
    virtual std::int64_t RemoveHighlightedItem(IDeviceResource* resource) = 0;
    virtual std::int64_t RemoveAll() = 0;
};

} // namespace VnI
