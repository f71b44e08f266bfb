//===-- tools/design/YosysPorts.h - the top-level ports of a yosys netlist ---===//
//
// \file
// Pin planning needs only the top module's ports of a yosys JSON netlist, and which of
// them are clocks, yet a synthesized netlist is mostly cells. The reader streams the
// document and keeps the ports of each module plus the net bits that reach a clock
// input, so its memory follows the number of ports and clock nets, never the file size.
//
//   VnTool::Design design;
//   std::string error;
//   if (!VnTool::ReadYosysPortsFile("top.json", design, error)) { report(error); }
//   for (const auto& port : design.ports) { ... port.name is "led[0]" as nextpnr names it }
//
//===------------------------------------------------------------------------------===//
#pragma once

#include <istream>
#include <string>
#include <string_view>
#include <vector>

namespace VnTool {

/// Stored in the ports' enumerated property; do not reorder.
enum class PortDirection : int { Input = 0, Output = 1, Inout = 2 };

/// "input", "output" or "inout".
const char* PortDirectionName(PortDirection direction);

/// What decides where a port's pad may be, beyond its being a port: the cell of the
/// design that is wired to the pad.
enum class PadUse : int {
    Plain = 0,    ///< no such cell, or a plain SB_IO / SB_IO_OD
    GlobalBuffer, ///< SB_GB_IO: its pad must drive a global buffer
    PllInput,     ///< PACKAGEPIN of SB_PLL40_PAD, _2_PAD or _2F_PAD: the PLL's own pad
    LedDriver,    ///< RGB0..RGB2 of SB_RGBA_DRV / SB_RGB_DRV: a fixed pad
    Differential, ///< SB_LVDS_INPUT or IO_STANDARD SB_LVDS_INPUT: a pair's first pin
};

/// One bit of a top-level port, which is what a pin constraint names.
struct DesignPort {
    std::string name; ///< as nextpnr names the bit: "clk", "led[0]"
    std::string bus;  ///< the port's name in the netlist: "led"
    int bit = -1;     ///< the index in `name`; -1 when the name has none
    int width = 1;    ///< bits of the whole bus
    PortDirection direction = PortDirection::Input;
    bool clock = false; ///< drives a flip-flop's clock or a global buffer
    PadUse padUse = PadUse::Plain;
    int padIndex = -1;   ///< the LED driver's output (0 for RGB0); -1 otherwise
    std::string padCell; ///< the type of the cell wired to the pad, or empty
};

struct Design {
    std::string top;               ///< the top module's name
    std::vector<DesignPort> ports; ///< netlist order; a bus's bits in its bits order
    int padPlls = 0;               ///< PLLs fed by their pad (SB_PLL40_*PAD)
    int twoOutputPlls = 0;         ///< PLLs with two outputs, whose second takes a pad too
    bool ledDriver = false;        ///< an SB_RGBA_DRV or SB_RGB_DRV is used
};

/// Reads the ports of the top module: the module marked top, else the only module that
/// is no black box, and the cells of it that decide where pads go. `source` names the
/// input in messages. A port whose bit indices do not fit an int is refused. Returns false with one
/// line "source:line: why" in `error` on malformed JSON, on JSON that is no yosys netlist and when
/// no top module can be told; `design` is then unspecified.
bool ReadYosysPorts(std::istream& in, std::string_view source, Design& design, std::string& error);

/// The same from a file; also fails when the file cannot be opened.
bool ReadYosysPortsFile(const std::string& path, Design& design, std::string& error);

} // namespace VnTool
