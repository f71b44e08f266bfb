//===-- tests/PropertyTest.cpp - property values serve their type, count and identity -===//
//
// Property values, enumerations and both factories: accessors, counts, visibility,
// interface identity, slot order and the enumeration's current-value rules.
//
//===------------------------------------------------------------------------------===//
#include "MessageCapture.h"
#include "Slots.h"

#include "s/ColorProperty.h"
#include "s/ManagedPropertyFactory.h"
#include "s/PossibleEnumValuesItr.h"
#include "s/Property.h"
#include "s/PropertyFactory.h"

#include <gtest/gtest.h>

#include <climits>
#include <cmath>
#include <memory>
#include <string>
#include <vector>

using CommonI::RefCountPtr;
using Vn::Eng::ColorProperty;
using Vn::Eng::EnumeratedProperty;
using Vn::Eng::ManagedPropertyFactory;
using Vn::Eng::PossibleEnumValuesItr;
using Vn::Eng::Property;
using Vn::Eng::PropertyFactory;
using VnI::IColorProperty;
using VnI::IPossibleEnumValuesItr;
using VnI::IProperty;

namespace {

const char kInvalid[] = "Tried to set value of Enumerated Property to invalid type\n";

int CountOf(CitI::IInterface* p) {
    int count = -1;
    static_cast<CommonI::IRefCount*>(p->GetInterface(CommonI::IID_IRefCount))->GetRefCount(count);
    return count;
}

RefCountPtr<IProperty> Adopt(IProperty* raw) {
    return RefCountPtr<IProperty>::Adopt(raw);
}
RefCountPtr<IColorProperty> Adopt(IColorProperty* raw) {
    return RefCountPtr<IColorProperty>::Adopt(raw);
}

std::vector<std::string> Walk(const RefCountPtr<IPossibleEnumValuesItr>& it) {
    std::vector<std::string> out;
    if (!it) {
        ADD_FAILURE() << "no iterator where one was expected";
        return out;
    }
    for (it->First(); !it->IsEnd(); it->Next()) {
        out.push_back(it->CurrentItem().str());
    }
    return out;
}

EnumeratedProperty& AsEnum(const RefCountPtr<IProperty>& p) {
    return dynamic_cast<EnumeratedProperty&>(*p);
}

/// Whether the enumeration sits on text at index, told through its interface only.
::testing::AssertionResult IsAt(const RefCountPtr<IProperty>& p, const char* text, int index) {
    const auto atIndex = Adopt(PropertyFactory::CreateIntProperty(index, true));
    if (p->GetStringProperty() != Port::StringBase<char>(text) ||
        !p->Equals(RefCountPtr<const IProperty>(atIndex), 0)) {
        return ::testing::AssertionFailure()
               << "at " << p->GetStringProperty().str() << ", not " << text << "/" << index;
    }
    return ::testing::AssertionSuccess();
}

struct Defaults {
    VnI::PropertyType type;
    int asInt;
    double asDouble;
    std::string asText;
    bool asBool;
    bool hasValues = false;
};

void ExpectAccessors(const RefCountPtr<IProperty>& p, const Defaults& want) {
    EXPECT_EQ(p->GetType(), want.type);
    EXPECT_EQ(p->GetIntProperty(), want.asInt);
    EXPECT_EQ(p->GetDoubleProperty(), want.asDouble);
    EXPECT_EQ(p->GetStringProperty().str(), want.asText);
    EXPECT_EQ(p->GetBoolProperty(), want.asBool);
    EXPECT_EQ(static_cast<bool>(p->GetPossibleValues()), want.hasValues);
    EXPECT_EQ(p->GetIndex(), -1);
    EXPECT_TRUE(p->IsVisible());
    EXPECT_EQ(CountOf(p.Get()), 1);
}

} // namespace

