//===-- tools/Common.cpp - what the subcommands share ---------------------------===//
#include "Commands.h"

#include "Port/SafeFile.h"

#include <cstdio>

namespace VnTool {

int UsageError(const std::string& command, const std::string& why) {
    std::fprintf(stderr, "venlomer %s: %s (see venlomer %s --help)\n", command.c_str(),
                 Port::Printable(why).c_str(), command.c_str());
    return kExitUsage;
}

int Refused(const std::string& command, const std::string& why) {
    // Reasons quote names from files and the command line; a terminal must not obey them.
    std::fprintf(stderr, "venlomer %s: %s\n", command.c_str(), Port::Printable(why).c_str());
    return kExitRefused;
}

std::vector<OptionSyntax> DeviceOptionSyntax() {
    return {
        {"--chipdb", "FILE", "chip database (default: chipdb-8k.txt of fpga-icestorm-chipdb)"},
        {"--device", "NAME", "chipdb-NAME.txt of the chip-database folder (1k, 8k, ...)"},
        {"--package", "NAME", "package whose pins to read (default: ct256, else the first)"},
    };
}

int OpenDevice(const std::string& command, const ParsedArgs& args, DeviceSource& source,
               std::unique_ptr<DeviceModel>& model) {
    DeviceRequest request{args.Value("--chipdb"), args.Value("--device"), args.Value("--package")};
    for (const char* option : {"--chipdb", "--device"}) {
        if (args.Has(option) && args.Value(option).empty()) {
            return UsageError(command, std::string(option) + " wants a name");
        }
    }
    std::string error;
    switch (ResolveDevice(request, source, error)) {
    case DeviceResolution::Ok:
        break;
    case DeviceResolution::BadUsage:
        return UsageError(command, error);
    case DeviceResolution::Missing:
        return Refused(command, error);
    }
    model = DeviceModel::Open(source, error);
    if (!model) {
        return Refused(command, error);
    }
    return kExitOk;
}

} // namespace VnTool
