//===-- s/internal/Spill.h - the entries of a key that stands more than once ----===//
//
// \file
// The managers keep one entry per time a holder or resource is listed. Nearly always
// there is one, and it is packed into the address index's slot itself; a key listed
// again moves to a Spill, which keeps its oldest entry inline and queues the later ones
// behind it. Both managers take entries back oldest first (and the selection also the
// newest, when a failed call unwinds), so the queue is a deque: no end costs a shift.
//
//   auto box = std::make_unique<Spill<Key, Entry>>(key, slot.Only());
//   box->Append(entry);               // may throw; the box is then as it was
//   slot.SetBox(box.release());
//
//===------------------------------------------------------------------------------===//
#pragma once

#include <cstddef>
#include <deque>
#include <utility>

namespace Vn::Eng::detail {

template <class Key, class Entry> class Spill {
public:
    Spill(Key* key, Entry oldest) : m_key(key), m_oldest(std::move(oldest)) {}

    /// The key whose entries these are (not owned).
    Key* GetKey() const { return m_key; }
    std::size_t Size() const { return 1 + m_later.size(); }
    Entry& Oldest() { return m_oldest; }
    Entry& Newest() { return m_later.empty() ? m_oldest : m_later.back(); }

    /// Adds the newest entry. Strong guarantee: a failed allocation changes nothing.
    void Append(Entry entry) { m_later.push_back(std::move(entry)); }
    /// Drops the oldest entry; false when it was the last one (the Spill is then spent,
    /// and its owner frees it).
    bool DropOldest() {
        if (m_later.empty()) {
            return false;
        }
        m_oldest = std::move(m_later.front());
        m_later.pop_front();
        return true;
    }
    /// Drops the newest entry; false when it was the last one.
    bool DropNewest() {
        if (m_later.empty()) {
            return false;
        }
        m_later.pop_back();
        return true;
    }
    /// Drops entries from the oldest on while `spent(entry)` holds; false when none is
    /// left.
    template <class Spent> bool DropOldestWhile(Spent&& spent) {
        while (spent(m_oldest)) {
            if (!DropOldest()) {
                return false;
            }
        }
        return true;
    }
    /// Calls f on every entry, oldest first.
    template <class F> void ForEach(F&& f) {
        f(m_oldest);
        for (Entry& entry : m_later) {
            f(entry);
        }
    }

private:
    Key* m_key;
    Entry m_oldest;
    std::deque<Entry> m_later; // oldest first
};

} // namespace Vn::Eng::detail
