//===-- tools/commands/Colors.cpp - venlomer colors: the colour scheme the library loaded ---===//
//
// Shows the colour manager's state as the library loaded it, so that a scheme file can be
// checked without the editor: the single colours, the tile types, and every list with its
// count, optionally drawn as swatches.
//
//===------------------------------------------------------------------------------===//
#include "Commands.h"
#include "PropertyText.h"
#include "Svg.h"

#include "s/ColorScheme.h"

#include <algorithm>
#include <cstdio>
#include <string>
#include <vector>

namespace VnTool {

namespace {

const char kCommand[] = "colors";

using Vn::Eng::ColorScheme;
using Swatch = ColorScheme::Swatch;

struct Group {
    std::string title;
    bool counted; // a list, printed with its count
    std::vector<std::pair<std::string, Swatch>> colors;
};

// A group takes its title's row and one row per 24 swatches.
std::size_t RowsOf(std::size_t swatches) {
    return 1 + (swatches + 23) / 24;
}

std::string Hex(const Swatch& color) {
    if (!color.present) {
        return "(none)";
    }
    return HexColour(color.red, color.green, color.blue) + (color.valid ? "" : " (not valid)");
}

Group List(const std::string& title, const std::vector<Swatch>& list) {
    Group group{title, true, {}};
    for (std::size_t i = 0; i < list.size(); ++i) {
        group.colors.emplace_back(std::to_string(i), list[i]);
    }
    return group;
}

std::vector<Group> Collect() {
    std::vector<Group> groups;
    groups.push_back({"Single colours",
                      false,
                      {{"tile", ColorScheme::GetTileColor()},
                       {"signal", ColorScheme::GetSignalColor()},
                       {"switch box", ColorScheme::GetSwitchBoxColor()}}});
    Group types{"Tile types", true, {}};
    for (auto& type : ColorScheme::GetTileTypes()) {
        types.colors.emplace_back(std::move(type.name), type.color);
    }
    groups.push_back(std::move(types));
    groups.push_back(List("Generic colours", ColorScheme::GetGenericColors()));
    groups.push_back(List("Selected-path colours", ColorScheme::GetSelectedPathColors()));
    // The defaults, as read: the working palettes may have been recoloured or grown.
    groups.push_back(
        List("IO bank colours", ColorScheme::GetDefaultPalette(ColorScheme::Palette::IOBank)));
    groups.push_back(List("Clock region colours",
                          ColorScheme::GetDefaultPalette(ColorScheme::Palette::ClockRegion)));
    groups.push_back(List("Flight-time colours",
                          ColorScheme::GetDefaultPalette(ColorScheme::Palette::FlightTime)));
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
    double width = left * 2 + labelWidth +
                   static_cast<double>(std::min<std::size_t>(widest, 24)) * (swatch + 4);
    double height = 60;
    for (const auto& group : groups) {
        height += static_cast<double>(RowsOf(group.colors.size())) * (swatch + 8);
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
            const std::size_t column = i % 24;
            const std::size_t line = i / 24; // whole rows of 24 swatches
            double x = left + labelWidth + static_cast<double>(column) * (swatch + 4);
            double row = y + static_cast<double>(line) * (swatch + 8);
            // A missing colour is drawn crossed out rather than left out, so that the
            // swatches still count what the scheme lacks.
            if (color.present) {
                svg.Rect(x, row, swatch, swatch, HexColour(color.red, color.green, color.blue),
                         "swatch", name + " " + Hex(color));
            } else {
                svg.Rect(x, row, swatch, swatch, "none", "swatch missing", name + " (none)",
                         "#c00000", 1.5);
            }
            ++i;
        }
        y += static_cast<double>(RowsOf(group.colors.size())) * (swatch + 8);
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
    const std::string path = ColorScheme::GetPath();
    std::string source;
    switch (ColorScheme::GetSource()) {
    case ColorScheme::Source::Absent:
        source = "no rareroded.acd found; the library runs without colours";
        break;
    case ColorScheme::Source::Rejected:
        source = path + " was rejected; the library runs without colours";
        break;
    case ColorScheme::Source::Read:
        source = "read from " + path;
        break;
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
        return Draw(groups, args.Value("--svg"), source, path);
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
