//===-- tests/support/FakeHolders.h - minimal holders and tree nodes that count references -===//
//
// Implementations of the published interfaces with nothing but the state the managers
// touch, so the managers can be tested on their own. Fake nodes count their references
// and live objects, so tests also see that the managers hold nothing.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "CommonI/TRefCountHelper.h"
#include "VnI/IDeviceResource.h"
#include "VnI/ITreeNode.h"

#include <string>
#include <vector>

namespace VnTest {

class FakeNode;

class FakeHolder : public VnI::IPropertyHolder {
public:
    explicit FakeHolder(int type, std::string name = {}) : m_type(type), m_name(std::move(name)) {}
    ~FakeHolder() override;

    CitI::IInterface* GetInterface(const Port::XUID& id) override {
        return id == VnI::IID_IPropertyHolder || id == CitI::IID_IInterface ? this : nullptr;
    }
    Port::StringBase<char> GetName() override { return Port::StringBase<char>(m_name); }
    Port::StringBase<char> GetDisplayName() override { return GetName(); }
    CommonI::RefCountPtr<VnI::IPropertyItr> GetProperties() override { return nullptr; }
    int GetNumProperties() override { return 0; }
    CommonI::RefCountPtr<VnI::IProperty> GetPropertyByName(const Port::StringBase<char>&) override {
        return nullptr;
    }
    std::int64_t AddProperty(const Port::StringBase<char>&,
                             const CommonI::RefCountPtr<VnI::IProperty>&, bool) override {
        return 0;
    }
    std::int64_t RemoveProperty(const Port::StringBase<char>&) override { return 0; }
    CommonI::RefCountPtr<VnI::ITreeNode> GetParentTreeNode() override { return m_node; }
    std::int64_t SetParentTreeNode(const CommonI::RefCountPtr<VnI::ITreeNode>& node) override {
        m_node = node;
        return 0;
    }
    bool IsSelected() override { return m_selected; }
    std::int64_t SetSelected(bool selected) override {
        m_selected = selected;
        ++m_selectCalls;
        return 0;
    }
    VnI::IPropertyNameList* GetPropertyNames() override { return nullptr; }
    int GetType() const override { return m_type; }

    int m_type;
    std::string m_name;
    bool m_selected = false;
    int m_selectCalls = 0;
    CommonI::RefCountPtr<VnI::ITreeNode> m_node;
};

class FakeResource final : public FakeHolder, public VnI::IDeviceResource {
public:
    explicit FakeResource(std::string name = {}) : FakeHolder(7, std::move(name)) {}
    CitI::IInterface* GetInterface(const Port::XUID& id) override {
        if (id == VnI::IID_IDeviceResource || id == CitI::IID_IInterface) {
            return static_cast<VnI::IDeviceResource*>(this);
        }
        return FakeHolder::GetInterface(id);
    }
    Port::StringBase<char> GetTileName() const override { return {}; }
    std::int64_t GetLocation(int&, int&) const override { return 0; }
    Port::StringBase<char> GetSiteType() const override { return {}; }
    std::int64_t SetHighlighted(bool highlighted) override {
        m_highlighted = highlighted;
        return 1;
    }
    bool IsHighlighted() const override { return m_highlighted; }
    CommonI::RefCountPtr<VnI::IColorProperty> GetHighlightColor() override { return nullptr; }

    bool m_highlighted = false;
};

/// A counted node whose children are kept in a vector in the order given.
class FakeNode final : public CommonI::TRefCountHelperBase<FakeNode, 0>, public VnI::ITreeNode {
public:
    static int& Alive() {
        static int alive = 0;
        return alive;
    }
    /// A node showing holder (which then holds it), or a group node for null.
    static CommonI::RefCountPtr<FakeNode> Make(FakeHolder* holder) {
        auto node = CommonI::RefCountPtr<FakeNode>::Adopt(new FakeNode(holder));
        if (holder != nullptr) {
            holder->SetParentTreeNode(CommonI::RefCountPtr<VnI::ITreeNode>(node.Get()));
        }
        return node;
    }
    ~FakeNode() override { --Alive(); }

    CitI::IInterface* GetInterface(const Port::XUID& id) override {
        if (id == CommonI::IID_IRefCount) {
            return static_cast<CommonI::IRefCount*>(this);
        }
        if (id == VnI::IID_ITreeNode || id == CitI::IID_IInterface) {
            return static_cast<VnI::ITreeNode*>(this);
        }
        return nullptr;
    }
    std::int64_t AddChild(const CommonI::RefCountPtr<const VnI::ITreeNode>&) override { return 1; }
    std::int64_t InsertChild(const CommonI::RefCountPtr<VnI::ITreeNode>&,
                             const CommonI::RefCountPtr<const VnI::ITreeNodeItr>&) override {
        return 1;
    }
    VnI::IPropertyHolder* GetDataRef() const override { return m_holder; }
    CommonI::RefCountPtr<VnI::ITreeNodeItr> GetChildren() override;
    std::int64_t RemoveChild(const CommonI::RefCountPtr<VnI::ITreeNodeItr>&) override { return 1; }
    CommonI::RefCountPtr<VnI::ITreeNode> GetParent() override { return nullptr; }
    bool HasChildren() override { return !m_children.empty(); }

    void Add(const CommonI::RefCountPtr<FakeNode>& child) { m_children.push_back(child); }

    std::vector<CommonI::RefCountPtr<FakeNode>> m_children;

private:
    explicit FakeNode(FakeHolder* holder) : m_holder(holder) { ++Alive(); }
    FakeHolder* m_holder;
};

class FakeNodeItr final : public CommonI::TRefCountHelperBase<FakeNodeItr, 0>,
                          public VnI::ITreeNodeItr {
public:
    explicit FakeNodeItr(FakeNode* parent) : m_parent(parent) {}
    CitI::IInterface* GetInterface(const Port::XUID& id) override {
        if (id == CommonI::IID_IRefCount) {
            return static_cast<CommonI::IRefCount*>(this);
        }
        return id == VnI::IID_ITreeNodeItr ? static_cast<VnI::ITreeNodeItr*>(this) : nullptr;
    }
    CommonI::RefCountPtr<VnI::ITreeNode> CurrentItem() const override {
        if (IsEnd()) {
            return nullptr;
        }
        return CommonI::RefCountPtr<VnI::ITreeNode>(m_parent->m_children[m_at].Get());
    }
    std::int64_t First() override {
        m_at = 0;
        return 1;
    }
    std::int64_t Next() override {
        if (!IsEnd()) {
            ++m_at;
        }
        return 1;
    }
    bool IsEnd() const override { return m_at >= m_parent->m_children.size(); }

private:
    FakeNode* m_parent;
    size_t m_at = 0;
};

inline CommonI::RefCountPtr<VnI::ITreeNodeItr> FakeNode::GetChildren() {
    return CommonI::RefCountPtr<VnI::ITreeNodeItr>::Adopt(new FakeNodeItr(this));
}

// Drops the node reference first, so a node's holder never outlives the node's use.
inline FakeHolder::~FakeHolder() {
    m_node.Reset();
}

} // namespace VnTest
