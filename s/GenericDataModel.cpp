//===-- s/GenericDataModel.cpp --------------------------------------------------===//
#include "Port/UnitStartup.h"

#include "s/GenericDataModel.h"

namespace Vn::Eng {

namespace GenericDataModelImp {
// Nothing yet; the record keeps room for state without changing the object's layout.
struct Record {};
} // namespace GenericDataModelImp

GenericDataModel::GenericDataModel() : m_imp(new GenericDataModelImp::Record()) {}

GenericDataModel::~GenericDataModel() {
    delete m_imp;
}

CitI::IInterface* GenericDataModel::GetInterface(const Port::XUID& id) {
    if (id == VnI::IID_IDataModel || id == CitI::IID_IInterface) {
        return static_cast<VnI::IDataModel*>(this);
    }
    return nullptr;
}

VnI::IPropertyNameList* GenericDataModel::GetPropertyNames(int) const {
    return nullptr;
}

Port::StringBase<char> GenericDataModel::GetTypeName(int) const {
    return {};
}

CommonI::RefCountPtr<VnI::IPropertyHolderItr>
GenericDataModel::Find(int, const Port::StringBase<char>&,
                       const CommonI::RefCountPtr<const VnI::IProperty>&, int) {
    return nullptr;
}

} // namespace Vn::Eng
