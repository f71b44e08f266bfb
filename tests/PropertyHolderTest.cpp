//===-- tests/PropertyHolderTest.cpp - holders keep each property in its name's slot -===//
#include "MessageCapture.h"
#include "Slots.h"

#include "s/PropertyFactory.h"
#include "s/PropertyHolder.h"
#include "s/PropertyItr.h"
#include "s/PropertyNameList.h"
#include "s/TreeNode.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

using CommonI::RefCountPtr;
using Port::StringBase;
using Vn::Eng::PropertyFactory;
using Vn::Eng::PropertyHolder;
using Vn::Eng::PropertyNameList;
using VnI::IProperty;

namespace {

// A holder of the host's kind: its schema is a list it shares with others of its kind.
class Pin final : public PropertyHolder {
public:
    explicit Pin(PropertyNameList* schema)
        : m_names(schema != nullptr ? static_cast<VnI::IPropertyNameList*>(
                                          schema->GetInterface(VnI::IID_IPropertyNameList))
                                    : nullptr) {}
    StringBase<char> GetName() override { return "P1"; }
    VnI::IPropertyNameList* GetPropertyNames() override { return m_names; }
    int GetType() const override { return 2; }

private:
    VnI::IPropertyNameList* m_names;
};

RefCountPtr<IProperty> Int(int value, bool visible = true) {
    return RefCountPtr<IProperty>::Adopt(PropertyFactory::CreateIntProperty(value, visible));
}
RefCountPtr<IProperty> Text(const char* value) {
    return RefCountPtr<IProperty>::Adopt(PropertyFactory::CreateStringProperty(value, true));
}

int CountOf(CitI::IInterface* p) {
    int count = -1;
    static_cast<CommonI::IRefCount*>(p->GetInterface(CommonI::IID_IRefCount))->GetRefCount(count);
    return count;
}

std::vector<IProperty*> Shown(PropertyHolder& holder) {
    std::vector<IProperty*> out;
    auto it = holder.GetProperties();
    for (it->First(); !it->IsEnd(); it->Next()) {
        out.push_back(it->CurrentItem().Get());
    }
    return out;
}

// The slot count that Dump reports on its second line.
int DumpedSlots(const PropertyHolder& holder) {
    VnTest::MessageCapture capture;
    holder.Dump();
    const std::string& text = capture.Messages().at(1).text;
    return std::stoi(text.substr(text.rfind('=') + 1));
}

} // namespace

TEST(PropertyHolder, StoresUnderANewNameAndAppendsItToTheList) {
    PropertyNameList schema;
    Pin pin(&schema);
    auto bank = Int(12);
    EXPECT_EQ(pin.AddProperty("Bank", bank, false), 1);
    EXPECT_EQ(pin.AddProperty("Site", Text("A3"), true), 1);
    EXPECT_EQ(schema.GetNumNames(), 2);
    EXPECT_EQ(schema.Contains("Bank"), 0);
    ASSERT_NE(schema.GetPropertyName(0), nullptr);
    ASSERT_NE(schema.GetPropertyName(1), nullptr);
    EXPECT_EQ(schema.GetPropertyName(0)->GetType(), VnI::INT_TYPE);
    EXPECT_FALSE(schema.GetPropertyName(0)->IsVisible());
    EXPECT_EQ(schema.GetPropertyName(1)->GetType(), VnI::STRING_TYPE);
    EXPECT_TRUE(schema.GetPropertyName(1)->IsVisible());
    EXPECT_EQ(bank->GetIndex(), 0);
    const auto site = pin.GetPropertyByName("Site");
    ASSERT_TRUE(site);
    EXPECT_EQ(site->GetIndex(), 1);
    EXPECT_EQ(pin.GetNumProperties(), 2);
    EXPECT_EQ(pin.GetPropertyByName("Bank").Get(), bank.Get());
    EXPECT_EQ(CountOf(bank.Get()), 2);
    EXPECT_EQ(pin.GetPropertyByName("bank"), nullptr) << "names are case-sensitive";
}

