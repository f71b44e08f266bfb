//===-- tools/editor/Editor.cpp - the pin-planning editor's engine --------===//
#include "Editor.h"

#include "PlanSession.h"

#include "CompareFlags.h"
#include "DeviceModel.h"
#include "PinCsv.h"
#include "PortHolders.h"
#include "PropertyText.h"

#include "CommonI/RefCountPtr.h"
#include "Port/Regexp.h"
#include "Port/SafeFile.h"
#include "VnI/ITreeNode.h"
#include "VnI/PropertyType.h"
#include "s/ColorManager.h"
#include "s/FindItr.h"
#include "s/HighlightManager.h"
#include "s/PropertyFactory.h"
#include "s/PropertyHolderItr.h"
#include "s/SelectionManager.h"
#include "s/TreeDataModel.h"
#include "s/TreeNode.h"

#include <nlohmann/json.hpp>

#include <charconv>
#include <filesystem>
#include <list>
#include <map>
#include <optional>
#include <set>
#include <unordered_map>
#include <vector>

namespace VnTool {

namespace {

using json = nlohmann::json;
using Text = Port::StringBase<char>;
template <class T> using Ptr = CommonI::RefCountPtr<T>;

using Refusal = PlanRefusal;

// Nesting deeper than this is no request of the page's; refused before parsing, so that
// neither the parser nor a refusal quoting the value recurses without bound.
constexpr int kMaxJsonDepth = 32;

// Text from a request quoted in a refusal is cut to this.
constexpr std::size_t kMaxQuoted = 200;

std::string Quoted(const std::string& text) {
    return text.size() <= kMaxQuoted ? text : text.substr(0, kMaxQuoted) + "...";
}

// The deepest nesting of `body`, counted without parsing (strings skipped), stopping as
// soon as it passes the limit.
bool TooDeep(const std::string& body) {
    int depth = 0;
    bool inString = false;
    for (std::size_t i = 0; i < body.size(); ++i) {
        const char c = body[i];
        if (inString) {
            i += c == '\\' ? 1 : 0;
            inString = c != '"';
        } else if (c == '"') {
            inString = true;
        } else if (c == '[' || c == '{') {
            if (++depth > kMaxJsonDepth) {
                return true;
            }
        } else if (c == ']' || c == '}') {
            --depth;
        }
    }
    return false;
}

json ValueOf(const Ptr<VnI::IProperty>& property) {
    switch (property->GetType()) {
    case VnI::INT_TYPE:
        return property->GetIntProperty();
    case VnI::DOUBLE_TYPE:
        return property->GetDoubleProperty();
    case VnI::BOOL_TYPE:
        return property->GetBoolProperty();
    default:
        return property->GetStringProperty().str();
    }
}

const char* TypeName(VnI::PropertyType type) {
    switch (type) {
    case VnI::INT_TYPE:
        return "int";
    case VnI::DOUBLE_TYPE:
        return "double";
    case VnI::BOOL_TYPE:
        return "bool";
    case VnI::ENUM_TYPE:
        return "enum";
    default:
        return "string";
    }
}

std::string StringField(const json& request, const char* name) {
    auto it = request.find(name);
    if (it == request.end() || !it->is_string()) {
        throw Refusal{400, std::string("the request needs \"") + name + "\" as a string"};
    }
    return it->get<std::string>();
}

std::string PortId(const std::string& name) {
    return "port:" + name;
}

} // namespace

struct Editor::State {
    EditorFiles files;
    std::unique_ptr<DeviceModel> device;
    const ChipDb* dbp = nullptr;
    Design design;
    PlanSession plan;
    std::unique_ptr<PortHolders> ports;
    std::unordered_map<std::string, PortHolder*> portByName;
    Ptr<VnI::ITreeModel> designTree;
    mutable DevicePalette palette;    // remembers whether it fell back; no plan state
    std::vector<std::string> matches; // ids of the last search
    std::string recoveryError;        // why the last change's recovery was not written

    ~State() {
        // The device model's managers may hold port holders, which die before the model.
        if (device) {
            device->Highlight().RemoveAll();
            device->Selection().RemoveAll();
        }
        designTree = nullptr;
    }

    const ChipDb& db() const { return *dbp; }
    Vn::Eng::SelectionManager& selection() const { return device->Selection(); }
    Vn::Eng::HighlightManager& highlight() const { return device->Highlight(); }

