//===-- tests/design/PinPlanTest.cpp - pin checks name each mistake; assignment fills in -===//
#include "PinPlan.h"
#include "PortHolders.h"

#include "CommonI/RefCountPtr.h"
#include "VnI/PropertyType.h"
#include "s/FindItr.h"
#include "s/PropertyFactory.h"
#include "s/PropertyHolderItr.h"
#include "s/SelectionManager.h"
#include "s/TreeNode.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <map>
#include <sstream>

namespace {

using VnTool::ChipDb;
using VnTool::Design;
using VnTool::PcfFile;
using VnTool::PinProblem;

// A 6 x 6 device: pins 1-3 on the top edge (bank 0), 4-6 right (1), 7-8 bottom (2),
// 9-10 left (3); pins 8 and 10 drive global buffers.
const char kDevice[] = ".device t 6 6 0\n"
                       ".pins p\n"
                       "1 1 5 0\n2 2 5 0\n3 3 5 0\n4 5 2 0\n5 5 3 0\n6 5 3 1\n"
                       "7 2 0 0\n8 3 0 1\n9 0 2 0\n10 0 3 1\n"
                       ".gbufpin\n3 0 1 0\n0 3 1 1\n";

// The chip-database reader takes only whole grids: IO tiles round the edge, logic inside,
// no corners.
std::string Tiles(int width, int height) {
    std::string text;
    for (int x = 0; x < width; ++x) {
        for (int y = 0; y < height; ++y) {
            bool edgeX = x == 0 || x == width - 1;
            bool edgeY = y == 0 || y == height - 1;
            if (edgeX && edgeY) {
                continue;
            }
            text += std::string(edgeX || edgeY ? ".io_tile " : ".logic_tile ") + std::to_string(x) +
                    " " + std::to_string(y) + "\n";
        }
    }
    return text;
}

ChipDb Device() {
    ChipDb db;
    std::istringstream in(kDevice + Tiles(6, 6));
    std::string error;
    EXPECT_TRUE(VnTool::ReadChipDb(in, "t.txt", "p", db, error)) << error;
    return db;
}

VnTool::DesignPort Port(std::string bus, int bit, int width, bool clock = false) {
    VnTool::DesignPort port;
    port.bus = bus;
    port.bit = bit;
    port.width = width;
    port.clock = clock;
    port.name = bit < 0 ? bus : bus + "[" + std::to_string(bit) + "]";
    return port;
}

// clk, rst, led[0..2] (listed high bit first, as a [0:2] bus is), d[0..1].
Design Counter() {
    Design design;
    design.top = "top";
    design.ports = {Port("clk", -1, 1, true), Port("led", 2, 3),  Port("led", 1, 3),
                    Port("led", 0, 3),        Port("rst", -1, 1), Port("d", 0, 2),
                    Port("d", 1, 2)};
    return design;
}

PcfFile Pcf(const std::string& text) {
    PcfFile pcf;
    std::string error;
    EXPECT_TRUE(pcf.Parse(text, "p.pcf", error)) << error;
    return pcf;
}

std::vector<std::string> Messages(const std::vector<PinProblem>& problems) {
    std::vector<std::string> messages;
    for (const auto& problem : problems) {
        messages.push_back(problem.message);
    }
    return messages;
}

TEST(PinChecks, EachMistakeIsReportedAtItsLineErrorsFirst) {
    ChipDb db = Device();
    Design design = Counter();
    PcfFile pcf = Pcf("# plan\n"
                      "set_io clk 8\n"
                      "set_io rst 99\n" // no such pin
                      "set_io led[0] 1\n"
                      "set_io led[1] 1\n" // pin taken
                      "set_io led[2] 2\n"
                      "set_io led[2] 3\n"        // second pin for a port
                      "set_io led[0] 1\n"        // the same line again
                      "set_io ghost 4\n"         // not in the design
                      "set_io -nowarn spare 5\n" // not in the design, but said so
                      "set_io d[0] 6\n"
                      "set_foo x\n");
    VnTool::CheckSummary summary;
    auto problems =
        VnTool::CheckPins(db, design, "top.json", pcf, VnTool::CheckOptions{}, &summary);
    EXPECT_EQ(
        Messages(problems),
        (std::vector<std::string>{
            "p.pcf:3: error: pin '99' is not in package p of device t",
            "p.pcf:5: error: pin 1 already holds port 'led[0]' (line 4)",
            "p.pcf:7: error: port 'led[2]' is put on two pins: 2 (line 6) and 3",
            "p.pcf:8: error: duplicate constraint: port 'led[0]' is already on pin 1 (line 4)",
            "p.pcf:12: error: nextpnr-ice40 knows no PCF command 'set_foo'",
            // NOLINTNEXTLINE(bugprone-suspicious-missing-comma): one message, split to fit
            "top.json: error: port 'd[1]' has no pin; nextpnr-ice40 refuses an unconstrained "
            "port unless given --pcf-allow-unconstrained",
            // NOLINTNEXTLINE(bugprone-suspicious-missing-comma): one message, split to fit
            "p.pcf:9: warning: design top.json has no port 'ghost'; the line is kept "
            "(-nowarn or --warn-no-port says it may be absent)",
        }));
    EXPECT_EQ(problems[1].port, "led[1]");
    EXPECT_EQ(problems[1].pin, "1");
    EXPECT_EQ(summary.absentLines, 2u);
    EXPECT_EQ(summary.keptSilently, 1u);

    // The board file's exact reading: the stray line is an error of its own.
    VnTool::CheckOptions strict;
    strict.strict = true;
    auto exact = Messages(VnTool::CheckPins(db, design, "top.json", pcf, strict));
    EXPECT_NE(std::find(exact.begin(), exact.end(),
                        "p.pcf:9: error: design top.json has no port 'ghost' (add -nowarn to keep "
                        "the line anyway)"),
              exact.end());
}

// A board file names every pin of the board; a design uses a few. Lines for the ports it
// lacks are read as nextpnr-ice40 reads them: they hold no pin, their pins need not be in
// this package, and aliases of one pad are no conflict.
TEST(PinChecks, ABoardFilesLinesForAbsentPortsHoldNoPin) {
    ChipDb db = Device();
    Design design = Counter();
    PcfFile pcf = Pcf("set_io\t--warn-no-port LED_RED_N 1\t# red\n"
                      "set_io -nowarn LED_RGB[0] 1\n" // another name of the same pad
                      "set_io -nowarn FLASH_CS 77\n"  // a pin of the board's larger package
                      "set_io clk 8\nset_io rst 7\n"
                      "set_io led[0] 1\n" // the design's own port on the aliased pad
                      "set_io led[1] 2\nset_io led[2] 3\nset_io d[0] 4\nset_io d[1] 5\n");
    VnTool::CheckSummary summary;
    auto problems =
        VnTool::CheckPins(db, design, "top.json", pcf, VnTool::CheckOptions{}, &summary);
    EXPECT_EQ(
        Messages(problems),
        std::vector<std::string>{"p.pcf:3: warning: pin '77' is not in package p of device t"});
    EXPECT_EQ(summary.absentLines, 3u);
    EXPECT_EQ(summary.keptSilently, 3u);

    // Two present ports on the aliased pad are the conflict, named by the port that holds it.
    pcf.Assign("led[1]", "1");
    auto shared = Messages(VnTool::CheckPins(db, design, "top.json", pcf, VnTool::CheckOptions{}));
    ASSERT_FALSE(shared.empty());
    EXPECT_EQ(shared[0], "p.pcf:7: error: pin 1 already holds port 'led[0]' (line 6)");
}

// A slip in a board file shows where the design's port went missing.
TEST(PinChecks, ATypoOnANowarnLineLeavesAPortUnconstrainedAndSaysWhere) {
    ChipDb db = Device();
    Design design = Counter();
    PcfFile pcf = Pcf("set_io clk 8\nset_io rst 7\nset_io led[0] 1\nset_io led[1] 2\n"
                      "set_io led[3] 3\n" // led is led[0..2]
                      "set_io d[0] 4\nset_io -nowarn d_1 5\n");
    auto problems =
        Messages(VnTool::CheckPins(db, design, "top.json", pcf, VnTool::CheckOptions{}));
    EXPECT_EQ(problems,
              (std::vector<std::string>{
                  "top.json: error: port 'led[2]' has no pin (p.pcf:5 names 'led[3]': did you "
                  "mean 'led[2]'?); nextpnr-ice40 refuses an unconstrained port unless given "
                  "--pcf-allow-unconstrained",
                  "top.json: error: port 'd[1]' has no pin (p.pcf:7 names 'd_1': did you mean "
                  "'d[1]'?); nextpnr-ice40 refuses an unconstrained port unless given "
                  "--pcf-allow-unconstrained",
                  "p.pcf:5: warning: design top.json has no port 'led[3]' (bus 'led' has bits 0 "
                  "to 2) (did you mean led[2]?); the line is kept (-nowarn or --warn-no-port "
                  "says it may be absent)",
              }));
    VnTool::CheckOptions allow;
    allow.allowUnconstrained = true;
    EXPECT_FALSE(VnTool::HasErrors(VnTool::CheckPins(db, design, "top.json", pcf, allow)));
}

TEST(PinChecks, APullupResistorIsOnlyForUltraPlus) {
    ChipDb db = Device();
    Design design;
    design.ports = {Port("a", -1, 1)};
    auto problems = Messages(VnTool::CheckPins(
        db, design, "top.json", Pcf("set_io -pullup_resistor 10K -nowarn b 2\nset_io a 1\n"),
        VnTool::CheckOptions{}));
    EXPECT_EQ(problems, std::vector<std::string>{
                            "p.pcf:1: error: -pullup_resistor is only for UltraPlus parts (up5k, "
                            "up3k); device t has fixed pull-ups"});
}

// The test device with the hard blocks of a larger one: a PLL whose pad is pin 8 and
// whose second output takes pin 7, and an LED driver on pins 1 to 3.
ChipDb DeviceWithHardBlocks() {
    ChipDb db;
    std::istringstream in(kDevice + Tiles(6, 6) +
                          ".extra_cell 3 0 PLL\nLOCKED q\nPLLOUT_A 3 0 1\nPLLOUT_B 2 0 0\n"
                          "DIVF_0 0 1 PLLCONFIG_5\n"
                          ".extra_cell 0 4 0 RGBA_DRV\nRGB0 1 5 0\nRGB1 2 5 0\nRGB2 3 5 0\n"
                          "CURREN 0 4 lutff_6/in_3\n");
    std::string error;
    EXPECT_TRUE(VnTool::ReadChipDb(in, "t.txt", "p", db, error)) << error;
    return db;
}

VnTool::DesignPort PadPort(const std::string& name, VnTool::PadUse use, int index = -1) {
    VnTool::DesignPort port = Port(name, -1, 1);
    port.padUse = use;
    port.padIndex = index;
    port.padCell = use == VnTool::PadUse::PllInput ? "SB_PLL40_2F_PAD" : "SB_X";
    return port;
}

Design HardBlockDesign() {
    using VnTool::PadUse;
    Design design;
    design.ports = {PadPort("ref", PadUse::PllInput),    PadPort("r", PadUse::LedDriver, 0),
                    PadPort("g", PadUse::LedDriver, 1),  PadPort("b", PadUse::LedDriver, 2),
                    PadPort("lv", PadUse::Differential), PadPort("x", PadUse::Plain)};
    design.padPlls = 1;
    design.twoOutputPlls = 1;
    design.ledDriver = true;
    return design;
}

TEST(HardBlocks, AutoAssignPutsEachPortOnTheOnePadThatIsRightAndKeepsTheOthersOff) {
    ChipDb db = DeviceWithHardBlocks();
    Design design = HardBlockDesign();
    PcfFile pcf = Pcf("");
    auto given = VnTool::AutoAssign(db, design, pcf);
    // The differential input takes pin 5 and keeps its partner 6 free; the PLL's second
    // output keeps 7; the plain port gets the first pin left.
    EXPECT_EQ(given,
              (std::vector<std::pair<std::string, std::string>>{
                  {"ref", "8"}, {"r", "1"}, {"g", "2"}, {"b", "3"}, {"lv", "5"}, {"x", "4"}}));
    EXPECT_TRUE(VnTool::CheckPins(db, design, "top.json", pcf, VnTool::CheckOptions{}).empty());
}

TEST(HardBlocks, EachBrokenRuleIsAnErrorNamingThePinsThatWouldBeRight) {
    ChipDb db = DeviceWithHardBlocks();
    Design design = HardBlockDesign();
    const std::string good = "set_io r 1\nset_io g 2\nset_io b 3\nset_io ref 8\n"
                             "set_io lv 5\nset_io x 9\n";
    struct Case {
        std::string from;
        std::string to;
        std::string says;
    };
    const Case cases[] = {
        {"set_io ref 8", "set_io ref 10",
         "p.pcf:4: error: port 'ref' feeds SB_PLL40_2F_PAD through its pad, so it must be on a "
         "PLL's pad: 8"},
        {"set_io g 2", "set_io g 4",
         "p.pcf:2: error: port 'g' is output RGB1 of the LED driver, whose pad is fixed: pin 2 "
         "(nextpnr-ice40 puts it there whatever the line says)"},
        {"set_io x 9", "set_io x 7",
         "p.pcf:6: error: pin 7 is the pad of the second output of SB_PLL40_2F_PAD, which the "
         "design uses; put 'x' elsewhere"},
        {"set_io lv 5", "set_io lv 6",
         "p.pcf:5: error: differential input 'lv' must be on the first pin of a pair whose "
         "second pin is bonded: 5"},
        {"set_io x 9", "set_io x 6",
         "p.pcf:5: error: differential input 'lv' takes its pair's second pin 6, which holds "
         "port 'x' (line 6)"},
    };
    for (const Case& c : cases) {
        std::string text = good;
        text.replace(text.find(c.from), c.from.size(), c.to);
        auto problems =
            Messages(VnTool::CheckPins(db, design, "top.json", Pcf(text), VnTool::CheckOptions{}));
        ASSERT_FALSE(problems.empty()) << c.to;
        EXPECT_EQ(problems[0], c.says);
    }
    // Another port on an LED pad, when the other LED port is elsewhere.
    Design two = design;
    two.ports[2].padUse = VnTool::PadUse::Plain;
    auto problems =
        Messages(VnTool::CheckPins(db, two, "top.json", Pcf(good), VnTool::CheckOptions{}));
    ASSERT_FALSE(problems.empty());
    EXPECT_EQ(problems[0], "p.pcf:2: error: pin 2 is the pad of output RGB1 of the LED driver, "
                           "which the design uses; put 'g' elsewhere");
    // In a package where the PLL is not bonded out, there is no right pad.
    ChipDb locked;
    std::istringstream in(".device t 6 6 0\n.pins q\n8 3 0 1\n" + Tiles(6, 6) +
                          ".extra_cell 3 0 PLL\nLOCKED q\nPLLOUT_A 3 0 1\n");
    std::string error;
    ASSERT_TRUE(VnTool::ReadChipDb(in, "t.txt", "q", locked, error)) << error;
    Design pll;
    pll.ports = {PadPort("ref", VnTool::PadUse::PllInput)};
    EXPECT_EQ(Messages(VnTool::CheckPins(locked, pll, "top.json", Pcf("set_io ref 8\n"),
                                         VnTool::CheckOptions{})),
              std::vector<std::string>{"p.pcf:1: error: port 'ref' feeds SB_PLL40_2F_PAD through "
                                       "its pad, so it must be on a PLL's pad: none in this "
                                       "package"});
}

// An SB_GB_IO's pad feeds a global buffer directly, so only the pins wired to one can hold
// it; a board file's -nowarn line is held to that as much as any other.
TEST(HardBlocks, AGlobalBufferPadCellIsRefusedOffTheGlobalBufferPinsAndKeptOnThem) {
    ChipDb db = Device();
    Design design;
    design.ports = {PadPort("gclk", VnTool::PadUse::GlobalBuffer), Port("x", -1, 1)};
    design.ports[0].padCell = "SB_GB_IO";
    for (const char* pin : {"9", "1"}) {
        auto problems = Messages(
            VnTool::CheckPins(db, design, "top.json",
                              Pcf(std::string("set_io x 2\nset_io -nowarn gclk ") + pin + "\n"),
                              VnTool::CheckOptions{}));
        EXPECT_EQ(
            problems,
            std::vector<std::string>{"p.pcf:2: error: port 'gclk' is an SB_GB_IO, whose pad must "
                                     "drive a global buffer: 8, 10"})
            << pin;
    }
    for (const char* pin : {"8", "10"}) {
        PcfFile pcf = Pcf(std::string("set_io x 2\nset_io -nowarn gclk ") + pin + "\n");
        EXPECT_TRUE(VnTool::CheckPins(db, design, "top.json", pcf, VnTool::CheckOptions{}).empty())
            << pin;
    }
    // Left to the tool, it lands on one of them.
    PcfFile pcf = Pcf("");
    auto given = VnTool::AutoAssign(db, design, pcf);
    EXPECT_EQ(given, (std::vector<std::pair<std::string, std::string>>{{"gclk", "8"}, {"x", "1"}}));
    EXPECT_TRUE(VnTool::CheckPins(db, design, "top.json", pcf, VnTool::CheckOptions{}).empty());
}

// A bus goes to the first bank with room for all of it, the last bank included.
TEST(AutoAssign, ABusFitsWhenOnlyTheLastBankHasRoom) {
    ChipDb db = Device();
    Design design;
    design.ports = {Port("w", 0, 2), Port("w", 1, 2)};
    PcfFile pcf = Pcf("set_io -nowarn a 1\nset_io -nowarn b 2\nset_io -nowarn c 4\n"
                      "set_io -nowarn d 5\nset_io -nowarn e 7\n");
    auto given = VnTool::AutoAssign(db, design, pcf);
    EXPECT_EQ(given,
              (std::vector<std::pair<std::string, std::string>>{{"w[0]", "9"}, {"w[1]", "10"}}));
}

TEST(PinChecks, AClockOffTheGlobalBufferPinsIsAWarningNamingThem) {
    ChipDb db = Device();
    Design design;
    design.ports = {Port("clk", -1, 1, true), Port("data", -1, 1)};
    PcfFile pcf = Pcf("set_io clk 1\nset_io data 10\n");
    EXPECT_EQ(Messages(VnTool::CheckPins(db, design, "top.json", pcf, true)),
              std::vector<std::string>{"p.pcf:1: warning: clock port 'clk' is on pin 1, which "
                                       "drives no global buffer (those are 8, 10)"});
}

TEST(PinChecks, PinsAreCountedAsPeopleCountThem) {
    ChipDb db;
    std::istringstream in(".device t 4 4 0\n.pins p\nB1 0 1 0\nA10 0 2 0\nA2 0 1 1\n10 0 2 1\n"
                          "9 3 1 0\nA02 3 1 1\n" +
                          Tiles(4, 4));
    std::string error;
    ASSERT_TRUE(VnTool::ReadChipDb(in, "t.txt", "p", db, error)) << error;
    std::vector<std::string> names;
    for (const auto* pin : VnTool::PinsInOrder(db)) {
        names.push_back(pin->name);
    }
    EXPECT_EQ(names, (std::vector<std::string>{"9", "10", "A02", "A2", "A10", "B1"}));
}

TEST(AutoAssign, ClocksTakeGlobalBuffersAndBusesStayTogetherInOneBank) {
    ChipDb db = Device();
    Design design = Counter();
    PcfFile pcf = Pcf("# mine\n");
    auto given = VnTool::AutoAssign(db, design, pcf);
    std::map<std::string, std::string> pins(given.begin(), given.end());
    EXPECT_EQ(pins, (std::map<std::string, std::string>{{"clk", "8"},
                                                        {"led[0]", "1"},
                                                        {"led[1]", "2"},
                                                        {"led[2]", "3"},
                                                        {"d[0]", "4"},
                                                        {"d[1]", "5"},
                                                        {"rst", "6"}}));
    EXPECT_EQ(pcf.Text().rfind("# mine\n", 0), 0u);
    EXPECT_TRUE(VnTool::CheckPins(db, design, "top.json", pcf, true).empty());

    // The same plan again from the same start: nothing depends on chance or addresses.
    PcfFile again = Pcf("# mine\n");
    VnTool::AutoAssign(db, design, again);
    EXPECT_EQ(again.Text(), pcf.Text());
}

TEST(AutoAssign, KeepsTheUsersPinsAndFillsAroundThem) {
    ChipDb db = Device();
    Design design = Counter();
    // led[1] sits in bank 0 already and pin 4 is taken by a line for another design's
    // port: the rest of led still fits in bank 0; d moves to bank 1's remaining pins.
    PcfFile pcf = Pcf("set_io led[1] 2\nset_io -nowarn other 4\n");
    auto given = VnTool::AutoAssign(db, design, pcf);
    std::map<std::string, std::string> pins(given.begin(), given.end());
    EXPECT_EQ(pins, (std::map<std::string, std::string>{{"clk", "8"},
                                                        {"led[0]", "1"},
                                                        {"led[2]", "3"},
                                                        {"d[0]", "5"},
                                                        {"d[1]", "6"},
                                                        {"rst", "7"}}));
    EXPECT_EQ(pcf.Text().rfind("set_io led[1] 2\nset_io -nowarn other 4\n", 0), 0u);
}

TEST(AutoAssign, ABusNoBankCanHoldIsSpreadAndSpareClocksTakeOrdinaryPins) {
    ChipDb db = Device();
    Design design;
    // Three clocks for two global-buffer pins; a four-bit bus no bank holds.
    design.ports = {Port("c", 0, 3, true), Port("c", 1, 3, true), Port("c", 2, 3, true),
                    Port("w", 0, 4),       Port("w", 1, 4),       Port("w", 2, 4),
                    Port("w", 3, 4)};
    PcfFile pcf = Pcf("");
    auto given = VnTool::AutoAssign(db, design, pcf);
    EXPECT_EQ(given, (std::vector<std::pair<std::string, std::string>>{{"c[0]", "8"},
                                                                       {"c[1]", "10"},
                                                                       {"c[2]", "1"},
                                                                       {"w[0]", "2"},
                                                                       {"w[1]", "3"},
                                                                       {"w[2]", "4"},
                                                                       {"w[3]", "5"}}));

    // More ports than pins: the ones left over get none and stay unconstrained.
    for (int i = 0; i < 6; ++i) {
        design.ports.push_back(Port("x" + std::to_string(i), -1, 1));
    }
    PcfFile full = Pcf("");
    EXPECT_EQ(VnTool::AutoAssign(db, design, full).size(), 10u);
    auto problems = VnTool::CheckPins(db, design, "top.json", full, false);
    EXPECT_EQ(problems.size(), 3u + 1u); // x3..x5 without pins, c[2] off a global buffer
}

using Text = Port::StringBase<char>;
template <class T> using Ptr = CommonI::RefCountPtr<T>;

std::vector<std::string> Found(VnTool::PortHolders& ports, const char* name, VnI::IProperty* wanted,
                               int flags) {
    auto all = ports.List();
    auto found =
        Vn::Eng::FindItr::CreateInstance(Vn::Eng::PropertyHolderItr::CreateInstance(&all), name,
                                         Ptr<const VnI::IProperty>::Adopt(wanted), flags);
    std::vector<std::string> names;
    for (; !found->IsEnd(); found->Next()) {
        names.push_back(found->CurrentItem()->GetName().str());
    }
    return names;
}

TEST(PortHolders, PortsAreSearchedSelectedAndShownAsPinsAre) {
    ChipDb db = Device();
    Design design = Counter();
    design.ports[4].direction = VnTool::PortDirection::Inout;
    VnTool::PortHolders ports(design);
    PcfFile pcf = Pcf("set_io clk 8\nset_io led[0] 1\nset_io led[1] 2\nset_io d[0] 99\n");
    ports.ApplyPins(db, pcf);

    ASSERT_EQ(ports.Size(), design.ports.size());
    auto* clk = ports.Find("clk");
    ASSERT_NE(clk, nullptr);
    EXPECT_EQ(clk->GetType(), VnTool::kPortHolderType);
    EXPECT_NE(clk->GetType(), 7);
    EXPECT_EQ(clk->GetPropertyNames(), ports.Find("rst")->GetPropertyNames());
    EXPECT_EQ(clk->GetPropertyByName("Pin")->GetStringProperty().str(), "8");
    EXPECT_EQ(clk->GetPropertyByName("Bank")->GetIntProperty(), 2);
    EXPECT_EQ(ports.Find("d[0]")->GetPropertyByName("Pin")->GetStringProperty().str(), "99");
    EXPECT_EQ(ports.Find("d[0]")->GetPropertyByName("Bank")->GetIntProperty(), -1);
    EXPECT_EQ(ports.Find("led[2]")->GetPropertyByName("Pin")->GetStringProperty().str(), "");

    using Vn::Eng::PropertyFactory;
    EXPECT_EQ(
        Found(ports, "Clock", PropertyFactory::CreateBoolProperty(true, true), VnI::MATCH_EXACT),
        std::vector<std::string>{"clk"});
    EXPECT_EQ(Found(ports, "Bank", PropertyFactory::CreateIntProperty(0, true), VnI::MATCH_EXACT),
              (std::vector<std::string>{"led[1]", "led[0]"}));
    EXPECT_EQ(Found(ports, "Name", PropertyFactory::CreateStringProperty("LED\\[[12]\\]", true),
                    VnI::MATCH_REGEXP | VnI::MATCH_IGNORE_CASE),
              (std::vector<std::string>{"led[2]", "led[1]"}));
    EXPECT_EQ(Found(ports, "Bit", PropertyFactory::CreateIntProperty(1, true), VnI::MATCH_EXACT),
              (std::vector<std::string>{"led[1]", "d[1]"}));
    // A direction is searched by its text, as a user types it.
    EXPECT_EQ(Found(ports, "Direction", PropertyFactory::CreateStringProperty("inout", true),
                    VnI::MATCH_EXACT),
              std::vector<std::string>{"rst"});

    Vn::Eng::SelectionManager selection;
    selection.AddSelectedItem(clk, false);
    EXPECT_TRUE(clk->IsSelected());
    auto node = Vn::Eng::TreeNode::CreateInstance(clk, nullptr);
    EXPECT_EQ(node->GetDataRef(), clk);
    EXPECT_EQ(node->GetDataRef()->GetName().str(), "clk");
    selection.RemoveAll();
}

} // namespace
