//===-- tools/design/Pcf.cpp - pin constraint files as nextpnr-ice40 reads them ---===//
#include "Pcf.h"

#include "Port/SafeFile.h"

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

// Words separated by blanks, up to a '#' that starts a comment: the way nextpnr-ice40
// splits a line.
std::vector<Token> Tokens(std::string_view line) {
    std::vector<Token> tokens;
    std::size_t i = 0;
    while (i < line.size()) {
        while (i < line.size() && (line[i] == ' ' || line[i] == '\t')) {
            ++i;
        }
        if (i >= line.size() || line[i] == '#') {
            break;
        }
        std::size_t start = i;
        while (i < line.size() && line[i] != ' ' && line[i] != '\t' && line[i] != '#') {
            ++i;
        }
        tokens.push_back({line.substr(start, i - start), start});
    }
    return tokens;
}

// Returns the reason the set_io line cannot be read, or empty.
std::string ParseSetIo(const std::vector<Token>& tokens, PcfLine& line) {
    std::size_t i = 1;
    for (; i < tokens.size() && tokens[i].text.size() > 1 && tokens[i].text[0] == '-'; ++i) {
        std::string_view option = tokens[i].text;
        if (option == "-nowarn") {
            line.noWarn = true;
        } else if (option == "-pullup" || option == "-pullup_resistor") {
            if (i + 1 >= tokens.size()) {
                return std::string(option) + " wants a value";
            }
            std::string_view value = tokens[++i].text;
            bool valid = option == "-pullup" ? value == "yes" || value == "no"
                                             : value == "3P3K" || value == "6P8K" ||
                                                   value == "10K" || value == "100K";
            if (!valid) {
                return "invalid value '" + std::string(value) + "' for " + std::string(option) +
                       (option == "-pullup" ? " (yes or no)" : " (3P3K, 6P8K, 10K or 100K)");
            }
        } else {
            line.notes.push_back("nextpnr-ice40 ignores the option '" + std::string(option) + "'");
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

} // namespace

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
        std::size_t contentStop = stop;
        if (contentStop > start && text[contentStop - 1] == '\r') {
            --contentStop;
        }
        line.text = std::string(text.substr(start, contentStop - start));
        line.end = std::string(text.substr(
            contentStop, (newline == std::string_view::npos ? stop : stop + 1) - contentStop));
        start = newline == std::string_view::npos ? text.size() : newline + 1;

        auto tokens = Tokens(line.text);
        if (tokens.empty()) {
            line.kind = line.text.find('#') != std::string::npos ? PcfLine::Kind::Comment
                                                                 : PcfLine::Kind::Blank;
        } else {
            line.command = std::string(tokens[0].text);
            if (line.command == "set_io") {
                line.kind = PcfLine::Kind::SetIo;
                std::string why = ParseSetIo(tokens, line);
                if (!why.empty()) {
                    error = m_source + ":" + std::to_string(line.number) + ": " + why;
                    m_lines.clear();
                    return false;
                }
            } else {
                line.kind = PcfLine::Kind::Other;
            }
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
    // A last line without its end gets the file's line end before a line follows it.
    std::string end = "\n";
    for (const PcfLine& line : m_lines) {
        if (!line.end.empty()) {
            end = line.end;
            break;
        }
    }
    if (!m_lines.empty() && m_lines.back().end.empty()) {
        m_lines.back().end = end;
    }
    PcfLine line;
    line.kind = PcfLine::Kind::SetIo;
    line.command = "set_io";
    line.port = port;
    line.pin = pin;
    line.text = "set_io " + port + " " + pin;
    line.pinAt = line.text.size() - pin.size();
    line.end = end;
    m_lines.push_back(std::move(line));
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
