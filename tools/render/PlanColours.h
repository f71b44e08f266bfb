//===-- tools/render/PlanColours.h - the colours of a pin plan, told apart from the banks ---===//
//
// \file
// A pin plan draws free pins in their bank's colour, so the colours of "assigned",
// "problem" and "search match" must each differ from every bank's colour and from one
// another, or a reader takes an assigned pin of one bank for a free pin of another. The
// scheme names no colour for a plan's states; they are picked from the scheme's own
// colours (signal, generic, selected-path) by how far they lie from the ones taken.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "DeviceModel.h"

#include <string>
#include <vector>

namespace VnTool {

struct PlanColours {
    std::vector<std::string> banks; ///< by bank number, kBankCount of them
    std::string match;              ///< a search match: the first selected-path colour
    std::string assigned;
    std::string problem;
};

/// Picks the plan's colours; `palette` records whether the scheme lacked a bank colour.
PlanColours ChoosePlanColours(DevicePalette& palette);

/// How far apart two "#rrggbb" colours are (RGB distance, 0 to 441); -1 for a malformed one.
double ColourDistance(const std::string& a, const std::string& b);

/// Whether text on `fill` reads better in white than in black.
bool IsDark(const std::string& fill);

} // namespace VnTool
