//===-- tools/board/PinCsv.h - the pin plan as a table, and tables read back ---===//
//
// \file
// Boards are reviewed in spreadsheets: the plan goes out as one CSV row per port (RFC
// 4180: comma separated, fields with a comma, quote or line end quoted, quotes doubled,
// CRLF line ends, a header row) and comes back either as the same table or as the
// two-column (pin, net) list a board designer keeps.
//
//   std::string csv = VnTool::PlanCsv(db, design, "top.json", pcf);  // what the editor serves
//
//===------------------------------------------------------------------------------===//
#pragma once

#include "ChipDb.h"
#include "NetMatch.h"
#include "Pcf.h"
#include "YosysPorts.h"

#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace VnTool {

/// One record with its fields quoted where RFC 4180 asks, ended by CRLF.
std::string CsvRecord(const std::vector<std::string>& fields);

/// Reads CSV: commas between fields, double quotes around a field that holds commas,
/// quotes or line ends, a doubled quote for a quote; CRLF or LF line ends; a leading
/// byte-order mark skipped; blank lines skipped. `source` names the text in messages.
/// Returns false with "source:line: why" in `error`.
bool ParseCsv(std::string_view text, std::string_view source,
              std::vector<std::vector<std::string>>& records, std::string& error);

/// The plan table's columns, in order.
const std::vector<std::string>& PlanCsvColumns();

/// The plan as CSV: the header, then one row per design port in design order with its
/// direction, pin, bank, IO tile and block, whether the pin drives a global buffer, the
/// pull-up of its set_io line, the I/O standard, the differential partner pin (bank 3
/// pairs), and the problems CheckPins finds for the port. `designSource` names the
/// netlist in those problems.
std::string PlanCsv(const ChipDb& db, const Design& design, const std::string& designSource,
                    const PcfFile& pcf);

/// A table read back: a plan table gives (port, pin) pairs, an empty pin meaning none;
/// a (pin, net) list gives the nets on the FPGA's pins.
struct CsvTable {
    bool netList = false;
    std::vector<std::pair<std::string, std::string>> assignments;
    std::vector<NetOnPin> nets;
};

/// Tells the kind by the header: a "port" column makes a plan table, "pin" and "net"
/// columns a net list; without such a header, rows of exactly two fields are (pin, net).
bool ReadPinCsv(std::string_view text, std::string_view source, CsvTable& table,
                std::string& error);

} // namespace VnTool
