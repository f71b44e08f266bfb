//===-- tests/tool/ToolProcessTest.cpp - venlomer prints, draws and refuses as documented -===//
//
// Each test runs the built tool in a scratch folder of its own and judges what a user
// sees: the exit status, the lines on stdout and stderr, and the picture, which is parsed
// back with a real XML parser. Expected numbers come from a plain scan of the chip
// database, not from the tool's reader.
//
//===------------------------------------------------------------------------------===//
#include "ProcessHelpers.h"
#include <expat.h>

#include <gtest/gtest.h>
#include <sqlite3.h>

#include <sys/wait.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <map>
#include <regex>
#include <set>
#include <sstream>
#include <string>
#include <vector>

namespace {

namespace fs = std::filesystem;
using VnTest::Contains;
using VnTest::LineCount;
using VnTest::Quote;
using VnTest::Result;
using VnTest::Slurp;
using VnTest::WriteBytes;

class ToolProcess : public ::testing::Test {
protected:
    void SetUp() override {
        std::string pattern = (fs::temp_directory_path() / "venlomer-tool-XXXXXX").string();
        ASSERT_NE(mkdtemp(pattern.data()), nullptr);
        m_dir = pattern;
    }
    void TearDown() override {
        std::error_code ec;
        fs::remove_all(m_dir, ec);
    }

    Result Run(const std::vector<std::string>& args, const std::string& env = "") {
        std::string command =
            "cd " + Quote(m_dir.string()) + " && env " + env + " " + Quote(VENLOMER_TOOL_PATH);
        for (const auto& arg : args) {
            command += " " + Quote(arg);
        }
        command +=
            " >" + Quote((m_dir / "stdout").string()) + " 2>" + Quote((m_dir / "stderr").string());
        Result result;
        int raw = std::system(command.c_str());
        result.status = WIFEXITED(raw) ? WEXITSTATUS(raw) : -1;
        result.out = Slurp(m_dir / "stdout");
        result.err = Slurp(m_dir / "stderr");
        return result;
    }

