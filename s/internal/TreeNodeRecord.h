//===-- s/internal/TreeNodeRecord.h - a tree node's implementation record -------===//
//
// \file
// Shared by the node, its child iterator and the tree model, which all read the sibling
// chain in place.
//
// Counted links: m_firshChild (parent to first child) and m_nextSibling (each child to
// the next). Everything else points back without a reference. The back links that can
// outlive their target are kept weak with intrusive lists, so that linking, unlinking
// and clearing them costs O(1) per link:
//   - every node whose m_parentNode names this node hangs on m_parentLinksHead, through
//     its m_parentLinksPrev / m_parentLinksNext;
//   - every node whose m_propHolder names a PropertyHolder hangs on that holder's list,
//     through m_holderLinksPrev / m_holderLinksNext.
// m_linkedUnder is the node whose chain this node is really in, whatever the parent
// link says (callers can rewrite that with SetParent), so that unlinking always repairs
// the right chain.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "CommonI/TRefCountHelper.h"
#include "VnI/ITreeNode.h"
#include "s/TreeNode.h"

#include <cstdint>

namespace Vn::Eng::TreeNodeImp {

class TreeNode_ITreeNode final : public VnI::ITreeNode {
public:
    explicit TreeNode_ITreeNode(TreeNode* owner) : m_owner(owner) {}
    TreeNode_ITreeNode(const TreeNode_ITreeNode&) = delete;
    TreeNode_ITreeNode& operator=(const TreeNode_ITreeNode&) = delete;

    CitI::IInterface* GetInterface(const Port::XUID& id) override {
        return m_owner != nullptr ? m_owner->GetInterface(id) : nullptr;
    }
    std::int64_t AddChild(const CommonI::RefCountPtr<const VnI::ITreeNode>& child) override {
        return m_owner->AddChild(child);
    }
    std::int64_t InsertChild(const CommonI::RefCountPtr<VnI::ITreeNode>& node,
                             const CommonI::RefCountPtr<const VnI::ITreeNodeItr>& before) override {
        return m_owner->InsertChild(node, before);
    }
    VnI::IPropertyHolder* GetDataRef() const override { return m_owner->GetDataRef(); }
    CommonI::RefCountPtr<VnI::ITreeNodeItr> GetChildren() override {
        return m_owner->GetChildren();
    }
    std::int64_t RemoveChild(const CommonI::RefCountPtr<VnI::ITreeNodeItr>& at) override {
        return m_owner->RemoveChild(at);
    }
    CommonI::RefCountPtr<VnI::ITreeNode> GetParent() override { return m_owner->GetParent(); }
    bool HasChildren() override { return m_owner->HasChildren(); }

    TreeNode* GetOwner() const { return m_owner; }

private:
    TreeNode* m_owner; // not owned
};

struct Record {
    explicit Record(TreeNode* owner) : m_ITreeNode(owner), m_xIRefCount(owner) {}

    TreeNode_ITreeNode m_ITreeNode;
    CommonI::TRefCountHelper<TreeNode, 0> m_xIRefCount;
    std::uint8_t visible = 1;
    std::uint8_t m_selected = 0;
    bool m_parentTracked = false; // m_parentNode is a node of ours and lists this one
    bool m_holderTracked = false; // m_propHolder is a PropertyHolder and lists this one
    TreeNode* m_prevSibling = nullptr;
    TreeNode* m_nextSibling = nullptr; // counted
    TreeNode* m_firshChild = nullptr;  // counted
    VnI::ITreeNode* m_parentNode = nullptr;
    VnI::IPropertyHolder* m_propHolder = nullptr;

    TreeNode* m_linkedUnder = nullptr;
    TreeNode* m_parentLinksHead = nullptr;
    TreeNode* m_parentLinksPrev = nullptr;
    TreeNode* m_parentLinksNext = nullptr;
    TreeNode* m_holderLinksPrev = nullptr;
    TreeNode* m_holderLinksNext = nullptr;
};

/// The public node behind an interface pointer, or null when it is null or belongs to
/// no node of this library.
TreeNode* NodeOf(const VnI::ITreeNode* node);

/// The node's VnI::ITreeNode.
inline VnI::ITreeNode* InterfaceOf(TreeNode* node) {
    return &RecordOf(*node)->m_ITreeNode;
}

} // namespace Vn::Eng::TreeNodeImp
