//===-- tools/Colors.cpp - venlomer colors: the colour scheme the library loaded -===//
#include "Commands.h"

namespace VnTool {

namespace {

const char kCommand[] = "colors";

int Run(const ParsedArgs& /*args*/) {
    return NotAvailable(kCommand, "colour manager");
}

} // namespace

const Command& ColorsCommand() {
    static const Command command{
        {kCommand,
         "",
         "print the colour scheme the library loaded and draw it as swatches",
         {{"--svg", "OUT", "also draw the scheme as swatches into OUT"}},
         0,
         0,
         ""},
        Run};
    return command;
}

} // namespace VnTool
