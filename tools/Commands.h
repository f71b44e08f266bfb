//===-- tools/Commands.h - the subcommands of venlomer --------------------------===//
#pragma once

#include "Args.h"

#include <string>

namespace VnTool {

struct Command {
    CommandSyntax syntax;
    int (*run)(const ParsedArgs& args);
};

const Command& FloorplanCommand();
const Command& ColorsCommand();
const Command& NgcStubCommand();
const Command& NgcNewCommand();
const Command& NgdSampleCommand();
const Command& ProjectFilesCommand();
const Command& EditCommand();

/// Prints "venlomer CMD: WHY (see venlomer CMD --help)" on stderr; returns kExitUsage.
int UsageError(const std::string& command, const std::string& why);
/// Prints "venlomer CMD: WHY" on stderr; returns kExitRefused.
int Refused(const std::string& command, const std::string& why);

/// How many error messages the library has shown so far; a refusal that follows none
/// must state its reason itself.
int LibraryErrorCount();

/// A data file shipped with venlomer: looked up in the folders of VENLOMER_DATA_PATH,
/// then in share/venlomer beside the program's bin folder. Empty when not found.
std::string FindDataFile(const std::string& name);

} // namespace VnTool
