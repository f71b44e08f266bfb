//===-- tests/PointerIndexTest.cpp - colliding and wrapping runs of addresses stay reachable -===//
//
// The managers' address index on its own: keys are chosen by their home slot, so runs of
// colliding keys, and runs that wrap from the table's last slot to its first, are built
// on purpose rather than hoped for among a million addresses.
//
//===------------------------------------------------------------------------------===//
#include "s/internal/PointerIndex.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <filesystem>
#include <fstream>
#include <map>
#include <random>
#include <sstream>
#include <string>
#include <vector>

namespace {

using Index = Vn::Eng::detail::PointerIndex<int, Vn::Eng::detail::KeyedSlot<int, int>>;
constexpr std::size_t kCapacity = 64; // reserved by each test; it holds up to 48 keys

// The value stored for key, added as 0 when absent.
int& FindOrAdd(Index& index, const int* key) {
    if (auto* slot = index.Find(key)) {
        return slot->value;
    }
    auto& slot = index.Add(key);
    slot.key = key;
    return slot.value;
}

void Erase(Index& index, const int* key) {
    auto* slot = index.Find(key);
    ASSERT_NE(slot, nullptr);
    index.Erase(slot);
}

// Addresses of a pool, filed by the home slot the index computes for them.
class KeysByHome {
public:
    KeysByHome() : m_pool(1 << 14), m_byHome(kCapacity) {
        for (const int& x : m_pool) {
            m_byHome[Index::HomeIn(&x, kCapacity)].push_back(&x);
        }
    }
    /// A key not handed out before whose home is home.
    const int* Take(std::size_t home) {
        std::vector<const int*>& keys = m_byHome[home];
        EXPECT_FALSE(keys.empty()) << "no key left with home " << home;
        if (keys.empty()) {
            return nullptr;
        }
        const int* key = keys.back();
        keys.pop_back();
        return key;
    }

private:
    std::vector<int> m_pool;
    std::vector<std::vector<const int*>> m_byHome;
};

// Every key of the model is found with its value; every key of gone is not found.
void ExpectHolds(Index& index, const std::map<const int*, int>& model,
                 const std::vector<const int*>& gone) {
    ASSERT_EQ(index.Capacity(), kCapacity) << "the table grew: collisions were not tested";
    for (const auto& [key, value] : model) {
        const auto* found = index.Find(key);
        ASSERT_NE(found, nullptr) << "key " << key << " with home " << Index::HomeIn(key, kCapacity)
                                  << " is unreachable";
        EXPECT_EQ(found->value, value);
    }
    for (const int* key : gone) {
        EXPECT_EQ(index.Find(key), nullptr) << "erased key " << key << " is still found";
    }
}

// Adds keys with the given homes, in order, valued 1, 2, 3, ...
std::vector<const int*> AddWithHomes(Index& index, KeysByHome& keys,
                                     std::map<const int*, int>& model,
                                     const std::vector<std::size_t>& homes) {
    std::vector<const int*> added;
    for (std::size_t home : homes) {
        const int* key = keys.Take(home);
        const int value = static_cast<int>(model.size()) + 1;
        FindOrAdd(index, key) = value;
        model[key] = value;
        added.push_back(key);
    }
    return added;
}

} // namespace

TEST(PointerIndex, StartsEmptyAndAddsEachKeyOnce) {
    KeysByHome keys;
    Index index;
    EXPECT_EQ(index.Capacity(), 0u);
    const int* a = keys.Take(5);
    EXPECT_EQ(index.Find(a), nullptr);
    FindOrAdd(index, a) = 7;
    EXPECT_EQ(index.Capacity(), 2u);
    FindOrAdd(index, a) += 1; // found, not added again
    ASSERT_NE(index.Find(a), nullptr);
    EXPECT_EQ(index.Find(a)->value, 8);
    EXPECT_EQ(index.Size(), 1u);
    Erase(index, a);
    EXPECT_EQ(index.Find(a), nullptr);
    FindOrAdd(index, a) = 1;
    index.Clear();
    EXPECT_EQ(index.Find(a), nullptr);
    EXPECT_EQ(index.Bytes(), 0u);
}

// The table's bytes per key stay within 8/3 of a slot at every size it passes through, so
// a manager's index costs a bounded number of bytes per listed item however many there
// are; and every key stays reachable across the growths.
TEST(PointerIndex, StaysBetweenThreeEighthsAndThreeQuartersFullAsItGrows) {
    std::vector<int> pool(5000);
    Index index;
    for (std::size_t n = 1; n <= pool.size(); ++n) {
        FindOrAdd(index, &pool[n - 1]) = static_cast<int>(n);
        ASSERT_LE(index.Capacity() * 3, n * 8) << "too sparse at " << n << " keys";
        ASSERT_LE(n * 4, index.Capacity() * 3) << "too full at " << n << " keys";
    }
    for (std::size_t i = 0; i < pool.size(); ++i) {
        ASSERT_NE(index.Find(&pool[i]), nullptr) << i;
        EXPECT_EQ(index.Find(&pool[i])->value, static_cast<int>(i + 1));
    }
}

