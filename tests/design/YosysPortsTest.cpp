//===-- tests/design/YosysPortsTest.cpp - top ports and clocks, named as nextpnr names them -===//
#include "YosysPorts.h"

#include <gtest/gtest.h>

#include <map>
#include <sstream>

namespace {

using VnTool::Design;
using VnTool::PortDirection;

bool Read(const std::string& json, Design& design, std::string& error) {
    std::istringstream in(json);
    return VnTool::ReadYosysPorts(in, "n.json", design, error);
}

std::map<std::string, const VnTool::DesignPort*> ByName(const Design& design) {
    std::map<std::string, const VnTool::DesignPort*> ports;
    for (const auto& port : design.ports) {
        ports[port.name] = &port;
    }
    return ports;
}

// As synth_ice40 writes it: black boxes of the cell library first, the design last, its
// cells both before and after its ports, with constant bits among the connections.
const char kNetlist[] = R"({
  "creator": "test",
  "modules": {
    "SB_DFF": {"attributes": {"blackbox": "00000000000000000000000000000001"},
               "ports": {"C": {"direction": "input", "bits": [2]}}},
    "top": {
      "attributes": {"top": "00000000000000000000000000000001", "src": "t.v:1"},
      "cells": {
        "ff": {"type": "SB_DFF", "parameters": {"X": "1"},
               "connections": {"C": [2], "D": [9], "Q": [3]}},
        "w": {"type": "$dff", "connections": {"CLK": [7], "D": ["0"], "Q": [8]}},
        "lut": {"type": "SB_LUT4", "connections": {"I0": [4], "O": [10]}}
      },
      "ports": {
        "clk": {"direction": "input", "bits": [2]},
        "led": {"direction": "output", "bits": [3, 10, "0"]},
        "up": {"direction": "input", "upto": 1, "bits": [4, 5, 6]},
        "dn": {"direction": "inout", "offset": 4, "bits": [11, 12]},
        "one": {"direction": "input", "offset": 3, "bits": [7]},
        "gb": {"direction": "input", "bits": [13]},
        "gbio": {"direction": "input", "bits": [14]}
      },
      "more_cells_are_ignored": {"ports": {"x": {"direction": "input", "bits": [1]}}},
      "cells": {
        "g": {"connections": {"USER_SIGNAL_TO_GLOBAL_BUFFER": [13]}, "type": "SB_GB"},
        "pad": {"type": "SB_GB_IO", "connections": {"PACKAGE_PIN": [14], "D_IN_0": [2]}},
        "notclock": {"type": "SB_LUT4", "connections": {"C": [5]}}
      }
    }
  }
})";

TEST(YosysPorts, BitsAreNamedAsNextpnrNamesThem) {
    Design design;
    std::string error;
    ASSERT_TRUE(Read(kNetlist, design, error)) << error;
    EXPECT_EQ(design.top, "top");
    std::vector<std::string> names;
    for (const auto& port : design.ports) {
        names.push_back(port.name);
    }
    // A [0:2] port's first bit is its highest index; a lone bit keeps its name only at
    // offset 0 (nextpnr calls a one-bit [3:3] port "one[3]").
    EXPECT_EQ(names,
              (std::vector<std::string>{"clk", "led[0]", "led[1]", "led[2]", "up[2]", "up[1]",
                                        "up[0]", "dn[4]", "dn[5]", "one[3]", "gb", "gbio"}));
    auto ports = ByName(design);
    EXPECT_EQ(ports["clk"]->bit, -1);
    EXPECT_EQ(ports["up[0]"]->bit, 0);
    EXPECT_EQ(ports["up[0]"]->bus, "up");
    EXPECT_EQ(ports["up[0]"]->width, 3);
    EXPECT_EQ(ports["one[3]"]->width, 1);
    EXPECT_EQ(ports["clk"]->direction, PortDirection::Input);
    EXPECT_EQ(ports["led[2]"]->direction, PortDirection::Output);
    EXPECT_EQ(ports["dn[5]"]->direction, PortDirection::Inout);
}

TEST(YosysPorts, ClockPortsAreThoseThatReachAClockInputOrAGlobalBuffer) {
    Design design;
    std::string error;
    ASSERT_TRUE(Read(kNetlist, design, error)) << error;
    std::vector<std::string> clocks;
    for (const auto& port : design.ports) {
        if (port.clock) {
            clocks.push_back(port.name);
        }
    }
    // one[3] drives a word-level flip-flop's CLK; up[1] reaches only a LUT's pin named C.
    EXPECT_EQ(clocks, (std::vector<std::string>{"clk", "one[3]", "gb", "gbio"}));
}

