//===-- tools/design/PinPlan.cpp - checks and automatic assignment of pins ---===//
#include "PinPlan.h"
#include "Suggest.h"

#include <algorithm>
#include <cctype>
#include <map>
#include <set>
#include <unordered_map>
#include <unordered_set>

namespace VnTool {

namespace {

// PCF commands nextpnr-ice40 accepts besides set_io; it refuses any other.
const char* const kKnownCommands[] = {"set_frequency"};

bool IsDigit(char c) {
    return std::isdigit(static_cast<unsigned char>(c)) != 0;
}

// Compares runs of digits by value and other runs as text, so "A2" < "A10" < "B1".
bool NaturalLess(const std::string& a, const std::string& b) {
    std::size_t i = 0;
    std::size_t j = 0;
    while (i < a.size() && j < b.size()) {
        if (IsDigit(a[i]) && IsDigit(b[j])) {
            std::size_t ei = i;
            std::size_t ej = j;
            while (ei < a.size() && IsDigit(a[ei])) {
                ++ei;
            }
            while (ej < b.size() && IsDigit(b[ej])) {
                ++ej;
            }
            std::string_view da(a.data() + i, ei - i);
            std::string_view db(b.data() + j, ej - j);
            da.remove_prefix(std::min(da.find_first_not_of('0'), da.size()));
            db.remove_prefix(std::min(db.find_first_not_of('0'), db.size()));
            if (da.size() != db.size()) {
                return da.size() < db.size();
            }
            if (da != db) {
                return da < db;
            }
            i = ei;
            j = ej;
        } else {
            if (a[i] != b[j]) {
                return a[i] < b[j];
            }
            ++i;
            ++j;
        }
    }
    if ((i < a.size()) != (j < b.size())) {
        return j < b.size();
    }
    return a < b;
}

std::string Where(const PcfFile& pcf, const PcfLine& line) {
    // A line the tool is about to add has no number yet.
    return line.number == 0 ? pcf.Source() + " (new line)"
                            : pcf.Source() + ":" + std::to_string(line.number);
}

void Add(std::vector<PinProblem>& problems, PinProblem::Severity severity, const std::string& where,
         const std::string& port, const std::string& pin, const std::string& text) {
    PinProblem problem;
    problem.severity = severity;
    problem.port = port;
    problem.pin = pin;
    problem.message =
        where + (severity == PinProblem::Severity::Error ? ": error: " : ": warning: ") + text;
    problems.push_back(std::move(problem));
}

// The order of pins along their edge: left to right on the top and bottom edges, bottom
// to top on the sides, the IO blocks of one tile in turn.
bool AlongTheEdge(const Pin* a, const Pin* b) {
    bool sideA = a->bank == 1 || a->bank == 3;
    int alongA = sideA ? a->y : a->x;
    int alongB = sideA ? b->y : b->x;
    if (alongA != alongB) {
        return alongA < alongB;
    }
    return a->pio < b->pio;
}

// The pads the device's hard blocks take in the package read.
struct HardPads {
    std::vector<const Pin*> pllInputs;                         // of the PLLs bonded out
    std::unordered_map<const Pin*, const Pin*> pllSecond;      // PLLOUT_A pin -> PLLOUT_B pin
    std::vector<const Pin*> led = {nullptr, nullptr, nullptr}; // RGB0..RGB2
};

HardPads FindHardPads(const ChipDb& db) {
    HardPads pads;
    std::unordered_map<int, const Pin*> inputOfPll;
    for (const HardBlockPad& pad : db.hardBlockPads) {
        const Pin* pin = PinOfPad(db, pad);
        if (pin == nullptr) {
            continue;
        }
        if (pad.role == HardBlockPad::Role::LedDriver && pad.block >= 0 && pad.block < 3) {
            pads.led[static_cast<std::size_t>(pad.block)] = pin;
        } else if (pad.role == HardBlockPad::Role::PllInput && !pad.lockedInPackage) {
            pads.pllInputs.push_back(pin);
            inputOfPll[pad.block] = pin;
        }
    }
    for (const HardBlockPad& pad : db.hardBlockPads) {
        auto input = inputOfPll.find(pad.block);
        if (pad.role == HardBlockPad::Role::PllSecondOut && input != inputOfPll.end()) {
            pads.pllSecond[input->second] = PinOfPad(db, pad);
        }
    }
    return pads;
}

// The low-power and high-performance parts take differential inputs in bank 3 only; the
// UltraPlus parts anywhere.
bool DifferentialOnlyInBankThree(const ChipDb& db) {
    return db.device == "384" || db.device == "1k" || db.device == "8k";
}

// The other IO block of the pin's tile: a differential pair's second pin, when bonded.
const Pin* PartnerOf(const ChipDb& db, const Pin& pin) {
    for (const Pin& other : db.pins) {
        if (other.x == pin.x && other.y == pin.y && other.pio != pin.pio) {
            return &other;
        }
    }
    return nullptr;
}

std::string Names(const std::vector<const Pin*>& pins) {
    std::string names;
    for (const Pin* pin : pins) {
        names += (names.empty() ? "" : ", ") + pin->name;
    }
    return names.empty() ? "none in this package" : names;
}

std::string GlobalBufferPinNames(const ChipDb& db) {
    std::string names;
    for (const Pin* pin : PinsInOrder(db)) {
        if (IsGlobalBufferPin(db, *pin)) {
            names += (names.empty() ? "" : ", ") + pin->name;
        }
    }
    return names.empty() ? "none in this package" : names;
}

} // namespace

std::vector<const Pin*> PinsInOrder(const ChipDb& db) {
    std::vector<const Pin*> pins;
    for (const Pin& pin : db.pins) {
        pins.push_back(&pin);
    }
    std::sort(pins.begin(), pins.end(),
              [](const Pin* a, const Pin* b) { return NaturalLess(a->name, b->name); });
    return pins;
}

bool HasErrors(const std::vector<PinProblem>& problems) {
    return std::any_of(problems.begin(), problems.end(), [](const PinProblem& p) {
        return p.severity == PinProblem::Severity::Error;
    });
}

namespace {

// One pass over the lines and one over the ports, with every look-up hashed: a netlist of
// tens of thousands of port bits is checked in the time it takes to read.
class PlanChecker {
public:
    PlanChecker(const ChipDb& db, const Design& design, const std::string& designSource,
                const PcfFile& pcf, const CheckOptions& options)
        : m_db(db), m_design(design), m_designSource(designSource), m_pcf(pcf), m_options(options) {
        for (const Pin& pin : db.pins) {
            m_pins.emplace(pin.name, &pin);
        }
        for (const DesignPort& port : design.ports) {
            m_ports.emplace(port.name, &port);
        }
    }