    // The holders' Pin and Bank follow the plan, so that a search finds ports by pin.
    void AfterChange() {
        ports->ApplyPins(db(), plan.Pcf());
        recoveryError.clear();
        if (!plan.WriteRecovery(recoveryError)) {
            recoveryError = "unsaved work is not in the recovery file: " + recoveryError;
        }
    }

    // Ports by name, in one pass over the holders (they are in design order).
    void IndexPorts() {
        ports = std::make_unique<PortHolders>(design);
        const std::list<VnI::IPropertyHolder*> holders = ports->List();
        auto holder = holders.begin();
        for (const DesignPort& port : design.ports) {
            portByName.emplace(port.name, static_cast<PortHolder*>(*holder++));
        }
    }

    // The design > bus > bit tree; a one-bit port sits directly under the design.
    void BuildDesignTree() {
        auto root = Vn::Eng::TreeGroupNode::CreateInstance(Text(design.top.c_str()), nullptr);
        // The design's children in netlist order: a one-bit port, or a bus's group with
        // its bits in their netlist order.
        std::vector<Ptr<VnI::ITreeNode>> children;
        std::map<std::string, std::pair<Ptr<VnI::ITreeNode>, std::vector<PortHolder*>>> buses;
        for (const DesignPort& port : design.ports) {
            PortHolder* holder = portByName.at(port.name);
            if (port.bit < 0 && port.width == 1) {
                children.push_back(Vn::Eng::TreeNode::CreateInstance(holder, root));
                continue;
            }
            auto& [node, bits] = buses[port.bus];
            if (!node) {
                node = Vn::Eng::TreeGroupNode::CreateInstance(Text(port.bus.c_str()), root);
                children.push_back(node);
            }
            bits.push_back(holder);
        }
        // AddChild puts a child in front of its siblings: add last to first.
        for (auto& [name, bus] : buses) {
            auto& [node, bits] = bus;
            for (auto it = bits.rbegin(); it != bits.rend(); ++it) {
                node->AddChild(Vn::Eng::TreeNode::CreateInstance(*it, node));
            }
        }
        for (auto it = children.rbegin(); it != children.rend(); ++it) {
            root->AddChild(*it);
        }
        designTree = Vn::Eng::TreeDataModel::CreateInstance(root);
    }

    // ---- ids ----------------------------------------------------------------------------

    // Ids name holders in the page: "port:led[0]", "pin:B5", "bank:0", "tile:IO_4_33",
    // "device".
    static std::string IdOf(VnI::IPropertyHolder* holder) {
        if (holder->GetType() == kPortHolderType) {
            return PortId(holder->GetName().str());
        }
        auto* resource = dynamic_cast<DeviceHolder*>(holder);
        if (resource == nullptr) {
            return "";
        }
        switch (resource->GetKind()) {
        case DeviceHolder::Kind::Pin:
            return "pin:" + resource->GetName().str();
        case DeviceHolder::Kind::Bank:
            return "bank:" + std::to_string(resource->GetIndex());
        case DeviceHolder::Kind::Tile:
            return "tile:" + resource->GetName().str();
        case DeviceHolder::Kind::Device:
            return "device";
        }
        return "";
    }

    VnI::IPropertyHolder* HolderOf(const std::string& id) const {
        if (id.rfind("port:", 0) == 0) {
            auto it = portByName.find(id.substr(5));
            return it == portByName.end() ? nullptr : it->second;
        }
        if (id.rfind("pin:", 0) == 0) {
            return device->FindPin(id.substr(4));
        }
        if (id.rfind("bank:", 0) == 0) {
            std::string number = id.substr(5);
            int bank = -1;
            auto [end, ec] = std::from_chars(number.data(), number.data() + number.size(), bank);
            bool whole = ec == std::errc() && end == number.data() + number.size();
            return whole && bank >= 0 && bank < kBankCount ? device->Bank(bank) : nullptr;
        }
        if (id.rfind("tile:", 0) == 0) {
            // A tree click away; a linear look among a thousand tiles costs nothing.
            for (DeviceHolder* tile : device->Tiles()) {
                if (tile->GetName().str() == id.substr(5)) {
                    return tile;
                }
            }
            return nullptr;
        }
        if (id == "device") {
            return device->Device();
        }
        return nullptr;
    }

