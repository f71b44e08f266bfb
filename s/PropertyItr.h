//===-- s/PropertyItr.h - walks one holder's property slots ---------------------===//
//
// \file
// The iterator PropertyHolder::GetProperties hands out. It reads the holder's slot
// vector in place and yields the occupied slots in slot order, skipping hidden
// properties unless told to show them. Its position is a slot number, not a vector
// iterator, so a holder that grows its slots while an iterator is out never leaves that
// iterator dangling; the holder itself must outlive it.
//
//   auto it = holder.GetProperties();          // count 1, standing on slot 0
//   for (it->First(); !it->IsEnd(); it->Next()) { use(it->CurrentItem()); }
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "VnI/IPropertyHolder.h"
#include "s/Export.h"

#include <cstddef>
#include <cstdint>
#include <initializer_list>
#include <new>
#include <utility>

namespace Vn::Eng {

/// A holder's slots: a growable array of counted properties. Sixteen bytes where a
/// std::vector takes twenty-four, since every holder carries one and a holder's count and
/// capacity never need more than 32 bits. Slots past the size are kept null, so growing
/// the size never has to construct anything.
class PropertySlots {
public:
    using Slot = CommonI::RefCountPtr<VnI::IProperty>;

    PropertySlots() = default;
    PropertySlots(std::initializer_list<Slot> slots) {
        reserve(slots.size());
        for (const Slot& slot : slots) {
            m_slots[m_size++] = slot;
        }
    }
    ~PropertySlots() {
        for (std::uint32_t i = 0; i < m_capacity; ++i) {
            m_slots[i].~Slot();
        }
        ::operator delete(m_slots);
    }
    PropertySlots(const PropertySlots&) = delete;
    PropertySlots& operator=(const PropertySlots&) = delete;

    std::size_t size() const { return m_size; }
    std::size_t capacity() const { return m_capacity; }
    Slot& operator[](std::size_t i) { return m_slots[i]; }
    const Slot& operator[](std::size_t i) const { return m_slots[i]; }

    /// Room for n slots; throws std::bad_alloc and changes nothing when it cannot grow.
    void reserve(std::size_t n) {
        if (n <= m_capacity) {
            return;
        }
        auto* grown = static_cast<Slot*>(::operator new(n * sizeof(Slot)));
        for (std::size_t i = 0; i < n; ++i) {
            new (grown + i) Slot(i < m_capacity ? std::move(m_slots[i]) : Slot());
        }
        for (std::uint32_t i = 0; i < m_capacity; ++i) {
            m_slots[i].~Slot();
        }
        ::operator delete(m_slots);
        m_slots = grown;
        m_capacity = static_cast<std::uint32_t>(n);
    }
    /// Lengthens to n null slots; n must not exceed the capacity, and slots never shrink.
    void resize(std::size_t n) { m_size = static_cast<std::uint32_t>(n); }

private:
    Slot* m_slots = nullptr;
    std::uint32_t m_size = 0;
    std::uint32_t m_capacity = 0;
};

namespace PropertyItrImp {
struct Record;
}

class VENLOMER_API PropertyItr : public VnI::IPropertyItr {
public:
    using Slots = PropertySlots;

    /// A new iterator (count 1, adopted by the result) on `slots`, standing on slot 0.
    /// `slots` is not owned; a null vector gives an iterator that is always at its end.
    static CommonI::RefCountPtr<VnI::IPropertyItr> CreateInstance(const Slots* slots,
                                                                  bool shouldShowInvisible);

    PropertyItr(const Slots* slots, bool shouldShowInvisible);
    ~PropertyItr() override;
    PropertyItr(const PropertyItr&) = delete;
    PropertyItr& operator=(const PropertyItr&) = delete;

    /// VnI::IPropertyItr and CitI::IInterface give the iterator, CommonI::IRefCount its
    /// counter object; anything else null.
    CitI::IInterface* GetInterface(const Port::XUID& id) override;
    /// The property at the position (one new reference); null at the end.
    CommonI::RefCountPtr<VnI::IProperty> CurrentItem() override;
    /// Moves to the first shown slot. 0 without a vector, else 1.
    std::int64_t First() override;
    /// Moves to the next shown slot. 0 when already at the end, else 1.
    std::int64_t Next() override;
    bool IsEnd() const override;

private:
    PropertyItrImp::Record* m_imp;
};

} // namespace Vn::Eng
