//===-- ReadIndex.h - finding owners and repeated names while a file is read ---===//
//
// A file of 100,000 designs holds several rows per design, and the reader looks up an
// owner and checks a name for every one of them. Node-based hash containers made that a
// few scattered allocations and cache misses per row, so a file ten times larger took
// three times longer per row; these keep each look-up in one compact array.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include <algorithm>
#include <cstdint>
#include <functional>
#include <stdexcept>
#include <string_view>
#include <utility>
#include <vector>

namespace Nmod_Detail {

/// The objects read from one table, by row id, in the order read. The reader asks for
/// rows by increasing id, so the ids need no hash table: rows numbered 1, 2, 3, ... (as
/// every writer numbers them) are found at their offset, any other numbering by search.
template <class Object> class RowsById {
public:
    void Add(long long id, Object* object) { m_rows.emplace_back(id, object); }

    /// The last row read under `id` (a table without a unique id may repeat one), or
    /// null when no row has it.
    Object* Find(long long id) const {
        if (m_rows.empty()) {
            return nullptr;
        }
        // Unsigned, so that ids far apart wrap instead of overflowing.
        const auto offset =
            static_cast<std::uint64_t>(id) - static_cast<std::uint64_t>(m_rows.front().first);
        if (offset < m_rows.size() && m_rows[offset].first == id &&
            (offset + 1 == m_rows.size() || m_rows[offset + 1].first != id)) {
            return m_rows[offset].second;
        }
        const auto after =
            std::upper_bound(m_rows.begin(), m_rows.end(), id,
                             [](long long wanted, const std::pair<long long, Object*>& row) {
                                 return wanted < row.first;
                             });
        if (after == m_rows.begin() || std::prev(after)->first != id) {
            return nullptr;
        }
        return std::prev(after)->second;
    }

    /// The object of the `entry`th row read.
    Object* At(std::size_t entry) const { return m_rows[entry].second; }
    std::size_t Size() const { return m_rows.size(); }

private:
    std::vector<std::pair<long long, Object*>> m_rows;
};

/// Names already seen, each under an owner row. A slot keeps only a hash and the number
/// of the entry it stands for: the name itself lives once, in the object read, and the
/// caller compares an entry with a name when their hashes meet.
class SeenNames {
public:
    /// Where a name was looked for, to be remembered there if it is new.
    struct Probe {
        std::uint32_t hash = 0;
        std::size_t slot = 0;
    };

    /// Whether an entry for (owner, name) was remembered, `isEntry(entry)` telling
    /// whether that entry has this owner and name. Otherwise `probe` is where Remember
    /// puts it.
    template <class IsEntry>
    bool Contains(long long owner, std::string_view name, IsEntry isEntry, Probe& probe) {
        if ((m_count + 1) * 2 > m_slots.size()) {
            Grow();
        }
        probe.hash = Hash(owner, name);
        const std::size_t mask = m_slots.size() - 1;
        for (std::size_t slot = probe.hash & mask;; slot = (slot + 1) & mask) {
            const Slot& at = m_slots[slot];
            if (at.entry == 0) {
                probe.slot = slot;
                return false;
            }
            if (at.hash == probe.hash && isEntry(at.entry - 1)) {
                return true;
            }
        }
    }

    /// Remembers `entry` where `probe` found no entry, before any other look-up.
    void Remember(const Probe& probe, std::size_t entry) {
        if (entry >= UINT32_MAX) {
            throw std::length_error("more rows in one table than a netlist database holds");
        }
        m_slots[probe.slot] = Slot{probe.hash, static_cast<std::uint32_t>(entry + 1)};
        ++m_count;
    }

private:
    struct Slot {
        std::uint32_t hash;
        std::uint32_t entry; // one more than the entry's number; 0 for a free slot
    };

    static std::uint32_t Hash(long long owner, std::string_view name) {
        std::uint64_t h = std::hash<std::string_view>{}(name) +
                          static_cast<std::uint64_t>(owner) * 0x9E3779B97F4A7C15ULL;
        h ^= h >> 29;
        h *= 0xBF58476D1CE4E5B9ULL;
        return static_cast<std::uint32_t>(h ^ (h >> 32));
    }

    // Half full at most, so that a free slot is always near.
    void Grow() {
        std::vector<Slot> old(std::max<std::size_t>(64, m_slots.size() * 2), Slot{0, 0});
        old.swap(m_slots);
        const std::size_t mask = m_slots.size() - 1;
        for (const Slot& moved : old) {
            if (moved.entry == 0) {
                continue;
            }
            std::size_t slot = moved.hash & mask;
            while (m_slots[slot].entry != 0) {
                slot = (slot + 1) & mask;
            }
            m_slots[slot] = moved;
        }
    }

    std::vector<Slot> m_slots;
    std::size_t m_count = 0;
};

} // namespace Nmod_Detail
