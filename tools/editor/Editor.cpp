//===-- tools/editor/Editor.cpp - the pin-planning editor's engine --------===//
#include "Editor.h"

#include "CompareFlags.h"
#include "DeviceModel.h"
#include "PortHolders.h"

#include "CommonI/RefCountPtr.h"
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

// How many steps undo keeps; a plan is a few hundred assignments at most.
constexpr std::size_t kUndoDepth = 1000;

// A refusal: the request changes nothing and the page shows `what`.
struct Refusal {
    int status;
    std::string what;
};

std::string ColorHex(const Ptr<VnI::IColorProperty>& color) {
    if (!color || !color->IsValid()) {
        return "";
    }
    static const char digits[] = "0123456789abcdef";
    std::string hex = "#";
    for (std::uint8_t part : {color->GetRed(), color->GetGreen(), color->GetBlue()}) {
        hex += digits[part >> 4];
        hex += digits[part & 15];
    }
    return hex;
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
    PcfFile pcf;
    std::unique_ptr<PortHolders> ports;
    std::unordered_map<std::string, PortHolder*> portByName;
    Ptr<VnI::ITreeModel> designTree;
    mutable DevicePalette palette; // remembers whether it fell back; no plan state

    std::vector<PcfFile> undo;
    std::vector<PcfFile> redo;
    long revision = 0;
    std::string savedText;     // what the constraint file on disk holds
    std::string recoveredText; // what the recovery file holds
    bool ownsRecovery = false; // written or loaded by this session
    std::vector<PinProblem> problems;
    std::vector<std::string> matches; // ids of the last search

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

    // By text, so that undoing back to the saved plan counts as saved.
    bool Unsaved() const { return pcf.Text() != savedText; }

    void Recheck() {
        problems = CheckPins(db(), design, files.design, pcf, false);
        ports->ApplyPins(db(), pcf);
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
            throw Refusal{404, "the design has no port \"" + name + "\""};
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

    // What the edits change: the assignments, their checks, undo and save.
    json PlanJson() const {
        json state;
        state["revision"] = revision;
        state["saved"] = !Unsaved();
        state["canUndo"] = !undo.empty();
        state["canRedo"] = !redo.empty();
        state["files"] = {{"design", std::filesystem::path(files.design).filename().string()},
                          {"pcf", std::filesystem::path(files.pcf).filename().string()}};
        json portList = json::array();
        for (const DesignPort& port : design.ports) {
            PortHolder* holder = portByName.at(port.name);
            portList.push_back(
                {{"id", PortId(port.name)},
                 {"name", port.name},
                 {"bus", port.bus},
                 {"bit", port.bit},
                 {"direction", PortDirectionName(port.direction)},
                 {"clock", port.clock},
                 {"pin", holder->GetPropertyByName("Pin")->GetStringProperty().str()},
                 {"bank", holder->GetPropertyByName("Bank")->GetIntProperty()}});
        }
        state["ports"] = std::move(portList);
        json assignments = json::object();
        for (const PcfLine& line : pcf.Lines()) {
            if (line.kind == PcfLine::Kind::SetIo && !assignments.contains(line.pin)) {
                assignments[line.pin] = line.port;
            }
        }
        state["assignments"] = std::move(assignments);
        json problemList = json::array();
        std::set<std::string> problemPins;
        std::set<std::string> problemPorts;
        int errors = 0;
        for (const PinProblem& problem : problems) {
            bool error = problem.severity == PinProblem::Severity::Error;
            errors += error ? 1 : 0;
            problemList.push_back({{"severity", error ? "error" : "warning"},
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
        state["problems"] = std::move(problemList);
        state["errors"] = errors;
        state["problemPins"] = problemPins;
        state["problemPorts"] = problemPorts;
        return state;
    }

    // What a search and a click change: the selection and the highlight. The revision rides
    // along so that the page's undo step stays the plan's.
    json MarksJson() const {
        json state;
        state["revision"] = revision;
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
        state["matchColor"] = ColorHex(Vn::Eng::ColorManager::GetSelectedPathColor(0));
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

    // ---- changes ------------------------------------------------------------------------

    // Applies `change` to a copy; keeps it only when it adds no error.
    template <class Change> void Edit(Change change) {
        PcfFile next = pcf;
        change(next);
        auto nextProblems = CheckPins(db(), design, files.design, next, false);
        std::set<std::string> before;
        for (const PinProblem& p : problems) {
            if (p.severity == PinProblem::Severity::Error) {
                before.insert(p.message);
            }
        }
        std::string added;
        for (const PinProblem& p : nextProblems) {
            if (p.severity == PinProblem::Severity::Error && before.count(p.message) == 0) {
                added += (added.empty() ? "" : "; ") + p.message;
            }
        }
        if (!added.empty()) {
            throw Refusal{409, "refused: " + added};
        }
        undo.push_back(std::move(pcf));
        if (undo.size() > kUndoDepth) {
            undo.erase(undo.begin());
        }
        redo.clear();
        pcf = std::move(next);
        ++revision;
        Recheck();
    }

    void CheckStep(const json& request) const {
        auto it = request.find("step");
        if (it == request.end() || !it->is_number_integer()) {
            throw Refusal{400, "undo and redo need \"step\": the revision the page shows"};
        }
        if (it->get<long>() != revision) {
            throw Refusal{409, "stale step " + std::to_string(it->get<long>()) +
                                   ": the plan is at revision " + std::to_string(revision) +
                                   "; reload to see it"};
        }
    }

    void Travel(std::vector<PcfFile>& from, std::vector<PcfFile>& to, const char* what) {
        if (from.empty()) {
            throw Refusal{409, std::string("nothing to ") + what};
        }
        to.push_back(std::move(pcf));
        pcf = std::move(from.back());
        from.pop_back();
        ++revision;
        Recheck();
    }

    void Save() {
        std::string error;
        if (!Port::WriteFileSafely(
                files.pcf, pcf.Text(), error,
                {files.design, files.device.chipDb, DeviceModel::ColourSchemePath()})) {
            throw Refusal{500, error};
        }
        savedText = pcf.Text();
        std::error_code ec;
        std::filesystem::remove(RecoveryPathOf(files.pcf), ec);
        recoveredText = savedText;
        ownsRecovery = false;
    }

    static std::string RecoveryPathOf(const std::string& pcf) { return pcf + ".recovery"; }

    // ---- search and selection ----------------------------------------------------------

    // The value typed as the schema declares `property`, since a property only equals one
    // of its own type. Null when the schema lacks the name.
    static Ptr<VnI::IProperty> Wanted(VnI::IPropertyNameList* names, const std::string& property,
                                      const std::string& value) {
        int position = names->Contains(Text(property.c_str()));
        if (position < 0) {
            return nullptr;
        }
        VnI::IPropertyName* name = names->GetPropertyName(position);
        switch (name->GetType()) {
        case VnI::INT_TYPE: {
            int number = 0;
            auto [end, ec] = std::from_chars(value.data(), value.data() + value.size(), number);
            if (ec != std::errc() || end != value.data() + value.size()) {
                throw Refusal{400, property + " is a whole number; got \"" + value + "\""};
            }
            return Ptr<VnI::IProperty>::Adopt(
                Vn::Eng::PropertyFactory::CreateIntProperty(number, true));
        }
        case VnI::BOOL_TYPE: {
            bool yes = value == "yes" || value == "true" || value == "1";
            if (!yes && value != "no" && value != "false" && value != "0") {
                throw Refusal{400, property + " is yes or no; got \"" + value + "\""};
            }
            return Ptr<VnI::IProperty>::Adopt(
                Vn::Eng::PropertyFactory::CreateBoolProperty(yes, true));
        }
        // An enumerated holder property compares its text with a string's.
        default:
            return Ptr<VnI::IProperty>::Adopt(
                Vn::Eng::PropertyFactory::CreateStringProperty(value.c_str(), true));
        }
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
                    throw Refusal{400, "unknown compare flag " + flag.dump()};
                }
                flags |= *bit;
            }
        }
        std::vector<VnI::IPropertyHolder*> found;
        std::list<VnI::IPropertyHolder*> pinList(device->Pins().begin(), device->Pins().end());
        std::list<VnI::IPropertyHolder*> portList = ports->List();
        bool any = SearchOver(pinList, device->PinNames(), property, value, flags, found);
        any = SearchOver(portList, ports->Names(), property, value, flags, found) || any;
        if (!any) {
            throw Refusal{400, "pins and ports have no property \"" + property + "\""};
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
            throw Refusal{404, "nothing is called \"" + id + "\""};
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
            throw Refusal{400, "mode is replace, toggle or add; got \"" + mode + "\""};
        }
    }

    json Dispatch(const std::string& method, const std::string& path, const std::string& body) {
        bool post = method == "POST";
        if (!post && method != "GET") {
            throw Refusal{405, method + " is not served"};
        }
        json request = json::object();
        if (post) {
            request = json::parse(body, nullptr, false);
            if (request.is_discarded() || !request.is_object()) {
                throw Refusal{400, "the body is no JSON object"};
            }
        }
        auto want = [&](bool isPost) {
            if (post != isPost) {
                throw Refusal{405, path + " wants " + (isPost ? "POST" : "GET")};
            }
        };
        if (path == "/api/state") {
            want(false);
            return StateJson();
        }
        if (path == "/api/device") {
            want(false);
            return DeviceJson();
        }
        if (path == "/api/tree") {
            want(false);
            return TreeJson();
        }
        if (path == "/api/properties") {
            want(false);
            return PropertiesJson();
        }
        if (path == "/api/search") {
            want(true);
            Search(request);
            return MarksJson();
        }
        if (path == "/api/select") {
            want(true);
            Select(request);
            return MarksJson();
        }
        if (path == "/api/assign") {
            want(true);
            std::string port = StringField(request, "port");
            std::string pin = StringField(request, "pin");
            PortNamed(port);
            if (device->FindPin(pin) == nullptr) {
                throw Refusal{404, "package " + db().package + " has no pin \"" + pin + "\""};
            }
            Edit([&](PcfFile& next) { next.Assign(port, pin); });
            return PlanJson();
        }
        if (path == "/api/unassign") {
            want(true);
            std::string port = StringField(request, "port");
            PortNamed(port);
            Edit([&](PcfFile& next) {
                if (next.Unassign(port) == 0) {
                    throw Refusal{409, "port \"" + port + "\" has no pin"};
                }
            });
            return PlanJson();
        }
        if (path == "/api/auto") {
            want(true);
            Edit([&](PcfFile& next) {
                if (AutoAssign(db(), design, next).empty()) {
                    throw Refusal{409, "no port without a pin got one"};
                }
            });
            return PlanJson();
        }
        if (path == "/api/undo" || path == "/api/redo") {
            want(true);
            CheckStep(request);
            bool isUndo = path == "/api/undo";
            Travel(isUndo ? undo : redo, isUndo ? redo : undo, isUndo ? "undo" : "redo");
            return PlanJson();
        }
        if (path == "/api/save") {
            want(true);
            Save();
            return PlanJson();
        }
        throw Refusal{404, "no such API: " + path};
    }
};

Editor::Editor() : m_state(std::make_unique<State>()) {}

Editor::~Editor() = default;

bool Editor::Open(const EditorFiles& files, std::string& error) {
    std::lock_guard<std::mutex> hold(m_lock);
    State& s = *m_state;
    s.files = files;
    s.device = DeviceModel::Open(files.device, error);
    if (!s.device || !ReadYosysPortsFile(files.design, s.design, error) ||
        !s.pcf.ParseFile(files.pcf, error, true)) {
        return false;
    }
    s.dbp = &s.device->Db();
    s.ports = std::make_unique<PortHolders>(s.design);
    for (const DesignPort& port : s.design.ports) {
        s.portByName.emplace(port.name, s.ports->Find(port.name));
    }
    s.BuildDesignTree();
    s.Recheck();
    s.savedText = s.pcf.Text();
    s.recoveredText = s.savedText;
    return true;
}

std::string Editor::RecoveryPath() const {
    return State::RecoveryPathOf(m_state->files.pcf);
}

bool Editor::HasRecovery() const {
    std::error_code ec;
    return std::filesystem::exists(RecoveryPath(), ec);
}

bool Editor::LoadRecovery(std::string& error) {
    std::lock_guard<std::mutex> hold(m_lock);
    State& s = *m_state;
    PcfFile recovered;
    if (!recovered.ParseFile(RecoveryPath(), error)) {
        return false;
    }
    // Lines keep the constraint file's name in messages: that is where they will go.
    PcfFile renamed;
    if (!renamed.Parse(recovered.Text(), s.files.pcf, error)) {
        return false;
    }
    s.undo.push_back(std::move(s.pcf));
    s.redo.clear();
    s.pcf = std::move(renamed);
    ++s.revision;
    s.recoveredText = s.pcf.Text();
    s.ownsRecovery = true;
    s.Recheck();
    return true;
}

bool Editor::WriteRecovery(std::string& error) {
    std::lock_guard<std::mutex> hold(m_lock);
    State& s = *m_state;
    std::string text = s.pcf.Text();
    if (text == s.savedText && s.ownsRecovery) {
        // Undone back to the saved plan: nothing is left to recover.
        std::error_code ec;
        std::filesystem::remove(RecoveryPath(), ec);
        s.ownsRecovery = false;
        s.recoveredText = text;
        return true;
    }
    if (text == s.savedText || text == s.recoveredText) {
        return true;
    }
    if (!Port::WriteFileSafely(RecoveryPath(), text, error,
                               {s.files.design, s.files.device.chipDb, s.files.pcf})) {
        return false;
    }
    s.recoveredText = std::move(text);
    s.ownsRecovery = true;
    return true;
}

bool Editor::Unsaved() const {
    std::lock_guard<std::mutex> hold(m_lock);
    return m_state->Unsaved();
}

EditorReply Editor::Handle(const std::string& method, const std::string& path,
                           const std::string& body) {
    std::lock_guard<std::mutex> hold(m_lock);
    EditorReply reply;
    try {
        reply.body = m_state->Dispatch(method, path, body)
                         .dump(-1, ' ', false, json::error_handler_t::replace);
    } catch (const Refusal& refusal) {
        reply.status = refusal.status;
        reply.body =
            json{{"error", refusal.what}}.dump(-1, ' ', false, json::error_handler_t::replace);
    } catch (const std::exception& e) {
        reply.status = 500;
        reply.body = json{{"error", e.what()}}.dump(-1, ' ', false, json::error_handler_t::replace);
    }
    return reply;
}

} // namespace VnTool
