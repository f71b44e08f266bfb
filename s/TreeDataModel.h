//===-- s/TreeDataModel.h - the model behind one tree view ----------------------===//
//
// \file
// The model holds the tree's root and hands it out. When its last reference goes it
// takes the whole tree apart, deepest nodes first, so that no node of the former tree
// stays linked under another: nodes still held elsewhere (by their holders or by
// callers) survive as single nodes, the rest are destroyed as the chains let go.
//
//   auto model = TreeDataModel::CreateInstance(root);  // count 1; root gains one
//   auto same = model->GetRootNode();                  // root gains one more
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "VnI/ITreeNode.h"
#include "s/Export.h"

namespace Vn::Eng {

namespace TreeDataModelImp {
struct Record;
}

class VENLOMER_API TreeDataModel {
public:
    /// A new model (count 1, adopted by the result) over root.
    static CommonI::RefCountPtr<VnI::ITreeModel>
    CreateInstance(CommonI::RefCountPtr<VnI::ITreeNode> root);

    explicit TreeDataModel(CommonI::RefCountPtr<VnI::ITreeNode> root);
    /// Takes the tree apart, then drops the root.
    virtual ~TreeDataModel();
    TreeDataModel(const TreeDataModel&) = delete;
    TreeDataModel& operator=(const TreeDataModel&) = delete;

    /// The root (one new reference); null for a model made without one.
    CommonI::RefCountPtr<VnI::ITreeNode> GetRootNode();
    /// VnI::ITreeModel and CitI::IInterface give the interface object, CommonI::IRefCount
    /// the counter object; anything else null.
    CitI::IInterface* GetInterface(const Port::XUID& id);

private:
    TreeDataModelImp::Record* m_imp;
};

} // namespace Vn::Eng
