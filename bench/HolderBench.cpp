//===-- bench/HolderBench.cpp - look-up, memory, search and tree measurements ----===//
#include "Harness.h"

#include "VnI/ITreeNode.h"
#include "s/DeviceResource.h"
#include "s/FindItr.h"
#include "s/GenericPropertyHolder.h"
#include "s/PropertyFactory.h"
#include "s/PropertyHolderItr.h"
#include "s/PropertyNameList.h"
#include "s/TreeNode.h"

#include <memory>
#include <string>
#include <vector>

namespace VnBench {

namespace {

using CommonI::RefCountPtr;
using Str = Port::StringBase<char>;

// A device resource as a host would derive one: all its state is in the library's
// holder, its schema is one name list shared by every resource of its kind.
class Pin final : public Vn::Eng::DeviceResource {
public:
    explicit Pin(VnI::IPropertyNameList* names) : m_names(names) {}
    Str GetName() override { return {}; }
    VnI::IPropertyNameList* GetPropertyNames() override { return m_names; }
    Str GetTileName() const override { return {}; }
    std::int64_t GetLocation(int&, int&) const override { return 0; }
    Str GetSiteType() const override { return {}; }

private:
    VnI::IPropertyNameList* m_names;
};

RefCountPtr<VnI::IProperty> Int(int value) {
    return RefCountPtr<VnI::IProperty>::Adopt(
        Vn::Eng::PropertyFactory::CreateIntProperty(value, true));
}

RefCountPtr<VnI::IProperty> Text(const std::string& value) {
    return RefCountPtr<VnI::IProperty>::Adopt(
        Vn::Eng::PropertyFactory::CreateStringProperty(Str(value), true));
}

VnI::IPropertyNameList* NameInterface(Vn::Eng::PropertyNameList& list) {
    return static_cast<VnI::IPropertyNameList*>(list.GetInterface(VnI::IID_IPropertyNameList));
}

void Lookup(benchmark::State& state) {
    Vn::Eng::PropertyNameList list;
    std::vector<Str> names;
    for (const std::string& text : SixteenNames()) {
        names.emplace_back(text);
    }
    std::vector<std::unique_ptr<Pin>> pins;
    for (size_t h = 0; h < GetSizes().holders; ++h) {
        pins.push_back(std::make_unique<Pin>(NameInterface(list)));
        for (int i = 0; i < 16; ++i) {
            pins.back()->AddProperty(names[static_cast<size_t>(i)], Int(i));
        }
    }
    size_t holder = 0;
    size_t name = 0;
    for (auto _ : state) {
        RefCountPtr<VnI::IProperty> value = pins[holder]->GetPropertyByName(names[name]);
        benchmark::DoNotOptimize(value);
        name = (name + 1) & 15;
        holder = name == 0 ? (holder + 1) % pins.size() : holder;
    }
    SetItems(state, 1);
}

// The look-up part of GetPropertyByName without the counted reference it hands out:
// the holder's name list asked for the name's position.
void LookupPositionOnly(benchmark::State& state) {
    Vn::Eng::PropertyNameList list;
    std::vector<Str> names;
    for (const std::string& text : SixteenNames()) {
        names.emplace_back(text);
        list.AddName(names.back(), VnI::INT_TYPE, true);
    }
    std::vector<std::unique_ptr<Pin>> pins;
    for (size_t h = 0; h < GetSizes().holders; ++h) {
        pins.push_back(std::make_unique<Pin>(NameInterface(list)));
    }
    size_t holder = 0;
    size_t name = 0;
    for (auto _ : state) {
        int position = pins[holder]->GetPropertyNames()->Contains(names[name]);
        benchmark::DoNotOptimize(position);
        name = (name + 1) & 15;
        holder = name == 0 ? (holder + 1) % pins.size() : holder;
    }
    SetItems(state, 1);
}

// 8 properties per resource: 4 int, 2 string, 1 enumerated, 1 bool; the same contents as
// the bag baseline.
void Bytes(benchmark::State& state) {
    const size_t count = GetSizes().small;
    Vn::Eng::PropertyNameList list;
    std::vector<Str> kinds{Str("IO"), Str("SLICE"), Str("BRAM")};
    const Str x("X"), y("Y"), bank("Bank"), index("Index"), name("Name"), tile("Tile"),
        type("Type"), used("Used");
    auto fill = [&](Pin& pin, size_t i) {
        pin.AddProperty(x, Int(static_cast<int>(i % 100)));
        pin.AddProperty(y, Int(static_cast<int>(i / 100)));
        pin.AddProperty(bank, Int(static_cast<int>(i % 4)));
        pin.AddProperty(index, Int(static_cast<int>(i)));
        pin.AddProperty(name, Text(std::string("IOB_").append(std::to_string(i))));
        pin.AddProperty(tile, Text(std::string("T").append(std::to_string(i % 997))));
        pin.AddProperty(type,
                        RefCountPtr<VnI::IProperty>::Adopt(
                            Vn::Eng::PropertyFactory::CreateEnumProperty(kinds, Str("IO"), true)));
        pin.AddProperty(used, RefCountPtr<VnI::IProperty>::Adopt(
                                  Vn::Eng::PropertyFactory::CreateBoolProperty(i % 2 == 0, true)));
    };
    Pin schema(NameInterface(list)); // the shared schema is built once, not per resource
    fill(schema, 0);
    for (auto _ : state) {
        std::vector<std::unique_ptr<Pin>> pins;
        pins.reserve(count);
        const std::uint64_t before = AllocatedBytes();
        for (size_t i = 0; i < count; ++i) {
            pins.push_back(std::make_unique<Pin>(NameInterface(list)));
            fill(*pins.back(), i);
        }
        state.counters["bytes_per_object"] =
            static_cast<double>(AllocatedBytes() - before) / static_cast<double>(count);
    }
}

// One population of pins shared by the search measurements: X is an int, Name a text
// such as "Bank3_pin123".
struct Population {
    Vn::Eng::PropertyNameList list;
    std::vector<std::unique_ptr<Pin>> pins;
    Vn::Eng::PropertyHolderList holders;

