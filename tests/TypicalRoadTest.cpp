//===-- tests/TypicalRoadTest.cpp - a host's road: build, select, highlight, find again -===//
//
// The road a host takes: build device resources with properties from the factory, show
// them in a tree, select one with descent, highlight it, colour it, and find resources
// again among the selection.
//
//===------------------------------------------------------------------------------===//
#include "s/ColorManager.h"
#include "s/DeviceResource.h"
#include "s/FindItr.h"
#include "s/HighlightManager.h"
#include "s/PropertyFactory.h"
#include "s/PropertyNameList.h"
#include "s/SelectionManager.h"
#include "s/TreeNode.h"

#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <vector>

using CommonI::RefCountPtr;
using Str = Port::StringBase<char>;

namespace {

class Site final : public Vn::Eng::DeviceResource {
public:
    Site(VnI::IPropertyNameList* names, std::string name)
        : m_names(names), m_name(std::move(name)) {}
    Str GetName() override { return Str(m_name.c_str()); }
    VnI::IPropertyNameList* GetPropertyNames() override { return m_names; }
    Str GetTileName() const override { return Str("IO_T"); }
    std::int64_t GetLocation(int& x, int& y) const override {
        x = y = 0;
        return 1;
    }
    Str GetSiteType() const override { return Str("IO"); }

private:
    VnI::IPropertyNameList* m_names;
    std::string m_name;
};

RefCountPtr<VnI::IProperty> Adopt(VnI::IProperty* p) {
    return RefCountPtr<VnI::IProperty>::Adopt(p);
}

} // namespace

TEST(TypicalRoad, SelectHighlightColourAndFindAgainAmongTheSelection) {
    Vn::Eng::PropertyNameList schema;
    auto* names =
        static_cast<VnI::IPropertyNameList*>(schema.GetInterface(VnI::IID_IPropertyNameList));

    // 1. Resources with properties from the factory: a bank holding four pins.
    std::vector<std::unique_ptr<Site>> sites;
    for (int i = 0; i < 5; ++i) {
        sites.push_back(
            std::make_unique<Site>(names, i == 0 ? "bank0" : "pin" + std::to_string(i)));
        Site& site = *sites.back();
        EXPECT_EQ(site.GetType(), VnI::DEVICE_RESOURCE_HOLDER_TYPE);
        site.AddProperty(Str("Name"), Adopt(Vn::Eng::PropertyFactory::CreateStringProperty(
                                          site.GetName(), true)));
        site.AddProperty(Str("X"),
                         Adopt(Vn::Eng::PropertyFactory::CreateIntProperty(i * 10, true)));
    }

    // 2. A tree node for each resource: the bank's node holds the pins' nodes.
    std::vector<RefCountPtr<VnI::ITreeNode>> nodes;
    auto bankNode = Vn::Eng::TreeNode::CreateInstance(sites[0].get(), nullptr);
    for (size_t i = 1; i < sites.size(); ++i) {
        auto node = Vn::Eng::TreeNode::CreateInstance(sites[i].get(), bankNode);
        bankNode->AddChild(RefCountPtr<const VnI::ITreeNode>(node));
        EXPECT_EQ(sites[i]->GetParentTreeNode().Get(), node.Get()) << "the node told its holder";
    }

    {
        // 3. A click selects the bank, and with it the pins below its node.
        Vn::Eng::SelectionManager selection;
        selection.AddSelectedItem(sites[0].get(), true);
        for (auto& site : sites) {
            EXPECT_TRUE(site->IsSelected());
        }
        auto inCategory = selection.GetSelectedItems(VnI::DEVICE_RESOURCE_HOLDER_TYPE);
        int filed = 0;
        for (; !inCategory->IsEnd(); inCategory->Next()) {
            ++filed;
        }
        EXPECT_EQ(filed, 5);

        // 4. The view highlights the bank and colours it.
        Vn::Eng::HighlightManager highlight;
        auto* bank =
            static_cast<VnI::IDeviceResource*>(sites[0]->GetInterface(VnI::IID_IDeviceResource));
        highlight.AddHighlightedItem(bank);
        EXPECT_TRUE(bank->IsHighlighted());
        auto colour = Vn::Eng::ColorManager::GetTileSiteColor(Str("IO"));
        ASSERT_TRUE(colour) << "the shipped scheme colours IO tiles";
        EXPECT_EQ(colour.Get(), Vn::Eng::ColorManager::GetTileSiteColor(Str("IO")).Get());

        // 5. A search over the selection: the resources whose X is above 15.
        auto wanted = RefCountPtr<const VnI::IProperty>(
            Adopt(Vn::Eng::PropertyFactory::CreateIntProperty(15, true)));
        auto found = Vn::Eng::FindItr::CreateInstance(selection.GetAllSelectedItems(), Str("X"),
                                                      wanted, VnI::MATCH_GREATER);
        std::vector<std::string> names_found;
        for (; !found->IsEnd(); found->Next()) {
            names_found.push_back(found->CurrentItem()->GetName().str());
        }
        // Selection order is depth first from the bank; children come in the tree's order
        // (the last one added first).
        EXPECT_EQ(names_found, (std::vector<std::string>{"pin4", "pin3", "pin2"}));

        highlight.RemoveAll();
        selection.RemoveAll();
    }
    EXPECT_FALSE(sites[0]->IsSelected());
}
