//===-- VnI/IProperty.h - typed property values ---------------------------------===//
//
// Slot orders (binary contract, do not reorder):
//   IPossibleEnumValuesItr: GetInterface, ~, CurrentItem, First, Next, IsEnd
//   IProperty: GetInterface, ~, GetType, GetIntProperty, GetDoubleProperty,
//              GetStringProperty, GetBoolProperty, GetPossibleValues, Equals, LessThan,
//              SetIndex, GetIndex, IsVisible
//   IColorProperty: IProperty's, then GetRed, GetGreen, GetBlue, SetRGB, IsValid
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "CommonI/RefCountPtr.h"
#include "Port/StringBase.h"
#include "VnI/Ids.h"
#include "VnI/PropertyType.h"

#include <cstdint>

namespace VnI {

class VN_INTERFACE IPossibleEnumValuesItr : public CitI::IInterface {
public:
    static constexpr const Port::XUID& kIID = IID_IPossibleEnumValuesItr;

    /// Copy of the value under the cursor; empty at the end.
    virtual Port::StringBase<char> CurrentItem() const = 0;
    virtual std::int64_t First() = 0;
    virtual std::int64_t Next() = 0;
    virtual bool IsEnd() const = 0;
};

class VN_INTERFACE IProperty : public CitI::IInterface {
public:
    static constexpr const Port::XUID& kIID = IID_IProperty;

    virtual PropertyType GetType() const = 0;
    virtual int GetIntProperty() const = 0;
    virtual double GetDoubleProperty() const = 0;
    virtual Port::StringBase<char> GetStringProperty() const = 0;
    virtual bool GetBoolProperty() const = 0;
    /// The choices of an enumerated property (one new reference); null for other types.
    virtual CommonI::RefCountPtr<IPossibleEnumValuesItr> GetPossibleValues() const = 0;
    /// Whether this value matches other under the compare flags (MATCH_*).
    virtual bool Equals(const CommonI::RefCountPtr<const IProperty>& other, int flags) const = 0;
    virtual bool LessThan(const CommonI::RefCountPtr<const IProperty>& other, int flags) const = 0;
    /// Stores the slot position in the owning holder (-1: in none). True when non-zero.
    virtual bool SetIndex(std::int8_t index) = 0;
    virtual std::int8_t GetIndex() const = 0;
    virtual bool IsVisible() const = 0;
};

class VN_INTERFACE IColorProperty : public IProperty {
public:
    static constexpr const Port::XUID& kIID = IID_IColorProperty;

    virtual std::uint8_t GetRed() const = 0;
    virtual std::uint8_t GetGreen() const = 0;
    virtual std::uint8_t GetBlue() const = 0;
    /// Stores the three components and marks the colour valid. Returns 1.
    virtual std::int64_t SetRGB(std::uint8_t red, std::uint8_t green, std::uint8_t blue) = 0;
    virtual bool IsValid() const = 0;
};

} // namespace VnI
