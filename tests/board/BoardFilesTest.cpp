//===-- tests/board/BoardFilesTest.cpp - KiCad netlists and board files of each generation ---===//
#include "BoardFiles.h"
#include "BoardTestSupport.h"
#include "NetMatch.h"

#include <gtest/gtest.h>

#include <map>

namespace {

using BoardTest::DataFile;

std::map<std::string, std::string> NetsOf(const VnTool::BoardPart& part) {
    std::map<std::string, std::string> nets;
    for (const auto& pin : VnTool::NetsOnPins(part)) {
        nets[pin.pin] = pin.net;
    }
    return nets;
}

struct Generation {
    const char* file;
    const char* kind;
    const char* reset; // the reset net as that generation writes its overbar
};

class EveryGeneration : public ::testing::TestWithParam<Generation> {};

// The same board drawn in each KiCad generation reads as the same parts and nets, and
// leads to the same plan.
TEST_P(EveryGeneration, ReadsTheSameBoard) {
    const Generation& generation = GetParam();
    VnTool::Board board;
    std::string error;
    ASSERT_TRUE(VnTool::ReadBoardFile(DataFile(generation.file), board, error)) << error;
    EXPECT_EQ(board.kind, generation.kind);
    EXPECT_EQ(board.layout, std::string(generation.file).find(".kicad_pcb") != std::string::npos);
    // The buttons are drawn on the schematic, mounted off the board.
    EXPECT_EQ(board.parts.size(), board.layout ? 5u : 7u);

    const VnTool::BoardPart* fpga = VnTool::FindFpga(board, BoardTest::OneK(), "", error);
    ASSERT_NE(fpga, nullptr) << error;
    EXPECT_EQ(fpga->ref, "U1");
    EXPECT_EQ(fpga->value, "iCE40HX1K-TQ144");
    auto nets = NetsOf(*fpga);
    EXPECT_EQ(nets["21"], "/FPGA/CLK");
    EXPECT_EQ(nets["7"], generation.reset);
    EXPECT_EQ(nets["9"], "/Rx_TTL|UART_RX");
    EXPECT_EQ(nets["98"], "/LED[1]");
    EXPECT_EQ(nets["5"], "GND");
    ASSERT_NE(board.Find("R1"), nullptr);
    EXPECT_EQ(NetsOf(*board.Find("R1"))["2"], "Net-(D1-Pad2)");
    EXPECT_EQ(board.Find("X1")->footprint, "Oscillator:Oscillator_SMD_Abracon_ASE-4Pin_3.2x2.5mm");

    auto design = BoardTest::DesignOf({"clk", "rst_n", "btn_n", "uart_rx", "uart_tx", "led[0]",
                                       "led[1]", "led[2]", "led[3]", "lcd_d0", "spare"});
    auto match = VnTool::MatchPorts(design, BoardTest::OneK(), VnTool::NetsOnPins(*fpga));
    std::vector<std::pair<std::string, std::string>> expected = {
        {"clk", "21"},    {"rst_n", "7"},   {"btn_n", "8"},   {"uart_rx", "9"}, {"uart_tx", "10"},
        {"led[0]", "99"}, {"led[1]", "98"}, {"led[2]", "97"}, {"led[3]", "96"}, {"lcd_d0", "112"}};
    EXPECT_EQ(match.placed, expected);
    EXPECT_EQ(match.unmatched, std::vector<std::string>{"spare"});
    EXPECT_TRUE(match.problems.empty()) << match.problems.front();
    EXPECT_EQ(match.unused, std::vector<std::string>{"101 /SPARE_IO"});
}

INSTANTIATE_TEST_SUITE_P(
    KiCad, EveryGeneration,
    ::testing::Values(
        Generation{"board1k-kicad5.net", "KiCad netlist (version D)", "/FPGA/~RST"},
        Generation{"board1k-kicad6.net", "KiCad netlist (version E)", "/FPGA/~{RST}"},
        Generation{"board1k-kicad5.xml", "KiCad XML netlist (version D)", "/FPGA/~RST"},
        Generation{"board1k-kicad4.kicad_pcb", "KiCad board file (version 4)", "/FPGA/~RST"},
        Generation{"board1k-kicad6.kicad_pcb", "KiCad board file (version 20211014)",
                   "/FPGA/~{RST}"},
        Generation{"board1k-kicad8.kicad_pcb", "KiCad board file (version 20240108)",
                   "/FPGA/~{RST}"}));

std::string ErrorOf(const std::string& text) {
    VnTool::Board board;
    std::string error;
    EXPECT_FALSE(VnTool::ReadBoard(text, "b.net", board, error)) << text;
    return error;
}

TEST(BoardFiles, MalformedInputIsRefusedWithItsLine) {
    EXPECT_EQ(ErrorOf("(export (version D)\n  (nets\n    (net (code 1) (name A)"),
              "b.net:3: the file ends inside a list opened on line 3");
    EXPECT_EQ(ErrorOf("(export (version \"E)\n(nets))"),
              "b.net:2: the file ends inside a string opened on line 1");
    EXPECT_EQ(ErrorOf("(export (version D))\n)"), "b.net:2: text after the closing ')'");
    EXPECT_EQ(ErrorOf("(export (version D))"),
              "b.net:1: a KiCad netlist without a (nets ...) section");
    EXPECT_EQ(ErrorOf("(kicad_sch (version 20211123))"),
              "b.net:1: neither a KiCad netlist (export ...) nor a board file (kicad_pcb ...) "
              "but (kicad_sch ...)");
    EXPECT_EQ(ErrorOf("<export version=\"D\">\n<nets>\n</net>\n</export>"),
              "b.net:3: </net> closes <nets> opened on line 2");
    EXPECT_EQ(ErrorOf("<export><nets><net name=\"a&bogus;\"/></nets></export>"),
              "b.net:1: unknown entity '&bogus;'");
    EXPECT_EQ(ErrorOf(""), "b.net:1: expected '(' at the start of the file");
    // Nesting that would exhaust the stack of a recursive reader.
    EXPECT_NE(ErrorOf(std::string(100000, '(')).find("nested deeper"), std::string::npos);
    std::string deepXml;
    for (int i = 0; i < 1000; ++i) {
        deepXml += "<a>";
    }
    EXPECT_NE(ErrorOf(deepXml).find("nested deeper"), std::string::npos);
}

TEST(BoardFiles, QuotingEscapesAndEntitiesAreUndone) {
    VnTool::Board board;
    std::string error;
    ASSERT_TRUE(
        VnTool::ReadBoard("(export (version \"E\") (nets (net (code \"1\") "
                          "(name \"/say \\\"hi\\\" (x)\") (node (ref \"U1\") (pin \"A1\")))))",
                          "e.net", board, error))
        << error;
    EXPECT_EQ(board.parts.at(0).pins.at(0).second, "/say \"hi\" (x)");
    ASSERT_TRUE(VnTool::ReadBoard("\xEF\xBB\xBF<?xml version=\"1.0\"?>\n<!-- made by hand -->\n"
                                  "<export version='D'><nets><net code=\"1\" "
                                  "name=\"/R&amp;D&#x7C;T&lt;1&gt;\"><node ref=\"U1\" pin=\"A1\"/>"
                                  "</net></nets></export>",
                                  "x.xml", board, error))
        << error;
    EXPECT_EQ(board.parts.at(0).pins.at(0).second, "/R&D|T<1>");
}

// A pad names its net by number and name up to KiCad 8; a lone word is the number when
// the board's net table has it, else the name.
TEST(BoardFiles, PadNetsByNumberOrName) {
    VnTool::Board board;
    std::string error;
    ASSERT_TRUE(VnTool::ReadBoard(
        "(kicad_pcb (version 20240108) (net 0 \"\") (net 3 \"/CLK\")\n"
        "  (footprint \"P:Q\" (property \"Reference\" \"U2\") (property \"Value\" \"V\")\n"
        "    (pad \"1\" smd rect (net 3 \"/CLK\")) (pad \"2\" smd rect (net 3))\n"
        "    (pad \"3\" smd rect (net \"/DATA\")) (pad \"\" np_thru_hole circle) (pad \"4\" smd "
        "rect)))",
        "b.kicad_pcb", board, error))
        << error;
    ASSERT_EQ(board.parts.size(), 1u);
    std::vector<std::pair<std::string, std::string>> expected = {
        {"1", "/CLK"}, {"2", "/CLK"}, {"3", "/DATA"}, {"4", ""}};
    EXPECT_EQ(board.parts[0].pins, expected);
    EXPECT_EQ(board.parts[0].value, "V");
    EXPECT_EQ(board.parts[0].footprint, "P:Q");
}

} // namespace
