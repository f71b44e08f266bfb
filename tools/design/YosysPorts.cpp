//===-- tools/design/YosysPorts.cpp - the top-level ports of a yosys netlist ---===//
#include "YosysPorts.h"
#include "SourceLine.h"

#include "Port/SafeFile.h"

#include <nlohmann/json.hpp>

#include <climits>
#include <cstddef>
#include <cstdint>
#include <fstream>
#include <iterator>
#include <unordered_map>
#include <unordered_set>
#include <utility>

namespace VnTool {

namespace {

using Json = nlohmann::json;

// Buffered reading that counts the lines it has handed out, so that the SAX events can
// name the line they came from. nlohmann reads through an iterator pair; this is that
// iterator.
class CountingSource {
public:
    explicit CountingSource(std::istream& in) : m_in(in) {}

    bool AtEnd() {
        if (m_pos < m_end) {
            return false;
        }
        m_in.read(m_buffer, sizeof m_buffer);
        m_pos = 0;
        m_end = static_cast<std::size_t>(m_in.gcount());
        return m_end == 0;
    }
    const char& Current() { return m_buffer[m_pos]; }
    void Advance() {
        if (m_buffer[m_pos++] == '\n') {
            ++m_line;
        }
    }
    std::size_t Line() const { return m_line; }
    bool Bad() const { return m_in.bad(); }

private:
    std::istream& m_in;
    char m_buffer[1 << 16];
    std::size_t m_pos = 0;
    std::size_t m_end = 0;
    std::size_t m_line = 1;
};

class CountingIterator {
public:
    using iterator_category = std::input_iterator_tag;
    using value_type = char;
    using difference_type = std::ptrdiff_t;
    using pointer = const char*;
    using reference = const char&;

    CountingIterator() = default;
    explicit CountingIterator(CountingSource* source) : m_source(source) {}

    reference operator*() const { return m_source->Current(); }
    CountingIterator& operator++() {
        m_source->Advance();
        return *this;
    }
    CountingIterator operator++(int) {
        CountingIterator before = *this;
        ++*this;
        return before;
    }
    bool operator==(const CountingIterator& other) const { return AtEnd() == other.AtEnd(); }
    bool operator!=(const CountingIterator& other) const { return !(*this == other); }

private:
    bool AtEnd() const { return m_source == nullptr || m_source->AtEnd(); }
    CountingSource* m_source = nullptr;
};

// What a JSON container is in a yosys netlist; everything the ports do not need is
// Ignored, and so are all containers inside it.
enum class Role {
    Root,
    Modules,
    Module,
    Attributes,
    Ports,
    Port,
    PortBits,
    Cells,
    Cell,
    CellParameters,
    Connections,
    ClockBits,
    Ignored
};

struct Frame {
    Role role;
    std::string key; // the last key seen, in objects whose keys matter
};

struct RawPort {
    std::string name;
    std::string direction;
    std::vector<long long> bits; // -1 for a constant bit
    long long offset = 0;
    bool upto = false;
    bool sawBits = false;
    std::size_t line = 0;
};

struct Module {
    std::string name;
    bool top = false;
    bool blackbox = false;
    std::vector<RawPort> ports;
    std::unordered_set<long long> clockBits; // net bits that reach a clock input
    struct PadBit {
        PadUse use = PadUse::Plain;
        int index = -1;
        std::string cell;
    };
    std::unordered_map<long long, PadBit> padBits; // net bits wired to a pad by a cell
    int padPlls = 0;
    int twoOutputPlls = 0;
    bool ledDriver = false;
};

// The connection of a cell that is wired to a package pad, and what that asks of the pad.
struct PadConnection {
    const char* type;
    const char* connection;
    PadUse use;
};
constexpr PadConnection kPadConnections[] = {
    {"SB_IO", "PACKAGE_PIN", PadUse::Plain},
    {"SB_IO_OD", "PACKAGEPIN", PadUse::Plain},
    {"SB_GB_IO", "PACKAGE_PIN", PadUse::GlobalBuffer},
    {"SB_PLL40_PAD", "PACKAGEPIN", PadUse::PllInput},
    {"SB_PLL40_2_PAD", "PACKAGEPIN", PadUse::PllInput},
    {"SB_PLL40_2F_PAD", "PACKAGEPIN", PadUse::PllInput},
    {"SB_LVDS_INPUT", "PACKAGE_PIN", PadUse::Differential},
    {"SB_RGBA_DRV", "RGB0", PadUse::LedDriver},
    {"SB_RGBA_DRV", "RGB1", PadUse::LedDriver},
    {"SB_RGBA_DRV", "RGB2", PadUse::LedDriver},
    {"SB_RGB_DRV", "RGB0", PadUse::LedDriver},
    {"SB_RGB_DRV", "RGB1", PadUse::LedDriver},
    {"SB_RGB_DRV", "RGB2", PadUse::LedDriver},
};

bool IsPadConnectionName(const std::string& name) {
    return name == "PACKAGE_PIN" || name == "PACKAGEPIN" || name == "RGB0" || name == "RGB1" ||
           name == "RGB2";
}

// The connection of a cell that is its clock, by cell type; null for cells without one.
const char* ClockConnection(const std::string& type) {
    if (type.rfind("SB_DFF", 0) == 0) {
        return "C";
    }
    if (type.rfind("$_", 0) == 0 && type.find("DFF") != std::string::npos) {
        return "C"; // yosys gate-level flip-flops: $_DFF_P_, $_SDFFE_PP0P_, ...
    }
    if (type.rfind('$', 0) == 0 && type.find("dff") != std::string::npos) {
        return "CLK"; // yosys word-level flip-flops: $dff, $adff, $sdffe, ...
    }
    if (type == "SB_GB") {
        return "USER_SIGNAL_TO_GLOBAL_BUFFER";
    }
    if (type == "SB_GB_IO") {
        return "PACKAGE_PIN";
    }
    return nullptr;
}

bool IsClockConnectionName(const std::string& name) {
    return name == "C" || name == "CLK" || name == "USER_SIGNAL_TO_GLOBAL_BUFFER" ||
           name == "PACKAGE_PIN";
}

// A yosys attribute is a binary string ("00000000000000000000000000000001"); any 1 makes
// it true. Older writers put plain numbers.
bool AttributeIsTrue(const std::string& value) {
    return value.find('1') != std::string::npos;
}

class Handler : public nlohmann::json_sax<Json> {
public:
    Handler(std::string_view source, CountingSource& input) : m_source(source), m_input(input) {}

