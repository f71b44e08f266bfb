//===-- tools/render/DeviceDraw.cpp - a device model drawn as an SVG floorplan ---===//
#include "DeviceDraw.h"

#include "Svg.h"

#include "s/ColorManager.h"

#include <algorithm>
#include <utility>

namespace VnTool {

namespace {

// One picture in the making: the grid's geometry, the palette and the counts, shared by
// the tiles, the pins and the legend drawn in turn.
class Floorplan {
public:
    Floorplan(DeviceModel& model, const DrawRequest& request)
        : m_model(model), m_db(model.Db()), m_request(request),
          m_plan(request.plan || !request.marks.empty()),
          m_legendX(kMargin + m_db.width * kCell + 24),
          m_svg(m_legendX + 180,
                std::max(kTop + m_db.height * kCell + kMargin, kTop + (m_plan ? 420.0 : 330.0))) {
        m_svg.Text(kMargin, 26,
                   "Device " + m_db.device + ", package " + m_db.package + request.title, 15);
        if (m_plan) {
            m_assigned = m_palette.Of(Vn::Eng::ColorManager::GetSignalColor(), "#3070ff");
            m_problem = m_palette.PathColour(0);
        }
    }

    void DrawTiles() {
        for (DeviceHolder* tile : m_model.Tiles()) {
            int x = 0;
            int y = 0;
            tile->GetLocation(x, y);
            auto [px, py] = Place(x, y);
            std::string kind = tile->GetPropertyByName("Type")->GetStringProperty().str();
            m_svg.Rect(px + 1, py + 1, kCell - 2, kCell - 2, m_palette.TileColour(*tile),
                       "tile " + kind,
                       tile->GetTileName().str() + " (" + tile->GetSiteType().str() + ")");
        }
    }

    void DrawPins() {
        for (DeviceHolder* pin : m_model.Pins()) {
            bool lit = pin->AsResource()->IsHighlighted();
            if (!m_request.highlightOnly || lit) {
                DrawPin(*pin, lit);
                m_highlighted += lit ? 1 : 0;
                ++m_pins;
            }
        }
    }

    void DrawLegend() {
        double y = LegendTitle(kTop + 4, "Tile types");
        for (const char* site : {"SLICE", "TB_IO", "LR_IO", "BRAM"}) {
            m_svg.Rect(m_legendX, y, 14, 14, m_palette.SiteColour(site), "legend");
            m_svg.Text(m_legendX + 20, y + 11, site, 12);
            y += 18;
        }
        y = LegendTitle(y + 8, "IO banks");
        for (int bank = 0; bank < kBankCount; ++bank) {
            y = LegendRow(y, 5, m_palette.BankColour(bank), 0.5,
                          "Bank " + std::to_string(bank) + " (" + BankEdgeName(bank) + ", " +
                              std::to_string(m_model.PinCount(bank)) + " pins)");
        }
        if (m_plan) {
            y = LegendTitle(y + 8, "Pin plan");
            y = LegendRow(y, 5, m_assigned, 1.0, "assigned");
            y = LegendRow(y, 5, m_problem, 1.0, "problem");
            y = LegendRow(y, 3.5, m_palette.BankColour(0), 0.5, "free (bank colour)");
        }
        y = LegendTitle(y + 8, "Highlight");
        LegendRow(y, 5, m_palette.PathColour(0), 1.5, "search match");
    }

    DeviceDrawing Finish() {
        return {m_svg.Finish(), m_pins, m_highlighted, m_palette.UsedFallback()};
    }

private:
    static constexpr double kCell = 22;
    static constexpr double kMargin = 30;
    static constexpr double kTop = 46;

    std::pair<double, double> Place(int x, int y) const {
        // The top edge (bank 0) at the top.
        return {kMargin + x * kCell, kTop + (m_db.height - 1 - y) * kCell};
    }

    void DrawPin(DeviceHolder& pin, bool lit) {
        VnI::IDeviceResource* resource = pin.AsResource();
        int x = 0;
        int y = 0;
        resource->GetLocation(x, y);
        int bank = pin.IntOf("Bank");
        auto [px, py] = Place(x, y);
        // Two IO blocks share a tile: side by side along the edge.
        double offset = (pin.IntOf("Block") == 0 ? -0.22 : 0.22) * kCell;
        double cx = px + kCell / 2 + (bank == 0 || bank == 2 ? offset : 0);
        double cy = py + kCell / 2 + (bank == 1 || bank == 3 ? offset : 0);
        std::string tip = "pin " + pin.GetName().str() + ", bank " + std::to_string(bank) + ", " +
                          resource->GetTileName().str();
        auto mark = m_request.marks.find(pin.GetIndex());
        if (mark != m_request.marks.end()) {
            DrawMarkedPin(mark->second, bank, cx, cy, lit, tip);
        } else if (lit) {
            m_svg.Circle(cx, cy, 5, m_palette.PinColour(pin), m_plan ? "pin free hl" : "pin hl",
                         tip, "#000000", 1.5);
        } else {
            m_svg.Circle(cx, cy, 3.5, m_palette.BankColour(bank), m_plan ? "pin free" : "pin", tip);
        }
    }

    void DrawMarkedPin(const PinMark& mark, int bank, double cx, double cy, bool lit,
                       std::string tip) {
        bool problem = mark.status == PinMark::Status::Problem;
        tip += ": " + mark.label + (problem ? " (" + mark.reason + ")" : "");
        m_svg.Circle(cx, cy, lit ? 6 : 5, problem ? m_problem : m_assigned,
                     std::string(problem ? "pin problem" : "pin assigned") + (lit ? " hl" : ""),
                     tip, "#000000", lit ? 2.0 : 1.0);
        // Labels go outward, away from the die.
        double lx = cx + (bank == 1 ? 8 : bank == 3 ? -8 : 0);
        double ly = cy + (bank == 0 ? -8 : bank == 2 ? 14 : 4);
        m_svg.Text(lx, ly, mark.label, 8, bank == 1 ? "start" : bank == 3 ? "end" : "middle");
    }

    double LegendTitle(double y, const char* title) {
        m_svg.Text(m_legendX, y + 10, title, 13);
        return y + 18;
    }

    double LegendRow(double y, double radius, const std::string& colour, double stroke,
                     const std::string& text) {
        if (stroke > 0.5) {
            m_svg.Circle(m_legendX + 7, y + 7, radius, colour, "legend", {}, "#000000", stroke);
        } else {
            m_svg.Circle(m_legendX + 7, y + 7, radius, colour, "legend");
        }
        m_svg.Text(m_legendX + 20, y + 11, text, 12);
        return y + 18;
    }

    DeviceModel& m_model;
    const ChipDb& m_db;
    const DrawRequest& m_request;
    DevicePalette m_palette;
    const bool m_plan;
    const double m_legendX;
    SvgWriter m_svg;
    std::string m_assigned;
    std::string m_problem;
    int m_pins = 0;
    int m_highlighted = 0;
};

} // namespace

DeviceDrawing RenderDevice(DeviceModel& model, const DrawRequest& request) {
    Floorplan picture(model, request);
    picture.DrawTiles();
    picture.DrawPins();
    picture.DrawLegend();
    return picture.Finish();
}

} // namespace VnTool
