//===-- StringBase.cpp - length-counted narrow text -----------------------------===//
#include "Port/StringBase.h"

#include "Port/Regexp.h"

#include <algorithm>
#include <cstdarg>
#include <cstdio>
#include <cstring>

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

} // namespace

StringBase<char>::StringBase(const char* text) : m_text(text != nullptr ? text : "") {}

StringBase<char>::StringBase(const char* text, unsigned int length)
    : m_text(text != nullptr ? std::string(text, length) : std::string()) {}

StringBase<char>::StringBase(std::string_view text) : m_text(text) {}

StringBase<char>& StringBase<char>::operator=(const char* text) {
    m_text.assign(text != nullptr ? text : "");
    return *this;
}

StringBase<char>& StringBase<char>::operator+=(const StringBase& other) {
    m_text += other.m_text;
    return *this;
}

StringBase<char>& StringBase<char>::operator+=(const char* text) {
    return Append(text, npos);
}

StringBase<char>& StringBase<char>::Append(const char* text, unsigned int n) {
    m_text.append(text != nullptr ? text : "", CLength(text, n));
    return *this;
}

StringBase<char>& StringBase<char>::Insert(unsigned int pos, const char* text, unsigned int n) {
    const size_t at = std::min<size_t>(pos, m_text.size());
    m_text.insert(at, text != nullptr ? text : "", CLength(text, n));
    return *this;
}

int StringBase<char>::Compare(const StringBase& other, CompareType type) const {
    return CompareBytes(m_text, other.m_text, type == kIgnoreCase);
}

unsigned int StringBase<char>::GetIndexOfString(const StringBase& other, CompareType type) const {
    if (type != kIgnoreCase) {
        const size_t at = m_text.find(other.m_text);
        return at == std::string::npos ? npos : static_cast<unsigned int>(at);
    }
    const auto equal = [](char a, char b) {
        return FoldCase(static_cast<unsigned char>(a)) == FoldCase(static_cast<unsigned char>(b));
    };
    const auto it =
        std::search(m_text.begin(), m_text.end(), other.m_text.begin(), other.m_text.end(), equal);
    return it == m_text.end() && !other.m_text.empty()
               ? npos
               : static_cast<unsigned int>(it - m_text.begin());
}

StringBase<char>& StringBase<char>::MakeUpper() {
    for (char& c : m_text) {
        c = static_cast<char>(FoldCase(static_cast<unsigned char>(c)));
    }
    return *this;
}

StringBase<char>& StringBase<char>::Format(const char* format, ...) {
    if (format == nullptr) {
        m_text.clear();
        return *this;
    }
    va_list args;
    va_start(args, format);
    va_list again;
    va_copy(again, args);
    const int needed = std::vsnprintf(nullptr, 0, format, args);
    va_end(args);
    if (needed < 0) {
        m_text.clear();
    } else {
        std::string out(static_cast<size_t>(needed) + 1, '\0');
        std::vsnprintf(out.data(), out.size(), format, again);
        out.resize(static_cast<size_t>(needed));
        m_text = std::move(out);
    }
    va_end(again);
    return *this;
}

Port_Range StringBase<char>::GetRangeOfMatch(const Port_Regexp& regexp) const {
    unsigned int start = 0;
    unsigned int length = 0;
    if (!regexp.Find(m_text, &start, &length)) {
        return Port_Range{npos, 0};
    }
    // Inclusive end; an empty match at 0 wraps to 0xFFFFFFFF and so still starts at 0.
    return Port_Range{start, start + length - 1u};
}

bool StringBase<char>::GetUINT32(const Port_Range& range, unsigned int* value) const {
    if (value == nullptr || range.first > range.second || range.second >= m_text.size()) {
        return false;
    }
    std::uint64_t number = 0;
    for (size_t i = range.first; i <= range.second; ++i) {
        const char c = m_text[i];
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
