//===-- tests/TreeNodeTest.cpp - adding and removing children keep chain and iterators -===//
#include "MessageCapture.h"
#include "Slots.h"

#include "s/PropertyHolder.h"
#include "s/TreeDataModel.h"
#include "s/TreeNode.h"
#include "s/TreeNodeItr.h"

#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <type_traits>
#include <vector>

using CommonI::RefCountPtr;
using Vn::Eng::TreeGroupNode;
using Vn::Eng::TreeNode;
using VnI::ITreeNode;
using VnI::ITreeNodeItr;

namespace {

// The smallest concrete holder: a name, no schema.
class Holder final : public Vn::Eng::PropertyHolder {
public:
    explicit Holder(std::string name) : m_name(std::move(name)) {}
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

RefCountPtr<ITreeNode> Node(RefCountPtr<ITreeNode> parent = nullptr) {
    return TreeNode::CreateInstance(nullptr, std::move(parent));
}

std::vector<ITreeNode*> Children(const RefCountPtr<ITreeNode>& node) {
    std::vector<ITreeNode*> out;
    for (auto it = node->GetChildren(); !it->IsEnd(); it->Next()) {
        out.push_back(it->CurrentItem().Get());
    }
    return out;
}

// A group node's name, or "?" for a node that is no group node.
std::string NameOf(ITreeNode* node) {
    auto* group = dynamic_cast<TreeGroupNode*>(TreeNode::FromInterface(node));
    return group != nullptr ? group->GetName().str() : "?";
}

// An iterator over node's children standing on the child at position.
RefCountPtr<ITreeNodeItr> At(const RefCountPtr<ITreeNode>& node, int position) {
    auto it = node->GetChildren();
    for (int i = 0; i < position; ++i) {
        it->Next();
    }
    return it;
}

// A parent with children C, B, A (added A, then B, then C).
struct Family {
    RefCountPtr<ITreeNode> parent = Node();
    RefCountPtr<ITreeNode> a = Node(parent), b = Node(parent), c = Node(parent);
    Family() {
        parent->AddChild(a);
        parent->AddChild(b);
        parent->AddChild(c);
    }
};

} // namespace

TEST(TreeLinking, ChildrenComeOutNewestFirstAndNameTheirParent) {
    Family f;
    EXPECT_EQ(Children(f.parent), (std::vector<ITreeNode*>{f.c.Get(), f.b.Get(), f.a.Get()}));
    EXPECT_TRUE(f.parent->HasChildren());
    EXPECT_FALSE(f.a->HasChildren());
    for (auto* child : {f.a.Get(), f.b.Get(), f.c.Get()}) {
        EXPECT_EQ(child->GetParent().Get(), f.parent.Get());
    }
    EXPECT_EQ(f.parent->GetParent(), nullptr);
}

TEST(TreeLinking, AddingANodeAgainMovesItToTheFrontOnce) {
    Family f;
    f.parent->AddChild(f.a);
    EXPECT_EQ(Children(f.parent), (std::vector<ITreeNode*>{f.a.Get(), f.c.Get(), f.b.Get()}));
    f.parent->AddChild(f.a);
    EXPECT_EQ(Children(f.parent), (std::vector<ITreeNode*>{f.a.Get(), f.c.Get(), f.b.Get()}));
    EXPECT_EQ(CountOf(f.a.Get()), 2) << "the chain holds it once, the test once";
}

TEST(TreeLinking, InsertGoesInFrontOfTheIteratorsChild) {
    {
        Family f;
        auto d = Node();
        EXPECT_EQ(f.parent->InsertChild(d, At(f.parent, 1)), 1);
        EXPECT_EQ(Children(f.parent),
                  (std::vector<ITreeNode*>{f.c.Get(), d.Get(), f.b.Get(), f.a.Get()}));
        EXPECT_EQ(d->GetParent().Get(), f.parent.Get());
    }
    {
        Family f;
        auto d = Node();
        f.parent->InsertChild(d, At(f.parent, 0));
        EXPECT_EQ(Children(f.parent),
                  (std::vector<ITreeNode*>{d.Get(), f.c.Get(), f.b.Get(), f.a.Get()}));
    }
    {
        Family f;
        auto d = Node();
        EXPECT_EQ(f.parent->InsertChild(d, At(f.parent, 3)), 1);
        EXPECT_EQ(Children(f.parent), (std::vector<ITreeNode*>{f.c.Get(), f.b.Get(), f.a.Get()}))
            << "an end iterator does not append";
        EXPECT_EQ(d->GetParent(), nullptr);
        EXPECT_EQ(CountOf(d.Get()), 1);
    }
}

TEST(TreeLinking, InsertRefusesTheNodeBeforeItselfAndForeignPositions) {
    Family f;
    f.parent->InsertChild(f.b, At(f.parent, 1));
    EXPECT_EQ(Children(f.parent), (std::vector<ITreeNode*>{f.c.Get(), f.b.Get(), f.a.Get()}));

    Family other;
    auto d = Node();
    f.parent->InsertChild(d, At(other.parent, 1));
    EXPECT_EQ(Children(f.parent), (std::vector<ITreeNode*>{f.c.Get(), f.b.Get(), f.a.Get()}));
    EXPECT_EQ(Children(other.parent),
              (std::vector<ITreeNode*>{other.c.Get(), other.b.Get(), other.a.Get()}));

    f.parent->InsertChild(nullptr, At(f.parent, 0));
    f.parent->InsertChild(d, nullptr);
    EXPECT_EQ(Children(f.parent).size(), 3u);
}

TEST(TreeLinking, InsertMovesASiblingWithinTheChain) {
    Family f;
    f.parent->InsertChild(f.a, At(f.parent, 0)); // the last one to the front
    EXPECT_EQ(Children(f.parent), (std::vector<ITreeNode*>{f.a.Get(), f.c.Get(), f.b.Get()}));
    f.parent->InsertChild(f.a, At(f.parent, 2)); // and back in front of B
    EXPECT_EQ(Children(f.parent), (std::vector<ITreeNode*>{f.c.Get(), f.a.Get(), f.b.Get()}));
    EXPECT_EQ(CountOf(f.a.Get()), 2);
}

TEST(TreeLinking, RemovingTheFirstChildMovesTheIteratorOn) {
    Family f;
    auto it = At(f.parent, 0);
    EXPECT_EQ(f.parent->RemoveChild(it), 1);
    EXPECT_EQ(Children(f.parent), (std::vector<ITreeNode*>{f.b.Get(), f.a.Get()}));
    EXPECT_EQ(it->CurrentItem().Get(), f.b.Get());
    EXPECT_EQ(CountOf(f.c.Get()), 1) << "the chain let go of it";
    EXPECT_EQ(f.c->GetParent().Get(), f.parent.Get()) << "a removed node keeps its parent link";
}

TEST(TreeLinking, RemovingAMiddleChildJoinsItsNeighbours) {
    Family f;
    f.parent->RemoveChild(At(f.parent, 1));
    EXPECT_EQ(Children(f.parent), (std::vector<ITreeNode*>{f.c.Get(), f.a.Get()}));
    // A's previous link must now be C: inserting in front of A lands between them.
    auto d = Node();
    f.parent->InsertChild(d, At(f.parent, 1));
    EXPECT_EQ(Children(f.parent), (std::vector<ITreeNode*>{f.c.Get(), d.Get(), f.a.Get()}));
    // And B is out of every chain: linking it elsewhere takes nobody with it.
    auto other = Node();
    other->AddChild(f.b);
    EXPECT_EQ(Children(other), (std::vector<ITreeNode*>{f.b.Get()}));
}

TEST(TreeLinking, RemovingThroughOneIteratorInALoopEmptiesTheNode) {
    Family f;
    for (auto it = f.parent->GetChildren(); !it->IsEnd();) {
        f.parent->RemoveChild(it);
    }
    EXPECT_FALSE(f.parent->HasChildren());
    EXPECT_TRUE(Children(f.parent).empty());
    for (auto* child : {f.a.Get(), f.b.Get(), f.c.Get()}) {
        EXPECT_EQ(CountOf(child), 1);
        EXPECT_EQ(child->GetParent().Get(), f.parent.Get());
    }
    f.parent->RemoveChild(f.parent->GetChildren()); // at its end: nothing
    f.parent->RemoveChild(nullptr);
}

TEST(TreeLinking, ANodeIsTakenOutOfTheChainItIsReallyIn) {
    Family f;
    auto q = Node();
    q->AddChild(f.b); // from the middle of another chain
    EXPECT_EQ(Children(f.parent), (std::vector<ITreeNode*>{f.c.Get(), f.a.Get()}));
    EXPECT_EQ(f.b->GetParent().Get(), q.Get());
    q->AddChild(f.c); // the other parent's first child
    EXPECT_EQ(Children(f.parent), (std::vector<ITreeNode*>{f.a.Get()}));
    EXPECT_EQ(Children(q), (std::vector<ITreeNode*>{f.c.Get(), f.b.Get()}));

    // Neither a foreign iterator nor a parent link rewritten by hand fools the removal:
    // A leaves the chain it is really in.
    TreeNode::FromInterface(f.a.Get())->SetParent(q);
    q->RemoveChild(At(f.parent, 0));
    EXPECT_FALSE(f.parent->HasChildren());
    EXPECT_EQ(CountOf(f.a.Get()), 1);
}

TEST(TreeLinking, ANodeCannotBecomeItsOwnAncestor) {
    auto root = Node();
    auto mid = Node(root);
    auto leaf = Node(mid);
    root->AddChild(mid);
    mid->AddChild(leaf);
    leaf->AddChild(root);
    mid->AddChild(mid);
    leaf->InsertChild(mid, At(mid, 0));
    EXPECT_EQ(Children(root), (std::vector<ITreeNode*>{mid.Get()}));
    EXPECT_EQ(Children(mid), (std::vector<ITreeNode*>{leaf.Get()}));
    EXPECT_FALSE(leaf->HasChildren());
    EXPECT_EQ(CountOf(root.Get()), 1) << "no counted cycle";
    root->AddChild(nullptr);
    EXPECT_EQ(Children(root).size(), 1u);
}

TEST(TreeLinking, AChildMadeWithAParentIsNotLinkedUntilAdded) {
    auto parent = Node();
    auto child = Node(parent);
    EXPECT_EQ(child->GetParent().Get(), parent.Get());
    EXPECT_FALSE(parent->HasChildren());
    EXPECT_EQ(CountOf(parent.Get()), 1) << "a child does not keep its parent alive";
}

TEST(TreeIterator, ReadsTheLiveChainAndAnswersNullAtItsEnd) {
    auto parent = Node();
    auto it = parent->GetChildren();
    EXPECT_TRUE(it->IsEnd());
    EXPECT_EQ(it->CurrentItem(), nullptr);
    EXPECT_EQ(it->Next(), 1);
    EXPECT_TRUE(it->IsEnd());
    auto a = Node();
    parent->AddChild(a);
    EXPECT_TRUE(it->IsEnd()) << "the position stays where it was";
    EXPECT_EQ(it->First(), 1);
    EXPECT_EQ(it->CurrentItem().Get(), a.Get());
    EXPECT_EQ(CountOf(a.Get()), 2) << "CurrentItem's reference was dropped";
    auto b = Node();
    parent->AddChild(b);
    it->First();
    EXPECT_EQ(it->CurrentItem().Get(), b.Get());
}

TEST(TreeHolders, ANodeMadeForAHolderIsItsTreeNode) {
    Holder h("h");
    auto parent = Node();
    auto node = TreeNode::CreateInstance(&h, parent);
    EXPECT_EQ(CountOf(node.Get()), 2) << "the caller's and the holder's";
    EXPECT_EQ(h.GetParentTreeNode().Get(), node.Get());
    EXPECT_EQ(node->GetDataRef(), &h);
    // A second node for the same holder takes its place there.
    auto second = TreeNode::CreateInstance(&h, nullptr);
    EXPECT_EQ(h.GetParentTreeNode().Get(), second.Get());
    EXPECT_EQ(CountOf(node.Get()), 1);
    EXPECT_EQ(node->GetDataRef(), &h) << "the first still shows the holder";
}

TEST(TreeHolders, GroupNodesShowNoHolderAndKeepTheirName) {
    auto parent = Node();
    auto group = TreeGroupNode::CreateInstance("Bank 0", parent);
    EXPECT_EQ(group->GetDataRef(), nullptr);
    EXPECT_EQ(group->GetParent().Get(), parent.Get());
    auto* asGroup = dynamic_cast<TreeGroupNode*>(TreeNode::FromInterface(group.Get()));
    ASSERT_NE(asGroup, nullptr);
    EXPECT_EQ(asGroup->GetName(), Port::StringBase<char>("Bank 0"));
    EXPECT_EQ(TreeNode::FromInterface(nullptr), nullptr);
}

TEST(TreeCopy, ChildrenComeOutReversedAndHoldersLinkToTheCopies) {
    Holder rootHolder("r"), hx("x"), hy("y"), hg("g");
    auto root = TreeNode::CreateInstance(&rootHolder, nullptr);
    auto x = TreeNode::CreateInstance(&hx, root);
    auto y = TreeNode::CreateInstance(&hy, root);
    auto g = TreeNode::CreateInstance(&hg, x);
    auto g2 = Node(x);
    x->AddChild(g2);
    x->AddChild(g);
    root->AddChild(y);
    root->AddChild(x); // root: x, y; x: g, g2

    auto copy = TreeNode::CreateInstance(root);
    ASSERT_TRUE(copy);
    EXPECT_NE(copy.Get(), root.Get());
    EXPECT_EQ(copy->GetDataRef(), &rootHolder);
    EXPECT_EQ(copy->GetParent(), nullptr);
    EXPECT_EQ(rootHolder.GetParentTreeNode().Get(), root.Get())
        << "the copied root's holder is not told";

    const auto top = Children(copy);
    ASSERT_EQ(top.size(), 2u);
    EXPECT_EQ(top[0]->GetDataRef(), &hy);
    EXPECT_EQ(top[1]->GetDataRef(), &hx);
    EXPECT_EQ(hx.GetParentTreeNode().Get(), top[1]);
    EXPECT_EQ(hy.GetParentTreeNode().Get(), top[0]);
    EXPECT_EQ(top[1]->GetParent().Get(), copy.Get());

    const auto below = Children(RefCountPtr<ITreeNode>(top[1]));
    ASSERT_EQ(below.size(), 2u);
    EXPECT_EQ(below[0]->GetDataRef(), nullptr);
    EXPECT_EQ(below[1]->GetDataRef(), &hg);
    EXPECT_EQ(hg.GetParentTreeNode().Get(), below[1]);

    // The source is untouched.
    EXPECT_EQ(Children(root), (std::vector<ITreeNode*>{x.Get(), y.Get()}));
    EXPECT_EQ(Children(x), (std::vector<ITreeNode*>{g.Get(), g2.Get()}));
    EXPECT_EQ(TreeNode::CreateInstance(RefCountPtr<ITreeNode>()), nullptr);
}

TEST(TreeCopy, GroupNodesStayGroupNodesWithTheirNames) {
    auto root = TreeGroupNode::CreateInstance("Device", nullptr);
    auto bank0 = TreeGroupNode::CreateInstance("Bank 0", root);
    auto bank1 = TreeGroupNode::CreateInstance("Bank 1", root);
    auto pins = TreeGroupNode::CreateInstance("Pins", bank0);
    auto io = TreeGroupNode::CreateInstance("IO", bank0);
    root->AddChild(bank1);
    root->AddChild(bank0); // Device: Bank 0, Bank 1
    bank0->AddChild(io);
    bank0->AddChild(pins); // Bank 0: Pins, IO

    auto copy = TreeNode::CreateInstance(root);
    EXPECT_EQ(NameOf(copy.Get()), "Device");
    const auto top = Children(copy);
    ASSERT_EQ(top.size(), 2u);
    EXPECT_EQ(NameOf(top[0]), "Bank 1");
    EXPECT_EQ(NameOf(top[1]), "Bank 0");
    const auto below = Children(RefCountPtr<ITreeNode>(top[1]));
    ASSERT_EQ(below.size(), 2u);
    EXPECT_EQ(NameOf(below[0]), "IO");
    EXPECT_EQ(NameOf(below[1]), "Pins");
    EXPECT_EQ(below[0]->GetParent().Get(), top[1]);
}

TEST(TreeInterfaces, NodesAnswerTheirInterfaceObjectAndCounter) {
    auto plain = Node();
    auto group = TreeGroupNode::CreateInstance("g", nullptr);
    for (ITreeNode* node : {plain.Get(), group.Get()}) {
        TreeNode* owner = TreeNode::FromInterface(node);
        CitI::IInterface* counter = node->GetInterface(CommonI::IID_IRefCount);
        ASSERT_NE(counter, nullptr);
        EXPECT_NE(counter, static_cast<CitI::IInterface*>(node));
        for (CitI::IInterface* from : {static_cast<CitI::IInterface*>(node), counter}) {
            EXPECT_EQ(from->GetInterface(VnI::IID_ITreeNode), node);
            EXPECT_EQ(from->GetInterface(CitI::IID_IInterface), node);
            EXPECT_EQ(from->GetInterface(CommonI::IID_IRefCount), counter);
            EXPECT_EQ(from->GetInterface(VnI::IID_ITreeNodeItr), nullptr);
            EXPECT_EQ(from->GetInterface(VnI::IID_IPropertyHolder), nullptr);
        }
        EXPECT_EQ(owner->GetInterface(VnI::IID_ITreeNode), node);
        EXPECT_EQ(owner->GetInterface(CommonI::IID_IRefCount), counter);
    }
}

TEST(TreeInterfaces, IteratorsAnswerNoBaseInterface) {
    auto parent = Node();
    auto it = parent->GetChildren();
    CitI::IInterface* counter = it->GetInterface(CommonI::IID_IRefCount);
    ASSERT_NE(counter, nullptr);
    for (CitI::IInterface* from : {static_cast<CitI::IInterface*>(it.Get()), counter}) {
        EXPECT_EQ(from->GetInterface(VnI::IID_ITreeNodeItr), it.Get());
        EXPECT_EQ(from->GetInterface(CitI::IID_IInterface), nullptr);
        EXPECT_EQ(from->GetInterface(CommonI::IID_IRefCount), counter);
        EXPECT_EQ(from->GetInterface(VnI::IID_ITreeNode), nullptr);
    }
    EXPECT_EQ(CountOf(it.Get()), 1);
}

TEST(TreeInterfaces, TheModelAnswersItsInterfaceObjectAndCounter) {
    auto model = Vn::Eng::TreeDataModel::CreateInstance(Node());
    CitI::IInterface* counter = model->GetInterface(CommonI::IID_IRefCount);
    ASSERT_NE(counter, nullptr);
    for (CitI::IInterface* from : {static_cast<CitI::IInterface*>(model.Get()), counter}) {
        EXPECT_EQ(from->GetInterface(VnI::IID_ITreeModel), model.Get());
        EXPECT_EQ(from->GetInterface(CitI::IID_IInterface), model.Get());
        EXPECT_EQ(from->GetInterface(CommonI::IID_IRefCount), counter);
        EXPECT_EQ(from->GetInterface(VnI::IID_ITreeNode), nullptr);
    }
    EXPECT_EQ(CountOf(model.Get()), 1);
}

TEST(TreeInterfaces, SlotOrderIsTheContract) {
    using VnTest::SlotOf;
    EXPECT_EQ(SlotOf(&ITreeNode::GetInterface), 0);
    EXPECT_EQ(SlotOf(&ITreeNode::AddChild), 3);
    EXPECT_EQ(SlotOf(&ITreeNode::InsertChild), 4);
    EXPECT_EQ(SlotOf(&ITreeNode::GetDataRef), 5);
    EXPECT_EQ(SlotOf(&ITreeNode::GetChildren), 6);
    EXPECT_EQ(SlotOf(&ITreeNode::RemoveChild), 7);
    EXPECT_EQ(SlotOf(&ITreeNode::GetParent), 8);
    EXPECT_EQ(SlotOf(&ITreeNode::HasChildren), 9);
    EXPECT_EQ(SlotOf(&ITreeNodeItr::CurrentItem), 3);
    EXPECT_EQ(SlotOf(&ITreeNodeItr::First), 4);
    EXPECT_EQ(SlotOf(&ITreeNodeItr::Next), 5);
    EXPECT_EQ(SlotOf(&ITreeNodeItr::IsEnd), 6);
    EXPECT_EQ(SlotOf(&VnI::ITreeModel::GetRootNode), 3);
    // The public classes add nothing virtual but their destructors.
    EXPECT_EQ(SlotOf(&TreeNode::AddChild), -1);
    EXPECT_EQ(SlotOf(&Vn::Eng::TreeNodeItr::Next), -1);
    EXPECT_EQ(SlotOf(&Vn::Eng::TreeDataModel::GetRootNode), -1);
    EXPECT_TRUE(std::has_virtual_destructor_v<TreeNode>);
    EXPECT_TRUE(std::has_virtual_destructor_v<Vn::Eng::TreeNodeItr>);
    EXPECT_TRUE(std::has_virtual_destructor_v<Vn::Eng::TreeDataModel>);
}

TEST(TreeInterfaces, DumpIssuesItsEightLinesFromItsUnit) {
    VnTest::MessageCapture capture;
    auto node = Node();
    TreeNode::FromInterface(node.Get())->Dump();
    ASSERT_EQ(capture.Messages().size(), 8u);
    const char* members[] = {"m_ITreeNode",   "visible",      "m_selected",   "m_prevSibling",
                             "m_nextSibling", "m_firshChild", "m_parentNode", "m_propHolder"};
    for (size_t i = 0; i < 8; ++i) {
        const Port::Message& m = capture.Messages()[i];
        EXPECT_EQ(m.severity, Port::Severity::Status);
        EXPECT_EQ(m.domain, "Venlomer");
        EXPECT_EQ(m.unit, "../s/TreeNode");
        EXPECT_EQ(m.revision, "$Revision: 1.5 $");
        EXPECT_EQ(m.line, 169 + static_cast<int>(i));
        const std::string prefix = std::string("Vn::Eng::TreeNode::m_imp->") + members[i] + " = ";
        EXPECT_EQ(m.text.rfind(prefix, 0), 0u) << m.text;
    }
    EXPECT_EQ(capture.Messages()[1].text, "Vn::Eng::TreeNode::m_imp->visible = 1\n");
    EXPECT_EQ(capture.Messages()[2].text, "Vn::Eng::TreeNode::m_imp->m_selected = 0\n");
}
