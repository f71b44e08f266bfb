//===-- s/DeviceResource.h - the base of the device resources the editor shows --===//
//
// \file
// A device resource is a property holder of type 7 with a highlighted flag, a highlight
// colour hook and a second published interface, VnI::IDeviceResource, carried by an
// interface object that forwards to the resource. The host derives its concrete
// resources from this class and supplies the name, the name list and the three device
// operations; the library never calls those three.
//
// Like every holder it is not counted. The highlight and selection managers keep plain
// pointers to resources, so a resource leaves both before it is destroyed.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "VnI/IDeviceResource.h"
#include "s/Export.h"
#include "s/PropertyHolder.h"

namespace Vn::Eng {

namespace DeviceResourceImp {
class DeviceResource_IDeviceResource;
}

class VENLOMER_API DeviceResource : public PropertyHolder {
public:
    DeviceResource();
    /// Deletes the interface object, then runs the holder's destructor.
    ~DeviceResource() override;
    DeviceResource(const DeviceResource&) = delete;
    DeviceResource& operator=(const DeviceResource&) = delete;

    /// VnI::IPropertyHolder gives the holder; VnI::IDeviceResource and CitI::IInterface
    /// the interface object; anything else null.
    CitI::IInterface* GetInterface(const Port::XUID& id) override;
    /// 7.
    int GetType() const override;

    /// Name of the tile the resource lies in.
    virtual Port::StringBase<char> GetTileName() const = 0;
    /// Grid position of the resource. Returns 1 when it has one.
    virtual std::int64_t GetLocation(int& x, int& y) const = 0;
    /// Kind of site (such as "IO" or "SLICE").
    virtual Port::StringBase<char> GetSiteType() const = 0;
    virtual bool IsHighlighted() const;
    /// Null here; a resource that has a highlight colour answers it (one new reference).
    virtual CommonI::RefCountPtr<VnI::IColorProperty> GetHighlightColor();
    /// Stores the flag. Returns 1.
    virtual std::int64_t SetHighlighted(bool highlighted);

    /// Prints nothing: a resource has no state of its own worth a debug line.
    void Dump() const;

private:
    DeviceResourceImp::DeviceResource_IDeviceResource* m_xIDeviceResource;
};

} // namespace Vn::Eng
