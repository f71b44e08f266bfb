//===-- tests/ProjFileHelperTest.cpp - the lookup finds the files; the host keeps nothing -===//
//
// Each test writes a project description for the sample host, points VENLOMER_PROJECT at
// it and runs the lookup. After every lookup the host must hold nothing of the lookup's:
// the project-manager component no object at all, the task-helper component only its
// open session, and after closing that, nothing.
//
//===------------------------------------------------------------------------------===//
#include "s/ProjFileHelper.h"

#include "CitP/Factory.h"
#include "MessageCapture.h"
#include "ProjectDescription.h"
#include "hostproj/Components.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

#include <dlfcn.h>

namespace {

using ::testing::ElementsAre;
using ::testing::ElementsAreArray;
using ::testing::HasSubstr;

// A function a sample component exports, or null while the component is not loaded.
template <class F> F ComponentFunction(const char* component, const char* name) {
    const std::string path = CitP::Factory::LoadedPath(component);
    if (path.empty()) {
        return nullptr;
    }
    void* handle = ::dlopen(path.c_str(), RTLD_NOW | RTLD_NOLOAD);
    if (handle == nullptr) {
        return nullptr;
    }
    auto function = reinterpret_cast<F>(::dlsym(handle, name));
    ::dlclose(handle); // drops only the NOLOAD reference
    return function;
}

int CallCount(const char* component, const char* name) {
    auto function = ComponentFunction<int (*)()>(component, name);
    return function != nullptr ? function() : 0;
}

int TaskHelperAlive() {
    return CallCount(HostProj::kTaskHelperComponent, "VenlomerSampleTaskHelper_AliveObjects");
}
int SessionObjects() {
    return CallCount(HostProj::kTaskHelperComponent, "VenlomerSampleTaskHelper_SessionObjects");
}
int ProjectManagerAlive() {
    return CallCount(HostProj::kProjectManagerComponent, "VenlomerSampleProjMgr_AliveObjects");
}
void CloseHostProject() {
    if (auto close = ComponentFunction<void (*)()>(HostProj::kTaskHelperComponent,
                                                   "VenlomerSampleTaskHelper_CloseProject")) {
        close();
    }
}

struct Lookup {
    bool found = false;
    std::string project, ngd, ucf;
    std::vector<std::string> debug;
    std::vector<std::string> errors;
};

class ProjectLookup : public ::testing::Test {
protected:
    void SetUp() override {
        std::string pattern =
            (std::filesystem::temp_directory_path() / "venlomer-proj-XXXXXX").string();
        ASSERT_NE(::mkdtemp(pattern.data()), nullptr);
        m_dir = pattern;
        ::unsetenv("VENLOMER_PROJECT");
    }
    void TearDown() override {
        CloseHostProject();
        ::unsetenv("VENLOMER_PROJECT");
        std::filesystem::remove_all(m_dir);
    }

    // Writes the description and makes it the host's project for the next lookup.
    void Describe(const std::string& text) {
        const std::filesystem::path file = m_dir / "project.txt";
        std::ofstream(file, std::ios::binary) << text;
        ::setenv("VENLOMER_PROJECT", file.c_str(), 1);
    }

    // Runs the lookup on out-parameters that hold stale text, as a caller's might.
    Lookup Run() {
        VnTest::MessageCapture capture;
        Port::StringBase<char> project("stale"), ngd("stale"), ucf("stale");
        Lookup result;
        result.found = Vn::Eng::ProjFileHelper::GetFilesFromHost(project, ngd, ucf);
        result.project = project.str();
        result.ngd = ngd.str();
        result.ucf = ucf.str();
        result.debug = capture.Debug();
        result.errors = capture.Errors();
        return result;
    }

    // Nothing the lookup received may still be alive: only the host's own session.
    static void ExpectEverythingReleased() {
        EXPECT_EQ(ProjectManagerAlive(), 0) << "project-manager objects left alive";
        EXPECT_EQ(TaskHelperAlive(), SessionObjects()) << "task-helper objects beside the session";
        CloseHostProject();
        EXPECT_EQ(TaskHelperAlive(), 0) << "the session's objects carry extra references";
    }

