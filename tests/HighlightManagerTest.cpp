//===-- tests/HighlightManagerTest.cpp - highlights keep list, flags and index in step -===//
#include "FakeHolders.h"
#include "MessageCapture.h"
#include "Slots.h"

#include "s/DeviceResourceItr.h"
#include "s/HighlightManager.h"
#include "s/PropertyHolderItr.h"

#include <gtest/gtest.h>

#include <memory>
#include <numeric>
#include <random>
#include <type_traits>
#include <vector>

using CommonI::RefCountPtr;
using Vn::Eng::HighlightManager;
using VnTest::FakeResource;

namespace {

std::vector<VnI::IDeviceResource*> Walk(const RefCountPtr<VnI::IDeviceResourceItr>& it) {
    std::vector<VnI::IDeviceResource*> out;
    if (!it) {
        ADD_FAILURE() << "no iterator where one was expected";
        return out;
    }
    for (it->First(); !it->IsEnd(); it->Next()) {
        out.push_back(it->CurrentItem());
    }
    return out;
}

VnI::IDeviceResource* R(FakeResource& r) {
    return &r;
}

} // namespace

TEST(HighlightManager, ListsInOrderAndKeepsFlagsInStep) {
    FakeResource a, b, c;
    HighlightManager manager;
    for (FakeResource* r : {&a, &b, &c}) {
        EXPECT_EQ(manager.AddHighlightedItem(r), 1);
    }
    EXPECT_TRUE(b.IsHighlighted());
    EXPECT_EQ(Walk(manager.GetHighlightedItems()), (std::vector{R(a), R(b), R(c)}));
    EXPECT_EQ(manager.AddHighlightedItem(nullptr), 1);
    EXPECT_EQ(Walk(manager.GetHighlightedItems()).size(), 3u);
}

TEST(HighlightManager, DuplicatesStandTwiceAndLeaveOneAtATime) {
    FakeResource a, b;
    HighlightManager manager;
    manager.AddHighlightedItem(&a);
    manager.AddHighlightedItem(&b);
    manager.AddHighlightedItem(&a);
    manager.RemoveHighlightedItem(&a);
    EXPECT_FALSE(a.IsHighlighted()) << "the flag clears although one entry remains";
    EXPECT_EQ(Walk(manager.GetHighlightedItems()), (std::vector{R(b), R(a)}));
    manager.RemoveHighlightedItem(&a);
    EXPECT_EQ(Walk(manager.GetHighlightedItems()), (std::vector{R(b)}));
}

TEST(HighlightManager, RemovingWhatWasNeverAddedChangesNothing) {
    VnTest::MessageCapture capture;
    FakeResource a, stranger;
    HighlightManager manager;
    manager.AddHighlightedItem(&a);
    stranger.SetHighlighted(true);
    EXPECT_EQ(manager.RemoveHighlightedItem(&stranger), 1);
    EXPECT_EQ(manager.RemoveHighlightedItem(nullptr), 1);
    EXPECT_TRUE(stranger.IsHighlighted());
    EXPECT_EQ(Walk(manager.GetHighlightedItems()), (std::vector{R(a)}));
    EXPECT_TRUE(capture.Messages().empty());
}

TEST(HighlightManager, RemoveAllAndDestructionClearEveryFlag) {
    FakeResource a, b, c, kept;
    {
        HighlightManager manager;
        manager.AddHighlightedItem(&a);
        manager.AddHighlightedItem(&b);
        manager.AddHighlightedItem(&c);
        EXPECT_EQ(manager.RemoveAll(), 1);
        EXPECT_FALSE(a.IsHighlighted() || b.IsHighlighted() || c.IsHighlighted());
        EXPECT_TRUE(Walk(manager.GetHighlightedItems()).empty());
        EXPECT_EQ(manager.RemoveAll(), 1);
        manager.AddHighlightedItem(&kept);
        manager.RemoveHighlightedItem(&a); // the index was cleared too: nothing happens
    }
    EXPECT_FALSE(kept.IsHighlighted());
}

TEST(HighlightManager, ManyEntriesOfOneResourceLeaveOldestFirst) {
    FakeResource a, b;
    HighlightManager manager;
    for (int i = 0; i < 100; ++i) {
        manager.AddHighlightedItem(&a);
        manager.AddHighlightedItem(&b);
    }
    for (int i = 0; i < 60; ++i) {
        manager.RemoveHighlightedItem(&a);
    }
    auto left = Walk(manager.GetHighlightedItems());
    ASSERT_EQ(left.size(), 140u);
    // The first 60 a's are gone: the list starts with 60 b's, then alternates.
    for (size_t i = 0; i < 60; ++i) {
        EXPECT_EQ(left[i], R(b));
    }
    EXPECT_EQ(left[60], R(a));
    EXPECT_EQ(left[61], R(b));
}

