//===-- tests/netlist/NetlistStubTest.cpp - stubs from texts or an NGD; refusals named -===//
//
// Netlist stubs made by the library's utilities, from four texts or from an NGD file.
//
//===------------------------------------------------------------------------------===//
#include "MessageCapture.h"
#include "NetlistFiles.h"

#include "designmodel/Nmod_Exception.h"
#include "s/Utilities.h"

#include <condition_variable>
#include <mutex>
#include <set>
#include <sys/stat.h>
#include <thread>

using Vn::Eng::Utilities;
using VnTest::DesignSpec;
using VnTest::ExecSql;
using VnTest::GoodDesign;
using VnTest::ReadNetlist;
using VnTest::WriteFile;
using VnTest::WriteNetlist;

namespace {

class NetlistStubs : public VnTest::NetlistFolder {
protected:
    /// The one message of a refusal: an error from this library's utilities.
    static int ExpectOnlyError(const VnTest::MessageCapture& capture, const std::string& text) {
        EXPECT_EQ(capture.Messages().size(), 1u);
        if (capture.Messages().size() != 1u) {
            return -1;
        }
        const Port::Message& message = capture.Messages()[0];
        EXPECT_EQ(message.severity, Port::Severity::Error);
        EXPECT_EQ(message.text, text);
        EXPECT_EQ(message.domain, "Venlomer");
        EXPECT_EQ(message.unit, "../s/Utilities");
        EXPECT_EQ(message.revision, "$Revision: 1.3 $");
        EXPECT_GT(message.line, 0);
        return message.line;
    }

    static void ExpectOnlyDebug(const VnTest::MessageCapture& capture, const std::string& text) {
        EXPECT_EQ(capture.Messages().size(), 1u);
        EXPECT_EQ(capture.Debug(), std::vector<std::string>{text});
    }

    /// Runs CreateNGCFromNGD on an NGD made from `designs` and expects the refusal
    /// "The ngd file \"<ngd>\" <what>", and no stub.
    int ExpectRefusal(const std::vector<DesignSpec>& designs, const std::string& what,
                      const std::vector<std::string>& debugFirst = {}) {
        const std::string ngd = PathOf("in.ngd");
        const std::string ngc = PathOf("out.ngc");
        std::filesystem::remove(ngd);
        WriteNetlist(ngd, designs);
        VnTest::MessageCapture capture;
        EXPECT_FALSE(Utilities::CreateNGCFromNGD(ngd.c_str(), ngc.c_str()));
        EXPECT_FALSE(std::filesystem::exists(ngc));
        EXPECT_EQ(capture.Debug(), debugFirst);
        EXPECT_EQ(capture.Errors(),
                  std::vector<std::string>{"The ngd file \"" + ngd + "\" " + what});
        for (const auto& message : capture.Messages()) {
            if (message.severity == Port::Severity::Error) {
                EXPECT_EQ(message.unit, "../s/Utilities");
                EXPECT_EQ(message.revision, "$Revision: 1.3 $");
                EXPECT_EQ(message.domain, "Venlomer");
                return message.line;
            }
        }
        return -1;
    }
};

} // namespace

TEST_F(NetlistStubs, MissingArgumentsAreADebugNoteAndFalse) {
    const std::string ngd = PathOf("good.ngd");
    WriteNetlist(ngd, {GoodDesign()});
    const std::pair<std::string, std::string> cases[] = {
        {ngd, ""}, {"", PathOf("out.ngc")}, {"", ""}};
    for (const auto& [in, out] : cases) {
        VnTest::MessageCapture capture;
        EXPECT_FALSE(Utilities::CreateNGCFromNGD(in.c_str(), out.c_str()));
        ExpectOnlyDebug(capture, "No ngd or ngc file specified.\n");
    }
    EXPECT_EQ(FolderContents(), std::vector<std::string>{"good.ngd"});
}

TEST_F(NetlistStubs, AnExistingStubCountsAsDoneWithoutLookingAtTheNgd) {
    const std::string ngc = PathOf("out.ngc");
    WriteFile(ngc, "an old stub");
    VnTest::MessageCapture capture;
    EXPECT_TRUE(Utilities::CreateNGCFromNGD(PathOf("missing.ngd").c_str(), ngc.c_str()));
    ExpectOnlyDebug(capture, "Specified ngc file " + ngc + " exists.\n");
    EXPECT_EQ(VnTest::ReadFile(ngc), "an old stub");
    EXPECT_EQ(FolderContents(), std::vector<std::string>{"out.ngc"});
}

