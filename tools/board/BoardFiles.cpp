//===-- tools/board/BoardFiles.cpp - the parts and nets of a board's KiCad files ---===//
#include "BoardFiles.h"

#include "SExpr.h"
#include "Xml.h"

#include "Port/SafeFile.h"

#include <map>

namespace VnTool {

namespace {

// Parts in the order first met, looked up by reference.
class PartList {
public:
    BoardPart& Get(const std::string& ref) {
        auto [it, added] = m_index.emplace(ref, m_parts.size());
        if (added) {
            m_parts.emplace_back();
            m_parts.back().ref = ref;
        }
        return m_parts[it->second];
    }
    std::vector<BoardPart> Take() { return std::move(m_parts); }

private:
    std::vector<BoardPart> m_parts;
    std::map<std::string, std::size_t> m_index;
};

std::string ValueOf(const SExpr& list, std::string_view head) {
    const SExpr* found = list.Find(head);
    return found != nullptr ? found->AtomAt(1) : std::string();
}

std::string Where(std::string_view source, std::size_t line) {
    return std::string(source) + ":" + std::to_string(line) + ": ";
}

// (export (version D|"E") (components (comp (ref U1) (value ..) (footprint ..)) ...)
//         (nets (net (code 1) (name /LED0) (node (ref U1) (pin 99)) ...) ...))
bool ReadNetlistSExpr(const SExpr& root, std::string_view source, Board& board,
                      std::string& error) {
    std::string version = ValueOf(root, "version");
    board.kind = "KiCad netlist (version " + (version.empty() ? "?" : version) + ")";
    const SExpr* nets = root.Find("nets");
    if (nets == nullptr) {
        error = Where(source, root.line) + "a KiCad netlist without a (nets ...) section";
        return false;
    }
    PartList parts;
    if (const SExpr* components = root.Find("components")) {
        for (const SExpr& comp : components->children) {
            if (comp.Head() == "comp" && !ValueOf(comp, "ref").empty()) {
                BoardPart& part = parts.Get(ValueOf(comp, "ref"));
                part.value = ValueOf(comp, "value");
                part.footprint = ValueOf(comp, "footprint");
            }
        }
    }
    for (const SExpr& net : nets->children) {
        if (net.Head() != "net") {
            continue;
        }
        std::string name = ValueOf(net, "name");
        for (const SExpr& node : net.children) {
            std::string ref = ValueOf(node, "ref");
            std::string pin = ValueOf(node, "pin");
            if (node.Head() != "node" || ref.empty() || pin.empty()) {
                continue;
            }
            parts.Get(ref).pins.emplace_back(pin, name);
        }
    }
    board.parts = parts.Take();
    return true;
}

std::string ChildText(const XmlElement& element, std::string_view name) {
    const XmlElement* child = element.Child(name);
    return child != nullptr ? child->text : std::string();
}

bool ReadNetlistXml(std::string_view text, std::string_view source, Board& board,
                    std::string& error) {
    XmlElement root;
    if (!ParseXml(text, source, root, error)) {
        return false;
    }
    const XmlElement* nets = root.Child("nets");
    if (root.name != "export" || nets == nullptr) {
        error = Where(source, root.line) + "not a KiCad XML netlist (no <export> with <nets>)";
        return false;
    }
    std::string version = root.Attribute("version");
    board.kind = "KiCad XML netlist (version " + (version.empty() ? "?" : version) + ")";
    PartList parts;
    if (const XmlElement* components = root.Child("components")) {
        for (const XmlElement& comp : components->children) {
            if (comp.name == "comp" && !comp.Attribute("ref").empty()) {
                BoardPart& part = parts.Get(comp.Attribute("ref"));
                part.value = ChildText(comp, "value");
                part.footprint = ChildText(comp, "footprint");
            }
        }
    }
    for (const XmlElement& net : nets->children) {
        for (const XmlElement& node : net.children) {
            if (net.name == "net" && node.name == "node" && !node.Attribute("ref").empty() &&
                !node.Attribute("pin").empty()) {
                parts.Get(node.Attribute("ref"))
                    .pins.emplace_back(node.Attribute("pin"), net.Attribute("name"));
            }
        }
    }
    board.parts = parts.Take();
    return true;
}

// The reference and value of a footprint: (fp_text reference U1 ...) up to KiCad 7,
// (property "Reference" "U1" ...) since KiCad 8.
void ReadFootprintTexts(const SExpr& footprint, BoardPart& part) {
    for (const SExpr& child : footprint.children) {
        const std::string& head = child.Head();
        std::string kind = child.AtomAt(1);
        bool reference = (head == "fp_text" && kind == "reference") ||
                         (head == "property" && kind == "Reference");
        bool value =
            (head == "fp_text" && kind == "value") || (head == "property" && kind == "Value");
        if (reference) {
            part.ref = child.AtomAt(2);
        } else if (value) {
            part.value = child.AtomAt(2);
        }
    }
}

// (kicad_pcb (version N) ... (net 1 "/LED0") ...
//   (module|footprint NAME ... (pad 1 smd rect ... (net 1 "/LED0")) ...))
bool ReadLayout(const SExpr& root, Board& board) {
    std::string version = ValueOf(root, "version");
    board.kind = "KiCad board file (version " + (version.empty() ? "?" : version) + ")";
    board.layout = true;
    std::map<std::string, std::string> netNames;
    for (const SExpr& child : root.children) {
        if (child.Head() == "net" && child.children.size() >= 3) {
            netNames[child.AtomAt(1)] = child.AtomAt(2);
        }
    }
    for (const SExpr& footprint : root.children) {
        if (footprint.Head() != "module" && footprint.Head() != "footprint") {
            continue;
        }
        BoardPart part;
        part.footprint = footprint.AtomAt(1);
        ReadFootprintTexts(footprint, part);
        for (const SExpr& pad : footprint.children) {
            if (pad.Head() != "pad" || pad.AtomAt(1).empty()) {
                continue; // unnumbered pads are mounting holes
            }
            std::string net;
            if (const SExpr* padNet = pad.Find("net")) {
                // (net NUMBER NAME); a lone word is the name when no net has it as number.
                net = padNet->children.size() >= 3 ? padNet->AtomAt(2) : padNet->AtomAt(1);
                if (auto named = netNames.find(padNet->AtomAt(1));
                    padNet->children.size() == 2 && named != netNames.end()) {
                    net = named->second;
                }
            }
            part.pins.emplace_back(pad.AtomAt(1), net);
        }
        if (!part.ref.empty()) {
            board.parts.push_back(std::move(part));
        }
    }
    return true;
}

} // namespace

const BoardPart* Board::Find(std::string_view ref) const {
    for (const BoardPart& part : parts) {
        if (part.ref == ref) {
            return &part;
        }
    }
    return nullptr;
}

bool ReadBoard(std::string_view text, std::string_view source, Board& board, std::string& error) {
    board = Board();
    board.source = std::string(source);
    // Some editors put a byte-order mark before XML.
    std::string_view body = text.substr(text.substr(0, 3) == "\xEF\xBB\xBF" ? 3 : 0);
    std::size_t first = body.find_first_not_of(" \t\r\n");
    if (first != std::string_view::npos && body[first] == '<') {
        return ReadNetlistXml(body, source, board, error);
    }
    SExpr root;
    if (!ParseSExpr(text, source, root, error)) {
        return false;
    }
    if (root.Head() == "export") {
        return ReadNetlistSExpr(root, source, board, error);
    }
    if (root.Head() == "kicad_pcb") {
        return ReadLayout(root, board);
    }
    error = Where(source, root.line) + "neither a KiCad netlist (export ...) nor a board file " +
            "(kicad_pcb ...) but (" + root.Head() + " ...)";
    return false;
}

bool ReadBoardFile(const std::string& path, Board& board, std::string& error) {
    std::string text;
    if (!Port::ReadRegularFile(path, text, error)) {
        return false;
    }
    return ReadBoard(text, path, board, error);
}

} // namespace VnTool
