//===-- tests/allocation/HotPathAllocationTest.cpp - a search's compares allocate nothing -===//
//
// A search compares one wanted value with the property of every holder and looks the
// property's name up in every holder's schema: over a million holders, one allocation per
// comparison is a million allocations. These tests count them.
//
//===------------------------------------------------------------------------------===//
#include "s/GenericPropertyHolder.h"
#include "s/PropertyFactory.h"
#include "s/PropertyNameList.h"

#include "CountingNew.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

using CommonI::RefCountPtr;
using Vn::Eng::PropertyFactory;
using VnI::IProperty;

namespace {

// Longer than any small-string buffer, so that a copy would have to allocate.
const char kLong[] = "a text well beyond every small-string buffer of the library";

RefCountPtr<const IProperty> Adopt(IProperty* raw) {
    return RefCountPtr<const IProperty>::Adopt(raw);
}

} // namespace

TEST(HotPathAllocations, PlainComparisonsAllocateNothing) {
    const auto i1 = Adopt(PropertyFactory::CreateIntProperty(100, true));
    const auto i2 = Adopt(PropertyFactory::CreateIntProperty(96, true));
    const auto d1 = Adopt(PropertyFactory::CreateDoubleProperty(1.5, true));
    const auto d2 = Adopt(PropertyFactory::CreateDoubleProperty(1.5, true));
    const auto s1 = Adopt(PropertyFactory::CreateStringProperty(kLong, true));
    const auto s2 = Adopt(PropertyFactory::CreateStringProperty(kLong, true));
    std::vector<Port::StringBase<char>> values{kLong, "B"};
    const auto e = Adopt(PropertyFactory::CreateEnumProperty(values, "", true));

    // The counter sees the allocations of the library: copying a long text is one.
    ASSERT_GT(VnTest::AllocationsOf([&] { (void)s1->GetStringProperty(); }), 0);

    bool all = true;
    EXPECT_EQ(VnTest::AllocationsOf([&] {
                  all = all && !i1->Equals(i2, 0) && i1->Equals(i2, VnI::MATCH_WITHIN_5_PERCENT);
                  all = all && d1->Equals(d2, VnI::MATCH_EXACT);
                  all = all && s1->Equals(s2, 0) && s1->Equals(s2, VnI::MATCH_SUBSTRING);
                  all = all && s1->Equals(s2, VnI::MATCH_IGNORE_CASE | VnI::MATCH_SUBSTRING);
                  all = all && e->Equals(s1, 0) && !s1->LessThan(s2, 0);
              }),
              0);
    EXPECT_TRUE(all);
}

TEST(HotPathAllocations, NameLookupBuildsNoString) {
    Vn::Eng::PropertyNameList list;
    list.AddName(kLong, VnI::STRING_TYPE, true);
    const Port::StringBase<char> wanted(kLong);
    const Port::StringBase<char> absent("another text well beyond every small-string buffer");
    int found = 0;
    int missing = 0;
    EXPECT_EQ(VnTest::AllocationsOf([&] {
                  found = list.Contains(wanted);
                  missing = list.Contains(absent);
              }),
              0);
    EXPECT_EQ(found, 0);
    EXPECT_EQ(missing, -1);
}

// A host passes a literal, so every look-up builds a text from it: names up to the
// documented inline limit must not cost an allocation anywhere on that road.
TEST(HotPathAllocations, LookUpsByNamesUpToTheInlineLimitAllocateNothing) {
    const std::string names[] = {std::string(16, 'n'), std::string(31, 'o'),
                                 std::string(Port::StringBase<char>::kInlineCapacity, 'p')};
    Vn::Eng::GenericPropertyHolder holder;
    for (const std::string& name : names) {
        ASSERT_EQ(holder.AddProperty(
                      name.c_str(),
                      RefCountPtr<IProperty>::Adopt(PropertyFactory::CreateIntProperty(1, true))),
                  1);
    }
    const auto replacement =
        RefCountPtr<IProperty>::Adopt(PropertyFactory::CreateIntProperty(2, true));
    for (const std::string& name : names) {
        const char* literal = name.c_str();
        RefCountPtr<IProperty> found;
        EXPECT_EQ(VnTest::AllocationsOf([&] {
                      found = holder.GetPropertyByName(literal);
                      holder.AddProperty(literal, replacement);
                      (void)holder.GetPropertyNames()->Contains(literal);
                      (void)Port::StringBase<char>(literal).Compare(literal,
                                                                    Port::StringBase<char>::kExact);
                  }),
                  0)
            << name.size() << " bytes";
        EXPECT_TRUE(found) << name.size() << " bytes";
    }
    EXPECT_EQ(holder.GetPropertyByName(names[1].c_str()), replacement);
    EXPECT_EQ(holder.GetNumProperties(), 3);
}

TEST(HotPathAllocations, ALongerNameAllocatesWhereTheLimitSays) {
    const std::string name(Port::StringBase<char>::kInlineCapacity + 1, 'q');
    Vn::Eng::GenericPropertyHolder holder;
    holder.AddProperty(name.c_str(),
                       RefCountPtr<IProperty>::Adopt(PropertyFactory::CreateIntProperty(1, true)));
    RefCountPtr<IProperty> found;
    EXPECT_GT(VnTest::AllocationsOf([&] { found = holder.GetPropertyByName(name.c_str()); }), 0);
    EXPECT_TRUE(found);
}
