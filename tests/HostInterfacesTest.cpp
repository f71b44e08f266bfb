//===-- tests/HostInterfacesTest.cpp - host identifiers and slot orders are the published -===//
//
// The lookup and the sample host share these headers, so a mistyped identifier or a
// reordered operation would pass every end-to-end test and still fail against the
// real host. Here each identifier is compared with its published text, and slots with
// the published order.
//
//===------------------------------------------------------------------------------===//
#include "Slots.h"
#include "hostproj/Dpm.h"
#include "hostproj/IProject.h"
#include "hostproj/Prjrep.h"
#include "hostproj/TaskHelper.h"

#include <gtest/gtest.h>

#include <cstddef>
#include <cstdint>
#include <set>
#include <string>
#include <utility>
#include <vector>

TEST(HostInterfaces, IdentifiersAreThePublishedOnesAndAllDiffer) {
    const std::vector<std::pair<Port::XUID, const char*>> ids = {
        {Dpm::CLSID_ProjectHelper(), "0725C3D2-5E9B-4383-A7B6-A80C932EAC21"},
        {Dpm::IProjectHelper::IID(), "6002C9FE-BB9B-4ED7-9B78-D59CF0C04B07"},
        {Dpm::IProjectCompReference::IID(), "C9B69CBC-0D15-4CC4-A24D-F403F60D77FD"},
        {Dpm::IViewNetworkHelp::IID(), "25A9E219-6655-4851-AF5A-A3069D2A111F"},
        {Dpm::IView::IID(), "7712A3E4-8429-449A-A82C-B7A1B78F3863"},
        {IProject::IID(), "155462E3-6B65-42E1-94AB-FC281C0EF860"},
        {Dpm::IDefDataId::IID(), "05E2C73F-A5B3-4A0B-9AB1-9229002413CB"},
        {Dpm::IDataIdentity::IID(), "02C092B4-7972-4BBE-8340-B370F411CC8F"},
        {Dpm::IDesignUnitFile::IID(), "09411137-6791-4986-AA3C-43609908D0C7"},
        {Prjrep::IIterator::IID(), "7CE0B9F0-61A2-4F29-9C4F-1D53872FC7B4"},
        {Prjrep::IRefCount::IID(), "80B45FAF-A340-43E6-B60B-0435FADEA5F3"},
        {Dpm::IDesignUnitIterator::IID(), "2DF348FB-EB95-40CF-A1AE-08F387FB385B"},
        {Dpm::IDesignUnitType::IID(), "2FC4E309-B903-4126-BF81-94B55ED286ED"},
        {Dpm::IHdlFile::IID(), "7D72019D-90EF-4E4E-BCD9-A41DD3783D3F"},
        {Dpm::IViewType::IID(), "9FC9C959-67CF-44CC-B2AA-CFFF3178C051"},
        {Dpm::ITransformBindingInstanceSet::IID(), "5D668616-2130-473F-87CA-0293AEC8F386"},
        {Dpm::ITransformBindingInstanceIterator::IID(), "51847251-BCBB-4505-86F6-4E33635FEBED"},
        {HostTask::CLSID_TaskHelper, "7D528480-1196-4635-ABA9-639446E4AA59"},
        {HostTask::IID_ITaskHelper, "D611A294-6A12-4BE0-8167-5590BEB51670"},
    };
    std::set<std::string> seen;
    for (const auto& [id, text] : ids) {
        EXPECT_EQ(id.ToString(), text);
        EXPECT_TRUE(seen.insert(id.ToString()).second) << text << " used twice";
    }
}

