//===-- tools/device/DeviceOptions.cpp - which chip database a command opens ---===//
#include "DeviceOptions.h"

#include "Port/SearchPath.h"
#include "Suggest.h"

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

// The chip-database names of the folder, for "did you mean".
std::vector<std::string> KnownDeviceNames() {
    std::vector<std::string> names;
    for (const PartInfo& part : Parts()) {
        names.emplace_back(part.part);
    }
    std::error_code ec;
    for (const auto& entry : fs::directory_iterator(ChipDbFolder(), ec)) {
        std::string file = entry.path().filename().string();
        if (file.rfind("chipdb-", 0) == 0 && file.size() > 11 &&
            file.compare(file.size() - 4, 4, ".txt") == 0) {
            names.push_back(file.substr(7, file.size() - 11));
        }
    }
    return names;
}

// A 4k part's packages are listed in the 8k file with ":4k" after the name; people and
// nextpnr-ice40 call them by the plain name.
std::string PartPackage(const PartInfo& part, const std::string& package) {
    std::string suffix = part.packageSuffix;
    if (package.empty()) {
        return std::string(part.defaultPackage) + suffix;
    }
    if (suffix.empty() ||
        (package.size() > suffix.size() &&
         package.compare(package.size() - suffix.size(), suffix.size(), suffix) == 0)) {
        return package;
    }
    return package + suffix;
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

const std::vector<PartInfo>& Parts() {
    static const std::vector<PartInfo> parts = {
        {"lp384", "384", "qn32", "", false},   {"lp1k", "1k", "tq144", "", false},
        {"lp4k", "8k", "tq144", ":4k", false}, {"lp8k", "8k", "ct256", "", false},
        {"hx1k", "1k", "tq144", "", false},    {"hx4k", "8k", "tq144", ":4k", false},
        {"hx8k", "8k", "ct256", "", false},    {"up3k", "5k", "sg48", "", true},
        {"up5k", "5k", "sg48", "", true},      {"u1k", "u4k", "sg48", "", false},
        {"u2k", "u4k", "sg48", "", false},     {"u4k", "u4k", "sg48", "", false},
    };
    return parts;
}

const PartInfo* FindPart(const std::string& name) {
    for (const PartInfo& part : Parts()) {
        if (name == part.part) {
            return &part;
        }
    }
    return nullptr;
}

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
        // "u4k" is a part and a chip database alike, and both mean the same file.
        const PartInfo* part = FindPart(request.device);
        std::string chipDbName = part != nullptr ? part->chipDb : request.device;
        fs::path file = fs::path(ChipDbFolder()) / ("chipdb-" + chipDbName + ".txt");
        if (!fs::is_regular_file(file, ec)) {
            error =
                "no chip database for device " + request.device + ": " + file.string() +
                " is missing" +
                (part != nullptr ? std::string() : DidYouMean(request.device, KnownDeviceNames())) +
                " (install fpga-icestorm-chipdb, or use --chipdb FILE)";
            return DeviceResolution::Missing;
        }
        source.chipDb = file.string();
        if (part != nullptr) {
            source.part = part->part;
            source.package = PartPackage(*part, source.package);
        } else if (source.package.empty()) {
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
