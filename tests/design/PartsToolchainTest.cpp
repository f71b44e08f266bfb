//===-- tests/design/PartsToolchainTest.cpp - every part and package, judged by nextpnr -===//
//
// For each part nextpnr-ice40 takes and each package of it: an automatic plan of a design
// with a bus and a clock and, where the package has them, a PLL fed by its pad, a
// differential input and the LED driver. nextpnr must accept the plan, constrain every
// port to the IO block of its planned pin and create every SB_IO it was asked for, and
// icepack must pack the result. The netlists are made once per build tree.
//
//===------------------------------------------------------------------------------===//
#include "NextpnrBels.h"
#include "PinPlan.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <map>
#include <regex>
#include <sstream>

#include <sys/wait.h>
#include <unistd.h>

namespace {

namespace fs = std::filesystem;

struct Part {
    const char* name;   // nextpnr-ice40's option without its dashes
    const char* chipdb; // chipdb-NAME.txt
    const char* suffix; // of the package names in the chip database
    std::vector<const char*> packages;
    bool lowPowerOrHigh; // differential inputs in bank 3 only
};

const std::vector<const char*> kOneKPackages = {
    "cb121", "cb132", "cb81", "cm121", "cm36", "cm49", "cm81", "qn84", "swg16tr", "tq144", "vq100"};
const std::vector<const char*> kFourKPackages = {"bg121", "cb132", "cm121",
                                                 "cm225", "cm81",  "tq144"};
const std::vector<const char*> kEightKPackages = {"bg121", "cb132", "cm121",
                                                  "cm225", "cm81",  "ct256"};

// The packages each part takes, as nextpnr-ice40 0.4 accepts them.
const Part kParts[] = {
    {"lp384", "384", "", {"cm36", "cm49", "qn32"}, true},
    {"hx1k", "1k", "", kOneKPackages, true},
    {"lp1k", "1k", "", kOneKPackages, true},
    {"hx4k", "8k", ":4k", kFourKPackages, true},
    {"lp4k", "8k", ":4k", kFourKPackages, true},
    {"hx8k", "8k", "", kEightKPackages, true},
    {"lp8k", "8k", "", kEightKPackages, true},
    {"up5k", "5k", "", {"sg48", "uwg30"}, false},
    {"up3k", "5k", "", {"sg48", "uwg30"}, false},
    {"u4k", "u4k", "", {"sg48"}, false},
    {"u1k", "u4k", "", {"sg48"}, false},
    {"u2k", "u4k", "", {"sg48"}, false},
};

int Shell(const std::string& command, const fs::path& log) {
    int status = std::system((command + " >'" + log.string() + "' 2>&1").c_str());
    return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
}

std::string ReadAll(const fs::path& path) {
    std::ifstream in(path, std::ios::binary);
    std::ostringstream text;
    text << in.rdbuf();
    return text.str();
}

// The design's features a package can carry.
struct Features {
    bool pll = false;
    bool lvds = false;
    bool led = false;
    std::string Defines() const {
        return std::string(pll ? " -DPLL" : "") + (lvds ? " -DLVDS" : "") + (led ? " -DLED" : "");
    }
    std::string Tag() const {
        return std::string("parts") + (pll ? "-pll" : "") + (lvds ? "-lvds" : "") +
               (led ? "-led" : "");
    }
};

Features FeaturesOf(const VnTool::ChipDb& db, const Part& part) {
    Features f;
    for (const auto& pad : db.hardBlockPads) {
        bool bonded = VnTool::PinOfPad(db, pad) != nullptr;
        f.pll = f.pll || (pad.role == VnTool::HardBlockPad::Role::PllInput && bonded &&
                          !pad.lockedInPackage);
        f.led = f.led || (pad.role == VnTool::HardBlockPad::Role::LedDriver && bonded &&
                          std::string(part.chipdb) == "5k");
    }
    for (const auto& pin : db.pins) {
        for (const auto& other : db.pins) {
            f.lvds = f.lvds || (pin.pio == 0 && other.pio == 1 && other.x == pin.x &&
                                other.y == pin.y && (!part.lowPowerOrHigh || pin.bank == 3));
        }
    }
    return f;
}

// The netlist of the features, made once per build tree under a name of this process
// and then renamed, so that test processes running side by side never read half of one.
std::string Netlist(const Features& f, std::string& why, const std::string& format = "json") {
    fs::path json = fs::path(VENLOMER_DESIGN_CACHE) / (f.Tag() + "." + format);
    fs::path verilog = fs::path(VENLOMER_DESIGN_DATA) / "parts.v";
    std::error_code ec;
    if (fs::exists(json, ec) && fs::last_write_time(json, ec) >= fs::last_write_time(verilog, ec)) {
        return json.string();
    }
    fs::create_directories(VENLOMER_DESIGN_CACHE, ec);
    std::string partial = json.string() + ".part" + std::to_string(static_cast<long>(::getpid()));
    std::string command = "yosys -q -p 'read_verilog" + f.Defines() + " " + verilog.string() +
                          "; synth_ice40 -top top -" + format + " " + partial + "'";
    if (Shell(command, partial + ".log") != 0) {
        why = command + " failed: " + ReadAll(partial + ".log");
        return "";
    }
    fs::rename(partial, json, ec);
    fs::remove(partial + ".log", ec);
    return json.string();
}

class EveryPart : public ::testing::TestWithParam<Part> {};

TEST_P(EveryPart, AnAutoPlanOfEachPackageIsPlacedPinForPinAndPacked) {
    const Part& part = GetParam();
    for (const char* program : {"yosys", "nextpnr-ice40", "icepack"}) {
        ASSERT_EQ(std::system((std::string("command -v ") + program + " >/dev/null").c_str()), 0)
            << program << " missing: install it with scripts/bootstrap";
    }
    fs::path dir = fs::temp_directory_path() / ("venlomer-parts-" + std::string(part.name) + "-" +
                                                std::to_string(static_cast<long>(::getpid())));
    fs::create_directories(dir);
    Features seen;
    for (const char* package : part.packages) {
        SCOPED_TRACE(std::string(part.name) + " " + package);
        VnTool::ChipDb db;
        std::string error;
        ASSERT_TRUE(VnTool::ReadChipDbFile(std::string(VENLOMER_SYSTEM_CHIPDB_DIR) + "/chipdb-" +
                                               part.chipdb + ".txt",
                                           std::string(package) + part.suffix, db, error))
            << error;
        Features features = FeaturesOf(db, part);
        seen.pll = seen.pll || features.pll;
        seen.lvds = seen.lvds || features.lvds;
        seen.led = seen.led || features.led;
        std::string json = Netlist(features, error);
        ASSERT_FALSE(json.empty()) << error;
        VnTool::Design design;
        ASSERT_TRUE(VnTool::ReadYosysPortsFile(json, design, error)) << error;

        VnTool::PcfFile pcf;
        auto given = VnTool::AutoAssign(db, design, pcf);
        ASSERT_EQ(given.size(), design.ports.size()) << pcf.Text();
        auto problems = VnTool::CheckPins(db, design, json, pcf, VnTool::CheckOptions{});
        for (const auto& problem : problems) {
            ADD_FAILURE() << problem.message;
        }

        fs::path pcfFile = dir / "plan.pcf";
        std::ofstream(pcfFile) << pcf.Text();
        fs::path asc = dir / "plan.asc";
        fs::path log = dir / "nextpnr.log";
        ASSERT_EQ(Shell(std::string("nextpnr-ice40 --") + part.name + " --package " + package +
                            " --placer heap --json '" + json + "' --pcf '" + pcfFile.string() +
                            "' --asc '" + asc.string() + "'",
                        log),
                  0)
            << pcf.Text() << ReadAll(log);
        std::string placed = ReadAll(log);
        const auto bels = VnTest::ConstrainedBels(placed);
        const auto expected = VnTest::PlannedBels(db, given);
        EXPECT_EQ(bels, expected) << pcf.Text();
        // The LED driver's outputs are no SB_IO, by design; any other port nextpnr declines
        // to give an SB_IO was planned on a pad it does not use.
        std::regex declined("Info: \\S+ use by SB_RGBA_DRV[^\\n]*");
        std::string rest = std::regex_replace(placed, declined, "");
        EXPECT_EQ(rest.find("not creating SB_IO"), std::string::npos) << placed;
        EXPECT_EQ(Shell("icepack '" + asc.string() + "' '" + (dir / "plan.bin").string() + "'",
                        dir / "icepack.log"),
                  0)
            << ReadAll(dir / "icepack.log");
    }
    // The hard blocks were tried where the part has them, not passed over unseen.
    EXPECT_EQ(seen.pll, std::string(part.chipdb) != "384");
    EXPECT_TRUE(seen.lvds);
    EXPECT_EQ(seen.led, std::string(part.chipdb) == "5k");
    std::error_code ec;
    fs::remove_all(dir, ec);
}

// Plans that break a hard block's rule, each refused by the check at its line; nextpnr or
// arachne-pnr refuses it too, or (for the LED driver) shows that it ignored the line.
TEST(HardBlockRules, PlansThatBreakThemAreRefusedAndSoAreTheyByAReferee) {
    for (const char* program : {"yosys", "nextpnr-ice40", "arachne-pnr"}) {
        ASSERT_EQ(std::system((std::string("command -v ") + program + " >/dev/null").c_str()), 0)
            << program << " missing: install it with scripts/bootstrap";
    }
    fs::path dir = fs::temp_directory_path() /
                   ("venlomer-rules-" + std::to_string(static_cast<long>(::getpid())));
    fs::create_directories(dir);
    struct Case {
        const char* tag;
        const char* part;
        const char* chipdb;
        const char* package;
        Features features;
        const char* from; // a line of the automatic plan
        const char* to;   // the mistake put in its place
        const char* ours;
        const char* referee; // "nextpnr" or "arachne"
        const char* theirs;
    };
    const Case cases[] = {
        {"pll-pad",
         "up5k",
         "5k",
         "sg48",
         {true, false, false},
         "set_io pll_ref 35",
         "set_io pll_ref 2",
         "feeds SB_PLL40_PAD through its pad",
         "nextpnr",
         "is not connected to any PLL BEL"},
        {"led-pad",
         "up5k",
         "5k",
         "sg48",
         {false, false, true},
         "set_io led_g 40",
         "set_io led_g 2",
         "of the LED driver, whose pad is fixed: pin 40",
         "nextpnr",
         "led_g use by SB_RGBA_DRV/SB_RGB_DRV rgb, not creating SB_IO"},
        {"lvds-bank",
         "hx1k",
         "1k",
         "tq144",
         {false, true, false},
         "set_io lvds_in 2",
         "set_io lvds_in 101",
         "must be in bank 3 on this part",
         "arachne",
         "LVDS port `lvds_in' not in bank 3"},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.tag);
        VnTool::ChipDb db;
        std::string error;
        ASSERT_TRUE(VnTool::ReadChipDbFile(std::string(VENLOMER_SYSTEM_CHIPDB_DIR) + "/chipdb-" +
                                               c.chipdb + ".txt",
                                           c.package, db, error))
            << error;
        std::string json = Netlist(c.features, error);
        ASSERT_FALSE(json.empty()) << error;
        VnTool::Design design;
        ASSERT_TRUE(VnTool::ReadYosysPortsFile(json, design, error)) << error;
        VnTool::PcfFile plan;
        VnTool::AutoAssign(db, design, plan);
        std::string text = plan.Text();
        ASSERT_NE(text.find(std::string(c.from) + "\n"), std::string::npos) << text;
        text.replace(text.find(c.from), std::string(c.from).size(), c.to);
        VnTool::PcfFile wrong;
        ASSERT_TRUE(wrong.Parse(text, "wrong.pcf", error)) << error;
        auto problems = VnTool::CheckPins(db, design, json, wrong, VnTool::CheckOptions{});
        ASSERT_TRUE(VnTool::HasErrors(problems)) << text;
        EXPECT_NE(problems[0].message.find(c.ours), std::string::npos) << problems[0].message;
        EXPECT_EQ(problems[0].message.rfind("wrong.pcf:", 0), 0u) << problems[0].message;

        fs::path pcf = dir / (std::string(c.tag) + ".pcf");
        std::ofstream(pcf) << text;
        fs::path log = dir / (std::string(c.tag) + ".log");
        if (std::string(c.referee) == "arachne") {
            std::string blif = Netlist(c.features, error, "blif");
            ASSERT_FALSE(blif.empty()) << error;
            EXPECT_NE(Shell(std::string("arachne-pnr -d ") + c.chipdb + " -P " + c.package +
                                " -p '" + pcf.string() + "' -o '" + (dir / "a.asc").string() +
                                "' '" + blif + "'",
                            log),
                      0);
        } else {
            Shell(std::string("nextpnr-ice40 --") + c.part + " --package " + c.package +
                      " --placer heap --json '" + json + "' --pcf '" + pcf.string() + "' --asc '" +
                      (dir / "n.asc").string() + "'",
                  log);
        }
        EXPECT_NE(ReadAll(log).find(c.theirs), std::string::npos) << ReadAll(log);
    }
    std::error_code ec;
    fs::remove_all(dir, ec);
}

INSTANTIATE_TEST_SUITE_P(Toolchain, EveryPart, ::testing::ValuesIn(kParts),
                         [](const ::testing::TestParamInfo<Part>& param) {
                             return std::string(param.param.name);
                         });

} // namespace
