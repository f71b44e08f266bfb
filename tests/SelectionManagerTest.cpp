//===-- tests/SelectionManagerTest.cpp - selection files by type, descends, keeps its order -===//
#include "FakeHolders.h"
#include "MessageCapture.h"
#include "Slots.h"

#include "s/PropertyHolderItr.h"
#include "s/SelectionManager.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <memory>
#include <numeric>
#include <random>
#include <vector>

using CommonI::RefCountPtr;
using Vn::Eng::SelectionManager;
using VnTest::FakeHolder;
using VnTest::FakeNode;

namespace {

std::vector<VnI::IPropertyHolder*> Walk(const RefCountPtr<VnI::IPropertyHolderItr>& it) {
    std::vector<VnI::IPropertyHolder*> out;
    if (!it) {
        ADD_FAILURE() << "no iterator where one was expected";
        return out;
    }
    for (it->First(); !it->IsEnd(); it->Next()) {
        out.push_back(it->CurrentItem());
    }
    return out;
}

constexpr const char* kMissing = "Trying to remove an item that doesn't exist";

// h with children c1, c2 in that order, c1 with child g1.
struct SmallTree {
    FakeHolder h{3, "h"}, c1{3, "c1"}, c2{4, "c2"}, g1{5, "g1"};
    RefCountPtr<FakeNode> nh = FakeNode::Make(&h), n1 = FakeNode::Make(&c1),
                          n2 = FakeNode::Make(&c2), ng = FakeNode::Make(&g1);
    SmallTree() {
        nh->Add(n1);
        nh->Add(n2);
        n1->Add(ng);
    }
};

} // namespace

TEST(SelectionManager, StartsWithTwelveEmptyCategories) {
    SelectionManager manager;
    EXPECT_EQ(manager.GetNumCategories(), 12);
    for (int c = 0; c < 12; ++c) {
        auto it = manager.GetSelectedItems(c);
        ASSERT_TRUE(it) << c;
        EXPECT_TRUE(it->IsEnd());
    }
    EXPECT_FALSE(manager.GetSelectedItems(12));
    EXPECT_FALSE(manager.GetSelectedItems(-1));
    EXPECT_TRUE(Walk(manager.GetAllSelectedItems()).empty());
}

TEST(SelectionManager, GrowsCategoriesForHigherTypesAndFilesByType) {
    FakeHolder high(15), low(2);
    SelectionManager manager;
    manager.AddSelectedItem(&high, false);
    manager.AddSelectedItem(&low, false);
    EXPECT_EQ(manager.GetNumCategories(), 16);
    for (int c = 12; c < 15; ++c) {
        EXPECT_TRUE(Walk(manager.GetSelectedItems(c)).empty()) << c;
    }
    EXPECT_EQ(Walk(manager.GetSelectedItems(15)), std::vector<VnI::IPropertyHolder*>{&high});
    EXPECT_EQ(Walk(manager.GetSelectedItems(2)), std::vector<VnI::IPropertyHolder*>{&low});
    EXPECT_EQ(Walk(manager.GetAllSelectedItems()),
              (std::vector<VnI::IPropertyHolder*>{&high, &low}));
    EXPECT_TRUE(high.IsSelected());
}

