//===-- tests/allocation/ExceptionSafetyTest.cpp - a failed allocation changes nothing -===//
//
// Operations that keep two structures in step (names and their index, a manager's lists
// and its address index, the tile-type colours and their index) run with each of their
// allocations failing in turn; after every failure both structures must be exactly as
// before, and later operations must still find everything at its place.
//
//===------------------------------------------------------------------------------===//
#include "FakeHolders.h"

#include "s/ColorManager.h"
#include "s/HighlightManager.h"
#include "s/PropertyFactory.h"
#include "s/PropertyHolder.h"
#include "s/PropertyNameList.h"
#include "s/SelectionManager.h"
#include "s/internal/ColorManagerImp.h"

#include "CountingNew.h"

#include <gtest/gtest.h>

#include <stdexcept>
#include <string>
#include <vector>

using CommonI::RefCountPtr;
using Port::StringBase;
using VnTest::FailEachAllocationInTurn;
using VnTest::FakeHolder;
using VnTest::FakeNode;
using VnTest::FakeResource;

namespace {

// Longer than any short-string buffer, so copying a name allocates.
StringBase<char> LongName(int i) {
    return StringBase<char>(
        ("a property name too long to be kept inline " + std::to_string(i)).c_str());
}

// ---- property name lists -----------------------------------------------------------

struct NameListState {
    std::vector<std::string> names; // by position
    bool operator==(const NameListState&) const = default;
};

NameListState StateOf(Vn::Eng::PropertyNameList& list) {
    NameListState state;
    for (int i = 0; i < list.GetNumNames(); ++i) {
        VnI::IPropertyName* name = list.GetPropertyName(i);
        EXPECT_NE(name, nullptr) << i;
        if (name != nullptr) {
            state.names.push_back(std::string(name->GetName().view()));
        }
    }
    return state;
}

class Pin final : public Vn::Eng::PropertyHolder {
public:
    explicit Pin(Vn::Eng::PropertyNameList& schema)
        : m_names(static_cast<VnI::IPropertyNameList*>(
              schema.GetInterface(VnI::IID_IPropertyNameList))) {}
    StringBase<char> GetName() override { return {}; }
    VnI::IPropertyNameList* GetPropertyNames() override { return m_names; }
    int GetType() const override { return 2; }

private:
    VnI::IPropertyNameList* m_names;
};

// ---- managers ------------------------------------------------------------------------

std::vector<VnI::IPropertyHolder*> Walk(const RefCountPtr<VnI::IPropertyHolderItr>& it) {
    std::vector<VnI::IPropertyHolder*> out;
    EXPECT_TRUE(it);
    for (; it && !it->IsEnd(); it->Next()) {
        out.push_back(it->CurrentItem());
    }
    return out;
}

struct SelectionState {
    std::vector<std::vector<VnI::IPropertyHolder*>> categories;
    std::vector<VnI::IPropertyHolder*> all;
    std::vector<bool> flags;
    bool operator==(const SelectionState&) const = default;
};

SelectionState StateOf(Vn::Eng::SelectionManager& manager,
                       const std::vector<FakeHolder*>& holders) {
    SelectionState state;
    for (int c = 0; c < manager.GetNumCategories(); ++c) {
        state.categories.push_back(Walk(manager.GetSelectedItems(c)));
    }
    state.all = Walk(manager.GetAllSelectedItems());
    for (FakeHolder* h : holders) {
        state.flags.push_back(h->m_selected);
    }
    return state;
}

struct HighlightState {
    std::vector<VnI::IDeviceResource*> list;
    std::vector<bool> flags;
    bool operator==(const HighlightState&) const = default;
};

HighlightState StateOf(Vn::Eng::HighlightManager& manager,
                       const std::vector<FakeResource*>& resources) {
    HighlightState state;
    const auto it = manager.GetHighlightedItems();
    EXPECT_TRUE(it);
    for (; it && !it->IsEnd(); it->Next()) {
        state.list.push_back(it->CurrentItem());
    }
    for (FakeResource* r : resources) {
        state.flags.push_back(r->m_highlighted);
    }
    return state;
}

} // namespace