    fs::path m_dir;
};

// ---- what the picture holds ------------------------------------------------------------

struct SvgCounts {
    bool wellFormed = false;
    std::string error;
    int tiles = 0;
    int pins = 0;
    int highlighted = 0;
    int elements = 0;
    std::map<std::string, std::set<std::string>> fillsByClass;
};

void OnStart(void* data, const XML_Char* name, const XML_Char** attributes) {
    auto* counts = static_cast<SvgCounts*>(data);
    ++counts->elements;
    (void)name;
    std::string cssClass;
    std::string fill;
    for (int i = 0; attributes[i] != nullptr; i += 2) {
        if (std::string(attributes[i]) == "fill") {
            fill = attributes[i + 1];
        }
        if (std::string(attributes[i]) != "class") {
            continue;
        }
        cssClass = attributes[i + 1];
        std::istringstream tokens(attributes[i + 1]);
        std::string token;
        while (tokens >> token) {
            counts->tiles += token == "tile" ? 1 : 0;
            counts->pins += token == "pin" ? 1 : 0;
            counts->highlighted += token == "hl" ? 1 : 0;
        }
    }
    if (!cssClass.empty()) {
        counts->fillsByClass[cssClass].insert(fill);
    }
}

SvgCounts ParseSvg(const fs::path& path) {
    SvgCounts counts;
    std::string text = Slurp(path);
    XML_Parser parser = XML_ParserCreate(nullptr);
    XML_SetUserData(parser, &counts);
    XML_SetStartElementHandler(parser, OnStart);
    counts.wellFormed =
        XML_Parse(parser, text.data(), static_cast<int>(text.size()), 1) == XML_STATUS_OK;
    if (!counts.wellFormed) {
        counts.error = std::string(XML_ErrorString(XML_GetErrorCode(parser))) + " at line " +
                       std::to_string(XML_GetCurrentLineNumber(parser));
    }
    XML_ParserFree(parser);
    return counts;
}

// ---- what the chip database holds, by a plain scan -------------------------------------

struct ScannedPin {
    std::string name;
    int x = 0;
    int y = 0;
};

struct Scan {
    int width = 0;
    int height = 0;
    int tiles = 0;
    std::vector<ScannedPin> pins;
};

// Pins of `package`, or of the first package when it is empty.
Scan ScanChipDb(const std::string& path, const std::string& package) {
    Scan scan;
    std::ifstream in(path);
    std::string line;
    bool inPins = false;
    bool taken = false;
    while (std::getline(in, line)) {
        // Only headers and the wanted pins matter; the bulk of the file is routing.
        if (line.empty() || (line[0] != '.' && !inPins)) {
            continue;
        }
        std::istringstream fields(line);
        std::string head;
        fields >> head;
        if (head.rfind('.', 0) == 0) {
            inPins = false;
            if (head == ".device") {
                std::string name;
                fields >> name >> scan.width >> scan.height;
            } else if (head == ".logic_tile" || head == ".io_tile" || head == ".ramb_tile" ||
                       head == ".ramt_tile") {
                ++scan.tiles;
            } else if (head == ".pins") {
                std::string name;
                fields >> name;
                inPins = !taken && (package.empty() || name == package);
                taken = taken || inPins;
            }
        } else if (inPins && !head.empty() && head[0] != '#') {
            ScannedPin pin{head};
            fields >> pin.x >> pin.y;
            scan.pins.push_back(pin);
        }
    }
    return scan;
}

std::string SystemChipDb(const char* name) {
    std::string path = std::string(VENLOMER_SYSTEM_CHIPDB_DIR) + "/" + name;
    return fs::exists(path) ? path : std::string();
}

// ---- the tool as a whole ---------------------------------------------------------------

TEST_F(ToolProcess, HelpIsGivenForTheToolAndEveryCommand) {
    Result top = Run({"--help"});
    EXPECT_EQ(top.status, 0);
    const char* commands[] = {"floorplan", "colors",     "ngc-stub",
                              "ngc-new",   "ngd-sample", "project-files"};
    for (const char* command : commands) {
        EXPECT_TRUE(Contains(top.out, command)) << command;
        Result help = Run({command, "--help"});
        EXPECT_EQ(help.status, 0) << command;
        EXPECT_EQ(help.out.rfind(std::string("usage: venlomer ") + command, 0), 0u) << help.out;
        EXPECT_TRUE(help.err.empty()) << help.err;
    }
}

TEST_F(ToolProcess, BadUsageExitsWithTwoAndOneLineOfReason) {
    const std::vector<std::vector<std::string>> cases = {
        {},
        {"paint"},
        {"floorplan", "--bogus"},
        {"floorplan", "--svg"},
        {"floorplan", "--find", "Bank"},
        {"floorplan", "--find", "=3"},
        {"floorplan", "--find", "Bank=0", "--flags", "fuzzy"},
        {"floorplan", "--flags", "exact"},
        {"floorplan", "extra"},
        {"ngc-stub", "only-one.ngd"},
        {"ngc-new", "a.ngc", "design", "part"},
        {"ngd-sample"},
        {"colors", "--svg"},
        {"project-files", "--project"},
        // An empty device name is refused alike by every command that opens a device.
        {"floorplan", "--chipdb", ""},
        {"edit", "--design", "top.json", "--pcf", "top.pcf", "--chipdb", ""},
        {"edit", "--design", "top.json", "--pcf", "top.pcf", "--device", ""},
    };
    for (const auto& args : cases) {
        std::string shown;
        for (const auto& arg : args) {
            shown += arg + " ";
        }
        Result result = Run(args);
        EXPECT_EQ(result.status, 2) << shown;
        EXPECT_EQ(LineCount(result.err), 1) << shown << "\n" << result.err;
        EXPECT_TRUE(result.out.empty()) << shown << "\n" << result.out;
    }
}

// ---- floorplan ------------------------------------------------------------------------

// Drawn without a search and with one that matches nothing: every tile and pin, none lit.
TEST_F(ToolProcess, FloorplanOfTheBundledDeviceDrawsEveryTileAndPin) {
    Scan scan = ScanChipDb(VENLOMER_BUNDLED_CHIPDB, "");
    for (bool search : {false, true}) {
        std::vector<std::string> args = {"floorplan", "--chipdb", VENLOMER_BUNDLED_CHIPDB};
        if (search) {
            args.insert(args.end(), {"--find", "Name=NO-SUCH-PIN"});
        }
        Result result = Run(args);
        ASSERT_EQ(result.status, 0) << result.err;
        EXPECT_TRUE(Contains(result.out, "Device demo (10 x 12 tiles)")) << result.out;
        EXPECT_TRUE(
            Contains(result.out, "Floorplan written to " + (m_dir / "floorplan.svg").string()))
            << result.out;
        if (search) {
            EXPECT_TRUE(Contains(result.out, ": 0 matches")) << result.out;
            EXPECT_TRUE(Contains(result.out, "Highlighted: 0 pins")) << result.out;
        }
        SvgCounts svg = ParseSvg(m_dir / "floorplan.svg");
        ASSERT_TRUE(svg.wellFormed) << svg.error;
        EXPECT_EQ(svg.tiles, scan.tiles);
        EXPECT_EQ(svg.pins, static_cast<int>(scan.pins.size()));
        EXPECT_EQ(svg.highlighted, 0);
    }
    EXPECT_FALSE(fs::exists(m_dir / "floorplan.svg.part"));
}

TEST_F(ToolProcess, FloorplanFallsBackToTheBundledDeviceWithoutThePackage) {
    Result result = Run({"floorplan", "--svg", "fallback.svg"},
                        "VENLOMER_CHIPDB_DIR=" + (m_dir / "no-such-folder").string());
    ASSERT_EQ(result.status, 0) << result.err;
    EXPECT_TRUE(Contains(result.out, "bundled demo device")) << result.out;
    EXPECT_TRUE(Contains(result.out, "Device demo")) << result.out;
    EXPECT_TRUE(ParseSvg(m_dir / "fallback.svg").wellFormed);
}

TEST_F(ToolProcess, ARegexpSearchHighlightsThePinsWhoseNameItMatchesFromTheStart) {
    Scan scan = ScanChipDb(VENLOMER_BUNDLED_CHIPDB, "");
    std::regex pattern("^1[0-9]");
    int expected = 0;
    for (const auto& pin : scan.pins) {
        expected += std::regex_search(pin.name, pattern) ? 1 : 0;
    }
    ASSERT_GT(expected, 0);
    Result result = Run({"floorplan", "--chipdb", VENLOMER_BUNDLED_CHIPDB, "--find", "Name=1[0-9]",
                         "--flags", "regexp", "--highlight-only"});
    ASSERT_EQ(result.status, 0) << result.err;
    EXPECT_TRUE(Contains(result.out, ": " + std::to_string(expected) + " matches")) << result.out;
    SvgCounts svg = ParseSvg(m_dir / "floorplan.svg");
    ASSERT_TRUE(svg.wellFormed) << svg.error;
    // --highlight-only leaves the other pins out of the picture.
    EXPECT_EQ(svg.pins, expected);
    EXPECT_EQ(svg.highlighted, expected);
}

TEST_F(ToolProcess, AWithinFivePercentSearchOnXTakesTheNeighbouringColumns) {
    std::string chipDb = SystemChipDb("chipdb-8k.txt");
    std::string package = chipDb.empty() ? "" : "ct256";
    int wanted = chipDb.empty() ? 8 : 20;
    if (chipDb.empty()) {
        chipDb = VENLOMER_BUNDLED_CHIPDB;
    }
    Scan scan = ScanChipDb(chipDb, package);
    int expected = 0;
    int exact = 0;
    for (const auto& pin : scan.pins) {
        // The pin's own X is the value within 5 percent of which the wanted one must lie.
        expected += (wanted >= pin.x - pin.x * 0.05 && pin.x + pin.x * 0.05 >= wanted) ? 1 : 0;
        exact += pin.x == wanted ? 1 : 0;
    }
    std::vector<std::string> args = {
        "floorplan", "--chipdb",        chipDb, "--find", "X=" + std::to_string(wanted),
        "--flags",   "within-5-percent"};
    if (!package.empty()) {
        args.insert(args.end(), {"--package", package});
        EXPECT_GT(expected, exact) << "column 21 lies within 5 percent of 20";
    }
    Result result = Run(args);
    ASSERT_EQ(result.status, 0) << result.err;
    EXPECT_TRUE(Contains(result.out, ": " + std::to_string(expected) + " match")) << result.out;
    SvgCounts svg = ParseSvg(m_dir / "floorplan.svg");
    ASSERT_TRUE(svg.wellFormed) << svg.error;
    EXPECT_EQ(svg.highlighted, expected);
}

TEST_F(ToolProcess, ABankSearchOnTheDefaultDeviceSelectsThePinsBelowTheBank) {
    std::string chipDb = SystemChipDb("chipdb-8k.txt");
    if (chipDb.empty()) {
        GTEST_SKIP() << "fpga-icestorm-chipdb is not installed";
    }
    Scan scan = ScanChipDb(chipDb, "ct256");
    int top = 0;
    for (const auto& pin : scan.pins) {
        top += pin.y == scan.height - 1 ? 1 : 0;
    }
    ASSERT_GT(top, 0);
    Result result = Run({"floorplan", "--find", "Bank=0", "--svg", "bank0.svg"});
    ASSERT_EQ(result.status, 0) << result.err;
    EXPECT_TRUE(Contains(result.out, "package ct256")) << result.out;
    // The bank itself matches too; selecting it brings its pins along.
    EXPECT_TRUE(Contains(result.out, ": " + std::to_string(top + 1) + " matches")) << result.out;
    EXPECT_TRUE(Contains(result.out, "Selected: " + std::to_string(top + 1) + " resources"))
        << result.out;
    EXPECT_TRUE(Contains(result.out, "Highlighted: " + std::to_string(top) + " pins"))
        << result.out;
    SvgCounts svg = ParseSvg(m_dir / "bank0.svg");
    ASSERT_TRUE(svg.wellFormed) << svg.error;
    EXPECT_EQ(svg.tiles, scan.tiles);
    EXPECT_EQ(svg.pins, static_cast<int>(scan.pins.size()));
    EXPECT_EQ(svg.highlighted, top);
}

TEST_F(ToolProcess, FloorplanRefusalsExitWithOneAndSayWhy) {
    {
        std::ofstream(m_dir / "bad.txt") << ".device x 4 4 0\n.io_tile 9 9\n";
        Result result = Run({"floorplan", "--chipdb", (m_dir / "bad.txt").string()});
        EXPECT_EQ(result.status, 1);
        EXPECT_TRUE(Contains(result.err, "bad.txt:2: .io_tile outside the device grid"))
            << result.err;
        EXPECT_FALSE(fs::exists(m_dir / "floorplan.svg"));
    }
    {
        Result result =
            Run({"floorplan", "--chipdb", VENLOMER_BUNDLED_CHIPDB, "--package", "qfn999"});
        EXPECT_EQ(result.status, 1);
        EXPECT_TRUE(Contains(result.err, "no package \"qfn999\"")) << result.err;
    }
    {
        Result result = Run({"floorplan", "--chipdb", VENLOMER_BUNDLED_CHIPDB, "--svg",
                             (m_dir / "missing-folder" / "x.svg").string()});
        EXPECT_EQ(result.status, 1);
        EXPECT_TRUE(Contains(result.err, "cannot write")) << result.err;
    }
}

TEST_F(ToolProcess, ASearchValueThatCannotBeOfThePropertysTypeIsBadUsage) {
    for (const char* find : {"X=abc", "Colour=red"}) {
        Result result = Run({"floorplan", "--chipdb", VENLOMER_BUNDLED_CHIPDB, "--find", find});
        EXPECT_EQ(result.status, 2) << find;
        EXPECT_EQ(LineCount(result.err), 1) << result.err;
        EXPECT_TRUE(result.out.empty()) << result.out;
        EXPECT_FALSE(fs::exists(m_dir / "floorplan.svg"));
    }
}

// The Clock column prints "yes" and "no"; the search takes the words it prints. A small
// netlist as yosys writes it for one flip-flop: clk reaches the flip-flop's clock.
TEST_F(ToolProcess, PinsShowFindsTheClockPortsByTheWordTheTablePrints) {
    std::ofstream(m_dir / "dff.json") << R"({"creator": "Yosys", "modules": {"top": {
  "attributes": {"top": "00000000000000000000000000000001"},
  "ports": {"clk": {"direction": "input", "bits": [2]}, "d": {"direction": "input", "bits": [3]},
            "q": {"direction": "output", "bits": [4]}},
  "cells": {"q_reg": {"type": "SB_DFF", "port_directions": {"C": "input", "D": "input", "Q": "output"},
                      "connections": {"C": [2], "D": [3], "Q": [4]}}},
  "netnames": {}}}}
)";
    std::ofstream(m_dir / "dff.pcf") << "set_io clk 21\nset_io d 2\n";
    auto show = [&](const char* find) {
        return Run({"pins", "show", "--design", "dff.json", "--pcf", "dff.pcf", "--device", "1k",
                    "--find", find, "--svg", "dff.svg"},
                   "VENLOMER_CHIPDB_DIR=" VENLOMER_SYSTEM_CHIPDB_DIR);
    };
    Result clocks = show("Clock=yes");
    ASSERT_EQ(clocks.status, 0) << clocks.err;
    EXPECT_TRUE(Contains(clocks.out, ": 1 match\n")) << clocks.out;
    EXPECT_TRUE(Contains(clocks.out, "clk")) << clocks.out;
    Result others = show("Clock=no");
    ASSERT_EQ(others.status, 0) << others.err;
    EXPECT_TRUE(Contains(others.out, ": 2 matches")) << others.out;
    Result neither = show("Clock=maybe");
    EXPECT_EQ(neither.status, 2);
    EXPECT_TRUE(Contains(neither.err, "Clock is yes or no")) << neither.err;
}

} // namespace

