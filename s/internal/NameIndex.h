//===-- s/internal/NameIndex.h - text to position, compact ----------------------===//
//
// The look-up behind every GetPropertyByName, so a search over a million holders runs
// it a million times, and the storage behind every name list, of which a generic holder
// carries one of its own: both speed and bytes per name count.
//
// Texts live back to back in one buffer, each after one byte its owner keeps with it
// (a name list packs the name's type and visibility there). Every entry is eight bytes:
// where its text starts and a tag of 24 hash bits above the length (capped at 255), so a
// text is read only when its tag matches. Up to kScanLimit entries are scanned in order,
// which for so few costs less than a table and no memory; past that, an open-addressing
// table of positions, at most half full, finds a text with about one probe.
// Exact, case-sensitive, byte-wise; texts may hold NUL bytes.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include <cstdint>
#include <cstring>
#include <stdexcept>
#include <string_view>
#include <utility>
#include <vector>

namespace Vn::Eng::detail {

class NameIndex {
public:
    /// Up to this many texts are found by scanning the tags; more get a hash table.
    static constexpr std::size_t kScanLimit = 16;

    /// The position stored for text, or -1.
    int Find(std::string_view text) const {
        const std::size_t count = m_entries.size();
        if (count == 0) {
            return -1;
        }
        const Key key = MakeKey(text);
        if (m_table.empty()) {
            for (std::size_t position = 0; position < count; ++position) {
                if (m_entries[position].tag == key.tag && Holds(position, text, key.head)) {
                    return static_cast<int>(position);
                }
            }
            return -1;
        }
        const std::size_t mask = m_table.size() - 1;
        for (std::size_t i = key.start & mask;; i = (i + 1) & mask) {
            const std::uint32_t position = m_table[i];
            if (position == kEmpty) {
                return -1;
            }
            if (m_entries[position].tag == key.tag && Holds(position, text, key.head)) {
                return static_cast<int>(position);
            }
        }
    }

    /// Enters text at the next position (the number of texts so far), with a byte kept
    /// for the caller; text must be absent. All or nothing: when growing fails, it throws
    /// and the index is as it was.
    std::uint32_t Append(std::string_view text, std::uint8_t extra = 0) {
        const std::size_t count = m_entries.size();
        if (count + 1 >= kEmpty || text.size() + 1 > kMaxTextBytes - m_texts.size()) {
            throw std::length_error("name index full");
        }
        // Everything that may allocate happens before anything changes.
        std::vector<std::uint32_t> table;
        const bool rebuild = count + 1 > kScanLimit && (count + 1) * 2 > m_table.size();
        if (rebuild) {
            table.assign(m_table.empty() ? 64 : m_table.size() * 2, kEmpty);
        }
        Grow(m_entries, count + 1, 4);
        Grow(m_texts, m_texts.size() + 1 + text.size(), 32);

        m_texts.push_back(static_cast<char>(extra));
        const auto start = static_cast<std::uint32_t>(m_texts.size());
        m_texts.insert(m_texts.end(), text.begin(), text.end());
        const Key key = MakeKey(text);
        m_entries.push_back(Entry{start, key.tag});
        const auto position = static_cast<std::uint32_t>(count);
        if (rebuild) {
            m_table.swap(table);
            for (std::uint32_t p = 0; p < position; ++p) {
                Place(MakeKey(Text(p)).start, p);
            }
        }
        if (!m_table.empty()) {
            Place(key.start, position);
        }
        return position;
    }

    std::size_t Size() const { return m_entries.size(); }
    /// The text at position (which must exist), valid until the next Append or Clear.
    std::string_view Text(std::size_t position) const {
        const std::size_t start = m_entries[position].start;
        const std::size_t end =
            position + 1 < m_entries.size() ? m_entries[position + 1].start - 1 : m_texts.size();
        return {m_texts.data() + start, end - start};
    }
    /// The byte entered with the text at position.
    std::uint8_t Extra(std::size_t position) const {
        return static_cast<std::uint8_t>(m_texts[m_entries[position].start - 1]);
    }
    /// Whether the texts are found through a hash table rather than by scanning.
    bool HasTable() const { return !m_table.empty(); }

    void Swap(NameIndex& other) noexcept {
        m_entries.swap(other.m_entries);
        m_texts.swap(other.m_texts);
        m_table.swap(other.m_table);
    }

    void Clear() {
        m_entries.clear();
        m_texts.clear();
        m_table.clear();
    }

private:
    static constexpr std::uint32_t kEmpty = 0xFFFFFFFFu;
    static constexpr std::size_t kMaxTextBytes = 0xFFFFFFFFu;
    static constexpr std::uint64_t kMix0 = 0x9E3779B97F4A7C15u;
    static constexpr std::uint64_t kMix1 = 0xC2B2AE3D27D4EB4Fu;

    struct Entry {
        std::uint32_t start; // of the text in m_texts; its extra byte sits just before
        std::uint32_t tag;   // 24 bits of hash above the length, capped at 255
    };
    struct Key {
        std::uint64_t head;
        std::uint32_t tag;
        std::uint32_t start; // where probing begins, before masking
    };

    // Doubles from `least`, so appending one at a time stays linear overall.
    template <class Vector>
    static void Grow(Vector& vector, std::size_t needed, std::size_t least) {
        if (needed > vector.capacity()) {
            std::size_t capacity = vector.capacity() < least ? least : vector.capacity() * 2;
            while (capacity < needed) {
                capacity *= 2;
            }
            vector.reserve(capacity);
        }
    }

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

    // The first min(n, 8) bytes of p as one word, never reading past the text: for n
    // below 8 overlapping reads, which with the length tell any two texts apart.
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

    // Whether the text at position is text, whose head is given; the tags matched already.
    bool Holds(std::size_t position, std::string_view text, std::uint64_t head) const {
        const std::string_view stored = Text(position);
        if (stored.size() != text.size()) {
            return false;
        }
        if (text.size() <= 8) {
            return Head(stored.data(), stored.size()) == head;
        }
        return std::memcmp(stored.data(), text.data(), text.size()) == 0;
    }

    void Place(std::uint32_t start, std::uint32_t position) {
        const std::size_t mask = m_table.size() - 1;
        std::size_t i = start & mask;
        while (m_table[i] != kEmpty) {
            i = (i + 1) & mask;
        }
        m_table[i] = position;
    }

    std::vector<Entry> m_entries;       // by position
    std::vector<char> m_texts;          // extra byte, then text, for each position in turn
    std::vector<std::uint32_t> m_table; // positions; empty up to kScanLimit texts
};

} // namespace Vn::Eng::detail
