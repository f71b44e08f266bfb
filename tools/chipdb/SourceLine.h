//===-- tools/chipdb/SourceLine.h - "FILE:LINE: why" for messages about input ---===//
//
// \file
// Every reader of the tool (chip databases, netlists, constraint files) names the place of
// a fault the way compilers do, so that editors and terminals can jump to it. The lowest
// floor holds the one spelling of it.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include <string>
#include <string_view>

namespace VnTool {

/// "SOURCE:LINE: TEXT". Any integer type of line number, as each reader counts its own.
template <class Line>
std::string AtLine(std::string_view source, Line line, std::string_view text) {
    std::string message(source);
    message += ':';
    message += std::to_string(line);
    message += ": ";
    message += text;
    return message;
}

} // namespace VnTool
