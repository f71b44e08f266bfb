//===-- tests/board/NetMatchTest.cpp - net names read, matched to ports, never guessed ---===//
#include "NetMatch.h"
#include "BoardTestSupport.h"

#include <gtest/gtest.h>

namespace {

using BoardTest::DesignOf;
using BoardTest::OneK;

std::string Describe(std::string_view net) {
    std::string out;
    for (const auto& name : VnTool::ReadNetName(net)) {
        out += (out.empty() ? "" : " ") + name.plain + (name.low ? " low:" + name.stem : "") +
               (name.overbar ? " overbar" : "");
    }
    return out;
}

TEST(NetNames, PathsMarksAlternativesAndUnnamedNets) {
    EXPECT_EQ(Describe("/FPGA/LCD_D0"), "lcdd0");
    EXPECT_EQ(Describe("UART-TX"), "uarttx");
    EXPECT_EQ(Describe("/LED[3]"), "led3");
    EXPECT_EQ(Describe("/sheet/~{RESET}"), "reset low:reset overbar");
    EXPECT_EQ(Describe("~RESET~"), "reset low:reset overbar");
    EXPECT_EQ(Describe("nCS"), "ncs low:cs");
    EXPECT_EQ(Describe("north"), "north");
    EXPECT_EQ(Describe("CS_N"), "csn low:cs");
    EXPECT_EQ(Describe("/WE_b"), "web low:we");
    EXPECT_EQ(Describe("/Rx_TTL|FIFO_D0"), "rxttl fifod0");
    EXPECT_EQ(Describe("Net-(D1-Pad3)"), "");
    EXPECT_EQ(Describe("unconnected-(U1-Pad5)"), "");
    EXPECT_EQ(Describe("N-000012"), "");
    EXPECT_EQ(Describe("/power/"), "");
    EXPECT_EQ(Describe(""), "");
}

// The nets on the FPGA's pins for the cases below: pins 1..4, 7..12 and 19..26 are I/O
// pins of tq144; 5 and 6 are not.
std::vector<VnTool::NetOnPin> Pins(std::initializer_list<VnTool::NetOnPin> pins) {
    return pins;
}

TEST(NetMatch, BusBitsCaseAndPunctuation) {
    auto match =
        VnTool::MatchPorts(DesignOf({"led[0]", "led[1]", "led[2]", "uart_tx", "sda"}), OneK(),
                           Pins({{"1", "/LED0"},
                                 {"2", "/io/led[1]"},
                                 {"3", "LED_2"},
                                 {"4", "/UART-TX"},
                                 {"7", "Net-(U1-Pad7)"},
                                 {"8", "/I2C_SDA"}}));
    std::vector<std::pair<std::string, std::string>> expected = {
        {"led[0]", "1"}, {"led[1]", "2"}, {"led[2]", "3"}, {"uart_tx", "4"}};
    EXPECT_EQ(match.placed, expected);
    // Close is not the same: i2c_sda is no name for sda.
    EXPECT_EQ(match.unmatched, std::vector<std::string>{"sda"});
    EXPECT_EQ(match.unused, std::vector<std::string>{"8 /I2C_SDA"});
}

TEST(NetMatch, ActiveLowByTheStrongestRuleOnly) {
    auto design = DesignOf({"rst_n", "cs_n", "we_n", "oe_n", "irq_n", "reset"});
    auto match = VnTool::MatchPorts(design, OneK(),
                                    Pins({{"1", "RST_N"},       // rule 1 for rst_n...
                                          {"2", "~{RST}"},      // ...so this one is not a rival
                                          {"3", "/bus/nCS"},    // rule 2
                                          {"4", "WE_B"},        // rule 2
                                          {"7", "~OE~"},        // rule 2, KiCad 5's overbar
                                          {"8", "IRQ"},         // rule 3: a port's _n, no mark
                                          {"9", "~{RESET}"}})); // never for "reset"
    std::vector<std::pair<std::string, std::string>> expected = {
        {"rst_n", "1"}, {"cs_n", "3"}, {"we_n", "4"}, {"oe_n", "7"}, {"irq_n", "8"}};
    EXPECT_EQ(match.placed, expected);
    EXPECT_EQ(match.unmatched, std::vector<std::string>{"reset"});
}

TEST(NetMatch, AmbiguityIsReportedNotPlaced) {
    // led0 and led[0] both fit LED0; uart_tx fits two nets; FIFO_D0|Rx_TTL fits two ports.
    auto match = VnTool::MatchPorts(
        DesignOf({"led0", "led[0]", "uart_tx", "rx_ttl", "fifo_d0", "clk", "key"}), OneK(),
        Pins({{"1", "LED0"},
              {"2", "/a/UART_TX"},
              {"3", "/b/uart_tx"},
              {"4", "/Rx_TTL|FIFO_D0"},
              {"7", "/CLK"},
              {"8", "/CLK"},
              {"5", "KEY"}}));
    EXPECT_TRUE(match.placed.empty());
    const std::string notIo = "net KEY matches port key but is on pin 5, which is no I/O pin "
                              "of package tq144; not placed";
    std::vector<std::string> expected = {
        "net LED0: ports led0, led[0] could all take it; none placed",
        "port uart_tx: nets /a/UART_TX, /b/uart_tx all match; not placed",
        "net /Rx_TTL|FIFO_D0: ports rx_ttl, fifo_d0 could all take it; none placed",
        "net /CLK is on pins 7, 8 of the FPGA; port clk not placed", notIo};
    EXPECT_EQ(match.problems, expected);
}

TEST(NetMatch, FindsTheFpgaOrSaysWhyNot) {
    VnTool::Board board;
    board.source = "b.net";
    VnTool::BoardPart fpga{"U1", "ice40", "", {}};
    for (const char* pin : {"1", "2", "3", "4", "5", "6", "7", "8", "9", "10", "11", "12"}) {
        fpga.pins.emplace_back(pin, "");
    }
    VnTool::BoardPart resistor{"R1", "1k", "", {{"1", "A"}, {"2", "B"}}};
    board.parts = {resistor, fpga};
    std::string error;
    const VnTool::BoardPart* found = VnTool::FindFpga(board, OneK(), "", error);
    ASSERT_NE(found, nullptr) << error;
    EXPECT_EQ(found->ref, "U1");
    EXPECT_EQ(VnTool::FindFpga(board, OneK(), "R1", error)->ref, "R1");

    fpga.ref = "U2";
    board.parts.push_back(fpga);
    EXPECT_EQ(VnTool::FindFpga(board, OneK(), "", error), nullptr);
    EXPECT_EQ(error, "several parts in b.net could be the FPGA on package tq144 of device 1k: "
                     "U1 (10 I/O pins), U2 (10 I/O pins); --ref names it");
    EXPECT_EQ(VnTool::FindFpga(board, OneK(), "U2", error)->ref, "U2");
    EXPECT_EQ(VnTool::FindFpga(board, OneK(), "U9", error), nullptr);
    EXPECT_EQ(error, "b.net has no part U9");

    board.parts = {resistor};
    EXPECT_EQ(VnTool::FindFpga(board, OneK(), "", error), nullptr);
    EXPECT_NE(error.find("no part in b.net has the I/O pins of package tq144"), std::string::npos);
}

TEST(NetMatch, ComparesANetlistWithItsBoard) {
    VnTool::BoardPart netlist{"U1", "", "", {{"1", "/LED0"}, {"2", "Net-(U1-Pad2)"}, {"3", "/A"}}};
    VnTool::BoardPart layout{
        "U1", "", "", {{"1", "/LED1"}, {"2", "Net-(R3-Pad1)"}, {"3", "/A"}, {"4", "/B"}}};
    std::vector<std::string> expected = {"1: /LED0 in a.net, /LED1 in b.kicad_pcb",
                                         "4: no named net in a.net, /B in b.kicad_pcb"};
    EXPECT_EQ(VnTool::CompareParts(netlist, "a.net", layout, "b.kicad_pcb"), expected);
}

} // namespace
