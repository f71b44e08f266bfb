//===-- bench/BenchMain.cpp - runs the suite and prints the verdict table -------===//
//
// Every measurement is compared with its baseline measured in the same run, so the
// verdicts hold on any machine; no absolute time is ever a target. With repetitions the
// fastest repetition of each counts.
//
//   venlomer_bench [--tiny] [Google Benchmark flags]
//
//===------------------------------------------------------------------------------===//
#include "Harness.h"

#include <cstdio>
#include <cstring>
#include <map>
#include <string>
#include <vector>

namespace VnBench {

namespace {
Sizes g_sizes;
}

const Sizes& GetSizes() {
    return g_sizes;
}

namespace {

// Collects one value per benchmark: ns per item, or bytes per object where reported.
class CollectingReporter : public benchmark::ConsoleReporter {
public:
    void ReportRuns(const std::vector<Run>& runs) override {
        ConsoleReporter::ReportRuns(runs);
        for (const Run& run : runs) {
            if (run.error_occurred || run.run_type != Run::RT_Iteration) {
                continue;
            }
            const std::string& name = run.run_name.function_name;
            // With repetitions, keep the fastest: noise on a shared machine only ever adds.
            auto keep = [&](double value, const char* unit) {
                auto [at, added] = m_values.try_emplace(name, Value{value, unit});
                if (!added && value < at->second.value) {
                    at->second.value = value;
                }
            };
            if (auto bytes = run.counters.find("bytes_per_object"); bytes != run.counters.end()) {
                keep(bytes->second.value, "B/obj");
            } else if (auto rate = run.counters.find("items_per_second");
                       rate != run.counters.end() && rate->second.value > 0) {
                keep(1e9 / rate->second.value, "ns/item");
            }
        }
    }

    struct Value {
        double value;
        const char* unit;
    };
    const Value* Find(const std::string& name) const {
        auto found = m_values.find(name);
        return found == m_values.end() ? nullptr : &found->second;
    }

private:
    std::map<std::string, Value> m_values;
};

struct Target {
    const char* measurement;
    const char* ours;
    const char* baseline;
    double maxRatio; // ours / baseline must not exceed this
    const char* wording;
};

const Target kTargets[] = {
    {"GetPropertyByName, 16 props, shared list", "lookup/ours", "lookup/bag_unordered_map", 0.5,
     ">= 2x faster than bag"},
    {"GetPropertyByName, 16 props, shared list", "lookup/ours", "lookup/floor", 3.0,
     "within 3x of floor"},
    {"  (a counted copy alone: AddRef + Release)", "reference/counted_copy",
     "lookup/bag_unordered_map", 1e9, "share of the bag's look-up"},
    {"  (the name's position alone, no copy)", "reference/position_only",
     "lookup/bag_unordered_map", 1e9, "share of the bag's look-up"},
    {"bytes per device resource, 8 props", "bytes/ours", "bytes/bag_unordered_map", 0.6,
     "<= 0.6x of bag"},
    {"FindItr 1M resources, int, exact", "search_int/finditr", "search_int/hand_loop", 2.0,
     "within 2x of hand loop"},
    {"FindItr 1M resources, int, exact", "search_int/finditr", "search_int/bags", 1.0 / 3.0,
     ">= 3x faster than bags"},
    {"FindItr 1M resources, MATCH_REGEXP", "search_regex/finditr_regexp",
     "search_regex/finditr_icase_substring", 3.0, "within 3x of icase|substring"},
    {"FindItr 1M resources, MATCH_REGEXP", "search_regex/finditr_regexp",
     "search_regex/bags_std_regex_per_item", 0.1, ">= 10x faster than std::regex"},
    {"selection: select, remove in random order", "selection/ours_large", "selection/ours_small",
     2.0, "per holder: 1M within 2x of 10k"},
    {"  (baseline std::list, quadratic)", "selection/list_medium", "selection/list_small", 1e9,
     "for reference"},
    {"highlight: add, remove in random order", "highlight/ours_large", "highlight/ours_small", 2.0,
     "per resource: 1M within 2x of 10k"},
    {"  (bare std::list unlink by iterator)", "reference/list_unlink_large",
     "reference/list_unlink_small", 1e9, "the documented list alone, 1M vs 10k"},
    {"tree of siblings: build, walk, copy, destroy", "tree_siblings/large", "tree_siblings/small",
     2.0, "per node: 1M within 2x of 10k"},
    {"tree chain: build, walk, copy, destroy", "tree_chain/large", "tree_chain/small", 2.0,
     "per node: 1M within 2x of 10k"},
    {"GetTileSiteColor on a known name", "colour/GetTileSiteColor", "colour/unordered_map", 2.0,
     "within 2x of unordered_map"},
};

int PrintTable(const CollectingReporter& results) {
    std::printf("\n%-46s %12s %12s %9s  %-34s %s\n", "measurement", "ours", "baseline", "ratio",
                "target", "verdict");
    int missed = 0;
    for (const Target& t : kTargets) {
        const auto* ours = results.Find(t.ours);
        const auto* base = results.Find(t.baseline);
        if (ours == nullptr || base == nullptr) {
            std::printf("%-46s %12s %12s %9s  %-34s %s\n", t.measurement, ours ? "" : "-",
                        base ? "" : "-", "-", t.wording, "not measured");
            ++missed;
            continue;
        }
        const double ratio = base->value > 0 ? ours->value / base->value : 0;
        const bool reference = t.maxRatio > 1e8;
        const bool met = ratio <= t.maxRatio;
        missed += (!met && !reference) ? 1 : 0;
        std::printf("%-46s %9.1f %-2s %9.1f %-2s %9.3f  %-34s %s\n", t.measurement, ours->value,
                    ours->unit[0] == 'B' ? "B" : "ns", base->value,
                    base->unit[0] == 'B' ? "B" : "ns", ratio, t.wording,
                    reference ? "-"
                    : met     ? "met"
                              : "NOT MET");
    }
    if (GetSizes().tiny) {
        std::printf(
            "(tiny sizes: the run checks that every benchmark works; ratios mean nothing)\n");
        return 0;
    }
    return missed == 0 ? 0 : 1;
}

} // namespace
} // namespace VnBench

int main(int argc, char** argv) {
    std::vector<char*> args;
    for (int i = 0; i < argc; ++i) {
        if (std::strcmp(argv[i], "--tiny") == 0) {
            VnBench::g_sizes = {1000, 100, 300, 100, 50, true};
        } else {
            args.push_back(argv[i]);
        }
    }
    int count = static_cast<int>(args.size());
    benchmark::Initialize(&count, args.data());
    VnBench::RegisterBaselines();
    VnBench::RegisterLibraryBenchmarks();
    VnBench::RegisterHolderBenchmarks();
    VnBench::CollectingReporter reporter;
    benchmark::RunSpecifiedBenchmarks(&reporter);
    benchmark::Shutdown();
    return VnBench::PrintTable(reporter);
}
