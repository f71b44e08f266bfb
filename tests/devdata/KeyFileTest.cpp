//===-- tests/devdata/KeyFileTest.cpp - key files read exactly, or rejected whole by line -===//
#include "MessageCapture.h"
#include "TempFiles.h"

#include "devdata/PM_DEVKEY.h"
#include "devdata/PM_PIC.h"

#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <utility>
#include <vector>

namespace {

const char kEntry = ':';
const char kField = ',';

// The reader as the colour manager drives it: ':' between entries, ',' between fields.
struct Reader {
    explicit Reader(const std::string& path, unsigned char required = 0, unsigned char search = 1,
                    unsigned char report = 1)
        : part(nullptr, nullptr, nullptr), keys(path.c_str(), &part, required, search, report) {}

    short Count(const char* key) const { return keys.GetMaxIndex(key, kEntry, kField).first; }
    int At(const char* key, short entry, short field) {
        return keys.GetInt32ByKey(key, &kEntry, entry, &kField, field);
    }
    std::vector<int> Entry(const char* key, short entry) {
        return {At(key, entry, 0), At(key, entry, 1), At(key, entry, 2)};
    }

    PM_PIC part;
    PM_DEVKEY keys;
};

class KeyFile : public ::testing::Test {
protected:
    std::string Write(std::string_view text) { return m_dir.Write("keys.acd", text); }
    VnTest::TempDir m_dir;
};

TEST_F(KeyFile, ReadsEntriesAndFieldsAroundCommentsBlanksAndSpaces) {
    Reader r(Write("# a scheme\n"
                   "\n"
                   "   \t\n"
                   "TILE_COLOR = 10,20,30   # trailing comment\n"
                   "\tLIST=1,2,3:4,5,6 : 7 , 8 , 9\r\n"
                   "TIGHT=11,12,13\n"
                   "LAST = 40,41,42")); // no newline at the end
    ASSERT_EQ(r.keys.get_validity(), 1);
    EXPECT_EQ(r.Entry("TILE_COLOR", 0), (std::vector<int>{10, 20, 30}));
    EXPECT_EQ(r.keys.GetMaxIndex("LIST", kEntry, kField), (std::pair<short, short>{3, 3}));
    EXPECT_EQ(r.Entry("LIST", 0), (std::vector<int>{1, 2, 3}));
    EXPECT_EQ(r.Entry("LIST", 2), (std::vector<int>{7, 8, 9}));
    EXPECT_EQ(r.Entry("TIGHT", 0), (std::vector<int>{11, 12, 13}));
    EXPECT_EQ(r.Entry("LAST", 0), (std::vector<int>{40, 41, 42}));
}

TEST_F(KeyFile, TakesCrLfAndCrCrLfAsLineEndsAlike) {
    for (const char* end : {"\r", "\n", "\r\n"}) {
        SCOPED_TRACE(testing::PrintToString(std::string(end)));
        const std::string e(end);
        Reader r(Write("# a scheme saved by some editor" + e + "A = 1,2,3" + e + e + "B = 4" + e));
        ASSERT_EQ(r.keys.get_validity(), 1);
        EXPECT_EQ(r.Entry("A", 0), (std::vector<int>{1, 2, 3}));
        EXPECT_EQ(r.Entry("B", 0), (std::vector<int>{4, 0, 0}));
    }
    // Mixed ends count one line each, so a message names the right line.
    VnTest::MessageCapture capture;
    Reader bad(Write("A = 1\rB = 2\r\nC = 3\n\rD = x\n"));
    EXPECT_EQ(bad.keys.get_validity(), 0);
    ASSERT_EQ(capture.Errors().size(), 1u);
    EXPECT_NE(capture.Errors()[0].find("line 5:"), std::string::npos) << capture.Errors()[0];
}

TEST_F(KeyFile, KeepsNegativeLargeAndZeroPaddedValuesExactly) {
    Reader r(Write("V = -1, 2147483647, -2147483648 : 300, 007, -0\n"));
    ASSERT_EQ(r.keys.get_validity(), 1);
    EXPECT_EQ(r.Entry("V", 0), (std::vector<int>{-1, 2147483647, -2147483647 - 1}));
    EXPECT_EQ(r.Entry("V", 1), (std::vector<int>{300, 7, 0}));
}

TEST_F(KeyFile, AnswersZeroForWhatIsNotThere) {
    Reader r(Write("LIST = 1,2,3 : 4\nEMPTY =\n"));
    ASSERT_EQ(r.keys.get_validity(), 1);
    EXPECT_EQ(r.keys.GetMaxIndex("ABSENT", kEntry, kField), (std::pair<short, short>{0, 0}));
    EXPECT_EQ(r.keys.GetMaxIndex("EMPTY", kEntry, kField), (std::pair<short, short>{0, 0}));
    EXPECT_EQ(r.keys.GetMaxIndex(nullptr, kEntry, kField), (std::pair<short, short>{0, 0}));
    EXPECT_EQ(r.At("ABSENT", 0, 0), 0);
    EXPECT_EQ(r.At("EMPTY", 0, 0), 0);
    EXPECT_EQ(r.At("LIST", 1, 1), 0) << "entry 1 has one field";
    EXPECT_EQ(r.At("LIST", 2, 0), 0) << "there are two entries";
    EXPECT_EQ(r.At("LIST", -1, 0), 0);
    EXPECT_EQ(r.At("LIST", 0, -1), 0);
    EXPECT_EQ(r.keys.GetInt32ByKey(nullptr, &kEntry, 0, &kField, 0), 0);
    EXPECT_EQ(r.keys.GetInt32ByKey("LIST", nullptr, 0, &kField, 0), 0);
    EXPECT_EQ(r.keys.GetInt32ByKey("LIST", &kEntry, 0, nullptr, 0), 0);
    EXPECT_EQ(r.keys.GetMaxIndex("LIST", kEntry, kField), (std::pair<short, short>{2, 3}))
        << "the second member is the widest entry";
}

TEST_F(KeyFile, ComparesKeysExactly) {
    Reader r(Write("TILE = 1\nTile = 2\n"));
    ASSERT_EQ(r.keys.get_validity(), 1);
    EXPECT_EQ(r.At("TILE", 0, 0), 1);
    EXPECT_EQ(r.At("Tile", 0, 0), 2);
    EXPECT_EQ(r.At("tile", 0, 0), 0);
    EXPECT_EQ(r.At("TILE ", 0, 0), 0);
}

TEST_F(KeyFile, SplitsByTheSeparatorsEachReadAsksFor) {
    Reader r(Write("V = 1,2;3,4\n"));
    const char comma = ',', semicolon = ';', colon = ':';
    // Alternating separator pairs on one key must never reuse the other pair's split.
    EXPECT_EQ(r.keys.GetMaxIndex("V", ';', ',').first, 2);
    EXPECT_EQ(r.keys.GetInt32ByKey("V", &semicolon, 1, &comma, 0), 3);
    EXPECT_EQ(r.keys.GetMaxIndex("V", ',', ';').first, 3);
    EXPECT_EQ(r.keys.GetInt32ByKey("V", &comma, 1, &semicolon, 0), 2);
    EXPECT_EQ(r.keys.GetInt32ByKey("V", &comma, 1, &semicolon, 1), 3);
    EXPECT_EQ(r.keys.GetInt32ByKey("V", &semicolon, 0, &comma, 1), 2);
    // Under ':' and ',' the whole value is one entry whose middle field "2;3" is no integer.
    EXPECT_EQ(r.keys.GetMaxIndex("V", ':', ','), (std::pair<short, short>{1, 3}));
    EXPECT_EQ(r.keys.GetInt32ByKey("V", &colon, 0, &comma, 0), 1);
    EXPECT_EQ(r.keys.GetInt32ByKey("V", &colon, 0, &comma, 1), 0);
    EXPECT_EQ(r.keys.GetInt32ByKey("V", &colon, 0, &comma, 2), 4);
}

TEST_F(KeyFile, ReadsOnlyTheOneSeparatorCharacterPassed) {
    Reader r(Write("V = 5,6:7,8\n"));
    // Each separator lives alone on the heap, with no terminator after it: reading past
    // it is an overflow the sanitizer build reports.
    auto entry = std::make_unique<char>(':');
    auto field = std::make_unique<char>(',');
    EXPECT_EQ(r.keys.GetInt32ByKey("V", entry.get(), 1, field.get(), 1), 8);
    // The first character decides even when more text follows it.
    const char text[] = ":,";
    EXPECT_EQ(r.keys.GetInt32ByKey("V", &text[0], 1, &text[1], 0), 7);
}

TEST_F(KeyFile, ClampsCountsOfHugeListsAndReadsTheirEnds) {
    std::string text = "BIG = ";
    for (int i = 0; i < 40000; ++i) {
        text += std::to_string(i) + "," + std::to_string(-i) + (i + 1 < 40000 ? ":" : "\n");
    }
    Reader r(Write(text));
    ASSERT_EQ(r.keys.get_validity(), 1);
    EXPECT_EQ(r.keys.GetMaxIndex("BIG", kEntry, kField), (std::pair<short, short>{32767, 2}));
    long sum = 0;
    for (short i = 0; i < 32767; ++i) { // quadratic reads would time out here
        sum += r.At("BIG", i, 0) + r.At("BIG", i, 1);
    }
    EXPECT_EQ(sum, 0);
    EXPECT_EQ(r.At("BIG", 32767, 0), 32767);
}

// ---- rejected files --------------------------------------------------------------------

struct BadFile {
    const char* text;
    unsigned long line; // the line the message must name
};

class RejectedKeyFile : public KeyFile, public ::testing::WithParamInterface<BadFile> {};

TEST_P(RejectedKeyFile, IsRejectedWholeWithOneMessageNamingFileAndLine) {
    const std::string path = Write(std::string("GOOD = 1,2,3\n# fine so far\n") + GetParam().text);
    VnTest::MessageCapture capture;
    Reader r(path);
    EXPECT_EQ(r.keys.get_validity(), 0);
    EXPECT_EQ(r.Count("GOOD"), 0) << "no key of a rejected file is kept";
    EXPECT_EQ(r.At("GOOD", 0, 0), 0);
    ASSERT_EQ(capture.Errors().size(), 1u);
    EXPECT_EQ(capture.Messages().size(), 1u);
    const std::string message = capture.Errors()[0];
    EXPECT_NE(message.find(path), std::string::npos) << message;
    EXPECT_NE(message.find("line " + std::to_string(GetParam().line) + ":"), std::string::npos)
        << message;
}

INSTANTIATE_TEST_SUITE_P(
    Malformed, RejectedKeyFile,
    ::testing::Values(BadFile{"JUST_A_KEY\n", 3}, BadFile{"= 5\n", 3}, BadFile{"KEY 5\n", 3},
                      BadFile{"KEY-X = 1\n", 3}, BadFile{"K = 1.5\n", 3}, BadFile{"K = 12a\n", 3},
                      BadFile{"K = 0x10\n", 3}, BadFile{"K = 1,,2\n", 3}, BadFile{"K = 1,\n", 3},
                      BadFile{"K = ,1\n", 3}, BadFile{"K = 1 2\n", 3}, BadFile{"K = --1\n", 3},
                      BadFile{"K = 2147483648\n", 3}, BadFile{"K = -2147483649\n", 3},
                      BadFile{"K = 99999999999999999999999\n", 3}, BadFile{"K = 1\n\nK = 2\n", 5},
                      BadFile{"GOOD = 4\n", 3}, BadFile{"K = 1 # c\nK\n", 4}));

TEST_F(KeyFile, RejectsANulByteInALine) {
    VnTest::MessageCapture capture;
    Reader r(Write(std::string_view("A = 1\nB = 2\0\n", 13)));
    EXPECT_EQ(r.keys.get_validity(), 0);
    ASSERT_EQ(capture.Errors().size(), 1u);
    EXPECT_NE(capture.Errors()[0].find("line 2:"), std::string::npos);
}

TEST_F(KeyFile, NamesTheFirstDefinitionOfADuplicatedKey) {
    VnTest::MessageCapture capture;
    Reader r(Write("A = 1\nB = 2\nA = 3\n"));
    EXPECT_EQ(r.keys.get_validity(), 0);
    ASSERT_EQ(capture.Errors().size(), 1u);
    EXPECT_NE(capture.Errors()[0].find("line 3: key A is defined twice (first on line 1)"),
              std::string::npos)
        << capture.Errors()[0];
}

TEST_F(KeyFile, RejectsSilentlyWhenAskedNotToReport) {
    VnTest::MessageCapture capture;
    Reader r(Write("not a key line\n"), 0, 1, 0);
    EXPECT_EQ(r.keys.get_validity(), 0);
    EXPECT_TRUE(capture.Messages().empty());
}

TEST_F(KeyFile, SurvivesBinaryContent) {
    std::string bytes;
    for (int i = 0; i < 4096; ++i) {
        bytes.push_back(static_cast<char>((i * 7919) & 0xFF));
    }
    VnTest::MessageCapture capture;
    Reader r(Write(bytes));
    EXPECT_EQ(r.keys.get_validity(), 0);
    EXPECT_EQ(capture.Errors().size(), 1u);
}

TEST_F(KeyFile, RefusesAFileLargerThanTheCapBeforeReadingIt) {
    // A list of a few hundred megabytes once took six times its size in memory; past the
    // cap nothing of it is read. A file of exactly the cap is still taken whole.
    const std::string key = "K = 7\n";
    std::string atCap = "#";
    atCap.resize(PM_DEVKEY::kMaxFileBytes - key.size() - 1, 'x');
    atCap += '\n' + key;
    ASSERT_EQ(atCap.size(), PM_DEVKEY::kMaxFileBytes);
    {
        VnTest::MessageCapture capture;
        Reader r(Write(atCap));
        ASSERT_EQ(r.keys.get_validity(), 1);
        EXPECT_EQ(r.At("K", 0, 0), 7);
        EXPECT_TRUE(capture.Errors().empty());
    }
    VnTest::MessageCapture capture;
    Reader r(Write("#" + atCap));
    EXPECT_EQ(r.keys.get_validity(), 0);
    EXPECT_EQ(r.At("K", 0, 0), 0);
    ASSERT_EQ(capture.Errors().size(), 1u);
    EXPECT_NE(capture.Errors()[0].find("cannot be read"), std::string::npos) << capture.Errors()[0];
}

// ---- finding the file ------------------------------------------------------------------

TEST(KeyFileLookup, AbsentFileIsSilentUnlessRequired) {
    VnTest::TempDir empty;
    VnTest::ScopedEnv path("VENLOMER_DATA_PATH", empty.str());
    VnTest::ScopedCwd cwd(empty.path());
    VnTest::MessageCapture capture;
    {
        Reader r("no-such-file.acd");
        EXPECT_EQ(r.keys.get_validity(), 0);
        EXPECT_TRUE(r.keys.GetPath().IsEmpty());
        EXPECT_EQ(r.Count("ANY"), 0);
    }
    EXPECT_TRUE(capture.Messages().empty());
    Reader required("no-such-file.acd", 1, 1, 1);
    EXPECT_EQ(required.keys.get_validity(), 0);
    ASSERT_EQ(capture.Errors().size(), 1u);
    EXPECT_NE(capture.Errors()[0].find("no-such-file.acd"), std::string::npos);
    Reader nullName("", 1, 1, 1);
    EXPECT_EQ(nullName.keys.get_validity(), 0);
}

TEST(KeyFileLookup, TakesTheFirstDataPathFolderHoldingTheFile) {
    VnTest::TempDir empty, first, second;
    first.Write("scheme.acd", "WHO = 1\n");
    second.Write("scheme.acd", "WHO = 2\n");
    std::filesystem::create_directory(empty.path() / "scheme.acd"); // a folder is no file
    VnTest::ScopedEnv path("VENLOMER_DATA_PATH",
                           empty.str() + "::/no/such/dir:" + first.str() + ":" + second.str());
    Reader r("scheme.acd");
    EXPECT_EQ(r.At("WHO", 0, 0), 1);
    EXPECT_EQ(std::string(r.keys.GetPath().view()), (first.path() / "scheme.acd").string());

    VnTest::ScopedEnv reversed("VENLOMER_DATA_PATH", second.str() + ":" + first.str());
    EXPECT_EQ(Reader("scheme.acd").At("WHO", 0, 0), 2);
}

TEST(KeyFileLookup, FallsBackToTheCurrentDirectory) {
    VnTest::TempDir empty, here;
    here.Write("scheme.acd", "WHO = 3\n");
    VnTest::ScopedCwd cwd(here.path());
    {
        VnTest::ScopedEnv path("VENLOMER_DATA_PATH", empty.str());
        EXPECT_EQ(Reader("scheme.acd").At("WHO", 0, 0), 3);
    }
    VnTest::ScopedEnv unset("VENLOMER_DATA_PATH", std::nullopt);
    EXPECT_EQ(Reader("scheme.acd").At("WHO", 0, 0), 3);
}

TEST(KeyFileLookup, SearchesOnlyWhenAskedAndOpensPathsAsGiven) {
    VnTest::TempDir data, here;
    data.Write("scheme.acd", "WHO = 4\n");
    VnTest::ScopedEnv path("VENLOMER_DATA_PATH", data.str());
    VnTest::ScopedCwd cwd(here.path());
    EXPECT_EQ(Reader("scheme.acd", 0, 0, 1).keys.get_validity(), 0) << "no search: cwd only";
    EXPECT_EQ(Reader("scheme.acd", 0, 1, 1).At("WHO", 0, 0), 4);
    // A name with a folder in it is never looked up along the path.
    here.Write("scheme.acd", "WHO = 5\n");
    EXPECT_EQ(Reader("./scheme.acd").At("WHO", 0, 0), 5);
    EXPECT_EQ(Reader((data.path() / "scheme.acd").string()).At("WHO", 0, 0), 4);
}

} // namespace
