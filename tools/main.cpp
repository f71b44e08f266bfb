//===-- tools/main.cpp - venlomer: the library at work without the host ---===//
//
// The editor that normally hosts the library draws its device views and runs its
// searches through it; this tool takes the same roads from the command line so that the
// library can be tried and shown on its own.
//
//===------------------------------------------------------------------------------===//
#include "Commands.h"
#include "SourceLine.h"

#include "Port/MsgMan.h"
#include "Port/SafeFile.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <exception>
#include <filesystem>
#include <optional>
#include <string>
#include <unistd.h>
#include <vector>

namespace {

using VnTool::Command;

const std::vector<const Command*>& AllCommands() {
    static const std::vector<const Command*> commands = {
        &VnTool::FloorplanCommand(),  &VnTool::ColorsCommand(),
        &VnTool::NgcStubCommand(),    &VnTool::NgcNewCommand(),
        &VnTool::NgdSampleCommand(),  &VnTool::ProjectFilesCommand(),
        &VnTool::PinsCheckCommand(),  &VnTool::PinsAssignCommand(),
        &VnTool::PinsShowCommand(),   &VnTool::PinsFromBoardCommand(),
        &VnTool::PinsExportCommand(), &VnTool::PinsImportCommand(),
        &VnTool::EditCommand(),
    };
    return commands;
}

void PrintToolHelp() {
    std::printf("usage: venlomer [--verbose] COMMAND [options]\n\n"
                "Runs the venlomer library's device-resource, search, selection, colour,\n"
                "netlist and project services from the command line.\n\ncommands:\n");
    for (const Command* command : AllCommands()) {
        std::printf("  %-15s %s\n", command->syntax.name.c_str(), command->syntax.summary.c_str());
    }
    std::printf("\nRun 'venlomer COMMAND --help' for a command's options.\n"
                "Exit status: 0 success, 1 refused operation, 2 bad usage.\n");
}

bool g_verbose = false;
int g_libraryErrors = 0;

// Library messages share stderr with the tool's own reasons, tagged so that a reader can
// tell which of the two spoke.
void ShowMessage(const Port::Message& message) {
    std::string text = message.text;
    while (!text.empty() && text.back() == '\n') {
        text.pop_back();
    }
    // Message texts quote names from files; line breaks stay, other controls are shown.
    std::string shown;
    for (std::size_t start = 0; start <= text.size();) {
        std::size_t end = std::min(text.find('\n', start), text.size());
        if (start != 0) {
            shown += '\n';
        }
        shown += Port::Printable(text.substr(start, end - start));
        start = end + 1;
    }
    text = shown;
    switch (message.severity) {
    case Port::Severity::Error:
        ++g_libraryErrors;
        std::fprintf(stderr, "[library error] %s\n", text.c_str());
        break;
    case Port::Severity::Status:
        std::fprintf(stderr, "[library] %s\n", text.c_str());
        break;
    case Port::Severity::Debug:
        if (g_verbose) {
            std::fprintf(stderr, "[library debug] %s\n",
                         message.unit.empty()
                             ? text.c_str()
                             : VnTool::AtLine(message.unit, message.line, text).c_str());
        }
        break;
    }
}

// The library reads its colour scheme while it is loaded, before main runs, and finds it
// along VENLOMER_DATA_PATH. A program run from a build tree has its data beside it in
// ../share/venlomer, which the library does not know; so when the variable is unset the
// tool starts itself again once with the variable pointing there.
void FindOwnDataOrRestart(char** argv) {
    namespace fs = std::filesystem;
    if (std::getenv("VENLOMER_DATA_PATH") != nullptr) {
        return;
    }
    const fs::path self = VnTool::ProgramFile();
    const fs::path data = VnTool::OwnDataFolder();
    std::error_code ec;
    if (self.empty() || !fs::is_regular_file(data / "rareroded.acd", ec)) {
        return;
    }
    setenv("VENLOMER_DATA_PATH", data.c_str(), 1);
    execv(self.c_str(), argv);
    // Running on without the scheme beats not running: the output says what is missing.
}

const Command* FindCommand(const std::string& name) {
    for (const Command* candidate : AllCommands()) {
        if (candidate->syntax.name == name) {
            return candidate;
        }
    }
    return nullptr;
}

// The pins commands are two words: "pins check" becomes one argument at `first`. An exit
// status when there is no second word.
std::optional<int> JoinPinsCommand(std::vector<std::string>& args, std::size_t& first) {
    if (args[first] != "pins") {
        return std::nullopt;
    }
    if (first + 1 == args.size() || args[first + 1].empty() || args[first + 1][0] == '-') {
        bool help =
            first + 1 < args.size() && (args[first + 1] == "--help" || args[first + 1] == "-h");
        std::fprintf(help ? stdout : stderr,
                     "%susage: venlomer pins check|assign|show|from-board|export|import [options] "
                     "(see venlomer pins "
                     "COMMAND --help)\n",
                     help ? "" : "venlomer pins: no pins command given; ");
        return help ? VnTool::kExitOk : VnTool::kExitUsage;
    }
    args[first + 1].insert(0, "pins ");
    ++first;
    return std::nullopt;
}

} // namespace

int VnTool::LibraryErrorCount() {
    return g_libraryErrors;
}

int main(int argc, char** argv) {
    FindOwnDataOrRestart(argv);
    std::vector<std::string> args(argv + 1, argv + argc);
    std::size_t first = 0;
    while (first < args.size() && (args[first] == "--verbose" || args[first] == "-v")) {
        g_verbose = true;
        ++first;
    }
    if (first == args.size()) {
        std::fprintf(stderr, "venlomer: no command given (see venlomer --help)\n");
        return VnTool::kExitUsage;
    }
    if (std::optional<int> status = JoinPinsCommand(args, first)) {
        return *status;
    }
    const std::string& name = args[first];
    if (name == "--help" || name == "-h" || name == "help") {
        PrintToolHelp();
        return VnTool::kExitOk;
    }
    const Command* command = FindCommand(name);
    if (command == nullptr) {
        std::fprintf(stderr, "venlomer: unknown command %s (see venlomer --help)\n",
                     Port::Printable(name).c_str());
        return VnTool::kExitUsage;
    }
    VnTool::ParsedArgs parsed;
    std::string error;
    std::vector<std::string> rest(args.begin() + static_cast<long>(first) + 1, args.end());
    if (!VnTool::ParseArgs(command->syntax, rest, parsed, error)) {
        return VnTool::UsageError(name, error);
    }
    if (parsed.help) {
        std::fputs(VnTool::HelpText(command->syntax).c_str(), stdout);
        return VnTool::kExitOk;
    }
    g_verbose = g_verbose || parsed.verbose;
    Port::SetMessageSink(ShowMessage);
    int status = VnTool::kExitRefused;
    try {
        status = command->run(parsed);
    } catch (const std::exception& e) {
        // The outside libraries may throw what the library lets pass; the user gets a
        // reason rather than an abort.
        std::fprintf(stderr, "venlomer %s: %s\n", name.c_str(), Port::Printable(e.what()).c_str());
    }
    std::fflush(stdout);
    Port::SetMessageSink({});
    return status;
}
