//===-- Port/Regexp.h - linear-time regular expressions -------------------------===//
//
// \file
// Port_Regexp compiles a pattern in RE2 syntax (which includes `.` and `*`), reading
// texts as narrow 8-bit text: every byte is one character (Latin-1). Matching
// runs in time linear in the text, so a pattern typed into a search box can never hang
// the editor. An invalid pattern matches nothing and never throws.
//
// Compiled patterns are shared through a process-wide cache: constructing the same
// pattern over and over (a search over a million holders builds one per holder) costs
// a lookup, not a compile.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "Port/Export.h"

#include <memory>
#include <string_view>

namespace Port {
template <class CharT> class StringBase;
}

class VN_PORT_API Port_Regexp {
public:
    explicit Port_Regexp(const Port::StringBase<char>& pattern);
    explicit Port_Regexp(std::string_view pattern);
    explicit Port_Regexp(const char* pattern)
        : Port_Regexp(std::string_view(pattern ? pattern : "")) {}
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

    struct Compiled;

private:
    std::shared_ptr<const Compiled> m_compiled;
};
