//===-- tests/FindItrTest.cpp - the search yields exactly the holders that match --===//
#include "FakeHolders.h"
#include "MessageCapture.h"
#include "Slots.h"

#include "s/DeviceResource.h"
#include "s/FindItr.h"
#include "s/GenericPropertyHolder.h"
#include "s/Property.h"
#include "s/PropertyFactory.h"
#include "s/PropertyHolderItr.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <iterator>
#include <memory>
#include <utility>
#include <vector>

using CommonI::RefCountPtr;
using Port::StringBase;
using Vn::Eng::FindItr;
using Vn::Eng::GenericPropertyHolder;
using Vn::Eng::PropertyFactory;
using Vn::Eng::PropertyHolderList;
using VnI::IPropertyHolder;
using VnI::IPropertyHolderItr;

namespace {

RefCountPtr<VnI::IProperty> Int(int value) {
    return RefCountPtr<VnI::IProperty>::Adopt(PropertyFactory::CreateIntProperty(value, true));
}
RefCountPtr<VnI::IProperty> Text(const char* value) {
    return RefCountPtr<VnI::IProperty>::Adopt(PropertyFactory::CreateStringProperty(value, true));
}
RefCountPtr<const VnI::IProperty> Wanted(RefCountPtr<VnI::IProperty> p) {
    return p;
}

// Holders carrying "Bank" (or nothing, for a missing value) in list order.
struct Holders {
    std::vector<std::unique_ptr<GenericPropertyHolder>> owned;
    PropertyHolderList list;

    Holders& Bank(int value) {
        Add()->AddProperty("Bank", Int(value));
        return *this;
    }
    Holders& Name(const char* value) {
        Add()->AddProperty("Name", Text(value));
        return *this;
    }
    Holders& Bare() {
        Add()->AddProperty("Other", Int(0));
        return *this;
    }
    Holders& Null() {
        list.push_back(nullptr);
        return *this;
    }
    IPropertyHolder* operator[](size_t i) { return owned.at(i).get(); }
    RefCountPtr<IPropertyHolderItr> Itr() {
        return Vn::Eng::PropertyHolderItr::CreateInstance(&list);
    }

private:
    GenericPropertyHolder* Add() {
        owned.push_back(std::make_unique<GenericPropertyHolder>());
        list.push_back(owned.back().get());
        return owned.back().get();
    }
};

std::vector<IPropertyHolder*> Yielded(const RefCountPtr<IPropertyHolderItr>& it) {
    std::vector<IPropertyHolder*> out;
    if (!it) {
        ADD_FAILURE() << "no iterator where one was expected";
        return out;
    }
    for (; !it->IsEnd(); it->Next()) {
        out.push_back(it->CurrentItem());
    }
    return out;
}

// Which holders of the list a search for "Bank"/"Name" with this value and flags yields.
std::vector<IPropertyHolder*> Search(Holders& h, const char* name,
                                     RefCountPtr<VnI::IProperty> value, int flags) {
    return Yielded(FindItr::CreateInstance(h.Itr(), name, Wanted(std::move(value)), flags));
}

} // namespace

TEST(FindItr, StandsOnTheFirstMatchAtOnceAndAgainAfterFirst) {
    Holders h;
    h.Bank(1).Bank(2).Bank(3).Bank(1);
    auto found = FindItr::CreateInstance(h.Itr(), "Bank", Wanted(Int(3)), VnI::MATCH_EXACT);
    EXPECT_EQ(found->CurrentItem(), h[2]);
    found->Next();
    EXPECT_TRUE(found->IsEnd());
    EXPECT_EQ(found->CurrentItem(), nullptr);
    EXPECT_EQ(found->First(), 1);
    EXPECT_EQ(found->CurrentItem(), h[2]);

    auto first = FindItr::CreateInstance(h.Itr(), "Bank", Wanted(Int(1)), 0);
    EXPECT_EQ(Yielded(first), (std::vector<IPropertyHolder*>{h[0], h[3]}));
}

TEST(FindItr, YieldsConsecutiveMatchesBoth) {
    Holders h;
    h.Bank(5).Bank(5).Bank(6).Bank(5);
    EXPECT_EQ(Search(h, "Bank", Int(5), 0), (std::vector<IPropertyHolder*>{h[0], h[1], h[3]}));
}

