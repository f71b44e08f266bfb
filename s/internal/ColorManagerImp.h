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

#include <cstdint>
#include <unordered_map>
#include <vector>

namespace Vn::Eng {

struct ColorManagerImp {
    using Color = CommonI::RefCountPtr<VnI::IColorProperty>;
    using ColorList = std::vector<Color>;

    Color m_tileColor;
    Color m_signalColor;
    Color m_switchBoxColor;
    // Looked up by exact name; the iteration order is never used.
    std::unordered_map<Port::StringBase<char>, Color> m_tileTypeColors;
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
