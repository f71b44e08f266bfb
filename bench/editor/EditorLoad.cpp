//===-- bench/editor/EditorLoad.cpp - the editor's server under load ---------------===//
//
// The editor in-process on a loopback port, on a chip database and a generated design of
// 200 ports: 50 clients search at once for a while (no request may fail), then one client
// measures a search and an assignment with its checks on their own. Prints one row per
// measurement with its target; exit 1 when a request failed.
//
//   venlomer_bench_editor --chipdb chipdb-8k.txt --package ct256 [--clients 50] [--seconds 10]
//
//===------------------------------------------------------------------------------===//
#include "Editor.h"
#include "Server.h"

#include <httplib.h>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <string>
#include <thread>
#include <unistd.h>
#include <vector>

namespace {

using Clock = std::chrono::steady_clock;
namespace fs = std::filesystem;

// 25 buses of 8 bits: 200 ports, as a board's data lines come.
std::string Design() {
    std::string ports;
    int bit = 2;
    for (int bus = 0; bus < 25; ++bus) {
        std::string bits;
        for (int i = 0; i < 8; ++i) {
            bits += (i == 0 ? "" : ", ") + std::to_string(bit++);
        }
        ports += std::string(bus == 0 ? "" : ",\n") + "\"d" + std::to_string(bus) +
                 "\": {\"direction\": \"" + (bus % 2 == 0 ? "input" : "output") +
                 "\", \"bits\": [" + bits + "]}";
    }
    return "{\"creator\": \"Yosys\", \"modules\": {\"top\": {\"attributes\": {\"top\": \"1\"}, "
           "\"ports\": {" +
           ports + "}, \"cells\": {}, \"netnames\": {}}}}";
}

double Percentile(std::vector<double> values, double p) {
    if (values.empty()) {
        return 0;
    }
    std::sort(values.begin(), values.end());
    std::size_t at =
        static_cast<std::size_t>(std::lround(p * static_cast<double>(values.size() - 1)));
    return values[std::min(at, values.size() - 1)];
}

double Ms(Clock::duration d) {
    return std::chrono::duration<double, std::milli>(d).count();
}

// A limit of 0: measured for the table, no target.
void Row(const char* what, double value, const char* unit, double limit) {
    if (limit <= 0) {
        std::printf("| %-44s | %9.2f %-3s | %-11s | %-3s |\n", what, value, unit, "-", "-");
        return;
    }
    std::printf("| %-44s | %9.2f %-3s | < %5.0f %-3s | %-3s |\n", what, value, unit, limit, unit,
                value < limit ? "yes" : "no");
}

const char* const kSearches[] = {
    R"({"property": "Bank", "value": "0", "flags": ["exact"]})",
    R"({"property": "Name", "value": "^[AB]1[0-9]$", "flags": ["regexp"]})",
    R"({"property": "X", "value": "20", "flags": ["within-5-percent"]})",
    R"({"property": "Name", "value": "d1", "flags": ["substring", "ignore-case"]})",
};

} // namespace

