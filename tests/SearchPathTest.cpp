//===-- tests/SearchPathTest.cpp - search paths split into folders, empty ones left out -===//
#include "Port/SearchPath.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstdlib>

namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

TEST(SearchPath, FoldersComeInTheOrderWritten) {
    EXPECT_THAT(Port::SplitSearchPath("/b:/a:rel/dir"), ElementsAre("/b", "/a", "rel/dir"));
    EXPECT_THAT(Port::SplitSearchPath("/only"), ElementsAre("/only"));
    // Nothing but the colon separates: blanks and other punctuation are part of a name.
    EXPECT_THAT(Port::SplitSearchPath(" a b :c;d"), ElementsAre(" a b ", "c;d"));
}

TEST(SearchPath, EmptyElementsNameNoFolder) {
    // Each of these would otherwise add "" to the search, which one reader takes for the
    // current folder and another, prefixed to "/name", for the filesystem root.
    EXPECT_THAT(Port::SplitSearchPath(""), IsEmpty());
    EXPECT_THAT(Port::SplitSearchPath(":"), IsEmpty());
    EXPECT_THAT(Port::SplitSearchPath(":::"), IsEmpty());
    EXPECT_THAT(Port::SplitSearchPath(":/a::/b:"), ElementsAre("/a", "/b"));
}

TEST(SearchPath, AnUnsetVariableIsAnEmptySearch) {
    ::unsetenv("VENLOMER_TEST_SEARCH_PATH");
    EXPECT_THAT(Port::SearchPathFromEnv("VENLOMER_TEST_SEARCH_PATH"), IsEmpty());
    ::setenv("VENLOMER_TEST_SEARCH_PATH", "/x::/y", 1);
    EXPECT_THAT(Port::SearchPathFromEnv("VENLOMER_TEST_SEARCH_PATH"), ElementsAre("/x", "/y"));
    ::unsetenv("VENLOMER_TEST_SEARCH_PATH");
}

} // namespace
