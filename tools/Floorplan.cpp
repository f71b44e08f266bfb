//===-- tools/Floorplan.cpp - venlomer floorplan: the editor's road on a device ---===//
//
// Builds what the editor builds when it opens a device view: device resources for the
// tiles and the package pins with their properties, a tree of banks and pins, then runs a
// search, selects and highlights the matches and draws the device in the colours of the
// library's colour scheme. Only the library's published classes are used, as a host uses
// them.
//
//===------------------------------------------------------------------------------===//
#include "ChipDb.h"
#include "Commands.h"
#include "Svg.h"

#include "CommonI/RefCountPtr.h"
#include "VnI/IDeviceResource.h"
#include "VnI/ITreeNode.h"
#include "VnI/PropertyType.h"
#include "devdata/PM_DEVKEY.h"
#include "s/ColorManager.h"
#include "s/DeviceResource.h"
#include "s/FindItr.h"
#include "s/HighlightManager.h"
#include "s/PropertyFactory.h"
#include "s/PropertyHolderItr.h"
#include "s/PropertyNameList.h"
#include "s/SelectionManager.h"
#include "s/TreeDataModel.h"
#include "s/TreeNode.h"

#include <charconv>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <initializer_list>
#include <list>
#include <memory>
#include <string>
#include <vector>

namespace VnTool {

namespace {

const char kCommand[] = "floorplan";
const char kDefaultChipDbFolder[] = "/usr/share/fpga-icestorm/chipdb";
const char kDefaultChipDb[] = "chipdb-8k.txt";
const char kDefaultPackage[] = "ct256";
const char kBundledChipDb[] = "chipdb-demo.txt";

struct FlagName {
    const char* name;
    int bit;
};

// The compare flags by the names the user types.
const FlagName kFlagNames[] = {
    {"exact", VnI::MATCH_EXACT},
    {"ignore-case", VnI::MATCH_IGNORE_CASE},
    {"substring", VnI::MATCH_SUBSTRING},
    {"within-5-percent", VnI::MATCH_WITHIN_5_PERCENT},
    {"less", VnI::MATCH_LESS},
    {"greater", VnI::MATCH_GREATER},
    {"any", VnI::MATCH_ANY},
    {"regexp", VnI::MATCH_REGEXP},
};

bool ParseFlags(const std::string& list, int& flags, std::string& error) {
    flags = 0;
    std::size_t start = 0;
    while (start <= list.size()) {
        std::size_t end = list.find_first_of(",|+", start);
        if (end == std::string::npos) {
            end = list.size();
        }
        std::string word = list.substr(start, end - start);
        bool known = false;
        for (const auto& flag : kFlagNames) {
            if (word == flag.name) {
                flags |= flag.bit;
                known = true;
            }
        }
        if (!known) {
            error = "unknown compare flag \"" + word +
                    "\"; use exact, ignore-case, substring, within-5-percent, less, greater, "
                    "any, regexp";
            return false;
        }
        start = end + 1;
    }
    return true;
}

std::string FlagsText(int flags) {
    std::string text;
    for (const auto& flag : kFlagNames) {
        if ((flags & flag.bit) != 0) {
            text += (text.empty() ? "" : ",") + std::string(flag.name);
        }
    }
    return text.empty() ? "exact" : text;
}

struct Options {
    std::string chipDb;
    std::string package;
    std::string note; // why the device is not the one asked for
    bool search = false;
    std::string findName;
    std::string findValue;
    int flags = 0;
    std::string svg = "floorplan.svg";
    bool highlightOnly = false;
};

int ResolveOptions(const ParsedArgs& args, Options& options) {
    std::string error;
    if (args.Has("--flags") && !ParseFlags(args.Value("--flags"), options.flags, error)) {
        return UsageError(kCommand, error);
    }
    if (args.Has("--find")) {
        std::string find = args.Value("--find");
        auto eq = find.find('=');
        if (eq == std::string::npos || eq == 0) {
            return UsageError(kCommand, "--find wants NAME=VALUE, got \"" + find + "\"");
        }
        options.search = true;
        options.findName = find.substr(0, eq);
        options.findValue = find.substr(eq + 1);
    } else if (args.Has("--flags")) {
        return UsageError(kCommand, "--flags needs --find");
    }
    options.highlightOnly = args.Has("--highlight-only");
    if (args.Has("--svg")) {
        options.svg = args.Value("--svg");
        if (options.svg.empty()) {
            return UsageError(kCommand, "--svg wants a file name");
        }
    }
    options.package = args.Value("--package");
    if (args.Has("--chipdb")) {
        options.chipDb = args.Value("--chipdb");
        return kExitOk;
    }
    const char* folder = std::getenv("VENLOMER_CHIPDB_DIR");
    std::filesystem::path preferred =
        std::filesystem::path(folder != nullptr ? folder : kDefaultChipDbFolder) / kDefaultChipDb;
    std::error_code ec;
    if (std::filesystem::is_regular_file(preferred, ec)) {
        options.chipDb = preferred.string();
        if (!args.Has("--package")) {
            options.package = kDefaultPackage;
        }
        return kExitOk;
    }
    options.chipDb = FindDataFile(kBundledChipDb);
    if (options.chipDb.empty()) {
        return Refused(kCommand, "no chip database: " + preferred.string() +
                                     " is missing (install fpga-icestorm-chipdb) and the "
                                     "bundled " +
                                     kBundledChipDb + " was not found; use --chipdb FILE");
    }
    options.note = preferred.string() + " not found (package fpga-icestorm-chipdb); using the "
                                        "bundled demo device";
    return kExitOk;
}

using Text = Port::StringBase<char>;
template <class T> using Ptr = CommonI::RefCountPtr<T>;

Ptr<VnI::IProperty> Adopt(VnI::IProperty* property) {
    return Ptr<VnI::IProperty>::Adopt(property);
}

const char* const kBankEdges[] = {"top", "right", "bottom", "left"};

// The editor's device resources for this family. The three device operations answer
// what a view needs to place and colour a resource without knowing its kind.
class ToolResource : public Vn::Eng::DeviceResource {
public:
    ToolResource(VnI::IPropertyNameList* names, std::string tileName, int x, int y,
                 std::string siteType)
        : m_names(names), m_tileName(std::move(tileName)), m_x(x), m_y(y),
          m_siteType(std::move(siteType)) {}

