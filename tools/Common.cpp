//===-- tools/Common.cpp - what the subcommands share ---------------------------===//
#include "Commands.h"

#include "Port/SafeFile.h"
#include "Port/SearchPath.h"

#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <system_error>

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

std::filesystem::path ProgramFile() {
    std::error_code ec;
    std::filesystem::path self = std::filesystem::read_symlink("/proc/self/exe", ec);
    return ec ? std::filesystem::path() : self;
}

std::filesystem::path OwnDataFolder() {
    const std::filesystem::path self = ProgramFile();
    return self.empty() ? self : self.parent_path().parent_path() / "share" / "venlomer";
}

std::string FindDataFile(const std::string& name) {
    namespace fs = std::filesystem;
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
