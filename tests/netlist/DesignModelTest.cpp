// The design-model library: telling netlist files apart, reading them back, and writing
// them all or nothing.
#include "MessageCapture.h"
#include "NetlistFiles.h"
#include "Slots.h"

#include "designmodel/Nhlp_PartAnno.h"
#include "designmodel/Nmod_Exception.h"
#include "devdata/PM_PIC.h"

#include <sys/stat.h>

using VnTest::DesignSpec;
using VnTest::ExecSql;
using VnTest::GoodDesign;
using VnTest::ReadNetlist;
using VnTest::WriteFile;
using VnTest::WriteNetlist;

namespace {

class NetlistFiles : public VnTest::NetlistFolder {};

/// Overwrites the last page of a database file, which the format record does not use.
void DamageLastPage(const std::string& path) {
    std::string bytes = VnTest::ReadFile(path);
    const size_t pageSize = 4096;
    ASSERT_GT(bytes.size(), 4 * pageSize) << "fixture too small to damage one table only";
    std::fill(bytes.end() - static_cast<std::ptrdiff_t>(pageSize), bytes.end(), '\xFF');
    WriteFile(path, bytes);
}

/// A design whose properties fill several pages.
DesignSpec BulkyDesign() {
    DesignSpec design = GoodDesign();
    for (int i = 0; i < 200; ++i) {
        design.views[0].properties.emplace_back("P" + std::to_string(i), std::string(100, 'v'));
    }
    return design;
}

} // namespace

TEST_F(NetlistFiles, CanReadTellsEveryKindOfFileApart) {
    const std::string good = PathOf("good.ngd");
    WriteNetlist(good, {GoodDesign()});
    EXPECT_EQ(Nhlp_FileConv::CanRead(good.c_str()), Nhlp_FileConv::FILE_READABLE);

    EXPECT_EQ(Nhlp_FileConv::CanRead(PathOf("missing.ngd").c_str()), Nhlp_FileConv::FILE_NOT_FOUND);
    EXPECT_EQ(Nhlp_FileConv::CanRead((good + "/below.ngd").c_str()), Nhlp_FileConv::FILE_NOT_FOUND);
    EXPECT_EQ(Nhlp_FileConv::CanRead(""), Nhlp_FileConv::FILE_NOT_FOUND);
    EXPECT_EQ(Nhlp_FileConv::CanRead(nullptr), Nhlp_FileConv::FILE_NOT_FOUND);

    EXPECT_EQ(Nhlp_FileConv::CanRead(m_folder.c_str()), Nhlp_FileConv::FILE_NOT_NGD);
    WriteFile(PathOf("text.ngd"), "design D\npart P\n");
    EXPECT_EQ(Nhlp_FileConv::CanRead(PathOf("text.ngd").c_str()), Nhlp_FileConv::FILE_NOT_NGD);
    WriteFile(PathOf("empty.ngd"), "");
    EXPECT_EQ(Nhlp_FileConv::CanRead(PathOf("empty.ngd").c_str()), Nhlp_FileConv::FILE_NOT_NGD);

    const std::string ngc = PathOf("stub.ngc");
    WriteNetlist(ngc, {GoodDesign()}, false);
    EXPECT_EQ(Nhlp_FileConv::CanRead(ngc.c_str()), Nhlp_FileConv::FILE_NOT_NGD);

    const std::string foreign = PathOf("foreign.db");
    ExecSql(foreign.c_str(), "CREATE TABLE t(x); INSERT INTO t VALUES (1);");
    EXPECT_EQ(Nhlp_FileConv::CanRead(foreign.c_str()), Nhlp_FileConv::FILE_NOT_NGD);

    const std::string noRecord = PathOf("norecord.ngd");
    WriteNetlist(noRecord, {GoodDesign()});
    ExecSql(noRecord, "DELETE FROM nmod_format");
    EXPECT_EQ(Nhlp_FileConv::CanRead(noRecord.c_str()), Nhlp_FileConv::FILE_NOT_NGD);

    const std::string old = PathOf("old.ngd");
    WriteNetlist(old, {GoodDesign()});
    ExecSql(old, "UPDATE nmod_format SET version = 1");
    EXPECT_EQ(Nhlp_FileConv::CanRead(old.c_str()), Nhlp_FileConv::FILE_OBSOLETE);

    const std::string newer = PathOf("newer.ngd");
    WriteNetlist(newer, {GoodDesign()});
    ExecSql(newer, "UPDATE nmod_format SET version = 3");
    EXPECT_EQ(Nhlp_FileConv::CanRead(newer.c_str()), Nhlp_FileConv::FILE_NOT_NGD);

    const std::string loop = PathOf("loop.ngd");
    std::filesystem::create_symlink(loop, loop);
    EXPECT_EQ(Nhlp_FileConv::CanRead(loop.c_str()), Nhlp_FileConv::FILE_UNKNOWN_ERROR);
}

