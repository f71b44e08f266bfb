//===-- tests/UtilitiesCompareTest.cpp - the name predicates are strict weak orderings -===//
#include "s/Utilities.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <string>
#include <vector>

using Port::StringBase;
using Vn::Eng::Utilities;

namespace {

struct PredicateRow {
    const char* a;
    const char* b;
    bool numLess;
    bool strLess;
};

std::vector<std::string> Sorted(std::vector<std::string> texts,
                                bool (*less)(const StringBase<char>&, const StringBase<char>&)) {
    std::vector<StringBase<char>> names(texts.begin(), texts.end());
    std::stable_sort(names.begin(), names.end(), less);
    std::vector<std::string> out;
    out.reserve(names.size());
    for (const auto& name : names) {
        out.push_back(name.str());
    }
    return out;
}

} // namespace

TEST(NameComparison, AnswersThePublishedTable) {
    // Rows whose num_compare result belongs to the text reader are checked for the byte
    // order only below; here texts that are no number count as 0.
    const PredicateRow rows[] = {
        {"9", "10", true, false},  {"10", "9", false, true},   {"7", "007", false, false},
        {"007", "7", false, true}, {"ab", "abc", false, true}, {"abc", "ab", false, false},
        {"B", "a", false, true},   {"", "", false, false},     {"", "a", false, true},
        {"0", "", false, false},   {"a", "1", true, false},    {"Z", "a", false, true},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(std::string("a=\"") + row.a + "\" b=\"" + row.b + "\"");
        EXPECT_EQ(Utilities::num_compare(row.a, row.b), row.numLess);
        EXPECT_EQ(Utilities::str_compare(row.a, row.b), row.strLess);
    }
}

TEST(NameComparison, NumbersTheReaderRejectsCountAsZero) {
    // Above 4294967295, signs, blanks and mixed text read no number.
    for (const char* notANumber :
         {"4294967296", "99999999999999999999", "-1", " 5", "5 ", "12a", "x", ""}) {
        SCOPED_TRACE(notANumber);
        EXPECT_TRUE(Utilities::num_compare(notANumber, "1"));
        EXPECT_FALSE(Utilities::num_compare("1", notANumber));
        EXPECT_FALSE(Utilities::num_compare(notANumber, "0"));
        EXPECT_FALSE(Utilities::num_compare("0", notANumber));
    }
    EXPECT_TRUE(Utilities::num_compare("4294967294", "4294967295"));
    EXPECT_FALSE(Utilities::num_compare("4294967295", "4294967294"));
}

TEST(NameComparison, ByteOrderIsUnsignedAndLengthCounted) {
    // Bytes above 0x7F sort after ASCII, and a NUL inside a text is a byte like any other.
    EXPECT_TRUE(Utilities::str_compare("z", "\xC3\xA9"));
    EXPECT_FALSE(Utilities::str_compare("\xC3\xA9", "z"));
    const StringBase<char> withNul("a\0b", 3);
    const StringBase<char> shorter("a", 1);
    EXPECT_TRUE(Utilities::str_compare(shorter, withNul));
    EXPECT_FALSE(Utilities::str_compare(withNul, shorter));
    EXPECT_TRUE(Utilities::str_compare(withNul, StringBase<char>("a\0c", 3)));
}

TEST(NameComparison, SortsPinNamesByNumber) {
    EXPECT_EQ(Sorted({"10", "9", "100", "007", "1", "0"}, Utilities::num_compare),
              (std::vector<std::string>{"0", "1", "007", "9", "10", "100"}));
    // Texts that are no number tie with 0 and keep their order in a stable sort.
    EXPECT_EQ(Sorted({"12", "IO_L1P", "3", "", "4294967296", "0"}, Utilities::num_compare),
              (std::vector<std::string>{"IO_L1P", "", "4294967296", "0", "3", "12"}));
}

TEST(NameComparison, SortsNamesByBytes) {
    EXPECT_EQ(Sorted({"b", "B", "ab", "a", "", "10", "9", "abc"}, Utilities::str_compare),
              (std::vector<std::string>{"", "10", "9", "B", "a", "ab", "abc", "b"}));
}

TEST(NameComparison, BothPredicatesAreStrictWeakOrderings) {
    const std::vector<StringBase<char>> names = {"",   "0", "00", "1",          "01",         "9",
                                                 "10", "x", "X",  "4294967295", "4294967296", "ab"};
    for (auto less : {Utilities::num_compare, Utilities::str_compare}) {
        for (const auto& a : names) {
            EXPECT_FALSE(less(a, a)) << a.str();
            for (const auto& b : names) {
                EXPECT_FALSE(less(a, b) && less(b, a)) << a.str() << " / " << b.str();
                for (const auto& c : names) {
                    if (less(a, b) && less(b, c)) {
                        EXPECT_TRUE(less(a, c)) << a.str() << " < " << b.str() << " < " << c.str();
                    }
                    // Incomparability is transitive: equal-ranked names form classes.
                    const bool abTie = !less(a, b) && !less(b, a);
                    const bool bcTie = !less(b, c) && !less(c, b);
                    if (abTie && bcTie) {
                        EXPECT_TRUE(!less(a, c) && !less(c, a));
                    }
                }
            }
        }
    }
}
