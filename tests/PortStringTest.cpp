//===-- tests/PortStringTest.cpp - the port string keeps bytes; compares, finds, formats -===//
#include "Port/Regexp.h"
#include "Port/StringBase.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdint>
#include <string>
#include <utility>

using Port::StringBase;
using Str = StringBase<char>;

namespace {
constexpr unsigned int kWholeText = 0xFFFFFFFFu;
}

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

// Texts up to kInlineCapacity bytes live in the object and longer ones on the heap; every
// operation must give the same bytes on both sides of that line and across it.
TEST(PortString, KeepsItsBytesAcrossTheInlineLimit) {
    const std::size_t limit = Str::kInlineCapacity;
    for (std::size_t n : {limit - 1, limit, limit + 1, 2 * limit + 3}) {
        const std::string bytes = std::string(n - 1, 'q') + '\0';
        Str text(bytes.data(), static_cast<unsigned int>(n));
        ASSERT_EQ(text.GetLength(), n);
        EXPECT_EQ(text.view(), bytes);
        EXPECT_EQ(text.c_str()[n], '\0') << n;

        Str copy(text);
        Str moved(std::move(copy));
        EXPECT_EQ(moved, text) << n;
        EXPECT_TRUE(copy.IsEmpty()) << "a moved-from text is left empty"; // NOLINT
        EXPECT_EQ(copy.c_str()[0], '\0');

        Str assigned("x");
        assigned = text;
        EXPECT_EQ(assigned, text);
        assigned = Str("short again");
        EXPECT_EQ(assigned.view(), "short again") << "shrinking from " << n;
    }
}

TEST(PortString, AppendsAndInsertsItsOwnBytes) {
    // The source lies inside the text being changed: short, long, and growing past the
    // inline limit while reading from the inline bytes.
    for (std::size_t n : {5u, 30u, 47u, 60u}) {
        const std::string start(n, 'a');
        Str text(start.c_str());
        text.Append(text.c_str(), kWholeText);
        EXPECT_EQ(text.str(), start + start);

        std::string model = start + start;
        text.Insert(1, text.c_str() + 2, 3);
        model.insert(1, model.substr(2, 3));
        EXPECT_EQ(text.str(), model) << n;

        text = text.c_str() + 1;
        EXPECT_EQ(text.str(), model.substr(1)) << n;

        text += text;
        EXPECT_EQ(text.str(), model.substr(1) + model.substr(1)) << n;
    }
}

// Random edits checked against std::string, with lengths that keep crossing the limit.
TEST(PortString, AgreesWithStdStringOverRandomEdits) {
    std::uint32_t seed = 12345;
    const auto next = [&seed](std::uint32_t below) {
        seed = seed * 1664525u + 1013904223u;
        return (seed >> 8) % below;
    };
    Str text;
    std::string model;
    for (int step = 0; step < 4000; ++step) {
        const std::string piece(next(40), static_cast<char>('a' + next(26)));
        switch (next(6)) {
        case 0:
            text.Append(piece.data(), static_cast<unsigned int>(piece.size()));
            model += piece;
            break;
        case 1: {
            const auto at = next(static_cast<std::uint32_t>(model.size() + 5));
            text.Insert(at, piece.c_str(), kWholeText);
            model.insert(std::min<std::size_t>(at, model.size()), piece);
            break;
        }
        case 2:
            text = piece.c_str();
            model = piece;
            break;
        case 3:
            text.MakeUpper();
            for (char& c : model) {
                c = static_cast<char>(c >= 'a' && c <= 'z' ? c - 'a' + 'A' : c);
            }
            break;
        case 4:
            if (model.size() > 200) {
                text.Clear();
                model.clear();
            }
            break;
        default: {
            const Str copy = text;
            text = copy;
            break;
        }
        }
        ASSERT_EQ(text.view(), model) << "step " << step;
        ASSERT_EQ(text.c_str()[model.size()], '\0') << "step " << step;
    }
}
