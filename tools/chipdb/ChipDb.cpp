//===-- tools/chipdb/ChipDb.cpp - reads the tiles and package pins of a chip database ---===//
#include "ChipDb.h"
#include "SourceLine.h"
#include "Suggest.h"

#include "Port/SafeFile.h"

#include <algorithm>
#include <charconv>
#include <set>
#include <unordered_map>
#include <unordered_set>
#include <utility>

namespace VnTool {

namespace {

// The family's largest device is 34 x 34 tiles. A grid larger than this is no device of
// it; refusing it keeps a corrupt size from making the model, which costs about a
// kilobyte per tile, and the drawing absurdly large.
constexpr int kMaxGridSide = 128;
// Every IO tile of the family holds two IO blocks, numbered 0 and 1.
constexpr int kIoBlocksPerTile = 2;
// Real files list a handful of packages; many more means a damaged or crafted file.
constexpr std::size_t kMaxPackages = 64;
// No line the reader interprets has more fields than this; splitting stops there, so a
// crafted line of a million words costs nothing.
constexpr std::size_t kMaxFields = 8;

// Every section name the family's databases use. Anything else is damage: a misspelt
// tile section would otherwise drop its tile in silence.
constexpr std::string_view kKnownSections[] = {
    ".buffer",         ".colbuf",          ".device",
    ".dsp0_tile",      ".dsp0_tile_bits",  ".dsp1_tile",
    ".dsp1_tile_bits", ".dsp2_tile",       ".dsp2_tile_bits",
    ".dsp3_tile",      ".dsp3_tile_bits",  ".extra_bits",
    ".extra_cell",     ".gbufin",          ".gbufpin",
    ".ieren",          ".io_tile",         ".io_tile_bits",
    ".iolatch",        ".ipcon_tile",      ".ipcon_tile_bits",
    ".logic_tile",     ".logic_tile_bits", ".net",
    ".pins",           ".ramb_tile",       ".ramb_tile_bits",
    ".ramt_tile",      ".ramt_tile_bits",  ".routing",
};

// Tiles the tool does not draw but that fill their place in the grid.
constexpr std::string_view kOtherTileSections[] = {".dsp0_tile", ".dsp1_tile", ".dsp2_tile",
                                                   ".dsp3_tile", ".ipcon_tile"};

enum class Section { None, Device, Tile, WantedPins, GlobalBufferPins, ExtraCell, Skipped };

std::vector<std::string_view> Fields(std::string_view line) {
    std::vector<std::string_view> fields;
    std::size_t i = 0;
    while (i < line.size()) {
        while (i < line.size() && (line[i] == ' ' || line[i] == '\t')) {
            ++i;
        }
        std::size_t start = i;
        while (i < line.size() && line[i] != ' ' && line[i] != '\t') {
            ++i;
        }
        if (i > start) {
            fields.push_back(line.substr(start, i - start));
            if (fields.size() > kMaxFields) {
                break;
            }
        }
    }
    return fields;
}

bool ToInt(std::string_view text, int& value) {
    auto [end, ec] = std::from_chars(text.data(), text.data() + text.size(), value);
    return ec == std::errc() && end == text.data() + text.size();
}

bool TileKindOfSection(std::string_view name, TileKind& kind) {
    static const std::pair<std::string_view, TileKind> kSections[] = {
        {".logic_tile", TileKind::Logic},
        {".io_tile", TileKind::Io},
        {".ramb_tile", TileKind::RamBottom},
        {".ramt_tile", TileKind::RamTop},
    };
    for (const auto& [section, k] : kSections) {
        if (name == section) {
            kind = k;
            return true;
        }
    }
    return false;
}

class Reader {
public:
    Reader(std::string_view source, std::string_view package, ChipDb& db)
        : m_source(source), m_wanted(package), m_db(db) {}

