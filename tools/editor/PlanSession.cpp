//===-- tools/editor/PlanSession.cpp - one constraint file being edited ---===//
#include "PlanSession.h"

#include "Port/SafeFile.h"

#include <cstdio>
#include <filesystem>
#include <set>

namespace VnTool {

namespace {

// How many steps undo keeps; each holds only the lines it changed.
constexpr std::size_t kUndoDepth = 1000;

// The longest name a folder entry may have on the systems the tool runs on.
constexpr std::size_t kNameMax = 255;

std::uint64_t NameHash(const std::string& text) {
    std::uint64_t hash = 14695981039346656037ULL; // FNV-1a
    for (unsigned char c : text) {
        hash = (hash ^ c) * 1099511628211ULL;
    }
    return hash;
}

// What an error is about, without where it was found: a line number moves when a line
// is added above it, and the same error must not count as new for that.
std::string ProblemKey(const PinProblem& problem) {
    const std::string& message = problem.message;
    const auto mark = message.find(": error: ");
    std::string what = mark == std::string::npos ? message : message.substr(mark + 9);
    return problem.port + '\n' + problem.pin + '\n' + what;
}

std::vector<std::string> LinesOf(const PcfFile& pcf) {
    std::vector<std::string> lines;
    lines.reserve(pcf.Lines().size());
    for (const PcfLine& line : pcf.Lines()) {
        lines.push_back(line.text + line.end);
    }
    return lines;
}

std::string Join(const std::vector<std::string>& lines) {
    std::string text;
    for (const std::string& line : lines) {
        text += line;
    }
    return text;
}

std::map<std::string, std::string> PinsOf(const PcfFile& pcf) {
    std::map<std::string, std::string> pins;
    for (const PcfLine& line : pcf.Lines()) {
        if (line.kind == PcfLine::Kind::SetIo) {
            pins.emplace(line.port, line.pin);
        }
    }
    return pins;
}

// "top.pcf:4: set_io led[0] 3" for each line of `port` in `pcf`, or what is missing.
std::string LinesNaming(const PcfFile& pcf, const std::string& port) {
    std::string out;
    for (const PcfLine& line : pcf.Lines()) {
        if (line.kind == PcfLine::Kind::SetIo && line.port == port) {
            out += (out.empty() ? "" : "; ") + pcf.Source() + ":" + std::to_string(line.number) +
                   ": " + line.text;
        }
    }
    return out.empty() ? pcf.Source() + ": no set_io line for " + port + " any more" : out;
}

} // namespace

std::string SideFilePath(const std::string& path, const std::string& suffix) {
    const std::filesystem::path whole(path);
    std::string name = whole.filename().string();
    if (name.size() + suffix.size() > kNameMax) {
        char hash[20];
        std::snprintf(hash, sizeof hash, "~%016llx",
                      static_cast<unsigned long long>(NameHash(name)));
        std::size_t keep = kNameMax - suffix.size() - 17;
        // Cut between characters, not inside one.
        while (keep > 0 && (static_cast<unsigned char>(name[keep]) & 0xC0) == 0x80) {
            --keep;
        }
        name = name.substr(0, keep) + hash;
    }
    return (whole.parent_path() / (name + suffix)).string();
}

bool PlanSession::Open(const ChipDb& db, const Design& design, const std::string& designPath,
                       const std::string& pcfPath, std::string& error) {
    m_db = &db;
    m_design = &design;
    m_designPath = designPath;
    m_pcfPath = pcfPath;
    if (!ReadDisk(m_diskText, m_diskExisted, error) || !m_pcf.Parse(m_diskText, m_pcfPath, error)) {
        return false;
    }
    m_recoveredText = m_diskText;
    m_text = m_pcf.Text();
    m_problems = CheckPins(db, design, designPath, m_pcf, false);
    m_pinOfPort = PinsOf(m_pcf);
    return true;
}

bool PlanSession::Unsaved() const {
    return m_text != m_diskText;
}

std::size_t PlanSession::HistoryBytes() const {
    std::size_t bytes = 0;
    for (const auto* steps : {&m_undo, &m_redo}) {
        for (const Step& step : *steps) {
            bytes += sizeof(Step);
            for (const auto* lines : {&step.removed, &step.added}) {
                for (const std::string& line : *lines) {
                    bytes += sizeof(std::string) + line.capacity();
                }
            }
        }
    }
    return bytes;
}

PlanSession::Step PlanSession::Diff(const PcfFile& before, const PcfFile& after) {
    const auto& a = before.Lines();
    const auto& b = after.Lines();
    auto same = [](const PcfLine& x, const PcfLine& y) {
        return x.text == y.text && x.end == y.end;
    };
    std::size_t head = 0;
    while (head < a.size() && head < b.size() && same(a[head], b[head])) {
        ++head;
    }
    std::size_t tail = 0;
    while (tail < a.size() - head && tail < b.size() - head &&
           same(a[a.size() - 1 - tail], b[b.size() - 1 - tail])) {
        ++tail;
    }
    Step step;
    step.at = head;
    step.removed.reserve(a.size() - tail - head);
    step.added.reserve(b.size() - tail - head);
    for (std::size_t i = head; i < a.size() - tail; ++i) {
        step.removed.push_back(a[i].text + a[i].end);
    }
    for (std::size_t i = head; i < b.size() - tail; ++i) {
        step.added.push_back(b[i].text + b[i].end);
    }
    return step;
}

void PlanSession::Adopt(PcfFile next, std::vector<PinProblem> problems) {
    m_pcf = std::move(next);
    m_text = m_pcf.Text();
    m_problems = std::move(problems);
    m_pinOfPort = PinsOf(m_pcf);
    ++m_revision;
}

void PlanSession::Edit(const std::function<void(PcfFile&)>& change) {
    PcfFile next = m_pcf;
    change(next);
    auto problems = CheckPins(*m_db, *m_design, m_designPath, next, false);
    std::set<std::string> before;
    for (const PinProblem& p : m_problems) {
        if (p.severity == PinProblem::Severity::Error) {
            before.insert(ProblemKey(p));
        }
    }
    std::string added;
    for (const PinProblem& p : problems) {
        if (p.severity == PinProblem::Severity::Error && before.count(ProblemKey(p)) == 0) {
            added += (added.empty() ? "" : "; ") + p.message;
        }
    }
    if (!added.empty()) {
        throw PlanRefusal{409, "refused: " + added};
    }
    m_undo.push_back(Diff(m_pcf, next));
    if (m_undo.size() > kUndoDepth) {
        m_undo.erase(m_undo.begin());
    }
    m_redo.clear();
    Adopt(std::move(next), std::move(problems));
}

// Kept whole: the step is checked, reversed and moved in one piece so that a refusal
// anywhere leaves both stacks as they were.
void PlanSession::Travel(std::vector<Step>& from, std::vector<Step>& to, long step,
                         const char* what) {
    if (step != m_revision) {
        throw PlanRefusal{409, "stale step " + std::to_string(step) + ": the plan is at revision " +
                                   std::to_string(m_revision) + "; reload to see it"};
    }
    if (from.empty()) {
        throw PlanRefusal{409, std::string("nothing to ") + what};
    }
    Step back = from.back();
    std::vector<std::string> lines = LinesOf(m_pcf);
    auto first = lines.begin() + static_cast<std::ptrdiff_t>(back.at);
    lines.erase(first, first + static_cast<std::ptrdiff_t>(back.added.size()));
    lines.insert(lines.begin() + static_cast<std::ptrdiff_t>(back.at), back.removed.begin(),
                 back.removed.end());
    PcfFile next;
    std::string error;
    if (!next.Parse(Join(lines), m_pcfPath, error)) {
        throw PlanRefusal{500, "the step cannot be taken back: " + error};
    }
    std::swap(back.removed, back.added);
    from.pop_back();
    to.push_back(std::move(back));
    auto problems = CheckPins(*m_db, *m_design, m_designPath, next, false);
    Adopt(std::move(next), std::move(problems));
}

void PlanSession::Undo(long step) {
    Travel(m_undo, m_redo, step, "undo");
}

void PlanSession::Redo(long step) {
    Travel(m_redo, m_undo, step, "redo");
}

bool PlanSession::ReadDisk(std::string& text, bool& exists, std::string& error) const {
    std::error_code ec;
    exists = std::filesystem::exists(m_pcfPath, ec) || std::filesystem::is_symlink(m_pcfPath, ec);
    text.clear();
    return !exists || Port::ReadRegularFile(m_pcfPath, text, error);
}

void PlanSession::Save(const std::vector<std::string>& inputs) {
    std::string disk;
    bool exists = false;
    std::string error;
    if (!ReadDisk(disk, exists, error)) {
        throw PlanRefusal{500, error};
    }
    if (exists != m_diskExisted || disk != m_diskText) {
        PlanRefusal refusal{409, m_pcfPath + " changed on disk since it was read or saved; "
                                             "take the new file, with or without this editor's "
                                             "edits on top, before saving"};
        refusal.changedOnDisk = true;
        throw refusal;
    }
    const std::string& text = m_text;
    if (!Port::WriteFileSafely(m_pcfPath, text, error, inputs)) {
        throw PlanRefusal{500, error};
    }
    m_diskText = text;
    m_diskExisted = true;
    if (!WriteRecovery(error)) {
        throw PlanRefusal{500, "saved, but the recovery file could not be removed: " + error};
    }
}

// Kept whole: the three plans (as read, as edited, as on disk now) are compared port by
// port in one pass, and every conflict is named before anything is changed.
PcfFile PlanSession::Reapplied(const PcfFile& disk) const {
    PcfFile base;
    std::string error;
    base.Parse(m_diskText, m_pcfPath, error);
    const auto before = PinsOf(base);
    const auto& ours = m_pinOfPort;
    const auto theirs = PinsOf(disk);
    std::set<std::string> ports;
    for (const auto* side : {&before, &ours}) {
        for (const auto& [port, pin] : *side) {
            ports.insert(port);
        }
    }
    auto pinIn = [](const std::map<std::string, std::string>& pins, const std::string& port) {
        auto it = pins.find(port);
        return it == pins.end() ? std::string("\n(none)") : it->second;
    };
    PcfFile result = disk;
    PlanRefusal conflict{409, ""};
    conflict.changedOnDisk = true;
    for (const std::string& port : ports) {
        const std::string was = pinIn(before, port);
        const std::string now = pinIn(ours, port);
        const std::string there = pinIn(theirs, port);
        if (was == now || now == there) {
            continue; // not edited here, or the file already agrees
        }
        if (there != was) {
            conflict.conflicts.push_back(LinesNaming(disk, port) + " (this editor put " + port +
                                         (now[0] == '\n' ? " on no pin)" : " on " + now + ")"));
            continue;
        }
        if (now[0] == '\n') {
            result.Unassign(port);
        } else {
            result.Assign(port, now);
        }
    }
    if (!conflict.conflicts.empty()) {
        conflict.what = "the file on disk changed the pins of ports this editor changed too";
        throw conflict;
    }
    return result;
}

void PlanSession::TakeDisk(bool reapply) {
    std::string text;
    bool exists = false;
    std::string error;
    PcfFile disk;
    if (!ReadDisk(text, exists, error) || !disk.Parse(text, m_pcfPath, error)) {
        throw PlanRefusal{409, "the file on disk cannot be taken: " + error};
    }
    PcfFile next = reapply ? Reapplied(disk) : disk;
    m_diskText = std::move(text);
    m_diskExisted = exists;
    m_undo.clear();
    m_redo.clear();
    auto problems = CheckPins(*m_db, *m_design, m_designPath, next, false);
    Adopt(std::move(next), std::move(problems));
}

bool PlanSession::WriteRecovery(std::string& error) {
    const std::string& text = m_text;
    if (text == m_diskText) {
        // Nothing unsaved: nothing is left to recover.
        if (m_ownsRecovery) {
            std::error_code ec;
            std::filesystem::remove(RecoveryPath(), ec);
            m_ownsRecovery = false;
        }
        m_recoveredText = text;
        return true;
    }
    if (text == m_recoveredText && m_ownsRecovery) {
        return true;
    }
    if (!Port::WriteFileSafely(RecoveryPath(), text, error, {m_designPath, m_pcfPath})) {
        return false;
    }
    m_recoveredText = text;
    m_ownsRecovery = true;
    return true;
}

bool PlanSession::LoadRecovery(std::string& error) {
    std::string text;
    PcfFile recovered;
    if (!Port::ReadRegularFile(RecoveryPath(), text, error) ||
        !recovered.Parse(text, RecoveryPath(), error)) {
        return false;
    }
    // Lines keep the constraint file's name in messages: that is where they will go.
    PcfFile renamed;
    if (!renamed.Parse(text, m_pcfPath, error)) {
        return false;
    }
    m_undo.push_back(Diff(m_pcf, renamed));
    m_redo.clear();
    auto problems = CheckPins(*m_db, *m_design, m_designPath, renamed, false);
    Adopt(std::move(renamed), std::move(problems));
    m_recoveredText = m_text;
    m_ownsRecovery = true;
    return true;
}

} // namespace VnTool
