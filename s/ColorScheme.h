//===-- s/ColorScheme.h - a read-only look at the colour scheme -----------------===//
//
// \file
// What the colour manager holds, as values: which scheme file it read (or rejected, or
// did not find), the single colours, the tile types, the generic and selected-path
// colours and both sides of every indexed palette. For programs that show or check a
// scheme without being a view of the editor.
//
// Nothing here hands out the shared colour objects, so nothing here can recolour them;
// and nothing allocates a generic colour or grows a palette, so looking never changes
// what the editor's views get next. Each call answers the state at that moment.
//
//   if (ColorScheme::GetSource() == ColorScheme::Source::Read) {
//       for (const auto& type : ColorScheme::GetTileTypes()) { ... type.name, type.color.red }
//   }
//
// Like ColorManager: call from one thread at a time.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "s/Export.h"

#include <cstdint>
#include <string>
#include <vector>

namespace Vn::Eng {

class VENLOMER_API ColorScheme {
public:
    ColorScheme() = delete;

    /// What became of the scheme file when the library was loaded.
    enum class Source {
        Read,     ///< found and accepted: the colours below come from it
        Rejected, ///< found, but unreadable or malformed: no colours at all
        Absent,   ///< not found anywhere along the search: no colours at all
    };

    /// One colour's values. `present` is false where the scheme holds no colour (a null
    /// entry); the components are 0 then.
    struct Swatch {
        bool present = false;
        bool valid = false;
        std::uint8_t red = 0;
        std::uint8_t green = 0;
        std::uint8_t blue = 0;

        friend bool operator==(const Swatch&, const Swatch&) = default;
    };

    struct NamedSwatch {
        std::string name;
        Swatch color;
    };

    enum class Palette { IOBank, ClockRegion, FlightTime };

    static Source GetSource();
    /// The file that was read or rejected; empty when none was found.
    static std::string GetPath();

    static Swatch GetTileColor();
    static Swatch GetSignalColor();
    static Swatch GetSwitchBoxColor();
    /// Every tile type known now, the 23 of the file and any added by lookups since,
    /// sorted by name.
    static std::vector<NamedSwatch> GetTileTypes();
    /// The generic colours in the order they are handed out.
    static std::vector<Swatch> GetGenericColors();
    static std::vector<Swatch> GetSelectedPathColors();
    /// The palette as callers have changed and grown it.
    static std::vector<Swatch> GetWorkingPalette(Palette palette);
    /// The palette as read from the file.
    static std::vector<Swatch> GetDefaultPalette(Palette palette);
};

} // namespace Vn::Eng
