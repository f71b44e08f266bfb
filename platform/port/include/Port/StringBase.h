//===-- Port/StringBase.h - length-counted narrow text --------------------------===//
//
// \file
// Port::StringBase<char> is the text type of every signature of the library. It is
// length-counted: it may hold NUL bytes, and two texts are equal when their lengths and
// bytes are equal. Positions and lengths are 32-bit; 0xFFFFFFFF means "absent" for
// positions and "the whole C text" for lengths passed to Append and Insert.
//
// Port_Range is an inclusive pair of positions [first, second]. A range that does not
// describe a match has first != 0 or second < first; GetRangeOfMatch answers
// {0xFFFFFFFF, 0} for "no match".
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "Port/Export.h"

#include <cstddef>
#include <functional>
#include <string>
#include <string_view>

class Port_Regexp;

struct Port_Range {
    unsigned int first = 0;
    unsigned int second = 0;
};

namespace Port {

template <class CharT> class StringBase;

template <> class VN_PORT_API StringBase<char> {
public:
    /// Comparison flavours of Compare and GetIndexOfString.
    enum CompareType : int {
        kExact = 0,      ///< byte for byte, ordered as unsigned bytes
        kIgnoreCase = 1, ///< ASCII letters folded, then as kExact
        kByteOrder = 3   ///< plain unsigned byte order, shorter prefix first
    };
    static constexpr unsigned int npos = 0xFFFFFFFFu;

    StringBase() = default;
    StringBase(
        const char* text); // NOLINT(google-explicit-constructor): value type like std::string
    StringBase(const char* text, unsigned int length);
    explicit StringBase(std::string_view text);
    StringBase(const StringBase&) = default;
    StringBase(StringBase&&) noexcept = default;
    ~StringBase() = default;

    StringBase& operator=(const StringBase&) = default;
    StringBase& operator=(StringBase&&) noexcept = default;
    StringBase& operator=(const char* text);
    StringBase& operator+=(const StringBase& other);
    StringBase& operator+=(const char* text);

    /// Appends n bytes of text, or the whole C text when n is 0xFFFFFFFF. Null appends nothing.
    StringBase& Append(const char* text, unsigned int n);
    /// Inserts n bytes (0xFFFFFFFF: the whole C text) before pos; pos past the end appends.
    StringBase& Insert(unsigned int pos, const char* text, unsigned int n);

    /// Negative, zero or positive as this text sorts before, equal to or after other.
    int Compare(const StringBase& other, CompareType type) const;
    /// Position of the first occurrence of other, or 0xFFFFFFFF. An empty text is found at 0.
    unsigned int GetIndexOfString(const StringBase& other, CompareType type) const;
    /// ASCII letters to upper case, in place.
    StringBase& MakeUpper();
    /// Replaces the text with printf-style output of any length.
    StringBase& Format(const char* format, ...) __attribute__((format(printf, 2, 3)));
    /// Inclusive range of the leftmost match; {0xFFFFFFFF, 0} when there is none.
    Port_Range GetRangeOfMatch(const Port_Regexp& regexp) const;
    /// Reads the plain decimal number (digits only, at most 4294967295) spelled by the
    /// inclusive range. Returns false and leaves *value untouched when the range lies
    /// outside the text, holds anything but digits, or spells a larger number.
    bool GetUINT32(const Port_Range& range, unsigned int* value) const;

    unsigned int GetLength() const { return static_cast<unsigned int>(m_text.size()); }
    bool IsEmpty() const { return m_text.empty(); }
    /// NUL-terminated view; embedded NUL bytes end it early for C callers.
    const char* c_str() const { return m_text.c_str(); }
    const char* data() const { return m_text.data(); }
    std::string_view view() const { return m_text; }
    const std::string& str() const { return m_text; }
    void Clear() { m_text.clear(); }

    friend bool operator==(const StringBase& a, const StringBase& b) {
        return a.m_text == b.m_text;
    }
    friend bool operator!=(const StringBase& a, const StringBase& b) { return !(a == b); }

private:
    std::string m_text;
};

using String = StringBase<char>;

} // namespace Port

template <> struct std::hash<Port::StringBase<char>> {
    size_t operator()(const Port::StringBase<char>& s) const noexcept {
        return std::hash<std::string_view>{}(s.view());
    }
};