    bool Line(std::string_view line) {
        ++m_line;
        if (!line.empty() && line.back() == '\r') {
            line.remove_suffix(1);
        }
        if (line.empty()) {
            return true;
        }
        if (line[0] == '.') {
            return Header(line);
        }
        // Nearly every line of the file lies in a routing or bit section: leave those at
        // the first character.
        if (m_section == Section::Skipped || line[0] == '#') {
            return true;
        }
        auto fields = Fields(line);
        if (fields.empty()) {
            return true;
        }
        switch (m_section) {
        case Section::WantedPins:
            return PinLine(fields);
        case Section::GlobalBufferPins:
            return GlobalBufferPinLine(fields);
        case Section::ExtraCell:
            return ExtraCellLine(fields);
        case Section::None:
            return Fail("text outside any section");
        default:
            return Fail("unexpected line after a one-line section");
        }
    }

    bool Finish(std::string& error) {
        if (m_failed) {
            error = m_error;
            return false;
        }
        if (!m_seenDevice) {
            error = std::string(m_source) + ": no .device line: not a chip database";
            return false;
        }
        if (!m_wanted.empty() && m_db.package.empty()) {
            error = std::string(m_source) + ": no package \"" + std::string(m_wanted) + "\"";
            // "tq144" on the 8k file is most likely the 4k parts' "tq144:4k".
            std::string hint = DidYouMean(m_wanted, m_db.packages);
            for (const std::string& package : m_db.packages) {
                if (package.rfind(std::string(m_wanted) + ":", 0) == 0) {
                    hint = " (did you mean " + package + "?)";
                }
            }
            error += hint;
            error += m_db.packages.empty() ? "; the file has no .pins section"
                                           : "; the file has: " + Join(m_db.packages);
            return false;
        }
        if (m_cutShort) {
            error =
                AtLine(m_source, m_line, "the last line has no line end: the file is cut short");
            return false;
        }
        // Every place of the grid but the four corners holds a tile; fewer means the file
        // was cut short or damaged, and the picture would quietly miss part of the device.
        const std::size_t expected = static_cast<std::size_t>(m_db.width) * m_db.height -
                                     (m_db.width > 1 && m_db.height > 1 ? 4 : 0);
        if (m_tilesPlaced != expected) {
            error = AtLine(m_source, m_line,
                           "the file ends with " + std::to_string(m_tilesPlaced) + " of the " +
                               std::to_string(expected) + " tiles of a " +
                               std::to_string(m_db.width) + " x " + std::to_string(m_db.height) +
                               " device: it is cut short or damaged");
            return false;
        }
        // Pins come before the tiles in the file, so their tiles are checked at the end.
        for (Pin& pin : m_db.pins) {
            if (m_grid[Cell(pin.x, pin.y)] != kIoCell) {
                error = AtLine(m_source, pin.line,
                               "pin " + pin.name + " lies on " + std::to_string(pin.x) + " " +
                                   std::to_string(pin.y) + ", which is no IO tile");
                return false;
            }
        }
        return true;
    }

    // Called once the stream has ended: a last line without its line end is the mark of
    // a file cut short in the middle of a line.
    void CutShort() { m_cutShort = true; }

private:
    static std::string Join(const std::vector<std::string>& names) {
        std::string text;
        for (const auto& name : names) {
            text += (text.empty() ? "" : ", ") + name;
        }
        return text;
    }
    // The grid holds, per place, what occupies it: nothing, a tile of a TileKind (stored
    // plus one), or a tile the tool does not draw.
    static constexpr unsigned char kEmptyCell = 0;
    static constexpr unsigned char kIoCell = static_cast<unsigned char>(TileKind::Io) + 1;
    static constexpr unsigned char kOtherCell = 0xff;
    std::size_t Cell(int x, int y) const {
        return static_cast<std::size_t>(y) * static_cast<std::size_t>(m_db.width) +
               static_cast<std::size_t>(x);
    }

    bool Fail(const std::string& why) {
        if (!m_failed) {
            m_failed = true;
            m_error = AtLine(m_source, m_line, why);
        }
        return false;
    }