TEST(PropertyAccessors, ServeTheirOwnTypeAndDefaultTheRest) {
    std::vector<Port::StringBase<char>> values{"A", "B"};
    SCOPED_TRACE("int");
    ExpectAccessors(Adopt(PropertyFactory::CreateIntProperty(12, true)),
                    {VnI::INT_TYPE, 12, 12.0, "", false});
    SCOPED_TRACE("double");
    ExpectAccessors(Adopt(PropertyFactory::CreateDoubleProperty(-2.7, true)),
                    {VnI::DOUBLE_TYPE, -2, -2.7, "", false});
    ExpectAccessors(Adopt(PropertyFactory::CreateDoubleProperty(2.7, true)),
                    {VnI::DOUBLE_TYPE, 2, 2.7, "", false});
    SCOPED_TRACE("text");
    ExpectAccessors(Adopt(PropertyFactory::CreateStringProperty("12", true)),
                    {VnI::STRING_TYPE, -1, -1.0, "12", false});
    SCOPED_TRACE("bool");
    ExpectAccessors(Adopt(PropertyFactory::CreateBoolProperty(true, true)),
                    {VnI::BOOL_TYPE, -1, -1.0, "", true});
    SCOPED_TRACE("enum");
    ExpectAccessors(Adopt(PropertyFactory::CreateEnumProperty(values, "B", true)),
                    {VnI::ENUM_TYPE, -1, -1.0, "B", false, true});
    SCOPED_TRACE("colour");
    ExpectAccessors(
        RefCountPtr<IProperty>(Adopt(PropertyFactory::CreateColorProperty(0x102030, true))),
        {VnI::COLOR_TYPE, -1, -1.0, "", false});
}

TEST(PropertyAccessors, RealsOutsideTheIntRangeReadAsUsableInts) {
    EXPECT_EQ(Adopt(PropertyFactory::CreateDoubleProperty(1e300, true))->GetIntProperty(), INT_MAX);
    EXPECT_EQ(Adopt(PropertyFactory::CreateDoubleProperty(-1e300, true))->GetIntProperty(),
              INT_MIN);
    EXPECT_EQ(Adopt(PropertyFactory::CreateDoubleProperty(INFINITY, true))->GetIntProperty(),
              INT_MAX);
    EXPECT_EQ(Adopt(PropertyFactory::CreateDoubleProperty(NAN, true))->GetIntProperty(), -1);
    EXPECT_EQ(Adopt(PropertyFactory::CreateDoubleProperty(-0.9, true))->GetIntProperty(), 0);
    EXPECT_EQ(Adopt(PropertyFactory::CreateIntProperty(INT_MIN, true))->GetDoubleProperty(),
              -2147483648.0);
}

TEST(PropertyAccessors, TextsKeepEveryByte) {
    const Port::StringBase<char> withNul("a\0b", 3);
    Port::StringBase<char> source = withNul;
    const auto p = Adopt(PropertyFactory::CreateStringProperty(source, true));
    source = "changed";
    EXPECT_EQ(p->GetStringProperty(), withNul) << "the property copies the text";
}

TEST(PropertyIndex, StoresAnyIndexAndReportsWhetherItIsNonZero) {
    const auto p = Adopt(PropertyFactory::CreateIntProperty(1, true));
    EXPECT_TRUE(p->SetIndex(5));
    EXPECT_EQ(p->GetIndex(), 5);
    EXPECT_FALSE(p->SetIndex(0));
    EXPECT_EQ(p->GetIndex(), 0);
    EXPECT_TRUE(p->SetIndex(-1));
    EXPECT_EQ(p->GetIndex(), -1);
    EXPECT_TRUE(p->SetIndex(127));
    EXPECT_EQ(p->GetIndex(), 127);

    const auto c = Adopt(PropertyFactory::CreateColorProperty(1, true));
    EXPECT_FALSE(c->SetIndex(0));
    EXPECT_TRUE(c->SetIndex(-128));
    EXPECT_EQ(c->GetIndex(), -128);
}