TEST(AllocationFailure, AddNameLeavesNamesAndIndexAsTheyWere) {
    // Every size up to where the index builds and then grows its table, so that each
    // growth of the vector and of the index (whatever their steps) has its turn to fail.
    for (int before = 0; before <= 33; ++before) {
        SCOPED_TRACE(before);
        Vn::Eng::PropertyNameList list;
        for (int i = 0; i < before; ++i) {
            ASSERT_EQ(list.AddName(LongName(i), VnI::INT_TYPE, true), i);
        }
        const NameListState was = StateOf(list);
        const StringBase<char> added = LongName(before);
        int result = -2;
        const long allocations =
            FailEachAllocationInTurn([&] { result = list.AddName(added, VnI::INT_TYPE, true); },
                                     [&](long k) {
                                         SCOPED_TRACE(k);
                                         EXPECT_EQ(list.GetNumNames(), before);
                                         EXPECT_EQ(list.Contains(added), -1);
                                         EXPECT_EQ(StateOf(list), was);
                                         for (int i = 0; i < before; ++i) {
                                             EXPECT_EQ(list.Contains(LongName(i)), i);
                                         }
                                     });
        // A fresh list makes no name objects, so there only its index allocates.
        EXPECT_GE(allocations, 1) << "the new name was never failed";
        EXPECT_EQ(result, before);
        // Positions go on where they were, for names and for the slots of holders.
        const StringBase<char> later = LongName(1000);
        EXPECT_EQ(list.AddName(later, VnI::INT_TYPE, true), before + 1);
        EXPECT_EQ(list.Contains(added), before);
        EXPECT_EQ(list.Contains(later), before + 1);
        Pin pin(list);
        ASSERT_EQ(pin.AddProperty(later, RefCountPtr<VnI::IProperty>::Adopt(
                                             Vn::Eng::PropertyFactory::CreateIntProperty(5, true))),
                  1);
        const auto found = pin.GetPropertyByName(later);
        ASSERT_TRUE(found);
        EXPECT_EQ(found->GetIndex(), before + 1);
        EXPECT_EQ(found->GetIntProperty(), 5);
    }
}

// Every size up to the index's third table, so that each growth of the map's entries and
// of the index (whatever their steps) has its turn to fail.
TEST(AllocationFailure, TileTypeColoursKeepMapAndIndexInStep) {
    Vn::Eng::TileColorMap map;
    for (int before = 0; before <= 66; ++before) {
        SCOPED_TRACE(before);
        map.clear();
        for (int i = 0; i < before; ++i) {
            map[LongName(i)];
        }
        StringBase<char> added = LongName(before);
        const long allocations =
            FailEachAllocationInTurn([&] { map[std::move(added)]; },
                                     [&](long k) {
                                         SCOPED_TRACE(k);
                                         EXPECT_EQ(map.size(), static_cast<std::size_t>(before));
                                         EXPECT_EQ(added, LongName(before))
                                             << "the name is kept when nothing is added";
                                         EXPECT_THROW(map.at(LongName(before)), std::out_of_range);
                                     });
        if (before == 0 || before == 16 || before == 32 || before == 64) {
            EXPECT_GE(allocations, 1) << "the entries or the table must grow here";
        }
        ASSERT_EQ(map.size(), static_cast<std::size_t>(before) + 1);
        EXPECT_NO_THROW(map.at(LongName(before)));
        for (int i = 0; i <= before; ++i) {
            ASSERT_NO_THROW(map.at(LongName(i))) << i;
            EXPECT_EQ((map.begin() + i)->first, LongName(i));
        }
    }
}

