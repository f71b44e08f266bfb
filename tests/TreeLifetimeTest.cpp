//===-- tests/TreeLifetimeTest.cpp - tree nodes live while someone holds them, no longer -===//
//
// Who keeps a tree node alive, and what a node answers once its parent, its holder or
// its model is gone.
//
//===------------------------------------------------------------------------------===//
#include "FakeHolders.h"

#include "s/PropertyHolder.h"
#include "s/PropertyHolderItr.h"
#include "s/SelectionManager.h"
#include "s/TreeDataModel.h"
#include "s/TreeNode.h"

#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <vector>

using CommonI::RefCountPtr;
using Vn::Eng::TreeDataModel;
using Vn::Eng::TreeNode;
using VnI::ITreeNode;

namespace {

class Holder final : public Vn::Eng::PropertyHolder {
public:
    explicit Holder(std::string name = {}) : m_name(std::move(name)) {}
    Port::StringBase<char> GetName() override { return Port::StringBase<char>(m_name); }
    VnI::IPropertyNameList* GetPropertyNames() override { return nullptr; }
    int GetType() const override { return 3; }

private:
    std::string m_name;
};

int CountOf(CitI::IInterface* p) {
    int count = -1;
    static_cast<CommonI::IRefCount*>(p->GetInterface(CommonI::IID_IRefCount))->GetRefCount(count);
    return count;
}

std::vector<ITreeNode*> Children(ITreeNode* node) {
    std::vector<ITreeNode*> out;
    for (auto it = node->GetChildren(); !it->IsEnd(); it->Next()) {
        out.push_back(it->CurrentItem().Get());
    }
    return out;
}

// Visits every node below root (root included) on an explicit stack.
template <class Visit> void Walk(ITreeNode* root, Visit visit) {
    std::vector<RefCountPtr<ITreeNode>> work{RefCountPtr<ITreeNode>(root)};
    while (!work.empty()) {
        auto node = std::move(work.back());
        work.pop_back();
        visit(node.Get());
        for (auto it = node->GetChildren(); !it->IsEnd(); it->Next()) {
            work.push_back(it->CurrentItem());
        }
    }
}

} // namespace

TEST(TreeModel, AnswersItsRootWithOneMoreReferenceEachTime) {
    auto root = TreeNode::CreateInstance(nullptr, nullptr);
    auto model = TreeDataModel::CreateInstance(root);
    EXPECT_EQ(CountOf(root.Get()), 2);
    {
        auto first = model->GetRootNode();
        auto second = model->GetRootNode();
        EXPECT_EQ(first.Get(), root.Get());
        EXPECT_EQ(CountOf(root.Get()), 4);
    }
    model.Reset();
    EXPECT_EQ(CountOf(root.Get()), 1);
    EXPECT_FALSE(root->HasChildren());

    auto empty = TreeDataModel::CreateInstance(nullptr);
    EXPECT_EQ(empty->GetRootNode(), nullptr);
}

TEST(TreeModel, DestructionLeavesSurvivorsSingleAndHoldersNodesAlive) {
    Holder hr("r"), ha("a"), hb("b"), hg("g");
    RefCountPtr<ITreeNode> root = TreeNode::CreateInstance(&hr, nullptr);
    {
        auto a = TreeNode::CreateInstance(&ha, root);
        auto b = TreeNode::CreateInstance(&hb, root);
        auto g = TreeNode::CreateInstance(&hg, a);
        auto loose = TreeNode::CreateInstance(nullptr, a);
        a->AddChild(loose); // held by nothing but the chain
        a->AddChild(g);
        root->AddChild(b);
        root->AddChild(a);
    }
    auto model = TreeDataModel::CreateInstance(root);
    root.Reset();
    model.Reset();

    auto r = hr.GetParentTreeNode();
    auto a = ha.GetParentTreeNode();
    auto b = hb.GetParentTreeNode();
    auto g = hg.GetParentTreeNode();
    for (auto* node : {r.Get(), a.Get(), b.Get(), g.Get()}) {
        ASSERT_NE(node, nullptr);
        EXPECT_FALSE(node->HasChildren());
        EXPECT_EQ(CountOf(node), 2) << "the holder's and ours: no chain holds it any more";
    }
    // Survivors keep parent links to parents that are still alive.
    EXPECT_EQ(a->GetParent().Get(), r.Get());
    EXPECT_EQ(b->GetParent().Get(), r.Get());
    EXPECT_EQ(g->GetParent().Get(), a.Get());
    // Out of every chain: relinking b elsewhere brings nobody along.
    auto fresh = TreeNode::CreateInstance(nullptr, nullptr);
    fresh->AddChild(b);
    EXPECT_EQ(Children(fresh.Get()), std::vector<ITreeNode*>{b.Get()});
}