// ---- netlist stubs --------------------------------------------------------------------

namespace {

// One column of the first row a query answers, or "" without a row.
std::string QueryText(const fs::path& database, const std::string& sql) {
    sqlite3* db = nullptr;
    std::string text;
    if (sqlite3_open_v2(database.c_str(), &db, SQLITE_OPEN_READONLY, nullptr) == SQLITE_OK) {
        sqlite3_stmt* statement = nullptr;
        if (sqlite3_prepare_v2(db, sql.c_str(), -1, &statement, nullptr) == SQLITE_OK &&
            sqlite3_step(statement) == SQLITE_ROW) {
            const unsigned char* value = sqlite3_column_text(statement, 0);
            text = value != nullptr ? reinterpret_cast<const char*>(value) : "";
        }
        sqlite3_finalize(statement);
    }
    sqlite3_close(db);
    return text;
}

struct StubContent {
    std::string design, part, block;
};

StubContent ReadStub(const fs::path& file) {
    return {QueryText(file, "SELECT name FROM nmod_design ORDER BY id"),
            QueryText(file, "SELECT value FROM nmod_view_property WHERE name = 'PART'"),
            QueryText(file, "SELECT name FROM nmod_block ORDER BY id")};
}

} // namespace

TEST_F(ToolProcess, AStubIsMadeFromTheSampleNetlistWithItsThreeNames) {
    Result sample = Run({"ngd-sample", "top.ngd", "--design", "top", "--part", "iCE40HX1K-TQ144",
                         "--block", "top_root"});
    ASSERT_EQ(sample.status, 0) << sample.err;
    ASSERT_TRUE(fs::exists(m_dir / "top.ngd"));

    Result stub = Run({"--verbose", "ngc-stub", "top.ngd", "top.ngc"});
    ASSERT_EQ(stub.status, 0) << stub.err;
    EXPECT_TRUE(Contains(stub.out, "written to top.ngc")) << stub.out;
    // The library's debug line shows only when asked for.
    EXPECT_TRUE(Contains(stub.err, "Parttype Databook format: iCE40HX1K-TQ144")) << stub.err;
    StubContent content = ReadStub(m_dir / "top.ngc");
    EXPECT_EQ(content.design, "top");
    EXPECT_EQ(content.part, "iCE40HX1K-TQ144");
    EXPECT_EQ(content.block, "top_root");

    // An existing stub counts as done and is not touched.
    auto written = fs::last_write_time(m_dir / "top.ngc");
    Result again = Run({"ngc-stub", "top.ngd", "top.ngc"});
    EXPECT_EQ(again.status, 0) << again.err;
    EXPECT_TRUE(Contains(again.out, "exists already")) << again.out;
    EXPECT_FALSE(Contains(again.err, "Parttype")) << again.err;
    EXPECT_EQ(fs::last_write_time(m_dir / "top.ngc"), written);

    // The sample is never written over.
    Result sampleAgain = Run({"ngd-sample", "top.ngd"});
    EXPECT_EQ(sampleAgain.status, 1);
    EXPECT_TRUE(Contains(sampleAgain.err, "exists already")) << sampleAgain.err;
}

