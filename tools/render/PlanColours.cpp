//===-- tools/render/PlanColours.cpp - the colours of a pin plan, told apart from the banks ---===//
#include "PlanColours.h"

#include "PropertyText.h"
#include "Svg.h"

#include "s/ColorScheme.h"

#include <algorithm>
#include <cmath>

namespace VnTool {

namespace {

// Nearer than this, two fills of small circles are taken for one another.
constexpr double kDistinct = 100;

int HexDigit(char c) {
    if (c >= '0' && c <= '9') {
        return c - '0';
    }
    if (c >= 'a' && c <= 'f') {
        return c - 'a' + 10;
    }
    return c >= 'A' && c <= 'F' ? c - 'A' + 10 : -1;
}

bool Parse(const std::string& text, int rgb[3]) {
    if (text.size() != 7 || text[0] != '#') {
        return false;
    }
    for (std::size_t i = 0; i < 3; ++i) {
        const int high = HexDigit(text[1 + 2 * i]);
        const int low = HexDigit(text[2 + 2 * i]);
        if (high < 0 || low < 0) {
            return false;
        }
        rgb[i] = high * 16 + low;
    }
    return true;
}

// The scheme's colours a plan state may take, in the order they are preferred.
std::vector<std::string> Candidates() {
    using Vn::Eng::ColorScheme;
    std::vector<ColorScheme::Swatch> swatches = {ColorScheme::GetSignalColor()};
    for (const auto& list :
         {ColorScheme::GetGenericColors(), ColorScheme::GetSelectedPathColors()}) {
        swatches.insert(swatches.end(), list.begin(), list.end());
    }
    std::vector<std::string> colours;
    for (const auto& swatch : swatches) {
        if (swatch.present && swatch.valid) {
            colours.push_back(HexColour(swatch.red, swatch.green, swatch.blue));
        }
    }
    return colours;
}

bool FarFromAll(const std::string& colour, const std::vector<std::string>& taken) {
    for (const std::string& other : taken) {
        if (ColourDistance(colour, other) < kDistinct) {
            return false;
        }
    }
    return true;
}

// How much a colour reads as red, the colour a reader looks for a fault in.
int Redness(const std::string& colour) {
    int rgb[3] = {0, 0, 0};
    Parse(colour, rgb);
    return rgb[0] - std::max(rgb[1], rgb[2]);
}

} // namespace

double ColourDistance(const std::string& a, const std::string& b) {
    int x[3];
    int y[3];
    if (!Parse(a, x) || !Parse(b, y)) {
        return -1;
    }
    double sum = 0;
    for (int i = 0; i < 3; ++i) {
        sum += static_cast<double>((x[i] - y[i]) * (x[i] - y[i]));
    }
    return std::sqrt(sum);
}

bool IsDark(const std::string& fill) {
    int rgb[3] = {255, 255, 255};
    Parse(fill, rgb);
    return 0.299 * rgb[0] + 0.587 * rgb[1] + 0.114 * rgb[2] < 110;
}

PlanColours ChoosePlanColours(DevicePalette& palette) {
    PlanColours colours;
    for (int bank = 0; bank < kBankCount; ++bank) {
        colours.banks.push_back(palette.BankColour(bank));
    }
    colours.match = palette.PathColour(0);
    std::vector<std::string> taken = colours.banks;
    taken.push_back(colours.match);
    const std::vector<std::string> candidates = Candidates();
    for (const std::string& colour : candidates) {
        if (FarFromAll(colour, taken)) {
            colours.assigned = colour;
            break;
        }
    }
    if (colours.assigned.empty()) {
        colours.assigned = "#332288"; // no scheme colour stands apart: a dark indigo does
    }
    taken.push_back(colours.assigned);
    for (const std::string& colour : candidates) {
        if (FarFromAll(colour, taken) &&
            (colours.problem.empty() || Redness(colour) > Redness(colours.problem))) {
            colours.problem = colour;
        }
    }
    if (colours.problem.empty()) {
        colours.problem = "#cc3311";
    }
    return colours;
}

} // namespace VnTool