TEST(SelectionManager, TypesUpToTheCategoryBoundAreFiledAndTheBoundItselfRefused) {
    constexpr int kBound = SelectionManager::kMaxCategories;
    VnTest::MessageCapture capture;
    FakeHolder last(kBound - 1, "last"), at(kBound, "at"), beyond(kBound + 1, "beyond");
    SelectionManager manager;

    EXPECT_EQ(manager.AddSelectedItem(&at, false), 1);
    EXPECT_EQ(manager.AddSelectedItem(&beyond, false), 1);
    EXPECT_FALSE(at.IsSelected());
    EXPECT_FALSE(beyond.IsSelected());
    EXPECT_EQ(manager.GetNumCategories(), 12);
    EXPECT_EQ(capture.Debug().size(), 2u);
    EXPECT_TRUE(Walk(manager.GetAllSelectedItems()).empty());

    capture.Clear();
    EXPECT_EQ(manager.AddSelectedItem(&last, false), 1);
    EXPECT_TRUE(last.IsSelected());
    EXPECT_TRUE(capture.Debug().empty());
    EXPECT_EQ(manager.GetNumCategories(), kBound);
    EXPECT_EQ(Walk(manager.GetSelectedItems(kBound - 1)),
              std::vector<VnI::IPropertyHolder*>{&last});
    EXPECT_FALSE(manager.GetSelectedItems(kBound));
    EXPECT_EQ(Walk(manager.GetAllSelectedItems()), std::vector<VnI::IPropertyHolder*>{&last});

    // Once the categories reach the bound, the bound is still refused.
    EXPECT_EQ(manager.AddSelectedItem(&at, false), 1);
    EXPECT_FALSE(at.IsSelected());
    EXPECT_EQ(manager.GetNumCategories(), kBound);
    manager.RemoveSelectedItem(&last, false);
    EXPECT_FALSE(last.IsSelected());
    EXPECT_TRUE(Walk(manager.GetSelectedItems(kBound - 1)).empty());
}

TEST(SelectionManager, SelectsOnceAndRespectsAFlagSetByHand) {
    FakeHolder a(1), preset(1);
    SelectionManager manager;
    manager.AddSelectedItem(&a, false);
    EXPECT_EQ(manager.AddSelectedItem(&a, false), 1);
    EXPECT_EQ(Walk(manager.GetAllSelectedItems()).size(), 1u);

    preset.SetSelected(true);
    manager.AddSelectedItem(&preset, false);
    EXPECT_EQ(Walk(manager.GetSelectedItems(1)), std::vector<VnI::IPropertyHolder*>{&a});
    EXPECT_EQ(manager.AddSelectedItem(nullptr, true), 1);
}

TEST(SelectionManager, RefusesNegativeAndHugeTypesWithoutChangingAnything) {
    VnTest::MessageCapture capture;
    FakeHolder negative(-3), huge(0x7FFFFFFF);
    SelectionManager manager;
    EXPECT_EQ(manager.AddSelectedItem(&negative, true), 1);
    EXPECT_EQ(manager.AddSelectedItem(&huge, true), 1);
    EXPECT_FALSE(negative.IsSelected());
    EXPECT_FALSE(huge.IsSelected());
    EXPECT_EQ(manager.GetNumCategories(), 12);
    EXPECT_EQ(capture.Debug().size(), 2u);
    manager.RemoveSelectedItem(&negative, false);
    EXPECT_EQ(capture.Debug().back(), kMissing);
}

TEST(SelectionManager, DescendsDepthFirstAndSkipsGroupNodesWithTheirSubtrees) {
    SmallTree t;
    FakeHolder hidden(3, "below group");
    auto group = FakeNode::Make(nullptr);
    auto underGroup = FakeNode::Make(&hidden);
    group->Add(underGroup);
    t.nh->Add(group);

    SelectionManager manager;
    manager.AddSelectedItem(&t.h, true);
    EXPECT_EQ(Walk(manager.GetAllSelectedItems()),
              (std::vector<VnI::IPropertyHolder*>{&t.h, &t.c1, &t.g1, &t.c2}));
    EXPECT_FALSE(hidden.IsSelected());
    EXPECT_EQ(Walk(manager.GetSelectedItems(3)), (std::vector<VnI::IPropertyHolder*>{&t.h, &t.c1}));
}

TEST(SelectionManager, DescentStopsAtHoldersAlreadySelected) {
    SmallTree t;
    SelectionManager manager;
    manager.AddSelectedItem(&t.c1, false); // g1 below it is not visited later
    manager.AddSelectedItem(&t.h, true);
    EXPECT_EQ(Walk(manager.GetAllSelectedItems()),
              (std::vector<VnI::IPropertyHolder*>{&t.c1, &t.h, &t.c2}));
    EXPECT_FALSE(t.g1.IsSelected());
}

