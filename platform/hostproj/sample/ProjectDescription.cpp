//===-- sample/ProjectDescription.cpp - reading a project description ----------===//
#include "ProjectDescription.h"

#include <array>
#include <optional>
#include <unordered_map>

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

} // namespace

bool ParseDescription(std::string_view text, Description& out, ParseError& error) {
    out = Description{};
    std::unordered_map<std::string, std::size_t> viewIndex;
    std::optional<PendingName> defaultView;
    std::vector<PendingUnit> units;
    std::vector<PendingBinding> bindings;
    std::vector<std::string> words;
    std::string why;

    auto fail = [&error](int line, std::string what) {
        error.line = line;
        error.what = std::move(what);
        return false;
    };

    int lineNo = 0;
    std::size_t pos = 0;
    while (pos < text.size()) {
        const std::size_t end = std::min(text.find('\n', pos), text.size());
        const std::string_view line = text.substr(pos, end - pos);
        pos = end + 1;
        ++lineNo;

        const std::size_t first = line.find_first_not_of(" \t\r");
        if (first == std::string_view::npos || line[first] == '#') {
            continue;
        }
        if (!SplitWords(line, words, why)) {
            return fail(lineNo, why);
        }
        const std::string& directive = words[0];
        const std::size_t args = words.size() - 1;

        if (directive == "project") {
            if (args != 1) {
                return fail(lineNo, "project takes one file name (\"\" for an empty one)");
            }
            if (out.hasProject) {
                return fail(lineNo, "a second project line");
            }
            out.hasProject = true;
            out.projectFile = words[1];
        } else if (directive == "view") {
            if (args < 1 || args > 3 || (args == 3 && words[3] != "second")) {
                return fail(lineNo, "view takes a name, an optional type and `second`");
            }
            if (!viewIndex.emplace(words[1], out.views.size()).second) {
                return fail(lineNo, "view '" + words[1] + "' declared twice");
            }
            ViewDesc view;
            view.name = words[1];
            view.hasType = args >= 2;
            view.typeId = args >= 2 ? words[2] : std::string();
            view.secondIdentity = args == 3;
            out.views.push_back(std::move(view));
        } else if (directive == "default") {
            if (args != 1) {
                return fail(lineNo, "default takes one view name");
            }
            if (defaultView) {
                return fail(lineNo, "a second default line");
            }
            defaultView = PendingName{lineNo, words[1]};
        } else if (directive == "unit") {
            if (args < 4) {
                return fail(lineNo, "unit takes a view, a type, a directory and a file");
            }
            PendingUnit pending{{lineNo, words[1]}, {}};
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
                    return fail(lineNo, "unknown unit option '" + words[i] + "'");
                }
            }
            units.push_back(std::move(pending));
        } else if (directive == "binding") {
            if (args < 1) {
                return fail(lineNo, "binding takes a view and the views it produces");
            }
            PendingBinding pending{{lineNo, words[1]}, {}};
            for (std::size_t i = 2; i < words.size(); ++i) {
                pending.produced.push_back({lineNo, words[i]});
            }
            bindings.push_back(std::move(pending));
        } else if (directive == "counting") {
            if (args != 1 || (words[1] != "prjrep" && words[1] != "common")) {
                return fail(lineNo, "counting takes prjrep or common");
            }
            out.commonCounting = words[1] == "common";
        } else if (directive == "fail") {
            if (args != 1) {
                return fail(lineNo, "fail takes one step name");
            }
            std::size_t step = 0;
            while (step < kStepNames.size() && kStepNames[step] != words[1]) {
                ++step;
            }
            if (step == kStepNames.size()) {
                return fail(lineNo, "unknown step '" + words[1] + "'");
            }
            out.failures |= 1u << step;
        } else {
            return fail(lineNo, "unknown directive '" + directive + "'");
        }
    }

    // Names are resolved after the whole file is read, so that a view may be used above
    // its declaration; the error reported is still the one of the first bad line.
    std::optional<PendingName> unknown;
    auto resolve = [&](const PendingName& name) -> std::size_t {
        const auto found = viewIndex.find(name.name);
        if (found != viewIndex.end()) {
            return found->second;
        }
        if (!unknown || name.line < unknown->line) {
            unknown = name;
        }
        return 0;
    };
    if (defaultView) {
        out.defaultView = resolve(*defaultView);
        out.hasDefault = true;
    }
    std::vector<std::size_t> unitViews;
    for (const PendingUnit& pending : units) {
        unitViews.push_back(resolve(pending.view));
    }
    std::vector<std::pair<std::size_t, std::vector<std::size_t>>> bindingViews;
    for (const PendingBinding& pending : bindings) {
        std::vector<std::size_t> produced;
        for (const PendingName& name : pending.produced) {
            produced.push_back(resolve(name));
        }
        bindingViews.emplace_back(resolve(pending.view), std::move(produced));
    }
    if (unknown) {
        return fail(unknown->line, "no view named '" + unknown->name + "'");
    }
    for (std::size_t i = 0; i < units.size(); ++i) {
        out.views[unitViews[i]].units.push_back(std::move(units[i].unit));
    }
    for (auto& [view, produced] : bindingViews) {
        out.views[view].bindings.push_back(std::move(produced));
    }
    return true;
}

} // namespace SampleHost
