//===-- s/TreeNode.h - counted tree nodes and named group nodes -----------------===//
//
// \file
// A node shows one property holder, or is a TreeGroupNode that shows none and carries a
// name. The children of a node form one sibling chain: the parent counts its first child,
// each child counts the next one. The back links (previous sibling, parent, holder) are
// not counted, so a tree has no counted cycles; they are weak instead: a node whose
// parent or holder has been destroyed answers null from GetParent or GetDataRef.
//
//   auto root = TreeNode::CreateInstance(&rootHolder, nullptr);  // the holder counts it too
//   auto bank = TreeGroupNode::CreateInstance("Bank 0", root);
//   root->AddChild(bank);                    // children come out newest first
//   for (auto it = root->GetChildren(); !it->IsEnd(); it->Next()) { use(it->CurrentItem()); }
//
// Nothing here recurses over the tree: a million siblings or a chain a million levels
// deep is linked, copied and destroyed with a flat stack.
//
// Holders that do not derive from PropertyHolder, and parents that are not nodes of this
// library, are kept as plain pointers: they must outlive the nodes that name them.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "VnI/ITreeNode.h"
#include "s/Export.h"

namespace Vn::Eng {

class TreeNode;

namespace TreeNodeImp {
struct Record;
Record* RecordOf(const TreeNode& node);
} // namespace TreeNodeImp

class VENLOMER_API TreeNode {
public:
    /// A new node for `holder` (count 1 adopted by the result, plus the holder's
    /// reference when `holder` is not null) whose parent link names `parent`. The parent
    /// is not told: the node is among its children once the parent links it.
    static CommonI::RefCountPtr<VnI::ITreeNode>
    CreateInstance(VnI::IPropertyHolder* holder, CommonI::RefCountPtr<VnI::ITreeNode> parent);
    /// A deep copy of `node`, or null when it is null or not a node of this library. Each
    /// sibling chain of the copy is in the reverse order of the source's; group nodes are
    /// copied as group nodes. Every holder below the copied root then links to its copy.
    static CommonI::RefCountPtr<VnI::ITreeNode>
    CreateInstance(CommonI::RefCountPtr<VnI::ITreeNode> node);

    /// The public node behind a VnI::ITreeNode of this library (borrowed), or null for
    /// null and for nodes of other libraries. This is how a caller walking a tree reaches
    /// members that are not on the interface, such as a group node's name.
    static TreeNode* FromInterface(const VnI::ITreeNode* node);

    TreeNode(VnI::IPropertyHolder* holder, CommonI::RefCountPtr<VnI::ITreeNode> parent);
    /// Deep copy: see CreateInstance(node). The copy has the source's holder (which is
    /// not told) and no parent.
    TreeNode(const TreeNode& other);
    TreeNode& operator=(const TreeNode&) = delete;
    virtual ~TreeNode();

    /// Links child in front of the existing children, taking it out of any chain it is
    /// in. A null child, a node of another library, this node itself or one of its
    /// ancestors changes nothing. Returns 1.
    std::int64_t AddChild(const CommonI::RefCountPtr<const VnI::ITreeNode>& child);
    /// Links node directly in front of the child `before` stands on. Nothing changes
    /// when before is at its end or stands on no child of this node, or when node is that
    /// child, this node or one of its ancestors. Returns 1.
    std::int64_t InsertChild(const CommonI::RefCountPtr<VnI::ITreeNode>& node,
                             const CommonI::RefCountPtr<const VnI::ITreeNodeItr>& before);
    /// Moves `at` to the next sibling, then takes the child it stood on out of the chain
    /// it is linked in. The child keeps its parent and holder links. Returns 1.
    std::int64_t RemoveChild(const CommonI::RefCountPtr<VnI::ITreeNodeItr>& at);
    /// A new iterator (one reference) standing on the first child.
    CommonI::RefCountPtr<VnI::ITreeNodeItr> GetChildren();
    bool HasChildren();
    /// The node named by the parent link (one new reference); null for a root and once
    /// that node has been destroyed.
    CommonI::RefCountPtr<VnI::ITreeNode> GetParent();
    /// Replaces the parent link (no reference taken); the children of either node are
    /// not changed.
    void SetParent(CommonI::RefCountPtr<VnI::ITreeNode> parent);
    /// The holder shown, borrowed; null for a group node and once the holder has been
    /// destroyed.
    VnI::IPropertyHolder* GetDataRef() const;
    /// VnI::ITreeNode and CitI::IInterface give the interface object, CommonI::IRefCount
    /// the counter object; anything else null.
    CitI::IInterface* GetInterface(const Port::XUID& id);
    void Dump() const;

private:
    friend TreeNodeImp::Record* TreeNodeImp::RecordOf(const TreeNode& node);

    TreeNodeImp::Record* m_imp;
};

class VENLOMER_API TreeGroupNode : public TreeNode {
public:
    /// A new group node (count 1, adopted by the result) whose parent link names parent.
    static CommonI::RefCountPtr<VnI::ITreeNode>
    CreateInstance(const Port::StringBase<char>& name,
                   const CommonI::RefCountPtr<VnI::ITreeNode>& parent);

    TreeGroupNode(const Port::StringBase<char>& name,
                  const CommonI::RefCountPtr<VnI::ITreeNode>& parent);
    /// Deep copy, as TreeNode's; the copy carries the same name.
    TreeGroupNode(const TreeGroupNode& other);
    TreeGroupNode& operator=(const TreeGroupNode&) = delete;
    ~TreeGroupNode() override;

    Port::StringBase<char> GetName() const;

private:
    Port::StringBase<char>* m_name; // owned
};

} // namespace Vn::Eng