    bool Header(std::string_view line) {
        auto fields = Fields(line);
        std::string_view name = fields[0];
        TileKind kind;
        if (name == ".device") {
            return DeviceLine(fields);
        }
        if (TileKindOfSection(name, kind)) {
            return TileLine(fields, kind);
        }
        if (name == ".pins") {
            return PinsHeader(fields);
        }
        if (name == ".gbufpin") {
            m_section = Section::GlobalBufferPins;
            return true;
        }
        // The PLLs and LED drivers name the IO blocks they take; the other hard blocks do
        // not reach the pins.
        if (name == ".extra_cell" && fields.size() >= 4) {
            m_extraCell = std::string(fields.back());
            if (m_extraCell == "PLL") {
                ++m_plls;
            }
            bool wanted =
                m_extraCell == "PLL" || m_extraCell == "RGBA_DRV" || m_extraCell == "RGB_DRV";
            m_section = wanted ? Section::ExtraCell : Section::Skipped;
            return true;
        }
        for (std::string_view other : kOtherTileSections) {
            if (name == other) {
                return OtherTileLine(fields);
            }
        }
        bool known = false;
        for (std::string_view section : kKnownSections) {
            known = known || name == section;
        }
        if (!known) {
            return Fail("unknown section " + std::string(name.substr(0, 64)) +
                        " (a damaged file?)");
        }
        m_section = Section::Skipped;
        return true;
    }

    bool Place(std::string_view section, int x, int y, unsigned char what) {
        if (!InGrid(x, y)) {
            return Fail(std::string(section) + " outside the device grid");
        }
        unsigned char& cell = m_grid[Cell(x, y)];
        if (cell != kEmptyCell) {
            return Fail("a second tile at " + std::to_string(x) + " " + std::to_string(y));
        }
        cell = what;
        ++m_tilesPlaced;
        return true;
    }

    bool OtherTileLine(const std::vector<std::string_view>& f) {
        if (!m_seenDevice) {
            return Fail(std::string(f[0]) + " before the .device line");
        }
        int x = 0;
        int y = 0;
        if (f.size() != 3 || !ToInt(f[1], x) || !ToInt(f[2], y)) {
            return Fail(std::string(f[0]) + " wants two coordinates");
        }
        if (!Place(f[0], x, y, kOtherCell)) {
            return false;
        }
        // Its bits follow in the lines below, as after the other tile headers.
        m_section = Section::Skipped;
        return true;
    }

    bool DeviceLine(const std::vector<std::string_view>& f) {
        if (m_seenDevice) {
            return Fail("a second .device line");
        }
        int nets = 0;
        if (f.size() != 5 || !ToInt(f[2], m_db.width) || !ToInt(f[3], m_db.height) ||
            !ToInt(f[4], nets)) {
            return Fail(".device wants a name, a width, a height and a net count");
        }
        if (m_db.width < 1 || m_db.height < 1 || m_db.width > kMaxGridSide ||
            m_db.height > kMaxGridSide || nets < 0) {
            return Fail("device size out of range");
        }
        m_db.device = std::string(f[1]);
        m_grid.assign(static_cast<std::size_t>(m_db.width) * m_db.height, kEmptyCell);
        m_seenDevice = true;
        m_section = Section::Device;
        return true;
    }

    bool InGrid(int x, int y) const {
        return x >= 0 && y >= 0 && x < m_db.width && y < m_db.height;
    }

    bool TileLine(const std::vector<std::string_view>& f, TileKind kind) {
        if (!m_seenDevice) {
            return Fail(std::string(f[0]) + " before the .device line");
        }
        Tile tile;
        tile.kind = kind;
        if (f.size() != 3 || !ToInt(f[1], tile.x) || !ToInt(f[2], tile.y)) {
            return Fail(std::string(f[0]) + " wants two coordinates");
        }
        if (!Place(f[0], tile.x, tile.y, static_cast<unsigned char>(kind) + 1)) {
            return false;
        }
        m_db.tiles.push_back(tile);
        m_section = Section::Tile;
        return true;
    }

