//===-- Port/StringBase.h - length-counted narrow text --------------------------===//
//
// \file
// Port::StringBase<char> is the text type of every signature of the library. It is
// length-counted: it may hold NUL bytes, and two texts are equal when their lengths and
// bytes are equal. Positions and lengths are 32-bit; 0xFFFFFFFF means "absent" for
// positions and "the whole C text" for lengths passed to Append and Insert.
//
// Texts of up to 47 bytes live inside the object, so building one from a literal name and
// copying one never allocate; longer texts live on the heap. A property name is almost
// always that short, and every look-up by name builds one from whatever the host passed.
//
// Port_Range is an inclusive pair of positions [first, second]. A range that does not
// describe a match has first != 0 or second < first; GetRangeOfMatch answers
// {0xFFFFFFFF, 0} for "no match".
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "Port/Export.h"

#include <cstddef>
#include <cstring>
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

    StringBase() noexcept { SetInline(0); }
    StringBase(
        const char* text); // NOLINT(google-explicit-constructor): value type like std::string
    StringBase(const char* text, unsigned int length);
    explicit StringBase(std::string_view text);
    StringBase(const StringBase& other) {
        if (other.OnHeap()) {
            CopyLong(other);
        } else {
            std::memcpy(m_bytes, other.m_bytes, sizeof m_bytes);
        }
    }
    StringBase(StringBase&& other) noexcept {
        std::memcpy(m_bytes, other.m_bytes, sizeof m_bytes);
        other.SetInline(0);
    }
    ~StringBase() {
        if (OnHeap()) {
            delete[] HeapData();
        }
    }

    StringBase& operator=(const StringBase& other) {
        if (this != &other) {
            Assign(other.data(), other.GetLength());
        }
        return *this;
    }
    StringBase& operator=(StringBase&& other) noexcept {
        if (this != &other) {
            if (OnHeap()) {
                delete[] HeapData();
            }
            std::memcpy(m_bytes, other.m_bytes, sizeof m_bytes);
            other.SetInline(0);
        }
        return *this;
    }
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

    /// The most bytes a text holds without a heap block of its own.
    static constexpr unsigned int kInlineCapacity = 47;

    unsigned int GetLength() const {
        return OnHeap() ? HeapLength() : kInlineCapacity - static_cast<unsigned char>(Tag());
    }
    bool IsEmpty() const { return GetLength() == 0; }
    /// NUL-terminated view; embedded NUL bytes end it early for C callers.
    const char* c_str() const { return data(); }
    const char* data() const { return OnHeap() ? HeapData() : m_bytes; }
    std::string_view view() const { return {data(), GetLength()}; }
    /// A copy as a standard string.
    std::string str() const { return std::string(view()); }
    /// Empties the text and gives back its heap block, if any.
    void Clear() {
        if (OnHeap()) {
            delete[] HeapData();
        }
        SetInline(0);
    }

    friend bool operator==(const StringBase& a, const StringBase& b) {
        return a.view() == b.view();
    }
    friend bool operator!=(const StringBase& a, const StringBase& b) { return !(a == b); }

private:
    // The last byte tells the two forms apart. Inline it is 47 minus the length, so a text
    // of 47 bytes finds its terminating NUL there; on the heap it is kHeapTag, and the
    // first sixteen bytes hold the block, the length and the capacity (NUL not counted).
    static constexpr unsigned char kHeapTag = 0xFF;
    static constexpr std::size_t kLengthAt = sizeof(char*);
    static constexpr std::size_t kCapacityAt = kLengthAt + sizeof(unsigned int);

    char Tag() const { return m_bytes[kInlineCapacity]; }
    bool OnHeap() const { return static_cast<unsigned char>(Tag()) == kHeapTag; }
    char* HeapData() const {
        char* block;
        std::memcpy(&block, m_bytes, sizeof block);
        return block;
    }
    unsigned int HeapLength() const {
        unsigned int length;
        std::memcpy(&length, m_bytes + kLengthAt, sizeof length);
        return length;
    }
    unsigned int Capacity() const {
        if (!OnHeap()) {
            return kInlineCapacity;
        }
        unsigned int capacity;
        std::memcpy(&capacity, m_bytes + kCapacityAt, sizeof capacity);
        return capacity;
    }
    void SetInline(unsigned int length) {
        m_bytes[length] = '\0';
        m_bytes[kInlineCapacity] = static_cast<char>(kInlineCapacity - length);
    }
    void SetHeap(char* block, unsigned int length, unsigned int capacity) {
        std::memcpy(m_bytes, &block, sizeof block);
        std::memcpy(m_bytes + kLengthAt, &length, sizeof length);
        std::memcpy(m_bytes + kCapacityAt, &capacity, sizeof capacity);
        m_bytes[kInlineCapacity] = static_cast<char>(kHeapTag);
    }
    void SetLength(unsigned int length);
    void CopyLong(const StringBase& other);
    void Assign(const char* text, std::size_t n);
    void Splice(std::size_t at, const char* text, std::size_t n);

    alignas(char*) char m_bytes[kInlineCapacity + 1];
};

using String = StringBase<char>;

} // namespace Port

template <> struct std::hash<Port::StringBase<char>> {
    size_t operator()(const Port::StringBase<char>& s) const noexcept {
        return std::hash<std::string_view>{}(s.view());
    }
};
