//===-- s/internal/TextSearch.h - a string comparison prepared for a whole search --===//
//
// A search compares a million holders' texts with one wanted text under one set of
// flags. StringProperty::Equals, reached through the interface, finds the search's
// expression again at every call (a per-thread cache, a text compare) and tests both
// sides' types through virtual calls. When both sides are exactly this library's
// StringProperty, whose Equals nobody overrides, the search answers with the same
// comparison prepared once. Anything else still goes through Equals.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "Port/Regexp.h"
#include "VnI/IProperty.h"

#include <optional>

namespace Vn::Eng {
class StringProperty;
}

namespace Vn::Eng::detail {

class PreparedTextMatch {
public:
    /// Prepared for `wanted` (borrowed: the caller keeps it alive) under `flags`.
    PreparedTextMatch(const VnI::IProperty* wanted, int flags);

    /// Whether Matches answers for this candidate: both sides exactly StringProperty.
    bool Answers(const VnI::IProperty& candidate) const;
    /// What candidate.Equals(wanted, flags) answers; only where Answers.
    bool Matches(const VnI::IProperty& candidate) const;

private:
    int m_flags;
    const StringProperty* m_wanted = nullptr;
    std::optional<Port_Regexp> m_expression; // with MATCH_REGEXP
};

} // namespace Vn::Eng::detail
