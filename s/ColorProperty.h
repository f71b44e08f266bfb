//===-- s/ColorProperty.h - a colour value --------------------------------------===//
//
// \file
// The colour manager's currency: red, green and blue components plus a flag that says
// whether the colour holds a real value. It is self-counted like Property but not
// derived from it, because it publishes VnI::IColorProperty (an extended IProperty).
// Made only by the property factories, which hand out the first reference.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "CommonI/RefCountPtr.h"
#include "CommonI/TRefCountHelper.h"
#include "VnI/IProperty.h"
#include "s/Export.h"

#include <cstdint>

namespace Vn::Eng {

class VENLOMER_API ColorProperty : public CommonI::TRefCountHelperBase<ColorProperty, 0>,
                                   public VnI::IColorProperty {
public:
    /// A valid colour.
    ColorProperty(std::uint8_t red, std::uint8_t green, std::uint8_t blue);
    /// 0xRRGGBB for rgb >= 0 (bits above 23 ignored); a negative rgb gives an invalid
    /// colour whose components read 255.
    explicit ColorProperty(int rgb);
    ColorProperty(const ColorProperty&) = delete;
    ColorProperty& operator=(const ColorProperty&) = delete;

    /// IRefCount gives the object itself; IColorProperty, IProperty and
    /// CitI::IInterface its colour interface.
    CitI::IInterface* GetInterface(const Port::XUID& id) override;

    // Declared before every interface override so that it follows GetRefCount in the
    // primary vtable, as in Property.
    virtual void SetVisible(bool visible);

    VnI::PropertyType GetType() const override;
    int GetIntProperty() const override;
    double GetDoubleProperty() const override;
    Port::StringBase<char> GetStringProperty() const override;
    bool GetBoolProperty() const override;
    CommonI::RefCountPtr<VnI::IPossibleEnumValuesItr> GetPossibleValues() const override;
    /// True when red, green and blue are equal; validity is not compared.
    bool Equals(const CommonI::RefCountPtr<const VnI::IProperty>& other, int flags) const override;
    /// Orders by red, then blue, then green; MATCH_ANY turns every undecided answer true.
    bool LessThan(const CommonI::RefCountPtr<const VnI::IProperty>& other,
                  int flags) const override;
    bool SetIndex(std::int8_t index) override;
    std::int8_t GetIndex() const override;
    bool IsVisible() const override;

    std::uint8_t GetRed() const override;
    std::uint8_t GetGreen() const override;
    std::uint8_t GetBlue() const override;
    std::int64_t SetRGB(std::uint8_t red, std::uint8_t green, std::uint8_t blue) override;
    bool IsValid() const override;

protected:
    ~ColorProperty() override = default;

private:
    std::int8_t m_index = -1;
    bool m_isVisible = true;
    std::uint8_t m_redValue;
    std::uint8_t m_greenValue;
    std::uint8_t m_blueValue;
    bool m_isValid;
};

} // namespace Vn::Eng