    std::filesystem::path m_dir;
};

const char kProject[] = R"(# a small design with a synthesis and a translation view
project "/designs/top/top.zam"
view synth VIEW_Synthesis
view xlate VIEW_Translation
default synth
unit synth DESUT_VHDL "/designs/top/src/" "top.vhd"
unit synth DESUT_UCF "/designs/top/" "top.ucf"
binding synth xlate
unit xlate DESUT_NGD "/designs/top/build/" "top.ngd"
)";

TEST_F(ProjectLookup, FindsAllThreeNamesAndReportsEachStepInOrder) {
    Describe(kProject);
    const Lookup result = Run();
    EXPECT_TRUE(result.found);
    EXPECT_EQ(result.project, "/designs/top/top.zam");
    EXPECT_EQ(result.ucf, "/designs/top/top.ucf");
    EXPECT_EQ(result.ngd, "/designs/top/build/top.ngd");
    EXPECT_THAT(result.debug,
                ElementsAre("ZAM File /designs/top/top.zam\n", "Got ID for file DESUT_VHDL\n",
                            "Got ID for file DESUT_UCF\n", "UCF File /designs/top/top.ucf\n",
                            "Got ID for file DESUT_NGD\n",
                            "NGD File /designs/top/build/top.ngd\n"));
    EXPECT_TRUE(result.errors.empty());
    ExpectEverythingReleased();
    EXPECT_FALSE(CitP::Factory::LoadedPath(HostProj::kTaskHelperComponent).empty());
    EXPECT_FALSE(CitP::Factory::LoadedPath(HostProj::kProjectManagerComponent).empty());
}

TEST_F(ProjectLookup, ReadsTheProjectAnewOnEveryCall) {
    Describe(kProject);
    ASSERT_TRUE(Run().found);
    std::string other = kProject;
    other.replace(other.find("top.ngd"), 7, "next.ngd");
    Describe(other);
    EXPECT_EQ(Run().ngd, "/designs/top/build/next.ngd");
    ExpectEverythingReleased();
}

TEST_F(ProjectLookup, JoinsDirectoryAndFileTextsWithNothingBetween) {
    Describe(R"(project p.zam
view a VIEW_Synthesis
view t VIEW_Translation
default a
unit a DESUT_UCF "C:dir" "top.ucf"
unit t DESUT_NGD "" "only-a-file.ngd"
binding a t
)");
    const Lookup result = Run();
    EXPECT_TRUE(result.found);
    EXPECT_EQ(result.ucf, "C:dirtop.ucf");
    EXPECT_EQ(result.ngd, "only-a-file.ngd");
    ExpectEverythingReleased();
}

TEST_F(ProjectLookup, TakesTheViewTypeIgnoringCaseButUnitTypesOnlyExactly) {
    Describe(R"(project p.zam
view a VIEW_Synthesis
view t view_TRANSLATION
default a
unit a desut_ucf "/d/" "lower.ucf"
unit a DESUT_UCF "/d/" "exact.ucf"
binding a t
unit t Desut_Ngd "/d/" "mixed.ngd"
unit t DESUT_NGD "/d/" "exact.ngd"
)");
    const Lookup result = Run();
    EXPECT_TRUE(result.found);
    EXPECT_EQ(result.ucf, "/d/exact.ucf");
    EXPECT_EQ(result.ngd, "/d/exact.ngd");
    ExpectEverythingReleased();
}

TEST_F(ProjectLookup, SearchesDepthFirstThroughBindingInstancesToAnyDepth) {
    // deep's translation view is two binding instances down the first binding instance;
    // the second binding instance's is nearer but comes later in depth-first order.
    Describe(R"(project p.zam
view top VIEW_Synthesis
view mid VIEW_Map
view deep VIEW_Translation
view near VIEW_Translation
default top
unit top DESUT_UCF "/d/" "top.ucf"
binding top mid
binding top near
binding mid deep
unit deep DESUT_NGD "/d/" "deep.ngd"
unit near DESUT_NGD "/d/" "near.ngd"
)");
    const Lookup result = Run();
    EXPECT_TRUE(result.found);
    EXPECT_EQ(result.ngd, "/d/deep.ngd");
    ExpectEverythingReleased();
}