TEST(SelectionManager, RemovalWithChildrenGoesOneLevelDown) {
    SmallTree t;
    SelectionManager manager;
    manager.AddSelectedItem(&t.h, true);
    manager.RemoveSelectedItem(&t.h, true);
    EXPECT_FALSE(t.h.IsSelected());
    EXPECT_FALSE(t.c1.IsSelected());
    EXPECT_FALSE(t.c2.IsSelected());
    EXPECT_TRUE(t.g1.IsSelected());
    EXPECT_EQ(Walk(manager.GetAllSelectedItems()), std::vector<VnI::IPropertyHolder*>{&t.g1});
}

TEST(SelectionManager, RemovingWhatIsNotSelectedReportsOnceAndStillVisitsChildren) {
    SmallTree t;
    SelectionManager manager;
    manager.AddSelectedItem(&t.c1, false);
    VnTest::MessageCapture capture;
    EXPECT_EQ(manager.RemoveSelectedItem(&t.h, false), 1);
    EXPECT_EQ(capture.Debug(), std::vector<std::string>{kMissing});
    capture.Clear();
    manager.RemoveSelectedItem(&t.h, true);
    // h itself and c2 are missing; c1 is removed.
    EXPECT_EQ(capture.Debug(), (std::vector<std::string>{kMissing, kMissing}));
    EXPECT_FALSE(t.c1.IsSelected());
}

TEST(SelectionManager, KeepsOrderOfSelectionAcrossRemovals) {
    FakeHolder a(1), b(1), c(1);
    SelectionManager manager;
    for (FakeHolder* h : {&a, &b, &c}) {
        manager.AddSelectedItem(h, false);
    }
    manager.RemoveSelectedItem(&b, false);
    EXPECT_EQ(Walk(manager.GetAllSelectedItems()), (std::vector<VnI::IPropertyHolder*>{&a, &c}));
    EXPECT_EQ(Walk(manager.GetSelectedItems(1)), (std::vector<VnI::IPropertyHolder*>{&a, &c}));
    manager.AddSelectedItem(&b, false);
    EXPECT_EQ(Walk(manager.GetAllSelectedItems()),
              (std::vector<VnI::IPropertyHolder*>{&a, &c, &b}));
}

TEST(SelectionManager, AHolderWhoseTypeChangedStaysUntilRemoveAll) {
    VnTest::MessageCapture capture;
    FakeHolder moving(2);
    SelectionManager manager;
    manager.AddSelectedItem(&moving, false);
    moving.m_type = 3;
    manager.RemoveSelectedItem(&moving, false);
    EXPECT_EQ(capture.Debug(), std::vector<std::string>{kMissing});
    EXPECT_TRUE(moving.IsSelected());
    EXPECT_EQ(Walk(manager.GetSelectedItems(2)).size(), 1u);
    manager.RemoveAll();
    EXPECT_FALSE(moving.IsSelected());
}

TEST(SelectionManager, ReselectingAfterAFlagClearedByHandListsTheHolderTwice) {
    FakeHolder h(1);
    SelectionManager manager;
    manager.AddSelectedItem(&h, false);
    h.SetSelected(false); // the host bypassed the manager
    manager.AddSelectedItem(&h, false);
    EXPECT_EQ(Walk(manager.GetAllSelectedItems()).size(), 2u);
    // One removal takes it out of its category wholly and out of the overall list once.
    manager.RemoveSelectedItem(&h, false);
    EXPECT_TRUE(Walk(manager.GetSelectedItems(1)).empty());
    EXPECT_EQ(Walk(manager.GetAllSelectedItems()).size(), 1u);
}

TEST(SelectionManager, RemoveAllClearsListsAndFlagsButKeepsCategories) {
    FakeHolder a(1), b(20);
    SelectionManager manager;
    manager.AddSelectedItem(&a, false);
    manager.AddSelectedItem(&b, false);
    EXPECT_EQ(manager.RemoveAll(), 1);
    EXPECT_FALSE(a.IsSelected());
    EXPECT_FALSE(b.IsSelected());
    EXPECT_EQ(manager.GetNumCategories(), 21);
    EXPECT_TRUE(Walk(manager.GetAllSelectedItems()).empty());
    manager.AddSelectedItem(&a, false); // the index was cleared with the lists
    manager.RemoveSelectedItem(&a, false);
    EXPECT_TRUE(Walk(manager.GetAllSelectedItems()).empty());
}