TEST(FindItr, WithoutAMatchItIsAtItsEndFromTheStart) {
    Holders h;
    h.Bank(1).Bank(2);
    auto found = FindItr::CreateInstance(h.Itr(), "Bank", Wanted(Int(9)), 0);
    EXPECT_TRUE(found->IsEnd());
    EXPECT_EQ(found->CurrentItem(), nullptr);
    EXPECT_EQ(found->Next(), 1);

    Holders none;
    EXPECT_TRUE(Search(none, "Bank", Int(1), VnI::MATCH_ANY).empty());
}

TEST(FindItr, SkipsHoldersWithoutThePropertyAndNullHolders) {
    Holders h;
    h.Bare().Null().Bank(4).Name("4").Bank(4);
    EXPECT_EQ(Search(h, "Bank", Int(4), 0), (std::vector<IPropertyHolder*>{h[1], h[3]}));
    // MATCH_ANY matches every value, but never a holder that lacks the property.
    EXPECT_EQ(Search(h, "Bank", Int(0), VnI::MATCH_ANY),
              (std::vector<IPropertyHolder*>{h[1], h[3]}));
    // An emptied slot is no property either.
    h[1]->RemoveProperty("Bank");
    EXPECT_EQ(Search(h, "Bank", Int(4), 0), (std::vector<IPropertyHolder*>{h[3]}));
}

TEST(FindItr, WithoutAPropertyToMatchYieldsEveryHolder) {
    Holders h;
    h.Bank(1).Bare().Null();
    auto all = FindItr::CreateInstance(h.Itr(), "Bank", nullptr, VnI::MATCH_EXACT);
    EXPECT_EQ(Yielded(all), (std::vector<IPropertyHolder*>{h[0], h[1], nullptr}));
}

TEST(FindItr, WithoutAnIteratorIsAlwaysAtItsEnd) {
    auto found = FindItr::CreateInstance(nullptr, "Bank", Wanted(Int(1)), 0);
    EXPECT_TRUE(found->IsEnd());
    EXPECT_EQ(found->CurrentItem(), nullptr);
    EXPECT_EQ(found->First(), 1);
    EXPECT_EQ(found->Next(), 1);
}

TEST(FindItr, DrivesTheCallersIterator) {
    Holders h;
    h.Bank(1).Bank(2).Bank(2);
    auto underlying = h.Itr();
    auto found = FindItr::CreateInstance(underlying, "Bank", Wanted(Int(2)), 0);
    EXPECT_EQ(underlying->CurrentItem(), h[1]);
    found->Next();
    EXPECT_EQ(underlying->CurrentItem(), h[2]);
    underlying->First(); // and moving it moves the search
    EXPECT_EQ(found->CurrentItem(), h[0]);
}

TEST(FindItr, TheHoldersPropertyIsTheReceiverOfEachFlagFamily) {
    Holders h;
    h.Bank(100).Bank(94).Bank(105).Name("Bank12").Name("bank7").Name("Ban");
    using V = std::vector<IPropertyHolder*>;
    EXPECT_EQ(Search(h, "Bank", Int(100), VnI::MATCH_WITHIN_5_PERCENT), (V{h[0], h[2]}));
    EXPECT_EQ(Search(h, "Bank", Int(100), VnI::MATCH_LESS), (V{h[1]}));
    EXPECT_EQ(Search(h, "Bank", Int(100), VnI::MATCH_GREATER), (V{h[2]}));
    EXPECT_EQ(Search(h, "Bank", Text("100"), 0), V{}) << "types must agree";
    EXPECT_EQ(Search(h, "Name", Text("bank"), VnI::MATCH_IGNORE_CASE | VnI::MATCH_SUBSTRING),
              (V{h[3], h[4]}));
    EXPECT_EQ(Search(h, "Name", Text("ank"), VnI::MATCH_SUBSTRING), (V{h[3], h[4]}));
    EXPECT_EQ(Search(h, "Name", Text("BAN"), VnI::MATCH_IGNORE_CASE), (V{h[5]}));
    EXPECT_EQ(Search(h, "Name", Text("Ban.*2"), VnI::MATCH_REGEXP), (V{h[3]}));
    EXPECT_EQ(Search(h, "Name", Text("Ban"), VnI::MATCH_EXACT), (V{h[5]}));
    EXPECT_EQ(Search(h, "Name", Text("x"), VnI::MATCH_ANY), (V{h[3], h[4], h[5]}));
}