TEST_F(ProjectLookup, ReadsAViewTypeThatHasOnlyTheSecondIdentity) {
    Describe(R"(project p.zam
view a VIEW_Synthesis
view untyped
view t VIEW_Translation second
default a
unit a DESUT_UCF "/d/" "a.ucf"
binding a untyped t
unit t DESUT_NGD "/d/" "t.ngd"
)");
    const Lookup result = Run();
    EXPECT_TRUE(result.found);
    EXPECT_EQ(result.ngd, "/d/t.ngd");
    ExpectEverythingReleased();
}

TEST_F(ProjectLookup, LetsALaterUnitOfATypeOverwriteAnEarlierOne) {
    Describe(R"(project p.zam
view a VIEW_Synthesis
view t VIEW_Translation
default a
unit a DESUT_UCF "/d/" "first.ucf"
unit a DESUT_UCF "/d/" "second.ucf"
binding a t
unit t DESUT_NGD "/d/" "first.ngd"
unit t DESUT_NGD "/d/" "second.ngd"
)");
    const Lookup result = Run();
    EXPECT_TRUE(result.found);
    EXPECT_EQ(result.ucf, "/d/second.ucf");
    EXPECT_EQ(result.ngd, "/d/second.ngd");
    ExpectEverythingReleased();
}

TEST_F(ProjectLookup, LetsALaterUnitOverwriteOneThatNamedItsViewBeforeTheDeclaration) {
    // The first unit waits for its view; the second, read once the view is known, must
    // still come after it.
    Describe(R"(project p.zam
unit a DESUT_UCF "/d/" "first.ucf"
unit t DESUT_NGD "/d/" "first.ngd"
view a VIEW_Synthesis
view t VIEW_Translation
default a
unit a DESUT_UCF "/d/" "second.ucf"
binding a t
unit t DESUT_NGD "/d/" "second.ngd"
)");
    const Lookup result = Run();
    EXPECT_TRUE(result.found);
    EXPECT_EQ(result.ucf, "/d/second.ucf");
    EXPECT_EQ(result.ngd, "/d/second.ngd");
    ExpectEverythingReleased();
}

// The parsed views, one line each: name, units' files in order, bindings' views in order.
std::string Render(const SampleHost::Description& description) {
    std::string text;
    for (const auto& view : description.views) {
        text += view.name + ":";
        for (const auto& unit : view.units) {
            text += " " + unit.typeId + "=" + unit.directory + unit.file;
        }
        for (const auto& produced : view.bindings) {
            text += " [";
            for (std::size_t index : produced) {
                text += " " + description.views.at(index).name;
            }
            text += " ]";
        }
        text += "\n";
    }
    return text;
}

TEST(ProjectDescription, KeepsFileOrderWhereLinesNameAViewAboveAndBelowItsDeclaration) {
    // On view a: lines before its declaration, lines after it that must queue behind
    // those, and a binding waiting for a view further down. On b: a binding filed at once,
    // then one that waits, then one that could be filed at once but must not overtake.
    // On c: a unit filed at once only because nothing of c's waits.
    const std::string text = R"(project p.zam
unit a DESUT_VHDL "/d/" "1.vhd"
binding a t
view a VIEW_Synthesis
view b
binding b a
unit a DESUT_UCF "/d/" "2.ucf"
binding a b
binding b t
view c
unit c DESUT_UCF "/d/" "3.ucf"
binding a b t
view t VIEW_Translation
binding b a
unit a DESUT_VERILOG "/d/" "4.v"
binding a t
unit c DESUT_NGD "/d/" "5.ngd"
binding c a b
default c
)";
    const std::string expected = "a: DESUT_VHDL=/d/1.vhd DESUT_UCF=/d/2.ucf DESUT_VERILOG=/d/4.v"
                                 " [ t ] [ b ] [ b t ] [ t ]\n"
                                 "b: [ a ] [ t ] [ a ]\n"
                                 "c: DESUT_UCF=/d/3.ucf DESUT_NGD=/d/5.ngd [ a b ]\n"
                                 "t:\n";
    SampleHost::Description whole, streamed;
    SampleHost::ParseError error;
    ASSERT_TRUE(SampleHost::ParseDescription(text, whole, error)) << error.line << error.what;
    std::istringstream lines(text);
    ASSERT_TRUE(SampleHost::ParseDescription(lines, streamed, error)) << error.line << error.what;
    for (const auto* description : {&whole, &streamed}) {
        EXPECT_EQ(Render(*description), expected);
        EXPECT_TRUE(description->hasDefault);
        EXPECT_EQ(description->defaultView, 2u);
    }
}

