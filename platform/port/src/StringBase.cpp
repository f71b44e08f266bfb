//===-- StringBase.cpp - length-counted narrow text -----------------------------===//
#include "Port/StringBase.h"

#include "Port/Regexp.h"

#include <algorithm>
#include <cstdarg>
#include <cstdio>
#include <cstring>
#include <functional>
#include <stdexcept>
#include <string>

namespace Port {

namespace {

unsigned char FoldCase(unsigned char c) {
    return (c >= 'a' && c <= 'z') ? static_cast<unsigned char>(c - 'a' + 'A') : c;
}

int CompareBytes(std::string_view a, std::string_view b, bool ignoreCase) {
    const size_t n = std::min(a.size(), b.size());
    for (size_t i = 0; i < n; ++i) {
        unsigned char ca = static_cast<unsigned char>(a[i]);
        unsigned char cb = static_cast<unsigned char>(b[i]);
        if (ignoreCase) {
            ca = FoldCase(ca);
            cb = FoldCase(cb);
        }
        if (ca != cb) {
            return ca < cb ? -1 : 1;
        }
    }
    if (a.size() == b.size()) {
        return 0;
    }
    return a.size() < b.size() ? -1 : 1;
}

size_t CLength(const char* text, unsigned int n) {
    if (text == nullptr) {
        return 0;
    }
    return n == StringBase<char>::npos ? std::strlen(text) : n;
}

// Lengths are 32-bit and 0xFFFFFFFF is kept for "absent", as std::string keeps npos.
void CheckLength(std::size_t n) {
    if (n >= StringBase<char>::npos) {
        throw std::length_error("Port::StringBase: text longer than 4294967294 bytes");
    }
}

} // namespace

StringBase<char>::StringBase(const char* text) {
    SetInline(0);
    if (text != nullptr) {
        Assign(text, std::strlen(text));
    }
}

StringBase<char>::StringBase(const char* text, unsigned int length) {
    SetInline(0);
    if (text != nullptr) {
        Assign(text, length);
    }
}

StringBase<char>::StringBase(std::string_view text) {
    SetInline(0);
    Assign(text.data(), text.size());
}

void StringBase<char>::SetLength(unsigned int length) {
    if (OnHeap()) {
        std::memcpy(m_bytes + kLengthAt, &length, sizeof length);
        HeapData()[length] = '\0';
    } else {
        SetInline(length);
    }
}

void StringBase<char>::CopyLong(const StringBase& other) {
    const unsigned int length = other.HeapLength();
    char* block = new char[std::size_t{length} + 1];
    std::memcpy(block, other.HeapData(), std::size_t{length} + 1);
    SetHeap(block, length, length);
}

void StringBase<char>::Assign(const char* text, std::size_t n) {
    CheckLength(n);
    if (n <= kInlineCapacity) {
        // text may lie in this very text, inline or in the block freed below.
        char* old = OnHeap() ? HeapData() : nullptr;
        if (n != 0) {
            std::memmove(m_bytes, text, n);
        }
        SetInline(static_cast<unsigned int>(n));
        delete[] old;
        return;
    }
    if (OnHeap() && n <= Capacity()) {
        // Still on the heap, so the length goes beside the block. Not through SetLength:
        // after the memmove the compiler cannot tell that the text is still on the heap
        // and would see SetLength's inline branch store past the inline bytes.
        char* block = HeapData();
        std::memmove(block, text, n);
        const auto length = static_cast<unsigned int>(n);
        std::memcpy(m_bytes + kLengthAt, &length, sizeof length);
        block[n] = '\0';
        return;
    }
    char* block = new char[n + 1];
    std::memcpy(block, text, n);
    block[n] = '\0';
    if (OnHeap()) {
        delete[] HeapData();
    }
    SetHeap(block, static_cast<unsigned int>(n), static_cast<unsigned int>(n));
}

void StringBase<char>::Splice(std::size_t at, const char* text, std::size_t n) {
    if (n == 0) {
        return;
    }
    const std::size_t length = GetLength();
    CheckLength(length + n);
    const std::size_t total = length + n;
    char* here = OnHeap() ? HeapData() : m_bytes;
    if (total <= Capacity()) {
        const std::less<const char*> before;
        if (!before(text, here) && before(text, here + length + 1)) {
            // Moving the tail would shift the very bytes to insert: take them aside.
            const StringBase aside(std::string_view(text, n));
            Splice(at, aside.data(), n);
            return;
        }
        std::memmove(here + at + n, here + at, length - at);
        std::memcpy(here + at, text, n);
        SetLength(static_cast<unsigned int>(total));
        return;
    }
    // Geometric growth keeps a run of appends linear.
    const std::size_t capacity =
        std::max<std::size_t>(total, std::min<std::size_t>(2 * std::size_t{Capacity()}, npos - 1));
    char* block = new char[capacity + 1];
    std::memcpy(block, here, at);
    std::memcpy(block + at, text, n);
    std::memcpy(block + at + n, here + at, length - at);
    block[total] = '\0';
    if (OnHeap()) {
        delete[] HeapData();
    }
    SetHeap(block, static_cast<unsigned int>(total), static_cast<unsigned int>(capacity));
}

StringBase<char>& StringBase<char>::operator=(const char* text) {
    Assign(text != nullptr ? text : "", text != nullptr ? std::strlen(text) : 0);
    return *this;
}

StringBase<char>& StringBase<char>::operator+=(const StringBase& other) {
    Splice(GetLength(), other.data(), other.GetLength());
    return *this;
}

StringBase<char>& StringBase<char>::operator+=(const char* text) {
    return Append(text, npos);
}

StringBase<char>& StringBase<char>::Append(const char* text, unsigned int n) {
    if (text != nullptr) {
        Splice(GetLength(), text, CLength(text, n));
    }
    return *this;
}

StringBase<char>& StringBase<char>::Insert(unsigned int pos, const char* text, unsigned int n) {
    if (text != nullptr) {
        Splice(std::min<std::size_t>(pos, GetLength()), text, CLength(text, n));
    }
    return *this;
}

int StringBase<char>::Compare(const StringBase& other, CompareType type) const {
    return CompareBytes(view(), other.view(), type == kIgnoreCase);
}

unsigned int StringBase<char>::GetIndexOfString(const StringBase& other, CompareType type) const {
    const std::string_view text = view();
    const std::string_view wanted = other.view();
    if (type != kIgnoreCase) {
        const size_t at = text.find(wanted);
        return at == std::string_view::npos ? npos : static_cast<unsigned int>(at);
    }
    const auto equal = [](char a, char b) {
        return FoldCase(static_cast<unsigned char>(a)) == FoldCase(static_cast<unsigned char>(b));
    };
    const auto it = std::search(text.begin(), text.end(), wanted.begin(), wanted.end(), equal);
    return it == text.end() && !wanted.empty() ? npos
                                               : static_cast<unsigned int>(it - text.begin());
}

StringBase<char>& StringBase<char>::MakeUpper() {
    char* here = OnHeap() ? HeapData() : m_bytes;
    for (char* c = here; c != here + GetLength(); ++c) {
        *c = static_cast<char>(FoldCase(static_cast<unsigned char>(*c)));
    }
    return *this;
}

StringBase<char>& StringBase<char>::Format(const char* format, ...) {
    if (format == nullptr) {
        Clear();
        return *this;
    }
    va_list args;
    va_start(args, format);
    va_list again;
    va_copy(again, args);
    char small[kInlineCapacity + 1];
    const int needed = std::vsnprintf(small, sizeof small, format, args);
    va_end(args);
    if (needed < 0) {
        Clear();
    } else if (static_cast<std::size_t>(needed) < sizeof small) {
        Assign(small, static_cast<std::size_t>(needed));
    } else {
        std::string out(static_cast<size_t>(needed) + 1, '\0');
        std::vsnprintf(out.data(), out.size(), format, again);
        Assign(out.data(), static_cast<size_t>(needed));
    }
    va_end(again);
    return *this;
}

Port_Range StringBase<char>::GetRangeOfMatch(const Port_Regexp& regexp) const {
    unsigned int start = 0;
    unsigned int length = 0;
    if (!regexp.Find(view(), &start, &length)) {
        return Port_Range{npos, 0};
    }
    // Inclusive end; an empty match at 0 wraps to 0xFFFFFFFF and so still starts at 0.
    return Port_Range{start, start + length - 1u};
}

bool StringBase<char>::GetUINT32(const Port_Range& range, unsigned int* value) const {
    if (value == nullptr || range.first > range.second || range.second >= GetLength()) {
        return false;
    }
    std::uint64_t number = 0;
    for (size_t i = range.first; i <= range.second; ++i) {
        const char c = data()[i];
        if (c < '0' || c > '9') {
            return false;
        }
        number = number * 10 + static_cast<unsigned>(c - '0');
        if (number > 0xFFFFFFFFull) {
            return false;
        }
    }
    *value = static_cast<unsigned int>(number);
    return true;
}

} // namespace Port
