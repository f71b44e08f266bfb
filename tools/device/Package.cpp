//===-- tools/device/Package.cpp - a chip database's package as a board designer sees it ---===//
#include "Package.h"

#include <algorithm>
#include <cctype>
#include <cmath>
#include <map>
#include <set>
#include <unordered_map>

namespace VnTool {

namespace {

// Letters JEDEC leaves out of ball-row names: they read too much like digits or others.
constexpr std::string_view kSkippedByJedec = "IOQSXZ";

// Every one- and two-letter row name, far beyond the largest ball grid.
constexpr std::size_t kRowNameLimit = std::size_t{26} * 27;

// Footprint families whose pins run around four sides, even when the names carry a
// letter (the dual-row no-lead packages name their rows "A" and "B").
bool IsPerimeterFamily(std::string_view footprint) {
    for (std::string_view family : {"qn", "sg", "tq", "vq", "lq", "qf"}) {
        if (footprint.substr(0, family.size()) == family) {
            return true;
        }
    }
    return false;
}

// Balls a ball grid leaves empty, as rings counted from the outside (1 the outermost).
// The chip database cannot tell an empty place from a power ball; these are the
// footprints of the family whose ball count is not rows times columns.
const std::map<std::string, std::set<int>, std::less<>>& EmptyRings() {
    static const std::map<std::string, std::set<int>, std::less<>> rings = {
        {"cb132", {2, 5}}, // 14 x 14: rings 1, 3 and 4 and the centre 4 x 4
    };
    return rings;
}

struct SplitName {
    std::string letters;
    int number = 0;
    bool ok = false;
};

SplitName Split(std::string_view name) {
    SplitName split;
    std::size_t i = 0;
    while (i < name.size() && std::isalpha(static_cast<unsigned char>(name[i])) != 0) {
        split.letters += static_cast<char>(std::toupper(static_cast<unsigned char>(name[i])));
        ++i;
    }
    if (i == name.size() || name.size() - i > 6) {
        return split;
    }
    for (; i < name.size(); ++i) {
        if (std::isdigit(static_cast<unsigned char>(name[i])) == 0) {
            return split;
        }
        split.number = split.number * 10 + (name[i] - '0');
    }
    split.ok = split.number > 0;
    return split;
}

// "cm225:4k" -> footprint "cm225", count 225; "swg16tr" -> 16.
void ReadPackageName(const std::string& package, PackageLayout& layout) {
    layout.package = package;
    layout.footprint = package.substr(0, package.find(':'));
    std::size_t i = 0;
    while (i < layout.footprint.size() &&
           std::isalpha(static_cast<unsigned char>(layout.footprint[i])) != 0) {
        ++i;
    }
    int count = 0;
    for (; i < layout.footprint.size() &&
           std::isdigit(static_cast<unsigned char>(layout.footprint[i])) != 0 && count < 100000;
         ++i) {
        count = count * 10 + (layout.footprint[i] - '0');
    }
    layout.declaredCount = count;
}

int PerfectSquareRoot(int n) {
    const int root = static_cast<int>(std::lround(std::sqrt(static_cast<double>(n))));
    return root * root == n ? root : 0;
}

void Count(PackageLayout& layout) {
    layout.ioCount = 0;
    for (const PackageSite& site : layout.sites) {
        layout.ioCount += site.pin >= 0 ? 1 : 0;
    }
    layout.otherCount = static_cast<int>(layout.sites.size()) - layout.ioCount;
}

// ---- ball grids ------------------------------------------------------------------------

struct GridShape {
    int rows = 0;
    int columns = 0;
    std::string extraLetters; // letters JEDEC skips that the names use
};

bool MeasureGrid(const ChipDb& db, const std::vector<SplitName>& names, GridShape& shape,
                 std::vector<int>& rowOf, std::string& error) {
    for (const SplitName& name : names) {
        for (char letter : name.letters) {
            if (kSkippedByJedec.find(letter) != std::string_view::npos &&
                shape.extraLetters.find(letter) == std::string::npos) {
                shape.extraLetters += letter;
            }
        }
        shape.columns = std::max(shape.columns, name.number);
    }
    std::vector<std::string> order = BallRowNames(kRowNameLimit, shape.extraLetters);
    std::unordered_map<std::string, int> index;
    for (std::size_t i = 0; i < order.size(); ++i) {
        index.emplace(order[i], static_cast<int>(i));
    }
    for (std::size_t i = 0; i < names.size(); ++i) {
        auto found = index.find(names[i].letters);
        if (found == index.end()) {
            error = "pin '" + db.pins[i].name + "' of package " + db.package + " names no ball row";
            return false;
        }
        rowOf.push_back(found->second);
        shape.rows = std::max(shape.rows, found->second + 1);
    }
    return true;
}

// Kept whole: the grid's size, its empty places and its sites are decided together from
// the names and the declared count, and the note says which guess was made.
void LayOutGrid(const ChipDb& db, const std::vector<SplitName>& names, GridShape shape,
                const std::vector<int>& rowOf, PackageLayout& layout) {
    layout.kind = PackageLayout::Kind::BallGrid;
    // A last row or column of power balls leaves no name behind; a square count says how
    // far the grid really goes.
    if (const int side = PerfectSquareRoot(layout.declaredCount);
        side >= shape.rows && side >= shape.columns && shape.rows * shape.columns < side * side) {
        shape.rows = side;
        shape.columns = side;
    }
    layout.rowNames = BallRowNames(static_cast<std::size_t>(shape.rows), shape.extraLetters);
    layout.columns = shape.columns;
    std::set<int> emptyRings;
    if (auto known = EmptyRings().find(layout.footprint); known != EmptyRings().end()) {
        emptyRings = known->second;
    }
    auto ringOf = [&](int row, int column) {
        return std::min({row, column, shape.rows - 1 - row, shape.columns - 1 - column}) + 1;
    };
    std::map<std::pair<int, int>, int> pinAt;
    for (std::size_t i = 0; i < names.size(); ++i) {
        const int row = rowOf[i];
        const int column = names[i].number - 1;
        pinAt.emplace(std::make_pair(row, column), static_cast<int>(i));
        if (emptyRings.count(ringOf(row, column)) != 0) {
            emptyRings.clear(); // an I/O ball where the table says none: trust the pins
            layout.note = "ball " + db.pins[i].name + " lies where " + layout.footprint +
                          " has no ball; every grid place is drawn";
        }
    }
    for (int row = 0; row < shape.rows; ++row) {
        for (int column = 0; column < shape.columns; ++column) {
            if (emptyRings.count(ringOf(row, column)) != 0) {
                continue;
            }
            PackageSite site;
            site.name = layout.rowNames[static_cast<std::size_t>(row)] + std::to_string(column + 1);
            auto pin = pinAt.find({row, column});
            site.pin = pin == pinAt.end() ? -1 : pin->second;
            site.row = row;
            site.column = column;
            const int shown = layout.bottomView ? shape.columns - 1 - column : column;
            site.x = shown + 1.0;
            site.y = row + 1.0;
            layout.sites.push_back(std::move(site));
        }
    }
    layout.width = shape.columns + 1.0;
    layout.height = shape.rows + 1.0;
    for (std::size_t row = 0; row < layout.rowNames.size(); ++row) {
        const std::string& name = layout.rowNames[row];
        if (name.size() == 1 && row + 1 < layout.rowNames.size()) {
            for (char c = static_cast<char>(name[0] + 1); c < layout.rowNames[row + 1][0]; ++c) {
                layout.skippedLetters += c;
            }
        }
    }
    if (layout.note.empty() && layout.declaredCount > 0 &&
        static_cast<int>(layout.sites.size()) != layout.declaredCount) {
        layout.note = std::to_string(layout.sites.size()) + " grid places for " +
                      std::to_string(layout.declaredCount) +
                      " balls: which places are empty is not known, every one is drawn";
    }
}

// ---- pins around four sides ------------------------------------------------------------

// How far in from the frame's edge each row of pads lies, in pitch units.
double RingDepth(std::size_t ring) {
    return 0.5 + 1.1 * static_cast<double>(ring);
}

void LayOutPerimeter(const std::vector<std::string>& rowLetters, PackageLayout& layout,
                     const std::unordered_map<std::string, int>& pinByName) {
    layout.kind = PackageLayout::Kind::Perimeter;
    auto perSide = [](int n) { return (n + 3) / 4; };
    const int outer = perSide(layout.ringSizes.front());
    const double frame = outer + 3.0;
    layout.width = frame;
    layout.height = frame;
    for (std::size_t ring = 0; ring < layout.ringSizes.size(); ++ring) {
        const int n = layout.ringSizes[ring];
        const int m = perSide(n);
        const double depth = RingDepth(ring);
        const double start = (frame - m) / 2 + 0.5;
        for (int k = 1; k <= n; ++k) {
            PackageSite site;
            site.name = rowLetters[ring] + std::to_string(k);
            auto pin = pinByName.find(site.name);
            site.pin = pin == pinByName.end() ? -1 : pin->second;
            site.ring = static_cast<int>(ring);
            site.number = k;
            const int side = (k - 1) / m;
            const double along = start + (k - 1) % m;
            using Side = PackageSite::Side;
            static constexpr Side kSides[] = {Side::Left, Side::Bottom, Side::Right, Side::Top};
            site.side = kSides[side];
            switch (site.side) {
            case Side::Left:
                site.x = depth, site.y = along;
                break;
            case Side::Bottom:
                site.x = along, site.y = frame - depth;
                break;
            case Side::Right:
                site.x = frame - depth, site.y = frame - along;
                break;
            default:
                site.x = frame - along, site.y = depth;
                break;
            }
            if (layout.bottomView) {
                site.x = frame - site.x;
                site.side = site.side == Side::Left    ? Side::Right
                            : site.side == Side::Right ? Side::Left
                                                       : site.side;
            }
            layout.sites.push_back(std::move(site));
        }
    }
}

// The rows' sizes: numbered names make one row as long as the package's count; lettered
// rows each reach their highest name, and the last takes what the count has left.
void SizeRings(const std::vector<SplitName>& names, const std::vector<std::string>& rowLetters,
               PackageLayout& layout) {
    std::map<std::string, int> highest;
    for (const SplitName& name : names) {
        highest[name.letters] = std::max(highest[name.letters], name.number);
    }
    int total = 0;
    for (const std::string& letters : rowLetters) {
        const int size = highest[letters];
        total += size;
        layout.ringSizes.push_back(size);
    }
    if (layout.declaredCount > total) {
        layout.ringSizes.back() += layout.declaredCount - total;
    } else if (layout.declaredCount > 0 && layout.declaredCount < total) {
        layout.note = "pin names run to " + std::to_string(total) + ", past the " +
                      std::to_string(layout.declaredCount) + " pins of " + layout.footprint;
    }
}

} // namespace

const PackageSite* PackageLayout::Find(std::string_view name) const {
    for (const PackageSite& site : sites) {
        if (site.name == name) {
            return &site;
        }
    }
    return nullptr;
}

std::vector<std::string> BallRowNames(std::size_t count, std::string_view extra) {
    std::string alphabet;
    for (char c = 'A'; c <= 'Z'; ++c) {
        if (kSkippedByJedec.find(c) == std::string_view::npos ||
            extra.find(c) != std::string_view::npos) {
            alphabet += c;
        }
    }
    std::vector<std::string> names;
    for (std::size_t i = 0; names.size() < count && i < alphabet.size(); ++i) {
        names.emplace_back(1, alphabet[i]);
    }
    for (std::size_t i = 0; names.size() < count && i < alphabet.size() * alphabet.size(); ++i) {
        names.push_back(std::string{alphabet[i / alphabet.size()], alphabet[i % alphabet.size()]});
    }
    return names;
}

bool LayOutPackage(const ChipDb& db, bool bottomView, PackageLayout& layout, std::string& error) {
    layout = PackageLayout();
    layout.bottomView = bottomView;
    ReadPackageName(db.package, layout);
    if (db.pins.empty()) {
        error = "package " + db.package + " of device " + db.device + " has no pins to lay out";
        return false;
    }
    std::vector<SplitName> names;
    std::unordered_map<std::string, int> pinByName;
    std::size_t numbered = 0;
    for (std::size_t i = 0; i < db.pins.size(); ++i) {
        names.push_back(Split(db.pins[i].name));
        if (!names.back().ok) {
            error = "pin '" + db.pins[i].name + "' of package " + db.package +
                    " is neither a number nor a ball name";
            return false;
        }
        numbered += names.back().letters.empty() ? 1 : 0;
        pinByName.emplace(names.back().letters + std::to_string(names.back().number),
                          static_cast<int>(i));
    }
    if (numbered != 0 && numbered != names.size()) {
        error = "package " + db.package + " mixes numbered pins and ball names";
        return false;
    }
    if (numbered == names.size()) {
        const std::vector<std::string> rows = {""};
        SizeRings(names, rows, layout);
        LayOutPerimeter(rows, layout, pinByName);
        Count(layout);
        return true;
    }
    GridShape shape;
    std::vector<int> rowOf;
    if (!MeasureGrid(db, names, shape, rowOf, error)) {
        return false;
    }
    // Lettered rows around four sides: the family says so, or the names are far too few
    // for the grid they would span (a grid's balls are at least half its places).
    const long places = static_cast<long>(shape.rows) * shape.columns;
    if (IsPerimeterFamily(layout.footprint) ||
        (layout.declaredCount > 0 && places > 2L * layout.declaredCount)) {
        std::set<int> used(rowOf.begin(), rowOf.end());
        std::vector<std::string> order = BallRowNames(kRowNameLimit, shape.extraLetters);
        std::vector<std::string> rows;
        rows.reserve(used.size());
        for (int row : used) {
            rows.push_back(order[static_cast<std::size_t>(row)]);
        }
        SizeRings(names, rows, layout);
        LayOutPerimeter(rows, layout, pinByName);
    } else {
        LayOutGrid(db, names, shape, rowOf, layout);
    }
    Count(layout);
    return true;
}

} // namespace VnTool