TEST_F(ProjectLookup, StopsScanningOnceBothSlotsHoldANameAndDeliversTheSameNames) {
    // A netlist unit in the default view fills the shared slot: the first constraints
    // unit then ends the scan, and in the translation view the first netlist unit does.
    Describe(R"(project p.zam
view a VIEW_Synthesis
view t VIEW_Translation
default a
unit a DESUT_NGD "/d/" "synth.ngd"
unit a DESUT_UCF "/d/" "first.ucf"
unit a DESUT_UCF "/d/" "second.ucf"
binding a t
unit t DESUT_NGD "/d/" "first.ngd"
unit t DESUT_NGD "/d/" "second.ngd"
)");
    const Lookup result = Run();
    EXPECT_TRUE(result.found);
    EXPECT_EQ(result.ucf, "/d/first.ucf");
    EXPECT_EQ(result.ngd, "/d/first.ngd");
    EXPECT_THAT(result.debug,
                ElementsAre("ZAM File p.zam\n", "Got ID for file DESUT_NGD\n",
                            "Got ID for file DESUT_UCF\n", "UCF File /d/first.ucf\n",
                            "Got ID for file DESUT_NGD\n", "NGD File /d/first.ngd\n"));
    ExpectEverythingReleased();
}

TEST_F(ProjectLookup, ANetlistUnitInTheDefaultViewDecidesWhichTranslationUnitIsDelivered) {
    // The same translation view with two netlist units: which one is delivered depends on
    // whether the default view has a netlist unit too, through the text both scans share.
    const std::string translation = R"(binding a t
unit t DESUT_NGD "/d/" "first.ngd"
unit t DESUT_NGD "/d/" "second.ngd"
unit t DESUT_UCF "/d/" "ignored.ucf"
)";
    const std::string head = "project p.zam\nview a VIEW_Synthesis\nview t VIEW_Translation\n"
                             "default a\nunit a DESUT_UCF \"/d/\" \"a.ucf\"\n";

    Describe(head + translation);
    const Lookup alone = Run();
    EXPECT_TRUE(alone.found);
    EXPECT_EQ(alone.ucf, "/d/a.ucf");
    EXPECT_EQ(alone.ngd, "/d/second.ngd") << "the scan runs through: the last unit wins";
    EXPECT_EQ(std::count(alone.debug.begin(), alone.debug.end(), "Got ID for file DESUT_NGD\n"), 2);

    Describe(head + "unit a DESUT_NGD \"/d/\" \"synth.ngd\"\n" + translation);
    const Lookup shared = Run();
    EXPECT_TRUE(shared.found);
    EXPECT_EQ(shared.ucf, "/d/a.ucf");
    EXPECT_EQ(shared.ngd, "/d/first.ngd") << "the scratch text is full: the first unit ends it";
    EXPECT_THAT(shared.debug,
                ElementsAre("ZAM File p.zam\n", "Got ID for file DESUT_UCF\n",
                            "Got ID for file DESUT_NGD\n", "UCF File /d/a.ucf\n",
                            "Got ID for file DESUT_NGD\n", "NGD File /d/first.ngd\n"));
    ExpectEverythingReleased();
}