TEST(HighlightManager, AnswersItsInterfaceAndForwardsThroughIt) {
    HighlightManager manager;
    auto* iface =
        static_cast<VnI::IHighlightManager*>(manager.GetInterface(VnI::IID_IHighlightManager));
    ASSERT_NE(iface, nullptr);
    EXPECT_EQ(manager.GetInterface(CitI::IID_IInterface), iface);
    EXPECT_EQ(manager.GetInterface(CommonI::IID_IRefCount), nullptr);
    EXPECT_EQ(iface->GetInterface(VnI::IID_ISelectionManager), nullptr);
    FakeResource a;
    iface->AddHighlightedItem(&a);
    EXPECT_EQ(Walk(iface->GetHighlightedItems()), (std::vector{R(a)}));
    iface->RemoveHighlightedItem(&a);
    EXPECT_FALSE(a.IsHighlighted());
    iface->AddHighlightedItem(&a);
    iface->RemoveAll();
    EXPECT_TRUE(Walk(iface->GetHighlightedItems()).empty());
}

TEST(HighlightManager, SlotOrderIsTheContract) {
    using VnI::IHighlightManager;
    using VnTest::SlotOf;
    EXPECT_EQ(SlotOf(&IHighlightManager::GetHighlightedItems), 3);
    EXPECT_EQ(SlotOf(&IHighlightManager::AddHighlightedItem), 4);
    EXPECT_EQ(SlotOf(&IHighlightManager::RemoveHighlightedItem), 5);
    EXPECT_EQ(SlotOf(&IHighlightManager::RemoveAll), 6);
}

TEST(HighlightManagerScale, AMillionResourcesRemovedInAnotherOrderStayQuick) {
    constexpr int kCount = 1000000;
    std::vector<std::unique_ptr<FakeResource>> resources(kCount);
    for (auto& r : resources) {
        r = std::make_unique<FakeResource>();
    }
    HighlightManager manager;
    for (auto& r : resources) {
        manager.AddHighlightedItem(r.get());
    }
    std::vector<int> order(kCount);
    std::iota(order.begin(), order.end(), 0);
    std::shuffle(order.begin(), order.end(), std::mt19937(777));
    for (int i : order) {
        manager.RemoveHighlightedItem(resources[static_cast<size_t>(i)].get());
    }
    EXPECT_TRUE(Walk(manager.GetHighlightedItems()).empty());
    EXPECT_FALSE(resources[42]->IsHighlighted());
}

TEST(ListIterators, SlotOrdersAreTheContract) {
    using VnI::IDeviceResourceItr;
    using VnI::IPropertyHolderItr;
    using VnTest::SlotOf;
    EXPECT_EQ(SlotOf(&IPropertyHolderItr::GetInterface), 0);
    EXPECT_EQ(SlotOf(&IPropertyHolderItr::CurrentItem), 3);
    EXPECT_EQ(SlotOf(&IPropertyHolderItr::First), 4);
    EXPECT_EQ(SlotOf(&IPropertyHolderItr::Next), 5);
    EXPECT_EQ(SlotOf(&IPropertyHolderItr::IsEnd), 6);
    EXPECT_EQ(SlotOf(&IDeviceResourceItr::GetInterface), 0);
    EXPECT_EQ(SlotOf(&IDeviceResourceItr::CurrentItem), 3);
    EXPECT_EQ(SlotOf(&IDeviceResourceItr::First), 4);
    EXPECT_EQ(SlotOf(&IDeviceResourceItr::Next), 5);
    EXPECT_EQ(SlotOf(&IDeviceResourceItr::IsEnd), 6);
    // The classes fill exactly those slots and add nothing virtual but their destructors.
    using Vn::Eng::DeviceResourceItr;
    using Vn::Eng::PropertyHolderItr;
    EXPECT_EQ(SlotOf(&PropertyHolderItr::GetInterface), 0);
    EXPECT_EQ(SlotOf(&PropertyHolderItr::CurrentItem), 3);
    EXPECT_EQ(SlotOf(&PropertyHolderItr::First), 4);
    EXPECT_EQ(SlotOf(&PropertyHolderItr::Next), 5);
    EXPECT_EQ(SlotOf(&PropertyHolderItr::IsEnd), 6);
    EXPECT_EQ(SlotOf(&PropertyHolderItr::Dump), -1);
    EXPECT_EQ(SlotOf(&DeviceResourceItr::GetInterface), 0);
    EXPECT_EQ(SlotOf(&DeviceResourceItr::CurrentItem), 3);
    EXPECT_EQ(SlotOf(&DeviceResourceItr::First), 4);
    EXPECT_EQ(SlotOf(&DeviceResourceItr::Next), 5);
    EXPECT_EQ(SlotOf(&DeviceResourceItr::IsEnd), 6);
    EXPECT_EQ(SlotOf(&DeviceResourceItr::Dump), -1);
    EXPECT_TRUE(std::has_virtual_destructor_v<PropertyHolderItr>);
    EXPECT_TRUE(std::has_virtual_destructor_v<DeviceResourceItr>);
}

