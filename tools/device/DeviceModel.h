//===-- tools/device/DeviceModel.h - a device as the editor's holders and tree ---===//
//
// \file
// One home for the device every subcommand (and the editor) works on: the chip
// database's device, its IO banks, tiles and package pins as device resources of the
// library (holder type VnI::DEVICE_RESOURCE_HOLDER_TYPE), their properties made by the
// library's PropertyFactory with one shared PropertyNameList per kind, and a
// TreeDataModel of device > banks > pins, plus a group of tiles. The model also holds
// the selection and highlight managers views use on it.
//
//   VnTool::DeviceSource source;   // from ResolveDevice (DeviceOptions.h)
//   std::string error;
//   auto model = VnTool::DeviceModel::Open(source, error);
//   if (!model) { report(error); }                        // "chipdb-8k.txt:12: ..."
//   VnTool::DeviceHolder* pin = model->FindPin("C8");
//   model->Selection().AddSelectedItem(model->Bank(0), true);
//
// Ownership: the model owns every holder, name list, the tree and both managers. Holder
// pointers, name-list pointers and the tree stay valid for the model's whole life and
// die with it; nothing the model hands out is reference counted by the caller. On
// destruction the managers let go of their plain pointers first, then the tree is taken
// apart, then the holders go. A caller that put a model holder in a manager of its own
// must take it out before the model dies. Not thread-safe: the library's colour manager
// changes state on look-up, so one thread at a time uses a model and its palette.
//
// Properties, in the order they list:
//   device  Name, Package, Width, Height
//   bank    Name ("Bank 0"), Bank, Edge (top/right/bottom/left), Pins
//   tile    Name ("LOGIC_3_4"), Type (enum logic/io/ramb/ramt), X, Y
//   pin     Name, Bank, Tile, X, Y, Block
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "ChipDb.h"
#include "DeviceOptions.h"

#include "CommonI/RefCountPtr.h"
#include "VnI/IDeviceResource.h"
#include "VnI/IProperty.h"
#include "VnI/IPropertyHolder.h"
#include "VnI/ITreeNode.h"
#include "s/DeviceResource.h"
#include "s/HighlightManager.h"
#include "s/PropertyNameList.h"
#include "s/SelectionManager.h"

#include <memory>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

namespace VnTool {

/// Banks of this family: top 0, right 1, bottom 2, left 3.
inline constexpr int kBankCount = 4;

/// The edge a bank lies on ("top", "right", "bottom", "left"); "" out of range.
const char* BankEdgeName(int bank);

/// A device resource of the model: the device itself, a bank, a tile or a package pin.
class DeviceHolder : public Vn::Eng::DeviceResource {
public:
    enum class Kind { Device, Bank, Tile, Pin };

    DeviceHolder(Kind kind, int index, VnI::IPropertyNameList* names, std::string tileName, int x,
                 int y, std::string siteType);

    /// What it is.
    Kind GetKind() const { return m_kind; }
    /// Its place in the chip database: the bank number, the index into ChipDb::tiles or
    /// ChipDb::pins; 0 for the device.
    int GetIndex() const { return m_index; }

    /// The Name property's text.
    Port::StringBase<char> GetName() override;
    /// The kind's shared list, borrowed from the model.
    VnI::IPropertyNameList* GetPropertyNames() override { return m_names; }
    /// The IO tile of a pin, the tile itself for a tile ("LOGIC_3_4"); "" otherwise.
    Port::StringBase<char> GetTileName() const override;
    /// Tiles and pins have a grid place (returns 1); the device and banks do not (0).
    std::int64_t GetLocation(int& x, int& y) const override;
    /// The colour scheme's tile type for a tile (SLICE, TB_IO, LR_IO, BRAM); "IO" for a
    /// pin, "IO_BANK" for a bank, "DEVICE" for the device.
    Port::StringBase<char> GetSiteType() const override;
    /// A pin answers the first selected-path colour, as the editor's pin view shows it;
    /// the others null.
    CommonI::RefCountPtr<VnI::IColorProperty> GetHighlightColor() override;

    /// The interface object, which the highlight manager and views take.
    VnI::IDeviceResource* AsResource();
    /// An int property's value; `fallback` when it has none.
    int IntOf(const char* name, int fallback = -1);

private:
    Kind m_kind;
    int m_index;
    VnI::IPropertyNameList* m_names;
    std::string m_tileName;
    int m_x;
    int m_y;
    std::string m_siteType;
};

class DeviceModel {
public:
    /// Builds the holders and the tree of `db`.
    explicit DeviceModel(ChipDb db);
    ~DeviceModel();
    DeviceModel(const DeviceModel&) = delete;
    DeviceModel& operator=(const DeviceModel&) = delete;