TEST_F(ProjectLookup, FindsATranslationViewBeyondACycleAndSharedViews) {
    // a -> m -> a closes a cycle; m is also reached twice through a diamond.
    Describe(R"(project p.zam
view a VIEW_Synthesis
view m VIEW_Map
view n VIEW_Par
view t VIEW_Translation
default a
unit a DESUT_UCF "/d/" "a.ucf"
binding a m n
binding m a
binding n m t
unit t DESUT_NGD "/d/" "t.ngd"
)");
    const Lookup result = Run();
    EXPECT_TRUE(result.found);
    EXPECT_EQ(result.ngd, "/d/t.ngd");
    ExpectEverythingReleased();
}

TEST_F(ProjectLookup, FindsTheDefaultViewItselfWhenACycleLeadsBackToIt) {
    Describe(R"(project p.zam
view a VIEW_Translation
view m VIEW_Map
default a
unit a DESUT_UCF "/d/" "a.ucf"
unit a DESUT_NGD "/d/" "a.ngd"
binding a m
binding m a
)");
    const Lookup result = Run();
    EXPECT_TRUE(result.found);
    EXPECT_EQ(result.ngd, "/d/a.ngd");
    ExpectEverythingReleased();
}

TEST_F(ProjectLookup, WalksAVeryDeepChainOfViewsWithoutRecursing) {
    constexpr int kDepth = 20000;
    std::string text = "project p.zam\r\ndefault v0\n  unit v0 DESUT_UCF /d/ a.ucf\n";
    for (int i = 0; i < kDepth; ++i) {
        text += "view v" + std::to_string(i) + " VIEW_Step\n";
        text += "binding v" + std::to_string(i) + " v" + std::to_string(i + 1) + "\n";
    }
    text += "view v" + std::to_string(kDepth) + " VIEW_Translation\n";
    text += "unit v" + std::to_string(kDepth) + " DESUT_NGD /d/ deep.ngd\n";
    Describe(text);
    const Lookup result = Run();
    EXPECT_TRUE(result.found);
    EXPECT_EQ(result.ngd, "/d/deep.ngd");
    ExpectEverythingReleased();
}

TEST_F(ProjectLookup, ReleasesThroughTheCommonCounterWhenHostObjectsOfferOnlyThat) {
    Describe(std::string(kProject) + "counting common\n");
    const Lookup result = Run();
    EXPECT_TRUE(result.found);
    ExpectEverythingReleased();
}

TEST_F(ProjectLookup, AHostWithoutAnOpenProjectGivesOneMessageAndNoNames) {
    const Lookup result = Run(); // VENLOMER_PROJECT unset: nothing is open
    EXPECT_FALSE(result.found);
    EXPECT_EQ(result.project, "");
    EXPECT_EQ(result.ucf, "");
    EXPECT_EQ(result.ngd, "");
    EXPECT_THAT(result.debug, ElementsAre("Cannot get IProject Interface\n"));
    EXPECT_TRUE(result.errors.empty());
    ExpectEverythingReleased();
}

TEST_F(ProjectLookup, AMalformedDescriptionIsReportedWithItsLineAndOpensNoProject) {
    Describe("project p.zam\nview a VIEW_Synthesis\nunit a DESUT_UCF \"/d/ a.ucf\n");
    const Lookup result = Run();
    EXPECT_FALSE(result.found);
    ASSERT_EQ(result.errors.size(), 1u);
    EXPECT_THAT(result.errors[0], HasSubstr("line 3: unterminated quoted word"));
    EXPECT_THAT(result.debug, ElementsAre("Cannot get IProject Interface\n"));
    ExpectEverythingReleased();
}

