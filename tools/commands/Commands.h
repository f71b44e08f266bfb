//===-- tools/commands/Commands.h - the subcommands of venlomer -----------===//
#pragma once

#include "Args.h"
#include "DeviceDraw.h"
#include "DeviceModel.h"
#include "DeviceOptions.h"
#include "DeviceSearch.h"
#include "Pcf.h"
#include "YosysPorts.h"

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
const Command& PinsFromBoardCommand();
const Command& PinsExportCommand();
const Command& PinsImportCommand();
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

/// Which chip database and package the device options name (an empty --chipdb or
/// --device is bad usage). Returns kExitOk, or the exit status after reporting why not.
int ResolveDeviceOptions(const std::string& command, const ParsedArgs& args, DeviceSource& source);

/// Resolves the device options of `args` and reads the chip database. Returns kExitOk
/// with `model` set, or the status of the usage error or refusal it has reported.
int OpenDevice(const std::string& command, const ParsedArgs& args, DeviceSource& source,
               std::unique_ptr<DeviceModel>& model);

/// The search options: --find NAME=VALUE and --flags LIST.
std::vector<OptionSyntax> SearchOptionSyntax();

/// Reads --find and --flags. Returns kExitOk, or kExitUsage after reporting.
int ParseSearchArgs(const std::string& command, const ParsedArgs& args, SearchRequest& request);

/// MakeWanted, its refusal reported as bad usage. Returns kExitOk or kExitUsage.
int MakeWantedOrUsage(const std::string& command, const SearchRequest& request,
                      const std::vector<SearchKind>& kinds, const std::string& who,
                      const std::string& known, CommonI::RefCountPtr<VnI::IProperty>& wanted);

/// The view options: --view die|package and --bottom.
std::vector<OptionSyntax> ViewOptionSyntax();

/// Reads --view and --bottom into `request`. Returns kExitOk, or kExitUsage after reporting.
int ParseViewArgs(const std::string& command, const ParsedArgs& args, DrawRequest& request);

/// What every pins command reads: the device, the design and the constraint file.
struct PinFiles {
    DeviceSource source;
    std::unique_ptr<DeviceModel> model;
    std::string designPath;
    std::string pcfPath;
    Design design;
    PcfFile pcf;
    bool pcfExisted = true;
};

/// Reads --design, --pcf and the device options. The constraint file may never be the
/// netlist, the chip database or one of `alsoRead`; a missing one is empty when
/// `missingPcfIsEmpty`. Returns kExitOk, or the status of the usage error or refusal it
/// has reported.
int LoadPinFiles(const std::string& command, const ParsedArgs& args, bool missingPcfIsEmpty,
                 PinFiles& plan, const std::vector<std::string>& alsoRead = {});

/// Writes `text` to `path` through the safe writer, never over one of `inputs` (the files
/// the command read) nor the colour scheme: DeviceModel::FilesNeverReplaced.
bool WriteTextFile(const std::string& path, const std::string& text, std::string& error,
                   const std::vector<std::string>& inputs = {});

/// Draws the model, writes the picture through the safe writer (never over the colour
/// scheme or the request's inputs), then prints where it went. Returns kExitOk, or
/// kExitRefused after reporting why it could not write.
int DrawDevice(const std::string& command, DeviceModel& model, const DrawRequest& request);

} // namespace VnTool