TEST(PropertyHolder, AnEnumeratedPropertyHandsItsValuesToTheList) {
    PropertyNameList schema;
    Pin pin(&schema);
    std::vector<StringBase<char>> standards{"LVCMOS33", "LVDS"};
    pin.AddProperty("Standard", RefCountPtr<IProperty>::Adopt(
                                    PropertyFactory::CreateEnumProperty(standards, "LVDS", true)));
    VnI::IPropertyName* name = schema.GetPropertyName(0);
    ASSERT_NE(name, nullptr);
    EXPECT_EQ(name->GetType(), VnI::ENUM_TYPE);
    std::vector<std::string> values;
    auto it = name->GetPossibleValues();
    for (it->First(); !it->IsEnd(); it->Next()) {
        values.push_back(it->CurrentItem().str());
    }
    EXPECT_EQ(values, (std::vector<std::string>{"LVCMOS33", "LVDS"}));
}

TEST(PropertyHolder, ReplacingKeepsTheCountAndRetiresTheOldProperty) {
    PropertyNameList schema;
    Pin pin(&schema);
    auto first = Int(1);
    auto second = Int(2);
    pin.AddProperty("Bank", first, true);
    EXPECT_EQ(pin.AddProperty("Bank", second, false), 1);
    EXPECT_EQ(first->GetIndex(), -1);
    EXPECT_EQ(CountOf(first.Get()), 1) << "the holder let go of it";
    EXPECT_EQ(second->GetIndex(), 0);
    EXPECT_EQ(pin.GetNumProperties(), 1);
    ASSERT_NE(schema.GetPropertyName(0), nullptr);
    EXPECT_TRUE(schema.GetPropertyName(0)->IsVisible()) << "visibility is the first add's";
    EXPECT_EQ(pin.GetPropertyByName("Bank").Get(), second.Get());

    // The same object again stays stored once; dropping the caller's reference first
    // proves the holder never lets go of it on the way.
    IProperty* raw = second.Get();
    EXPECT_EQ(pin.AddProperty("Bank", second), 1);
    second.Reset();
    EXPECT_EQ(pin.GetNumProperties(), 1);
    EXPECT_EQ(CountOf(raw), 1);
    EXPECT_EQ(raw->GetIndex(), 0);
}

TEST(PropertyHolder, RefusesANullPropertyAndWorksWithoutANameList) {
    PropertyNameList schema;
    Pin pin(&schema);
    EXPECT_EQ(pin.AddProperty("Bank", nullptr, true), 0);
    EXPECT_EQ(schema.GetNumNames(), 0);
    EXPECT_EQ(pin.GetNumProperties(), 0);
    EXPECT_EQ(DumpedSlots(pin), 0);

    Pin schemaless(nullptr);
    auto p = Int(3);
    EXPECT_EQ(schemaless.AddProperty("Bank", p), 0);
    EXPECT_EQ(p->GetIndex(), -1);
    EXPECT_EQ(schemaless.RemoveProperty("Bank"), 0);
    EXPECT_EQ(schemaless.GetPropertyByName("Bank"), nullptr);
    EXPECT_EQ(schemaless.GetNumProperties(), 0);
    EXPECT_TRUE(Shown(schemaless).empty());
}

TEST(PropertyHolder, TheShortAddIsVisibleAndTheLongOneKeepsItsFlag) {
    PropertyNameList schema;
    Pin pin(&schema);
    pin.AddProperty("Shown", Int(1));
    pin.AddProperty("Hidden", Int(2), false);
    ASSERT_NE(schema.GetPropertyName(0), nullptr);
    ASSERT_NE(schema.GetPropertyName(1), nullptr);
    EXPECT_TRUE(schema.GetPropertyName(0)->IsVisible());
    EXPECT_FALSE(schema.GetPropertyName(1)->IsVisible());
}