TEST(SelectionManager, DestructionClearsTheFlagsOfWhatIsStillSelected) {
    FakeHolder a(1), b(2);
    {
        SelectionManager manager;
        manager.AddSelectedItem(&a, false);
        manager.AddSelectedItem(&b, false);
        manager.RemoveSelectedItem(&b, false);
        b.SetSelected(true); // set by hand after removal: not the manager's to clear
    }
    EXPECT_FALSE(a.IsSelected());
    EXPECT_TRUE(b.IsSelected());
}

TEST(SelectionManager, AnswersItsInterfaceAndForwardsThroughIt) {
    SelectionManager manager;
    auto* iface =
        static_cast<VnI::ISelectionManager*>(manager.GetInterface(VnI::IID_ISelectionManager));
    ASSERT_NE(iface, nullptr);
    EXPECT_EQ(manager.GetInterface(CitI::IID_IInterface), iface);
    EXPECT_EQ(manager.GetInterface(CommonI::IID_IRefCount), nullptr);
    EXPECT_EQ(iface->GetInterface(VnI::IID_ISelectionManager), iface);
    EXPECT_EQ(iface->GetInterface(VnI::IID_IHighlightManager), nullptr);
    FakeHolder h(4);
    iface->AddSelectedItem(&h, false);
    EXPECT_EQ(Walk(iface->GetSelectedItems(4)), std::vector<VnI::IPropertyHolder*>{&h});
    EXPECT_EQ(iface->GetNumCategories(), 12);
    iface->RemoveSelectedItem(&h, false);
    EXPECT_FALSE(h.IsSelected());
    iface->AddSelectedItem(&h, false);
    iface->RemoveAll();
    EXPECT_TRUE(Walk(iface->GetAllSelectedItems()).empty());
}

TEST(SelectionManager, SlotOrderIsTheContract) {
    using VnI::ISelectionManager;
    using VnTest::SlotOf;
    EXPECT_EQ(SlotOf(&ISelectionManager::GetInterface), 0);
    EXPECT_EQ(SlotOf(&ISelectionManager::GetNumCategories), 3);
    EXPECT_EQ(SlotOf(&ISelectionManager::GetSelectedItems), 4);
    EXPECT_EQ(SlotOf(&ISelectionManager::GetAllSelectedItems), 5);
    EXPECT_EQ(SlotOf(&ISelectionManager::AddSelectedItem), 6);
    EXPECT_EQ(SlotOf(&ISelectionManager::RemoveSelectedItem), 7);
    EXPECT_EQ(SlotOf(&ISelectionManager::RemoveAll), 8);
}

TEST(SelectionManagerScale, AMillionHoldersRemovedInAnotherOrderStayQuick) {
    constexpr int kCount = 1000000;
    std::vector<std::unique_ptr<FakeHolder>> holders;
    holders.reserve(kCount);
    for (int i = 0; i < kCount; ++i) {
        holders.push_back(std::make_unique<FakeHolder>(i % 13));
    }
    SelectionManager manager;
    for (auto& h : holders) {
        manager.AddSelectedItem(h.get(), false);
    }
    std::vector<int> order(kCount);
    std::iota(order.begin(), order.end(), 0);
    std::shuffle(order.begin(), order.end(), std::mt19937(12345));
    // Keep the first hundred of the shuffled order to check what remains.
    for (int i = 100; i < kCount; ++i) {
        manager.RemoveSelectedItem(
            holders[static_cast<size_t>(order[static_cast<size_t>(i)])].get(), false);
    }
    auto remaining = Walk(manager.GetAllSelectedItems());
    std::vector<int> expected(order.begin(), order.begin() + 100);
    std::sort(expected.begin(), expected.end()); // the overall list keeps selection order
    ASSERT_EQ(remaining.size(), 100u);
    for (size_t i = 0; i < 100; ++i) {
        EXPECT_EQ(remaining[i], holders[static_cast<size_t>(expected[i])].get());
    }
}

