//===-- hostproj/Prjrep.h - the host repository's counting and iteration -------===//
//
// \file
// Host objects count their references through Prjrep::IRefCount rather than the
// portability layer's CommonI::IRefCount; some older host objects answer only the latter.
// Whoever owns a host object releases it with ReleaseHostObject, which tries both.
//
// Two holders say, at the point of declaration, whether a host pointer is owned:
//
//   Prjrep::AutoRelease<Dpm::IViewType> type;    // owned: released when type dies
//   view->GetViewType(type.Receive());           // the host fills in a new reference
//   Prjrep::AutoCast<Dpm::IDefDataId> id(type);  // borrowed from `type`: never released
//   if (id) { id->GetId(text); }
//
// Slot orders (binary contract with the host, do not reorder):
//   IRefCount: GetInterface, ~, AddRef, Release
//   IIterator: GetInterface, ~, CurrentItem, First, Next, IsEnd
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "CitI/IInterface.h"
#include "CommonI/IRefCount.h"
#include "Port/XUID.h"

#include <cstdint>
#include <utility>

namespace Prjrep {

class VN_INTERFACE IRefCount : public CitI::IInterface {
public:
    static const Port::XUID& IID() {
        static const Port::XUID id("{80b45faf-a340-43e6-b60b-0435fadea5f3}");
        return id;
    }
    /// Adds one reference. Returns 1.
    virtual std::int64_t AddRef() = 0;
    /// Drops one reference; the last one destroys the object. Returns 1.
    virtual std::int64_t Release() = 0;
};

/// A generic iterator whose elements are reached by asking them for an interface.
class VN_INTERFACE IIterator : public CitI::IInterface {
public:
    static const Port::XUID& IID() {
        static const Port::XUID id("{7CE0B9F0-61A2-4f29-9C4F-1D53872FC7B4}");
        return id;
    }
    /// The current element, borrowed (no reference); null at the end.
    virtual CitI::IInterface* CurrentItem() = 0;
    virtual std::int64_t First() = 0;
    virtual std::int64_t Next() = 0;
    virtual bool IsEnd() = 0;
};

/// Drops one reference on a host object: through Prjrep::IRefCount when it answers that,
/// else through CommonI::IRefCount; an object that answers neither is left alone.
inline void ReleaseHostObject(CitI::IInterface* object) {
    if (object == nullptr) {
        return;
    }
    if (auto* counter = static_cast<IRefCount*>(object->GetInterface(IRefCount::IID()))) {
        counter->Release();
    } else if (auto* common =
                   static_cast<CommonI::IRefCount*>(object->GetInterface(CommonI::IID_IRefCount))) {
        common->Release();
    }
}

/// Owns one reference on a host object and releases it (ReleaseHostObject) when it dies.
template <class T> class AutoRelease {
public:
    AutoRelease() = default;
    /// Takes over the reference p carries; does not add one.
    explicit AutoRelease(T* p) : m_ptr(p) {}
    AutoRelease(const AutoRelease&) = delete;
    AutoRelease& operator=(const AutoRelease&) = delete;
    AutoRelease(AutoRelease&& other) noexcept : m_ptr(std::exchange(other.m_ptr, nullptr)) {}
    AutoRelease& operator=(AutoRelease&& other) noexcept {
        if (this != &other) {
            Reset();
            m_ptr = std::exchange(other.m_ptr, nullptr);
        }
        return *this;
    }
    ~AutoRelease() { Reset(); }

    /// Releases what is held and hands out the empty slot for a host out-parameter, which
    /// fills it with a new reference that this holder then owns.
    T*& Receive() {
        Reset();
        return m_ptr;
    }
    /// Releases what is held.
    void Reset() { ReleaseHostObject(std::exchange(m_ptr, nullptr)); }

    T* Get() const { return m_ptr; }
    T* operator->() const { return m_ptr; }
    explicit operator bool() const { return m_ptr != nullptr; }

private:
    T* m_ptr = nullptr;
};

/// Another interface of an object someone else holds: asked for by T's identifier,
/// never counted, never released. Valid only while the object's holder keeps it.
template <class T> class AutoCast {
public:
    AutoCast() = default;
    /// Asks from (which may be null) for T; does not add a reference.
    explicit AutoCast(CitI::IInterface* from)
        : m_ptr(from != nullptr ? static_cast<T*>(from->GetInterface(T::IID())) : nullptr) {}
    template <class U>
    explicit AutoCast(const AutoRelease<U>& holder) : AutoCast(AsInterface(holder.Get())) {}
    template <class U>
    explicit AutoCast(const AutoCast<U>& other) : AutoCast(AsInterface(other.Get())) {}

    T* Get() const { return m_ptr; }
    T* operator->() const { return m_ptr; }
    explicit operator bool() const { return m_ptr != nullptr; }

private:
    template <class U> static CitI::IInterface* AsInterface(U* p) { return p; }

    T* m_ptr = nullptr;
};

} // namespace Prjrep
