//===-- tools/ProjectFiles.cpp - venlomer project-files -------------------------===//
#include "Commands.h"

namespace VnTool {

namespace {

const char kCommand[] = "project-files";

int Run(const ParsedArgs& /*args*/) {
    return NotAvailable(kCommand, "project file lookup");
}

} // namespace

const Command& ProjectFilesCommand() {
    static const Command command{
        {kCommand,
         "",
         "ask the host's project manager for the open project's files",
         {{"--project", "FILE", "project description (default: $VENLOMER_PROJECT)"}},
         0,
         0,
         ""},
        Run};
    return command;
}

} // namespace VnTool
