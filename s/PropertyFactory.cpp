//===-- s/PropertyFactory.cpp ---------------------------------------------------===//
#include "Port/UnitStartup.h"

#include "s/PropertyFactory.h"

#include "s/ColorProperty.h"
#include "s/Property.h"
#include "s/internal/PropertyCreation.h"

namespace Vn::Eng {

VnI::IProperty* PropertyFactory::CreateIntProperty(int value, bool visible) {
    return detail::Publish<VnI::IProperty>(new (std::nothrow) IntProperty(value), visible);
}

VnI::IProperty* PropertyFactory::CreateDoubleProperty(double value, bool visible) {
    return detail::Publish<VnI::IProperty>(new (std::nothrow) DoubleProperty(value), visible);
}

VnI::IProperty* PropertyFactory::CreateStringProperty(const Port::StringBase<char>& value,
                                                      bool visible) {
    return detail::Publish<VnI::IProperty>(new (std::nothrow) StringProperty(value), visible);
}

VnI::IProperty* PropertyFactory::CreateBoolProperty(bool value, bool visible) {
    return detail::Publish<VnI::IProperty>(new (std::nothrow) BoolProperty(value), visible);
}

VnI::IColorProperty* PropertyFactory::CreateColorProperty(int rgb, bool visible) {
    return detail::Publish<VnI::IColorProperty>(new (std::nothrow) ColorProperty(rgb), visible);
}

VnI::IColorProperty* PropertyFactory::CreateColorProperty(char red, char green, char blue,
                                                          bool visible) {
    return detail::Publish<VnI::IColorProperty>(
        new (std::nothrow)
            ColorProperty(detail::Byte(red), detail::Byte(green), detail::Byte(blue)),
        visible);
}

VnI::IProperty*
PropertyFactory::CreateEnumProperty(std::vector<Port::StringBase<char>>& possibleValues,
                                    const Port::StringBase<char>& current, bool visible) {
    return detail::CreateEnum(possibleValues, current, visible);
}

} // namespace Vn::Eng
