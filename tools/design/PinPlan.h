//===-- tools/design/PinPlan.h - checks and automatic assignment of pins ---===//
//
// \file
// Judges a design's ports against a constraint file on one package of a device, the
// way nextpnr-ice40 would (and a little stricter where a slip is cheap to catch), and
// fills in free pins for the ports the file leaves out.
//
//   auto problems = VnTool::CheckPins(db, design, "top.json", pcf, false);
//   VnTool::AutoAssign(db, design, pcf);   // then write pcf.Text()
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "ChipDb.h"
#include "Pcf.h"
#include "YosysPorts.h"

#include <cstddef>
#include <string>
#include <utility>
#include <vector>

namespace VnTool {

struct PinProblem {
    enum class Severity { Warning, Error };
    Severity severity = Severity::Error;
    std::string port;    ///< the port it concerns, or empty
    std::string pin;     ///< the pin it concerns, or empty
    std::string message; ///< one line: "top.pcf:3: error: ..."
};

/// How a constraint file is read.
struct CheckOptions {
    /// The board file's reading: every line must name a port of the design (unless it says
    /// -nowarn), its pin must be in the package, and no two lines may share a pin. Without
    /// it, lines are read as nextpnr-ice40 reads them: a line for a port the design lacks is
    /// a warning (none with -nowarn or --warn-no-port) and its pin is not held against the
    /// design's ports.
    bool strict = false;
    /// A design port without a pin is a warning, as nextpnr-ice40's
    /// --pcf-allow-unconstrained makes it; else an error, as nextpnr refuses it.
    bool allowUnconstrained = false;
};

/// What a check counted besides its problems.
struct CheckSummary {
    std::size_t absentLines = 0;  ///< set_io lines for ports the design lacks
    std::size_t keptSilently = 0; ///< of those, the ones that say -nowarn or --warn-no-port
};

/// Every problem of the plan: the errors, then the warnings, each in file order and then
/// the design's ports in design order. `designSource` names the netlist in messages about
/// ports without a constraint line. Takes time in proportion to the lines and ports.
std::vector<PinProblem> CheckPins(const ChipDb& db, const Design& design,
                                  const std::string& designSource, const PcfFile& pcf,
                                  const CheckOptions& options, CheckSummary* summary = nullptr);

/// The reading the editor has always had: with `strict`, CheckOptions::strict; without it,
/// the toolchain's reading with unconstrained ports allowed, since a plan being edited
/// has ports still to place.
std::vector<PinProblem> CheckPins(const ChipDb& db, const Design& design,
                                  const std::string& designSource, const PcfFile& pcf, bool strict);

/// Whether any of `problems` is an error.
bool HasErrors(const std::vector<PinProblem>& problems);

/// The package's pins in the order people count them: "2" before "10", "A2" before
/// "A10", then "B1".
std::vector<const Pin*> PinsInOrder(const ChipDb& db);

/// Gives every design port without a set_io line a free pin and records it in `pcf`:
/// clock ports first, on global-buffer pins; then each bus's bits together in one bank,
/// in pin order, when a bank has room for all of them; then every other port on the first
/// free pin, keeping global-buffer pins for last. A pin is free when no line of `pcf`
/// names it: on a board, a line for a port the design lacks still says what is wired
/// there. Returns the (port, pin) pairs given, in order; ports for which no pin was left
/// are not in it.
std::vector<std::pair<std::string, std::string>> AutoAssign(const ChipDb& db, const Design& design,
                                                            PcfFile& pcf);

} // namespace VnTool
