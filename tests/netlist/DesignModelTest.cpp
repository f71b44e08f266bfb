//===-- tests/netlist/DesignModelTest.cpp - netlist files told apart, read, written whole -===//
//
// The design-model library: telling netlist files apart, reading them back, and writing
// them all or nothing.
//
//===------------------------------------------------------------------------------===//
#include "MessageCapture.h"
#include "NetlistFiles.h"
#include "Slots.h"

#include "designmodel/Nhlp_PartAnno.h"
#include "designmodel/Nmod_Exception.h"
#include "devdata/PM_PIC.h"

#include <sys/stat.h>

#include <stdexcept>

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

namespace {

/// Reads `path` and expects a Format refusal whose message holds `words`, with nothing
/// handed out.
void ExpectRefusedAsFormat(const std::string& path, const std::string& words) {
    Nmod_Model* model = nullptr;
    Nmod_Txn* txn = nullptr;
    try {
        Nhlp_FileConv::ReadAsNmod(path.c_str(), model, txn, false);
        ADD_FAILURE() << "read although it holds " << words;
        delete model;
    } catch (const Nmod_Exception::Format& e) {
        EXPECT_NE(std::string(e.what()).find(words), std::string::npos) << e.what();
    }
    EXPECT_EQ(model, nullptr);
    EXPECT_EQ(txn, nullptr);
}

} // namespace

TEST_F(NetlistFiles, TheLargeNgdWriterThrowsWhereItCannotWriteAWholeFile) {
    // The benchmarks have no test framework to stop them: a file the writer could not
    // finish must be an exception, never a half-written input measured as if whole.
    EXPECT_THROW(VnTest::WriteLargeNgd(PathOf("missing/large.ngd"), 10, 0, 0), std::runtime_error);
    const std::string existing = PathOf("existing.ngd");
    ASSERT_NO_THROW(VnTest::WriteLargeNgd(existing, 10, 2, 3));
    EXPECT_THROW(VnTest::WriteLargeNgd(existing, 10, 0, 0), std::runtime_error);
    const auto model = ReadNetlist(existing);
    ASSERT_NE(model, nullptr);
    EXPECT_EQ(model->GetDesignMgr()->GetNumDesigns(), 10u);
}

TEST_F(NetlistFiles, ALargeNgdIsReadInTimeProportionalToItsSize) {
    // A reader that looked for duplicates by walking what it had read so far would take
    // many minutes here: 100,000 designs, 50,000 views of one design and 50,000
    // properties of one view.
    const std::string path = PathOf("large.ngd");
    ASSERT_NO_THROW(VnTest::WriteLargeNgd(path, 100000, 50000, 50000));
    EXPECT_EQ(Nhlp_FileConv::CanRead(path.c_str()), Nhlp_FileConv::FILE_READABLE);
    {
        const auto model = ReadNetlist(path);
        ASSERT_NE(model, nullptr);
        Nmod_DesignMgr* designs = model->GetDesignMgr();
        ASSERT_EQ(designs->GetNumDesigns(), 100000u);
        auto order = designs->GetDesignItr();
        EXPECT_STREQ(order.Current()->GetName(), "D0");
        Nmod_Design* first = order.Current();
        EXPECT_EQ(first->GetViewItr().GetCount(), 50001u);
        EXPECT_NE(first->GetViewByName("V49999"), nullptr);
        Nmod_View* wide = first->GetViewByName("EXPANDED");
        ASSERT_NE(wide, nullptr);
        EXPECT_EQ(wide->GetNumProperties(), 50001u);
        EXPECT_STREQ(wide->GetPropertyString("N49999"), "v49999");
        Nmod_View* last = designs->GetDesignByName("D99999")->GetViewByName("EXPANDED");
        ASSERT_NE(last, nullptr);
        EXPECT_STREQ(last->GetPropertyString("PART"), "P99999");
        ASSERT_NE(last->GetBlock(), nullptr);
        EXPECT_STREQ(last->GetBlock()->GetName(), "B99999");
    }

    // A duplicate at the very end is still found, in each of the three tables.
    const char* duplicates[][3] = {
        {"nmod_design", "INSERT INTO nmod_design(name) VALUES ('D0')", "design \"D0\" twice"},
        {"nmod_view", "INSERT INTO nmod_view(design_id, name) VALUES (1, 'V0')",
         "view \"V0\" of design \"D0\" twice"},
        {"nmod_view_property", "INSERT INTO nmod_view_property VALUES (1, 'N0', 'again')",
         "property \"N0\" of view \"EXPANDED\" twice"},
    };
    for (const auto& [table, sql, words] : duplicates) {
        SCOPED_TRACE(sql);
        ExecSql(path, sql);
        ExpectRefusedAsFormat(path, words);
        const std::string undo = std::string("DELETE FROM ") + table +
                                 " WHERE rowid = (SELECT max(rowid) FROM " + table + ")";
        ExecSql(path, undo.c_str());
    }
    // The same names in different owners are no duplicates.
    ExecSql(path, "INSERT INTO nmod_design(id, name) VALUES (200000, 'other');"
                  "INSERT INTO nmod_view(design_id, name) VALUES (200000, 'V0');"
                  "INSERT INTO nmod_view_property VALUES (2, 'N0', 'x');");
    EXPECT_EQ(ReadNetlist(path)->GetDesignMgr()->GetNumDesigns(), 100001u);
}

