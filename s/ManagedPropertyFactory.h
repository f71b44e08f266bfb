//===-- s/ManagedPropertyFactory.h - creates properties, with reservation hints -===//
//
// \file
// The same creation functions as PropertyFactory on an object, plus reservation calls
// meant for pooled creation. Properties it made behave exactly as PropertyFactory's and
// outlive the factory. The reservations are hints only: they allocate nothing today and
// always succeed.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "VnI/IProperty.h"
#include "s/Export.h"

#include <vector>

namespace Vn::Eng {

namespace ManagedPropertyFactoryImp {
struct Record;
}

class VENLOMER_API ManagedPropertyFactory {
public:
    ManagedPropertyFactory();
    virtual ~ManagedPropertyFactory();
    ManagedPropertyFactory(const ManagedPropertyFactory&) = delete;
    ManagedPropertyFactory& operator=(const ManagedPropertyFactory&) = delete;

    VnI::IProperty* CreateIntProperty(int value, bool visible);
    VnI::IProperty* CreateDoubleProperty(double value, bool visible);
    VnI::IProperty* CreateStringProperty(const Port::StringBase<char>& value, bool visible);
    VnI::IProperty* CreateBoolProperty(bool value, bool visible);
    /// The colour's IProperty, which is the same sub-object as its IColorProperty.
    VnI::IProperty* CreateColorProperty(int rgb, bool visible);
    VnI::IProperty* CreateColorProperty(char red, char green, char blue, bool visible);
    VnI::IProperty* CreateEnumProperty(std::vector<Port::StringBase<char>>& possibleValues,
                                       const Port::StringBase<char>& current, bool visible);

    /// Each returns true.
    bool ReserveSpaceForIntProperties(unsigned int count);
    bool ReserveSpaceForStringProperties(unsigned int count);
    bool ReserveSpaceForBoolProperties(unsigned int count);
    bool ReserveSpaceForDoubleProperties(unsigned int count);
    bool ReserveSpaceForEnumProperties(unsigned int count);
    bool ReserveSpaceForColorProperties(unsigned int count);

    /// Prints nothing: the factory has no state worth showing.
    void Dump() const;

private:
    ManagedPropertyFactoryImp::Record* m_imp;
};

} // namespace Vn::Eng
