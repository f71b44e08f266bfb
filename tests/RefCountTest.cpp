//===-- tests/RefCountTest.cpp - counts are atomic; the last release destroys once -===//
#include "CommonI/RefCountPtr.h"
#include "CommonI/TRefCountHelper.h"
#include "VnI/IStringContainer.h"
#include "s/CStringContainer.h"

#include <gtest/gtest.h>

#include <thread>
#include <vector>

namespace {

// A self-counted object that tells how often it was destroyed.
class Probe final : public CommonI::TRefCountHelperBase<Probe, 0> {
public:
    explicit Probe(int* destroyed) : m_destroyed(destroyed) {}
    ~Probe() override { ++*m_destroyed; }
    CitI::IInterface* GetInterface(const Port::XUID& id) override {
        return id == CommonI::IID_IRefCount || id == CitI::IID_IInterface ? this : nullptr;
    }

private:
    int* m_destroyed;
};

// A shape-3 owner: its record holds the counter object, whose last Release deletes the
// owner, whose destructor frees the record (and the counter with it).
class RecordOwner {
public:
    explicit RecordOwner(int* destroyed) : m_record(new Record{this}), m_destroyed(destroyed) {}
    ~RecordOwner() {
        delete m_record;
        ++*m_destroyed;
    }
    CitI::IInterface* GetInterface(const Port::XUID& id) {
        return id == CommonI::IID_IRefCount || id == CitI::IID_IInterface ? &m_record->counter
                                                                          : nullptr;
    }
    CommonI::IRefCount* Counter() { return &m_record->counter; }

private:
    struct Record {
        explicit Record(RecordOwner* owner) : counter(owner) {}
        CommonI::TRefCountHelper<RecordOwner, 0> counter;
    };
    Record* m_record;
    int* m_destroyed;
};

int CountOf(CitI::IInterface* p) {
    int count = -1;
    static_cast<CommonI::IRefCount*>(p->GetInterface(CommonI::IID_IRefCount))->GetRefCount(count);
    return count;
}

} // namespace

TEST(RefCounting, ConcurrentAddRefReleasePairsLeaveTheCountAndDestroyOnce) {
    int destroyed = 0;
    auto* probe = new Probe(&destroyed);
    std::vector<std::thread> threads;
    threads.reserve(8);
    for (int t = 0; t < 8; ++t) {
        threads.emplace_back([probe] {
            for (int i = 0; i < 100000; ++i) {
                probe->AddRef();
                probe->Release();
            }
        });
    }
    for (auto& thread : threads) {
        thread.join();
    }
    EXPECT_EQ(CountOf(probe), 1);
    EXPECT_EQ(destroyed, 0);
    probe->Release();
    EXPECT_EQ(destroyed, 1);
}

TEST(RefCounting, CountedPointerAddsOnCopyAndDropsOnReset) {
    int destroyed = 0;
    auto adopted = CommonI::RefCountPtr<CitI::IInterface>::Adopt(new Probe(&destroyed));
    EXPECT_EQ(CountOf(adopted.Get()), 1);
    {
        CommonI::RefCountPtr<CitI::IInterface> copy = adopted;
        EXPECT_EQ(CountOf(adopted.Get()), 2);
        CommonI::RefCountPtr<CitI::IInterface> fromRaw(adopted.Get());
        EXPECT_EQ(CountOf(adopted.Get()), 3);
        CommonI::RefCountPtr<CitI::IInterface> moved = std::move(copy);
        EXPECT_FALSE(copy); // NOLINT(bugprone-use-after-move): a moved-from pointer is empty
        EXPECT_EQ(CountOf(adopted.Get()), 3);
    }
    EXPECT_EQ(CountOf(adopted.Get()), 1);
    auto& same = adopted; // through an alias, as self-assignment happens in real code
    adopted = same;       // self-assignment keeps the reference
    EXPECT_EQ(CountOf(adopted.Get()), 1);
    adopted.Reset();
    EXPECT_FALSE(adopted);
    EXPECT_EQ(destroyed, 1);
}

TEST(RefCounting, CreateInstanceGivesCountOneThroughAnyInterface) {
    auto container = Vn::Eng::CStringContainer::CreateInstance();
    ASSERT_TRUE(container);
    EXPECT_EQ(CountOf(container.Get()), 1);
    CitI::IInterface* iterator = container->GetInterface(VnI::IID_IStringIterator);
    EXPECT_EQ(CountOf(iterator), 1);
    container->AddString("x"); // the count is the object's, not the interface's
    static_cast<CommonI::IRefCount*>(iterator->GetInterface(CommonI::IID_IRefCount))->AddRef();
    EXPECT_EQ(CountOf(container.Get()), 2);
    static_cast<CommonI::IRefCount*>(iterator->GetInterface(CommonI::IID_IRefCount))->Release();
    EXPECT_EQ(CountOf(container.Get()), 1);
}

TEST(RefCounting, TheRecordCounterDestroysItsOwnerOnceOnTheLastReleaseFromAnyThread) {
    int destroyed = 0;
    auto* owner = new RecordOwner(&destroyed);
    CommonI::IRefCount* counter = owner->Counter();
    EXPECT_EQ(counter->GetInterface(CommonI::IID_IRefCount), counter);
    EXPECT_EQ(counter->GetInterface(CitI::IID_IInterface), counter) << "asked of the owner";
    for (int i = 0; i < 7; ++i) {
        counter->AddRef();
    }
    std::vector<std::thread> threads;
    threads.reserve(8);
    for (int t = 0; t < 8; ++t) {
        threads.emplace_back([counter] { counter->Release(); });
    }
    for (auto& thread : threads) {
        thread.join();
    }
    EXPECT_EQ(destroyed, 1) << "eight releases of eight references: destroyed exactly once";
}

TEST(RefCounting, DroppingTheLastPointerOfAStringContainerDestroysIt) {
    // The container's own destructor frees its record; under the sanitizer build a
    // missed destruction is a leak and a double one a use after free.
    auto container = Vn::Eng::CStringContainer::CreateInstance();
    container->AddString("kept alive only by the pointer");
    CommonI::RefCountPtr<VnI::IStringIterator> it;
    container->GetStringIterator(it);
    container.Reset();
    it->First();
    EXPECT_EQ(it->CurrentItem(), Port::StringBase<char>("kept alive only by the pointer"))
        << "the iterator's reference keeps the object";
    it.Reset();
}
