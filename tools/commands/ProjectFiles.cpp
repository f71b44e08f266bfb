//===-- tools/commands/ProjectFiles.cpp - venlomer project-files ----------===//
//
// Asks the host's project manager, as the editor does when it opens, for the project
// file, the constraints file and the netlist database. Without the host, the sample host
// component serves the project described by the file in VENLOMER_PROJECT.
//
//===------------------------------------------------------------------------------===//
#include "Commands.h"

#include "s/ProjFileHelper.h"

#include <cstdio>
#include <cstdlib>

namespace VnTool {

namespace {

const char kCommand[] = "project-files";

int Run(const ParsedArgs& args) {
    if (args.Has("--project")) {
        // The sample host reads its description from the environment, as the real host
        // takes its project from its own session.
        setenv("VENLOMER_PROJECT", args.Value("--project").c_str(), 1);
    }
    const char* description = std::getenv("VENLOMER_PROJECT");
    Port::StringBase<char> project, ngd, ucf;
    bool found = Vn::Eng::ProjFileHelper::GetFilesFromHost(project, ngd, ucf);
    std::printf("Project file:     %s\n", project.c_str());
    std::printf("Constraints file: %s\n", ucf.c_str());
    std::printf("Netlist database: %s\n", ngd.c_str());
    if (!found) {
        std::string why = description == nullptr || *description == '\0'
                              ? "no project open: set VENLOMER_PROJECT or use --project FILE"
                              : "the host did not give every file (--verbose shows the "
                                "lookup's steps)";
        return Refused(kCommand, why);
    }
    return kExitOk;
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
         "Without the host, the sample host component serves the project described in\n"
         "FILE; its format is documented in platform/hostproj/include/hostproj/SampleHost.h.\n"},
        Run};
    return command;
}

} // namespace VnTool
