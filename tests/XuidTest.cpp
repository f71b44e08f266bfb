//===-- tests/XuidTest.cpp - XUIDs parse GUID text, compare both halves, keep their values -===//
#include "Port/XUID.h"
#include "VnI/Ids.h"

#include <gtest/gtest.h>

TEST(Xuid, ParsesGuidTextWithOrWithoutBracesInAnyCase) {
    const Port::XUID expected(0x0725C3D25E9B4383ull, 0xA7B6A80C932EAC21ull);
    EXPECT_EQ(Port::XUID("{0725c3d2-5e9b-4383-a7b6-a80c932eac21}"), expected);
    EXPECT_EQ(Port::XUID("0725C3D2-5E9B-4383-A7B6-A80C932EAC21"), expected);
    EXPECT_EQ(Port::XUID("{0725c3D2-5E9b-4383-a7B6-A80c932eac21}"), expected);
    EXPECT_EQ(Port::XUID("{7712A3E4-8429-449a-A82C-B7A1B78F3863}").ToString(),
              "7712A3E4-8429-449A-A82C-B7A1B78F3863");
}

TEST(Xuid, MalformedTextGivesTheZeroId) {
    for (const char* bad : {"", "{}", "0725c3d2-5e9b-4383-a7b6-a80c932eac2", // one digit short
                            "0725c3d2-5e9b-4383-a7b6-a80c932eac211",         // one too many
                            "{0725c3d2-5e9b-4383-a7b6-a80c932eac21",         // open brace
                            "0725c3d2+5e9b-4383-a7b6-a80c932eac21",          // wrong dash
                            "g725c3d2-5e9b-4383-a7b6-a80c932eac21"}) {
        EXPECT_TRUE(Port::XUID(bad).IsNull()) << bad;
    }
    EXPECT_TRUE(Port::XUID(static_cast<const char*>(nullptr)).IsNull());
}

TEST(Xuid, EqualityNeedsBothHalves) {
    EXPECT_NE(Port::XUID(1, 2), Port::XUID(1, 3));
    EXPECT_NE(Port::XUID(1, 2), Port::XUID(0, 2));
    EXPECT_EQ(Port::XUID(1, 2), Port::XUID(1, 2));
}

// The published identifiers, written as GUID text: a typo in either half fails here.
TEST(Xuid, PublishedIdentifiersHaveTheirContractValues) {
    struct Row {
        Port::XUID id;
        const char* text;
    };
    const Row rows[] = {
        {CitI::IID_IInterface, "C569A982-87C5-4D45-8A2C-17B796723BDC"},
        {CommonI::IID_IRefCount, "F3524653-0FB8-4605-A6C1-6E80946A2CDD"},
        {VnI::IID_IStringContainer, "902A53DA-FEAD-47AE-8A0D-534C6A5DBD54"},
        {VnI::IID_IStringIterator, "F4E61719-0DCE-4E67-8491-CEAE546DB067"},
        {VnI::IID_IProperty, "A14EEF28-5109-481D-B460-31093CB52DD8"},
        {VnI::IID_IColorProperty, "C00B8B53-5096-4BDF-864D-610101828237"},
        {VnI::IID_IPossibleEnumValuesItr, "2D312293-D20B-4891-B5E9-CD24E2E4F859"},
        {VnI::IID_IPropertyName, "1CA6C97A-FC22-4851-8648-0B5D021556FC"},
        {VnI::IID_IPropertyNameItr, "230BE6C3-4678-4C1B-83C8-D45BD6E9CF04"},
        {VnI::IID_IPropertyNameList, "6DFC8E1C-CBB6-4B68-A650-5ED29FEA5D89"},
        {VnI::IID_IPropertyHolder, "67233C64-2BB5-46E5-AA44-1B45301EC0A6"},
        {VnI::IID_IPropertyItr, "4FB7A8F8-7503-43F1-9AC1-C99BBDE20149"},
        {VnI::IID_IPropertyHolderItr, "831E68ED-BAE7-43AF-AD8A-D9A4462AF3BF"},
        {VnI::IID_IDeviceResource, "6722E20C-94F3-4F67-943F-C295C4CDEA89"},
        {VnI::IID_IDeviceResourceItr, "97995BDE-21EF-4F41-80E1-912F5200673C"},
        {VnI::IID_IDataModel, "CC07A05B-8025-47B9-B609-25F095C07EAD"},
        {VnI::IID_ISelectionManager, "7B5B3AF5-C25D-4C44-970B-914374B8C663"},
        {VnI::IID_IHighlightManager, "7E106CDA-DEE6-4A00-A923-D6771BE69385"},
        {VnI::IID_ITreeModel, "6553E6E0-BD93-4B3A-BADD-4E6F504AFEF9"},
        {VnI::IID_ITreeNode, "7124CDED-D840-4D46-830D-D47ABD5F551D"},
        {VnI::IID_ITreeNodeItr, "272DF52C-A3DA-4759-BBD4-BA63A2950C16"},
    };
    for (const Row& row : rows) {
        EXPECT_EQ(row.id, Port::XUID(row.text)) << row.text;
        EXPECT_EQ(row.id.ToString(), row.text);
    }
    for (size_t i = 0; i < std::size(rows); ++i) {
        for (size_t j = i + 1; j < std::size(rows); ++j) {
            EXPECT_NE(rows[i].id, rows[j].id) << rows[i].text;
        }
    }
}
