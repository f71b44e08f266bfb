//===-- tests/PropertyNameListTest.cpp - name lists keep positions, look-ups, references -===//
//
// Property names, their iterator and name lists: positions, lookup, appending, clearing,
// borrowed pointers and debug output.
//
//===------------------------------------------------------------------------------===//
#include "MessageCapture.h"
#include "Slots.h"

#include "s/PossibleEnumValuesItr.h"
#include "s/PropertyName.h"
#include "s/PropertyNameItr.h"
#include "s/PropertyNameList.h"

#include <gtest/gtest.h>

#include <cstdio>
#include <string>
#include <vector>

using CommonI::RefCountPtr;
using Vn::Eng::PossibleEnumValuesItr;
using Vn::Eng::PropertyName;
using Vn::Eng::PropertyNameItr;
using Vn::Eng::PropertyNameList;
using VnI::IPossibleEnumValuesItr;
using VnI::IPropertyName;
using VnI::IPropertyNameItr;
using VnI::IPropertyNameList;

namespace {

int CountOf(CitI::IInterface* p) {
    int count = -1;
    static_cast<CommonI::IRefCount*>(p->GetInterface(CommonI::IID_IRefCount))->GetRefCount(count);
    return count;
}

std::vector<std::string> Values(const RefCountPtr<IPossibleEnumValuesItr>& it) {
    std::vector<std::string> out;
    for (it->First(); !it->IsEnd(); it->Next()) {
        out.push_back(it->CurrentItem().str());
    }
    return out;
}

std::vector<std::string> Names(const IPropertyNameList& list) {
    std::vector<std::string> out;
    const auto it = list.GetNameItr();
    for (it->First(); !it->IsEnd(); it->Next()) {
        out.push_back(it->CurrentItem()->GetName().str());
    }
    return out;
}

/// Bank (visible, int) at 0 and Pin (hidden, text) at 1.
struct BankAndPin : testing::Test {
    PropertyNameList list;
    IPropertyNameList& api =
        *static_cast<IPropertyNameList*>(list.GetInterface(VnI::IID_IPropertyNameList));
    void SetUp() override {
        ASSERT_EQ(api.AddName("Bank", VnI::INT_TYPE, true), 0);
        ASSERT_EQ(api.AddName("Pin", VnI::STRING_TYPE, false), 1);
    }
    int VisibleNames() {
        VnTest::MessageCapture capture;
        list.Dump();
        const auto lines = capture.Status();
        EXPECT_EQ(lines.size(), 2u);
        int visible = -1;
        std::sscanf(lines.back().c_str(),
                    "Vn::Eng::PropertyNameList::m_imp->m_numVisibleNames = %d", &visible);
        return visible;
    }
};

std::vector<Port::StringBase<char>> kAbc{"A", "B", "C"};

} // namespace

TEST(PropertyName, ReportsWhatItWasCreatedWith) {
    const auto bank = PropertyName::CreateInstance("Bank", VnI::INT_TYPE, false);
    ASSERT_TRUE(bank);
    EXPECT_EQ(bank->GetName(), Port::StringBase<char>("Bank"));
    EXPECT_EQ(bank->GetType(), VnI::INT_TYPE);
    EXPECT_FALSE(bank->IsVisible());
    const auto bankValues = bank->GetPossibleValues();
    ASSERT_TRUE(bankValues);
    EXPECT_TRUE(bankValues->IsEnd());
    EXPECT_EQ(CountOf(bank.Get()), 1);
}

