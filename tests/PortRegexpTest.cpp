//===-- tests/PortRegexpTest.cpp - regexps: leftmost, linear time, ASCII case, bounded cache -===//
#include "Port/Regexp.h"
#include "Port/StringBase.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <chrono>
#include <cstdint>
#include <cstdio>
#include <string>

#include <unistd.h>

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
    // NOLINTNEXTLINE(performance-unnecessary-copy-initialization): the copy is the subject
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
    // Patterns whose opening characters a match must start with, and the ways that
    // opening ends: a repeat taking back its last character, an escape, a class, an
    // alternation or a flag group that changes what the opening means, bytes past ASCII.
    const char* const patterns[] = {
        "Ban",      "ank",        ".*ank.*", "x*",       "[0-9]+",   "(?i)bank", "(",
        "BANK1_.*", "^^bank",     "Bax*nk",  "Bank?1",   "Ban{1}k",  "Ban{0}k",  "Bank+1",
        "Ba\\w",    "Ba[nN]k",    "x|Bank",  "B(?i)ANK", "Bank$",    "Bank1\\d", "\xe9t\xe9",
        "\xc9T",    "bank1_pin7", "Bank\n",  "a{",       "Bank1_pin"};
    const char* const texts[] = {"Bank12", "",           "12Bank", "bank",      "BANK1_x",
                                 "Bank",   "bank1_pin7", "Bk",     "\xe9t\xe9", "\xc9t",
                                 "Bank\n", "Bank1\n",    "Baxxnk", "Bak1",      "Bannk1"};
    for (const auto letterCase : {Port_Regexp::Case::Match, Port_Regexp::Case::Ignore}) {
        for (const char* pattern : patterns) {
            Port_Regexp re(pattern, letterCase);
            for (const char* text : texts) {
                unsigned int start = 1;
                const bool leftmostAtZero = re.Find(text, &start, nullptr) && start == 0;
                EXPECT_EQ(re.MatchesAtStart(text), leftmostAtZero)
                    << pattern << " on " << text << " ignoring case "
                    << (letterCase == Port_Regexp::Case::Ignore);
            }
        }
    }
    // The opening compare folds ASCII letters only, as the expression does.
    EXPECT_TRUE(Port_Regexp("bANK1_", Port_Regexp::Case::Ignore).MatchesAtStart("Bank1_pin"));
    EXPECT_FALSE(Port_Regexp("\xe9t", Port_Regexp::Case::Ignore).MatchesAtStart("\xc9t"));
    EXPECT_FALSE(Port_Regexp("bank1_", Port_Regexp::Case::Match).MatchesAtStart("Bank1_pin"));
}

TEST(PortRegexp, EveryByteIsOneCharacter) {
    // Narrow 8-bit text: a byte that is not valid UTF-8 is still one character for `.`.
    EXPECT_TRUE(Port_Regexp("^a.b$").MatchesAtStart("a\xE9"
                                                    "b"));
    EXPECT_TRUE(Port_Regexp("^a..b$").MatchesAtStart("a\xC3\xA9"
                                                     "b"));
    EXPECT_TRUE(Port_Regexp("^a.b$").MatchesAtStart("a\nb")) << "a line break is a character";
    EXPECT_TRUE(Port_Regexp("pin.*bank").MatchesAtStart("pin A1\nbank 2"));
    EXPECT_TRUE(Port_Regexp("(?i)caf\xC9").MatchesAtStart("CAF\xC9"));
    EXPECT_FALSE(Port_Regexp("(?i)caf\xC9").MatchesAtStart("CAF\xE9"))
        << "only ASCII letters have a case";
}

namespace {
struct FoldCase {
    const char* pattern;
    const char* text;
    bool matches; // a match anywhere, case ignored
};
} // namespace

