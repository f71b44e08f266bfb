//===-- tools/board/NetMatch.h - a board's nets matched to a design's ports ---===//
//
// \file
// On a board the FPGA footprint's pad numbers or ball names are the package's pin
// names; only the net names vary. This file finds the FPGA among the parts and matches
// its nets to the design's ports by the rule list of docs/board.md, which never guesses:
// a port two nets could claim, or a net two ports could take, is reported and not placed.
//
//   const VnTool::BoardPart* fpga = VnTool::FindFpga(board, db, "", error);
//   VnTool::BoardMatch match = VnTool::MatchPorts(design, db, VnTool::NetsOnPins(*fpga));
//   for (auto& [port, pin] : match.placed) { pcf.Assign(port, pin); }
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "BoardFiles.h"
#include "ChipDb.h"
#include "YosysPorts.h"

#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace VnTool {

/// One name a net label gives, read for matching.
struct NetName {
    std::string plain;    ///< lower case, letters and digits only: "ledr0" for "/LED_R[0]"
    std::string stem;     ///< `plain` without its active-low mark; equal to it when unmarked
    bool low = false;     ///< marked active low: ~{X}, ~X, nX, X_B, X_N
    bool overbar = false; ///< the mark is an overbar, which has no letters to compare
};

/// The names a net's label gives: its sheet path dropped, one per '|'-separated part;
/// none for a net KiCad named itself (Net-(...), unconnected-(...), N-000...) or no name.
std::vector<NetName> ReadNetName(std::string_view net);

/// A pin of the FPGA and the net on it, as the board names both.
struct NetOnPin {
    std::string pin;
    std::string net;
};

/// The pins of `part`, each once, with its net.
std::vector<NetOnPin> NetsOnPins(const BoardPart& part);

/// The FPGA: the part of reference `ref`, or when `ref` is empty the only part at least 8
/// and more than half of whose pins are I/O pins of the package. Null with the reason in
/// `error` when there is no such part or there are several.
const BoardPart* FindFpga(const Board& board, const ChipDb& db, const std::string& ref,
                          std::string& error);

struct BoardMatch {
    /// (port, package pin) in design order: the ports a net was found for alone.
    std::vector<std::pair<std::string, std::string>> placed;
    /// Design ports no net matched.
    std::vector<std::string> unmatched;
    /// One line each: a port or net that more than one could take, a net on several pins,
    /// a net on a pin that is no I/O pin; none of them placed.
    std::vector<std::string> problems;
    /// Named nets on I/O pins that no port took: "99 /SPARE".
    std::vector<std::string> unused;
};

/// Matches the nets on the FPGA's pins to the design's ports.
BoardMatch MatchPorts(const Design& design, const ChipDb& db, const std::vector<NetOnPin>& pins);

/// Pins whose nets differ between two reads of the same part (a netlist and its board
/// file): "12: /LED0 in a.net, /LED1 in b.kicad_pcb", in pin order of the first.
std::vector<std::string> CompareParts(const BoardPart& first, std::string_view firstSource,
                                      const BoardPart& second, std::string_view secondSource);

} // namespace VnTool
