//===-- s/ManagedPropertyFactory.cpp --------------------------------------------===//
#include "Port/UnitStartup.h"

#include "s/ManagedPropertyFactory.h"

#include "s/ColorProperty.h"
#include "s/Property.h"
#include "s/internal/PropertyCreation.h"

namespace Vn::Eng {

namespace ManagedPropertyFactoryImp {
// Room for the pools the reservation calls will one day fill; empty until then.
struct Record {
    unsigned char m_reserved = 0;
};
} // namespace ManagedPropertyFactoryImp

ManagedPropertyFactory::ManagedPropertyFactory() : m_imp(new ManagedPropertyFactoryImp::Record()) {}

ManagedPropertyFactory::~ManagedPropertyFactory() {
    delete m_imp;
}

VnI::IProperty* ManagedPropertyFactory::CreateIntProperty(int value, bool visible) {
    return detail::Publish<VnI::IProperty>(new (std::nothrow) IntProperty(value), visible);
}

VnI::IProperty* ManagedPropertyFactory::CreateDoubleProperty(double value, bool visible) {
    return detail::Publish<VnI::IProperty>(new (std::nothrow) DoubleProperty(value), visible);
}

VnI::IProperty* ManagedPropertyFactory::CreateStringProperty(const Port::StringBase<char>& value,
                                                             bool visible) {
    return detail::Publish<VnI::IProperty>(new (std::nothrow) StringProperty(value), visible);
}

VnI::IProperty* ManagedPropertyFactory::CreateBoolProperty(bool value, bool visible) {
    return detail::Publish<VnI::IProperty>(new (std::nothrow) BoolProperty(value), visible);
}

VnI::IProperty* ManagedPropertyFactory::CreateColorProperty(int rgb, bool visible) {
    return detail::Publish<VnI::IProperty>(new (std::nothrow) ColorProperty(rgb), visible);
}

VnI::IProperty* ManagedPropertyFactory::CreateColorProperty(char red, char green, char blue,
                                                            bool visible) {
    return detail::Publish<VnI::IProperty>(
        new (std::nothrow)
            ColorProperty(detail::Byte(red), detail::Byte(green), detail::Byte(blue)),
        visible);
}

VnI::IProperty*
ManagedPropertyFactory::CreateEnumProperty(std::vector<Port::StringBase<char>>& possibleValues,
                                           const Port::StringBase<char>& current, bool visible) {
    return detail::CreateEnum(possibleValues, current, visible);
}

bool ManagedPropertyFactory::ReserveSpaceForIntProperties(unsigned int) {
    return true;
}
bool ManagedPropertyFactory::ReserveSpaceForStringProperties(unsigned int) {
    return true;
}
bool ManagedPropertyFactory::ReserveSpaceForBoolProperties(unsigned int) {
    return true;
}
bool ManagedPropertyFactory::ReserveSpaceForDoubleProperties(unsigned int) {
    return true;
}
bool ManagedPropertyFactory::ReserveSpaceForEnumProperties(unsigned int) {
    return true;
}
bool ManagedPropertyFactory::ReserveSpaceForColorProperties(unsigned int) {
    return true;
}

void ManagedPropertyFactory::Dump() const {}

} // namespace Vn::Eng
