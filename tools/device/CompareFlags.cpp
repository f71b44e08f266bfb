//===-- tools/device/CompareFlags.cpp - the compare flags by name ---------===//
#include "CompareFlags.h"

#include "VnI/PropertyType.h"

namespace VnTool {

const std::vector<CompareFlagWord>& CompareFlagTable() {
    static const std::vector<CompareFlagWord> table = {
        {"exact", VnI::MATCH_EXACT},
        {"ignore-case", VnI::MATCH_IGNORE_CASE},
        {"substring", VnI::MATCH_SUBSTRING},
        {"within-5-percent", VnI::MATCH_WITHIN_5_PERCENT},
        {"less", VnI::MATCH_LESS},
        {"greater", VnI::MATCH_GREATER},
        {"any", VnI::MATCH_ANY},
        {"regexp", VnI::MATCH_REGEXP},
    };
    return table;
}

std::optional<int> CompareFlagNamed(std::string_view word) {
    for (const auto& flag : CompareFlagTable()) {
        if (word == flag.word) {
            return flag.bit;
        }
    }
    return std::nullopt;
}

std::string CompareFlagsText(int flags) {
    std::string text;
    for (const auto& flag : CompareFlagTable()) {
        if ((flags & flag.bit) != 0) {
            text += text.empty() ? "" : ",";
            text += flag.word;
        }
    }
    return text.empty() ? "exact" : text;
}

std::string CompareFlagWords() {
    std::string words;
    for (const auto& flag : CompareFlagTable()) {
        words += words.empty() ? "" : ", ";
        words += flag.word;
    }
    return words;
}

} // namespace VnTool