TEST(AllocationFailure, ANewTileTypeTakesNoGenericColourUnlessItIsAdded) {
    Vn::Eng::ColorManagerImp& state = *Vn::Eng::ColorManager::m_imp;
    ASSERT_GE(state.m_genericColors.size(), 2u) << "the default colour scheme was not read";
    const std::size_t types = state.m_tileTypeColors.size();
    const std::int32_t next = state.m_nextGenericColor;
    const StringBase<char> name("A_TILE_TYPE_NOBODY_HAS_EVER_DRAWN");
    Vn::Eng::ColorManager::Color got;
    FailEachAllocationInTurn([&] { got = Vn::Eng::ColorManager::GetTileSiteColor(name); },
                             [&](long k) {
                                 SCOPED_TRACE(k);
                                 EXPECT_EQ(state.m_tileTypeColors.size(), types);
                                 EXPECT_EQ(state.m_nextGenericColor, next);
                                 EXPECT_THROW(state.m_tileTypeColors.at(name), std::out_of_range);
                             });
    EXPECT_EQ(state.m_tileTypeColors.size(), types + 1);
    ASSERT_TRUE(got);
    EXPECT_EQ(got.Get(), state.m_tileTypeColors.at(name).Get());
    EXPECT_EQ(got.Get(), state.m_genericColors[static_cast<std::size_t>(next)].Get());
    EXPECT_EQ(Vn::Eng::ColorManager::GetTileSiteColor(name).Get(), got.Get());
}

TEST(AllocationFailure, SelectingLeavesListsIndexAndFlagsAsTheyWere) {
    std::vector<FakeHolder> pool;
    pool.reserve(40);
    for (int i = 0; i < 40; ++i) {
        pool.emplace_back(i % 3, "p" + std::to_string(i));
    }
    FakeHolder high(15, "high");
    std::vector<FakeHolder*> all{&high};
    for (FakeHolder& h : pool) {
        all.push_back(&h);
    }

    Vn::Eng::SelectionManager manager;
    // 32 already selected: the next one makes the address index grow.
    for (int i = 0; i < 32; ++i) {
        ASSERT_EQ(manager.AddSelectedItem(&pool[static_cast<std::size_t>(i)], false), 1);
    }
    // A holder whose flag the host cleared by hand stands a second time when selected again.
    pool[3].m_selected = false;
    for (FakeHolder* h : {&pool[32], &high, &pool[3]}) {
        SCOPED_TRACE(h->m_name);
        const SelectionState was = StateOf(manager, all);
        const long allocations =
            FailEachAllocationInTurn([&] { manager.AddSelectedItem(h, false); },
                                     [&](long k) {
                                         SCOPED_TRACE(k);
                                         EXPECT_EQ(StateOf(manager, all), was);
                                     });
        EXPECT_GE(allocations, 2);
        EXPECT_TRUE(h->m_selected);
        const auto everything = Walk(manager.GetAllSelectedItems());
        ASSERT_FALSE(everything.empty());
        EXPECT_EQ(everything.back(), h);
    }
    EXPECT_EQ(manager.GetNumCategories(), 16);
    EXPECT_EQ(Walk(manager.GetSelectedItems(15)), std::vector<VnI::IPropertyHolder*>{&high});

    // The index still finds every entry: removing each selected holder empties every
    // category; pool[3] leaves the overall list once per removal, so its second entry
    // stays there.
    for (int i = 0; i <= 32; ++i) {
        manager.RemoveSelectedItem(&pool[static_cast<std::size_t>(i)], false);
    }
    manager.RemoveSelectedItem(&high, false);
    EXPECT_EQ(Walk(manager.GetAllSelectedItems()), std::vector<VnI::IPropertyHolder*>{&pool[3]});
    for (int c = 0; c < manager.GetNumCategories(); ++c) {
        EXPECT_TRUE(Walk(manager.GetSelectedItems(c)).empty()) << c;
    }
    for (FakeHolder* h : all) {
        EXPECT_FALSE(h->m_selected) << h->m_name;
    }
}

