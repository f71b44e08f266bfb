//===-- tools/design/PortHolders.cpp - design ports as the library's holders ---===//
#include "PortHolders.h"

#include "CommonI/RefCountPtr.h"
#include "VnI/PropertyType.h"
#include "s/PropertyFactory.h"

#include <unordered_map>

namespace VnTool {

namespace {

using Text = Port::StringBase<char>;

CommonI::RefCountPtr<VnI::IProperty> Adopt(VnI::IProperty* property) {
    return CommonI::RefCountPtr<VnI::IProperty>::Adopt(property);
}

} // namespace

Text PortHolder::GetName() {
    auto name = GetPropertyByName(GetNameTitle());
    return name ? name->GetStringProperty() : Text();
}

PortHolders::PortHolders(const Design& design) {
    m_directions = {Text(PortDirectionName(PortDirection::Input)),
                    Text(PortDirectionName(PortDirection::Output)),
                    Text(PortDirectionName(PortDirection::Inout))};
    m_names.AddName("Name", VnI::STRING_TYPE, true);
    {
        auto prototype =
            Adopt(Vn::Eng::PropertyFactory::CreateEnumProperty(m_directions, "", true));
        m_names.AddEnumName("Direction", VnI::ENUM_TYPE, prototype->GetPossibleValues(), true);
    }
    m_names.AddName("Bit", VnI::INT_TYPE, true);
    m_names.AddName("Clock", VnI::BOOL_TYPE, true);
    m_names.AddName("Pin", VnI::STRING_TYPE, true);
    m_names.AddName("Bank", VnI::INT_TYPE, true);

    for (const DesignPort& port : design.ports) {
        auto holder = std::make_unique<PortHolder>(Names());
        holder->AddProperty(
            "Name", Adopt(Vn::Eng::PropertyFactory::CreateStringProperty(port.name.c_str(), true)));
        holder->AddProperty("Direction",
                            Adopt(Vn::Eng::PropertyFactory::CreateEnumProperty(
                                m_directions, PortDirectionName(port.direction), true)));
        holder->AddProperty("Bit",
                            Adopt(Vn::Eng::PropertyFactory::CreateIntProperty(port.bit, true)));
        holder->AddProperty("Clock",
                            Adopt(Vn::Eng::PropertyFactory::CreateBoolProperty(port.clock, true)));
        holder->AddProperty("Pin", Adopt(Vn::Eng::PropertyFactory::CreateStringProperty("", true)));
        holder->AddProperty("Bank", Adopt(Vn::Eng::PropertyFactory::CreateIntProperty(-1, true)));
        // A netlist names each bit once; should it not, the first keeps the name, as a
        // walk in design order would find it.
        m_byName.emplace(port.name, holder.get());
        m_holders.push_back(std::move(holder));
    }
}

PortHolders::~PortHolders() {
    // The holders refer to the schema; they go first.
    m_holders.clear();
}

VnI::IPropertyNameList* PortHolders::Names() {
    return static_cast<VnI::IPropertyNameList*>(m_names.GetInterface(VnI::IPropertyNameList::kIID));
}

void PortHolders::ApplyPins(const ChipDb& db, const PcfFile& pcf) {
    std::unordered_map<std::string, int> bankOfPin;
    for (const Pin& pin : db.pins) {
        bankOfPin.emplace(pin.name, pin.bank);
    }
    std::unordered_map<std::string, const PcfLine*> lineOfPort;
    for (const PcfLine& line : pcf.Lines()) {
        if (line.kind == PcfLine::Kind::SetIo) {
            lineOfPort.emplace(line.port, &line);
        }
    }
    for (auto& holder : m_holders) {
        auto line = lineOfPort.find(holder->GetName().str());
        std::string pin = line != lineOfPort.end() ? line->second->pin : std::string();
        auto bank = bankOfPin.find(pin);
        holder->AddProperty(
            "Pin", Adopt(Vn::Eng::PropertyFactory::CreateStringProperty(pin.c_str(), true)));
        holder->AddProperty("Bank", Adopt(Vn::Eng::PropertyFactory::CreateIntProperty(
                                        bank != bankOfPin.end() ? bank->second : -1, true)));
    }
}

PortHolder* PortHolders::Find(const std::string& name) const {
    auto found = m_byName.find(name);
    return found == m_byName.end() ? nullptr : found->second;
}

std::list<VnI::IPropertyHolder*> PortHolders::List() const {
    std::list<VnI::IPropertyHolder*> list;
    for (const auto& holder : m_holders) {
        list.push_back(holder.get());
    }
    return list;
}

} // namespace VnTool
