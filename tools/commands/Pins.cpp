//===-- tools/commands/Pins.cpp - venlomer pins check|assign|show: plan a design's pins ---===//
//
// The road from a yosys netlist to a constraint file nextpnr-ice40 accepts: the ports of
// the design, the pins of the device model, the checks of the plan, and the file written
// through the safe writer only when the plan it holds has no error.
//
//===------------------------------------------------------------------------------===//
#include "Commands.h"
#include "DeviceDraw.h"
#include "DeviceSearch.h"
#include "PinPlan.h"
#include "PortHolders.h"
#include "Suggest.h"

#include "Port/SafeFile.h"

#include <cstdio>
#include <filesystem>
#include <limits>
#include <map>
#include <set>
#include <unordered_map>
#include <unordered_set>

namespace VnTool {

namespace {

const char kCheck[] = "pins check";
const char kAssign[] = "pins assign";
const char kShow[] = "pins show";

using Assignments = std::vector<std::pair<std::string, std::string>>;

using Plan = PinFiles;

int Load(const std::string& command, const ParsedArgs& args, bool missingPcfIsEmpty, Plan& plan) {
    return LoadPinFiles(command, args, missingPcfIsEmpty, plan);
}

void PrintDevice(const Plan& plan) {
    if (!plan.source.note.empty()) {
        std::printf("Note: %s\n", plan.source.note.c_str());
    }
    const ChipDb& db = plan.model->Db();
    std::string part = plan.source.part.empty() ? "" : " (part " + plan.source.part + ")";
    std::printf("Device %s%s, package %s: %zu pins; design %s (top %s): %zu ports\n",
                db.device.c_str(), part.c_str(), db.package.empty() ? "(none)" : db.package.c_str(),
                db.pins.size(), plan.designPath.c_str(), Port::Printable(plan.design.top).c_str(),
                plan.design.ports.size());
}

std::string Count(std::size_t n, const char* one, const char* many) {
    return std::to_string(n) + " " + (n == 1 ? one : many);
}

int Errors(const std::vector<PinProblem>& problems) {
    int errors = 0;
    for (const auto& problem : problems) {
        errors += problem.severity == PinProblem::Severity::Error ? 1 : 0;
    }
    return errors;
}

// Every error is shown, since any one of them stops place-and-route; warnings come after
// them and a board file's many may be cut short.
void PrintProblems(const std::vector<PinProblem>& problems) {
    const std::size_t shownWarnings = 40;
    std::size_t warnings = 0;
    for (const PinProblem& problem : problems) {
        bool error = problem.severity == PinProblem::Severity::Error;
        if (!error && ++warnings > shownWarnings) {
            continue;
        }
        std::printf("%s\n", Port::Printable(problem.message).c_str());
    }
    if (warnings > shownWarnings) {
        std::printf("... and %zu more warnings\n", warnings - shownWarnings);
    }
}

CheckOptions ReadingOf(const ParsedArgs& args) {
    CheckOptions options;
    options.strict = args.Has("--strict");
    options.allowUnconstrained = args.Has("--allow-unconstrained");
    return options;
}

// ---- check -----------------------------------------------------------------------------

int RunCheck(const ParsedArgs& args) {
    Plan plan;
    if (int status = Load(kCheck, args, false, plan); status != kExitOk) {
        return status;
    }
    CheckSummary summary;
    auto problems = CheckPins(plan.model->Db(), plan.design, plan.designPath, plan.pcf,
                              ReadingOf(args), &summary);
    PrintDevice(plan);

    // Counted once per port: a table row must not look through every problem.
    std::unordered_map<std::string, std::pair<int, int>> countOfPort;
    for (const auto& problem : problems) {
        auto& [errors, warnings] = countOfPort[problem.port];
        (problem.severity == PinProblem::Severity::Error ? errors : warnings) += 1;
    }
    // The table is read from the ports' holders, as the editor's port list is.
    PortHolders ports(plan.design);
    ports.ApplyPins(plan.model->Db(), plan.pcf);
    std::vector<std::vector<std::string>> rows;
    std::size_t placed = 0;
    for (VnI::IPropertyHolder* holder : ports.List()) {
        std::string name = holder->GetName().str();
        std::string pin = PropertyText(holder->GetPropertyByName("Pin"));
        std::string bank = PropertyText(holder->GetPropertyByName("Bank"));
        auto counts = countOfPort.find(name);
        int errors = counts != countOfPort.end() ? counts->second.first : 0;
        int warnings = counts != countOfPort.end() ? counts->second.second : 0;
        std::string said;
        if (errors > 0) {
            said = Count(static_cast<std::size_t>(errors), "error", "errors");
        }
        if (warnings > 0) {
            said += (said.empty() ? "" : ", ") +
                    Count(static_cast<std::size_t>(warnings), "warning", "warnings");
        }
        placed += pin.empty() ? 0 : 1;
        rows.push_back({Port::Printable(name), PropertyText(holder->GetPropertyByName("Direction")),
                        PropertyText(holder->GetPropertyByName("Clock")),
                        pin.empty() ? "-" : Port::Printable(pin), bank == "-1" ? "-" : bank,
                        said.empty() ? "ok" : said});
    }
    PrintTable({"Port", "Direction", "Clock", "Pin", "Bank", "Problems"}, rows);
    PrintProblems(problems);
    if (summary.absentLines > 0) {
        std::printf("%s: %s for ports the design lacks, kept (%zu of them marked -nowarn or "
                    "--warn-no-port)\n",
                    plan.pcfPath.c_str(), Count(summary.absentLines, "line", "lines").c_str(),
                    summary.keptSilently);
    }
    int errors = Errors(problems);
    std::printf(
        "%s: %zu on pins, %zu without; %s, %s\n", Count(ports.Size(), "port", "ports").c_str(),
        placed, ports.Size() - placed,
        Count(static_cast<std::size_t>(errors), "error", "errors").c_str(),
        Count(problems.size() - static_cast<std::size_t>(errors), "warning", "warnings").c_str());
    return errors > 0 ? kExitRefused : kExitOk;
}

// ---- assign ----------------------------------------------------------------------------

// Another program (an editor, a hand) may have changed the constraint file while the
// plan was worked out from it; writing then would drop its lines without a word.
bool StillAsRead(const Plan& plan, std::string& error) {
    std::error_code ec;
    const bool exists = std::filesystem::exists(std::filesystem::symlink_status(plan.pcfPath, ec));
    std::string now;
    if (exists && !Port::ReadRegularFile(plan.pcfPath, now, error)) {
        return false;
    }
    if (exists != plan.pcfExisted || now != plan.pcf.Text()) {
        error = plan.pcfPath + " changed on disk while this ran; nothing was written (run again "
                               "to plan on the new file)";
        return false;
    }
    return true;
}

// PORT=PIN operands; a port given twice is a slip of the command line, not a plan.
int ReadAssignments(const ParsedArgs& args, Assignments& wanted) {
    std::unordered_set<std::string> seen;
    for (const std::string& operand : args.operands) {
        auto eq = operand.find('=');
        if (eq == std::string::npos || eq == 0 || eq + 1 == operand.size()) {
            return UsageError(kAssign, "an assignment is PORT=PIN, got \"" + operand + "\"");
        }
        wanted.emplace_back(operand.substr(0, eq), operand.substr(eq + 1));
        if (!seen.insert(wanted.back().first).second) {
            return UsageError(kAssign, "port '" + wanted.back().first +
                                           "' is given twice; give each port one pin");
        }
    }
    return kExitOk;
}

// Why the wanted assignments cannot be made, or empty.
std::string CheckWanted(const Plan& plan, const Assignments& wanted) {
    const ChipDb& db = plan.model->Db();
    std::unordered_set<std::string> designPorts;
    std::vector<std::string> portNames;
    for (const auto& port : plan.design.ports) {
        designPorts.insert(port.name);
        portNames.push_back(port.name);
    }
    std::vector<std::string> pinNames;
    for (const Pin& pin : db.pins) {
        pinNames.push_back(pin.name);
    }
    for (const auto& [port, pin] : wanted) {
        if (designPorts.count(port) == 0) {
            return "design " + plan.designPath + " has no port '" + port + "'" +
                   DidYouMean(port, portNames);
        }
        if (plan.model->FindPin(pin) == nullptr) {
            return "pin '" + pin + "' is not in package " + db.package + " of device " + db.device +
                   DidYouMean(pin, pinNames);
        }
    }
    return {};
}

// A pin the user asks for that another port of the design holds: told from the user's
// side, naming the holder, whichever of the two lines comes first in the file.
std::string CheckHeld(const Plan& plan, const PcfFile& result, const Assignments& wanted) {
    std::unordered_set<std::string> designPorts;
    for (const auto& port : plan.design.ports) {
        designPorts.insert(port.name);
    }
    std::unordered_map<std::string, std::vector<const PcfLine*>> holders;
    for (const PcfLine& line : result.Lines()) {
        if (line.kind == PcfLine::Kind::SetIo && designPorts.count(line.port) != 0) {
            holders[line.pin].push_back(&line);
        }
    }
    for (const auto& [port, pin] : wanted) {
        for (const PcfLine* holder : holders[pin]) {
            if (holder->port != port) {
                return "pin " + pin + " already holds port '" + holder->port + "' (" +
                       (holder->number == 0 ? std::string("new line")
                                            : "line " + std::to_string(holder->number)) +
                       ")";
            }
        }
    }
    return {};
}

// Auto-assignment cannot succeed when the ports outnumber the pins no line names: say so
// before placing any.
std::string CheckRoom(const Plan& plan, const PcfFile& pcf) {
    std::unordered_set<std::string> named;
    std::unordered_set<std::string> constrained;
    for (const PcfLine& line : pcf.Lines()) {
        if (line.kind == PcfLine::Kind::SetIo) {
            named.insert(line.pin);
            constrained.insert(line.port);
        }
    }
    std::size_t free = 0;
    for (const Pin& pin : plan.model->Db().pins) {
        free += named.count(pin.name) == 0 ? 1 : 0;
    }
    std::size_t open = 0;
    for (const DesignPort& port : plan.design.ports) {
        open += constrained.count(port.name) == 0 ? 1 : 0;
    }
    if (open <= free) {
        return {};
    }
    return Count(open, "port", "ports") + " without a pin but only " +
           Count(free, "free pin", "free pins") + " in package " + plan.model->Db().package;
}

// Every port name goes into the file as it is, so it must be one a constraint file can
// hold; and the written text must mean what the plan says.
std::string CheckWritable(const PcfFile& result, const std::string& text) {
    for (const PcfLine& line : result.Lines()) {
        if (line.kind != PcfLine::Kind::SetIo || line.number != 0) {
            continue;
        }
        for (const std::string* word : {&line.port, &line.pin}) {
            if (std::string why = PcfWordProblem(*word); !why.empty()) {
                return "'" + Port::Printable(*word) +
                       "' cannot be written to a constraint file: " + why;
            }
        }
    }
    PcfFile back;
    std::string error;
    if (!back.Parse(text, result.Source(), error)) {
        return "the written file would not read back: " + error;
    }
    if (PcfAssignments(back) != PcfAssignments(result)) {
        return "the written file would not read back as the plan (a port or pin name that "
               "the constraint syntax splits or hides)";
    }
    return {};
}

std::string FirstErrorAndCount(const std::vector<PinProblem>& problems) {
    std::string first;
    for (const auto& problem : problems) {
        if (first.empty() && problem.severity == PinProblem::Severity::Error) {
            first = problem.message;
        }
    }
    int more = Errors(problems) - 1;
    return first +
           (more > 0
                ? " (and " + Count(static_cast<std::size_t>(more), "more error", "more errors") +
                      "; venlomer pins check lists them)"
                : "");
}

// What pins assign was asked to change.
struct AssignRequest {
    Assignments wanted;
    std::vector<std::string> unassign;
    bool autoAssign = false;
};

int ReadRequest(const ParsedArgs& args, AssignRequest& request) {
    if (int status = ReadAssignments(args, request.wanted); status != kExitOk) {
        return status;
    }
    request.unassign = args.Values("--unassign");
    request.autoAssign = args.Has("--auto");
    if (request.wanted.empty() && request.unassign.empty() && !request.autoAssign) {
        return UsageError(kAssign, "nothing to do: give PORT=PIN, --unassign PORT or --auto");
    }
    return kExitOk;
}

// The plan's constraint file with the request made in it, and the pins --auto chose into
// `given`; returns why the request cannot be made, or empty.
std::string ApplyRequest(const Plan& plan, const AssignRequest& request, PcfFile& result,
                         Assignments& given) {
    if (std::string why = CheckWanted(plan, request.wanted); !why.empty()) {
        return why;
    }
    result = plan.pcf;
    for (const std::string& port : request.unassign) {
        if (result.Unassign(port) == 0) {
            return "port '" + port + "' has no set_io line to remove";
        }
    }
    for (const auto& [port, pin] : request.wanted) {
        result.Assign(port, pin);
    }
    if (std::string why = CheckHeld(plan, result, request.wanted); !why.empty()) {
        return why;
    }
    if (request.autoAssign) {
        if (std::string why = CheckRoom(plan, result); !why.empty()) {
            return why;
        }
        given = AutoAssign(plan.model->Db(), plan.design, result);
    }
    return {};
}

void PrintAssignments(const Plan& plan, const AssignRequest& request, const Assignments& given) {
    PrintDevice(plan);
    for (const std::string& port : request.unassign) {
        std::printf("  %s: unassigned\n", Port::Printable(port).c_str());
    }
    auto describe = [&](const std::string& port, const std::string& pin) {
        DeviceHolder* holder = plan.model->FindPin(pin);
        std::printf("  %s -> %s (bank %d%s)\n", Port::Printable(port).c_str(),
                    Port::Printable(pin).c_str(), plan.model->PinOf(holder).bank,
                    plan.model->IsGlobalBufferPin(holder) ? ", global buffer" : "");
    };
    for (const auto& [port, pin] : request.wanted) {
        describe(port, pin);
    }
    for (const auto& [port, pin] : given) {
        describe(port, pin);
    }
}

// Writes the checked plan, unless the file already says it.
int WritePlan(const Plan& plan, const PcfFile& result, const std::string& text) {
    if (plan.pcfExisted && text == plan.pcf.Text()) {
        std::printf("%s unchanged\n", plan.pcfPath.c_str());
        return kExitOk;
    }
    std::string error;
    if (!StillAsRead(plan, error) ||
        !WriteTextFile(plan.pcfPath, text, error, {plan.designPath, plan.source.chipDb})) {
        return Refused(kAssign, error);
    }
    std::size_t lines = 0;
    for (const auto& line : result.Lines()) {
        lines += line.kind == PcfLine::Kind::SetIo ? 1 : 0;
    }
    std::printf("%s %s: %s\n", plan.pcfExisted ? "Updated" : "Created", plan.pcfPath.c_str(),
                Count(lines, "set_io line", "set_io lines").c_str());
    return kExitOk;
}

int RunAssign(const ParsedArgs& args) {
    AssignRequest request;
    if (int status = ReadRequest(args, request); status != kExitOk) {
        return status;
    }
    Plan plan;
    if (int status = Load(kAssign, args, true, plan); status != kExitOk) {
        return status;
    }
    auto refuse = [&](const std::string& why) {
        return Refused(kAssign, why + "; " + plan.pcfPath + " left untouched");
    };
    PcfFile result;
    Assignments given;
    if (std::string why = ApplyRequest(plan, request, result, given); !why.empty()) {
        return refuse(why);
    }
    // A plan being built port by port has ports still to place; with --auto every port
    // has a pin, so an unconstrained one is the error nextpnr-ice40 would make it.
    CheckOptions reading = ReadingOf(args);
    reading.allowUnconstrained = reading.allowUnconstrained || !request.autoAssign;
    auto problems = CheckPins(plan.model->Db(), plan.design, plan.designPath, result, reading);
    if (HasErrors(problems)) {
        return refuse(FirstErrorAndCount(problems));
    }
    std::string text = result.Text();
    if (std::string why = CheckWritable(result, text); !why.empty()) {
        return refuse(why);
    }
    PrintAssignments(plan, request, given);
    PrintProblems(problems);
    return WritePlan(plan, result, text);
}

// ---- show ------------------------------------------------------------------------------

int ReadShowArgs(const ParsedArgs& args, SearchRequest& search, DrawRequest& draw) {
    if (int status = ParseSearchArgs(kShow, args, search); status != kExitOk) {
        return status;
    }
    if (int status = ParseViewArgs(kShow, args, draw); status != kExitOk) {
        return status;
    }
    draw.plan = true;
    draw.highlightOnly = args.Has("--highlight-only");
    draw.svg = args.Value("--svg", "pins.svg");
    if (draw.svg.empty()) {
        return UsageError(kShow, "--svg wants a file name");
    }
    return kExitOk;
}

// Labels every pin with the design ports the file puts on it, then marks the pins a
// problem names (a port's problem falls on the pin it is on) with the first such problem.
void MarkPlan(const DeviceModel& model, const PortHolders& ports, const PcfFile& pcf,
              const std::vector<PinProblem>& problems, std::map<int, PinMark>& marks) {
    auto pinIndex = [&](const std::string& pin) {
        DeviceHolder* holder = model.FindPin(pin);
        return holder != nullptr ? holder->GetIndex() : -1;
    };
    for (const auto& line : pcf.Lines()) {
        int index = line.kind == PcfLine::Kind::SetIo && ports.Find(line.port) != nullptr
                        ? pinIndex(line.pin)
                        : -1;
        if (index >= 0) {
            PinMark& mark = marks[index];
            mark.label += (mark.label.empty() ? "" : ",") + line.port;
        }
    }
    for (const auto& problem : problems) {
        std::string pin = problem.pin;
        if (pin.empty() && ports.Find(problem.port) != nullptr) {
            pin = PropertyText(ports.Find(problem.port)->GetPropertyByName("Pin"));
        }
        int index = pinIndex(pin);
        if (index < 0) {
            continue;
        }
        PinMark& mark = marks[index];
        if (mark.status != PinMark::Status::Problem) {
            mark.status = PinMark::Status::Problem;
            mark.reason = problem.message;
        }
        if (mark.label.empty()) {
            mark.label = problem.port;
        }
    }
}

void PrintPinCounts(const DeviceModel& model, const std::map<int, PinMark>& marks) {
    std::size_t problemPins = 0;
    for (const auto& [index, mark] : marks) {
        problemPins += mark.status == PinMark::Status::Problem ? 1 : 0;
    }
    std::printf("Pins: %zu assigned, %zu with problems, %zu free\n", marks.size() - problemPins,
                problemPins, model.Pins().size() - marks.size());
}

// Searches banks, pins and ports together and highlights what matched.
void SearchPlan(DeviceModel& model, PortHolders& ports, const SearchRequest& search,
                const CommonI::RefCountPtr<VnI::IProperty>& wanted,
                const std::vector<SearchKind>& kinds) {
    std::vector<VnI::IPropertyHolder*> candidates(model.Banks().begin(), model.Banks().end());
    candidates.insert(candidates.end(), model.Pins().begin(), model.Pins().end());
    for (VnI::IPropertyHolder* port : ports.List()) {
        candidates.push_back(port);
    }
    std::string over = std::to_string(model.Banks().size()) + " banks, " +
                       std::to_string(model.Pins().size()) + " pins and " +
                       std::to_string(ports.Size()) + " ports";
    auto matches = SearchAndPrint(search, wanted, candidates, kinds, over);
    // A matched port stands for the pin it is on: the device's managers hold device
    // resources only.
    std::vector<VnI::IPropertyHolder*> resources;
    for (VnI::IPropertyHolder* match : matches) {
        if (match->GetPropertyNames() != ports.Names()) {
            resources.push_back(match);
        } else if (DeviceHolder* pin =
                       model.FindPin(PropertyText(match->GetPropertyByName("Pin")))) {
            resources.push_back(pin);
        }
    }
    SelectAndHighlight(model, resources);
}

int RunShow(const ParsedArgs& args) {
    SearchRequest search;
    DrawRequest draw;
    if (int status = ReadShowArgs(args, search, draw); status != kExitOk) {
        return status;
    }
    Plan plan;
    if (int status = Load(kShow, args, false, plan); status != kExitOk) {
        return status;
    }
    DeviceModel& model = *plan.model;
    PortHolders ports(plan.design);
    ports.ApplyPins(model.Db(), plan.pcf);
    std::vector<SearchKind> kinds = {
        {model.PinNames(), "Pins"}, {model.BankNames(), "Banks"}, {ports.Names(), "Ports"}};
    CommonI::RefCountPtr<VnI::IProperty> wanted;
    if (search.active) {
        if (int status =
                MakeWantedOrUsage(kShow, search, kinds, "pins, banks and ports",
                                  "Name, Bank, Tile, X, Y, Block, Edge, Pins, Direction, Bit, "
                                  "Clock, Pin",
                                  wanted);
            status != kExitOk) {
            return status;
        }
    }
    auto problems = CheckPins(model.Db(), plan.design, plan.designPath, plan.pcf, ReadingOf(args));
    PrintDevice(plan);
    MarkPlan(model, ports, plan.pcf, problems, draw.marks);
    PrintPinCounts(model, draw.marks);
    PrintProblems(problems);
    if (search.active) {
        SearchPlan(model, ports, search, wanted, kinds);
        draw.title = ", search " + search.name + "=" + search.value;
    }
    draw.inputs = {plan.source.chipDb, plan.designPath, plan.pcfPath};
    return DrawDevice(kShow, model, draw);
}

std::vector<OptionSyntax> PlanOptions() {
    std::vector<OptionSyntax> options = {
        {"--design", "D.json", "the yosys netlist (synth_ice40 ... -json D.json)"},
        {"--pcf", "P.pcf", "the pin constraint file"},
        {"--strict", "", "read the file as an exact list: every line names a port of the design"},
        {"--allow-unconstrained", "",
         "a port without a pin is a warning (nextpnr-ice40's --pcf-allow-unconstrained)"},
    };
    for (const OptionSyntax& option : DeviceOptionSyntax()) {
        options.push_back(option);
    }
    return options;
}

const char kDeviceDetails[] =
    "Without --chipdb or --device, chipdb-8k.txt (package ct256) is taken from\n"
    "/usr/share/fpga-icestorm/chipdb (or the folder in VENLOMER_CHIPDB_DIR), else the\n"
    "bundled demo device. --device takes nextpnr-ice40's part names (hx1k, hx8k, lp384,\n"
    "lp1k, lp4k, lp8k, hx4k, up5k, up3k, u4k, u1k, u2k) with nextpnr's default package,\n"
    "or a chip database's name: --device 1k means chipdb-1k.txt there (package tq144\n"
    "unless --package says otherwise).\n"
    "Lines for ports the design lacks are kept with a warning (none with -nowarn or\n"
    "--warn-no-port) and hold no pin; a design port without a pin is an error.\n"
    "Exit status: 0 success, 1 refused or problems found, 2 bad usage.\n";

} // namespace

const Command& PinsCheckCommand() {
    static const Command command = [] {
        auto options = PlanOptions();

        return Command{{kCheck, "", "check a design's pin constraints against the device", options,
                        0, 0,
                        std::string("Prints a table of the design's ports with pin, bank and "
                                    "problems, then each problem\nas FILE:LINE: error|warning: "
                                    "WHY. Exits 1 on any error.\n") +
                            kDeviceDetails +
                            "Example: venlomer pins check --design top.json --pcf top.pcf "
                            "--device 1k --package tq144\n"},
                       RunCheck};
    }();
    return command;
}

const Command& PinsAssignCommand() {
    static const Command command = [] {
        auto options = PlanOptions();
        options.push_back(
            {"--unassign", "PORT", "drop the port's set_io lines (repeatable)", true});
        options.push_back({"--auto", "", "give every port without a pin a free pin"});
        return Command{
            {kAssign, "[PORT=PIN ...]", "put design ports on pins and write the constraint file",
             options, 0, std::numeric_limits<std::size_t>::max(),
             std::string("Removes, then assigns, then (with --auto) fills in: clock ports on "
                         "global-buffer\npins, each bus together in one bank in pin order, then "
                         "the rest. The file is\nwritten (created when absent) only when the "
                         "resulting plan has no error; lines\nthe tool does not own stay as "
                         "they are. Otherwise it is left untouched and\nthe errors are "
                         "printed.\n") +
                 kDeviceDetails +
                 "Example: venlomer pins assign --design top.json --pcf top.pcf --device 1k "
                 "clk=21 --auto\n"},
            RunAssign};
    }();
    return command;
}

const Command& PinsShowCommand() {
    static const Command command = [] {
        auto options = PlanOptions();
        for (const OptionSyntax& option : SearchOptionSyntax()) {
            options.push_back(option);
        }
        options.back().help = "compare flags of the search, comma separated";
        options[options.size() - 2].help = "search the banks, pins and ports for a value";
        options.push_back({"--svg", "OUT", "where to write the picture (default: pins.svg)"});
        options.push_back({"--highlight-only", "", "draw only the pins the search highlighted"});
        for (const OptionSyntax& option : ViewOptionSyntax()) {
            options.push_back(option);
        }
        return Command{
            {kShow, "", "draw the device with the design's pins labelled and coloured by status",
             options, 0, 0,
             std::string("Assigned pins carry their port's name; pins with a problem are drawn "
                         "in the\nproblem colour, free pins in their bank's colour. Searchable "
                         "like floorplan;\nports have Name, Direction, Bit, Clock, Pin, Bank, "
                         "and a matched port\nhighlights its pin.\n") +
                 kDeviceDetails +
                 "Example: venlomer pins show --design top.json --pcf top.pcf --find "
                 "Name=led --flags substring --svg pins.svg\n"},
            RunShow};
    }();
    return command;
}

} // namespace VnTool
