//===-- tools/device/PropertyText.h - a property's value as users type and read it ---===//
//
// \file
// The command tables, the editor's answers and the search queries of both read and
// write property values as text. They meet here so that what one prints the other
// accepts: a bool is "yes" or "no" in a table, and `Clock=yes` finds it in a search.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "CommonI/RefCountPtr.h"
#include "VnI/IProperty.h"
#include "VnI/PropertyType.h"

#include <string>

namespace VnTool {

/// A property's value as the tables print it: a number in decimal, a bool as "yes" or
/// "no", anything else as its text; empty for a null property.
std::string PropertyText(const CommonI::RefCountPtr<VnI::IProperty>& property);

/// `text` as a search value of `type`, since a property only equals one of its own type:
/// an int from a whole decimal number, a bool from yes/no, true/false or 1/0, any other
/// type (strings, enumerations) as a string. Returns null with the reason in `error`
/// ("NAME is a whole number; got ..."), naming the property `name`.
CommonI::RefCountPtr<VnI::IProperty> TypedValue(VnI::PropertyType type, const std::string& name,
                                                const std::string& text, std::string& error);

/// A colour as "#rrggbb", lower case.
std::string HexColour(int red, int green, int blue);

/// The library's colour as "#rrggbb"; empty when it is null or not valid.
std::string HexColour(const CommonI::RefCountPtr<VnI::IColorProperty>& colour);

} // namespace VnTool
