//===-- tests/PortStringTest.cpp - the port string keeps bytes; compares, finds, formats -===//
#include "Port/Regexp.h"
#include "Port/StringBase.h"

#include <gtest/gtest.h>

#include <string>

using Port::StringBase;
using Str = StringBase<char>;

TEST(PortString, HoldsNulBytesAndComparesByLengthAndBytes) {
    const Str a("a\0b", 3);
    const Str b("a\0c", 3);
    EXPECT_EQ(a.GetLength(), 3u);
    EXPECT_NE(a, b);
    EXPECT_LT(a.Compare(b, Str::kExact), 0);
    EXPECT_EQ(a, Str("a\0b", 3));
    EXPECT_NE(Str("a"), a) << "a prefix up to the NUL byte is not the same text";
}

TEST(PortString, CompareTypesOrderAsDocumented) {
    EXPECT_EQ(Str("Bank").Compare(Str("BANK"), Str::kIgnoreCase), 0);
    EXPECT_NE(Str("Bank").Compare(Str("BANK"), Str::kExact), 0);
    // Type 3 is unsigned byte order: upper case before lower case, high bytes last,
    // a proper prefix first.
    EXPECT_LT(Str("B").Compare(Str("a"), Str::kByteOrder), 0);
    EXPECT_LT(Str("z").Compare(Str("\xC3"), Str::kByteOrder), 0);
    EXPECT_LT(Str("ab").Compare(Str("abc"), Str::kByteOrder), 0);
    EXPECT_GT(Str("abc").Compare(Str("ab"), Str::kByteOrder), 0);
    EXPECT_EQ(Str().Compare(Str(), Str::kByteOrder), 0);
}

TEST(PortString, FindsSubstringsWithAndWithoutCase) {
    const Str text("Bank12");
    EXPECT_EQ(text.GetIndexOfString(Str("nk"), Str::kExact), 2u);
    EXPECT_EQ(text.GetIndexOfString(Str("bank"), Str::kExact), Str::npos);
    EXPECT_EQ(text.GetIndexOfString(Str("bank"), Str::kIgnoreCase), 0u);
    EXPECT_EQ(text.GetIndexOfString(Str("K1"), Str::kIgnoreCase), 3u);
    EXPECT_EQ(text.GetIndexOfString(Str(""), Str::kIgnoreCase), 0u);
    EXPECT_EQ(Str("").GetIndexOfString(Str("x"), Str::kIgnoreCase), Str::npos);
}

TEST(PortString, MakeUpperChangesOnlyAsciiLetters) {
    Str text("ab-1\xE9z");
    text.MakeUpper();
    EXPECT_EQ(text, Str("AB-1\xE9Z"));
}

TEST(PortString, AppendAndInsertTakeTheWholeCTextForAllOnes) {
    Str text("ac");
    text.Insert(1, "bXX", 1);
    EXPECT_EQ(text, Str("abc"));
    text.Append("def", 0xFFFFFFFFu);
    EXPECT_EQ(text, Str("abcdef"));
    text.Insert(0xFFFFFFFFu, "!", 0xFFFFFFFFu);
    EXPECT_EQ(text, Str("abcdef!"));
    text.Append(nullptr, 5);
    EXPECT_EQ(text.GetLength(), 7u);
}

TEST(PortString, FormatNeverTruncatesAndTreatsArgumentsAsText) {
    const std::string big(100000, 'x');
    Str text;
    text.Format("[%s]", big.c_str());
    EXPECT_EQ(text.GetLength(), big.size() + 2);
    // A '%' inside an argument is text, not a directive.
    text.Format("%s", "100%s %n");
    EXPECT_EQ(text, Str("100%s %n"));
    text.Format("%d%%", 5);
    EXPECT_EQ(text, Str("5%"));
}

TEST(PortString, GetUint32ReadsOnlyPlainDecimalNumbersInsideTheText) {
    unsigned int value = 77;
    EXPECT_TRUE(Str("4294967295").GetUINT32({0, 9}, &value));
    EXPECT_EQ(value, 4294967295u);
    EXPECT_TRUE(Str("007").GetUINT32({0, 2}, &value));
    EXPECT_EQ(value, 7u);
    EXPECT_TRUE(Str("ab12cd").GetUINT32({2, 3}, &value));
    EXPECT_EQ(value, 12u);

    value = 77;
    EXPECT_FALSE(Str("4294967296").GetUINT32({0, 9}, &value)) << "one above the largest";
    EXPECT_FALSE(Str("99999999999999999999").GetUINT32({0, 19}, &value));
    EXPECT_FALSE(Str("12a").GetUINT32({0, 2}, &value));
    EXPECT_FALSE(Str(" 12").GetUINT32({0, 2}, &value));
    EXPECT_FALSE(Str("-1").GetUINT32({0, 1}, &value));
    // The empty text's whole range ends at 0 - 1 in unsigned arithmetic.
    EXPECT_FALSE(Str("").GetUINT32({0, 0xFFFFFFFFu}, &value));
    EXPECT_FALSE(Str("12").GetUINT32({0, 2}, &value)) << "range past the end";
    EXPECT_FALSE(Str("12").GetUINT32({1, 0}, &value)) << "reversed range";
    EXPECT_EQ(value, 77u) << "a refused read writes nothing";
}

TEST(PortString, RangeOfMatchIsInclusiveAndSaysWhenNothingMatched) {
    const Str text("Bank12");
    Port_Range r = text.GetRangeOfMatch(Port_Regexp("ank"));
    EXPECT_EQ(r.first, 1u);
    EXPECT_EQ(r.second, 3u);
    r = text.GetRangeOfMatch(Port_Regexp("[0-9]+"));
    EXPECT_EQ(r.first, 4u);
    EXPECT_EQ(r.second, 5u);
    r = text.GetRangeOfMatch(Port_Regexp("zzz"));
    EXPECT_TRUE(r.first != 0 || r.second < r.first);
    // An empty match at the start still starts at 0 and is not "second below first".
    r = Str("").GetRangeOfMatch(Port_Regexp(".*"));
    EXPECT_EQ(r.first, 0u);
    EXPECT_GE(r.second, r.first);
}
