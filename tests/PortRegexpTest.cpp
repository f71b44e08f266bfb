#include "Port/Regexp.h"
#include "Port/StringBase.h"

#include <gtest/gtest.h>

#include <chrono>
#include <string>

TEST(PortRegexp, FindsTheLeftmostMatch) {
    Port_Regexp re("a+b");
    unsigned int start = 0;
    unsigned int length = 0;
    ASSERT_TRUE(re.Find("xxaab_ab", &start, &length));
    EXPECT_EQ(start, 2u);
    EXPECT_EQ(length, 3u);
    EXPECT_TRUE(Port_Regexp("B.nk").Find("Bank", nullptr, nullptr));
    EXPECT_FALSE(Port_Regexp("^ank").Find("Bank", nullptr, nullptr));
}

TEST(PortRegexp, InvalidPatternsMatchNothingAndDoNotThrow) {
    for (const char* bad : {"(", "[a-", "*", "a{2,1}", "\\"}) {
        Port_Regexp re(bad);
        EXPECT_FALSE(re.IsValid()) << bad;
        EXPECT_FALSE(re.Find("anything (", nullptr, nullptr)) << bad;
    }
}

TEST(PortRegexp, PathologicalPatternsRunInLinearTime) {
    const std::string text(10000, 'a');
    const auto start = std::chrono::steady_clock::now();
    EXPECT_FALSE(Port_Regexp("(a*)*b").Find(text, nullptr, nullptr));
    EXPECT_FALSE(Port_Regexp("(a|a)*b").Find(text, nullptr, nullptr));
    const auto elapsed = std::chrono::steady_clock::now() - start;
    // A backtracking engine needs longer than the age of the universe here; a generous
    // bound keeps sanitizer builds out of trouble while still catching the blow-up.
    EXPECT_LT(elapsed, std::chrono::seconds(5));
}

TEST(PortRegexp, CopiesShareTheCompiledPatternAndBothMatch) {
    Port_Regexp a("x[0-9]");
    Port_Regexp b(a);
    Port_Regexp c("other");
    c = a;
    EXPECT_TRUE(b.Find("ax1", nullptr, nullptr));
    EXPECT_TRUE(c.Find("ax1", nullptr, nullptr));
    // Many patterns in turn: the cache evicts without breaking the ones still held.
    for (int i = 0; i < 1000; ++i) {
        Port_Regexp tmp("p" + std::to_string(i));
        EXPECT_TRUE(tmp.Find("p" + std::to_string(i), nullptr, nullptr));
    }
    EXPECT_TRUE(a.Find("x9", nullptr, nullptr));
}

TEST(PortRegexp, MatchesAtStartAgreesWithTheLeftmostMatch) {
    for (const char* pattern : {"Ban", "ank", ".*ank.*", "x*", "[0-9]+", "(?i)bank", "("}) {
        Port_Regexp re(pattern);
        for (const char* text : {"Bank12", "", "12Bank", "bank"}) {
            unsigned int start = 1;
            const bool leftmostAtZero = re.Find(text, &start, nullptr) && start == 0;
            EXPECT_EQ(re.MatchesAtStart(text), leftmostAtZero) << pattern << " on " << text;
        }
    }
}

TEST(PortRegexp, EveryByteIsOneCharacter) {
    // Narrow 8-bit text: a byte that is not valid UTF-8 is still one character for `.`.
    EXPECT_TRUE(Port_Regexp("^a.b$").MatchesAtStart("a\xE9"
                                                    "b"));
    EXPECT_TRUE(Port_Regexp("^a..b$").MatchesAtStart("a\xC3\xA9"
                                                     "b"));
    EXPECT_TRUE(Port_Regexp("(?i)caf\xC9").MatchesAtStart("CAF\xE9"));
}