TEST(ColorProperty, UnpacksNonNegativeIntsAndMarksNegativesInvalid) {
    struct Case {
        int rgb;
        int red, green, blue;
        bool valid;
    };
    const Case cases[] = {
        {0x123456, 0x12, 0x34, 0x56, true},
        {0, 0, 0, 0, true},
        {0xFFFFFF, 255, 255, 255, true},
        {0x7F123456, 0x12, 0x34, 0x56, true}, // bits above 23 ignored
        {0x01000000, 0, 0, 0, true},
        {-1, 255, 255, 255, false},
        {-5, 255, 255, 255, false},
        {INT_MIN, 255, 255, 255, false},
        {static_cast<int>(0x80123456u), 255, 255, 255, false},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.rgb);
        const auto color = Adopt(PropertyFactory::CreateColorProperty(c.rgb, true));
        EXPECT_EQ(color->GetRed(), c.red);
        EXPECT_EQ(color->GetGreen(), c.green);
        EXPECT_EQ(color->GetBlue(), c.blue);
        EXPECT_EQ(color->IsValid(), c.valid);
    }
}

TEST(ColorProperty, SetRGBStoresTheComponentsAndMakesTheColourValid) {
    const auto color = Adopt(PropertyFactory::CreateColorProperty(-1, true));
    EXPECT_EQ(color->SetRGB(1, 2, 3), 1);
    EXPECT_EQ(color->GetRed(), 1);
    EXPECT_EQ(color->GetGreen(), 2);
    EXPECT_EQ(color->GetBlue(), 3);
    EXPECT_TRUE(color->IsValid());
}

TEST(ColorProperty, TakesCharComponentsAsUnsignedBytes) {
    const auto color = Adopt(PropertyFactory::CreateColorProperty(
        static_cast<char>(200), static_cast<char>(-1), static_cast<char>(128), false));
    EXPECT_EQ(color->GetRed(), 200);
    EXPECT_EQ(color->GetGreen(), 255);
    EXPECT_EQ(color->GetBlue(), 128);
    EXPECT_TRUE(color->IsValid());
    EXPECT_FALSE(color->IsVisible());
}

TEST(ColorProperty, HoldsTheOtherColourWhileComparing) {
    const auto a = Adopt(PropertyFactory::CreateColorProperty(0x010203, true));
    const auto b = Adopt(PropertyFactory::CreateColorProperty(0x010203, true));
    const RefCountPtr<const IProperty> other(b);
    EXPECT_TRUE(a->Equals(other, 0));
    a->LessThan(other, 0);
    EXPECT_EQ(CountOf(b.Get()), 2) << "the comparison gave back every reference it took";
}

TEST(PropertyInterfaces, ValuesAnswerTheirCounterAndIProperty) {
    const auto p = Adopt(PropertyFactory::CreateStringProperty("x", true));
    CitI::IInterface* counter = p->GetInterface(CommonI::IID_IRefCount);
    ASSERT_NE(counter, nullptr);
    EXPECT_NE(static_cast<void*>(counter), static_cast<void*>(p.Get()))
        << "the count comes first in the object";
    EXPECT_EQ(p->GetInterface(VnI::IID_IProperty), p.Get());
    EXPECT_EQ(p->GetInterface(CitI::IID_IInterface), p.Get());
    EXPECT_EQ(counter->GetInterface(VnI::IID_IProperty), p.Get());
    EXPECT_EQ(counter->GetInterface(CommonI::IID_IRefCount), counter);
    EXPECT_EQ(p->GetInterface(VnI::IID_IColorProperty), nullptr);
    EXPECT_EQ(p->GetInterface(VnI::IID_IPossibleEnumValuesItr), nullptr);

    static_cast<CommonI::IRefCount*>(counter)->AddRef();
    EXPECT_EQ(CountOf(p.Get()), 2);
    static_cast<CommonI::IRefCount*>(counter)->Release();
    EXPECT_EQ(CountOf(p.Get()), 1);
}

