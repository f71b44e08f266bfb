//===-- tools/render/DeviceSearch.h - search, select and print a device model's holders ---===//
//
// \file
// What floorplan and pins show share of the editor's search road: the --find and
// --flags options, a FindItr over banks and pins (and whatever other holders a command
// adds), the matches printed as one table per kind, then selected through the model's
// SelectionManager (a matched bank brings its pins) and the selected pins highlighted
// through its HighlightManager.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "DeviceModel.h"
#include "PropertyText.h"

#include "CommonI/RefCountPtr.h"
#include "VnI/IProperty.h"
#include "VnI/IPropertyHolder.h"

#include <string>
#include <utility>
#include <vector>

namespace VnTool {

struct SearchRequest {
    bool active = false; ///< --find was given
    std::string name;
    std::string value;
    int flags = 0; ///< VnI::MATCH_* bits
};

/// The flags as the user types them ("regexp,ignore-case"; "exact" for none).
std::string FlagsText(int flags);

/// A kind of holder the search runs over: its schema and the title of its table.
struct SearchKind {
    VnI::IPropertyNameList* names;
    std::string title; ///< "Pins", "Banks", "Ports"
};

/// The value to search for, typed (TypedValue) after the first kind that declares the
/// property, since a property only equals one of its own type. Returns false with the reason ("WHO
/// have no property ...; they have KNOWN", a number that is none) in `error`.
bool MakeWanted(const SearchRequest& request, const std::vector<SearchKind>& kinds,
                const std::string& who, const std::string& known,
                CommonI::RefCountPtr<VnI::IProperty>& wanted, std::string& error);

/// Prints "Tree: device > Bank 0 (52 pins), ..., Tiles (n)" from the model's tree.
void PrintTree(DeviceModel& model);

/// Runs the search over `candidates` in their order and prints the summary line (which
/// says it ran over `over`) and one table per kind among the matches.
std::vector<VnI::IPropertyHolder*>
SearchAndPrint(const SearchRequest& request, const CommonI::RefCountPtr<VnI::IProperty>& wanted,
               const std::vector<VnI::IPropertyHolder*>& candidates,
               const std::vector<SearchKind>& kinds, const std::string& over);

/// Selects the matches in the model's selection manager (a matched bank brings the pins
/// below it), highlights the selected pins, and prints how many of each.
void SelectAndHighlight(DeviceModel& model, const std::vector<VnI::IPropertyHolder*>& matches);

/// The floorplan search: banks then pins of the model.
void SearchDevice(DeviceModel& model, const SearchRequest& request,
                  const CommonI::RefCountPtr<VnI::IProperty>& wanted);

/// Prints a table: the header row, then the rows, columns padded to their widest cell.
void PrintTable(const std::vector<std::string>& columns,
                const std::vector<std::vector<std::string>>& rows);

} // namespace VnTool
