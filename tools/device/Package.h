//===-- tools/device/Package.h - a chip database's package as a board designer sees it ---===//
//
// \file
// The chip database names the I/O pins of a package and nothing else: not how many balls
// or leads the package has, where they sit, nor which are power, ground or configuration.
// A board designer checks a footprint by those places, so this unit lays the package out:
//
// - a ball grid (names such as "A1", "T16": ct256, cm225, cb132, cm81, swg16tr, uwg30, ...)
//   as rows and columns, the rows from the letters the names use in JEDEC order (I, O, Q,
//   S, X and Z left out, unless the package's own names use one), the columns from the
//   numbers, A1 at the top left seen from the top;
// - a leaded or no-lead package with its pins around four sides (tq144, vq100, sg48, qn32:
//   numbered names; qn84: a second, inner row named "B1" on, the outer row "A1" on), pin 1
//   at the top of the left side and counted counter-clockwise seen from the top, each row
//   counted from its own pin 1.
//
// How many balls or pins a package has comes from its name's number (ct256: 256, tq144:
// 144); a place that no I/O pin of the database names is a ball or pin of another kind, and
// it is laid out like the others, marked as not I/O. A variant after a colon ("cm225:4k",
// the same package bonded to a smaller part) has the same footprint: only the pins differ.
// The bottom view mirrors left and right, as the footprint on the board is seen.
//
//   VnTool::PackageLayout layout;
//   std::string error;
//   if (!VnTool::LayOutPackage(db, /*bottomView=*/false, layout, error)) { report(error); }
//   for (const VnTool::PackageSite& site : layout.sites) { ... site.x, site.y, site.pin }
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "ChipDb.h"

#include <string>
#include <string_view>
#include <vector>

namespace VnTool {

/// One ball or pin of the package.
struct PackageSite {
    std::string name; ///< "A1", "144"
    int pin = -1;     ///< index into ChipDb::pins; -1 when the place is not an I/O pin
    /// Centre in pitch units, from the top left of the layout's frame, as the view shows
    /// it (mirrored in the bottom view).
    double x = 0;
    double y = 0;
    // Ball grids: the row (0 for A) and column (0 for column 1) in the grid.
    int row = -1;
    int column = -1;
    // Pins around four sides: which side the pin is on in the view, which row from the
    // outside (0) and its place counted from that row's pin 1 (1 for pin 1).
    enum class Side { None, Left, Bottom, Right, Top };
    Side side = Side::None;
    int ring = 0;
    int number = 0;
    /// A fixed function of the pad beside I/O (a PLL's output, an LED driver): shown by
    /// the views when set. The chip database reader does not read these facts yet, so the
    /// layout leaves it empty; it is the place where they go.
    std::string role;
};

struct PackageLayout {
    enum class Kind { BallGrid, Perimeter };
    Kind kind = Kind::BallGrid;
    std::string package;   ///< as the chip database names it ("cm225:4k")
    std::string footprint; ///< the footprint part of the name ("cm225")
    int declaredCount = 0; ///< balls or pins the name gives (225); 0 when it gives none
    bool bottomView = false;
    double width = 0; ///< the frame, in pitch units
    double height = 0;
    // Ball grids.
    std::vector<std::string> rowNames; ///< top to bottom ("A", "B", ..., "H", "J", ...)
    int columns = 0;
    std::string skippedLetters; ///< letters before the last row that no row uses ("IOQS")
    // Perimeter packages: the pins of each row, the outside row first.
    std::vector<int> ringSizes;
    /// Every ball or pin, I/O or not; ball grids row by row, perimeter rows from pin 1.
    std::vector<PackageSite> sites;
    int ioCount = 0;    ///< sites that are I/O pins
    int otherCount = 0; ///< sites that are not
    /// A word on a guess the layout had to make, such as a ball count the names do not
    /// fit; empty when the layout is as the name and the pins say.
    std::string note;

    /// The site of that name, or null.
    const PackageSite* Find(std::string_view name) const;
};

/// Lays out `db`'s package (db.package, whose pins are db.pins). Fails with a one-line
/// reason when the pin names fit neither shape: mixed numbered and lettered names, or a
/// name that is neither.
bool LayOutPackage(const ChipDb& db, bool bottomView, PackageLayout& layout, std::string& error);

/// The ball-grid row names in JEDEC order from "A": single letters without I, O, Q, S, X
/// and Z, then "AA", "AB", ... on the same alphabet; `extra` letters (that a package's
/// names use although the order skips them) are kept in their alphabetical place.
std::vector<std::string> BallRowNames(std::size_t count, std::string_view extra = {});

} // namespace VnTool