TEST_F(NetlistFiles, CanReadReportsAFileItMayNotRead) {
    if (::geteuid() == 0) {
        GTEST_SKIP() << "running as root: permissions do not keep root from reading";
    }
    const std::string locked = PathOf("locked.ngd");
    WriteNetlist(locked, {GoodDesign()});
    ASSERT_EQ(::chmod(locked.c_str(), 0), 0);
    EXPECT_EQ(Nhlp_FileConv::CanRead(locked.c_str()), Nhlp_FileConv::FILE_NO_READ_PERMISSION);
}

TEST_F(NetlistFiles, IntegrityCheckFindsDamageThatTheFormatRecordHides) {
    const std::string good = PathOf("good.ngd");
    WriteNetlist(good, {BulkyDesign()});
    EXPECT_TRUE(Nmod_Model::IsQdbReadable(good.c_str()));

    const std::string damaged = PathOf("damaged.ngd");
    WriteNetlist(damaged, {BulkyDesign()});
    DamageLastPage(damaged);
    EXPECT_EQ(Nhlp_FileConv::CanRead(damaged.c_str()), Nhlp_FileConv::FILE_READABLE);
    EXPECT_FALSE(Nmod_Model::IsQdbReadable(damaged.c_str()));

    WriteFile(PathOf("text.ngd"), "not a database at all, but long enough to have a header");
    EXPECT_FALSE(Nmod_Model::IsQdbReadable(PathOf("text.ngd").c_str()));
    EXPECT_FALSE(Nmod_Model::IsQdbReadable(PathOf("missing.ngd").c_str()));
    // Checking must not create what it checks.
    EXPECT_FALSE(std::filesystem::exists(PathOf("missing.ngd")));
    EXPECT_FALSE(Nmod_Model::IsQdbReadable(nullptr));
}