TEST_F(NetlistFiles, ValuesOfAnotherTypeThanTheColumnsAreRefused) {
    // Written as another program would, without STRICT tables: every column takes any
    // type of value, and the reader must look at each.
    const auto outside = [this](const std::string& name, const std::string& changes) {
        std::string path = PathOf(name);
        ExecSql(path, VnTest::kOutsideSchema);
        ExecSql(path, ("INSERT INTO nmod_format VALUES (1, 'NGD', " +
                       std::to_string(Nmod_Model::kFormatVersion) +
                       ", 'm', 't', 'v');"
                       "INSERT INTO nmod_design VALUES (1, 'D');"
                       "INSERT INTO nmod_view VALUES (1, 1, 'EXPANDED');"
                       "INSERT INTO nmod_view_property VALUES (1, 'PART', 'P');"
                       "INSERT INTO nmod_block VALUES (1, 1, 'B', 0);" +
                       changes)
                          .c_str());
        return path;
    };
    const std::string good = outside("good.ngd", "");
    EXPECT_EQ(Nhlp_FileConv::CanRead(good.c_str()), Nhlp_FileConv::FILE_READABLE);
    const auto read = ReadNetlist(good);
    ASSERT_NE(read, nullptr);
    EXPECT_STREQ(read->GetDesignMgr()
                     ->GetDesignByName("D")
                     ->GetViewByName("EXPANDED")
                     ->GetBlock()
                     ->GetName(),
                 "B");

    struct Case {
        const char* change;
        const char* refusal;
        bool formatRecord; // CanRead looks at the format record only
    };
    const Case cases[] = {
        {"UPDATE nmod_format SET version = '2abc'", "format version that is not a whole", true},
        {"UPDATE nmod_format SET version = 2.5", "format version that is not a whole", true},
        {"UPDATE nmod_format SET version = CAST('2' AS BLOB)", "format version that is not a whole",
         true},
        {"UPDATE nmod_format SET kind = CAST('NGD' AS BLOB)", "format kind that is not text", true},
        {"UPDATE nmod_format SET tool = x'7474'", "tool name that is not text", false},
        {"UPDATE nmod_design SET name = CAST('D' AS BLOB)", "design name that is not text", false},
        {"UPDATE nmod_view SET design_id = 'one'", "view's design that is not a whole", false},
        {"UPDATE nmod_view SET name = x'4558'", "view name that is not text", false},
        {"UPDATE nmod_view_property SET view_id = 1.5", "property's view that is not a whole",
         false},
        {"UPDATE nmod_view_property SET value = x'50'", "property value that is not text", false},
        {"UPDATE nmod_block SET type = '0x'", "block type that is not a whole", false},
        {"UPDATE nmod_block SET type = -1", "of a type out of range", false},
        {"UPDATE nmod_block SET type = 4294967296", "of a type out of range", false},
        {"UPDATE nmod_block SET name = NULL", "block name with no value", false},
    };
    int serial = 0;
    for (const Case& c : cases) {
        SCOPED_TRACE(c.change);
        const std::string path = outside("bad" + std::to_string(serial++) + ".ngd", c.change);
        EXPECT_EQ(Nhlp_FileConv::CanRead(path.c_str()),
                  c.formatRecord ? Nhlp_FileConv::FILE_NOT_NGD : Nhlp_FileConv::FILE_READABLE);
        ExpectRefusedAsFormat(path, c.refusal);
    }
    // The largest type a block can carry is kept whole.
    const std::string widest = outside("widest.ngd", "UPDATE nmod_block SET type = 4294967295");
    EXPECT_EQ(ReadNetlist(widest)
                  ->GetDesignMgr()
                  ->GetDesignByName("D")
                  ->GetViewByName("EXPANDED")
                  ->GetBlock()
                  ->GetType(),
              4294967295u);
}