    /// Reads source's chip database and builds its model; null with a one-line reason
    /// ("file:line: why") in `error` when the file cannot be read.
    static std::unique_ptr<DeviceModel> Open(const DeviceSource& source, std::string& error);

    /// What the model was built from.
    const ChipDb& Db() const { return m_db; }

    DeviceHolder* Device() const { return m_device; }
    /// The bank of that number, or null when the package bonds no pin in it.
    DeviceHolder* Bank(int bank) const;
    /// The banks that have pins, by number.
    const std::vector<DeviceHolder*>& Banks() const { return m_banks; }
    /// Tiles in chip-database order.
    const std::vector<DeviceHolder*>& Tiles() const { return m_tiles; }
    /// Package pins in chip-database order (Pins()[i] is Db().pins[i]).
    const std::vector<DeviceHolder*>& Pins() const { return m_pins; }
    /// The pin of that package-pin name, or null.
    DeviceHolder* FindPin(std::string_view name) const;
    /// The pins of a bank in chip-database order; empty for a bank without pins.
    std::vector<DeviceHolder*> PinsOfBank(int bank) const;
    /// How many pins a bank has.
    int PinCount(int bank) const;
    /// The chip database's record of a pin holder.
    const Pin& PinOf(const DeviceHolder* pin) const;
    /// Whether a pin drives a global network (a clock belongs there).
    bool IsGlobalBufferPin(const DeviceHolder* pin) const;

    /// The shared property-name lists of each kind.
    VnI::IPropertyNameList* DeviceNames();
    VnI::IPropertyNameList* BankNames();
    VnI::IPropertyNameList* TileNames();
    VnI::IPropertyNameList* PinNames();

    /// Device at the root; a node per bank with its pins; then a "Tiles" group node
    /// (a group node has no holder).
    VnI::ITreeModel* Tree() const { return m_tree.Get(); }

    Vn::Eng::SelectionManager& Selection() { return m_selection; }
    Vn::Eng::HighlightManager& Highlight() { return m_highlight; }

    /// The colour-scheme file the library read; a command must never write over it.
    static std::string ColourSchemePath();
    /// The files a write must never replace: every file the run reads (`read`: the chip
    /// database, the netlist, the constraint file when something else is written) and the
    /// colour scheme; empty names are dropped. The one list every writer passes to the
    /// safe writer.
    static std::vector<std::string> FilesNeverReplaced(std::vector<std::string> read);

private:
    void BuildResources();
    void DeclareNames();
    void BuildDeviceAndBanks();
    void BuildTiles();
    void BuildPins();
    void BuildTree();
    DeviceHolder* Make(DeviceHolder::Kind kind, int index, Vn::Eng::PropertyNameList& names,
                       std::string tileName, int x, int y, std::string siteType);

    ChipDb m_db;
    // The enumerated property's choices: declared before every property and name that
    // refers to them, so that they outlive them.
    std::vector<Port::StringBase<char>> m_tileTypes;
    Vn::Eng::PropertyNameList m_deviceNames, m_bankNames, m_tileNames, m_pinNames;
    std::vector<std::unique_ptr<DeviceHolder>> m_holders;
    DeviceHolder* m_device = nullptr;
    std::vector<DeviceHolder*> m_bankByNumber; // null where the package has none
    std::vector<DeviceHolder*> m_banks;
    std::vector<DeviceHolder*> m_tiles;
    std::vector<DeviceHolder*> m_pins;
    std::vector<int> m_pinsPerBank;
    std::vector<bool> m_globalBuffer; // by pin index
    std::unordered_map<std::string, int> m_pinByName;
    CommonI::RefCountPtr<VnI::ITreeModel> m_tree;
    Vn::Eng::SelectionManager m_selection;
    Vn::Eng::HighlightManager m_highlight;
};

/// Colours from the library's colour manager as "#rrggbb", with a grey in their place
/// where the scheme has none for a role; remembers whether it had to.
class DevicePalette {
public:
    /// A tile's fill by its site type.
    std::string TileColour(const DeviceHolder& tile);
    /// A site type's fill ("SLICE", ...), for legends.
    std::string SiteColour(const char* siteType);
    /// A bank's pin colour.
    std::string BankColour(int bank);
    /// A pin: its highlight colour when highlighted, else its bank's colour.
    std::string PinColour(DeviceHolder& pin);
    /// The colour of selected path `path`.
    std::string PathColour(int path);
    /// Any colour of the library, or `fallback` when it is null or invalid.
    std::string Of(const CommonI::RefCountPtr<VnI::IColorProperty>& colour, const char* fallback);
    /// Whether some role had no colour in the scheme.
    bool UsedFallback() const { return m_usedFallback; }

private:
    bool m_usedFallback = false;
};

} // namespace VnTool
