//===-- tests/DeviceResourceTest.cpp - resources and generic holders keep type, flags, slots -===//
#include "MessageCapture.h"
#include "Slots.h"

#include "s/DeviceResource.h"
#include "s/GenericDataModel.h"
#include "s/GenericPropertyHolder.h"
#include "s/PropertyFactory.h"
#include "s/PropertyNameList.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

using CommonI::RefCountPtr;
using Port::StringBase;
using Vn::Eng::DeviceResource;
using Vn::Eng::GenericPropertyHolder;
using VnI::IDeviceResource;
using VnI::IProperty;

namespace {

// A concrete resource as the host writes one.
class Pad final : public DeviceResource {
public:
    StringBase<char> GetName() override { return "AB12"; }
    VnI::IPropertyNameList* GetPropertyNames() override { return nullptr; }
    StringBase<char> GetTileName() const override { return "IOB_X0Y12"; }
    std::int64_t GetLocation(int& x, int& y) const override {
        x = 0;
        y = 12;
        return 1;
    }
    StringBase<char> GetSiteType() const override { return "IOB"; }
};

RefCountPtr<IProperty> Int(int value) {
    return RefCountPtr<IProperty>::Adopt(Vn::Eng::PropertyFactory::CreateIntProperty(value, true));
}

} // namespace

// Hosts file and compare holders by these numbers; a renumbering breaks every host.
static_assert(VnI::DEVICE_RESOURCE_HOLDER_TYPE == 7 && VnI::GENERIC_HOLDER_TYPE == 11);

TEST(DeviceResource, IsAHolderOfTypeSevenAndStartsUnhighlighted) {
    Pad pad;
    VnI::IPropertyHolder* holder = &pad;
    EXPECT_EQ(holder->GetType(), VnI::DEVICE_RESOURCE_HOLDER_TYPE);
    EXPECT_FALSE(pad.IsHighlighted());
    EXPECT_FALSE(pad.IsSelected());
    EXPECT_EQ(pad.GetNumProperties(), 0);
    EXPECT_EQ(pad.GetHighlightColor(), nullptr);
}

TEST(DeviceResource, TheHighlightedFlagIsOneThroughClassAndInterface) {
    Pad pad;
    auto* resource = static_cast<IDeviceResource*>(pad.GetInterface(VnI::IID_IDeviceResource));
    ASSERT_NE(resource, nullptr);
    EXPECT_EQ(pad.SetHighlighted(true), 1);
    EXPECT_TRUE(resource->IsHighlighted());
    EXPECT_EQ(resource->SetHighlighted(false), 1);
    EXPECT_FALSE(pad.IsHighlighted());
    EXPECT_EQ(resource->GetHighlightColor(), nullptr);
}

TEST(DeviceResource, TheInterfaceForwardsTheDeviceOperations) {
    Pad pad;
    auto* resource = static_cast<IDeviceResource*>(pad.GetInterface(VnI::IID_IDeviceResource));
    EXPECT_EQ(resource->GetTileName(), StringBase<char>("IOB_X0Y12"));
    EXPECT_EQ(resource->GetSiteType(), StringBase<char>("IOB"));
    int x = -1, y = -1;
    EXPECT_EQ(resource->GetLocation(x, y), 1);
    EXPECT_EQ(y, 12);
}

TEST(DeviceResource, AnswersTheHolderAndItsInterfaceObject) {
    Pad pad;
    CitI::IInterface* holder = static_cast<VnI::IPropertyHolder*>(&pad);
    CitI::IInterface* object = pad.GetInterface(VnI::IID_IDeviceResource);
    ASSERT_NE(object, nullptr);
    EXPECT_NE(object, holder);
    EXPECT_EQ(pad.GetInterface(CitI::IID_IInterface), object);
    EXPECT_EQ(pad.GetInterface(VnI::IID_IPropertyHolder), holder);
    for (CitI::IInterface* from : {holder, object}) {
        EXPECT_EQ(from->GetInterface(VnI::IID_IPropertyHolder), holder);
        EXPECT_EQ(from->GetInterface(VnI::IID_IDeviceResource), object);
        EXPECT_EQ(from->GetInterface(CitI::IID_IInterface), object);
        EXPECT_EQ(from->GetInterface(CommonI::IID_IRefCount), nullptr);
        EXPECT_EQ(from->GetInterface(VnI::IID_IDataModel), nullptr);
    }
}

