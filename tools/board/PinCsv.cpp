//===-- tools/board/PinCsv.cpp - the pin plan as a table, and tables read back ---===//
#include "PinCsv.h"
#include "SourceLine.h"

#include "PinPlan.h"

#include <algorithm>
#include <cctype>
#include <sstream>

namespace VnTool {

namespace {

std::string Lower(std::string_view text) {
    std::string out;
    for (char c : text) {
        out += static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
    }
    return out;
}

// The value after `option` among the words of a set_io line, or empty.
std::string OptionValue(const std::string& line, std::string_view option) {
    std::istringstream words(line);
    std::string word;
    while (words >> word && word != "#") {
        if (word == option && (words >> word)) {
            return word;
        }
    }
    return {};
}

std::string PullUp(const PcfLine& line) {
    std::string text = line.text.substr(0, line.pinAt);
    std::string pullup = OptionValue(text, "-pullup");
    std::string resistor = OptionValue(text, "-pullup_resistor");
    return pullup + (!pullup.empty() && !resistor.empty() ? " " : "") + resistor;
}

// The other pin of an LVDS input pair: the two blocks of one IO tile of bank 3.
std::string DifferentialPartner(const ChipDb& db, const Pin& pin) {
    if (pin.bank != 3) {
        return {};
    }
    for (const Pin& other : db.pins) {
        if (other.x == pin.x && other.y == pin.y && other.pio == 1 - pin.pio) {
            return other.name;
        }
    }
    return {};
}

int ColumnOf(const std::vector<std::string>& header, std::initializer_list<const char*> names) {
    for (std::size_t i = 0; i < header.size(); ++i) {
        std::string column = Lower(header[i]);
        for (const char* name : names) {
            if (column == name) {
                return static_cast<int>(i);
            }
        }
    }
    return -1;
}

std::string FieldAt(const std::vector<std::string>& record, int column) {
    return column >= 0 && static_cast<std::size_t>(column) < record.size()
               ? record[static_cast<std::size_t>(column)]
               : std::string();
}

} // namespace

std::string CsvRecord(const std::vector<std::string>& fields) {
    // A lone empty field written bare would read back as a blank line, which is skipped.
    if (fields.size() == 1 && fields[0].empty()) {
        return "\"\"\r\n";
    }
    std::string out;
    for (std::size_t i = 0; i < fields.size(); ++i) {
        const std::string& field = fields[i];
        out += i == 0 ? "" : ",";
        if (field.find_first_of(",\"\r\n") == std::string::npos) {
            out += field;
            continue;
        }
        out += '"';
        for (char c : field) {
            out += c == '"' ? std::string("\"\"") : std::string(1, c);
        }
        out += '"';
    }
    return out + "\r\n";
}

// Kept whole: one pass of a small state machine (in a quoted field or not), whose states
// read best side by side.
bool ParseCsv(std::string_view text, std::string_view source,
              std::vector<std::vector<std::string>>& records, std::string& error) {
    records.clear();
    if (text.substr(0, 3) == "\xEF\xBB\xBF") {
        text.remove_prefix(3);
    }
    std::vector<std::string> record;
    std::string field;
    bool quoted = false;    // inside quotes
    bool wasQuoted = false; // the current field was quoted
    bool any = false;       // the record has begun
    std::size_t line = 1;
    std::size_t quoteLine = 0;
    auto endRecord = [&] {
        if (any) {
            record.push_back(std::move(field));
            records.push_back(std::move(record));
        }
        record.clear();
        field.clear();
        any = wasQuoted = false;
    };
    for (std::size_t i = 0; i < text.size(); ++i) {
        char c = text[i];
        if (quoted) {
            if (c == '"' && i + 1 < text.size() && text[i + 1] == '"') {
                field += '"';
                ++i;
            } else if (c == '"') {
                quoted = false;
            } else {
                line += c == '\n' ? 1 : 0;
                field += c;
            }
            continue;
        }
        if (c == '"') {
            if (!field.empty() || wasQuoted) {
                error =
                    AtLine(source, line, "a quote inside a field that is not quoted as a whole");
                return false;
            }
            quoted = wasQuoted = any = true;
            quoteLine = line;
        } else if (c == ',') {
            record.push_back(std::move(field));
            field.clear();
            wasQuoted = false;
            any = true;
        } else if (c == '\n' || c == '\r') {
            if (c == '\r' && i + 1 < text.size() && text[i + 1] == '\n') {
                ++i;
            }
            endRecord();
            ++line;
        } else if (wasQuoted) {
            error = AtLine(source, line, "text after a quoted field's closing quote");
            return false;
        } else {
            field += c;
            any = true;
        }
    }
    if (quoted) {
        error = AtLine(source, quoteLine, "the quoted field opened here never closes");
        return false;
    }
    endRecord();
    return true;
}

const std::vector<std::string>& PlanCsvColumns() {
    static const std::vector<std::string> columns = {"port",
                                                     "direction",
                                                     "pin",
                                                     "bank",
                                                     "tile_x",
                                                     "tile_y",
                                                     "block",
                                                     "global_buffer",
                                                     "pull_up",
                                                     "io_standard",
                                                     "differential_partner",
                                                     "problems"};
    return columns;
}

std::string PlanCsv(const ChipDb& db, const Design& design, const std::string& designSource,
                    const PcfFile& pcf) {
    std::vector<PinProblem> problems = CheckPins(db, design, designSource, pcf, false);
    std::string out = CsvRecord(PlanCsvColumns());
    for (const DesignPort& port : design.ports) {
        const PcfLine* line = nullptr;
        for (const PcfLine& candidate : pcf.Lines()) {
            if (line == nullptr && candidate.kind == PcfLine::Kind::SetIo &&
                candidate.port == port.name) {
                line = &candidate;
            }
        }
        const Pin* pin = nullptr;
        for (const Pin& candidate : db.pins) {
            if (line != nullptr && candidate.name == line->pin) {
                pin = &candidate;
            }
        }
        std::string said;
        for (const PinProblem& problem : problems) {
            if (problem.port == port.name) {
                said += (said.empty() ? "" : "; ") + problem.message;
            }
        }
        std::vector<std::string> row = {port.name, PortDirectionName(port.direction),
                                        line != nullptr ? line->pin : ""};
        if (pin != nullptr) {
            // SB_LVCMOS is what the toolchain gives every pin a constraint file places: the
            // file has no way to ask for another.
            row.insert(row.end(),
                       {std::to_string(pin->bank), std::to_string(pin->x), std::to_string(pin->y),
                        std::to_string(pin->pio), IsGlobalBufferPin(db, *pin) ? "yes" : "no",
                        PullUp(*line), "SB_LVCMOS", DifferentialPartner(db, *pin)});
        } else {
            row.insert(row.end(),
                       {"", "", "", "", "", line != nullptr ? PullUp(*line) : "", "", ""});
        }
        row.push_back(said);
        out += CsvRecord(row);
    }
    return out;
}

bool ReadPinCsv(std::string_view text, std::string_view source, CsvTable& table,
                std::string& error) {
    table = CsvTable();
    std::vector<std::vector<std::string>> records;
    if (!ParseCsv(text, source, records, error)) {
        return false;
    }
    if (records.empty()) {
        error = std::string(source) + ": no rows";
        return false;
    }
    const std::vector<std::string>& header = records.front();
    int port = ColumnOf(header, {"port"});
    int pin = ColumnOf(header, {"pin", "pad", "ball"});
    int net = ColumnOf(header, {"net", "signal", "net name"});
    std::size_t first = 1;
    if (port < 0 && (pin < 0 || net < 0)) {
        bool twoColumns = std::all_of(records.begin(), records.end(),
                                      [](const auto& record) { return record.size() == 2; });
        if (!twoColumns) {
            error = std::string(source) +
                    ":1: neither a plan table (a 'port' column) nor a list of pins and nets "
                    "('pin' and 'net' columns, or two columns)";
            return false;
        }
        pin = 0;
        net = 1;
        first = 0;
    }
    table.netList = port < 0;
    if (pin < 0) {
        error = std::string(source) + ":1: the table has a 'port' column but no 'pin' column";
        return false;
    }
    for (std::size_t i = first; i < records.size(); ++i) {
        const auto& record = records[i];
        if (table.netList) {
            if (!FieldAt(record, pin).empty()) {
                table.nets.push_back({FieldAt(record, pin), FieldAt(record, net)});
            }
        } else if (!FieldAt(record, port).empty()) {
            table.assignments.emplace_back(FieldAt(record, port), FieldAt(record, pin));
        }
    }
    return true;
}

} // namespace VnTool
