//===-- tools/render/DeviceDraw.cpp - a device model drawn as an SVG floorplan ---===//
#include "DeviceDraw.h"

#include "PlanColours.h"
#include "Svg.h"

#include <algorithm>

namespace VnTool {

namespace {

constexpr double kCell = 22;
constexpr double kLabelSize = 8;
// Longer port names are cut; the pin's tooltip holds the whole.
constexpr double kLabelRoom = 100;

struct Frame {
    double left = 30;
    double top = 46;
    int height = 0; // tiles
    void Place(int x, int y, double& px, double& py) const {
        px = left + x * kCell;
        py = top + (height - 1 - y) * kCell; // the top edge (bank 0) at the top
    }
};

void DrawTiles(DeviceModel& model, const Frame& frame, DevicePalette& palette, SvgWriter& svg) {
    for (DeviceHolder* tile : model.Tiles()) {
        int x = 0;
        int y = 0;
        tile->GetLocation(x, y);
        double px = 0;
        double py = 0;
        frame.Place(x, y, px, py);
        std::string kind = tile->GetPropertyByName("Type")->GetStringProperty().str();
        svg.Rect(px + 1, py + 1, kCell - 2, kCell - 2, palette.TileColour(*tile), "tile " + kind,
                 tile->GetTileName().str() + " (" + tile->GetSiteType().str() + ")");
    }
}

// A label runs outward from its pin, away from the die: across the edge on the left and
// right, turned upright on the top and bottom. The two IO blocks of a tile sit side by
// side along the edge, half a tile apart; only upright labels keep theirs from running
// into each other there.
void DrawLabel(SvgWriter& svg, double cx, double cy, int bank, const std::string& label) {
    const std::string shown = FitText(label, kLabelRoom, kLabelSize);
    const double across = kLabelSize * 0.35; // centres the upright glyphs on the pin
    switch (bank) {
    case 0:
        svg.Text(cx + across, cy - 8, shown, kLabelSize, "start", "label", -90);
        break;
    case 2:
        svg.Text(cx + across, cy + 8, shown, kLabelSize, "end", "label", -90);
        break;
    case 1:
        svg.Text(cx + 8, cy + across, shown, kLabelSize, "start", "label");
        break;
    default:
        svg.Text(cx - 8, cy + across, shown, kLabelSize, "end", "label");
        break;
    }
}

struct PinCounts {
    int drawn = 0;
    int highlighted = 0;
};

PinCounts DrawPins(DeviceModel& model, const DrawRequest& request, const Frame& frame,
                   const PlanColours& colours, DevicePalette& palette, SvgWriter& svg) {
    const bool plan = request.plan || !request.marks.empty();
    PinCounts counts;
    for (DeviceHolder* pin : model.Pins()) {
        VnI::IDeviceResource* resource = pin->AsResource();
        const bool lit = resource->IsHighlighted();
        if (request.highlightOnly && !lit) {
            continue;
        }
        int x = 0;
        int y = 0;
        resource->GetLocation(x, y);
        const int bank = pin->IntOf("Bank");
        const int block = pin->IntOf("Block");
        double px = 0;
        double py = 0;
        frame.Place(x, y, px, py);
        const double offset = (block == 0 ? -0.22 : 0.22) * kCell;
        const double cx = px + kCell / 2 + (bank == 0 || bank == 2 ? offset : 0);
        const double cy = py + kCell / 2 + (bank == 1 || bank == 3 ? offset : 0);
        std::string tip = "pin " + pin->GetName().str() + ", bank " + std::to_string(bank) + ", " +
                          resource->GetTileName().str();
        auto mark = request.marks.find(pin->GetIndex());
        if (mark != request.marks.end()) {
            const bool problem = mark->second.status == PinMark::Status::Problem;
            tip += ": " + mark->second.label + (problem ? " (" + mark->second.reason + ")" : "");
            svg.Circle(cx, cy, lit ? 6 : 5, problem ? colours.problem : colours.assigned,
                       std::string(problem ? "pin problem" : "pin assigned") + (lit ? " hl" : ""),
                       tip, lit ? colours.match : "#000000", lit ? 2.5 : 1.0);
            DrawLabel(svg, cx, cy, bank, mark->second.label);
        } else if (lit) {
            svg.Circle(cx, cy, 5, palette.PinColour(*pin), plan ? "pin free hl" : "pin hl", tip,
                       "#000000", 1.5);
        } else {
            svg.Circle(cx, cy, 3.5, palette.BankColour(bank), plan ? "pin free" : "pin", tip);
        }
        counts.highlighted += lit ? 1 : 0;
        ++counts.drawn;
    }
    return counts;
}

void DrawLegend(DeviceModel& model, const DrawRequest& request, const PlanColours& colours,
                DevicePalette& palette, double legendX, double top, SvgWriter& svg) {
    const bool plan = request.plan || !request.marks.empty();
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
    std::vector<int> used(kBankCount, 0);
    for (const auto& [index, mark] : request.marks) {
        const int bank = model.Db().pins[static_cast<std::size_t>(index)].bank;
        used[static_cast<std::size_t>(std::clamp(bank, 0, kBankCount - 1))] += 1;
    }
    for (int bank = 0; bank < kBankCount; ++bank) {
        const int pins = model.PinCount(bank);
        const int taken = used[static_cast<std::size_t>(bank)];
        svg.Circle(legendX + 7, y + 7, 5, colours.banks[static_cast<std::size_t>(bank)], "legend");
        svg.Text(
            legendX + 20, y + 11,
            "Bank " + std::to_string(bank) + " (" + BankEdgeName(bank) + ", " +
                (plan ? std::to_string(taken) + " used, " + std::to_string(pins - taken) + " free)"
                      : std::to_string(pins) + " pins)"),
            12);
        y += 18;
    }
    if (plan) {
        y += 8;
        svg.Text(legendX, y + 10, "Pin plan", 13);
        y += 18;
        svg.Circle(legendX + 7, y + 7, 5, colours.assigned, "legend assigned", {}, "#000000", 1.0);
        svg.Text(legendX + 20, y + 11, "assigned", 12);
        y += 18;
        svg.Circle(legendX + 7, y + 7, 5, colours.problem, "legend problem", {}, "#000000", 1.0);
        svg.Text(legendX + 20, y + 11, "problem", 12);
        y += 18;
        svg.Circle(legendX + 7, y + 7, 3.5, colours.banks[0], "legend");
        svg.Text(legendX + 20, y + 11, "free (bank colour)", 12);
        y += 18;
    }
    y += 8;
    svg.Text(legendX, y + 10, "Highlight", 13);
    y += 18;
    svg.Circle(legendX + 7, y + 7, 5, colours.match, "legend match", {}, "#000000", 1.5);
    svg.Text(legendX + 20, y + 11, "search match", 12);
}

// Room the labels need beyond the die, so that none runs off the picture.
double LabelMargin(const DrawRequest& request) {
    double widest = 0;
    for (const auto& [index, mark] : request.marks) {
        widest =
            std::max(widest, TextWidth(FitText(mark.label, kLabelRoom, kLabelSize), kLabelSize));
    }
    return widest > 0 ? widest + 12 : 0;
}

} // namespace

DeviceDrawing RenderDevice(DeviceModel& model, const DrawRequest& request) {
    const ChipDb& db = model.Db();
    DevicePalette palette;
    const PlanColours colours = ChoosePlanColours(palette);
    const double labels = LabelMargin(request);
    Frame frame;
    frame.left = 30 + labels;
    frame.top = 46 + labels;
    frame.height = db.height;
    const double gridWidth = db.width * kCell;
    const double gridHeight = db.height * kCell;
    const double legendX = frame.left + gridWidth + labels + 24;
    const bool plan = request.plan || !request.marks.empty();
    SvgWriter svg(legendX + 240, std::max(frame.top + gridHeight + labels + 30,
                                          frame.top + (plan ? 420.0 : 330.0)));
    svg.Text(30, 26, "Device " + db.device + ", package " + db.package + request.title, 15);
    DrawTiles(model, frame, palette, svg);
    const PinCounts counts = DrawPins(model, request, frame, colours, palette, svg);
    DrawLegend(model, request, colours, palette, legendX, frame.top, svg);
    return {svg.Finish(), counts.drawn, counts.highlighted, palette.UsedFallback(), {}};
}

} // namespace VnTool
