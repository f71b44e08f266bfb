//===-- sample/ProjectDescription.cpp - reading a project description ----------===//
#include "Port/UnitStartup.h"

#include "ProjectDescription.h"

#include <algorithm>
#include <array>
#include <cstdint>
#include <functional>
#include <istream>
#include <optional>
#include <unordered_set>
#include <utility>

namespace SampleHost {

namespace {

constexpr std::array<std::string_view, static_cast<std::size_t>(Fail::Count)> kStepNames = {
    "task-helper",
    "context-status",
    "context",
    "project-manager",
    "current-project",
    "iproject",
    "project-helper",
    "project-helper-interface",
    "project-reference",
    "view-network-help",
    "default-view-network",
    "default-view",
    "design-units",
    "binding-set",
    "binding-iterator",
    "binding-views",
    "views-iterator"};

bool IsBlank(char c) {
    return c == ' ' || c == '\t' || c == '\r';
}

// Splits one line into words; false with a reason on an unterminated quote or a quote
// glued to a bare word (which would make the word boundary a guess).
bool SplitWords(std::string_view line, std::vector<std::string>& words, std::string& why) {
    words.clear();
    std::size_t i = 0;
    while (true) {
        while (i < line.size() && IsBlank(line[i])) {
            ++i;
        }
        if (i == line.size()) {
            return true;
        }
        std::string word;
        if (line[i] == '"') {
            ++i;
            bool closed = false;
            while (i < line.size()) {
                const char c = line[i++];
                if (c == '"') {
                    closed = true;
                    break;
                }
                if (c == '\\' && i < line.size() && (line[i] == '"' || line[i] == '\\')) {
                    word.push_back(line[i++]);
                } else {
                    word.push_back(c);
                }
            }
            if (!closed) {
                why = "unterminated quoted word";
                return false;
            }
            if (i < line.size() && !IsBlank(line[i])) {
                why = "a quoted word must be followed by a blank";
                return false;
            }
        } else {
            while (i < line.size() && !IsBlank(line[i])) {
                if (line[i] == '"') {
                    why = "a quote inside a bare word";
                    return false;
                }
                word.push_back(line[i++]);
            }
        }
        words.push_back(std::move(word));
    }
}

// The views by name: positions in the description's own list, so that a name is held
// once. A node-based map would cost more than the view records themselves for a file of
// short view lines.
class ViewIndex {
public:
    static constexpr std::size_t kNone = static_cast<std::size_t>(-1);

    explicit ViewIndex(const std::vector<ViewDesc>& views) : m_views(views) {}

    std::size_t Find(std::string_view name) const {
        if (m_slots.empty()) {
            return kNone;
        }
        for (std::size_t slot = Hash(name) & Mask();; slot = (slot + 1) & Mask()) {
            const std::uint32_t entry = m_slots[slot];
            if (entry == 0) {
                return kNone;
            }
            if (m_views[entry - 1].name == name) {
                return entry - 1;
            }
        }
    }

    /// Adds the view at `index`, whose name is not in the index yet.
    void Add(std::size_t index) {
        if ((m_count + 1) * 2 > m_slots.size()) {
            Grow();
        }
        Place(index);
        ++m_count;
    }

private:
    static std::size_t Hash(std::string_view name) { return std::hash<std::string_view>{}(name); }
    std::size_t Mask() const { return m_slots.size() - 1; }

    void Place(std::size_t index) {
        std::size_t slot = Hash(m_views[index].name) & Mask();
        while (m_slots[slot] != 0) {
            slot = (slot + 1) & Mask();
        }
        m_slots[slot] = static_cast<std::uint32_t>(index + 1);
    }

    void Grow() {
        m_slots.assign(std::max<std::size_t>(16, m_slots.size() * 2), 0);
        for (std::size_t i = 0; i < m_count; ++i) {
            Place(i);
        }
    }

    const std::vector<ViewDesc>& m_views;
    std::vector<std::uint32_t> m_slots; // view position + 1; 0 is a free slot
    std::size_t m_count = 0;
};

// A reference to a view by name, resolved once every view is known.
struct PendingName {
    int line;
    std::string name;
};

struct PendingUnit {
    PendingName view;
    UnitDesc unit;
};

struct PendingBinding {
    PendingName view;
    std::vector<PendingName> produced;
};

// The state of one reading: what is already known for sure goes into `out`; the view
// names met on the way wait in the pending lists until every view is declared.
class Reader {
public:
    Reader(Description& out, ParseError& error)
        : m_out(out), m_error(error), m_viewIndex(out.views) {}

