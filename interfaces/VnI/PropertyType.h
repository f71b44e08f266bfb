//===-- VnI/PropertyType.h - value types and compare flags ----------------------===//
#pragma once

namespace VnI {

/// The type of a property's value. Stored and published: do not reorder or renumber.
enum PropertyType : int {
    UNDEFINED_TYPE = 0,
    INT_TYPE = 1,
    DOUBLE_TYPE = 2,
    STRING_TYPE = 3,
    BOOL_TYPE = 4,
    ENUM_TYPE = 5,
    COLOR_TYPE = 6,
    ICON_TYPE = 7, ///< reserved; no class of this library reports it
};

/// Compare flags of IProperty::Equals and of the search; bits may be combined, and 0
/// means exact equality. Published values: do not change.
inline constexpr int MATCH_EXACT = 0x01;
inline constexpr int MATCH_IGNORE_CASE = 0x02;
inline constexpr int MATCH_SUBSTRING = 0x04;
inline constexpr int MATCH_WITHIN_5_PERCENT = 0x08;
inline constexpr int MATCH_LESS = 0x10;
inline constexpr int MATCH_GREATER = 0x20;
inline constexpr int MATCH_ANY = 0x40;
inline constexpr int MATCH_REGEXP = 0x80;

} // namespace VnI