    bool PinsHeader(const std::vector<std::string_view>& f) {
        if (f.size() != 2) {
            return Fail(".pins wants one package name");
        }
        std::string package(f[1]);
        for (const auto& seen : m_db.packages) {
            if (seen == package) {
                return Fail("package " + package + " listed twice");
            }
        }
        if (m_db.packages.size() == kMaxPackages) {
            return Fail("more than " + std::to_string(kMaxPackages) + " packages");
        }
        m_db.packages.push_back(package);
        bool wanted = m_db.package.empty() && (m_wanted.empty() || m_wanted == package);
        if (wanted) {
            m_db.package = package;
        }
        m_section = wanted ? Section::WantedPins : Section::Skipped;
        return true;
    }

    bool PinLine(const std::vector<std::string_view>& f) {
        if (!m_seenDevice) {
            return Fail("pins before the .device line");
        }
        Pin pin;
        if (f.size() != 4 || !ToInt(f[1], pin.x) || !ToInt(f[2], pin.y) || !ToInt(f[3], pin.pio)) {
            return Fail("a pin line wants a pin name, two coordinates and an IO block number");
        }
        if (!InGrid(pin.x, pin.y)) {
            return Fail("pin " + std::string(f[0]) + " outside the device grid");
        }
        if (pin.pio < 0) {
            return Fail("pin " + std::string(f[0]) + " has a negative IO block number");
        }
        if (pin.pio >= kIoBlocksPerTile) {
            return Fail("pin " + std::string(f[0]) + " names IO block " + std::to_string(pin.pio) +
                        "; an IO tile has blocks 0 and 1");
        }
        pin.bank = IoBankOf(pin.x, pin.y, m_db.width, m_db.height);
        // Banks are edges; a pin inside the grid would belong to none.
        if (pin.bank < 0) {
            return Fail("pin " + std::string(f[0]) + " lies on " + std::to_string(pin.x) + " " +
                        std::to_string(pin.y) + ", which is on no edge of the device");
        }
        pin.name = std::string(f[0]);
        if (!m_pinNames.insert(pin.name).second) {
            return Fail("pin " + pin.name + " listed twice");
        }
        const auto [claimed, fresh] =
            m_blockOwners.try_emplace(Cell(pin.x, pin.y) * kIoBlocksPerTile + pin.pio, pin.name);
        if (!fresh) {
            return Fail("pin " + pin.name + " claims IO block " + std::to_string(pin.pio) +
                        " of tile " + std::to_string(pin.x) + " " + std::to_string(pin.y) +
                        ", which pin " + claimed->second + " has");
        }
        pin.line = m_line;
        m_db.pins.push_back(std::move(pin));
        return true;
    }

    bool GlobalBufferPinLine(const std::vector<std::string_view>& f) {
        GlobalBufferPin pin;
        if (f.size() != 4 || !ToInt(f[0], pin.x) || !ToInt(f[1], pin.y) || !ToInt(f[2], pin.pio) ||
            !ToInt(f[3], pin.network)) {
            return Fail("a .gbufpin line wants two coordinates, an IO block and a network number");
        }
        if (!m_seenDevice || !InGrid(pin.x, pin.y) || pin.pio < 0 || pin.network < 0) {
            return Fail("global buffer pin outside the device");
        }
        m_db.globalBufferPins.push_back(pin);
        return true;
    }

    // "PLLOUT_A 6 0 1", "RGB0 4 31 0", "LOCKED cb81 cm36 ...": the lines that place
    // the block's pads; the rest of the section configures it.
    bool ExtraCellLine(const std::vector<std::string_view>& f) {
        const bool pll = m_extraCell == "PLL";
        if (pll && f[0] == "LOCKED") {
            m_lockedPlls.emplace_back(m_plls - 1, std::vector<std::string>(f.begin() + 1, f.end()));
            return true;
        }
        HardBlockPad pad;
        if (pll && (f[0] == "PLLOUT_A" || f[0] == "PLLOUT_B")) {
            pad.role = f[0] == "PLLOUT_A" ? HardBlockPad::Role::PllInput
                                          : HardBlockPad::Role::PllSecondOut;
            pad.block = m_plls - 1;
        } else if (!pll && (f[0] == "RGB0" || f[0] == "RGB1" || f[0] == "RGB2")) {
            pad.role = HardBlockPad::Role::LedDriver;
            pad.block = f[0][3] - '0';
        } else {
            return true;
        }
        if (f.size() != 4 || !ToInt(f[1], pad.x) || !ToInt(f[2], pad.y) || !ToInt(f[3], pad.pio) ||
            !m_seenDevice || !InGrid(pad.x, pad.y) || pad.pio < 0) {
            return Fail("a hard block's pad wants a place in the device: " + std::string(f[0]));
        }
        m_db.hardBlockPads.push_back(pad);
        return true;
    }

