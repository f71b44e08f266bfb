//===-- sample/HostObject.h - counting shared by every sample host object ------===//
//
// \file
// Every object of the sample host counts its references and is counted among the
// objects alive in its component, so that tests can prove a caller released what it
// owned. An object answers Prjrep::IRefCount, CommonI::IRefCount or both, as its
// component decides.
//
// Objects that live as parts of a larger one (the views, binding instances and design
// units of a view network) have no count of their own: their AddRef and Release act on
// the whole, which dies with its last reference, parts and all.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "CitI/IInterface.h"
#include "CommonI/IRefCount.h"
#include "hostproj/Prjrep.h"

#include <atomic>
#include <cstdint>
#include <utility>

namespace SampleHost {

enum class Counting { Prjrep, Common, Both };

class HostObject {
public:
    /// Born with one reference, counted in alive until destroyed. A part passes the
    /// whole it belongs to; its counting then goes to the whole.
    HostObject(std::atomic<int>& alive, Counting counting, HostObject* whole = nullptr)
        : m_alive(alive), m_counting(counting), m_whole(whole), m_prjrep(this), m_common(this) {
        ++m_alive;
    }
    virtual ~HostObject() { --m_alive; }
    HostObject(const HostObject&) = delete;
    HostObject& operator=(const HostObject&) = delete;

    void AddRef() {
        if (m_whole != nullptr) {
            m_whole->AddRef();
            return;
        }
        m_count.fetch_add(1, std::memory_order_relaxed);
    }
    void Release() {
        if (m_whole != nullptr) {
            m_whole->Release();
            return;
        }
        if (m_count.fetch_sub(1, std::memory_order_acq_rel) == 1) {
            delete this;
        }
    }
    int RefCount() const {
        return m_whole != nullptr ? m_whole->RefCount() : m_count.load(std::memory_order_acquire);
    }

    /// The answer of every interface of this object: its counting interfaces as its
    /// component chose, then whatever Own gives.
    CitI::IInterface* Ask(const Port::XUID& id) {
        if (id == Prjrep::IRefCount::IID() && m_counting != Counting::Common) {
            return &m_prjrep;
        }
        if (id == CommonI::IID_IRefCount && m_counting != Counting::Prjrep) {
            return &m_common;
        }
        return Own(id);
    }

protected:
    /// This object's own interfaces; null for anything it does not answer.
    virtual CitI::IInterface* Own(const Port::XUID& id) = 0;

    /// The Own of an object with one interface: that interface and CitI::IInterface
    /// answer self, anything else null.
    template <class Interface, class Self>
    static CitI::IInterface* OwnOnly(Self* self, const Port::XUID& id) {
        return id == Interface::IID() || id == CitI::IID_IInterface ? static_cast<Interface*>(self)
                                                                    : nullptr;
    }

private:
    class PrjrepCounter final : public Prjrep::IRefCount {
    public:
        explicit PrjrepCounter(HostObject* owner) : m_owner(owner) {}
        CitI::IInterface* GetInterface(const Port::XUID& id) override { return m_owner->Ask(id); }
        std::int64_t AddRef() override {
            m_owner->AddRef();
            return 1;
        }
        std::int64_t Release() override {
            m_owner->Release();
            return 1;
        }

    private:
        HostObject* m_owner;
    };

    class CommonCounter final : public CommonI::IRefCount {
    public:
        explicit CommonCounter(HostObject* owner) : m_owner(owner) {}
        CitI::IInterface* GetInterface(const Port::XUID& id) override { return m_owner->Ask(id); }
        std::int64_t AddRef() override {
            m_owner->AddRef();
            return 1;
        }
        std::int64_t Release() override {
            m_owner->Release();
            return 1;
        }
        std::int64_t GetRefCount(int& count) override {
            count = m_owner->RefCount();
            return 1;
        }

    private:
        HostObject* m_owner;
    };

    std::atomic<int>& m_alive;
    Counting m_counting;
    HostObject* m_whole;
    std::atomic<int> m_count{1};
    PrjrepCounter m_prjrep;
    CommonCounter m_common;
};

/// An object that answers nothing but CitI::IInterface and its counting: what a host
/// hands out where it fails to give the interface a caller expects.
class Opaque final : public HostObject, public CitI::IInterface {
public:
    using HostObject::HostObject;
    CitI::IInterface* GetInterface(const Port::XUID& id) override { return Ask(id); }

protected:
    CitI::IInterface* Own(const Port::XUID& id) override {
        return id == CitI::IID_IInterface ? static_cast<CitI::IInterface*>(this) : nullptr;
    }
};

/// One reference on a HostObject, dropped with the holder.
template <class T> class Hold {
public:
    Hold() = default;
    /// AddRef's p.
    explicit Hold(T* p) : m_ptr(p) {
        if (m_ptr != nullptr) {
            m_ptr->AddRef();
        }
    }
    /// Takes over the reference p carries.
    static Hold Adopt(T* p) {
        Hold h;
        h.m_ptr = p;
        return h;
    }
    Hold(const Hold& other) : Hold(other.m_ptr) {}
    Hold(Hold&& other) noexcept : m_ptr(std::exchange(other.m_ptr, nullptr)) {}
    Hold& operator=(Hold&& other) noexcept {
        if (this != &other) {
            Reset();
            m_ptr = std::exchange(other.m_ptr, nullptr);
        }
        return *this;
    }
    Hold& operator=(const Hold&) = delete;
    ~Hold() { Reset(); }
    void Reset() {
        if (m_ptr != nullptr) {
            std::exchange(m_ptr, nullptr)->Release();
        }
    }
    T* Get() const { return m_ptr; }
    T* operator->() const { return m_ptr; }
    explicit operator bool() const { return m_ptr != nullptr; }

private:
    T* m_ptr = nullptr;
};

} // namespace SampleHost