    Text GetName() override {
        auto name = GetPropertyByName(Vn::Eng::PropertyHolder::GetNameTitle());
        return name ? name->GetStringProperty() : Text();
    }
    VnI::IPropertyNameList* GetPropertyNames() override { return m_names; }
    Text GetTileName() const override { return Text(m_tileName.c_str()); }
    std::int64_t GetLocation(int& x, int& y) const override {
        x = m_x;
        y = m_y;
        return m_x >= 0 ? 1 : 0;
    }
    Text GetSiteType() const override { return Text(m_siteType.c_str()); }

private:
    VnI::IPropertyNameList* m_names; // shared by every resource of the kind
    std::string m_tileName;
    int m_x;
    int m_y;
    std::string m_siteType;
};

// A package pin shows the first selected-path colour when highlighted, as the editor's
// pin view does.
class PinResource : public ToolResource {
public:
    using ToolResource::ToolResource;
    Ptr<VnI::IColorProperty> GetHighlightColor() override {
        return Vn::Eng::ColorManager::GetSelectedPathColor(0);
    }
};

std::string TileName(const Tile& tile) {
    std::string kind = TileKindName(tile.kind);
    for (char& c : kind) {
        c = static_cast<char>(c - 'a' + 'A');
    }
    return kind + "_" + std::to_string(tile.x) + "_" + std::to_string(tile.y);
}

// The tile-type names of the colour scheme, by which views colour tiles.
std::string SiteTypeOf(const Tile& tile, const ChipDb& db) {
    switch (tile.kind) {
    case TileKind::Logic:
        return "SLICE";
    case TileKind::Io: {
        int bank = IoBankOf(tile.x, tile.y, db.width, db.height);
        return bank == 0 || bank == 2 ? "TB_IO" : "LR_IO";
    }
    case TileKind::RamBottom:
    case TileKind::RamTop:
        return "BRAM";
    }
    return "SLICE";
}

std::string ValueText(const Ptr<VnI::IProperty>& property) {
    if (!property) {
        return "";
    }
    switch (property->GetType()) {
    case VnI::INT_TYPE:
        return std::to_string(property->GetIntProperty());
    case VnI::DOUBLE_TYPE:
        return std::to_string(property->GetDoubleProperty());
    case VnI::BOOL_TYPE:
        return property->GetBoolProperty() ? "yes" : "no";
    default:
        return property->GetStringProperty().str();
    }
}

bool g_usedFallbackColor = false;

std::string ColorText(const Ptr<VnI::IColorProperty>& color, const char* fallback) {
    if (!color || !color->IsValid()) {
        g_usedFallbackColor = true;
        return fallback;
    }
    return HexColor(color->GetRed(), color->GetGreen(), color->GetBlue());
}

// Everything the road builds, torn down in the order the library's ownership asks for:
// managers let go of their plain pointers first, the model takes the tree apart, then the
// resources (which hold their tree nodes) go.
struct Model {
    // The enumerated property's choices: declared first so that they outlive every
    // property and name that refers to them.
    std::vector<Text> tileTypes;
    Vn::Eng::PropertyNameList deviceNames, bankNames, tileNames, pinNames;
    std::vector<std::unique_ptr<ToolResource>> resources;
    ToolResource* device = nullptr;
    std::vector<ToolResource*> banks; // by bank number; null where the device has none
    std::vector<ToolResource*> tiles;
    std::vector<ToolResource*> pins;
    std::vector<int> pinsPerBank;
    Ptr<VnI::ITreeModel> tree;
    Vn::Eng::SelectionManager selection;
    Vn::Eng::HighlightManager highlight;

