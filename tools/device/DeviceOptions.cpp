//===-- tools/device/DeviceOptions.cpp - which chip database a command opens ---===//
#include "DeviceOptions.h"

#include "Port/SearchPath.h"

#include <cstdlib>
#include <filesystem>
#include <system_error>

namespace VnTool {

namespace {

namespace fs = std::filesystem;

const char kDefaultDevice[] = "8k";
const char kBundledChipDb[] = "chipdb-demo.txt";

// The package people mostly mean on a device whose file lists many: the ones of the
// common boards. Others take the first package of the file.
std::string DefaultPackage(const std::string& device) {
    if (device == "8k") {
        return "ct256";
    }
    if (device == "1k") {
        return "tq144";
    }
    return "";
}

bool PlainName(const std::string& name) {
    if (name.empty() || name == "." || name == "..") {
        return false;
    }
    for (char c : name) {
        if (c == '/' || c == '\0' || static_cast<unsigned char>(c) < 0x20) {
            return false;
        }
    }
    return true;
}

} // namespace

std::string ChipDbFolder() {
    const char* folder = std::getenv("VENLOMER_CHIPDB_DIR");
    return folder != nullptr && *folder != '\0' ? folder : kDefaultChipDbFolder;
}

DeviceResolution ResolveDevice(const DeviceRequest& request, DeviceSource& source,
                               std::string& error) {
    source = DeviceSource{};
    source.package = request.package;
    if (!request.chipDb.empty() && !request.device.empty()) {
        error = "--chipdb and --device both name a chip database; give one";
        return DeviceResolution::BadUsage;
    }
    if (!request.chipDb.empty()) {
        source.chipDb = request.chipDb;
        return DeviceResolution::Ok;
    }
    std::error_code ec;
    if (!request.device.empty()) {
        if (!PlainName(request.device)) {
            error = "--device wants a device name such as 1k or 8k, got \"" + request.device +
                    "\"; use --chipdb FILE for a file";
            return DeviceResolution::BadUsage;
        }
        fs::path file = fs::path(ChipDbFolder()) / ("chipdb-" + request.device + ".txt");
        if (!fs::is_regular_file(file, ec)) {
            error = "no chip database for device " + request.device + ": " + file.string() +
                    " is missing (install fpga-icestorm-chipdb, or use --chipdb FILE)";
            return DeviceResolution::Missing;
        }
        source.chipDb = file.string();
        if (source.package.empty()) {
            source.package = DefaultPackage(request.device);
        }
        return DeviceResolution::Ok;
    }
    fs::path preferred =
        fs::path(ChipDbFolder()) / ("chipdb-" + std::string(kDefaultDevice) + ".txt");
    if (fs::is_regular_file(preferred, ec)) {
        source.chipDb = preferred.string();
        if (source.package.empty()) {
            source.package = DefaultPackage(kDefaultDevice);
        }
        return DeviceResolution::Ok;
    }
    source.chipDb = FindDataFile(kBundledChipDb);
    if (source.chipDb.empty()) {
        error = "no chip database: " + preferred.string() +
                " is missing (install fpga-icestorm-chipdb) and the bundled " + kBundledChipDb +
                " was not found; use --chipdb FILE";
        return DeviceResolution::Missing;
    }
    source.note = preferred.string() + " not found (package fpga-icestorm-chipdb); using the "
                                       "bundled demo device";
    return DeviceResolution::Ok;
}

std::filesystem::path ProgramFile() {
    std::error_code ec;
    fs::path self = fs::read_symlink("/proc/self/exe", ec);
    return ec ? fs::path() : self;
}

std::filesystem::path OwnDataFolder() {
    const fs::path self = ProgramFile();
    return self.empty() ? self : self.parent_path().parent_path() / "share" / "venlomer";
}

std::string FindDataFile(const std::string& name) {
    std::error_code ec;
    for (const std::string& folder : Port::SearchPathFromEnv("VENLOMER_DATA_PATH")) {
        fs::path candidate = fs::path(folder) / name;
        if (fs::is_regular_file(candidate, ec)) {
            return candidate.string();
        }
    }
    if (const fs::path own = OwnDataFolder(); !own.empty()) {
        fs::path candidate = own / name;
        if (fs::is_regular_file(candidate, ec)) {
            return candidate.string();
        }
    }
    return {};
}

} // namespace VnTool
