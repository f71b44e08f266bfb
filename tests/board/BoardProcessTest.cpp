//===-- tests/board/BoardProcessTest.cpp - from a board's files to a placed design ---===//
//
// The board commands run as a user meets them: a plan made from a board file that
// nextpnr-ice40 places exactly as planned, disagreements with the constraint file and
// between a netlist and its board refused until settled, and the CSV table out and in.
//
//===------------------------------------------------------------------------------===//
#include "BoardTestSupport.h"
#include "NextpnrBels.h"
#include "ProcessHelpers.h"

#include <gtest/gtest.h>

#include <sys/wait.h>
#include <unistd.h>

#include <cstdlib>
#include <filesystem>
#include <map>

namespace {

namespace fs = std::filesystem;
using BoardTest::DataFile;
using VnTest::Contains;
using VnTest::Quote;
using VnTest::Result;
using VnTest::Slurp;
using VnTest::WriteBytes;

// Synthesized once per build tree; a netlist older than its Verilog is made again.
std::string Netlist(std::string& why) {
    fs::path json = fs::path(VENLOMER_NETLIST_CACHE) / "board1k.json";
    fs::path verilog = DataFile("board1k.v");
    std::error_code ec;
    if (fs::exists(json, ec) && fs::last_write_time(json, ec) >= fs::last_write_time(verilog, ec)) {
        return json.string();
    }
    fs::create_directories(VENLOMER_NETLIST_CACHE, ec);
    std::string partial = json.string() + ".part" + std::to_string(static_cast<long>(::getpid()));
    std::string command = "timeout 300 yosys -q -p " +
                          Quote("synth_ice40 -top top -json " + partial) + " " +
                          Quote(verilog.string()) + " >/dev/null 2>&1";
    if (std::system(command.c_str()) != 0) {
        why = command + " failed (scripts/bootstrap installs yosys)";
        return "";
    }
    fs::rename(partial, json, ec);
    return json.string();
}

class BoardProcess : public ::testing::Test {
protected:
    void SetUp() override {
        std::string pattern = (fs::temp_directory_path() / "venlomer-board-XXXXXX").string();
        ASSERT_NE(mkdtemp(pattern.data()), nullptr);
        m_dir = pattern;
        std::string why;
        m_json = Netlist(why);
        ASSERT_FALSE(m_json.empty()) << why;
        m_pcf = (m_dir / "top.pcf").string();
    }
    void TearDown() override {
        std::error_code ec;
        fs::remove_all(m_dir, ec);
    }

    Result Run(const std::string& command, std::vector<std::string> args) {
        std::string line = "cd " + Quote(m_dir.string()) + " && timeout 120 " +
                           Quote(VENLOMER_TOOL_PATH) + " pins " + command;
        args.insert(args.end(), {"--design", m_json, "--pcf", m_pcf, "--device", "1k"});
        for (const auto& arg : args) {
            line += " " + Quote(arg);
        }
        line +=
            " >" + Quote((m_dir / "stdout").string()) + " 2>" + Quote((m_dir / "stderr").string());
        int raw = std::system(line.c_str());
        Result result;
        result.status = WIFEXITED(raw) ? WEXITSTATUS(raw) : -1;
        result.out = Slurp(m_dir / "stdout");
        result.err = Slurp(m_dir / "stderr");
        return result;
    }

    // The bel nextpnr-ice40 constrained each port to, and its exit status.
    int Place(std::map<std::string, std::string>& bels, std::string& log) {
        fs::path logFile = m_dir / "nextpnr.log";
        std::string line = "timeout 300 nextpnr-ice40 --hx1k --package tq144 --json " +
                           Quote(m_json) + " --pcf " + Quote(m_pcf) + " --asc " +
                           Quote((m_dir / "top.asc").string()) + " >" + Quote(logFile.string()) +
                           " 2>&1";
        int raw = std::system(line.c_str());
        log = Slurp(logFile);
        bels = VnTest::ConstrainedBels(log);
        return WIFEXITED(raw) ? WEXITSTATUS(raw) : -1;
    }

