//===-- tools/chipdb/ChipDb.h - reads the tiles and package pins of a chip database ---===//
//
// \file
// The tool draws devices described in the text chip databases of the Debian package
// fpga-icestorm-chipdb. Of such a file we need only the device size, the tiles and the
// pins of one package; the routing and bit sections that make up nearly all of its bulk
// are passed over without being stored, so the largest device reads in a fraction of a
// second.
//
//   VnTool::ChipDb db;
//   std::string error;
//   if (!VnTool::ReadChipDbFile("chipdb-8k.txt", "ct256", db, error)) { report(error); }
//
// Errors name the file and the line ("chipdb-8k.txt:3021: ...") as a compiler does.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include <cstddef>
#include <istream>
#include <string>
#include <string_view>
#include <vector>

namespace VnTool {

/// Tile kinds of the database; the values index TileKindName and are stored in the
/// tool's enumerated property, so do not reorder.
enum class TileKind : int { Logic = 0, Io = 1, RamBottom = 2, RamTop = 3 };

/// The section name of a kind without its dot and "_tile" ("logic", "io", ...).
const char* TileKindName(TileKind kind);

struct Tile {
    TileKind kind = TileKind::Logic;
    int x = 0;
    int y = 0;
};

struct Pin {
    std::string name; ///< package pin name, such as "A1" or "112"
    int x = 0;        ///< the IO tile the pin is bonded to
    int y = 0;
    int pio = 0;   ///< IO block inside that tile
    int bank = -1; ///< IO bank, see IoBankOf
    std::size_t line = 0;
};

/// An IO block that drives a global network directly when used as an input (the
/// .gbufpin section); clocks belong on these.
struct GlobalBufferPin {
    int x = 0;
    int y = 0;
    int pio = 0;
    int network = 0; ///< the global network it drives
};

/// An IO block a hard block of the device is wired to (from the .extra_cell sections):
/// the PLL's pad and second output, the UltraPlus LED driver's outputs.
struct HardBlockPad {
    enum class Role {
        PllInput,     ///< PLLOUT_A: the pad a SB_PLL40_*PAD's PACKAGEPIN must be on
        PllSecondOut, ///< PLLOUT_B: taken by a two-output PLL
        LedDriver,    ///< RGB0..RGB2 of the LED driver (`index`)
    };
    Role role = Role::PllInput;
    int block = 0; ///< which PLL of the device, in file order; the output index for LEDs
    int x = 0;
    int y = 0;
    int pio = 0;
    bool lockedInPackage = false; ///< the PLL is not bonded out in the package read
};

struct ChipDb {
    std::string device; ///< the device name of the .device line, such as "8k"
    int width = 0;
    int height = 0;
    std::string package;                           ///< the package whose pins were read
    std::vector<std::string> packages;             ///< every package of the file, in file order
    std::vector<Tile> tiles;                       ///< in file order
    std::vector<Pin> pins;                         ///< in file order
    std::vector<GlobalBufferPin> globalBufferPins; ///< in file order, of every package
    std::vector<HardBlockPad> hardBlockPads;       ///< in file order
};

/// The pin of `db`'s package bonded to the IO block of `pad`; null when the package has
/// none there.
const Pin* PinOfPad(const ChipDb& db, const HardBlockPad& pad);

/// The IO bank of a tile on the edge of a width x height grid, numbered as this family's
/// data sheets do: top edge 0, right 1, bottom 2, left 3; -1 for a tile inside.
int IoBankOf(int x, int y, int width, int height);

/// Whether `pin` is bonded to an IO block of the .gbufpin section.
bool IsGlobalBufferPin(const ChipDb& db, const Pin& pin);

/// Reads a chip database from a stream. `package` names the package whose pins are kept;
/// empty takes the first package of the file. `source` names the input in messages.
/// Returns false with a one-line reason in `error` on malformed input or when the
/// package is not in the file; `db` is then unspecified.
bool ReadChipDb(std::istream& in, std::string_view source, std::string_view package, ChipDb& db,
                std::string& error);

/// The same from a file ("-" for standard input); also fails when the file cannot be
/// opened, is no regular file or is larger than Port::kMaxInputBytes.
bool ReadChipDbFile(const std::string& path, std::string_view package, ChipDb& db,
                    std::string& error);

} // namespace VnTool
