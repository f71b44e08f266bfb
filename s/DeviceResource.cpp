//===-- s/DeviceResource.cpp ----------------------------------------------------===//
#include "Port/UnitStartup.h"

#include "s/DeviceResource.h"

#include "s/internal/Shapes.h"

namespace Vn::Eng {

namespace DeviceResourceImp {

class DeviceResource_IDeviceResource final
    : public detail::InterfaceObject<DeviceResource, VnI::IDeviceResource> {
public:
    using InterfaceObject::InterfaceObject;

    Port::StringBase<char> GetTileName() const override { return m_owner->GetTileName(); }
    std::int64_t GetLocation(int& x, int& y) const override { return m_owner->GetLocation(x, y); }
    Port::StringBase<char> GetSiteType() const override { return m_owner->GetSiteType(); }
    std::int64_t SetHighlighted(bool highlighted) override {
        return m_owner->SetHighlighted(highlighted);
    }
    bool IsHighlighted() const override { return m_owner->IsHighlighted(); }
    CommonI::RefCountPtr<VnI::IColorProperty> GetHighlightColor() override {
        return m_owner->GetHighlightColor();
    }

    bool m_isHighlighted = false;
};

} // namespace DeviceResourceImp

DeviceResource::DeviceResource()
    : m_xIDeviceResource(new DeviceResourceImp::DeviceResource_IDeviceResource(this)) {}

DeviceResource::~DeviceResource() {
    delete m_xIDeviceResource;
}

CitI::IInterface* DeviceResource::GetInterface(const Port::XUID& id) {
    if (id == VnI::IID_IPropertyHolder) {
        return static_cast<VnI::IPropertyHolder*>(this);
    }
    if (id == VnI::IID_IDeviceResource || id == CitI::IID_IInterface) {
        return m_xIDeviceResource;
    }
    return nullptr;
}

int DeviceResource::GetType() const {
    return VnI::DEVICE_RESOURCE_HOLDER_TYPE;
}

bool DeviceResource::IsHighlighted() const {
    return m_xIDeviceResource->m_isHighlighted;
}

CommonI::RefCountPtr<VnI::IColorProperty> DeviceResource::GetHighlightColor() {
    return nullptr;
}

std::int64_t DeviceResource::SetHighlighted(bool highlighted) {
    m_xIDeviceResource->m_isHighlighted = highlighted;
    return 1;
}

void DeviceResource::Dump() const {}

} // namespace Vn::Eng
