//===-- s/DeviceResourceItr.cpp -------------------------------------------------===//
#include "Port/UnitStartup.h"

#include "s/DeviceResourceItr.h"

#include "s/internal/ListCursor.h"
#include "s/internal/Shapes.h"

namespace Vn::Eng {

namespace {
const char kRevision[] = "$Revision: 1.2 $";
const detail::Unit kUnit{"../s/DeviceResourceItr", kRevision};
} // namespace

namespace DeviceResourceItrImp {
struct Record : detail::ListCursor<DeviceResourceItr, VnI::IDeviceResource> {
    using ListCursor::ListCursor;
};
} // namespace DeviceResourceItrImp

CommonI::RefCountPtr<VnI::IDeviceResourceItr>
DeviceResourceItr::CreateInstance(const DeviceResourceList* list) {
    return detail::AdoptCreated<VnI::IDeviceResourceItr>(new DeviceResourceItr(list));
}

DeviceResourceItr::DeviceResourceItr(const DeviceResourceList* list)
    : m_imp(new DeviceResourceItrImp::Record(this, list)) {}

DeviceResourceItr::~DeviceResourceItr() {
    delete m_imp;
}

CitI::IInterface* DeviceResourceItr::GetInterface(const Port::XUID& id) {
    return detail::AnswerCountedRecord<VnI::IDeviceResourceItr>(this, &m_imp->m_counter, id);
}

VnI::IDeviceResource* DeviceResourceItr::CurrentItem() const {
    return m_imp->CurrentItem();
}
std::int64_t DeviceResourceItr::First() {
    return m_imp->First();
}
std::int64_t DeviceResourceItr::Next() {
    return m_imp->Next();
}
bool DeviceResourceItr::IsEnd() const {
    return m_imp->IsEnd();
}

void DeviceResourceItr::Dump() const {
    detail::DumpLine(kUnit, __LINE__, "Vn::Eng::DeviceResourceItr::m_imp->m_deviceResources = %x\n",
                     detail::AddressArg(m_imp->m_list));
    detail::DumpLine(kUnit, __LINE__, "Vn::Eng::DeviceResourceItr::m_imp->m_itr = %x\n",
                     detail::AddressArg(&m_imp->m_itr));
}

} // namespace Vn::Eng
