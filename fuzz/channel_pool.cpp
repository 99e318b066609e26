#include "fuzz/channel_pool.h"

#include "host/qen_channel.h"

namespace apefuzz {

ChannelPool::~ChannelPool() {
  Clear();
}

Qen_Channel* ChannelPool::At(std::size_t index) const {
  if (entries_.empty()) return nullptr;
  return entries_[index % entries_.size()].Channel.get();
}

void ChannelPool::Keep(std::unique_ptr<Qen_Channel> channel, bool pinned) {
  entries_.push_back({std::move(channel), pinned});
}

void ChannelPool::Destroy(std::size_t index) {
  if (entries_.empty()) return;
  const std::size_t at = index % entries_.size();
  if (entries_[at].Pinned) return;
  entries_.erase(entries_.begin() + static_cast<std::ptrdiff_t>(at));
}

void ChannelPool::Clear() {
  for (int pass = 0; pass < 2; ++pass) {
    const bool pinned = pass == 1;
    for (std::size_t i = entries_.size(); i-- > 0;)
      if (entries_[i].Pinned == pinned) entries_[i].Channel.reset();
  }
  entries_.clear();
}

}  // namespace apefuzz