    std::vector<PinProblem> Run(CheckSummary& summary) {
        for (const PcfLine& line : m_pcf.Lines()) {
            if (line.kind == PcfLine::Kind::Other) {
                Command(line);
            } else if (line.kind == PcfLine::Kind::SetIo) {
                SetIo(line, summary);
            }
        }
        PadRules();
        Unconstrained();
        std::stable_partition(m_problems.begin(), m_problems.end(), [](const PinProblem& p) {
            return p.severity == PinProblem::Severity::Error;
        });
        return std::move(m_problems);
    }

private:
    using Severity = PinProblem::Severity;
    struct Placed {
        const PcfLine* line;
        const DesignPort* port;
        const Pin* pin;
    };

    void Command(const PcfLine& line) {
        bool known = std::any_of(std::begin(kKnownCommands), std::end(kKnownCommands),
                                 [&](const char* c) { return line.command == c; });
        if (!known) {
            Add(m_problems, Severity::Error, Where(m_pcf, line), "", "",
                "nextpnr-ice40 knows no PCF command '" + line.command + "'");
        }
    }

    void SetIo(const PcfLine& line, CheckSummary& summary) {
        const std::string where = Where(m_pcf, line);
        for (const std::string& note : line.notes) {
            Add(m_problems, Severity::Warning, where, line.port, line.pin, note);
        }
        // nextpnr-ice40 stops at the option whether the port is there or not.
        if (!line.pullupResistor.empty() && m_db.device != "5k") {
            Add(m_problems, Severity::Error, where, line.port, line.pin,
                "-pullup_resistor is only for UltraPlus parts (up5k, up3k); device " + m_db.device +
                    " has fixed pull-ups");
        }
        auto port = m_ports.find(line.port);
        bool present = port != m_ports.end();
        if (!present) {
            ++summary.absentLines;
            summary.keptSilently += line.noWarn ? 1 : 0;
            m_absentNames.push_back(line.port);
            m_absentLine.emplace(line.port, &line);
        }
        // A board file names every pin of the board; the lines for ports the design lacks
        // are the toolchain's business only under the strict reading.
        bool judged = present || m_options.strict;
        auto pin = m_pins.find(line.pin);
        if (pin == m_pins.end()) {
            Add(m_problems, judged ? Severity::Error : Severity::Warning, where, line.port,
                line.pin,
                "pin '" + line.pin + "' is not in package " + m_db.package + " of device " +
                    m_db.device + DidYouMean(line.pin, PinNames()));
        }
        if (!present) {
            Absent(line, where);
        }
        if (judged) {
            Twice(line, where);
        }
        if (present && pin != m_pins.end() && m_lineOfPort.at(line.port) == &line) {
            m_placed.push_back({&line, port->second, pin->second});
        }
        if (present && port->second->clock && pin != m_pins.end() &&
            !IsGlobalBufferPin(m_db, *pin->second)) {
            Add(m_problems, Severity::Warning, where, line.port, line.pin,
                "clock port '" + line.port + "' is on pin " + line.pin +
                    ", which drives no global buffer (those are " + GlobalBufferPinNames(m_db) +
                    ")");
        }
    }