TEST(YosysPorts, TheTopModuleIsTheMarkedOneElseTheOnlyDesign) {
    Design design;
    std::string error;
    ASSERT_TRUE(Read(R"({"modules": {
        "SB_IO": {"attributes": {"blackbox": "1"}, "ports": {}},
        "counter": {"ports": {"q": {"direction": "output", "bits": [2, 3]}}}}})",
                     design, error))
        << error;
    EXPECT_EQ(design.top, "counter");
    EXPECT_EQ(design.ports.size(), 2u);

    ASSERT_TRUE(Read(R"({"modules": {
        "a": {"ports": {"x": {"direction": "input", "bits": [2]}}},
        "b": {"attributes": {"top": "00000000000000000000000000000001"},
              "ports": {"y": {"direction": "input", "bits": [2]}}}}})",
                     design, error))
        << error;
    EXPECT_EQ(design.top, "b");
    ASSERT_EQ(design.ports.size(), 1u);
    EXPECT_EQ(design.ports[0].name, "y");

    // A top attribute of zero marks nothing.
    EXPECT_FALSE(
        Read(R"({"modules": {"a": {"attributes": {"top": "00000000000000000000000000000000"}},
                                     "b": {}}})",
             design, error));
    EXPECT_EQ(error,
              "n.json: no top module: 2 modules and none is marked top (synthesize with -top)");
}

struct Bad {
    const char* json;
    const char* message; // the start of the one-line error
};

TEST(YosysPorts, BadInputIsRefusedInOneLineNamingFileAndLine) {
    const Bad cases[] = {
        {"", "n.json:1: malformed JSON: "},
        {"{\n  \"modules\": {\n    \"top\": {,}\n", "n.json:3: malformed JSON: "},
        {"{\"modules\": {}} trailing", "n.json:1: malformed JSON: "},
        {"[1, 2]", "n.json:1: not a yosys netlist: the document is no object"},
        {"\"text\"", "n.json:1: not a yosys netlist: the document is no object"},
        {"{\"creator\": \"x\"}", "n.json:1: not a yosys netlist: no \"modules\""},
        {"{\"modules\": []}", "n.json:1: not a yosys netlist: \"modules\" is no object"},
        {"{\"modules\": 5}", "n.json:1: not a yosys netlist: \"modules\" is no object"},
        {"{\"modules\": {\"m\": {\"ports\": {\"p\": 5}}}}",
         "n.json:1: not a yosys netlist: port \"p\" is no object"},
        {"{\"modules\": {\"m\": 3}}", "n.json:1: not a yosys netlist: module \"m\" is no object"},
        {"{\"modules\": {\"m\": {\"ports\": []}}}",
         "n.json:1: not a yosys netlist: \"ports\" is no object"},
        {"{\"modules\": {\"m\": {\"ports\": {\n\"p\": {\"direction\": \"sideways\", \"bits\": "
         "[2]}}}}}",
         "n.json:2: not a yosys netlist: port \"p\" has direction \"sideways\""},
        {"{\"modules\": {\"m\": {\"ports\": {\"p\": {\"direction\": \"input\"}}}}}",
         "n.json:1: not a yosys netlist: port \"p\" has no bits"},
        {"{\"modules\": {\"m\": {\"ports\": {\"p\": {\"direction\": \"input\", \"bits\": 2}}}}}",
         "n.json:1: not a yosys netlist: the bits of port \"p\" are no array"},
        {"{\"modules\": {\"m\": {\"ports\": {\"p\": {\"direction\": \"input\", \"bits\": "
         "[[2]]}}}}}",
         "n.json:1: not a yosys netlist: port bits must be numbers"},
        {"{\"modules\": {}}",
         "n.json: no top module: the netlist has no module that is no black box"},
        {"{\"modules\": {\"a\": {\"attributes\": {\"top\": \"1\"}}, \"b\": {\"attributes\": "
         "{\"top\": \"1\"}}}}",
         "n.json: no single top module: a and b are both marked top"},
    };
    for (const Bad& c : cases) {
        SCOPED_TRACE(c.json);
        Design design;
        std::string error;
        EXPECT_FALSE(Read(c.json, design, error));
        EXPECT_EQ(error.rfind(c.message, 0), 0u) << error;
        EXPECT_EQ(error.find('\n'), std::string::npos) << error;
    }
    Design design;
    std::string error;
    EXPECT_FALSE(VnTool::ReadYosysPortsFile("/nonexistent/top.json", design, error));
    EXPECT_EQ(error, "/nonexistent/top.json: cannot open: No such file or directory");
}

} // namespace

