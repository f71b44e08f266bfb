//===-- s/internal/NameIndex.h - text to position, compact ----------------------===//
//
// The look-up behind every GetPropertyByName, so a search over a million holders runs
// it a million times, and the storage behind every name list, of which a generic holder
// carries one of its own: both speed and bytes per name count.
//
// Entries and texts share one block, entries first, so a list of a few names costs one
// allocation and grows both with one copy. Texts live back to back, each after one byte
// its owner keeps with it (a name list packs the name's type and visibility there). Every
// entry is eight bytes: where its text starts and a tag of 24 hash bits above the length
// (capped at 255), so a text is read only when its tag matches. Up to kScanLimit entries
// are scanned in order, which for so few costs less than a table and no memory; past
// that, an open-addressing table of positions, at most half full, finds a text with about
// one probe. Exact, case-sensitive, byte-wise; texts may hold NUL bytes.
//
// A caller that adds a text when it is absent makes its Key once and passes it to Find
// and Append, so the text is hashed once and the entries scanned once.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <memory>
#include <stdexcept>
#include <string_view>
#include <utility>

namespace Vn::Eng::detail {

class NameIndex {
public:
    /// Up to this many texts are found by scanning the tags; more get a hash table.
    static constexpr std::size_t kScanLimit = 16;

    /// What Find and Append need of a text, made once for both.
    struct Key {
        std::uint64_t head;
        std::uint32_t tag;
        std::uint32_t start; // where probing begins, before masking
    };

    NameIndex() = default;
    NameIndex(const NameIndex& other) { other.CopyTo(*this); }
    NameIndex& operator=(const NameIndex& other) {
        if (this != &other) {
            NameIndex copy(other);
            Swap(copy);
        }
        return *this;
    }
    ~NameIndex() = default;

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

    /// The position stored for text, or -1.
    int Find(std::string_view text) const { return m_count == 0 ? -1 : Find(text, MakeKey(text)); }
    /// As Find, with text's key made by the caller.
    int Find(std::string_view text, const Key& key) const {
        const Entry* entries = Entries();
        if (m_tableSize == 0) {
            for (std::size_t position = 0; position < m_count; ++position) {
                if (entries[position].tag == key.tag && Holds(position, text, key.head)) {
                    return static_cast<int>(position);
                }
            }
            return -1;
        }
        const std::size_t mask = m_tableSize - 1;
        for (std::size_t i = key.start & mask;; i = (i + 1) & mask) {
            const std::uint32_t position = m_table[i];
            if (position == kEmpty) {
                return -1;
            }
            if (entries[position].tag == key.tag && Holds(position, text, key.head)) {
                return static_cast<int>(position);
            }
        }
    }

    /// Enters text at the next position (the number of texts so far), with a byte kept
    /// for the caller; text must be absent. All or nothing: when growing fails, it throws
    /// and the index is as it was.
    std::uint32_t Append(std::string_view text, std::uint8_t extra = 0) {
        return Append(text, extra, MakeKey(text));
    }
    /// As Append, with text's key made by the caller.
    std::uint32_t Append(std::string_view text, std::uint8_t extra, const Key& key) {
        const std::size_t count = m_count;
        if (count + 1 >= kEmpty || text.size() + 1 > kMaxTextBytes - m_textSize) {
            throw std::length_error("name index full");
        }
        // Everything that may allocate happens before anything changes.
        std::unique_ptr<std::uint32_t[]> table;
        std::size_t tableSize = 0;
        if (count + 1 > kScanLimit && (count + 1) * 2 > m_tableSize) {
            tableSize = m_tableSize == 0 ? 64 : std::size_t{m_tableSize} * 2;
            table.reset(new std::uint32_t[tableSize]);
            std::fill_n(table.get(), tableSize, kEmpty);
        }
        const std::size_t textBytes = m_textSize + 1 + text.size();
        if (count + 1 > m_entryCapacity || textBytes > m_textCapacity) {
            Regrow(count + 1, textBytes);
        }

        char* texts = Texts();
        texts[m_textSize] = static_cast<char>(extra);
        const std::uint32_t start = m_textSize + 1;
        if (!text.empty()) {
            std::memcpy(texts + start, text.data(), text.size());
        }
        m_textSize = static_cast<std::uint32_t>(textBytes);
        Entries()[count] = Entry{start, key.tag};
        m_count = static_cast<std::uint32_t>(count + 1);
        const auto position = static_cast<std::uint32_t>(count);
        if (table) {
            m_table.swap(table);
            m_tableSize = static_cast<std::uint32_t>(tableSize);
            for (std::uint32_t p = 0; p < position; ++p) {
                Place(MakeKey(Text(p)).start, p);
            }
        }
        if (m_tableSize != 0) {
            Place(key.start, position);
        }
        return position;
    }

    std::size_t Size() const { return m_count; }
    /// The text at position (which must exist), valid until the next Append or Clear.
    std::string_view Text(std::size_t position) const {
        const Entry* entries = Entries();
        const std::size_t start = entries[position].start;
        const std::size_t end =
            position + 1 < m_count ? entries[position + 1].start - 1 : m_textSize;
        return {Texts() + start, end - start};
    }
    /// The byte entered with the text at position.
    std::uint8_t Extra(std::size_t position) const {
        return static_cast<std::uint8_t>(Texts()[Entries()[position].start - 1]);
    }
    /// Whether the texts are found through a hash table rather than by scanning.
    bool HasTable() const { return m_tableSize != 0; }

