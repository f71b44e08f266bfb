//===-- s/internal/PropertyCreation.h - the creation steps both factories share -===//
#pragma once

#include "s/Property.h"

#include <new>

namespace Vn::Eng::detail {

/// The last steps of every creation function: hide the property if asked, then hand out
/// its published interface carrying the one initial reference (no AddRef).
template <class I, class Impl> I* Publish(Impl* created, bool visible) {
    if (created == nullptr) {
        return nullptr;
    }
    if (!visible) {
        created->SetVisible(false);
    }
    return static_cast<I*>(created->GetInterface(I::kIID));
}

/// Colour components arrive as plain char; their bits are the byte, whatever the
/// signedness of char.
inline std::uint8_t Byte(char c) {
    return static_cast<std::uint8_t>(static_cast<unsigned char>(c));
}

inline VnI::IProperty* CreateEnum(std::vector<Port::StringBase<char>>& possibleValues,
                                  const Port::StringBase<char>& current, bool visible) {
    auto* created = new (std::nothrow) EnumeratedProperty(possibleValues);
    if (created != nullptr && !current.IsEmpty()) {
        created->SetCurrentValue(current);
    }
    return Publish<VnI::IProperty>(created, visible);
}

} // namespace Vn::Eng::detail