TEST_F(ProjectLookup, RefusesEveryKindOfMalformedLineNamingIt) {
    const std::vector<std::pair<std::string, std::string>> cases = {
        {"project a.zam\nbogus x\n", "line 2: unknown directive 'bogus'"},
        {"\n# fine\nproject a\"b\n", "line 3: a quote inside a bare word"},
        {"project \"a\"b\n", "line 1: a quoted word must be followed by a blank"},
        {"project a.zam\nproject b.zam\n", "line 2: a second project line"},
        {"project\n", "line 1: project takes one file name"},
        {"view a X\nview a Y\n", "line 2: view 'a' declared twice"},
        {"view a X first\n", "line 1: view takes a name"},
        {"view a X\nunit a T d\n", "line 2: unit takes a view"},
        {"view a X\nunit a T d f no-such\n", "line 2: unknown unit option 'no-such'"},
        {"fail everything\n", "line 1: unknown step 'everything'"},
        {"counting twice\n", "line 1: counting takes prjrep or common"},
        {"fail\n", "line 1: fail takes one step name"},
        {"default\n", "line 1: default takes one view name"},
        {"view a X\ndefault a\ndefault a\n", "line 3: a second default line"},
        {"binding\n", "line 1: binding takes a view"},
        {"view a X\nbinding a b c\nview b X\n", "line 2: no view named 'c'"},
    };
    for (const auto& [text, reason] : cases) {
        SCOPED_TRACE(text);
        Describe(text);
        const Lookup result = Run();
        EXPECT_FALSE(result.found);
        ASSERT_EQ(result.errors.size(), 1u);
        EXPECT_THAT(result.errors[0], HasSubstr(reason));
        EXPECT_THAT(result.debug, ElementsAre("Cannot get IProject Interface\n"));
        ExpectEverythingReleased();
    }
}

TEST_F(ProjectLookup, AnUnknownViewIsReportedAtTheFirstLineThatUsesIt) {
    Describe("project p.zam\nview a X\nbinding a b\ndefault nowhere\nview b Y\n");
    const Lookup result = Run();
    EXPECT_FALSE(result.found);
    ASSERT_EQ(result.errors.size(), 1u);
    EXPECT_THAT(result.errors[0], HasSubstr("line 4: no view named 'nowhere'"));
    ExpectEverythingReleased();
}

TEST_F(ProjectLookup, AMissingDescriptionFileIsReportedAndOpensNoProject) {
    ::setenv("VENLOMER_PROJECT", (m_dir / "absent.txt").c_str(), 1);
    const Lookup result = Run();
    EXPECT_FALSE(result.found);
    ASSERT_EQ(result.errors.size(), 1u);
    EXPECT_THAT(result.errors[0], HasSubstr("absent.txt cannot be read"));
    EXPECT_THAT(result.debug, ElementsAre("Cannot get IProject Interface\n"));
    ExpectEverythingReleased();
}

// ---- one row of the failure table per case -------------------------------------------

struct FailureCase {
    const char* name;
    std::string description;
    const char* message;
    bool projectSet;
    bool ucfSet;
};

void PrintTo(const FailureCase& row, std::ostream* os) {
    *os << row.name;
}

std::string With(const char* extra) {
    return std::string(kProject) + extra + "\n";
}

std::string Without(const char* line) {
    std::string text = kProject;
    text.erase(text.find(line), std::string(line).size() + 1);
    return text;
}

const char kNoProject[] = "Cannot get IProject Interface\n";
const char kNoHelper[] = "Cannot get IProjectHelper interface\n";
const char kNoUcf[] = "Could not find the UCF file\n";
const char kNoTranslation[] = "Cannot get Dpm::IView interface for VIEW_Translation\n";
const char kNoNgd[] = "Could not find the NGD file\n";

