//===-- VnI/ITreeNode.h - tree nodes, their child iterator and the tree model ---===//
//
// Slot orders (binary contract, do not reorder):
//   ITreeNode: GetInterface, ~, AddChild, InsertChild, GetDataRef, GetChildren,
//              RemoveChild, GetParent, HasChildren
//   ITreeNodeItr: GetInterface, ~, CurrentItem, First, Next, IsEnd
//   ITreeModel: GetInterface, ~, GetRootNode
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "VnI/IPropertyHolder.h"

namespace VnI {

class ITreeNodeItr;

class VN_INTERFACE ITreeNode : public CitI::IInterface {
public:
    static constexpr const Port::XUID& kIID = IID_ITreeNode;

    /// Links child in front of the existing children. Returns 1.
    virtual std::int64_t AddChild(const CommonI::RefCountPtr<const ITreeNode>& child) = 0;
    /// Links node directly in front of the child before stands on. Returns 1.
    virtual std::int64_t InsertChild(const CommonI::RefCountPtr<ITreeNode>& node,
                                     const CommonI::RefCountPtr<const ITreeNodeItr>& before) = 0;
    /// The holder the node shows, borrowed; null for group nodes.
    virtual IPropertyHolder* GetDataRef() const = 0;
    /// A new iterator standing on the first child (one reference).
    virtual CommonI::RefCountPtr<ITreeNodeItr> GetChildren() = 0;
    /// Unlinks the child at stands on, moving at to the next sibling first. Returns 1.
    virtual std::int64_t RemoveChild(const CommonI::RefCountPtr<ITreeNodeItr>& at) = 0;
    /// The parent (one new reference), or null.
    virtual CommonI::RefCountPtr<ITreeNode> GetParent() = 0;
    virtual bool HasChildren() = 0;
};

class VN_INTERFACE ITreeNodeItr : public CitI::IInterface {
public:
    static constexpr const Port::XUID& kIID = IID_ITreeNodeItr;

    /// The current child (one new reference); null at the end.
    virtual CommonI::RefCountPtr<ITreeNode> CurrentItem() const = 0;
    virtual std::int64_t First() = 0;
    virtual std::int64_t Next() = 0;
    virtual bool IsEnd() const = 0;
};

class VN_INTERFACE ITreeModel : public CitI::IInterface {
public:
    static constexpr const Port::XUID& kIID = IID_ITreeModel;

    /// The root (one new reference).
    virtual CommonI::RefCountPtr<ITreeNode> GetRootNode() = 0;
};

} // namespace VnI