TEST(PropertyName, CopiesValuesFromWhereTheIteratorStands) {
    const auto all = PossibleEnumValuesItr::CreateInstance(&kAbc);
    const auto full = PropertyName::CreateInstance("Io", VnI::ENUM_TYPE, all, true);
    EXPECT_TRUE(all->IsEnd()) << "the caller's iterator is left at its end";
    EXPECT_EQ(Values(full->GetPossibleValues()), (std::vector<std::string>{"A", "B", "C"}));

    const auto advanced = PossibleEnumValuesItr::CreateInstance(&kAbc);
    advanced->Next();
    const auto tail = PropertyName::CreateInstance("Io", VnI::ENUM_TYPE, advanced, true);
    EXPECT_EQ(Values(tail->GetPossibleValues()), (std::vector<std::string>{"B", "C"}));

    const auto none = PropertyName::CreateInstance("Io", VnI::ENUM_TYPE, advanced, true);
    EXPECT_TRUE(none->GetPossibleValues()->IsEnd()) << "an iterator at its end gives no values";

    const auto fromNull = PropertyName::CreateInstance("Io", VnI::ENUM_TYPE,
                                                       RefCountPtr<IPossibleEnumValuesItr>(), true);
    ASSERT_TRUE(fromNull);
    EXPECT_TRUE(fromNull->GetPossibleValues()->IsEnd()) << "no iterator gives no values";
}

TEST(PropertyName, OwnsACopyOfItsValues) {
    std::vector<Port::StringBase<char>> values{"X", "Y"};
    const auto name = PropertyName::CreateInstance(
        "Io", VnI::ENUM_TYPE, PossibleEnumValuesItr::CreateInstance(&values), true);
    values.clear();
    values.emplace_back("Z");
    EXPECT_EQ(Values(name->GetPossibleValues()), (std::vector<std::string>{"X", "Y"}));
}

TEST(PropertyName, AnswersItsInterfacesAlikeFromEveryInterface) {
    const auto name = PropertyName::CreateInstance("Bank", VnI::INT_TYPE, true);
    IPropertyName* api = name.Get();
    auto* counter = api->GetInterface(CommonI::IID_IRefCount);
    ASSERT_NE(counter, nullptr);
    EXPECT_NE(static_cast<void*>(counter), static_cast<void*>(api));
    EXPECT_EQ(api->GetInterface(VnI::IID_IPropertyName), api);
    EXPECT_EQ(api->GetInterface(CitI::IID_IInterface), api);
    EXPECT_EQ(counter->GetInterface(VnI::IID_IPropertyName), api);
    EXPECT_EQ(counter->GetInterface(CommonI::IID_IRefCount), counter);
    EXPECT_EQ(api->GetInterface(VnI::IID_IProperty), nullptr);
    EXPECT_EQ(api->GetInterface(VnI::IID_IPropertyNameList), nullptr);

    RefCountPtr<IPropertyName> second;
    second = name; // one more holder
    EXPECT_EQ(CountOf(api), 2);
}

TEST_F(BankAndPin, GivesPositionsInInsertionOrderAndRejectsDuplicates) {
    EXPECT_EQ(api.GetNumNames(), 2);
    EXPECT_EQ(VisibleNames(), 1);

    EXPECT_EQ(api.AddName("Bank", VnI::STRING_TYPE, false), -1);
    EXPECT_EQ(api.GetNumNames(), 2);
    EXPECT_EQ(VisibleNames(), 1) << "a rejected name is not counted";
    ASSERT_NE(api.GetPropertyName(0), nullptr);
    EXPECT_EQ(api.GetPropertyName(0)->GetType(), VnI::INT_TYPE) << "the first name keeps its type";
    EXPECT_TRUE(api.GetPropertyName(0)->IsVisible());

    EXPECT_EQ(
        api.AddEnumName("Pin", VnI::ENUM_TYPE, PossibleEnumValuesItr::CreateInstance(&kAbc), true),
        -1);
    ASSERT_NE(api.GetPropertyName(1), nullptr);
    EXPECT_TRUE(api.GetPropertyName(1)->GetPossibleValues()->IsEnd())
        << "the first name keeps its values";

    EXPECT_EQ(
        api.AddEnumName("Io", VnI::ENUM_TYPE, PossibleEnumValuesItr::CreateInstance(&kAbc), true),
        2);
    ASSERT_NE(api.GetPropertyName(2), nullptr);
    EXPECT_EQ(Values(api.GetPropertyName(2)->GetPossibleValues()),
              (std::vector<std::string>{"A", "B", "C"}));
    EXPECT_EQ(VisibleNames(), 2);
}

