//===-- Port/SearchPath.h - colon-separated lists of folders --------------------===//
//
// \file
// VENLOMER_COMPONENT_PATH, VENLOMER_DATA_PATH and their like are read the one way PATH
// is: folders separated by colons, searched in order.
//
//   for (const std::string& folder : Port::SearchPathFromEnv("VENLOMER_DATA_PATH")) { ... }
//
//===------------------------------------------------------------------------------===//
#pragma once

#include <cstdlib>
#include <string>
#include <string_view>
#include <vector>

namespace Port {

/// The folders of a colon-separated list, in order. Empty elements (a leading, trailing
/// or doubled colon) are left out: readers disagree on what one means, the current
/// folder or the filesystem root, and a search should look in neither by accident.
inline std::vector<std::string> SplitSearchPath(std::string_view list) {
    std::vector<std::string> folders;
    while (!list.empty()) {
        const std::size_t colon = list.find(':');
        const std::string_view folder = list.substr(0, colon);
        if (!folder.empty()) {
            folders.emplace_back(folder);
        }
        list = colon == std::string_view::npos ? std::string_view() : list.substr(colon + 1);
    }
    return folders;
}

/// The folders of the search path in the environment variable `name`; none when it is
/// unset or empty.
inline std::vector<std::string> SearchPathFromEnv(const char* name) {
    const char* value = std::getenv(name);
    return value != nullptr ? SplitSearchPath(value) : std::vector<std::string>();
}

} // namespace Port