    Population() {
        const size_t count = GetSizes().large;
        pins.reserve(count);
        for (size_t i = 0; i < count; ++i) {
            pins.push_back(std::make_unique<Pin>(NameInterface(list)));
            pins.back()->AddProperty(Str("X"), Int(static_cast<int>(i % 1000)));
            pins.back()->AddProperty(
                Str("Name"), Text("Bank" + std::to_string(i % 8) + "_pin" + std::to_string(i)));
            holders.push_back(pins.back().get());
        }
    }
    static Population& Get() {
        static Population population;
        return population;
    }
};

size_t CountFound(const RefCountPtr<VnI::IPropertyHolderItr>& found) {
    size_t matches = 0;
    for (; !found->IsEnd(); found->Next()) {
        ++matches;
    }
    return matches;
}

void Search(benchmark::State& state, const char* name, RefCountPtr<VnI::IProperty> wanted,
            int flags) {
    Population& population = Population::Get();
    const Str propertyName(name);
    for (auto _ : state) {
        auto found = Vn::Eng::FindItr::CreateInstance(
            Vn::Eng::PropertyHolderItr::CreateInstance(&population.holders), propertyName,
            RefCountPtr<const VnI::IProperty>(wanted), flags);
        benchmark::DoNotOptimize(CountFound(found));
    }
    SetItems(state, population.holders.size());
}

// What a caller writes by hand with the same library calls, without the find iterator.
void HandLoop(benchmark::State& state) {
    Population& population = Population::Get();
    const Str propertyName("X");
    const RefCountPtr<const VnI::IProperty> wanted(Int(500));
    for (auto _ : state) {
        size_t matches = 0;
        for (VnI::IPropertyHolder* holder : population.holders) {
            auto candidate = holder->GetPropertyByName(propertyName);
            if (candidate && candidate->Equals(wanted, VnI::MATCH_EXACT)) {
                ++matches;
            }
        }
        benchmark::DoNotOptimize(matches);
    }
    SetItems(state, population.holders.size());
}

// The least any search through the documented calls does per holder, on the same
// population and in the same order: a step along the holder list (a std::list, as the
// holder iterator walks), a virtual call on the holder (GetPropertyByName is one), the
// counted reference it hands out (AddRef, Release) and a virtual call on the property
// (Equals is one). The properties are taken from a side vector filled beforehand, so
// finding the property by name and the holder's slots cost nothing here.
void SearchIntBound(benchmark::State& state) {
    Population& population = Population::Get();
    std::vector<RefCountPtr<VnI::IProperty>> properties;
    properties.reserve(population.holders.size());
    for (VnI::IPropertyHolder* holder : population.holders) {
        properties.push_back(holder->GetPropertyByName(Str("X")));
    }
    for (auto _ : state) {
        size_t matches = 0;
        auto property = properties.cbegin();
        for (VnI::IPropertyHolder* holder : population.holders) {
            benchmark::DoNotOptimize(holder->GetType());
            const RefCountPtr<VnI::IProperty> counted = *property++;
            matches += counted->GetIntProperty() == 500 ? 1 : 0;
        }
        benchmark::DoNotOptimize(matches);
    }
    SetItems(state, population.holders.size());
}

// What handing out one counted reference costs by itself: the AddRef and the Release
// that every documented GetPropertyByName makes, and a bag's shared_ptr copy makes too.
void CountedCopy(benchmark::State& state) {
    const RefCountPtr<VnI::IProperty> held = Int(1);
    for (auto _ : state) {
        RefCountPtr<VnI::IProperty> copy = held;
        benchmark::DoNotOptimize(copy);
    }
    SetItems(state, 1);
}

// Generic holders of sixteen int properties each, built and let go, a thousand per
// iteration: the same work as the bag baseline.
void BuildGeneric(benchmark::State& state) {
    std::vector<Str> names;
    for (const std::string& text : SixteenNames()) {
        names.emplace_back(text);
    }
    const size_t count = GetSizes().holders;
    for (auto _ : state) {
        std::vector<std::unique_ptr<Vn::Eng::GenericPropertyHolder>> holders;
        holders.reserve(count);
        for (size_t h = 0; h < count; ++h) {
            holders.push_back(std::make_unique<Vn::Eng::GenericPropertyHolder>());
            for (int i = 0; i < 16; ++i) {
                holders.back()->AddProperty(names[static_cast<size_t>(i)], Int(i));
            }
        }
        benchmark::DoNotOptimize(holders.data());
    }
    SetItems(state, count);
}

// Heap bytes one generic holder with sixteen int properties holds, the properties
// included, as malloc rounds them in a fresh heap (so no run sees larger blocks left by
// the benchmarks that happened to run before it).
void GenericBytes(benchmark::State& state) {
    std::vector<Str> names;
    for (const std::string& text : SixteenNames()) {
        names.emplace_back(text);
    }
    for (auto _ : state) {
        std::vector<RefCountPtr<VnI::IProperty>> properties;
        properties.reserve(16);
        StartRoundedBytes();
        for (int i = 0; i < 16; ++i) {
            properties.push_back(Int(i));
        }
        const std::int64_t propertyBytes = StopRoundedBytes();
        StartRoundedBytes();
        auto holder = std::make_unique<Vn::Eng::GenericPropertyHolder>();
        for (int i = 0; i < 16; ++i) {
            holder->AddProperty(names[static_cast<size_t>(i)], properties[static_cast<size_t>(i)]);
        }
        const std::int64_t holderBytes = StopRoundedBytes();
        state.counters["bytes_per_object"] = static_cast<double>(holderBytes + propertyBytes);
        state.counters["property_bytes"] = static_cast<double>(propertyBytes);
    }
}

// Builds a tree of `count` nodes below a root (siblings, or a chain), walks it, copies it
// deeply and lets both go.
void Tree(benchmark::State& state, size_t count, bool chain) {
    for (auto _ : state) {
        auto root = Vn::Eng::TreeNode::CreateInstance(nullptr, nullptr);
        RefCountPtr<VnI::ITreeNode> parent = root;
        for (size_t i = 0; i < count; ++i) {
            auto node = Vn::Eng::TreeNode::CreateInstance(nullptr, parent);
            parent->AddChild(RefCountPtr<const VnI::ITreeNode>(node));
            if (chain) {
                parent = node;
            }
        }
        size_t walked = 0;
        std::vector<RefCountPtr<VnI::ITreeNode>> work{root};
        while (!work.empty()) {
            auto node = std::move(work.back());
            work.pop_back();
            for (auto it = node->GetChildren(); !it->IsEnd(); it->Next()) {
                work.push_back(it->CurrentItem());
                ++walked;
            }
        }
        auto copy = Vn::Eng::TreeNode::CreateInstance(root);
        benchmark::DoNotOptimize(walked);
        parent.Reset();
        copy.Reset();
        root.Reset();
    }
    SetItems(state, count);
}

} // namespace

void RegisterHolderBenchmarks() {
    const Sizes& sizes = GetSizes();
    PerCall(benchmark::RegisterBenchmark("lookup/ours", Lookup));
    PerCall(benchmark::RegisterBenchmark("reference/counted_copy", CountedCopy));
    PerCall(benchmark::RegisterBenchmark("reference/position_only", LookupPositionOnly));
    benchmark::RegisterBenchmark("bytes/ours", Bytes)->Iterations(1);
    benchmark::RegisterBenchmark("bytes/generic_16", GenericBytes)->Iterations(1);
    PerCall(benchmark::RegisterBenchmark("generic/build_ours_16", BuildGeneric));
    Passes(
        benchmark::RegisterBenchmark("search_int/finditr", Search, "X", Int(500), VnI::MATCH_EXACT),
        1);
    Passes(benchmark::RegisterBenchmark("search_int/hand_loop", HandLoop), 1);
    Passes(benchmark::RegisterBenchmark("search_int/bound", SearchIntBound), 1);
    Passes(benchmark::RegisterBenchmark("search_regex/finditr_regexp", Search, "Name",
                                        Text("BANK3_.*"),
                                        VnI::MATCH_REGEXP | VnI::MATCH_IGNORE_CASE),
           1);
    Passes(benchmark::RegisterBenchmark("search_regex/finditr_icase_substring", Search, "Name",
                                        Text("bank3_"),
                                        VnI::MATCH_IGNORE_CASE | VnI::MATCH_SUBSTRING),
           1);
    Passes(benchmark::RegisterBenchmark("tree_siblings/small", Tree, sizes.small, false), 30);
    Passes(benchmark::RegisterBenchmark("tree_siblings/large", Tree, sizes.large, false), 1);
    Passes(benchmark::RegisterBenchmark("tree_chain/small", Tree, sizes.small, true), 30);
    Passes(benchmark::RegisterBenchmark("tree_chain/large", Tree, sizes.large, true), 1);
}

} // namespace VnBench
