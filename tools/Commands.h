//===-- tools/Commands.h - the subcommands of venlomer --------------------------===//
#pragma once

#include "Args.h"
#include "DeviceModel.h"
#include "DeviceOptions.h"

#include <memory>
#include <string>
#include <vector>

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
const Command& PinsCheckCommand();
const Command& PinsAssignCommand();
const Command& PinsShowCommand();
const Command& EditCommand();

/// Prints "venlomer CMD: WHY (see venlomer CMD --help)" on stderr; returns kExitUsage.
int UsageError(const std::string& command, const std::string& why);
/// Prints "venlomer CMD: WHY" on stderr; returns kExitRefused.
int Refused(const std::string& command, const std::string& why);

/// How many error messages the library has shown so far; a refusal that follows none
/// must state its reason itself.
int LibraryErrorCount();

/// --chipdb, --device and --package, as every device command declares them.
std::vector<OptionSyntax> DeviceOptionSyntax();

/// Resolves the device options of `args` and reads the chip database. Returns kExitOk
/// with `model` set, or the status of the usage error or refusal it has reported.
int OpenDevice(const std::string& command, const ParsedArgs& args, DeviceSource& source,
               std::unique_ptr<DeviceModel>& model);

} // namespace VnTool
