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
#include "s/internal/NameIndex.h"

#include <cstddef>
#include <cstdint>
#include <stdexcept>
#include <utility>
#include <vector>

namespace Vn::Eng {

// The tile-type map: exact, case-sensitive names to colours. A flat name index (one
// probe, no division by a prime) in front of the entries in order of first use; the
// views ask it for every tile they draw.
class TileColorMap {
public:
    using Color = CommonI::RefCountPtr<VnI::IColorProperty>;
    using Entry = std::pair<Port::StringBase<char>, Color>;

    /// The entry for name, added holding a null colour when name is new (name is moved
    /// from only then).
    Color& operator[](Port::StringBase<char>&& name) {
        const auto key = detail::NameIndex::MakeKey(name.view());
        const int found = m_index.Find(name.view(), key);
        if (found >= 0) {
            return m_entries[static_cast<std::size_t>(found)].second;
        }
        // Room first, so that once the index holds the name the entry cannot fail to
        // follow it (moving the name in does not allocate); a failure leaves both
        // structures and the caller's name as they were.
        if (m_entries.size() == m_entries.capacity()) {
            m_entries.reserve(m_entries.empty() ? 16 : m_entries.size() * 2);
        }
        m_index.Append(name.view(), 0, key);
        return m_entries.emplace_back(std::move(name), Color()).second;
    }
    /// The entry for name; throws std::out_of_range when there is none, as a map does.
    const Color& at(const Port::StringBase<char>& name) const {
        const int found = m_index.Find(name.view());
        if (found < 0) {
            throw std::out_of_range("no such tile type");
        }
        return m_entries[static_cast<std::size_t>(found)].second;
    }
    std::size_t size() const { return m_entries.size(); }
    bool empty() const { return m_entries.empty(); }
    void clear() {
        m_entries.clear();
        m_index.Clear();
    }
    std::vector<Entry>::const_iterator begin() const { return m_entries.begin(); }
    std::vector<Entry>::const_iterator end() const { return m_entries.end(); }

private:
    detail::NameIndex m_index;
    std::vector<Entry> m_entries; // by position in the index
};

struct ColorManagerImp {
    using Color = CommonI::RefCountPtr<VnI::IColorProperty>;
    using ColorList = std::vector<Color>;

    Color m_tileColor;
    Color m_signalColor;
    Color m_switchBoxColor;
    // Looked up by exact name; the iteration order is never used.
    TileColorMap m_tileTypeColors;
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
