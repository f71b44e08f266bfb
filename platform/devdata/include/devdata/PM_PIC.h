//===-- devdata/PM_PIC.h - part information -------------------------------------===//
//
// \file
// A part is named by up to three texts (device, package, speed grade). Its databook
// name is the non-empty texts joined by '-', in that order: PM_PIC("ice40hx8k", "ct256",
// nullptr) is "ice40hx8k-ct256", and a part named by one text answers that text. A part
// with no texts (three null pointers) names no device and answers the empty text.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "Port/Export.h"
#include "Port/StringBase.h"

class VN_VISIBLE PM_PIC {
public:
    PM_PIC(const char* device, const char* package, const char* speed);
    virtual ~PM_PIC();
    PM_PIC(const PM_PIC&) = default;
    PM_PIC& operator=(const PM_PIC&) = default;

    Port::StringBase<char> getDatabookName() const;
    const Port::StringBase<char>& getDevice() const { return m_device; }
    const Port::StringBase<char>& getPackage() const { return m_package; }
    const Port::StringBase<char>& getSpeed() const { return m_speed; }

private:
    Port::StringBase<char> m_device;
    Port::StringBase<char> m_package;
    Port::StringBase<char> m_speed;
};