    ~Model() {
        highlight.RemoveAll();
        selection.RemoveAll();
        tree = nullptr;
        resources.clear();
    }

    VnI::IPropertyNameList* List(Vn::Eng::PropertyNameList& list) {
        return static_cast<VnI::IPropertyNameList*>(
            list.GetInterface(VnI::IPropertyNameList::kIID));
    }

    template <class T>
    T* Make(Vn::Eng::PropertyNameList& names, std::string tileName, int x, int y,
            std::string siteType) {
        auto resource =
            std::make_unique<T>(List(names), std::move(tileName), x, y, std::move(siteType));
        T* raw = resource.get();
        resources.push_back(std::move(resource));
        return raw;
    }
};

void AddText(ToolResource* r, const char* name, const std::string& value) {
    r->AddProperty(name,
                   Adopt(Vn::Eng::PropertyFactory::CreateStringProperty(value.c_str(), true)));
}
void AddInt(ToolResource* r, const char* name, int value) {
    r->AddProperty(name, Adopt(Vn::Eng::PropertyFactory::CreateIntProperty(value, true)));
}

void BuildResources(const ChipDb& db, Model& m) {
    m.tileTypes = {Text("logic"), Text("io"), Text("ramb"), Text("ramt")};
    // Names are declared up front so that every kind lists its columns in this order,
    // whatever order properties arrive in.
    struct Column {
        const char* name;
        VnI::PropertyType type;
    };
    auto declare = [](Vn::Eng::PropertyNameList& list, std::initializer_list<Column> columns) {
        for (const Column& column : columns) {
            list.AddName(column.name, column.type, true);
        }
    };
    const auto text = VnI::STRING_TYPE;
    const auto number = VnI::INT_TYPE;
    declare(m.deviceNames,
            {{"Name", text}, {"Package", text}, {"Width", number}, {"Height", number}});
    declare(m.bankNames, {{"Name", text}, {"Bank", number}, {"Edge", text}, {"Pins", number}});
    declare(m.tileNames, {{"Name", text}});
    {
        auto prototype = Adopt(Vn::Eng::PropertyFactory::CreateEnumProperty(m.tileTypes, "", true));
        m.tileNames.AddEnumName("Type", VnI::ENUM_TYPE, prototype->GetPossibleValues(), true);
    }
    declare(m.tileNames, {{"X", number}, {"Y", number}});
    declare(m.pinNames, {{"Name", text},
                         {"Bank", number},
                         {"Tile", text},
                         {"X", number},
                         {"Y", number},
                         {"Block", number}});

    m.device = m.Make<ToolResource>(m.deviceNames, "", -1, -1, "DEVICE");
    AddText(m.device, "Name", db.device);
    AddText(m.device, "Package", db.package);
    AddInt(m.device, "Width", db.width);
    AddInt(m.device, "Height", db.height);

    m.pinsPerBank.assign(4, 0);
    for (const Pin& pin : db.pins) {
        if (pin.bank >= 0 && pin.bank < 4) {
            ++m.pinsPerBank[pin.bank];
        }
    }
    m.banks.assign(4, nullptr);
    for (int bank = 0; bank < 4; ++bank) {
        if (m.pinsPerBank[bank] == 0) {
            continue;
        }
        ToolResource* r = m.Make<ToolResource>(m.bankNames, "", -1, -1, "IO_BANK");
        AddText(r, "Name", "Bank " + std::to_string(bank));
        AddInt(r, "Bank", bank);
        AddText(r, "Edge", kBankEdges[bank]);
        AddInt(r, "Pins", m.pinsPerBank[bank]);
        m.banks[bank] = r;
    }
    for (const Tile& tile : db.tiles) {
        ToolResource* r =
            m.Make<ToolResource>(m.tileNames, TileName(tile), tile.x, tile.y, SiteTypeOf(tile, db));
        AddText(r, "Name", TileName(tile));
        r->AddProperty("Type", Adopt(Vn::Eng::PropertyFactory::CreateEnumProperty(
                                   m.tileTypes, TileKindName(tile.kind), true)));
        AddInt(r, "X", tile.x);
        AddInt(r, "Y", tile.y);
        m.tiles.push_back(r);
    }
    for (const Pin& pin : db.pins) {
        Tile tile{TileKind::Io, pin.x, pin.y};
        ToolResource* r = m.Make<PinResource>(m.pinNames, TileName(tile), pin.x, pin.y, "IO");
        AddText(r, "Name", pin.name);
        AddInt(r, "Bank", pin.bank);
        AddText(r, "Tile", TileName(tile));
        AddInt(r, "X", pin.x);
        AddInt(r, "Y", pin.y);
        AddInt(r, "Block", pin.pio);
        m.pins.push_back(r);
    }
}

// The device at the root; under it a node per bank with its pins, and a group of tiles.
// AddChild puts a child in front of its siblings, so children are added last to first.
void BuildTree(Model& m) {
    auto root = Vn::Eng::TreeNode::CreateInstance(m.device, nullptr);
    auto tilesGroup = Vn::Eng::TreeGroupNode::CreateInstance("Tiles", root);
    for (auto it = m.tiles.rbegin(); it != m.tiles.rend(); ++it) {
        tilesGroup->AddChild(Vn::Eng::TreeNode::CreateInstance(*it, tilesGroup));
    }
    root->AddChild(tilesGroup);
    std::vector<Ptr<VnI::ITreeNode>> bankNodes(4);
    for (int bank = 3; bank >= 0; --bank) {
        if (m.banks[bank] != nullptr) {
            bankNodes[bank] = Vn::Eng::TreeNode::CreateInstance(m.banks[bank], root);
        }
    }
    for (auto it = m.pins.rbegin(); it != m.pins.rend(); ++it) {
        int bank = (*it)->GetPropertyByName("Bank")->GetIntProperty();
        bankNodes[bank]->AddChild(Vn::Eng::TreeNode::CreateInstance(*it, bankNodes[bank]));
    }
    for (int bank = 3; bank >= 0; --bank) {
        if (bankNodes[bank]) {
            root->AddChild(bankNodes[bank]);
        }
    }
    m.tree = Vn::Eng::TreeDataModel::CreateInstance(root);
}

int CountChildren(const Ptr<VnI::ITreeNode>& node) {
    int count = 0;
    for (auto it = node->GetChildren(); !it->IsEnd(); it->Next()) {
        ++count;
    }
    return count;
}

// Read back through the model, as a tree view would fill itself.
void PrintTree(Model& m) {
    auto root = m.tree->GetRootNode();
    std::string line = "Tree: " + root->GetDataRef()->GetName().str() + " >";
    bool first = true;
    for (auto it = root->GetChildren(); !it->IsEnd(); it->Next()) {
        auto child = it->CurrentItem();
        VnI::IPropertyHolder* holder = child->GetDataRef();
        int count = CountChildren(child);
        std::string name = holder != nullptr ? holder->GetName().str() : "Tiles";
        line += std::string(first ? " " : ", ") + name + " (" + std::to_string(count) +
                (holder != nullptr ? " pins)" : ")");
        first = false;
    }
    std::printf("%s\n", line.c_str());
}

std::vector<std::string> ColumnNames(VnI::IPropertyNameList* names) {
    std::vector<std::string> columns;
    for (int i = 0; i < names->GetNumNames(); ++i) {
        columns.push_back(names->GetPropertyName(i)->GetName().str());
    }
    return columns;
}

// One table per kind of resource among the matches, in the order the kinds first match.
void PrintMatches(const std::vector<VnI::IPropertyHolder*>& matches,
                  VnI::IPropertyNameList* pinKind) {
    std::vector<VnI::IPropertyNameList*> kinds;
    for (auto* holder : matches) {
        bool seen = false;
        for (auto* kind : kinds) {
            seen = seen || kind == holder->GetPropertyNames();
        }
        if (!seen) {
            kinds.push_back(holder->GetPropertyNames());
        }
    }
    for (auto* kind : kinds) {
        std::printf("%s:\n", kind == pinKind ? "Pins" : "Banks");
        std::vector<std::string> columns = ColumnNames(kind);
        std::vector<std::vector<std::string>> rows;
        for (auto* holder : matches) {
            if (holder->GetPropertyNames() != kind) {
                continue;
            }
            std::vector<std::string> row;
            for (const auto& column : columns) {
                row.push_back(ValueText(holder->GetPropertyByName(column.c_str())));
            }
            rows.push_back(std::move(row));
        }
        std::vector<std::size_t> widths(columns.size());
        for (std::size_t c = 0; c < columns.size(); ++c) {
            widths[c] = columns[c].size();
            for (const auto& row : rows) {
                widths[c] = std::max(widths[c], row[c].size());
            }
        }
        auto printRow = [&](const std::vector<std::string>& cells) {
            std::string line = " ";
            for (std::size_t c = 0; c < cells.size(); ++c) {
                line += " " + cells[c];
                if (c + 1 < cells.size()) {
                    line += std::string(widths[c] - cells[c].size(), ' ') + " ";
                }
            }
            std::printf("%s\n", line.c_str());
        };
        printRow(columns);
        for (const auto& row : rows) {
            printRow(row);
        }
    }
}

// The value to search for, typed after the property it is compared with. Null after a
// usage error has been reported.
int MakeWanted(Model& m, const Options& options, Ptr<VnI::IProperty>& wanted) {
    // The wanted value takes the type the pins (or banks) declare for that name, since a
    // property only equals a property of its own type.
    Text name(options.findName.c_str());
    VnI::IPropertyNameList* declaring = nullptr;
    int position = -1;
    for (auto* list : {m.List(m.pinNames), m.List(m.bankNames)}) {
        if (declaring == nullptr && (position = list->Contains(name)) >= 0) {
            declaring = list;
        }
    }
    if (declaring == nullptr) {
        return UsageError(kCommand, "pins and banks have no property \"" + options.findName +
                                        "\"; they have Name, Bank, Tile, X, Y, Block, Edge, Pins");
    }
    if (declaring->GetPropertyName(position)->GetType() == VnI::INT_TYPE) {
        int value = 0;
        const std::string& text = options.findValue;
        auto [end, ec] = std::from_chars(text.data(), text.data() + text.size(), value);
        if (ec != std::errc() || end != text.data() + text.size()) {
            return UsageError(kCommand,
                              options.findName + " is a whole number; got \"" + text + "\"");
        }
        wanted = Adopt(Vn::Eng::PropertyFactory::CreateIntProperty(value, true));
    } else {
        wanted =
            Adopt(Vn::Eng::PropertyFactory::CreateStringProperty(options.findValue.c_str(), true));
    }
    return kExitOk;
}

void Search(Model& m, const Options& options, const Ptr<VnI::IProperty>& wanted) {
    Text name(options.findName.c_str());
    std::list<VnI::IPropertyHolder*> candidates;
    int bankCount = 0;
    for (auto* bank : m.banks) {
        if (bank != nullptr) {
            candidates.push_back(bank);
            ++bankCount;
        }
    }
    candidates.insert(candidates.end(), m.pins.begin(), m.pins.end());
    auto found = Vn::Eng::FindItr::CreateInstance(
        Vn::Eng::PropertyHolderItr::CreateInstance(&candidates), name, wanted, options.flags);
    std::vector<VnI::IPropertyHolder*> matches;
    for (; !found->IsEnd(); found->Next()) {
        matches.push_back(found->CurrentItem());
    }
    std::printf("Search: %s = \"%s\" (%s) over %d banks and %zu pins: %zu %s\n",
                options.findName.c_str(), options.findValue.c_str(),
                FlagsText(options.flags).c_str(), bankCount, m.pins.size(), matches.size(),
                matches.size() == 1 ? "match" : "matches");
    PrintMatches(matches, m.List(m.pinNames));

    // A matched bank brings the pins shown below it into the selection.
    for (auto* holder : matches) {
        m.selection.AddSelectedItem(holder, true);
    }
    int selected = 0;
    int highlighted = 0;
    for (auto it = m.selection.GetAllSelectedItems(); !it->IsEnd(); it->Next()) {
        VnI::IPropertyHolder* holder = it->CurrentItem();
        ++selected;
        if (holder->GetPropertyNames() == m.List(m.pinNames)) {
            // Resources are not counted: the plain interface pointer is all there is.
            m.highlight.AddHighlightedItem(static_cast<VnI::IDeviceResource*>(
                holder->GetInterface(VnI::IDeviceResource::kIID)));
            ++highlighted;
        }
    }
    std::printf("Selected: %d resources (category %d, pins below matched banks included)\n",
                selected, VnI::DEVICE_RESOURCE_HOLDER_TYPE);
    std::printf("Highlighted: %d pins\n", highlighted);
}

// The colour scheme the library read is an input too: a picture must never replace it.
std::string SchemePath() {
    PM_DEVKEY keys("rareroded.acd", nullptr, 0, 1, 0);
    return keys.GetPath().str();
}

int Draw(Model& m, const ChipDb& db, const Options& options) {
    const double cell = 22;
    const double margin = 30;
    const double top = 46;
    const double gridWidth = db.width * cell;
    const double gridHeight = db.height * cell;
    const double legendX = margin + gridWidth + 24;
    SvgWriter svg(legendX + 180, std::max(top + gridHeight + margin, top + 330.0));
    std::string title = "Device " + db.device + ", package " + db.package;
    if (options.search) {
        title += ", search " + options.findName + "=" + options.findValue;
    }
    svg.Text(margin, 26, title, 15);

    auto place = [&](int x, int y, double& px, double& py) {
        px = margin + x * cell;
        py = top + (db.height - 1 - y) * cell; // the top edge (bank 0) at the top
    };
    for (ToolResource* tile : m.tiles) {
        int x = 0;
        int y = 0;
        tile->GetLocation(x, y);
        double px = 0;
        double py = 0;
        place(x, y, px, py);
        auto color = Vn::Eng::ColorManager::GetTileSiteColor(tile->GetSiteType());
        std::string kind = tile->GetPropertyByName("Type")->GetStringProperty().str();
        svg.Rect(px + 1, py + 1, cell - 2, cell - 2, ColorText(color, "#d0d0d0"), "tile " + kind,
                 tile->GetTileName().str() + " (" + tile->GetSiteType().str() + ")");
    }
    int drawnPins = 0;
    int drawnHighlighted = 0;
    for (ToolResource* pin : m.pins) {
        auto* resource =
            static_cast<VnI::IDeviceResource*>(pin->GetInterface(VnI::IDeviceResource::kIID));
        bool lit = resource->IsHighlighted();
        if (options.highlightOnly && !lit) {
            continue;
        }
        int x = 0;
        int y = 0;
        resource->GetLocation(x, y);
        int bank = pin->GetPropertyByName("Bank")->GetIntProperty();
        int block = pin->GetPropertyByName("Block")->GetIntProperty();
        double px = 0;
        double py = 0;
        place(x, y, px, py);
        // Two IO blocks share a tile: side by side along the edge.
        double offset = (block == 0 ? -0.22 : 0.22) * cell;
        double cx = px + cell / 2 + (bank == 0 || bank == 2 ? offset : 0);
        double cy = py + cell / 2 + (bank == 1 || bank == 3 ? offset : 0);
        std::string tip = "pin " + pin->GetName().str() + ", bank " + std::to_string(bank) + ", " +
                          resource->GetTileName().str();
        if (lit) {
            svg.Circle(cx, cy, 5, ColorText(resource->GetHighlightColor(), "#ff0000"), "pin hl",
                       tip, "#000000", 1.5);
            ++drawnHighlighted;
        } else {
            svg.Circle(cx, cy, 3.5,
                       ColorText(Vn::Eng::ColorManager::GetIOBankColor(bank, false), "#808080"),
                       "pin", tip);
        }
        ++drawnPins;
    }

    double y = top + 4;
    svg.Text(legendX, y + 10, "Tile types", 13);
    y += 18;
    for (const char* site : {"SLICE", "TB_IO", "LR_IO", "BRAM"}) {
        svg.Rect(legendX, y, 14, 14,
                 ColorText(Vn::Eng::ColorManager::GetTileSiteColor(site), "#d0d0d0"), "legend");
        svg.Text(legendX + 20, y + 11, site, 12);
        y += 18;
    }
    y += 8;
    svg.Text(legendX, y + 10, "IO banks", 13);
    y += 18;
    for (int bank = 0; bank < 4; ++bank) {
        svg.Circle(legendX + 7, y + 7, 5,
                   ColorText(Vn::Eng::ColorManager::GetIOBankColor(bank, false), "#808080"),
                   "legend");
        svg.Text(legendX + 20, y + 11,
                 "Bank " + std::to_string(bank) + " (" + kBankEdges[bank] + ", " +
                     std::to_string(m.pinsPerBank[bank]) + " pins)",
                 12);
        y += 18;
    }
    y += 8;
    svg.Text(legendX, y + 10, "Highlight", 13);
    y += 18;
    svg.Circle(legendX + 7, y + 7, 5,
               ColorText(Vn::Eng::ColorManager::GetSelectedPathColor(0), "#ff0000"), "legend", {},
               "#000000", 1.5);
    svg.Text(legendX + 20, y + 11, "search match", 12);

    std::string error;
    if (!WriteTextFile(options.svg, svg.Finish(), error, {options.chipDb, SchemePath()})) {
        return Refused(kCommand, error);
    }
    if (g_usedFallbackColor) {
        std::printf("Note: the colour scheme gave no colour for some roles; those are drawn "
                    "grey (venlomer colors shows the scheme)\n");
    }
    std::error_code ec;
    auto where = std::filesystem::absolute(options.svg, ec);
    std::printf("Floorplan written to %s (%zu tiles, %d pins, %d highlighted)\n",
                ec ? options.svg.c_str() : where.c_str(), m.tiles.size(), drawnPins,
                drawnHighlighted);
    return kExitOk;
}

int Run(const ParsedArgs& args) {
    Options options;
    if (int status = ResolveOptions(args, options); status != kExitOk) {
        return status;
    }
    ChipDb db;
    std::string error;
    if (!ReadChipDbFile(options.chipDb, options.package, db, error)) {
        return Refused(kCommand, error);
    }
    Model model;
    BuildResources(db, model);
    Ptr<VnI::IProperty> wanted;
    if (options.search) {
        if (int status = MakeWanted(model, options, wanted); status != kExitOk) {
            return status;
        }
    }
    if (!options.note.empty()) {
        std::printf("Note: %s\n", options.note.c_str());
    }
    std::printf(
        "Device %s (%d x %d tiles) from %s, package %s: %zu tiles, %zu pins\n", db.device.c_str(),
        db.width, db.height, options.chipDb == "-" ? "standard input" : options.chipDb.c_str(),
        db.package.empty() ? "(none)" : db.package.c_str(), db.tiles.size(), db.pins.size());
    BuildTree(model);
    PrintTree(model);
    if (options.search) {
        Search(model, options, wanted);
    }
    return Draw(model, db, options);
}

} // namespace

const Command& FloorplanCommand() {
    static const Command command{
        {kCommand,
         "",
         "draw a device's tiles and package pins, search the pins, select and highlight",
         {
             {"--chipdb", "FILE", "chip database (default: chipdb-8k.txt of fpga-icestorm-chipdb)"},
             {"--package", "NAME", "package whose pins to read (default: ct256, else the first)"},
             {"--find", "NAME=VALUE", "search the banks and pins for a property value"},
             {"--flags", "LIST", "compare flags of the search, comma separated"},
             {"--svg", "OUT", "where to write the picture (default: floorplan.svg)"},
             {"--highlight-only", "", "draw only the pins the search highlighted"},
         },
         0,
         0,
         "Searchable properties: pins have Name, Bank, Tile, X, Y, Block; banks have Name,\n"
         "Bank, Edge, Pins. Compare flags: exact, ignore-case, substring, within-5-percent,\n"
         "less, greater, any, regexp (combinable, e.g. --flags regexp,ignore-case).\n"
         "A matched bank selects the pins below it in the tree.\n"
         "Without --chipdb, chipdb-8k.txt is taken from /usr/share/fpga-icestorm/chipdb (or\n"
         "the folder in VENLOMER_CHIPDB_DIR), else the bundled demo device.\n"
         "Example: venlomer floorplan --find Bank=0 --svg bank0.svg\n"},
        Run};
    return command;
}

} // namespace VnTool
