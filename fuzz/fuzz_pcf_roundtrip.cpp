//===-- fuzz/fuzz_pcf_roundtrip.cpp - constraint files edited and written back -----===//
//
// The input is read as a constraint file; when it reads, a few assignments and
// unassignments chosen by the input's last bytes are applied, as `venlomer pins` and the
// editor apply them. The written text must read back to the same plan (the same port on
// the same pin, with the same options, line for line), that plan must be the one the
// edits asked for, and every line the edits did not touch must come out byte for byte as
// it came in. A mismatch traps.
//
//===------------------------------------------------------------------------------===//
#include "Pcf.h"

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace {

using Plan = std::vector<std::pair<std::string, std::string>>;

// Names as boards spell them, for when the input offers none a file can hold.
const char* const kPorts[] = {"clk", "led[0]", "LED_R", "uart_tx", "btn\\1", "set_io"};
const char* const kPins[] = {"21", "B5", "35", "A1", "144", "C8"};

// The input read backwards from its end, so that the edits and the file's first lines
// come from different bytes; zero once it runs out.
class Tail {
public:
    explicit Tail(std::string_view data) : m_data(data), m_left(data.size()) {}

    unsigned Next() { return m_left == 0 ? 0u : static_cast<unsigned char>(m_data[--m_left]); }

    // A port or pin name: one the file already holds, a piece of the input, or a stock one;
    // always a name a constraint file can hold.
    std::string Name(const std::vector<std::string>& known, const char* const (&stock)[6]) {
        unsigned how = Next();
        if (how % 3 == 0 && !known.empty()) {
            return known[(how / 3) % known.size()];
        }
        if (how % 3 == 1 && !m_data.empty()) {
            std::size_t at = ((Next() << 8U) | Next()) % m_data.size();
            std::string piece(m_data.substr(at, 1 + Next() % 12));
            if (VnTool::PcfWordProblem(piece).empty()) {
                return piece;
            }
        }
        return stock[how % 6];
    }

private:
    std::string_view m_data;
    std::size_t m_left;
};

void Check(bool ok) {
    if (!ok) {
        __builtin_trap();
    }
}

// What Assign promises, worked out apart from it: the port's first line takes the pin and
// its later lines go, or one line is added at the end.
void ExpectAssign(Plan& plan, const std::string& port, const std::string& pin) {
    bool done = false;
    for (auto it = plan.begin(); it != plan.end();) {
        if (it->first != port) {
            ++it;
        } else if (done) {
            it = plan.erase(it);
        } else {
            it->second = pin;
            done = true;
            ++it;
        }
    }
    if (!done) {
        plan.emplace_back(port, pin);
    }
}

void ExpectUnassign(Plan& plan, const std::string& port) {
    std::erase_if(plan, [&](const auto& entry) { return entry.first == port; });
}

// Applies the edits the input chooses to `pcf` and to the plan expected of it; returns the
// ports whose lines an edit may have changed.
std::vector<std::string> Edit(VnTool::PcfFile& pcf, Tail& tail, Plan& expected) {
    std::vector<std::string> ports;
    std::vector<std::string> pins;
    for (const auto& [port, pin] : expected) {
        ports.push_back(port);
        pins.push_back(pin);
    }
    std::vector<std::string> touched;
    for (unsigned edits = tail.Next() % 5; edits > 0; --edits) {
        bool assign = tail.Next() % 3 != 0;
        std::string port = tail.Name(ports, kPorts);
        touched.push_back(port);
        if (assign) {
            std::string pin = tail.Name(pins, kPins);
            pcf.Assign(port, pin);
            ExpectAssign(expected, port, pin);
        } else {
            int had = static_cast<int>(std::count_if(
                expected.begin(), expected.end(), [&](const auto& e) { return e.first == port; }));
            Check(pcf.Unassign(port) == had);
            ExpectUnassign(expected, port);
        }
    }
    return touched;
}

bool SameMeaning(const VnTool::PcfLine& a, const VnTool::PcfLine& b) {
    return a.kind == b.kind && a.command == b.command && a.port == b.port && a.pin == b.pin &&
           a.noWarn == b.noWarn && a.pullupResistor == b.pullupResistor;
}

// A line that came from the file keeps its text unless an edit was about its port, and
// then only its pin changes; its line end stays, but for a last line without a line feed,
// which gets one when a line follows it.
void CheckKeptLine(const VnTool::PcfLine& now, const std::vector<VnTool::PcfLine>& before,
                   const std::vector<std::string>& touched) {
    Check(now.number >= 1 && now.number <= before.size());
    const VnTool::PcfLine& was = before[now.number - 1];
    bool edited = now.kind == VnTool::PcfLine::Kind::SetIo &&
                  std::find(touched.begin(), touched.end(), now.port) != touched.end();
    if (edited) {
        std::string text = was.text;
        text.replace(was.pinAt, was.pin.size(), now.pin);
        Check(now.text == text && now.noWarn == was.noWarn &&
              now.pullupResistor == was.pullupResistor);
    } else {
        Check(now.text == was.text && SameMeaning(now, was));
    }
    bool lastWithoutFeed =
        now.number == before.size() && (was.end.empty() || was.end.back() != '\n');
    Check(now.end == was.end ||
          (lastWithoutFeed && now.end.starts_with(was.end) && now.end.ends_with("\n")));
}

// The file's lines come out in their order, none lost but the touched ports' set_io lines.
void CheckKeptLines(const std::vector<VnTool::PcfLine>& now,
                    const std::vector<VnTool::PcfLine>& before,
                    const std::vector<std::string>& touched) {
    std::vector<bool> kept(before.size(), false);
    std::size_t last = 0;
    for (const VnTool::PcfLine& line : now) {
        if (line.number != 0) {
            CheckKeptLine(line, before, touched);
            Check(line.number > last);
            last = line.number;
            kept[line.number - 1] = true;
        }
    }
    for (std::size_t i = 0; i < before.size(); ++i) {
        bool mayGo = before[i].kind == VnTool::PcfLine::Kind::SetIo &&
                     std::find(touched.begin(), touched.end(), before[i].port) != touched.end();
        Check(kept[i] || mayGo);
    }
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    std::string_view text(reinterpret_cast<const char*>(data), size);
    VnTool::PcfFile pcf;
    std::string error;
    if (!pcf.Parse(text, "fuzz.pcf", error)) {
        Check(error.starts_with("fuzz.pcf:") && pcf.Lines().empty());
        return 0;
    }
    Check(pcf.Text() == text);
    const std::vector<VnTool::PcfLine> before = pcf.Lines();
    Plan expected = VnTool::PcfAssignments(pcf);
    Tail tail(text);
    const std::vector<std::string> touched = Edit(pcf, tail, expected);
    Check(VnTool::PcfAssignments(pcf) == expected);

    VnTool::PcfFile back;
    Check(back.Parse(pcf.Text(), "fuzz.pcf", error));
    Check(back.Lines().size() == pcf.Lines().size());
    for (std::size_t i = 0; i < pcf.Lines().size(); ++i) {
        const VnTool::PcfLine& now = pcf.Lines()[i];
        Check(SameMeaning(back.Lines()[i], now) && back.Lines()[i].text == now.text &&
              back.Lines()[i].end == now.end);
    }
    CheckKeptLines(pcf.Lines(), before, touched);
    return 0;
}
