// Finds the line on which each value of a JSON text starts, so that a message about a value can
// name its line. nlohmann::json keeps no positions, so the (already valid) text is walked again.
#pragma once

#include <map>
#include <string>

#include "tools/scene/doc_path.h"

namespace apescene {

class JsonLocator {
 public:
  // `text` must be valid JSON (parse it first); an invalid text leaves the map partly filled.
  explicit JsonLocator(const std::string& text);
  // The 1-based line of the value at `path`, or of its nearest enclosing value; 0 when unknown.
  int LineOf(const DocPath& path) const;

  // The first key given twice in one object, if any: nlohmann::json keeps only one of them, so a
  // scene author's second value would vanish without a word.
  bool HasDuplicateKey() const { return has_duplicate_; }
  const DocPath& DuplicateKey() const { return duplicate_; }

  // Documents nested deeper than this are refused, so that walking them cannot exhaust the
  // stack.
  static constexpr int kMaximumDepth = 256;
  bool TooDeep() const { return too_deep_; }

  // 1-based line and column of a byte offset into the text.
  static void LineAndColumn(const std::string& text, std::size_t offset, int* line, int* column);

 private:
  std::map<std::string, int> lines_;  // path text -> line
  bool has_duplicate_ = false;
  bool too_deep_ = false;
  DocPath duplicate_;
};

}  // namespace apescene