TEST_F(BankAndPin, LooksNamesUpByExactText) {
    EXPECT_EQ(api.Contains("Bank"), 0);
    EXPECT_EQ(api.Contains("Pin"), 1);
    EXPECT_EQ(api.Contains("bank"), -1);
    EXPECT_EQ(api.Contains("Ban"), -1);
    EXPECT_EQ(api.Contains("Bank "), -1);
    EXPECT_EQ(api.Contains(""), -1);
    EXPECT_EQ(api.Contains(Port::StringBase<char>("Pin\0", 4)), -1) << "bytes past a NUL count";

    EXPECT_EQ(api.AddName(Port::StringBase<char>("Pin\0x", 5), VnI::INT_TYPE, true), 2);
    EXPECT_EQ(api.Contains(Port::StringBase<char>("Pin\0x", 5)), 2);
    EXPECT_EQ(api.AddName("", VnI::INT_TYPE, true), 3) << "the empty text is a name like any other";
    EXPECT_EQ(api.Contains(""), 3);
}

TEST_F(BankAndPin, LendsNamesWithoutAReference) {
    EXPECT_EQ(api.GetPropertyName(-1), nullptr);
    EXPECT_EQ(api.GetPropertyName(2), nullptr);
    IPropertyName* pin = api.GetPropertyName(1);
    ASSERT_NE(pin, nullptr);
    EXPECT_EQ(pin->GetName(), Port::StringBase<char>("Pin"));
    EXPECT_FALSE(pin->IsVisible());
    EXPECT_EQ(CountOf(pin), 1) << "only the list holds it";

    const auto it = api.GetNameItr();
    it->First();
    EXPECT_EQ(it->CurrentItem(), api.GetPropertyName(0));
    EXPECT_EQ(CountOf(it->CurrentItem()), 1);
}

TEST_F(BankAndPin, KeepsANameAliveThatACallerStillHolds) {
    RefCountPtr<IPropertyName> kept(api.GetPropertyName(0));
    EXPECT_EQ(CountOf(kept.Get()), 2);
    api.ClearList();
    EXPECT_EQ(CountOf(kept.Get()), 1);
    EXPECT_EQ(kept->GetName(), Port::StringBase<char>("Bank"));
}

TEST_F(BankAndPin, IteratesInPositionOrderAndStopsAtTheEnd) {
    const auto it = api.GetNameItr();
    EXPECT_EQ(CountOf(it.Get()), 1);
    EXPECT_EQ(it->First(), 0);
    ASSERT_FALSE(it->IsEnd());
    EXPECT_EQ(it->CurrentItem()->GetName(), Port::StringBase<char>("Bank"));
    EXPECT_EQ(it->Next(), 0);
    EXPECT_EQ(it->CurrentItem()->GetName(), Port::StringBase<char>("Pin"));
    it->Next();
    EXPECT_TRUE(it->IsEnd());
    EXPECT_EQ(it->CurrentItem(), nullptr);
    EXPECT_EQ(it->Next(), 0);
    EXPECT_TRUE(it->IsEnd()) << "Next at the end changes nothing";

    // The cursor is a position: names added while walking are reached, nothing dangles.
    api.AddName("Site", VnI::STRING_TYPE, true);
    EXPECT_FALSE(it->IsEnd());
    EXPECT_EQ(it->CurrentItem()->GetName(), Port::StringBase<char>("Site"));
    api.ClearList();
    EXPECT_TRUE(it->IsEnd());
    EXPECT_EQ(it->CurrentItem(), nullptr);
    it->First();
    EXPECT_TRUE(it->IsEnd());
}