TEST(AllocationFailure, SelectingASubtreeIsTakenBackWhole) {
    // h (type 3) with children c1 (type 3), c2 (type 14); c1 with child g1 (type 13).
    FakeHolder other(2, "other"), h(3, "h"), c1(3, "c1"), c2(14, "c2"), g1(13, "g1");
    const auto nh = FakeNode::Make(&h), n1 = FakeNode::Make(&c1), n2 = FakeNode::Make(&c2),
               ng = FakeNode::Make(&g1);
    nh->Add(n1);
    nh->Add(n2);
    n1->Add(ng);
    const std::vector<FakeHolder*> all{&other, &h, &c1, &c2, &g1};

    Vn::Eng::SelectionManager manager;
    manager.AddSelectedItem(&other, false);
    const SelectionState was = StateOf(manager, all);
    const long allocations = FailEachAllocationInTurn([&] { manager.AddSelectedItem(&h, true); },
                                                      [&](long k) {
                                                          SCOPED_TRACE(k);
                                                          EXPECT_EQ(StateOf(manager, all), was);
                                                          EXPECT_EQ(manager.GetNumCategories(), 12);
                                                      });
    EXPECT_GE(allocations, 8);
    EXPECT_EQ(Walk(manager.GetAllSelectedItems()),
              (std::vector<VnI::IPropertyHolder*>{&other, &h, &c1, &g1, &c2}));
    EXPECT_EQ(manager.GetNumCategories(), 15);

    // Deselecting with children takes h, c1 and c2 or nothing at all.
    const SelectionState selected = StateOf(manager, all);
    FailEachAllocationInTurn([&] { manager.RemoveSelectedItem(&h, true); },
                             [&](long k) {
                                 SCOPED_TRACE(k);
                                 EXPECT_EQ(StateOf(manager, all), selected);
                             });
    EXPECT_EQ(Walk(manager.GetAllSelectedItems()),
              (std::vector<VnI::IPropertyHolder*>{&other, &g1}));
    EXPECT_FALSE(h.m_selected);
    EXPECT_FALSE(c2.m_selected);
    EXPECT_TRUE(g1.m_selected);
}

TEST(AllocationFailure, HighlightingLeavesListIndexAndFlagsAsTheyWere) {
    std::vector<FakeResource> pool(40);
    std::vector<FakeResource*> all;
    all.reserve(pool.size());
    for (FakeResource& r : pool) {
        all.push_back(&r);
    }
    Vn::Eng::HighlightManager manager;
    for (int i = 0; i < 32; ++i) {
        manager.AddHighlightedItem(&pool[static_cast<std::size_t>(i)]);
    }
    // A new resource that makes the index grow, then a second and third entry of one.
    std::vector<VnI::IDeviceResource*> added;
    for (FakeResource* r : {&pool[32], &pool[5], &pool[5]}) {
        const HighlightState was = StateOf(manager, all);
        const long allocations = FailEachAllocationInTurn([&] { manager.AddHighlightedItem(r); },
                                                          [&](long k) {
                                                              SCOPED_TRACE(k);
                                                              EXPECT_EQ(StateOf(manager, all), was);
                                                          });
        EXPECT_GE(allocations, 1);
        added.push_back(r);
    }
    const HighlightState now = StateOf(manager, all);
    ASSERT_EQ(now.list.size(), 35u);
    EXPECT_EQ(std::vector<VnI::IDeviceResource*>(now.list.end() - 3, now.list.end()), added);

    // The index still leads to every entry, oldest first.
    manager.RemoveHighlightedItem(&pool[5]);
    manager.RemoveHighlightedItem(&pool[5]);
    const HighlightState afterTwo = StateOf(manager, all);
    ASSERT_EQ(afterTwo.list.size(), 33u);
    EXPECT_EQ(afterTwo.list.back(), &pool[5]);
    EXPECT_EQ(afterTwo.list[5], &pool[6]);
    for (FakeResource& r : pool) {
        manager.RemoveHighlightedItem(&r);
    }
    EXPECT_TRUE(StateOf(manager, all).list.empty());
}