TEST(TreeModel, DestructionWalksPastChildrenWhoseParentLinkWasRewritten) {
    auto root = TreeNode::CreateInstance(nullptr, nullptr);
    auto child = TreeNode::CreateInstance(nullptr, root);
    auto grandchild = TreeNode::CreateInstance(nullptr, child);
    root->AddChild(child);
    child->AddChild(grandchild);
    TreeNode::FromInterface(child.Get())->SetParent(nullptr);
    TreeNode::FromInterface(grandchild.Get())->SetParent(grandchild);
    TreeDataModel::CreateInstance(root).Reset();
    EXPECT_FALSE(root->HasChildren());
    EXPECT_FALSE(child->HasChildren());
    EXPECT_EQ(CountOf(child.Get()), 1);
    EXPECT_EQ(CountOf(grandchild.Get()), 1);
}

TEST(TreeBackLinks, ASurvivorOfTheModelForgetsItsDestroyedParent) {
    Holder h("c");
    {
        auto r = TreeNode::CreateInstance(nullptr, nullptr);
        auto c = TreeNode::CreateInstance(&h, r);
        r->AddChild(c);
        auto model = TreeDataModel::CreateInstance(r);
        EXPECT_EQ(c->GetParent().Get(), r.Get());
    } // the model goes, and with it the root nothing else held
    auto c = h.GetParentTreeNode();
    ASSERT_TRUE(c);
    EXPECT_EQ(c->GetParent(), nullptr);
    EXPECT_FALSE(c->HasChildren());
}

TEST(TreeBackLinks, ARemovedChildAnswersItsParentUntilThatDies) {
    Holder h("c");
    auto parent = TreeNode::CreateInstance(nullptr, nullptr);
    auto c = TreeNode::CreateInstance(&h, parent);
    parent->AddChild(c);
    parent->RemoveChild(parent->GetChildren());
    EXPECT_EQ(c->GetParent().Get(), parent.Get());
    parent.Reset();
    EXPECT_EQ(c->GetParent(), nullptr);

    // A parent link set by hand, or by construction only, is just as weak.
    auto other = TreeNode::CreateInstance(nullptr, nullptr);
    auto orphan = TreeNode::CreateInstance(nullptr, other);
    auto byHand = TreeNode::CreateInstance(nullptr, nullptr);
    TreeNode::FromInterface(byHand.Get())->SetParent(other);
    other.Reset();
    EXPECT_EQ(orphan->GetParent(), nullptr);
    EXPECT_EQ(byHand->GetParent(), nullptr);
}

TEST(TreeBackLinks, AParentThatDiesSeparatesTheChildrenItsHoldersKeep) {
    Holder h1("1"), h2("2"), h3("3");
    RefCountPtr<ITreeNode> parent = TreeNode::CreateInstance(nullptr, nullptr);
    for (Holder* h : {&h1, &h2, &h3}) {
        parent->AddChild(TreeNode::CreateInstance(h, parent));
    }
    parent.Reset();
    for (Holder* h : {&h1, &h2, &h3}) {
        auto node = h->GetParentTreeNode();
        EXPECT_EQ(node->GetParent(), nullptr);
        EXPECT_EQ(CountOf(node.Get()), 2);
        auto fresh = TreeNode::CreateInstance(nullptr, nullptr);
        fresh->AddChild(node);
        EXPECT_EQ(Children(fresh.Get()), std::vector<ITreeNode*>{node.Get()});
    }
}

