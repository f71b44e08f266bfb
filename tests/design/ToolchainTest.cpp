//===-- tests/design/ToolchainTest.cpp - planned pins are placed by nextpnr-ice40 -===//
//
// The designs in data/ are synthesized once per test program; each test plans pins with
// the library, writes the constraint file and lets nextpnr-ice40 place the design. A
// plan passes only if nextpnr puts every constrained port at the IO block the chip
// database gives its pin, and icepack makes a bitstream of the result.
//
//===------------------------------------------------------------------------------===//
#include "NextpnrBels.h"
#include "PinPlan.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <map>
#include <sstream>

#include <sys/wait.h>
#include <unistd.h>

namespace {

namespace fs = std::filesystem;

const char kBootstrap[] = "install the open iCE40 toolchain with scripts/bootstrap "
                          "(Debian packages yosys, nextpnr-ice40, fpga-icestorm)";

bool OnPath(const std::string& program) {
    const char* path = std::getenv("PATH");
    std::stringstream folders(path != nullptr ? path : "");
    std::string folder;
    while (std::getline(folders, folder, ':')) {
        std::error_code ec;
        if (!folder.empty() && fs::is_regular_file(fs::path(folder) / program, ec)) {
            return true;
        }
    }
    return false;
}

std::string ReadAll(const fs::path& path) {
    std::ifstream in(path, std::ios::binary);
    std::ostringstream text;
    text << in.rdbuf();
    return text.str();
}

void WriteAll(const fs::path& path, const std::string& text) {
    std::ofstream out(path, std::ios::binary);
    out << text;
}

// Runs a command with its output in `log`; returns its exit status.
int RunCommand(const std::string& command, const fs::path& log) {
    int status = std::system((command + " >'" + log.string() + "' 2>&1").c_str());
    return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
}

struct Target {
    const char* name;   // of the Verilog file in data/, without .v
    const char* device; // nextpnr's option
    const char* chipdb; // file in the chip-database folder
    const char* package;
};

const Target kOneK{"counter1k", "--hx1k", "chipdb-1k.txt", "tq144"};
const Target kEightK{"counter8k", "--hx8k", "chipdb-8k.txt", "ct256"};

class Toolchain : public ::testing::Test {
protected:
    static void SetUpTestSuite() {
        s_missing.clear();
        for (const char* program : {"yosys", "nextpnr-ice40", "icepack"}) {
            if (!OnPath(program)) {
                s_missing += std::string(s_missing.empty() ? "" : ", ") + program;
            }
        }
        if (!s_missing.empty()) {
            return;
        }
        s_folder = fs::temp_directory_path() /
                   ("venlomer-toolchain-" + std::to_string(static_cast<long>(::getpid())));
        fs::create_directories(s_folder);
        // ctest runs every test in a process of its own: the netlists are kept in the
        // build tree and made again only when their Verilog is newer.
        fs::create_directories(VENLOMER_DESIGN_CACHE);
        for (const Target* target : {&kOneK, &kEightK}) {
            fs::path verilog = fs::path(VENLOMER_DESIGN_DATA) / (std::string(target->name) + ".v");
            fs::path json = Json(*target);
            std::error_code ec;
            if (fs::exists(json, ec) &&
                fs::last_write_time(json, ec) >= fs::last_write_time(verilog, ec)) {
                continue;
            }
            // Written under a name of this process, then renamed: a test program running
            // beside this one never reads half a netlist.
            fs::path partial = s_folder / (std::string(target->name) + ".json");
            std::string command = "yosys -q -p 'synth_ice40 -top top -json " + partial.string() +
                                  "' '" + verilog.string() + "'";
            if (RunCommand(command, s_folder / (std::string(target->name) + ".yosys.log")) != 0) {
                s_missing = "a working yosys (" + command + " failed)";
                return;
            }
            fs::copy_file(partial,
                          json.string() + ".part" + std::to_string(static_cast<long>(::getpid())),
                          fs::copy_options::overwrite_existing, ec);
            fs::rename(json.string() + ".part" + std::to_string(static_cast<long>(::getpid())),
                       json, ec);
            if (ec) {
                s_missing = "a writable build tree (" + json.string() + ": " + ec.message() + ")";
                return;
            }
        }
    }
    static void TearDownTestSuite() {
        std::error_code ec;
        if (!s_folder.empty()) {
            fs::remove_all(s_folder, ec);
        }
    }

    void SetUp() override {
        ASSERT_TRUE(s_missing.empty()) << "missing " << s_missing << ": " << kBootstrap;
    }

