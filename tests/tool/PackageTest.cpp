//===-- tests/tool/PackageTest.cpp - the package as the board designer sees it ---===//
//
// The layout of every package of the installed chip databases, the pictures of both views
// parsed back with a real XML parser, and the commands that write them. Expected counts
// come from the package names and a plain scan of the files, not from the tool's reader.
//
//===------------------------------------------------------------------------------===//
#include "Package.h"
#include "DeviceDraw.h"
#include "DeviceModel.h"
#include "PackageDraw.h"
#include "PlanColours.h"
#include "ProcessHelpers.h"

#include <expat.h>
#include <gtest/gtest.h>

#include <sys/wait.h>

#include <algorithm>
#include <cmath>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <map>
#include <set>
#include <sstream>
#include <string>
#include <vector>

namespace {

namespace fs = std::filesystem;
using VnTool::PackageLayout;
using VnTool::PackageSite;
using Side = VnTool::PackageSite::Side;

std::string SystemChipDb(const std::string& name) {
    return std::string(VENLOMER_SYSTEM_CHIPDB_DIR) + "/" + name;
}

// Every ".pins NAME" section of a chip database with its pin names, by a plain scan.
std::map<std::string, std::vector<std::string>> ScanPackages(const std::string& path) {
    std::map<std::string, std::vector<std::string>> packages;
    std::ifstream in(path);
    std::string line;
    std::vector<std::string>* current = nullptr;
    while (std::getline(in, line)) {
        // Only headers and pin lines matter; the bulk of the file is routing.
        if (line.empty() || line[0] == '#' || (line[0] != '.' && current == nullptr)) {
            continue;
        }
        std::istringstream fields(line);
        std::string head;
        fields >> head;
        if (head[0] == '.') {
            current = nullptr;
            if (head == ".pins") {
                std::string name;
                fields >> name;
                current = &packages[name];
            }
        } else if (current != nullptr) {
            current->push_back(head);
        }
    }
    return packages;
}

std::unique_ptr<VnTool::DeviceModel> Open(const std::string& file, const std::string& package) {
    VnTool::DeviceSource source{SystemChipDb(file), package, ""};
    std::string error;
    auto model = VnTool::DeviceModel::Open(source, error);
    EXPECT_TRUE(model) << error << " (install fpga-icestorm-chipdb with scripts/bootstrap)";
    return model;
}

PackageLayout LayOut(const VnTool::ChipDb& db, bool bottom) {
    PackageLayout layout;
    std::string error;
    EXPECT_TRUE(VnTool::LayOutPackage(db, bottom, layout, error)) << error;
    return layout;
}

const PackageSite& At(const PackageLayout& layout, const std::string& name) {
    const PackageSite* site = layout.Find(name);
    if (site == nullptr) {
        ADD_FAILURE() << name << " is not in " << layout.package;
        static const PackageSite none;
        return none;
    }
    return *site;
}

// ---- the layouts -----------------------------------------------------------------------

// Every package of every chip database: each I/O pin is laid out once under its own
// name, the places are as many as the name's number says, and no two share a place.
TEST(PackageLayout, EveryPackageOfEveryChipDatabaseIsLaidOutWhole) {
    int packages = 0;
    for (const char* file : {"chipdb-384.txt", "chipdb-1k.txt", "chipdb-5k.txt", "chipdb-8k.txt",
                             "chipdb-lm4k.txt", "chipdb-u4k.txt"}) {
        if (!fs::exists(SystemChipDb(file))) {
            ADD_FAILURE() << file << " missing: install fpga-icestorm-chipdb (scripts/bootstrap)";
            continue;
        }
        for (const auto& [package, names] : ScanPackages(SystemChipDb(file))) {
            SCOPED_TRACE(std::string(file) + " " + package);
            // The layout needs only the package's pin names, in file order.
            VnTool::ChipDb db;
            db.device = file;
            db.package = package;
            for (const std::string& name : names) {
                db.pins.push_back({name});
            }
            for (bool bottom : {false, true}) {
                const PackageLayout layout = LayOut(db, bottom);
                const std::string digits = package.substr(package.find_first_of("0123456789"));
                EXPECT_EQ(layout.sites.size(), static_cast<std::size_t>(std::stoi(digits)));
                EXPECT_EQ(layout.note, "");
                EXPECT_EQ(layout.ioCount, static_cast<int>(names.size()));
                EXPECT_EQ(layout.ioCount + layout.otherCount,
                          static_cast<int>(layout.sites.size()));
                for (const std::string& name : names) {
                    const PackageSite& site = At(layout, name);
                    ASSERT_GE(site.pin, 0) << name;
                    EXPECT_EQ(db.pins[static_cast<std::size_t>(site.pin)].name, name);
                }
                std::set<std::pair<long, long>> places;
                for (const PackageSite& site : layout.sites) {
                    EXPECT_TRUE(site.x > 0 && site.x < layout.width && site.y > 0 &&
                                site.y < layout.height)
                        << site.name;
                    EXPECT_TRUE(
                        places.emplace(std::lround(site.x * 10), std::lround(site.y * 10)).second)
                        << site.name << " shares its place";
                }
            }
            ++packages;
        }
    }
    EXPECT_GE(packages, 30);
}

TEST(PackageLayout, BallGridRowsSkipTheJedecLettersAndTheBottomViewMirrors) {
    auto model = Open("chipdb-8k.txt", "ct256");
    ASSERT_TRUE(model);
    const PackageLayout top = LayOut(model->Db(), false);
    EXPECT_EQ(top.kind, PackageLayout::Kind::BallGrid);
    const std::vector<std::string> rows = {"A", "B", "C", "D", "E", "F", "G", "H",
                                           "J", "K", "L", "M", "N", "P", "R", "T"};
    EXPECT_EQ(top.rowNames, rows);
    EXPECT_EQ(top.columns, 16);
    EXPECT_EQ(top.skippedLetters, "IOQS");
    EXPECT_EQ(top.otherCount, 256 - 206);
    // A1 at the top left seen from the top, rows down and columns rightward.
    EXPECT_LT(At(top, "A1").x, At(top, "A16").x);
    EXPECT_LT(At(top, "A1").y, At(top, "T1").y);
    EXPECT_EQ(At(top, "H1").y, At(top, "J1").y - 1); // no row I between them
    EXPECT_EQ(At(top, "T4").pin, -1);                // a ball without I/O is still there

    const PackageLayout bottom = LayOut(model->Db(), true);
    EXPECT_GT(At(bottom, "A1").x, At(bottom, "A16").x);
    for (const PackageSite& site : top.sites) {
        const PackageSite& mirrored = At(bottom, site.name);
        EXPECT_DOUBLE_EQ(mirrored.x, top.width - site.x) << site.name;
        EXPECT_DOUBLE_EQ(mirrored.y, site.y) << site.name;
        EXPECT_EQ(mirrored.pin, site.pin);
    }
}

TEST(PackageLayout, OddGridsKeepTheirShapeAndTheirEmptyRings) {
    auto cb132 = Open("chipdb-1k.txt", "cb132");
    ASSERT_TRUE(cb132);
    const PackageLayout layout = LayOut(cb132->Db(), false);
    EXPECT_EQ(layout.rowNames.size(), 14u);
    EXPECT_EQ(layout.columns, 14);
    // The second ring and the fifth hold no balls; the centre does.
    EXPECT_EQ(layout.Find("B2"), nullptr);
    EXPECT_EQ(layout.Find("B7"), nullptr);
    EXPECT_EQ(layout.Find("E5"), nullptr);
    EXPECT_NE(layout.Find("B1"), nullptr);
    EXPECT_NE(layout.Find("G7"), nullptr);
    EXPECT_EQ(layout.sites.size(), 132u);

    auto uwg30 = Open("chipdb-5k.txt", "uwg30"); // six rows of five
    ASSERT_TRUE(uwg30);
    const PackageLayout chipScale = LayOut(uwg30->Db(), false);
    EXPECT_EQ(chipScale.rowNames.size(), 6u);
    EXPECT_EQ(chipScale.columns, 5);

    // A variant after the colon is the same footprint with fewer pins bonded.
    auto full = Open("chipdb-8k.txt", "cm225");
    auto variant = Open("chipdb-8k.txt", "cm225:4k");
    ASSERT_TRUE(full && variant);
    const PackageLayout a = LayOut(full->Db(), false);
    const PackageLayout b = LayOut(variant->Db(), false);
    EXPECT_EQ(b.footprint, "cm225");
    EXPECT_EQ(a.sites.size(), b.sites.size());
    EXPECT_GT(a.ioCount, b.ioCount);
}

// Counter-clockwise from pin 1 at the top of the left side: down the left, along the
// bottom, up the right, back along the top.
TEST(PackageLayout, LeadedPinsRunCounterClockwiseFromPinOne) {
    auto model = Open("chipdb-1k.txt", "tq144");
    ASSERT_TRUE(model);
    const PackageLayout top = LayOut(model->Db(), false);
    EXPECT_EQ(top.kind, PackageLayout::Kind::Perimeter);
    EXPECT_EQ(top.ringSizes, std::vector<int>{144});
    EXPECT_EQ(top.otherCount, 144 - static_cast<int>(model->Db().pins.size()));
    const std::map<std::string, Side> sides = {
        {"1", Side::Left},   {"36", Side::Left},   {"37", Side::Bottom}, {"72", Side::Bottom},
        {"73", Side::Right}, {"108", Side::Right}, {"109", Side::Top},   {"144", Side::Top}};
    for (const auto& [name, side] : sides) {
        EXPECT_EQ(At(top, name).side, side) << name;
    }
    EXPECT_LT(At(top, "1").y, At(top, "36").y);    // down the left
    EXPECT_LT(At(top, "37").x, At(top, "72").x);   // along the bottom
    EXPECT_GT(At(top, "73").y, At(top, "108").y);  // up the right
    EXPECT_GT(At(top, "109").x, At(top, "144").x); // back along the top
    // Pin 1 is the top-left corner's pin of the left side.
    for (const PackageSite& site : top.sites) {
        if (site.side == Side::Left) {
            EXPECT_GE(site.y, At(top, "1").y);
        }
    }
    const PackageLayout bottom = LayOut(model->Db(), true);
    EXPECT_EQ(At(bottom, "1").side, Side::Right);
    EXPECT_EQ(At(bottom, "37").side, Side::Bottom);
    EXPECT_GT(At(bottom, "37").x, At(bottom, "72").x);
}

TEST(PackageLayout, TheDualRowNoLeadPackageCountsEachRowFromItsOwnPinOne) {
    auto model = Open("chipdb-1k.txt", "qn84");
    ASSERT_TRUE(model);
    const PackageLayout layout = LayOut(model->Db(), false);
    EXPECT_EQ(layout.kind, PackageLayout::Kind::Perimeter);
    EXPECT_EQ(layout.ringSizes, (std::vector<int>{48, 36}));
    EXPECT_EQ(At(layout, "A1").side, Side::Left);
    EXPECT_EQ(At(layout, "B1").side, Side::Left);
    EXPECT_EQ(At(layout, "A13").side, Side::Bottom);
    EXPECT_EQ(At(layout, "B10").side, Side::Bottom);
    EXPECT_LT(At(layout, "A1").x, At(layout, "B1").x); // the A row outside
    EXPECT_EQ(layout.otherCount, 84 - static_cast<int>(model->Db().pins.size()));
}

// Chip databases written for these cases: a package whose names use a letter JEDEC skips,
// one whose last row is all power, and names that are no pins at all.
TEST(PackageLayout, NamesDecideTheLettersAndTheCountTheSize) {
    auto layOut = [](const std::string& package, const std::string& pins, PackageLayout& layout,
                     std::string& error) {
        std::istringstream in(".device t 3 3 4\n.io_tile 1 0\n.io_tile 0 1\n.io_tile 2 1\n"
                              ".io_tile 1 2\n.logic_tile 1 1\n.pins " +
                              package + "\n" + pins);
        VnTool::ChipDb db;
        if (!VnTool::ReadChipDb(in, "t.txt", package, db, error)) {
            return false;
        }
        return VnTool::LayOutPackage(db, false, layout, error);
    };
    PackageLayout layout;
    std::string error;
    ASSERT_TRUE(layOut("cx25", "A1 1 0 0\nD4 1 0 1\n", layout, error)) << error;
    EXPECT_EQ(layout.rowNames, (std::vector<std::string>{"A", "B", "C", "D", "E"}));
    EXPECT_EQ(layout.columns, 5); // grown to the square the count names
    EXPECT_EQ(layout.sites.size(), 25u);
    EXPECT_EQ(layout.Find("E5")->pin, -1);
    ASSERT_TRUE(layOut("cx81", "A1 1 0 0\nI2 1 0 1\n", layout, error)) << error;
    EXPECT_EQ(layout.rowNames.size(), 9u);
    EXPECT_EQ(layout.rowNames.back(), "I"); // the names use it, so the grid does
    EXPECT_EQ(layout.skippedLetters, "");
    EXPECT_EQ(layout.Find("I2")->pin, 1);
    ASSERT_TRUE(layOut("cx16", "A1 1 0 0\nH4 1 0 1\n", layout, error)) << error;
    EXPECT_EQ(layout.sites.size(), 32u);
    EXPECT_NE(layout.note, ""); // 32 places for 16 balls: said, not hidden
    EXPECT_FALSE(layOut("tq8", "1 1 0 0\nA2 1 0 1\n", layout, error));
    EXPECT_NE(error.find("mixes"), std::string::npos) << error;
    EXPECT_FALSE(layOut("tq8", "1 1 0 0\nVCC 1 0 1\n", layout, error));
    EXPECT_NE(error.find("VCC"), std::string::npos) << error;

    EXPECT_EQ(VnTool::BallRowNames(21).back(), "AA"); // after Y
    EXPECT_EQ(VnTool::BallRowNames(9, "I").back(), "I");
}

// ---- the pictures ----------------------------------------------------------------------

struct Element {
    std::string tag;
    std::map<std::string, std::string> attributes;
    std::string text;
    std::set<std::string> classes() const {
        std::set<std::string> tokens;
        std::istringstream words(Get("class"));
        std::string word;
        while (words >> word) {
            tokens.insert(word);
        }
        return tokens;
    }
    bool Has(const std::string& token) const { return classes().count(token) != 0; }
    std::string Get(const std::string& name) const {
        auto it = attributes.find(name);
        return it == attributes.end() ? std::string() : it->second;
    }
    double Number(const std::string& name) const { return std::atof(Get(name).c_str()); }
};

struct Svg {
    bool wellFormed = false;
    std::vector<Element> elements;
    std::vector<std::size_t> open; // the elements being read, innermost last
    std::vector<const Element*> With(const std::string& tag, const std::string& token) const {
        std::vector<const Element*> found;
        for (const Element& element : elements) {
            if (element.tag == tag && (token.empty() || element.Has(token))) {
                found.push_back(&element);
            }
        }
        return found;
    }
    // The element whose tooltip starts with `prefix`.
    const Element* Titled(const std::string& prefix) const {
        for (std::size_t i = 0; i + 1 < elements.size(); ++i) {
            if (elements[i + 1].tag == "title" && elements[i + 1].text.rfind(prefix, 0) == 0) {
                return &elements[i];
            }
        }
        return nullptr;
    }
};

void OnStart(void* data, const XML_Char* name, const XML_Char** attributes) {
    Element element{name, {}, {}};
    for (int i = 0; attributes[i] != nullptr; i += 2) {
        element.attributes[attributes[i]] = attributes[i + 1];
    }
    auto* svg = static_cast<Svg*>(data);
    svg->open.push_back(svg->elements.size());
    svg->elements.push_back(element);
}

void OnEnd(void* data, const XML_Char* /*name*/) {
    static_cast<Svg*>(data)->open.pop_back();
}

void OnText(void* data, const XML_Char* chars, int length) {
    auto* svg = static_cast<Svg*>(data);
    if (!svg->open.empty()) {
        svg->elements[svg->open.back()].text.append(chars, static_cast<std::size_t>(length));
    }
}

Svg ParseSvg(const std::string& text) {
    Svg svg;
    XML_Parser parser = XML_ParserCreate(nullptr);
    XML_SetUserData(parser, &svg);
    XML_SetElementHandler(parser, OnStart, OnEnd);
    XML_SetCharacterDataHandler(parser, OnText);
    svg.wellFormed =
        XML_Parse(parser, text.data(), static_cast<int>(text.size()), 1) == XML_STATUS_OK;
    XML_ParserFree(parser);
    return svg;
}

// Where a text lands, as a box; the width is a generous estimate for a sans-serif face.
struct Box {
    double x0, y0, x1, y1;
};

Box BoxOf(const Element& text) {
    const double size = text.Number("font-size");
    std::size_t characters = 0;
    for (char c : text.text) {
        characters += (static_cast<unsigned char>(c) & 0xc0) != 0x80 ? 1 : 0;
    }
    const double length = 0.55 * size * static_cast<double>(characters);
    const std::string anchor = text.Get("text-anchor");
    const double d0 = anchor == "end" ? -length : anchor == "middle" ? -length / 2 : 0;
    const double x = text.Number("x");
    const double y = text.Number("y");
    if (text.Get("transform").rfind("rotate(-90", 0) == 0) {
        return {x - 0.75 * size, y - d0 - length, x + 0.2 * size, y - d0};
    }
    return {x + d0, y - 0.75 * size, x + d0 + length, y + 0.2 * size};
}

// Pairs of labels whose boxes overlap.
std::vector<std::string> Overlaps(const Svg& svg) {
    std::vector<std::string> found;
    auto labels = svg.With("text", "label");
    for (std::size_t i = 0; i < labels.size(); ++i) {
        for (std::size_t j = i + 1; j < labels.size(); ++j) {
            Box a = BoxOf(*labels[i]);
            Box b = BoxOf(*labels[j]);
            if (a.x0 < b.x1 && b.x0 < a.x1 && a.y0 < b.y1 && b.y0 < a.y1) {
                found.push_back(labels[i]->text + " / " + labels[j]->text);
            }
        }
    }
    return found;
}

// A plan with a port on every pin of the model, named after it.
VnTool::DrawRequest EveryPinAssigned(const VnTool::DeviceModel& model) {
    VnTool::DrawRequest request;
    request.plan = true;
    for (VnTool::DeviceHolder* pin : model.Pins()) {
        request.marks[pin->GetIndex()].label = "port_" + pin->GetName().str();
    }
    return request;
}

class PlanPictures : public ::testing::Test {
protected:
    static Svg Draw(VnTool::DeviceModel& model, const VnTool::DrawRequest& request) {
        VnTool::DeviceDrawing drawing;
        std::string error;
        EXPECT_TRUE(VnTool::RenderView(model, request, drawing, error)) << error;
        Svg svg = ParseSvg(drawing.svg);
        EXPECT_TRUE(svg.wellFormed);
        return svg;
    }
};

TEST_F(PlanPictures, TheDieLegendTellsAssignedProblemAndMatchApartFromTheBanks) {
    auto model = Open("chipdb-8k.txt", "ct256");
    ASSERT_TRUE(model);
    VnTool::DrawRequest request;
    request.plan = true;
    request.marks[model->FindPin("A1")->GetIndex()].label = "led";
    request.marks[model->FindPin("B1")->GetIndex()] = {VnTool::PinMark::Status::Problem, "rx",
                                                       "why"};
    const Svg svg = Draw(*model, request);
    std::vector<std::string> banks;
    for (int bank = 0; bank < VnTool::kBankCount; ++bank) {
        auto legend = svg.With("circle", "legend");
        banks.push_back(legend[static_cast<std::size_t>(bank)]->Get("fill"));
    }
    const std::string assigned = svg.With("circle", "assigned").at(0)->Get("fill");
    const std::string problem = svg.With("circle", "problem").at(0)->Get("fill");
    const std::string match = svg.With("circle", "match").at(0)->Get("fill");
    for (const std::string& bank : banks) {
        EXPECT_GE(VnTool::ColourDistance(assigned, bank), 100) << assigned << " vs " << bank;
        EXPECT_GE(VnTool::ColourDistance(problem, bank), 100) << problem << " vs " << bank;
    }
    EXPECT_GE(VnTool::ColourDistance(problem, match), 100) << problem << " vs " << match;
    EXPECT_GE(VnTool::ColourDistance(assigned, match), 100) << assigned << " vs " << match;
    // The pins themselves wear the legend's colours.
    EXPECT_EQ(svg.With("circle", "pin").size(), model->Pins().size());
    EXPECT_EQ(svg.Titled("pin A1,")->Get("fill"), assigned);
    EXPECT_EQ(svg.Titled("pin B1,")->Get("fill"), problem);
}

// Both IO blocks of a tile taken, on every edge: no port name runs into another.
TEST_F(PlanPictures, NoTwoPortNamesOverlapOnTheDieOrThePackage) {
    for (const auto& [file, package] : std::vector<std::pair<std::string, std::string>>{
             {"chipdb-8k.txt", "ct256"}, {"chipdb-1k.txt", "tq144"}, {"chipdb-1k.txt", "qn84"}}) {
        SCOPED_TRACE(package);
        auto model = Open(file, package);
        ASSERT_TRUE(model);
        VnTool::DrawRequest request = EveryPinAssigned(*model);
        const Svg die = Draw(*model, request);
        EXPECT_EQ(die.With("text", "label").size(), model->Pins().size());
        EXPECT_EQ(Overlaps(die), std::vector<std::string>{});
        request.view = VnTool::DrawRequest::View::Package;
        const Svg view = Draw(*model, request);
        EXPECT_GE(view.With("text", "label").size(), model->Pins().size() * 9 / 10);
        EXPECT_EQ(Overlaps(view), std::vector<std::string>{});
    }
}

TEST_F(PlanPictures, TheBallGridShowsBanksByColourAndNumberAndCountsThem) {
    auto model = Open("chipdb-8k.txt", "ct256");
    ASSERT_TRUE(model);
    VnTool::DrawRequest request;
    request.view = VnTool::DrawRequest::View::Package;
    request.marks[model->FindPin("A2")->GetIndex()].label = "a_rather_long_port_name[12]";
    request.marks[model->FindPin("C8")->GetIndex()].label = "clk";
    const Svg svg = Draw(*model, request);
    auto balls = [&](const std::string& token) {
        std::size_t n = 0;
        for (const Element* ball : svg.With("circle", "ball")) {
            n += ball->Has(token) ? 1 : 0;
        }
        return n;
    };
    EXPECT_EQ(balls("ball"), 256u);
    EXPECT_EQ(balls("other"), 50u);
    EXPECT_EQ(balls("io"), 206u);
    std::size_t buffers = 0;
    for (VnTool::DeviceHolder* pin : model->Pins()) {
        buffers += model->IsGlobalBufferPin(pin) ? 1 : 0;
    }
    EXPECT_GT(buffers, 0u);
    EXPECT_EQ(balls("gbuf"), buffers);
    // Bank colour and bank number agree on every free ball.
    std::map<std::string, std::set<std::string>> fillsByBank;
    for (const Element* ball : svg.With("circle", "free")) {
        for (const std::string& token : ball->classes()) {
            if (token.rfind("bank", 0) == 0) {
                fillsByBank[token].insert(ball->Get("fill"));
            }
        }
    }
    EXPECT_EQ(fillsByBank.size(), 4u);
    for (const auto& [bank, fills] : fillsByBank) {
        EXPECT_EQ(fills.size(), 1u) << bank;
    }
    EXPECT_EQ(svg.With("text", "bankmark").size(), 206u + 4u); // each I/O ball and the legend
    // The legend counts used and free by bank (A2 and C8 are both in bank 0).
    std::vector<std::string> counts;
    for (const Element* text : svg.With("text", "bankcount")) {
        counts.push_back(text->text);
    }
    EXPECT_EQ(counts.at(0),
              "Bank 0 (top): 2 used, " + std::to_string(model->PinCount(0) - 2) + " free");
    EXPECT_EQ(counts.at(1),
              "Bank 1 (right): 0 used, " + std::to_string(model->PinCount(1)) + " free");
    // Names that fit are written whole; a long one is cut, whole in the tooltip.
    std::set<std::string> labels;
    for (const Element* text : svg.With("text", "label")) {
        labels.insert(text->text);
    }
    EXPECT_EQ(labels.count("clk"), 1u);
    EXPECT_EQ(labels.count("a_rather_long_port_name[12]"), 0u);
    ASSERT_NE(svg.Titled("A2: "), nullptr);
    EXPECT_NE(svg.Titled("A2: ")->Get("class").find("assigned"), std::string::npos);
    EXPECT_EQ(svg.With("polygon", "pin1").size(), 1u);
}

TEST_F(PlanPictures, TheNoLeadPackageMarksPinOneAndMirrorsFromBelow) {
    auto model = Open("chipdb-u4k.txt", "sg48");
    ASSERT_TRUE(model);
    VnTool::DrawRequest request;
    request.view = VnTool::DrawRequest::View::Package;
    const Svg top = Draw(*model, request);
    EXPECT_EQ(top.With("rect", "pad").size(), 48u);
    std::size_t others = 0;
    for (const Element* pad : top.With("rect", "pad")) {
        others += pad->Has("other") ? 1 : 0;
    }
    EXPECT_EQ(others, 48u - model->Pins().size());
    auto first = top.With("rect", "pin1");
    ASSERT_EQ(first.size(), 1u);
    EXPECT_TRUE(top.Titled("1: ") == first[0]);
    const double width = top.With("rect", "body").at(0)->Number("width");
    const double left = top.With("rect", "body").at(0)->Number("x");
    EXPECT_LT(first[0]->Number("x"), left + width / 2);
    request.bottom = true;
    const Svg bottom = Draw(*model, request);
    auto mirrored = bottom.With("rect", "pin1");
    ASSERT_EQ(mirrored.size(), 1u);
    EXPECT_GT(mirrored[0]->Number("x"), left + width / 2);
}

// ---- the commands ----------------------------------------------------------------------

class PackageCommands : public ::testing::Test {
protected:
    void SetUp() override {
        std::string pattern = (fs::temp_directory_path() / "venlomer-package-XXXXXX").string();
        ASSERT_NE(mkdtemp(pattern.data()), nullptr);
        m_dir = pattern;
    }
    void TearDown() override {
        std::error_code ec;
        fs::remove_all(m_dir, ec);
    }
    VnTest::Result Run(const std::vector<std::string>& args) {
        std::string command = "cd " + VnTest::Quote(m_dir.string()) + " && timeout 120 " +
                              VnTest::Quote(VENLOMER_TOOL_PATH);
        for (const auto& arg : args) {
            command += " " + VnTest::Quote(arg);
        }
        command += " >stdout 2>stderr";
        VnTest::Result result;
        const int raw = std::system(command.c_str());
        result.status = WIFEXITED(raw) ? WEXITSTATUS(raw) : -1;
        result.out = VnTest::Slurp(m_dir / "stdout");
        result.err = VnTest::Slurp(m_dir / "stderr");
        return result;
    }
    fs::path m_dir;
};

TEST_F(PackageCommands, FloorplanDrawsThePackageFromBelowAndRefusesABadView) {
    VnTest::Result result = Run({"floorplan", "--device", "1k", "--package", "tq144", "--view",
                                 "package", "--bottom", "--find", "Bank=3", "--svg", "p.svg"});
    ASSERT_EQ(result.status, 0) << result.err;
    EXPECT_TRUE(VnTest::Contains(result.out, "Package view written to")) << result.out;
    EXPECT_TRUE(VnTest::Contains(result.out, "tq144, bottom view: 144 pins")) << result.out;
    const Svg svg = ParseSvg(VnTest::Slurp(m_dir / "p.svg"));
    ASSERT_TRUE(svg.wellFormed);
    EXPECT_EQ(svg.With("rect", "pad").size(), 144u);
    // The search's matches are the bank's pins, lit on the package.
    auto lit = svg.With("rect", "hl");
    EXPECT_FALSE(lit.empty());
    for (const Element* pad : lit) {
        EXPECT_TRUE(pad->Has("bank3")) << pad->Get("class");
    }

    for (const std::vector<std::string>& bad :
         {std::vector<std::string>{"floorplan", "--view", "sideways"},
          std::vector<std::string>{"floorplan", "--bottom"},
          std::vector<std::string>{"pins", "show", "--view", "ball"}}) {
        VnTest::Result refused = Run(bad);
        EXPECT_EQ(refused.status, 2) << bad.back() << refused.err;
        EXPECT_EQ(VnTest::LineCount(refused.err), 1) << refused.err;
    }
}

// The plan on the package, from a design yosys made and a constraint file as a user writes.
TEST_F(PackageCommands, PinsShowNamesTheDesignsPortsOnTheBallGrid) {
    const fs::path verilog = fs::path(VENLOMER_DESIGN_DATA) / "counter8k.v";
    const std::string json = (m_dir / "top.json").string();
    ASSERT_EQ(std::system(("timeout 300 yosys -q -p " +
                           VnTest::Quote("synth_ice40 -top top -json " + json) + " " +
                           VnTest::Quote(verilog.string()) + " >/dev/null 2>&1")
                              .c_str()),
              0);
    VnTest::WriteBytes(m_dir / "top.pcf", "# board rev B\nset_io clk J3\nset_io rst A1\n"
                                          "set_io led[0] A2\nset_io led[1] A3\n");
    VnTest::Result result = Run({"pins", "show", "--design", json, "--pcf", "top.pcf", "--view",
                                 "package", "--svg", "plan.svg"});
    // A3 is no I/O pin of ct256: the plan has a problem, the picture is still written.
    EXPECT_TRUE(VnTest::Contains(result.out, "Package view written to"))
        << result.out << result.err;
    const Svg svg = ParseSvg(VnTest::Slurp(m_dir / "plan.svg"));
    ASSERT_TRUE(svg.wellFormed);
    std::set<std::string> labels;
    for (const Element* text : svg.With("text", "label")) {
        labels.insert(text->text);
    }
    EXPECT_EQ(labels, (std::set<std::string>{"clk", "rst", "led[0]"}));
    EXPECT_TRUE(svg.Titled("J3: ")->Has("assigned"));
    EXPECT_TRUE(svg.Titled("A3: ")->Has("other"));
}

} // namespace