TEST_F(ToolProcess, AStubFromAMissingOrForeignNetlistIsRefusedWithTheLibrarysReason) {
    Result missing = Run({"ngc-stub", "missing.ngd", "out.ngc"});
    EXPECT_EQ(missing.status, 1);
    EXPECT_TRUE(Contains(missing.err, "The ngd file \"missing.ngd\" was not found")) << missing.err;
    EXPECT_FALSE(fs::exists(m_dir / "out.ngc"));

    std::ofstream(m_dir / "text.ngd") << "not a database\n";
    Result foreign = Run({"ngc-stub", "text.ngd", "out.ngc"});
    EXPECT_EQ(foreign.status, 1);
    EXPECT_TRUE(Contains(foreign.err, "text.ngd")) << foreign.err;
    EXPECT_FALSE(fs::exists(m_dir / "out.ngc"));
}

TEST_F(ToolProcess, AStubIsMadeFromFourNamesInTheirOrder) {
    Result made = Run({"ngc-new", "n.ngc", "design_d", "part_p", "block_b"});
    ASSERT_EQ(made.status, 0) << made.err;
    StubContent content = ReadStub(m_dir / "n.ngc");
    EXPECT_EQ(content.design, "design_d");
    EXPECT_EQ(content.part, "part_p");
    EXPECT_EQ(content.block, "block_b");

    Result again = Run({"ngc-new", "n.ngc", "other", "part", "block"});
    EXPECT_EQ(again.status, 1);
    EXPECT_EQ(ReadStub(m_dir / "n.ngc").design, "design_d");
}