// Appending a list either takes every new name, in order, or none: a name whose creation
// fails is never skipped while the names after it go in one place too early.
TEST(AllocationFailure, AppendListTakesEveryNameOrNone) {
    for (int before : {0, 3, 16}) {
        SCOPED_TRACE(before);
        Vn::Eng::PropertyNameList list;
        Vn::Eng::PropertyNameList other;
        for (int i = 0; i < before; ++i) {
            list.AddName(LongName(i), VnI::INT_TYPE, i % 2 == 0);
        }
        // Two names the list has already, then twenty new ones (the vector and the index
        // both grow on the way).
        for (int i = before - 2; i < before + 20; ++i) {
            if (i >= 0) {
                other.AddName(LongName(i), VnI::STRING_TYPE, i % 3 != 0);
            }
        }
        const NameListState was = StateOf(list);
        NameListState whole = was;
        for (int i = before; i < before + 20; ++i) {
            whole.names.push_back(std::string(LongName(i).view()));
        }
        const auto* otherNames =
            static_cast<VnI::IPropertyNameList*>(other.GetInterface(VnI::IID_IPropertyNameList));
        // A failure the append does not need (the values iterator of a name that has no
        // values) may let it finish; any other leaves the list untouched.
        Vn::Eng::PropertyNameList fresh;
        for (int i = 0; i < before; ++i) {
            fresh.AddName(LongName(i), VnI::INT_TYPE, i % 2 == 0);
        }
        const long allocations =
            FailEachAllocationInTurn([&] { list.AppendList(otherNames); },
                                     [&](long k) {
                                         SCOPED_TRACE(k);
                                         const NameListState now = StateOf(list);
                                         EXPECT_TRUE(now == was || now == whole)
                                             << "part of the list was appended";
                                         if (now == whole) {
                                             list.ClearList();
                                             list.AppendList(static_cast<VnI::IPropertyNameList*>(
                                                 fresh.GetInterface(VnI::IID_IPropertyNameList)));
                                             ASSERT_EQ(StateOf(list), was);
                                         } else {
                                             EXPECT_EQ(list.Contains(LongName(before)), -1);
                                         }
                                     });
        EXPECT_GE(allocations, 20);
        ASSERT_EQ(list.GetNumNames(), before + 20);
        for (int i = 0; i < before + 20; ++i) {
            ASSERT_EQ(list.Contains(LongName(i)), i);
            EXPECT_EQ(list.GetPropertyName(i)->GetName(), LongName(i));
            // Names already present keep their own type; the appended ones bring theirs.
            EXPECT_EQ(list.GetPropertyName(i)->GetType(),
                      i < before ? VnI::INT_TYPE : VnI::STRING_TYPE);
        }
    }
}

// ---- palettes ------------------------------------------------------------------------

// Growing a palette by reading past its end, or by setting a colour past it, either
// grows it wholly or leaves it as it was: never part way, never with a null colour.
TEST(AllocationFailure, PaletteGrowthIsAllOrNothing) {
    using Vn::Eng::ColorManager;
    const auto snapshot = [] {
        std::vector<const VnI::IColorProperty*> colours;
        for (const auto& c : ColorManager::m_imp->m_ioBankColors) {
            colours.push_back(c.Get());
        }
        return colours;
    };
    ASSERT_GT(ColorManager::GetNumDefaultIOBankColors(), 0) << "no colour scheme was read";
    const int start = static_cast<int>(ColorManager::m_imp->m_ioBankColors.size());

    auto was = snapshot();
    ColorManager::Color got;
    long allocations =
        FailEachAllocationInTurn([&] { got = ColorManager::GetIOBankColor(start + 5, false); },
                                 [&](long k) {
                                     SCOPED_TRACE(k);
                                     EXPECT_EQ(snapshot(), was);
                                 });
    EXPECT_GE(allocations, 6);
    ASSERT_TRUE(got);
    ASSERT_EQ(ColorManager::m_imp->m_ioBankColors.size(), static_cast<std::size_t>(start) + 6);
    for (const auto& c : ColorManager::m_imp->m_ioBankColors) {
        EXPECT_TRUE(c);
    }

    was = snapshot();
    const auto red = RefCountPtr<VnI::IColorProperty>::Adopt(
        Vn::Eng::PropertyFactory::CreateColorProperty(static_cast<char>(200), 0, 0, true));
    bool set = false;
    const auto at = static_cast<unsigned int>(start + 9);
    allocations = FailEachAllocationInTurn([&] { set = ColorManager::SetIOBankColor(at, red); },
                                           [&](long k) {
                                               SCOPED_TRACE(k);
                                               EXPECT_EQ(snapshot(), was);
                                           });
    EXPECT_GE(allocations, 4);
    EXPECT_TRUE(set);
    ASSERT_EQ(ColorManager::m_imp->m_ioBankColors.size(), static_cast<std::size_t>(at) + 1);
    for (const auto& c : ColorManager::m_imp->m_ioBankColors) {
        EXPECT_TRUE(c);
    }
    EXPECT_EQ(ColorManager::GetIOBankColor(static_cast<int>(at), false)->GetRed(), 200);
}
