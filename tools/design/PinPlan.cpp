//===-- tools/design/PinPlan.cpp - checks and automatic assignment of pins ---===//
#include "PinPlan.h"
#include "Suggest.h"

#include <algorithm>
#include <cctype>
#include <map>
#include <set>
#include <unordered_map>

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
        Unconstrained();
        std::stable_partition(m_problems.begin(), m_problems.end(), [](const PinProblem& p) {
            return p.severity == PinProblem::Severity::Error;
        });
        return std::move(m_problems);
    }

private:
    using Severity = PinProblem::Severity;

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
        // A hint compares the port with every absent line: worth it for the first few.
        std::size_t hints = 0;
        for (const DesignPort& port : m_design.ports) {
            if (m_lineOfPort.count(port.name) != 0) {
                continue;
            }
            std::string text = "port '" + port.name + "' has no pin";
            if (hints < 20) {
                ++hints;
                std::string near = ClosestName(port.name, m_absentNames);
                if (!near.empty()) {
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
    // Free pins in the order they are handed out: ordinary pins first, global-buffer pins
    // kept for the clocks and for last.
    std::vector<const Pin*> ordinary;
    std::vector<const Pin*> global;
    for (const Pin* pin : PinsInOrder(db)) {
        if (taken.count(pin->name) == 0) {
            (IsGlobalBufferPin(db, *pin) ? global : ordinary).push_back(pin);
        }
    }
    std::vector<const Pin*> everyFree;
    for (const Pin* pin : PinsInOrder(db)) {
        if (taken.count(pin->name) == 0) {
            everyFree.push_back(pin);
        }
    }
    std::set<const Pin*> used;
    std::set<std::string> placed;
    std::vector<std::pair<std::string, std::string>> given;
    auto give = [&](const DesignPort& port, const Pin* pin) {
        used.insert(pin);
        placed.insert(port.name);
        given.emplace_back(port.name, pin->name);
    };
    // Pins are only ever taken, so each list is walked once from where the last search
    // stopped.
    std::map<const std::vector<const Pin*>*, std::size_t> cursor;
    auto firstFree = [&](const std::vector<const Pin*>& list) -> const Pin* {
        std::size_t& at = cursor[&list];
        while (at < list.size() && used.count(list[at]) != 0) {
            ++at;
        }
        return at < list.size() ? list[at] : nullptr;
    };
    // The first bank with room for every bit, its pins in their order along the edge so
    // that neighbouring bits land on neighbouring pins; empty when none has.
    auto bankFor = [&](const std::vector<const Pin*>& candidates, std::size_t count) {
        for (int bank = 0; bank < 4; ++bank) {
            std::vector<const Pin*> room;
            for (const Pin* pin : candidates) {
                if (pin->bank == bank && used.count(pin) == 0) {
                    room.push_back(pin);
                }
            }
            if (room.size() >= count) {
                std::stable_sort(room.begin(), room.end(), AlongTheEdge);
                room.resize(count);
                return room;
            }
        }
        return std::vector<const Pin*>{};
    };

    std::vector<const DesignPort*> open;
    for (const DesignPort& port : design.ports) {
        if (constrained.count(port.name) == 0) {
            open.push_back(&port);
        }
    }
    for (const DesignPort* port : open) {
        if (port->clock) {
            if (const Pin* pin = firstFree(global)) {
                give(*port, pin);
            }
        }
    }
    std::vector<const DesignPort*> rest;
    std::set<std::string> busesDone;
    for (const DesignPort* port : open) {
        if (placed.count(port->name) != 0) {
            continue;
        }
        if (port->clock || port->width <= 1) {
            rest.push_back(port);
            continue;
        }
        if (!busesDone.insert(port->bus).second) {
            continue;
        }
        std::vector<const DesignPort*> bits;
        for (const DesignPort* other : open) {
            if (other->bus == port->bus && placed.count(other->name) == 0) {
                bits.push_back(other);
            }
        }
        std::sort(bits.begin(), bits.end(),
                  [](const DesignPort* a, const DesignPort* b) { return a->bit < b->bit; });
        // Ordinary pins when a bank has enough of them, else any free pins of one bank.
        std::vector<const Pin*> room = bankFor(ordinary, bits.size());
        if (room.empty()) {
            room = bankFor(everyFree, bits.size());
        }
        if (room.empty()) {
            rest.insert(rest.end(), bits.begin(), bits.end());
            continue;
        }
        for (std::size_t i = 0; i < bits.size(); ++i) {
            give(*bits[i], room[i]);
        }
    }
    for (const DesignPort* port : rest) {
        const Pin* pin = firstFree(ordinary);
        if (pin == nullptr) {
            pin = firstFree(global);
        }
        if (pin != nullptr) {
            give(*port, pin);
        }
    }
    pcf.AppendAll(given);
    return given;
}

} // namespace VnTool
