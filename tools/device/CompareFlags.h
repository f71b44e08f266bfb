//===-- tools/device/CompareFlags.h - the compare flags by the names users type ---===//
//
// \file
// The tool's --flags option and the editor's search both name the library's compare
// flags in words; one table serves both, so a flag added to one is known to the other.
//
//===------------------------------------------------------------------------------===//
#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace VnTool {

/// The compare flag bit a user's word names ("exact", "ignore-case", "substring",
/// "within-5-percent", "less", "greater", "any", "regexp"); empty for any other word.
std::optional<int> CompareFlagNamed(std::string_view word);

/// The words of the flags set in `flags`, comma-separated; "exact" when none is set.
std::string CompareFlagsText(int flags);

/// Every word CompareFlagNamed knows, comma-separated, for messages.
std::string CompareFlagWords();

/// One compare flag: the word users type and the library's bit.
struct CompareFlagWord {
    const char* word;
    int bit;
};

/// Every compare flag in the order help texts list them; what the editor serves its page,
/// so the page offers exactly the words the server accepts.
const std::vector<CompareFlagWord>& CompareFlagTable();

} // namespace VnTool
