//===-- tests/LastBuiltTest.cpp - the last-built value is rebuilt only for a new key -===//
#include "Port/LastBuilt.h"

#include <gtest/gtest.h>

#include <stdexcept>
#include <string>
#include <thread>

namespace {

// Counts the builds, and hands out values that tell them apart.
struct Builder {
    int builds = 0;
    std::string operator()() { return "built " + std::to_string(++builds); }
};

TEST(LastBuilt, BuildsOnceForTheSameTextAndOptions) {
    Port::LastBuilt<std::string> last;
    Builder build;
    EXPECT_EQ(last.Get("a.*", 0, build), "built 1");
    EXPECT_EQ(last.Get(std::string("a.*"), 0, build), "built 1");
    EXPECT_EQ(build.builds, 1);
}

TEST(LastBuilt, BuildsAgainWhenTheTextOrTheOptionsChange) {
    Port::LastBuilt<std::string> last;
    Builder build;
    last.Get("a", 0, build);
    EXPECT_EQ(last.Get("a", 1, build), "built 2") << "same text, other options";
    EXPECT_EQ(last.Get("b", 1, build), "built 3") << "same options, other text";
    EXPECT_EQ(last.Get("ab", 1, build), "built 4") << "a longer text with the old as prefix";
    EXPECT_EQ(last.Get("a", 1, build), "built 5") << "only the last one is kept";
    // The empty text is a text like any other, not "nothing built yet".
    EXPECT_EQ(last.Get("", 0, build), "built 6");
    EXPECT_EQ(last.Get("", 0, build), "built 6");
}

TEST(LastBuilt, AFailedBuildLeavesNothingBehind) {
    Port::LastBuilt<std::string> last;
    Builder build;
    last.Get("a", 0, build);
    EXPECT_THROW(last.Get("b", 0, []() -> std::string { throw std::runtime_error("no"); }),
                 std::runtime_error);
    // Neither the value of "a" under the key of "b", nor the value of "a" kept as if
    // nothing had happened: the next call builds.
    EXPECT_EQ(last.Get("b", 0, build), "built 2");
    EXPECT_EQ(last.Get("a", 0, build), "built 3");
}

TEST(LastBuilt, EachThreadKeepsItsOwn) {
    // The way callers hold it: one thread_local per call site.
    static auto get = [](const char* text, int& builds) -> std::string {
        thread_local Port::LastBuilt<std::string> last;
        return last.Get(text, 0, [&] {
            ++builds;
            return std::string(text);
        });
    };
    int mainBuilds = 0;
    EXPECT_EQ(get("main", mainBuilds), "main");
    int otherBuilds = 0;
    std::string seen;
    std::thread other([&] {
        seen = get("other", otherBuilds);
        seen += get("other", otherBuilds);
    });
    other.join();
    EXPECT_EQ(seen, "otherother");
    EXPECT_EQ(otherBuilds, 1);
    // The other thread's pattern did not replace this thread's.
    EXPECT_EQ(get("main", mainBuilds), "main");
    EXPECT_EQ(mainBuilds, 1);
}

} // namespace
