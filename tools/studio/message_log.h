// The emitter's messages ("APE: ...") of the current run, each distinct text with its count, in
// the order first seen.
#pragma once

#include <cstddef>
#include <string>
#include <vector>

namespace apestudio {

class MessageLog {
 public:
  struct Entry {
    std::string Text;
    long long Count = 0;
  };

  void Add(const std::string& text);
  void Clear();
  const std::vector<Entry>& Entries() const { return entries_; }
  long long Total() const { return total_; }

  // Distinct texts kept; later new ones are only counted, so a flood cannot grow the log.
  static constexpr std::size_t kMaximumDistinct = 200;

 private:
  std::vector<Entry> entries_;
  long long total_ = 0;
};

}  // namespace apestudio
