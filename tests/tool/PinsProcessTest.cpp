//===-- tests/tool/PinsProcessTest.cpp - venlomer pins run as a program ----------===//
//
// The pins commands judged as a user meets them: exit statuses, the lines they print,
// refusals that leave the constraint file byte for byte and time for time as it was, and
// the whole road: yosys, venlomer pins assign, nextpnr-ice40 placing every constrained
// port at the IO block the chip database gives its pin, icepack making a bitstream.
//
//===------------------------------------------------------------------------------===//
#include "ProcessHelpers.h"

#include <gtest/gtest.h>

#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <map>
#include <regex>
#include <sstream>
#include <string>
#include <thread>
#include <vector>

namespace {

namespace fs = std::filesystem;
using VnTest::Contains;
using VnTest::LineCount;
using VnTest::Quote;
using VnTest::Result;
using VnTest::Slurp;
using VnTest::WriteBytes;

bool OnPath(const std::string& program) {
    return std::system(("command -v " + program + " >/dev/null 2>&1").c_str()) == 0;
}

struct Target {
    const char* name;
    const char* device;  // --device of venlomer
    const char* nextpnr; // nextpnr-ice40's device option
    const char* package;
};
const Target kOneK{"counter1k", "1k", "--hx1k", "tq144"};
const Target kEightK{"counter8k", "8k", "--hx8k", "ct256"};

// The phase before: the designs are synthesized once per build tree and shared.
std::string Netlist(const Target& target, std::string& why) {
    fs::path json = fs::path(VENLOMER_NETLIST_CACHE) / (std::string(target.name) + ".json");
    fs::path verilog = fs::path(VENLOMER_DESIGN_DATA) / (std::string(target.name) + ".v");
    std::error_code ec;
    if (fs::exists(json, ec) && fs::last_write_time(json, ec) >= fs::last_write_time(verilog, ec)) {
        return json.string();
    }
    if (!OnPath("yosys")) {
        why = "yosys is missing: install it with scripts/bootstrap";
        return "";
    }
    fs::create_directories(VENLOMER_NETLIST_CACHE, ec);
    std::string partial = json.string() + ".pins" + std::to_string(static_cast<long>(::getpid()));
    std::string command = "yosys -q -p " + Quote("synth_ice40 -top top -json " + partial) + " " +
                          Quote(verilog.string()) + " >/dev/null 2>&1";
    if (std::system(command.c_str()) != 0) {
        why = command + " failed";
        return "";
    }
    fs::rename(partial, json, ec);
    return json.string();
}

class PinsProcess : public ::testing::Test {
protected:
    void SetUp() override {
        std::string pattern = (fs::temp_directory_path() / "venlomer-pins-XXXXXX").string();
        ASSERT_NE(mkdtemp(pattern.data()), nullptr);
        m_dir = pattern;
        if (!fs::is_regular_file(fs::path(VENLOMER_SYSTEM_CHIPDB_DIR) / "chipdb-1k.txt")) {
            GTEST_FAIL() << "chip databases missing: install fpga-icestorm-chipdb "
                            "(scripts/bootstrap)";
        }
        std::string why;
        m_json = Netlist(kOneK, why);
        ASSERT_FALSE(m_json.empty()) << why;
    }
    void TearDown() override {
        std::error_code ec;
        fs::remove_all(m_dir, ec);
    }