    static void Load(const Target& target, VnTool::ChipDb& db, VnTool::Design& design) {
        std::string error;
        std::string chipdb = std::string(VENLOMER_SYSTEM_CHIPDB_DIR) + "/" + target.chipdb;
        ASSERT_TRUE(VnTool::ReadChipDbFile(chipdb, target.package, db, error))
            << error << ": " << kBootstrap;
        ASSERT_TRUE(VnTool::ReadYosysPortsFile(Json(target), design, error)) << error;
    }
    static std::string Json(const Target& target) {
        return (fs::path(VENLOMER_DESIGN_CACHE) / (std::string(target.name) + ".json")).string();
    }

    // nextpnr's verdict on a constraint file: its exit status, and the bel it constrained
    // each port to.
    static int Place(const Target& target, const std::string& pcfText, const std::string& tag,
                     std::map<std::string, std::string>& bels, std::string& log) {
        fs::path pcf = s_folder / (tag + ".pcf");
        fs::path asc = s_folder / (tag + ".asc");
        fs::path logFile = s_folder / (tag + ".nextpnr.log");
        WriteAll(pcf, pcfText);
        int status = RunCommand(std::string("nextpnr-ice40 ") + target.device + " --package " +
                                    target.package + " --json '" + Json(target) + "' --pcf '" +
                                    pcf.string() + "' --asc '" + asc.string() + "'",
                                logFile);
        log = ReadAll(logFile);
        bels = VnTest::ConstrainedBels(log);
        return status;
    }

    static void PlanPlaceAndPack(const Target& target) {
        VnTool::ChipDb db;
        VnTool::Design design;
        ASSERT_NO_FATAL_FAILURE(Load(target, db, design));
        ASSERT_FALSE(design.ports.empty());

        VnTool::PcfFile pcf;
        std::string error;
        ASSERT_TRUE(pcf.Parse("# planned by venlomer\nset_frequency clk 12\n", "top.pcf", error));
        auto given = VnTool::AutoAssign(db, design, pcf);
        EXPECT_EQ(given.size(), design.ports.size());
        auto problems = VnTool::CheckPins(db, design, Json(target), pcf, true);
        for (const auto& problem : problems) {
            ADD_FAILURE() << problem.message;
        }

        std::map<std::string, std::string> bels;
        std::string log;
        ASSERT_EQ(Place(target, pcf.Text(), target.name, bels, log), 0) << log;
        const auto expected = VnTest::PlannedBels(db, given);
        EXPECT_EQ(bels, expected) << log;

        fs::path asc = s_folder / (std::string(target.name) + ".asc");
        fs::path bin = s_folder / (std::string(target.name) + ".bin");
        EXPECT_EQ(RunCommand("icepack '" + asc.string() + "' '" + bin.string() + "'",
                             s_folder / "icepack.log"),
                  0)
            << ReadAll(s_folder / "icepack.log");
        std::error_code ec;
        EXPECT_GT(fs::file_size(bin, ec), 0u);
    }

