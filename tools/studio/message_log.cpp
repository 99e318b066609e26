#include "tools/studio/message_log.h"

namespace apestudio {

void MessageLog::Add(const std::string& text) {
  ++total_;
  for (Entry& entry : entries_)
    if (entry.Text == text) {
      ++entry.Count;
      return;
    }
  if (entries_.size() < kMaximumDistinct) entries_.push_back({text, 1});
}

void MessageLog::Clear() {
  entries_.clear();
  total_ = 0;
}

}  // namespace apestudio