TEST_F(BankAndPin, AppendsOnlyTheNamesItLacksAsCopies) {
    PropertyNameList other;
    auto& from = *static_cast<IPropertyNameList*>(other.GetInterface(VnI::IID_IPropertyNameList));
    from.AddName("Pin", VnI::INT_TYPE, true);
    from.AddEnumName("Site", VnI::ENUM_TYPE, PossibleEnumValuesItr::CreateInstance(&kAbc), false);

    EXPECT_EQ(api.AppendList(&from), 1);
    EXPECT_EQ(Names(api), (std::vector<std::string>{"Bank", "Pin", "Site"}));
    ASSERT_NE(api.GetPropertyName(1), nullptr);
    EXPECT_EQ(api.GetPropertyName(1)->GetType(), VnI::STRING_TYPE)
        << "a present name is skipped whatever its type";
    IPropertyName* site = api.GetPropertyName(2);
    ASSERT_NE(site, nullptr);
    EXPECT_EQ(site->GetType(), VnI::ENUM_TYPE);
    EXPECT_FALSE(site->IsVisible());
    EXPECT_EQ(Values(site->GetPossibleValues()), (std::vector<std::string>{"A", "B", "C"}));
    EXPECT_NE(site, from.GetPropertyName(1)) << "the lists share no name object";
    EXPECT_EQ(VisibleNames(), 1);

    other.ClearList();
    EXPECT_EQ(Values(site->GetPossibleValues()), (std::vector<std::string>{"A", "B", "C"}));
}

TEST_F(BankAndPin, AppendingItselfOrNothingChangesNothing) {
    EXPECT_EQ(api.AppendList(&api), 1);
    EXPECT_EQ(Names(api), (std::vector<std::string>{"Bank", "Pin"}));
    EXPECT_EQ(VisibleNames(), 1);

    PropertyNameList empty;
    EXPECT_EQ(api.AppendList(
                  static_cast<IPropertyNameList*>(empty.GetInterface(VnI::IID_IPropertyNameList))),
              1);
    EXPECT_EQ(api.AppendList(nullptr), 1);
    EXPECT_EQ(api.GetNumNames(), 2);
}

TEST_F(BankAndPin, ClearingStartsAgainAtPositionZero) {
    EXPECT_EQ(api.ClearList(), 1);
    EXPECT_EQ(api.GetNumNames(), 0);
    EXPECT_EQ(api.Contains("Bank"), -1);
    EXPECT_EQ(api.Contains("Pin"), -1);
    EXPECT_EQ(api.GetPropertyName(0), nullptr);
    EXPECT_EQ(VisibleNames(), 0);
    EXPECT_EQ(api.AddName("Pin", VnI::INT_TYPE, true), 0);
    EXPECT_EQ(api.Contains("Pin"), 0);
}

TEST_F(BankAndPin, AnswersNoCounterAndIsHeldWithoutCounting) {
    EXPECT_EQ(list.GetInterface(CommonI::IID_IRefCount), nullptr);
    EXPECT_EQ(api.GetInterface(CommonI::IID_IRefCount), nullptr);
    EXPECT_EQ(list.GetInterface(CitI::IID_IInterface), &api);
    EXPECT_EQ(api.GetInterface(VnI::IID_IPropertyNameList), &api);
    EXPECT_EQ(api.GetInterface(VnI::IID_IPropertyName), nullptr);
    {
        RefCountPtr<IPropertyNameList> held(&api); // never released: the creator owns it
    }
    EXPECT_EQ(api.GetNumNames(), 2);
}

