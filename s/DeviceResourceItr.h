//===-- s/DeviceResourceItr.h - walks a list of device resources in place ----------------===//
//
// \file
// The iterator reads the list it was given where it stands: an element added ahead of
// the position is seen; removing the element at the position, or destroying the list,
// invalidates the iterator. Owners hand these out for immediate use.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "VnI/IDeviceResource.h"
#include "s/Export.h"

#include <list>

namespace Vn::Eng {

using DeviceResourceList = std::list<VnI::IDeviceResource*>;

namespace DeviceResourceItrImp {
struct Record;
}

class VENLOMER_API DeviceResourceItr : public VnI::IDeviceResourceItr {
public:
    /// A new iterator standing on the list's first element (count 1, adopted). A null list
    /// gives an iterator that is always at its end.
    static CommonI::RefCountPtr<VnI::IDeviceResourceItr>
    CreateInstance(const DeviceResourceList* list);

    explicit DeviceResourceItr(const DeviceResourceList* list);
    ~DeviceResourceItr() override;
    DeviceResourceItr(const DeviceResourceItr&) = delete;
    DeviceResourceItr& operator=(const DeviceResourceItr&) = delete;

    CitI::IInterface* GetInterface(const Port::XUID& id) override;
    VnI::IDeviceResource* CurrentItem() const override;
    std::int64_t First() override;
    std::int64_t Next() override;
    bool IsEnd() const override;

    void Dump() const;

private:
    DeviceResourceItrImp::Record* m_imp;
};

} // namespace Vn::Eng