TEST(DeviceResource, DumpPrintsNothing) {
    VnTest::MessageCapture capture;
    Pad pad;
    pad.Dump();
    EXPECT_TRUE(capture.Messages().empty());
}

TEST(DeviceResource, SlotOrdersAreTheContract) {
    using VnTest::SlotOf;
    using ShortAdd =
        std::int64_t (DeviceResource::*)(const StringBase<char>&, const RefCountPtr<IProperty>&);
    EXPECT_EQ(SlotOf(&DeviceResource::GetType), 15);
    EXPECT_EQ(SlotOf(static_cast<ShortAdd>(&DeviceResource::AddProperty)), 16);
    EXPECT_EQ(SlotOf(&DeviceResource::GetTileName), 17);
    EXPECT_EQ(SlotOf(&DeviceResource::GetLocation), 18);
    EXPECT_EQ(SlotOf(&DeviceResource::GetSiteType), 19);
    EXPECT_EQ(SlotOf(&DeviceResource::IsHighlighted), 20);
    EXPECT_EQ(SlotOf(&DeviceResource::GetHighlightColor), 21);
    EXPECT_EQ(SlotOf(&DeviceResource::SetHighlighted), 22);

    EXPECT_EQ(SlotOf(&IDeviceResource::GetInterface), 0);
    EXPECT_EQ(SlotOf(&IDeviceResource::GetTileName), 3);
    EXPECT_EQ(SlotOf(&IDeviceResource::GetLocation), 4);
    EXPECT_EQ(SlotOf(&IDeviceResource::GetSiteType), 5);
    EXPECT_EQ(SlotOf(&IDeviceResource::SetHighlighted), 6);
    EXPECT_EQ(SlotOf(&IDeviceResource::IsHighlighted), 7);
    EXPECT_EQ(SlotOf(&IDeviceResource::GetHighlightColor), 8);
}

TEST(GenericPropertyHolder, StartsEmptyAndNamelessAsTypeEleven) {
    GenericPropertyHolder holder;
    EXPECT_EQ(holder.GetType(), VnI::GENERIC_HOLDER_TYPE);
    EXPECT_EQ(holder.GetName(), StringBase<char>());
    EXPECT_EQ(holder.GetDisplayName(), StringBase<char>());
    ASSERT_NE(holder.GetPropertyNames(), nullptr);
    EXPECT_EQ(holder.GetPropertyNames()->GetNumNames(), 0);
    EXPECT_EQ(holder.GetInterface(VnI::IID_IPropertyHolder),
              static_cast<VnI::IPropertyHolder*>(&holder));
    EXPECT_EQ(holder.GetInterface(VnI::IID_IPropertyNameList), nullptr);
}

TEST(GenericPropertyHolder, EachHolderGrowsAListOfItsOwn) {
    GenericPropertyHolder first, second;
    auto note = Int(4);
    EXPECT_EQ(first.AddProperty("Note", note), 1);
    EXPECT_EQ(first.GetPropertyNames()->GetNumNames(), 1);
    EXPECT_EQ(first.GetPropertyNames()->Contains("Note"), 0);
    EXPECT_EQ(note->GetIndex(), 0);

    second.AddProperty("Other", Int(1));
    second.AddProperty("Note", Int(2));
    const auto secondNote = second.GetPropertyByName("Note");
    ASSERT_TRUE(secondNote);
    EXPECT_EQ(secondNote->GetIndex(), 1);
    EXPECT_EQ(first.GetPropertyNames()->GetNumNames(), 1);
    EXPECT_NE(first.GetPropertyNames(), second.GetPropertyNames());
}