TEST(PropertyInterfaces, ColoursAnswerOneSubObjectForAllThreeInterfaces) {
    IColorProperty* raw = PropertyFactory::CreateColorProperty(5, true);
    const auto color = Adopt(raw);
    EXPECT_EQ(raw->GetInterface(VnI::IID_IColorProperty), raw);
    EXPECT_EQ(raw->GetInterface(VnI::IID_IProperty), static_cast<IProperty*>(raw));
    EXPECT_EQ(raw->GetInterface(CitI::IID_IInterface), raw);
    CitI::IInterface* counter = raw->GetInterface(CommonI::IID_IRefCount);
    ASSERT_NE(counter, nullptr);
    EXPECT_EQ(counter->GetInterface(VnI::IID_IColorProperty), raw);
    EXPECT_EQ(raw->GetInterface(VnI::IID_IPropertyName), nullptr);
}

TEST(PropertySlots, FollowThePublishedOrder) {
    using VnTest::SlotOf;
    EXPECT_EQ(SlotOf(&IProperty::GetInterface), 0);
    EXPECT_EQ(SlotOf(&IProperty::GetType), 3);
    EXPECT_EQ(SlotOf(&IProperty::GetIntProperty), 4);
    EXPECT_EQ(SlotOf(&IProperty::GetDoubleProperty), 5);
    EXPECT_EQ(SlotOf(&IProperty::GetStringProperty), 6);
    EXPECT_EQ(SlotOf(&IProperty::GetBoolProperty), 7);
    EXPECT_EQ(SlotOf(&IProperty::GetPossibleValues), 8);
    EXPECT_EQ(SlotOf(&IProperty::Equals), 9);
    EXPECT_EQ(SlotOf(&IProperty::LessThan), 10);
    EXPECT_EQ(SlotOf(&IProperty::SetIndex), 11);
    EXPECT_EQ(SlotOf(&IProperty::GetIndex), 12);
    EXPECT_EQ(SlotOf(&IProperty::IsVisible), 13);

    EXPECT_EQ(SlotOf(&IColorProperty::GetRed), 14);
    EXPECT_EQ(SlotOf(&IColorProperty::GetGreen), 15);
    EXPECT_EQ(SlotOf(&IColorProperty::GetBlue), 16);
    EXPECT_EQ(SlotOf(&IColorProperty::SetRGB), 17);
    EXPECT_EQ(SlotOf(&IColorProperty::IsValid), 18);

    EXPECT_EQ(SlotOf(&IPossibleEnumValuesItr::GetInterface), 0);
    EXPECT_EQ(SlotOf(&IPossibleEnumValuesItr::CurrentItem), 3);
    EXPECT_EQ(SlotOf(&IPossibleEnumValuesItr::First), 4);
    EXPECT_EQ(SlotOf(&IPossibleEnumValuesItr::Next), 5);
    EXPECT_EQ(SlotOf(&IPossibleEnumValuesItr::IsEnd), 6);
}

TEST(PropertySlots, SetVisibleFollowsTheCountingOperations) {
    using VnTest::SlotOf;
    // The counter base is the primary base: GetInterface 0, destructor 1-2, AddRef 3,
    // Release 4, GetRefCount 5, then SetVisible.
    EXPECT_EQ(SlotOf(&Property::AddRef), 3);
    EXPECT_EQ(SlotOf(&Property::GetRefCount), 5);
    EXPECT_EQ(SlotOf(&Property::SetVisible), 6);
    EXPECT_EQ(SlotOf(&EnumeratedProperty::SetVisible), 6);
    EXPECT_EQ(SlotOf(&ColorProperty::GetRefCount), 5);
    EXPECT_EQ(SlotOf(&ColorProperty::SetVisible), 6);
    // The object starts with its count: IRefCount is at the object's own address.
    IProperty* raw = PropertyFactory::CreateIntProperty(1, true);
    auto* object = static_cast<Property*>(raw);
    EXPECT_EQ(static_cast<void*>(object),
              static_cast<void*>(raw->GetInterface(CommonI::IID_IRefCount)));
    Adopt(raw);
}