    bool null() override { return Scalar(); }
    bool boolean(bool) override { return Scalar(); }
    bool number_integer(number_integer_t value) override { return Number(value); }
    bool number_unsigned(number_unsigned_t value) override {
        // Beyond any net or index: kept as the largest value, which every later check
        // refuses, rather than as -1, which would read as a constant bit or offset -1.
        return Number(value > static_cast<number_unsigned_t>(INT64_MAX)
                          ? INT64_MAX
                          : static_cast<long long>(value));
    }
    bool number_float(number_float_t, const string_t&) override { return Scalar(); }
    bool binary(binary_t&) override { return Scalar(); }

    bool string(string_t& value) override {
        if (!ScalarFits()) {
            return false;
        }
        Frame& frame = m_frames.back();
        switch (frame.role) {
        case Role::Attributes:
            if (frame.key == "top") {
                m_modules.back().top = AttributeIsTrue(value);
            } else if (frame.key == "blackbox") {
                m_modules.back().blackbox = AttributeIsTrue(value);
            }
            return true;
        case Role::Port:
            if (frame.key == "direction") {
                m_modules.back().ports.back().direction = value;
            } else if (frame.key == "upto") {
                m_modules.back().ports.back().upto = AttributeIsTrue(value);
            }
            return true;
        case Role::PortBits:
            m_modules.back().ports.back().bits.push_back(-1);
            return true;
        case Role::Cell:
            if (frame.key == "type") {
                m_cellType = value;
            }
            return true;
        case Role::CellParameters:
            if (frame.key == "IO_STANDARD") {
                m_cellIoStandard = value;
            }
            return true;
        default:
            return Scalar();
        }
    }

    bool key(string_t& value) override {
        Frame& frame = m_frames.back();
        // Assigned, not moved: the frame's key keeps its capacity from cell to cell.
        if (frame.role != Role::Ignored) {
            frame.key.assign(value);
        }
        return true;
    }

    bool start_object(std::size_t) override { return Open(false); }
    bool start_array(std::size_t) override { return Open(true); }

    bool end_object() override {
        Role role = m_frames.back().role;
        if (role == Role::Port && !FinishPort()) {
            return false;
        }
        if (role == Role::Cell) {
            FinishCell();
        }
        if (role == Role::Root && !m_sawModules) {
            return Fail("not a yosys netlist: no \"modules\"");
        }
        m_frames.pop_back();
        return true;
    }
    bool end_array() override {
        m_frames.pop_back();
        return true;
    }

