//===-- s/internal/NameIndex.h - text to position, in one flat table ------------===//
//
// The look-up behind every GetPropertyByName, so a search over a million holders runs
// it a million times. An open-addressing table kept at most half full finds a name with
// one probe on average. Each slot carries the text's length and its first eight bytes,
// so a name of up to eight bytes (most property and tile names) is found without
// touching the stored text at all, and the hash reads the text a word at a time rather
// than a byte at a time. Exact, case-sensitive, byte-wise; texts may hold NUL bytes.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include <cstdint>
#include <cstring>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace Vn::Eng::detail {

class NameIndex {
public:
    /// The position stored for text, or -1.
    int Find(std::string_view text) const {
        if (text.size() > 8) {
            return FindLong(text);
        }
        if (m_mask == 0) {
            return -1;
        }
        // Equal tags and heads prove a text of up to eight bytes equal: no call, no
        // read of the stored text.
        const Key key = MakeKey(text);
        for (std::size_t i = key.start & m_mask;; i = (i + 1) & m_mask) {
            const Slot& slot = m_slots[i];
            if (slot.tag == key.tag && slot.head == key.head) {
                return static_cast<int>(slot.position);
            }
            if (slot.position == kEmpty) {
                return -1;
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
        Place(text, position);
        return position;
    }

    void Swap(NameIndex& other) noexcept {
        m_slots.swap(other.m_slots);
        std::swap(m_mask, other.m_mask);
        m_texts.swap(other.m_texts);
    }

    void Clear() {
        m_slots.clear();
        m_texts.clear();
        m_mask = 0;
    }

private:
    static constexpr std::uint32_t kEmpty = 0xFFFFFFFFu;
    static constexpr std::uint64_t kMix0 = 0x9E3779B97F4A7C15u;
    static constexpr std::uint64_t kMix1 = 0xC2B2AE3D27D4EB4Fu;
    // The tag is 24 bits of hash above the length (capped at 255), so equal tags and
    // equal heads prove a text of up to eight bytes equal without reading it.
    struct Slot {
        std::uint64_t head; // the text's first eight bytes, zero beyond its end
        std::uint32_t tag;
        std::uint32_t position;
    };
    struct Key {
        std::uint64_t head;
        std::uint32_t tag;
        std::uint32_t start; // where probing begins, before masking
    };

    static std::uint64_t Load64(const char* p) {
        std::uint64_t word;
        std::memcpy(&word, p, 8);
        return word;
    }
    static std::uint64_t Load32(const char* p) {
        std::uint32_t word;
        std::memcpy(&word, p, 4);
        return word;
    }

    // The first min(n, 8) bytes of p as one word, the rest zero, never reading past the
    // text: two overlapping reads put every byte at its own place.
    static std::uint64_t Head(const char* p, std::size_t n) {
        if (n >= 8) {
            return Load64(p);
        }
        if (n >= 4) {
            return Load32(p) | (Load32(p + n - 4) << ((n - 4) * 8));
        }
        if (n == 0) {
            return 0;
        }
        const auto byte = [p](std::size_t i) {
            return static_cast<std::uint64_t>(static_cast<unsigned char>(p[i])) << (i * 8);
        };
        return byte(0) | byte(n / 2) | byte(n - 1);
    }

    // One 64x64->128 multiply folded to 64 bits spreads every input bit over the result.
    static std::uint64_t Mix(std::uint64_t a, std::uint64_t b) {
        __extension__ using Wide = unsigned __int128;
        const Wide product = static_cast<Wide>(a) * b;
        return static_cast<std::uint64_t>(product) ^ static_cast<std::uint64_t>(product >> 64);
    }

    static Key MakeKey(std::string_view text) {
        const char* p = text.data();
        const std::size_t n = text.size();
        const std::uint64_t head = Head(p, n);
        std::uint64_t hash = Mix(head ^ kMix0, n ^ kMix1);
        if (n > 8) {
            hash = LongHash(p, n, hash);
        }
        const auto length = static_cast<std::uint32_t>(n < 255 ? n : 255);
        return Key{head, (static_cast<std::uint32_t>(hash) & 0xFFFFFF00u) | length,
                   static_cast<std::uint32_t>(hash >> 32)};
    }

    // Whole words after the head, then the last eight bytes (overlapping the previous
    // word when the length is not a multiple of eight). Kept out of line so the short
    // path stays small.
    [[gnu::noinline]] static std::uint64_t LongHash(const char* p, std::size_t n,
                                                    std::uint64_t hash) {
        for (std::size_t at = 8; at + 8 < n; at += 8) {
            hash = Mix(hash ^ Load64(p + at), kMix0);
        }
        return Mix(hash ^ Load64(p + n - 8), kMix1);
    }

    [[gnu::noinline]] int FindLong(std::string_view text) const {
        if (m_mask == 0) {
            return -1;
        }
        const Key key = MakeKey(text);
        for (std::size_t i = key.start & m_mask;; i = (i + 1) & m_mask) {
            const Slot& slot = m_slots[i];
            if (slot.position == kEmpty) {
                return -1;
            }
            if (slot.tag == key.tag && slot.head == key.head && m_texts[slot.position] == text) {
                return static_cast<int>(slot.position);
            }
        }
    }

    void Place(std::string_view text, std::uint32_t position) {
        const Key key = MakeKey(text);
        std::size_t i = key.start & m_mask;
        while (m_slots[i].position != kEmpty) {
            i = (i + 1) & m_mask;
        }
        m_slots[i] = Slot{key.head, key.tag, position};
    }

    void Rehash(std::size_t capacity) {
        // An empty slot's tag claims a length of 255 or more, which no short key has.
        m_slots.assign(capacity, Slot{0, kEmpty, kEmpty});
        m_mask = capacity - 1;
        for (std::uint32_t position = 0; position < m_texts.size(); ++position) {
            Place(m_texts[position], position);
        }
    }

    std::vector<Slot> m_slots;        // a power of two long, at most half full
    std::size_t m_mask = 0;           // m_slots.size() - 1 once there are slots
    std::vector<std::string> m_texts; // by position
};

} // namespace Vn::Eng::detail
