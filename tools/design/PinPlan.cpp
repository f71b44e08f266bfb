//===-- tools/design/PinPlan.cpp - checks and automatic assignment of pins ---===//
#include "PinPlan.h"

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

std::vector<PinProblem> CheckPins(const ChipDb& db, const Design& design,
                                  const std::string& designSource, const PcfFile& pcf,
                                  bool strict) {
    using Severity = PinProblem::Severity;
    std::vector<PinProblem> problems;
    std::unordered_map<std::string, const Pin*> pins;
    for (const Pin& pin : db.pins) {
        pins.emplace(pin.name, &pin);
    }
    std::unordered_map<std::string, const DesignPort*> ports;
    for (const DesignPort& port : design.ports) {
        ports.emplace(port.name, &port);
    }
    std::unordered_map<std::string, const PcfLine*> lineOfPort;
    std::unordered_map<std::string, const PcfLine*> lineOfPin;

    for (const PcfLine& line : pcf.Lines()) {
        const std::string where = Where(pcf, line);
        if (line.kind == PcfLine::Kind::Other) {
            bool known = std::any_of(std::begin(kKnownCommands), std::end(kKnownCommands),
                                     [&](const char* c) { return line.command == c; });
            if (!known) {
                Add(problems, Severity::Error, where, "", "",
                    "nextpnr-ice40 knows no PCF command '" + line.command + "'");
            }
            continue;
        }
        if (line.kind != PcfLine::Kind::SetIo) {
            continue;
        }
        for (const std::string& note : line.notes) {
            Add(problems, Severity::Warning, where, line.port, line.pin, note);
        }
        auto pin = pins.find(line.pin);
        if (pin == pins.end()) {
            Add(problems, Severity::Error, where, line.port, line.pin,
                "pin '" + line.pin + "' is not in package " + db.package + " of device " +
                    db.device);
        }
        auto earlier = lineOfPort.find(line.port);
        if (earlier != lineOfPort.end()) {
            const PcfLine& first = *earlier->second;
            Add(problems, Severity::Error, where, line.port, line.pin,
                first.pin == line.pin
                    ? "duplicate constraint: port '" + line.port + "' is already on pin " +
                          line.pin + " (line " + std::to_string(first.number) + ")"
                    : "port '" + line.port + "' is put on two pins: " + first.pin + " (line " +
                          std::to_string(first.number) + ") and " + line.pin);
        } else {
            lineOfPort.emplace(line.port, &line);
        }
        auto holder = lineOfPin.find(line.pin);
        if (holder != lineOfPin.end() && holder->second->port != line.port) {
            Add(problems, Severity::Error, where, line.port, line.pin,
                "pin " + line.pin + " already holds port '" + holder->second->port + "' (line " +
                    std::to_string(holder->second->number) + ")");
        } else if (holder == lineOfPin.end()) {
            lineOfPin.emplace(line.pin, &line);
        }
        auto port = ports.find(line.port);
        if (port == ports.end()) {
            // nextpnr-ice40 only warns here; a stale line is an error to us, unless the
            // user said -nowarn as nextpnr lets them.
            if (!line.noWarn) {
                Add(problems, Severity::Error, where, line.port, line.pin,
                    "design " + designSource + " has no port '" + line.port +
                        "' (add -nowarn to keep the line anyway)");
            }
        } else if (port->second->clock && pin != pins.end() &&
                   !IsGlobalBufferPin(db, *pin->second)) {
            Add(problems, Severity::Warning, where, line.port, line.pin,
                "clock port '" + line.port + "' is on pin " + line.pin +
                    ", which drives no global buffer (those are " + GlobalBufferPinNames(db) + ")");
        }
    }
    for (const DesignPort& port : design.ports) {
        if (lineOfPort.count(port.name) == 0) {
            Add(problems, strict ? Severity::Error : Severity::Warning, designSource, port.name, "",
                "port '" + port.name + "' has no pin");
        }
    }
    return problems;
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
        pcf.Assign(port.name, pin->name);
        given.emplace_back(port.name, pin->name);
    };
    auto firstFree = [&](const std::vector<const Pin*>& list) -> const Pin* {
        for (const Pin* pin : list) {
            if (used.count(pin) == 0) {
                return pin;
            }
        }
        return nullptr;
    };
    // The first bank with room for every bit, its pins in order; empty when none has.
    auto bankFor = [&](const std::vector<const Pin*>& candidates, std::size_t count) {
        for (int bank = 0; bank < 4; ++bank) {
            std::vector<const Pin*> room;
            for (const Pin* pin : candidates) {
                if (pin->bank == bank && used.count(pin) == 0 && room.size() < count) {
                    room.push_back(pin);
                }
            }
            if (room.size() == count) {
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
    return given;
}

} // namespace VnTool
