//===-- s/ColorScheme.cpp -------------------------------------------------------===//
#include "s/ColorScheme.h"

#include "s/ColorManager.h"
#include "s/internal/ColorManagerImp.h"
#include "s/internal/ColorSchemeSource.h"

#include <algorithm>

namespace Vn::Eng {

namespace detail {

ColorSchemeSource& LoadedColorSchemeSource() {
    static ColorSchemeSource source;
    return source;
}

} // namespace detail

namespace {

using Color = ColorManagerImp::Color;

ColorScheme::Swatch SwatchOf(const Color& color) {
    if (!color) {
        return {};
    }
    return {true, color->IsValid(), color->GetRed(), color->GetGreen(), color->GetBlue()};
}

std::vector<ColorScheme::Swatch> SwatchesOf(const ColorManagerImp::ColorList& list) {
    std::vector<ColorScheme::Swatch> swatches;
    swatches.reserve(list.size());
    for (const Color& color : list) {
        swatches.push_back(SwatchOf(color));
    }
    return swatches;
}

const ColorManagerImp& State() {
    return *ColorManager::m_imp;
}

} // namespace

ColorScheme::Source ColorScheme::GetSource() {
    const detail::ColorSchemeSource& source = detail::LoadedColorSchemeSource();
    if (source.accepted) {
        return Source::Read;
    }
    return source.path.empty() ? Source::Absent : Source::Rejected;
}

std::string ColorScheme::GetPath() {
    return detail::LoadedColorSchemeSource().path;
}

ColorScheme::Swatch ColorScheme::GetTileColor() {
    return SwatchOf(State().m_tileColor);
}

ColorScheme::Swatch ColorScheme::GetSignalColor() {
    return SwatchOf(State().m_signalColor);
}

ColorScheme::Swatch ColorScheme::GetSwitchBoxColor() {
    return SwatchOf(State().m_switchBoxColor);
}

std::vector<ColorScheme::NamedSwatch> ColorScheme::GetTileTypes() {
    std::vector<NamedSwatch> types;
    types.reserve(State().m_tileTypeColors.size());
    for (const auto& [name, color] : State().m_tileTypeColors) {
        types.push_back({name.str(), SwatchOf(color)});
    }
    std::sort(types.begin(), types.end(),
              [](const NamedSwatch& a, const NamedSwatch& b) { return a.name < b.name; });
    return types;
}

std::vector<ColorScheme::Swatch> ColorScheme::GetGenericColors() {
    return SwatchesOf(State().m_genericColors);
}

std::vector<ColorScheme::Swatch> ColorScheme::GetSelectedPathColors() {
    return SwatchesOf(State().m_selectedPathColors);
}

std::vector<ColorScheme::Swatch> ColorScheme::GetWorkingPalette(Palette palette) {
    switch (palette) {
    case Palette::IOBank:
        return SwatchesOf(State().m_ioBankColors);
    case Palette::ClockRegion:
        return SwatchesOf(State().m_clockRegionColors);
    case Palette::FlightTime:
        return SwatchesOf(State().m_flightTimeColors);
    }
    return {};
}

std::vector<ColorScheme::Swatch> ColorScheme::GetDefaultPalette(Palette palette) {
    switch (palette) {
    case Palette::IOBank:
        return SwatchesOf(State().m_defaultIOBankColors);
    case Palette::ClockRegion:
        return SwatchesOf(State().m_defaultClockRegionColors);
    case Palette::FlightTime:
        return SwatchesOf(State().m_defaultFlightTimeColors);
    }
    return {};
}

} // namespace Vn::Eng
