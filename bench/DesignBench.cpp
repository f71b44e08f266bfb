//===-- bench/DesignBench.cpp - the ports of a 100 MB yosys netlist ---------------===//
//
// Pin planning reads only the top module's ports of a netlist that is mostly cells. The
// netlist is generated once into a temporary folder (100 MB; 1 MB at tiny sizes): a top
// module of 64 ports and enough LUT cells, with the attributes yosys writes, to reach the
// size. Ours reads its ports; the baseline reads the file's bytes and does nothing with
// them, the least any reader does. The peak resident memory of each read is a counter:
// the reader's must stay far below the file size.
//
// The same is measured for the other large inputs a session reads: the largest chip
// database, netlist databases of 10,000 and 100,000 designs (reading must stay linear),
// and a 20 MB project description read by the sample host as the lookup asks for it.
//
//===------------------------------------------------------------------------------===//
#include "ChipDb.h"
#include "DeviceOptions.h"
#include "Harness.h"
#include "LargeNgd.h"
#include "YosysPorts.h"

#include "CitP/Factory.h"
#include "designmodel/Nhlp_FileConv.h"
#include "designmodel/Nmod_Model.h"
#include "hostproj/Components.h"
#include "s/ProjFileHelper.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <memory>
#include <string>
#include <vector>

#include <dlfcn.h>
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