TEST_F(NetlistStubs, EveryFileThatIsNoReadableNgdIsRefusedByName) {
    const std::string ngc = PathOf("out.ngc");
    const std::string missing = PathOf("missing.ngd");
    const std::string text = PathOf("text.ngd");
    WriteFile(text, "design D\n");
    const std::string stub = PathOf("stub.ngc");
    WriteNetlist(stub, {GoodDesign()}, false);
    const std::string old = PathOf("old.ngd");
    WriteNetlist(old, {GoodDesign()});
    ExecSql(old, "UPDATE nmod_format SET version = 1");
    const std::string loop = PathOf("loop.ngd");
    std::filesystem::create_symlink(loop, loop);

    const std::pair<std::string, std::string> cases[] = {
        {missing, "The ngd file \"" + missing + "\" was not found \n"},
        {text, "The file " + text + " is not an ngd file \n"},
        {stub, "The file " + stub + " is not an ngd file \n"},
        {m_folder.string(), "The file " + m_folder.string() + " is not an ngd file \n"},
        {old, "The ngd file \"" + old + "\" is obsolete \n"},
        {loop, "An unknown error was returned reading the file \"" + loop + "\" \n"},
    };
    std::set<int> lines;
    for (const auto& [ngd, error] : cases) {
        SCOPED_TRACE(ngd);
        VnTest::MessageCapture capture;
        EXPECT_FALSE(Utilities::CreateNGCFromNGD(ngd.c_str(), ngc.c_str()));
        lines.insert(ExpectOnlyError(capture, error));
        EXPECT_FALSE(std::filesystem::exists(ngc));
    }
    EXPECT_EQ(lines.size(), 1u) << "one place reports every status of the file check";
}

TEST_F(NetlistStubs, AnNgdThatMayNotBeReadIsRefusedByName) {
    if (::geteuid() == 0) {
        GTEST_SKIP() << "running as root: permissions do not keep root from reading";
    }
    const std::string ngd = PathOf("locked.ngd");
    WriteNetlist(ngd, {GoodDesign()});
    ASSERT_EQ(::chmod(ngd.c_str(), 0), 0);
    VnTest::MessageCapture capture;
    EXPECT_FALSE(Utilities::CreateNGCFromNGD(ngd.c_str(), PathOf("out.ngc").c_str()));
    ExpectOnlyError(capture,
                    "The file \"" + ngd + "\" cannot be read. Please check the file permission \n");
}

TEST_F(NetlistStubs, ADamagedNgdIsNotQdbReadable) {
    DesignSpec bulky = GoodDesign();
    for (int i = 0; i < 200; ++i) {
        bulky.views[0].properties.emplace_back("P" + std::to_string(i), std::string(100, 'v'));
    }
    const std::string ngd = PathOf("damaged.ngd");
    WriteNetlist(ngd, {bulky});
    std::string bytes = VnTest::ReadFile(ngd);
    ASSERT_GT(bytes.size(), 4u * 4096u);
    std::fill(bytes.end() - 4096, bytes.end(), '\xFF');
    WriteFile(ngd, bytes);

    VnTest::MessageCapture capture;
    EXPECT_FALSE(Utilities::CreateNGCFromNGD(ngd.c_str(), PathOf("out.ngc").c_str()));
    ExpectOnlyError(capture, "The ngd file \"" + ngd + "\" is not QDB readable\n");
    EXPECT_FALSE(std::filesystem::exists(PathOf("out.ngc")));
}

TEST_F(NetlistStubs, AnNgdWithoutOneCompleteDesignIsRefusedByName) {
    std::set<int> lines;
    lines.insert(
        ExpectRefusal({GoodDesign("D1"), GoodDesign("D2")}, "contains more than one design\n"));
    lines.insert(ExpectRefusal({}, "does not contain a design\n"));
    lines.insert(ExpectRefusal({{"D", {{"SOURCE", {{"PART", "P"}}, "B"}}}},
                               "does not contain an EXPANDED view\n"));
    lines.insert(
        ExpectRefusal({{"D", {{"EXPANDED", {{"NOTPART", "P"}}, "B"}}}}, "does not name a part\n"));
    // The part is announced before the block is looked for.
    lines.insert(ExpectRefusal({{"D", {{"EXPANDED", {{"PART", "xc-pkg"}}, ""}}}},
                               "does not contain a ROOT block\n",
                               {"Parttype Databook format: xc-pkg\n"}));
    EXPECT_EQ(lines.size(), 5u) << "each refusal is reported from a place of its own";
}

