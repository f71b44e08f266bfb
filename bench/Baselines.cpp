//===-- bench/Baselines.cpp - what a competent developer writes without us ------===//
//
// Each baseline is written as one would without this library: a property bag per
// object (a hash map or an ordered map from name to a shared variant), the floor of one
// hash look-up plus one vector index on plain structs, a selection kept in a std::list
// with find-then-erase, a regular expression compiled per comparison or once (std::regex)
// and RE2 on bare names, and a colour table in an unordered_map.
//
//===------------------------------------------------------------------------------===//
#include "Harness.h"

#include <algorithm>
#include <list>
#include <map>
#include <memory>
#include <numeric>
#include <random>
#include <re2/re2.h>
#include <regex>
#include <string>
#include <unordered_map>
#include <variant>
#include <vector>

namespace VnBench {

std::vector<std::string> SixteenNames() {
    std::vector<std::string> names;
    names.reserve(16);
    for (int i = 0; i < 16; ++i) {
        names.push_back(std::string("Prop").append(std::to_string(i)));
    }
    return names;
}

namespace {

using Value = std::variant<int, double, std::string, bool>;
using Bag = std::unordered_map<std::string, std::shared_ptr<Value>>;
using OrderedBag = std::map<std::string, std::shared_ptr<Value>>;

template <class BagType> void LookupInBags(benchmark::State& state) {
    const auto names = SixteenNames();
    std::vector<BagType> bags(GetSizes().holders);
    for (auto& bag : bags) {
        for (int i = 0; i < 16; ++i) {
            bag[names[static_cast<size_t>(i)]] = std::make_shared<Value>(i);
        }
    }
    size_t holder = 0;
    size_t name = 0;
    for (auto _ : state) {
        auto found = bags[holder].find(names[name]);
        std::shared_ptr<Value> value = found->second; // a bag hands out a shared value
        benchmark::DoNotOptimize(value);
        name = (name + 1) & 15;
        holder = name == 0 ? (holder + 1) % bags.size() : holder;
    }
    SetItems(state, 1);
}

// The floor: one shared name index and a slot vector per object.
void LookupFloor(benchmark::State& state) {
    const auto names = SixteenNames();
    std::unordered_map<std::string, int> index;
    for (int i = 0; i < 16; ++i) {
        index.emplace(names[static_cast<size_t>(i)], i);
    }
    struct Plain {
        std::vector<Value*> slots;
    };
    std::vector<Value> values(16);
    std::vector<Plain> objects(GetSizes().holders);
    for (auto& object : objects) {
        for (auto& v : values) {
            object.slots.push_back(&v);
        }
    }
    size_t holder = 0;
    size_t name = 0;
    for (auto _ : state) {
        Value* value = objects[holder].slots[static_cast<size_t>(index.find(names[name])->second)];
        benchmark::DoNotOptimize(value);
        name = (name + 1) & 15;
        holder = name == 0 ? (holder + 1) % objects.size() : holder;
    }
    SetItems(state, 1);
}

// 8 properties per object: 4 int, 2 string, 1 enumerated (kept as its text), 1 bool.
void BagBytes(benchmark::State& state) {
    const size_t count = GetSizes().small;
    for (auto _ : state) {
        const std::uint64_t before = AllocatedBytes();
        std::vector<Bag> bags(count);
        const std::uint64_t vectorBytes = AllocatedBytes() - before;
        for (size_t i = 0; i < count; ++i) {
            Bag& bag = bags[i];
            bag["X"] = std::make_shared<Value>(static_cast<int>(i % 100));
            bag["Y"] = std::make_shared<Value>(static_cast<int>(i / 100));
            bag["Bank"] = std::make_shared<Value>(static_cast<int>(i % 4));
            bag["Index"] = std::make_shared<Value>(static_cast<int>(i));
            bag["Name"] = std::make_shared<Value>(std::string("IOB_").append(std::to_string(i)));
            bag["Tile"] = std::make_shared<Value>(std::string("T").append(std::to_string(i % 997)));
            bag["Type"] = std::make_shared<Value>(std::string("IO"));
            bag["Used"] = std::make_shared<Value>(i % 2 == 0);
        }
        state.counters["bytes_per_object"] =
            static_cast<double>(AllocatedBytes() - before - vectorBytes) /
            static_cast<double>(count);
    }
}

std::vector<Bag> PinBags(size_t count) {
    std::vector<Bag> bags(count);
    for (size_t i = 0; i < count; ++i) {
        bags[i]["X"] = std::make_shared<Value>(static_cast<int>(i % 1000));
        bags[i]["Name"] =
            std::make_shared<Value>("Bank" + std::to_string(i % 8) + "_pin" + std::to_string(i));
    }
    return bags;
}

void SearchBagsIntExact(benchmark::State& state) {
    const auto bags = PinBags(GetSizes().large);
    const std::string name = "X";
    for (auto _ : state) {
        size_t matches = 0;
        for (const Bag& bag : bags) {
            auto found = bag.find(name);
            if (found != bag.end() && std::get<int>(*found->second) == 500) {
                ++matches;
            }
        }
        benchmark::DoNotOptimize(matches);
    }
    SetItems(state, bags.size());
}

void SearchBagsStdRegexPerItem(benchmark::State& state) {
    const auto bags = PinBags(GetSizes().regexBaseline);
    const std::string name = "Name";
    const std::string pattern = "BANK3_.*";
    for (auto _ : state) {
        size_t matches = 0;
        for (const Bag& bag : bags) {
            auto found = bag.find(name);
            if (found == bag.end()) {
                continue;
            }
            // As a naive search does: build the expression for every comparison.
            const std::regex re(pattern, std::regex::icase);
            if (std::regex_search(std::get<std::string>(*found->second), re,
                                  std::regex_constants::match_continuous)) {
                ++matches;
            }
        }
        benchmark::DoNotOptimize(matches);
    }
    SetItems(state, bags.size());
}

// What a competent search does with std::regex: one expression, compiled once.
void SearchBagsStdRegexOnce(benchmark::State& state) {
    const auto bags = PinBags(GetSizes().medium);
    const std::string name = "Name";
    const std::regex re("BANK3_.*", std::regex::icase);
    for (auto _ : state) {
        size_t matches = 0;
        for (const Bag& bag : bags) {
            auto found = bag.find(name);
            if (found != bag.end() && std::regex_search(std::get<std::string>(*found->second), re,
                                                        std::regex_constants::match_continuous)) {
                ++matches;
            }
        }
        benchmark::DoNotOptimize(matches);
    }
    SetItems(state, bags.size());
}

// The floor: RE2, compiled once, run anchored over a plain vector of the names, with no
// property look-up at all.
void SearchNamesRe2(benchmark::State& state) {
    std::vector<std::string> names;
    for (size_t i = 0; i < GetSizes().large; ++i) {
        names.push_back("Bank" + std::to_string(i % 8) + "_pin" + std::to_string(i));
    }
    RE2::Options options;
    options.set_case_sensitive(false);
    const RE2 re("BANK3_.*", options);
    for (auto _ : state) {
        size_t matches = 0;
        for (const std::string& text : names) {
            if (re.Match(text, 0, text.size(), RE2::ANCHOR_START, nullptr, 0)) {
                ++matches;
            }
        }
        benchmark::DoNotOptimize(matches);
    }
    SetItems(state, names.size());
}

// Select every item, then remove them one by one in a random order.
void ListSelection(benchmark::State& state, size_t count) {
    std::vector<int> items(count);
    std::vector<size_t> order(count);
    std::iota(order.begin(), order.end(), 0);
    std::shuffle(order.begin(), order.end(), std::mt19937(1));
    for (auto _ : state) {
        std::list<int*> selection;
        for (int& item : items) {
            selection.push_back(&item);
        }
        for (size_t i : order) {
            selection.erase(std::find(selection.begin(), selection.end(), &items[i]));
        }
        benchmark::DoNotOptimize(selection);
    }
    SetItems(state, count);
}

// The documented list itself with a perfect index: every node's iterator is kept, and
// the nodes are unlinked in a random order. No manager does less than this per item.
void BareListUnlink(benchmark::State& state, size_t count) {
    std::vector<int> items(count);
    std::vector<size_t> order(count);
    std::iota(order.begin(), order.end(), 0);
    std::shuffle(order.begin(), order.end(), std::mt19937(1));
    for (auto _ : state) {
        std::list<int*> list;
        std::vector<std::list<int*>::iterator> where;
        where.reserve(count);
        for (int& item : items) {
            where.push_back(list.insert(list.end(), &item));
        }
        for (size_t i : order) {
            list.erase(where[i]);
        }
        benchmark::DoNotOptimize(list);
    }
    SetItems(state, count);
}

struct Colour {
    unsigned char r, g, b;
};
using ColourMap = std::unordered_map<std::string, std::shared_ptr<Colour>>;

// A colour table as one would write it, behind the same signature shape as ours: the
// name arrives by value and a counted reference goes back.
[[gnu::noinline]] std::shared_ptr<Colour> FindColour(const ColourMap& colours, std::string name) {
    const auto found = colours.find(name);
    return found != colours.end() ? found->second : nullptr;
}

void TileColourMap(benchmark::State& state) {
    ColourMap colours;
    for (const char* tile :
         {"SLICE",     "IO",       "TB_IO",       "LR_IO", "CLK",   "BRAM",  "GT",     "GT_TOP",
          "GT_BOTTOM", "GT10_TOP", "GT10_BOTTOM", "PPC",   "EMPTY", "TERM",  "L_BUFG", "R_BUFG",
          "T_BUFG",    "B_BUFG",   "BUFG",        "LBUFR", "RBUFR", "TBUFR", "BBUFR"}) {
        colours.emplace(tile, std::make_shared<Colour>());
    }
    const std::string name = "SLICE";
    for (auto _ : state) {
        std::shared_ptr<Colour> colour = FindColour(colours, name);
        benchmark::DoNotOptimize(colour);
    }
    SetItems(state, 1);
}

// Sixteen properties in a bag, built and let go, a thousand bags per iteration.
void BuildBags(benchmark::State& state) {
    const auto names = SixteenNames();
    const size_t count = GetSizes().holders;
    for (auto _ : state) {
        std::vector<Bag> bags(count);
        for (Bag& bag : bags) {
            for (int i = 0; i < 16; ++i) {
                bag[names[static_cast<size_t>(i)]] = std::make_shared<Value>(i);
            }
        }
        benchmark::DoNotOptimize(bags.data());
    }
    SetItems(state, count);
}

// Live bytes of two bare lists of `count` addresses: what the selection's lists hold
// without any index. bytes_per_object is per item.
void BareListBytes(benchmark::State& state, size_t count, int lists) {
    std::vector<int> items(count);
    for (auto _ : state) {
        const std::int64_t before = LiveBytes();
        std::vector<std::list<int*>> all(static_cast<size_t>(lists));
        for (auto& list : all) {
            for (int& item : items) {
                list.push_back(&item);
            }
        }
        state.counters["bytes_per_object"] =
            static_cast<double>(LiveBytes() - before) / static_cast<double>(count);
    }
}

} // namespace

void RegisterBaselines() {
    const Sizes& sizes = GetSizes();
    PerCall(benchmark::RegisterBenchmark("lookup/bag_unordered_map", LookupInBags<Bag>));
    PerCall(benchmark::RegisterBenchmark("lookup/bag_map", LookupInBags<OrderedBag>));
    PerCall(benchmark::RegisterBenchmark("lookup/floor", LookupFloor));
    benchmark::RegisterBenchmark("bytes/bag_unordered_map", BagBytes)->Iterations(1);
    Passes(benchmark::RegisterBenchmark("search_int/bags", SearchBagsIntExact), 1);
    Passes(benchmark::RegisterBenchmark("search_regex/bags_std_regex_per_item",
                                        SearchBagsStdRegexPerItem),
           1);
    benchmark::RegisterBenchmark("selection/list_small", ListSelection, sizes.small)->Iterations(1);
    benchmark::RegisterBenchmark("selection/list_medium", ListSelection, sizes.medium)
        ->Iterations(1);
    PerCall(benchmark::RegisterBenchmark("colour/unordered_map", TileColourMap));
    Passes(benchmark::RegisterBenchmark("search_regex/bags_std_regex_once", SearchBagsStdRegexOnce),
           1);
    Passes(benchmark::RegisterBenchmark("search_regex/re2_names", SearchNamesRe2), 1);
    PerCall(benchmark::RegisterBenchmark("generic/build_bags_16", BuildBags));
    benchmark::RegisterBenchmark("bytes/two_bare_lists", BareListBytes, sizes.large, 2)
        ->Iterations(1);
    benchmark::RegisterBenchmark("bytes/one_bare_list", BareListBytes, sizes.large, 1)
        ->Iterations(1);
    Passes(benchmark::RegisterBenchmark("reference/list_unlink_small", BareListUnlink, sizes.small),
           30);
    Passes(benchmark::RegisterBenchmark("reference/list_unlink_large", BareListUnlink, sizes.large),
           1);
}

} // namespace VnBench