TEST(PropertyHolder, RemovingEmptiesTheSlotAndKeepsTheName) {
    PropertyNameList schema;
    Pin pin(&schema);
    auto bank = Int(5);
    pin.AddProperty("Bank", bank);
    pin.AddProperty("Site", Text("A3"));
    EXPECT_EQ(pin.RemoveProperty("Nowhere"), 1);
    EXPECT_EQ(pin.GetNumProperties(), 2);
    EXPECT_EQ(schema.GetNumNames(), 2) << "an unknown name is not added by a removal";

    EXPECT_EQ(pin.RemoveProperty("Bank"), 1);
    EXPECT_EQ(pin.GetNumProperties(), 1);
    EXPECT_EQ(bank->GetIndex(), -1);
    EXPECT_EQ(CountOf(bank.Get()), 1);
    EXPECT_EQ(pin.GetPropertyByName("Bank"), nullptr);
    EXPECT_EQ(schema.Contains("Bank"), 0);
    EXPECT_EQ(pin.RemoveProperty("Bank"), 1);
    EXPECT_EQ(pin.GetNumProperties(), 1) << "an empty slot is not counted twice";
    EXPECT_EQ(DumpedSlots(pin), 2) << "the dump counts slots, empty or not";
}

TEST(PropertyHolder, HoldersSharingAListKeepTheirOwnSlots) {
    PropertyNameList schema;
    Pin first(&schema), second(&schema);
    first.AddProperty("Bank", Int(1));
    second.AddProperty("Bank", Int(2));
    first.AddProperty("Site", Text("A3"));
    EXPECT_EQ(second.GetPropertyByName("Site"), nullptr) << "beyond the second's slots";
    EXPECT_EQ(second.RemoveProperty("Site"), 1);
    EXPECT_EQ(DumpedSlots(second), 1);
    auto site = Text("B7");
    second.AddProperty("Site", site);
    EXPECT_EQ(second.GetPropertyByName("Site").Get(), site.Get());
    EXPECT_EQ(site->GetIndex(), 1);
    const auto firstSite = first.GetPropertyByName("Site");
    ASSERT_TRUE(firstSite);
    EXPECT_EQ(firstSite->GetStringProperty(), StringBase<char>("A3"));
}

TEST(PropertyHolder, SlotsFollowTheNameListsLengthAsItGrows) {
    PropertyNameList schema;
    for (const char* name : {"A", "B", "C"}) {
        schema.AddName(name, VnI::INT_TYPE, true);
    }
    Pin pin(&schema);
    pin.AddProperty("B", Int(1));
    EXPECT_EQ(DumpedSlots(pin), 3);
    for (int i = 3; i < 17; ++i) {
        pin.AddProperty(StringBase<char>(("N" + std::to_string(i)).c_str()), Int(i));
    }
    EXPECT_EQ(DumpedSlots(pin), 17);
    EXPECT_EQ(pin.GetNumProperties(), 15);
    const auto n16 = pin.GetPropertyByName("N16");
    ASSERT_TRUE(n16);
    EXPECT_EQ(n16->GetIndex(), 16);
}

TEST(PropertyHolder, RefusesNamesBeyondWhatAnIndexCanHold) {
    PropertyNameList schema;
    for (int i = 0; i < 127; ++i) {
        schema.AddName(StringBase<char>(("N" + std::to_string(i)).c_str()), VnI::INT_TYPE, true);
    }
    Pin pin(&schema);
    auto last = Int(127);
    EXPECT_EQ(pin.AddProperty("Last", last), 1);
    EXPECT_EQ(last->GetIndex(), 127);
    auto beyond = Int(128);
    EXPECT_EQ(pin.AddProperty("Beyond", beyond), 0);
    EXPECT_EQ(schema.GetNumNames(), 128) << "the name list is left alone";
    EXPECT_EQ(beyond->GetIndex(), -1);
    EXPECT_EQ(pin.GetNumProperties(), 1);

    // A name some other party put at position 128 cannot hold a property either.
    schema.AddName("Late", VnI::INT_TYPE, true);
    EXPECT_EQ(pin.AddProperty("Late", beyond), 0);
    EXPECT_EQ(pin.GetPropertyByName("Late"), nullptr);
    EXPECT_EQ(pin.GetPropertyByName("Last").Get(), last.Get());
}