TEST_F(NetlistStubs, AGoodNgdGivesAStubWithItsDesignPartAndRootBlock) {
    const std::string ngd = PathOf("top.ngd");
    DesignSpec design = GoodDesign("top_design", "ice40hx8k-ct256", "top_root");
    design.views.push_back({"SOURCE", {{"PART", "other"}}, "other_root"});
    design.views[0].properties.emplace_back("VIEW_TYPE", "PHYSICAL");
    WriteNetlist(ngd, {design});
    const std::string ngdBytes = VnTest::ReadFile(ngd);
    const std::string ngc = PathOf("top.ngc");

    VnTest::MessageCapture capture;
    EXPECT_TRUE(Utilities::CreateNGCFromNGD(ngd.c_str(), ngc.c_str()));
    EXPECT_EQ(capture.Debug(),
              std::vector<std::string>{"Parttype Databook format: ice40hx8k-ct256\n"});
    EXPECT_TRUE(capture.Errors().empty());
    EXPECT_EQ(VnTest::ReadFile(ngd), ngdBytes) << "the NGD is only read";
    EXPECT_EQ(FolderContents(), (std::vector<std::string>{"top.ngc", "top.ngd"}));

    const auto stub = ReadNetlist(ngc);
    ASSERT_NE(stub, nullptr);
    EXPECT_FALSE(stub->IsNgd());
    EXPECT_STREQ(stub->GetModelName(), "STE_VARO_DUMMY_NGC_MODEL");
    EXPECT_STREQ(stub->GetToolName(), "STE_VARO");
    EXPECT_STREQ(stub->GetToolVersion(), "$Revision: 1.3 $");
    ASSERT_EQ(stub->GetDesignMgr()->GetNumDesigns(), 1u);
    auto designs = stub->GetDesignMgr()->GetDesignItr();
    Nmod_Design* read = designs.Current();
    EXPECT_STREQ(read->GetName(), "top_design");
    ASSERT_EQ(read->GetViewItr().GetCount(), 1u);
    Nmod_View* view = read->GetViewByName("SOURCE");
    ASSERT_NE(view, nullptr);
    EXPECT_EQ(view->GetNumProperties(), 2u);
    EXPECT_STREQ(view->GetPropertyString("VIEW_TYPE"), "LOGICAL");
    EXPECT_STREQ(view->GetPropertyString("PART"), "ice40hx8k-ct256");
    ASSERT_NE(view->GetBlock(), nullptr);
    EXPECT_STREQ(view->GetBlock()->GetName(), "top_root");
    EXPECT_EQ(view->GetBlock()->GetType(), 0u);

    // Asked again, the stub is there and stays as it is.
    const std::string stubBytes = VnTest::ReadFile(ngc);
    EXPECT_TRUE(Utilities::CreateNGCFromNGD(ngd.c_str(), ngc.c_str()));
    EXPECT_EQ(VnTest::ReadFile(ngc), stubBytes);
}

TEST_F(NetlistStubs, FileNamesHoldingFormatDirectivesArePrintedAsTheyAre) {
    const std::string missing = PathOf("%n%s%x%n.ngd");
    VnTest::MessageCapture refused;
    EXPECT_FALSE(Utilities::CreateNGCFromNGD(missing.c_str(), PathOf("out.ngc").c_str()));
    ExpectOnlyError(refused, "The ngd file \"" + missing + "\" was not found \n");

    const std::string notNgd = PathOf("%s%s%s%n.ngd");
    WriteFile(notNgd, "text");
    VnTest::MessageCapture refusedToo;
    EXPECT_FALSE(Utilities::CreateNGCFromNGD(notNgd.c_str(), PathOf("out.ngc").c_str()));
    ExpectOnlyError(refusedToo, "The file " + notNgd + " is not an ngd file \n");

    const std::string ngd = PathOf("100%n.ngd");
    const std::string ngc = PathOf("%s%n.ngc");
    WriteNetlist(ngd, {GoodDesign("%n%s", "%s-%n", "%x")});
    EXPECT_TRUE(Utilities::CreateNGCFromNGD(ngd.c_str(), ngc.c_str()));
    const auto stub = ReadNetlist(ngc);
    Nmod_View* view = stub->GetDesignMgr()->GetDesignByName("%n%s")->GetViewByName("SOURCE");
    EXPECT_STREQ(view->GetPropertyString("PART"), "%s-%n");
    EXPECT_STREQ(view->GetBlock()->GetName(), "%x");

    VnTest::MessageCapture exists;
    EXPECT_TRUE(Utilities::CreateNGCFromNGD(ngd.c_str(), ngc.c_str()));
    ExpectOnlyDebug(exists, "Specified ngc file " + ngc + " exists.\n");
}

