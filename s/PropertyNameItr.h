//===-- s/PropertyNameItr.h - walks the names of a name list --------------------===//
//
// \file
// Made by PropertyNameList::GetNameItr. It reads the list's vector in place, as it is
// when each operation runs, and does not keep the list alive. The cursor is a position,
// so names appended while walking are reached and never leave it dangling.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "CommonI/RefCountPtr.h"
#include "VnI/IPropertyName.h"
#include "s/Export.h"

#include <vector>

namespace Vn::Eng {

namespace PropertyNameItrImp {
struct Record;
}

class VENLOMER_API PropertyNameItr : public VnI::IPropertyNameItr {
public:
    using Names = std::vector<CommonI::RefCountPtr<VnI::IPropertyName>>;

    /// A new iterator over names (null: at its end at once), count 1, adopted.
    static CommonI::RefCountPtr<VnI::IPropertyNameItr> CreateInstance(const Names* names);

    ~PropertyNameItr() override;
    PropertyNameItr(const PropertyNameItr&) = delete;
    PropertyNameItr& operator=(const PropertyNameItr&) = delete;

    /// IPropertyNameItr and CitI::IInterface give the object; IRefCount the counter.
    CitI::IInterface* GetInterface(const Port::XUID& id) override;
    /// Borrowed (no reference); null at the end.
    VnI::IPropertyName* CurrentItem() const override;
    /// Returns 0.
    std::int64_t First() override;
    /// Returns 0; at the end it stays there.
    std::int64_t Next() override;
    bool IsEnd() const override;

    void Dump() const;

private:
    explicit PropertyNameItr(const Names* names);

    PropertyNameItrImp::Record* m_imp;
};

} // namespace Vn::Eng
