//===-- bench/Machine.h - what a table says about the machine it was measured on -===//
//
// Both benchmark programs print the processor and the load around their run, so a reader
// can tell a slow machine from a busy one. Header-only: the editor's benchmark is its own
// program and links nothing of the library's.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include <fstream>
#include <string>

#include <unistd.h>

namespace VnBench {

/// "model name" of the first processor, or "unknown".
inline std::string CpuModel() {
    std::ifstream in("/proc/cpuinfo");
    std::string line;
    while (std::getline(in, line)) {
        if (line.rfind("model name", 0) == 0) {
            const auto colon = line.find(':');
            return colon == std::string::npos ? line : line.substr(colon + 2);
        }
    }
    return "unknown";
}

inline long LogicalCpus() {
    return sysconf(_SC_NPROCESSORS_ONLN);
}

/// The 1, 5 and 15 minute load averages as the kernel gives them.
inline std::string LoadAverage() {
    std::ifstream in("/proc/loadavg");
    std::string one, five, fifteen;
    in >> one >> five >> fifteen;
    return one + " " + five + " " + fifteen;
}

} // namespace VnBench