TEST_F(BankAndPin, DumpsItsMembers) {
    VnTest::MessageCapture capture;
    list.Dump();
    ASSERT_EQ(capture.Messages().size(), 2u);
    const Port::Message names = capture.Messages()[0];
    const Port::Message visible = capture.Messages()[1];
    for (const auto* m : {&names, &visible}) {
        EXPECT_EQ(m->severity, Port::Severity::Status);
        EXPECT_EQ(m->domain, "Venlomer");
        EXPECT_EQ(m->unit, "../s/PropertyNameList");
        EXPECT_EQ(m->revision, "$Revision: 1.7 $");
    }
    EXPECT_EQ(names.line, 103);
    EXPECT_EQ(visible.line, 104);
    // The list's vector is what its iterators walk, so the iterator's dump names the
    // same address.
    const auto it = api.GetNameItr();
    static_cast<PropertyNameItr*>(it.Get())->Dump();
    ASSERT_EQ(capture.Messages().size(), 4u);
    unsigned int address = 0;
    ASSERT_EQ(std::sscanf(capture.Messages()[2].text.c_str(),
                          "Vn::Eng::PropertyNameItr::m_imp->m_propertyNames = %x", &address),
              1);
    char expected[128];
    std::snprintf(expected, sizeof expected,
                  "Vn::Eng::PropertyNameList::m_imp->names = %x, numNames = 2\n", address);
    EXPECT_EQ(names.text, expected);
    EXPECT_EQ(visible.text, "Vn::Eng::PropertyNameList::m_imp->m_numVisibleNames = 1\n");
}

TEST(PropertyNameItr, DumpsItsMembers) {
    PropertyNameList list;
    list.AddName("Bank", VnI::INT_TYPE, true);
    const auto it = list.GetNameItr();
    VnTest::MessageCapture capture;
    static_cast<PropertyNameItr*>(it.Get())->Dump();
    ASSERT_EQ(capture.Messages().size(), 2u);
    EXPECT_EQ(capture.Messages()[0].unit, "../s/PropertyNameItr");
    EXPECT_EQ(capture.Messages()[0].revision, "$Revision: 1.3 $");
    EXPECT_EQ(capture.Messages()[0].line, 116);
    EXPECT_EQ(capture.Messages()[1].line, 118);
    unsigned int names = 0;
    unsigned int cursor = 0;
    EXPECT_EQ(std::sscanf(capture.Messages()[0].text.c_str(),
                          "Vn::Eng::PropertyNameItr::m_imp->m_propertyNames = %x", &names),
              1);
    EXPECT_EQ(std::sscanf(capture.Messages()[1].text.c_str(),
                          "Vn::Eng::PropertyNameItr::m_imp->m_itr = %x", &cursor),
              1);
    EXPECT_NE(names, 0u);
    EXPECT_NE(cursor, names) << "the cursor's own address, not the vector's";

    capture.Clear();
    const auto detached = PropertyNameItr::CreateInstance(nullptr);
    static_cast<PropertyNameItr*>(detached.Get())->Dump();
    EXPECT_EQ(capture.Status().front(), "Vn::Eng::PropertyNameItr::m_imp->m_propertyNames = 0\n");
}

TEST(PropertyNameItr, WithoutAListIsAtItsEnd) {
    const auto it = PropertyNameItr::CreateInstance(nullptr);
    EXPECT_TRUE(it->IsEnd());
    it->First();
    it->Next();
    EXPECT_TRUE(it->IsEnd());
    EXPECT_EQ(it->CurrentItem(), nullptr);
}

TEST(PropertyNameItr, AnswersItselfAndItsCounter) {
    PropertyNameList list;
    const auto it = list.GetNameItr();
    IPropertyNameItr* api = it.Get();
    EXPECT_EQ(api->GetInterface(VnI::IID_IPropertyNameItr), api);
    EXPECT_EQ(api->GetInterface(CitI::IID_IInterface), api);
    auto* counter = api->GetInterface(CommonI::IID_IRefCount);
    ASSERT_NE(counter, nullptr);
    EXPECT_EQ(counter->GetInterface(VnI::IID_IPropertyNameItr), api);
    EXPECT_EQ(api->GetInterface(VnI::IID_IPossibleEnumValuesItr), nullptr);
}

