//===-- tests/SpillTest.cpp - a spill keeps entries oldest first and drops either end -===//
#include "s/internal/Spill.h"

#include <gtest/gtest.h>

#include <vector>

namespace {

using Vn::Eng::detail::Spill;

std::vector<int> All(Spill<const char, int>& spill) {
    std::vector<int> out;
    spill.ForEach([&out](int e) { out.push_back(e); });
    return out;
}

TEST(Spill, KeepsEntriesOldestFirstAndAnswersBothEnds) {
    const char key = 'k';
    Spill<const char, int> spill(&key, 1);
    EXPECT_EQ(spill.GetKey(), &key);
    EXPECT_EQ(spill.Oldest(), 1);
    EXPECT_EQ(spill.Newest(), 1) << "one entry is oldest and newest";
    spill.Append(2);
    spill.Append(3);
    EXPECT_EQ(spill.Size(), 3u);
    EXPECT_EQ(spill.Oldest(), 1);
    EXPECT_EQ(spill.Newest(), 3);
    EXPECT_EQ(All(spill), (std::vector<int>{1, 2, 3}));
}

TEST(Spill, DropsFromEitherEndAndSaysWhenTheLastWouldGo) {
    const char key = 'k';
    Spill<const char, int> spill(&key, 1);
    spill.Append(2);
    spill.Append(3);
    spill.Append(4);
    EXPECT_TRUE(spill.DropOldest());
    EXPECT_EQ(spill.Oldest(), 2) << "the next oldest moves inline";
    EXPECT_TRUE(spill.DropNewest());
    EXPECT_EQ(spill.Newest(), 3);
    EXPECT_EQ(All(spill), (std::vector<int>{2, 3}));
    EXPECT_TRUE(spill.DropOldest());
    // The last entry is never dropped: the owner frees the spent Spill instead.
    EXPECT_FALSE(spill.DropOldest());
    EXPECT_FALSE(spill.DropNewest());
    EXPECT_EQ(All(spill), (std::vector<int>{3}));
}

TEST(Spill, SpentEntriesLeaveOnlyOnceTheyReachTheFront) {
    // The selection marks an entry spent wherever it stands (0 here); only the spent
    // entries in front are dropped, so the oldest entry in use comes first.
    const char key = 'k';
    Spill<const char, int> spill(&key, 0);
    spill.Append(0);
    spill.Append(5);
    spill.Append(0);
    spill.Append(7);
    const auto spent = [](int e) { return e == 0; };
    EXPECT_TRUE(spill.DropOldestWhile(spent));
    EXPECT_EQ(All(spill), (std::vector<int>{5, 0, 7}));
    EXPECT_TRUE(spill.DropOldestWhile(spent)) << "nothing spent in front: nothing dropped";
    EXPECT_EQ(spill.Size(), 3u);
    spill.ForEach([](int& e) { e = 0; });
    EXPECT_FALSE(spill.DropOldestWhile(spent)) << "all spent";
}

} // namespace
