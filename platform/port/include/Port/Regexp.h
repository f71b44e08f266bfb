//===-- Port/Regexp.h - linear-time regular expressions -------------------------===//
//
// \file
// Port_Regexp compiles a pattern in RE2 syntax (which includes `.` and `*`), reading
// texts as narrow 8-bit text: every byte is one character (Latin-1), and `.` matches
// every byte, line breaks included. Matching runs in time linear in the text, so a
// pattern typed into a search box can never hang the editor. An invalid pattern matches
// nothing and never throws.
//
// Letter case, when ignored (Case::Ignore, or (?i) in the pattern), is that of the ASCII
// letters only, as everywhere else in the library: no other byte has a case. \d, \w, \s
// and their negations keep their meaning.
//
// Compiled patterns are shared through a process-wide cache: constructing the same
// pattern over and over (a search over a million holders builds one per holder) costs
// a lookup, not a compile. The cache is bounded by the memory its expressions may hold,
// each expression's own growth being capped; a pattern too large for that cap is
// invalid.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "Port/Export.h"

#include <cstddef>
#include <memory>
#include <string_view>

namespace Port {
template <class CharT> class StringBase;
}

class VN_PORT_API Port_Regexp {
public:
    enum class Case { Match, Ignore };

    explicit Port_Regexp(const Port::StringBase<char>& pattern, Case letterCase = Case::Match);
    explicit Port_Regexp(std::string_view pattern, Case letterCase = Case::Match);
    explicit Port_Regexp(const char* pattern, Case letterCase = Case::Match)
        : Port_Regexp(std::string_view(pattern ? pattern : ""), letterCase) {}
    Port_Regexp(const Port_Regexp&);
    Port_Regexp& operator=(const Port_Regexp&);
    ~Port_Regexp();

    /// False when the pattern did not compile; such an expression matches nothing.
    bool IsValid() const;
    /// Leftmost match in text: true with its start and length, false when none.
    bool Find(std::string_view text, unsigned int* start, unsigned int* length) const;
    /// Whether a match starts at the first byte (the leftmost match then starts there too).
    /// Cheaper than Find: no scan along the text and no match bounds.
    bool MatchesAtStart(std::string_view text) const;

    /// The memory the shared cache accounts for its expressions now, and its bound.
    static std::size_t CacheBytes();
    static std::size_t CacheBudget();

    struct Compiled;

private:
    std::shared_ptr<const Compiled> m_compiled;
};
