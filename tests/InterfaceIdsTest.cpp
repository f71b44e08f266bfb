//===-- tests/InterfaceIdsTest.cpp - every published interface identifier is distinct -===//
//
// Every published interface identifier is distinct, so GetInterface never hands out one
// interface for another.
//
//===------------------------------------------------------------------------------===//
#include "VnI/Ids.h"

#include <gtest/gtest.h>

#include <set>
#include <utility>

TEST(InterfaceIds, AreAllDistinct) {
    const Port::XUID ids[] = {
        VnI::IID_IStringContainer,
        VnI::IID_IStringIterator,
        VnI::IID_IProperty,
        VnI::IID_IColorProperty,
        VnI::IID_IPossibleEnumValuesItr,
        VnI::IID_IPropertyName,
        VnI::IID_IPropertyNameItr,
        VnI::IID_IPropertyNameList,
        VnI::IID_IPropertyHolder,
        VnI::IID_IPropertyItr,
        VnI::IID_IPropertyHolderItr,
        VnI::IID_IDeviceResource,
        VnI::IID_IDeviceResourceItr,
        VnI::IID_IDataModel,
        VnI::IID_ISelectionManager,
        VnI::IID_IHighlightManager,
        VnI::IID_ITreeModel,
        VnI::IID_ITreeNode,
        VnI::IID_ITreeNodeItr,
        CitI::IID_IInterface,
        CommonI::IID_IRefCount,
    };
    for (std::size_t i = 0; i < std::size(ids); ++i) {
        for (std::size_t j = i + 1; j < std::size(ids); ++j) {
            EXPECT_FALSE(ids[i] == ids[j]) << "identifiers " << i << " and " << j << " collide";
        }
    }
}