    void Absent(const PcfLine& line, const std::string& where) {
        if (line.noWarn) {
            return;
        }
        std::string text = "design " + m_designSource + " has no port '" + line.port + "'" +
                           BusHint(line.port) + DidYouMean(line.port, PortNames());
        if (m_options.strict) {
            Add(m_problems, Severity::Error, where, line.port, line.pin,
                text + " (add -nowarn to keep the line anyway)");
        } else {
            Add(m_problems, Severity::Warning, where, line.port, line.pin,
                text + "; the line is kept (-nowarn or --warn-no-port says it may be absent)");
        }
    }

    // A port on two lines, and a pin held by two ports.
    void Twice(const PcfLine& line, const std::string& where) {
        auto earlier = m_lineOfPort.find(line.port);
        if (earlier != m_lineOfPort.end()) {
            const PcfLine& first = *earlier->second;
            Add(m_problems, Severity::Error, where, line.port, line.pin,
                first.pin == line.pin
                    ? "duplicate constraint: port '" + line.port + "' is already on pin " +
                          line.pin + " (line " + std::to_string(first.number) + ")"
                    : "port '" + line.port + "' is put on two pins: " + first.pin + " (line " +
                          std::to_string(first.number) + ") and " + line.pin);
        } else {
            m_lineOfPort.emplace(line.port, &line);
        }
        auto holder = m_lineOfPin.find(line.pin);
        if (holder == m_lineOfPin.end()) {
            m_lineOfPin.emplace(line.pin, &line);
        } else if (holder->second->port != line.port) {
            Add(m_problems, Severity::Error, where, line.port, line.pin,
                "pin " + line.pin + " already holds port '" + holder->second->port + "' (line " +
                    std::to_string(holder->second->number) + ")");
        }
    }

    // Where the design's hard blocks put their pads: each port's own rule, then the pads
    // those blocks take away from every other port.
    void PadRules() {
        const HardPads pads = FindHardPads(m_db);
        std::unordered_map<const Pin*, const Placed*> onPin;
        std::unordered_map<const Pin*, std::string> heldBy;
        for (const Placed& placed : m_placed) {
            onPin.emplace(placed.pin, &placed);
            if (placed.port->padUse == PadUse::PllInput && m_design.twoOutputPlls > 0) {
                auto second = pads.pllSecond.find(placed.pin);
                if (second != pads.pllSecond.end() && second->second != nullptr) {
                    heldBy.emplace(second->second, "the second output of " + placed.port->padCell);
                }
            }
        }
        for (std::size_t i = 0; m_design.ledDriver && i < pads.led.size(); ++i) {
            if (pads.led[i] != nullptr) {
                heldBy.emplace(pads.led[i],
                               "output RGB" + std::to_string(i) + " of the LED driver");
            }
        }
        for (const Placed& placed : m_placed) {
            std::string why = OwnRule(placed, pads, onPin);
            auto held = heldBy.find(placed.pin);
            if (why.empty() && placed.port->padUse != PadUse::LedDriver && held != heldBy.end()) {
                why = "pin " + placed.pin->name + " is the pad of " + held->second +
                      ", which the design uses; put '" + placed.port->name + "' elsewhere";
            }
            if (!why.empty()) {
                Add(m_problems, Severity::Error, Where(m_pcf, *placed.line), placed.port->name,
                    placed.pin->name, why);
            }
        }
    }

