//===-- PM_PIC.cpp --------------------------------------------------------------===//
#include "devdata/PM_PIC.h"

PM_PIC::PM_PIC(const char* device, const char* package, const char* speed)
    : m_device(device), m_package(package), m_speed(speed) {}

PM_PIC::~PM_PIC() = default;

Port::StringBase<char> PM_PIC::getDatabookName() const {
    Port::StringBase<char> name;
    for (const Port::StringBase<char>* part : {&m_device, &m_package, &m_speed}) {
        if (part->IsEmpty()) {
            continue;
        }
        if (!name.IsEmpty()) {
            name += "-";
        }
        name += *part;
    }
    return name;
}
