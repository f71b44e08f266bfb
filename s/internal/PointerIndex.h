//===-- s/internal/PointerIndex.h - a flat hash table keyed by object address ---===//
//
// The managers' indexes map an item's address to where it stands in their lists. At a
// million items a node-based map costs a bucket, a node and whatever the node points to
// on every removal; here one probe finds the slot in the table itself. Linear probing
// with backward-shift deletion keeps the table free of tombstones however many items
// come and go.
//
// The slot type decides what a slot holds. A manager's slot need not hold the key: the
// list node a slot points to already holds the item's address, so the slot keeps a
// short tag of the key's hash beside the node, and the node is read only when the tag
// matches. Slots are plain values (the table moves them bit for bit); a slot must have
// these members:
//
//   bool Empty() const;                              // a value-initialised slot is empty
//   const Key* KeyOf() const;                        // for a slot that is not empty
//   bool Holds(const Key* key, std::uint64_t hash) const;
//
// The table is kept between 3/8 and 3/4 full (from its first key until it is cleared;
// removals never shrink it, so that a removal never allocates), which bounds its bytes
// per key by 8/3 of a slot's size.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include <bit>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <type_traits>
#include <utility>

#include <sys/mman.h>

namespace Vn::Eng::detail {

/// A slot holding the key itself beside a value.
template <class Key, class Value> struct KeyedSlot {
    const Key* key = nullptr;
    Value value{};

    bool Empty() const { return key == nullptr; }
    const Key* KeyOf() const { return key; }
    bool Holds(const Key* k, std::uint64_t) const { return key == k; }
};

/// Asks for the whole 2 MiB pages inside [data, data + bytes) to be backed by huge pages,
/// which only helps before they are first touched. A large table is probed at random: with
/// 4 KiB pages nearly every probe of a first selection at a million items pays a page fault
/// or a TLB miss (the machines we run on leave huge pages to those who ask). Only the
/// interior is advised, so the table still comes from the ordinary operator new, counted and
/// failing as every other allocation does; at worst its first and last 2 MiB stay in small
/// pages.
inline void AdviseHugePages(void* data, std::size_t bytes) {
#ifdef MADV_HUGEPAGE
    constexpr std::uintptr_t kHuge = std::uintptr_t{1} << 21;
    const auto first = reinterpret_cast<std::uintptr_t>(data);
    const std::uintptr_t begin = (first + kHuge - 1) & ~(kHuge - 1);
    const std::uintptr_t end = (first + bytes) & ~(kHuge - 1);
    if (begin < end) {
        // Only a hint: refused, the table works the same in small pages.
        ::madvise(reinterpret_cast<void*>(begin), end - begin, MADV_HUGEPAGE);
    }
#else
    (void)data;
    (void)bytes;
#endif
}

/// A fixed run of value-initialised slots; unlike a vector it can advise its memory
/// between allocating and first writing it.
template <class Slot> class SlotTable {
public:
    SlotTable() = default;
    explicit SlotTable(std::size_t count)
        : m_slots(std::allocator<Slot>().allocate(count)), m_count(count) {
        AdviseHugePages(m_slots, count * sizeof(Slot));
        std::uninitialized_value_construct_n(m_slots, count);
    }
    ~SlotTable() {
        if (m_slots != nullptr) {
            std::allocator<Slot>().deallocate(m_slots, m_count);
        }
    }
    SlotTable(const SlotTable&) = delete;
    SlotTable& operator=(const SlotTable&) = delete;
    void swap(SlotTable& other) noexcept {
        std::swap(m_slots, other.m_slots);
        std::swap(m_count, other.m_count);
    }

    Slot& operator[](std::size_t i) { return m_slots[i]; }
    Slot* data() { return m_slots; }
    const Slot* data() const { return m_slots; }
    Slot* begin() { return m_slots; }
    Slot* end() { return m_slots + m_count; }
    std::size_t size() const { return m_count; }
    bool empty() const { return m_count == 0; }

private:
    // Slots are moved bit for bit and never destroyed one by one.
    static_assert(std::is_trivially_copyable_v<Slot> && std::is_trivially_destructible_v<Slot>);

    Slot* m_slots = nullptr;
    std::size_t m_count = 0;
};

template <class Key, class Slot> class PointerIndex {
public:
    /// The 64-bit mix of key's address: its bits 20 and up choose the home slot, its top
    /// bits are free for a slot's tag.
    static std::uint64_t Hash(const Key* key) {
        // Addresses are aligned and allocated in runs: a multiplicative mix spreads them.
        const auto bits = static_cast<std::uint64_t>(reinterpret_cast<std::uintptr_t>(key));
        return bits * 0x9E3779B97F4A7C15ull;
    }

    /// Starts fetching the slot where probing for key begins, so that a caller with other
    /// work to do first (allocating list nodes) need not wait for it afterwards: in a
    /// table far larger than the caches that slot is a miss on nearly every call.
    void Prefetch(const Key* key) const {
        if (!m_slots.empty()) {
            __builtin_prefetch(m_slots.data() + HomeOf(Hash(key)), 1);
        }
    }

    /// The slot holding key, or null.
    Slot* Find(const Key* key) {
        if (m_size == 0) {
            return nullptr;
        }
        const std::uint64_t hash = Hash(key);
        for (std::size_t i = HomeOf(hash);; i = (i + 1) & Mask()) {
            Slot& slot = m_slots[i];
            if (slot.Empty()) {
                return nullptr;
            }
            if (slot.Holds(key, hash)) {
                return &slot;
            }
        }
    }

    /// An empty slot for key, which must be absent; the caller fills it for key before
    /// the next call. Only growing the table can fail, and then nothing has changed.
    Slot& Add(const Key* key) {
        if ((m_size + 1) * 4 > m_slots.size() * 3) {
            Rehash(m_slots.empty() ? 2 : m_slots.size() * 2);
        }
        std::size_t i = HomeOf(Hash(key));
        while (!m_slots[i].Empty()) {
            i = (i + 1) & Mask();
        }
        ++m_size;
        return m_slots[i];
    }

    /// Empties slot (one of this table's), shifting later members of its probe run back
    /// so that no search ever needs a tombstone.
    void Erase(Slot* slot) {
        auto hole = static_cast<std::size_t>(slot - m_slots.data());
        for (std::size_t next = (hole + 1) & Mask(); !m_slots[next].Empty();
             next = (next + 1) & Mask()) {
            const std::size_t home = HomeOf(Hash(m_slots[next].KeyOf()));
            // Move `next` into the hole unless its home lies cyclically in (hole, next].
            const bool stays =
                hole <= next ? (hole < home && home <= next) : (hole < home || home <= next);
            if (!stays) {
                m_slots[hole] = m_slots[next];
                hole = next;
            }
        }
        m_slots[hole] = Slot();
        --m_size;
    }

    void Clear() {
        SlotTable<Slot>().swap(m_slots);
        m_size = 0;
    }

    /// Makes room for at least capacity slots (rounded up to a power of two) now.
    void Reserve(std::size_t capacity) {
        std::size_t wanted = 2;
        while (wanted < capacity) {
            wanted *= 2;
        }
        if (wanted > m_slots.size()) {
            Rehash(wanted);
        }
    }

    template <class F> void ForEach(F&& f) {
        for (Slot& slot : m_slots) {
            if (!slot.Empty()) {
                f(slot);
            }
        }
    }

    std::size_t Size() const { return m_size; }
    /// The number of slots: 0 before the first key, then 2, doubling whenever a key
    /// would make the table more than 3/4 full.
    std::size_t Capacity() const { return m_slots.size(); }
    std::size_t Bytes() const { return m_slots.size() * sizeof(Slot); }
    /// The slot where probing for key begins in a table of capacity slots (a power of
    /// two), so that tests can choose keys that collide.
    static std::size_t HomeIn(const Key* key, std::size_t capacity) {
        return static_cast<std::size_t>(Hash(key) >> 20) & (capacity - 1);
    }

private:
    std::size_t Mask() const { return m_slots.size() - 1; }
    std::size_t HomeOf(std::uint64_t hash) const {
        return static_cast<std::size_t>(hash >> 20) & Mask();
    }

    void Rehash(std::size_t capacity) {
        SlotTable<Slot> old(capacity);
        old.swap(m_slots);
        // A slot may have to read its key from memory of its own (a manager's list node),
        // a miss in a large table. The keys of a batch are read before any is placed, so
        // their misses overlap instead of each waiting behind the last one's probing.
        constexpr std::size_t kBatch = 16;
        Slot* batch[kBatch];
        const Key* keys[kBatch];
        std::size_t n = 0;
        const auto place = [&] {
            for (std::size_t k = 0; k < n; ++k) {
                keys[k] = batch[k]->KeyOf();
            }
            for (std::size_t k = 0; k < n; ++k) {
                std::size_t i = HomeOf(Hash(keys[k]));
                while (!m_slots[i].Empty()) {
                    i = (i + 1) & Mask();
                }
                m_slots[i] = *batch[k];
            }
            n = 0;
        };
        for (Slot& slot : old) {
            if (!slot.Empty()) {
                batch[n++] = &slot;
                if (n == kBatch) {
                    place();
                }
            }
        }
        place();
    }

    SlotTable<Slot> m_slots; // a power of two long, at most 3/4 full
    std::size_t m_size = 0;
};

/// The bits of a std::list iterator, so that a slot can pack one with a tag: iterators
/// of the standard libraries this builds with are one node pointer, aligned to at least
/// eight bytes, and valid user-space addresses use the low 48 bits.
template <class Iterator> struct IteratorBits {
    static_assert(sizeof(Iterator) == sizeof(std::uint64_t), "a list iterator is one pointer");
    static constexpr std::uint64_t kAddress = (std::uint64_t{1} << 48) - 8;

    static_assert(std::is_trivially_copyable_v<Iterator>);

    static std::uint64_t Of(Iterator it) { return std::bit_cast<std::uint64_t>(it); }
    /// True when it can be packed: its bits outside kAddress are zero.
    static bool Packs(Iterator it) { return (Of(it) & ~kAddress) == 0; }
    static Iterator From(std::uint64_t bits) { return std::bit_cast<Iterator>(bits & kAddress); }
};

} // namespace Vn::Eng::detail
