//===-- Port/XUID.h - 128-bit interface identifiers -----------------------------===//
//
// \file
// An XUID is two unsigned 64-bit halves compared by value. Identifiers of the library
// are compile-time constants built from their halves; the host's are read from GUID
// text such as "{0725c3d2-5e9b-4383-a7b6-a80c932eac21}" (braces optional, any letter
// case). Malformed text gives the all-zero identifier, which no interface uses.
//
// The type is a literal type (no virtual destructor) so that identifiers can be
// constexpr and never depend on the order of static initialisation.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "Port/Export.h"

#include <cstdint>
#include <string>

namespace Port {

class VN_PORT_API XUID {
public:
    constexpr XUID() = default;
    constexpr XUID(std::uint64_t high, std::uint64_t low) : m_high(high), m_low(low) {}
    /// Parses GUID text; malformed or null text gives the all-zero identifier.
    explicit XUID(const char* guidText);

    constexpr std::uint64_t GetHigh() const { return m_high; }
    constexpr std::uint64_t GetLow() const { return m_low; }
    constexpr bool IsNull() const { return m_high == 0 && m_low == 0; }
    /// Upper-case GUID text without braces.
    std::string ToString() const;

    friend constexpr bool operator==(const XUID& a, const XUID& b) {
        return a.m_high == b.m_high && a.m_low == b.m_low;
    }
    friend constexpr bool operator!=(const XUID& a, const XUID& b) { return !(a == b); }

private:
    std::uint64_t m_high = 0;
    std::uint64_t m_low = 0;
};

} // namespace Port
