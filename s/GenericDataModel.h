//===-- s/GenericDataModel.h - a data model that knows no holder types ----------===//
//
// \file
// The base of the host's data models: it answers schema, type-name and search questions
// with empty results whatever their arguments, and leaves the number of types and the
// holders of a type to the concrete model. VnI::IDataModel is inherited virtually so a
// host model can reach it along more than one path. A data model is not counted: whoever
// creates one deletes it.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "VnI/IDataModel.h"
#include "s/Export.h"

namespace Vn::Eng {

namespace GenericDataModelImp {
struct Record;
}

class VENLOMER_API GenericDataModel : public virtual VnI::IDataModel {
public:
    GenericDataModel();
    ~GenericDataModel() override;
    GenericDataModel(const GenericDataModel&) = delete;
    GenericDataModel& operator=(const GenericDataModel&) = delete;

    /// VnI::IDataModel and CitI::IInterface give the model's VnI::IDataModel; anything
    /// else null.
    CitI::IInterface* GetInterface(const Port::XUID& id) override;
    /// Null: this model knows no schema.
    VnI::IPropertyNameList* GetPropertyNames(int type) const override;
    /// Empty.
    Port::StringBase<char> GetTypeName(int type) const override;
    /// Null: this model finds nothing.
    CommonI::RefCountPtr<VnI::IPropertyHolderItr>
    Find(int type, const Port::StringBase<char>& name,
         const CommonI::RefCountPtr<const VnI::IProperty>& property, int flags) override;

private:
    GenericDataModelImp::Record* m_imp;
};

} // namespace Vn::Eng
