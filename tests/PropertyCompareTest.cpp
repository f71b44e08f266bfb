//===-- tests/PropertyCompareTest.cpp - Equals and LessThan answer the table for each type -===//
//
// Equals and LessThan of every property type under the compare flags. Each row of the
// tables runs as a test of its own, so a fault names the exact case it breaks.
//
//===------------------------------------------------------------------------------===//
#include "s/ColorProperty.h"
#include "s/Property.h"
#include "s/PropertyFactory.h"

#include <gtest/gtest.h>

#include <cmath>
#include <functional>
#include <limits>
#include <string>
#include <vector>

using CommonI::RefCountPtr;
using Vn::Eng::PropertyFactory;
using VnI::IProperty;
using namespace VnI; // the MATCH_* flags read as in callers' code

namespace {

using Prop = RefCountPtr<const IProperty>;
using Maker = std::function<Prop()>;

Prop Adopt(IProperty* raw) {
    return Prop::Adopt(raw);
}

Maker Int(int v) {
    return [v] { return Adopt(PropertyFactory::CreateIntProperty(v, true)); };
}
Maker Dbl(double v) {
    return [v] { return Adopt(PropertyFactory::CreateDoubleProperty(v, true)); };
}
Maker Str(std::string v) {
    return [v] {
        return Adopt(PropertyFactory::CreateStringProperty(Port::StringBase<char>(v), true));
    };
}
Maker Bool(bool v) {
    return [v] { return Adopt(PropertyFactory::CreateBoolProperty(v, true)); };
}
Maker Rgb(int r, int g, int b) {
    return [=] {
        return Adopt(PropertyFactory::CreateColorProperty(
            static_cast<char>(r), static_cast<char>(g), static_cast<char>(b), true));
    };
}
Maker Rgb(int packed) {
    return [=] { return Adopt(PropertyFactory::CreateColorProperty(packed, true)); };
}
// Enumerations over A, B, C at the given text; the list outlives every test.
std::vector<Port::StringBase<char>>& Abc() {
    static std::vector<Port::StringBase<char>> values{"A", "B", "C"};
    return values;
}
Maker Enum(const char* current) {
    return [current] { return Adopt(PropertyFactory::CreateEnumProperty(Abc(), current, true)); };
}
Maker Null() {
    return [] { return Prop(); };
}

struct Row {
    const char* name;
    Maker self;
    Maker other;
    int flags;
    bool expected;
};

void PrintTo(const Row& row, std::ostream* os) {
    *os << row.name;
}

std::string RowName(const testing::TestParamInfo<Row>& info) {
    return info.param.name;
}

// clang-format off
const Row kEqualsRows[] = {
    // MATCH_ANY is looked at before anything else, the other's type included.
    {"AnyIntAgainstText",            Int(5),    Str("x"),  MATCH_ANY, true},
    {"AnyTextAgainstColour",         Str("x"),  Rgb(1),    MATCH_ANY, true},
    {"AnyBoolAgainstDouble",         Bool(true), Dbl(1),   MATCH_ANY, true},
    {"AnyEnumAgainstColour",         Enum("C"), Rgb(1),    MATCH_ANY, true},
    {"AnyColourAgainstInt",          Rgb(1),    Int(1),    MATCH_ANY, true},
    {"AnyBeatsExactOnUnequalInts",   Int(5),    Int(6),    MATCH_ANY | MATCH_EXACT, true},
    {"AnyAgainstNoProperty",         Int(5),    Null(),    MATCH_ANY, true},
    {"NoPropertyIsNeverEqual",       Int(5),    Null(),    0, false},
    {"NoPropertyIsNeverEqualText",   Str("a"),  Null(),    0, false},

    // Integers.
    {"IntPlainEqual",                Int(5),    Int(5),    0, true},
    {"IntPlainUnequal",              Int(5),    Int(6),    0, false},
    {"IntExactEqual",                Int(5),    Int(5),    MATCH_EXACT, true},
    {"IntExactOverridesLess",        Int(5),    Int(6),    MATCH_EXACT | MATCH_LESS, false},
    {"IntExactOverridesWithin",      Int(100),  Int(96),   MATCH_EXACT | MATCH_WITHIN_5_PERCENT, false},
    {"IntLessTrue",                  Int(5),    Int(6),    MATCH_LESS, true},
    {"IntLessFalseWhenAbove",        Int(6),    Int(5),    MATCH_LESS, false},
    {"IntLessFalseWhenEqual",        Int(5),    Int(5),    MATCH_LESS, false},
    {"IntGreaterTrue",               Int(6),    Int(5),    MATCH_GREATER, true},
    {"IntGreaterFalseWhenEqual",     Int(5),    Int(5),    MATCH_GREATER, false},
    {"IntLessDecidesBeforeGreater",  Int(6),    Int(5),    MATCH_LESS | MATCH_GREATER, false},
    {"IntLessDecidesBeforeWithin",   Int(100),  Int(96),   MATCH_LESS | MATCH_WITHIN_5_PERCENT, false},
    {"IntGreaterDecidesBeforeWithin", Int(100), Int(104),  MATCH_GREATER | MATCH_WITHIN_5_PERCENT, false},
    {"IntWithinLowerBound",          Int(100),  Int(95),   MATCH_WITHIN_5_PERCENT, true},
    {"IntWithinUpperBound",          Int(100),  Int(105),  MATCH_WITHIN_5_PERCENT, true},
    {"IntWithinBelowLowerBound",     Int(100),  Int(94),   MATCH_WITHIN_5_PERCENT, false},
    {"IntWithinAboveUpperBound",     Int(100),  Int(106),  MATCH_WITHIN_5_PERCENT, false},
    {"IntWithinNegativeMatchesNothing", Int(-100), Int(-100), MATCH_WITHIN_5_PERCENT, false},
    {"IntWithinZeroMatchesZero",     Int(0),    Int(0),    MATCH_WITHIN_5_PERCENT, true},
    {"IntWithinZeroRejectsOne",      Int(0),    Int(1),    MATCH_WITHIN_5_PERCENT, false},
    {"IntWithinLargeValuesInDouble", Int(2000000000), Int(2099999999), MATCH_WITHIN_5_PERCENT, true},
    {"IntTextBitsMeanEquality",      Int(5),    Int(5),    MATCH_IGNORE_CASE | MATCH_SUBSTRING, true},
    {"IntTextBitsRejectUnequal",     Int(5),    Int(6),    MATCH_IGNORE_CASE, false},
    {"IntRegexpMeansEquality",       Int(5),    Int(5),    MATCH_REGEXP, true},
    {"IntAgainstDoubleOfSameValue",  Int(5),    Dbl(5.0),  0, false},
    {"IntAgainstEnumAtThatIndex",    Int(2),    Enum("C"), 0, false},

    // Reals.
    {"DoublePlainEqual",             Dbl(1.5),  Dbl(1.5),  0, true},
    {"DoublePlainUnequal",           Dbl(1.5),  Dbl(1.25), 0, false},
    {"DoubleNaNNeverEqualItself",    Dbl(NAN),  Dbl(NAN),  0, false},
    {"DoubleNaNOnTheOtherSide",      Dbl(1.0),  Dbl(NAN),  MATCH_EXACT, false},
    {"DoubleNaNNeverWithin",         Dbl(NAN),  Dbl(NAN),  MATCH_WITHIN_5_PERCENT, false},
    {"DoubleNaNNeverLess",           Dbl(NAN),  Dbl(1.0),  MATCH_LESS, false},
    {"DoubleLess",                   Dbl(1.0),  Dbl(2.0),  MATCH_LESS, true},
    {"DoubleGreater",                Dbl(2.0),  Dbl(1.0),  MATCH_GREATER, true},
    {"DoubleWithin",                 Dbl(2.0),  Dbl(2.09), MATCH_WITHIN_5_PERCENT, true},
    {"DoubleOutsideWithin",          Dbl(2.0),  Dbl(2.11), MATCH_WITHIN_5_PERCENT, false},
    {"DoubleInfinityEqualsItself",   Dbl(INFINITY), Dbl(INFINITY), 0, true},
    {"DoubleAgainstInt",             Dbl(5.0),  Int(5),    0, false},

    // Texts.
    {"TextPlainEqual",               Str("Bank12"), Str("Bank12"), 0, true},
    {"TextPlainCaseMatters",         Str("Bank12"), Str("bank12"), 0, false},
    {"TextPlainLengthMatters",       Str("Bank12"), Str("Bank1"), 0, false},
    {"TextEmptyEqualsEmpty",         Str(""),   Str(""),   0, true},
    {"TextEmbeddedNulCounts",        Str(std::string("a\0b", 3)), Str(std::string("a\0c", 3)), 0, false},
    {"TextIgnoreCase",               Str("Bank12"), Str("bANK12"), MATCH_IGNORE_CASE, true},
    {"TextIgnoreCaseNotSubstring",   Str("Bank12"), Str("bank"), MATCH_IGNORE_CASE, false},
    {"TextExactOverridesIgnoreCase", Str("Bank12"), Str("bank12"), MATCH_EXACT | MATCH_IGNORE_CASE, false},
    {"TextSubstringIgnoringCase",    Str("Bank12"), Str("bank"), MATCH_IGNORE_CASE | MATCH_SUBSTRING, true},
    {"TextSubstringKeepsCase",       Str("Bank12"), Str("bank"), MATCH_SUBSTRING, false},
    {"TextSubstringInside",          Str("Bank12"), Str("nk1"),  MATCH_SUBSTRING, true},
    {"TextSubstringLongerThanValue", Str("Bank"), Str("Bank12"), MATCH_SUBSTRING, false},
    {"TextEmptySubstringIsFound",    Str("Bank12"), Str(""),   MATCH_SUBSTRING, true},
    {"TextExactOverridesSubstring",  Str("Bank12"), Str("nk1"), MATCH_EXACT | MATCH_SUBSTRING, false},
    {"TextLessNeverMatches",         Str("a"),  Str("b"),  MATCH_LESS, false},
    {"TextGreaterNeverMatches",      Str("b"),  Str("a"),  MATCH_GREATER, false},
    {"TextWithinNeverMatches",       Str("a"),  Str("a"),  MATCH_WITHIN_5_PERCENT, false},
    {"TextAgainstEnumOfSameText",    Str("C"),  Enum("C"), 0, false},
    {"TextAgainstInt",               Str("12"), Int(12),   0, false},

    // Texts under regular expressions: the match must start the value.
    {"RegexpPrefixMatches",          Str("Bank12"), Str("Ban"), MATCH_REGEXP, true},
    {"RegexpDotStar",                Str("Bank12"), Str("B.*2"), MATCH_REGEXP, true},
    {"RegexpNotAtStart",             Str("Bank12"), Str("ank"), MATCH_REGEXP, false},
    {"RegexpSubstringAnywhere",      Str("Bank12"), Str("ank"), MATCH_REGEXP | MATCH_SUBSTRING, true},
    {"RegexpKeepsCase",              Str("Bank12"), Str("bank"), MATCH_REGEXP, false},
    {"RegexpIgnoringCase",           Str("Bank12"), Str("bank"), MATCH_REGEXP | MATCH_IGNORE_CASE, true},
    {"RegexpIgnoringCaseLowerValue", Str("bank12"), Str("BANK"), MATCH_REGEXP | MATCH_IGNORE_CASE, true},
    {"RegexpIgnoringCaseKeepsDigitClass", Str("BANK1"), Str("bank\\d"), MATCH_REGEXP | MATCH_IGNORE_CASE, true},
    {"RegexpIgnoringCaseDigitClassRejectsLetter", Str("BANKX"), Str("bank\\d"), MATCH_REGEXP | MATCH_IGNORE_CASE, false},
    {"RegexpIgnoringCaseKeepsSpaceClass", Str("Pin A"), Str("pin\\sa"), MATCH_REGEXP | MATCH_IGNORE_CASE, true},
    {"RegexpIgnoringCaseKeepsWordClass", Str("io_7"), Str("IO\\w\\d"), MATCH_REGEXP | MATCH_IGNORE_CASE, true},
    {"RegexpEmptyPatternMatchesAtStart", Str("Bank12"), Str(""), MATCH_REGEXP, true},
    {"RegexpAlternationIsWholePattern", Str("xyz"), Str("a|x"), MATCH_REGEXP, true},
    {"RegexpAlternationLaterBranch", Str("Clk3"), Str("Bank|Clk\\d"), MATCH_REGEXP, true},
    {"RegexpValueShorterThanPrefix", Str("Ban"),    Str("Bank"), MATCH_REGEXP, false},
    {"RegexpPrefixThenRepetition",   Str("Ban"),    Str("Bank*"), MATCH_REGEXP, true},
    {"RegexpPrefixThenRepetitionShort", Str("Ba"),  Str("Bank*"), MATCH_REGEXP, false},
    // Ignoring case folds the ASCII letters only, as MATCH_IGNORE_CASE alone does.
    {"RegexpIgnoringCaseKeepsLatin1Case", Str("\xC9T\xC9"), Str("\xE9t\xE9$"), MATCH_REGEXP | MATCH_IGNORE_CASE, false},
    {"IgnoreCaseKeepsLatin1Case",    Str("\xC9T\xC9"), Str("\xE9t\xE9"), MATCH_IGNORE_CASE, false},
    {"RegexpIgnoringCaseFoldsAsciiBesideLatin1", Str("\xC9T\xC9"), Str("\xC9t\xC9$"), MATCH_REGEXP | MATCH_IGNORE_CASE, true},
    {"RegexpIgnoringCaseRange",      Str("PIN"), Str("[a-z]+$"), MATCH_REGEXP | MATCH_IGNORE_CASE, true},
    {"RegexpIgnoringCaseNegatedClass", Str("A1"), Str("[^a]"), MATCH_REGEXP | MATCH_IGNORE_CASE, false},
    {"RegexpIgnoringCaseNonWordStaysNonWord", Str("A"), Str("\\W"), MATCH_REGEXP | MATCH_IGNORE_CASE, false},
    {"RegexpIgnoringCaseNonSpaceKeepsLetters", Str("a"), Str("\\S$"), MATCH_REGEXP | MATCH_IGNORE_CASE, true},
    {"RegexpIgnoringCaseSubstring",  Str("io BANK 3"), Str("bank \\d"), MATCH_REGEXP | MATCH_IGNORE_CASE | MATCH_SUBSTRING, true},
    // Every byte is one character, a line break too.
    {"RegexpDotMatchesLineBreak",    Str("pin A1\nbank 2"), Str("pin.*bank"), MATCH_REGEXP, true},
    {"RegexpSubstringAcrossLineBreak", Str("x\nbank 2"), Str("ba.k"), MATCH_REGEXP | MATCH_SUBSTRING, true},
    {"RegexpPrefixKeepsLatin1Case",  Str("\xC9T\xC9"), Str("\xE9t\xE9$"), MATCH_REGEXP, false},
    {"RegexpLeadingRepetitionIsInvalid", Str("abc"), Str("*abc"), MATCH_REGEXP, false},
    {"RegexpEmptyFlagGroupIsInvalid", Str("x"),     Str("(?)?x"), MATCH_REGEXP, false},
    // No match: the plain tests decide on the unchanged texts.
    {"RegexpFallsBackToSubstring",   Str("x(a+b)"), Str("(a+b)"), MATCH_REGEXP | MATCH_SUBSTRING, true},
    {"RegexpAloneHasNoFallback",     Str("x(a+b)"), Str("(a+b)"), MATCH_REGEXP, false},
    {"RegexpInvalidFallsBackToExact", Str("a(b"), Str("a(b"), MATCH_REGEXP | MATCH_EXACT, true},
    {"RegexpInvalidExactStillUnequal", Str("a(bc"), Str("a(b"), MATCH_REGEXP | MATCH_EXACT, false},
    {"RegexpFallsBackToIgnoreCase",  Str("A+B"), Str("a+b"), MATCH_REGEXP | MATCH_IGNORE_CASE, true},

    // Flags.
    {"BoolEqual",                    Bool(true), Bool(true), 0, true},
    {"BoolUnequal",                  Bool(true), Bool(false), 0, false},
    {"BoolFalseEqualsFalse",         Bool(false), Bool(false), 0, true},
    {"BoolIgnoresLess",              Bool(true), Bool(true), MATCH_LESS, true},
    {"BoolIgnoresSubstring",         Bool(false), Bool(true), MATCH_SUBSTRING, false},
    {"BoolAgainstInt",               Bool(true), Int(1),   0, false},

    // Enumerations at C (index 2) over A, B, C.
    {"EnumAgainstItsText",           Enum("C"), Str("C"),  0, true},
    {"EnumAgainstOtherText",         Enum("C"), Str("B"),  0, false},
    {"EnumTextCaseMatters",          Enum("C"), Str("c"),  MATCH_IGNORE_CASE, false},
    {"EnumIgnoresSubstring",         Enum("C"), Str(""),   MATCH_SUBSTRING, false},
    {"EnumAgainstItsIndex",          Enum("C"), Int(2),    0, true},
    {"EnumAgainstOtherIndex",        Enum("C"), Int(1),    0, false},
    {"EnumIndexIgnoresLess",         Enum("C"), Int(3),    MATCH_LESS, false},
    {"EnumFirstAgainstMinusOne",     Enum("A"), Int(-1),   0, false},
    {"EnumAgainstEnumAtSameValue",   Enum("C"), Enum("C"), 0, false},
    {"EnumAgainstDouble",            Enum("C"), Dbl(2.0),  0, false},

    // Colours: components only.
    {"ColourEqual",                  Rgb(1, 2, 3), Rgb(1, 2, 3), 0, true},
    {"ColourEqualFromPacked",        Rgb(1, 2, 3), Rgb(0x010203), 0, true},
    {"ColourRedDiffers",             Rgb(1, 2, 3), Rgb(9, 2, 3), 0, false},
    {"ColourGreenDiffers",           Rgb(1, 2, 3), Rgb(1, 9, 3), 0, false},
    {"ColourBlueDiffers",            Rgb(1, 2, 3), Rgb(1, 2, 9), 0, false},
    {"ColourValidityNotCompared",    Rgb(-1),   Rgb(255, 255, 255), 0, true},
    {"ColourIgnoresLess",            Rgb(1, 2, 3), Rgb(1, 2, 3), MATCH_LESS, true},
    {"ColourAgainstInt",             Rgb(0x010203), Int(0x010203), 0, false},
};
// clang-format on

class EqualsFlags : public testing::TestWithParam<Row> {};

TEST_P(EqualsFlags, GivesTheDocumentedAnswer) {
    const Row& row = GetParam();
    const Prop self = row.self();
    ASSERT_TRUE(self);
    EXPECT_EQ(self->Equals(row.other(), row.flags), row.expected);
}

INSTANTIATE_TEST_SUITE_P(Table, EqualsFlags, testing::ValuesIn(kEqualsRows), RowName);

// clang-format off
const Row kLessThanRows[] = {
    {"IntBelow",                     Int(1),    Int(2),    0, true},
    {"IntAbove",                     Int(2),    Int(1),    0, false},
    {"IntEqual",                     Int(2),    Int(2),    0, false},
    {"IntIgnoresFlags",              Int(1),    Int(2),    MATCH_GREATER, true},
    {"IntAgainstTextReadsMinusOne",  Int(-5),   Str("7"),  0, true},
    {"IntAgainstTextNotBelowMinusOne", Int(0),  Str("7"),  0, false},
    {"IntAgainstNoProperty",         Int(-5),   Null(),    0, false},
    {"DoubleBelow",                  Dbl(-0.5), Dbl(0.0),  0, true},
    {"DoubleAgainstIntReadsMinusOne", Dbl(-2.0), Int(100), 0, true},
    {"DoubleNaNNeverBelow",          Dbl(NAN),  Dbl(1.0),  0, false},
    {"TextBelow",                    Str("a"),  Str("b"),  0, true},
    {"TextAbove",                    Str("b"),  Str("a"),  0, false},
    {"TextEqual",                    Str("a"),  Str("a"),  0, false},
    {"TextPrefixFirst",              Str("ab"), Str("abc"), 0, true},
    {"TextEmptyFirst",               Str(""),   Str("a"),  0, true},
    {"TextUpperBeforeLower",         Str("Z"),  Str("a"),  0, true},
    {"TextBytesUnsigned",            Str("a"),  Str("\xC3\xA9"), 0, true},
    {"TextIgnoresIgnoreCase",        Str("B"),  Str("a"),  MATCH_IGNORE_CASE, true},
    {"TextAgainstEnumText",          Str("A"),  Enum("B"), 0, true},
    {"BoolFalseBelowTrue",           Bool(false), Bool(true), 0, true},
    {"BoolTrueNotBelowFalse",        Bool(true), Bool(false), 0, false},
    {"BoolFalseNotBelowFalse",       Bool(false), Bool(false), 0, false},
    {"EnumBelowText",                Enum("A"), Str("B"),  0, true},
    {"EnumNotBelowItsText",          Enum("B"), Str("B"),  0, false},
    {"EnumAgainstInt",               Enum("A"), Int(5),    0, false},
    {"ColourEqualNotBelow",          Rgb(10, 0, 5), Rgb(10, 0, 5), 0, false},
    {"ColourBlueDecides",            Rgb(10, 0, 5), Rgb(10, 0, 6), 0, true},
    {"ColourBlueBeforeGreater",      Rgb(10, 0, 5), Rgb(10, 200, 6), 0, true},
    {"ColourRedDecidesFirst",        Rgb(10, 0, 5), Rgb(9, 255, 255), 0, false},
    {"ColourBlueDecidesBeforeGreen", Rgb(10, 200, 5), Rgb(10, 0, 6), 0, true},
    {"ColourGreenDecidesLast",       Rgb(10, 1, 5), Rgb(10, 2, 5), 0, true},
    {"ColourGreenAboveNotBelow",     Rgb(10, 2, 5), Rgb(10, 1, 5), 0, false},
    {"ColourRedBelow",               Rgb(9, 255, 255), Rgb(10, 0, 0), 0, true},
    {"ColourComponentsUnsigned",     Rgb(127, 0, 0), Rgb(128, 0, 0), 0, true},
    {"ColourAnyStartsTrue",          Rgb(10, 0, 5), Rgb(10, 0, 5), MATCH_ANY, true},
    {"ColourAnyWhenAbove",           Rgb(10, 0, 5), Rgb(9, 0, 5), MATCH_ANY, true},
    {"ColourAnyAgainstInt",          Rgb(10, 0, 5), Int(1),    MATCH_ANY, true},
    {"ColourAgainstInt",             Rgb(0, 0, 0), Int(1),     0, false},
};
// clang-format on

class LessThanFlags : public testing::TestWithParam<Row> {};

TEST_P(LessThanFlags, GivesTheDocumentedAnswer) {
    const Row& row = GetParam();
    const Prop self = row.self();
    ASSERT_TRUE(self);
    EXPECT_EQ(self->LessThan(row.other(), row.flags), row.expected);
}

INSTANTIATE_TEST_SUITE_P(Table, LessThanFlags, testing::ValuesIn(kLessThanRows), RowName);

} // namespace

