//===-- fuzz/fuzz_board.cpp - a board's KiCad files read from any input ---------===//
//
// Netlists and board files come from other people's machines; whatever they hold, the
// readers must answer with a board or a reason naming the input, and the net-name rules
// must take any name a file can carry.
//
//===------------------------------------------------------------------------------===//
#include "BoardFiles.h"
#include "NetMatch.h"

#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <string>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    std::string text(reinterpret_cast<const char*>(data), size);
    VnTool::Board board;
    std::string error;
    if (!VnTool::ReadBoard(text, "fuzz", board, error)) {
        if (error.rfind("fuzz:", 0) != 0) {
            std::abort(); // every refusal names its input and line
        }
        return 0;
    }
    for (const VnTool::BoardPart& part : board.parts) {
        for (const VnTool::NetOnPin& pin : VnTool::NetsOnPins(part)) {
            for (const VnTool::NetName& name : VnTool::ReadNetName(pin.net)) {
                // A name to match by is never empty, and a mark only ever shortens it.
                if (name.plain.empty() || name.stem.size() > name.plain.size()) {
                    std::abort();
                }
            }
        }
    }
    return 0;
}
