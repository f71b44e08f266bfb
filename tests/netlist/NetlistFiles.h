//===-- tests/netlist/NetlistFiles.h - netlist files as our writer and others write them -===//
#pragma once

#include "LargeNgd.h"
#include "designmodel/Nhlp_FileConv.h"
#include "designmodel/Nmod_Model.h"
#include "designmodel/Nmod_Testing.h"

#include <gtest/gtest.h>
#include <sqlite3.h>

#include <atomic>
#include <filesystem>
#include <fstream>
#include <memory>
#include <random>
#include <string>
#include <unistd.h>
#include <utility>
#include <vector>

namespace VnTest {

/// What one view of a fixture holds; an empty block name means no root block.
struct ViewSpec {
    std::string name;
    std::vector<std::pair<std::string, std::string>> properties;
    std::string block;
};

struct DesignSpec {
    std::string name;
    std::vector<ViewSpec> views;
};

/// The usual NGD: design D, an EXPANDED view naming part P with root block B.
inline DesignSpec GoodDesign(const std::string& design = "D", const std::string& part = "P",
                             const std::string& block = "B") {
    return {design, {{"EXPANDED", {{"PART", part}}, block}}};
}

/// Writes a netlist file through the design-model library.
inline void WriteNetlist(const std::string& path, const std::vector<DesignSpec>& designs,
                         bool ngd = true) {
    Nmod_Model model("fixture", "venlomer-tests", "1", false);
    model.Create(path.c_str(), ngd, false);
    model.CreateTxn("fixture", Nmod_Txn::NMOD_TXN_UPDATE);
    for (const auto& designSpec : designs) {
        Nmod_Design* design = model.GetDesignMgr()->CreateDesign(designSpec.name.c_str());
        for (const auto& viewSpec : designSpec.views) {
            Nmod_View* view = design->CreateView(viewSpec.name.c_str(), true);
            for (const auto& [name, value] : viewSpec.properties) {
                view->CreatePropertyString(name.c_str(), value.c_str());
            }
            if (!viewSpec.block.empty()) {
                view->CreateBlock(viewSpec.block.c_str(), 0);
            }
        }
    }
}

/// Runs SQL on a file (made when missing) as an outside program would.
inline void ExecSql(const std::string& path, const char* sql) {
    sqlite3* db = nullptr;
    ASSERT_EQ(
        sqlite3_open_v2(path.c_str(), &db, SQLITE_OPEN_READWRITE | SQLITE_OPEN_CREATE, nullptr),
        SQLITE_OK);
    // Test files need no durability, and waiting for the disk only slows the suite.
    ASSERT_EQ(sqlite3_exec(db, "PRAGMA synchronous = OFF", nullptr, nullptr, nullptr), SQLITE_OK);
    char* error = nullptr;
    const int rc = sqlite3_exec(db, sql, nullptr, nullptr, &error);
    const std::string words = error != nullptr ? error : "";
    sqlite3_free(error);
    sqlite3_close(db);
    ASSERT_EQ(rc, SQLITE_OK) << words;
}

inline std::unique_ptr<Nmod_Model> ReadNetlist(const std::string& path) {
    Nmod_Model* model = nullptr;
    Nmod_Txn* txn = nullptr;
    Nhlp_FileConv::ReadAsNmod(path.c_str(), model, txn, true);
    return std::unique_ptr<Nmod_Model>(model);
}

inline void WriteFile(const std::string& path, const std::string& bytes) {
    std::ofstream(path, std::ios::binary) << bytes;
}

inline std::string ReadFile(const std::string& path) {
    std::ifstream in(path, std::ios::binary);
    return std::string(std::istreambuf_iterator<char>(in), {});
}

/// A fresh folder per test, removed with everything in it afterwards.
class NetlistFolder : public ::testing::Test {
protected:
    void SetUp() override {
        static std::atomic<unsigned> serial{0};
        std::random_device random;
        m_folder = std::filesystem::temp_directory_path() /
                   ("venlomer-netlist-" + std::to_string(::getpid()) + "-" +
                    std::to_string(serial++) + "-" + std::to_string(random()));
        std::filesystem::create_directories(m_folder);
    }
    void TearDown() override {
        Nmod_Testing::FailWriteStep(-1);
        Nmod_Testing::BeforeMoveIntoPlace(nullptr);
        std::error_code ignored;
        std::filesystem::permissions(m_folder, std::filesystem::perms::owner_all,
                                     std::filesystem::perm_options::add, ignored);
        std::filesystem::remove_all(m_folder, ignored);
    }

    std::string PathOf(const std::string& name) const { return (m_folder / name).string(); }

    /// The names in the folder, hidden ones included (leftover private files show here).
    std::vector<std::string> FolderContents() const {
        std::vector<std::string> names;
        for (const auto& entry : std::filesystem::directory_iterator(m_folder)) {
            names.push_back(entry.path().filename().string());
        }
        std::sort(names.begin(), names.end());
        return names;
    }

    std::filesystem::path m_folder;
};

} // namespace VnTest
