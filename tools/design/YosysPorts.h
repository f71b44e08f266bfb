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

/// One bit of a top-level port, which is what a pin constraint names.
struct DesignPort {
    std::string name; ///< as nextpnr names the bit: "clk", "led[0]"
    std::string bus;  ///< the port's name in the netlist: "led"
    int bit = -1;     ///< the index in `name`; -1 when the name has none
    int width = 1;    ///< bits of the whole bus
    PortDirection direction = PortDirection::Input;
    bool clock = false; ///< drives a flip-flop's clock or a global buffer
};

struct Design {
    std::string top;               ///< the top module's name
    std::vector<DesignPort> ports; ///< netlist order; a bus's bits in its bits order
};

/// Reads the ports of the top module: the module marked top, else the only module that
/// is no black box. `source` names the input in messages. Returns false with one line
/// "source:line: why" in `error` on malformed JSON, on JSON that is no yosys netlist and
/// when no top module can be told; `design` is then unspecified.
bool ReadYosysPorts(std::istream& in, std::string_view source, Design& design, std::string& error);

/// The same from a file; also fails when the file cannot be opened.
bool ReadYosysPortsFile(const std::string& path, Design& design, std::string& error);

} // namespace VnTool
