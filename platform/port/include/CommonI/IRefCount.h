//===-- CommonI/IRefCount.h - the counting interface ----------------------------===//
//
// Slot order: GetInterface, destructor, AddRef, Release, GetRefCount. All three counting
// operations return the status 1.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "CitI/IInterface.h"

#include <cstdint>

namespace CommonI {

inline constexpr Port::XUID IID_IRefCount{0xF35246530FB84605ull, 0xA6C16E80946A2CDDull};

class VN_INTERFACE IRefCount : public CitI::IInterface {
public:
    static constexpr const Port::XUID& kIID = IID_IRefCount;

    /// Adds one reference. Returns 1.
    virtual std::int64_t AddRef() = 0;
    /// Drops one reference; the object is destroyed when this drop brought the count to 0.
    /// Returns 1.
    virtual std::int64_t Release() = 0;
    /// Stores the current count. Returns 1.
    virtual std::int64_t GetRefCount(int& count) = 0;
};

} // namespace CommonI
