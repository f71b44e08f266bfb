//===-- s/TreeNodeItr.h - walks the children of one tree node -------------------===//
//
// \file
// The iterator reads the live sibling chain at every step and holds no reference: the
// nodes it stands on must outlive it. It is also the position argument of
// TreeNode::InsertChild and TreeNode::RemoveChild.
//
//   for (auto it = node->GetChildren(); !it->IsEnd(); it->Next()) { use(it->CurrentItem()); }
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "VnI/ITreeNode.h"
#include "s/Export.h"

namespace Vn::Eng {

class TreeNode;

namespace TreeNodeItrImp {
struct Record;
}

class VENLOMER_API TreeNodeItr {
public:
    /// A new iterator (count 1, adopted by the result) standing on parent's first child.
    static CommonI::RefCountPtr<VnI::ITreeNodeItr> CreateInstance(TreeNode* parent);

    explicit TreeNodeItr(TreeNode* parent);
    virtual ~TreeNodeItr();
    TreeNodeItr(const TreeNodeItr&) = delete;
    TreeNodeItr& operator=(const TreeNodeItr&) = delete;

    /// The current child (one new reference); null at the end.
    CommonI::RefCountPtr<VnI::ITreeNode> CurrentItem() const;
    /// Back to the parent's current first child. Returns 1.
    std::int64_t First();
    /// On to the next sibling. Returns 1.
    std::int64_t Next();
    bool IsEnd() const;
    /// VnI::ITreeNodeItr gives the interface object, CommonI::IRefCount the counter
    /// object; anything else, CitI::IInterface included, null.
    CitI::IInterface* GetInterface(const Port::XUID& id);

private:
    TreeNodeItrImp::Record* m_imp;
};

} // namespace Vn::Eng
