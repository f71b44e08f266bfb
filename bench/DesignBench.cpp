//===-- bench/DesignBench.cpp - the ports of a 100 MB yosys netlist ---------------===//
//
// Pin planning reads only the top module's ports of a netlist that is mostly cells. The
// netlist is generated once into a temporary folder (100 MB; 1 MB at tiny sizes): a top
// module of 64 ports and enough LUT cells, with the attributes yosys writes, to reach the
// size. Ours reads its ports; the baseline reads the file's bytes and does nothing with
// them, the least any reader does. The peak resident memory of each read is a counter:
// the reader's must stay far below the file size.
//
//===------------------------------------------------------------------------------===//
#include "ChipDb.h"
#include "DeviceOptions.h"
#include "Harness.h"
#include "YosysPorts.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <string>
#include <vector>

#include <malloc.h>
#include <unistd.h>

namespace VnBench {

namespace {

namespace fs = std::filesystem;

std::uint64_t NetlistBytes() {
    return GetSizes().tiny ? (std::uint64_t{1} << 20) : (std::uint64_t{100} << 20);
}

// Written once per run and removed at exit.
const std::string& BigNetlist() {
    // Never destroyed: the removal at exit still needs the name.
    static const std::string& path = *new std::string([] {
        fs::path file =
            fs::temp_directory_path() /
            ("venlomer-bench-" + std::to_string(static_cast<long>(::getpid())) + ".json");
        std::ofstream out(file, std::ios::binary);
        out << "{\n  \"creator\": \"venlomer bench\",\n  \"modules\": {\n    \"top\": {\n"
               "      \"attributes\": { \"top\": \"00000000000000000000000000000001\" },\n"
               "      \"ports\": {\n";
        for (int i = 0; i < 64; ++i) {
            out << "        \"p" << i << "\": { \"direction\": \"" << (i % 2 ? "output" : "input")
                << "\", \"bits\": [ " << (i + 2) << " ] }" << (i + 1 < 64 ? "," : "") << "\n";
        }
        out << "      },\n      \"cells\": {\n";
        std::uint64_t written = 0;
        for (long cell = 0; written < NetlistBytes(); ++cell) {
            std::string text =
                std::string(cell == 0 ? "" : ",\n") + "        \"lut_" + std::to_string(cell) +
                "\": {\n          \"hide_name\": 0, \"type\": \"SB_LUT4\",\n"
                "          \"parameters\": { \"LUT_INIT\": \"0110100110010110\" },\n"
                "          \"attributes\": { \"src\": \"top.v:12.3-14.22\" },\n"
                "          \"port_directions\": { \"I0\": \"input\", \"I1\": \"input\", "
                "\"O\": \"output\" },\n"
                "          \"connections\": { \"I0\": [ " +
                std::to_string(100 + cell) + " ], \"I1\": [ " + std::to_string(101 + cell) +
                " ], \"O\": [ " + std::to_string(102 + cell) + " ] }\n        }";
            out << text;
            written += text.size();
        }
        out << "\n      }\n    }\n  }\n}\n";
        std::atexit([] {
            std::error_code ec;
            fs::remove(BigNetlist(), ec);
        });
        return file.string();
    }());
    return path;
}

// A line of /proc/self/status in MiB ("VmHWM:", "VmRSS:").
double StatusMiB(const char* wanted) {
    std::ifstream status("/proc/self/status");
    std::string key;
    while (status >> key) {
        if (key == wanted) {
            double kib = 0;
            status >> kib;
            return kib / 1024.0;
        }
        status.ignore(1 << 10, '\n');
    }
    return 0;
}

// The peak resident set is a process-wide mark, and the benchmarks before this one leave
// memory resident. Resetting the mark to the current resident set (Linux: writing 5 to
// clear_refs) and subtracting that set makes the peak the read's own growth. Returns the
// resident set the peak starts from.
double ResetPeak() {
    // Freed blocks an earlier benchmark left in the heap would let a read grow into them
    // unseen; handing them back first makes the growth the read's own.
    ::malloc_trim(0);
    std::ofstream("/proc/self/clear_refs") << "5";
    return StatusMiB("VmRSS:");
}

double PeakMiB(double start) {
    return StatusMiB("VmHWM:") - start;
}

// The verdict table takes one value per benchmark: time per read from the timed
// variant, the peak in bytes from the memory variant (range argument 1).
void Report(benchmark::State& state, double peakMiB) {
    state.counters["peak_rss_mib"] = peakMiB;
    if (state.range(0) == 1) {
        state.counters["bytes_per_object"] = peakMiB * (1 << 20);
    } else {
        state.SetItemsProcessed(state.iterations());
    }
}

void PortsOfBigNetlist(benchmark::State& state) {
    const std::string& path = BigNetlist();
    double peak = 0;
    for (auto _ : state) {
        const double start = ResetPeak();
        VnTool::Design design;
        std::string error;
        if (!VnTool::ReadYosysPortsFile(path, design, error) || design.ports.size() != 64) {
            state.SkipWithError(error.c_str());
            return;
        }
        peak = std::max(peak, PeakMiB(start));
    }
    Report(state, peak);
}

void ReadBytesOfBigNetlist(benchmark::State& state) {
    const std::string& path = BigNetlist();
    double peak = 0;
    std::vector<char> chunk(1 << 16);
    for (auto _ : state) {
        const double start = ResetPeak();
        std::ifstream in(path, std::ios::binary);
        std::uint64_t sum = 0;
        while (in.read(chunk.data(), static_cast<std::streamsize>(chunk.size())) ||
               in.gcount() > 0) {
            sum += static_cast<unsigned char>(chunk[0]);
            if (in.eof()) {
                break;
            }
        }
        benchmark::DoNotOptimize(sum);
        peak = std::max(peak, PeakMiB(start));
    }
    Report(state, peak);
}

// The largest chip database of the family, found where the tool looks for it; empty when
// it is not installed.
std::string LargestChipDb() {
    const fs::path path = fs::path(VnTool::ChipDbFolder()) / "chipdb-8k.txt";
    std::error_code ec;
    return fs::is_regular_file(path, ec) ? path.string() : std::string();
}

void ReadLargestChipDb(benchmark::State& state) {
    const std::string path = LargestChipDb();
    if (path.empty()) {
        state.SkipWithError("chipdb-8k.txt not installed: not measured");
        return;
    }
    double peak = 0;
    for (auto _ : state) {
        const double start = ResetPeak();
        VnTool::ChipDb db;
        std::string error;
        if (!VnTool::ReadChipDbFile(path, "ct256", db, error)) {
            state.SkipWithError(error.c_str());
            return;
        }
        benchmark::DoNotOptimize(db);
        peak = std::max(peak, PeakMiB(start));
    }
    Report(state, peak);
}

void ReadBytesOfLargestChipDb(benchmark::State& state) {
    const std::string path = LargestChipDb();
    if (path.empty()) {
        state.SkipWithError("chipdb-8k.txt not installed: not measured");
        return;
    }
    double peak = 0;
    std::vector<char> chunk(1 << 16);
    for (auto _ : state) {
        const double start = ResetPeak();
        std::ifstream in(path, std::ios::binary);
        std::uint64_t sum = 0;
        while (in.read(chunk.data(), static_cast<std::streamsize>(chunk.size())) ||
               in.gcount() > 0) {
            sum += static_cast<unsigned char>(chunk[0]);
        }
        benchmark::DoNotOptimize(sum);
        peak = std::max(peak, PeakMiB(start));
    }
    Report(state, peak);
}

} // namespace

void RegisterDesignBenchmarks() {
    auto once = [](benchmark::internal::Benchmark* b, int memory) {
        b->Unit(benchmark::kMillisecond)->Iterations(GetSizes().tiny ? 1 : 3)->Arg(memory);
    };
    once(benchmark::RegisterBenchmark("design/ports_100mb", PortsOfBigNetlist), 0);
    once(benchmark::RegisterBenchmark("design/read_bytes_100mb", ReadBytesOfBigNetlist), 0);
    once(benchmark::RegisterBenchmark("design/ports_100mb_peak", PortsOfBigNetlist), 1);
    once(benchmark::RegisterBenchmark("design/read_bytes_100mb_peak", ReadBytesOfBigNetlist), 1);
    once(benchmark::RegisterBenchmark("chipdb/read_8k", ReadLargestChipDb), 0);
    once(benchmark::RegisterBenchmark("chipdb/read_bytes_8k", ReadBytesOfLargestChipDb), 0);
    once(benchmark::RegisterBenchmark("chipdb/read_8k_peak", ReadLargestChipDb), 1);
}

} // namespace VnBench
