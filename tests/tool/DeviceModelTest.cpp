//===-- tests/tool/DeviceModelTest.cpp - the device model and its options ---------===//
#include "DeviceModel.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>

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

TEST(DeviceModel, PinsBanksAndTreeAgreeWithTheChipDatabase) {
    auto model = OpenEightK();
    ASSERT_TRUE(model);
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

} // namespace
