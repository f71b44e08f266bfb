//===-- tests/design/PortsMemoryTest.cpp - a netlist's ports cost memory for ports only -===//
//
// A memory bound, not a timing: the ports of a netlist of many megabytes are read in a
// child process whose peak resident size must stay close to that of reading a tiny
// netlist of the same shape.
//
//===------------------------------------------------------------------------------===//
#include <gtest/gtest.h>

#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <string>

#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

namespace {

namespace fs = std::filesystem;

// A synthesized-looking netlist: `cells` flip-flops clocked by port clk, with parameters
// and attributes as yosys writes them, and the ports after the cells.
void WriteNetlist(const fs::path& path, long cells) {
    std::ofstream out(path, std::ios::binary);
    out << "{\n  \"creator\": \"test\",\n  \"modules\": {\n    \"top\": {\n"
           "      \"attributes\": {\"top\": \"00000000000000000000000000000001\"},\n"
           "      \"cells\": {\n";
    for (long i = 0; i < cells; ++i) {
        long net = 10 + i;
        out << "        \"$auto$ff.cc:266:slice$" << i << "\": {\n"
            << "          \"hide_name\": 1,\n          \"type\": \"SB_DFFR\",\n"
            << "          \"parameters\": {\"INIT\": \"00000000000000000000000000000000\"},\n"
            << "          \"attributes\": {\"src\": \"counter.v:10.3-12.28|/usr/share/yosys/"
               "ice40/ff_map.v:9.57-9.103\"},\n"
            << "          \"port_directions\": {\"C\": \"input\", \"D\": \"input\", \"Q\": "
               "\"output\", \"R\": \"input\"},\n"
            << "          \"connections\": {\"C\": [2], \"D\": [" << net << "], \"Q\": [" << net + 1
            << "], \"R\": [3]}\n"
            << "        }" << (i + 1 < cells ? "," : "") << "\n";
    }
    out << "      },\n      \"ports\": {\n"
           "        \"clk\": {\"direction\": \"input\", \"bits\": [2]},\n"
           "        \"rst\": {\"direction\": \"input\", \"bits\": [3]},\n"
           "        \"led\": {\"direction\": \"output\", \"bits\": [4, 5, 6, 7]}\n"
           "      }\n    }\n  }\n}\n";
}

struct ProbeResult {
    int status = -1;
    long peakKiB = 0;
    std::string output;
};

ProbeResult Probe(const fs::path& netlist, const fs::path& outFile) {
    ProbeResult result;
    pid_t child = fork();
    if (child == 0) {
        std::FILE* out = std::freopen(outFile.c_str(), "w", stdout);
        (void)out;
        // Under AddressSanitizer freed blocks wait in a quarantine of up to 256 MB, which
        // would be counted as the reader's; keep it small.
        const char* asan = std::getenv("ASAN_OPTIONS");
        std::string options = std::string(asan != nullptr ? asan : "") + ":quarantine_size_mb=4";
        setenv("ASAN_OPTIONS", options.c_str(), 1);
        execl(VENLOMER_PORTS_PROBE, VENLOMER_PORTS_PROBE, netlist.c_str(), nullptr);
        _exit(127);
    }
    int status = 0;
    rusage usage{};
    if (child < 0 || wait4(child, &status, 0, &usage) != child) {
        return result;
    }
    result.status = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
    result.peakKiB = usage.ru_maxrss;
    std::ifstream in(outFile);
    std::getline(in, result.output);
    return result;
}

TEST(PortsMemory, ReadingFiftyMegabytesOfCellsKeepsThemOutOfMemory) {
    fs::path folder = fs::temp_directory_path() /
                      ("venlomer-ports-memory-" + std::to_string(static_cast<long>(getpid())));
    fs::create_directories(folder);
    WriteNetlist(folder / "small.json", 10);
    WriteNetlist(folder / "large.json", 140000);
    std::error_code ec;
    auto size = fs::file_size(folder / "large.json", ec);
    EXPECT_GT(size, 50u * 1024 * 1024);

    ProbeResult small = Probe(folder / "small.json", folder / "small.out");
    ProbeResult large = Probe(folder / "large.json", folder / "large.out");
    fs::remove_all(folder, ec);

    ASSERT_EQ(small.status, 0);
    ASSERT_EQ(large.status, 0);
    // Six port bits, the clock among them, found after all the cells.
    EXPECT_EQ(small.output, "6 1");
    EXPECT_EQ(large.output, "6 1");
    EXPECT_LT(large.peakKiB - small.peakKiB, 64L * 1024)
        << "small " << small.peakKiB << " KiB, large " << large.peakKiB << " KiB";
}

} // namespace
