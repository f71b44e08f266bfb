//===-- bench/LibraryBench.cpp - the library's side of each measurement ---------===//
#include "Harness.h"

#include "VnI/IManagers.h"
#include "VnI/ITreeNode.h"
#include "s/ColorManager.h"
#include "s/HighlightManager.h"
#include "s/SelectionManager.h"

#include <malloc.h>

#include <algorithm>
#include <list>
#include <memory>
#include <numeric>
#include <random>
#include <vector>

namespace VnBench {

namespace {

// The managers only need a holder's type and flags; a minimal resource keeps the
// measurement on the manager.
class MinimalResource final : public VnI::IPropertyHolder, public VnI::IDeviceResource {
public:
    CitI::IInterface* GetInterface(const Port::XUID& id) override {
        if (id == VnI::IID_IDeviceResource) {
            return static_cast<VnI::IDeviceResource*>(this);
        }
        return id == VnI::IID_IPropertyHolder ? static_cast<VnI::IPropertyHolder*>(this) : nullptr;
    }
    Port::StringBase<char> GetName() override { return {}; }
    Port::StringBase<char> GetDisplayName() override { return {}; }
    CommonI::RefCountPtr<VnI::IPropertyItr> GetProperties() override { return nullptr; }
    int GetNumProperties() override { return 0; }
    CommonI::RefCountPtr<VnI::IProperty> GetPropertyByName(const Port::StringBase<char>&) override {
        return nullptr;
    }
    std::int64_t AddProperty(const Port::StringBase<char>&,
                             const CommonI::RefCountPtr<VnI::IProperty>&, bool) override {
        return 0;
    }
    std::int64_t RemoveProperty(const Port::StringBase<char>&) override { return 0; }
    CommonI::RefCountPtr<VnI::ITreeNode> GetParentTreeNode() override { return nullptr; }
    std::int64_t SetParentTreeNode(const CommonI::RefCountPtr<VnI::ITreeNode>&) override {
        return 0;
    }
    bool IsSelected() override { return m_selected; }
    std::int64_t SetSelected(bool selected) override {
        m_selected = selected;
        return 0;
    }
    VnI::IPropertyNameList* GetPropertyNames() override { return nullptr; }
    int GetType() const override { return VnI::DEVICE_RESOURCE_HOLDER_TYPE; }
    Port::StringBase<char> GetTileName() const override { return {}; }
    std::int64_t GetLocation(int&, int&) const override { return 0; }
    Port::StringBase<char> GetSiteType() const override { return {}; }
    std::int64_t SetHighlighted(bool highlighted) override {
        m_highlighted = highlighted;
        return 1;
    }
    bool IsHighlighted() const override { return m_highlighted; }
    CommonI::RefCountPtr<VnI::IColorProperty> GetHighlightColor() override { return nullptr; }

private:
    bool m_selected = false;
    bool m_highlighted = false;
};

std::vector<size_t> Shuffled(size_t count) {
    std::vector<size_t> order(count);
    std::iota(order.begin(), order.end(), 0);
    std::shuffle(order.begin(), order.end(), std::mt19937(1));
    return order;
}

void SelectThenRemove(benchmark::State& state, size_t count) {
    std::vector<MinimalResource> holders(count);
    const auto order = Shuffled(count);
    for (auto _ : state) {
        Vn::Eng::SelectionManager manager;
        for (auto& h : holders) {
            manager.AddSelectedItem(&h, false);
        }
        for (size_t i : order) {
            manager.RemoveSelectedItem(&holders[i], false);
        }
    }
    SetItems(state, count);
}

void HighlightThenRemove(benchmark::State& state, size_t count) {
    std::vector<MinimalResource> resources(count);
    const auto order = Shuffled(count);
    for (auto _ : state) {
        Vn::Eng::HighlightManager manager;
        for (auto& r : resources) {
            manager.AddHighlightedItem(&r);
        }
        for (size_t i : order) {
            manager.RemoveHighlightedItem(&resources[i]);
        }
    }
    SetItems(state, count);
}

// Whether a pass finds the heap memory it needs already mapped (left by the pass before)
// or must fault in fresh pages, as the first selection in an editor's session does.
enum class FirstTouch { Reused, Fresh };

// Hands the heap's free pages back to the system, untimed, so that the pass after it
// touches fresh memory.
void ReturnFreePages(benchmark::State& state, FirstTouch touch) {
    if (touch == FirstTouch::Fresh) {
        state.PauseTiming();
        ::malloc_trim(0);
        state.ResumeTiming();
    }
}

// Selects `count` holders into a new manager: the cost of a first selection. Letting the
// selection go is not timed.
void SelectFromEmpty(benchmark::State& state, size_t count, FirstTouch touch) {
    std::vector<MinimalResource> holders(count);
    for (auto _ : state) {
        ReturnFreePages(state, touch);
        auto manager = std::make_unique<Vn::Eng::SelectionManager>();
        for (auto& h : holders) {
            manager->AddSelectedItem(&h, false);
        }
        state.PauseTiming();
        manager.reset();
        state.ResumeTiming();
    }
    SetItems(state, count);
}

// What the two documented lists alone cost a first selection on fresh memory: each
// holder's flag set and a node appended to each list.
void TwoListsFromEmpty(benchmark::State& state, size_t count) {
    std::vector<MinimalResource> holders(count);
    for (auto _ : state) {
        ReturnFreePages(state, FirstTouch::Fresh);
        auto lists = std::make_unique<std::list<VnI::IPropertyHolder*>[]>(2);
        for (auto& h : holders) {
            h.SetSelected(true);
            lists[0].push_back(&h);
            lists[1].push_back(&h);
        }
        benchmark::DoNotOptimize(lists.get());
        state.PauseTiming();
        lists.reset();
        for (auto& h : holders) {
            h.SetSelected(false);
        }
        state.ResumeTiming();
    }
    SetItems(state, count);
}

// Live heap bytes of a manager holding `count` items, lists and index together.
template <class Fill> std::int64_t ManagerBytes(size_t count, Fill&& fill) {
    std::vector<MinimalResource> items(count);
    const std::int64_t before = LiveBytes();
    return fill(items) - before;
}

std::int64_t ListBytes(size_t count, int lists) {
    std::vector<int> items(count);
    const std::int64_t before = LiveBytes();
    std::vector<std::list<int*>> all(static_cast<size_t>(lists));
    for (auto& list : all) {
        for (int& item : items) {
            list.push_back(&item);
        }
    }
    return LiveBytes() - before;
}

std::int64_t SelectionBytes(size_t count) {
    return ManagerBytes(count, [](std::vector<MinimalResource>& holders) {
        Vn::Eng::SelectionManager manager;
        for (auto& h : holders) {
            manager.AddSelectedItem(&h, false);
        }
        return LiveBytes();
    });
}

std::int64_t HighlightBytes(size_t count) {
    return ManagerBytes(count, [](std::vector<MinimalResource>& resources) {
        Vn::Eng::HighlightManager manager;
        for (auto& r : resources) {
            manager.AddHighlightedItem(&r);
        }
        return LiveBytes();
    });
}

// The sizes a table is sparsest at (one past 3/4 of a power of two) and round ones.
std::vector<size_t> SweepSizes() {
    const size_t large = GetSizes().large;
    std::vector<size_t> sizes{GetSizes().small, large};
    for (size_t power = 1024; power * 3 / 4 < large; power *= 2) {
        sizes.push_back(power * 3 / 4 + 1);
    }
    return sizes;
}

// Index bytes per item in the manager's lists: the manager's bytes less those of as many
// bare lists, the worst over the sizes swept. The selection lists each holder twice.
void IndexBytesPerListedItem(benchmark::State& state, bool selection) {
    for (auto _ : state) {
        double worst = 0;
        for (size_t count : SweepSizes()) {
            const int lists = selection ? 2 : 1;
            const std::int64_t manager = selection ? SelectionBytes(count) : HighlightBytes(count);
            const double perItem = static_cast<double>(manager - ListBytes(count, lists)) /
                                   static_cast<double>(count * static_cast<size_t>(lists));
            worst = std::max(worst, perItem);
        }
        state.counters["bytes_per_object"] = worst;
    }
}

void BytesPerSelectedHolder(benchmark::State& state) {
    for (auto _ : state) {
        state.counters["bytes_per_object"] = static_cast<double>(SelectionBytes(GetSizes().large)) /
                                             static_cast<double>(GetSizes().large);
    }
}

// A view colours every tile it draws by its type name; a known name must cost no more
// than one lookup in a hash map. The name is copied per call, as the by-value signature
// makes every caller do.
void TileSiteColour(benchmark::State& state) {
    const Port::StringBase<char> name("SLICE");
    if (!Vn::Eng::ColorManager::GetTileSiteColor(name)) {
        state.SkipWithError("no colour scheme loaded (VENLOMER_DATA_PATH)");
        return;
    }
    for (auto _ : state) {
        auto colour = Vn::Eng::ColorManager::GetTileSiteColor(name);
        benchmark::DoNotOptimize(colour);
    }
    SetItems(state, 1);
}

} // namespace

void RegisterLibraryBenchmarks() {
    const Sizes& sizes = GetSizes();
    Passes(benchmark::RegisterBenchmark("selection/ours_small", SelectThenRemove, sizes.small), 30);
    Passes(benchmark::RegisterBenchmark("selection/ours_large", SelectThenRemove, sizes.large), 1);
    Passes(benchmark::RegisterBenchmark("highlight/ours_small", HighlightThenRemove, sizes.small),
           30);
    Passes(benchmark::RegisterBenchmark("highlight/ours_large", HighlightThenRemove, sizes.large),
           1);
    PerCall(benchmark::RegisterBenchmark("colour/GetTileSiteColor", TileSiteColour));
    Passes(benchmark::RegisterBenchmark("select_from_empty/small", SelectFromEmpty, sizes.small,
                                        FirstTouch::Reused),
           30);
    Passes(benchmark::RegisterBenchmark("select_from_empty/large", SelectFromEmpty, sizes.large,
                                        FirstTouch::Fresh),
           1);
    Passes(benchmark::RegisterBenchmark("reference/two_lists_from_empty_large", TwoListsFromEmpty,
                                        sizes.large),
           1);
    benchmark::RegisterBenchmark("bytes/selection_index_per_listed", IndexBytesPerListedItem, true)
        ->Iterations(1);
    benchmark::RegisterBenchmark("bytes/highlight_index_per_listed", IndexBytesPerListedItem, false)
        ->Iterations(1);
    benchmark::RegisterBenchmark("bytes/selection_per_holder", BytesPerSelectedHolder)
        ->Iterations(1);
}

} // namespace VnBench
