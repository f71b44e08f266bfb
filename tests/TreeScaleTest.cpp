//===-- tests/TreeScaleTest.cpp - a million siblings or levels need no recursion --===//
//
// A million siblings and a chain a million levels deep: built, walked, copied and taken
// apart. Any recursion over the tree would overflow the stack long before the end.
//
//===------------------------------------------------------------------------------===//
#include "s/TreeDataModel.h"
#include "s/TreeNode.h"

#include <gtest/gtest.h>

#include <vector>

using CommonI::RefCountPtr;
using Vn::Eng::TreeDataModel;
using Vn::Eng::TreeNode;
using VnI::ITreeNode;

namespace {

constexpr int kMillion = 1000000;

int CountChildren(ITreeNode* node) {
    int n = 0;
    for (auto it = node->GetChildren(); !it->IsEnd(); it->Next()) {
        ++n;
    }
    return n;
}

// Follows first children down to the bottom; the number of levels below node.
int Depth(const RefCountPtr<ITreeNode>& node) {
    int depth = 0;
    RefCountPtr<ITreeNode> at = node;
    for (;;) {
        auto children = at->GetChildren();
        if (children->IsEnd()) {
            return depth;
        }
        at = children->CurrentItem();
        ++depth;
    }
}

RefCountPtr<ITreeNode> Chain(int levels) {
    auto root = TreeNode::CreateInstance(nullptr, nullptr);
    RefCountPtr<ITreeNode> at = root;
    for (int i = 0; i < levels; ++i) {
        auto child = TreeNode::CreateInstance(nullptr, at);
        at->AddChild(child);
        at = std::move(child);
    }
    return root;
}

int CountOf(CitI::IInterface* p) {
    int count = -1;
    static_cast<CommonI::IRefCount*>(p->GetInterface(CommonI::IID_IRefCount))->GetRefCount(count);
    return count;
}

} // namespace

TEST(TreeScale, AMillionSiblingsAreBuiltWalkedCopiedAndDestroyed) {
    auto root = TreeNode::CreateInstance(nullptr, nullptr);
    for (int i = 0; i < kMillion; ++i) {
        root->AddChild(TreeNode::CreateInstance(nullptr, root));
    }
    EXPECT_EQ(CountChildren(root.Get()), kMillion);
    auto copy = TreeNode::CreateInstance(root);
    EXPECT_EQ(CountChildren(copy.Get()), kMillion);
    copy.Reset(); // the node lets go of a million-long chain
    TreeDataModel::CreateInstance(root).Reset();
    EXPECT_FALSE(root->HasChildren());
}

TEST(TreeScale, AChainAMillionLevelsDeepIsBuiltWalkedCopiedAndDestroyed) {
    auto root = Chain(kMillion);
    EXPECT_EQ(Depth(root), kMillion);
    {
        auto copy = TreeNode::CreateInstance(root);
        EXPECT_EQ(Depth(copy), kMillion);
    } // the copy goes by releasing its root: each node lets go of the next level

    // The original goes through a model, which takes it apart deepest first.
    RefCountPtr<ITreeNode> bottom = root;
    while (bottom->HasChildren()) {
        bottom = bottom->GetChildren()->CurrentItem();
    }
    TreeDataModel::CreateInstance(root).Reset();
    EXPECT_FALSE(root->HasChildren());
    EXPECT_EQ(CountOf(bottom.Get()), 1);
    EXPECT_EQ(bottom->GetParent(), nullptr) << "its parent was destroyed on the way up";
}