    PortHolder* PortNamed(const std::string& name) const {
        auto it = portByName.find(name);
        if (it == portByName.end()) {
            throw Refusal{404, "the design has no port \"" + Quoted(name) + "\""};
        }
        return it->second;
    }

    // ---- answers ------------------------------------------------------------------------

    // An answer carries only the parts its request can change, and the page lays it over
    // what it holds: a search among 200 ports answers a kilobyte of marks, not the whole
    // plan with a message for every port. GET /api/state is both parts.
    json StateJson() const {
        json state = PlanJson();
        state.update(MarksJson());
        return state;
    }

    json PortsJson() const {
        const auto& pins = plan.PinOfPort();
        std::unordered_map<std::string, int> bankOfPin;
        for (const Pin& pin : db().pins) {
            bankOfPin.emplace(pin.name, pin.bank);
        }
        json list = json::array();
        for (const DesignPort& port : design.ports) {
            auto pin = pins.find(port.name);
            std::string name = pin == pins.end() ? "" : pin->second;
            auto bank = bankOfPin.find(name);
            list.push_back({{"id", PortId(port.name)},
                            {"name", port.name},
                            {"bus", port.bus},
                            {"bit", port.bit},
                            {"direction", PortDirectionName(port.direction)},
                            {"clock", port.clock},
                            {"pin", name},
                            {"bank", bank == bankOfPin.end() ? -1 : bank->second}});
        }
        return list;
    }

    json ProblemsJson(json& state) const {
        json list = json::array();
        std::set<std::string> problemPins;
        std::set<std::string> problemPorts;
        int errors = 0;
        for (const PinProblem& problem : plan.Problems()) {
            bool error = problem.severity == PinProblem::Severity::Error;
            errors += error ? 1 : 0;
            list.push_back({{"severity", error ? "error" : "warning"},
                            {"port", problem.port},
                            {"pin", problem.pin},
                            {"message", problem.message}});
            if (!problem.pin.empty()) {
                problemPins.insert(problem.pin);
            }
            if (!problem.port.empty()) {
                problemPorts.insert(problem.port);
            }
        }
        state["errors"] = errors;
        state["problemPins"] = problemPins;
        state["problemPorts"] = problemPorts;
        return list;
    }

    // What the edits change: the assignments, their checks, undo and save.
    json PlanJson() const {
        json state;
        state["revision"] = plan.Revision();
        state["saved"] = !plan.Unsaved();
        state["canUndo"] = plan.CanUndo();
        state["canRedo"] = plan.CanRedo();
        state["recoveryError"] = recoveryError;
        state["files"] = {{"design", std::filesystem::path(files.design).filename().string()},
                          {"pcf", std::filesystem::path(files.pcf).filename().string()}};
        state["ports"] = PortsJson();
        json assignments = json::object();
        for (const auto& [port, pin] : plan.PinOfPort()) {
            if (!assignments.contains(pin)) {
                assignments[pin] = port;
            }
        }
        state["assignments"] = std::move(assignments);
        state["problems"] = ProblemsJson(state);
        return state;
    }

    // What a search and a click change: the selection and the highlight. The revision rides
    // along so that the page's undo step stays the plan's.
    json MarksJson() const {
        json state;
        state["revision"] = plan.Revision();
        json selected = json::array();
        for (auto it = selection().GetAllSelectedItems(); !it->IsEnd(); it->Next()) {
            std::string id = IdOf(it->CurrentItem());
            if (!id.empty()) {
                selected.push_back(id);
            }
        }
        state["selected"] = std::move(selected);
        state["matches"] = matches;
        json lit = json::object();
        for (auto it = highlight().GetHighlightedItems(); !it->IsEnd(); it->Next()) {
            VnI::IDeviceResource* resource = it->CurrentItem();
            auto* holder = static_cast<VnI::IPropertyHolder*>(
                resource->GetInterface(VnI::IPropertyHolder::kIID));
            lit[holder->GetName().str()] = palette.Of(resource->GetHighlightColor(), "#ff0000");
        }
        state["highlighted"] = std::move(lit);
        // A match is shown in the first selected-path colour, as the pin view rings it.
        state["matchColor"] = HexColour(Vn::Eng::ColorManager::GetSelectedPathColor(0));
        return state;
    }