    bool parse_error(std::size_t, const std::string&,
                     const nlohmann::detail::exception& ex) override {
        // nlohmann's text: "[json.exception.parse_error.101] parse error at line 3,
        // column 5: syntax error while parsing ...": keep its line and its reason.
        std::string text = ex.what();
        std::size_t line = m_input.Line();
        auto at = text.find("at line ");
        if (at != std::string::npos) {
            line = std::stoul(text.substr(at + 8));
        }
        auto colon = text.find(": ", at == std::string::npos ? 0 : at);
        std::string why = colon == std::string::npos ? text : text.substr(colon + 2);
        m_error = AtLine(m_source, line, "malformed JSON: " + why);
        return false;
    }

    const std::string& Error() const { return m_error; }
    std::vector<Module>& Modules() { return m_modules; }

private:
    bool Fail(const std::string& why) {
        if (m_error.empty()) {
            m_error = AtLine(m_source, m_input.Line(), why);
        }
        return false;
    }

    // A plain value where the netlist wants a container.
    bool ScalarFits() {
        if (m_frames.empty()) {
            return Fail("not a yosys netlist: the document is no object");
        }
        const Frame& frame = m_frames.back();
        switch (frame.role) {
        case Role::Root:
            return frame.key != "modules" || Fail("not a yosys netlist: \"modules\" is no object");
        case Role::Modules:
            return Fail("not a yosys netlist: module \"" + frame.key + "\" is no object");
        case Role::Module:
            if (frame.key == "ports" || frame.key == "cells") {
                return Fail("not a yosys netlist: \"" + frame.key + "\" is no object");
            }
            return true;
        case Role::Ports:
            return Fail("not a yosys netlist: port \"" + frame.key + "\" is no object");
        case Role::Port:
            if (frame.key == "bits") {
                return Fail("not a yosys netlist: the bits of port \"" +
                            m_modules.back().ports.back().name + "\" are no array");
            }
            return true;
        default:
            return true;
        }
    }

    bool Scalar() {
        if (!ScalarFits()) {
            return false;
        }
        if (m_frames.back().role == Role::PortBits) {
            return Fail("not a yosys netlist: port bits must be numbers or constants");
        }
        return true;
    }

    bool Number(long long value) {
        if (!ScalarFits()) {
            return false;
        }
        Frame& frame = m_frames.back();
        switch (frame.role) {
        case Role::PortBits:
            m_modules.back().ports.back().bits.push_back(value);
            return true;
        case Role::ClockBits:
            m_cellBits.emplace_back(m_frames[m_frames.size() - 2].key, value);
            return true;
        case Role::Port:
            if (frame.key == "offset") {
                m_modules.back().ports.back().offset = value;
            } else if (frame.key == "upto") {
                m_modules.back().ports.back().upto = value != 0;
            }
            return true;
        default:
            return true;
        }
    }

    // The role of a new container from its parent's role and the key it stands under.
    bool Open(bool array) {
        if (m_frames.empty()) {
            if (array) {
                return Fail("not a yosys netlist: the document is no object");
            }
            m_frames.push_back({Role::Root, {}});
            return true;
        }
        const Frame& parent = m_frames.back();
        Role role = Role::Ignored;
        bool ok = true;
        switch (parent.role) {
        case Role::Root:
        case Role::Modules:
        case Role::Module:
            ok = OpenInModules(parent.role, parent.key, array, role);
            break;
        case Role::Ports:
        case Role::Port:
        case Role::PortBits:
            ok = OpenInPorts(parent.role, parent.key, array, role);
            break;
        case Role::Cells:
        case Role::Cell:
        case Role::Connections:
            role = OpenInCells(parent.role, parent.key, array);
            break;
        default:
            break;
        }
        if (!ok) {
            return false;
        }
        m_frames.push_back({role, {}});
        return true;
    }

    // A container the netlist needs to be an object: `role` becomes `wanted` when it is.
    bool ObjectRole(bool array, Role wanted, const std::string& what, Role& role) {
        if (array) {
            return Fail("not a yosys netlist: " + what + " is no object");
        }
        role = wanted;
        return true;
    }

