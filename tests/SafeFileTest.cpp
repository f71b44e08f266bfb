//===-- tests/SafeFileTest.cpp - files are written whole or not at all, read safely -===//
#include "Port/SafeFile.h"

#include <gtest/gtest.h>

#include <fcntl.h>
#include <sys/stat.h>
#include <sys/time.h>
#include <sys/wait.h>
#include <unistd.h>

#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>

namespace {

namespace fs = std::filesystem;

std::string Slurp(const fs::path& path) {
    std::ifstream in(path, std::ios::binary);
    std::ostringstream text;
    text << in.rdbuf();
    return text.str();
}

void Put(const fs::path& path, const std::string& text) {
    std::ofstream(path, std::ios::binary) << text;
}

mode_t ModeOf(const fs::path& path) {
    struct stat info {};
    ::stat(path.c_str(), &info);
    return info.st_mode & 07777;
}

// Names in the folder that are neither of the given ones: what a run left behind.
int Extras(const fs::path& folder, std::initializer_list<std::string> known) {
    int extras = 0;
    for (const auto& entry : fs::directory_iterator(folder)) {
        bool listed = false;
        for (const auto& name : known) {
            listed = listed || entry.path().filename() == name;
        }
        extras += listed ? 0 : 1;
    }
    return extras;
}

class SafeFile : public ::testing::Test {
protected:
    void SetUp() override {
        std::string pattern = (fs::temp_directory_path() / "venlomer-safefile-XXXXXX").string();
        ASSERT_NE(::mkdtemp(pattern.data()), nullptr);
        m_dir = pattern;
    }
    void TearDown() override {
        std::error_code ec;
        fs::remove_all(m_dir, ec);
    }
    fs::path m_dir;
};

TEST_F(SafeFile, ANewFileIsWrittenWholeWithTheUmasksModeAndNothingBeside) {
    const mode_t old = ::umask(027);
    std::string error;
    const bool written = Port::WriteFileSafely((m_dir / "new.svg").string(), "picture", error);
    ::umask(old);
    ASSERT_TRUE(written) << error;
    EXPECT_EQ(Slurp(m_dir / "new.svg"), "picture");
    EXPECT_EQ(ModeOf(m_dir / "new.svg"), 0640u);
    EXPECT_EQ(Extras(m_dir, {"new.svg"}), 0);
}

TEST_F(SafeFile, AReplacedFileKeepsItsModeAndALinkKeepsPointingAtTheNewContent) {
    Put(m_dir / "private.txt", "old");
    ::chmod((m_dir / "private.txt").c_str(), 0600);
    fs::create_directory(m_dir / "elsewhere");
    fs::create_symlink(m_dir / "private.txt", m_dir / "elsewhere" / "link.txt");
    std::string error;
    ASSERT_TRUE(Port::WriteFileSafely((m_dir / "elsewhere" / "link.txt").string(), "new", error))
        << error;
    EXPECT_TRUE(fs::is_symlink(m_dir / "elsewhere" / "link.txt"));
    EXPECT_EQ(Slurp(m_dir / "private.txt"), "new");
    EXPECT_EQ(ModeOf(m_dir / "private.txt"), 0600u);
    // The temporary lived beside the file the link points to, and is gone.
    EXPECT_EQ(Extras(m_dir, {"private.txt", "elsewhere"}), 0);
    EXPECT_EQ(Extras(m_dir / "elsewhere", {"link.txt"}), 0);
}

// 0664 with a group the writer is in, so that a writer keeping no mode (the temporary is
// 0600) or no group fails here. Root may give a file to any group; others use one of their
// own supplementary groups.
TEST_F(SafeFile, AReplacedFileKeepsAGroupWritableModeAndItsGroup) {
    gid_t group = 0;
    if (::geteuid() == 0) {
        group = 1;
    } else {
        gid_t groups[64];
        const int count = ::getgroups(64, groups);
        for (int i = 0; i < count && group == 0; ++i) {
            group = groups[i] != ::getegid() ? groups[i] : 0;
        }
        if (group == 0) {
            GTEST_SKIP() << "this user is in no second group to give the file to";
        }
    }
    const fs::path shared = m_dir / "shared.pcf";
    Put(shared, "old");
    ASSERT_EQ(::chown(shared.c_str(), static_cast<uid_t>(-1), group), 0);
    ASSERT_EQ(::chmod(shared.c_str(), 0664), 0);
    std::string error;
    ASSERT_TRUE(Port::WriteFileSafely(shared.string(), "new", error)) << error;
    struct stat info {};
    ASSERT_EQ(::stat(shared.c_str(), &info), 0);
    EXPECT_EQ(info.st_mode & 07777, 0664u);
    EXPECT_EQ(info.st_gid, group);
    EXPECT_EQ(Slurp(shared), "new");
}

// A read-only file in a folder the user may write is refused, for root as for anyone: the
// mode says no one was meant to write it.
TEST_F(SafeFile, AReadOnlyFileIsNotReplacedEvenWhereTheFolderAllowsIt) {
    const fs::path locked = m_dir / "locked.pcf";
    Put(locked, "mine");
    ASSERT_EQ(::chmod(locked.c_str(), 0444), 0);
    std::string error;
    EXPECT_FALSE(Port::WriteFileSafely(locked.string(), "theirs", error));
    EXPECT_NE(error.find("read-only"), std::string::npos) << error;
    EXPECT_NE(error.find("0444"), std::string::npos) << error;
    EXPECT_EQ(Slurp(locked), "mine");
    EXPECT_EQ(ModeOf(locked), 0444u);
    EXPECT_EQ(Extras(m_dir, {"locked.pcf"}), 0);
}

// Another user's 0644 file in a folder everyone may write: the writer could not write the
// file itself, so it must not replace it (and take it over). Needs a second user: root
// forks a child that becomes `nobody`.
TEST_F(SafeFile, AnotherOwnersFileInAWritableFolderIsNotTakenOver) {
    if (::geteuid() != 0) {
        GTEST_SKIP() << "only root can make a file of another owner here";
    }
    ASSERT_EQ(::chmod(m_dir.c_str(), 0777), 0);
    const fs::path theirs = m_dir / "theirs.pcf";
    Put(theirs, "root's");
    ASSERT_EQ(::chmod(theirs.c_str(), 0644), 0);
    int pipe[2];
    ASSERT_EQ(::pipe(pipe), 0);
    const pid_t child = ::fork();
    if (child == 0) {
        ::close(pipe[0]);
        if (::setgid(65534) != 0 || ::setuid(65534) != 0) {
            ::_exit(2);
        }
        std::string error;
        const bool written = Port::WriteFileSafely(theirs.string(), "nobody's", error);
        (void)!::write(pipe[1], error.data(), error.size());
        ::_exit(written ? 1 : 0);
    }
    ::close(pipe[1]);
    char reason[512] = {};
    (void)!::read(pipe[0], reason, sizeof reason - 1);
    ::close(pipe[0]);
    int status = 0;
    ::waitpid(child, &status, 0);
    ASSERT_TRUE(WIFEXITED(status));
    EXPECT_EQ(WEXITSTATUS(status), 0) << "replaced: " << reason;
    EXPECT_NE(std::string(reason).find("read-only"), std::string::npos) << reason;
    struct stat info {};
    ASSERT_EQ(::stat(theirs.c_str(), &info), 0);
    EXPECT_EQ(info.st_uid, 0u);
    EXPECT_EQ(Slurp(theirs), "root's");
}

TEST_F(SafeFile, AnOutputThatIsAnInputIsRefusedHoweverItIsSpelled) {
    Put(m_dir / "input.txt", "precious");
    fs::create_hard_link(m_dir / "input.txt", m_dir / "hard.txt");
    fs::create_symlink("input.txt", m_dir / "soft.txt");
    const std::string input = (m_dir / "input.txt").string();
    for (const fs::path& output :
         {m_dir / "." / "input.txt", m_dir / "hard.txt", m_dir / "soft.txt"}) {
        std::string error;
        Port::SafeWriter writer;
        EXPECT_FALSE(writer.Open(output.string(), error, {input})) << output;
        EXPECT_NE(error.find("same file as the input"), std::string::npos) << error;
    }
    Port::InputFile opened;
    std::string error;
    ASSERT_TRUE(opened.Open(input, error)) << error;
    Port::SafeWriter writer;
    EXPECT_FALSE(writer.Open((m_dir / "hard.txt").string(), error, {},
                             Port::SafeWriter::Mode::Replace, {opened.Identity()}));
    EXPECT_EQ(Slurp(m_dir / "input.txt"), "precious");
    EXPECT_EQ(Extras(m_dir, {"input.txt", "hard.txt", "soft.txt"}), 0);
}

TEST_F(SafeFile, ALinkPlantedUnderATemporaryLikeNameIsNeverFollowed) {
    Put(m_dir / "victim.txt", "untouched");
    fs::create_directory(m_dir / "shared");
    // Every name a run of this process could pick first is beyond guessing; plant the
    // old fixed name and a spread of names of the temporaries' own shape.
    fs::create_symlink(m_dir / "victim.txt", m_dir / "shared" / "out.svg.part");
    char name[64];
    for (unsigned i = 0; i < 64; ++i) {
        std::snprintf(name, sizeof name, ".venlomer-%08x-%08x.tmp", unsigned(::getpid()),
                      i * 0x04000000u);
        fs::create_symlink(m_dir / "victim.txt", m_dir / "shared" / name);
    }
    std::string error;
    ASSERT_TRUE(Port::WriteFileSafely((m_dir / "shared" / "out.svg").string(), "drawn", error))
        << error;
    EXPECT_EQ(Slurp(m_dir / "shared" / "out.svg"), "drawn");
    EXPECT_EQ(Slurp(m_dir / "victim.txt"), "untouched");
    // Links are no leftovers of ours: the cleanup leaves them alone too.
    EXPECT_EQ(Extras(m_dir / "shared", {"out.svg"}), 65);
}

TEST_F(SafeFile, AnUncommittedWriteLeavesTheOldFileAndNoTemporary) {
    Put(m_dir / "out.txt", "old");
    {
        Port::SafeWriter writer;
        std::string error;
        ASSERT_TRUE(writer.Open((m_dir / "out.txt").string(), error)) << error;
        ASSERT_TRUE(writer.Write("half of the n", error)) << error;
        EXPECT_TRUE(fs::exists(writer.WorkingPath()));
    }
    EXPECT_EQ(Slurp(m_dir / "out.txt"), "old");
    EXPECT_EQ(Extras(m_dir, {"out.txt"}), 0);
}

TEST_F(SafeFile, CreateOnlyPublishesANewFileButNeverReplacesOne) {
    std::string error;
    {
        Port::SafeWriter writer;
        ASSERT_TRUE(writer.Open((m_dir / "stub.db").string(), error, {},
                                Port::SafeWriter::Mode::CreateOnly))
            << error;
        // A library that writes by name writes the working file, then the writer commits.
        Put(writer.WorkingPath(), "first");
        ASSERT_TRUE(writer.Commit(error)) << error;
    }
    EXPECT_EQ(Slurp(m_dir / "stub.db"), "first");
    {
        Port::SafeWriter writer;
        EXPECT_FALSE(writer.Open((m_dir / "stub.db").string(), error, {},
                                 Port::SafeWriter::Mode::CreateOnly));
        EXPECT_NE(error.find("exists already"), std::string::npos) << error;
    }
    {
        // A file that appears between Open and Commit still wins.
        Port::SafeWriter writer;
        ASSERT_TRUE(writer.Open((m_dir / "late.db").string(), error, {},
                                Port::SafeWriter::Mode::CreateOnly))
            << error;
        ASSERT_TRUE(writer.Write("mine", error));
        Put(m_dir / "late.db", "theirs");
        EXPECT_FALSE(writer.Commit(error));
        EXPECT_NE(error.find("exists already"), std::string::npos) << error;
    }
    EXPECT_EQ(Slurp(m_dir / "late.db"), "theirs");
    EXPECT_EQ(Extras(m_dir, {"stub.db", "late.db"}), 0);
}

TEST_F(SafeFile, ACharacterDeviceIsWrittenInPlace) {
    std::string error;
    Port::SafeWriter writer;
    ASSERT_TRUE(writer.Open("/dev/null", error)) << error;
    EXPECT_TRUE(writer.Direct());
    ASSERT_TRUE(writer.Write("gone", error)) << error;
    ASSERT_TRUE(writer.Commit(error)) << error;
    struct stat info {};
    ASSERT_EQ(::stat("/dev/null", &info), 0);
    EXPECT_TRUE(S_ISCHR(info.st_mode));
}

TEST_F(SafeFile, FoldersLinksToNothingAndMissingFoldersAreRefusedWithTheirReason) {
    fs::create_symlink(m_dir / "nowhere", m_dir / "dangling");
    const std::pair<fs::path, const char*> cases[] = {
        {m_dir, "a folder"},
        {m_dir / "dangling", "link to nothing"},
        {m_dir / "missing" / "x.svg", "No such file"},
    };
    for (const auto& [path, reason] : cases) {
        std::string error;
        EXPECT_FALSE(Port::WriteFileSafely(path.string(), "x", error)) << path;
        EXPECT_NE(error.find("cannot write " + path.string()), std::string::npos) << error;
        EXPECT_NE(error.find(reason), std::string::npos) << error;
    }
    EXPECT_FALSE(fs::exists(m_dir / "nowhere"));
}

TEST_F(SafeFile, TheLongestLegalNameIsWritten) {
    const std::string name(255, 'n');
    std::string error;
    ASSERT_TRUE(Port::WriteFileSafely((m_dir / name).string(), "long", error)) << error;
    EXPECT_EQ(Slurp(m_dir / name), "long");
}

pid_t FinishedPid() {
    const pid_t child = ::fork();
    if (child == 0) {
        ::_exit(0);
    }
    ::waitpid(child, nullptr, 0);
    return child;
}

void Age(const fs::path& path, int seconds) {
    struct timeval times[2];
    ::gettimeofday(&times[0], nullptr);
    times[0].tv_sec -= seconds;
    times[1] = times[0];
    ::utimes(path.c_str(), times);
}

TEST_F(SafeFile, LeftoversOfRunsThatAreGoneAreCleanedAndNothingElse) {
    char name[64];
    auto leftover = [&](pid_t pid, unsigned random, int age) {
        std::snprintf(name, sizeof name, ".venlomer-%08x-%08x.tmp", unsigned(pid), random);
        Put(m_dir / name, "partial");
        Age(m_dir / name, age);
        return std::string(name);
    };
    const std::string gone = leftover(FinishedPid(), 1, 120);
    const std::string live = leftover(::getppid(), 2, 120);          // a run still going
    const std::string fresh = leftover(FinishedPid(), 3, 0);         // maybe another namespace
    const std::string ancient = leftover(::getppid(), 4, 2 * 86400); // a reused pid
    Put(m_dir / ".venlomer-notours.tmp", "someone's");
    Age(m_dir / ".venlomer-notours.tmp", 2 * 86400);
    std::string error;
    ASSERT_TRUE(Port::WriteFileSafely((m_dir / "out.txt").string(), "x", error)) << error;
    EXPECT_FALSE(fs::exists(m_dir / gone));
    EXPECT_FALSE(fs::exists(m_dir / ancient));
    EXPECT_TRUE(fs::exists(m_dir / live));
    EXPECT_TRUE(fs::exists(m_dir / fresh));
    EXPECT_TRUE(fs::exists(m_dir / ".venlomer-notours.tmp"));
}

// ---- reading ----------------------------------------------------------------------------

TEST_F(SafeFile, OnlyRegularFilesAreReadAndAFifoDoesNotBlock) {
    ASSERT_EQ(::mkfifo((m_dir / "fifo").c_str(), 0600), 0);
    const std::pair<std::string, const char*> cases[] = {
        {(m_dir / "fifo").string(), "a FIFO, not a regular file"},
        {"/dev/zero", "a character device, not a regular file"},
        {m_dir.string(), "a folder, not a regular file"},
        {(m_dir / "missing").string(), "cannot open: No such file"},
        {"-", "cannot open"},
    };
    for (const auto& [path, reason] : cases) {
        std::string text;
        std::string error;
        EXPECT_FALSE(Port::ReadRegularFile(path, text, error)) << path;
        EXPECT_EQ(error.rfind(path + ": " + reason, 0), 0u) << error;
    }
}

TEST_F(SafeFile, TheSizeLimitIsKeptAtOpenAndWhileTheFileGrows) {
    Put(m_dir / "data", std::string(100, 'd'));
    std::string text;
    std::string error;
    EXPECT_FALSE(Port::ReadRegularFile((m_dir / "data").string(), text, error, 99));
    EXPECT_NE(error.find("100 bytes is more than the 99 bytes read at most"), std::string::npos)
        << error;
    ASSERT_TRUE(Port::ReadRegularFile((m_dir / "data").string(), text, error, 100)) << error;
    EXPECT_EQ(text, std::string(100, 'd'));

    Port::InputFile file;
    ASSERT_TRUE(file.Open((m_dir / "data").string(), error, 150)) << error;
    std::ofstream(m_dir / "data", std::ios::app) << std::string(100, 'e');
    std::string line;
    std::getline(file.Stream(), line);
    EXPECT_LE(line.size(), 150u);
    EXPECT_TRUE(file.Failed(error));
    EXPECT_NE(error.find("more than the 150 bytes"), std::string::npos) << error;

    // A sparse file costs no disk but has the size of one beyond the default limit.
    { std::ofstream(m_dir / "huge"); }
    fs::resize_file(m_dir / "huge", Port::kMaxInputBytes + 1);
    EXPECT_FALSE(Port::ReadRegularFile((m_dir / "huge").string(), text, error));
    EXPECT_NE(error.find("more than the 512 MiB read at most"), std::string::npos) << error;
}

TEST(Printable, ControlBytesAreShownEscapedAndTextIsKept) {
    EXPECT_EQ(Port::Printable("A1 \xc3\xa9t\xc3\xa9"), "A1 \xc3\xa9t\xc3\xa9");
    EXPECT_EQ(Port::Printable("\x1b[2Jpin\r\n\x7f"), "\\x1b[2Jpin\\x0d\\x0a\\x7f");
    EXPECT_EQ(Port::Printable("\xc2\x9b"
                              "1m \x9b"),
              "\\xc2\\x9b1m \\x9b");
}

} // namespace
