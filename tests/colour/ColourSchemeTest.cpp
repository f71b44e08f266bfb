//===-- tests/colour/ColourSchemeTest.cpp - each kind of scheme file gives its colours -===//
//
// Each suite expects the scheme file its ctest registration points VENLOMER_DATA_PATH at
// (see CMakeLists.txt), and each test runs in a process of its own: the scheme is read
// once when the library loads, and the lookups change the state they read.
//
//===------------------------------------------------------------------------------===//
#include "MessageCapture.h"

#include "CommonI/IRefCount.h"
#include "devdata/PM_DEVKEY.h"
#include "devdata/PM_PIC.h"
#include "s/ColorManager.h"
#include "s/ColorScheme.h"
#include "s/PropertyFactory.h"
#include "s/internal/ColorManagerImp.h"

#include <gtest/gtest.h>

#include <array>
#include <cstdlib>
#include <filesystem>
#include <ostream>
#include <set>
#include <string>
#include <vector>

namespace {

using Vn::Eng::ColorManager;
using Vn::Eng::ColorManagerImp;
using Color = ColorManager::Color;
using ColorList = ColorManagerImp::ColorList;
using Rgb = std::array<int, 3>;

ColorManagerImp& State() {
    return *ColorManager::m_imp;
}

Rgb RgbOf(const Color& c) {
    return {c->GetRed(), c->GetGreen(), c->GetBlue()};
}

int RefCount(const Color& c) {
    int count = 0;
    static_cast<CommonI::IRefCount*>(c->GetInterface(CommonI::IID_IRefCount))->GetRefCount(count);
    return count;
}

Color NewColor(int r, int g, int b) {
    return Color::Adopt(Vn::Eng::PropertyFactory::CreateColorProperty(
        static_cast<char>(r), static_cast<char>(g), static_cast<char>(b), true));
}

const std::vector<std::string> kTileNames = {
    "SLICE",     "IO",       "TB_IO",       "LR_IO", "CLK",   "BRAM",  "GT",     "GT_TOP",
    "GT_BOTTOM", "GT10_TOP", "GT10_BOTTOM", "PPC",   "EMPTY", "TERM",  "L_BUFG", "R_BUFG",
    "T_BUFG",    "B_BUFG",   "BUFG",        "LBUFR", "RBUFR", "TBUFR", "BBUFR"};

std::set<std::string> MapNames() {
    std::set<std::string> names;
    for (const auto& [name, color] : State().m_tileTypeColors) {
        names.insert(name.str());
    }
    return names;
}

// The two growing palettes behave alike; their cases run on both.
struct Palette {
    const char* name;
    Color (*get)(int, bool);
    bool (*set)(unsigned int, Color);
    int (*numDefaults)();
    ColorList ColorManagerImp::*working;
    ColorList ColorManagerImp::*defaults;

