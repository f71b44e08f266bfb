//===-- s/internal/PointerIndex.h - a flat hash table keyed by object address ---===//
//
// The managers' indexes map an item's address to where it stands in their lists. At a
// million items a node-based map costs a bucket, a node and whatever the node points to
// on every removal; here one probe finds the value in the table itself. Linear probing
// with backward-shift deletion keeps the table free of tombstones however many items
// come and go.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include <cstddef>
#include <cstdint>
#include <utility>
#include <vector>

namespace Vn::Eng::detail {

template <class Key, class Value> class PointerIndex {
public:
    /// The value stored for key, or null.
    Value* Find(const Key* key) {
        if (m_size == 0) {
            return nullptr;
        }
        for (std::size_t i = Home(key);; i = (i + 1) & Mask()) {
            Slot& slot = m_slots[i];
            if (slot.key == key) {
                return &slot.value;
            }
            if (slot.key == nullptr) {
                return nullptr;
            }
        }
    }

    /// The value stored for key, default-constructed when key was absent.
    Value& FindOrAdd(const Key* key) {
        if ((m_size + 1) * 2 > m_slots.size()) {
            Rehash(m_slots.empty() ? 64 : m_slots.size() * 2);
        }
        std::size_t i = Home(key);
        for (; m_slots[i].key != nullptr; i = (i + 1) & Mask()) {
            if (m_slots[i].key == key) {
                return m_slots[i].value;
            }
        }
        m_slots[i].key = key;
        m_slots[i].value = Value();
        ++m_size;
        return m_slots[i].value;
    }

    /// Removes key (which must be present), shifting later members of its probe run back
    /// so that no search ever needs a tombstone.
    void Erase(const Key* key) {
        std::size_t hole = Home(key);
        while (m_slots[hole].key != key) {
            hole = (hole + 1) & Mask();
        }
        for (std::size_t next = (hole + 1) & Mask(); m_slots[next].key != nullptr;
             next = (next + 1) & Mask()) {
            const std::size_t home = Home(m_slots[next].key);
            // Move `next` into the hole unless its home lies cyclically in (hole, next].
            const bool stays =
                hole <= next ? (hole < home && home <= next) : (hole < home || home <= next);
            if (!stays) {
                m_slots[hole] = std::move(m_slots[next]);
                hole = next;
            }
        }
        m_slots[hole].key = nullptr;
        m_slots[hole].value = Value();
        --m_size;
    }

    void Clear() {
        m_slots.clear();
        m_size = 0;
    }

    /// The number of slots: 0 before the first key, then 64, doubling whenever a key
    /// would make the table more than half full.
    std::size_t Capacity() const { return m_slots.size(); }
    /// The slot where probing for key begins in a table of capacity slots (a power of
    /// two), so that tests can choose keys that collide.
    static std::size_t HomeIn(const Key* key, std::size_t capacity) {
        // Addresses are aligned and allocated in runs: a multiplicative mix spreads them.
        const auto bits = static_cast<std::uint64_t>(reinterpret_cast<std::uintptr_t>(key));
        return static_cast<std::size_t>((bits * 0x9E3779B97F4A7C15ull) >> 20) & (capacity - 1);
    }

private:
    struct Slot {
        const Key* key = nullptr;
        Value value{};
    };

    std::size_t Mask() const { return m_slots.size() - 1; }
    std::size_t Home(const Key* key) const { return HomeIn(key, m_slots.size()); }

    void Rehash(std::size_t capacity) {
        std::vector<Slot> old(capacity);
        old.swap(m_slots);
        for (Slot& slot : old) {
            if (slot.key != nullptr) {
                std::size_t i = Home(slot.key);
                while (m_slots[i].key != nullptr) {
                    i = (i + 1) & Mask();
                }
                m_slots[i] = std::move(slot);
            }
        }
    }

    std::vector<Slot> m_slots; // a power of two long, at most half full
    std::size_t m_size = 0;
};

} // namespace Vn::Eng::detail