TEST(PropertyHolder, ReleasesItsPropertiesAndItsNodeWhenDestroyed) {
    PropertyNameList schema;
    auto kept = Int(7);
    RefCountPtr<VnI::ITreeNode> node;
    {
        Pin pin(&schema);
        pin.AddProperty("Bank", kept);
        node = Vn::Eng::TreeNode::CreateInstance(&pin, nullptr);
        EXPECT_EQ(CountOf(kept.Get()), 2);
        EXPECT_EQ(CountOf(node.Get()), 2);
    }
    EXPECT_EQ(CountOf(kept.Get()), 1);
    EXPECT_EQ(kept->GetIndex(), 0) << "a dying holder leaves indexes alone";
    EXPECT_EQ(CountOf(node.Get()), 1);
    EXPECT_EQ(node->GetDataRef(), nullptr);
}

TEST(PropertyHolder, KeepsTheSelectedFlagAndTheTreeNode) {
    Pin pin(nullptr);
    EXPECT_FALSE(pin.IsSelected());
    EXPECT_EQ(pin.SetSelected(true), 0);
    EXPECT_TRUE(pin.IsSelected());
    EXPECT_EQ(pin.GetParentTreeNode(), nullptr);

    auto a = Vn::Eng::TreeNode::CreateInstance(nullptr, nullptr);
    auto b = Vn::Eng::TreeNode::CreateInstance(nullptr, nullptr);
    EXPECT_EQ(pin.SetParentTreeNode(a), 0);
    EXPECT_EQ(CountOf(a.Get()), 2);
    pin.SetParentTreeNode(a);
    EXPECT_EQ(CountOf(a.Get()), 2) << "the same node again is held once";
    pin.SetParentTreeNode(b);
    EXPECT_EQ(CountOf(a.Get()), 1);
    EXPECT_EQ(pin.GetParentTreeNode().Get(), b.Get());

    // The holder may hold the only reference to the node it is handed back.
    b.Reset();
    pin.SetParentTreeNode(pin.GetParentTreeNode());
    ASSERT_TRUE(pin.GetParentTreeNode());
    EXPECT_EQ(CountOf(pin.GetParentTreeNode().Get()), 2);
    pin.SetParentTreeNode(nullptr);
    EXPECT_EQ(pin.GetParentTreeNode(), nullptr);
}

TEST(PropertyHolder, TitlesAndDisplayName) {
    EXPECT_EQ(PropertyHolder::GetNameTitle(), StringBase<char>("Name"));
    EXPECT_EQ(PropertyHolder::GetBridgeIDTitle(), StringBase<char>("Bridge ID"));
    EXPECT_EQ(PropertyHolder::GetHighlightColorTitle(), StringBase<char>("Highlight Color"));
    Pin pin(nullptr);
    EXPECT_EQ(pin.GetDisplayName(), StringBase<char>("P1"));
}

TEST(PropertyHolder, AnswersOnlyItsOwnInterfaceAndIsNotCounted) {
    Pin pin(nullptr);
    VnI::IPropertyHolder* asHolder = &pin;
    EXPECT_EQ(pin.GetInterface(VnI::IID_IPropertyHolder), asHolder);
    EXPECT_EQ(pin.GetInterface(CitI::IID_IInterface), asHolder);
    EXPECT_EQ(pin.GetInterface(CommonI::IID_IRefCount), nullptr);
    EXPECT_EQ(pin.GetInterface(VnI::IID_IDeviceResource), nullptr);
    { RefCountPtr<VnI::IPropertyHolder> held(asHolder); } // must not delete it
    EXPECT_EQ(pin.GetType(), 2);
}