TEST(PropertyNameList, ReleasesItsNamesWhenDestroyed) {
    RefCountPtr<IPropertyName> survivor;
    {
        PropertyNameList list;
        list.AddName("Bank", VnI::INT_TYPE, true);
        list.AddName("Pin", VnI::INT_TYPE, true);
        survivor = RefCountPtr<IPropertyName>(list.GetPropertyName(1));
        EXPECT_EQ(CountOf(survivor.Get()), 2);
    }
    EXPECT_EQ(CountOf(survivor.Get()), 1);
    EXPECT_EQ(survivor->GetName(), Port::StringBase<char>("Pin"));
}

TEST(PropertyNameSlots, FollowThePublishedOrder) {
    using VnTest::SlotOf;
    EXPECT_EQ(SlotOf(&IPropertyName::GetInterface), 0);
    EXPECT_EQ(SlotOf(&IPropertyName::GetName), 3);
    EXPECT_EQ(SlotOf(&IPropertyName::GetType), 4);
    EXPECT_EQ(SlotOf(&IPropertyName::GetPossibleValues), 5);
    EXPECT_EQ(SlotOf(&IPropertyName::IsVisible), 6);

    EXPECT_EQ(SlotOf(&IPropertyNameItr::GetInterface), 0);
    EXPECT_EQ(SlotOf(&IPropertyNameItr::CurrentItem), 3);
    EXPECT_EQ(SlotOf(&IPropertyNameItr::First), 4);
    EXPECT_EQ(SlotOf(&IPropertyNameItr::Next), 5);
    EXPECT_EQ(SlotOf(&IPropertyNameItr::IsEnd), 6);

    EXPECT_EQ(SlotOf(&IPropertyNameList::GetInterface), 0);
    EXPECT_EQ(SlotOf(&IPropertyNameList::GetNumNames), 3);
    EXPECT_EQ(SlotOf(&IPropertyNameList::GetNameItr), 4);
    EXPECT_EQ(SlotOf(&IPropertyNameList::Contains), 5);
    EXPECT_EQ(SlotOf(&IPropertyNameList::AddName), 6);
    EXPECT_EQ(SlotOf(&IPropertyNameList::AddEnumName), 7);
    EXPECT_EQ(SlotOf(&IPropertyNameList::AppendList), 8);
    EXPECT_EQ(SlotOf(&IPropertyNameList::ClearList), 9);
    EXPECT_EQ(SlotOf(&IPropertyNameList::GetPropertyName), 10);

    // The public objects' own virtual operations: IsVisible before the destructor.
    EXPECT_EQ(SlotOf(&PropertyName::IsVisible), 0);
    EXPECT_EQ(SlotOf(&PropertyName::GetInterface), -1) << "not virtual on the public object";
    EXPECT_EQ(SlotOf(&PropertyNameList::GetNumNames), -1);
    EXPECT_EQ(SlotOf(&PropertyNameItr::CurrentItem), 3);
}