    void Swap(NameIndex& other) noexcept {
        m_block.swap(other.m_block);
        m_table.swap(other.m_table);
        std::swap(m_count, other.m_count);
        std::swap(m_entryCapacity, other.m_entryCapacity);
        std::swap(m_textSize, other.m_textSize);
        std::swap(m_textCapacity, other.m_textCapacity);
        std::swap(m_tableSize, other.m_tableSize);
    }

    /// Forgets every text; the block is kept for the texts to come.
    void Clear() noexcept {
        m_count = 0;
        m_textSize = 0;
        m_table.reset();
        m_tableSize = 0;
    }

private:
    static constexpr std::uint32_t kEmpty = 0xFFFFFFFFu;
    static constexpr std::size_t kMaxTextBytes = 0xFFFFFFFFu;
    static constexpr std::uint64_t kMix0 = 0x9E3779B97F4A7C15u;
    static constexpr std::uint64_t kMix1 = 0xC2B2AE3D27D4EB4Fu;
    // The first block holds eight names of up to seven bytes: a generic holder's list
    // of sixteen short names then takes two blocks in all.
    static constexpr std::size_t kFirstEntries = 8;
    static constexpr std::size_t kFirstTextBytes = 64;

    struct Entry {
        std::uint32_t start; // of the text among the texts; its extra byte sits just before
        std::uint32_t tag;   // 24 bits of hash above the length, capped at 255
    };

    const Entry* Entries() const { return reinterpret_cast<const Entry*>(m_block.get()); }
    Entry* Entries() { return reinterpret_cast<Entry*>(m_block.get()); }
    const char* Texts() const {
        return reinterpret_cast<const char*>(m_block.get()) + m_entryCapacity * sizeof(Entry);
    }
    char* Texts() {
        return reinterpret_cast<char*>(m_block.get()) + m_entryCapacity * sizeof(Entry);
    }

    // Each part doubles (from its first size) when it would be more than half full, so
    // that entries and texts mostly grow in the same step and appending one at a time
    // stays linear overall. Throws with nothing changed when the block cannot be had.
    static std::size_t Grown(std::size_t capacity, std::size_t needed, std::size_t first) {
        if (capacity == 0) {
            capacity = first;
        } else if (needed * 2 > capacity) {
            capacity *= 2;
        }
        while (capacity < needed) {
            capacity *= 2;
        }
        return capacity;
    }
    void Regrow(std::size_t entries, std::size_t textBytes) {
        const std::size_t entryCapacity = Grown(m_entryCapacity, entries, kFirstEntries);
        const std::size_t textCapacity =
            std::min(Grown(m_textCapacity, textBytes, kFirstTextBytes), kMaxTextBytes);
        Reallocate(entryCapacity, textCapacity);
    }
    void Reallocate(std::size_t entryCapacity, std::size_t textCapacity) {
        std::unique_ptr<std::byte[]> block(
            new std::byte[entryCapacity * sizeof(Entry) + textCapacity]);
        if (m_count != 0) {
            std::memcpy(block.get(), m_block.get(), m_count * sizeof(Entry));
        }
        if (m_textSize != 0) {
            std::memcpy(block.get() + entryCapacity * sizeof(Entry), Texts(), m_textSize);
        }
        m_block.swap(block);
        m_entryCapacity = static_cast<std::uint32_t>(entryCapacity);
        m_textCapacity = static_cast<std::uint32_t>(textCapacity);
    }
    // A copy as tight as the texts allow; the table as it is.
    void CopyTo(NameIndex& copy) const {
        if (m_count != 0) {
            copy.Reallocate(m_count, m_textSize);
            std::memcpy(copy.m_block.get(), m_block.get(), m_count * sizeof(Entry));
            std::memcpy(copy.Texts(), Texts(), m_textSize);
        }
        if (m_tableSize != 0) {
            copy.m_table.reset(new std::uint32_t[m_tableSize]);
            std::memcpy(copy.m_table.get(), m_table.get(), m_tableSize * sizeof(std::uint32_t));
        }
        copy.m_count = m_count;
        copy.m_textSize = m_textSize;
        copy.m_tableSize = m_tableSize;
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
        const std::size_t mask = m_tableSize - 1;
        std::size_t i = start & mask;
        while (m_table[i] != kEmpty) {
            i = (i + 1) & mask;
        }
        m_table[i] = position;
    }

    std::unique_ptr<std::byte[]> m_block;     // entries by position, then the texts
    std::unique_ptr<std::uint32_t[]> m_table; // positions; none up to kScanLimit texts
    std::uint32_t m_count = 0;
    std::uint32_t m_entryCapacity = 0;
    std::uint32_t m_textSize = 0; // extra byte, then text, for each position in turn
    std::uint32_t m_textCapacity = 0;
    std::uint32_t m_tableSize = 0;
};

} // namespace Vn::Eng::detail
