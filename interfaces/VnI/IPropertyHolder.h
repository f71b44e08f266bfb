//===-- VnI/IPropertyHolder.h - objects that carry named properties -------------===//
//
// Slot orders (binary contract, do not reorder):
//   IPropertyItr: GetInterface, ~, CurrentItem, First, Next, IsEnd
//   IPropertyHolder: GetInterface, ~, GetName, GetDisplayName, GetProperties,
//                    GetNumProperties, GetPropertyByName, AddProperty, RemoveProperty,
//                    GetParentTreeNode, SetParentTreeNode, IsSelected, SetSelected,
//                    GetPropertyNames, GetType
//   IPropertyHolderItr: GetInterface, ~, CurrentItem, First, Next, IsEnd
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "VnI/IProperty.h"
#include "VnI/IPropertyName.h"

namespace VnI {

class ITreeNode;

/// Holder types answered by IPropertyHolder::GetType. The selection manager files
/// holders by this number and hosts compare against it, so the values are fixed.
inline constexpr int DEVICE_RESOURCE_HOLDER_TYPE = 7;
inline constexpr int GENERIC_HOLDER_TYPE = 11;

class VN_INTERFACE IPropertyItr : public CitI::IInterface {
public:
    static constexpr const Port::XUID& kIID = IID_IPropertyItr;

    /// The property at the position (one new reference); null at the end.
    virtual CommonI::RefCountPtr<IProperty> CurrentItem() = 0;
    virtual std::int64_t First() = 0;
    virtual std::int64_t Next() = 0;
    virtual bool IsEnd() const = 0;
};

class VN_INTERFACE IPropertyHolder : public CitI::IInterface {
public:
    static constexpr const Port::XUID& kIID = IID_IPropertyHolder;

    virtual Port::StringBase<char> GetName() = 0;
    virtual Port::StringBase<char> GetDisplayName() = 0;
    /// A new iterator over the occupied, visible slots (one reference).
    virtual CommonI::RefCountPtr<IPropertyItr> GetProperties() = 0;
    virtual int GetNumProperties() = 0;
    /// The property stored under name (one new reference), or null.
    virtual CommonI::RefCountPtr<IProperty>
    GetPropertyByName(const Port::StringBase<char>& name) = 0;
    /// Stores property under name. 1 when stored; 0 for a null property or no name list.
    virtual std::int64_t AddProperty(const Port::StringBase<char>& name,
                                     const CommonI::RefCountPtr<IProperty>& property,
                                     bool visible) = 0;
    /// Empties the slot of name. 0 when there is no name list, else 1.
    virtual std::int64_t RemoveProperty(const Port::StringBase<char>& name) = 0;
    /// The tree node that shows this holder (one new reference), or null.
    virtual CommonI::RefCountPtr<ITreeNode> GetParentTreeNode() = 0;
    /// Holds node (one reference) in place of the previous one. Returns 0.
    virtual std::int64_t SetParentTreeNode(const CommonI::RefCountPtr<ITreeNode>& node) = 0;
    virtual bool IsSelected() = 0;
    /// Returns 0.
    virtual std::int64_t SetSelected(bool selected) = 0;
    /// The holder's schema, borrowed; may be null.
    virtual IPropertyNameList* GetPropertyNames() = 0;
    /// The holder type: DEVICE_RESOURCE_HOLDER_TYPE, GENERIC_HOLDER_TYPE, or a host's own.
    virtual int GetType() const = 0;
};

class VN_INTERFACE IPropertyHolderItr : public CitI::IInterface {
public:
    static constexpr const Port::XUID& kIID = IID_IPropertyHolderItr;

    /// The holder at the position, borrowed; null at the end.
    virtual IPropertyHolder* CurrentItem() const = 0;
    virtual std::int64_t First() = 0;
    virtual std::int64_t Next() = 0;
    virtual bool IsEnd() const = 0;
};

} // namespace VnI
