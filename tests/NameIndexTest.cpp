#include "s/PropertyNameList.h"

#include <gtest/gtest.h>

#include <string>

using Str = Port::StringBase<char>;

// The index grows and probes past collisions; every name must still be found at its own
// position and nothing else found at all, across many growth steps.
TEST(NameIndex, ThousandsOfNamesAreFoundAtTheirPositionsAcrossGrowth) {
    Vn::Eng::PropertyNameList list;
    constexpr int kNames = 5000;
    for (int i = 0; i < kNames; ++i) {
        ASSERT_EQ(list.AddName(Str(("n" + std::to_string(i)).c_str()), VnI::INT_TYPE, true), i);
    }
    for (int i = 0; i < kNames; ++i) {
        EXPECT_EQ(list.Contains(Str(("n" + std::to_string(i)).c_str())), i);
        EXPECT_EQ(list.Contains(Str(("m" + std::to_string(i)).c_str())), -1);
    }
    EXPECT_EQ(list.AddName(Str("n4999"), VnI::INT_TYPE, true), -1);
    list.ClearList();
    EXPECT_EQ(list.Contains(Str("n1")), -1);
    EXPECT_EQ(list.AddName(Str("n1"), VnI::INT_TYPE, true), 0);
}

TEST(NameIndex, TextsAreComparedByEveryByte) {
    Vn::Eng::PropertyNameList list;
    list.AddName(Str("a\0b", 3), VnI::INT_TYPE, true);
    list.AddName(Str("a"), VnI::INT_TYPE, true);
    list.AddName(Str(""), VnI::INT_TYPE, true);
    EXPECT_EQ(list.Contains(Str("a\0b", 3)), 0);
    EXPECT_EQ(list.Contains(Str("a\0c", 3)), -1);
    EXPECT_EQ(list.Contains(Str("a")), 1);
    EXPECT_EQ(list.Contains(Str("")), 2);
    EXPECT_EQ(list.Contains(Str("A")), -1);
}