    std::string OwnRule(const Placed& placed, const HardPads& pads,
                        const std::unordered_map<const Pin*, const Placed*>& onPin) const {
        const DesignPort& port = *placed.port;
        const Pin& pin = *placed.pin;
        const std::string who = "port '" + port.name + "'";
        switch (port.padUse) {
        case PadUse::PllInput:
            if (std::find(pads.pllInputs.begin(), pads.pllInputs.end(), &pin) ==
                pads.pllInputs.end()) {
                return who + " feeds " + port.padCell + " through its pad, so it must be on a " +
                       "PLL's pad: " + Names(pads.pllInputs);
            }
            return {};
        case PadUse::LedDriver: {
            const Pin* fixed = pads.led[static_cast<std::size_t>(std::clamp(port.padIndex, 0, 2))];
            if (fixed != &pin) {
                return who + " is output RGB" + std::to_string(port.padIndex) +
                       " of the LED driver, whose pad is fixed: " +
                       (fixed != nullptr ? "pin " + fixed->name : std::string("none here")) +
                       " (nextpnr-ice40 puts it there whatever the line says)";
            }
            return {};
        }
        case PadUse::GlobalBuffer:
            if (!IsGlobalBufferPin(m_db, pin)) {
                return who + " is an SB_GB_IO, whose pad must drive a global buffer: " +
                       GlobalBufferPinNames(m_db);
            }
            return {};
        case PadUse::Differential:
            return DifferentialRule(placed, onPin);
        case PadUse::Plain:
            return {};
        }
        return {};
    }

    std::string DifferentialRule(const Placed& placed,
                                 const std::unordered_map<const Pin*, const Placed*>& onPin) const {
        const Pin& pin = *placed.pin;
        const std::string who = "differential input '" + placed.port->name + "'";
        std::string right = DifferentialPinNames();
        if (DifferentialOnlyInBankThree(m_db) && pin.bank != 3) {
            return who + " must be in bank 3 on this part (pin " + pin.name + " is in bank " +
                   std::to_string(pin.bank) + "): " + right;
        }
        const Pin* partner = PartnerOf(m_db, pin);
        if (pin.pio != 0 || partner == nullptr) {
            return who + " must be on the first pin of a pair whose second pin is bonded: " + right;
        }
        auto other = onPin.find(partner);
        if (other != onPin.end()) {
            return who + " takes its pair's second pin " + partner->name + ", which holds port '" +
                   other->second->port->name + "' (line " +
                   std::to_string(other->second->line->number) + ")";
        }
        return {};
    }

    std::string DifferentialPinNames() const {
        std::vector<const Pin*> pins;
        for (const Pin* pin : PinsInOrder(m_db)) {
            if (pin->pio == 0 && PartnerOf(m_db, *pin) != nullptr &&
                (!DifferentialOnlyInBankThree(m_db) || pin->bank == 3)) {
                pins.push_back(pin);
            }
        }
        return Names(pins);
    }

    // "led[8]" of an eight-bit led: the index is what is wrong, and the hint says so.
    std::string BusHint(const std::string& name) {
        auto open = name.rfind('[');
        if (open == std::string::npos || open == 0 || name.back() != ']') {
            return {};
        }
        if (m_bits.empty()) {
            for (const DesignPort& port : m_design.ports) {
                if (port.bit < 0) {
                    continue;
                }
                auto [it, added] = m_bits.emplace(port.bus, std::make_pair(port.bit, port.bit));
                it->second.first = std::min(it->second.first, port.bit);
                it->second.second = std::max(it->second.second, port.bit);
            }
        }
        auto bus = m_bits.find(name.substr(0, open));
        if (bus == m_bits.end()) {
            return {};
        }
        return " (bus '" + bus->first + "' has bits " + std::to_string(bus->second.first) + " to " +
               std::to_string(bus->second.second) + ")";
    }

