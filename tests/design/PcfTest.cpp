//===-- tests/design/PcfTest.cpp - constraint files read, edit and write back byte for byte -===//
#include "Pcf.h"

#include <gtest/gtest.h>

namespace {

using VnTool::PcfFile;
using VnTool::PcfLine;

// Everything a user's file may hold: comments, blank lines, tabs, CRLF, options, a
// trailing comment, unknown commands and no line end after the last line.
const char kUserFile[] = "# board: icestick\r\n"
                         "\r\n"
                         "set_io\t-nowarn  clk 21   # the oscillator\r\n"
                         "set_frequency clk 12\r\n"
                         "set_io -pullup yes -pullup_resistor 10K rst 99\r\n"
                         "set_io led[0] 1\r\n"
                         "   # indented note\r\n"
                         "set_io led[1] 2";

TEST(Pcf, AnUnchangedFileIsWrittenBackByteForByte) {
    for (const std::string& text : {std::string(kUserFile), std::string(""), std::string("\n\n"),
                                    std::string("set_io a 1\n")}) {
        PcfFile pcf;
        std::string error;
        ASSERT_TRUE(pcf.Parse(text, "p.pcf", error)) << error;
        EXPECT_EQ(pcf.Text(), text);
    }
}

TEST(Pcf, LinesAreReadAsNextpnrReadsThem) {
    PcfFile pcf;
    std::string error;
    ASSERT_TRUE(pcf.Parse(kUserFile, "p.pcf", error)) << error;
    const auto& lines = pcf.Lines();
    ASSERT_EQ(lines.size(), 8u);
    EXPECT_EQ(lines[0].kind, PcfLine::Kind::Comment);
    EXPECT_EQ(lines[1].kind, PcfLine::Kind::Blank);
    EXPECT_EQ(lines[2].kind, PcfLine::Kind::SetIo);
    EXPECT_EQ(lines[2].port, "clk");
    EXPECT_EQ(lines[2].pin, "21");
    EXPECT_TRUE(lines[2].noWarn);
    EXPECT_EQ(lines[3].kind, PcfLine::Kind::Other);
    EXPECT_EQ(lines[3].command, "set_frequency");
    EXPECT_EQ(lines[4].port, "rst");
    EXPECT_EQ(lines[4].pin, "99");
    EXPECT_FALSE(lines[4].noWarn);
    EXPECT_EQ(lines[6].kind, PcfLine::Kind::Comment);
    EXPECT_EQ(lines[7].number, 8u);
    EXPECT_EQ(lines[7].end, "");
}

TEST(Pcf, AssigningRewritesOnlyThePinOfThePortsLine) {
    PcfFile pcf;
    std::string error;
    ASSERT_TRUE(pcf.Parse(kUserFile, "p.pcf", error)) << error;
    pcf.Assign("clk", "35");
    pcf.Assign("rst", "7");
    std::string expected(kUserFile);
    expected.replace(expected.find("clk 21"), 6, "clk 35");
    expected.replace(expected.find("rst 99"), 6, "rst 7");
    EXPECT_EQ(pcf.Text(), expected);
}

TEST(Pcf, NewConstraintsGoAtTheEndWithTheFilesLineEnd) {
    PcfFile pcf;
    std::string error;
    ASSERT_TRUE(pcf.Parse(kUserFile, "p.pcf", error)) << error;
    pcf.Assign("led[2]", "3");
    pcf.Assign("led[3]", "4");
    EXPECT_EQ(pcf.Text(), std::string(kUserFile) + "\r\nset_io led[2] 3\r\nset_io led[3] 4\r\n");

    PcfFile empty;
    ASSERT_TRUE(empty.Parse("", "new.pcf", error));
    empty.Assign("a", "B1");
    EXPECT_EQ(empty.Text(), "set_io a B1\n");
}

TEST(Pcf, UnassigningDropsEveryLineOfThePortAndNothingElse) {
    PcfFile pcf;
    std::string error;
    ASSERT_TRUE(pcf.Parse("# keep\nset_io a 1\nset_io b 2\nset_io a 3 # again\nset_frequency a 5\n",
                          "p.pcf", error));
    EXPECT_EQ(pcf.Unassign("a"), 2);
    EXPECT_EQ(pcf.Unassign("zz"), 0);
    EXPECT_EQ(pcf.Text(), "# keep\nset_io b 2\nset_frequency a 5\n");

    // Assigning a port that has two lines keeps the first, rewritten, and drops the other.
    ASSERT_TRUE(pcf.Parse("set_io a 1\nset_io b 2\nset_io a 3\n", "p.pcf", error));
    pcf.Assign("a", "9");
    EXPECT_EQ(pcf.Text(), "set_io a 9\nset_io b 2\n");
}

TEST(Pcf, SyntaxErrorsNameFileAndLine) {
    struct Case {
        const char* text;
        const char* error;
    };
    const Case cases[] = {
        {"set_io a\n", "p.pcf:1: expected 'set_io [options] PORT PIN'"},
        {"# ok\nset_io\n", "p.pcf:2: expected 'set_io [options] PORT PIN'"},
        {"set_io -nowarn a # 3\n", "p.pcf:1: expected 'set_io [options] PORT PIN'"},
        {"\n\nset_io -pullup maybe a 1\n",
         "p.pcf:3: invalid value 'maybe' for -pullup (yes, no, 1 or 0)"},
        {"set_io -pullup_resistor 5K a 1\n",
         "p.pcf:1: invalid value '5K' for -pullup_resistor (3P3K, 6P8K, 10K or 100K)"},
        {"set_io a 1\r\nset_io -pullup\r\n", "p.pcf:2: -pullup wants a value"},
        {"set_frequency clk\n", "p.pcf:1: expected 'set_frequency NET MHZ'"},
        {"set_frequency clk abc\n",
         "p.pcf:1: the frequency 'abc' is no number of MHz (such as 12 or 48.5)"},
        // Saved with carriage returns alone: nextpnr-ice40 would read one line.
        {"set_io a 1\rset_io b 2\r",
         "p.pcf:1: a carriage return without a line feed inside the line: nextpnr-ice40 reads "
         "the words after it as part of this line (save the file with LF or CRLF line ends)"},
    };
    for (const Case& c : cases) {
        PcfFile pcf;
        std::string error;
        EXPECT_FALSE(pcf.Parse(c.text, "p.pcf", error)) << c.text;
        EXPECT_EQ(error, c.error);
        EXPECT_TRUE(pcf.Lines().empty());
    }
}

// The separators and comments nextpnr-ice40 0.4 reads, each tried against it: form feed
// and vertical tab split words, "\r\r\n" ends a line, a lone '-' is an option it ignores,
// '#' inside a word starts a comment, and 1 or 0 are pull-up values.
TEST(Pcf, WordsCommentsAndLineEndsAreSplitAsNextpnrSplitsThem) {
    PcfFile pcf;
    std::string error;
    const std::string text = "set_io\fclk\v21#osc\r\r\n"
                             "set_io - -pullup 1 led[0] 99\n"
                             "set_io --warn-no-port led[1] 98 # board\r\n"
                             "set_frequency clk 12.5\r";
    ASSERT_TRUE(pcf.Parse(text, "p.pcf", error)) << error;
    const auto& lines = pcf.Lines();
    ASSERT_EQ(lines.size(), 4u);
    EXPECT_EQ(lines[0].port, "clk");
    EXPECT_EQ(lines[0].pin, "21");
    EXPECT_EQ(lines[0].end, "\r\r\n");
    EXPECT_EQ(lines[1].port, "led[0]");
    EXPECT_EQ(lines[1].notes, std::vector<std::string>{"nextpnr-ice40 ignores the option '-'"});
    EXPECT_TRUE(lines[2].noWarn);
    EXPECT_EQ(lines[3].end, "\r");
    EXPECT_EQ(pcf.Text(), text);

    // A constraint added after a last line ended by a carriage return alone must not join
    // it: the line gets its line feed first.
    pcf.Assign("rst", "7");
    EXPECT_EQ(pcf.Text(), text + "\nset_io rst 7\r\r\n");
    PcfFile back;
    ASSERT_TRUE(back.Parse(pcf.Text(), "p.pcf", error)) << error;
    EXPECT_EQ(VnTool::PcfAssignments(back), VnTool::PcfAssignments(pcf));
}

TEST(Pcf, NamesAConstraintFileCannotHoldAreTold) {
    EXPECT_EQ(VnTool::PcfWordProblem("led[0]"), "");
    EXPECT_EQ(VnTool::PcfWordProblem("\\odd$name"), "");
    for (const char* bad : {"", "-x", "a#b", "a b", "a\tb", "a\nb", "a\rb", "a\fb"}) {
        EXPECT_NE(VnTool::PcfWordProblem(bad), "") << bad;
    }
    EXPECT_EQ(VnTool::PcfWordProblem(std::string("a\0b", 3)), "it holds a NUL character");
}

TEST(Pcf, WhatNextpnrIgnoresIsNotedOnTheLine) {
    PcfFile pcf;
    std::string error;
    ASSERT_TRUE(pcf.Parse("set_io -bogus a 1\nset_io b 2 extra\n", "p.pcf", error)) << error;
    ASSERT_EQ(pcf.Lines().size(), 2u);
    EXPECT_EQ(pcf.Lines()[0].port, "a");
    EXPECT_EQ(pcf.Lines()[0].notes,
              std::vector<std::string>{"nextpnr-ice40 ignores the option '-bogus'"});
    EXPECT_EQ(pcf.Lines()[1].notes,
              std::vector<std::string>{"nextpnr-ice40 ignores the words after the pin"});
}

TEST(Pcf, AMissingFileIsAnEmptyPlanOnlyWhenAskedFor) {
    PcfFile pcf;
    std::string error;
    EXPECT_FALSE(pcf.ParseFile("/nonexistent/p.pcf", error));
    EXPECT_EQ(error, "/nonexistent/p.pcf: cannot open: No such file or directory");
    EXPECT_TRUE(pcf.ParseFile("/nonexistent/p.pcf", error, true)) << error;
    EXPECT_EQ(pcf.Text(), "");
}

} // namespace