TEST(PointerIndex, ErasingFromARunMovesLaterKeysBackButNotBeforeTheirHomes) {
    KeysByHome keys;
    Index index;
    index.Reserve(kCapacity);
    std::map<const int*, int> model;
    // Slots 10 to 14: a, b, c (home 10), d (home 11), e (home 13). Erasing a must move
    // b, c and d back one slot each, while e may move only as far as its home.
    const auto k = AddWithHomes(index, keys, model, {10, 10, 10, 11, 13, 20});
    std::vector<const int*> gone;
    for (const int* erased : {k[0], k[2], k[1], k[4], k[3], k[5]}) {
        Erase(index, erased);
        model.erase(erased);
        gone.push_back(erased);
        SCOPED_TRACE(gone.size());
        ExpectHolds(index, model, gone);
    }
}

TEST(PointerIndex, RunsWrapFromTheLastSlotToTheFirst) {
    KeysByHome keys;
    Index index;
    index.Reserve(kCapacity);
    std::map<const int*, int> model;
    // Slots 62 to 4 across the end: a (home 62), b (63), c (0), d and e (62), f (2),
    // g (4). Erasing a leaves b and c at their homes, on both sides of the end, and brings
    // d and e back across it; f moves back to its home, g stays.
    const auto k = AddWithHomes(index, keys, model, {62, 63, 0, 62, 62, 2, 4});
    std::vector<const int*> gone;
    for (const int* erased : {k[0], k[3], k[1], k[5], k[2], k[4], k[6]}) {
        Erase(index, erased);
        model.erase(erased);
        gone.push_back(erased);
        SCOPED_TRACE(gone.size());
        ExpectHolds(index, model, gone);
    }
}

TEST(PointerIndex, RandomChurnAroundTheWrapKeepsEveryKeyReachable) {
    KeysByHome keys;
    const std::vector<std::size_t> homes{60, 61, 62, 63, 0, 1, 2, 3};
    std::vector<const int*> candidates; // 3 per home: up to 24 keys, the table stays 64
    for (std::size_t home : homes) {
        for (int i = 0; i < 3; ++i) {
            candidates.push_back(keys.Take(home));
        }
    }
    std::mt19937 random(1234);
    for (int round = 0; round < 200; ++round) {
        SCOPED_TRACE(round);
        Index index;
        index.Reserve(kCapacity);
        std::map<const int*, int> model;
        std::vector<const int*> order = candidates;
        std::shuffle(order.begin(), order.end(), random);
        for (const int* key : order) {
            const int value = static_cast<int>(model.size()) + 100;
            FindOrAdd(index, key) = value;
            model[key] = value;
        }
        std::shuffle(order.begin(), order.end(), random);
        std::vector<const int*> gone;
        for (std::size_t i = 0; i < order.size(); ++i) {
            Erase(index, order[i]);
            model.erase(order[i]);
            gone.push_back(order[i]);
            ExpectHolds(index, model, gone);
            if (HasFatalFailure()) {
                return;
            }
            // Now and then a key comes back, into whatever the shifts left.
            if (i % 5 == 4) {
                const int* back = gone[gone.size() / 2];
                gone.erase(gone.begin() + static_cast<std::ptrdiff_t>(gone.size() / 2));
                FindOrAdd(index, back) = -1;
                model[back] = -1;
                order.push_back(back);
                ExpectHolds(index, model, gone);
            }
        }
        EXPECT_TRUE(model.empty());
    }
}

namespace {

// The VmFlags line of the mapping that holds address, as the kernel reports it; empty
// when there is none.
std::string VmFlagsOf(const void* address) {
    const auto at = reinterpret_cast<std::uintptr_t>(address);
    std::ifstream smaps("/proc/self/smaps");
    std::string line;
    bool inside = false;
    while (std::getline(smaps, line)) {
        std::uintptr_t low = 0;
        std::uintptr_t high = 0;
        char dash = 0;
        std::istringstream range(line);
        if (range >> std::hex >> low >> dash >> high && dash == '-' &&
            line.find(':') > line.find(' ')) {
            inside = low <= at && at < high;
        } else if (inside && line.rfind("VmFlags:", 0) == 0) {
            return line;
        }
    }
    return {};
}

} // namespace

// A table of many megabytes is probed at random: it asks for huge pages before its first
// touch, and still starts with every slot empty.
TEST(PointerIndexTable, LargeTableIsAdvisedForHugePagesAndStartsEmpty) {
    using Slot = Vn::Eng::detail::KeyedSlot<int, int>;
    constexpr std::size_t kSlots = std::size_t{1} << 20; // 16 MiB
    Vn::Eng::detail::SlotTable<Slot> table(kSlots);
    ASSERT_EQ(table.size(), kSlots);
    EXPECT_TRUE(std::all_of(table.begin(), table.end(), [](const Slot& s) { return s.Empty(); }));

    if (!std::filesystem::exists("/sys/kernel/mm/transparent_hugepage/enabled")) {
        GTEST_SKIP() << "this kernel has no transparent huge pages";
    }
    constexpr std::uintptr_t kHuge = std::uintptr_t{1} << 21;
    const auto first = reinterpret_cast<std::uintptr_t>(table.data());
    // NOLINTNEXTLINE(performance-no-int-to-ptr): an address to look up, never dereferenced
    const void* interior = reinterpret_cast<const void*>((first + kHuge - 1) & ~(kHuge - 1));
    const std::string flags = VmFlagsOf(interior);
    ASSERT_FALSE(flags.empty()) << "no mapping found for the table in /proc/self/smaps";
    EXPECT_NE((flags + " ").find(" hg "), std::string::npos) << flags;
}
