//===-- tools/chipdb/Suggest.h - "did you mean" for misspelt names ---===//
//
// \file
// Part, package, port and pin names are typed by hand; a refusal that names the likely
// intended one saves a trip to the data sheet.
//
//   std::string hint = VnTool::DidYouMean("hx8", {"hx1k", "hx8k"});   // " (did you mean hx8k?)"
//
//===------------------------------------------------------------------------------===//
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace VnTool {

/// The candidate closest to `word` by edit distance (ignoring case), when it is close
/// enough to be a slip: at most a third of the word's length, and at least one edit.
/// Empty when none is.
std::string ClosestName(std::string_view word, const std::vector<std::string>& candidates);

/// The index in `folded` (names already passed through FoldedName) of the one closest to
/// `word` as ClosestName judges it, or -1. For many words against one long list.
long ClosestFoldedIndex(std::string_view word, const std::vector<std::string>& folded);

/// `word` as names are compared: case folded, and a bit index written "[1]", "_1", ".1"
/// or "-1" alike.
std::string FoldedName(std::string_view word);

/// " (did you mean NAME?)" for ClosestName, or empty: ready to append to a message.
std::string DidYouMean(std::string_view word, const std::vector<std::string>& candidates);

} // namespace VnTool
