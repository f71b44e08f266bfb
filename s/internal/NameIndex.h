//===-- s/internal/NameIndex.h - text to position, in one flat table ------------===//
//
// The look-up behind every GetPropertyByName, so a search over a million holders runs
// it a million times. An open-addressing table of (hash, position) pairs kept at most
// half full finds a name with one probe on average, touching one cache line for the slot
// and one for the text, where a node-based map divides by a prime and chases pointers.
// Exact, case-sensitive, byte-wise; texts may hold NUL bytes.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace Vn::Eng::detail {

class NameIndex {
public:
    /// The position stored for text, or -1.
    int Find(std::string_view text) const {
        if (m_slots.empty()) {
            return -1;
        }
        const std::uint32_t hash = Hash(text);
        const std::size_t mask = m_slots.size() - 1;
        for (std::size_t i = hash & mask;; i = (i + 1) & mask) {
            const Slot& slot = m_slots[i];
            if (slot.position == kEmpty) {
                return -1;
            }
            if (slot.hash == hash && m_texts[slot.position] == text) {
                return static_cast<int>(slot.position);
            }
        }
    }

    /// Enters text at the next position (the number of texts so far); text must be absent.
    std::uint32_t Append(std::string_view text) {
        if ((m_texts.size() + 1) * 2 > m_slots.size()) {
            Rehash(m_slots.empty() ? 16 : m_slots.size() * 2);
        }
        const auto position = static_cast<std::uint32_t>(m_texts.size());
        m_texts.emplace_back(text);
        Place(Hash(text), position);
        return position;
    }

    void Clear() {
        m_slots.clear();
        m_texts.clear();
    }

private:
    static constexpr std::uint32_t kEmpty = 0xFFFFFFFFu;
    struct Slot {
        std::uint32_t hash;
        std::uint32_t position;
    };

    // FNV-1a: names are short, and this mixes every byte into the low bits the mask keeps.
    static std::uint32_t Hash(std::string_view text) {
        std::uint32_t hash = 2166136261u;
        for (const char c : text) {
            hash = (hash ^ static_cast<unsigned char>(c)) * 16777619u;
        }
        return hash;
    }

    void Place(std::uint32_t hash, std::uint32_t position) {
        const std::size_t mask = m_slots.size() - 1;
        std::size_t i = hash & mask;
        while (m_slots[i].position != kEmpty) {
            i = (i + 1) & mask;
        }
        m_slots[i] = Slot{hash, position};
    }

    void Rehash(std::size_t capacity) {
        m_slots.assign(capacity, Slot{0, kEmpty});
        for (std::uint32_t position = 0; position < m_texts.size(); ++position) {
            Place(Hash(m_texts[position]), position);
        }
    }

    std::vector<Slot> m_slots;        // a power of two long, at most half full
    std::vector<std::string> m_texts; // by position
};

} // namespace Vn::Eng::detail