TEST(PortRegexp, IgnoringCaseFoldsAsciiLettersOnly) {
    const FoldCase cases[] = {
        // Letters, alone and repeated, in groups and alternations.
        {"bank", "BANK", true},
        {"BaNk", "bAnK", true},
        {"^ab*c$", "ABBBC", true},
        {"(pin|clk)\\d", "CLK7", true},
        {"\xE9t\xE9", "\xC9T\xC9", false},
        {"\xE9T\xE9", "\xE9t\xE9", true},
        {"\xDF", "SS", false},
        // Classes gain the other case of every letter they hold, before negation.
        {"^[a-z]+$", "PIN", true},
        {"^[A-Z]+$", "pin", true},
        {"^[^a]$", "A", false},
        {"^[^a-c]$", "B", false},
        {"^[^a-c]$", "d", true},
        {"^[x-]$", "X", true},
        {"^[x-]$", "-", true},
        {"^[-x]$", "X", true},
        {"^[]x]$", "]", true},
        {"^[]x]$", "X", true},
        {"^[Z-a]$", "z", true},
        {"^[Z-a]$", "A", true},
        {"^[Z-a]$", "_", true},
        {"^[Z-a]$", "b", false},
        {"^[\\x41-\\x43]$", "b", true},
        {"^[[:upper:]]$", "q", true},
        {"^[[:lower:]]$", "Q", true},
        {"^[[:^alpha:]]$", "q", false},
        {"^[\\p{Lu}]$", "q", true},
        {"^\\p{Lu}$", "q", true},
        {"^\\p{Ll}$", "Q", true},
        {"^\\pL$", "Q", true},
        // Escapes keep their meaning.
        {"^\\d$", "7", true},
        {"^\\d$", "D", false},
        {"^\\D$", "d", true},
        {"^\\w$", "W", true},
        {"^\\W$", "w", false},
        {"^\\W$", "W", false},
        {"^\\W$", "-", true},
        {"^\\s$", "S", false},
        {"^\\S$", "s", true},
        {"^[\\W]$", "w", false},
        {"^[\\S]$", " ", false},
        {"a\\b", "A B", true},
        {"a\\B", "A B", false},
        {"^\\x41$", "a", true},
        {"^\\x{62}$", "B", true},
        {"^\\101$", "a", true},
        {"^\\Qa.b\\E$", "A.B", true},
        {"^\\Qa.b\\E$", "AxB", false},
        {"^\\Qa.b", "A.B", true},
        {"\\n", "\n", true},
        {"x{2}", "XX", true},
        // Named groups keep their names; flags in the pattern turn folding off and on.
        {"(?P<Bank>b)\\d", "B1", true},
        {"(?:ab)+c", "ABabC", true},
        {"(?)bank", "BANK", true},
        {"(?-i)bank", "BANK", false},
        {"(?-i:b)ank", "bANK", true},
        {"(?-i:b)ank", "BANK", false},
        {"(b(?-i)a)nk", "BaNK", true},
        {"(b(?-i)a)nk", "BANK", false},
        {"(?s-i:.a)", "\nA", false},
        {"(?s-i:.a)", "\na", true},
        {"(?im)^b$", "a\nB", true},
    };
    for (const FoldCase& c : cases) {
        Port_Regexp re(c.pattern, Port_Regexp::Case::Ignore);
        EXPECT_TRUE(re.IsValid()) << c.pattern;
        EXPECT_EQ(re.Find(c.text, nullptr, nullptr), c.matches) << c.pattern << " on " << c.text;
    }
}