TEST_F(NetlistFiles, ReadBackGivesWhatWasWrittenInOrder) {
    const std::string path = PathOf("two.ngd");
    {
        Nmod_Model model("top", "mytool", "4.2", false);
        model.Create(path.c_str(), true, false);
        model.CreateTxn("build", Nmod_Txn::NMOD_TXN_UPDATE);
        Nmod_Design* second = model.GetDesignMgr()->CreateDesign("zeta");
        Nmod_Design* first = model.GetDesignMgr()->CreateDesign("alpha");
        Nmod_View* view = first->CreateView("EXPANDED", true);
        view->CreatePropertyString("PART", "old");
        view->CreatePropertyString("note", "it's \"quoted\" and %s");
        view->CreatePropertyString("PART", "ice40hx8k-ct256");
        view->CreateBlock("root", 7);
        EXPECT_EQ(first->CreateView("EXPANDED", false), view);
        second->CreateView("SOURCE", true);
    }
    const auto model = ReadNetlist(path);
    ASSERT_NE(model, nullptr);
    EXPECT_STREQ(model->GetModelName(), "top");
    EXPECT_STREQ(model->GetToolName(), "mytool");
    EXPECT_STREQ(model->GetToolVersion(), "4.2");
    EXPECT_TRUE(model->IsNgd());
    ASSERT_NE(model->GetTxn(), nullptr);
    EXPECT_EQ(model->GetTxn()->GetType(), Nmod_Txn::NMOD_TXN_READ_ONLY);

    auto designs = model->GetDesignMgr()->GetDesignItr();
    ASSERT_EQ(designs.GetCount(), 2u);
    EXPECT_STREQ((*designs)->GetName(), "zeta");
    designs.Next();
    Nmod_Design* alpha = designs.Current();
    EXPECT_STREQ(alpha->GetName(), "alpha");
    designs.Next();
    EXPECT_TRUE(designs.IsEnd());
    EXPECT_EQ(designs.Current(), nullptr);

    Nmod_View* view = alpha->GetViewByName("EXPANDED");
    ASSERT_NE(view, nullptr);
    EXPECT_EQ(view->GetNumProperties(), 2u);
    EXPECT_STREQ(view->GetPropertyString("PART"), "ice40hx8k-ct256");
    EXPECT_STREQ(view->GetPropertyString("note"), "it's \"quoted\" and %s");
    EXPECT_EQ(view->GetPropertyString("part"), nullptr);
    ASSERT_NE(view->GetBlock(), nullptr);
    EXPECT_STREQ(view->GetBlock()->GetName(), "root");
    EXPECT_EQ(view->GetBlock()->GetType(), 7u);
    EXPECT_EQ(alpha->GetViewByName("SOURCE"), nullptr);
    EXPECT_EQ(model->GetDesignMgr()->GetDesignByName("zeta")->GetViewByName("SOURCE")->GetBlock(),
              nullptr);

    Nhlp_PartAnno part(view);
    ASSERT_NE(part.GetPmPic(), nullptr);
    EXPECT_EQ(part.GetPmPic()->getDatabookName(), "ice40hx8k-ct256");
    EXPECT_EQ(Nhlp_PartAnno(nullptr).GetPmPic(), nullptr);
    Nmod_View* noPart = model->GetDesignMgr()->GetDesignByName("zeta")->GetViewByName("SOURCE");
    EXPECT_EQ(Nhlp_PartAnno(noPart).GetPmPic(), nullptr);
}

TEST_F(NetlistFiles, ReadingRefusesWhatItCannotReadAndHandsOutNothing) {
    WriteFile(PathOf("text.ngd"), "design D\n");
    Nmod_Model* model = nullptr;
    Nmod_Txn* txn = nullptr;
    try {
        Nhlp_FileConv::ReadAsNmod(PathOf("text.ngd").c_str(), model, txn, false);
        ADD_FAILURE() << "a text file was read as a netlist";
    } catch (const Nmod_Exception::Database& e) {
        // The engine's own words reach the caller.
        EXPECT_NE(std::string(e.what()).find("file is not a database"), std::string::npos)
            << e.what();
        EXPECT_NE(std::string(e.what()).find("text.ngd"), std::string::npos) << e.what();
    }
    EXPECT_EQ(model, nullptr);
    EXPECT_EQ(txn, nullptr);

    const std::string orphan = PathOf("orphan.ngd");
    WriteNetlist(orphan, {GoodDesign()});
    ExecSql(orphan, "PRAGMA foreign_keys = OFF; DELETE FROM nmod_design;");
    EXPECT_THROW(Nhlp_FileConv::ReadAsNmod(orphan.c_str(), model, txn, false),
                 Nmod_Exception::Format);

    const std::string damaged = PathOf("damaged.ngd");
    WriteNetlist(damaged, {BulkyDesign()});
    DamageLastPage(damaged);
    EXPECT_THROW(Nhlp_FileConv::ReadAsNmod(damaged.c_str(), model, txn, true),
                 Nmod_Exception::Base);
    EXPECT_THROW(Nhlp_FileConv::ReadAsNmod(PathOf("missing.ngd").c_str(), model, txn, false),
                 Nmod_Exception::Database);
    EXPECT_EQ(model, nullptr);
    EXPECT_FALSE(std::filesystem::exists(PathOf("missing.ngd")));
}

TEST_F(NetlistFiles, AFileNamedLikeAnEngineUriIsAPlainFile) {
    const std::string name = "file:x.ngd?mode=memory";
    const auto previous = std::filesystem::current_path();
    std::filesystem::current_path(m_folder);
    WriteNetlist(name, {GoodDesign()});
    const auto model = ReadNetlist(name);
    std::filesystem::current_path(previous);
    EXPECT_TRUE(std::filesystem::exists(PathOf(name)));
    ASSERT_NE(model, nullptr);
    EXPECT_EQ(model->GetDesignMgr()->GetNumDesigns(), 1u);
}

