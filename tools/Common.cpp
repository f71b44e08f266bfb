//===-- tools/Common.cpp - what the subcommands share ---------------------------===//
#include "Commands.h"

#include "Port/SafeFile.h"

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

std::string FindDataFile(const std::string& name) {
    namespace fs = std::filesystem;
    std::error_code ec;
    if (const char* path = std::getenv("VENLOMER_DATA_PATH")) {
        std::string folders(path);
        std::size_t start = 0;
        while (start <= folders.size()) {
            std::size_t end = folders.find(':', start);
            if (end == std::string::npos) {
                end = folders.size();
            }
            if (end > start) {
                fs::path candidate = fs::path(folders.substr(start, end - start)) / name;
                if (fs::is_regular_file(candidate, ec)) {
                    return candidate.string();
                }
            }
            start = end + 1;
        }
    }
    fs::path self = fs::read_symlink("/proc/self/exe", ec);
    if (!ec) {
        fs::path candidate = self.parent_path().parent_path() / "share" / "venlomer" / name;
        if (fs::is_regular_file(candidate, ec)) {
            return candidate.string();
        }
    }
    return {};
}

} // namespace VnTool