class BothFactories : public testing::TestWithParam<bool> {
protected:
    // True: the managed factory; false: the static one.
    bool Managed() const { return GetParam(); }
    ManagedPropertyFactory managed;

    IProperty* Int(int v, bool visible) {
        return Managed() ? managed.CreateIntProperty(v, visible)
                         : PropertyFactory::CreateIntProperty(v, visible);
    }
    IProperty* Double(double v, bool visible) {
        return Managed() ? managed.CreateDoubleProperty(v, visible)
                         : PropertyFactory::CreateDoubleProperty(v, visible);
    }
    IProperty* Text(const char* v, bool visible) {
        return Managed() ? managed.CreateStringProperty(v, visible)
                         : PropertyFactory::CreateStringProperty(v, visible);
    }
    IProperty* Bool(bool v, bool visible) {
        return Managed() ? managed.CreateBoolProperty(v, visible)
                         : PropertyFactory::CreateBoolProperty(v, visible);
    }
    IProperty* Color(int rgb, bool visible) {
        return Managed() ? managed.CreateColorProperty(rgb, visible)
                         : PropertyFactory::CreateColorProperty(rgb, visible);
    }
    IProperty* Color(char r, char g, char b, bool visible) {
        return Managed() ? managed.CreateColorProperty(r, g, b, visible)
                         : PropertyFactory::CreateColorProperty(r, g, b, visible);
    }
    IProperty* Enum(std::vector<Port::StringBase<char>>& values, const char* current,
                    bool visible) {
        return Managed() ? managed.CreateEnumProperty(values, current, visible)
                         : PropertyFactory::CreateEnumProperty(values, current, visible);
    }
};

TEST_P(BothFactories, HandOutOneReferenceAndTheAskedVisibility) {
    std::vector<Port::StringBase<char>> values{"A", "B"};
    for (bool visible : {true, false}) {
        SCOPED_TRACE(visible ? "visible" : "hidden");
        const RefCountPtr<IProperty> made[] = {
            Adopt(Int(7, visible)),           Adopt(Double(0.5, visible)),
            Adopt(Text("t", visible)),        Adopt(Bool(true, visible)),
            Adopt(Color(0x010203, visible)),  Adopt(Color('\1', '\2', '\3', visible)),
            Adopt(Enum(values, "", visible)),
        };
        const VnI::PropertyType types[] = {VnI::INT_TYPE,  VnI::DOUBLE_TYPE, VnI::STRING_TYPE,
                                           VnI::BOOL_TYPE, VnI::COLOR_TYPE,  VnI::COLOR_TYPE,
                                           VnI::ENUM_TYPE};
        for (std::size_t i = 0; i < std::size(made); ++i) {
            SCOPED_TRACE(i);
            ASSERT_TRUE(made[i]);
            EXPECT_EQ(made[i]->GetType(), types[i]);
            EXPECT_EQ(made[i]->IsVisible(), visible);
            EXPECT_EQ(made[i]->GetIndex(), -1);
            EXPECT_EQ(CountOf(made[i].Get()), 1);
        }
    }
}

TEST_P(BothFactories, ColoursComeBackAsTheirColourInterface) {
    IProperty* raw = Color(-5, true);
    const auto held = Adopt(raw);
    EXPECT_EQ(raw->GetInterface(VnI::IID_IColorProperty), static_cast<CitI::IInterface*>(raw))
        << "the IProperty handed out is the colour sub-object itself";
    const auto color = CommonI::QueryInterface<IColorProperty>(raw);
    ASSERT_TRUE(color);
    EXPECT_FALSE(color->IsValid());
    EXPECT_EQ(color->GetRed(), 255);
    EXPECT_EQ(color->GetGreen(), 255);
    EXPECT_EQ(color->GetBlue(), 255);
}

