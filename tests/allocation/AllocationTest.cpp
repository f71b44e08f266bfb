//===-- tests/allocation/AllocationTest.cpp - the holder's look-ups allocate nothing -===//
//
// What the holder's hot paths cost in allocations.
//
//===------------------------------------------------------------------------------===//
#include "s/GenericPropertyHolder.h"
#include "s/PropertyFactory.h"
#include "s/PropertyHolder.h"
#include "s/PropertyNameList.h"

#include "CountingNew.h"

#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <vector>

using CommonI::RefCountPtr;
using Port::StringBase;

namespace {

class Pin final : public Vn::Eng::PropertyHolder {
public:
    explicit Pin(Vn::Eng::PropertyNameList& schema)
        : m_names(static_cast<VnI::IPropertyNameList*>(
              schema.GetInterface(VnI::IID_IPropertyNameList))) {}
    StringBase<char> GetName() override { return {}; }
    VnI::IPropertyNameList* GetPropertyNames() override { return m_names; }
    int GetType() const override { return 2; }

private:
    VnI::IPropertyNameList* m_names;
};

RefCountPtr<VnI::IProperty> Int(int value) {
    return RefCountPtr<VnI::IProperty>::Adopt(
        Vn::Eng::PropertyFactory::CreateIntProperty(value, true));
}

StringBase<char> NameOf(int i) {
    return StringBase<char>(("Name" + std::to_string(i)).c_str());
}

} // namespace

TEST(HolderAllocations, LookUpByNameAllocatesNothing) {
    Vn::Eng::PropertyNameList schema;
    Pin pin(schema);
    for (int i = 0; i < 40; ++i) {
        pin.AddProperty(NameOf(i), Int(i));
    }
    const StringBase<char> wanted = NameOf(33);
    const StringBase<char> unknown("Nowhere");
    EXPECT_EQ(VnTest::AllocationsOf(
                  [&] { EXPECT_EQ(pin.GetPropertyByName(wanted)->GetIntProperty(), 33); }),
              0);
    EXPECT_EQ(VnTest::AllocationsOf([&] { EXPECT_EQ(pin.GetPropertyByName(unknown), nullptr); }),
              0);
}

TEST(HolderAllocations, SlotsAreReservedForTwiceTheNamesAndAtLeastSixteen) {
    Vn::Eng::PropertyNameList schema;
    for (int i = 0; i < 40; ++i) { // names known up front, so only the slots allocate
        schema.AddName(NameOf(i), VnI::INT_TYPE, true);
    }
    Vn::Eng::PropertyNameList small;
    for (int i = 0; i < 3; ++i) {
        small.AddName(NameOf(i), VnI::INT_TYPE, true);
    }
    Pin few(small);
    auto p = Int(0);
    EXPECT_EQ(VnTest::AllocationsOf([&] { few.AddProperty(NameOf(1), p); }), 1);
    // Room for 16: growing the list to 16 names and filling them never reallocates.
    for (int i = 3; i < 16; ++i) {
        small.AddName(NameOf(i), VnI::INT_TYPE, true);
    }
    for (int i = 0; i < 16; ++i) {
        EXPECT_EQ(VnTest::AllocationsOf([&] { few.AddProperty(NameOf(i), p); }), 0) << i;
    }
    // The 17th name needs room: 34 slots, enough up to 34 names.
    small.AddName(NameOf(16), VnI::INT_TYPE, true);
    EXPECT_EQ(VnTest::AllocationsOf([&] { few.AddProperty(NameOf(16), p); }), 1);
    for (int i = 17; i < 34; ++i) {
        small.AddName(NameOf(i), VnI::INT_TYPE, true);
    }
    EXPECT_EQ(VnTest::AllocationsOf([&] { few.AddProperty(NameOf(33), p); }), 0);
    small.AddName(NameOf(34), VnI::INT_TYPE, true);
    EXPECT_EQ(VnTest::AllocationsOf([&] { few.AddProperty(NameOf(34), p); }), 1);

    // A holder whose first add already sees 40 names reserves 80 at once.
    Pin many(schema);
    EXPECT_EQ(VnTest::AllocationsOf([&] { many.AddProperty(NameOf(0), p); }), 1);
    for (int i = 40; i < 80; ++i) {
        schema.AddName(NameOf(i), VnI::INT_TYPE, true);
    }
    EXPECT_EQ(VnTest::AllocationsOf([&] { many.AddProperty(NameOf(79), p); }), 0);
    schema.AddName(NameOf(80), VnI::INT_TYPE, true);
    EXPECT_EQ(VnTest::AllocationsOf([&] { many.AddProperty(NameOf(80), p); }), 1);
}

// A generic holder carries a name list of its own: sixteen properties must not cost a
// name object (and its record) per property, only a few growing blocks for the whole list.
TEST(Allocation, GenericHolderListsItsNamesInAFewBlocks) {
    std::vector<Port::StringBase<char>> names;
    std::vector<CommonI::RefCountPtr<VnI::IProperty>> properties;
    for (int i = 0; i < 16; ++i) {
        names.emplace_back(("Prop" + std::to_string(i)).c_str());
        properties.push_back(CommonI::RefCountPtr<VnI::IProperty>::Adopt(
            Vn::Eng::PropertyFactory::CreateIntProperty(i, true)));
    }
    std::unique_ptr<Vn::Eng::GenericPropertyHolder> holder;
    const long allocations = VnTest::AllocationsOf([&] {
        holder = std::make_unique<Vn::Eng::GenericPropertyHolder>();
        for (int i = 0; i < 16; ++i) {
            ASSERT_EQ(holder->AddProperty(names[static_cast<std::size_t>(i)],
                                          properties[static_cast<std::size_t>(i)]),
                      1);
        }
    });
    // The holder and its two records, the list's record, its entries and texts sharing
    // a block that grows once, and the slots.
    EXPECT_LE(allocations, 7);
    for (int i = 0; i < 16; ++i) {
        EXPECT_EQ(holder->GetPropertyByName(names[static_cast<std::size_t>(i)]),
                  properties[static_cast<std::size_t>(i)]);
        EXPECT_EQ(properties[static_cast<std::size_t>(i)]->GetIndex(), i);
    }
    EXPECT_EQ(holder->GetPropertyByName("Prop16"), nullptr);
}