// The least any reader of a file does: every byte through a small buffer, nothing kept.
void ReadBytes(benchmark::State& state, const std::string& path) {
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

void ReadBytesOfBigNetlist(benchmark::State& state) {
    ReadBytes(state, BigNetlist());
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
    ReadBytes(state, path);
}

// A folder of this run's generated inputs, removed with them at exit.
const fs::path& RunFolder() {
    // Never destroyed: the removal at exit still needs the name.
    static const fs::path& folder = *new fs::path([] {
        std::string pattern = (fs::temp_directory_path() / "venlomer-bench-XXXXXX").string();
        if (::mkdtemp(pattern.data()) == nullptr) {
            std::perror("venlomer_bench: mkdtemp");
            std::exit(1);
        }
        std::atexit([] {
            std::error_code ec;
            fs::remove_all(RunFolder(), ec);
        });
        return fs::path(pattern);
    }());
    return folder;
}

// The netlist databases of the reading rows, by size: `designs` designs, and as many views
// of one design and properties of one view as half that, so that every table grows with
// the size and a reader quadratic in any of them shows.
long NgdDesigns(bool large) {
    if (GetSizes().tiny) {
        return large ? 1000 : 100;
    }
    return large ? 100000 : 10000;
}

// Written at its first use in the run; an empty name when it could not be written.
const std::string& Ngd(bool large) {
    static std::string paths[2];
    std::string& path = paths[large ? 1 : 0];
    if (path.empty()) {
        const long designs = NgdDesigns(large);
        const fs::path file = RunFolder() / ("designs-" + std::to_string(designs) + ".ngd");
        try {
            VnTest::WriteLargeNgd(file.string(), designs, designs / 2, designs / 2);
            path = file.string();
        } catch (const std::exception& e) {
            std::fprintf(stderr, "venlomer_bench: %s\n", e.what());
        }
    }
    return path;
}

// Time and peak per design: range(0) picks the measurement as Report does, range(1) is
// 1 for the large file.
void ReadNgd(benchmark::State& state) {
    const bool large = state.range(1) == 1;
    const std::string& path = Ngd(large);
    if (path.empty()) {
        state.SkipWithError("the netlist database could not be written");
        return;
    }
    const auto designs = static_cast<std::size_t>(NgdDesigns(large));
    double peak = 0;
    for (auto _ : state) {
        const double start = ResetPeak();
        Nmod_Model* raw = nullptr;
        Nmod_Txn* txn = nullptr;
        try {
            Nhlp_FileConv::ReadAsNmod(path.c_str(), raw, txn, false);
        } catch (const std::exception& e) {
            state.SkipWithError(e.what());
            return;
        }
        const std::unique_ptr<Nmod_Model> model(raw);
        if (model->GetDesignMgr()->GetNumDesigns() != designs) {
            state.SkipWithError("not every design was read");
            return;
        }
        peak = std::max(peak, PeakMiB(start));
    }
    if (state.range(0) == 1) {
        state.counters["bytes_per_object"] = peak * (1 << 20) / static_cast<double>(designs);
    } else {
        SetItems(state, designs);
    }
    state.counters["peak_rss_mib"] = peak;
}

std::uint64_t DescriptionBytes() {
    return GetSizes().tiny ? (std::uint64_t{1} << 20) : (std::uint64_t{20} << 20);
}

// A large project as the tool's process test writes it: views with their units, each
// bound to the one netlist view, and the default view named at the end.
const std::string& BigDescription() {
    static const std::string path = [] {
        const fs::path file = RunFolder() / "big.prj";
        std::ofstream out(file, std::ios::binary);
        out << "project \"/work/top/top.zam\"\nview xlate VIEW_Translation\n"
               "unit xlate DESUT_NGD \"/work/top/\" \"top.ngd\"\n";
        for (long i = 0; static_cast<std::uint64_t>(out.tellp()) < DescriptionBytes(); ++i) {
            out << "view synth" << i << " VIEW_Synthesis\nunit synth" << i
                << " DESUT_UCF \"/work/top/\" \"top" << i << ".ucf\"\nunit synth" << i
                << " DESUT_VERILOG \"/work/top/src/\" \"block" << i << ".v\"\nbinding synth" << i
                << " xlate\n";
        }
        out << "default synth0\n";
        return file.string();
    }();
    return path;
}

// The sample host keeps the project it last read until the next lookup, which frees it
// just before reading anew: the next read would grow into that freed memory unseen, so
// the project is closed through the host's own hook before the peak is reset.
void CloseHostProject() {
    const std::string path = CitP::Factory::LoadedPath(HostProj::kTaskHelperComponent);
    void* handle = path.empty() ? nullptr : ::dlopen(path.c_str(), RTLD_NOW | RTLD_NOLOAD);
    if (handle == nullptr) {
        return;
    }
    if (auto close = reinterpret_cast<void (*)()>(
            ::dlsym(handle, "VenlomerSampleTaskHelper_CloseProject"))) {
        close();
    }
    ::dlclose(handle); // drops only the NOLOAD reference
}

// The sample host's parser is inside its component, so the description is read the way
// the tool's project-files reads it: the library's lookup loads the host's components and
// asks the open project for its files, which makes the host read the description anew.
void LookUpBigProject(benchmark::State& state) {
#ifdef VENLOMER_BENCH_COMPONENT_DIR
    ::setenv("VENLOMER_COMPONENT_PATH", VENLOMER_BENCH_COMPONENT_DIR, 0);
#endif
    ::setenv("VENLOMER_PROJECT", BigDescription().c_str(), 1);
    double peak = 0;
    for (auto _ : state) {
        const double start = ResetPeak();
        Port::StringBase<char> project, ngd, ucf;
        if (!Vn::Eng::ProjFileHelper::GetFilesFromHost(project, ngd, ucf) ||
            ucf.str() != "/work/top/top0.ucf" || ngd.str() != "/work/top/top.ngd") {
            state.SkipWithError("the host did not give the project's files");
            break;
        }
        peak = std::max(peak, PeakMiB(start));
        CloseHostProject();
    }
    CloseHostProject();
    ::unsetenv("VENLOMER_PROJECT");
    Report(state, peak);
}

void ReadBytesOfBigDescription(benchmark::State& state) {
    ReadBytes(state, BigDescription());
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
    for (const int memory : {0, 1}) {
        for (const int large : {1, 0}) {
            const std::string name = std::string("ngd/read_") + (large == 1 ? "100k" : "10k") +
                                     (memory == 1 ? "_peak" : "");
            benchmark::RegisterBenchmark(name.c_str(), ReadNgd)
                ->Unit(benchmark::kMillisecond)
                ->Iterations(GetSizes().tiny ? 1 : 3)
                ->Args({memory, large});
        }
    }
    once(benchmark::RegisterBenchmark("project/lookup_20mb", LookUpBigProject), 0);
    once(benchmark::RegisterBenchmark("project/read_bytes_20mb", ReadBytesOfBigDescription), 0);
    once(benchmark::RegisterBenchmark("project/lookup_20mb_peak", LookUpBigProject), 1);
}

} // namespace VnBench
