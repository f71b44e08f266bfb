//===-- s/CStringContainer.h - a counted list of texts with one shared cursor ---===//
//
// \file
// One object, two interfaces: VnI::IStringContainer to fill and empty it and
// VnI::IStringIterator to walk it. There is exactly one cursor per container, shared by
// everyone who holds the iterator interface.
//
//   auto names = CStringContainer::CreateInstance();   // count 1, adopted by `names`
//   names->AddString("A");
//   CommonI::RefCountPtr<VnI::IStringIterator> it;
//   names->GetStringIterator(it);                       // count 2
//   for (it->First(); !it->IsEnd(); it->Next()) { use(it->CurrentItem()); }
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "CommonI/RefCountPtr.h"
#include "VnI/IStringContainer.h"
#include "s/Export.h"

namespace Vn::Eng {

namespace StringContainerImpl {
struct Record;
}

class VENLOMER_API CStringContainer {
public:
    /// A new, empty container with count 1, adopted by the returned pointer.
    static CommonI::RefCountPtr<VnI::IStringContainer> CreateInstance();

    CStringContainer();
    ~CStringContainer();
    CStringContainer(const CStringContainer&) = delete;
    CStringContainer& operator=(const CStringContainer&) = delete;

    /// IStringContainer and IStringIterator give their interface objects; IRefCount and
    /// CitI::IInterface the counter object; anything else (or no record) null.
    CitI::IInterface* GetInterface(const Port::XUID& id);
    void Dump() const;

private:
    StringContainerImpl::Record* m_pImpl;
};

} // namespace Vn::Eng
