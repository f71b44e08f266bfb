//===-- tools/device/PropertyText.cpp - a property's value as text ---------===//
#include "PropertyText.h"

#include "s/PropertyFactory.h"

#include <charconv>
#include <cstdio>

namespace VnTool {

template <class T> using Ptr = CommonI::RefCountPtr<T>;

std::string PropertyText(const Ptr<VnI::IProperty>& property) {
    if (!property) {
        return "";
    }
    switch (property->GetType()) {
    case VnI::INT_TYPE:
        return std::to_string(property->GetIntProperty());
    case VnI::DOUBLE_TYPE:
        return std::to_string(property->GetDoubleProperty());
    case VnI::BOOL_TYPE:
        return property->GetBoolProperty() ? "yes" : "no";
    default:
        return property->GetStringProperty().str();
    }
}

Ptr<VnI::IProperty> TypedValue(VnI::PropertyType type, const std::string& name,
                               const std::string& text, std::string& error) {
    switch (type) {
    case VnI::INT_TYPE: {
        int number = 0;
        auto [end, ec] = std::from_chars(text.data(), text.data() + text.size(), number);
        if (ec != std::errc() || end != text.data() + text.size()) {
            error = name + " is a whole number; got \"" + text + "\"";
            return nullptr;
        }
        return Ptr<VnI::IProperty>::Adopt(
            Vn::Eng::PropertyFactory::CreateIntProperty(number, true));
    }
    case VnI::BOOL_TYPE: {
        bool yes = text == "yes" || text == "true" || text == "1";
        if (!yes && text != "no" && text != "false" && text != "0") {
            error = name + " is yes or no; got \"" + text + "\"";
            return nullptr;
        }
        return Ptr<VnI::IProperty>::Adopt(Vn::Eng::PropertyFactory::CreateBoolProperty(yes, true));
    }
    // An enumerated holder property compares its text with a string's.
    default:
        return Ptr<VnI::IProperty>::Adopt(
            Vn::Eng::PropertyFactory::CreateStringProperty(text.c_str(), true));
    }
}

std::string HexColour(int red, int green, int blue) {
    char buffer[8];
    std::snprintf(buffer, sizeof buffer, "#%02x%02x%02x", red & 0xff, green & 0xff, blue & 0xff);
    return buffer;
}

std::string HexColour(const Ptr<VnI::IColorProperty>& colour) {
    if (!colour || !colour->IsValid()) {
        return "";
    }
    return HexColour(colour->GetRed(), colour->GetGreen(), colour->GetBlue());
}

} // namespace VnTool
