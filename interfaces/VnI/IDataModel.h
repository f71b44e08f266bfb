//===-- VnI/IDataModel.h - schemas and search by holder type --------------------===//
//
// Slot order (binary contract, do not reorder): GetInterface, ~, GetPropertyNames,
// GetTypeName, GetNumTypes, GetHolders, Find. The fifth and sixth operations are
// supplied by the host's data models; the library never calls them.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "VnI/IPropertyHolder.h"

namespace VnI {

class VN_INTERFACE IDataModel : public CitI::IInterface {
public:
    static constexpr const Port::XUID& kIID = IID_IDataModel;

    /// The schema of holders of that type, borrowed; may be null.
    virtual IPropertyNameList* GetPropertyNames(int type) const = 0;
    virtual Port::StringBase<char> GetTypeName(int type) const = 0;
    /// Number of holder types the model knows.
    virtual int GetNumTypes() const = 0;
    /// Every holder of that type (one reference), or null.
    virtual CommonI::RefCountPtr<IPropertyHolderItr> GetHolders(int type) = 0;
    /// The holders of that type whose property name matches property under flags.
    virtual CommonI::RefCountPtr<IPropertyHolderItr>
    Find(int type, const Port::StringBase<char>& name,
         const CommonI::RefCountPtr<const IProperty>& property, int flags) = 0;
};

} // namespace VnI
