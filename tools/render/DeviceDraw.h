//===-- tools/render/DeviceDraw.h - a device model drawn as an SVG floorplan ---===//
//
// \file
// Tiles in their colour-scheme colour, pins in their bank's colour (or the highlight
// colour when the model's highlight manager holds them), and a legend. A pin plan adds
// labels and a status per pin; the picture then colours pins by status instead.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "DeviceModel.h"

#include <map>
#include <string>
#include <vector>

namespace VnTool {

/// What a pin plan says about one pin.
struct PinMark {
    enum class Status { Assigned, Problem };
    Status status = Status::Assigned;
    std::string label;  ///< the port (or ports) on it
    std::string reason; ///< for a problem: the first message, shown on hover
};

struct DrawRequest {
    /// The die with its tiles, or the package as the board sees it.
    enum class View { Die, Package };
    View view = View::Die;
    bool bottom = false; ///< the package seen from below (mirrored)
    std::string svg;     ///< where the command writes it
    std::string title;   ///< after "Device D, package P"
    bool highlightOnly = false;
    /// By pin index (DeviceModel::Pins()); when any pin is marked the picture is a pin
    /// plan: marked pins by status, the others free.
    std::map<int, PinMark> marks;
    bool plan = false;               ///< draw the plan legend even when nothing is marked
    std::vector<std::string> inputs; ///< files the picture must never replace
};

/// The picture and what went into it; writing it is the command's business.
struct DeviceDrawing {
    std::string svg;
    int pins = 0;              ///< pins drawn
    int highlighted = 0;       ///< of them, highlighted
    bool usedFallback = false; ///< the colour scheme lacked a role and grey stood in
    std::string summary;       ///< what the command says it wrote, for the package view
};

DeviceDrawing RenderDevice(DeviceModel& model, const DrawRequest& request);

} // namespace VnTool