TEST_F(NetlistFiles, ANameHoldingANulByteIsRefusedNotCut) {
    const std::pair<const char*, const char*> cases[] = {
        {"UPDATE nmod_design SET name = CAST(x'440078' AS TEXT)", "design name with a NUL"},
        {"UPDATE nmod_view SET name = CAST(x'45585000' AS TEXT)", "view name with a NUL"},
        {"UPDATE nmod_view_property SET name = CAST(x'0050' AS TEXT)", "property name with a NUL"},
        {"UPDATE nmod_view_property SET value = CAST(x'500031' AS TEXT)",
         "property value with a NUL"},
        {"UPDATE nmod_block SET name = CAST(x'420042' AS TEXT)", "block name with a NUL"},
        {"UPDATE nmod_format SET model_name = CAST(x'6d006d' AS TEXT)", "model name with a NUL"},
    };
    int serial = 0;
    for (const auto& [change, refusal] : cases) {
        SCOPED_TRACE(change);
        const std::string path = PathOf("nul" + std::to_string(serial++) + ".ngd");
        WriteNetlist(path, {GoodDesign()});
        // Without STRICT checks on, the engine keeps the NUL inside the text.
        ExecSql(path, change);
        ExpectRefusedAsFormat(path, refusal);
    }
}

TEST_F(NetlistFiles, ARowWhoseParentIsNotInTheFileIsRefused) {
    // A file written by another program may link a row to an owner it does not hold; each
    // kind of row is refused by name rather than filed under a guess or dropped. Other
    // rows of the same file point at their owner correctly, so only the dangling link is
    // to blame.
    const std::pair<const char*, const char*> cases[] = {
        {"INSERT INTO nmod_view VALUES (2, 7, 'SOURCE')", "a view of a design it does not hold"},
        {"INSERT INTO nmod_view_property VALUES (7, 'X', 'y')",
         "a property of a view it does not hold"},
        {"UPDATE nmod_block SET view_id = 7", "a block of a view it does not hold"},
    };
    int serial = 0;
    for (const auto& [change, refusal] : cases) {
        SCOPED_TRACE(change);
        const std::string path = PathOf("orphan" + std::to_string(serial++) + ".ngd");
        ExecSql(path, VnTest::kOutsideSchema);
        ExecSql(path, (std::string("INSERT INTO nmod_format VALUES (1, 'NGD', ") +
                       std::to_string(Nmod_Model::kFormatVersion) +
                       ", 'm', 't', 'v');"
                       "INSERT INTO nmod_design VALUES (1, 'D');"
                       "INSERT INTO nmod_view VALUES (1, 1, 'EXPANDED');"
                       "INSERT INTO nmod_view_property VALUES (1, 'PART', 'P');"
                       "INSERT INTO nmod_block VALUES (1, 1, 'B', 0);" +
                       change)
                          .c_str());
        ExpectRefusedAsFormat(path, refusal);
    }
}

