//===-- tools/commands/ViewArgs.cpp - which view of the device a picture shows ---===//
#include "Commands.h"

namespace VnTool {

std::vector<OptionSyntax> ViewOptionSyntax() {
    return {
        {"--view", "die|package", "the die's tiles (default) or the package's balls and pins"},
        {"--bottom", "", "the package seen from below, mirrored as on the board (--view package)"},
    };
}

int ParseViewArgs(const std::string& command, const ParsedArgs& args, DrawRequest& request) {
    const std::string view = args.Value("--view", "die");
    if (view == "package") {
        request.view = DrawRequest::View::Package;
    } else if (view != "die") {
        return UsageError(command, "--view is die or package, got \"" + view + "\"");
    }
    request.bottom = args.Has("--bottom");
    if (request.bottom && request.view != DrawRequest::View::Package) {
        return UsageError(command, "--bottom needs --view package");
    }
    return kExitOk;
}

} // namespace VnTool
