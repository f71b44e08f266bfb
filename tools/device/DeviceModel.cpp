//===-- tools/device/DeviceModel.cpp - a device as the editor's holders and tree ---===//
#include "DeviceModel.h"
#include "PropertyText.h"

#include "VnI/PropertyType.h"
#include "s/ColorManager.h"
#include "s/ColorScheme.h"
#include "s/PropertyFactory.h"
#include "s/PropertyHolder.h"
#include "s/TreeDataModel.h"
#include "s/TreeNode.h"

#include <cstdio>
#include <initializer_list>

namespace VnTool {

namespace {

using Text = Port::StringBase<char>;
template <class T> using Ptr = CommonI::RefCountPtr<T>;

const char* const kBankEdges[kBankCount] = {"top", "right", "bottom", "left"};

Ptr<VnI::IProperty> Adopt(VnI::IProperty* property) {
    return Ptr<VnI::IProperty>::Adopt(property);
}

VnI::IPropertyNameList* ListOf(Vn::Eng::PropertyNameList& list) {
    return static_cast<VnI::IPropertyNameList*>(list.GetInterface(VnI::IPropertyNameList::kIID));
}

std::string TileName(TileKind kind, int x, int y) {
    std::string name = TileKindName(kind);
    for (char& c : name) {
        c = static_cast<char>(c - 'a' + 'A');
    }
    return name + "_" + std::to_string(x) + "_" + std::to_string(y);
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

void AddText(DeviceHolder* r, const char* name, const std::string& value) {
    r->AddProperty(name,
                   Adopt(Vn::Eng::PropertyFactory::CreateStringProperty(value.c_str(), true)));
}

void AddInt(DeviceHolder* r, const char* name, int value) {
    r->AddProperty(name, Adopt(Vn::Eng::PropertyFactory::CreateIntProperty(value, true)));
}

} // namespace

const char* BankEdgeName(int bank) {
    return bank >= 0 && bank < kBankCount ? kBankEdges[bank] : "";
}

// ---- holders ---------------------------------------------------------------------------

DeviceHolder::DeviceHolder(Kind kind, int index, VnI::IPropertyNameList* names,
                           std::string tileName, int x, int y, std::string siteType)
    : m_kind(kind), m_index(index), m_names(names), m_tileName(std::move(tileName)), m_x(x), m_y(y),
      m_siteType(std::move(siteType)) {}

Text DeviceHolder::GetName() {
    auto name = GetPropertyByName(Vn::Eng::PropertyHolder::GetNameTitle());
    return name ? name->GetStringProperty() : Text();
}

Text DeviceHolder::GetTileName() const {
    return Text(m_tileName.c_str());
}

std::int64_t DeviceHolder::GetLocation(int& x, int& y) const {
    x = m_x;
    y = m_y;
    return m_x >= 0 ? 1 : 0;
}

Text DeviceHolder::GetSiteType() const {
    return Text(m_siteType.c_str());
}

Ptr<VnI::IColorProperty> DeviceHolder::GetHighlightColor() {
    if (m_kind != Kind::Pin) {
        return nullptr;
    }
    return Vn::Eng::ColorManager::GetSelectedPathColor(0);
}

VnI::IDeviceResource* DeviceHolder::AsResource() {
    return static_cast<VnI::IDeviceResource*>(GetInterface(VnI::IDeviceResource::kIID));
}

int DeviceHolder::IntOf(const char* name, int fallback) {
    auto property = GetPropertyByName(name);
    return property && property->GetType() == VnI::INT_TYPE ? property->GetIntProperty() : fallback;
}

// ---- the model -------------------------------------------------------------------------

DeviceModel::DeviceModel(ChipDb db) : m_db(std::move(db)) {
    BuildResources();
    BuildTree();
}

DeviceModel::~DeviceModel() {
    m_highlight.RemoveAll();
    m_selection.RemoveAll();
    m_tree = nullptr;
    m_holders.clear();
}

std::unique_ptr<DeviceModel> DeviceModel::Open(const DeviceSource& source, std::string& error) {
    ChipDb db;
    if (!ReadChipDbFile(source.chipDb, source.package, db, error)) {
        return nullptr;
    }
    return std::make_unique<DeviceModel>(std::move(db));
}

DeviceHolder* DeviceModel::Make(DeviceHolder::Kind kind, int index,
                                Vn::Eng::PropertyNameList& names, std::string tileName, int x,
                                int y, std::string siteType) {
    auto holder = std::make_unique<DeviceHolder>(kind, index, ListOf(names), std::move(tileName), x,
                                                 y, std::move(siteType));
    DeviceHolder* raw = holder.get();
    m_holders.push_back(std::move(holder));
    return raw;
}

void DeviceModel::BuildResources() {
    DeclareNames();
    BuildDeviceAndBanks();
    BuildTiles();
    BuildPins();
}

void DeviceModel::DeclareNames() {
    m_tileTypes = {Text("logic"), Text("io"), Text("ramb"), Text("ramt")};
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
    declare(m_deviceNames,
            {{"Name", text}, {"Package", text}, {"Width", number}, {"Height", number}});
    declare(m_bankNames, {{"Name", text}, {"Bank", number}, {"Edge", text}, {"Pins", number}});
    declare(m_tileNames, {{"Name", text}});
    {
        auto prototype = Adopt(Vn::Eng::PropertyFactory::CreateEnumProperty(m_tileTypes, "", true));
        m_tileNames.AddEnumName("Type", VnI::ENUM_TYPE, prototype->GetPossibleValues(), true);
    }
    declare(m_tileNames, {{"X", number}, {"Y", number}});
    declare(m_pinNames, {{"Name", text},
                         {"Bank", number},
                         {"Tile", text},
                         {"X", number},
                         {"Y", number},
                         {"Block", number}});
}

void DeviceModel::BuildDeviceAndBanks() {
    using Kind = DeviceHolder::Kind;
    m_device = Make(Kind::Device, 0, m_deviceNames, "", -1, -1, "DEVICE");
    AddText(m_device, "Name", m_db.device);
    AddText(m_device, "Package", m_db.package);
    AddInt(m_device, "Width", m_db.width);
    AddInt(m_device, "Height", m_db.height);

    m_pinsPerBank.assign(kBankCount, 0);
    for (const Pin& pin : m_db.pins) {
        if (pin.bank >= 0 && pin.bank < kBankCount) {
            ++m_pinsPerBank[pin.bank];
        }
    }
    m_bankByNumber.assign(kBankCount, nullptr);
    for (int bank = 0; bank < kBankCount; ++bank) {
        if (m_pinsPerBank[bank] == 0) {
            continue;
        }
        DeviceHolder* r = Make(Kind::Bank, bank, m_bankNames, "", -1, -1, "IO_BANK");
        AddText(r, "Name", "Bank " + std::to_string(bank));
        AddInt(r, "Bank", bank);
        AddText(r, "Edge", kBankEdges[bank]);
        AddInt(r, "Pins", m_pinsPerBank[bank]);
        m_bankByNumber[bank] = r;
        m_banks.push_back(r);
    }
}

void DeviceModel::BuildTiles() {
    int index = 0;
    for (const Tile& tile : m_db.tiles) {
        std::string name = TileName(tile.kind, tile.x, tile.y);
        DeviceHolder* r = Make(DeviceHolder::Kind::Tile, index++, m_tileNames, name, tile.x, tile.y,
                               SiteTypeOf(tile, m_db));
        AddText(r, "Name", name);
        r->AddProperty("Type", Adopt(Vn::Eng::PropertyFactory::CreateEnumProperty(
                                   m_tileTypes, TileKindName(tile.kind), true)));
        AddInt(r, "X", tile.x);
        AddInt(r, "Y", tile.y);
        m_tiles.push_back(r);
    }
}

void DeviceModel::BuildPins() {
    int index = 0;
    for (const Pin& pin : m_db.pins) {
        std::string tile = TileName(TileKind::Io, pin.x, pin.y);
        DeviceHolder* r =
            Make(DeviceHolder::Kind::Pin, index, m_pinNames, tile, pin.x, pin.y, "IO");
        AddText(r, "Name", pin.name);
        AddInt(r, "Bank", pin.bank);
        AddText(r, "Tile", tile);
        AddInt(r, "X", pin.x);
        AddInt(r, "Y", pin.y);
        AddInt(r, "Block", pin.pio);
        m_pins.push_back(r);
        m_globalBuffer.push_back(VnTool::IsGlobalBufferPin(m_db, pin));
        m_pinByName.emplace(pin.name, index); // the first of a name wins, as the reader's
        ++index;
    }
}

// AddChild puts a child in front of its siblings, so children are added last to first.
void DeviceModel::BuildTree() {
    auto root = Vn::Eng::TreeNode::CreateInstance(m_device, nullptr);
    auto tilesGroup = Vn::Eng::TreeGroupNode::CreateInstance("Tiles", root);
    for (auto it = m_tiles.rbegin(); it != m_tiles.rend(); ++it) {
        tilesGroup->AddChild(Vn::Eng::TreeNode::CreateInstance(*it, tilesGroup));
    }
    root->AddChild(tilesGroup);
    std::vector<Ptr<VnI::ITreeNode>> bankNodes(kBankCount);
    for (int bank = kBankCount - 1; bank >= 0; --bank) {
        if (m_bankByNumber[bank] != nullptr) {
            bankNodes[bank] = Vn::Eng::TreeNode::CreateInstance(m_bankByNumber[bank], root);
        }
    }
    for (auto it = m_pins.rbegin(); it != m_pins.rend(); ++it) {
        int bank = m_db.pins[static_cast<std::size_t>((*it)->GetIndex())].bank;
        if (bank >= 0 && bank < kBankCount && bankNodes[bank]) {
            bankNodes[bank]->AddChild(Vn::Eng::TreeNode::CreateInstance(*it, bankNodes[bank]));
        }
    }
    for (int bank = kBankCount - 1; bank >= 0; --bank) {
        if (bankNodes[bank]) {
            root->AddChild(bankNodes[bank]);
        }
    }
    m_tree = Vn::Eng::TreeDataModel::CreateInstance(root);
}

DeviceHolder* DeviceModel::Bank(int bank) const {
    return bank >= 0 && bank < kBankCount ? m_bankByNumber[static_cast<std::size_t>(bank)]
                                          : nullptr;
}

DeviceHolder* DeviceModel::FindPin(std::string_view name) const {
    auto it = m_pinByName.find(std::string(name));
    return it == m_pinByName.end() ? nullptr : m_pins[static_cast<std::size_t>(it->second)];
}

std::vector<DeviceHolder*> DeviceModel::PinsOfBank(int bank) const {
    std::vector<DeviceHolder*> pins;
    for (DeviceHolder* pin : m_pins) {
        if (PinOf(pin).bank == bank) {
            pins.push_back(pin);
        }
    }
    return pins;
}

int DeviceModel::PinCount(int bank) const {
    return bank >= 0 && bank < kBankCount ? m_pinsPerBank[static_cast<std::size_t>(bank)] : 0;
}

const Pin& DeviceModel::PinOf(const DeviceHolder* pin) const {
    return m_db.pins[static_cast<std::size_t>(pin->GetIndex())];
}

bool DeviceModel::IsGlobalBufferPin(const DeviceHolder* pin) const {
    return pin != nullptr && pin->GetKind() == DeviceHolder::Kind::Pin &&
           m_globalBuffer[static_cast<std::size_t>(pin->GetIndex())];
}

VnI::IPropertyNameList* DeviceModel::DeviceNames() {
    return ListOf(m_deviceNames);
}
VnI::IPropertyNameList* DeviceModel::BankNames() {
    return ListOf(m_bankNames);
}
VnI::IPropertyNameList* DeviceModel::TileNames() {
    return ListOf(m_tileNames);
}
VnI::IPropertyNameList* DeviceModel::PinNames() {
    return ListOf(m_pinNames);
}

std::string DeviceModel::ColourSchemePath() {
    return Vn::Eng::ColorScheme::GetPath();
}

std::vector<std::string> DeviceModel::FilesNeverReplaced(std::vector<std::string> read) {
    read.push_back(ColourSchemePath());
    std::erase_if(read, [](const std::string& path) { return path.empty(); });
    return read;
}

// ---- colours ---------------------------------------------------------------------------

std::string DevicePalette::Of(const Ptr<VnI::IColorProperty>& colour, const char* fallback) {
    if (!colour || !colour->IsValid()) {
        m_usedFallback = true;
        return fallback;
    }
    return HexColour(colour);
}

std::string DevicePalette::TileColour(const DeviceHolder& tile) {
    return Of(Vn::Eng::ColorManager::GetTileSiteColor(tile.GetSiteType()), "#d0d0d0");
}

std::string DevicePalette::SiteColour(const char* siteType) {
    return Of(Vn::Eng::ColorManager::GetTileSiteColor(siteType), "#d0d0d0");
}

std::string DevicePalette::BankColour(int bank) {
    return Of(Vn::Eng::ColorManager::GetIOBankColor(bank, false), "#808080");
}

std::string DevicePalette::PinColour(DeviceHolder& pin) {
    VnI::IDeviceResource* resource = pin.AsResource();
    if (resource->IsHighlighted()) {
        return Of(resource->GetHighlightColor(), "#ff0000");
    }
    return BankColour(pin.IntOf("Bank"));
}

std::string DevicePalette::PathColour(int path) {
    return Of(Vn::Eng::ColorManager::GetSelectedPathColor(path), "#ff0000");
}

} // namespace VnTool
