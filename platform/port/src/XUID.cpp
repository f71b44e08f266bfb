//===-- XUID.cpp - GUID text to identifier --------------------------------------===//
#include "Port/XUID.h"

#include <cstdio>
#include <cstring>

namespace Port {

namespace {

int HexValue(char c) {
    if (c >= '0' && c <= '9') {
        return c - '0';
    }
    if (c >= 'a' && c <= 'f') {
        return c - 'a' + 10;
    }
    if (c >= 'A' && c <= 'F') {
        return c - 'A' + 10;
    }
    return -1;
}

// Reads 8-4-4-4-12 hexadecimal groups; false on any deviation.
bool ParseGuid(const char* text, std::uint64_t& high, std::uint64_t& low) {
    size_t length = std::strlen(text);
    if (length == 38 && text[0] == '{' && text[37] == '}') {
        ++text;
        length = 36;
    }
    if (length != 36) {
        return false;
    }
    static constexpr int kDashes[] = {8, 13, 18, 23};
    std::uint64_t halves[2] = {0, 0};
    int digit = 0;
    for (int i = 0; i < 36; ++i) {
        const bool dashHere =
            i == kDashes[0] || i == kDashes[1] || i == kDashes[2] || i == kDashes[3];
        if (dashHere) {
            if (text[i] != '-') {
                return false;
            }
            continue;
        }
        const int value = HexValue(text[i]);
        if (value < 0) {
            return false;
        }
        std::uint64_t& half = halves[digit / 16];
        half = (half << 4) | static_cast<std::uint64_t>(value);
        ++digit;
    }
    high = halves[0];
    low = halves[1];
    return true;
}

} // namespace

XUID::XUID(const char* guidText) {
    std::uint64_t high = 0;
    std::uint64_t low = 0;
    if (guidText != nullptr && ParseGuid(guidText, high, low)) {
        m_high = high;
        m_low = low;
    }
}

std::string XUID::ToString() const {
    char buffer[40];
    std::snprintf(buffer, sizeof buffer, "%08X-%04X-%04X-%04X-%012llX",
                  static_cast<unsigned>(m_high >> 32),
                  static_cast<unsigned>((m_high >> 16) & 0xFFFF),
                  static_cast<unsigned>(m_high & 0xFFFF), static_cast<unsigned>(m_low >> 48),
                  static_cast<unsigned long long>(m_low & 0xFFFFFFFFFFFFull));
    return buffer;
}

} // namespace Port