    void Unconstrained() {
        for (const DesignPort& port : m_design.ports) {
            m_foldedPorts.emplace(FoldedName(port.name), port.name);
        }
        std::vector<std::string> foldedAbsent;
        for (const std::string& name : m_absentNames) {
            foldedAbsent.push_back(FoldedName(name));
        }
        // A hint compares the port with every absent line: worth it for the first few.
        std::size_t hints = 0;
        for (const DesignPort& port : m_design.ports) {
            if (m_lineOfPort.count(port.name) != 0) {
                continue;
            }
            std::string text = "port '" + port.name + "' has no pin";
            if (hints < 20) {
                ++hints;
                long at = ClosestFoldedIndex(port.name, foldedAbsent);
                std::string near =
                    at < 0 ? std::string() : m_absentNames[static_cast<std::size_t>(at)];
                // "LED[0]" beside the design's "led[0]" is the board's other name for
                // another port, not a slip for "led[2]"; "d_1" is one for "d[1]" itself.
                auto other = m_foldedPorts.find(FoldedName(near));
                if (!near.empty() && (other == m_foldedPorts.end() || other->second == port.name)) {
                    text += " (" + Where(m_pcf, *m_absentLine.at(near)) + " names '" + near +
                            "': did you mean '" + port.name + "'?)";
                }
            }
            if (!m_options.allowUnconstrained) {
                text += "; nextpnr-ice40 refuses an unconstrained port unless given "
                        "--pcf-allow-unconstrained";
            }
            Add(m_problems, m_options.allowUnconstrained ? Severity::Warning : Severity::Error,
                m_designSource, port.name, "", text);
        }
    }

    const std::vector<std::string>& PinNames() {
        if (m_pinNames.empty()) {
            for (const Pin& pin : m_db.pins) {
                m_pinNames.push_back(pin.name);
            }
        }
        return m_pinNames;
    }

    // Hints are given for the first mistakes only: a file of thousands of stray lines
    // would otherwise cost lines times ports.
    const std::vector<std::string>& PortNames() {
        static const std::vector<std::string> kNone;
        if (++m_portHints > 20) {
            return kNone;
        }
        if (m_portNames.empty()) {
            for (const DesignPort& port : m_design.ports) {
                m_portNames.push_back(port.name);
            }
        }
        return m_portNames;
    }