TEST(HostInterfaces, OperationsSitInTheirPublishedSlots) {
    using VnTest::SlotOf;
    EXPECT_EQ(SlotOf(&Prjrep::IRefCount::AddRef), 3);
    EXPECT_EQ(SlotOf(&Prjrep::IRefCount::Release), 4);
    for (const auto& slots :
         {std::vector<std::ptrdiff_t>{
              SlotOf(&Prjrep::IIterator::CurrentItem), SlotOf(&Prjrep::IIterator::First),
              SlotOf(&Prjrep::IIterator::Next), SlotOf(&Prjrep::IIterator::IsEnd)},
          {SlotOf(&Dpm::IDesignUnitIterator::CurrentItem), SlotOf(&Dpm::IDesignUnitIterator::First),
           SlotOf(&Dpm::IDesignUnitIterator::Next), SlotOf(&Dpm::IDesignUnitIterator::IsEnd)},
          {SlotOf(&Dpm::ITransformBindingInstanceIterator::CurrentItem),
           SlotOf(&Dpm::ITransformBindingInstanceIterator::First),
           SlotOf(&Dpm::ITransformBindingInstanceIterator::Next),
           SlotOf(&Dpm::ITransformBindingInstanceIterator::IsEnd)}}) {
        EXPECT_EQ(slots, (std::vector<std::ptrdiff_t>{3, 4, 5, 6}));
    }
    EXPECT_EQ(SlotOf(&Dpm::IDataIdentity::GetName), 3);
    EXPECT_EQ(SlotOf(&Dpm::IDataIdentity::GetIdText), 4);
    EXPECT_EQ(SlotOf(&Dpm::IView::GetViewType), 3);
    EXPECT_EQ(SlotOf(&Dpm::IView::GetTransformBindingInstances), 4);
    EXPECT_EQ(SlotOf(&Dpm::IViewNetworkHelp::GetViewNetwork), 3);
    EXPECT_EQ(SlotOf(&Dpm::IViewNetworkHelp::GetDesignUnits), 4);
}

namespace {

// A host object that counts through one interface only, or none.
class Counted final : public Dpm::IViewType {
public:
    enum class Via { Prjrep, Common, Nothing };
    explicit Counted(Via via) : m_via(via), m_prjrep(this), m_common(this) {}
    CitI::IInterface* GetInterface(const Port::XUID& id) override {
        if (id == Prjrep::IRefCount::IID() && m_via == Via::Prjrep) {
            return &m_prjrep;
        }
        if (id == CommonI::IID_IRefCount && m_via != Via::Nothing) {
            return &m_common; // answered by both kinds: the Prjrep counter must win
        }
        return id == Dpm::IViewType::IID() ? this : nullptr;
    }
    int prjrepReleases = 0;
    int commonReleases = 0;

private:
    struct PrjrepCounter final : Prjrep::IRefCount {
        explicit PrjrepCounter(Counted* owner) : m_owner(owner) {}
        CitI::IInterface* GetInterface(const Port::XUID& id) override {
            return m_owner->GetInterface(id);
        }
        std::int64_t AddRef() override { return 1; }
        std::int64_t Release() override {
            ++m_owner->prjrepReleases;
            return 1;
        }
        Counted* m_owner;
    };
    struct CommonCounter final : CommonI::IRefCount {
        explicit CommonCounter(Counted* owner) : m_owner(owner) {}
        CitI::IInterface* GetInterface(const Port::XUID& id) override {
            return m_owner->GetInterface(id);
        }
        std::int64_t AddRef() override { return 1; }
        std::int64_t Release() override {
            ++m_owner->commonReleases;
            return 1;
        }
        std::int64_t GetRefCount(int& count) override {
            count = 1;
            return 1;
        }
        Counted* m_owner;
    };
    Via m_via;
    PrjrepCounter m_prjrep;
    CommonCounter m_common;
};

} // namespace

TEST(HostInterfaces, AutoReleaseReleasesOnceThroughThePreferredCounterAndAutoCastNever) {
    Counted both(Counted::Via::Prjrep), common(Counted::Via::Common),
        neither(Counted::Via::Nothing);
    {
        Prjrep::AutoRelease<CitI::IInterface> a(&both);
        Prjrep::AutoRelease<CitI::IInterface> b(&common);
        Prjrep::AutoRelease<CitI::IInterface> c(&neither); // nothing to call: no crash
        Prjrep::AutoCast<Dpm::IViewType> view(a);
        EXPECT_EQ(view.Get(), static_cast<CitI::IInterface*>(&both));
        Prjrep::AutoCast<Dpm::IViewType> again(view);
        EXPECT_TRUE(again);
        EXPECT_FALSE(Prjrep::AutoCast<Dpm::IHdlFile>(a)) << "a view type is no file";
        EXPECT_FALSE(Prjrep::AutoCast<Dpm::IViewType>(static_cast<CitI::IInterface*>(nullptr)));
    }
    EXPECT_EQ(both.prjrepReleases, 1);
    EXPECT_EQ(both.commonReleases, 0);
    EXPECT_EQ(common.commonReleases, 1);

    Prjrep::AutoRelease<CitI::IInterface> slot(&both);
    slot.Receive() = &common; // the held object is released before the slot is handed out
    EXPECT_EQ(both.prjrepReleases, 2);
    Prjrep::AutoRelease<CitI::IInterface> moved(std::move(slot));
    moved.Reset();
    EXPECT_EQ(common.commonReleases, 2);
}