TEST(SelectionManagerScale, DescentThroughAMillionDeepChainDoesNotRecurse) {
    constexpr int kDepth = 1000000;
    std::vector<std::unique_ptr<FakeHolder>> holders;
    std::vector<RefCountPtr<FakeNode>> nodes;
    holders.reserve(kDepth);
    nodes.reserve(kDepth);
    for (int i = 0; i < kDepth; ++i) {
        holders.push_back(std::make_unique<FakeHolder>(1));
        nodes.push_back(FakeNode::Make(holders.back().get()));
        if (i > 0) {
            nodes[static_cast<size_t>(i - 1)]->Add(nodes.back());
        }
    }
    {
        SelectionManager manager;
        manager.AddSelectedItem(holders.front().get(), true);
        auto all = Walk(manager.GetAllSelectedItems());
        ASSERT_EQ(all.size(), static_cast<size_t>(kDepth));
        EXPECT_EQ(all.back(), holders.back().get());
    }
    // The fake chain owns its children through a vector; take it apart from the bottom so
    // the test's own clean-up does not recurse either.
    for (auto& h : holders) {
        h->m_node.Reset();
    }
    for (size_t i = nodes.size(); i-- > 0;) {
        nodes[i]->m_children.clear();
    }
}

// Categories on both sides of 2^16 and up to the bound, holders selected once and some
// selected again after their flag was cleared by hand, all removed in a shuffled order:
// every removal takes the holder out of exactly its own category and once out of the
// overall list.
TEST(SelectionManager, WideCategoriesAndReselectionsLeaveExactlyTheirOwnPlaces) {
    const int kTypes[] = {
        0, 11, (1 << 16) - 1, 1 << 16, (1 << 16) + 5, SelectionManager::kMaxCategories - 1};
    std::vector<std::unique_ptr<FakeHolder>> holders;
    holders.reserve(600);
    for (int i = 0; i < 600; ++i) {
        holders.push_back(std::make_unique<FakeHolder>(kTypes[i % 6]));
    }
    SelectionManager manager;
    std::vector<std::size_t> expected(6, 0);
    for (std::size_t i = 0; i < holders.size(); ++i) {
        manager.AddSelectedItem(holders[i].get(), false);
        ++expected[i % 6];
        if (i % 7 == 0) { // selected again: it stands twice in both lists
            holders[i]->SetSelected(false);
            manager.AddSelectedItem(holders[i].get(), false);
            ++expected[i % 6];
        }
    }
    std::vector<std::size_t> order(holders.size());
    std::iota(order.begin(), order.end(), 0);
    std::shuffle(order.begin(), order.end(), std::mt19937(7));
    std::size_t all = Walk(manager.GetAllSelectedItems()).size();
    for (std::size_t i : order) {
        FakeHolder& h = *holders[i];
        const std::size_t times = i % 7 == 0 ? 2 : 1;
        manager.RemoveSelectedItem(&h, false);
        expected[i % 6] -= times;
        all -= 1; // the category wholly, the overall list once
        ASSERT_FALSE(h.IsSelected());
        const auto inCategory = Walk(manager.GetSelectedItems(kTypes[i % 6]));
        ASSERT_EQ(inCategory.size(), expected[i % 6]) << "holder " << i;
        EXPECT_EQ(std::count(inCategory.begin(), inCategory.end(), &h), 0);
        ASSERT_EQ(Walk(manager.GetAllSelectedItems()).size(), all) << "holder " << i;
    }
    // What remains overall is the second place of each holder selected twice, in order.
    std::vector<VnI::IPropertyHolder*> twice;
    for (std::size_t i = 0; i < holders.size(); i += 7) {
        twice.push_back(holders[i].get());
    }
    EXPECT_EQ(Walk(manager.GetAllSelectedItems()), twice);
    for (VnI::IPropertyHolder* h : twice) {
        manager.RemoveSelectedItem(h, false); // not in its category any more: only a note
    }
    manager.RemoveAll();
    EXPECT_TRUE(Walk(manager.GetAllSelectedItems()).empty());
}