// A host's string property that decides equality itself.
class AlwaysEqualText final : public Vn::Eng::StringProperty {
public:
    using StringProperty::StringProperty;
    bool Equals(const RefCountPtr<const VnI::IProperty>&, int) const override { return true; }
};

// A host's string property that reports a text other than the one it was built with.
class ReportedText final : public Vn::Eng::StringProperty {
public:
    ReportedText(const char* stored, const char* reported)
        : StringProperty(StringBase<char>(stored)), m_reported(reported) {}
    StringBase<char> GetStringProperty() const override { return m_reported; }

private:
    StringBase<char> m_reported;
};

TEST(FindItr, TextSearchesYieldWhatEachHoldersEqualsAnswers) {
    Holders h;
    for (const char* name : {"Bank12", "bank7", "Ban", "BANK3_pin9", "Bank3_", "xBank3_", "", "a.b",
                             "Bank3_\n", "\xe9t\xe9", "\xc9T\xc9"}) {
        h.Name(name);
    }
    const int shapes[] = {0,
                          VnI::MATCH_EXACT,
                          VnI::MATCH_IGNORE_CASE,
                          VnI::MATCH_SUBSTRING,
                          VnI::MATCH_IGNORE_CASE | VnI::MATCH_SUBSTRING,
                          VnI::MATCH_REGEXP,
                          VnI::MATCH_REGEXP | VnI::MATCH_IGNORE_CASE,
                          VnI::MATCH_REGEXP | VnI::MATCH_SUBSTRING,
                          VnI::MATCH_REGEXP | VnI::MATCH_IGNORE_CASE | VnI::MATCH_SUBSTRING,
                          VnI::MATCH_REGEXP | VnI::MATCH_EXACT,
                          VnI::MATCH_ANY,
                          VnI::MATCH_LESS};
    for (const char* wanted :
         {"BANK3_.*", "bank", "Ban", "a.b", "(", "ank\\d+", ".*_\n", "\xe9T", "", "x|Bank1"}) {
        for (const int flags : shapes) {
            std::vector<IPropertyHolder*> expected;
            for (size_t i = 0; i < h.owned.size(); ++i) {
                if (h[i]->GetPropertyByName("Name")->Equals(Wanted(Text(wanted)), flags)) {
                    expected.push_back(h[i]);
                }
            }
            EXPECT_EQ(Search(h, "Name", Text(wanted), flags), expected)
                << wanted << " with flags " << flags;
        }
    }
}

TEST(FindItr, AHostsStringPropertyAnswersThroughItsOwnMethods) {
    Holders h;
    h.Name("Bank12").Name("bank7");
    GenericPropertyHolder host;
    host.AddProperty("Name", RefCountPtr<VnI::IProperty>::Adopt(new AlwaysEqualText("zzz")));
    h.list.push_back(&host);
    using V = std::vector<IPropertyHolder*>;
    EXPECT_EQ(Search(h, "Name", Text("Ban.*"), VnI::MATCH_REGEXP), (V{h[0], &host}));
    EXPECT_EQ(Search(h, "Name", Text("q"), VnI::MATCH_EXACT), (V{&host}));
    // The wanted side's text is what it reports, not what it was built with.
    const RefCountPtr<VnI::IProperty> reported =
        RefCountPtr<VnI::IProperty>::Adopt(new ReportedText("nothing", "BANK1.*"));
    EXPECT_EQ(Search(h, "Name", reported, VnI::MATCH_REGEXP | VnI::MATCH_IGNORE_CASE),
              (V{h[0], &host}));
    EXPECT_EQ(Search(h, "Name", RefCountPtr<VnI::IProperty>::Adopt(new ReportedText("x", "bank7")),
                     VnI::MATCH_EXACT),
              (V{h[1], &host}));
}

