// What must hold of an emitter whatever its host did: the checks the fuzzers, the corpus replay
// and the soak run make after every operation.
#pragma once

#include <string>
#include <vector>

class Qen_HostContext;
class Tev_AdvancedParticleEmitter;

namespace apefuzz {

// "" when the emitter is sound, else what is wrong: the pool's size is not "ParticleCount", a
// vertex array is shorter than the pool needs, or a working emitter lacks its path's array.
std::string CheckEmitter(const Tev_AdvancedParticleEmitter& emitter);

// Catches every message of a host context (debug and overload) while it lives, and remembers the
// first that does not begin with "APE: ". Leaves silent sinks behind when it goes.
class MessageWatch {
 public:
  explicit MessageWatch(Qen_HostContext& context);
  ~MessageWatch();
  MessageWatch(const MessageWatch&) = delete;
  MessageWatch& operator=(const MessageWatch&) = delete;

  // "" while every message was well-formed.
  const std::string& Fault() const { return fault_; }
  int Count() const { return count_; }

 private:
  void Take(const char* text);

  Qen_HostContext& context_;
  std::string fault_;
  int count_ = 0;
};

}  // namespace apefuzz