    // What never changes while the editor runs: the grid, the pins and their colours.
    json DeviceJson() {
        const ChipDb& chip = db();
        json tiles = json::array();
        for (DeviceHolder* tile : device->Tiles()) {
            int x = 0;
            int y = 0;
            tile->GetLocation(x, y);
            tiles.push_back({{"name", tile->GetName().str()},
                             {"x", x},
                             {"y", y},
                             {"type", tile->GetPropertyByName("Type")->GetStringProperty().str()},
                             {"site", tile->GetSiteType().str()},
                             {"color", palette.TileColour(*tile)}});
        }
        json pins = json::array();
        for (DeviceHolder* pin : device->Pins()) {
            const Pin& record = device->PinOf(pin);
            pins.push_back({{"id", IdOf(pin)},
                            {"name", record.name},
                            {"bank", record.bank},
                            {"x", record.x},
                            {"y", record.y},
                            {"block", record.pio},
                            {"gbuf", device->IsGlobalBufferPin(pin)},
                            {"color", palette.BankColour(record.bank)}});
        }
        json banks = json::array();
        for (DeviceHolder* bank : device->Banks()) {
            int number = bank->GetIndex();
            banks.push_back({{"id", IdOf(bank)},
                             {"bank", number},
                             {"edge", BankEdgeName(number)},
                             {"pins", device->PinCount(number)},
                             {"color", palette.BankColour(number)}});
        }
        json sites = json::object();
        for (const char* site : {"SLICE", "TB_IO", "LR_IO", "BRAM"}) {
            sites[site] = palette.SiteColour(site);
        }
        json paths = json::array();
        for (int path = 0; path < 4; ++path) {
            paths.push_back(palette.PathColour(path));
        }
        return {{"name", chip.device},
                {"package", chip.package},
                {"width", chip.width},
                {"height", chip.height},
                {"tiles", std::move(tiles)},
                {"pins", std::move(pins)},
                {"banks", std::move(banks)},
                {"sites", std::move(sites)},
                {"selectedPath", std::move(paths)}};
    }

    json TreeNodeJson(const Ptr<VnI::ITreeNode>& node) const {
        // The trees are a few levels deep (device > bank > pin, design > bus > bit), so
        // recursion here is bounded by the data's shape, not its size.
        json out;
        VnI::IPropertyHolder* holder = node->GetDataRef();
        if (holder != nullptr) {
            out["label"] = holder->GetName().str();
            out["id"] = IdOf(holder);
        } else if (auto* group = dynamic_cast<Vn::Eng::TreeGroupNode*>(
                       Vn::Eng::TreeNode::FromInterface(node.Get()))) {
            out["label"] = group->GetName().str();
        }
        json children = json::array();
        for (auto it = node->GetChildren(); !it->IsEnd(); it->Next()) {
            children.push_back(TreeNodeJson(it->CurrentItem()));
        }
        out["children"] = std::move(children);
        return out;
    }

    json TreeJson() const {
        json roots = json::array();
        roots.push_back(TreeNodeJson(device->Tree()->GetRootNode()));
        roots.push_back(TreeNodeJson(designTree->GetRootNode()));
        return {{"roots", roots}};
    }

    json PropertiesJson() {
        VnI::IPropertyHolder* last = nullptr;
        for (auto it = selection().GetAllSelectedItems(); !it->IsEnd(); it->Next()) {
            last = it->CurrentItem();
        }
        if (last == nullptr) {
            return {{"id", nullptr}, {"properties", json::array()}};
        }
        VnI::IPropertyNameList* names = last->GetPropertyNames();
        json list = json::array();
        for (auto it = last->GetProperties(); !it->IsEnd(); it->Next()) {
            auto property = it->CurrentItem();
            VnI::IPropertyName* name = names->GetPropertyName(property->GetIndex());
            list.push_back({{"name", name != nullptr ? name->GetName().str() : ""},
                            {"type", TypeName(property->GetType())},
                            {"value", ValueOf(property)}});
        }
        std::string id = IdOf(last);
        return {{"id", id}, {"kind", id.substr(0, id.find(':'))}, {"properties", std::move(list)}};
    }

    // ---- search and selection ----------------------------------------------------------

