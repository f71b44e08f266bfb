//===-- CitI/IInterface.h - the base of every published interface ---------------===//
//
// \file
// Every interface answers GetInterface(id) with a pointer to the requested interface of
// the same object, or null. GetInterface never changes a reference count.
//
// Slot order (part of the binary contract): GetInterface, then the virtual destructor.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "Port/Export.h"
#include "Port/XUID.h"

namespace CitI {

inline constexpr Port::XUID IID_IInterface{0xC569A98287C54D45ull, 0x8A2C17B796723BDCull};

class VN_INTERFACE IInterface {
public:
    static constexpr const Port::XUID& kIID = IID_IInterface;

    /// Returns the requested interface of this object, or null. Does not AddRef.
    virtual IInterface* GetInterface(const Port::XUID& id) = 0;
    virtual ~IInterface() = default;

protected:
    IInterface() = default;
    IInterface(const IInterface&) = default;
    IInterface& operator=(const IInterface&) = default;
};

} // namespace CitI
