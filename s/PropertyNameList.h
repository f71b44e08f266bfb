//===-- s/PropertyNameList.h - the schema of a kind of holder -------------------===//
//
// \file
// An ordered list of property names. A name's position is its slot number in every
// holder of the kind, and stays valid until ClearList. Lookup by text is a hash lookup on
// the text's bytes (exact, case-sensitive); a text occurs at most once.
//
// The list is not counted: its creator owns and deletes it and hands out borrowed
// VnI::IPropertyNameList pointers (a CommonI::RefCountPtr holding one never releases it).
//
//   PropertyNameList schema;
//   schema.AddName("Bank", VnI::INT_TYPE, true);      // 0
//   schema.AddName("Pin", VnI::STRING_TYPE, false);   // 1
//   schema.Contains("Pin");                           // 1
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "CommonI/RefCountPtr.h"
#include "VnI/IPropertyName.h"
#include "s/Export.h"

namespace Vn::Eng {

namespace PropertyNameListImp {
struct Record;
}

class PropertyNameList;

namespace detail {
// The position of name in list, found and (when absent) added in one look-up, with the
// property's type, its possible values and `visible`; a name is added only while the
// list has at most `maxPosition` names. -1 when absent and not added.
int PositionAddingName(PropertyNameList& list, const Port::StringBase<char>& name,
                       VnI::IProperty& property, bool visible, int maxPosition);
} // namespace detail

class VENLOMER_API PropertyNameList {
public:
    PropertyNameList();
    /// Releases every name; names referenced elsewhere live on.
    virtual ~PropertyNameList();
    PropertyNameList(const PropertyNameList&) = delete;
    PropertyNameList& operator=(const PropertyNameList&) = delete;

    /// IPropertyNameList and CitI::IInterface give the interface object; anything else,
    /// CommonI::IRefCount included, null.
    CitI::IInterface* GetInterface(const Port::XUID& id);

    int GetNumNames() const;
    /// The name at position, borrowed; null when out of range.
    VnI::IPropertyName* GetPropertyName(int position);
    /// A new iterator over the names in position order (one reference).
    CommonI::RefCountPtr<VnI::IPropertyNameItr> GetNameItr() const;
    /// The position of the name with exactly this text, or -1.
    int Contains(const Port::StringBase<char>& name) const;
    /// The new name's position, or -1 (and no change) when the text is already present.
    int AddName(const Port::StringBase<char>& name, VnI::PropertyType type, bool visible);
    /// As AddName, with the possible values the iterator yields (it is consumed).
    int AddEnumName(const Port::StringBase<char>& name, VnI::PropertyType type,
                    const CommonI::RefCountPtr<VnI::IPossibleEnumValuesItr>& values, bool visible);
    /// Appends copies of the other list's names whose texts this list lacks. Returns 1.
    std::int64_t AppendList(const VnI::IPropertyNameList* other);
    /// Releases every name and starts again at position 0. Returns 1.
    std::int64_t ClearList();

    void Dump() const;

private:
    friend int detail::PositionAddingName(PropertyNameList& list,
                                          const Port::StringBase<char>& name,
                                          VnI::IProperty& property, bool visible, int maxPosition);

    PropertyNameListImp::Record* m_imp;
};

} // namespace Vn::Eng