TEST_F(NetlistFiles, AFileAppearsUnderItsNameOnlyWhenTheModelIsDone) {
    const std::string path = PathOf("top.ngc");
    {
        Nmod_Model model("m", "t", "v", false);
        model.Create(path.c_str(), false, false);
        model.GetDesignMgr()->CreateDesign("D")->CreateView("SOURCE", true)->CreateBlock("B", 0);
        EXPECT_FALSE(std::filesystem::exists(path));
        EXPECT_EQ(FolderContents().size(), 1u) << "one private file while writing";
    }
    EXPECT_EQ(FolderContents(), std::vector<std::string>{"top.ngc"});
    EXPECT_TRUE(Nmod_Model::IsQdbReadable(path.c_str()));

    // Close finishes early; the model writes nothing after that.
    const std::string early = PathOf("early.ngc");
    Nmod_Model model("m", "t", "v", false);
    model.Create(early.c_str(), false, false);
    Nmod_Design* design = model.GetDesignMgr()->CreateDesign("D");
    model.Close();
    EXPECT_TRUE(std::filesystem::exists(early));
    EXPECT_THROW(design->CreateView("SOURCE", true), Nmod_Exception::Usage);
    model.Close();
}

TEST_F(NetlistFiles, AModelUnwoundByAnExceptionLeavesNoFile) {
    const std::string path = PathOf("top.ngc");
    try {
        Nmod_Model model("m", "t", "v", false);
        model.Create(path.c_str(), false, false);
        model.GetDesignMgr()->CreateDesign("D");
        throw std::runtime_error("the caller gave up");
    } catch (const std::runtime_error&) {
    }
    EXPECT_TRUE(FolderContents().empty());
}

TEST_F(NetlistFiles, EveryFailedWriteStepLeavesNothingBehind) {
    const std::string path = PathOf("top.ngd");
    long failures = 0;
    for (long step = 0;; ++step) {
        ASSERT_LT(step, 100) << "writing never finished";
        Nmod_Testing::FailWriteStep(step);
        VnTest::MessageCapture capture;
        bool thrown = false;
        try {
            WriteNetlist(path, {GoodDesign()});
        } catch (const Nmod_Exception::Database& e) {
            thrown = true;
            EXPECT_EQ(e.GetCode(), SQLITE_FULL);
        }
        if (!thrown && capture.Errors().empty()) {
            break; // the chosen step lies beyond the last one
        }
        ++failures;
        SCOPED_TRACE("failing step " + std::to_string(step));
        // Steps inside the destructor cannot throw; they are reported instead.
        EXPECT_TRUE(thrown || capture.Errors().size() == 1u);
        EXPECT_TRUE(FolderContents().empty());
    }
    EXPECT_GE(failures, 8) << "schema, record, rows, commit and move are all steps";
    ASSERT_TRUE(std::filesystem::exists(path));
    EXPECT_EQ(Nhlp_FileConv::CanRead(path.c_str()), Nhlp_FileConv::FILE_READABLE);
}

TEST_F(NetlistFiles, CreateNeverReplacesAFileUnlessAsked) {
    const std::string path = PathOf("top.ngc");
    WriteFile(path, "keep me");
    Nmod_Model refused("m", "t", "v", false);
    EXPECT_THROW(refused.Create(path.c_str(), false, false), Nmod_Exception::Usage);
    EXPECT_EQ(VnTest::ReadFile(path), "keep me");

    // A file that turns up while the model writes is kept, and the model says so.
    const std::string raced = PathOf("raced.ngc");
    {
        VnTest::MessageCapture capture;
        {
            Nmod_Model model("m", "t", "v", false);
            model.Create(raced.c_str(), false, false);
            WriteFile(raced, "first");
        }
        EXPECT_EQ(capture.Errors().size(), 1u);
    }
    EXPECT_EQ(VnTest::ReadFile(raced), "first");

    {
        Nmod_Model model("m", "t", "v", false);
        model.Create(path.c_str(), false, true);
        model.GetDesignMgr()->CreateDesign("D");
    }
    EXPECT_TRUE(Nmod_Model::IsQdbReadable(path.c_str()));
    EXPECT_EQ((std::vector<std::string>{"raced.ngc", "top.ngc"}), FolderContents());
}

