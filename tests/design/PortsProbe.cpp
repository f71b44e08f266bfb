//===-- tests/design/PortsProbe.cpp - the memory test's child: reads ports, nothing else -===//
//
// The memory test runs this in a child so that the child's peak resident size is the
// reader's own. Prints "<ports> <clock ports>" or the reader's error.
//
//===------------------------------------------------------------------------------===//
#include "YosysPorts.h"

#include <cstdio>
#include <string>

int main(int argc, char** argv) {
    if (argc != 2) {
        std::fprintf(stderr, "usage: %s NETLIST.json\n", argv[0]);
        return 2;
    }
    VnTool::Design design;
    std::string error;
    if (!VnTool::ReadYosysPortsFile(argv[1], design, error)) {
        std::fprintf(stderr, "%s\n", error.c_str());
        return 1;
    }
    int clocks = 0;
    for (const auto& port : design.ports) {
        clocks += port.clock ? 1 : 0;
    }
    std::printf("%zu %d\n", design.ports.size(), clocks);
    return 0;
}
