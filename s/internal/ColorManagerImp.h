//===-- s/internal/ColorManagerImp.h - the colour manager's state ---------------===//
//
// The one record behind ColorManager. It holds one reference on every colour in it.
// Working and default palettes of a kind come from two separate reads of the same key,
// so they start equal in value but never share an object: recolouring a working colour
// leaves its default as read. Field order is fixed.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "CommonI/RefCountPtr.h"
#include "Port/StringBase.h"
#include "VnI/IProperty.h"

#include <cstddef>
#include <cstdint>
#include <functional>
#include <unordered_map>
#include <vector>

namespace Vn::Eng {

// The map keeps each name's hash code in its node: the standard library does so for
// hashers that are not declared noexcept. Without the codes, finding where a bucket ends
// hashes the neighbouring names again, and a lookup costs several hashes instead of one.
struct TileNameHash {
    std::size_t operator()(const Port::StringBase<char>& name) const {
        return std::hash<Port::StringBase<char>>{}(name);
    }
};

struct ColorManagerImp {
    using Color = CommonI::RefCountPtr<VnI::IColorProperty>;
    using ColorList = std::vector<Color>;

    Color m_tileColor;
    Color m_signalColor;
    Color m_switchBoxColor;
    // Looked up by exact name; the iteration order is never used.
    std::unordered_map<Port::StringBase<char>, Color, TileNameHash> m_tileTypeColors;
    ColorList m_genericColors;
    std::int32_t m_nextGenericColor = 0;
    ColorList m_selectedPathColors;
    ColorList m_ioBankColors;
    ColorList m_clockRegionColors;
    ColorList m_flightTimeColors;
    ColorList m_defaultIOBankColors;
    ColorList m_defaultClockRegionColors;
    ColorList m_defaultFlightTimeColors;
};

} // namespace Vn::Eng
