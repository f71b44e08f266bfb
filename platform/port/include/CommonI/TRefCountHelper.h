//===-- CommonI/TRefCountHelper.h - the two counter objects ---------------------===//
//
// \file
// TRefCountHelperBase<T,0> is the counter a self-counted class derives from first: the
// object is its own IRefCount, and the last Release deletes it through its virtual
// destructor.
//
// TRefCountHelper<T,0> is the counter object that lives inside a private implementation
// record. It points at the public object that owns the record (not owning it); the last
// Release deletes that public object, whose destructor frees the record and with it the
// counter itself.
//
// Both start at 1 and decide on destruction from the value their own atomic decrement
// produced.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "CommonI/IRefCount.h"
#include "Port/SafeCount.h"

#include <cassert>
#include <cstdint>

namespace CommonI {

template <class T, int Variant> class TRefCountHelperBase;
template <class T, int Variant> class TRefCountHelper;

template <class T> class TRefCountHelperBase<T, 0> : public IRefCount {
public:
    /// AddRef's this object.
    std::int64_t AddRef() override {
        Port::SafeIncr(m_IRefCount);
        return 1;
    }
    /// Release's this object; deletes it when this call dropped the last reference.
    std::int64_t Release() override {
        const int left = Port::SafeDecr(m_IRefCount);
        assert(left >= 0 && "Release of an object whose count is already zero");
        if (left == 0) {
            delete this;
        }
        return 1;
    }
    std::int64_t GetRefCount(int& count) override {
        count = Port::SafeRead(m_IRefCount);
        return 1;
    }

protected:
    TRefCountHelperBase() = default;
    TRefCountHelperBase(const TRefCountHelperBase&) : IRefCount() {}
    TRefCountHelperBase& operator=(const TRefCountHelperBase&) { return *this; }
    ~TRefCountHelperBase() override = default;

    int m_IRefCount = 1;
};

template <class T> class TRefCountHelper<T, 0> final : public IRefCount {
public:
    explicit TRefCountHelper(T* owner) : m_owner(owner) {}
    TRefCountHelper(const TRefCountHelper&) = delete;
    TRefCountHelper& operator=(const TRefCountHelper&) = delete;
    ~TRefCountHelper() override = default;

    /// IRefCount answers this counter; anything else is the owner's question.
    CitI::IInterface* GetInterface(const Port::XUID& id) override {
        if (id == IID_IRefCount) {
            return this;
        }
        return m_owner != nullptr ? m_owner->GetInterface(id) : nullptr;
    }
    /// AddRef's the owner.
    std::int64_t AddRef() override {
        Port::SafeIncr(m_IRefCount);
        return 1;
    }
    /// Release's the owner; deletes the owner (and so this counter) on the last reference.
    std::int64_t Release() override {
        const int left = Port::SafeDecr(m_IRefCount);
        assert(left >= 0 && "Release of an object whose count is already zero");
        if (left == 0) {
            T* owner = m_owner; // `this` dies with the owner: read nothing after the delete
            delete owner;
        }
        return 1;
    }
    std::int64_t GetRefCount(int& count) override {
        count = Port::SafeRead(m_IRefCount);
        return 1;
    }

    T* GetOwner() const { return m_owner; }

private:
    int m_IRefCount = 1;
    T* m_owner;
};

} // namespace CommonI