    // The value typed as the schema declares `property`, since a property only equals one
    // of its own type. Null when the schema lacks the name.
    static Ptr<VnI::IProperty> Wanted(VnI::IPropertyNameList* names, const std::string& property,
                                      const std::string& value) {
        int position = names->Contains(Text(property.c_str()));
        if (position < 0) {
            return nullptr;
        }
        std::string error;
        Ptr<VnI::IProperty> wanted =
            TypedValue(names->GetPropertyName(position)->GetType(), property, value, error);
        if (!wanted) {
            throw Refusal{400, Quoted(error)};
        }
        return wanted;
    }

    // Runs the library's search over one kind of holder; appends the matches.
    static bool SearchOver(std::list<VnI::IPropertyHolder*>& holders, VnI::IPropertyNameList* names,
                           const std::string& property, const std::string& value, int flags,
                           std::vector<VnI::IPropertyHolder*>& found) {
        Ptr<VnI::IProperty> wanted = Wanted(names, property, value);
        if (!wanted) {
            return false;
        }
        auto it = Vn::Eng::FindItr::CreateInstance(
            Vn::Eng::PropertyHolderItr::CreateInstance(&holders), Text(property.c_str()),
            Ptr<const VnI::IProperty>(wanted.Get()), flags);
        for (; !it->IsEnd(); it->Next()) {
            found.push_back(it->CurrentItem());
        }
        return true;
    }

    void Search(const json& request) {
        if (request.value("clear", false)) {
            highlight().RemoveAll();
            matches.clear();
            return;
        }
        std::string property = StringField(request, "property");
        std::string value = StringField(request, "value");
        int flags = 0;
        if (auto it = request.find("flags"); it != request.end()) {
            if (!it->is_array()) {
                throw Refusal{400, "\"flags\" is a list of compare flag names"};
            }
            for (const json& flag : *it) {
                const std::optional<int> bit =
                    flag.is_string() ? CompareFlagNamed(flag.get<std::string>()) : std::nullopt;
                if (!bit) {
                    throw Refusal{400, "unknown compare flag " + Quoted(flag.dump())};
                }
                flags |= *bit;
            }
        }
        if ((flags & VnI::MATCH_REGEXP) != 0 && !Port_Regexp(std::string_view(value)).IsValid()) {
            throw Refusal{400, "\"" + Quoted(value) + "\" is no valid regular expression"};
        }
        std::vector<VnI::IPropertyHolder*> found;
        std::list<VnI::IPropertyHolder*> pinList(device->Pins().begin(), device->Pins().end());
        std::list<VnI::IPropertyHolder*> portList = ports->List();
        bool any = SearchOver(pinList, device->PinNames(), property, value, flags, found);
        any = SearchOver(portList, ports->Names(), property, value, flags, found) || any;
        if (!any) {
            throw Refusal{400, "pins and ports have no property \"" + Quoted(property) + "\""};
        }
        highlight().RemoveAll();
        matches.clear();
        for (VnI::IPropertyHolder* holder : found) {
            matches.push_back(IdOf(holder));
            if (auto* pin = dynamic_cast<DeviceHolder*>(holder)) {
                highlight().AddHighlightedItem(pin->AsResource());
            }
        }
    }

    void Select(const json& request) {
        if (request.value("clear", false)) {
            selection().RemoveAll();
            return;
        }
        std::string id = StringField(request, "id");
        VnI::IPropertyHolder* holder = HolderOf(id);
        if (holder == nullptr) {
            throw Refusal{404, "nothing is called \"" + Quoted(id) + "\""};
        }
        std::string mode = request.value("mode", "replace");
        bool descend = request.value("descend", false);
        if (mode == "replace") {
            selection().RemoveAll();
            selection().AddSelectedItem(holder, descend);
        } else if (mode == "toggle") {
            if (holder->IsSelected()) {
                selection().RemoveSelectedItem(holder, descend);
            } else {
                selection().AddSelectedItem(holder, descend);
            }
        } else if (mode == "add") {
            selection().AddSelectedItem(holder, descend);
        } else {
            throw Refusal{400, "mode is replace, toggle or add; got \"" + Quoted(mode) + "\""};
        }
    }

    // ---- routes -------------------------------------------------------------------------

