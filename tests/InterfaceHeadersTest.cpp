// Every published header compiles on its own and their identifiers are the ones each
// interface reports.
#include "VnI/IDataModel.h"
#include "VnI/IDeviceResource.h"
#include "VnI/IManagers.h"
#include "VnI/IProperty.h"
#include "VnI/IPropertyHolder.h"
#include "VnI/IPropertyName.h"
#include "VnI/IStringContainer.h"
#include "VnI/ITreeNode.h"

#include <gtest/gtest.h>

TEST(InterfaceHeaders, EachInterfaceCarriesItsOwnIdentifier) {
    EXPECT_EQ(VnI::IProperty::kIID, VnI::IID_IProperty);
    EXPECT_EQ(VnI::IColorProperty::kIID, VnI::IID_IColorProperty);
    EXPECT_EQ(VnI::IPropertyHolder::kIID, VnI::IID_IPropertyHolder);
    EXPECT_EQ(VnI::IDeviceResource::kIID, VnI::IID_IDeviceResource);
    EXPECT_EQ(VnI::ITreeNode::kIID, VnI::IID_ITreeNode);
    EXPECT_EQ(VnI::ISelectionManager::kIID, VnI::IID_ISelectionManager);
    EXPECT_EQ(VnI::IHighlightManager::kIID, VnI::IID_IHighlightManager);
    EXPECT_EQ(VnI::IDataModel::kIID, VnI::IID_IDataModel);
    EXPECT_EQ(VnI::MATCH_REGEXP, 0x80);
    EXPECT_EQ(VnI::ICON_TYPE, 7);
}
