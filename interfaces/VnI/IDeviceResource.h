//===-- VnI/IDeviceResource.h - device resources and their iterator -------------===//
//
// Slot orders (binary contract, do not reorder):
//   IDeviceResource: GetInterface, ~, GetTileName, GetLocation, GetSiteType,
//                    SetHighlighted, IsHighlighted, GetHighlightColor
//   IDeviceResourceItr: GetInterface, ~, CurrentItem, First, Next, IsEnd
//
// The three device operations after the destructor are supplied by the host's concrete
// resources; the library never calls them.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "VnI/IPropertyHolder.h"

namespace VnI {

class VN_INTERFACE IDeviceResource : public CitI::IInterface {
public:
    static constexpr const Port::XUID& kIID = IID_IDeviceResource;

    /// Name of the tile the resource lies in.
    virtual Port::StringBase<char> GetTileName() const = 0;
    /// Grid position of the resource. Returns 1 when it has one.
    virtual std::int64_t GetLocation(int& x, int& y) const = 0;
    /// Kind of site (such as "IO" or "SLICE").
    virtual Port::StringBase<char> GetSiteType() const = 0;
    /// Stores the highlighted flag. Returns 1.
    virtual std::int64_t SetHighlighted(bool highlighted) = 0;
    virtual bool IsHighlighted() const = 0;
    /// The resource's highlight colour (one new reference), or null.
    virtual CommonI::RefCountPtr<IColorProperty> GetHighlightColor() = 0;
};

class VN_INTERFACE IDeviceResourceItr : public CitI::IInterface {
public:
    static constexpr const Port::XUID& kIID = IID_IDeviceResourceItr;

    /// The resource at the position, borrowed; null at the end.
    virtual IDeviceResource* CurrentItem() const = 0;
    virtual std::int64_t First() = 0;
    virtual std::int64_t Next() = 0;
    virtual bool IsEnd() const = 0;
};

} // namespace VnI
