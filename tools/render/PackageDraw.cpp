//===-- tools/render/PackageDraw.cpp - a device's package drawn as the board designer sees it
//---===//
#include "PackageDraw.h"

#include "PlanColours.h"
#include "Svg.h"

#include <algorithm>
#include <map>

namespace VnTool {

namespace {

constexpr double kBallPitch = 40;
constexpr double kPadPitch = 24;
constexpr double kLabelSize = 7;
constexpr double kOuterLabelRoom = 110;

using Side = PackageSite::Side;

// What one ball or pin shows.
struct Look {
    bool io = false;
    int bank = -1;
    bool lit = false;
    bool globalBuffer = false;
    std::string fill;
    std::string cssClass;
    std::string label; ///< the port or ports on it
    std::string tip;
};

struct Canvas {
    DeviceModel& model;
    const PackageLayout& layout;
    const DrawRequest& request;
    DevicePalette palette;
    PlanColours colours;
    SvgWriter& svg;
    double pitch = kBallPitch;
    double left = 0; // the frame's top left corner in the picture
    double top = 0;

    double X(double units) const { return left + units * pitch; }
    double Y(double units) const { return top + units * pitch; }
};

// Every state of a site (not I/O, free, assigned, faulty, lit) is decided here at once, so
// that the fill, the class and the tooltip cannot disagree.
Look LookOf(Canvas& canvas, const PackageSite& site) {
    Look look;
    if (site.pin < 0) {
        look.fill = "#eeeeee";
        look.cssClass = "other";
        look.tip = site.name + ": not an I/O pin (power, ground, configuration or not bonded)";
        return look;
    }
    DeviceHolder* holder = canvas.model.Pins()[static_cast<std::size_t>(site.pin)];
    const Pin& pin = canvas.model.PinOf(holder);
    look.io = true;
    look.bank = pin.bank;
    look.lit = holder->AsResource()->IsHighlighted();
    look.globalBuffer = canvas.model.IsGlobalBufferPin(holder);
    look.tip = site.name + ": bank " + std::to_string(pin.bank) + ", IO_" + std::to_string(pin.x) +
               "_" + std::to_string(pin.y) + " block " + std::to_string(pin.pio) +
               (look.globalBuffer ? ", global buffer" : "") +
               (site.role.empty() ? "" : ", " + site.role);
    const bool plan = canvas.request.plan || !canvas.request.marks.empty();
    auto mark = canvas.request.marks.find(site.pin);
    if (mark != canvas.request.marks.end()) {
        const bool problem = mark->second.status == PinMark::Status::Problem;
        look.fill = problem ? canvas.colours.problem : canvas.colours.assigned;
        look.cssClass = problem ? "io problem" : "io assigned";
        look.label = mark->second.label;
        look.tip += ": " + look.label + (problem ? " (" + mark->second.reason + ")" : "");
    } else if (canvas.request.highlightOnly && !look.lit) {
        look.fill = "#f8f8f8";
        look.cssClass = "io dim";
    } else {
        look.fill = canvas.palette.BankColour(pin.bank);
        look.cssClass = plan ? "io free" : "io";
    }
    look.cssClass += " bank" + std::to_string(pin.bank) + (look.globalBuffer ? " gbuf" : "") +
                     (look.lit ? " hl" : "") + (site.role.empty() ? "" : " role");
    return look;
}

std::string TextColour(const Look& look) {
    return !look.io ? "#707070" : IsDark(look.fill) ? "#ffffff" : "#000000";
}

// ---- ball grids ------------------------------------------------------------------------

void DrawGridFrame(Canvas& canvas) {
    const PackageLayout& layout = canvas.layout;
    SvgWriter& svg = canvas.svg;
    const double w = layout.width * canvas.pitch;
    const double h = layout.height * canvas.pitch;
    svg.Rect(canvas.left, canvas.top, w, h, "#fafafa", "body", {}, "#404040", 1.5);
    // The A1 corner, cut as on the part's marking.
    const double cut = 0.6 * canvas.pitch;
    const bool right = layout.bottomView;
    const double cx = right ? canvas.left + w : canvas.left;
    const double dx = right ? -cut : cut;
    svg.Polygon({{cx, canvas.top}, {cx + dx, canvas.top}, {cx, canvas.top + cut}}, "#404040",
                "pin1", "A1 corner (pin 1)");
    for (std::size_t row = 0; row < layout.rowNames.size(); ++row) {
        const double y = canvas.Y(static_cast<double>(row) + 1.0) + 4;
        svg.Text(canvas.left - 8, y, layout.rowNames[row], 11, "end", "axis");
        svg.Text(canvas.left + w + 8, y, layout.rowNames[row], 11, "start", "axis");
    }
    for (int column = 0; column < layout.columns; ++column) {
        const int shown = layout.bottomView ? layout.columns - 1 - column : column;
        const double x = canvas.X(shown + 1.0);
        svg.Text(x, canvas.top - 8, std::to_string(column + 1), 11, "middle", "axis");
        svg.Text(x, canvas.top + h + 16, std::to_string(column + 1), 11, "middle", "axis");
    }
}

void DrawBall(Canvas& canvas, const PackageSite& site, const Look& look) {
    SvgWriter& svg = canvas.svg;
    const double cx = canvas.X(site.x);
    const double cy = canvas.Y(site.y);
    const double r = 0.36 * canvas.pitch;
    if (look.globalBuffer) {
        svg.Circle(cx, cy, r + 3, "none", "gbuf-ring", {}, "#000000", 1.2);
    }
    svg.Circle(cx, cy, look.io ? r : 0.8 * r, look.fill, "ball " + look.cssClass, look.tip,
               look.lit  ? canvas.colours.match
               : look.io ? "#202020"
                         : "#9a9a9a",
               look.lit ? 3.5 : 0.8);
    const std::string ink = TextColour(look);
    svg.Text(cx, look.io ? cy - 1 : cy + 3, site.name, 8, "middle", "name", 0, ink);
    if (look.io) {
        svg.Text(cx, cy + 8, std::to_string(look.bank), 7, "middle", "bankmark", 0, ink);
    }
    if (!look.label.empty()) {
        svg.Text(cx, cy + r + 8.5, FitText(look.label, canvas.pitch - 2, kLabelSize), kLabelSize,
                 "middle", "label");
    }
}

// ---- pins around four sides ------------------------------------------------------------

// How deep a site lies from its side's edge, and where along the side, in pitch units.
double DepthOf(const PackageLayout& layout, const PackageSite& site) {
    switch (site.side) {
    case Side::Left:
        return site.x;
    case Side::Right:
        return layout.width - site.x;
    case Side::Top:
        return site.y;
    default:
        return layout.height - site.y;
    }
}

double AlongOf(const PackageSite& site) {
    return site.side == Side::Left || site.side == Side::Right ? site.y : site.x;
}

bool Upright(Side side) {
    return side == Side::Top || side == Side::Bottom;
}

// A point `depth` units in from `side`'s edge, `along` units along it, in the picture.
void PointAt(const Canvas& canvas, Side side, double depth, double along, double& px, double& py) {
    const PackageLayout& layout = canvas.layout;
    switch (side) {
    case Side::Left:
        px = canvas.X(depth), py = canvas.Y(along);
        break;
    case Side::Right:
        px = canvas.X(layout.width - depth), py = canvas.Y(along);
        break;
    case Side::Top:
        px = canvas.X(along), py = canvas.Y(depth);
        break;
    default:
        px = canvas.X(along), py = canvas.Y(layout.height - depth);
        break;
    }
}

double InnermostDepth(const PackageLayout& layout) {
    double depth = 0;
    for (const PackageSite& site : layout.sites) {
        depth = std::max(depth, DepthOf(layout, site));
    }
    return depth;
}

// A label `from` units deep, running outward (toward the edge) or inward.
void DrawSideLabel(Canvas& canvas, const PackageSite& site, double from, bool outward,
                   const std::string& text) {
    if (text.empty()) {
        return; // no room: the pin's tooltip still names its port
    }
    double px = 0;
    double py = 0;
    PointAt(canvas, site.side, from, AlongOf(site), px, py);
    const double across = kLabelSize * 0.35;
    // Whether the text runs from the point toward smaller coordinates: leftward, or upward
    // (upright text reads from the bottom up, so it then starts at the point).
    const bool towardLow = outward == (site.side == Side::Left || site.side == Side::Top);
    if (Upright(site.side)) {
        canvas.svg.Text(px + across, py, text, kLabelSize, towardLow ? "start" : "end", "label",
                        -90);
    } else {
        canvas.svg.Text(px, py + across, text, kLabelSize, towardLow ? "end" : "start", "label");
    }
}

void DrawPad(Canvas& canvas, const PackageSite& site, const Look& look, double inwardFrom) {
    SvgWriter& svg = canvas.svg;
    const double cx = canvas.X(site.x);
    const double cy = canvas.Y(site.y);
    const double along = 0.62 * canvas.pitch;
    const double across = 0.95 * canvas.pitch;
    const bool upright = Upright(site.side);
    const double w = upright ? along : across;
    const double h = upright ? across : along;
    const bool first = site.ring == 0 && site.number == 1;
    std::string cssClass = "pad " + look.cssClass + (first ? " pin1" : "");
    svg.Rect(cx - w / 2, cy - h / 2, w, h, look.fill, cssClass, look.tip,
             look.lit  ? canvas.colours.match
             : first   ? "#000000"
             : look.io ? "#202020"
                       : "#9a9a9a",
             look.lit ? 3
             : first  ? 2
                      : 0.6);
    if (look.globalBuffer) {
        svg.Rect(cx - w / 2 - 2.5, cy - h / 2 - 2.5, w + 5, h + 5, "none", "gbuf-ring", {},
                 "#000000", 1.2);
    }
    svg.Text(cx + (upright ? 2.5 : 0), cy + (upright ? 0 : 2.5), site.name, 7, "middle", "name",
             upright ? -90 : 0, TextColour(look));
    if (look.label.empty()) {
        return;
    }
    const double depth = DepthOf(canvas.layout, site);
    if (site.ring == 0) {
        DrawSideLabel(canvas, site, depth - 0.475 - 3 / canvas.pitch, true,
                      FitText(look.label, kOuterLabelRoom, kLabelSize));
        return;
    }
    // Inner rows label inward, as far as the diagonal from the corners lets them run.
    const double a = AlongOf(site);
    const double side = Upright(site.side) ? canvas.layout.width : canvas.layout.height;
    const double room = (std::min(a, side - a) - inwardFrom - 0.5) * canvas.pitch;
    DrawSideLabel(canvas, site, inwardFrom, false, FitText(look.label, room, kLabelSize));
}

// Each side's run of pins of one bank, as a bar inside the row of pads with the bank
// named on it.
void DrawBankRuns(Canvas& canvas, double depth) {
    std::map<Side, std::vector<std::pair<double, int>>> io;
    for (const PackageSite& site : canvas.layout.sites) {
        if (site.pin >= 0) {
            io[site.side].emplace_back(
                AlongOf(site), canvas.model.Db().pins[static_cast<std::size_t>(site.pin)].bank);
        }
    }
    for (auto& [side, pins] : io) {
        std::sort(pins.begin(), pins.end());
        for (std::size_t i = 0; i < pins.size();) {
            std::size_t j = i;
            while (j + 1 < pins.size() && pins[j + 1].second == pins[i].second) {
                ++j;
            }
            const int bank = pins[i].second;
            double x0 = 0;
            double y0 = 0;
            double x1 = 0;
            double y1 = 0;
            PointAt(canvas, side, depth, pins[i].first - 0.35, x0, y0);
            PointAt(canvas, side, depth + 0.22, pins[j].first + 0.35, x1, y1);
            const std::string fill = canvas.palette.BankColour(bank);
            canvas.svg.Rect(std::min(x0, x1), std::min(y0, y1), std::abs(x1 - x0),
                            std::abs(y1 - y0), fill, "bankrun bank" + std::to_string(bank),
                            "bank " + std::to_string(bank), "#404040", 0.4);
            const double length = (pins[j].first - pins[i].first + 0.7) * canvas.pitch;
            const std::string name = TextWidth("bank 0", 8) <= length
                                         ? "bank " + std::to_string(bank)
                                         : std::to_string(bank);
            double tx = 0;
            double ty = 0;
            PointAt(canvas, side, depth + 0.75, (pins[i].first + pins[j].first) / 2, tx, ty);
            // Along a bar on the left or right the name is turned to run with it.
            const bool upright = Upright(side);
            canvas.svg.Text(tx + (upright ? 0 : 3), ty + (upright ? 3 : 0), name, 8, "middle",
                            "bankmark", upright ? 0 : -90);
            i = j + 1;
        }
    }
}

void DrawPerimeterFrame(Canvas& canvas) {
    const PackageLayout& layout = canvas.layout;
    canvas.svg.Rect(canvas.left, canvas.top, layout.width * canvas.pitch,
                    layout.height * canvas.pitch, "#fafafa", "body", {}, "#404040", 1.5);
    // The moulded dot in pin 1's corner, inside the rows of pads and the bank bars.
    const PackageSite& first = layout.sites.front();
    const double depth = InnermostDepth(layout) + 1.35;
    const double x = first.x < layout.width / 2 ? depth : layout.width - depth;
    canvas.svg.Circle(canvas.X(x), canvas.Y(depth), 0.28 * canvas.pitch, "#404040", "pin1",
                      "pin 1 mark", "#404040", 0.5);
}

// ---- the picture -----------------------------------------------------------------------

struct Tally {
    int io = 0;
    int lit = 0;
    std::vector<int> used = std::vector<int>(kBankCount, 0);
    std::vector<int> free = std::vector<int>(kBankCount, 0);
};

Tally DrawSites(Canvas& canvas) {
    Tally tally;
    const bool grid = canvas.layout.kind == PackageLayout::Kind::BallGrid;
    const double inward = grid ? 0 : InnermostDepth(canvas.layout) + 0.475 + 1.3;
    for (const PackageSite& site : canvas.layout.sites) {
        const Look look = LookOf(canvas, site);
        if (grid) {
            DrawBall(canvas, site, look);
        } else {
            DrawPad(canvas, site, look, inward);
        }
        if (look.io) {
            ++tally.io;
            tally.lit += look.lit ? 1 : 0;
            const auto bank = static_cast<std::size_t>(std::clamp(look.bank, 0, kBankCount - 1));
            (canvas.request.marks.count(site.pin) != 0 ? tally.used : tally.free)[bank] += 1;
        }
    }
    return tally;
}

double DrawLegend(Canvas& canvas, const Tally& tally, double x, double y) {
    SvgWriter& svg = canvas.svg;
    const PackageLayout& layout = canvas.layout;
    const bool grid = layout.kind == PackageLayout::Kind::BallGrid;
    const bool plan = canvas.request.plan || !canvas.request.marks.empty();
    const char* what = grid ? "balls" : "pins";
    svg.Text(x, y + 10, layout.bottomView ? "Bottom view (mirrored)" : "Top view", 13);
    y += 18;
    svg.Text(x, y + 10,
             std::to_string(layout.sites.size()) + " " + what + ": " +
                 std::to_string(layout.ioCount) + " I/O, " + std::to_string(layout.otherCount) +
                 " not I/O",
             12);
    y += 26;
    svg.Text(x, y + 10,
             grid ? "IO banks (number on each ball)" : "IO banks (named along each side)", 13);
    y += 18;
    for (int bank = 0; bank < kBankCount; ++bank) {
        const auto b = static_cast<std::size_t>(bank);
        svg.Circle(x + 8, y + 7, 7, canvas.colours.banks[b], "legend bank" + std::to_string(bank));
        svg.Text(x + 8, y + 10, std::to_string(bank), 8, "middle", "bankmark");
        svg.Text(x + 22, y + 11,
                 "Bank " + std::to_string(bank) + " (" + BankEdgeName(bank) +
                     "): " + std::to_string(tally.used[b]) + " used, " +
                     std::to_string(tally.free[b]) + " free",
                 12, "start", "bankcount");
        y += 20;
    }
    y += 8;
    auto entry = [&](const std::string& fill, const std::string& stroke, double width,
                     const std::string& cssClass, const std::string& text) {
        svg.Circle(x + 8, y + 7, 6, fill, "legend " + cssClass, {}, stroke, width);
        svg.Text(x + 22, y + 11, text, 12);
        y += 20;
    };
    if (plan) {
        entry(canvas.colours.assigned, "#000000", 1, "assigned",
              grid ? "assigned (port named below)" : "assigned (port named beside)");
        entry(canvas.colours.problem, "#000000", 1, "problem", "problem");
        entry(canvas.colours.banks[0], "#202020", 0.8, "free", "free (bank colour)");
    }
    entry("#eeeeee", "#9a9a9a", 0.8, "other", "not I/O (power, ground, config)");
    entry("none", "#000000", 1.2, "gbuf", "global buffer (outer ring)");
    entry("#ffffff", canvas.colours.match, 3, "match", "search match");
    entry("#404040", "#404040", 0.5, "pin1", grid ? "A1 corner (pin 1)" : "pin 1");
    if (!layout.note.empty()) {
        svg.Text(x, y + 10, FitText("Note: " + layout.note, 300, 10), 10, "start", "note");
        y += 16;
    }
    return y;
}

double OuterLabelMargin(const DrawRequest& request) {
    double widest = 0;
    for (const auto& [index, mark] : request.marks) {
        widest = std::max(widest,
                          TextWidth(FitText(mark.label, kOuterLabelRoom, kLabelSize), kLabelSize));
    }
    return widest + 14;
}

} // namespace

DeviceDrawing RenderPackage(DeviceModel& model, const PackageLayout& layout,
                            const DrawRequest& request) {
    const bool grid = layout.kind == PackageLayout::Kind::BallGrid;
    const double pitch = grid ? kBallPitch : kPadPitch;
    const double margin = grid ? 30 : std::max(30.0, OuterLabelMargin(request));
    const double frameWidth = layout.width * pitch;
    const double frameHeight = layout.height * pitch;
    const double legendX = margin + frameWidth + margin + 20;
    SvgWriter svg(legendX + 320, std::max(70 + margin + frameHeight + margin, 560.0));
    Canvas canvas{model, layout, request, {}, {}, svg, pitch, margin, 70 + margin};
    canvas.colours = ChoosePlanColours(canvas.palette);
    const ChipDb& db = model.Db();
    svg.Text(margin, 26, "Device " + db.device + ", package " + layout.package + request.title, 15);
    svg.Text(margin, 46,
             std::string(grid ? "Ball grid, " : "Pins counter-clockwise from pin 1, ") +
                 (layout.bottomView ? "seen from below (mirrored)" : "seen from the top"),
             12);
    if (grid) {
        DrawGridFrame(canvas);
    } else {
        DrawPerimeterFrame(canvas);
        DrawBankRuns(canvas, InnermostDepth(layout) + 0.475 + 0.15);
    }
    const Tally tally = DrawSites(canvas);
    DrawLegend(canvas, tally, legendX, 60);
    DeviceDrawing drawing{svg.Finish(), tally.io, tally.lit, canvas.palette.UsedFallback(), {}};
    drawing.summary = layout.package + ", " + (layout.bottomView ? "bottom" : "top") +
                      " view: " + std::to_string(layout.sites.size()) +
                      (grid ? " balls, " : " pins, ") + std::to_string(layout.ioCount) + " I/O, " +
                      std::to_string(layout.otherCount) + " not I/O, " + std::to_string(tally.lit) +
                      " highlighted";
    return drawing;
}

bool RenderView(DeviceModel& model, const DrawRequest& request, DeviceDrawing& drawing,
                std::string& error) {
    if (request.view == DrawRequest::View::Die) {
        drawing = RenderDevice(model, request);
        return true;
    }
    PackageLayout layout;
    if (!LayOutPackage(model.Db(), request.bottom, layout, error)) {
        return false;
    }
    drawing = RenderPackage(model, layout, request);
    return true;
}

} // namespace VnTool