TEST_F(ToolProcess, OfConcurrentRunsWritingOneStubOnlyTheOneWhoseDesignLandedSucceeds) {
    // Twelve runs at once, ten times over: whichever run finishes first owns the file,
    // and every other run, however far it got, reports failure.
    constexpr int kRuns = 12;
    constexpr int kRounds = 10;
    for (int round = 0; round < kRounds; ++round) {
        SCOPED_TRACE("round " + std::to_string(round));
        const std::string ngc = "race" + std::to_string(round) + ".ngc";
        std::string command = "cd " + Quote(m_dir.string()) + " && for i in $(seq 0 " +
                              std::to_string(kRuns - 1) + "); do (" + Quote(VENLOMER_TOOL_PATH) +
                              " ngc-new " + ngc +
                              " design_$i part block >/dev/null 2>&1; echo $? >status$i) & "
                              "done; wait";
        ASSERT_EQ(std::system(command.c_str()), 0);
        std::vector<int> winners;
        for (int i = 0; i < kRuns; ++i) {
            const std::string status = Slurp(m_dir / ("status" + std::to_string(i)));
            EXPECT_TRUE(status == "0\n" || status == "1\n") << "run " << i << ": " << status;
            if (status == "0\n") {
                winners.push_back(i);
            }
        }
        ASSERT_EQ(winners.size(), 1u) << "exactly one run may say it wrote the stub";
        EXPECT_EQ(ReadStub(m_dir / ngc).design, "design_" + std::to_string(winners[0]));
    }
}