TEST(PropertyEquals, ReadsAForeignTextPropertyThroughItsInterface) {
    // A host's own IProperty, not one of ours: compared through GetStringProperty.
    class HostText final : public CommonI::TRefCountHelperBase<HostText, 0>, public IProperty {
    public:
        CitI::IInterface* GetInterface(const Port::XUID& id) override {
            if (id == CommonI::IID_IRefCount) {
                return static_cast<CommonI::IRefCount*>(this);
            }
            return id == IID_IProperty ? static_cast<IProperty*>(this) : nullptr;
        }
        PropertyType GetType() const override { return STRING_TYPE; }
        int GetIntProperty() const override { return -1; }
        double GetDoubleProperty() const override { return -1.0; }
        Port::StringBase<char> GetStringProperty() const override { return "Bank12"; }
        bool GetBoolProperty() const override { return false; }
        RefCountPtr<IPossibleEnumValuesItr> GetPossibleValues() const override { return nullptr; }
        bool Equals(const Prop&, int) const override { return false; }
        bool LessThan(const Prop&, int) const override { return false; }
        bool SetIndex(std::int8_t) override { return false; }
        std::int8_t GetIndex() const override { return -1; }
        bool IsVisible() const override { return true; }
    };
    const Prop host = Prop::Adopt(static_cast<IProperty*>(new HostText()));
    EXPECT_TRUE(Str("Bank12")()->Equals(host, 0));
    EXPECT_TRUE(Str("xBANK12")()->Equals(host, MATCH_SUBSTRING | MATCH_IGNORE_CASE));
    EXPECT_TRUE(Enum("A")()->LessThan(host, 0));
    EXPECT_FALSE(Enum("C")()->Equals(host, 0));
}

TEST(PropertyEquals, ReadsAHostSubclassOfOurTextThroughItsOverride) {
    // A host may derive from our string property and answer another text; the other of a
    // comparison is read through its interface, so the override decides.
    class Shown final : public Vn::Eng::StringProperty {
    public:
        Shown() : StringProperty(Port::StringBase<char>("stored")) {}
        Port::StringBase<char> GetStringProperty() const override { return "shown"; }
    };
    const Prop shown = Prop::Adopt(static_cast<IProperty*>(new Shown()));
    EXPECT_TRUE(Str("shown")()->Equals(shown, 0));
    EXPECT_FALSE(Str("stored")()->Equals(shown, 0));
    EXPECT_TRUE(Str("shown")()->Equals(shown, MATCH_REGEXP));
    EXPECT_TRUE(Str("a")()->LessThan(shown, 0));
}
