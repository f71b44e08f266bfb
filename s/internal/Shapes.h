//===-- s/internal/Shapes.h - the reusable pieces of the four class shapes ------===//
//
// \file
// Shape 1 (self-counted): derive first from CommonI::TRefCountHelperBase<T,0>, then from
//   the published interface; answer GetInterface with AnswerSelfCounted.
// Shape 2 (interface + counted record): derive from the interface, keep a
//   CommonI::TRefCountHelper<T,0> in the record; answer with AnswerCountedRecord.
// Shape 3 (record with interface objects): each interface object derives from
//   InterfaceObject<Owner, Interface>, which forwards GetInterface to the owner.
// Shape 4 (uncounted): answer own interfaces, never CommonI::IRefCount.
//
// Creation: AdoptCreated<I>(owner) asks a new object for its main interface I and hands
// out that pointer adopting the initial count of 1 (no AddRef).
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "CitI/IInterface.h"
#include "CommonI/RefCountPtr.h"
#include "Port/MsgMan.h"

#include <cstdarg>
#include <cstdint>

namespace Vn::Eng::detail {

/// The interface object of shape 3: one published interface of an owner, forwarding
/// GetInterface so that every interface of one object answers alike.
template <class Owner, class Interface> class InterfaceObject : public Interface {
public:
    explicit InterfaceObject(Owner* owner) : m_owner(owner) {}
    InterfaceObject(const InterfaceObject&) = delete;
    InterfaceObject& operator=(const InterfaceObject&) = delete;

    CitI::IInterface* GetInterface(const Port::XUID& id) override {
        return m_owner != nullptr ? m_owner->GetInterface(id) : nullptr;
    }
    Owner* GetOwner() const { return m_owner; }

protected:
    Owner* m_owner; // not owned
};

/// Shape 2's answer: the object for its own interface and CitI::IInterface, the record's
/// counter for CommonI::IRefCount.
template <class Interface, class Counter>
CitI::IInterface* AnswerCountedRecord(Interface* self, Counter* counter, const Port::XUID& id) {
    if (id == Interface::kIID || id == CitI::IID_IInterface) {
        return self;
    }
    if (id == CommonI::IID_IRefCount) {
        return counter;
    }
    return nullptr;
}

/// Hands out a newly created object's main interface, adopting its initial count.
template <class I, class Owner> CommonI::RefCountPtr<I> AdoptCreated(Owner* owner) {
    if (owner == nullptr) {
        return nullptr;
    }
    return CommonI::RefCountPtr<I>::Adopt(static_cast<I*>(owner->GetInterface(I::kIID)));
}

/// Where a unit's Dump lines come from.
struct Unit {
    const char* path;     // "../s/<unit>"
    const char* revision; // the unit's revision keyword
};

/// One Dump line: a status message from the unit and line given.
void DumpLine(const Unit& unit, int line, const char* format, ...)
    __attribute__((format(printf, 3, 4)));

/// What a %x in a Dump format prints for an address: its low 32 bits, as the formats
/// expect an unsigned int (passing a 64-bit pointer to %x would be undefined).
inline unsigned int AddressArg(const void* address) {
    return static_cast<unsigned int>(reinterpret_cast<std::uintptr_t>(address));
}

} // namespace Vn::Eng::detail
