//===-- s/ColorManager.cpp ------------------------------------------------------===//
#include "Port/UnitStartup.h"

#include "s/ColorManager.h"

#include "Port/MsgMan.h"
#include "devdata/PM_DEVKEY.h"
#include "devdata/PM_PIC.h"
#include "s/PropertyFactory.h"
#include "s/internal/ColorManagerImp.h"
#include "s/internal/ColorSchemeSource.h"

#include <cstddef>
#include <exception>
#include <memory>
#include <utility>

namespace Vn::Eng {

namespace {

using Color = ColorManagerImp::Color;
using ColorList = ColorManagerImp::ColorList;

const char kSchemeFile[] = "rareroded.acd";
// Separators are passed by address; only these single characters are ever read.
const char kEntrySeparator = ':';
const char kFieldSeparator = ',';

struct TileKey {
    const char* key;
    const char* name; // the key without its "_TILE" ending
};

// Read in this order; a later key of the same name would win.
constexpr TileKey kTileKeys[] = {
    {"SLICE_TILE", "SLICE"},
    {"IO_TILE", "IO"},
    {"TB_IO_TILE", "TB_IO"},
    {"LR_IO_TILE", "LR_IO"},
    {"CLK_TILE", "CLK"},
    {"BRAM_TILE", "BRAM"},
    {"GT_TILE", "GT"},
    {"GT_TOP_TILE", "GT_TOP"},
    {"GT_BOTTOM_TILE", "GT_BOTTOM"},
    {"GT10_TOP_TILE", "GT10_TOP"},
    {"GT10_BOTTOM_TILE", "GT10_BOTTOM"},
    {"PPC_TILE", "PPC"},
    {"EMPTY_TILE", "EMPTY"},
    {"TERM_TILE", "TERM"},
    {"L_BUFG_TILE", "L_BUFG"},
    {"R_BUFG_TILE", "R_BUFG"},
    {"T_BUFG_TILE", "T_BUFG"},
    {"B_BUFG_TILE", "B_BUFG"},
    {"BUFG_TILE", "BUFG"},
    {"LBUFR_TILE", "LBUFR"},
    {"RBUFR_TILE", "RBUFR"},
    {"TBUFR_TILE", "TBUFR"},
    {"BBUFR_TILE", "BBUFR"},
};

// The scheme file may hold any integer; a component is its low 8 bits (300 is 44, -1 is
// 255), handed to the factory as the char it takes.
char LowByte(int value) {
    return static_cast<char>(static_cast<unsigned char>(value & 0xFF));
}

Color MakeColor(char red, char green, char blue) {
    // The factory's pointer carries the one reference the record keeps.
    return Color::Adopt(PropertyFactory::CreateColorProperty(red, green, blue, true));
}

Color CopyOf(const Color& color) {
    if (!color) {
        return nullptr;
    }
    return MakeColor(static_cast<char>(color->GetRed()), static_cast<char>(color->GetGreen()),
                     static_cast<char>(color->GetBlue()));
}

Color ReadColor(PM_DEVKEY& keys, const char* key, short entry) {
    const int red = keys.GetInt32ByKey(key, &kEntrySeparator, entry, &kFieldSeparator, 0);
    const int green = keys.GetInt32ByKey(key, &kEntrySeparator, entry, &kFieldSeparator, 1);
    const int blue = keys.GetInt32ByKey(key, &kEntrySeparator, entry, &kFieldSeparator, 2);
    return MakeColor(LowByte(red), LowByte(green), LowByte(blue));
}

ColorList ReadList(PM_DEVKEY& keys, const char* key) {
    ColorList list;
    const short count = keys.GetMaxIndex(key, kEntrySeparator, kFieldSeparator).first;
    if (count > 0) {
        list.reserve(static_cast<std::size_t>(count));
    }
    for (short i = 0; i < count; ++i) {
        list.push_back(ReadColor(keys, key, i));
    }
    return list;
}

void Reset(ColorManagerImp& state) {
    state.m_tileColor = nullptr;
    state.m_signalColor = nullptr;
    state.m_switchBoxColor = nullptr;
    state.m_tileTypeColors.clear();
    state.m_genericColors.clear();
    state.m_nextGenericColor = 0;
    state.m_selectedPathColors.clear();
    state.m_ioBankColors.clear();
    state.m_clockRegionColors.clear();
    state.m_flightTimeColors.clear();
    state.m_defaultIOBankColors.clear();
    state.m_defaultClockRegionColors.clear();
    state.m_defaultFlightTimeColors.clear();
}

void Load(ColorManagerImp& state) {
    Reset(state);
    const std::unique_ptr<PM_PIC> part = std::make_unique<PM_PIC>(nullptr, nullptr, nullptr);
    // Declared after the part so that it goes first when loading ends.
    const auto keys =
        std::make_unique<PM_DEVKEY>(kSchemeFile, part.get(), PM_DEVKEY::kAbsentIsSilent,
                                    PM_DEVKEY::kSearchDataPath, PM_DEVKEY::kRejectionIsReported);
    detail::LoadedColorSchemeSource() = {keys->GetPath().str(), keys->get_validity() != 0};
    if (keys->get_validity() == 0) {
        return;
    }
    state.m_tileColor = ReadColor(*keys, "TILE_COLOR", 0);
    state.m_signalColor = ReadColor(*keys, "SIGNAL_COLOR", 0);
    state.m_switchBoxColor = ReadColor(*keys, "SWITCH_BOX_COLOR", 0);
    for (const TileKey& tile : kTileKeys) {
        state.m_tileTypeColors[tile.name] = ReadColor(*keys, tile.key, 0);
    }
    state.m_genericColors = ReadList(*keys, "GENERIC_COLORS");
    state.m_selectedPathColors = ReadList(*keys, "SELECTED_PATH_COLORS");
    state.m_ioBankColors = ReadList(*keys, "IO_BANK_COLORS");
    state.m_clockRegionColors = ReadList(*keys, "CLK_REGION_COLORS");
    state.m_flightTimeColors = ReadList(*keys, "FLIGHT_TIME_COLORS");
    // Read again rather than copied: the defaults must be objects of their own.
    state.m_defaultIOBankColors = ReadList(*keys, "IO_BANK_COLORS");
    state.m_defaultClockRegionColors = ReadList(*keys, "CLK_REGION_COLORS");
    state.m_defaultFlightTimeColors = ReadList(*keys, "FLIGHT_TIME_COLORS");
}

ColorManagerImp s_state;

// Built right after the unit's start-up objects, while the library is being loaded. An
// exception escaping here would abort the host at load, so a load that fails that way
// leaves the scheme empty, as a missing file does.
struct SchemeLoader {
    SchemeLoader() {
        try {
            Load(s_state);
        } catch (const std::exception&) {
            Reset(s_state);
        }
    }
} s_schemeLoader;

// ---- growing palettes ----------------------------------------------------------------

struct GrowingPalette {
    ColorList& working;
    const ColorList& defaults;
    const char* label; // for reports
};

GrowingPalette IOBanks() {
    return {s_state.m_ioBankColors, s_state.m_defaultIOBankColors, "IO bank"};
}
GrowingPalette ClockRegions() {
    return {s_state.m_clockRegionColors, s_state.m_defaultClockRegionColors, "Clock region"};
}

// Appends fresh copies of the repeated defaults until the palette holds `length`
// colours. Callers make sure there are defaults to repeat.
// Grows the palette to length colours repeating the defaults, then appends last when it
// is given. All or nothing: every copy is made and the room reserved before the palette
// changes, so a failed allocation leaves it as it was (and never holds a null colour).
// False when a copy could not be made.
bool GrowTo(const GrowingPalette& palette, std::size_t length, const Color& last = nullptr) {
    ColorList added;
    added.reserve(length - palette.working.size() + (last ? 1 : 0));
    for (std::size_t i = palette.working.size(); i < length; ++i) {
        added.push_back(CopyOf(palette.defaults[i % palette.defaults.size()]));
    }
    if (last) {
        added.push_back(CopyOf(last));
    }
    for (const Color& color : added) {
        if (!color) {
            return false;
        }
    }
    palette.working.reserve(palette.working.size() + added.size());
    for (Color& color : added) {
        palette.working.push_back(std::move(color)); // room reserved: cannot fail
    }
    return true;
}

Color GetGrowing(const GrowingPalette& palette, int index, bool fromDefault) {
    if (index < 0) {
        return nullptr;
    }
    const auto position = static_cast<std::size_t>(index);
    if (fromDefault) {
        // With no defaults there is nothing to repeat (and no modulus to take).
        return palette.defaults.empty() ? nullptr
                                        : palette.defaults[position % palette.defaults.size()];
    }
    if (position < palette.working.size()) {
        return palette.working[position];
    }
    if (palette.defaults.empty()) {
        return nullptr;
    }
    if (position >= ColorManager::kMaxPaletteLength) {
        Port_MsgManData::debugStub("%s color %d out of range, palettes grow to at most %u colors\n",
                                   palette.label, index, ColorManager::kMaxPaletteLength);
        return nullptr;
    }
    if (!GrowTo(palette, position + 1)) {
        Port_MsgManData::debugStub("%s color %d: out of memory growing the palette\n",
                                   palette.label, index);
        return nullptr;
    }
    return palette.working[position];
}

bool SetGrowing(const GrowingPalette& palette, unsigned int index, Color color) {
    if (index < palette.working.size()) {
        palette.working[index] = std::move(color);
        return true;
    }
    if (index >= ColorManager::kMaxPaletteLength) {
        Port_MsgManData::debugStub("%s color %u out of range, palettes grow to at most %u colors\n",
                                   palette.label, index, ColorManager::kMaxPaletteLength);
        return false;
    }
    // Checked before growing, so a refused change leaves the palette as it was.
    if (!color) {
        Port_MsgManData::debugStub("Failed to set %s color %u: no color to copy\n", palette.label,
                                   index);
        return false;
    }
    if (index > palette.working.size() && palette.defaults.empty()) {
        Port_MsgManData::debugStub(
            "Failed to set %s color %u: no default colors to fill up to it\n", palette.label,
            index);
        return false;
    }
    // Beyond the old length the palette keeps a copy: the caller's later changes to its
    // own object do not reach it.
    if (!GrowTo(palette, index, color)) {
        Port_MsgManData::debugStub("Failed to set %s color %u: out of memory\n", palette.label,
                                   index);
        return false;
    }
    return true;
}

} // namespace

ColorManagerImp* const ColorManager::m_imp = &s_state;

// ---- named lookups ---------------------------------------------------------------------

ColorManager::Color ColorManager::GetTileColor() {
    return m_imp->m_tileColor;
}

ColorManager::Color ColorManager::GetSignalColor() {
    return m_imp->m_signalColor;
}

ColorManager::Color ColorManager::GetSwitchBoxColor() {
    return m_imp->m_switchBoxColor;
}

ColorManager::Color ColorManager::GetSelectedPathColor(int pathId) {
    const ColorList& paths = m_imp->m_selectedPathColors;
    const int count = static_cast<int>(paths.size());
    if (pathId >= 0 && pathId < count && paths[static_cast<std::size_t>(pathId)]) {
        return paths[static_cast<std::size_t>(pathId)];
    }
    Port_MsgManData::debugStub("Path ID %d out of range, %d colors allocated for paths\n", pathId,
                               count);
    return paths.empty() ? nullptr : paths.back();
}

ColorManager::Color ColorManager::GetTileSiteColor(Port::StringBase<char> tileTypeName) {
    // One look-up whether the name is known or new; the name is moved in only when new.
    auto& entry = m_imp->m_tileTypeColors[std::move(tileTypeName)];
    if (!entry) {
        // AllocateColor never touches the map, so the entry stays where it is.
        entry = AllocateColor();
    }
    return entry;
}

ColorManager::Color ColorManager::AllocateColor() {
    const ColorList& generic = m_imp->m_genericColors;
    if (generic.empty()) {
        return nullptr;
    }
    std::int32_t& next = m_imp->m_nextGenericColor;
    Color color = generic[static_cast<std::size_t>(next)];
    // Sticks on the last colour once every one has been handed out.
    if (next != static_cast<std::int32_t>(generic.size()) - 1) {
        ++next;
    }
    return color;
}

// ---- indexed palettes ------------------------------------------------------------------

int ColorManager::GetNumDefaultIOBankColors() {
    return static_cast<int>(m_imp->m_defaultIOBankColors.size());
}

int ColorManager::GetNumDefaultClkRgnColors() {
    return static_cast<int>(m_imp->m_defaultClockRegionColors.size());
}

int ColorManager::GetNumDefaultFltTimeColors() {
    return static_cast<int>(m_imp->m_defaultFlightTimeColors.size());
}

ColorManager::Color ColorManager::GetIOBankColor(int index, bool fromDefault) {
    return GetGrowing(IOBanks(), index, fromDefault);
}

ColorManager::Color ColorManager::GetClockRegionColor(int index, bool fromDefault) {
    return GetGrowing(ClockRegions(), index, fromDefault);
}

bool ColorManager::SetIOBankColor(unsigned int index, Color color) {
    return SetGrowing(IOBanks(), index, std::move(color));
}

bool ColorManager::SetClockRegionColor(unsigned int index, Color color) {
    return SetGrowing(ClockRegions(), index, std::move(color));
}

ColorManager::Color ColorManager::GetFlightTimeColor(int index, bool fromDefault) {
    if (index < 0) {
        return nullptr;
    }
    const ColorList& bands =
        fromDefault ? m_imp->m_defaultFlightTimeColors : m_imp->m_flightTimeColors;
    if (static_cast<std::size_t>(index) >= bands.size()) {
        Port_MsgManData::debugStub("Failed to get flight time: Flight Time %d out of range\n",
                                   index);
        return nullptr;
    }
    return bands[static_cast<std::size_t>(index)];
}

bool ColorManager::SetFlightTimeColor(unsigned int index, Color color) {
    ColorList& bands = m_imp->m_flightTimeColors;
    if (index < bands.size()) {
        bands[index] = std::move(color);
        return true;
    }
    // The report prints the index as the signed number callers usually mean.
    Port_MsgManData::debugStub("Failed to set flight time: Flight Time %d out of range\n",
                               static_cast<int>(index));
    return false;
}

} // namespace Vn::Eng