// ---- project files --------------------------------------------------------------------

TEST_F(ToolProcess, ProjectFilesComeFromTheSampleHostsProject) {
    std::ofstream(m_dir / "top.prj") << "project \"/work/top/top.zam\"\n"
                                        "view synth VIEW_Synthesis\n"
                                        "view xlate VIEW_Translation\n"
                                        "default synth\n"
                                        "unit synth DESUT_UCF \"/work/top/\" \"top.ucf\"\n"
                                        "binding synth xlate\n"
                                        "unit xlate DESUT_NGD \"/work/top/\" \"top.ngd\"\n";
    const std::string expected = "Project file:     /work/top/top.zam\n"
                                 "Constraints file: /work/top/top.ucf\n"
                                 "Netlist database: /work/top/top.ngd\n";
    Result byOption = Run({"project-files", "--project", "top.prj"});
    EXPECT_EQ(byOption.status, 0) << byOption.err;
    EXPECT_EQ(byOption.out, expected);

    Result byEnvironment =
        Run({"--verbose", "project-files"}, "VENLOMER_PROJECT=" + (m_dir / "top.prj").string());
    EXPECT_EQ(byEnvironment.status, 0) << byEnvironment.err;
    EXPECT_EQ(byEnvironment.out, expected);
    EXPECT_TRUE(Contains(byEnvironment.err, "NGD File /work/top/top.ngd")) << byEnvironment.err;
}

