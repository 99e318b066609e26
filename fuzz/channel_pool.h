// The channels a fuzzed host holds besides its emitters: any of them may be linked, changed or
// destroyed by a script. "Pinned" channels live until the pool goes, because a host API (the
// collision manager's AddMesh) asks the host to keep them alive.
#pragma once

#include <cstddef>
#include <memory>
#include <vector>

class Qen_Channel;

namespace apefuzz {

class ChannelPool {
 public:
  // More channels than this are not made: a long script stays cheap.
  static constexpr std::size_t kMaximumChannels = 256;

  ChannelPool() = default;
  ~ChannelPool();  // the unpinned channels first, newest first, then the pinned ones
  ChannelPool(const ChannelPool&) = delete;
  ChannelPool& operator=(const ChannelPool&) = delete;

  bool Full() const { return entries_.size() >= kMaximumChannels; }
  std::size_t Size() const { return entries_.size(); }
  // Null for an empty pool; the index wraps.
  Qen_Channel* At(std::size_t index) const;
  template <typename T>
  T* Add(std::unique_ptr<T> channel, bool pinned = false) {
    T* raw = channel.get();
    Keep(std::unique_ptr<Qen_Channel>(std::move(channel)), pinned);
    return raw;
  }
  // Destroys the channel at the (wrapped) index unless it is pinned.
  void Destroy(std::size_t index);
  void Clear();

 private:
  struct Entry {
    std::unique_ptr<Qen_Channel> Channel;
    bool Pinned;
  };
  void Keep(std::unique_ptr<Qen_Channel> channel, bool pinned);
  std::vector<Entry> entries_;
};

}  // namespace apefuzz
