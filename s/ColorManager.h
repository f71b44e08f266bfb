//===-- s/ColorManager.h - the shared colour scheme -----------------------------===//
//
// \file
// One colour scheme for every view, read once from "rareroded.acd" when the library is
// loaded and never written back. Everything is static: there is no instance.
//
// Colours are handed out shared: each operation returns the scheme's own object with one
// more reference, so a view that calls SetRGB on a colour it was given recolours it for
// every later caller. The only copies are the colours a growing palette makes for itself
// (see SetIOBankColor).
//
//   auto slice = ColorManager::GetTileSiteColor("SLICE");   // the SLICE_TILE colour
//   auto bank = ColorManager::GetIOBankColor(21, false);     // grows the palette to 22
//
// Not thread-safe: even the lookups change the state (allocation, growth), so call from
// one thread at a time.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "CommonI/RefCountPtr.h"
#include "Port/StringBase.h"
#include "VnI/IProperty.h"
#include "s/Export.h"

namespace Vn::Eng {

struct ColorManagerImp;

class VENLOMER_API ColorManager {
public:
    using Color = CommonI::RefCountPtr<VnI::IColorProperty>;

    ColorManager() = delete;

    // ---- named lookups --------------------------------------------------------------

    /// Null when the scheme was not read.
    static Color GetTileColor();
    static Color GetSignalColor();
    static Color GetSwitchBoxColor();
    /// The colour of path pathId. Out of range it reports through the debug output and
    /// answers the last path colour (null when there are none).
    static Color GetSelectedPathColor(int pathId);
    /// The colour of a tile type, by exact, case-sensitive name ("SLICE", not
    /// "SLICE_TILE"). A name met for the first time takes the next generic colour and
    /// keeps it.
    static Color GetTileSiteColor(Port::StringBase<char> tileTypeName);
    /// The next generic colour, in the order of the scheme; once they are used up, the
    /// last one again. Null when the scheme has none.
    static Color AllocateColor();

    // ---- indexed palettes ---------------------------------------------------------------

    static int GetNumDefaultIOBankColors();
    static int GetNumDefaultClkRgnColors();
    static int GetNumDefaultFltTimeColors();

    /// fromDefault: the default colour at index modulo the default length. Otherwise the
    /// working colour at index, growing the working palette up to index with fresh
    /// copies of the repeated defaults. Null for a negative index, when there is no
    /// default to repeat, or beyond the growth limit (kMaxPaletteLength, reported).
    static Color GetIOBankColor(int index, bool fromDefault);
    static Color GetClockRegionColor(int index, bool fromDefault);
    /// Within the working length the palette shares color itself. Beyond it the palette
    /// grows as when reading and takes a copy of color's values at index. False, with
    /// nothing changed, when it cannot grow that far: beyond the growth limit, a null
    /// color, or no default colours to fill the gap with.
    static bool SetIOBankColor(unsigned int index, Color color);
    static bool SetClockRegionColor(unsigned int index, Color color);

    /// The flight-time palette has a fixed length: out of range is reported and answers
    /// null (read) or false (change).
    static Color GetFlightTimeColor(int index, bool fromDefault);
    static bool SetFlightTimeColor(unsigned int index, Color color);

    /// The most colours a growing working palette holds. A host that asks for bank
    /// 4000000000 gets a report instead of an exhausted heap.
    static constexpr unsigned int kMaxPaletteLength = 65536;

    /// The state record, for the library's own units and white-box tests; it always
    /// points at the one record. Programs that show the scheme read ColorScheme.
    static ColorManagerImp* const m_imp;
};

} // namespace Vn::Eng
