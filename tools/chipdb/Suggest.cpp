//===-- tools/chipdb/Suggest.cpp - "did you mean" for misspelt names ---===//
#include "Suggest.h"

#include <algorithm>
#include <cctype>

namespace VnTool {

std::string FoldedName(std::string_view word) {
    std::string normal;
    for (char c : word) {
        if (c == ']') {
            continue;
        }
        normal += c == '[' || c == '.' || c == '-'
                      ? '_'
                      : static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
    }
    return normal;
}

namespace {

// Edit distance with swaps of neighbours, given up once it exceeds `limit`.
std::size_t Distance(std::string_view a, std::string_view b, std::size_t limit) {
    std::size_t gap = a.size() > b.size() ? a.size() - b.size() : b.size() - a.size();
    if (gap > limit) {
        return limit + 1;
    }
    std::vector<std::size_t> before(b.size() + 1);
    std::vector<std::size_t> previous(b.size() + 1);
    std::vector<std::size_t> current(b.size() + 1);
    for (std::size_t j = 0; j <= b.size(); ++j) {
        previous[j] = j;
    }
    for (std::size_t i = 1; i <= a.size(); ++i) {
        current[0] = i;
        for (std::size_t j = 1; j <= b.size(); ++j) {
            std::size_t cost = a[i - 1] == b[j - 1] ? 0 : 1;
            current[j] = std::min({previous[j] + 1, current[j - 1] + 1, previous[j - 1] + cost});
            if (i > 1 && j > 1 && a[i - 1] == b[j - 2] && a[i - 2] == b[j - 1]) {
                current[j] = std::min(current[j], before[j - 2] + 1);
            }
        }
        before.swap(previous);
        previous.swap(current);
    }
    return previous[b.size()];
}

} // namespace

long ClosestFoldedIndex(std::string_view word, const std::vector<std::string>& folded) {
    // Names are short; a long word compared with many names would cost more than a hint
    // is worth.
    if (word.empty() || word.size() > 64) {
        return -1;
    }
    // Pin numbers are all alike: "99" is as near "9" as it is "98", so no hint helps.
    if (std::all_of(word.begin(), word.end(),
                    [](char c) { return std::isdigit(static_cast<unsigned char>(c)) != 0; })) {
        return -1;
    }
    const std::string normal = FoldedName(word);
    const std::size_t limit = std::max<std::size_t>(1, word.size() / 3);
    long best = -1;
    std::size_t bestDistance = limit + 1;
    for (std::size_t i = 0; i < folded.size(); ++i) {
        std::size_t d = Distance(normal, folded[i], limit);
        if (d < bestDistance) {
            best = static_cast<long>(i);
            bestDistance = d;
        }
    }
    return best;
}

std::string ClosestName(std::string_view word, const std::vector<std::string>& candidates) {
    std::vector<std::string> folded;
    std::vector<std::string> others;
    for (const std::string& candidate : candidates) {
        if (candidate != word) {
            folded.push_back(FoldedName(candidate));
            others.push_back(candidate);
        }
    }
    long best = ClosestFoldedIndex(word, folded);
    return best < 0 ? std::string() : others[static_cast<std::size_t>(best)];
}

std::string DidYouMean(std::string_view word, const std::vector<std::string>& candidates) {
    std::string name = ClosestName(word, candidates);
    return name.empty() ? std::string() : " (did you mean " + name + "?)";
}

} // namespace VnTool