    const ChipDb& m_db;
    const Design& m_design;
    const std::string& m_designSource;
    const PcfFile& m_pcf;
    const CheckOptions& m_options;
    std::vector<PinProblem> m_problems;
    std::unordered_map<std::string, const Pin*> m_pins;
    std::unordered_map<std::string, const DesignPort*> m_ports;
    std::unordered_map<std::string, const PcfLine*> m_lineOfPort;
    std::unordered_map<std::string, const PcfLine*> m_lineOfPin;
    std::unordered_map<std::string, const PcfLine*> m_absentLine;
    std::vector<std::string> m_absentNames;
    std::vector<std::string> m_pinNames;
    std::vector<std::string> m_portNames;
    std::size_t m_portHints = 0;
    std::unordered_map<std::string, std::pair<int, int>> m_bits;
    std::unordered_map<std::string, std::string> m_foldedPorts; // folded name -> port
    std::vector<Placed> m_placed; // the present ports' first lines, with a pin of the package
};

} // namespace

std::vector<PinProblem> CheckPins(const ChipDb& db, const Design& design,
                                  const std::string& designSource, const PcfFile& pcf,
                                  const CheckOptions& options, CheckSummary* summary) {
    CheckSummary counted;
    auto problems = PlanChecker(db, design, designSource, pcf, options).Run(counted);
    if (summary != nullptr) {
        *summary = counted;
    }
    return problems;
}

std::vector<PinProblem> CheckPins(const ChipDb& db, const Design& design,
                                  const std::string& designSource, const PcfFile& pcf,
                                  bool strict) {
    CheckOptions options;
    options.strict = strict;
    options.allowUnconstrained = !strict;
    return CheckPins(db, design, designSource, pcf, options);
}

namespace {

// The ports whose pad a hard block decides go first, each to the one pad that is right for
// it; then the pads those blocks take are kept from every other port.
template <class Give>
void PlaceHardBlockPorts(const ChipDb& db, const Design& design, const PcfFile& pcf,
                         const std::vector<const DesignPort*>& open,
                         const std::set<std::string>& taken, std::set<const Pin*>& used,
                         Give give) {
    const HardPads pads = FindHardPads(db);
    auto isFree = [&](const Pin* pin) {
        return pin != nullptr && taken.count(pin->name) == 0 && used.count(pin) == 0;
    };
    auto holdSecond = [&](const Pin* input) {
        auto second = pads.pllSecond.find(input);
        if (design.twoOutputPlls > 0 && second != pads.pllSecond.end() && second->second) {
            used.insert(second->second);
        }
    };
    std::unordered_map<std::string, const DesignPort*> portOf;
    for (const DesignPort& port : design.ports) {
        portOf.emplace(port.name, &port);
    }
    for (const PcfLine& line : pcf.Lines()) {
        auto port = portOf.find(line.port);
        if (line.kind == PcfLine::Kind::SetIo && port != portOf.end() &&
            port->second->padUse == PadUse::PllInput) {
            for (const Pin* pin : pads.pllInputs) {
                if (pin->name == line.pin) {
                    holdSecond(pin);
                }
            }
        }
    }
    for (const DesignPort* port : open) {
        if (port->padUse == PadUse::LedDriver && port->padIndex >= 0 && port->padIndex < 3) {
            const Pin* pin = pads.led[static_cast<std::size_t>(port->padIndex)];
            if (isFree(pin)) {
                give(*port, pin);
            }
        } else if (port->padUse == PadUse::PllInput) {
            for (const Pin* pin : pads.pllInputs) {
                if (isFree(pin)) {
                    give(*port, pin);
                    holdSecond(pin);
                    break;
                }
            }
        }
    }
    for (const Pin* pin : pads.led) {
        if (design.ledDriver && pin != nullptr) {
            used.insert(pin);
        }
    }
    for (const DesignPort* port : open) {
        if (port->padUse != PadUse::Differential) {
            continue;
        }
        for (const Pin* pin : PinsInOrder(db)) {
            const Pin* partner = PartnerOf(db, *pin);
            if (pin->pio == 0 && isFree(pin) && isFree(partner) &&
                (!DifferentialOnlyInBankThree(db) || pin->bank == 3)) {
                give(*port, pin);
                used.insert(partner);
                break;
            }
        }
    }
}

using PinList = std::vector<const Pin*>;
using PortList = std::vector<const DesignPort*>;

// One auto-assignment under way: the free pins in the order they are handed out
// (ordinary pins first, global-buffer pins kept for the clocks and for last), the pins
// handed out and the ports that have one.
class PinGiver {
public:
    PinGiver(const ChipDb& db, const std::set<std::string>& taken);

    void Give(const DesignPort& port, const Pin* pin);
    // Clock and global-buffer ports onto global-buffer pins.
    void PlaceClocks(const PortList& open);
    // Each bus's open bits together in one bank; returns the ports still without a pin.
    PortList PlaceBuses(const PortList& open);
    // Every port left on the first free pin.
    void PlaceRest(const PortList& rest);

    std::set<const Pin*>& Used() { return m_used; }
    const std::vector<std::pair<std::string, std::string>>& Given() const { return m_given; }

private:
    bool Placed(const DesignPort& port) const { return m_placed.count(port.name) != 0; }
    const Pin* FirstFree(const PinList& list);
    PinList BankFor(const PinList& candidates, std::size_t count) const;
    bool PlaceBus(const PortList& bits);