std::vector<FailureCase> FailureCases() {
    return {
        {"NoProjectLine", Without("project \"/designs/top/top.zam\""), kNoProject, false, false},
        {"TaskHelperInterface", With("fail task-helper"), kNoProject, false, false},
        {"ContextRefused", With("fail context-status"), kNoProject, false, false},
        {"NoContext", With("fail context"), kNoProject, false, false},
        {"NoProjectManager", With("fail project-manager"), kNoProject, false, false},
        {"NoCurrentProject", With("fail current-project"), kNoProject, false, false},
        {"ProjectIsNoIProject", With("fail iproject"), kNoProject, false, false},
        {"EmptyProjectFileName",
         std::string("project \"\"\n") + Without("project \"/designs/top/top.zam\""),
         "Cannot get ZAM file name from Host\n", false, false},
        {"NoProjectHelper", With("fail project-helper"), kNoHelper, true, false},
        {"CreatedObjectIsNoProjectHelper", With("fail project-helper-interface"), kNoHelper, true,
         false},
        {"NoProjectReference", With("fail project-reference"),
         "Cannot get IProjectCompReference Interface\n", true, false},
        {"NoViewNetworkHelp", With("fail view-network-help"),
         "Cannot cast to IViewNetworkHelp interface\n", true, false},
        {"NoDefaultViewNetwork", With("fail default-view-network"),
         "Cannot get DefaultViewNetwork\n", true, false},
        {"NoDefaultView", Without("default synth"), "Cannot get DefaultViewNetwork\n", true, false},
        {"DefaultNetworkIsNoView", With("fail default-view"), "Cannot get Dpm::IView interface\n",
         true, false},
        {"NoUcfUnit", Without("unit synth DESUT_UCF \"/designs/top/\" \"top.ucf\""), kNoUcf, true,
         false},
        {"NoDesignUnits", With("fail design-units"), kNoUcf, true, false},
        {"UcfUnitWithoutType",
         Without("unit synth DESUT_UCF \"/designs/top/\" \"top.ucf\"") + "unit synth - /d/ x.ucf\n",
         kNoUcf, true, false},
        {"UcfTypeWithoutIdentity",
         Without("unit synth DESUT_UCF \"/designs/top/\" \"top.ucf\"") +
             "unit synth DESUT_UCF /d/ x.ucf no-id\n",
         kNoUcf, true, false},
        {"UcfUnitWithoutFileAccess",
         Without("unit synth DESUT_UCF \"/designs/top/\" \"top.ucf\"") +
             "unit synth DESUT_UCF /d/ x.ucf no-file-access\n",
         kNoUcf, true, false},
        {"UcfUnitWithoutFile",
         Without("unit synth DESUT_UCF \"/designs/top/\" \"top.ucf\"") +
             "unit synth DESUT_UCF /d/ x.ucf no-file\n",
         kNoUcf, true, false},
        {"NoBindingInstance", Without("binding synth xlate"), kNoTranslation, true, true},
        {"NoBindingSet", With("fail binding-set"), kNoTranslation, true, true},
        {"NoBindingIterator", With("fail binding-iterator"), kNoTranslation, true, true},
        {"NoViewsOfABinding", With("fail binding-views"), kNoTranslation, true, true},
        {"ViewsAreNoIterator", With("fail views-iterator"), kNoTranslation, true, true},
        {"CycleWithoutTranslation",
         Without("binding synth xlate") + "view m VIEW_Map\nbinding synth m\nbinding m synth m\n",
         kNoTranslation, true, true},
        {"NoNgdUnit", Without("unit xlate DESUT_NGD \"/designs/top/build/\" \"top.ngd\""), kNoNgd,
         true, true},
        {"NgdTypeInOtherCase",
         Without("unit xlate DESUT_NGD \"/designs/top/build/\" \"top.ngd\"") +
             "unit xlate desut_ngd /d/ x.ngd\n",
         kNoNgd, true, true},
    };
}

class FailingStep : public ProjectLookup, public ::testing::WithParamInterface<FailureCase> {};

TEST_P(FailingStep, ReportsTheStepKeepsWhatWasFoundAndReleasesEverything) {
    const FailureCase& row = GetParam();
    Describe(row.description);
    const Lookup result = Run();
    EXPECT_FALSE(result.found);
    ASSERT_FALSE(result.debug.empty());
    EXPECT_EQ(result.debug.back(), row.message);
    if (!row.projectSet) {
        EXPECT_EQ(result.debug.size(), 1u) << "a step before the project file name";
    }
    EXPECT_TRUE(result.errors.empty()) << result.errors.front();
    EXPECT_EQ(result.project, row.projectSet ? "/designs/top/top.zam" : "");
    EXPECT_EQ(result.ucf, row.ucfSet ? "/designs/top/top.ucf" : "");
    EXPECT_EQ(result.ngd, "");
    ExpectEverythingReleased();
}

INSTANTIATE_TEST_SUITE_P(EveryRow, FailingStep, ::testing::ValuesIn(FailureCases()),
                         [](const auto& row) { return std::string(row.param.name); });

} // namespace
