//===-- tests/tool/ProcessHelpers.h - what the process tests share: files, quoting, output -===//
//
// The process tests run the built tool through the shell and read what it wrote; the
// small pieces they all need live here once.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>

namespace VnTest {

/// What a run of the tool left: its exit status (124 when a time limit ended it) and
/// its two output streams.
struct Result {
    int status = -1;
    std::string out;
    std::string err;
};

/// The whole file, byte for byte; empty when it cannot be read.
inline std::string Slurp(const std::filesystem::path& path) {
    std::ifstream in(path, std::ios::binary);
    std::ostringstream text;
    text << in.rdbuf();
    return text.str();
}

/// Writes `text` to `path` as it is, replacing the file.
inline void WriteBytes(const std::filesystem::path& path, const std::string& text) {
    std::ofstream(path, std::ios::binary) << text;
}

/// `arg` as one word for the shell, whatever it holds.
inline std::string Quote(const std::string& arg) {
    std::string quoted = "'";
    for (char c : arg) {
        quoted += c == '\'' ? std::string("'\\''") : std::string(1, c);
    }
    return quoted + "'";
}

inline bool Contains(const std::string& text, const std::string& part) {
    return text.find(part) != std::string::npos;
}

// The line ends in a text: how the tests count the lines of a message or a listing.
inline int LineCount(const std::string& text) {
    int lines = 0;
    for (char c : text) {
        lines += c == '\n' ? 1 : 0;
    }
    return lines;
}

} // namespace VnTest