TEST_P(BothFactories, ColourComponentsKeepTheirPlacesAndFullByteRange) {
    // Three different values per colour, so that no two components can be swapped
    // unnoticed; chars are signed here, so values above 127 arrive negative.
    const int cases[][3] = {{1, 2, 3}, {200, 10, 130}, {0, 255, 128}, {127, 128, 129}};
    for (const auto& c : cases) {
        SCOPED_TRACE(testing::Message() << c[0] << "," << c[1] << "," << c[2]);
        const auto held = Adopt(
            Color(static_cast<char>(c[0]), static_cast<char>(c[1]), static_cast<char>(c[2]), true));
        ASSERT_TRUE(held);
        const auto color = CommonI::QueryInterface<IColorProperty>(held.Get());
        ASSERT_TRUE(color);
        EXPECT_EQ(color->GetRed(), c[0]);
        EXPECT_EQ(color->GetGreen(), c[1]);
        EXPECT_EQ(color->GetBlue(), c[2]);
        EXPECT_TRUE(color->IsValid());
        // The packed form of the same colour is equal to it.
        const auto packed = Adopt(Color((c[0] << 16) | (c[1] << 8) | c[2], true));
        ASSERT_TRUE(packed);
        EXPECT_TRUE(held->Equals(RefCountPtr<const IProperty>(packed.Get()), 0));
    }
}

TEST_P(BothFactories, EnumerationsStartOnTheAskedOrTheFirstValue) {
    std::vector<Port::StringBase<char>> values{"A", "B"};
    VnTest::MessageCapture capture;

    const auto onB = Adopt(Enum(values, "B", true));
    EXPECT_TRUE(IsAt(onB, "B", 1));
    EXPECT_TRUE(capture.Debug().empty());

    const auto onEmpty = Adopt(Enum(values, "", true));
    EXPECT_TRUE(IsAt(onEmpty, "A", 0));
    EXPECT_TRUE(capture.Debug().empty()) << "an empty current text is not a mistake";

    const auto onZ = Adopt(Enum(values, "Z", true));
    EXPECT_TRUE(IsAt(onZ, "A", 0));
    EXPECT_EQ(capture.Debug(), std::vector<std::string>{kInvalid});

    capture.Clear();
    const auto caseMatters = Adopt(Enum(values, "b", true));
    EXPECT_TRUE(IsAt(caseMatters, "A", 0));
    EXPECT_EQ(capture.Debug(), std::vector<std::string>{kInvalid});
}

INSTANTIATE_TEST_SUITE_P(Factory, BothFactories, testing::Bool(),
                         [](const testing::TestParamInfo<bool>& which) {
                             return which.param ? "Managed" : "Static";
                         });

TEST(ManagedPropertyFactory, ReservesNothingAndAlwaysSucceeds) {
    ManagedPropertyFactory factory;
    for (unsigned int count : {0u, 1u, 1000000u, 0xFFFFFFFFu}) {
        EXPECT_TRUE(factory.ReserveSpaceForIntProperties(count));
        EXPECT_TRUE(factory.ReserveSpaceForStringProperties(count));
        EXPECT_TRUE(factory.ReserveSpaceForBoolProperties(count));
        EXPECT_TRUE(factory.ReserveSpaceForDoubleProperties(count));
        EXPECT_TRUE(factory.ReserveSpaceForEnumProperties(count));
        EXPECT_TRUE(factory.ReserveSpaceForColorProperties(count));
    }
    const auto p = Adopt(factory.CreateIntProperty(3, true));
    EXPECT_EQ(CountOf(p.Get()), 1);
    EXPECT_EQ(p->GetIntProperty(), 3);

    VnTest::MessageCapture capture;
    factory.Dump();
    EXPECT_TRUE(capture.Messages().empty());
}

