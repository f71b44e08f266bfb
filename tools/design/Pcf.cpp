//===-- tools/design/Pcf.cpp - pin constraint files as nextpnr-ice40 reads them ---===//
#include "Pcf.h"
#include "SourceLine.h"

#include "Port/SafeFile.h"

#include <cctype>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <system_error>

namespace VnTool {

namespace {

// A constraint file is a few kilobytes; one of megabytes is some other file named by mistake.
constexpr std::uint64_t kMaxPcfBytes = std::uint64_t{16} << 20;

struct Token {
    std::string_view text;
    std::size_t at;
};

// nextpnr-ice40 splits a line at any of these, a carriage return included.
bool IsSeparator(char c) {
    return c == ' ' || c == '\t' || c == '\r' || c == '\f' || c == '\v';
}

// Words separated by blanks, up to a '#' that starts a comment even inside a word
// ("21#osc" is the pin 21): the way nextpnr-ice40 splits a line.
std::vector<Token> Tokens(std::string_view line) {
    std::vector<Token> tokens;
    std::size_t i = 0;
    while (i < line.size()) {
        while (i < line.size() && IsSeparator(line[i])) {
            ++i;
        }
        if (i >= line.size() || line[i] == '#') {
            break;
        }
        std::size_t start = i;
        while (i < line.size() && !IsSeparator(line[i]) && line[i] != '#') {
            ++i;
        }
        tokens.push_back({line.substr(start, i - start), start});
    }
    return tokens;
}

// A carriage return ends no line for nextpnr-ice40: the words after one inside a line
// are read as more words of it, so a file saved with carriage returns alone loses every
// line but the first. Returns where such a return is followed by words, or npos.
std::size_t LoneReturnBeforeWords(std::string_view line) {
    std::size_t comment = line.find('#');
    std::string_view words = line.substr(0, comment);
    for (std::size_t at = words.find('\r'); at != std::string_view::npos;
         at = words.find('\r', at + 1)) {
        for (std::size_t i = at + 1; i < words.size(); ++i) {
            if (!IsSeparator(words[i])) {
                return at;
            }
        }
    }
    return std::string_view::npos;
}

std::string ParseOption(const std::vector<Token>& tokens, std::size_t& i, PcfLine& line) {
    std::string_view option = tokens[i].text;
    if (option == "-nowarn" || option == "--warn-no-port") {
        line.noWarn = true;
        return {};
    }
    if (option != "-pullup" && option != "-pullup_resistor") {
        line.notes.push_back("nextpnr-ice40 ignores the option '" + std::string(option) + "'");
        return {};
    }
    if (i + 1 >= tokens.size()) {
        return std::string(option) + " wants a value";
    }
    std::string_view value = tokens[++i].text;
    bool pullup = option == "-pullup";
    bool valid = pullup ? value == "yes" || value == "no" || value == "1" || value == "0"
                        : value == "3P3K" || value == "6P8K" || value == "10K" || value == "100K";
    if (!valid) {
        return "invalid value '" + std::string(value) + "' for " + std::string(option) +
               (pullup ? " (yes, no, 1 or 0)" : " (3P3K, 6P8K, 10K or 100K)");
    }
    if (!pullup) {
        line.pullupResistor = std::string(value);
    }
    return {};
}

// Returns the reason the set_io line cannot be read, or empty.
std::string ParseSetIo(const std::vector<Token>& tokens, PcfLine& line) {
    std::size_t i = 1;
    // Every word that starts with '-' is an option to nextpnr-ice40, a lone '-' too.
    for (; i < tokens.size() && tokens[i].text[0] == '-'; ++i) {
        if (std::string why = ParseOption(tokens, i, line); !why.empty()) {
            return why;
        }
    }
    if (tokens.size() < i + 2) {
        return "expected 'set_io [options] PORT PIN'";
    }
    line.port = std::string(tokens[i].text);
    line.pin = std::string(tokens[i + 1].text);
    line.pinAt = tokens[i + 1].at;
    if (tokens.size() > i + 2) {
        line.notes.push_back("nextpnr-ice40 ignores the words after the pin");
    }
    return {};
}

// A whole decimal number, as a clock frequency in MHz is written.
bool IsFrequency(std::string_view text) {
    std::size_t i = 0;
    std::size_t digits = 0;
    while (i < text.size() && std::isdigit(static_cast<unsigned char>(text[i])) != 0) {
        ++i;
        ++digits;
    }
    if (i < text.size() && text[i] == '.') {
        ++i;
        while (i < text.size() && std::isdigit(static_cast<unsigned char>(text[i])) != 0) {
            ++i;
            ++digits;
        }
    }
    return digits > 0 && i == text.size();
}

// nextpnr-ice40 stops at a set_frequency without a value, and aborts on one that is no
// number.
std::string ParseSetFrequency(const std::vector<Token>& tokens) {
    if (tokens.size() < 3) {
        return "expected 'set_frequency NET MHZ'";
    }
    if (!IsFrequency(tokens[2].text)) {
        return "the frequency '" + std::string(tokens[2].text) +
               "' is no number of MHz (such as 12 or 48.5)";
    }
    return {};
}

// The line end of a line that has one: the carriage returns before its line feed and the
// line feed, which nextpnr-ice40 takes as blanks and the end.
std::size_t ContentStop(std::string_view text, std::size_t start, std::size_t stop) {
    while (stop > start && text[stop - 1] == '\r') {
        --stop;
    }
    return stop;
}

} // namespace

std::string PcfWordProblem(std::string_view name) {
    if (name.empty()) {
        return "it is empty";
    }
    if (name[0] == '-') {
        return "it starts with '-', which makes it an option";
    }
    for (char c : name) {
        if (c == '#') {
            return "it holds '#', which starts a comment";
        }
        if (c == '\n') {
            return "it holds a line feed, which ends the line";
        }
        if (IsSeparator(c)) {
            return "it holds a blank (space, tab, carriage return, form feed or vertical tab), "
                   "which splits it in two";
        }
        if (c == '\0') {
            return "it holds a NUL character";
        }
    }
    return {};
}

std::vector<std::pair<std::string, std::string>> PcfAssignments(const PcfFile& pcf) {
    std::vector<std::pair<std::string, std::string>> pairs;
    for (const PcfLine& line : pcf.Lines()) {
        if (line.kind == PcfLine::Kind::SetIo) {
            pairs.emplace_back(line.port, line.pin);
        }
    }
    return pairs;
}

bool PcfFile::Parse(std::string_view text, std::string_view source, std::string& error) {
    m_source = std::string(source);
    m_lines.clear();
    std::size_t start = 0;
    std::size_t number = 0;
    while (start < text.size()) {
        PcfLine line;
        line.number = ++number;
        std::size_t newline = text.find('\n', start);
        std::size_t stop = newline == std::string_view::npos ? text.size() : newline;
        std::size_t contentStop = ContentStop(text, start, stop);
        line.text = std::string(text.substr(start, contentStop - start));
        line.end = std::string(text.substr(
            contentStop, (newline == std::string_view::npos ? stop : stop + 1) - contentStop));
        start = newline == std::string_view::npos ? text.size() : newline + 1;

        auto tokens = Tokens(line.text);
        if (tokens.empty()) {
            line.kind = line.text.find('#') != std::string::npos ? PcfLine::Kind::Comment
                                                                 : PcfLine::Kind::Blank;
            m_lines.push_back(std::move(line));
            continue;
        }
        line.command = std::string(tokens[0].text);
        std::string why;
        if (LoneReturnBeforeWords(line.text) != std::string_view::npos) {
            why = "a carriage return without a line feed inside the line: nextpnr-ice40 reads "
                  "the words after it as part of this line (save the file with LF or CRLF "
                  "line ends)";
        } else if (line.command == "set_io") {
            line.kind = PcfLine::Kind::SetIo;
            why = ParseSetIo(tokens, line);
        } else {
            line.kind = PcfLine::Kind::Other;
            if (line.command == "set_frequency") {
                why = ParseSetFrequency(tokens);
            }
        }
        if (!why.empty()) {
            error = AtLine(m_source, line.number, why);
            m_lines.clear();
            return false;
        }
        m_lines.push_back(std::move(line));
    }
    return true;
}

bool PcfFile::ParseFile(const std::string& path, std::string& error, bool missingIsEmpty) {
    std::error_code ec;
    if (missingIsEmpty &&
        std::filesystem::symlink_status(path, ec).type() == std::filesystem::file_type::not_found) {
        m_source = path;
        m_lines.clear();
        return true;
    }
    std::string text;
    if (!Port::ReadRegularFile(path, text, error, kMaxPcfBytes)) {
        return false;
    }
    return Parse(text, path, error);
}

std::string PcfFile::Text() const {
    std::string text;
    for (const PcfLine& line : m_lines) {
        text += line.text;
        text += line.end;
    }
    return text;
}

void PcfFile::Assign(const std::string& port, const std::string& pin) {
    bool done = false;
    for (auto it = m_lines.begin(); it != m_lines.end();) {
        if (it->kind != PcfLine::Kind::SetIo || it->port != port) {
            ++it;
            continue;
        }
        if (done) {
            it = m_lines.erase(it);
            continue;
        }
        it->text.replace(it->pinAt, it->pin.size(), pin);
        it->pin = pin;
        done = true;
        ++it;
    }
    if (done) {
        return;
    }
    AppendAll({{port, pin}});
}

void PcfFile::AppendAll(const std::vector<std::pair<std::string, std::string>>& assignments) {
    if (assignments.empty()) {
        return;
    }
    // A last line without its line feed gets the file's line end before a line follows
    // it; a carriage return alone would join the two lines for nextpnr-ice40.
    std::string end = "\n";
    for (const PcfLine& line : m_lines) {
        if (!line.end.empty() && line.end.back() == '\n') {
            end = line.end;
            break;
        }
    }
    if (!m_lines.empty() && (m_lines.back().end.empty() || m_lines.back().end.back() != '\n')) {
        m_lines.back().end += m_lines.back().end.empty() ? end : "\n";
    }
    for (const auto& [port, pin] : assignments) {
        PcfLine line;
        line.kind = PcfLine::Kind::SetIo;
        line.command = "set_io";
        line.port = port;
        line.pin = pin;
        line.text = "set_io ";
        line.text += port;
        line.text += ' ';
        line.text += pin;
        line.pinAt = line.text.size() - pin.size();
        line.end = end;
        m_lines.push_back(std::move(line));
    }
}

int PcfFile::Unassign(const std::string& port) {
    int dropped = 0;
    for (auto it = m_lines.begin(); it != m_lines.end();) {
        if (it->kind == PcfLine::Kind::SetIo && it->port == port) {
            it = m_lines.erase(it);
            ++dropped;
        } else {
            ++it;
        }
    }
    return dropped;
}

} // namespace VnTool
