//===-- s/ColorProperty.cpp -----------------------------------------------------===//
#include "Port/UnitStartup.h"

#include "s/ColorProperty.h"

namespace Vn::Eng {

ColorProperty::ColorProperty(std::uint8_t red, std::uint8_t green, std::uint8_t blue)
    : m_redValue(red), m_greenValue(green), m_blueValue(blue), m_isValid(true) {}

ColorProperty::ColorProperty(int rgb)
    : m_redValue(rgb < 0 ? 255 : static_cast<std::uint8_t>((rgb >> 16) & 0xFF)),
      m_greenValue(rgb < 0 ? 255 : static_cast<std::uint8_t>((rgb >> 8) & 0xFF)),
      m_blueValue(rgb < 0 ? 255 : static_cast<std::uint8_t>(rgb & 0xFF)), m_isValid(rgb >= 0) {}

CitI::IInterface* ColorProperty::GetInterface(const Port::XUID& id) {
    if (id == CommonI::IID_IRefCount) {
        return static_cast<CommonI::IRefCount*>(this);
    }
    if (id == VnI::IID_IColorProperty || id == VnI::IID_IProperty || id == CitI::IID_IInterface) {
        return static_cast<VnI::IColorProperty*>(this);
    }
    return nullptr;
}

void ColorProperty::SetVisible(bool visible) {
    m_isVisible = visible;
}

VnI::PropertyType ColorProperty::GetType() const {
    return VnI::COLOR_TYPE;
}
int ColorProperty::GetIntProperty() const {
    return -1;
}
double ColorProperty::GetDoubleProperty() const {
    return -1.0;
}
Port::StringBase<char> ColorProperty::GetStringProperty() const {
    return {};
}
bool ColorProperty::GetBoolProperty() const {
    return false;
}
CommonI::RefCountPtr<VnI::IPossibleEnumValuesItr> ColorProperty::GetPossibleValues() const {
    return nullptr;
}

bool ColorProperty::Equals(const CommonI::RefCountPtr<const VnI::IProperty>& other,
                           int flags) const {
    if ((flags & VnI::MATCH_ANY) != 0) {
        return true;
    }
    if (!other || other->GetType() != VnI::COLOR_TYPE) {
        return false;
    }
    // Held for the duration: the comparison must not outlive its operand.
    const auto color = CommonI::QueryInterface<VnI::IColorProperty>(other.Get());
    return color && color->GetRed() == m_redValue && color->GetGreen() == m_greenValue &&
           color->GetBlue() == m_blueValue;
}

bool ColorProperty::LessThan(const CommonI::RefCountPtr<const VnI::IProperty>& other,
                             int flags) const {
    const bool undecided = (flags & VnI::MATCH_ANY) != 0;
    if (!other || other->GetType() != VnI::COLOR_TYPE) {
        return undecided;
    }
    const auto color = CommonI::QueryInterface<VnI::IColorProperty>(other.Get());
    if (!color) {
        return undecided;
    }
    // Blue is compared before green; lists sorted with this order depend on it.
    if (m_redValue != color->GetRed()) {
        return m_redValue < color->GetRed() || undecided;
    }
    if (m_blueValue != color->GetBlue()) {
        return m_blueValue < color->GetBlue() || undecided;
    }
    if (m_greenValue != color->GetGreen()) {
        return m_greenValue < color->GetGreen() || undecided;
    }
    return undecided;
}

bool ColorProperty::SetIndex(std::int8_t index) {
    m_index = index;
    return m_index != 0;
}

std::int8_t ColorProperty::GetIndex() const {
    return m_index;
}
bool ColorProperty::IsVisible() const {
    return m_isVisible;
}

std::uint8_t ColorProperty::GetRed() const {
    return m_redValue;
}
std::uint8_t ColorProperty::GetGreen() const {
    return m_greenValue;
}
std::uint8_t ColorProperty::GetBlue() const {
    return m_blueValue;
}

std::int64_t ColorProperty::SetRGB(std::uint8_t red, std::uint8_t green, std::uint8_t blue) {
    m_redValue = red;
    m_greenValue = green;
    m_blueValue = blue;
    m_isValid = true;
    return 1;
}

bool ColorProperty::IsValid() const {
    return m_isValid;
}

} // namespace Vn::Eng