namespace {

// A host's holder that is no PropertyHolder at all, with one "Bank".
class ForeignBank final : public VnTest::FakeHolder {
public:
    explicit ForeignBank(int bank) : FakeHolder(0), m_bank(Int(bank)) {}
    RefCountPtr<VnI::IProperty> GetPropertyByName(const StringBase<char>& name) override {
        return name == StringBase<char>("Bank") ? m_bank : nullptr;
    }

private:
    RefCountPtr<VnI::IProperty> m_bank;
};

class PinBank final : public Vn::Eng::DeviceResource {
public:
    PinBank(VnI::IPropertyNameList* names, int bank) : m_names(names) {
        AddProperty("Bank", Int(bank));
    }
    StringBase<char> GetName() override { return {}; }
    VnI::IPropertyNameList* GetPropertyNames() override { return m_names; }
    StringBase<char> GetTileName() const override { return {}; }
    std::int64_t GetLocation(int&, int&) const override { return 0; }
    StringBase<char> GetSiteType() const override { return {}; }

private:
    VnI::IPropertyNameList* m_names;
};

} // namespace

TEST(FindItr, OverAnyMixOfHoldersAListSearchYieldsEachMatchInOrder) {
    GenericPropertyHolder schema; // the pins share its name list
    schema.AddProperty("Bank", Int(0));
    std::vector<std::unique_ptr<IPropertyHolder>> owned;
    PropertyHolderList list;
    // Runs of every kind and length, so matches fall next to each other, a few apart, at
    // either end, and next to holders of another class, null or without the property.
    for (int i = 0; i < 64; ++i) {
        const int bank = (i * 7 + i / 5) % 3;
        switch ((i * 5 + i / 9) % 6) {
        case 0:
            owned.push_back(std::make_unique<ForeignBank>(bank));
            break;
        case 1:
        case 2:
            owned.push_back(std::make_unique<PinBank>(schema.GetPropertyNames(), bank));
            break;
        case 3:
            list.push_back(nullptr);
            continue;
        case 4:
            owned.push_back(std::make_unique<GenericPropertyHolder>());
            owned.back()->AddProperty("Other", Int(bank), true);
            break;
        default:
            owned.push_back(std::make_unique<GenericPropertyHolder>());
            owned.back()->AddProperty("Bank", Int(bank), true);
            break;
        }
        list.push_back(owned.back().get());
    }
    for (size_t length : {size_t{0}, size_t{1}, size_t{2}, size_t{3}, size_t{5}, list.size()}) {
        for (int bank = 0; bank < 3; ++bank) {
            PropertyHolderList part(list.begin(),
                                    std::next(list.begin(), static_cast<long>(length)));
            std::vector<IPropertyHolder*> expected;
            for (IPropertyHolder* holder : part) {
                auto property = holder != nullptr ? holder->GetPropertyByName("Bank") : nullptr;
                if (property && property->GetIntProperty() == bank) {
                    expected.push_back(holder);
                }
            }
            EXPECT_EQ(
                Yielded(FindItr::CreateInstance(Vn::Eng::PropertyHolderItr::CreateInstance(&part),
                                                "Bank", Wanted(Int(bank)), VnI::MATCH_EXACT)),
                expected)
                << length << " holders, bank " << bank;
        }
    }
}

namespace {

// A holder whose look-up edits the list being searched, once: it frees the node `away`
// places after its own and puts `replacement` at the end, so the list keeps its length.
class ListEditingHolder final : public GenericPropertyHolder {
public:
    ListEditingHolder(PropertyHolderList& list, long away, IPropertyHolder* replacement)
        : m_list(list), m_away(away), m_replacement(replacement) {
        AddProperty("Bank", Int(2)); // no match: the search steps on past it
    }
    RefCountPtr<VnI::IProperty> GetPropertyByName(const StringBase<char>& name) override {
        if (m_replacement != nullptr) {
            auto self = std::find(m_list.begin(), m_list.end(), this);
            m_list.erase(std::next(self, m_away));
            m_list.push_back(std::exchange(m_replacement, nullptr));
        }
        return GenericPropertyHolder::GetPropertyByName(name);
    }

private:
    PropertyHolderList& m_list;
    long m_away;
    IPropertyHolder* m_replacement;
};

} // namespace

