//===-- VnI/IPropertyName.h - property schemas ----------------------------------===//
//
// Slot orders (binary contract, do not reorder):
//   IPropertyName: GetInterface, ~, GetName, GetType, GetPossibleValues, IsVisible
//   IPropertyNameItr: GetInterface, ~, CurrentItem, First, Next, IsEnd
//   IPropertyNameList: GetInterface, ~, GetNumNames, GetNameItr, Contains, AddName,
//                      AddEnumName, AppendList, ClearList, GetPropertyName
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "VnI/IProperty.h"

namespace VnI {

class VN_INTERFACE IPropertyName : public CitI::IInterface {
public:
    static constexpr const Port::XUID& kIID = IID_IPropertyName;

    virtual Port::StringBase<char> GetName() const = 0;
    virtual PropertyType GetType() const = 0;
    /// An iterator over the name's choices; it must not outlive the name.
    virtual CommonI::RefCountPtr<IPossibleEnumValuesItr> GetPossibleValues() const = 0;
    virtual bool IsVisible() const = 0;
};

class VN_INTERFACE IPropertyNameItr : public CitI::IInterface {
public:
    static constexpr const Port::XUID& kIID = IID_IPropertyNameItr;

    /// The name under the cursor, borrowed (no reference); null at the end.
    virtual IPropertyName* CurrentItem() const = 0;
    virtual std::int64_t First() = 0;
    virtual std::int64_t Next() = 0;
    virtual bool IsEnd() const = 0;
};

class VN_INTERFACE IPropertyNameList : public CitI::IInterface {
public:
    static constexpr const Port::XUID& kIID = IID_IPropertyNameList;

    virtual int GetNumNames() const = 0;
    /// A new iterator over the names in position order (one reference).
    virtual CommonI::RefCountPtr<IPropertyNameItr> GetNameItr() const = 0;
    /// The name's position, or -1. Exact, case-sensitive.
    virtual int Contains(const Port::StringBase<char>& name) const = 0;
    /// The new name's position, or -1 when the text is already present.
    virtual int AddName(const Port::StringBase<char>& name, PropertyType type, bool visible) = 0;
    virtual int AddEnumName(const Port::StringBase<char>& name, PropertyType type,
                            const CommonI::RefCountPtr<IPossibleEnumValuesItr>& values,
                            bool visible) = 0;
    /// Appends copies of the other list's names that this list lacks. Returns 1.
    virtual std::int64_t AppendList(const IPropertyNameList* other) = 0;
    /// Releases every name; positions handed out before are void. Returns 1.
    virtual std::int64_t ClearList() = 0;
    /// The name at position, borrowed; null when out of range.
    virtual IPropertyName* GetPropertyName(int position) = 0;
};

} // namespace VnI
