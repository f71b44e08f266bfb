//===-- tools/board/SExpr.h - the S-expressions of KiCad's files -------------------===//
//
// \file
// KiCad writes its netlists and board files as S-expressions: lists in parentheses of
// bare words and double-quoted strings. Older versions leave most words bare, newer ones
// quote nearly all; a reader that treats both alike reads every generation.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

namespace VnTool {

struct SExpr {
    bool list = false;
    std::string atom;            ///< a word or a string's text, unescaped
    std::vector<SExpr> children; ///< a list's members
    std::size_t line = 0;

    /// The first member's word: "net" for (net 1 /LED0); empty for atoms.
    const std::string& Head() const;
    /// The first member list whose head is `head`, or null.
    const SExpr* Find(std::string_view head) const;
    /// The atom at `index` of this list, or empty.
    std::string AtomAt(std::size_t index) const;
};

/// Reads one S-expression (and only whitespace after it). `source` names the input in
/// messages. Returns false with "source:line: why" in `error`.
bool ParseSExpr(std::string_view text, std::string_view source, SExpr& out, std::string& error);

} // namespace VnTool
