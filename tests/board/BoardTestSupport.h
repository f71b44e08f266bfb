//===-- tests/board/BoardTestSupport.h - what the board tests share ---------===//
#pragma once

#include "ChipDb.h"
#include "YosysPorts.h"

#include <gtest/gtest.h>

#include <fstream>
#include <sstream>
#include <string>

namespace BoardTest {

inline std::string DataFile(const std::string& name) {
    return std::string(VENLOMER_BOARD_DATA) + "/" + name;
}

inline std::string ReadText(const std::string& path) {
    std::ifstream in(path, std::ios::binary);
    std::ostringstream text;
    text << in.rdbuf();
    return text.str();
}

// The 1k device's tq144 package, read once per program.
inline const VnTool::ChipDb& OneK() {
    static const VnTool::ChipDb db = [] {
        VnTool::ChipDb out;
        std::string error;
        if (!VnTool::ReadChipDbFile(std::string(VENLOMER_SYSTEM_CHIPDB_DIR) + "/chipdb-1k.txt",
                                    "tq144", out, error)) {
            ADD_FAILURE() << error << " (scripts/bootstrap installs fpga-icestorm-chipdb)";
        }
        return out;
    }();
    return db;
}

// A design of the ports named, as yosys names them: "led[2]" is bit 2 of a 4-bit bus.
inline VnTool::Design DesignOf(std::initializer_list<const char*> names) {
    VnTool::Design design;
    design.top = "top";
    for (const char* name : names) {
        VnTool::DesignPort port;
        port.name = name;
        std::string text = name;
        auto open = text.find('[');
        port.bus = text.substr(0, open);
        if (open != std::string::npos) {
            port.bit = std::stoi(text.substr(open + 1));
            port.width = 4;
        }
        port.direction = VnTool::PortDirection::Output;
        design.ports.push_back(port);
    }
    return design;
}

} // namespace BoardTest