TEST(PropertyHolder, DumpPrintsThreeLinesFromItsUnit) {
    PropertyNameList schema;
    Pin pin(&schema);
    pin.SetSelected(true);
    pin.AddProperty("A", Int(1));
    VnTest::MessageCapture capture;
    pin.Dump();
    ASSERT_EQ(capture.Messages().size(), 3u);
    const char* prefixes[] = {"Vn::Eng::PropertyHolder::m_imp->m_parentNode = ",
                              "Vn::Eng::PropertyHolder::m_imp->m_properties = ",
                              "Vn::Eng::PropertyHolder::m_imp->m_isSelected = "};
    for (size_t i = 0; i < 3; ++i) {
        const Port::Message& m = capture.Messages()[i];
        EXPECT_EQ(m.unit, "../s/PropertyHolder");
        EXPECT_EQ(m.revision, "$Revision: 1.6 $");
        EXPECT_EQ(m.domain, "Venlomer");
        EXPECT_EQ(m.severity, Port::Severity::Status);
        EXPECT_EQ(m.text.rfind(prefixes[i], 0), 0u) << m.text;
    }
    EXPECT_NE(capture.Messages()[1].text.find(" number of properties = 1\n"), std::string::npos);
    EXPECT_EQ(capture.Messages()[2].text, "Vn::Eng::PropertyHolder::m_imp->m_isSelected = 1\n");
}

TEST(PropertyHolder, SlotOrderIsTheContract) {
    using VnI::IPropertyHolder;
    using VnTest::SlotOf;
    EXPECT_EQ(SlotOf(&IPropertyHolder::GetInterface), 0);
    EXPECT_EQ(SlotOf(&IPropertyHolder::GetName), 3);
    EXPECT_EQ(SlotOf(&IPropertyHolder::GetDisplayName), 4);
    EXPECT_EQ(SlotOf(&IPropertyHolder::GetProperties), 5);
    EXPECT_EQ(SlotOf(&IPropertyHolder::GetNumProperties), 6);
    EXPECT_EQ(SlotOf(&IPropertyHolder::GetPropertyByName), 7);
    EXPECT_EQ(SlotOf(&IPropertyHolder::AddProperty), 8);
    EXPECT_EQ(SlotOf(&IPropertyHolder::RemoveProperty), 9);
    EXPECT_EQ(SlotOf(&IPropertyHolder::GetParentTreeNode), 10);
    EXPECT_EQ(SlotOf(&IPropertyHolder::SetParentTreeNode), 11);
    EXPECT_EQ(SlotOf(&IPropertyHolder::IsSelected), 12);
    EXPECT_EQ(SlotOf(&IPropertyHolder::SetSelected), 13);
    EXPECT_EQ(SlotOf(&IPropertyHolder::GetPropertyNames), 14);
    EXPECT_EQ(SlotOf(&IPropertyHolder::GetType), 15);
    using ShortAdd =
        std::int64_t (PropertyHolder::*)(const StringBase<char>&, const RefCountPtr<IProperty>&);
    using LongAdd = std::int64_t (PropertyHolder::*)(const StringBase<char>&,
                                                     const RefCountPtr<IProperty>&, bool);
    EXPECT_EQ(SlotOf(static_cast<LongAdd>(&PropertyHolder::AddProperty)), 8);
    EXPECT_EQ(SlotOf(static_cast<ShortAdd>(&PropertyHolder::AddProperty)), 16);
}

TEST(PropertyItr, SkipsEmptySlotsAndHiddenProperties) {
    PropertyNameList schema;
    Pin pin(&schema);
    auto a = Int(1);
    auto hidden = Int(2, false);
    auto c = Int(3);
    pin.AddProperty("A", a);
    pin.AddProperty("Gone", Int(9));
    pin.AddProperty("Hidden", hidden);
    pin.AddProperty("C", c);
    pin.RemoveProperty("Gone");
    EXPECT_EQ(Shown(pin), (std::vector<IProperty*>{a.Get(), c.Get()}));

    PropertyHolder::GetNameTitle(); // unrelated statics do not disturb iteration
    auto all = Vn::Eng::PropertyItr::CreateInstance(nullptr, true);
    EXPECT_EQ(all->First(), 0) << "no vector";
    EXPECT_TRUE(all->IsEnd());
    EXPECT_EQ(all->CurrentItem(), nullptr);
}