    json Assign(const json& request) {
        std::string port = StringField(request, "port");
        std::string pin = StringField(request, "pin");
        PortNamed(port);
        if (device->FindPin(pin) == nullptr) {
            throw Refusal{404, "package " + db().package + " has no pin \"" + Quoted(pin) + "\""};
        }
        plan.Edit([&](PcfFile& next) { next.Assign(port, pin); });
        return Changed();
    }

    json Unassign(const json& request) {
        std::string port = StringField(request, "port");
        PortNamed(port);
        plan.Edit([&](PcfFile& next) {
            if (next.Unassign(port) == 0) {
                throw Refusal{409, "port \"" + Quoted(port) + "\" has no pin"};
            }
        });
        return Changed();
    }

    json Auto(const json&) {
        plan.Edit([&](PcfFile& next) {
            if (AutoAssign(db(), design, next).empty()) {
                throw Refusal{409, "no port without a pin got one"};
            }
        });
        return Changed();
    }

    static long Step(const json& request) {
        auto it = request.find("step");
        if (it == request.end() || !it->is_number_integer()) {
            throw Refusal{400, "undo and redo need \"step\": the revision the page shows"};
        }
        return it->get<long>();
    }

    json Save(const json&) {
        plan.Save({files.design, files.device.chipDb, DeviceModel::ColourSchemePath()});
        recoveryError.clear();
        return PlanJson();
    }

    json TakeDisk(const json& request) {
        auto it = request.find("reapply");
        if (it == request.end() || !it->is_boolean()) {
            throw Refusal{400, "\"reapply\" is true (keep this editor's edits on top) or false"};
        }
        plan.TakeDisk(it->get<bool>());
        return Changed();
    }

    json Changed() {
        AfterChange();
        return PlanJson();
    }

    using Route = json (State::*)(const json&);
    static const std::map<std::string, std::pair<bool, Route>>& Routes() {
        // path -> (whether it is a POST, what serves it)
        static const std::map<std::string, std::pair<bool, Route>> routes{
            {"/api/ping", {false, &State::GetPing}},
            {"/api/flags", {false, &State::GetFlags}},
            {"/api/state", {false, &State::GetState}},
            {"/api/device", {false, &State::GetDevice}},
            {"/api/tree", {false, &State::GetTree}},
            {"/api/properties", {false, &State::GetProperties}},
            {"/api/search", {true, &State::PostSearch}},
            {"/api/select", {true, &State::PostSelect}},
            {"/api/assign", {true, &State::Assign}},
            {"/api/unassign", {true, &State::Unassign}},
            {"/api/auto", {true, &State::Auto}},
            {"/api/undo", {true, &State::Undo}},
            {"/api/redo", {true, &State::Redo}},
            {"/api/save", {true, &State::Save}},
            {"/api/take-disk", {true, &State::TakeDisk}},
        };
        return routes;
    }

    json GetPing(const json&) { return {{"revision", plan.Revision()}}; }
    // The compare-flag words the search takes, so the page offers exactly these.
    json GetFlags(const json&) {
        json words = json::array();
        for (const CompareFlagWord& flag : CompareFlagTable()) {
            words.push_back(flag.word);
        }
        return {{"flags", words}};
    }
    // The plan as the table `pins export --csv` writes, for the page's download.
    std::string PlanTable() const { return PlanCsv(db(), design, files.design, plan.Pcf()); }
    json GetState(const json&) { return StateJson(); }
    json GetDevice(const json&) { return DeviceJson(); }
    json GetTree(const json&) { return TreeJson(); }
    json GetProperties(const json&) { return PropertiesJson(); }
    json PostSearch(const json& request) {
        Search(request);
        return MarksJson();
    }
    json PostSelect(const json& request) {
        Select(request);
        return MarksJson();
    }
    json Undo(const json& request) {
        plan.Undo(Step(request));
        return Changed();
    }
    json Redo(const json& request) {
        plan.Redo(Step(request));
        return Changed();
    }

