//===-- tools/design/Pcf.h - pin constraint files as nextpnr-ice40 reads them ---===//
//
// \file
// A constraint file is the user's as much as the tool's: it carries comments, options
// and commands the tool has no business with. The model keeps every line with its exact
// text and line end, so that writing it back yields the same bytes, and it changes only
// the set_io lines of the ports it is told to assign or unassign; new constraints go at
// the end.
//
//   VnTool::PcfFile pcf;
//   if (!pcf.Parse(text, "top.pcf", error)) { report(error); }   // "top.pcf:4: ..."
//   pcf.Assign("led[0]", "B5");       // rewrites led[0]'s pin in place, or appends a line
//   std::string out = pcf.Text();
//
//===------------------------------------------------------------------------------===//
#pragma once

#include <cstddef>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace VnTool {

struct PcfLine {
    enum class Kind { Blank, Comment, SetIo, Other };
    Kind kind = Kind::Blank;
    std::string text;               ///< the line without its end
    std::string end;                ///< the carriage returns and line feed that end it: "\n",
                                    ///< "\r\n", "\r\r\n"; what is left for a last line
                                    ///< without a line feed ("" or "\r")
    std::size_t number = 0;         ///< 1-based line in the file it came from; 0 for new lines
    std::string command;            ///< the first word of a command line
    std::string port;               ///< set_io only
    std::string pin;                ///< set_io only
    std::size_t pinAt = 0;          ///< where `pin` starts in `text`
    bool noWarn = false;            ///< set_io -nowarn or --warn-no-port: the port may be absent
    std::string pullupResistor;     ///< set_io -pullup_resistor's value, or empty
    std::vector<std::string> notes; ///< what nextpnr-ice40 would warn about on this line
};

/// Why `name` cannot stand as a port or pin word of a set_io line (nextpnr-ice40 would
/// read it as something else), or empty when it can.
std::string PcfWordProblem(std::string_view name);

/// The (port, pin) of every set_io line, in file order: what a file means to the placer.
std::vector<std::pair<std::string, std::string>> PcfAssignments(const class PcfFile& pcf);

class PcfFile {
public:
    /// Reads constraint text. `source` names it in messages. Returns false with one line
    /// "source:line: why" in `error` at the first line nextpnr-ice40 would not parse;
    /// the model is then empty.
    bool Parse(std::string_view text, std::string_view source, std::string& error);
    /// Reads a file; also fails when it cannot be read. A missing file is an empty model
    /// when `missingIsEmpty`.
    bool ParseFile(const std::string& path, std::string& error, bool missingIsEmpty = false);

    /// The lines in order, the tool's changes included.
    const std::vector<PcfLine>& Lines() const { return m_lines; }
    /// The name the model was read under.
    const std::string& Source() const { return m_source; }
    /// The file's text: unchanged lines byte for byte.
    std::string Text() const;

    /// Puts `port` on `pin`: rewrites the pin of the port's first set_io line (keeping its
    /// options and comment) and drops any further set_io lines of the port; appends a
    /// line when the port has none.
    void Assign(const std::string& port, const std::string& pin);
    /// Drops every set_io line of `port`. Returns the number dropped.
    int Unassign(const std::string& port);

    /// Appends one set_io line per (port, pin), for ports that have no line yet; one
    /// pass however many there are, where Assign looks through the file for each.
    void AppendAll(const std::vector<std::pair<std::string, std::string>>& assignments);

private:
    std::string m_source;
    std::vector<PcfLine> m_lines;
};

} // namespace VnTool
