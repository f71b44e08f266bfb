//===-- tools/board/BoardFiles.h - the parts and nets of a board's KiCad files ---===//
//
// \file
// What pin planning needs of a board is each part's pins and the net on each. KiCad
// keeps that in three files of several generations, all read here into one model:
//  - the netlist as an S-expression (version "D" of KiCad 4 and 5 with bare words,
//    version "E" of KiCad 6 and later with every word quoted);
//  - the same netlist as XML;
//  - the board file (.kicad_pcb) of KiCad 4 to 8: the pads of each footprint (`module`
//    before KiCad 6, `footprint` since) and the net of each pad, by name or by number.
// The kind is told from the text, never from the file name.
//
//   VnTool::Board board;
//   if (!VnTool::ReadBoardFile("board.net", board, error)) { report(error); }
//
//===------------------------------------------------------------------------------===//
#pragma once

#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace VnTool {

struct BoardPart {
    std::string ref;       ///< the reference designator: "U1"
    std::string value;     ///< "iCE40HX1K-TQ144"
    std::string footprint; ///< "Package_QFP:LQFP-144_20x20mm_P0.5mm"
    /// (pin or pad name, net name) in file order; a pad on no net has an empty net.
    std::vector<std::pair<std::string, std::string>> pins;
};

struct Board {
    std::string source;  ///< the file it was read from
    std::string kind;    ///< "KiCad netlist (version D)", "KiCad board file (version 20171130)"...
    bool layout = false; ///< read from a board file rather than a netlist
    std::vector<BoardPart> parts; ///< in file order

    /// The part of that reference, or null.
    const BoardPart* Find(std::string_view ref) const;
};

/// Reads any of the three kinds from text. `source` names it in messages. Returns false
/// with "source:line: why" in `error`.
bool ReadBoard(std::string_view text, std::string_view source, Board& board, std::string& error);

/// The same from a file, read under the portability layer's input limits.
bool ReadBoardFile(const std::string& path, Board& board, std::string& error);

} // namespace VnTool
