//===-- CommonI/RefCountPtr.h - the counted pointer of every interface ----------===//
//
// \file
// RefCountPtr<T> holds one reference on the object behind a T*. Counting goes through
// the object's CommonI::IRefCount, found with GetInterface, so any interface of a counted
// object can be held. An object that answers no IRefCount (an uncounted object such as a
// name list) is held without counting and never released.
//
//   auto p = RefCountPtr<IFoo>::Adopt(raw);   // takes over the one reference raw carries
//   RefCountPtr<IFoo> q(raw);                 // AddRef's: raw now has one more reference
//   q = p;                                    // AddRef's p's object, Release's q's old one
//   p.Reset();                                // Release's; p is null
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "CommonI/IRefCount.h"

#include <cstddef>
#include <type_traits>
#include <utility>

namespace CommonI {

namespace detail {
template <class T> IRefCount* CounterOf(T* p) {
    if (p == nullptr) {
        return nullptr;
    }
    auto* mutableP = const_cast<std::remove_const_t<T>*>(p);
    if constexpr (std::is_convertible_v<std::remove_const_t<T>*, IRefCount*>) {
        // A self-counted class is its own counter; asking through CitI::IInterface would
        // be ambiguous there, as such a class reaches it through two bases.
        return mutableP;
    } else {
        auto* base = static_cast<CitI::IInterface*>(mutableP);
        return static_cast<IRefCount*>(base->GetInterface(IID_IRefCount));
    }
}
} // namespace detail

template <class T> class RefCountPtr {
public:
    using element_type = T;

    RefCountPtr() noexcept = default;
    RefCountPtr(std::nullptr_t) noexcept {} // NOLINT(google-explicit-constructor)
    /// AddRef's p.
    explicit RefCountPtr(T* p) : m_ptr(p) { AddRefHeld(); }
    /// Takes over the reference p carries; does not AddRef.
    static RefCountPtr Adopt(T* p) noexcept {
        RefCountPtr r;
        r.m_ptr = p;
        return r;
    }

    RefCountPtr(const RefCountPtr& other) : m_ptr(other.m_ptr) { AddRefHeld(); }
    RefCountPtr(RefCountPtr&& other) noexcept : m_ptr(std::exchange(other.m_ptr, nullptr)) {}
    template <class U, class = std::enable_if_t<std::is_convertible_v<U*, T*>>>
    RefCountPtr(const RefCountPtr<U>& other) // NOLINT(google-explicit-constructor)
        : m_ptr(other.Get()) {
        AddRefHeld();
    }
    template <class U, class = std::enable_if_t<std::is_convertible_v<U*, T*>>>
    RefCountPtr(RefCountPtr<U>&& other) noexcept // NOLINT(google-explicit-constructor)
        : m_ptr(other.Detach()) {}

    ~RefCountPtr() { Reset(); }

    RefCountPtr& operator=(const RefCountPtr& other) {
        RefCountPtr(other).Swap(*this);
        return *this;
    }
    RefCountPtr& operator=(RefCountPtr&& other) noexcept {
        RefCountPtr(std::move(other)).Swap(*this);
        return *this;
    }
    RefCountPtr& operator=(std::nullptr_t) {
        Reset();
        return *this;
    }

    /// Release's the held object (if it counts) and becomes null.
    void Reset() {
        T* old = std::exchange(m_ptr, nullptr);
        if (IRefCount* counter = detail::CounterOf(old)) {
            counter->Release();
        }
    }
    /// Gives up the held reference without Release'ing it.
    T* Detach() noexcept { return std::exchange(m_ptr, nullptr); }
    void Swap(RefCountPtr& other) noexcept { std::swap(m_ptr, other.m_ptr); }

    T* Get() const noexcept { return m_ptr; }
    T* operator->() const noexcept { return m_ptr; }
    T& operator*() const noexcept { return *m_ptr; }
    explicit operator bool() const noexcept { return m_ptr != nullptr; }

    friend bool operator==(const RefCountPtr& a, const RefCountPtr& b) {
        return a.m_ptr == b.m_ptr;
    }
    friend bool operator==(const RefCountPtr& a, std::nullptr_t) { return a.m_ptr == nullptr; }

private:
    void AddRefHeld() {
        if (IRefCount* counter = detail::CounterOf(m_ptr)) {
            counter->AddRef();
        }
    }

    T* m_ptr = nullptr;
};

/// Asks p for interface I (found by I::kIID) and returns it with one new reference, or null.
template <class I, class T> RefCountPtr<I> QueryInterface(T* p) {
    if (p == nullptr) {
        return nullptr;
    }
    auto* base = static_cast<CitI::IInterface*>(const_cast<std::remove_const_t<T>*>(p));
    return RefCountPtr<I>(static_cast<I*>(base->GetInterface(I::kIID)));
}

} // namespace CommonI
