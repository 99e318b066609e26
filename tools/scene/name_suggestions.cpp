#include "tools/scene/name_suggestions.h"

#include <algorithm>
#include <cctype>

namespace apescene {
namespace {

// Lower-case words: runs of letters and digits, split also where a lower-case letter meets an
// upper-case one ("AdvancedParticleEmitter" is three words).
std::vector<std::string> Words(const std::string& name) {
  std::vector<std::string> words;
  std::string word;
  char previous = 0;
  for (const char c : name) {
    const auto u = static_cast<unsigned char>(c);
    const bool part = std::isalnum(u) != 0;
    const bool camel_break = std::isupper(u) && std::islower(static_cast<unsigned char>(previous));
    if ((!part || camel_break) && !word.empty()) {
      words.push_back(word);
      word.clear();
    }
    if (part) word += static_cast<char>(std::tolower(u));
    previous = c;
  }
  if (!word.empty()) words.push_back(word);
  return words;
}

// Words that are the same but for a slip: longer words may differ more.
bool SameWord(const std::string& a, const std::string& b) {
  if (a == b) return true;
  const std::size_t shorter = std::min(a.size(), b.size());
  if (shorter < 4) return false;
  return EditDistance(a, b) <= (shorter >= 7 ? 2u : 1u);
}

struct WordScore {
  std::size_t Shared = 0;  // words of the wanted name found in the candidate
  std::size_t Extra = 0;   // words of the candidate not asked for
};

WordScore ScoreWords(const std::vector<std::string>& wanted,
                     const std::vector<std::string>& other) {
  WordScore score;
  for (const std::string& w : wanted)
    if (std::any_of(other.begin(), other.end(),
                    [&](const std::string& o) { return SameWord(w, o); }))
      ++score.Shared;
  for (const std::string& o : other)
    if (std::none_of(wanted.begin(), wanted.end(),
                     [&](const std::string& w) { return SameWord(w, o); }))
      ++score.Extra;
  return score;
}

}  // namespace

std::size_t EditDistance(const std::string& a, const std::string& b) {
  std::vector<std::size_t> row(b.size() + 1);
  for (std::size_t j = 0; j <= b.size(); ++j) row[j] = j;
  for (std::size_t i = 1; i <= a.size(); ++i) {
    std::size_t diagonal = row[0];
    row[0] = i;
    for (std::size_t j = 1; j <= b.size(); ++j) {
      const std::size_t up = row[j];
      const bool same = std::tolower(static_cast<unsigned char>(a[i - 1])) ==
                        std::tolower(static_cast<unsigned char>(b[j - 1]));
      row[j] = std::min({row[j] + 1, row[j - 1] + 1, diagonal + (same ? 0 : 1)});
      diagonal = up;
    }
  }
  return row[b.size()];
}

std::string SuggestName(const std::string& wanted, const std::vector<std::string>& candidates) {
  // A slip of the keyboard: close in spelling for the name's length.
  std::size_t best = wanted.size() / 3 + 2;
  std::string suggestion;
  for (const std::string& candidate : candidates) {
    const std::size_t distance = EditDistance(wanted, candidate);
    if (distance < best) best = distance, suggestion = candidate;
  }
  if (!suggestion.empty()) return suggestion;

  // Otherwise the most words in common, at least half of those asked for; fewer words beyond
  // them, then the nearer spelling, break ties.
  const std::vector<std::string> asked = Words(wanted);
  if (asked.empty()) return "";
  WordScore top;
  std::size_t top_distance = 0;
  for (const std::string& candidate : candidates) {
    const WordScore score = ScoreWords(asked, Words(candidate));
    if (score.Shared == 0 || 2 * score.Shared < asked.size()) continue;
    const std::size_t distance = EditDistance(wanted, candidate);
    const bool better =
        suggestion.empty() || score.Shared > top.Shared ||
        (score.Shared == top.Shared &&
         (score.Extra < top.Extra || (score.Extra == top.Extra && distance < top_distance)));
    if (better) top = score, top_distance = distance, suggestion = candidate;
  }
  return suggestion;
}

}  // namespace apescene
