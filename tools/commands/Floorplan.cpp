//===-- tools/commands/Floorplan.cpp - venlomer floorplan: the editor's road on a device ---===//
//
// Builds what the editor builds when it opens a device view (the device model), runs a
// search, selects and highlights the matches and draws the device in the colours of the
// library's colour scheme.
//
//===------------------------------------------------------------------------------===//
#include "Commands.h"
#include "DeviceDraw.h"
#include "DeviceSearch.h"

#include <cstdio>

namespace VnTool {

namespace {

const char kCommand[] = "floorplan";

int Run(const ParsedArgs& args) {
    SearchRequest search;
    if (int status = ParseSearchArgs(kCommand, args, search); status != kExitOk) {
        return status;
    }
    DrawRequest draw;
    if (int status = ParseViewArgs(kCommand, args, draw); status != kExitOk) {
        return status;
    }
    draw.highlightOnly = args.Has("--highlight-only");
    draw.svg = args.Value("--svg", "floorplan.svg");
    if (draw.svg.empty()) {
        return UsageError(kCommand, "--svg wants a file name");
    }
    DeviceSource source;
    std::unique_ptr<DeviceModel> model;
    if (int status = OpenDevice(kCommand, args, source, model); status != kExitOk) {
        return status;
    }
    CommonI::RefCountPtr<VnI::IProperty> wanted;
    if (search.active) {
        if (int status = MakeWantedOrUsage(
                kCommand, search, {{model->PinNames(), "Pins"}, {model->BankNames(), "Banks"}},
                "pins and banks", "Name, Bank, Tile, X, Y, Block, Edge, Pins", wanted);
            status != kExitOk) {
            return status;
        }
    }
    if (!source.note.empty()) {
        std::printf("Note: %s\n", source.note.c_str());
    }
    const ChipDb& db = model->Db();
    std::printf(
        "Device %s (%d x %d tiles) from %s, package %s: %zu tiles, %zu pins\n", db.device.c_str(),
        db.width, db.height, source.chipDb == "-" ? "standard input" : source.chipDb.c_str(),
        db.package.empty() ? "(none)" : db.package.c_str(), db.tiles.size(), db.pins.size());
    PrintTree(*model);
    if (search.active) {
        SearchDevice(*model, search, wanted);
        draw.title = ", search " + search.name + "=" + search.value;
    }
    draw.inputs = {source.chipDb};
    return DrawDevice(kCommand, *model, draw);
}

} // namespace

const Command& FloorplanCommand() {
    static const Command command = [] {
        std::vector<OptionSyntax> options = DeviceOptionSyntax();
        for (OptionSyntax& option : SearchOptionSyntax()) {
            options.push_back(option);
        }
        options.push_back({"--svg", "OUT", "where to write the picture (default: floorplan.svg)"});
        options.push_back({"--highlight-only", "", "draw only the pins the search highlighted"});
        for (OptionSyntax& option : ViewOptionSyntax()) {
            options.push_back(option);
        }
        return Command{
            {kCommand, "",
             "draw a device's tiles and package pins, search the pins, select and highlight",
             options, 0, 0,
             "Searchable properties: pins have Name, Bank, Tile, X, Y, Block; banks have Name,\n"
             "Bank, Edge, Pins. Compare flags: exact, ignore-case, substring, within-5-percent,\n"
             "less, greater, any, regexp (combinable, e.g. --flags regexp,ignore-case).\n"
             "A matched bank selects the pins below it in the tree.\n"
             "--view package draws the package as the board sees it: a ball grid in rows and\n"
             "columns, or the pins around four sides from pin 1; --bottom mirrors it.\n"
             "Without --chipdb or --device, chipdb-8k.txt is taken from\n"
             "/usr/share/fpga-icestorm/chipdb (or the folder in VENLOMER_CHIPDB_DIR), else the\n"
             "bundled demo device.\n"
             "Example: venlomer floorplan --find Bank=0 --svg bank0.svg\n"},
            Run};
    }();
    return command;
}

} // namespace VnTool