    PinList m_ordinary;
    PinList m_global;
    PinList m_everyFree;
    std::set<const Pin*> m_used;
    std::set<std::string> m_placed;
    std::vector<std::pair<std::string, std::string>> m_given;
    // Pins are only ever taken, so each list is walked once from where the last search
    // stopped.
    std::map<const PinList*, std::size_t> m_cursor;
};

PinGiver::PinGiver(const ChipDb& db, const std::set<std::string>& taken) {
    for (const Pin* pin : PinsInOrder(db)) {
        if (taken.count(pin->name) == 0) {
            (IsGlobalBufferPin(db, *pin) ? m_global : m_ordinary).push_back(pin);
            m_everyFree.push_back(pin);
        }
    }
}

void PinGiver::Give(const DesignPort& port, const Pin* pin) {
    m_used.insert(pin);
    m_placed.insert(port.name);
    m_given.emplace_back(port.name, pin->name);
}

const Pin* PinGiver::FirstFree(const PinList& list) {
    std::size_t& at = m_cursor[&list];
    while (at < list.size() && m_used.count(list[at]) != 0) {
        ++at;
    }
    return at < list.size() ? list[at] : nullptr;
}

// The first bank with room for every bit, its pins in their order along the edge so that
// neighbouring bits land on neighbouring pins; empty when none has.
PinList PinGiver::BankFor(const PinList& candidates, std::size_t count) const {
    for (int bank = 0; bank < 4; ++bank) {
        PinList room;
        for (const Pin* pin : candidates) {
            if (pin->bank == bank && m_used.count(pin) == 0) {
                room.push_back(pin);
            }
        }
        if (room.size() >= count) {
            std::stable_sort(room.begin(), room.end(), AlongTheEdge);
            room.resize(count);
            return room;
        }
    }
    return {};
}

void PinGiver::PlaceClocks(const PortList& open) {
    for (const DesignPort* port : open) {
        if ((port->clock || port->padUse == PadUse::GlobalBuffer) && !Placed(*port)) {
            if (const Pin* pin = FirstFree(m_global)) {
                Give(*port, pin);
            }
        }
    }
}

// Ordinary pins when a bank has enough of them, else any free pins of one bank; false
// when no bank has room for the bits, which are then left without pins.
bool PinGiver::PlaceBus(const PortList& bits) {
    PinList room = BankFor(m_ordinary, bits.size());
    if (room.empty()) {
        room = BankFor(m_everyFree, bits.size());
    }
    if (room.empty()) {
        return false;
    }
    for (std::size_t i = 0; i < bits.size(); ++i) {
        Give(*bits[i], room[i]);
    }
    return true;
}

PortList PinGiver::PlaceBuses(const PortList& open) {
    PortList rest;
    std::set<std::string> busesDone;
    for (const DesignPort* port : open) {
        if (Placed(*port)) {
            continue;
        }
        if (port->clock || port->width <= 1) {
            rest.push_back(port);
            continue;
        }
        if (!busesDone.insert(port->bus).second) {
            continue;
        }
        PortList bits;
        for (const DesignPort* other : open) {
            if (other->bus == port->bus && !Placed(*other)) {
                bits.push_back(other);
            }
        }
        std::sort(bits.begin(), bits.end(),
                  [](const DesignPort* a, const DesignPort* b) { return a->bit < b->bit; });
        if (!PlaceBus(bits)) {
            rest.insert(rest.end(), bits.begin(), bits.end());
        }
    }
    return rest;
}

void PinGiver::PlaceRest(const PortList& rest) {
    for (const DesignPort* port : rest) {
        const Pin* pin = FirstFree(m_ordinary);
        if (pin == nullptr) {
            pin = FirstFree(m_global);
        }
        if (pin != nullptr) {
            Give(*port, pin);
        }
    }
}

} // namespace

std::vector<std::pair<std::string, std::string>> AutoAssign(const ChipDb& db, const Design& design,
                                                            PcfFile& pcf) {
    std::set<std::string> taken;
    std::set<std::string> constrained;
    for (const PcfLine& line : pcf.Lines()) {
        if (line.kind == PcfLine::Kind::SetIo) {
            taken.insert(line.pin);
            constrained.insert(line.port);
        }
    }
    PortList open;
    for (const DesignPort& port : design.ports) {
        if (constrained.count(port.name) == 0) {
            open.push_back(&port);
        }
    }
    PinGiver giver(db, taken);
    PlaceHardBlockPorts(db, design, pcf, open, taken, giver.Used(),
                        [&](const DesignPort& port, const Pin* pin) { giver.Give(port, pin); });
    giver.PlaceClocks(open);
    giver.PlaceRest(giver.PlaceBuses(open));
    pcf.AppendAll(giver.Given());
    return giver.Given();
}

} // namespace VnTool
