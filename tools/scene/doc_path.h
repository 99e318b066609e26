// A place inside a scene document, written the way people read it:
//   channels.sparks.links."Births Per Second".keys[2]
#pragma once

#include <cstddef>
#include <string>
#include <variant>
#include <vector>

namespace apescene {

class DocPath {
 public:
  using Step = std::variant<std::string, std::size_t>;  // object key or array index

  DocPath() = default;
  DocPath Key(const std::string& key) const;
  DocPath Index(std::size_t index) const;

  // Keys that are plain identifiers stay bare, others are quoted; indices are [n]. The root is
  // the empty text.
  std::string Text() const;
  bool IsRoot() const { return steps_.empty(); }
  const std::vector<Step>& Steps() const { return steps_; }

 private:
  std::vector<Step> steps_;
};

}  // namespace apescene