    fs::path m_dir;
    std::string m_json;
    std::string m_pcf;
};

// The board's plan, as the fixture's nets give it.
const std::map<std::string, std::string> kPlan = {
    {"clk", "21"},    {"rst_n", "7"},   {"btn_n", "8"},   {"uart_rx", "9"}, {"uart_tx", "10"},
    {"led[0]", "99"}, {"led[1]", "98"}, {"led[2]", "97"}, {"led[3]", "96"}, {"lcd_d0", "112"}};

TEST_F(BoardProcess, NextpnrPlacesABoardFilesPlanExactlyAsPlanned) {
    WriteBytes(m_pcf, "# timing\nset_frequency clk 12\n");
    Result r = Run("from-board", {"--board", DataFile("board1k-kicad8.kicad_pcb")});
    ASSERT_EQ(r.status, 0) << r.out << r.err;
    EXPECT_TRUE(Contains(r.out, "FPGA U1 (iCE40HX1K-TQ144)")) << r.out;
    EXPECT_TRUE(Contains(r.out, "Ports with no net (1):\n  spare\n")) << r.out;
    EXPECT_TRUE(Contains(r.out, "101 /SPARE_IO")) << r.out;
    std::string pcf = Slurp(m_pcf);
    EXPECT_EQ(pcf.rfind("# timing\nset_frequency clk 12\n", 0), 0u) << pcf;

    // The port the board has no net for is the user's to place; --auto gives it a free pin.
    r = Run("assign", {"--auto"});
    ASSERT_EQ(r.status, 0) << r.out << r.err;
    std::map<std::string, std::string> bels;
    std::string log;
    ASSERT_EQ(Place(bels, log), 0) << log;
    ASSERT_EQ(bels.count("spare"), 1u) << log;
    bels.erase("spare");
    EXPECT_EQ(bels, VnTest::PlannedBels(BoardTest::OneK(), kPlan)) << log;
}

TEST_F(BoardProcess, ADisagreeingConstraintFileWaitsForPrefer) {
    const std::string before = "set_io clk 20 # moved by hand\nset_io led[0] 99\n";
    WriteBytes(m_pcf, before);
    std::vector<std::string> board = {"--board", DataFile("board1k-kicad5.net")};
    Result r = Run("from-board", board);
    EXPECT_EQ(r.status, 1) << r.out << r.err;
    EXPECT_TRUE(Contains(r.out, "port clk: " + m_pcf + " puts it on 20, the board on 21")) << r.out;
    EXPECT_TRUE(Contains(r.err, "--prefer board|file decides")) << r.err;
    EXPECT_EQ(Slurp(m_pcf), before);

    board.insert(board.end(), {"--prefer", "file"});
    r = Run("from-board", board);
    ASSERT_EQ(r.status, 0) << r.out << r.err;
    EXPECT_EQ(Slurp(m_pcf).rfind(before, 0), 0u) << Slurp(m_pcf);

    WriteBytes(m_pcf, before);
    board.back() = "board";
    r = Run("from-board", board);
    ASSERT_EQ(r.status, 0) << r.out << r.err;
    EXPECT_EQ(Slurp(m_pcf).rfind("set_io clk 21 # moved by hand\nset_io led[0] 99\n", 0), 0u)
        << Slurp(m_pcf);

    board.back() = "both";
    EXPECT_EQ(Run("from-board", board).status, 2);
}

TEST_F(BoardProcess, ABoardsOtherNamesForAPadAreNoDisagreement) {
    // A board-wide file names pads under ports the design lacks; those lines hold no pin,
    // so the board's plan goes over them and keeps them.
    const std::string before = "set_io --warn-no-port CLK_12M 21\nset_io -nowarn LED_RED 99\n";
    WriteBytes(m_pcf, before);
    Result r = Run("from-board", {"--board", DataFile("board1k-kicad5.net")});
    ASSERT_EQ(r.status, 0) << r.out << r.err;
    EXPECT_FALSE(Contains(r.out, "Disagreements")) << r.out;
    const std::string after = Slurp(m_pcf);
    EXPECT_EQ(after.rfind(before, 0), 0u) << after;
    EXPECT_TRUE(Contains(after, "set_io clk 21")) << after;
}

TEST_F(BoardProcess, AStaleNetlistIsCaughtAgainstItsBoard) {
    std::string stale = Slurp(DataFile("board1k-kicad6.net"));
    stale.replace(stale.find("(pin \"99\")"), 10, "(pin \"95\")");
    WriteBytes(m_dir / "stale.net", stale);
    Result r = Run("from-board", {"--board", (m_dir / "stale.net").string(), "--board",
                                  DataFile("board1k-kicad8.kicad_pcb")});
    EXPECT_EQ(r.status, 1) << r.out << r.err;
    EXPECT_TRUE(Contains(r.out, "99: no named net in")) << r.out;
    EXPECT_TRUE(Contains(r.out, "95: /LED0 in")) << r.out;
    EXPECT_FALSE(fs::exists(m_pcf));

    r = Run("from-board", {"--board", DataFile("board1k-kicad6.net"), "--board",
                           DataFile("board1k-kicad8.kicad_pcb")});
    EXPECT_EQ(r.status, 0) << r.out << r.err;
    EXPECT_TRUE(Contains(r.out, "The two files agree on every pin of U1")) << r.out;
}

TEST_F(BoardProcess, CsvOutAndBackIn) {
    ASSERT_EQ(Run("from-board", {"--board", DataFile("board1k-kicad6.kicad_pcb")}).status, 0);
    Result r = Run("export", {"--csv", "plan.csv"});
    ASSERT_EQ(r.status, 0) << r.err;
    std::string csv = Slurp(m_dir / "plan.csv");
    EXPECT_TRUE(Contains(csv, "\r\nclk,input,21,3,0,8,1,yes,,SB_LVCMOS,22,\r\n")) << csv;

    // Into an empty plan, and out again the same.
    fs::remove(m_pcf);
    r = Run("import", {"--csv", "plan.csv"});
    ASSERT_EQ(r.status, 0) << r.out << r.err;
    r = Run("export", {"--csv", "-"});
    ASSERT_EQ(r.status, 0) << r.err;
    EXPECT_EQ(r.out, csv);

    // A board designer's list of pins and nets goes through the same rules as a board.
    fs::remove(m_pcf);
    WriteBytes(m_dir / "pins.csv", "Pin,Net\r\n21,CLK\r\n99,/LED0\r\n96,\"/leds/led3\"\r\n");
    r = Run("import", {"--csv", "pins.csv"});
    ASSERT_EQ(r.status, 0) << r.out << r.err;
    EXPECT_EQ(Slurp(m_pcf), "set_io clk 21\nset_io led[0] 99\nset_io led[3] 96\n");

    WriteBytes(m_dir / "bad.csv", "port,pin\r\nnosuch,21\r\n");
    r = Run("import", {"--csv", "bad.csv"});
    EXPECT_EQ(r.status, 1);
    EXPECT_TRUE(Contains(r.err, "has no port 'nosuch'")) << r.err;
}

TEST_F(BoardProcess, BadUsageAndForeignFilesAreRefusedInOneLine) {
    const std::string board = DataFile("board1k-kicad5.net");
    const std::vector<std::pair<std::string, std::vector<std::string>>> usage = {
        {"from-board", {}},
        {"from-board", {"--board", board, "--board", board, "--board", board}},
        {"export", {}},
        {"import", {}}};
    for (const auto& [command, args] : usage) {
        Result r = Run(command, args);
        EXPECT_EQ(r.status, 2) << command << r.err;
        EXPECT_EQ(VnTest::LineCount(r.err), 1) << r.err;
    }
    Result r = Run("from-board", {"--board", DataFile("board1k.v")});
    EXPECT_EQ(r.status, 1);
    EXPECT_TRUE(Contains(r.err, "board1k.v:1: expected '(' at the start of the file")) << r.err;
    r = Run("from-board", {"--board", board, "--ref", "U7"});
    EXPECT_EQ(r.status, 1);
    EXPECT_TRUE(Contains(r.err, "has no part U7")) << r.err;
    EXPECT_FALSE(fs::exists(m_pcf));
}

} // namespace