    std::string_view m_source;
    std::string_view m_wanted;
    ChipDb& m_db;
    std::string m_extraCell;
    int m_plls = 0;
    std::vector<std::pair<int, std::vector<std::string>>> m_lockedPlls;

public:
    // A PLL listed as locked in the package read is not bonded out there.
    void MarkLockedPlls() {
        for (const auto& [block, packages] : m_lockedPlls) {
            bool locked =
                std::find(packages.begin(), packages.end(), m_db.package) != packages.end();
            for (HardBlockPad& pad : m_db.hardBlockPads) {
                if (pad.role != HardBlockPad::Role::LedDriver && pad.block == block) {
                    pad.lockedInPackage = pad.lockedInPackage || locked;
                }
            }
        }
    }

private:
    std::size_t m_line = 0;
    Section m_section = Section::None;
    bool m_seenDevice = false;
    bool m_failed = false;
    std::string m_error;
    bool m_cutShort = false;
    std::vector<unsigned char> m_grid; // by Cell(x, y)
    std::size_t m_tilesPlaced = 0;
    std::unordered_set<std::string> m_pinNames;
    std::unordered_map<std::size_t, std::string> m_blockOwners; // IO block → pin name
};

} // namespace

const char* TileKindName(TileKind kind) {
    switch (kind) {
    case TileKind::Logic:
        return "logic";
    case TileKind::Io:
        return "io";
    case TileKind::RamBottom:
        return "ramb";
    case TileKind::RamTop:
        return "ramt";
    }
    return "?";
}

bool IsGlobalBufferPin(const ChipDb& db, const Pin& pin) {
    for (const GlobalBufferPin& g : db.globalBufferPins) {
        if (g.x == pin.x && g.y == pin.y && g.pio == pin.pio) {
            return true;
        }
    }
    return false;
}

const Pin* PinOfPad(const ChipDb& db, const HardBlockPad& pad) {
    for (const Pin& pin : db.pins) {
        if (pin.x == pad.x && pin.y == pad.y && pin.pio == pad.pio) {
            return &pin;
        }
    }
    return nullptr;
}

int IoBankOf(int x, int y, int width, int height) {
    if (y == height - 1) {
        return 0;
    }
    if (x == width - 1) {
        return 1;
    }
    if (y == 0) {
        return 2;
    }
    if (x == 0) {
        return 3;
    }
    return -1;
}

bool ReadChipDb(std::istream& in, std::string_view source, std::string_view package, ChipDb& db,
                std::string& error) {
    db = ChipDb{};
    Reader reader(source, package, db);
    std::string line;
    while (std::getline(in, line)) {
        if (!reader.Line(line)) {
            break;
        }
        if (in.eof()) {
            reader.CutShort();
        }
    }
    if (in.bad()) {
        error = std::string(source) + ": read error";
        return false;
    }
    if (!reader.Finish(error)) {
        return false;
    }
    reader.MarkLockedPlls();
    return true;
}

bool ReadChipDbFile(const std::string& path, std::string_view package, ChipDb& db,
                    std::string& error) {
    Port::InputFile file;
    if (!file.Open(path, error, Port::kMaxInputBytes, true)) {
        return false;
    }
    const std::string source = path == "-" ? "standard input" : path;
    if (!ReadChipDb(file.Stream(), source, package, db, error)) {
        // A read cut short at the limit shows up as a truncated file; say which it was.
        file.Failed(error);
        return false;
    }
    return !file.Failed(error);
}

} // namespace VnTool