namespace {

// The cells that decide where a pad goes, as yosys writes them: the pad connection among
// others, parameters before or after it.
TEST(YosysPorts, PadCellsSayWhatEachPortsPadMustBe) {
    const char netlist[] = R"({"modules": {"top": {
      "attributes": {"top": "00000000000000000000000000000001"},
      "ports": {"ref": {"direction": "input", "bits": [2]},
                "gb": {"direction": "input", "bits": [3]},
                "rgb": {"direction": "output", "bits": [4, 5, 6]},
                "lv": {"direction": "input", "bits": [7]},
                "od": {"direction": "output", "bits": [8]},
                "plain": {"direction": "input", "bits": [9]}},
      "cells": {
        "pll": {"type": "SB_PLL40_2F_PAD", "parameters": {"DIVF": "0111111"},
                "connections": {"PACKAGEPIN": [2], "PLLOUTGLOBALA": [20]}},
        "g": {"type": "SB_GB_IO", "connections": {"PACKAGE_PIN": [3], "GLOBAL_BUFFER_OUTPUT": [21]}},
        "drv": {"type": "SB_RGBA_DRV", "connections": {"RGB0": [4], "RGB1": [5], "RGB2": [6],
                "RGB0PWM": [22]}},
        "l": {"type": "SB_IO", "connections": {"PACKAGE_PIN": [7], "D_IN_0": [23]},
              "parameters": {"IO_STANDARD": "SB_LVDS_INPUT", "PIN_TYPE": "000001"}},
        "o": {"type": "SB_IO_OD", "connections": {"PACKAGEPIN": [8]}}
      }}}})";
    Design design;
    std::string error;
    ASSERT_TRUE(Read(netlist, design, error)) << error;
    auto ports = ByName(design);
    using VnTool::PadUse;
    EXPECT_EQ(ports["ref"]->padUse, PadUse::PllInput);
    EXPECT_EQ(ports["ref"]->padCell, "SB_PLL40_2F_PAD");
    EXPECT_EQ(ports["gb"]->padUse, PadUse::GlobalBuffer);
    EXPECT_TRUE(ports["gb"]->clock);
    for (int i = 0; i < 3; ++i) {
        const auto* led = ports["rgb[" + std::to_string(i) + "]"];
        EXPECT_EQ(led->padUse, PadUse::LedDriver);
        EXPECT_EQ(led->padIndex, i);
    }
    EXPECT_EQ(ports["lv"]->padUse, PadUse::Differential);
    EXPECT_EQ(ports["od"]->padUse, PadUse::Plain);
    EXPECT_EQ(ports["plain"]->padCell, "");
    EXPECT_EQ(design.padPlls, 1);
    EXPECT_EQ(design.twoOutputPlls, 1);
    EXPECT_TRUE(design.ledDriver);
}

// A bit index is named in the constraint file: one that does not fit an int would wrap
// round into the name of another bit.
TEST(YosysPorts, AnOffsetBeyondTheIndicesAConstraintCanNameIsRefused) {
    for (const char* offset :
         {"9223372036854775807", "18446744073709551615", "2147483647", "-2147483649"}) {
        std::string netlist = std::string(R"({"modules": {"top": {"ports": {)") +
                              R"("d": {"direction": "input", "bits": [2, 3], "offset": )" + offset +
                              "}}}}}";
        Design design;
        std::string error;
        EXPECT_FALSE(Read(netlist, design, error)) << offset;
        EXPECT_NE(error.find("beyond the indices a constraint can name"), std::string::npos)
            << error;
    }
    Design design;
    std::string error;
    ASSERT_TRUE(Read(R"({"modules": {"top": {"ports": {"d": {"direction": "input", )"
                     R"("bits": [2, 3], "offset": 2147483646}}}}})",
                     design, error))
        << error;
    EXPECT_EQ(design.ports[1].name, "d[2147483647]");
}

} // namespace
