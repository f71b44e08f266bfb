//===-- tools/render/PackageDraw.h - a device's package drawn as the board designer sees it ---===//
//
// \file
// The package of a device model as an SVG picture: a ball grid's balls in rows and columns,
// or the pins around a leaded or no-lead package, from the top or (mirrored) from below.
// I/O balls and pins in their bank's colour with the bank's number written on them, the
// others drawn plain and marked as not I/O, global-buffer pins ringed, pin 1 marked. A pin
// plan (DrawRequest::marks) colours assigned and faulty pins as the die view does and
// writes the port's name beside its pin where it fits; the legend counts each bank's used
// and free pins.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "DeviceDraw.h"
#include "Package.h"

#include <string>

namespace VnTool {

/// The package view of `model` as `layout` lays it out (LayOutPackage of model.Db()).
DeviceDrawing RenderPackage(DeviceModel& model, const PackageLayout& layout,
                            const DrawRequest& request);

/// The view the request asks for: RenderDevice, or the package laid out and drawn. False
/// with a one-line reason when the package cannot be laid out.
bool RenderView(DeviceModel& model, const DrawRequest& request, DeviceDrawing& drawing,
                std::string& error);

} // namespace VnTool
