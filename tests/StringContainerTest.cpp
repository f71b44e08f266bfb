//===-- tests/StringContainerTest.cpp - the string container keeps texts whole, in order -===//
#include "MessageCapture.h"
#include "Slots.h"

#include "s/CStringContainer.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

extern "C" void InstFactoryEntry();

using CommonI::RefCountPtr;
using Vn::Eng::CStringContainer;
using VnI::IStringContainer;
using VnI::IStringIterator;

namespace {

int CountOf(CitI::IInterface* p) {
    int count = -1;
    static_cast<CommonI::IRefCount*>(p->GetInterface(CommonI::IID_IRefCount))->GetRefCount(count);
    return count;
}

std::vector<std::string> Walk(IStringIterator* it) {
    std::vector<std::string> out;
    for (it->First(); !it->IsEnd(); it->Next()) {
        out.push_back(it->CurrentItem().str());
    }
    return out;
}

struct Filled {
    RefCountPtr<IStringContainer> container = CStringContainer::CreateInstance();
    RefCountPtr<IStringIterator> it;
    explicit Filled(std::initializer_list<const char*> texts) {
        for (const char* t : texts) {
            container->AddString(t);
        }
        container->GetStringIterator(it);
    }
};

} // namespace

TEST(StringContainer, StartsEmptyAndAtItsEnd) {
    Filled f{};
    EXPECT_EQ(f.container->GetNumStrings(), 0);
    f.it->First();
    EXPECT_TRUE(f.it->IsEnd());
    EXPECT_EQ(f.it->CurrentItem(), Port::StringBase<char>());
}

TEST(StringContainer, KeepsDuplicatesInOrderAndRemovesTheFirstEqualText) {
    Filled f{"A", "B", "A"};
    EXPECT_EQ(f.container->GetNumStrings(), 3);
    EXPECT_EQ(Walk(f.it.Get()), (std::vector<std::string>{"A", "B", "A"}));

    f.it->First();
    f.it->Next();
    f.it->Next(); // on the second A
    f.container->RemoveString(f.it);
    EXPECT_EQ(Walk(f.it.Get()), (std::vector<std::string>{"B", "A"}));

    f.container->AddString("Z");
    RefCountPtr<IStringIterator> absent;
    {
        Filled other{"nothere"};
        other.it->First();
        absent = other.it;
    }
    f.container->RemoveString(absent);
    EXPECT_EQ(f.container->GetNumStrings(), 3) << "a text it does not hold removes nothing";
    f.container->RemoveString(RefCountPtr<IStringIterator>());
    EXPECT_EQ(f.container->GetNumStrings(), 3) << "a null iterator removes nothing";
}

TEST(StringContainer, TextsWithNulBytesAreKeptWhole) {
    Filled f{};
    f.container->AddString(Port::StringBase<char>("a\0b", 3));
    f.it->First();
    EXPECT_EQ(f.it->CurrentItem().GetLength(), 3u);
}

TEST(StringContainer, AllIteratorsShareOneCursor) {
    Filled f{"A", "B"};
    RefCountPtr<IStringIterator> second;
    const int before = CountOf(f.container.Get());
    f.container->GetStringIterator(second);
    EXPECT_EQ(second.Get(), f.it.Get());
    EXPECT_EQ(CountOf(f.container.Get()), before + 1);
    f.it->First();
    second->Next();
    EXPECT_EQ(f.it->CurrentItem(), Port::StringBase<char>("B"));
}

TEST(StringContainer, ClearEmptiesAndACursorPastTheEndReadsAsEnd) {
    Filled f{"A", "B", "C"};
    f.it->First();
    f.it->Next();
    f.it->Next();
    f.container->ClearStrings();
    EXPECT_EQ(f.container->GetNumStrings(), 0);
    EXPECT_TRUE(f.it->IsEnd());
    f.it->Next();
    EXPECT_TRUE(f.it->IsEnd());
}