    // The document, its modules and their sections; a module starts with its name.
    bool OpenInModules(Role parent, const std::string& key, bool array, Role& role) {
        switch (parent) {
        case Role::Root:
            if (key == "modules") {
                m_sawModules = true;
                return ObjectRole(array, Role::Modules, "\"modules\"", role);
            }
            return true;
        case Role::Modules:
            if (!ObjectRole(array, Role::Module, "module \"" + key + "\"", role)) {
                return false;
            }
            m_modules.push_back({});
            m_modules.back().name = key;
            return true;
        case Role::Module:
            if (key == "attributes") {
                return ObjectRole(array, Role::Attributes, "\"attributes\"", role);
            }
            if (key == "ports") {
                return ObjectRole(array, Role::Ports, "\"ports\"", role);
            }
            if (key == "cells") {
                return ObjectRole(array, Role::Cells, "\"cells\"", role);
            }
            return true;
        default:
            return true;
        }
    }

    // A module's ports, each starting with its name and line, and a port's bits.
    bool OpenInPorts(Role parent, const std::string& key, bool array, Role& role) {
        switch (parent) {
        case Role::Ports: {
            if (!ObjectRole(array, Role::Port, "port \"" + key + "\"", role)) {
                return false;
            }
            RawPort port;
            port.name = key;
            port.line = m_input.Line();
            m_modules.back().ports.push_back(std::move(port));
            return true;
        }
        case Role::Port:
            if (key == "bits") {
                if (!array) {
                    return Fail("not a yosys netlist: the bits of port \"" +
                                m_modules.back().ports.back().name + "\" are no array");
                }
                m_modules.back().ports.back().sawBits = true;
                role = Role::PortBits;
            }
            return true;
        case Role::PortBits:
            return Fail("not a yosys netlist: port bits must be numbers or constants");
        default:
            return true;
        }
    }

    // A module's cells: of a cell only its type, its parameters and the connections that
    // can be a clock or a pad are read; a new cell forgets the last one's.
    Role OpenInCells(Role parent, const std::string& key, bool array) {
        switch (parent) {
        case Role::Cells:
            if (array) {
                return Role::Ignored;
            }
            m_cellType.clear();
            m_cellIoStandard.clear();
            m_cellBits.clear();
            return Role::Cell;
        case Role::Cell:
            if (key == "connections" && !array) {
                return Role::Connections;
            }
            if (key == "parameters" && !array) {
                return Role::CellParameters;
            }
            return Role::Ignored;
        case Role::Connections:
            return array && (IsClockConnectionName(key) || IsPadConnectionName(key))
                       ? Role::ClockBits
                       : Role::Ignored;
        default:
            return Role::Ignored;
        }
    }

    bool FinishPort() {
        RawPort& port = m_modules.back().ports.back();
        if (port.direction != "input" && port.direction != "output" && port.direction != "inout") {
            m_error = AtLine(m_source, port.line,
                             "not a yosys netlist: port \"" + port.name + "\" has " +
                                 (port.direction.empty() ? "no direction"
                                                         : "direction \"" + port.direction + "\""));
            return false;
        }
        if (!port.sawBits) {
            m_error = AtLine(m_source, port.line,
                             "not a yosys netlist: port \"" + port.name + "\" has no bits");
            return false;
        }
        return true;
    }

    void FinishCell() {
        Module& module = m_modules.back();
        const char* clock = ClockConnection(m_cellType);
        for (const auto& [name, bit] : m_cellBits) {
            if (clock != nullptr && name == clock) {
                module.clockBits.insert(bit);
            }
        }
        FinishPadCell(module);
    }

    void FinishPadCell(Module& module) {
        bool pll = m_cellType.rfind("SB_PLL40_", 0) == 0;
        module.padPlls += pll && m_cellType.size() > 4 &&
                                  m_cellType.compare(m_cellType.size() - 4, 4, "_PAD") == 0
                              ? 1
                              : 0;
        module.twoOutputPlls += pll && m_cellType.find("_2") != std::string::npos ? 1 : 0;
        module.ledDriver =
            module.ledDriver || m_cellType == "SB_RGBA_DRV" || m_cellType == "SB_RGB_DRV";
        for (const PadConnection& pad : kPadConnections) {
            if (m_cellType != pad.type) {
                continue;
            }
            PadUse use = pad.use;
            if (use == PadUse::Plain && m_cellIoStandard == "SB_LVDS_INPUT") {
                use = PadUse::Differential;
            }
            for (const auto& [name, bit] : m_cellBits) {
                if (name == pad.connection && bit >= 0) {
                    int index = use == PadUse::LedDriver ? name[3] - '0' : -1;
                    module.padBits[bit] = {use, index, m_cellType};
                }
            }
        }
    }