TEST(GenericPropertyHolder, TakesAtMost128Names) {
    GenericPropertyHolder holder;
    for (int i = 0; i < 128; ++i) {
        ASSERT_EQ(holder.AddProperty(StringBase<char>(("N" + std::to_string(i)).c_str()), Int(i)),
                  1)
            << i;
    }
    EXPECT_EQ(holder.AddProperty("N128", Int(128)), 0);
    EXPECT_EQ(holder.GetNumProperties(), 128);
    EXPECT_EQ(holder.GetPropertyNames()->GetNumNames(), 128) << "the list is left alone";
    const auto last = holder.GetPropertyByName("N127");
    ASSERT_TRUE(last);
    EXPECT_EQ(last->GetIndex(), 127);
    // Names already listed are still replaced at the limit.
    EXPECT_EQ(holder.AddProperty("N127", Int(-1)), 1);
    EXPECT_EQ(last->GetIndex(), -1);
    // A name someone else put at position 128 cannot hold a property either.
    ASSERT_EQ(holder.GetPropertyNames()->AddName("Late", VnI::INT_TYPE, true), 128);
    EXPECT_EQ(holder.AddProperty("Late", Int(0)), 0);
    EXPECT_EQ(holder.GetPropertyByName("Late"), nullptr);
}

// The holder finds or adds a name in one step on its own list; what it stores, and what
// the list learns, must be what any holder's AddProperty gives.
TEST(GenericPropertyHolder, AddsReplacesAndListsAsEveryHolderDoes) {
    GenericPropertyHolder holder;
    VnI::IPropertyNameList* names = holder.GetPropertyNames();
    EXPECT_EQ(holder.AddProperty("Bank", RefCountPtr<IProperty>()), 0);
    EXPECT_EQ(names->GetNumNames(), 0);

    auto first = Int(1);
    auto second = Int(2);
    ASSERT_EQ(holder.AddProperty("Spare", first, false), 1);
    ASSERT_EQ(holder.AddProperty("Spare", second, true), 1);
    EXPECT_EQ(first->GetIndex(), -1);
    EXPECT_EQ(second->GetIndex(), 0);
    EXPECT_EQ(holder.GetNumProperties(), 1);
    ASSERT_NE(names->GetPropertyName(0), nullptr);
    EXPECT_FALSE(names->GetPropertyName(0)->IsVisible()) << "visibility is the first add's";
    EXPECT_EQ(holder.AddProperty("Spare", second), 1) << "the same object again";
    EXPECT_EQ(second->GetIndex(), 0);
    EXPECT_EQ(holder.GetNumProperties(), 1);

    std::vector<StringBase<char>> standards{"LVCMOS33", "LVDS"};
    ASSERT_EQ(holder.AddProperty("Standard", RefCountPtr<IProperty>::Adopt(
                                                 Vn::Eng::PropertyFactory::CreateEnumProperty(
                                                     standards, "LVDS", true))),
              1);
    VnI::IPropertyName* standard = names->GetPropertyName(1);
    ASSERT_NE(standard, nullptr);
    EXPECT_EQ(standard->GetType(), VnI::ENUM_TYPE);
    std::vector<std::string> values;
    auto it = standard->GetPossibleValues();
    for (it->First(); !it->IsEnd(); it->Next()) {
        values.push_back(it->CurrentItem().str());
    }
    EXPECT_EQ(values, (std::vector<std::string>{"LVCMOS33", "LVDS"}));

    // Names added after the list made its name objects go through the same step.
    ASSERT_EQ(holder.AddProperty("Drive", Int(8)), 1);
    EXPECT_EQ(names->Contains("Drive"), 2);
    ASSERT_NE(names->GetPropertyName(2), nullptr);
    EXPECT_EQ(names->GetPropertyName(2)->GetType(), VnI::INT_TYPE);
    EXPECT_EQ(holder.GetPropertyByName("Drive")->GetIntProperty(), 8);
    EXPECT_EQ(holder.GetNumProperties(), 3);
}

