//===-- fuzz/fuzz_chipdb.cpp - the tool's chip-database reader on any input -----===//
//
// A chip database is a file the user points the tool at; whatever it holds, the reader
// must answer with a device or a reason, never crash, hang or read out of bounds.
//
//===------------------------------------------------------------------------------===//
#include "ChipDb.h"

#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <sstream>
#include <string>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    std::string text(reinterpret_cast<const char*>(data), size);
    for (const char* package : {"", "p"}) {
        std::istringstream in(text);
        VnTool::ChipDb db;
        std::string error;
        bool ok = VnTool::ReadChipDb(in, "fuzz", package, db, error);
        if (ok) {
            // What the floorplan relies on: every tile inside the grid, every pin on an
            // IO tile of an edge.
            for (const auto& tile : db.tiles) {
                if (tile.x < 0 || tile.y < 0 || tile.x >= db.width || tile.y >= db.height) {
                    std::abort();
                }
            }
            for (const auto& pin : db.pins) {
                if (pin.bank < 0 || pin.bank > 3) {
                    std::abort();
                }
            }
        } else if (error.rfind("fuzz", 0) != 0) {
            std::abort(); // every refusal names its input
        }
    }
    return 0;
}
