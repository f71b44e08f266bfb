//===-- s/TreeDataModel.cpp -----------------------------------------------------===//
#include "Port/UnitStartup.h"

#include "s/TreeDataModel.h"

#include "CommonI/TRefCountHelper.h"
#include "s/internal/Shapes.h"

#include <utility>
#include <vector>

namespace Vn::Eng {

namespace TreeDataModelImp {

class TreeDataModel_ITreeModel final
    : public detail::InterfaceObject<TreeDataModel, VnI::ITreeModel> {
public:
    using InterfaceObject::InterfaceObject;

    CommonI::RefCountPtr<VnI::ITreeNode> GetRootNode() override { return m_owner->GetRootNode(); }
};

struct Record {
    Record(TreeDataModel* owner, CommonI::RefCountPtr<VnI::ITreeNode> root)
        : m_rootNode(std::move(root)), m_ITreeModel(owner), m_xIRefCount(owner) {}

    CommonI::RefCountPtr<VnI::ITreeNode> m_rootNode;
    TreeDataModel_ITreeModel m_ITreeModel;
    CommonI::TRefCountHelper<TreeDataModel, 0> m_xIRefCount;
};

namespace {

// Removes every node below root, each one after the nodes below it and in chain order
// among siblings. The path from the root to the node being looked at is the only state,
// so a chain a million levels deep costs a million pointers, not a million stack frames.
// The tree is reached through VnI::ITreeNode alone, so a host's own root is taken apart
// too as far as it answers.
void TakeApart(const CommonI::RefCountPtr<VnI::ITreeNode>& root) {
    std::vector<CommonI::RefCountPtr<VnI::ITreeNode>> path{root};
    for (;;) {
        const CommonI::RefCountPtr<VnI::ITreeNode>& node = path.back();
        const CommonI::RefCountPtr<VnI::ITreeNodeItr> children = node->GetChildren();
        if (children && !children->IsEnd()) {
            CommonI::RefCountPtr<VnI::ITreeNode> first = children->CurrentItem();
            if (!first) {
                return; // a chain that will not say what it holds cannot be taken apart
            }
            path.push_back(std::move(first));
            continue;
        }
        if (path.size() == 1) {
            return; // the root itself stays for the model to drop
        }
        // node has no children left, and it is its parent's first child: the ones before
        // it have gone already. Removing it through the parent works whatever its own
        // parent link says (a caller may have rewritten it).
        const CommonI::RefCountPtr<VnI::ITreeNode>& parent = path[path.size() - 2];
        const CommonI::RefCountPtr<VnI::ITreeNodeItr> at = parent->GetChildren();
        if (!at || at->CurrentItem() != node) {
            return; // not a chain of ours: stop rather than loop
        }
        parent->RemoveChild(at);
        if (at->First(); at->CurrentItem() == node) {
            return; // the removal did nothing: stop rather than loop
        }
        path.pop_back();
    }
}

} // namespace
} // namespace TreeDataModelImp

CommonI::RefCountPtr<VnI::ITreeModel>
TreeDataModel::CreateInstance(CommonI::RefCountPtr<VnI::ITreeNode> root) {
    return detail::AdoptCreated<VnI::ITreeModel>(new TreeDataModel(std::move(root)));
}

TreeDataModel::TreeDataModel(CommonI::RefCountPtr<VnI::ITreeNode> root)
    : m_imp(new TreeDataModelImp::Record(this, std::move(root))) {}

TreeDataModel::~TreeDataModel() {
    if (m_imp->m_rootNode) {
        TreeDataModelImp::TakeApart(m_imp->m_rootNode);
    }
    delete m_imp; // drops the root
}

CommonI::RefCountPtr<VnI::ITreeNode> TreeDataModel::GetRootNode() {
    return m_imp->m_rootNode;
}

CitI::IInterface* TreeDataModel::GetInterface(const Port::XUID& id) {
    if (m_imp == nullptr) {
        return nullptr;
    }
    if (id == VnI::IID_ITreeModel) {
        return &m_imp->m_ITreeModel;
    }
    if (id == CommonI::IID_IRefCount) {
        return &m_imp->m_xIRefCount;
    }
    if (id == CitI::IID_IInterface) {
        return &m_imp->m_ITreeModel;
    }
    return nullptr;
}

} // namespace Vn::Eng