namespace {

// A holder derived from the generic one that files its properties under a shared schema.
class SchemaHolder final : public GenericPropertyHolder {
public:
    explicit SchemaHolder(Vn::Eng::PropertyNameList& schema)
        : m_schema(static_cast<VnI::IPropertyNameList*>(
              schema.GetInterface(VnI::IID_IPropertyNameList))) {}
    VnI::IPropertyNameList* GetPropertyNames() override { return m_schema; }

private:
    VnI::IPropertyNameList* m_schema;
};

} // namespace

TEST(GenericPropertyHolder, ADerivedHolderStoresUnderTheListItAnswers) {
    Vn::Eng::PropertyNameList schema;
    schema.AddName("Bank", VnI::INT_TYPE, true);
    SchemaHolder holder(schema);
    ASSERT_EQ(holder.AddProperty("Pin", Int(3)), 1);
    EXPECT_EQ(schema.Contains("Pin"), 1);
    EXPECT_EQ(holder.GetPropertyByName("Pin")->GetIndex(), 1);
    EXPECT_EQ(holder.GenericPropertyHolder::GetPropertyNames()->GetNumNames(), 0);
}

namespace {

// The host supplies the two operations the generic model leaves open.
class OneTypeModel final : public Vn::Eng::GenericDataModel {
public:
    int GetNumTypes() const override { return 1; }
    RefCountPtr<VnI::IPropertyHolderItr> GetHolders(int) override { return nullptr; }
};

} // namespace

TEST(GenericDataModel, AnswersEveryQuestionWithAnEmptyResult) {
    OneTypeModel model;
    for (int type : {-1, 0, VnI::DEVICE_RESOURCE_HOLDER_TYPE, VnI::GENERIC_HOLDER_TYPE}) {
        EXPECT_EQ(model.GetPropertyNames(type), nullptr);
        EXPECT_EQ(model.GetTypeName(type), StringBase<char>());
        EXPECT_EQ(model.Find(type, "Bank", Int(3), VnI::MATCH_ANY), nullptr);
    }
    EXPECT_EQ(model.Find(VnI::DEVICE_RESOURCE_HOLDER_TYPE, "", nullptr, 0), nullptr);
}

TEST(GenericDataModel, AnswersItsDataModelPartOnly) {
    OneTypeModel model;
    VnI::IDataModel* part = &model;
    EXPECT_EQ(model.GetInterface(VnI::IID_IDataModel), part);
    EXPECT_EQ(model.GetInterface(CitI::IID_IInterface), part);
    EXPECT_EQ(part->GetInterface(VnI::IID_IDataModel), part);
    EXPECT_EQ(model.GetInterface(CommonI::IID_IRefCount), nullptr);
    EXPECT_EQ(model.GetInterface(VnI::IID_IPropertyHolder), nullptr);
    // Deleting through the interface reaches the whole model.
    VnI::IDataModel* owned = new OneTypeModel();
    delete owned;
}

TEST(GenericDataModel, SlotOrderIsTheContract) {
    using VnI::IDataModel;
    using VnTest::SlotOf;
    EXPECT_EQ(SlotOf(&IDataModel::GetInterface), 0);
    EXPECT_EQ(SlotOf(&IDataModel::GetPropertyNames), 3);
    EXPECT_EQ(SlotOf(&IDataModel::GetTypeName), 4);
    EXPECT_EQ(SlotOf(&IDataModel::GetNumTypes), 5);
    EXPECT_EQ(SlotOf(&IDataModel::GetHolders), 6);
    EXPECT_EQ(SlotOf(&IDataModel::Find), 7);
}