    Result Run(const std::vector<std::string>& args) {
        std::string command = "cd " + Quote(m_dir.string()) + " && " + Quote(VENLOMER_TOOL_PATH);
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

    // pins COMMAND --design D --pcf P --device D [rest]
    Result Pins(const char* command, const std::string& pcf, std::vector<std::string> rest = {},
                const std::string& design = "", const Target& target = kOneK) {
        std::vector<std::string> args = {
            "pins",  command, "--design", design.empty() ? m_json : design,
            "--pcf", pcf,     "--device", target.device};
        args.insert(args.end(), rest.begin(), rest.end());
        return Run(args);
    }

    fs::path m_dir;
    std::string m_json;
};

// A file as it was: bytes and modification time.
struct Snapshot {
    std::string bytes;
    fs::file_time_type time;
};
Snapshot Take(const fs::path& path) {
    return {Slurp(path), fs::last_write_time(path)};
}
void ExpectUntouched(const fs::path& path, const Snapshot& before, const std::string& why) {
    EXPECT_EQ(Slurp(path), before.bytes) << why;
    EXPECT_EQ(fs::last_write_time(path), before.time) << why;
}

TEST_F(PinsProcess, EachPinsCommandHasHelpAndBadUsageIsExitTwoWithOneLine) {
    for (const char* command : {"check", "assign", "show"}) {
        Result help = Run({"pins", command, "--help"});
        EXPECT_EQ(help.status, 0) << command;
        EXPECT_EQ(help.out.rfind(std::string("usage: venlomer pins ") + command, 0), 0u)
            << help.out;
        EXPECT_TRUE(Contains(help.out, "--device NAME")) << help.out;
    }
    EXPECT_TRUE(Contains(Run({"--help"}).out, "pins assign"));
    const std::vector<std::vector<std::string>> bad = {
        {"pins"},
        {"pins", "check", "--pcf", "x.pcf"},
        {"pins", "check", "--design", m_json},
        {"pins", "assign", "--design", m_json, "--pcf", "x.pcf"},
        {"pins", "assign", "--design", m_json, "--pcf", "x.pcf", "clk"},
        {"pins", "assign", "--design", m_json, "--pcf", "x.pcf", "=21"},
        {"pins", "check", "--design", m_json, "--pcf", "x.pcf", "--chipdb", "a", "--device", "1k"},
        {"pins", "check", "--design", m_json, "--pcf", "x.pcf", "--device", "../1k"},
        {"pins", "show", "--design", m_json, "--pcf", "x.pcf", "--flags", "exact"},
        {"pins", "assign", "--design", m_json, "--pcf", "x.pcf", "rst=2", "rst=3"},
    };
    for (const auto& args : bad) {
        Result result = Run(args);
        std::string shown;
        for (const auto& arg : args) {
            shown += arg + " ";
        }
        EXPECT_EQ(result.status, 2) << shown << result.err;
        EXPECT_EQ(LineCount(result.err), 1) << shown << result.err;
        EXPECT_FALSE(fs::exists(m_dir / "x.pcf")) << shown;
    }
}

TEST_F(PinsProcess, AssignCreatesTheFileThenChecksCleanAndKeepsWhatItDoesNotOwn) {
    fs::path pcf = m_dir / "top.pcf";
    Result made = Pins("assign", pcf.string(), {"clk=21", "--auto"});
    ASSERT_EQ(made.status, 0) << made.err;
    EXPECT_TRUE(Contains(made.out, "clk -> 21 (bank 3, global buffer)")) << made.out;
    EXPECT_TRUE(Contains(made.out, "Created " + pcf.string() + ": 10 set_io lines")) << made.out;
    std::string text = Slurp(pcf);
    EXPECT_TRUE(Contains(text, "set_io clk 21\n")) << text;
    EXPECT_EQ(LineCount(text), 10) << text;

    // The user's lines survive a reassignment; only the moved port's line changes.
    WriteBytes(pcf, "# board rev B\nset_frequency clk 12\n" + text);
    Result moved = Pins("assign", pcf.string(), {"rst=2"});
    ASSERT_EQ(moved.status, 0) << moved.err;
    std::string after = Slurp(pcf);
    EXPECT_EQ(after.rfind("# board rev B\nset_frequency clk 12\nset_io clk 21\n", 0), 0u) << after;
    EXPECT_TRUE(Contains(after, "set_io rst 2\n")) << after;
    EXPECT_FALSE(Contains(after, "set_io rst 1\n")) << after;

    Result check = Pins("check", pcf.string(), {"--strict"});
    EXPECT_EQ(check.status, 0) << check.out << check.err;
    EXPECT_TRUE(Contains(check.out, "10 ports: 10 on pins, 0 without; 0 errors, 0 warnings"))
        << check.out;
    EXPECT_TRUE(std::regex_search(check.out, std::regex(R"(\n  clk +input +yes +21 +3 +ok\n)")))
        << check.out;

    // Unassigning leaves a port without a pin: an error, as nextpnr-ice40 makes it, and a
    // warning when allowed as its --pcf-allow-unconstrained allows it.
    ASSERT_EQ(Pins("assign", pcf.string(), {"--unassign", "led[7]", "--unassign", "led[6]"}).status,
              0);
    EXPECT_FALSE(Contains(Slurp(pcf), "led[7]"));
    Result unconstrained = Pins("check", pcf.string());
    EXPECT_EQ(unconstrained.status, 1) << unconstrained.out;
    EXPECT_TRUE(Contains(unconstrained.out, "error: port 'led[7]' has no pin"))
        << unconstrained.out;
    Result allowed = Pins("check", pcf.string(), {"--allow-unconstrained"});
    EXPECT_EQ(allowed.status, 0) << allowed.out;
    EXPECT_TRUE(Contains(allowed.out, "warning: port 'led[7]' has no pin")) << allowed.out;

    // Nothing to change: the file is not rewritten.
    Snapshot before = Take(pcf);
    std::this_thread::sleep_for(std::chrono::milliseconds(20));
    Result same = Pins("assign", pcf.string(), {"rst=2"});
    EXPECT_EQ(same.status, 0) << same.err;
    ExpectUntouched(pcf, before, "unchanged plan");
}

TEST_F(PinsProcess, RefusedAssignmentsAndBadInputLeaveEveryFileUntouched) {
    fs::path pcf = m_dir / "top.pcf";
    ASSERT_EQ(Pins("assign", pcf.string(), {"--auto"}).status, 0);
    Snapshot before = Take(pcf);
    Snapshot design = Take(m_json);
    std::this_thread::sleep_for(std::chrono::milliseconds(20));

    struct Case {
        std::vector<std::string> args;
        const char* says;
    };
    std::string ledPin;
    std::smatch match;
    std::regex ledLine(R"(set_io led\[0\] (\S+))");
    ASSERT_TRUE(std::regex_search(before.bytes, match, ledLine));
    ledPin = match[1];
    const Case cases[] = {
        {{"rst=" + ledPin}, "already holds port 'led[0]'"},
        {{"rst=999"}, "pin '999' is not in package tq144"},
        {{"ghost=2"}, "has no port 'ghost'"},
        {{"--unassign", "ghost"}, "no set_io line"},
    };
    for (const Case& c : cases) {
        Result result = Pins("assign", pcf.string(), c.args);
        EXPECT_EQ(result.status, 1) << c.says;
        EXPECT_EQ(LineCount(result.err), 1) << result.err;
        EXPECT_TRUE(Contains(result.err, c.says)) << result.err;
        EXPECT_TRUE(Contains(result.err, "left untouched")) << result.err;
        ExpectUntouched(pcf, before, c.says);
    }

    // The constraint file can never be the netlist or the chip database.
    Result self = Pins("assign", m_json, {"--auto"});
    EXPECT_EQ(self.status, 1);
    EXPECT_TRUE(Contains(self.err, "not a constraint file")) << self.err;
    ExpectUntouched(m_json, design, "netlist given as --pcf");

    // Bad inputs: one line naming the file and line, nothing written.
    WriteBytes(m_dir / "broken.json", "{\"modules\": {\n\"top\": {\"ports\":\n{,}}}}\n");
    WriteBytes(m_dir / "notyosys.json", "{\"hello\": 1}\n");
    WriteBytes(m_dir / "twotops.json",
               "{\"modules\": {\"a\": {\"ports\": {}}, \"b\": {\"ports\": {}}}}\n");
    WriteBytes(m_dir / "syntax.pcf", "set_io clk 21\nset_io -pullup maybe rst 1\n");
    WriteBytes(m_dir / "unknown.pcf", "set_io clk 21\nset_io rst 999\n");
    WriteBytes(m_dir / "dup.pcf", "set_io clk 21\nset_io clk 21\n");
    struct Bad {
        std::string design;
        std::string pcf;
        const char* says;
    };
    const Bad bads[] = {
        {(m_dir / "broken.json").string(), pcf.string(), "broken.json:3:"},
        {(m_dir / "notyosys.json").string(), pcf.string(), "notyosys.json:1:"},
        {(m_dir / "twotops.json").string(), pcf.string(), "twotops.json: no top module"},
        {m_json, (m_dir / "syntax.pcf").string(), "syntax.pcf:2:"},
        {m_json, (m_dir / "unknown.pcf").string(), "unknown.pcf:2: error: pin '999'"},
        {m_json, (m_dir / "dup.pcf").string(), "dup.pcf:2: error: duplicate constraint"},
    };
    for (const Bad& bad : bads) {
        for (const char* command : {"assign", "check"}) {
            Snapshot pcfBefore = Take(bad.pcf);
            Result result = Pins(command, bad.pcf, {"--auto"}, bad.design);
            if (std::string(command) == "check") {
                result = Pins(command, bad.pcf, {}, bad.design);
            }
            EXPECT_EQ(result.status, 1) << command << " " << bad.says;
            std::string said = result.err + result.out;
            EXPECT_TRUE(Contains(said, bad.says)) << command << "\n" << said;
            if (std::string(command) == "assign") {
                EXPECT_EQ(LineCount(result.err), 1) << result.err;
            }
            ExpectUntouched(bad.pcf, pcfBefore, bad.says);
        }
    }
}

TEST_F(PinsProcess, ShowLabelsAssignedPinsAndMarksProblemsAndSearchesPorts) {
    fs::path pcf = m_dir / "top.pcf";
    WriteBytes(pcf, "set_io clk 21\nset_io led[0] 112\nset_io rst 1\n");
    Result result = Pins("show", pcf.string(),
                         {"--find", "Name=led", "--flags", "substring", "--svg", "plan.svg"});
    ASSERT_EQ(result.status, 0) << result.err;
    EXPECT_TRUE(Contains(result.out, "Pins: 3 assigned, 0 with problems, 93 free")) << result.out;
    EXPECT_TRUE(Contains(result.out, "over 4 banks, 96 pins and 10 ports: 8 matches"))
        << result.out;
    EXPECT_TRUE(Contains(result.out, "Highlighted: 1 pins")) << result.out; // only led[0] placed
    std::string svg = Slurp(m_dir / "plan.svg");
    EXPECT_TRUE(Contains(svg, ">led[0]</text>")) << "label of the assigned pin";
    EXPECT_TRUE(Contains(svg, "class=\"pin assigned hl\"")) << "the matched port's pin";
    std::size_t assigned = 0;
    for (std::size_t at = 0; (at = svg.find("class=\"pin assigned", at)) != std::string::npos;
         ++at) {
        ++assigned;
    }
    EXPECT_EQ(assigned, 3u);

    // The clock moved off a global-buffer pin is a problem pin, drawn as one.
    WriteBytes(pcf, "set_io clk 2\nset_io led[0] 112\n");
    Result moved = Pins("show", pcf.string(), {"--svg", "plan.svg"});
    ASSERT_EQ(moved.status, 0) << moved.err;
    EXPECT_TRUE(Contains(moved.out, "Pins: 1 assigned, 1 with problems")) << moved.out;
    EXPECT_TRUE(Contains(Slurp(m_dir / "plan.svg"), "class=\"pin problem\""));
}

// A board's constraint file names every pin of the board, as boards' files do: aliases of
// one pad, lines for ports this design lacks with and without -nowarn or --warn-no-port,
// a frequency, tabs, trailing comments, configuration pins.
const char kBoardFile[] = "# evaluation board, rev C\n"
                          "set_io\t--warn-no-port\tLED_RED_N  99\t# D1\n"
                          "set_io -nowarn LED_RGB[0] 99   # the same pad, another name\n"
                          "set_io -nowarn LED_RGB[1] 98\n"
                          "set_io UART_TX 8\n"
                          "set_io UART_RX 9 # to the FTDI\n"
                          "set_io -nowarn FLASH_SCK 70\nset_io -nowarn FLASH_SS 71\n"
                          "set_io -nowarn CDONE 65    # configuration pin\n"
                          "set_io -nowarn CRESET_B 66\n"
                          "set_io clk 21\nset_frequency clk 12\n"
                          "set_io rst 3\n"
                          "set_io led[0] 99\nset_io led[1] 98\nset_io led[2] 97\n"
                          "set_io led[3] 96\nset_io led[4] 95\nset_io led[5] 94\n"
                          "set_io led[6] 93\nset_io led[7] 91\n";

TEST_F(PinsProcess, ABoardFileIsAcceptedAndOnlyTheDesignsOwnPortsAreJudged) {
    fs::path pcf = m_dir / "board.pcf";
    WriteBytes(pcf, kBoardFile);
    Result check = Pins("check", pcf.string());
    EXPECT_EQ(check.status, 0) << check.out << check.err;
    EXPECT_TRUE(Contains(check.out, "board.pcf:5: warning: design ")) << check.out;
    // The configuration pins are no I/O of this package: a warning on an absent port's line.
    EXPECT_TRUE(Contains(check.out, "board.pcf:9: warning: pin '65' is not in package tq144"))
        << check.out;
    EXPECT_TRUE(Contains(check.out, "board.pcf: 9 lines for ports the design lacks, kept (7 of "
                                    "them marked -nowarn or --warn-no-port)"))
        << check.out;
    EXPECT_TRUE(Contains(check.out, "10 ports: 10 on pins, 0 without; 0 errors, 4 warnings"))
        << check.out;
    // Strict, the same file is the exact list it is not.
    EXPECT_EQ(Pins("check", pcf.string(), {"--strict"}).status, 1);

    // A pin of a line for an absent port holds nothing against the design: rst may move
    // onto the aliased pad's neighbour that only the flash names, and the refusal for a
    // real conflict names the port that holds the pin.
    Result moved = Pins("assign", pcf.string(), {"rst=70"});
    EXPECT_EQ(moved.status, 0) << moved.err;
    Result clash = Pins("assign", pcf.string(), {"rst=98"});
    EXPECT_EQ(clash.status, 1);
    EXPECT_TRUE(Contains(clash.err, "pin 98 already holds port 'led[1]' (line 15)")) << clash.err;

    // One planted mistake at a time: each refused at its line.
    struct Planted {
        std::string from;
        std::string to;
        const char* says;
    };
    const Planted planted[] = {
        {"set_io led[7] 91", "set_io led[7] 999", "board.pcf:21: error: pin '999' is not in"},
        {"set_io led[7] 91", "set_io led[7] 5", "board.pcf:21: error: pin '5' is not in"},
        {"set_io led[7] 91", "set_io led[7] 93", "board.pcf:21: error: pin 93 already holds"},
        {"set_io led[7] 91", "set_io led[6] 91", "board.pcf:21: error: port 'led[6]' is put on"},
        {"set_io led[7] 91", "set_io led[8] 91", "board.pcf:21 names 'led[8]'"},
        {"set_io rst 3", "set_io -nowarn rts 3", "board.pcf:13 names 'rts'"},
        {"set_io rst 3", "set_io rst", "board.pcf:13: expected 'set_io [options] PORT PIN'"},
    };
    for (const Planted& p : planted) {
        std::string text = kBoardFile;
        text.replace(text.find(p.from), p.from.size(), p.to);
        WriteBytes(pcf, text);
        Result result = Pins("check", pcf.string());
        EXPECT_EQ(result.status, 1) << p.to;
        EXPECT_TRUE(Contains(result.out + result.err, p.says)) << result.out << result.err;
    }
}

TEST_F(PinsProcess, PartNamesAreTheToolchainsAndMisspeltNamesGetAHint) {
    fs::path pcf = m_dir / "top.pcf";
    WriteBytes(pcf, "");
    Result hx4k = Run({"pins", "check", "--design", m_json, "--pcf", pcf.string(), "--device",
                       "hx4k", "--package", "tq144", "--allow-unconstrained"});
    EXPECT_EQ(hx4k.status, 0) << hx4k.err;
    EXPECT_TRUE(Contains(hx4k.out, "Device 8k (part hx4k), package tq144:4k")) << hx4k.out;
    Result up5k = Run({"pins", "check", "--design", m_json, "--pcf", pcf.string(), "--device",
                       "up5k", "--allow-unconstrained"});
    EXPECT_TRUE(Contains(up5k.out, "Device 5k (part up5k), package sg48")) << up5k.out;

    Result part =
        Run({"pins", "check", "--design", m_json, "--pcf", pcf.string(), "--device", "hx8"});
    EXPECT_EQ(part.status, 1);
    EXPECT_TRUE(Contains(part.err, "(did you mean hx8k?)")) << part.err;
    Result package = Run({"pins", "check", "--design", m_json, "--pcf", pcf.string(), "--device",
                          "8k", "--package", "tq144"});
    EXPECT_TRUE(Contains(package.err, "(did you mean tq144:4k?)")) << package.err;
    Result port = Pins("assign", pcf.string(), {"lde[0]=99"});
    EXPECT_TRUE(Contains(port.err, "has no port 'lde[0]' (did you mean led[0]?)")) << port.err;
}

// Port names come from the netlist; the file must hold them as they are, and the terminal
// must show them without their control characters.
TEST_F(PinsProcess, NamesAConstraintFileCannotHoldAreRefusedAndNamesAreShownEscaped) {
    auto design = [&](const std::string& name, const std::string& port) {
        fs::path json = m_dir / name;
        WriteBytes(json, "{\"modules\": {\"top\": {\"attributes\": {\"top\": 1}, \"ports\": "
                         "{\"" +
                             port +
                             "\": {\"direction\": \"input\", \"bits\": [2]}}, "
                             "\"cells\": {}, \"netnames\": {}}}}\n");
        return json.string();
    };
    fs::path pcf = m_dir / "top.pcf";
    for (const char* port : {"a#b", "-a", "a b", "a\\nb"}) {
        Result result = Pins("assign", pcf.string(), {"--auto"}, design("odd.json", port));
        EXPECT_EQ(result.status, 1) << port << result.out;
        EXPECT_TRUE(Contains(result.err, "cannot be written to a constraint file")) << result.err;
        EXPECT_FALSE(fs::exists(pcf)) << port;
    }
    WriteBytes(pcf, "");
    Result shown = Pins("check", pcf.string(), {"--allow-unconstrained"},
                        design("esc.json", "a\\u001b[31mred"));
    EXPECT_FALSE(Contains(shown.out, "\x1b")) << shown.out;
}

// The check and the picture are one pass over lines and ports: eight times the bits take
// about eight times as long (a little more as the memory grows past the caches), where a
// pass that compares every bit with every line, or looks each port up in a list, takes
// sixty-four times as long.
TEST_F(PinsProcess, TheCheckAndThePictureTakeTimeInProportionToThePortBits) {
    auto timed = [&](int bits, const std::string& command = "check") {
        std::string json = "{\"modules\": {\"top\": {\"attributes\": {\"top\": 1}, "
                           "\"ports\": {\"d\": {\"direction\": \"input\", \"bits\": [";
        std::string pcf;
        for (int i = 0; i < bits; ++i) {
            json += (i == 0 ? "" : ",") + std::to_string(i + 2);
            pcf += "set_io -nowarn other" + std::to_string(i) + " 1\n";
        }
        json += "]}}, \"cells\": {}, \"netnames\": {}}}}\n";
        WriteBytes(m_dir / "wide.json", json);
        WriteBytes(m_dir / "wide.pcf", pcf);
        auto start = std::chrono::steady_clock::now();
        std::vector<std::string> extra;
        if (command == "show") {
            extra = {"--svg", (m_dir / "wide.svg").string()};
        }
        Result result = Pins(command.c_str(), (m_dir / "wide.pcf").string(), extra,
                             (m_dir / "wide.json").string());
        EXPECT_EQ(result.status, command == "check" ? 1 : 0) << result.err;
        return std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
    };
    timed(1000); // the chip database's pages are warm for both runs
    double small = timed(5000);
    double large = timed(40000);
    EXPECT_LT(large, 12 * small + 0.5) << small << " s for 5000 bits, " << large << " s for 40000";
    small = timed(5000, "show");
    large = timed(40000, "show");
    EXPECT_LT(large, 12 * small + 0.5)
        << "show: " << small << " s for 5000 bits, " << large << " s for 40000";

    // More ports than pins: refused before any is placed, the file untouched.
    Snapshot before = Take(m_dir / "wide.pcf");
    Result full =
        Pins("assign", (m_dir / "wide.pcf").string(), {"--auto"}, (m_dir / "wide.json").string());
    EXPECT_EQ(full.status, 1);
    EXPECT_TRUE(Contains(full.err, "40000 ports without a pin but only 95 free pins")) << full.err;
    ExpectUntouched(m_dir / "wide.pcf", before, "more ports than pins");
}

// ---- the judge ------------------------------------------------------------------------

void RoadToBitstream(const Target& target, const fs::path& dir, const std::string& tool) {
    for (const char* program : {"nextpnr-ice40", "icepack"}) {
        ASSERT_TRUE(OnPath(program)) << program << " missing: install it with scripts/bootstrap";
    }
    std::string why;
    std::string json = Netlist(target, why);
    ASSERT_FALSE(json.empty()) << why;
    fs::path pcf = dir / (std::string(target.name) + ".pcf");
    fs::path log = dir / "log";
    auto run = [&](const std::string& command) {
        int raw = std::system((command + " >" + Quote(log.string()) + " 2>&1").c_str());
        return WIFEXITED(raw) ? WEXITSTATUS(raw) : -1;
    };
    std::string base = Quote(tool) + " pins assign --design " + Quote(json) + " --pcf " +
                       Quote(pcf.string()) + " --device " + target.device + " --package " +
                       target.package;
    // A hand-placed reset first, then the rest automatically.
    ASSERT_EQ(run(base + " rst=" + (target.device == std::string("1k") ? "3" : "A2")), 0)
        << Slurp(log);
    ASSERT_EQ(run(base + " --auto"), 0) << Slurp(log);

    // Where each pin is, by a plain scan of the chip database's .pins section.
    std::map<std::string, std::string> belOfPin;
    {
        std::ifstream db(fs::path(VENLOMER_SYSTEM_CHIPDB_DIR) /
                         ("chipdb-" + std::string(target.device) + ".txt"));
        std::string line;
        bool inPackage = false;
        while (std::getline(db, line)) {
            if (!line.empty() && line[0] == '.') {
                inPackage = line == ".pins " + std::string(target.package);
                continue;
            }
            std::istringstream words(line);
            std::string pin, x, y, z;
            if (inPackage && (words >> pin >> x >> y >> z)) {
                belOfPin[pin] = "X" + x + "/Y" + y + "/io" + z;
            }
        }
    }
    std::map<std::string, std::string> expected;
    {
        std::istringstream lines(Slurp(pcf));
        std::string line;
        std::regex setIo(R"(^set_io\s+(\S+)\s+(\S+)\s*$)");
        std::smatch m;
        while (std::getline(lines, line)) {
            if (std::regex_match(line, m, setIo)) {
                expected[m[1]] = belOfPin[m[2]];
            }
        }
    }
    EXPECT_EQ(expected.size(), 2u + (target.device == std::string("1k") ? 8u : 16u));
    EXPECT_EQ(expected.count("rst"), 1u);

    fs::path asc = dir / "out.asc";
    ASSERT_EQ(run(std::string("nextpnr-ice40 ") + target.nextpnr + " --package " + target.package +
                  " --json " + Quote(json) + " --pcf " + Quote(pcf.string()) + " --asc " +
                  Quote(asc.string())),
              0)
        << Slurp(log);
    std::string placed = Slurp(log);
    std::map<std::string, std::string> bels;
    std::regex constrained("constrained '([^']+)' to bel '([^']+)'");
    for (std::sregex_iterator it(placed.begin(), placed.end(), constrained), end; it != end; ++it) {
        bels[(*it)[1]] = (*it)[2];
    }
    EXPECT_EQ(bels, expected) << placed;
    fs::path bin = dir / "out.bin";
    ASSERT_EQ(run("icepack " + Quote(asc.string()) + " " + Quote(bin.string())), 0) << Slurp(log);
    EXPECT_GT(fs::file_size(bin), 0u);
}

TEST_F(PinsProcess, TheRoadOnTheOneKEndsInABitstreamWithEveryPortAtItsPin) {
    RoadToBitstream(kOneK, m_dir, VENLOMER_TOOL_PATH);
}

TEST_F(PinsProcess, TheRoadOnTheEightKEndsInABitstreamWithEveryPortAtItsPin) {
    RoadToBitstream(kEightK, m_dir, VENLOMER_TOOL_PATH);
}

} // namespace
