//===-- tools/commands/Common.cpp - what the subcommands share ------------===//
#include "Commands.h"

#include "PackageDraw.h"
#include "Port/SafeFile.h"

#include <cstdio>
#include <filesystem>

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

int ResolveDeviceOptions(const std::string& command, const ParsedArgs& args, DeviceSource& source) {
    DeviceRequest request{args.Value("--chipdb"), args.Value("--device"), args.Value("--package")};
    for (const char* option : {"--chipdb", "--device"}) {
        if (args.Has(option) && args.Value(option).empty()) {
            return UsageError(command, std::string(option) + " wants a name");
        }
    }
    std::string error;
    switch (ResolveDevice(request, source, error)) {
    case DeviceResolution::Ok:
        return kExitOk;
    case DeviceResolution::BadUsage:
        return UsageError(command, error);
    case DeviceResolution::Missing:
        break;
    }
    return Refused(command, error);
}

int OpenDevice(const std::string& command, const ParsedArgs& args, DeviceSource& source,
               std::unique_ptr<DeviceModel>& model) {
    if (int status = ResolveDeviceOptions(command, args, source); status != kExitOk) {
        return status;
    }
    std::string error;
    model = DeviceModel::Open(source, error);
    if (!model) {
        return Refused(command, error);
    }
    return kExitOk;
}

bool WriteTextFile(const std::string& path, const std::string& text, std::string& error,
                   const std::vector<std::string>& inputs) {
    return Port::WriteFileSafely(path, text, error, DeviceModel::FilesNeverReplaced(inputs));
}

int DrawDevice(const std::string& command, DeviceModel& model, const DrawRequest& request) {
    DeviceDrawing drawing;
    std::string error;
    if (!RenderView(model, request, drawing, error)) {
        return Refused(command, error);
    }
    if (!WriteTextFile(request.svg, drawing.svg, error, request.inputs)) {
        return Refused(command, error);
    }
    if (drawing.usedFallback) {
        std::printf("Note: the colour scheme gave no colour for some roles; those are drawn "
                    "grey (venlomer colors shows the scheme)\n");
    }
    std::error_code ec;
    auto where = std::filesystem::absolute(request.svg, ec);
    if (request.view == DrawRequest::View::Package) {
        std::printf("Package view written to %s (%s)\n", ec ? request.svg.c_str() : where.c_str(),
                    drawing.summary.c_str());
        return kExitOk;
    }
    std::printf("Floorplan written to %s (%zu tiles, %d pins, %d highlighted)\n",
                ec ? request.svg.c_str() : where.c_str(), model.Tiles().size(), drawing.pins,
                drawing.highlighted);
    return kExitOk;
}

int LoadPinFiles(const std::string& command, const ParsedArgs& args, bool missingPcfIsEmpty,
                 PinFiles& plan, const std::vector<std::string>& alsoRead) {
    plan.designPath = args.Value("--design");
    plan.pcfPath = args.Value("--pcf");
    if (plan.designPath.empty()) {
        return UsageError(command, "--design D.json is needed (yosys -p \"synth_ice40 -top top "
                                   "-json D.json\" makes one)");
    }
    if (plan.pcfPath.empty()) {
        return UsageError(command, "--pcf P.pcf is needed");
    }
    if (int status = OpenDevice(command, args, plan.source, plan.model); status != kExitOk) {
        return status;
    }
    // The constraint file is the one file a pins command may write: it must never be one
    // of the files it reads as something else.
    std::error_code ec;
    std::vector<std::string> inputs = alsoRead;
    inputs.insert(inputs.end(), {plan.designPath, plan.source.chipDb});
    for (const std::string& input : inputs) {
        if (std::filesystem::equivalent(plan.pcfPath, input, ec) && !ec) {
            return Refused(command, plan.pcfPath + " is " + input +
                                        ", not a constraint file; give the .pcf file to --pcf");
        }
    }
    std::string error;
    if (!ReadYosysPortsFile(plan.designPath, plan.design, error)) {
        return Refused(command, error);
    }
    plan.pcfExisted = std::filesystem::exists(std::filesystem::symlink_status(plan.pcfPath, ec));
    if (!plan.pcf.ParseFile(plan.pcfPath, error, missingPcfIsEmpty)) {
        return Refused(command, error);
    }
    return kExitOk;
}

} // namespace VnTool