    /// One line, without its line feed.
    bool ReadLine(std::string_view line);
    bool Resolve();

private:
    using Words = std::vector<std::string>;
    using Handler = bool (Reader::*)(const Words&);

    bool Fail(int line, std::string what) {
        m_error.line = line;
        m_error.what = std::move(what);
        return false;
    }
    bool Directive(const Words& words);

    // One per directive; each gets the whole line split into words (words[0] is the
    // directive itself) and reports its own errors at the current line.
    bool Project(const Words& words);
    bool View(const Words& words);
    bool Default(const Words& words);
    bool Unit(const Words& words);
    bool Binding(const Words& words);
    bool Counting(const Words& words);
    bool FailStep(const Words& words);

    static constexpr std::array<std::pair<std::string_view, Handler>, 7> kDirectives = {{
        {"project", &Reader::Project},
        {"view", &Reader::View},
        {"default", &Reader::Default},
        {"unit", &Reader::Unit},
        {"binding", &Reader::Binding},
        {"counting", &Reader::Counting},
        {"fail", &Reader::FailStep},
    }};

    std::size_t ResolveName(const PendingName& name);

    Description& m_out;
    ParseError& m_error;
    int m_line = 0;
    Words m_words; // kept between lines so that their buffers are reused
    std::string m_why;
    ViewIndex m_viewIndex;
    std::optional<PendingName> m_defaultView;
    // What names a view not declared when it was read; the views that have something
    // waiting take everything of that kind after it in the same way, so that the end keeps
    // the file's order.
    std::vector<PendingUnit> m_units;
    std::vector<PendingBinding> m_bindings;
    std::unordered_set<std::string> m_waitingUnits;
    std::unordered_set<std::string> m_waitingBindings;
    std::optional<PendingName> m_unknown; // the first name that resolved to no view
};

bool Reader::ReadLine(std::string_view line) {
    ++m_line;
    const std::size_t first = line.find_first_not_of(" \t\r");
    if (first == std::string_view::npos || line[first] == '#') {
        return true;
    }
    if (!SplitWords(line, m_words, m_why)) {
        return Fail(m_line, m_why);
    }
    return Directive(m_words);
}

bool Reader::Directive(const Words& words) {
    for (const auto& [name, handler] : kDirectives) {
        if (name == words[0]) {
            return (this->*handler)(words);
        }
    }
    return Fail(m_line, "unknown directive '" + words[0] + "'");
}

bool Reader::Project(const Words& words) {
    if (words.size() != 2) {
        return Fail(m_line, "project takes one file name (\"\" for an empty one)");
    }
    if (m_out.hasProject) {
        return Fail(m_line, "a second project line");
    }
    m_out.hasProject = true;
    m_out.projectFile = words[1];
    return true;
}

bool Reader::View(const Words& words) {
    const std::size_t args = words.size() - 1;
    if (args < 1 || args > 3 || (args == 3 && words[3] != "second")) {
        return Fail(m_line, "view takes a name, an optional type and `second`");
    }
    if (m_viewIndex.Find(words[1]) != ViewIndex::kNone) {
        return Fail(m_line, "view '" + words[1] + "' declared twice");
    }
    ViewDesc view;
    view.name = words[1];
    view.hasType = args >= 2;
    view.typeId = args >= 2 ? words[2] : std::string();
    view.secondIdentity = args == 3;
    m_out.views.push_back(std::move(view));
    m_viewIndex.Add(m_out.views.size() - 1);
    return true;
}

bool Reader::Default(const Words& words) {
    if (words.size() != 2) {
        return Fail(m_line, "default takes one view name");
    }
    if (m_defaultView) {
        return Fail(m_line, "a second default line");
    }
    m_defaultView = PendingName{m_line, words[1]};
    return true;
}

bool Reader::Unit(const Words& words) {
    if (words.size() < 5) {
        return Fail(m_line, "unit takes a view, a type, a directory and a file");
    }
    PendingUnit pending{{m_line, words[1]}, {}};
    UnitDesc& unit = pending.unit;
    unit.hasType = words[2] != "-";
    unit.typeId = unit.hasType ? words[2] : std::string();
    unit.directory = words[3];
    unit.file = words[4];
    for (std::size_t i = 5; i < words.size(); ++i) {
        if (words[i] == "no-id") {
            unit.answersId = false;
        } else if (words[i] == "no-file-access") {
            unit.fileAccess = false;
        } else if (words[i] == "no-file") {
            unit.hdlFile = false;
        } else {
            return Fail(m_line, "unknown unit option '" + words[i] + "'");
        }
    }
    // A view known by now, with nothing of its own waiting, takes the unit at once: only
    // what names a view further down waits for the end, in file order.
    const std::size_t view = m_viewIndex.Find(words[1]);
    if (view != ViewIndex::kNone && !m_waitingUnits.contains(words[1])) {
        m_out.views[view].units.push_back(std::move(pending.unit));
        return true;
    }
    m_waitingUnits.insert(words[1]);
    m_units.push_back(std::move(pending));
    return true;
}

bool Reader::Binding(const Words& words) {
    if (words.size() < 2) {
        return Fail(m_line, "binding takes a view and the views it produces");
    }
    PendingBinding pending{{m_line, words[1]}, {}};
    for (std::size_t i = 2; i < words.size(); ++i) {
        pending.produced.push_back({m_line, words[i]});
    }
    const std::size_t view = m_viewIndex.Find(words[1]);
    if (view != ViewIndex::kNone && !m_waitingBindings.contains(words[1])) {
        std::vector<std::size_t> produced;
        produced.reserve(pending.produced.size());
        for (const PendingName& name : pending.produced) {
            const std::size_t index = m_viewIndex.Find(name.name);
            if (index == ViewIndex::kNone) {
                break;
            }
            produced.push_back(index);
        }
        if (produced.size() == pending.produced.size()) {
            m_out.views[view].bindings.push_back(std::move(produced));
            return true;
        }
    }
    m_waitingBindings.insert(words[1]);
    m_bindings.push_back(std::move(pending));
    return true;
}

bool Reader::Counting(const Words& words) {
    if (words.size() != 2 || (words[1] != "prjrep" && words[1] != "common")) {
        return Fail(m_line, "counting takes prjrep or common");
    }
    m_out.commonCounting = words[1] == "common";
    return true;
}

bool Reader::FailStep(const Words& words) {
    if (words.size() != 2) {
        return Fail(m_line, "fail takes one step name");
    }
    const auto step = std::find(kStepNames.begin(), kStepNames.end(), words[1]);
    if (step == kStepNames.end()) {
        return Fail(m_line, "unknown step '" + words[1] + "'");
    }
    m_out.failures |= 1u << static_cast<unsigned>(step - kStepNames.begin());
    return true;
}

std::size_t Reader::ResolveName(const PendingName& name) {
    const std::size_t found = m_viewIndex.Find(name.name);
    if (found != ViewIndex::kNone) {
        return found;
    }
    if (!m_unknown || name.line < m_unknown->line) {
        m_unknown = name;
    }
    return 0;
}

// Names are resolved after the whole file is read, so that a view may be used above its
// declaration; the error reported is still the one of the first bad line.
bool Reader::Resolve() {
    if (m_defaultView) {
        m_out.defaultView = ResolveName(*m_defaultView);
        m_out.hasDefault = true;
    }
    std::vector<std::size_t> unitViews;
    unitViews.reserve(m_units.size());
    for (const PendingUnit& pending : m_units) {
        unitViews.push_back(ResolveName(pending.view));
    }
    std::vector<std::pair<std::size_t, std::vector<std::size_t>>> bindingViews;
    bindingViews.reserve(m_bindings.size());
    for (const PendingBinding& pending : m_bindings) {
        std::vector<std::size_t> produced;
        for (const PendingName& name : pending.produced) {
            produced.push_back(ResolveName(name));
        }
        bindingViews.emplace_back(ResolveName(pending.view), std::move(produced));
    }
    if (m_unknown) {
        return Fail(m_unknown->line, "no view named '" + m_unknown->name + "'");
    }
    for (std::size_t i = 0; i < m_units.size(); ++i) {
        m_out.views[unitViews[i]].units.push_back(std::move(m_units[i].unit));
    }
    for (auto& [view, produced] : bindingViews) {
        m_out.views[view].bindings.push_back(std::move(produced));
    }
    return true;
}

} // namespace

bool ParseDescription(std::string_view text, Description& out, ParseError& error) {
    out = Description{};
    Reader reader(out, error);
    std::size_t pos = 0;
    while (pos < text.size()) {
        const std::size_t end = std::min(text.find('\n', pos), text.size());
        if (!reader.ReadLine(text.substr(pos, end - pos))) {
            return false;
        }
        pos = end + 1;
    }
    return reader.Resolve();
}

bool ParseDescription(std::istream& in, Description& out, ParseError& error) {
    out = Description{};
    Reader reader(out, error);
    std::string line;
    while (std::getline(in, line)) {
        if (!reader.ReadLine(line)) {
            return false;
        }
    }
    return reader.Resolve();
}

} // namespace SampleHost
