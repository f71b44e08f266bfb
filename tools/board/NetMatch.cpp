//===-- tools/board/NetMatch.cpp - a board's nets matched to a design's ports ---===//
#include "NetMatch.h"

#include <algorithm>
#include <cctype>
#include <map>
#include <set>

namespace VnTool {

namespace {

std::string Canon(std::string_view text) {
    std::string out;
    for (char c : text) {
        if (std::isalnum(static_cast<unsigned char>(c)) != 0) {
            out += static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
        }
    }
    return out;
}

std::string Upper(std::string_view text) {
    std::string out(text);
    for (char& c : out) {
        c = static_cast<char>(std::toupper(static_cast<unsigned char>(c)));
    }
    return out;
}

std::string_view Trim(std::string_view text) {
    while (!text.empty() && (text.front() == ' ' || text.front() == '\t')) {
        text.remove_prefix(1);
    }
    while (!text.empty() && (text.back() == ' ' || text.back() == '\t')) {
        text.remove_suffix(1);
    }
    return text;
}

// Names KiCad gives nets nobody named: they say which pads meet, never what the signal is.
bool IsUnnamed(std::string_view name) {
    if (name.rfind("Net-(", 0) == 0 || name.rfind("unconnected-(", 0) == 0) {
        return true;
    }
    // KiCad 4's "N-000012".
    return name.size() > 2 && name.rfind("N-", 0) == 0 &&
           std::all_of(name.begin() + 2, name.end(),
                       [](char c) { return std::isdigit(static_cast<unsigned char>(c)) != 0; });
}

NetName ReadOneName(std::string_view label) {
    NetName name;
    std::string text(label);
    if (text.find("~{") != std::string::npos) { // KiCad 6 and later: ~{RESET}
        std::string bare;
        for (std::size_t i = 0; i < text.size(); ++i) {
            if (text.compare(i, 2, "~{") == 0) {
                ++i;
            } else if (text[i] != '}') {
                bare += text[i];
            }
        }
        name.overbar = name.low = true;
        name.plain = name.stem = Canon(bare);
        return name;
    }
    if (text.front() == '~') { // KiCad 5: ~RESET, ~RESET~
        name.overbar = name.low = true;
        name.plain = name.stem = Canon(text);
        return name;
    }
    name.plain = name.stem = Canon(text);
    std::size_t n = text.size();
    char last = static_cast<char>(std::toupper(static_cast<unsigned char>(text[n - 1])));
    if (n > 2 && (last == 'N' || last == 'B') &&
        (text[n - 2] == '_' || text[n - 2] == '-' || text[n - 2] == '.')) {
        name.low = true;
        name.stem = Canon(text.substr(0, n - 2));
    } else if (n > 1 && text[0] == 'n' && std::isupper(static_cast<unsigned char>(text[1])) != 0) {
        name.low = true;
        name.stem = Canon(text.substr(1));
    }
    return name;
}

// A design port read the same way: "rst_n" is active low with the stem "rst"; a bus bit's
// index belongs to its name ("led[0]" is "led0").
struct PortName {
    std::string plain;
    std::string stem;
    bool low = false;
};

PortName ReadPortName(const DesignPort& port) {
    PortName name;
    name.plain = name.stem = Canon(port.name);
    std::string bus = port.bus.empty() ? port.name : port.bus;
    if (bus.size() > 2 && bus[bus.size() - 2] == '_' && (bus.back() == 'n' || bus.back() == 'N')) {
        name.low = true;
        name.stem = Canon(bus.substr(0, bus.size() - 2)) +
                    (port.bit >= 0 && port.width > 1 ? std::to_string(port.bit) : "");
    }
    return name;
}

// The rules, strongest first; a port takes the nets of the first rule any net meets.
int RuleMatched(const PortName& port, const NetName& net) {
    if (!net.overbar && net.plain == port.plain) {
        return 1; // the same name, path, case and punctuation aside
    }
    if (port.low && net.low && net.stem == port.stem) {
        return 2; // both marked active low
    }
    if (port.low && !net.low && net.plain == port.stem) {
        return 3; // an active-low port on a net that carries no mark
    }
    return 0;
}

struct BoardNet {
    std::string name;
    std::vector<NetName> names;
    std::vector<std::string> pins; // as the board names them
};

std::string JoinQuoted(const std::vector<std::string>& items) {
    std::string out;
    for (const std::string& item : items) {
        out += (out.empty() ? "" : ", ") + item;
    }
    return out;
}

} // namespace

std::vector<NetName> ReadNetName(std::string_view net) {
    std::vector<NetName> names;
    std::string_view label =
        net.substr(net.rfind('/') == std::string_view::npos ? 0 : net.rfind('/') + 1);
    if (IsUnnamed(label) || IsUnnamed(net)) {
        return names;
    }
    while (!label.empty()) {
        std::size_t bar = label.find('|');
        std::string_view part = Trim(label.substr(0, bar));
        if (!part.empty()) {
            NetName name = ReadOneName(part);
            if (!name.plain.empty()) {
                names.push_back(std::move(name));
            }
        }
        label = bar == std::string_view::npos ? std::string_view() : label.substr(bar + 1);
    }
    return names;
}

std::vector<NetOnPin> NetsOnPins(const BoardPart& part) {
    std::vector<NetOnPin> pins;
    std::map<std::string, std::size_t> index;
    for (const auto& [pin, net] : part.pins) {
        auto [it, added] = index.emplace(pin, pins.size());
        if (added) {
            pins.push_back({pin, net});
        } else if (pins[it->second].net.empty()) {
            pins[it->second].net = net;
        }
    }
    return pins;
}

const BoardPart* FindFpga(const Board& board, const ChipDb& db, const std::string& ref,
                          std::string& error) {
    std::set<std::string> io;
    for (const Pin& pin : db.pins) {
        io.insert(Upper(pin.name));
    }
    auto ioPins = [&](const BoardPart& part) {
        std::size_t count = 0;
        for (const NetOnPin& pin : NetsOnPins(part)) {
            count += io.count(Upper(pin.pin));
        }
        return count;
    };
    std::string package = "package " + db.package + " of device " + db.device;
    if (!ref.empty()) {
        const BoardPart* part = board.Find(ref);
        if (part == nullptr) {
            error = board.source + " has no part " + ref;
        } else if (ioPins(*part) == 0) {
            error = "no pin of " + ref + " in " + board.source + " is an I/O pin of " + package +
                    " (is the device or package right?)";
            part = nullptr;
        }
        return part;
    }
    std::vector<const BoardPart*> found;
    std::vector<std::string> named;
    for (const BoardPart& part : board.parts) {
        std::size_t count = ioPins(part);
        if (count >= 8 && count * 2 > NetsOnPins(part).size()) {
            found.push_back(&part);
            named.push_back(part.ref + " (" + std::to_string(count) + " I/O pins)");
        }
    }
    if (found.size() == 1) {
        return found.front();
    }
    error = found.empty() ? "no part in " + board.source + " has the I/O pins of " + package +
                                " (is the device or package right? --ref names the FPGA)"
                          : "several parts in " + board.source + " could be the FPGA on " +
                                package + ": " + JoinQuoted(named) + "; --ref names it";
    return nullptr;
}

// Kept whole: the three passes (each port's nets, each net's ports, the verdicts) share
// the tables they build, and read best together.
BoardMatch MatchPorts(const Design& design, const ChipDb& db, const std::vector<NetOnPin>& pins) {
    std::vector<BoardNet> nets;
    std::map<std::string, std::size_t> netIndex;
    for (const NetOnPin& pin : pins) {
        std::vector<NetName> names = ReadNetName(pin.net);
        if (names.empty()) {
            continue;
        }
        auto [it, added] = netIndex.emplace(pin.net, nets.size());
        if (added) {
            nets.push_back({pin.net, std::move(names), {}});
        }
        nets[it->second].pins.push_back(pin.pin);
    }
    // Each port's nets under its strongest rule, and each net's claimants.
    std::vector<std::vector<std::size_t>> portNets(design.ports.size());
    std::vector<std::vector<std::size_t>> netPorts(nets.size());
    for (std::size_t p = 0; p < design.ports.size(); ++p) {
        PortName port = ReadPortName(design.ports[p]);
        for (int rule = 1; rule <= 3 && portNets[p].empty(); ++rule) {
            for (std::size_t n = 0; n < nets.size(); ++n) {
                bool hit = std::any_of(
                    nets[n].names.begin(), nets[n].names.end(),
                    [&](const NetName& name) { return RuleMatched(port, name) == rule; });
                if (hit) {
                    portNets[p].push_back(n);
                    netPorts[n].push_back(p);
                }
            }
        }
    }
    std::map<std::string, const Pin*> ioPins;
    for (const Pin& pin : db.pins) {
        ioPins[Upper(pin.name)] = &pin;
    }
    BoardMatch match;
    std::set<std::size_t> toldNets;
    for (std::size_t p = 0; p < design.ports.size(); ++p) {
        const std::string& port = design.ports[p].name;
        if (portNets[p].empty()) {
            match.unmatched.push_back(port);
            continue;
        }
        if (portNets[p].size() > 1) {
            std::vector<std::string> names;
            for (std::size_t n : portNets[p]) {
                names.push_back(nets[n].name);
            }
            match.problems.push_back("port " + port + ": nets " + JoinQuoted(names) +
                                     " all match; not placed");
            continue;
        }
        const BoardNet& net = nets[portNets[p].front()];
        if (netPorts[portNets[p].front()].size() > 1) {
            if (toldNets.insert(portNets[p].front()).second) {
                std::vector<std::string> names;
                for (std::size_t other : netPorts[portNets[p].front()]) {
                    names.push_back(design.ports[other].name);
                }
                match.problems.push_back("net " + net.name + ": ports " + JoinQuoted(names) +
                                         " could all take it; none placed");
            }
            continue;
        }
        if (net.pins.size() > 1) {
            match.problems.push_back("net " + net.name + " is on pins " + JoinQuoted(net.pins) +
                                     " of the FPGA; port " + port + " not placed");
            continue;
        }
        auto io = ioPins.find(Upper(net.pins.front()));
        if (io == ioPins.end()) {
            match.problems.push_back(
                "net " + net.name + " matches port " + port + " but is on pin " + net.pins.front() +
                ", which is no I/O pin of package " + db.package + "; not placed");
            continue;
        }
        match.placed.emplace_back(port, io->second->name);
    }
    for (std::size_t n = 0; n < nets.size(); ++n) {
        if (netPorts[n].empty() && nets[n].pins.size() == 1 &&
            ioPins.count(Upper(nets[n].pins.front())) != 0) {
            match.unused.push_back(nets[n].pins.front() + " " + nets[n].name);
        }
    }
    return match;
}

std::vector<std::string> CompareParts(const BoardPart& first, std::string_view firstSource,
                                      const BoardPart& second, std::string_view secondSource) {
    std::vector<NetOnPin> a = NetsOnPins(first);
    std::vector<NetOnPin> b = NetsOnPins(second);
    std::map<std::string, std::string> secondNets;
    for (const NetOnPin& pin : b) {
        secondNets[pin.pin] = pin.net;
    }
    for (const NetOnPin& pin : b) {
        if (std::none_of(a.begin(), a.end(), [&](const NetOnPin& x) { return x.pin == pin.pin; })) {
            a.push_back({pin.pin, ""});
        }
    }
    // KiCad names unnamed nets after their pads, and may name them differently in the two
    // files; only a named net on either side can disagree.
    auto shown = [](const std::string& net) {
        return ReadNetName(net).empty() ? std::string("no named net") : net;
    };
    std::vector<std::string> differences;
    for (const NetOnPin& pin : a) {
        std::string other = secondNets.count(pin.pin) != 0 ? secondNets[pin.pin] : std::string();
        if (shown(pin.net) != shown(other)) {
            differences.push_back(pin.pin + ": " + shown(pin.net) + " in " +
                                  std::string(firstSource) + ", " + shown(other) + " in " +
                                  std::string(secondSource));
        }
    }
    return differences;
}

} // namespace VnTool
