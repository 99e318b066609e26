// The name an unknown one most likely meant, for "did you mean" in messages about link, channel
// and type names.
#pragma once

#include <cstddef>
#include <string>
#include <vector>

namespace apescene {

// Levenshtein distance with letter case ignored.
std::size_t EditDistance(const std::string& a, const std::string& b);

// The candidate `wanted` most likely meant: a near spelling of the whole name (a slip of the
// keyboard), else the candidate sharing the most words with it, words compared loosely so that
// "Multiplicative Size Offset Max" finds the emitter's "Mulitplicative Size Offset Max (...)".
// Empty when no candidate is close.
std::string SuggestName(const std::string& wanted, const std::vector<std::string>& candidates);

}  // namespace apescene