TEST_F(NetlistStubs, ReadFailuresOfTheNgdReachTheCaller) {
    const std::string ngd = PathOf("orphan.ngd");
    WriteNetlist(ngd, {GoodDesign()});
    ExecSql(ngd, "PRAGMA foreign_keys = OFF; DELETE FROM nmod_design;");
    EXPECT_THROW(Utilities::CreateNGCFromNGD(ngd.c_str(), PathOf("out.ngc").c_str()),
                 Nmod_Exception::Base);
    EXPECT_FALSE(std::filesystem::exists(PathOf("out.ngc")));
}

TEST_F(NetlistStubs, CreateNgcWritesTheFourTextsAndNeverReplacesAFile) {
    const std::string ngc = PathOf("direct.ngc");
    EXPECT_TRUE(Utilities::CreateNGC(ngc.c_str(), "D", "P", "B"));
    const auto stub = ReadNetlist(ngc);
    Nmod_View* view = stub->GetDesignMgr()->GetDesignByName("D")->GetViewByName("SOURCE");
    ASSERT_NE(view, nullptr);
    EXPECT_STREQ(view->GetPropertyString("PART"), "P");
    EXPECT_STREQ(view->GetBlock()->GetName(), "B");

    const std::string kept = PathOf("kept.ngc");
    WriteFile(kept, "someone else's");
    VnTest::MessageCapture capture;
    EXPECT_FALSE(Utilities::CreateNGC(kept.c_str(), "D", "P", "B"));
    EXPECT_EQ(capture.Errors().size(), 1u);
    EXPECT_EQ(VnTest::ReadFile(kept), "someone else's");

    VnTest::MessageCapture missingFolder;
    EXPECT_FALSE(Utilities::CreateNGC(PathOf("none/x.ngc").c_str(), "D", "P", "B"));
    ASSERT_EQ(missingFolder.Errors().size(), 1u);
    EXPECT_EQ(missingFolder.Messages()[0].domain, "Nmod");
    EXPECT_FALSE(Utilities::CreateNGC("", "D", "P", "B"));
}

TEST_F(NetlistStubs, ALinkPlantedUnderTheStubsNameIsNeitherFollowedNorReplaced) {
    const std::string victim = PathOf("victim.txt");
    WriteFile(victim, "the planter's target");
    const std::string toFile = PathOf("to-file.ngc");
    std::filesystem::create_symlink(victim, toFile);
    // A link to nothing would create the file it names if the write followed it.
    const std::string toNothing = PathOf("to-nothing.ngc");
    std::filesystem::create_symlink(PathOf("created.txt"), toNothing);

    for (const std::string& ngc : {toFile, toNothing}) {
        SCOPED_TRACE(ngc);
        VnTest::MessageCapture capture;
        EXPECT_FALSE(Utilities::CreateNGC(ngc.c_str(), "D", "P", "B"));
        ASSERT_EQ(capture.Errors().size(), 1u);
        EXPECT_NE(capture.Errors()[0].find("exists already"), std::string::npos)
            << capture.Errors()[0];
        EXPECT_TRUE(std::filesystem::is_symlink(ngc));
    }
    EXPECT_EQ(VnTest::ReadFile(victim), "the planter's target");
    EXPECT_EQ(FolderContents(),
              (std::vector<std::string>{"to-file.ngc", "to-nothing.ngc", "victim.txt"}))
        << "no temporary is left and nothing is created through a link";
}