TEST(ManagedPropertyFactory, PropertiesOutliveTheFactory) {
    auto factory = std::make_unique<ManagedPropertyFactory>();
    const auto p = Adopt(factory->CreateStringProperty("kept", true));
    factory.reset();
    EXPECT_EQ(p->GetStringProperty(), Port::StringBase<char>("kept"));
}

TEST(EnumeratedProperty, MovesOnlyToValuesInItsList) {
    std::vector<Port::StringBase<char>> values{"A", "B", "C"};
    const auto p = Adopt(PropertyFactory::CreateEnumProperty(values, "", true));
    auto& e = AsEnum(p);
    VnTest::MessageCapture capture;

    EXPECT_TRUE(IsAt(p, "A", 0));
    e.SetCurrentValue(2u);
    EXPECT_TRUE(IsAt(p, "C", 2));
    EXPECT_EQ(e.GetCurrentIndex(), 2u);
    EXPECT_TRUE(capture.Debug().empty());

    e.SetCurrentValue(3u);
    EXPECT_TRUE(IsAt(p, "C", 2));
    e.SetCurrentValue(0xFFFFFFFFu);
    EXPECT_TRUE(IsAt(p, "C", 2));
    e.SetCurrentValue(Port::StringBase<char>("b"));
    EXPECT_TRUE(IsAt(p, "C", 2));
    e.SetCurrentValue(Port::StringBase<char>("B "));
    EXPECT_TRUE(IsAt(p, "C", 2));
    EXPECT_EQ(capture.Debug(), std::vector<std::string>(4, kInvalid));

    capture.Clear();
    e.SetCurrentValue(Port::StringBase<char>("B"));
    EXPECT_TRUE(IsAt(p, "B", 1));
    EXPECT_TRUE(capture.Debug().empty());
    EXPECT_EQ(p->GetIntProperty(), -1) << "the index is not the int value";
}

TEST(EnumeratedProperty, PicksTheFirstOfEqualTexts) {
    std::vector<Port::StringBase<char>> values{"A", "B", "B"};
    const auto p = Adopt(PropertyFactory::CreateEnumProperty(values, "", true));
    AsEnum(p).SetCurrentValue(2u);
    AsEnum(p).SetCurrentValue(Port::StringBase<char>("B"));
    EXPECT_TRUE(IsAt(p, "B", 1));
}

TEST(EnumeratedProperty, OverAnEmptyListIsEmptyAndRejectsEverything) {
    std::vector<Port::StringBase<char>> none;
    VnTest::MessageCapture capture;
    const auto p = Adopt(PropertyFactory::CreateEnumProperty(none, "", true));
    ASSERT_TRUE(p);
    EXPECT_TRUE(IsAt(p, "", 0));
    EXPECT_TRUE(capture.Debug().empty());

    AsEnum(p).SetCurrentValue(0u);
    AsEnum(p).SetCurrentValue(Port::StringBase<char>());
    AsEnum(p).SetCurrentValue(Port::StringBase<char>("A"));
    EXPECT_EQ(capture.Debug(), std::vector<std::string>(3, kInvalid));
    EXPECT_TRUE(IsAt(p, "", 0));
    const auto values = p->GetPossibleValues();
    ASSERT_TRUE(values);
    EXPECT_TRUE(values->IsEnd());

    capture.Clear();
    const auto asked = Adopt(PropertyFactory::CreateEnumProperty(none, "A", true));
    EXPECT_EQ(capture.Debug(), std::vector<std::string>{kInvalid});
    EXPECT_TRUE(IsAt(asked, "", 0));
}