    static inline std::string s_missing;
    static inline fs::path s_folder;
};

TEST_F(Toolchain, AutoPlanOnTheOneKIsPlacedPinForPinAndPacked) {
    PlanPlaceAndPack(kOneK);
}

TEST_F(Toolchain, AutoPlanOnTheEightKIsPlacedPinForPinAndPacked) {
    PlanPlaceAndPack(kEightK);
}

TEST_F(Toolchain, TheClockOfTheCounterIsSeenAndPutOnAGlobalBufferPin) {
    VnTool::ChipDb db;
    VnTool::Design design;
    ASSERT_NO_FATAL_FAILURE(Load(kEightK, db, design));
    std::vector<std::string> names;
    std::vector<std::string> clocks;
    for (const auto& port : design.ports) {
        names.push_back(port.name);
        if (port.clock) {
            clocks.push_back(port.name);
        }
    }
    EXPECT_EQ(clocks, std::vector<std::string>{"clk"});
    EXPECT_EQ(names.size(), 2u + 4u + 12u);
    EXPECT_NE(std::find(names.begin(), names.end(), "step[3]"), names.end());
    VnTool::PcfFile pcf;
    VnTool::AutoAssign(db, design, pcf);
    for (const auto& line : pcf.Lines()) {
        if (line.port == "clk") {
            EXPECT_EQ(line.pin, "C8"); // the first global-buffer pin of ct256 in pin order
        }
    }
}

// What the check refuses, nextpnr refuses too; where it refuses alone, it says it is
// stricter on purpose.
TEST_F(Toolchain, PlansTheCheckRefusesAreRefusedByNextpnr) {
    VnTool::ChipDb db;
    VnTool::Design design;
    ASSERT_NO_FATAL_FAILURE(Load(kOneK, db, design));
    VnTool::PcfFile base;
    VnTool::AutoAssign(db, design, base);
    const std::string good = base.Text();
    std::string freePin;
    std::string ledPin;
    for (const auto& pin : db.pins) {
        bool used = false;
        for (const auto& line : base.Lines()) {
            used = used || line.pin == pin.name;
            if (line.port == "led[0]") {
                ledPin = line.pin;
            }
        }
        if (!used && freePin.empty()) {
            freePin = pin.name;
        }
    }
    ASSERT_FALSE(freePin.empty());
    VnTool::PcfFile shared = base;
    shared.Unassign("led[7]");
    shared.Assign("led[7]", ledPin);
    // The plan with led[7]'s line replaced by `line`.
    auto without = [&](const std::string& line) {
        VnTool::PcfFile pcf = base;
        pcf.Unassign("led[7]");
        return pcf.Text() + line + "\n";
    };
    struct Case {
        const char* tag;
        std::string text;
        const char* ours;   // in the check's message
        const char* theirs; // in nextpnr's log
    };
    const Case cases[] = {
        {"unknown-pin", "set_io rst 999\n" + good, "pin '999' is not in package tq144",
         "package does not have a pin named '999'"},
        {"two-pins", good + "set_io rst " + freePin + "\n", "port 'rst' is put on two pins",
         "duplicate pin constraint on 'rst'"},
        {"duplicate-line", good + good.substr(0, good.find('\n') + 1), "duplicate constraint",
         "duplicate pin constraint"},
        {"shared-pin", shared.Text(), "already holds port", "cannot be bound to bel"},
        {"unknown-command", good + "set_foo 1\n", "knows no PCF command 'set_foo'",
         "unsupported PCF command 'set_foo'"},
        {"no-io-pin", without("set_io led[7] 5"), "pin '5' is not in package tq144",
         "package does not have a pin named '5'"},
        {"bus-index", without("set_io led[8] " + freePin), "names 'led[8]'",
         "IO 'led[7]' is unconstrained"},
        {"nowarn-typo", without("set_io -nowarn lde[7] " + freePin), "names 'lde[7]'",
         "IO 'led[7]' is unconstrained"},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.tag);
        VnTool::PcfFile pcf;
        std::string error;
        ASSERT_TRUE(pcf.Parse(c.text, c.tag, error)) << error;
        auto problems = VnTool::CheckPins(db, design, "top.json", pcf, VnTool::CheckOptions{});
        ASSERT_TRUE(VnTool::HasErrors(problems));
        bool named = false;
        for (const auto& problem : problems) {
            named = named || problem.message.find(c.ours) != std::string::npos;
        }
        EXPECT_TRUE(named);
        std::map<std::string, std::string> bels;
        std::string log;
        EXPECT_NE(Place(kOneK, c.text, c.tag, bels, log), 0);
        EXPECT_NE(log.find(c.theirs), std::string::npos) << log;
    }

    // A line without its pin is refused by the reader, and by nextpnr.
    {
        VnTool::PcfFile pcf;
        std::string error;
        EXPECT_FALSE(pcf.Parse(without("set_io led[7]"), "no-pin", error));
        EXPECT_NE(error.find("expected 'set_io [options] PORT PIN'"), std::string::npos) << error;
        std::map<std::string, std::string> bels;
        std::string log;
        EXPECT_NE(Place(kOneK, without("set_io led[7]"), "no-pin", bels, log), 0);
        EXPECT_NE(log.find("expected PCF syntax 'set_io cell pin'"), std::string::npos) << log;
    }

    // A line for a port the design lacks is a warning to both; the strict reading makes it
    // an error for those who want a board file exact.
    VnTool::PcfFile stale;
    std::string error;
    ASSERT_TRUE(stale.Parse(good + "set_io ghost 2\n", "stale", error));
    EXPECT_FALSE(VnTool::HasErrors(
        VnTool::CheckPins(db, design, "top.json", stale, VnTool::CheckOptions{})));
    VnTool::CheckOptions strict;
    strict.strict = true;
    EXPECT_TRUE(VnTool::HasErrors(VnTool::CheckPins(db, design, "top.json", stale, strict)));
    std::map<std::string, std::string> bels;
    std::string log;
    EXPECT_EQ(Place(kOneK, stale.Text(), "stale", bels, log), 0) << log;
    EXPECT_NE(log.find("unmatched constraint 'ghost'"), std::string::npos) << log;
}

} // namespace