TEST_F(NetlistStubs, AStubThatFailsWhileBeingWrittenLeavesNoFile) {
    const std::string ngc = PathOf("top.ngc");
    long failures = 0;
    for (long step = 0;; ++step) {
        ASSERT_LT(step, 100) << "the stub was never written";
        SCOPED_TRACE("failing step " + std::to_string(step));
        Nmod_Testing::FailWriteStep(step);
        VnTest::MessageCapture capture;
        if (Utilities::CreateNGC(ngc.c_str(), "D", "P", "B")) {
            EXPECT_TRUE(capture.Errors().empty());
            break;
        }
        ++failures;
        EXPECT_EQ(capture.Errors().size(), 1u);
        EXPECT_TRUE(FolderContents().empty()) << "a stub left behind would later pass as done";
    }
    EXPECT_GE(failures, 8);
    EXPECT_EQ(FolderContents(), std::vector<std::string>{"top.ngc"});
    EXPECT_EQ(ReadNetlist(ngc)->GetDesignMgr()->GetNumDesigns(), 1u);
}

TEST_F(NetlistStubs, OfWritersRacingForOneNameOnlyTheOneWhoseStubLandedSucceeds) {
    // Errors of the losers are counted, not printed; the sink may be called from every
    // thread at once.
    std::mutex sinkMutex;
    int errors = 0;
    Port::MessageSink previous = Port::SetMessageSink([&](const Port::Message& message) {
        const std::lock_guard<std::mutex> lock(sinkMutex);
        errors += message.severity == Port::Severity::Error ? 1 : 0;
    });
    constexpr int kWriters = 8;
    constexpr int kRounds = 25;
    int lateLosers = 0;
    for (int round = 0; round < kRounds; ++round) {
        SCOPED_TRACE("round " + std::to_string(round));
        const std::string ngc = PathOf("race" + std::to_string(round) + ".ngc");
        std::mutex startMutex;
        std::condition_variable start;
        bool go = false;
        bool results[kWriters] = {};
        std::vector<std::thread> writers;
        for (int i = 0; i < kWriters; ++i) {
            writers.emplace_back([&, i] {
                {
                    std::unique_lock<std::mutex> lock(startMutex);
                    start.wait(lock, [&] { return go; });
                }
                const std::string design = "design" + std::to_string(i);
                results[i] = Utilities::CreateNGC(ngc.c_str(), design.c_str(), "P", "B");
            });
        }
        {
            const std::lock_guard<std::mutex> lock(startMutex);
            go = true;
        }
        start.notify_all();
        for (auto& writer : writers) {
            writer.join();
        }
        std::vector<int> winners;
        for (int i = 0; i < kWriters; ++i) {
            if (results[i]) {
                winners.push_back(i);
            }
        }
        ASSERT_EQ(winners.size(), 1u) << "exactly one writer's stub is in the file";
        const auto stub = ReadNetlist(ngc);
        ASSERT_EQ(stub->GetDesignMgr()->GetNumDesigns(), 1u);
        EXPECT_STREQ(stub->GetDesignMgr()->GetDesignItr().Current()->GetName(),
                     ("design" + std::to_string(winners[0])).c_str());
        // Losers that got past the existence check found the name taken only at the end.
        const std::lock_guard<std::mutex> lock(sinkMutex);
        lateLosers += errors;
        errors = 0;
    }
    Port::SetMessageSink(std::move(previous));
    EXPECT_EQ(FolderContents().size(), static_cast<size_t>(kRounds)) << "no private file is left";
    RecordProperty("losers", lateLosers);
}

TEST_F(NetlistStubs, AStubOfAnotherWriterThatLandsFirstIsNoSuccess) {
    // Both writers passed the check for an existing file; the other one's stub lands
    // while this one is finishing.
    Nmod_Testing::BeforeMoveIntoPlace([](const char* finalPath) {
        Nmod_Testing::BeforeMoveIntoPlace(nullptr);
        ASSERT_TRUE(Utilities::CreateNGC(finalPath, "theirs", "P2", "B2"));
    });
    const std::string ngc = PathOf("top.ngc");
    VnTest::MessageCapture capture;
    const bool ours = Utilities::CreateNGC(ngc.c_str(), "ours", "P", "B");
    Nmod_Testing::BeforeMoveIntoPlace(nullptr);
    EXPECT_FALSE(ours) << "the file holds another writer's design";
    EXPECT_EQ(capture.Errors().size(), 1u) << "the loser says why";
    EXPECT_STREQ(ReadNetlist(ngc)->GetDesignMgr()->GetDesignItr().Current()->GetName(), "theirs");
    EXPECT_EQ(FolderContents(), std::vector<std::string>{"top.ngc"});
}
