//===-- s/TreeNodeItr.cpp -------------------------------------------------------===//
#include "Port/UnitStartup.h"

#include "s/TreeNodeItr.h"

#include "CommonI/TRefCountHelper.h"
#include "s/internal/Shapes.h"
#include "s/internal/TreeNodeRecord.h"

namespace Vn::Eng {

namespace TreeNodeItrImp {

class TreeNodeItr_ITreeNodeItr final
    : public detail::InterfaceObject<TreeNodeItr, VnI::ITreeNodeItr> {
public:
    using InterfaceObject::InterfaceObject;

    CommonI::RefCountPtr<VnI::ITreeNode> CurrentItem() const override {
        return m_owner->CurrentItem();
    }
    std::int64_t First() override { return m_owner->First(); }
    std::int64_t Next() override { return m_owner->Next(); }
    bool IsEnd() const override { return m_owner->IsEnd(); }
};

struct Record {
    Record(TreeNodeItr* owner, TreeNode* parent)
        : m_ITreeNodeItr(owner), m_xIRefCount(owner), m_parentNode(parent),
          m_currentNode(parent != nullptr ? TreeNodeImp::RecordOf(*parent)->m_firshChild
                                          : nullptr) {}

    TreeNodeItr_ITreeNodeItr m_ITreeNodeItr;
    CommonI::TRefCountHelper<TreeNodeItr, 0> m_xIRefCount;
    TreeNode* m_parentNode;  // not counted
    TreeNode* m_currentNode; // not counted; null at the end
};

} // namespace TreeNodeItrImp

CommonI::RefCountPtr<VnI::ITreeNodeItr> TreeNodeItr::CreateInstance(TreeNode* parent) {
    return detail::AdoptCreated<VnI::ITreeNodeItr>(new TreeNodeItr(parent));
}

TreeNodeItr::TreeNodeItr(TreeNode* parent) : m_imp(new TreeNodeItrImp::Record(this, parent)) {}

TreeNodeItr::~TreeNodeItr() {
    delete m_imp;
}

CommonI::RefCountPtr<VnI::ITreeNode> TreeNodeItr::CurrentItem() const {
    if (m_imp->m_currentNode == nullptr) {
        return nullptr;
    }
    return CommonI::RefCountPtr<VnI::ITreeNode>(TreeNodeImp::InterfaceOf(m_imp->m_currentNode));
}

std::int64_t TreeNodeItr::First() {
    if (m_imp->m_parentNode != nullptr) {
        m_imp->m_currentNode = TreeNodeImp::RecordOf(*m_imp->m_parentNode)->m_firshChild;
    }
    return 1;
}

std::int64_t TreeNodeItr::Next() {
    if (m_imp->m_currentNode != nullptr) {
        m_imp->m_currentNode = TreeNodeImp::RecordOf(*m_imp->m_currentNode)->m_nextSibling;
    }
    return 1;
}

bool TreeNodeItr::IsEnd() const {
    return m_imp->m_currentNode == nullptr;
}

CitI::IInterface* TreeNodeItr::GetInterface(const Port::XUID& id) {
    if (m_imp == nullptr) {
        return nullptr;
    }
    if (id == VnI::IID_ITreeNodeItr) {
        return &m_imp->m_ITreeNodeItr;
    }
    if (id == CommonI::IID_IRefCount) {
        return &m_imp->m_xIRefCount;
    }
    return nullptr;
}

} // namespace Vn::Eng