TEST(ListIterators, WalkTheirListInPlace) {
    Vn::Eng::PropertyHolderList holders;
    auto it = Vn::Eng::PropertyHolderItr::CreateInstance(&holders);
    ASSERT_TRUE(it);
    EXPECT_TRUE(it->IsEnd());
    EXPECT_EQ(it->First(), 1);
    EXPECT_EQ(it->Next(), 1);
    EXPECT_EQ(it->CurrentItem(), nullptr);

    VnTest::FakeHolder a(1), b(1);
    holders.push_back(&a);
    it->First();
    holders.push_back(&b); // added ahead of the position: seen
    EXPECT_EQ(it->CurrentItem(), &a);
    it->Next();
    EXPECT_EQ(it->CurrentItem(), &b);
    it->Next();
    EXPECT_TRUE(it->IsEnd());
    it->Next();
    EXPECT_TRUE(it->IsEnd());

    auto none = Vn::Eng::PropertyHolderItr::CreateInstance(nullptr);
    ASSERT_TRUE(none);
    EXPECT_TRUE(none->IsEnd());
    EXPECT_EQ(none->First(), 1);
    EXPECT_EQ(none->CurrentItem(), nullptr);
    auto noResources = Vn::Eng::DeviceResourceItr::CreateInstance(nullptr);
    ASSERT_TRUE(noResources);
    EXPECT_TRUE(noResources->IsEnd());
}

TEST(ListIterators, AnswerTheirInterfacesAndCount) {
    Vn::Eng::DeviceResourceList list;
    auto it = Vn::Eng::DeviceResourceItr::CreateInstance(&list);
    ASSERT_TRUE(it);
    CitI::IInterface* counter = it->GetInterface(CommonI::IID_IRefCount);
    ASSERT_NE(counter, nullptr);
    EXPECT_NE(counter, static_cast<CitI::IInterface*>(it.Get()));
    EXPECT_EQ(it->GetInterface(CitI::IID_IInterface), it.Get());
    EXPECT_EQ(counter->GetInterface(VnI::IID_IDeviceResourceItr), it.Get());
    EXPECT_EQ(it->GetInterface(VnI::IID_IPropertyHolderItr), nullptr);
    int count = 0;
    static_cast<CommonI::IRefCount*>(counter)->GetRefCount(count);
    EXPECT_EQ(count, 1);
}

TEST(ListIterators, DumpNamesTheirMembers) {
    VnTest::MessageCapture capture;
    Vn::Eng::PropertyHolderList holders;
    Vn::Eng::PropertyHolderItr itr(&holders);
    itr.Dump();
    Vn::Eng::DeviceResourceList resources;
    Vn::Eng::DeviceResourceItr ritr(&resources);
    ritr.Dump();
    const auto lines = capture.Status();
    ASSERT_EQ(lines.size(), 4u);
    EXPECT_EQ(lines[0].rfind("Vn::Eng::PropertyHolderItr::m_imp->m_propertyHolders = ", 0), 0u);
    EXPECT_EQ(lines[1].rfind("Vn::Eng::PropertyHolderItr::m_imp->m_itr = ", 0), 0u);
    EXPECT_EQ(lines[2].rfind("Vn::Eng::DeviceResourceItr::m_imp->m_deviceResources = ", 0), 0u);
    EXPECT_EQ(capture.Messages()[0].revision, "$Revision: 1.3 $");
    EXPECT_EQ(capture.Messages()[2].revision, "$Revision: 1.2 $");
    EXPECT_EQ(capture.Messages()[2].unit, "../s/DeviceResourceItr");
}