TEST(TreeBackLinks, ANodeForgetsItsDestroyedHolder) {
    auto holder = std::make_unique<Holder>("h");
    auto node = TreeNode::CreateInstance(holder.get(), nullptr);
    auto second = TreeNode::CreateInstance(holder.get(), nullptr); // two nodes name it
    EXPECT_EQ(node->GetDataRef(), holder.get());
    holder.reset();
    EXPECT_EQ(node->GetDataRef(), nullptr);
    EXPECT_EQ(second->GetDataRef(), nullptr);
    EXPECT_EQ(CountOf(second.Get()), 1) << "the holder's reference went with it";

    // A node that dies first leaves the holder's list behind it intact.
    auto other = std::make_unique<Holder>("o");
    auto a = TreeNode::CreateInstance(other.get(), nullptr);
    auto b = TreeNode::CreateInstance(other.get(), nullptr);
    auto c = TreeNode::CreateInstance(other.get(), nullptr);
    b.Reset();
    a.Reset();
    other.reset();
    EXPECT_EQ(c->GetDataRef(), nullptr);
}

TEST(TreeBackLinks, CopiesAndOriginalsAreSafeToWalkAfterTheHoldersGo) {
    std::vector<std::unique_ptr<Holder>> holders;
    holders.reserve(5);
    for (int i = 0; i < 5; ++i) {
        holders.push_back(std::make_unique<Holder>(std::to_string(i)));
    }
    auto root = TreeNode::CreateInstance(holders[0].get(), nullptr);
    auto a = TreeNode::CreateInstance(holders[1].get(), root);
    auto b = TreeNode::CreateInstance(holders[2].get(), root);
    root->AddChild(a);
    root->AddChild(b);
    for (int i = 3; i < 5; ++i) {
        a->AddChild(TreeNode::CreateInstance(holders[i].get(), a));
    }
    auto copy = TreeNode::CreateInstance(root);
    a.Reset();
    b.Reset();
    // The originals now point at holders that no longer point back; destroy them all.
    holders.clear();

    for (ITreeNode* tree : {root.Get(), copy.Get()}) {
        int nodes = 0;
        Walk(tree, [&](ITreeNode* n) {
            ++nodes;
            EXPECT_EQ(n->GetDataRef(), nullptr);
        });
        EXPECT_EQ(nodes, 5);
    }
}

TEST(TreeBackLinks, AHolderOfAnotherLibraryIsKeptAsAPlainPointer) {
    VnTest::FakeHolder foreign(4, "foreign");
    auto node = TreeNode::CreateInstance(&foreign, nullptr);
    EXPECT_EQ(node->GetDataRef(), &foreign);
    EXPECT_EQ(foreign.GetParentTreeNode().Get(), node.Get());
    auto copy = TreeNode::CreateInstance(node);
    EXPECT_EQ(copy->GetDataRef(), &foreign);
    foreign.SetParentTreeNode(nullptr);
}

TEST(TreeBackLinks, SelectionDescentSelectsOnlyLiveHolders) {
    Holder top("top"), live("live"), below("below");
    auto dead = std::make_unique<Holder>("dead");
    auto n = TreeNode::CreateInstance(&top, nullptr);
    auto nLive = TreeNode::CreateInstance(&live, n);
    auto nDead = TreeNode::CreateInstance(dead.get(), n);
    auto nBelow = TreeNode::CreateInstance(&below, nDead);
    nDead->AddChild(nBelow);
    n->AddChild(nDead);
    n->AddChild(nLive);
    dead.reset();

    Vn::Eng::SelectionManager manager;
    manager.AddSelectedItem(&top, true);
    std::vector<VnI::IPropertyHolder*> selected;
    auto it = manager.GetAllSelectedItems();
    for (it->First(); !it->IsEnd(); it->Next()) {
        selected.push_back(it->CurrentItem());
    }
    // A node whose holder is gone is skipped with its subtree, as a group node is.
    EXPECT_EQ(selected, (std::vector<VnI::IPropertyHolder*>{&top, &live}));
    manager.RemoveAll();
}