TEST(PropertyItr, ShowsHiddenPropertiesWhenAsked) {
    Vn::Eng::PropertyItr::Slots slots{Int(1), nullptr, Int(2, false)};
    auto it = Vn::Eng::PropertyItr::CreateInstance(&slots, true);
    std::vector<IProperty*> seen;
    for (it->First(); !it->IsEnd(); it->Next()) {
        seen.push_back(it->CurrentItem().Get());
    }
    EXPECT_EQ(seen, (std::vector<IProperty*>{slots[0].Get(), slots[2].Get()}));
}

TEST(PropertyItr, AnEmptyHolderEndsAtOnceAndNextAtTheEndFails) {
    Pin pin(nullptr);
    auto it = pin.GetProperties();
    EXPECT_EQ(it->First(), 1);
    EXPECT_TRUE(it->IsEnd());
    EXPECT_EQ(it->Next(), 0);
    EXPECT_EQ(it->CurrentItem(), nullptr);
}

TEST(PropertyItr, AFreshIteratorStandsOnSlotZeroUntilFirst) {
    PropertyNameList schema;
    Pin pin(&schema);
    pin.AddProperty("Gone", Int(1));
    pin.AddProperty("B", Int(2));
    pin.RemoveProperty("Gone");
    auto it = pin.GetProperties();
    EXPECT_FALSE(it->IsEnd());
    EXPECT_EQ(it->CurrentItem(), nullptr);
    it->First();
    EXPECT_EQ(it->CurrentItem()->GetIntProperty(), 2);
}

TEST(PropertyItr, SurvivesTheHolderGrowingItsSlots) {
    PropertyNameList schema;
    Pin pin(&schema);
    pin.AddProperty("A", Int(0));
    pin.AddProperty("B", Int(1));
    auto it = pin.GetProperties();
    it->First();
    for (int i = 2; i < 100; ++i) { // many reallocations of the slots
        pin.AddProperty(StringBase<char>(("N" + std::to_string(i)).c_str()), Int(i));
    }
    std::vector<int> seen;
    for (; !it->IsEnd(); it->Next()) {
        seen.push_back(it->CurrentItem()->GetIntProperty());
    }
    ASSERT_EQ(seen.size(), 100u);
    EXPECT_EQ(seen.front(), 0);
    EXPECT_EQ(seen.back(), 99);
}

TEST(PropertyItr, AnswersItselfAndItsCounter) {
    Pin pin(nullptr);
    auto it = pin.GetProperties();
    CitI::IInterface* counter = it->GetInterface(CommonI::IID_IRefCount);
    ASSERT_NE(counter, nullptr);
    for (CitI::IInterface* from : {static_cast<CitI::IInterface*>(it.Get()), counter}) {
        EXPECT_EQ(from->GetInterface(VnI::IID_IPropertyItr), it.Get());
        EXPECT_EQ(from->GetInterface(CitI::IID_IInterface), it.Get());
        EXPECT_EQ(from->GetInterface(CommonI::IID_IRefCount), counter);
        EXPECT_EQ(from->GetInterface(VnI::IID_IPropertyHolderItr), nullptr);
    }
    EXPECT_EQ(CountOf(it.Get()), 1);
    using VnTest::SlotOf;
    EXPECT_EQ(SlotOf(&VnI::IPropertyItr::CurrentItem), 3);
    EXPECT_EQ(SlotOf(&VnI::IPropertyItr::First), 4);
    EXPECT_EQ(SlotOf(&VnI::IPropertyItr::Next), 5);
    EXPECT_EQ(SlotOf(&VnI::IPropertyItr::IsEnd), 6);
}