TEST_F(NetlistFiles, RowsNumberedWithGapsOrFarApartFindTheirOwners) {
    // Writers number rows 1, 2, 3, ..., but another program may leave gaps, start below
    // zero or use ids near the ends of the range: each row must still land under the
    // owner its id names, and an id in a gap names none.
    const auto outside = [this](const std::string& name, const std::string& more) {
        std::string path = PathOf(name);
        ExecSql(path, VnTest::kOutsideSchema);
        ExecSql(path, ("INSERT INTO nmod_format VALUES (1, 'NGD', " +
                       std::to_string(Nmod_Model::kFormatVersion) +
                       ", 'm', 't', 'v');"
                       "INSERT INTO nmod_design VALUES (-3, 'low'), (5, 'mid'), "
                       "(1000000000000, 'high');"
                       "INSERT INTO nmod_view VALUES (9000000000000000000, -3, 'UP'), "
                       "(-9000000000000000000, 1000000000000, 'DOWN'), (2, 5, 'MID');"
                       "INSERT INTO nmod_view_property VALUES (2, 'PART', 'Pmid'), "
                       "(-9000000000000000000, 'PART', 'Phigh'), "
                       "(9000000000000000000, 'PART', 'Plow');"
                       "INSERT INTO nmod_block VALUES (1, 2, 'Bmid', 0), "
                       "(2, 9000000000000000000, 'Blow', 0);" +
                       more)
                          .c_str());
        return path;
    };
    const auto model = ReadNetlist(outside("sparse.ngd", ""));
    ASSERT_NE(model, nullptr);
    const struct {
        const char* design;
        const char* view;
        const char* part;
        const char* block;
    } expected[] = {{"low", "UP", "Plow", "Blow"},
                    {"mid", "MID", "Pmid", "Bmid"},
                    {"high", "DOWN", "Phigh", nullptr}};
    for (const auto& [design, view, part, block] : expected) {
        SCOPED_TRACE(design);
        Nmod_Design* owner = model->GetDesignMgr()->GetDesignByName(design);
        ASSERT_NE(owner, nullptr);
        ASSERT_EQ(owner->GetViewItr().GetCount(), 1u);
        Nmod_View* read = owner->GetViewByName(view);
        ASSERT_NE(read, nullptr);
        EXPECT_EQ(read->GetNumProperties(), 1u);
        EXPECT_STREQ(read->GetPropertyString("PART"), part);
        if (block == nullptr) {
            EXPECT_EQ(read->GetBlock(), nullptr);
        } else {
            ASSERT_NE(read->GetBlock(), nullptr);
            EXPECT_STREQ(read->GetBlock()->GetName(), block);
        }
    }

    ExpectRefusedAsFormat(outside("gap-design.ngd", "INSERT INTO nmod_view VALUES (3, 4, 'X')"),
                          "a view of a design it does not hold");
    ExpectRefusedAsFormat(outside("gap-view.ngd", "INSERT INTO nmod_view_property VALUES "
                                                  "(3, 'X', 'y')"),
                          "a property of a view it does not hold");
    ExpectRefusedAsFormat(outside("below.ngd", "INSERT INTO nmod_block VALUES (3, "
                                               "-9223372036854775808, 'X', 0)"),
                          "a block of a view it does not hold");
}

namespace {

bool IsWalMode(const std::string& path) {
    const std::string bytes = VnTest::ReadFile(path);
    return bytes.size() > 19 && bytes[18] == 2 && bytes[19] == 2;
}

} // namespace

TEST_F(NetlistFiles, AWriteAheadLogNgdIsReadWithoutWritingBesideIt) {
    const std::string ngd = PathOf("wal.ngd");
    WriteNetlist(ngd, {GoodDesign("top", "ice40hx8k-ct256", "root")});
    ExecSql(ngd, "PRAGMA journal_mode = WAL");
    ASSERT_TRUE(IsWalMode(ngd));
    ASSERT_EQ(FolderContents(), std::vector<std::string>{"wal.ngd"});

    // The folder is writable here, so a -wal or -shm file made by any step would show.
    EXPECT_EQ(Nhlp_FileConv::CanRead(ngd.c_str()), Nhlp_FileConv::FILE_READABLE);
    EXPECT_TRUE(Nmod_Model::IsQdbReadable(ngd.c_str()));
    const auto model = ReadNetlist(ngd);
    ASSERT_NE(model, nullptr);
    Nmod_View* view = model->GetDesignMgr()->GetDesignByName("top")->GetViewByName("EXPANDED");
    ASSERT_NE(view, nullptr);
    EXPECT_STREQ(view->GetPropertyString("PART"), "ice40hx8k-ct256");
    EXPECT_EQ(FolderContents(), std::vector<std::string>{"wal.ngd"})
        << "reading wrote beside the file, even with the model still open";
}

