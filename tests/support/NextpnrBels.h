//===-- tests/support/NextpnrBels.h - plans compared with where nextpnr put them ---===//
//
// \file
// The toolchain judges read nextpnr-ice40's log for the bel it constrained each port to,
// and compare that with the IO block a plan's pin is on in the chip database.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "ChipDb.h"

#include <map>
#include <regex>
#include <string>

namespace VnTest {

/// Port -> bel, from the "constrained 'P' to bel 'B'" lines of nextpnr-ice40's log.
inline std::map<std::string, std::string> ConstrainedBels(const std::string& log) {
    static const std::regex kConstrained("constrained '([^']+)' to bel '([^']+)'");
    std::map<std::string, std::string> bels;
    for (std::sregex_iterator it(log.begin(), log.end(), kConstrained), end; it != end; ++it) {
        bels[(*it)[1]] = (*it)[2];
    }
    return bels;
}

/// Port -> bel that a plan of (port, pin name) pairs asks for, named as nextpnr-ice40
/// names an IO block ("X0/Y8/io1"); a pin the chip database lacks is left out.
template <class Plan>
std::map<std::string, std::string> PlannedBels(const VnTool::ChipDb& db, const Plan& plan) {
    std::map<std::string, std::string> bels;
    for (const auto& [port, pinName] : plan) {
        for (const auto& pin : db.pins) {
            if (pin.name == pinName) {
                bels[port] = "X" + std::to_string(pin.x) + "/Y" + std::to_string(pin.y) + "/io" +
                             std::to_string(pin.pio);
            }
        }
    }
    return bels;
}

} // namespace VnTest