TEST(EnumeratedProperty, ReadsTheCreatorsListInPlace) {
    std::vector<Port::StringBase<char>> values{"A", "B"};
    const auto p = Adopt(PropertyFactory::CreateEnumProperty(values, "B", true));
    const auto before = p->GetPossibleValues();
    values.emplace_back("C");
    EXPECT_EQ(Walk(p->GetPossibleValues()), (std::vector<std::string>{"A", "B", "C"}));
    EXPECT_EQ(Walk(before), (std::vector<std::string>{"A", "B", "C"}))
        << "an older iterator sees the growth too";
    AsEnum(p).SetCurrentValue(Port::StringBase<char>("C"));
    EXPECT_TRUE(IsAt(p, "C", 2));

    values[2] = "Z";
    EXPECT_EQ(p->GetStringProperty(), Port::StringBase<char>("C"))
        << "the current text is the property's own copy";
}

TEST(PossibleEnumValuesItr, WalksInOrderAndStaysAtTheEnd) {
    std::vector<Port::StringBase<char>> values{"A", "B", "C"};
    const auto it = PossibleEnumValuesItr::CreateInstance(&values);
    EXPECT_EQ(CountOf(it.Get()), 1);
    EXPECT_FALSE(it->IsEnd()) << "a new iterator stands on the first value";
    EXPECT_EQ(it->CurrentItem(), Port::StringBase<char>("A"));
    EXPECT_EQ(it->First(), 1);
    for (const char* want : {"A", "B", "C"}) {
        ASSERT_FALSE(it->IsEnd());
        EXPECT_EQ(it->CurrentItem(), Port::StringBase<char>(want));
        EXPECT_EQ(it->Next(), 1);
    }
    EXPECT_TRUE(it->IsEnd());
    EXPECT_TRUE(it->CurrentItem().IsEmpty());
    EXPECT_EQ(it->Next(), 1);
    EXPECT_TRUE(it->IsEnd());
    it->First();
    EXPECT_EQ(it->CurrentItem(), Port::StringBase<char>("A"));
}

TEST(PossibleEnumValuesItr, SurvivesAListThatShrinksUnderIt) {
    std::vector<Port::StringBase<char>> values{"A", "B", "C"};
    const auto it = PossibleEnumValuesItr::CreateInstance(&values);
    it->Next();
    it->Next();
    values.resize(1);
    EXPECT_TRUE(it->IsEnd());
    EXPECT_TRUE(it->CurrentItem().IsEmpty());
    it->Next();
    it->First();
    EXPECT_EQ(it->CurrentItem(), Port::StringBase<char>("A"));
}

TEST(PossibleEnumValuesItr, WithoutAListIsAtItsEnd) {
    const auto it = PossibleEnumValuesItr::CreateInstance(nullptr);
    ASSERT_TRUE(it);
    EXPECT_TRUE(it->IsEnd());
    EXPECT_EQ(it->First(), 1);
    EXPECT_EQ(it->Next(), 1);
    EXPECT_TRUE(it->IsEnd());
    EXPECT_TRUE(it->CurrentItem().IsEmpty());
}

TEST(PossibleEnumValuesItr, AnswersItselfAndItsCounter) {
    std::vector<Port::StringBase<char>> values{"A"};
    const auto it = PossibleEnumValuesItr::CreateInstance(&values);
    IPossibleEnumValuesItr* api = it.Get();
    EXPECT_EQ(api->GetInterface(VnI::IID_IPossibleEnumValuesItr), api);
    EXPECT_EQ(api->GetInterface(CitI::IID_IInterface), api);
    CitI::IInterface* counter = api->GetInterface(CommonI::IID_IRefCount);
    ASSERT_NE(counter, nullptr);
    EXPECT_NE(static_cast<void*>(counter), static_cast<void*>(api));
    EXPECT_EQ(counter->GetInterface(VnI::IID_IPossibleEnumValuesItr), api);
    EXPECT_EQ(api->GetInterface(VnI::IID_IProperty), nullptr);

    RefCountPtr<IPossibleEnumValuesItr> second;
    second = it; // one more holder
    EXPECT_EQ(CountOf(api), 2);
}