TEST(FindItr, AHolderThatEditsTheListAheadIsFollowedAsTheListNowStands) {
    const int banks[] = {1, 2, 1, 1, 2, 1};
    for (size_t away = 1; away <= 4; ++away) {
        Holders h;
        for (int bank : banks) {
            h.Bank(bank);
        }
        GenericPropertyHolder replacement;
        replacement.AddProperty("Bank", Int(1));
        ListEditingHolder editor(h.list, static_cast<long>(away), &replacement);
        h.list.push_front(&editor);
        std::vector<IPropertyHolder*> expected;
        for (size_t i = 0; i < std::size(banks); ++i) {
            if (banks[i] == 1 && i + 1 != away) {
                expected.push_back(h[i]);
            }
        }
        expected.push_back(&replacement);
        EXPECT_EQ(Search(h, "Bank", Int(1), VnI::MATCH_EXACT), expected) << "away " << away;
    }
}

TEST(FindItr, AnswersItselfAndItsCounterAndHoldsItsArguments) {
    Holders h;
    h.Bank(1);
    auto underlying = h.Itr();
    auto wanted = Int(1);
    int before = -1;
    static_cast<CommonI::IRefCount*>(wanted->GetInterface(CommonI::IID_IRefCount))
        ->GetRefCount(before);
    auto found = FindItr::CreateInstance(underlying, "Bank", Wanted(wanted), 0);
    CitI::IInterface* counter = found->GetInterface(CommonI::IID_IRefCount);
    ASSERT_NE(counter, nullptr);
    for (CitI::IInterface* from : {static_cast<CitI::IInterface*>(found.Get()), counter}) {
        EXPECT_EQ(from->GetInterface(VnI::IID_IPropertyHolderItr), found.Get());
        EXPECT_EQ(from->GetInterface(CitI::IID_IInterface), found.Get());
        EXPECT_EQ(from->GetInterface(CommonI::IID_IRefCount), counter);
        EXPECT_EQ(from->GetInterface(VnI::IID_IPropertyItr), nullptr);
    }
    int held = -1;
    static_cast<CommonI::IRefCount*>(wanted->GetInterface(CommonI::IID_IRefCount))
        ->GetRefCount(held);
    EXPECT_EQ(held, before + 1);
    found.Reset();
    static_cast<CommonI::IRefCount*>(wanted->GetInterface(CommonI::IID_IRefCount))
        ->GetRefCount(held);
    EXPECT_EQ(held, before);
}

TEST(FindItr, DumpPrintsItsFourMembers) {
    Holders h;
    auto found = FindItr::CreateInstance(h.Itr(), "Bank", Wanted(Int(1)), VnI::MATCH_LESS);
    VnTest::MessageCapture capture;
    static_cast<FindItr*>(found.Get())->Dump();
    ASSERT_EQ(capture.Messages().size(), 4u);
    EXPECT_EQ(capture.Messages()[0].text, "Vn::Eng::FindItr::m_imp->m_flags = 16\n");
    EXPECT_EQ(capture.Messages()[1].text, "Vn::Eng::FindItr::m_imp->m_propNameToMatch = Bank\n");
    EXPECT_EQ(capture.Messages()[2].text.rfind("Vn::Eng::FindItr::m_imp->m_propertyToMatch = ", 0),
              0u);
    EXPECT_EQ(capture.Messages()[3].text.rfind("Vn::Eng::FindItr::m_imp->m_propHolderItr = ", 0),
              0u);
    for (const auto& m : capture.Messages()) {
        EXPECT_EQ(m.unit, "../s/FindItr");
        EXPECT_EQ(m.revision, "$Revision: 1.4 $");
        EXPECT_EQ(m.severity, Port::Severity::Status);
    }
}

TEST(FindItr, SlotOrderIsTheContract) {
    using VnTest::SlotOf;
    EXPECT_EQ(SlotOf(&FindItr::GetInterface), 0);
    EXPECT_EQ(SlotOf(&FindItr::CurrentItem), 3);
    EXPECT_EQ(SlotOf(&FindItr::First), 4);
    EXPECT_EQ(SlotOf(&FindItr::Next), 5);
    EXPECT_EQ(SlotOf(&FindItr::IsEnd), 6);
}