    json Dispatch(const std::string& method, const std::string& path, const std::string& body) {
        const bool post = method == "POST";
        if (!post && method != "GET") {
            throw Refusal{405, Quoted(method) + " is not served"};
        }
        auto route = Routes().find(path);
        if (route == Routes().end()) {
            throw Refusal{404, "no such API: " + Quoted(path)};
        }
        if (route->second.first != post) {
            throw Refusal{405, path + " wants " + (route->second.first ? "POST" : "GET")};
        }
        json request = json::object();
        if (post) {
            if (TooDeep(body)) {
                throw Refusal{400, "the body nests deeper than " + std::to_string(kMaxJsonDepth) +
                                       " levels"};
            }
            request = json::parse(body, nullptr, false);
            if (request.is_discarded() || !request.is_object()) {
                throw Refusal{400, "the body is no JSON object"};
            }
        }
        return (this->*route->second.second)(request);
    }
};

namespace {

// A name the page could not show or send back as it is: the holders keep names as C
// strings, and a control byte has no place in a constraint file.
bool ServableName(const std::string& name, std::string& why) {
    for (unsigned char c : name) {
        if (c < 0x20 || c == 0x7f) {
            why = "port \"" + Port::Printable(Quoted(name)) +
                  "\" holds a control byte; the editor cannot serve it";
            return false;
        }
    }
    return true;
}

std::string Dump(const json& value) {
    return value.dump(-1, ' ', false, json::error_handler_t::replace);
}

} // namespace

Editor::Editor() : m_state(std::make_unique<State>()) {}

Editor::~Editor() = default;

bool Editor::Open(const EditorFiles& files, std::string& error) {
    std::unique_ptr<DeviceModel> device = DeviceModel::Open(files.device, error);
    return device && Open(files, std::move(device), error);
}

bool Editor::Open(const EditorFiles& files, std::unique_ptr<DeviceModel> device,
                  std::string& error) {
    std::lock_guard<std::mutex> hold(m_lock);
    State& s = *m_state;
    s.files = files;
    s.device = std::move(device);
    if (!ReadYosysPortsFile(files.design, s.design, error)) {
        return false;
    }
    for (const DesignPort& port : s.design.ports) {
        if (!ServableName(port.name, error)) {
            error.insert(0, files.design + ": ");
            return false;
        }
    }
    s.dbp = &s.device->Db();
    if (!s.plan.Open(s.db(), s.design, files.design, files.pcf, error)) {
        return false;
    }
    s.IndexPorts();
    s.BuildDesignTree();
    s.ports->ApplyPins(s.db(), s.plan.Pcf());
    return true;
}

std::string Editor::RecoveryPath() const {
    return m_state->plan.RecoveryPath();
}

bool Editor::HasRecovery() const {
    std::error_code ec;
    return std::filesystem::exists(RecoveryPath(), ec);
}

bool Editor::LoadRecovery(std::string& error) {
    std::lock_guard<std::mutex> hold(m_lock);
    State& s = *m_state;
    if (!s.plan.LoadRecovery(error)) {
        return false;
    }
    s.ports->ApplyPins(s.db(), s.plan.Pcf());
    return true;
}

bool Editor::WriteRecovery(std::string& error) {
    std::lock_guard<std::mutex> hold(m_lock);
    return m_state->plan.WriteRecovery(error);
}

bool Editor::Unsaved() const {
    std::lock_guard<std::mutex> hold(m_lock);
    return m_state->plan.Unsaved();
}

std::size_t Editor::HistoryBytes() const {
    std::lock_guard<std::mutex> hold(m_lock);
    return m_state->plan.HistoryBytes();
}

EditorReply Editor::Handle(const std::string& method, const std::string& path,
                           const std::string& body) {
    std::lock_guard<std::mutex> hold(m_lock);
    EditorReply reply;
    try {
        if (method == "GET" && path == "/api/export.csv") {
            reply.body = m_state->PlanTable();
            reply.type = "text/csv; charset=utf-8";
            return reply;
        }
        reply.body = Dump(m_state->Dispatch(method, path, body));
    } catch (const Refusal& refusal) {
        reply.status = refusal.status;
        json answer{{"error", refusal.what}};
        if (refusal.changedOnDisk) {
            answer["changedOnDisk"] = true;
            answer["conflicts"] = refusal.conflicts;
        }
        reply.body = Dump(answer);
    } catch (const json::exception& e) {
        // A field of the wrong type: the request's fault, not the editor's.
        reply.status = 400;
        reply.body = Dump(json{{"error", std::string("a field has the wrong type: ") + e.what()}});
    } catch (const std::exception& e) {
        reply.status = 500;
        reply.body = Dump(json{{"error", e.what()}});
    }
    return reply;
}

} // namespace VnTool
