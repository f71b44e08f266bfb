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

namespace {

// Names a user meets and the ones that trip an index up: empty, NUL bytes inside and at
// the end, heads shared up to eight bytes, long names, names that differ in their last
// byte only. `count` of them, all distinct.
std::vector<std::string> AwkwardNames(std::size_t count) {
    std::vector<std::string> names;
    for (std::size_t i = 0; names.size() < count; ++i) {
        switch (i % 6) {
        case 0:
            names.push_back("P" + std::to_string(i));
            break;
        case 1:
            names.push_back(std::string("a\0", 2) + std::to_string(i));
            break;
        case 2:
            names.push_back("Highlight Color " + std::to_string(i));
            break;
        case 3:
            names.push_back(std::string(300, 'x') + std::to_string(i));
            break;
        case 4:
            names.push_back(std::to_string(i) + std::string(1, '\0'));
            break;
        default:
            names.push_back(i == 5 ? std::string() : "12345678" + std::to_string(i));
            break;
        }
    }
    return names;
}

} // namespace

// Small lists are scanned and larger ones hashed; the answers must not depend on which.
// Every size around the change is checked, in a bare index and in a list.
TEST(NameIndex, ScannedAndHashedListsGiveTheSameAnswers) {
    using Vn::Eng::detail::NameIndex;
    for (std::size_t count :
         {std::size_t{1}, NameIndex::kScanLimit - 1, NameIndex::kScanLimit,
          NameIndex::kScanLimit + 1, 2 * NameIndex::kScanLimit + 1, std::size_t{200}}) {
        SCOPED_TRACE(count);
        const auto names = AwkwardNames(count);
        Vn::Eng::PropertyNameList list;
        NameIndex index;
        for (std::size_t i = 0; i < count; ++i) {
            ASSERT_EQ(list.AddName(Str(names[i]), VnI::INT_TYPE, true), static_cast<int>(i));
            ASSERT_EQ(index.Append(names[i], static_cast<std::uint8_t>(i)), i);
        }
        EXPECT_EQ(index.HasTable(), count > NameIndex::kScanLimit);
        for (std::size_t i = 0; i < count; ++i) {
            const std::string& name = names[i];
            EXPECT_EQ(list.Contains(Str(name)), static_cast<int>(i)) << i;
            EXPECT_EQ(index.Find(name), static_cast<int>(i)) << i;
            EXPECT_EQ(index.Text(i), name) << i;
            EXPECT_EQ(index.Extra(i), static_cast<std::uint8_t>(i)) << i;
            // A duplicate is refused and changes nothing.
            EXPECT_EQ(list.AddName(Str(name), VnI::STRING_TYPE, false), -1) << i;
            // Near misses: one byte more, one less, one changed.
            EXPECT_EQ(list.Contains(Str(name + 'z')), -1) << i;
            if (!name.empty()) {
                std::string changed = name;
                changed.back() = static_cast<char>(changed.back() ^ 1);
                EXPECT_EQ(list.Contains(Str(changed)), -1) << i;
                const std::string shorter = name.substr(0, name.size() - 1);
                const auto at = std::find(names.begin(), names.end(), shorter);
                EXPECT_EQ(index.Find(shorter),
                          at == names.end() ? -1 : static_cast<int>(at - names.begin()))
                    << i;
            }
        }
        EXPECT_EQ(list.GetNumNames(), static_cast<int>(count));
        // The names made on request carry every byte of their texts.
        for (std::size_t i = 0; i < count; ++i) {
            ASSERT_NE(list.GetPropertyName(static_cast<int>(i)), nullptr);
            EXPECT_EQ(list.GetPropertyName(static_cast<int>(i))->GetName().view(), names[i]) << i;
        }
        // A copy keeps answering after the original is cleared.
        NameIndex copy = index;
        index.Clear();
        EXPECT_EQ(index.Find(names[0]), -1);
        EXPECT_EQ(copy.Find(names[count - 1]), static_cast<int>(count - 1));
    }
}

// Entries and texts share one block and grow at their own paces: long texts after short
// ones, many short ones after long ones. A copy is cut to size and must grow again on its
// own, leaving the original as it was; a cleared index reuses its block.
TEST(NameIndex, TextsAndExtrasSurviveEveryGrowthOfTheBlock) {
    using Vn::Eng::detail::NameIndex;
    std::vector<std::string> names;
    for (std::size_t i = 0; i < 40; ++i) {
        names.push_back(i % 10 == 3 ? std::string(100 + i, static_cast<char>('a' + i % 26))
                                    : "p" + std::to_string(i));
    }
    NameIndex index;
    const auto check = [&](const NameIndex& checked, std::size_t count) {
        ASSERT_EQ(checked.Size(), count);
        for (std::size_t i = 0; i < count; ++i) {
            EXPECT_EQ(checked.Text(i), names[i]) << i;
            EXPECT_EQ(checked.Extra(i), static_cast<std::uint8_t>(i * 7)) << i;
            EXPECT_EQ(checked.Find(names[i]), static_cast<int>(i)) << i;
        }
        for (std::size_t i = count; i < names.size(); ++i) {
            EXPECT_EQ(checked.Find(names[i]), -1) << i;
        }
    };
    for (std::size_t i = 0; i < 20; ++i) {
        const auto key = NameIndex::MakeKey(names[i]);
        ASSERT_EQ(index.Find(names[i], key), -1);
        ASSERT_EQ(index.Append(names[i], static_cast<std::uint8_t>(i * 7), key), i);
        check(index, i + 1);
    }
    NameIndex copy = index;
    for (std::size_t i = 20; i < names.size(); ++i) {
        ASSERT_EQ(copy.Append(names[i], static_cast<std::uint8_t>(i * 7)), i);
    }
    check(copy, names.size());
    check(index, 20);
    copy = index;
    check(copy, 20);

    index.Clear();
    check(index, 0);
    for (std::size_t i = 0; i < names.size(); ++i) {
        ASSERT_EQ(index.Append(names[i], static_cast<std::uint8_t>(i * 7)), i);
    }
    check(index, names.size());
    check(copy, 20);
}