// A list makes its name objects only when one is first asked for; whatever the order of
// adding and asking, each name must then report what it was added with.
TEST(PropertyNameList, NamesMadeOnRequestReportWhatTheyWereAddedWith) {
    const auto odd = static_cast<VnI::PropertyType>(200); // beyond the packed byte
    const auto negative = static_cast<VnI::PropertyType>(-1);
    for (bool askEarly : {false, true}) {
        SCOPED_TRACE(askEarly);
        PropertyNameList list;
        auto& api = *static_cast<IPropertyNameList*>(list.GetInterface(VnI::IID_IPropertyNameList));
        ASSERT_EQ(api.AddName("Bank", VnI::INT_TYPE, false), 0);
        ASSERT_EQ(api.AddName(Port::StringBase<char>("N\0ul", 4), VnI::COLOR_TYPE, true), 1);
        RefCountPtr<IPropertyNameItr> early;
        if (askEarly) {
            early = api.GetNameItr(); // handed out before the rest are added
        }
        ASSERT_EQ(api.AddName("Odd", odd, true), 2);
        ASSERT_EQ(api.AddName("Negative", negative, false), 3);
        ASSERT_EQ(api.AddEnumName("Site", VnI::ENUM_TYPE,
                                  PossibleEnumValuesItr::CreateInstance(&kAbc), true),
                  4);
        ASSERT_EQ(api.AddEnumName("NoValues", VnI::ENUM_TYPE, RefCountPtr<IPossibleEnumValuesItr>(),
                                  false),
                  5);
        ASSERT_EQ(api.AddName("Last", VnI::DOUBLE_TYPE, true), 6);

        const std::vector<std::string> texts{
            "Bank", std::string("N\0ul", 4), "Odd", "Negative", "Site", "NoValues", "Last"};
        const std::vector<VnI::PropertyType> types{VnI::INT_TYPE,   VnI::COLOR_TYPE, odd,
                                                   negative,        VnI::ENUM_TYPE,  VnI::ENUM_TYPE,
                                                   VnI::DOUBLE_TYPE};
        const std::vector<bool> visible{false, true, true, false, true, false, true};
        ASSERT_EQ(api.GetNumNames(), 7);
        for (int i = 0; i < 7; ++i) {
            IPropertyName* name = api.GetPropertyName(i);
            ASSERT_NE(name, nullptr) << i;
            EXPECT_EQ(name->GetName().view(), texts[static_cast<std::size_t>(i)]) << i;
            EXPECT_EQ(name->GetType(), types[static_cast<std::size_t>(i)]) << i;
            EXPECT_EQ(name->IsVisible(), visible[static_cast<std::size_t>(i)]) << i;
            EXPECT_EQ(name->GetPossibleValues()->IsEnd(), i != 4) << i;
            EXPECT_EQ(api.GetPropertyName(i), name) << "made once, lent again";
        }
        EXPECT_EQ(Values(api.GetPropertyName(4)->GetPossibleValues()),
                  (std::vector<std::string>{"A", "B", "C"}));
        if (early) {
            int seen = 0;
            for (early->First(); !early->IsEnd(); early->Next()) {
                EXPECT_EQ(early->CurrentItem(), api.GetPropertyName(seen)) << seen;
                ++seen;
            }
            EXPECT_EQ(seen, 7) << "names added after the iterator are reached";
        }

        // Appending into a list that has made no names yet copies every one faithfully,
        // and the clear keeps the early iterator on the list's (now empty) names.
        PropertyNameList copy;
        auto& to = *static_cast<IPropertyNameList*>(copy.GetInterface(VnI::IID_IPropertyNameList));
        ASSERT_EQ(to.AddName("Other", VnI::BOOL_TYPE, true), 0);
        ASSERT_EQ(to.AppendList(&api), 1);
        ASSERT_EQ(to.GetNumNames(), 8);
        for (int i = 0; i < 7; ++i) {
            IPropertyName* name = to.GetPropertyName(i + 1);
            EXPECT_EQ(name->GetName().view(), texts[static_cast<std::size_t>(i)]) << i;
            EXPECT_EQ(name->GetType(), types[static_cast<std::size_t>(i)]) << i;
            EXPECT_EQ(name->IsVisible(), visible[static_cast<std::size_t>(i)]) << i;
            EXPECT_EQ(to.Contains(name->GetName()), i + 1) << i;
        }
        EXPECT_EQ(Values(to.GetPropertyName(5)->GetPossibleValues()),
                  (std::vector<std::string>{"A", "B", "C"}));
        EXPECT_EQ(api.ClearList(), 1);
        if (early) {
            early->First();
            EXPECT_TRUE(early->IsEnd());
            ASSERT_EQ(api.AddName("Again", VnI::INT_TYPE, true), 0);
            early->First();
            ASSERT_FALSE(early->IsEnd());
            EXPECT_EQ(early->CurrentItem()->GetName(), Port::StringBase<char>("Again"));
        }
    }
}