    std::string_view m_source;
    CountingSource& m_input;
    std::vector<Frame> m_frames;
    std::vector<Module> m_modules;
    bool m_sawModules = false;
    std::string m_cellType;
    std::string m_cellIoStandard;
    std::vector<std::pair<std::string, long long>> m_cellBits; // clock and pad connections
    std::string m_error;
};

bool SelectTop(std::vector<Module>& modules, std::string_view source, Module*& top,
               std::string& error) {
    std::vector<Module*> marked;
    std::vector<Module*> designs;
    for (Module& module : modules) {
        if (module.top) {
            marked.push_back(&module);
        }
        if (!module.blackbox) {
            designs.push_back(&module);
        }
    }
    if (marked.size() == 1) {
        top = marked.front();
        return true;
    }
    if (marked.size() > 1) {
        error = std::string(source) + ": no single top module: " + marked[0]->name + " and " +
                marked[1]->name + " are both marked top";
        return false;
    }
    if (designs.size() == 1) {
        top = designs.front();
        return true;
    }
    error = std::string(source) + ": no top module: " +
            (designs.empty() ? std::string("the netlist has no module that is no black box")
                             : std::to_string(designs.size()) +
                                   " modules and none is marked top (synthesize with -top)");
    return false;
}

} // namespace

const char* PortDirectionName(PortDirection direction) {
    switch (direction) {
    case PortDirection::Input:
        return "input";
    case PortDirection::Output:
        return "output";
    case PortDirection::Inout:
        return "inout";
    }
    return "?";
}

namespace {

// The bits are named by index: an index that does not fit an int cannot be named.
bool OffsetFits(const RawPort& raw, std::string_view source, std::string& error) {
    const long long last = static_cast<long long>(raw.bits.size()) - 1;
    if (raw.offset < INT_MIN || raw.offset > INT_MAX || raw.offset > INT_MAX - last) {
        error = AtLine(source, raw.line,
                       "port \"" + raw.name + "\" has bit offset " + std::to_string(raw.offset) +
                           ", beyond the indices a constraint can name");
        return false;
    }
    return true;
}

} // namespace

bool ReadYosysPorts(std::istream& in, std::string_view source, Design& design, std::string& error) {
    design = Design{};
    CountingSource input(in);
    Handler handler(source, input);
    bool parsed = Json::sax_parse(CountingIterator(&input), CountingIterator(), &handler);
    if (input.Bad()) {
        error = std::string(source) + ": read error";
        return false;
    }
    if (!parsed) {
        error =
            handler.Error().empty() ? std::string(source) + ": malformed JSON" : handler.Error();
        return false;
    }
    Module* top = nullptr;
    if (!SelectTop(handler.Modules(), source, top, error)) {
        return false;
    }
    design.top = top->name;
    design.padPlls = top->padPlls;
    design.twoOutputPlls = top->twoOutputPlls;
    design.ledDriver = top->ledDriver;
    for (const RawPort& raw : top->ports) {
        if (!OffsetFits(raw, source, error)) {
            return false;
        }
        PortDirection direction = raw.direction == "input"    ? PortDirection::Input
                                  : raw.direction == "output" ? PortDirection::Output
                                                              : PortDirection::Inout;
        const long long width = static_cast<long long>(raw.bits.size());
        for (long long i = 0; i < width; ++i) {
            DesignPort port;
            port.bus = raw.name;
            port.width = static_cast<int>(width);
            port.direction = direction;
            // As nextpnr names the bits: a lone bit at offset 0 keeps the bare name; any
            // other bit is indexed, counting down from the top for [low:high] ports.
            if (width > 1 || raw.offset != 0) {
                port.bit = static_cast<int>(raw.upto ? raw.offset + width - 1 - i : raw.offset + i);
                port.name = raw.name + "[" + std::to_string(port.bit) + "]";
            } else {
                port.name = raw.name;
            }
            long long net = raw.bits[static_cast<std::size_t>(i)];
            port.clock = net >= 0 && top->clockBits.count(net) != 0;
            if (auto pad = top->padBits.find(net); net >= 0 && pad != top->padBits.end()) {
                port.padUse = pad->second.use;
                port.padIndex = pad->second.index;
                port.padCell = pad->second.cell;
            }
            design.ports.push_back(std::move(port));
        }
    }
    return true;
}

bool ReadYosysPortsFile(const std::string& path, Design& design, std::string& error) {
    Port::InputFile in;
    if (!in.Open(path, error)) {
        return false;
    }
    if (!ReadYosysPorts(in.Stream(), path, design, error)) {
        // A read that stopped at the size limit or an I/O error says so, not "truncated".
        std::string why;
        if (in.Failed(why)) {
            error = why;
        }
        return false;
    }
    return true;
}

} // namespace VnTool