TEST_F(NetlistFiles, MisuseIsRefusedWithUsageErrors) {
    Nmod_Model unopened("m", "t", "v", false);
    EXPECT_THROW(unopened.GetDesignMgr()->CreateDesign("D"), Nmod_Exception::Usage);
    EXPECT_THROW(unopened.Create(nullptr, false, false), Nmod_Exception::Usage);
    EXPECT_THROW(unopened.Create("", false, false), Nmod_Exception::Usage);
    EXPECT_THROW(Nmod_Model("m", "t", "v", true).Create(PathOf("x.ngc").c_str(), false, false),
                 Nmod_Exception::Usage);

    Nmod_Model model("m", "t", "v", false);
    model.Create(PathOf("x.ngc").c_str(), false, false);
    EXPECT_THROW(model.Create(PathOf("y.ngc").c_str(), false, false), Nmod_Exception::Usage);
    model.CreateTxn("t", Nmod_Txn::NMOD_TXN_UPDATE);
    EXPECT_THROW(model.CreateTxn("u", Nmod_Txn::NMOD_TXN_UPDATE), Nmod_Exception::Usage);
    model.DeleteTxn();
    EXPECT_EQ(model.GetTxn(), nullptr);
    Nmod_Design* design = model.GetDesignMgr()->CreateDesign("D");
    EXPECT_THROW(model.GetDesignMgr()->CreateDesign("D"), Nmod_Exception::Usage);
    EXPECT_THROW(model.GetDesignMgr()->CreateDesign(nullptr), Nmod_Exception::Usage);
    Nmod_View* view = design->CreateView("V", true);
    EXPECT_THROW(design->CreateView("V", true), Nmod_Exception::Usage);
    view->CreateBlock("B", 0);
    EXPECT_THROW(view->CreateBlock("C", 0), Nmod_Exception::Usage);
    EXPECT_THROW(view->CreatePropertyString("PART", nullptr), Nmod_Exception::Usage);
    model.Close();
    // Refused misuse does not spoil the file.
    const auto read = ReadNetlist(PathOf("x.ngc"));
    EXPECT_EQ(read->GetDesignMgr()->GetNumDesigns(), 1u);
    EXPECT_STREQ(
        read->GetDesignMgr()->GetDesignByName("D")->GetViewByName("V")->GetBlock()->GetName(), "B");
    EXPECT_THROW(read->GetDesignMgr()->CreateDesign("E"), Nmod_Exception::Usage);
}

TEST_F(NetlistFiles, AMissingFolderIsADatabaseErrorWithTheSystemsWords) {
    Nmod_Model model("m", "t", "v", false);
    try {
        model.Create(PathOf("no/such/folder/top.ngc").c_str(), false, false);
        ADD_FAILURE() << "created a file in a folder that does not exist";
    } catch (const Nmod_Exception::Database& e) {
        EXPECT_NE(std::string(e.what()).find("No such file or directory"), std::string::npos)
            << e.what();
    }
    EXPECT_TRUE(FolderContents().empty());
}

TEST(NmodExceptions, ReportIsTheThirdVirtualOperationAndIssuesOneError) {
    // Destructor (two slots), what(), Report(): callers reach Report by its place.
    EXPECT_EQ(VnTest::SlotOf(&Nmod_Exception::Base::Report), 3);
    VnTest::MessageCapture capture;
    const Nmod_Exception::Database error("cannot write \"a%n.ngc\": disk full", 13);
    const int line = __LINE__ - 1;
    static_cast<const Nmod_Exception::Base&>(error).Report();
    ASSERT_EQ(capture.Messages().size(), 1u);
    const Port::Message& message = capture.Messages()[0];
    EXPECT_EQ(message.severity, Port::Severity::Error);
    EXPECT_EQ(message.domain, "Nmod");
    EXPECT_EQ(message.text, "cannot write \"a%n.ngc\": disk full\n");
    EXPECT_EQ(message.unit, "../designmodel/DesignModelTest");
    EXPECT_EQ(message.line, line);
}