TEST(StringContainer, AnswersItsInterfacesFromEveryInterface) {
    Filled f{};
    CitI::IInterface* asContainer = f.container->GetInterface(VnI::IID_IStringContainer);
    CitI::IInterface* asIterator = f.container->GetInterface(VnI::IID_IStringIterator);
    CitI::IInterface* asCounter = f.container->GetInterface(CommonI::IID_IRefCount);
    CitI::IInterface* asBase = f.container->GetInterface(CitI::IID_IInterface);
    EXPECT_EQ(asContainer, f.container.Get());
    EXPECT_EQ(asIterator, f.it.Get());
    EXPECT_EQ(asBase, asCounter) << "CitI::IInterface is the counter object";
    EXPECT_NE(asCounter, asContainer);
    for (CitI::IInterface* from : {asContainer, asIterator, asCounter}) {
        EXPECT_EQ(from->GetInterface(VnI::IID_IStringContainer), asContainer);
        EXPECT_EQ(from->GetInterface(VnI::IID_IStringIterator), asIterator);
        EXPECT_EQ(from->GetInterface(CommonI::IID_IRefCount), asCounter);
        EXPECT_EQ(from->GetInterface(VnI::IID_IProperty), nullptr);
    }
}

TEST(StringContainer, DumpIssuesItsFiveLinesFromItsUnit) {
    VnTest::MessageCapture capture;
    CStringContainer container;
    container.Dump();
    ASSERT_EQ(capture.Messages().size(), 5u);
    const int lines[] = {263, 264, 265, 267, 269};
    const char* members[] = {"m_vec", "m_iter", "m_xIRefCount", "m_xIStringContainer",
                             "m_xIStringIterator"};
    for (size_t i = 0; i < 5; ++i) {
        const Port::Message& m = capture.Messages()[i];
        EXPECT_EQ(m.severity, Port::Severity::Status);
        EXPECT_EQ(m.domain, "Venlomer");
        EXPECT_EQ(m.unit, "../s/CStringContainer");
        EXPECT_EQ(m.revision, "$Revision: 1.3 $");
        EXPECT_EQ(m.line, lines[i]);
        const std::string prefix = std::string("CStringContainer::m_pImpl->") + members[i] + " = ";
        EXPECT_EQ(m.text.rfind(prefix, 0), 0u) << m.text;
        EXPECT_EQ(m.text.back(), '\n');
    }
}

TEST(StringContainer, SlotOrderIsTheContract) {
    using VnTest::SlotOf;
    EXPECT_EQ(SlotOf(&IStringContainer::GetInterface), 0);
    EXPECT_EQ(SlotOf(&IStringContainer::AddString), 3);
    EXPECT_EQ(SlotOf(&IStringContainer::RemoveString), 4);
    EXPECT_EQ(SlotOf(&IStringContainer::GetStringIterator), 5);
    EXPECT_EQ(SlotOf(&IStringContainer::GetNumStrings), 6);
    EXPECT_EQ(SlotOf(&IStringContainer::ClearStrings), 7);
    EXPECT_EQ(SlotOf(&IStringIterator::CurrentItem), 3);
    EXPECT_EQ(SlotOf(&IStringIterator::First), 4);
    EXPECT_EQ(SlotOf(&IStringIterator::Next), 5);
    EXPECT_EQ(SlotOf(&IStringIterator::IsEnd), 6);
    EXPECT_EQ(SlotOf(&CommonI::IRefCount::AddRef), 3);
    EXPECT_EQ(SlotOf(&CommonI::IRefCount::Release), 4);
    EXPECT_EQ(SlotOf(&CommonI::IRefCount::GetRefCount), 5);
}

TEST(LibraryEntry, InstFactoryEntryCanBeCalledAnyNumberOfTimes) {
    VnTest::MessageCapture capture;
    for (int i = 0; i < 3; ++i) {
        InstFactoryEntry();
    }
    EXPECT_TRUE(capture.Messages().empty());
}