TEST(PortRegexp, CaseInThePatternFoldsAsIgnoringCaseDoes) {
    EXPECT_TRUE(Port_Regexp("(?i)bank").Find("BANK", nullptr, nullptr));
    EXPECT_FALSE(Port_Regexp("bank").Find("BANK", nullptr, nullptr));
    EXPECT_TRUE(Port_Regexp("(?i:b)ank").Find("Bank", nullptr, nullptr));
    EXPECT_FALSE(Port_Regexp("(?i:b)ank").Find("BANK", nullptr, nullptr));
    EXPECT_FALSE(Port_Regexp("(?i)\xE9").Find("\xC9", nullptr, nullptr));
    // The same pattern with and without ignoring case are two expressions.
    EXPECT_TRUE(Port_Regexp("^bank$", Port_Regexp::Case::Ignore).Find("BANK", nullptr, nullptr));
    EXPECT_FALSE(Port_Regexp("^bank$").Find("BANK", nullptr, nullptr));
}

TEST(PortRegexp, InvalidPatternsStayInvalidWhenIgnoringCase) {
    for (const char* bad : {"(", ")", "[a-", "[z-a]", "*", "a{2,1}", "\\", "(?-)", "(?i-)", "(?x)",
                            "\\1", "\\x{}", "\\xG1", "[\\z]", "\\p{", "(?P<a", "a)"}) {
        Port_Regexp re(bad, Port_Regexp::Case::Ignore);
        EXPECT_FALSE(re.IsValid()) << bad;
        EXPECT_FALSE(re.Find("anything (a)", nullptr, nullptr)) << bad;
    }
}

TEST(PortRegexp, TheCacheIsBoundedByTheMemoryItsExpressionsMayHold) {
    auto residentBytes = [] {
        long pages = 0;
        long resident = 0;
        std::FILE* f = std::fopen("/proc/self/statm", "r");
        if (f != nullptr) {
            if (std::fscanf(f, "%ld %ld", &pages, &resident) != 2) {
                resident = 0;
            }
            std::fclose(f);
        }
        return static_cast<std::size_t>(resident) *
               static_cast<std::size_t>(::sysconf(_SC_PAGESIZE));
    };
    // Patterns of about 260 bytes whose automata want many states: each one, matched
    // against a long text, would fill as much memory as the engine allows it.
    std::string text;
    std::uint32_t seed = 12345;
    for (int i = 0; i < 4000; ++i) {
        seed = seed * 1103515245u + 12345u;
        text += (seed >> 16) & 1 ? 'a' : 'b';
    }
    [[maybe_unused]] const std::size_t residentBefore = residentBytes();
    std::size_t mostAccounted = 0;
    for (int i = 0; i < 300; ++i) {
        std::string pattern = "[ab]*a[ab]{14}c|q" + std::to_string(i) + "_";
        pattern += std::string(260 - pattern.size(), 'z');
        Port_Regexp re(pattern);
        ASSERT_TRUE(re.IsValid()) << pattern;
        EXPECT_FALSE(re.Find(text, nullptr, nullptr));
        mostAccounted = std::max(mostAccounted, Port_Regexp::CacheBytes());
    }
    EXPECT_GT(mostAccounted, 0u);
    EXPECT_LE(mostAccounted, Port_Regexp::CacheBudget());
    EXPECT_LE(Port_Regexp::CacheBudget(), std::size_t{16} << 20) << "a few megabytes";
#if !defined(__SANITIZE_ADDRESS__)
    // The sanitizer keeps freed memory in quarantine; only the plain build can see what
    // the process really holds. 300 unbounded expressions held over a gigabyte.
    const std::size_t residentAfter = residentBytes();
    if (residentBefore > 0) {
        EXPECT_LT(residentAfter, residentBefore + (std::size_t{64} << 20))
            << "resident memory grew from " << residentBefore << " to " << residentAfter;
    }
#endif
}

TEST(PortRegexp, APatternTooLargeForOneExpressionIsInvalid) {
    Port_Regexp huge("(?:[a-z0-9]{100}){100}");
    EXPECT_FALSE(huge.IsValid());
    EXPECT_FALSE(huge.Find(std::string(20000, 'a'), nullptr, nullptr));
    EXPECT_LE(Port_Regexp::CacheBytes(), Port_Regexp::CacheBudget());
}
