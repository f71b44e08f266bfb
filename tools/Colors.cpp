//===-- tools/Colors.cpp - venlomer colors: the colour scheme the library loaded -===//
//
// Shows the colour manager's state as the library loaded it, so that a scheme file can be
// checked without the editor: the single colours, the tile types, and every list with its
// count, optionally drawn as swatches.
//
//===------------------------------------------------------------------------------===//
#include "Commands.h"
#include "Svg.h"

#include "devdata/PM_DEVKEY.h"
#include "s/ColorManager.h"
#include "s/internal/ColorManagerImp.h"

#include <algorithm>
#include <cstdio>
#include <string>
#include <vector>

namespace VnTool {

namespace {

const char kCommand[] = "colors";

using Color = Vn::Eng::ColorManager::Color;

struct Group {
    std::string title;
    bool counted; // a list, printed with its count
    std::vector<std::pair<std::string, Color>> colors;
};

std::string Hex(const Color& color) {
    if (!color) {
        return "(none)";
    }
    return HexColor(color->GetRed(), color->GetGreen(), color->GetBlue()) +
           (color->IsValid() ? "" : " (not valid)");
}

Group Palette(const std::string& title, int count, Color (*get)(int, bool)) {
    Group group{title, true, {}};
    for (int i = 0; i < count; ++i) {
        // The defaults, as read: the working palettes may have been recoloured or grown.
        group.colors.emplace_back(std::to_string(i), get(i, true));
    }
    return group;
}

Group List(const std::string& title, const Vn::Eng::ColorManagerImp::ColorList& list) {
    Group group{title, true, {}};
    for (std::size_t i = 0; i < list.size(); ++i) {
        group.colors.emplace_back(std::to_string(i), list[i]);
    }
    return group;
}

std::vector<Group> Collect() {
    using Vn::Eng::ColorManager;
    const Vn::Eng::ColorManagerImp& state = *ColorManager::m_imp;
    std::vector<Group> groups;
    groups.push_back({"Single colours",
                      false,
                      {{"tile", ColorManager::GetTileColor()},
                       {"signal", ColorManager::GetSignalColor()},
                       {"switch box", ColorManager::GetSwitchBoxColor()}}});
    Group types{"Tile types", true, {}};
    for (const auto& [name, color] : state.m_tileTypeColors) {
        types.colors.emplace_back(name.str(), color);
    }
    std::sort(types.colors.begin(), types.colors.end(),
              [](const auto& a, const auto& b) { return a.first < b.first; });
    groups.push_back(std::move(types));
    groups.push_back(List("Generic colours", state.m_genericColors));
    groups.push_back(List("Selected-path colours", state.m_selectedPathColors));
    groups.push_back(Palette("IO bank colours", ColorManager::GetNumDefaultIOBankColors(),
                             &ColorManager::GetIOBankColor));
    groups.push_back(Palette("Clock region colours", ColorManager::GetNumDefaultClkRgnColors(),
                             &ColorManager::GetClockRegionColor));
    groups.push_back(Palette("Flight-time colours", ColorManager::GetNumDefaultFltTimeColors(),
                             &ColorManager::GetFlightTimeColor));
    return groups;
}

int Draw(const std::vector<Group>& groups, const std::string& path, const std::string& source,
         const std::string& schemePath) {
    const double swatch = 22;
    const double left = 20;
    const double labelWidth = 160;
    std::size_t widest = 1;
    for (const auto& group : groups) {
        widest = std::max(widest, group.colors.size());
    }
    double width = left * 2 + labelWidth + std::min<std::size_t>(widest, 24) * (swatch + 4);
    double height = 60;
    for (const auto& group : groups) {
        height += (1 + (group.colors.size() + 23) / 24) * (swatch + 8);
    }
    SvgWriter svg(width, height);
    svg.Text(left, 26, "Colour scheme: " + source, 14);
    double y = 50;
    for (const auto& group : groups) {
        std::string title = group.title;
        if (group.counted) {
            title += " (" + std::to_string(group.colors.size()) + ")";
        }
        svg.Text(left, y + 15, title, 12);
        std::size_t i = 0;
        for (const auto& [name, color] : group.colors) {
            double x = left + labelWidth + static_cast<double>(i % 24) * (swatch + 4);
            double row = y + static_cast<double>(i / 24) * (swatch + 8);
            // A missing colour is drawn crossed out rather than left out, so that the
            // swatches still count what the scheme lacks.
            if (color) {
                svg.Rect(x, row, swatch, swatch,
                         HexColor(color->GetRed(), color->GetGreen(), color->GetBlue()), "swatch",
                         name + " " + Hex(color));
            } else {
                svg.Rect(x, row, swatch, swatch, "none", "swatch missing", name + " (none)",
                         "#c00000", 1.5);
            }
            ++i;
        }
        y += (1 + (group.colors.size() + 23) / 24) * (swatch + 8);
        if (group.colors.empty()) {
            y -= swatch + 8;
        }
    }
    std::string error;
    if (!WriteTextFile(path, svg.Finish(), error, {schemePath})) {
        return Refused(kCommand, error);
    }
    std::printf("Swatches written to %s\n", path.c_str());
    return kExitOk;
}

int Run(const ParsedArgs& args) {
    if (args.Has("--svg") && args.Value("--svg").empty()) {
        return UsageError(kCommand, "--svg wants a file name");
    }
    // The library read its scheme when it was loaded; the same search again names the
    // file it found (silently: a rejection was reported at load already).
    PM_DEVKEY keys("rareroded.acd", nullptr, 0, 1, 0);
    std::string source;
    if (keys.GetPath().GetLength() == 0) {
        source = "no rareroded.acd found; the library runs without colours";
    } else if (keys.get_validity() == 0) {
        source = keys.GetPath().str() + " was rejected; the library runs without colours";
    } else {
        source = "read from " + keys.GetPath().str();
    }
    std::printf("Colour scheme: %s\n", source.c_str());
    std::vector<Group> groups = Collect();
    for (const auto& group : groups) {
        if (group.counted) {
            std::printf("%s (%zu):\n", group.title.c_str(), group.colors.size());
        } else {
            std::printf("%s:\n", group.title.c_str());
        }
        for (const auto& [name, color] : group.colors) {
            std::printf("  %-20s %s\n", name.c_str(), Hex(color).c_str());
        }
    }
    if (args.Has("--svg")) {
        return Draw(groups, args.Value("--svg"), source, keys.GetPath().str());
    }
    return kExitOk;
}

} // namespace

const Command& ColorsCommand() {
    static const Command command{
        {kCommand,
         "",
         "print the colour scheme the library loaded and draw it as swatches",
         {{"--svg", "OUT", "also draw the scheme as swatches into OUT"}},
         0,
         0,
         "The scheme file rareroded.acd is looked up in the folders of VENLOMER_DATA_PATH,\n"
         "then the current folder, then the installed share/venlomer.\n"},
        Run};
    return command;
}

} // namespace VnTool