TEST_F(ToolProcess, ProjectFilesWithoutAFullProjectAreRefused) {
    Result none = Run({"project-files"}, "-u VENLOMER_PROJECT");
    EXPECT_EQ(none.status, 1);
    EXPECT_TRUE(Contains(none.err, "no project open")) << none.err;

    // A project whose default view has no translation view below it: the project and the
    // constraints file are found, the netlist database is not.
    std::ofstream(m_dir / "half.prj") << "project \"/p/half.zam\"\n"
                                         "view synth VIEW_Synthesis\n"
                                         "default synth\n"
                                         "unit synth DESUT_UCF \"/p/\" \"half.ucf\"\n";
    Result half = Run({"project-files", "--project", "half.prj"});
    EXPECT_EQ(half.status, 1);
    EXPECT_TRUE(Contains(half.out, "Project file:     /p/half.zam\n")) << half.out;
    EXPECT_TRUE(Contains(half.out, "Constraints file: /p/half.ucf\n")) << half.out;
    EXPECT_TRUE(Contains(half.out, "Netlist database: \n")) << half.out;
}

// ---- colours --------------------------------------------------------------------------

namespace {

struct PrintedScheme {
    int colours = 0;  // every colour line printed
    int declared = 0; // the sum of the "(N)" counts plus the single colours
    bool countsAgree = true;
};

PrintedScheme ReadPrintedScheme(const std::string& out) {
    PrintedScheme scheme;
    std::istringstream lines(out);
    std::string line;
    int expectedInGroup = -1;
    int inGroup = 0;
    std::smatch match;
    const std::regex header(R"(^[A-Z][A-Za-z -]+ \((\d+)\):$)");
    auto closeGroup = [&] {
        if (expectedInGroup >= 0 && inGroup != expectedInGroup) {
            scheme.countsAgree = false;
        }
    };
    while (std::getline(lines, line)) {
        if (line.rfind("  ", 0) == 0) {
            ++scheme.colours;
            ++inGroup;
        } else if (std::regex_match(line, match, header)) {
            closeGroup();
            expectedInGroup = std::stoi(match[1]);
            scheme.declared += expectedInGroup;
            inGroup = 0;
        } else if (line == "Single colours:") {
            closeGroup();
            expectedInGroup = 3;
            scheme.declared += 3;
            inGroup = 0;
        }
    }
    closeGroup();
    return scheme;
}

} // namespace

