//===-- tools/device/CompareFlags.cpp - the compare flags by name ---------===//
#include "CompareFlags.h"

#include "VnI/PropertyType.h"

namespace VnTool {

namespace {

struct FlagName {
    const char* name;
    int bit;
};

const FlagName kFlagNames[] = {
    {"exact", VnI::MATCH_EXACT},
    {"ignore-case", VnI::MATCH_IGNORE_CASE},
    {"substring", VnI::MATCH_SUBSTRING},
    {"within-5-percent", VnI::MATCH_WITHIN_5_PERCENT},
    {"less", VnI::MATCH_LESS},
    {"greater", VnI::MATCH_GREATER},
    {"any", VnI::MATCH_ANY},
    {"regexp", VnI::MATCH_REGEXP},
};

} // namespace

std::optional<int> CompareFlagNamed(std::string_view word) {
    for (const auto& flag : kFlagNames) {
        if (word == flag.name) {
            return flag.bit;
        }
    }
    return std::nullopt;
}

std::string CompareFlagsText(int flags) {
    std::string text;
    for (const auto& flag : kFlagNames) {
        if ((flags & flag.bit) != 0) {
            text += (text.empty() ? "" : ",") + std::string(flag.name);
        }
    }
    return text.empty() ? "exact" : text;
}

const char* CompareFlagWords() {
    return "exact, ignore-case, substring, within-5-percent, less, greater, any, regexp";
}

} // namespace VnTool