int main(int argc, char** argv) {
    std::string chipDb = "/usr/share/fpga-icestorm/chipdb/chipdb-8k.txt";
    std::string package = "ct256";
    int clients = 50;
    int seconds = 10;
    for (int i = 1; i + 1 < argc; i += 2) {
        std::string option = argv[i];
        if (option == "--chipdb") {
            chipDb = argv[i + 1];
        } else if (option == "--package") {
            package = argv[i + 1];
        } else if (option == "--clients") {
            clients = std::atoi(argv[i + 1]);
        } else if (option == "--seconds") {
            seconds = std::atoi(argv[i + 1]);
        }
    }
    fs::path dir = fs::temp_directory_path() / ("venlomer-editor-load-" + std::to_string(getpid()));
    fs::create_directories(dir);
    std::ofstream(dir / "top.json") << Design();

    auto opening = Clock::now();
    VnTool::Editor editor;
    VnTool::EditorFiles files{
        (dir / "top.json").string(), (dir / "top.pcf").string(), {chipDb, package, ""}};
    std::string error;
    if (!editor.Open(files, error)) {
        std::fprintf(stderr, "editor-load: %s\n", error.c_str());
        return 1;
    }
    for (const char* path : {"/api/device", "/api/state", "/api/tree"}) {
        editor.Handle("GET", path, "");
    }
    double ready = Ms(Clock::now() - opening);

    VnTool::EditorServer server(editor);
    std::string page =
        (fs::path(argv[0]).parent_path().parent_path() / "share" / "venlomer" / "editor").string();
    if (!server.Load(page, error) || !server.Bind(0, error)) {
        std::fprintf(stderr, "editor-load: %s\n", error.c_str());
        return 1;
    }
    std::thread serving([&] { server.Run(); });

    std::atomic<bool> stop{false};
    std::atomic<long> failures{0};
    std::vector<std::vector<double>> latencies(static_cast<std::size_t>(clients));
    std::vector<std::thread> threads;
    threads.reserve(static_cast<std::size_t>(clients));
    for (int c = 0; c < clients; ++c) {
        threads.emplace_back([&, c] {
            httplib::Client client("127.0.0.1", server.Port());
            client.set_read_timeout(std::chrono::seconds(10));
            auto& mine = latencies[static_cast<std::size_t>(c)];
            for (std::size_t i = static_cast<std::size_t>(c); !stop; ++i) {
                auto start = Clock::now();
                auto result = client.Post("/api/search", kSearches[i % 4], "application/json");
                mine.push_back(Ms(Clock::now() - start));
                if (!result || result->status != 200) {
                    if (failures++ < 3) {
                        std::fprintf(stderr, "editor-load: search failed: %s\n",
                                     result ? std::to_string(result->status).c_str()
                                            : httplib::to_string(result.error()).c_str());
                    }
                }
            }
        });
    }
    std::this_thread::sleep_for(std::chrono::seconds(seconds));
    stop = true;
    for (auto& thread : threads) {
        thread.join();
    }
    std::vector<double> loaded;
    for (const auto& mine : latencies) {
        loaded.insert(loaded.end(), mine.begin(), mine.end());
    }

    // One client on its own: what a user's click costs.
    httplib::Client client("127.0.0.1", server.Port());
    client.set_keep_alive(true);
    std::vector<double> search;
    std::vector<double> assign;
    for (int i = 0; i < 400; ++i) {
        auto start = Clock::now();
        auto result = client.Post("/api/search", kSearches[i % 4], "application/json");
        search.push_back(Ms(Clock::now() - start));
        failures += !result || result->status != 200 ? 1 : 0;
    }
    const char* const pins[] = {"A1", "A2", "B3", "C3"};
    for (int i = 0; i < 400; ++i) {
        std::string body = "{\"port\": \"d" + std::to_string(i % 25) + "[" + std::to_string(i % 8) +
                           "]\", \"pin\": \"" + pins[i % 4] + "\"}";
        auto start = Clock::now();
        auto result = client.Post("/api/assign", body, "application/json");
        assign.push_back(Ms(Clock::now() - start));
        // A pin still taken by another port is refused with 409: a check ran, which is
        // what is measured; anything else is a failure.
        failures += !result || (result->status != 200 && result->status != 409) ? 1 : 0;
        client.Post("/api/unassign", body, "application/json");
    }
    server.Stop();
    serving.join();
    fs::remove_all(dir);

    std::printf("| %-44s | %-13s | %-11s | %-3s |\n", "editor (8k ct256, 200 ports)", "measured",
                "target", "met");
    Row("open and first answers (device, state, tree)", ready, "ms", 1000);
    char what[96];
    std::snprintf(what, sizeof what, "search p50, %d clients for %d s (%zu)", clients, seconds,
                  loaded.size());
    Row(what, Percentile(loaded, 0.5), "ms", 0);
    std::snprintf(what, sizeof what, "search p99, %d clients", clients);
    Row(what, Percentile(loaded, 0.99), "ms", 0);
    Row("search p99, one client", Percentile(search, 0.99), "ms", 20);
    Row("assignment with its checks p99, one client", Percentile(assign, 0.99), "ms", 20);
    std::printf("failed requests: %ld\n", failures.load());
    return failures == 0 ? 0 : 1;
}
