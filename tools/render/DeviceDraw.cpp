//===-- tools/render/DeviceDraw.cpp - a device model drawn as an SVG floorplan ---===//
#include "DeviceDraw.h"

#include "Svg.h"

#include "s/ColorManager.h"

#include <algorithm>

namespace VnTool {

DeviceDrawing RenderDevice(DeviceModel& model, const DrawRequest& request) {
    const ChipDb& db = model.Db();
    DevicePalette palette;
    const double cell = 22;
    const double margin = 30;
    const double top = 46;
    const double gridWidth = db.width * cell;
    const double gridHeight = db.height * cell;
    const double legendX = margin + gridWidth + 24;
    const bool plan = request.plan || !request.marks.empty();
    SvgWriter svg(legendX + 180, std::max(top + gridHeight + margin, top + (plan ? 420.0 : 330.0)));
    svg.Text(margin, 26, "Device " + db.device + ", package " + db.package + request.title, 15);

    auto place = [&](int x, int y, double& px, double& py) {
        px = margin + x * cell;
        py = top + (db.height - 1 - y) * cell; // the top edge (bank 0) at the top
    };
    for (DeviceHolder* tile : model.Tiles()) {
        int x = 0;
        int y = 0;
        tile->GetLocation(x, y);
        double px = 0;
        double py = 0;
        place(x, y, px, py);
        std::string kind = tile->GetPropertyByName("Type")->GetStringProperty().str();
        svg.Rect(px + 1, py + 1, cell - 2, cell - 2, palette.TileColour(*tile), "tile " + kind,
                 tile->GetTileName().str() + " (" + tile->GetSiteType().str() + ")");
    }
    const std::string assignedColour =
        plan ? palette.Of(Vn::Eng::ColorManager::GetSignalColor(), "#3070ff") : "";
    const std::string problemColour = plan ? palette.PathColour(0) : "";
    int drawnPins = 0;
    int drawnHighlighted = 0;
    for (DeviceHolder* pin : model.Pins()) {
        VnI::IDeviceResource* resource = pin->AsResource();
        bool lit = resource->IsHighlighted();
        if (request.highlightOnly && !lit) {
            continue;
        }
        int x = 0;
        int y = 0;
        resource->GetLocation(x, y);
        int bank = pin->IntOf("Bank");
        int block = pin->IntOf("Block");
        double px = 0;
        double py = 0;
        place(x, y, px, py);
        // Two IO blocks share a tile: side by side along the edge.
        double offset = (block == 0 ? -0.22 : 0.22) * cell;
        double cx = px + cell / 2 + (bank == 0 || bank == 2 ? offset : 0);
        double cy = py + cell / 2 + (bank == 1 || bank == 3 ? offset : 0);
        std::string tip = "pin " + pin->GetName().str() + ", bank " + std::to_string(bank) + ", " +
                          resource->GetTileName().str();
        auto mark = request.marks.find(pin->GetIndex());
        if (mark != request.marks.end()) {
            bool problem = mark->second.status == PinMark::Status::Problem;
            tip += ": " + mark->second.label + (problem ? " (" + mark->second.reason + ")" : "");
            svg.Circle(cx, cy, lit ? 6 : 5, problem ? problemColour : assignedColour,
                       std::string(problem ? "pin problem" : "pin assigned") + (lit ? " hl" : ""),
                       tip, "#000000", lit ? 2.0 : 1.0);
            // Labels go outward, away from the die.
            double lx = cx + (bank == 1 ? 8 : bank == 3 ? -8 : 0);
            double ly = cy + (bank == 0 ? -8 : bank == 2 ? 14 : 4);
            svg.Text(lx, ly, mark->second.label, 8,
                     bank == 1   ? "start"
                     : bank == 3 ? "end"
                                 : "middle");
        } else if (lit) {
            svg.Circle(cx, cy, 5, palette.PinColour(*pin), plan ? "pin free hl" : "pin hl", tip,
                       "#000000", 1.5);
        } else {
            svg.Circle(cx, cy, 3.5, palette.BankColour(bank), plan ? "pin free" : "pin", tip);
        }
        drawnHighlighted += lit ? 1 : 0;
        ++drawnPins;
    }

    double y = top + 4;
    svg.Text(legendX, y + 10, "Tile types", 13);
    y += 18;
    for (const char* site : {"SLICE", "TB_IO", "LR_IO", "BRAM"}) {
        svg.Rect(legendX, y, 14, 14, palette.SiteColour(site), "legend");
        svg.Text(legendX + 20, y + 11, site, 12);
        y += 18;
    }
    y += 8;
    svg.Text(legendX, y + 10, "IO banks", 13);
    y += 18;
    for (int bank = 0; bank < kBankCount; ++bank) {
        svg.Circle(legendX + 7, y + 7, 5, palette.BankColour(bank), "legend");
        svg.Text(legendX + 20, y + 11,
                 "Bank " + std::to_string(bank) + " (" + BankEdgeName(bank) + ", " +
                     std::to_string(model.PinCount(bank)) + " pins)",
                 12);
        y += 18;
    }
    if (plan) {
        y += 8;
        svg.Text(legendX, y + 10, "Pin plan", 13);
        y += 18;
        svg.Circle(legendX + 7, y + 7, 5, assignedColour, "legend", {}, "#000000", 1.0);
        svg.Text(legendX + 20, y + 11, "assigned", 12);
        y += 18;
        svg.Circle(legendX + 7, y + 7, 5, problemColour, "legend", {}, "#000000", 1.0);
        svg.Text(legendX + 20, y + 11, "problem", 12);
        y += 18;
        svg.Circle(legendX + 7, y + 7, 3.5, palette.BankColour(0), "legend");
        svg.Text(legendX + 20, y + 11, "free (bank colour)", 12);
        y += 18;
    }
    y += 8;
    svg.Text(legendX, y + 10, "Highlight", 13);
    y += 18;
    svg.Circle(legendX + 7, y + 7, 5, palette.PathColour(0), "legend", {}, "#000000", 1.5);
    svg.Text(legendX + 20, y + 11, "search match", 12);

    return {svg.Finish(), drawnPins, drawnHighlighted, palette.UsedFallback()};
}

} // namespace VnTool