TEST_F(ToolProcess, ColorsPrintsTheLoadedSchemeAndDrawsOneSwatchPerColour) {
    Result result = Run({"colors", "--svg", "scheme.svg"});
    ASSERT_EQ(result.status, 0) << result.err;
    std::smatch match;
    ASSERT_TRUE(std::regex_search(result.out, match,
                                  std::regex("Colour scheme: read from (.*rareroded\\.acd)\n")))
        << result.out;
    EXPECT_TRUE(fs::exists(match[1].str()));
    PrintedScheme scheme = ReadPrintedScheme(result.out);
    EXPECT_TRUE(scheme.countsAgree) << result.out;
    EXPECT_EQ(scheme.colours, scheme.declared);
    EXPECT_GT(scheme.colours, 3);
    // The roles the floorplan colours by are in the default scheme.
    for (const char* type : {"SLICE", "TB_IO", "LR_IO", "BRAM"}) {
        EXPECT_TRUE(std::regex_search(result.out,
                                      std::regex(std::string("\n  ") + type + " +#[0-9a-f]{6}\n")))
            << type;
    }

    std::string svgText = Slurp(m_dir / "scheme.svg");
    SvgCounts svg = ParseSvg(m_dir / "scheme.svg");
    ASSERT_TRUE(svg.wellFormed) << svg.error;
    int swatches = 0;
    for (std::size_t at = 0; (at = svgText.find("class=\"swatch", at)) != std::string::npos; ++at) {
        ++swatches;
    }
    EXPECT_EQ(swatches, scheme.colours);
}

TEST_F(ToolProcess, ColorsSaysWhenTheSchemeFileIsRejected) {
    std::ofstream(m_dir / "rareroded.acd") << "this is not a key file\n";
    Result result = Run({"colors"}, "VENLOMER_DATA_PATH=" + m_dir.string());
    EXPECT_EQ(result.status, 0) << result.err;
    EXPECT_TRUE(Contains(result.out, (m_dir / "rareroded.acd").string() + " was rejected"))
        << result.out;
    EXPECT_TRUE(Contains(result.out, "Generic colours (0):")) << result.out;
    EXPECT_TRUE(Contains(result.out, "  tile                 (none)")) << result.out;
}

TEST_F(ToolProcess, FloorplanColoursEveryRoleWithTheSchemesColour) {
    Result scheme = Run({"colors"});
    ASSERT_EQ(scheme.status, 0) << scheme.err;
    // The colour printed on the line "  NAME  #rrggbb" that follows the group's header.
    auto colourOf = [&](const std::string& group, const std::string& name) {
        std::size_t from = scheme.out.find(group);
        std::smatch match;
        std::string rest = from == std::string::npos ? "" : scheme.out.substr(from);
        std::regex line("\n  " + name + " +(#[0-9a-f]{6})\n");
        return std::regex_search(rest, match, line) ? match[1].str() : std::string("?");
    };
    Result result = Run({"floorplan", "--chipdb", VENLOMER_BUNDLED_CHIPDB, "--find", "Bank=0"});
    ASSERT_EQ(result.status, 0) << result.err;
    SvgCounts svg = ParseSvg(m_dir / "floorplan.svg");
    ASSERT_TRUE(svg.wellFormed) << svg.error;
    using Fills = std::set<std::string>;
    EXPECT_EQ(svg.fillsByClass["tile logic"], Fills{colourOf("Tile types", "SLICE")});
    EXPECT_EQ(svg.fillsByClass["tile ramb"], Fills{colourOf("Tile types", "BRAM")});
    EXPECT_EQ(svg.fillsByClass["tile ramt"], Fills{colourOf("Tile types", "BRAM")});
    EXPECT_EQ(svg.fillsByClass["tile io"],
              (Fills{colourOf("Tile types", "TB_IO"), colourOf("Tile types", "LR_IO")}));
    // Bank 0 is highlighted in the first path colour; the other banks keep theirs.
    EXPECT_EQ(svg.fillsByClass["pin hl"], Fills{colourOf("Selected-path colours", "0")});
    EXPECT_EQ(svg.fillsByClass["pin"],
              (Fills{colourOf("IO bank colours", "1"), colourOf("IO bank colours", "2"),
                     colourOf("IO bank colours", "3")}));
}

TEST_F(ToolProcess, TheProgramFindsTheSchemeBesideItWithoutTheDataPath) {
    Result result = Run({"colors"}, "-u VENLOMER_DATA_PATH");
    ASSERT_EQ(result.status, 0) << result.err;
    fs::path beside =
        fs::path(VENLOMER_TOOL_PATH).parent_path().parent_path() / "share" / "venlomer";
    EXPECT_TRUE(Contains(result.out, "read from " + (beside / "rareroded.acd").string()))
        << result.out;
}
