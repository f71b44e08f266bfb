//===-- tools/render/DeviceSearch.cpp - search, select and print a device model's holders ---===//
#include "DeviceSearch.h"

#include "CompareFlags.h"
#include "PropertyText.h"

#include "VnI/IDeviceResource.h"
#include "VnI/ITreeNode.h"
#include "VnI/PropertyType.h"
#include "s/FindItr.h"
#include "s/PropertyHolderItr.h"

#include <algorithm>
#include <cstdio>
#include <list>

namespace VnTool {

namespace {

template <class T> using Ptr = CommonI::RefCountPtr<T>;

int CountChildren(const Ptr<VnI::ITreeNode>& node) {
    int count = 0;
    for (auto it = node->GetChildren(); !it->IsEnd(); it->Next()) {
        ++count;
    }
    return count;
}

std::vector<std::string> ColumnNames(VnI::IPropertyNameList* names) {
    std::vector<std::string> columns;
    columns.reserve(static_cast<std::size_t>(std::max(0, names->GetNumNames())));
    for (int i = 0; i < names->GetNumNames(); ++i) {
        columns.push_back(names->GetPropertyName(i)->GetName().str());
    }
    return columns;
}

} // namespace

std::string FlagsText(int flags) {
    return CompareFlagsText(flags);
}

bool MakeWanted(const SearchRequest& request, const std::vector<SearchKind>& kinds,
                const std::string& who, const std::string& known, Ptr<VnI::IProperty>& wanted,
                std::string& error) {
    Port::StringBase<char> name(request.name.c_str());
    for (const SearchKind& kind : kinds) {
        if (int position = kind.names->Contains(name); position >= 0) {
            wanted = TypedValue(kind.names->GetPropertyName(position)->GetType(), request.name,
                                request.value, error);
            return static_cast<bool>(wanted);
        }
    }
    error = who + " have no property \"" + request.name + "\"; they have " + known;
    return false;
}

// Read back through the model, as a tree view would fill itself.
void PrintTree(DeviceModel& model) {
    auto root = model.Tree()->GetRootNode();
    std::string line = "Tree: " + root->GetDataRef()->GetName().str() + " >";
    bool first = true;
    for (auto it = root->GetChildren(); !it->IsEnd(); it->Next()) {
        auto child = it->CurrentItem();
        VnI::IPropertyHolder* holder = child->GetDataRef();
        int count = CountChildren(child);
        std::string name = holder != nullptr ? holder->GetName().str() : "Tiles";
        line += std::string(first ? " " : ", ") + name + " (" + std::to_string(count) +
                (holder != nullptr ? " pins)" : ")");
        first = false;
    }
    std::printf("%s\n", line.c_str());
}

void PrintTable(const std::vector<std::string>& columns,
                const std::vector<std::vector<std::string>>& rows) {
    std::vector<std::size_t> widths(columns.size());
    for (std::size_t c = 0; c < columns.size(); ++c) {
        widths[c] = columns[c].size();
        for (const auto& row : rows) {
            widths[c] = std::max(widths[c], row[c].size());
        }
    }
    auto printRow = [&](const std::vector<std::string>& cells) {
        std::string line = " ";
        for (std::size_t c = 0; c < cells.size(); ++c) {
            line += " " + cells[c];
            if (c + 1 < cells.size()) {
                line += std::string(widths[c] - cells[c].size(), ' ') + " ";
            }
        }
        std::printf("%s\n", line.c_str());
    };
    printRow(columns);
    for (const auto& row : rows) {
        printRow(row);
    }
}

std::vector<VnI::IPropertyHolder*>
SearchAndPrint(const SearchRequest& request, const Ptr<VnI::IProperty>& wanted,
               const std::vector<VnI::IPropertyHolder*>& candidates,
               const std::vector<SearchKind>& kinds, const std::string& over) {
    std::list<VnI::IPropertyHolder*> list(candidates.begin(), candidates.end());
    auto found = Vn::Eng::FindItr::CreateInstance(Vn::Eng::PropertyHolderItr::CreateInstance(&list),
                                                  Port::StringBase<char>(request.name.c_str()),
                                                  wanted, request.flags);
    std::vector<VnI::IPropertyHolder*> matches;
    for (; !found->IsEnd(); found->Next()) {
        matches.push_back(found->CurrentItem());
    }
    std::printf("Search: %s = \"%s\" (%s) over %s: %zu %s\n", request.name.c_str(),
                request.value.c_str(), FlagsText(request.flags).c_str(), over.c_str(),
                matches.size(), matches.size() == 1 ? "match" : "matches");
    // One table per kind among the matches, in the order the kinds first match.
    std::vector<VnI::IPropertyNameList*> seen;
    for (auto* holder : matches) {
        VnI::IPropertyNameList* kind = holder->GetPropertyNames();
        if (std::find(seen.begin(), seen.end(), kind) != seen.end()) {
            continue;
        }
        seen.push_back(kind);
        std::string title = "Matches";
        for (const SearchKind& known : kinds) {
            if (known.names == kind) {
                title = known.title;
            }
        }
        std::printf("%s:\n", title.c_str());
        std::vector<std::string> columns = ColumnNames(kind);
        std::vector<std::vector<std::string>> rows;
        for (auto* match : matches) {
            if (match->GetPropertyNames() != kind) {
                continue;
            }
            std::vector<std::string> row;
            row.reserve(columns.size());
            for (const auto& column : columns) {
                row.push_back(PropertyText(match->GetPropertyByName(column.c_str())));
            }
            rows.push_back(std::move(row));
        }
        PrintTable(columns, rows);
    }
    return matches;
}

void SelectAndHighlight(DeviceModel& model, const std::vector<VnI::IPropertyHolder*>& matches) {
    for (auto* holder : matches) {
        model.Selection().AddSelectedItem(holder, true);
    }
    int selected = 0;
    int highlighted = 0;
    for (auto it = model.Selection().GetAllSelectedItems(); !it->IsEnd(); it->Next()) {
        VnI::IPropertyHolder* holder = it->CurrentItem();
        ++selected;
        if (holder->GetPropertyNames() == model.PinNames()) {
            // Resources are not counted: the plain interface pointer is all there is.
            model.Highlight().AddHighlightedItem(static_cast<VnI::IDeviceResource*>(
                holder->GetInterface(VnI::IDeviceResource::kIID)));
            ++highlighted;
        }
    }
    std::printf("Selected: %d resources (category %d, pins below matched banks included)\n",
                selected, VnI::DEVICE_RESOURCE_HOLDER_TYPE);
    std::printf("Highlighted: %d pins\n", highlighted);
}

void SearchDevice(DeviceModel& model, const SearchRequest& request,
                  const Ptr<VnI::IProperty>& wanted) {
    std::vector<VnI::IPropertyHolder*> candidates(model.Banks().begin(), model.Banks().end());
    candidates.insert(candidates.end(), model.Pins().begin(), model.Pins().end());
    std::string over = std::to_string(model.Banks().size()) + " banks and " +
                       std::to_string(model.Pins().size()) + " pins";
    auto matches = SearchAndPrint(request, wanted, candidates,
                                  {{model.PinNames(), "Pins"}, {model.BankNames(), "Banks"}}, over);
    SelectAndHighlight(model, matches);
}

} // namespace VnTool
