//===-- tools/commands/SearchArgs.cpp - the search options of the device commands ---===//
#include "Commands.h"

#include "CompareFlags.h"

#include <optional>

namespace VnTool {

namespace {

bool ParseFlags(const std::string& list, int& flags, std::string& error) {
    flags = 0;
    std::size_t start = 0;
    while (start <= list.size()) {
        std::size_t end = list.find_first_of(",|+", start);
        if (end == std::string::npos) {
            end = list.size();
        }
        std::string word = list.substr(start, end - start);
        const std::optional<int> bit = CompareFlagNamed(word);
        if (!bit) {
            error = "unknown compare flag \"" + word + "\"; use " + CompareFlagWords();
            return false;
        }
        flags |= *bit;
        start = end + 1;
    }
    return true;
}

} // namespace

std::vector<OptionSyntax> SearchOptionSyntax() {
    return {
        {"--find", "NAME=VALUE", "search the banks and pins for a property value"},
        {"--flags", "LIST", "compare flags of the search, comma separated"},
    };
}

int ParseSearchArgs(const std::string& command, const ParsedArgs& args, SearchRequest& request) {
    std::string error;
    if (args.Has("--flags") && !ParseFlags(args.Value("--flags"), request.flags, error)) {
        return UsageError(command, error);
    }
    if (args.Has("--find")) {
        std::string find = args.Value("--find");
        auto eq = find.find('=');
        if (eq == std::string::npos || eq == 0) {
            return UsageError(command, "--find wants NAME=VALUE, got \"" + find + "\"");
        }
        request.active = true;
        request.name = find.substr(0, eq);
        request.value = find.substr(eq + 1);
    } else if (args.Has("--flags")) {
        return UsageError(command, "--flags needs --find");
    }
    return kExitOk;
}

int MakeWantedOrUsage(const std::string& command, const SearchRequest& request,
                      const std::vector<SearchKind>& kinds, const std::string& who,
                      const std::string& known, CommonI::RefCountPtr<VnI::IProperty>& wanted) {
    std::string error;
    if (!MakeWanted(request, kinds, who, known, wanted, error)) {
        return UsageError(command, error);
    }
    return kExitOk;
}

} // namespace VnTool
