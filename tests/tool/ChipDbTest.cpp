//===-- tests/tool/ChipDbTest.cpp - chip databases read whole into tiles and pins, or refused -===//
//
// Counts are checked against counts taken from the file by a separate, naive scan, so
// that a reader that drops or doubles sections cannot agree with itself.
//
//===------------------------------------------------------------------------------===//
#include "ChipDb.h"

#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <map>
#include <set>
#include <sstream>

namespace {

using VnTool::ChipDb;
using VnTool::TileKind;

struct IndependentCounts {
    std::map<std::string, int> tiles;          // section name → count
    std::vector<std::string> packages;         // in file order
    std::map<std::string, int> pinsPerPackage; // lines of each .pins section
};

IndependentCounts CountByScan(const std::string& path) {
    IndependentCounts counts;
    std::ifstream in(path);
    std::string line;
    std::string pinsOf;
    while (std::getline(in, line)) {
        if (line.rfind('.', 0) == 0) {
            pinsOf.clear();
            std::istringstream fields(line);
            std::string head, arg;
            fields >> head >> arg;
            if (head == ".logic_tile" || head == ".io_tile" || head == ".ramb_tile" ||
                head == ".ramt_tile") {
                ++counts.tiles[head];
            } else if (head == ".pins") {
                pinsOf = arg;
                counts.packages.push_back(arg);
                counts.pinsPerPackage[arg] = 0;
            }
        } else if (!pinsOf.empty() && !line.empty() && line[0] != '#') {
            ++counts.pinsPerPackage[pinsOf];
        }
    }
    return counts;
}

int TilesOfKind(const ChipDb& db, TileKind kind) {
    int n = 0;
    for (const auto& tile : db.tiles) {
        n += tile.kind == kind ? 1 : 0;
    }
    return n;
}

void ExpectCountsMatch(const std::string& path) {
    IndependentCounts expected = CountByScan(path);
    ASSERT_FALSE(expected.packages.empty());
    for (const auto& package : expected.packages) {
        SCOPED_TRACE(package);
        ChipDb db;
        std::string error;
        ASSERT_TRUE(VnTool::ReadChipDbFile(path, package, db, error)) << error;
        EXPECT_EQ(db.package, package);
        EXPECT_EQ(db.packages, expected.packages);
        EXPECT_EQ(static_cast<int>(db.pins.size()), expected.pinsPerPackage[package]);
        EXPECT_EQ(TilesOfKind(db, TileKind::Logic), expected.tiles[".logic_tile"]);
        EXPECT_EQ(TilesOfKind(db, TileKind::Io), expected.tiles[".io_tile"]);
        EXPECT_EQ(TilesOfKind(db, TileKind::RamBottom), expected.tiles[".ramb_tile"]);
        EXPECT_EQ(TilesOfKind(db, TileKind::RamTop), expected.tiles[".ramt_tile"]);
        for (const auto& pin : db.pins) {
            ASSERT_GE(pin.bank, 0) << pin.name;
        }
    }
}

// The tile lines of a whole w x h device: IO tiles around the edge, logic inside, no tile
// in the corners, as the family's databases have them.
std::string Tiles(int w, int h) {
    std::string text;
    for (int x = 0; x < w; ++x) {
        for (int y = 0; y < h; ++y) {
            const bool xEdge = x == 0 || x == w - 1;
            const bool yEdge = y == 0 || y == h - 1;
            if (!(xEdge && yEdge)) {
                text += std::string(xEdge || yEdge ? ".io_tile " : ".logic_tile ") +
                        std::to_string(x) + " " + std::to_string(y) + "\n";
            }
        }
    }
    return text;
}

bool Read(const std::string& text, ChipDb& db, std::string& error, std::string_view package = {}) {
    std::istringstream in(text);
    return VnTool::ReadChipDb(in, "test.txt", package, db, error);
}

TEST(ChipDbReader, BundledDeviceMatchesAnIndependentCountForEveryPackage) {
    ExpectCountsMatch(VENLOMER_BUNDLED_CHIPDB);
}

TEST(ChipDbReader, BundledDeviceTakesTheFirstPackageWhenNoneIsNamed) {
    ChipDb db;
    std::string error;
    ASSERT_TRUE(VnTool::ReadChipDbFile(VENLOMER_BUNDLED_CHIPDB, "", db, error)) << error;
    EXPECT_EQ(db.device, "demo");
    EXPECT_EQ(db.width, 10);
    EXPECT_EQ(db.height, 12);
    ASSERT_FALSE(db.packages.empty());
    EXPECT_EQ(db.package, db.packages.front());
}

TEST(ChipDbReader, OneKDeviceOfThePackageMatchesAnIndependentCount) {
    std::string path = std::string(VENLOMER_SYSTEM_CHIPDB_DIR) + "/chipdb-1k.txt";
    if (!std::filesystem::exists(path)) {
        GTEST_SKIP() << path << " is not installed (package fpga-icestorm-chipdb)";
    }
    ExpectCountsMatch(path);
}

TEST(ChipDbReader, PinsFallIntoTheBankOfTheirEdge) {
    // Banks as the data sheets number them: top 0, right 1, bottom 2, left 3.
    EXPECT_EQ(VnTool::IoBankOf(5, 11, 10, 12), 0);
    EXPECT_EQ(VnTool::IoBankOf(9, 5, 10, 12), 1);
    EXPECT_EQ(VnTool::IoBankOf(5, 0, 10, 12), 2);
    EXPECT_EQ(VnTool::IoBankOf(0, 5, 10, 12), 3);
    EXPECT_EQ(VnTool::IoBankOf(5, 5, 10, 12), -1);

    ChipDb db;
    std::string error;
    ASSERT_TRUE(Read(".device t 4 4 0\n.pins p\nT 1 3 0\nR 3 2 1\nB 2 0 0\nL 0 1 1\n" + Tiles(4, 4),
                     db, error))
        << error;
    ASSERT_EQ(db.pins.size(), 4u);
    EXPECT_EQ(db.pins[0].bank, 0);
    EXPECT_EQ(db.pins[1].bank, 1);
    EXPECT_EQ(db.pins[2].bank, 2);
    EXPECT_EQ(db.pins[3].bank, 3);
    EXPECT_EQ(db.pins[1].pio, 1);
}

TEST(ChipDbReader, SkippedSectionsAreNotParsedAndLayoutNoiseIsAccepted) {
    ChipDb db;
    std::string error;
    // Windows line ends, comments, blank lines, tabs, and garbage inside sections the
    // tool does not need.
    ASSERT_TRUE(Read("# comment\r\n\r\n.device t\t4 3 0\r\n.net 1\r\n!! whatever ~~\r\n"
                     ".buffer 1 1 2 B0[1]\r\n01 3\r\n.logic_tile 1 1\r\n.dsp0_tile 2 1\r\n"
                     "anything at all\r\n.io_tile\t1 0\r\n.io_tile 2 0\r\n.io_tile 1 2\r\n"
                     ".io_tile 2 2\r\n.io_tile 0 1\r\n.ipcon_tile 3 1\r\n",
                     db, error))
        << error;
    // The DSP and IP tiles fill their place but are not drawn.
    EXPECT_EQ(db.tiles.size(), 6u);
    EXPECT_TRUE(db.pins.empty());
    EXPECT_TRUE(db.package.empty());
}

TEST(ChipDbReader, EveryCutOfAWholeDeviceIsRefused) {
    const std::string whole = ".device t 5 4 0\n.pins p\nA 1 3 0\nB 4 1 1\n" + Tiles(5, 4) +
                              ".net 0\n1 1 span4_horz_0\n2 1 span4_horz_1\n";
    ChipDb db;
    std::string error;
    ASSERT_TRUE(Read(whole, db, error)) << error;
    // Cut anywhere but at a line end in the trailing bulk, the file cannot pass for whole.
    const std::size_t bulk = whole.find(".net");
    for (std::size_t cut = 1; cut < whole.size(); ++cut) {
        if (cut >= bulk && whole[cut - 1] == '\n') {
            continue;
        }
        SCOPED_TRACE(cut);
        EXPECT_FALSE(Read(whole.substr(0, cut), db, error));
        EXPECT_EQ(error.rfind("test.txt:", 0), 0u) << error;
    }
}

TEST(ChipDbReader, AnUnknownPackageIsRefusedWithTheNamesThereAre) {
    ChipDb db;
    std::string error;
    EXPECT_FALSE(Read(".device t 4 4 0\n.pins a\n.pins b:x\n", db, error, "zz"));
    EXPECT_NE(error.find("no package \"zz\""), std::string::npos) << error;
    EXPECT_NE(error.find("a, b:x"), std::string::npos) << error;
}

// The global-buffer pins as this family's data sheets list them for two packages, read
// here from the installed databases: a misread .gbufpin line moves one of them.
TEST(ChipDbReader, GlobalBufferPinsAreThePackagePinsOfTheDataSheets) {
    struct Case {
        const char* file;
        const char* package;
        std::set<std::string> pins;
    };
    const Case cases[] = {
        {"chipdb-1k.txt", "tq144", {"20", "21", "49", "50", "93", "94", "128", "129"}},
        {"chipdb-8k.txt", "ct256", {"C8", "F7", "G1", "H11", "H16", "J3", "K9", "R9"}},
    };
    for (const Case& c : cases) {
        std::string path = std::string(VENLOMER_SYSTEM_CHIPDB_DIR) + "/" + c.file;
        if (!std::filesystem::exists(path)) {
            GTEST_SKIP() << path << " is not installed (package fpga-icestorm-chipdb)";
        }
        ChipDb db;
        std::string error;
        ASSERT_TRUE(VnTool::ReadChipDbFile(path, c.package, db, error)) << error;
        EXPECT_EQ(db.globalBufferPins.size(), 8u);
        std::set<std::string> found;
        std::set<int> networks;
        for (const auto& pin : db.pins) {
            if (VnTool::IsGlobalBufferPin(db, pin)) {
                found.insert(pin.name);
            }
        }
        for (const auto& g : db.globalBufferPins) {
            networks.insert(g.network);
        }
        EXPECT_EQ(found, c.pins) << c.file;
        EXPECT_EQ(networks, (std::set<int>{0, 1, 2, 3, 4, 5, 6, 7})) << c.file;
    }
}

struct Malformed {
    const char* text;
    const char* where; // expected prefix "test.txt:N:" or the whole-file reason
    const char* why;
};

TEST(ChipDbReader, MalformedInputIsRefusedWithTheLine) {
    const Malformed cases[] = {
        {"hello world\n", "test.txt:1:", "outside any section"},
        {"", "test.txt:", "no .device line"},
        {"# only comments\n.net 3\n1 2 x\n", "test.txt:", "no .device line"},
        {".device 8k 34\n", "test.txt:1:", ".device wants"},
        {".device 8k 34 x 10\n", "test.txt:1:", ".device wants"},
        {".device 8k 0 34 10\n", "test.txt:1:", "size out of range"},
        {".device 8k 99999 34 10\n", "test.txt:1:", "size out of range"},
        {".device 8k 129 34 10\n", "test.txt:1:", "size out of range"},
        {".device 8k 2147483648 34 10\n", "test.txt:1:", ".device wants"},
        {".device a 4 4 0\n\n.device b 4 4 0\n", "test.txt:3:", "second .device"},
        {".logic_tile 1 1\n.device a 4 4 0\n", "test.txt:1:", "before the .device"},
        {".device a 4 4 0\n.io_tile 1\n", "test.txt:2:", "two coordinates"},
        {".device a 4 4 0\n.io_tile 1 2x\n", "test.txt:2:", "two coordinates"},
        {".device a 4 4 0\n.io_tile 4 1\n", "test.txt:2:", "outside the device grid"},
        {".device a 4 4 0\n.io_tile -1 1\n", "test.txt:2:", "outside the device grid"},
        {".device a 4 4 0\n.io_tile 0 1\n.logic_tile 0 1\n", "test.txt:3:", "second tile"},
        {".device a 4 4 0\n.io_tile 0 1\n.dsp1_tile 0 1\n", "test.txt:3:", "second tile"},
        {".device a 4 4 0\n.io_tile 0 1\n1 2\n", "test.txt:3:", "unexpected line"},
        {".device a 4 4 0\n.pins p\nA1 0 1\n", "test.txt:3:", "a pin line wants"},
        {".device a 4 4 0\n.pins p\nA1 0 1 -1\n", "test.txt:3:", "negative IO block"},
        {".device a 4 4 0\n.pins p\nA1 0 1 2147483647\n",
         "test.txt:3:", "names IO block 2147483647"},
        {".device a 4 4 0\n.pins p\nA1 0 1 2\n", "test.txt:3:", "blocks 0 and 1"},
        {".device a 4 4 0\n.pins p\nA1 0 1 1\nA2 0 1 0\nA3 0 1 1\n",
         "test.txt:5:", "pin A3 claims IO block 1 of tile 0 1, which pin A1 has"},
        {".device a 4 4 0\n.io_tilx 0 1\n", "test.txt:2:", "unknown section .io_tilx"},
        {".device a 4 4 0\n.pins p\nA1 0 1 0\n.pins q\nA1 0 1 0\n.io_tile 0 1\n",
         "test.txt:6:", "the file ends with 1 of the 12 tiles of a 4 x 4 device"},
        {".device a 2 2 0\n.net 1\n1 2 sp4", "test.txt:3:", "no line end: the file is cut short"},
        {".device a 4 4 0\n.pins p\nA1 0 1 0\nA1 0 1 1\n", "test.txt:4:", "listed twice"},
        {".device a 4 4 0\n.pins\n", "test.txt:2:", "one package name"},
        {".device a 4 4 0\n.pins p\n.pins p\n", "test.txt:3:", "listed twice"},
        // The pin's tile is checked once all tiles are known; the pin's own line is named.
        {".device a 3 3 0\n.pins p\n\nA1 0 1 0\n.logic_tile 0 1\n.logic_tile 1 1\n"
         ".io_tile 1 0\n.io_tile 1 2\n.io_tile 2 1\n",
         "test.txt:4:", "no IO tile"},
        {".device a 4 4 0\n.pins p\nA1 1 2 0\n.io_tile 1 2\n", "test.txt:3:", "on no edge"},
        {".device a 4 4 0\n.gbufpin\n0 1 0\n", "test.txt:3:", ".gbufpin line wants"},
        {".device a 4 4 0\n.gbufpin\n0 9 0 1\n", "test.txt:3:", "outside the device"},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.text);
        ChipDb db;
        std::string error;
        EXPECT_FALSE(Read(c.text, db, error));
        EXPECT_EQ(error.rfind(c.where, 0), 0u) << error;
        EXPECT_NE(error.find(c.why), std::string::npos) << error;
    }
}

} // namespace
