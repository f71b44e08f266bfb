//===-- tools/design/PortHolders.h - design ports as the library's holders ---===//
//
// \file
// The editor searches, selects and lists ports with the same library classes it uses
// for pins, so each port bit becomes a property holder of its own type with one shared
// schema: Name, Direction, Bit, Clock, Pin, Bank. Pin and Bank follow the constraint
// file: empty and -1 while a port has no pin.
//
//   VnTool::PortHolders ports(design);
//   ports.ApplyPins(db, pcf);                 // Pin and Bank from the set_io lines
//   std::list<VnI::IPropertyHolder*> all = ports.List();
//
// Holders are not counted: this object owns them, and they die with it. A host that
// selected or highlighted one takes it out of its managers first.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "ChipDb.h"
#include "Pcf.h"
#include "YosysPorts.h"

#include "VnI/IPropertyHolder.h"
#include "s/PropertyHolder.h"
#include "s/PropertyNameList.h"

#include <list>
#include <memory>
#include <string>
#include <unordered_map>
#include <vector>

namespace VnTool {

/// The holder type of a design port; 7 is the device resources'.
inline constexpr int kPortHolderType = 8;

class PortHolder : public Vn::Eng::PropertyHolder {
public:
    explicit PortHolder(VnI::IPropertyNameList* names) : m_names(names) {}
    /// The Name property's text.
    Port::StringBase<char> GetName() override;
    /// The schema shared by every port, borrowed.
    VnI::IPropertyNameList* GetPropertyNames() override { return m_names; }
    /// kPortHolderType.
    int GetType() const override { return kPortHolderType; }

private:
    VnI::IPropertyNameList* m_names;
};

class PortHolders {
public:
    /// One holder per port bit of `design`, in design order, with Pin empty, Bank -1.
    explicit PortHolders(const Design& design);
    ~PortHolders();
    PortHolders(const PortHolders&) = delete;
    PortHolders& operator=(const PortHolders&) = delete;

    /// Sets Pin and Bank of every port from the first set_io line that names it; a pin
    /// the package lacks keeps its name with Bank -1.
    void ApplyPins(const ChipDb& db, const PcfFile& pcf);

    /// The holder of the port of that name, or null.
    PortHolder* Find(const std::string& name) const;
    /// Every holder in design order, as the library's iterators take them.
    std::list<VnI::IPropertyHolder*> List() const;
    /// The shared schema.
    VnI::IPropertyNameList* Names();
    std::size_t Size() const { return m_holders.size(); }

private:
    // The direction choices outlive every property that refers to them.
    std::vector<Port::StringBase<char>> m_directions;
    Vn::Eng::PropertyNameList m_names;
    std::vector<std::unique_ptr<PortHolder>> m_holders;
    // By name, so that a plan of many ports looks each up in constant time.
    std::unordered_map<std::string, PortHolder*> m_byName;
};

} // namespace VnTool
