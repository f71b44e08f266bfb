//===-- tools/commands/Board.cpp - venlomer pins from-board|export|import ---===//
//
// The board's own files as the source of a pin plan: the FPGA's nets matched to the
// design's ports and written to the constraint file, and the plan as a CSV table out and
// back in. A plan that disagrees with the constraint file already there is written only
// when --prefer says which side wins; otherwise the disagreements are listed and the
// file left untouched.
//
//===------------------------------------------------------------------------------===//
#include "BoardFiles.h"
#include "Commands.h"
#include "NetMatch.h"
#include "PinCsv.h"
#include "PinPlan.h"

#include "Port/SafeFile.h"

#include <cstdio>
#include <filesystem>
#include <map>
#include <set>
#include <string_view>

namespace VnTool {

namespace {

const char kFromBoard[] = "pins from-board";
const char kExport[] = "pins export";
const char kImport[] = "pins import";

struct BoardPlan : PinFiles {
    std::vector<std::string> inputs; ///< every file read, never to be written over
};

// `plan.inputs` holds the board's files on the way in; the constraint file may be none of
// them either.
int LoadPlan(const std::string& command, const ParsedArgs& args, BoardPlan& plan) {
    if (int status = LoadPinFiles(command, args, true, plan, plan.inputs); status != kExitOk) {
        return status;
    }
    plan.inputs.insert(plan.inputs.end(), {plan.designPath, plan.source.chipDb});
    return kExitOk;
}

void PrintList(const char* title, const std::vector<std::string>& items) {
    if (items.empty()) {
        return;
    }
    std::printf("%s (%zu):\n", title, items.size());
    for (const std::string& item : items) {
        std::printf("  %s\n", Port::Printable(item).c_str());
    }
}

// Messages built in loops, one allocation each.
std::string Cat(std::initializer_list<std::string_view> parts) {
    std::string out;
    for (std::string_view part : parts) {
        out += part;
    }
    return out;
}

std::string FilePin(const PcfFile& pcf, const std::string& port) {
    for (const PcfLine& line : pcf.Lines()) {
        if (line.kind == PcfLine::Kind::SetIo && line.port == port) {
            return line.pin;
        }
    }
    return {};
}

// Puts the new plan over the constraint file. Where the two disagree (a port on another
// pin, a pin held by another port), --prefer decides; without it nothing is written.
// Kept whole: the disagreements are found and settled in one pass over the plan.
int Settle(const std::string& command, const ParsedArgs& args, BoardPlan& plan,
           const std::vector<std::pair<std::string, std::string>>& placed, const char* newSide,
           PcfFile& result) {
    std::string prefer = args.Value("--prefer");
    if (args.Has("--prefer") && prefer != "board" && prefer != "file") {
        return UsageError(command, "--prefer takes board or file, not \"" + prefer + "\"");
    }
    std::set<std::string> moving;
    for (const auto& [port, pin] : placed) {
        moving.insert(port);
    }
    // A line for a port the design lacks holds no pin, as the check reads it: a board's
    // file names one pad under several names, and only the design's ports can disagree.
    std::set<std::string> present;
    for (const DesignPort& port : plan.design.ports) {
        present.insert(port.name);
    }
    std::vector<std::string> conflicts;
    result = plan.pcf;
    for (const auto& [port, pin] : placed) {
        std::string filePin = FilePin(plan.pcf, port);
        std::vector<std::string> holders;
        for (const PcfLine& line : plan.pcf.Lines()) {
            if (line.kind == PcfLine::Kind::SetIo && line.pin == pin && line.port != port &&
                moving.count(line.port) == 0 && present.count(line.port) != 0) {
                holders.push_back(line.port);
            }
        }
        bool disagree = (!filePin.empty() && filePin != pin) || !holders.empty();
        if (!filePin.empty() && filePin != pin) {
            conflicts.push_back(Cat({"port ", port, ": ", plan.pcfPath, " puts it on ", filePin,
                                     ", the ", newSide, " on ", pin}));
        }
        for (const std::string& holder : holders) {
            conflicts.push_back(Cat({"pin ", pin, ": ", plan.pcfPath, " gives it to ", holder,
                                     ", the ", newSide, " to ", port}));
        }
        if (disagree && prefer == "file") {
            continue;
        }
        for (const std::string& holder : holders) {
            result.Unassign(holder);
        }
        result.Assign(port, pin);
    }
    if (!conflicts.empty() && prefer.empty()) {
        PrintList("Disagreements with the constraint file", conflicts);
        return Refused(command, std::to_string(conflicts.size()) + " pin" +
                                    (conflicts.size() == 1 ? "" : "s") + " of " + plan.pcfPath +
                                    " disagree with the " + newSide +
                                    "; --prefer board|file decides; " + plan.pcfPath +
                                    " left untouched");
    }
    if (!conflicts.empty()) {
        PrintList(prefer == "file" ? "Disagreements, kept as the constraint file has them"
                                   : "Disagreements, settled as the board has them",
                  conflicts);
    }
    return kExitOk;
}

// Checks the result and writes it through the safe writer when it holds no error.
int WritePlan(const std::string& command, const BoardPlan& plan, const PcfFile& result) {
    const ChipDb& db = plan.model->Db();
    auto problems = CheckPins(db, plan.design, plan.designPath, result, false);
    std::vector<std::string> errors;
    for (const PinProblem& problem : problems) {
        if (problem.severity == PinProblem::Severity::Error) {
            errors.push_back(problem.message);
        }
    }
    if (!errors.empty()) {
        PrintList("Errors in the resulting plan", errors);
        return Refused(command, "the plan has errors; " + plan.pcfPath + " left untouched");
    }
    std::string text = result.Text();
    if (plan.pcfExisted && text == plan.pcf.Text()) {
        std::printf("%s unchanged\n", plan.pcfPath.c_str());
        return kExitOk;
    }
    std::string error;
    if (!WriteTextFile(plan.pcfPath, text, error, plan.inputs)) {
        return Refused(command, error);
    }
    std::size_t lines = 0;
    for (const auto& line : result.Lines()) {
        lines += line.kind == PcfLine::Kind::SetIo ? 1 : 0;
    }
    std::printf("%s %s: %zu set_io line%s\n", plan.pcfExisted ? "Updated" : "Created",
                plan.pcfPath.c_str(), lines, lines == 1 ? "" : "s");
    return kExitOk;
}

// Prints what the match found, settles it with the constraint file and writes it.
int PlaceMatch(const std::string& command, const ParsedArgs& args, BoardPlan& plan,
               const BoardMatch& match, const char* newSide) {
    std::printf("Placed from the %s (%zu):\n", newSide, match.placed.size());
    for (const auto& [port, pin] : match.placed) {
        std::printf("  %s -> %s\n", Port::Printable(port).c_str(), pin.c_str());
    }
    PrintList("Not placed", match.problems);
    PrintList("Ports with no net", match.unmatched);
    PrintList("Nets on I/O pins that no port took", match.unused);
    PcfFile result;
    if (int status = Settle(command, args, plan, match.placed, newSide, result);
        status != kExitOk) {
        return status;
    }
    return WritePlan(command, plan, result);
}

// ---- from-board ------------------------------------------------------------------------

// Kept whole: reading each file, finding the FPGA on each and comparing them is one story.
int RunFromBoard(const ParsedArgs& args) {
    std::vector<std::string> files = args.Values("--board");
    if (files.empty() || files.size() > 2) {
        return UsageError(kFromBoard, "--board FILE is needed once, or twice for a netlist and "
                                      "its board file");
    }
    BoardPlan plan;
    plan.inputs = files;
    if (int status = LoadPlan(kFromBoard, args, plan); status != kExitOk) {
        return status;
    }
    const ChipDb& db = plan.model->Db();
    std::vector<Board> boards(files.size());
    std::vector<const BoardPart*> fpgas;
    std::string ref = args.Value("--ref");
    for (std::size_t i = 0; i < files.size(); ++i) {
        std::string error;
        if (!ReadBoardFile(files[i], boards[i], error)) {
            return Refused(kFromBoard, error);
        }
        const BoardPart* fpga = FindFpga(boards[i], db, ref, error);
        if (fpga == nullptr) {
            return Refused(kFromBoard, error);
        }
        fpgas.push_back(fpga);
        if (ref.empty()) {
            ref = fpga->ref; // the second file must speak of the same part
        }
    }
    std::printf("Device %s, package %s; design %s (top %s): %zu ports\n", db.device.c_str(),
                db.package.c_str(), plan.designPath.c_str(), plan.design.top.c_str(),
                plan.design.ports.size());
    for (std::size_t i = 0; i < files.size(); ++i) {
        std::printf("Board %s (%s): FPGA %s (%s), %zu pins\n", files[i].c_str(),
                    boards[i].kind.c_str(), Port::Printable(fpgas[i]->ref).c_str(),
                    Port::Printable(fpgas[i]->value).c_str(), NetsOnPins(*fpgas[i]).size());
    }
    if (files.size() == 2) {
        auto differences = CompareParts(*fpgas[0], files[0], *fpgas[1], files[1]);
        if (!differences.empty()) {
            PrintList("The two files disagree", differences);
            return Refused(kFromBoard, "the netlist and the board file disagree on " +
                                           std::to_string(differences.size()) +
                                           " pins (one is stale?); give only the one to trust; " +
                                           plan.pcfPath + " left untouched");
        }
        std::printf("The two files agree on every pin of %s\n", fpgas[0]->ref.c_str());
    }
    BoardMatch match = MatchPorts(plan.design, db, NetsOnPins(*fpgas[0]));
    return PlaceMatch(kFromBoard, args, plan, match, "board");
}

// ---- export and import -----------------------------------------------------------------

int RunExport(const ParsedArgs& args) {
    std::string out = args.Value("--csv");
    if (out.empty()) {
        return UsageError(kExport, "--csv OUT is needed (- for standard output)");
    }
    BoardPlan plan;
    if (int status = LoadPlan(kExport, args, plan); status != kExitOk) {
        return status;
    }
    if (!plan.pcfExisted) {
        return Refused(kExport, plan.pcfPath + " does not exist");
    }
    std::string csv = PlanCsv(plan.model->Db(), plan.design, plan.designPath, plan.pcf);
    if (out == "-") {
        std::fwrite(csv.data(), 1, csv.size(), stdout);
        return kExitOk;
    }
    std::string error;
    plan.inputs.push_back(plan.pcfPath);
    if (!WriteTextFile(out, csv, error, plan.inputs)) {
        return Refused(kExport, error);
    }
    std::printf("Wrote %s: %zu ports\n", out.c_str(), plan.design.ports.size());
    return kExitOk;
}

// A plan table is the user's edited plan: it replaces the pins of the ports it lists.
int ImportPlanTable(const ParsedArgs& args, BoardPlan& plan, const CsvTable& table) {
    const ChipDb& db = plan.model->Db();
    std::set<std::string> ports;
    for (const DesignPort& port : plan.design.ports) {
        ports.insert(port.name);
    }
    std::set<std::string> pins;
    for (const Pin& pin : db.pins) {
        pins.insert(pin.name);
    }
    PcfFile result = plan.pcf;
    std::string csv = args.Value("--csv");
    for (const auto& [port, pin] : table.assignments) {
        if (ports.count(port) == 0) {
            return Refused(kImport, Cat({csv, ": design ", plan.designPath, " has no port '", port,
                                         "'; ", plan.pcfPath, " left untouched"}));
        }
        if (!pin.empty() && pins.count(pin) == 0) {
            return Refused(kImport, Cat({csv, ": pin '", pin, "' of port ", port,
                                         " is not an I/O pin of package ", db.package, "; ",
                                         plan.pcfPath, " left untouched"}));
        }
        if (pin.empty()) {
            result.Unassign(port);
        } else {
            result.Assign(port, pin);
        }
    }
    std::printf("Read %zu ports from %s\n", table.assignments.size(), csv.c_str());
    return WritePlan(kImport, plan, result);
}

int RunImport(const ParsedArgs& args) {
    std::string in = args.Value("--csv");
    if (in.empty()) {
        return UsageError(kImport, "--csv FILE is needed");
    }
    BoardPlan plan;
    plan.inputs.push_back(in);
    if (int status = LoadPlan(kImport, args, plan); status != kExitOk) {
        return status;
    }
    std::string text;
    std::string error;
    CsvTable table;
    if (!Port::ReadRegularFile(in, text, error) || !ReadPinCsv(text, in, table, error)) {
        return Refused(kImport, error);
    }
    if (!table.netList) {
        return ImportPlanTable(args, plan, table);
    }
    std::printf("Read %zu pins and their nets from %s\n", table.nets.size(), in.c_str());
    BoardMatch match = MatchPorts(plan.design, plan.model->Db(), table.nets);
    return PlaceMatch(kImport, args, plan, match, "pin list");
}

std::vector<OptionSyntax> PlanOptions(std::vector<OptionSyntax> options) {
    options.push_back({"--design", "D.json", "the yosys netlist (synth_ice40 ... -json D.json)"});
    options.push_back({"--pcf", "P.pcf", "the pin constraint file"});
    for (const OptionSyntax& option : DeviceOptionSyntax()) {
        options.push_back(option);
    }
    return options;
}

const OptionSyntax kPrefer = {"--prefer", "board|file",
                              "which side wins where the constraint file disagrees"};

const char kDevice[] = "Without --chipdb or --device, chipdb-8k.txt (package ct256) is taken "
                       "as for venlomer pins check.\n"
                       "Exit status: 0 success, 1 refused, 2 bad usage.\n";

} // namespace

const Command& PinsFromBoardCommand() {
    static const Command command{
        {kFromBoard, "", "plan pins from the board's KiCad netlist or board file",
         PlanOptions(
             {{"--board", "FILE",
               "KiCad netlist or board file (.net, .xml, .kicad_pcb); twice to compare", true},
              {"--ref", "REF", "the FPGA's reference (default: the part with the package's pins)"},
              kPrefer}),
         0, 0,
         std::string("Matches the nets on the FPGA's pins to the design's ports by the rules of "
                     "docs/board.md\n(sheet path, case and punctuation aside; active-low marks; "
                     "bus bits; a|b labels).\nWhat two nets or two ports could claim is "
                     "listed, not placed. The constraint file\nis written, other lines kept, "
                     "only when the plan has no error and agrees with\nit (or --prefer "
                     "settles it).\n") +
             kDevice +
             "Example: venlomer pins from-board --board board.net --design top.json --pcf "
             "top.pcf --device 1k\n"},
        RunFromBoard};
    return command;
}

const Command& PinsExportCommand() {
    static const Command command{
        {kExport, "", "write the pin plan as a CSV table, one row per port",
         PlanOptions({{"--csv", "OUT", "the table to write (- for standard output)"}}), 0, 0,
         std::string("Columns: ") +
             [] {
                 std::string names;
                 for (const std::string& column : PlanCsvColumns()) {
                     names += (names.empty() ? "" : ", ") + column;
                 }
                 return names;
             }() +
             ".\nRFC 4180 quoting, CRLF line ends.\n" + kDevice +
             "Example: venlomer pins export --csv pins.csv --design top.json --pcf top.pcf\n"},
        RunExport};
    return command;
}

const Command& PinsImportCommand() {
    static const Command command{
        {kImport, "", "read a CSV pin table or a (pin, net) list into the constraint file",
         PlanOptions({{"--csv", "FILE", "the table to read"}, kPrefer}), 0, 0,
         std::string("A table with a 'port' column (as pins export writes it) sets the pins of "
                     "the ports\nit lists; an empty pin drops the port's constraint. A list "
                     "with 'pin' and 'net'\ncolumns, or of two columns without a header, is "
                     "matched like a board's nets.\n") +
             kDevice +
             "Example: venlomer pins import --csv pins.csv --design top.json --pcf top.pcf\n"},
        RunImport};
    return command;
}

} // namespace VnTool
