//===-- tests/NameIndexTest.cpp - the name index finds every name, collisions included -===//
#include "s/internal/NameIndex.h"
#include "s/PropertyNameList.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <string>
#include <vector>

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

// Names of up to eight bytes are told apart by their length and packed bytes alone, longer
// ones also by their stored text; every length around those limits, NUL bytes anywhere
// and a change at any one byte must still tell names apart.
TEST(NameIndex, EveryLengthAndEveryByteCounts) {
    std::vector<std::string> names;
    for (std::size_t length : {0, 1, 2, 3, 4, 5, 6, 7, 8, 9, 15, 16, 17, 24, 254, 255, 256, 300}) {
        std::string text;
        for (std::size_t i = 0; i < length; ++i) {
            text.push_back(static_cast<char>(i % 7 == 3 ? 0 : 'a' + i % 26));
        }
        names.push_back(text);
    }
    Vn::Eng::detail::NameIndex index;
    for (std::size_t i = 0; i < names.size(); ++i) {
        ASSERT_EQ(index.Append(names[i]), i);
    }
    for (std::size_t i = 0; i < names.size(); ++i) {
        const std::string& name = names[i];
        EXPECT_EQ(index.Find(name), static_cast<int>(i)) << "length " << name.size();
        const auto listedAt = [&](const std::string& text) {
            const auto at = std::find(names.begin(), names.end(), text);
            return at == names.end() ? -1 : static_cast<int>(at - names.begin());
        };
        EXPECT_EQ(index.Find(name + '\0'), listedAt(name + '\0')) << "length " << name.size();
        for (std::size_t at = 0; at < name.size(); ++at) {
            std::string changed = name;
            changed[at] = static_cast<char>(changed[at] ^ 0x20);
            ASSERT_EQ(index.Find(changed), -1) << "length " << name.size() << " byte " << at;
        }
        if (!name.empty()) {
            const std::string shorter = name.substr(0, name.size() - 1);
            EXPECT_EQ(index.Find(shorter), listedAt(shorter)) << "length " << name.size();
        }
    }
    // Long names that share their first eight bytes and their capped length.
    EXPECT_EQ(index.Find(std::string(names.back()).replace(299, 1, "!")), -1);
    EXPECT_EQ(index.Find(std::string(names.back(), 0, 299)), -1);
}

// Appending keeps every earlier answer while the table doubles, and clearing forgets all.
TEST(NameIndex, EmptyAndClearedIndexesFindNothing) {
    Vn::Eng::detail::NameIndex index;
    EXPECT_EQ(index.Find(""), -1);
    EXPECT_EQ(index.Find("a long name of many bytes"), -1);
    index.Append("");
    EXPECT_EQ(index.Find(""), 0);
    EXPECT_EQ(index.Find(std::string_view("\0", 1)), -1);
    index.Clear();
    EXPECT_EQ(index.Find(""), -1);
    EXPECT_EQ(index.Append("x"), 0u);
    EXPECT_EQ(index.Find("x"), 0);
}

// "nctmsx" and "nzmaos" share the 24 hash bits a slot keeps and their first probe in a
// fresh table: only the packed bytes can tell them apart.
TEST(NameIndex, NamesWhoseHashesCollideStayApart) {
    Vn::Eng::detail::NameIndex index;
    index.Append("nctmsx");
    EXPECT_EQ(index.Find("nzmaos"), -1);
    index.Append("nzmaos");
    EXPECT_EQ(index.Find("nctmsx"), 0);
    EXPECT_EQ(index.Find("nzmaos"), 1);
}
