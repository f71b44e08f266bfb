//===-- tests/tool/DeviceModelTest.cpp - the device model and its options ---------===//
#include "DeviceModel.h"
#include "PropertyText.h"

#include "s/PropertyFactory.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <set>
#include <utility>

namespace {

namespace fs = std::filesystem;

std::unique_ptr<VnTool::DeviceModel> OpenEightK() {
    VnTool::DeviceSource source{std::string(VENLOMER_SYSTEM_CHIPDB_DIR) + "/chipdb-8k.txt", "ct256",
                                ""};
    std::string error;
    auto model = VnTool::DeviceModel::Open(source, error);
    EXPECT_TRUE(model) << error << " (install fpga-icestorm-chipdb with scripts/bootstrap)";
    return model;
}

// The 8k device in ct256, read once for the cases that only look at it.
class EightK : public ::testing::Test {
protected:
    static void SetUpTestSuite() { s_model = OpenEightK().release(); }
    static void TearDownTestSuite() {
        delete s_model;
        s_model = nullptr;
    }
    void SetUp() override { ASSERT_NE(s_model, nullptr); }
    static VnTool::DeviceModel* s_model;
};
VnTool::DeviceModel* EightK::s_model = nullptr;

// Every pin holder stands where the chip database bonds its pin: the holder's X, Y and
// Block properties, its resource location and its tile name agree with the file's record,
// and its bank is the edge's (top 0, right 1, bottom 2, left 3, as the data sheets number
// them), so a swap of X and Y or a wrong bank for an edge fails here; the I/O tiles take
// their edge's site type.
TEST_F(EightK, PinAndIoTileHoldersStandWhereTheChipDatabasePutsThem) {
    const VnTool::ChipDb& db = s_model->Db();
    ASSERT_EQ(s_model->Pins().size(), db.pins.size());
    std::set<int> banksSeen;
    for (VnTool::DeviceHolder* holder : s_model->Pins()) {
        const VnTool::Pin& pin = s_model->PinOf(holder);
        SCOPED_TRACE(pin.name);
        EXPECT_EQ(holder->GetName().str(), pin.name);
        EXPECT_EQ(holder->IntOf("X"), pin.x);
        EXPECT_EQ(holder->IntOf("Y"), pin.y);
        EXPECT_EQ(holder->IntOf("Block"), pin.pio);
        int x = -1;
        int y = -1;
        holder->AsResource()->GetLocation(x, y);
        EXPECT_EQ(std::pair(x, y), std::pair(pin.x, pin.y));
        EXPECT_EQ(holder->AsResource()->GetTileName().str(),
                  "IO_" + std::to_string(pin.x) + "_" + std::to_string(pin.y));
        int edgeBank = pin.y == db.height - 1 ? 0 : pin.x == db.width - 1 ? 1 : pin.y == 0 ? 2 : 3;
        EXPECT_EQ(holder->IntOf("Bank"), edgeBank);
        banksSeen.insert(edgeBank);
    }
    EXPECT_EQ(banksSeen.size(), 4u); // the package bonds pins on every edge

    // One I/O tile per edge: the top and bottom rows hold TB_IO sites, the left and right
    // columns LR_IO, and a tile inside is no I/O site.
    struct Edge {
        int x, y;
        const char* siteType;
    };
    const int midX = db.width / 2;
    const int midY = db.height / 2;
    const Edge edges[] = {{midX, db.height - 1, "TB_IO"},
                          {db.width - 1, midY, "LR_IO"},
                          {midX, 0, "TB_IO"},
                          {0, midY, "LR_IO"}};
    for (const Edge& edge : edges) {
        SCOPED_TRACE(std::to_string(edge.x) + "," + std::to_string(edge.y));
        auto tile = std::find_if(s_model->Tiles().begin(), s_model->Tiles().end(),
                                 [&](VnTool::DeviceHolder* holder) {
                                     int x = -1;
                                     int y = -1;
                                     holder->GetLocation(x, y);
                                     return x == edge.x && y == edge.y;
                                 });
        ASSERT_NE(tile, s_model->Tiles().end());
        EXPECT_EQ((*tile)->GetSiteType().str(), edge.siteType);
        EXPECT_EQ((*tile)->GetPropertyByName("Type")->GetStringProperty().str(), "io");
        EXPECT_EQ((*tile)->IntOf("X"), edge.x);
        EXPECT_EQ((*tile)->IntOf("Y"), edge.y);
    }
    for (VnTool::DeviceHolder* tile : s_model->Tiles()) {
        int x = -1;
        int y = -1;
        tile->GetLocation(x, y);
        if (x == midX && y == midY) {
            EXPECT_EQ(tile->GetSiteType().str().find("_IO"), std::string::npos);
        }
    }
}

TEST_F(EightK, PinsBanksAndTreeAgreeWithTheChipDatabase) {
    VnTool::DeviceModel* model = s_model;
    EXPECT_EQ(model->Pins().size(), 206u);
    EXPECT_EQ(model->Tiles().size(), 34u * 34u - 4u); // every grid cell but the corners
    VnTool::DeviceHolder* pin = model->FindPin("C8");
    ASSERT_NE(pin, nullptr);
    EXPECT_EQ(pin->GetName().str(), "C8");
    EXPECT_EQ(pin->GetType(), VnI::DEVICE_RESOURCE_HOLDER_TYPE);
    EXPECT_EQ(&model->PinOf(pin), &model->Db().pins[static_cast<std::size_t>(pin->GetIndex())]);
    EXPECT_TRUE(model->IsGlobalBufferPin(pin));
    EXPECT_EQ(model->FindPin("Z99"), nullptr);
    EXPECT_FALSE(model->IsGlobalBufferPin(nullptr));
    EXPECT_EQ(model->Bank(4), nullptr);
    EXPECT_EQ(model->Bank(-1), nullptr);

    // Every pin sits under its own bank in the tree, and the bank counts match.
    int total = 0;
    auto root = model->Tree()->GetRootNode();
    EXPECT_EQ(root->GetDataRef(), model->Device());
    for (auto it = root->GetChildren(); !it->IsEnd(); it->Next()) {
        auto node = it->CurrentItem();
        auto* bank = node->GetDataRef();
        if (bank == nullptr) {
            continue; // the tiles group
        }
        int number = bank->GetPropertyByName("Bank")->GetIntProperty();
        EXPECT_EQ(bank, model->Bank(number));
        int pins = 0;
        for (auto child = node->GetChildren(); !child->IsEnd(); child->Next()) {
            EXPECT_EQ(
                child->CurrentItem()->GetDataRef()->GetPropertyByName("Bank")->GetIntProperty(),
                number);
            ++pins;
        }
        EXPECT_EQ(pins, model->PinCount(number));
        EXPECT_EQ(model->PinsOfBank(number).size(), static_cast<std::size_t>(pins));
        total += pins;
    }
    EXPECT_EQ(total, 206);
    // One shared schema per kind.
    EXPECT_EQ(model->Pins().front()->GetPropertyNames(), model->PinNames());
    EXPECT_EQ(model->Tiles().back()->GetPropertyNames(), model->TileNames());
}

TEST(DeviceModel, AModelDiesCleanlyWithItsPinsSelectedAndHighlighted) {
    auto model = OpenEightK();
    ASSERT_TRUE(model);
    model->Selection().AddSelectedItem(model->Bank(0), true);
    for (auto* pin : model->PinsOfBank(0)) {
        model->Highlight().AddHighlightedItem(pin->AsResource());
    }
    VnTool::DevicePalette palette;
    EXPECT_EQ(palette.PinColour(*model->PinsOfBank(0).front()).size(), 7u);
    EXPECT_TRUE(model->PinsOfBank(0).front()->AsResource()->IsHighlighted());
    model.reset(); // the sanitizer build catches a manager touching a dead holder
}

TEST(DeviceOptions, DeviceNamesAFileOfTheFolderAndContradictionsAreRefused) {
    VnTool::DeviceSource source;
    std::string error;
    ASSERT_EQ(setenv("VENLOMER_CHIPDB_DIR", VENLOMER_SYSTEM_CHIPDB_DIR, 1), 0);
    EXPECT_EQ(VnTool::ResolveDevice({"", "1k", ""}, source, error), VnTool::DeviceResolution::Ok);
    EXPECT_EQ(source.chipDb, std::string(VENLOMER_SYSTEM_CHIPDB_DIR) + "/chipdb-1k.txt");
    EXPECT_EQ(source.package, "tq144");
    EXPECT_EQ(VnTool::ResolveDevice({"", "1k", "cb81"}, source, error),
              VnTool::DeviceResolution::Ok);
    EXPECT_EQ(source.package, "cb81");
    EXPECT_EQ(VnTool::ResolveDevice({"x.txt", "1k", ""}, source, error),
              VnTool::DeviceResolution::BadUsage);
    EXPECT_EQ(VnTool::ResolveDevice({"", "../etc/1k", ""}, source, error),
              VnTool::DeviceResolution::BadUsage);
    EXPECT_EQ(VnTool::ResolveDevice({"", "99k", ""}, source, error),
              VnTool::DeviceResolution::Missing);
    EXPECT_NE(error.find("chipdb-99k.txt"), std::string::npos) << error;
    EXPECT_EQ(VnTool::ResolveDevice({"", "", ""}, source, error), VnTool::DeviceResolution::Ok);
    EXPECT_EQ(source.package, "ct256");
    EXPECT_TRUE(source.note.empty());
    unsetenv("VENLOMER_CHIPDB_DIR");
}

// What a table prints, a search accepts: the typed query reads back every value
// PropertyText writes, so `--find Clock=yes` finds the ports the Clock column says "yes" of.
TEST(PropertyText, ASearchValueReadsWhatTheTablesPrint) {
    using Vn::Eng::PropertyFactory;
    using Ptr = CommonI::RefCountPtr<VnI::IProperty>;
    std::string error;
    for (bool value : {true, false}) {
        Ptr printed = Ptr::Adopt(PropertyFactory::CreateBoolProperty(value, true));
        Ptr wanted =
            VnTool::TypedValue(VnI::BOOL_TYPE, "Clock", VnTool::PropertyText(printed), error);
        ASSERT_TRUE(wanted) << error;
        EXPECT_EQ(wanted->GetType(), VnI::BOOL_TYPE);
        EXPECT_TRUE(printed->Equals(wanted, VnI::MATCH_EXACT));
    }
    for (const char* yes : {"yes", "true", "1"}) {
        EXPECT_TRUE(VnTool::TypedValue(VnI::BOOL_TYPE, "Clock", yes, error)->GetBoolProperty());
    }
    EXPECT_FALSE(VnTool::TypedValue(VnI::BOOL_TYPE, "Clock", "maybe", error));
    EXPECT_EQ(error, "Clock is yes or no; got \"maybe\"");

    Ptr bank = VnTool::TypedValue(VnI::INT_TYPE, "Bank", "-3", error);
    ASSERT_TRUE(bank);
    EXPECT_EQ(VnTool::PropertyText(bank), "-3");
    for (const char* notWhole : {"", "3x", "1.5", "99999999999"}) {
        EXPECT_FALSE(VnTool::TypedValue(VnI::INT_TYPE, "Bank", notWhole, error)) << notWhole;
    }
    EXPECT_EQ(error, "Bank is a whole number; got \"99999999999\"");
    EXPECT_EQ(VnTool::TypedValue(VnI::STRING_TYPE, "Name", "led[0]", error)->GetType(),
              VnI::STRING_TYPE);
    EXPECT_EQ(VnTool::PropertyText(nullptr), "");
    EXPECT_EQ(VnTool::HexColour(nullptr), "");
}

} // namespace
