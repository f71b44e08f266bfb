//===-- tools/Netlist.cpp - venlomer ngc-stub, ngc-new and ngd-sample -----------===//
#include "Commands.h"

namespace VnTool {

namespace {

int RunStub(const ParsedArgs& /*args*/) {
    return NotAvailable("ngc-stub", "netlist stubs");
}
int RunNew(const ParsedArgs& /*args*/) {
    return NotAvailable("ngc-new", "netlist stubs");
}
int RunSample(const ParsedArgs& /*args*/) {
    return NotAvailable("ngd-sample", "design-model library");
}

} // namespace

const Command& NgcStubCommand() {
    static const Command command{{"ngc-stub",
                                  "NGD NGC",
                                  "create a stub netlist database NGC from the netlist NGD",
                                  {},
                                  2,
                                  2,
                                  ""},
                                 RunStub};
    return command;
}

const Command& NgcNewCommand() {
    static const Command command{{"ngc-new",
                                  "NGC DESIGN PART BLOCK",
                                  "create a stub netlist database NGC from four names",
                                  {},
                                  4,
                                  4,
                                  ""},
                                 RunNew};
    return command;
}

const Command& NgdSampleCommand() {
    static const Command command{
        {"ngd-sample", "OUT", "write a small valid NGD file to try ngc-stub on", {}, 1, 1, ""},
        RunSample};
    return command;
}

} // namespace VnTool
