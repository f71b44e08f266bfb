//===-- s/PropertyFactory.h - creates properties --------------------------------===//
//
// \file
// The one way to make a property. Every function returns a raw interface pointer that
// carries the new object's one reference: the caller owns it and either hands it on
// (typically adopted by a CommonI::RefCountPtr) or releases it. The factory keeps
// nothing. Allocation failure gives null.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "VnI/IProperty.h"
#include "s/Export.h"

#include <vector>

namespace Vn::Eng {

class VENLOMER_API PropertyFactory {
public:
    PropertyFactory() = delete;

    static VnI::IProperty* CreateIntProperty(int value, bool visible);
    static VnI::IProperty* CreateDoubleProperty(double value, bool visible);
    /// Copies value.
    static VnI::IProperty* CreateStringProperty(const Port::StringBase<char>& value, bool visible);
    static VnI::IProperty* CreateBoolProperty(bool value, bool visible);
    /// 0xRRGGBB; a negative rgb gives an invalid colour.
    static VnI::IColorProperty* CreateColorProperty(int rgb, bool visible);
    /// The char components are taken as unsigned bytes.
    static VnI::IColorProperty* CreateColorProperty(char red, char green, char blue, bool visible);
    /// An enumeration over the caller's list, which must outlive the property. A non-empty
    /// current text selects that value; an unknown one is reported and the property stays
    /// on the first value.
    static VnI::IProperty* CreateEnumProperty(std::vector<Port::StringBase<char>>& possibleValues,
                                              const Port::StringBase<char>& current, bool visible);
};

} // namespace Vn::Eng