TEST_F(NetlistFiles, AWriteAheadLogNgdInAReadOnlyFolderIsRead) {
    if (::geteuid() == 0) {
        GTEST_SKIP() << "running as root: a folder's permissions do not keep root from writing "
                        "there, so they prove nothing; the test above checks that nothing is "
                        "written beside the file";
    }
    const std::string ngd = PathOf("wal.ngd");
    WriteNetlist(ngd, {GoodDesign()});
    ExecSql(ngd, "PRAGMA journal_mode = WAL");
    ASSERT_EQ(::chmod(m_folder.c_str(), 0555), 0);
    EXPECT_EQ(Nhlp_FileConv::CanRead(ngd.c_str()), Nhlp_FileConv::FILE_READABLE);
    EXPECT_TRUE(Nmod_Model::IsQdbReadable(ngd.c_str()));
    const auto model = ReadNetlist(ngd);
    ASSERT_NE(model, nullptr);
    EXPECT_EQ(model->GetDesignMgr()->GetNumDesigns(), 1u);
}

TEST_F(NetlistFiles, AnNgdWhoseLastChangesStayInALogBesideItIsRefused) {
    // Copy a file and its log while a writer holds changes in the log only.
    const std::string live = PathOf("live.ngd");
    WriteNetlist(live, {GoodDesign()});
    ExecSql(live, "PRAGMA journal_mode = WAL");
    sqlite3* writer = nullptr;
    ASSERT_EQ(sqlite3_open(live.c_str(), &writer), SQLITE_OK);
    ASSERT_EQ(
        sqlite3_exec(writer, "UPDATE nmod_design SET name = 'renamed'", nullptr, nullptr, nullptr),
        SQLITE_OK);
    const std::string copy = PathOf("copy.ngd");
    std::filesystem::copy_file(live, copy);
    std::filesystem::copy_file(live + "-wal", copy + "-wal");
    sqlite3_close(writer);
    ASSERT_GT(std::filesystem::file_size(copy + "-wal"), 0u);
    const std::string log = VnTest::ReadFile(copy + "-wal");

    EXPECT_EQ(Nhlp_FileConv::CanRead(copy.c_str()), Nhlp_FileConv::FILE_NOT_NGD);
    EXPECT_FALSE(Nmod_Model::IsQdbReadable(copy.c_str()));
    ExpectRefusedAsFormat(copy, "never written into it");
    EXPECT_EQ(VnTest::ReadFile(copy + "-wal"), log);
    EXPECT_FALSE(std::filesystem::exists(copy + "-shm"));
    // The writer's own file, its log taken back in when it closed, reads with the change.
    EXPECT_NE(ReadNetlist(live)->GetDesignMgr()->GetDesignByName("renamed"), nullptr);
}

TEST_F(NetlistFiles, PlacementIsRecordedOnlyForTheModelsOwnFile) {
    bool placed = true;
    {
        Nmod_Model model("m", "t", "v", false);
        model.RecordPlacementIn(&placed);
        EXPECT_FALSE(placed);
        model.Create(PathOf("mine.ngc").c_str(), false, false);
        model.GetDesignMgr()->CreateDesign("D");
        EXPECT_FALSE(placed) << "nothing is in place before the model is done";
    }
    EXPECT_TRUE(placed);

    // Another writer's file under the name: the model keeps out, and says it did.
    const std::string raced = PathOf("raced.ngc");
    {
        VnTest::MessageCapture capture;
        Nmod_Model model("m", "t", "v", false);
        model.RecordPlacementIn(&placed);
        model.Create(raced.c_str(), false, false);
        WriteFile(raced, "first");
    }
    EXPECT_FALSE(placed);
    EXPECT_EQ(VnTest::ReadFile(raced), "first");

    // Close finishes early and records it there.
    Nmod_Model closing("m", "t", "v", false);
    closing.RecordPlacementIn(&placed);
    closing.Create(PathOf("closed.ngc").c_str(), false, false);
    closing.Close();
    EXPECT_TRUE(placed);

    // A model unwound by an exception, or one that never wrote, places nothing.
    try {
        Nmod_Model model("m", "t", "v", false);
        model.RecordPlacementIn(&placed);
        model.Create(PathOf("unwound.ngc").c_str(), false, false);
        throw std::runtime_error("given up");
    } catch (const std::runtime_error&) {
    }
    EXPECT_FALSE(placed);
    {
        Nmod_Model idle("m", "t", "v", false);
        idle.RecordPlacementIn(&placed);
        idle.Close();
    }
    EXPECT_FALSE(placed);
}