    ColorList& Working() const { return State().*working; }
    ColorList& Defaults() const { return State().*defaults; }
};

const Palette kIOBanks{"IOBank",
                       &ColorManager::GetIOBankColor,
                       &ColorManager::SetIOBankColor,
                       &ColorManager::GetNumDefaultIOBankColors,
                       &ColorManagerImp::m_ioBankColors,
                       &ColorManagerImp::m_defaultIOBankColors};
const Palette kClockRegions{"ClockRegion",
                            &ColorManager::GetClockRegionColor,
                            &ColorManager::SetClockRegionColor,
                            &ColorManager::GetNumDefaultClkRgnColors,
                            &ColorManagerImp::m_clockRegionColors,
                            &ColorManagerImp::m_defaultClockRegionColors};

void PrintTo(const Palette& palette, std::ostream* out) {
    *out << palette.name;
}

std::string PaletteName(const ::testing::TestParamInfo<Palette>& info) {
    return info.param.name;
}

// ---- no scheme file (also: a scheme file that is rejected) --------------------------

// The installed copy is looked for last, so a build installed into its own prefix would
// be found there: these cases cannot tell then, and skip.
class NoScheme : public ::testing::Test {
protected:
    void SetUp() override {
        PM_PIC part(nullptr, nullptr, nullptr);
        PM_DEVKEY keys("rareroded.acd", &part, PM_DEVKEY::kAbsentIsSilent,
                       PM_DEVKEY::kSearchDataPath, PM_DEVKEY::kRejectionIsReported);
        m_found = keys.get_validity() != 0;
        if (m_found && keys.GetPath() == VENLOMER_TEST_INSTALLED_SCHEME) {
            GTEST_SKIP() << "a scheme is installed at " << VENLOMER_TEST_INSTALLED_SCHEME;
        }
    }
    bool m_found = false;
};

TEST_F(NoScheme, StartsWithNoColoursAtAll) {
    EXPECT_FALSE(ColorManager::GetTileColor());
    EXPECT_FALSE(ColorManager::GetSignalColor());
    EXPECT_FALSE(ColorManager::GetSwitchBoxColor());
    EXPECT_TRUE(State().m_tileTypeColors.empty());
    for (const ColorList* list :
         {&State().m_genericColors, &State().m_selectedPathColors, &State().m_ioBankColors,
          &State().m_clockRegionColors, &State().m_flightTimeColors, &State().m_defaultIOBankColors,
          &State().m_defaultClockRegionColors, &State().m_defaultFlightTimeColors}) {
        EXPECT_TRUE(list->empty());
    }
    EXPECT_EQ(ColorManager::GetNumDefaultIOBankColors(), 0);
    EXPECT_EQ(ColorManager::GetNumDefaultClkRgnColors(), 0);
    EXPECT_EQ(ColorManager::GetNumDefaultFltTimeColors(), 0);
}

TEST_F(NoScheme, LookupsAnswerNullWithoutReadingOutOfRange) {
    VnTest::MessageCapture capture;
    EXPECT_FALSE(ColorManager::AllocateColor());
    EXPECT_FALSE(ColorManager::AllocateColor());
    EXPECT_EQ(State().m_nextGenericColor, 0);

    EXPECT_FALSE(ColorManager::GetTileSiteColor("SLICE"));
    EXPECT_EQ(MapNames(), std::set<std::string>{"SLICE"}) << "the name is entered, uncoloured";
    EXPECT_FALSE(ColorManager::GetTileSiteColor("SLICE"));
    EXPECT_TRUE(capture.Debug().empty());

    EXPECT_FALSE(ColorManager::GetSelectedPathColor(0));
    EXPECT_EQ(capture.Debug(),
              std::vector<std::string>{"Path ID 0 out of range, 0 colors allocated for paths\n"});
}

TEST_F(NoScheme, EmptyGrowingPalettesStartFromTheCallersColours) {
    VnTest::MessageCapture capture;
    for (const Palette* p : {&kIOBanks, &kClockRegions}) {
        SCOPED_TRACE(p->name);
        EXPECT_FALSE(p->get(0, true)) << "no defaults to repeat";
        EXPECT_FALSE(p->get(3, true));
        EXPECT_FALSE(p->get(0, false));
        EXPECT_TRUE(p->Working().empty()) << "a read has nothing to grow from";

        // Nothing to fill a gap with: refused, nothing changed.
        EXPECT_FALSE(p->set(2, NewColor(1, 2, 3)));
        EXPECT_TRUE(p->Working().empty());
        // Appending right at the end needs no filling.
        const Color c = NewColor(9, 8, 7);
        EXPECT_TRUE(p->set(0, c));
        ASSERT_EQ(p->Working().size(), 1u);
        EXPECT_EQ(RgbOf(p->get(0, false)), (Rgb{9, 8, 7}));
        EXPECT_NE(p->get(0, false).Get(), c.Get()) << "beyond the length the palette copies";
        EXPECT_FALSE(p->get(1, false));
        EXPECT_EQ(p->numDefaults(), 0);
    }
    EXPECT_EQ(capture.Debug().size(), 2u) << "one report per refused change";
}

TEST_F(NoScheme, FlightTimesAreOutOfRangeEverywhere) {
    VnTest::MessageCapture capture;
    EXPECT_FALSE(ColorManager::GetFlightTimeColor(0, false));
    EXPECT_FALSE(ColorManager::GetFlightTimeColor(0, true));
    EXPECT_FALSE(ColorManager::SetFlightTimeColor(0, NewColor(1, 1, 1)));
    EXPECT_EQ(capture.Debug(), (std::vector<std::string>{
                                   "Failed to get flight time: Flight Time 0 out of range\n",
                                   "Failed to get flight time: Flight Time 0 out of range\n",
                                   "Failed to set flight time: Flight Time 0 out of range\n"}));
}

TEST_F(NoScheme, FindsNoSchemeItCouldAccept) {
    EXPECT_FALSE(m_found) << "the registration points at a folder with a usable scheme";
}

TEST_F(NoScheme, TheViewSaysWhichFileWasRejectedOrThatNoneWasFound) {
    // The registrations point the search at a folder that holds a malformed scheme or none.
    const std::filesystem::path here = std::filesystem::path(std::getenv("VENLOMER_DATA_PATH"));
    using Vn::Eng::ColorScheme;
    if (std::filesystem::exists(here / "rareroded.acd")) {
        EXPECT_EQ(ColorScheme::GetSource(), ColorScheme::Source::Rejected);
        EXPECT_TRUE(std::filesystem::equivalent(ColorScheme::GetPath(), here / "rareroded.acd"));
    } else {
        EXPECT_EQ(ColorScheme::GetSource(), ColorScheme::Source::Absent);
        EXPECT_EQ(ColorScheme::GetPath(), "");
    }
    EXPECT_FALSE(ColorScheme::GetTileColor().present);
    EXPECT_TRUE(ColorScheme::GetTileTypes().empty());
    EXPECT_TRUE(ColorScheme::GetDefaultPalette(ColorScheme::Palette::IOBank).empty());
}

// ---- a small scheme with every key ---------------------------------------------------

TEST(SmallScheme, TheViewShowsTheFileAndItsValuesWithoutChangingAnything) {
    using Vn::Eng::ColorScheme;
    using Swatch = ColorScheme::Swatch;
    EXPECT_EQ(ColorScheme::GetSource(), ColorScheme::Source::Read);
    EXPECT_TRUE(std::filesystem::equivalent(
        ColorScheme::GetPath(),
        std::filesystem::path(std::getenv("VENLOMER_DATA_PATH")) / "rareroded.acd"));
    EXPECT_EQ(ColorScheme::GetSwitchBoxColor(), (Swatch{true, true, 7, 8, 9}));

    const auto types = ColorScheme::GetTileTypes();
    ASSERT_EQ(types.size(), kTileNames.size());
    for (std::size_t i = 1; i < types.size(); ++i) {
        EXPECT_LT(types[i - 1].name, types[i].name) << "sorted by name";
    }
    for (const auto& type : types) {
        const Color c = State().m_tileTypeColors.at(type.name.c_str());
        EXPECT_EQ((Rgb{type.color.red, type.color.green, type.color.blue}), RgbOf(c)) << type.name;
    }
    EXPECT_EQ(ColorScheme::GetGenericColors().size(), 3u);
    EXPECT_EQ(ColorScheme::GetSelectedPathColors().at(3), (Swatch{true, true, 40, 40, 40}));

    // Looking allocates nothing: the next generic colour is still the first.
    EXPECT_EQ(State().m_nextGenericColor, 0);
    // The working side follows the callers' changes; the default side stays as read.
    ColorManager::GetIOBankColor(0, false)->SetRGB(50, 60, 70);
    EXPECT_EQ(ColorScheme::GetWorkingPalette(ColorScheme::Palette::IOBank).at(0),
              (Swatch{true, true, 50, 60, 70}));
    EXPECT_EQ(ColorScheme::GetDefaultPalette(ColorScheme::Palette::IOBank).at(0),
              (Swatch{true, true, 1, 0, 0}));
    EXPECT_EQ(ColorScheme::GetDefaultPalette(ColorScheme::Palette::FlightTime).size(), 3u);
    EXPECT_EQ(ColorScheme::GetWorkingPalette(ColorScheme::Palette::ClockRegion).size(), 4u);
}

TEST(SmallScheme, ReadsEverySingleColourAndEveryTileKey) {
    EXPECT_EQ(RgbOf(ColorManager::GetTileColor()), (Rgb{1, 2, 3}));
    EXPECT_EQ(RgbOf(ColorManager::GetSignalColor()), (Rgb{4, 5, 6}));
    EXPECT_EQ(RgbOf(ColorManager::GetSwitchBoxColor()), (Rgb{7, 8, 9}));
    EXPECT_TRUE(ColorManager::GetTileColor()->IsValid());
    EXPECT_TRUE(ColorManager::GetTileColor()->IsVisible());

    EXPECT_EQ(MapNames(), std::set<std::string>(kTileNames.begin(), kTileNames.end()));
    for (int n = 0; n < static_cast<int>(kTileNames.size()); ++n) {
        const Color c =
            State().m_tileTypeColors.at(kTileNames[static_cast<std::size_t>(n)].c_str());
        EXPECT_EQ(RgbOf(c), (Rgb{100 + n, n, 0})) << kTileNames[static_cast<std::size_t>(n)];
    }
}

TEST(SmallScheme, KeepsWorkingAndDefaultPalettesApart) {
    EXPECT_EQ(ColorManager::GetNumDefaultIOBankColors(), 4);
    EXPECT_EQ(ColorManager::GetNumDefaultClkRgnColors(), 4);
    EXPECT_EQ(ColorManager::GetNumDefaultFltTimeColors(), 3);
    struct Pair {
        const ColorList& working;
        const ColorList& defaults;
    };
    for (const Pair& p : {Pair{State().m_ioBankColors, State().m_defaultIOBankColors},
                          Pair{State().m_clockRegionColors, State().m_defaultClockRegionColors},
                          Pair{State().m_flightTimeColors, State().m_defaultFlightTimeColors}}) {
        ASSERT_EQ(p.working.size(), p.defaults.size());
        for (std::size_t i = 0; i < p.working.size(); ++i) {
            EXPECT_EQ(RgbOf(p.working[i]), RgbOf(p.defaults[i]));
            EXPECT_NE(p.working[i].Get(), p.defaults[i].Get());
        }
    }
    EXPECT_EQ(RgbOf(State().m_ioBankColors[3]), (Rgb{4, 0, 0})) << "entries in file order";

    ColorManager::GetIOBankColor(0, false)->SetRGB(250, 0, 0);
    ColorManager::GetFlightTimeColor(0, false)->SetRGB(250, 0, 0);
    EXPECT_EQ(RgbOf(ColorManager::GetIOBankColor(0, true)), (Rgb{1, 0, 0}));
    EXPECT_EQ(RgbOf(ColorManager::GetFlightTimeColor(0, true)), (Rgb{0, 0, 1}));
    EXPECT_EQ(RgbOf(ColorManager::GetIOBankColor(0, false)), (Rgb{250, 0, 0}));
}

TEST(SmallScheme, HandsOutSharedObjectsNotCopies) {
    const Color tile = ColorManager::GetTileColor();
    EXPECT_EQ(RefCount(tile), 2) << "the record's reference and ours";
    EXPECT_EQ(ColorManager::GetTileColor().Get(), tile.Get());
    tile->SetRGB(11, 22, 33);
    EXPECT_EQ(RgbOf(ColorManager::GetTileColor()), (Rgb{11, 22, 33}));

    const Color io = ColorManager::GetTileSiteColor("IO");
    EXPECT_EQ(io.Get(), State().m_tileTypeColors.at("IO").Get());
    io->SetRGB(1, 1, 1);
    EXPECT_EQ(RgbOf(ColorManager::GetTileSiteColor("IO")), (Rgb{1, 1, 1}));
}

TEST(SmallScheme, AllocatesGenericColoursInOrderThenSticksOnTheLast) {
    const ColorList& generic = State().m_genericColors;
    ASSERT_EQ(generic.size(), 3u);
    std::vector<VnI::IColorProperty*> handed;
    for (int i = 0; i < 5; ++i) {
        handed.push_back(ColorManager::AllocateColor().Get());
    }
    EXPECT_EQ(handed, (std::vector<VnI::IColorProperty*>{generic[0].Get(), generic[1].Get(),
                                                         generic[2].Get(), generic[2].Get(),
                                                         generic[2].Get()}));
    EXPECT_EQ(State().m_nextGenericColor, 2);
    EXPECT_EQ(generic.size(), 3u) << "no colour is made";
}

TEST(SmallScheme, KnownTileNamesKeepTheirColourWithoutAllocating) {
    const Color io = ColorManager::GetTileSiteColor("IO");
    EXPECT_EQ(RgbOf(io), (Rgb{101, 1, 0}));
    EXPECT_EQ(ColorManager::GetTileSiteColor("IO").Get(), io.Get());
    EXPECT_EQ(State().m_nextGenericColor, 0);
    EXPECT_EQ(State().m_tileTypeColors.size(), 23u);
}

TEST(SmallScheme, NewTileNamesTakeTheNextGenericColourAndKeepIt) {
    const ColorList& generic = State().m_genericColors;
    EXPECT_EQ(ColorManager::GetTileSiteColor("DSP").Get(), generic[0].Get());
    EXPECT_EQ(ColorManager::GetTileSiteColor("DSP").Get(), generic[0].Get());
    EXPECT_EQ(ColorManager::AllocateColor().Get(), generic[1].Get());

    // Names are exact: the key, another case and a padded name are all new names.
    EXPECT_EQ(ColorManager::GetTileSiteColor("SLICE_TILE").Get(), generic[2].Get());
    EXPECT_NE(ColorManager::GetTileSiteColor("SLICE_TILE").Get(),
              State().m_tileTypeColors.at("SLICE").Get());
    EXPECT_EQ(ColorManager::GetTileSiteColor("slice").Get(), generic[2].Get()) << "used up";
    EXPECT_EQ(ColorManager::GetTileSiteColor("SLICE ").Get(), generic[2].Get());
    EXPECT_EQ(RgbOf(ColorManager::GetTileSiteColor("SLICE")), (Rgb{100, 0, 0}));
    EXPECT_EQ(State().m_tileTypeColors.size(), 23u + 4u);
}

TEST(SmallScheme, PathIdsOutOfRangeGetTheLastPathColourAndAReport) {
    const ColorList& paths = State().m_selectedPathColors;
    ASSERT_EQ(paths.size(), 4u);
    VnTest::MessageCapture capture;
    EXPECT_EQ(ColorManager::GetSelectedPathColor(0).Get(), paths[0].Get());
    EXPECT_EQ(ColorManager::GetSelectedPathColor(2).Get(), paths[2].Get());
    EXPECT_EQ(ColorManager::GetSelectedPathColor(3).Get(), paths[3].Get());
    EXPECT_TRUE(capture.Debug().empty());
    EXPECT_EQ(ColorManager::GetSelectedPathColor(4).Get(), paths[3].Get());
    EXPECT_EQ(ColorManager::GetSelectedPathColor(-1).Get(), paths[3].Get());
    EXPECT_EQ(capture.Debug(), (std::vector<std::string>{
                                   "Path ID 4 out of range, 4 colors allocated for paths\n",
                                   "Path ID -1 out of range, 4 colors allocated for paths\n"}));
}

TEST(SmallScheme, FlightTimesHaveAFixedLengthWithBothReports) {
    VnTest::MessageCapture capture;
    EXPECT_EQ(ColorManager::GetFlightTimeColor(2, false).Get(),
              State().m_flightTimeColors[2].Get());
    EXPECT_EQ(ColorManager::GetFlightTimeColor(2, true).Get(),
              State().m_defaultFlightTimeColors[2].Get());
    EXPECT_FALSE(ColorManager::GetFlightTimeColor(-1, false));
    EXPECT_FALSE(ColorManager::GetFlightTimeColor(-1, true));
    EXPECT_TRUE(capture.Debug().empty()) << "a negative index is not reported";

    EXPECT_FALSE(ColorManager::GetFlightTimeColor(3, false));
    EXPECT_FALSE(ColorManager::GetFlightTimeColor(3, true));
    EXPECT_FALSE(ColorManager::SetFlightTimeColor(3, NewColor(1, 2, 3)));
    EXPECT_FALSE(ColorManager::SetFlightTimeColor(0xFFFFFFFFu, NewColor(1, 2, 3)));
    EXPECT_EQ(capture.Debug(), (std::vector<std::string>{
                                   "Failed to get flight time: Flight Time 3 out of range\n",
                                   "Failed to get flight time: Flight Time 3 out of range\n",
                                   "Failed to set flight time: Flight Time 3 out of range\n",
                                   "Failed to set flight time: Flight Time -1 out of range\n"}));
    EXPECT_EQ(State().m_flightTimeColors.size(), 3u);

    const Color c = NewColor(5, 6, 7);
    EXPECT_TRUE(ColorManager::SetFlightTimeColor(1, c));
    EXPECT_EQ(ColorManager::GetFlightTimeColor(1, false).Get(), c.Get());
    EXPECT_EQ(RgbOf(ColorManager::GetFlightTimeColor(1, true)), (Rgb{0, 0, 2}));
}

// ---- the growing palettes of the small scheme (defaults D0..D3) ------------------------

class GrowingPalette : public ::testing::TestWithParam<Palette> {};

TEST_P(GrowingPalette, DefaultReadsWrapAndLeaveTheWorkingPaletteAlone) {
    const Palette& p = GetParam();
    EXPECT_EQ(p.get(6, true).Get(), p.Defaults()[2].Get());
    EXPECT_EQ(p.get(3, true).Get(), p.Defaults()[3].Get());
    EXPECT_EQ(p.get(4, true).Get(), p.Defaults()[0].Get());
    EXPECT_EQ(p.get(1, false).Get(), p.Working()[1].Get());
    EXPECT_EQ(p.Working().size(), 4u);
}

TEST_P(GrowingPalette, WorkingReadsGrowWithFreshCopiesOfTheRepeatedDefaults) {
    const Palette& p = GetParam();
    const Color six = p.get(6, false);
    ASSERT_EQ(p.Working().size(), 7u);
    EXPECT_EQ(six.Get(), p.Working()[6].Get());
    for (std::size_t i = 4; i < 7; ++i) {
        EXPECT_EQ(RgbOf(p.Working()[i]), RgbOf(p.Defaults()[i - 4]));
        EXPECT_NE(p.Working()[i].Get(), p.Defaults()[i - 4].Get());
        EXPECT_TRUE(p.Working()[i]->IsValid());
    }
    EXPECT_NE(p.Working()[4].Get(), p.Working()[5].Get());
    EXPECT_EQ(p.get(6, false).Get(), six.Get()) << "grown once";
    EXPECT_EQ(p.Working().size(), 7u);
    EXPECT_EQ(p.numDefaults(), 4);
    // A default recoloured after growth does not reach the copies.
    p.Defaults()[0]->SetRGB(77, 77, 77);
    EXPECT_NE(RgbOf(p.Working()[4]), (Rgb{77, 77, 77}));
}

TEST_P(GrowingPalette, NegativeIndicesReadNullSilently) {
    const Palette& p = GetParam();
    VnTest::MessageCapture capture;
    EXPECT_FALSE(p.get(-1, false));
    EXPECT_FALSE(p.get(-1, true));
    EXPECT_FALSE(p.get(-2147483647 - 1, false));
    EXPECT_TRUE(capture.Messages().empty());
    EXPECT_EQ(p.Working().size(), 4u);
}

TEST_P(GrowingPalette, ChangesWithinTheLengthShareTheCallersObject) {
    const Palette& p = GetParam();
    const Color old = p.Working()[2];
    EXPECT_EQ(RefCount(old), 2);
    const Color c = NewColor(9, 9, 9);
    EXPECT_TRUE(p.set(2, c));
    EXPECT_EQ(RefCount(old), 1) << "the palette released its old colour";
    EXPECT_EQ(RefCount(c), 2) << "the palette's reference and ours; the argument's is gone";
    EXPECT_EQ(p.get(2, false).Get(), c.Get());
    c->SetRGB(1, 2, 3);
    EXPECT_EQ(RgbOf(p.get(2, false)), (Rgb{1, 2, 3}));
    EXPECT_EQ(RgbOf(p.get(2, true)), RgbOf(p.Defaults()[2])) << "defaults are never changed";
    EXPECT_EQ(p.Working().size(), 4u);
}

TEST_P(GrowingPalette, ChangesAtTheEndAppendACopy) {
    const Palette& p = GetParam();
    const Color c = NewColor(9, 9, 9);
    EXPECT_TRUE(p.set(4, c));
    ASSERT_EQ(p.Working().size(), 5u);
    EXPECT_EQ(RgbOf(p.Working()[4]), (Rgb{9, 9, 9}));
    EXPECT_NE(p.Working()[4].Get(), c.Get());
    EXPECT_EQ(RefCount(c), 1);
    c->SetRGB(1, 2, 3);
    EXPECT_EQ(RgbOf(p.get(4, false)), (Rgb{9, 9, 9}));
}

TEST_P(GrowingPalette, ChangesBeyondTheEndFillTheGapFromTheDefaults) {
    const Palette& p = GetParam();
    EXPECT_TRUE(p.set(6, NewColor(9, 9, 9)));
    ASSERT_EQ(p.Working().size(), 7u);
    EXPECT_EQ(RgbOf(p.Working()[4]), RgbOf(p.Defaults()[0]));
    EXPECT_EQ(RgbOf(p.Working()[5]), RgbOf(p.Defaults()[1]));
    EXPECT_EQ(RgbOf(p.get(6, false)), (Rgb{9, 9, 9}));
}

TEST_P(GrowingPalette, RefusesANullColourBeyondTheEnd) {
    const Palette& p = GetParam();
    VnTest::MessageCapture capture;
    EXPECT_FALSE(p.set(4, nullptr));
    EXPECT_FALSE(p.set(9, nullptr));
    EXPECT_EQ(p.Working().size(), 4u) << "no partial growth";
    EXPECT_EQ(capture.Debug().size(), 2u);
}

TEST_P(GrowingPalette, StopsGrowingAtTheLimitWithAReport) {
    const Palette& p = GetParam();
    const unsigned int limit = ColorManager::kMaxPaletteLength;
    VnTest::MessageCapture capture;
    EXPECT_FALSE(p.set(0xFFFFFFFFu, NewColor(1, 2, 3)));
    EXPECT_FALSE(p.set(limit, NewColor(1, 2, 3)));
    EXPECT_FALSE(p.get(static_cast<int>(limit), false));
    EXPECT_FALSE(p.get(2147483647, false));
    EXPECT_EQ(p.Working().size(), 4u);
    ASSERT_EQ(capture.Debug().size(), 4u);
    EXPECT_NE(capture.Debug()[0].find("4294967295 out of range"), std::string::npos)
        << capture.Debug()[0];
    EXPECT_EQ(RgbOf(p.get(2147483647, true)), RgbOf(p.Defaults()[3])) << "defaults still wrap";

    // Right up to the limit is fine.
    const Color last = p.get(static_cast<int>(limit - 1), false);
    ASSERT_TRUE(last);
    EXPECT_EQ(p.Working().size(), limit);
    EXPECT_EQ(RgbOf(last), RgbOf(p.Defaults()[(limit - 1) % 4]));
    EXPECT_TRUE(p.set(limit - 1, NewColor(1, 2, 3)));
}

INSTANTIATE_TEST_SUITE_P(SmallScheme, GrowingPalette, ::testing::Values(kIOBanks, kClockRegions),
                         PaletteName);

// ---- a scheme lacking keys, with an empty list and odd components --------------------

TEST(PartialScheme, ReducesComponentsToTheirLowEightBits) {
    EXPECT_EQ(RgbOf(ColorManager::GetTileColor()), (Rgb{44, 255, 0})) << "300, -1, 256";
    EXPECT_EQ(RgbOf(ColorManager::GetSwitchBoxColor()), (Rgb{255, 0, 1})) << "511, -256, -255";
    EXPECT_EQ(RgbOf(State().m_clockRegionColors[0]), (Rgb{10, 20, 30}));
    EXPECT_EQ(RgbOf(State().m_clockRegionColors[1]), (Rgb{40, 50, 60}));
    EXPECT_EQ(State().m_clockRegionColors.size(), 2u);
}

TEST(PartialScheme, MissingKeysStillGiveColoursAndAllTwentyThreeNames) {
    const Color signal = ColorManager::GetSignalColor();
    ASSERT_TRUE(signal) << "a missing single key reads as a colour all the same";
    EXPECT_EQ(RgbOf(signal), (Rgb{0, 0, 0}));
    EXPECT_EQ(MapNames(), std::set<std::string>(kTileNames.begin(), kTileNames.end()));
    EXPECT_EQ(RgbOf(State().m_tileTypeColors.at("IO")), (Rgb{4, 5, 6}));
    EXPECT_EQ(RgbOf(State().m_tileTypeColors.at("BBUFR")), (Rgb{7, 8, 9}));
    EXPECT_EQ(RgbOf(State().m_tileTypeColors.at("GT")), (Rgb{0, 0, 0}));
    // Missing list keys are empty lists.
    EXPECT_TRUE(State().m_selectedPathColors.empty());
    EXPECT_EQ(ColorManager::GetNumDefaultIOBankColors(), 0);
    EXPECT_TRUE(State().m_ioBankColors.empty());
}

TEST(PartialScheme, UnevenEntriesReadMissingFieldsAsZero) {
    ASSERT_EQ(ColorManager::GetNumDefaultFltTimeColors(), 2);
    EXPECT_EQ(RgbOf(ColorManager::GetFlightTimeColor(0, true)), (Rgb{1, 2, 0}));
    EXPECT_EQ(RgbOf(ColorManager::GetFlightTimeColor(1, true)), (Rgb{3, 0, 0}));
}

TEST(PartialScheme, AnEmptyGenericListLeavesNewTileNamesUncoloured) {
    EXPECT_TRUE(State().m_genericColors.empty());
    EXPECT_FALSE(ColorManager::AllocateColor());
    EXPECT_FALSE(ColorManager::GetTileSiteColor("DSP"));
    EXPECT_FALSE(ColorManager::GetTileSiteColor("DSP"));
    EXPECT_EQ(State().m_tileTypeColors.size(), 24u);
    EXPECT_EQ(State().m_nextGenericColor, 0);
    EXPECT_EQ(RgbOf(ColorManager::GetTileSiteColor("SLICE")), (Rgb{1, 2, 3}));
}

// ---- the scheme we ship ----------------------------------------------------------------

// The shipped file read directly, beside what the colour manager made of it.
struct ShippedScheme : ::testing::Test {
    ShippedScheme()
        : part(nullptr, nullptr, nullptr),
          keys("rareroded.acd", &part, PM_DEVKEY::kAbsentIsSilent, PM_DEVKEY::kSearchDataPath,
               PM_DEVKEY::kRejectionIsReported) {}
    PM_PIC part;
    PM_DEVKEY keys;
};

TEST_F(ShippedScheme, DefinesEveryKeyWithThreeComponentsInRange) {
    ASSERT_EQ(keys.get_validity(), 1) << "the shipped scheme must parse";
    std::vector<std::string> single = {"TILE_COLOR", "SIGNAL_COLOR", "SWITCH_BOX_COLOR"};
    for (const std::string& tile : kTileNames) {
        single.push_back(tile + "_TILE");
    }
    for (const std::string& key : single) {
        EXPECT_EQ(keys.GetMaxIndex(key.c_str(), ':', ','), (std::pair<short, short>{1, 3})) << key;
    }
    const std::pair<const char*, short> lists[] = {{"GENERIC_COLORS", 16},
                                                   {"SELECTED_PATH_COLORS", 8},
                                                   {"IO_BANK_COLORS", 16},
                                                   {"CLK_REGION_COLORS", 16},
                                                   {"FLIGHT_TIME_COLORS", 5}};
    const char entry = ':', field = ',';
    for (const auto& [key, least] : lists) {
        const auto [count, fields] = keys.GetMaxIndex(key, entry, field);
        EXPECT_GE(count, least) << key;
        EXPECT_EQ(fields, 3) << key;
        for (short e = 0; e < count; ++e) {
            for (short f = 0; f < 3; ++f) {
                const int v = keys.GetInt32ByKey(key, &entry, e, &field, f);
                EXPECT_TRUE(v >= 0 && v <= 255) << key << " entry " << e << " field " << f;
            }
        }
    }
}

TEST_F(ShippedScheme, LoadsIntoTheColourManager) {
    ASSERT_TRUE(ColorManager::GetTileColor());
    EXPECT_TRUE(ColorManager::GetSignalColor());
    EXPECT_TRUE(ColorManager::GetSwitchBoxColor());
    EXPECT_EQ(MapNames(), std::set<std::string>(kTileNames.begin(), kTileNames.end()));
    EXPECT_EQ(static_cast<short>(ColorManager::GetNumDefaultIOBankColors()),
              keys.GetMaxIndex("IO_BANK_COLORS", ':', ',').first);
}

TEST_F(ShippedScheme, PalettesCanBeToldApart) {
    // A floor well below what the palettes were chosen for, so that a pasted duplicate or
    // a near-twin added later fails here.
    for (const ColorList* list :
         {&State().m_genericColors, &State().m_selectedPathColors, &State().m_defaultIOBankColors,
          &State().m_defaultClockRegionColors, &State().m_defaultFlightTimeColors}) {
        for (std::size_t i = 0; i < list->size(); ++i) {
            for (std::size_t j = i + 1; j < list->size(); ++j) {
                const Rgb a = RgbOf((*list)[i]), b = RgbOf((*list)[j]);
                const int d2 = (a[0] - b[0]) * (a[0] - b[0]) + (a[1] - b[1]) * (a[1] - b[1]) +
                               (a[2] - b[2]) * (a[2] - b[2]);
                EXPECT_GE(d2, 30 * 30) << "colours " << i << " and " << j << " are near twins";
            }
        }
    }
}

TEST_F(ShippedScheme, FlightTimeBandsGetLighterFromShortToLong) {
    const ColorList& bands = State().m_defaultFlightTimeColors;
    auto luminance = [](const Rgb& c) { return 2126 * c[0] + 7152 * c[1] + 722 * c[2]; };
    for (std::size_t i = 1; i < bands.size(); ++i) {
        EXPECT_LT(luminance(RgbOf(bands[i - 1])), luminance(RgbOf(bands[i]))) << "band " << i;
    }
}

} // namespace
