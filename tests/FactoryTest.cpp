//===-- tests/FactoryTest.cpp - components load by name, once, and make objects by id -===//
#include "CitP/Factory.h"
#include "Port/StringBase.h"

#include <gtest/gtest.h>

#include <dlfcn.h>

#include <atomic>
#include <string>
#include <thread>
#include <vector>

namespace {
constexpr Port::XUID kTestClassId{0x1111222233334444ull, 0x5555666677778888ull};

int AliveInTestComponent() {
    const std::string path = CitP::Factory::LoadedPath("venlomer_test_component");
    void* handle = ::dlopen(path.c_str(), RTLD_NOW | RTLD_NOLOAD);
    EXPECT_NE(handle, nullptr);
    auto alive = reinterpret_cast<int (*)()>(::dlsym(handle, "TestComponent_Alive"));
    const int n = alive != nullptr ? alive() : -1;
    ::dlclose(handle); // drops only the NOLOAD reference
    return n;
}
} // namespace

TEST(ComponentFactory, LoadsAComponentByNameAndCreatesByClassId) {
    ASSERT_TRUE(CitP::Factory::LoadLibraryFactory("venlomer_test_component"));
    EXPECT_TRUE(CitP::Factory::LoadLibraryFactory("venlomer_test_component")) << "second load";
    const int before = AliveInTestComponent();

    CitI::IInterface* raw = CitP::Factory::CreateInstance(kTestClassId);
    ASSERT_NE(raw, nullptr);
    EXPECT_EQ(AliveInTestComponent(), before + 1);
    auto* counter = static_cast<CommonI::IRefCount*>(raw->GetInterface(CommonI::IID_IRefCount));
    int count = 0;
    counter->GetRefCount(count);
    EXPECT_EQ(count, 1);
    counter->Release();
    EXPECT_EQ(AliveInTestComponent(), before);

    {
        auto held = CitP::Factory::CreateInstanceRef(kTestClassId);
        ASSERT_TRUE(held);
        auto* c = static_cast<CommonI::IRefCount*>(held->GetInterface(CommonI::IID_IRefCount));
        c->GetRefCount(count);
        EXPECT_EQ(count, 1) << "the counted pointer adopts the initial reference";
    }
    EXPECT_EQ(AliveInTestComponent(), before);
}

TEST(ComponentFactory, RefusesUnknownNamesAndIds) {
    EXPECT_FALSE(CitP::Factory::LoadLibraryFactory("no_such_component_anywhere"));
    EXPECT_FALSE(CitP::Factory::LoadLibraryFactory(""));
    EXPECT_FALSE(CitP::Factory::LoadLibraryFactory(Port::StringBase<char>("a\0b", 3)));
    EXPECT_EQ(CitP::Factory::CreateInstance(Port::XUID(9, 9)), nullptr);
    EXPECT_FALSE(CitP::Factory::CreateInstanceRef(Port::XUID(9, 9)));
}

TEST(ComponentFactory, FindsComponentsThroughTheSearchPathVariable) {
    const std::string path = [] {
        CitP::Factory::LoadLibraryFactory("venlomer_test_component");
        return CitP::Factory::LoadedPath("venlomer_test_component");
    }();
    ASSERT_FALSE(path.empty());
    const std::string dir = path.substr(0, path.rfind('/'));
    // A path given with a slash is taken as it is.
    EXPECT_TRUE(CitP::Factory::LoadLibraryFactory(Port::StringBase<char>(path.c_str())));
    ::setenv("VENLOMER_COMPONENT_PATH", ("/nonexistent:" + dir).c_str(), 1);
    EXPECT_TRUE(CitP::Factory::LoadLibraryFactory("libvenlomer_test_component.so"));
    ::unsetenv("VENLOMER_COMPONENT_PATH");
}

namespace {
constexpr Port::XUID kSlowClassId{0x5105105105105105ull, 0x0123456789abcdefull};
constexpr Port::XUID kFlakyClassId{0xf1a4f1a4f1a4f1a4ull, 0x0123456789abcdefull};

int InitsOf(const char* component) {
    const std::string path = CitP::Factory::LoadedPath(component);
    void* handle = ::dlopen(path.c_str(), RTLD_NOW | RTLD_NOLOAD);
    EXPECT_NE(handle, nullptr) << component;
    auto inits = reinterpret_cast<int (*)()>(::dlsym(handle, "SlowComponent_Inits"));
    const int n = inits != nullptr ? inits() : -1;
    ::dlclose(handle);
    return n;
}
} // namespace

TEST(ComponentFactory, ConcurrentLoadsOfOneNameWaitForItsInit) {
    // The init takes a while: every thread asks while it runs, and none may be told
    // "loaded" before the component's classes are there to create.
    constexpr int kThreads = 8;
    std::atomic<int> ready{0};
    std::atomic<int> loaded{0};
    std::atomic<int> created{0};
    std::vector<std::thread> threads;
    threads.reserve(kThreads);
    for (int i = 0; i < kThreads; ++i) {
        threads.emplace_back([&] {
            ++ready;
            while (ready.load() < kThreads) {
                std::this_thread::yield();
            }
            if (CitP::Factory::LoadLibraryFactory("venlomer_test_slow_component")) {
                ++loaded;
                if (CitP::Factory::CreateInstanceRef(kSlowClassId)) {
                    ++created;
                }
            }
        });
    }
    for (auto& t : threads) {
        t.join();
    }
    EXPECT_EQ(loaded.load(), kThreads);
    EXPECT_EQ(created.load(), kThreads) << "a load answered true before the init registered";
    EXPECT_EQ(InitsOf("venlomer_test_slow_component"), 1) << "the init runs once";
}

TEST(ComponentFactory, AFailedInitLeavesTheNameUnloadedAndALaterLoadRetries) {
    constexpr const char* kName = "venlomer_test_flaky_component";
    EXPECT_FALSE(CitP::Factory::LoadLibraryFactory(kName)) << "the first init throws";
    EXPECT_TRUE(CitP::Factory::LoadedPath(kName).empty());
    EXPECT_EQ(CitP::Factory::CreateInstance(kFlakyClassId), nullptr);

    // Two threads ask again: one runs the second init, the other waits for it; both
    // find the class registered.
    std::atomic<int> created{0};
    auto load = [&] {
        if (CitP::Factory::LoadLibraryFactory(kName) &&
            CitP::Factory::CreateInstanceRef(kFlakyClassId)) {
            ++created;
        }
    };
    std::thread other(load);
    load();
    other.join();
    EXPECT_EQ(created.load(), 2);
    EXPECT_FALSE(CitP::Factory::LoadedPath(kName).empty());
    EXPECT_EQ(InitsOf(kName), 2) << "a loaded component is not initialised again";
}
