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

// "" when what a frame call drew from is sound, else what is wrong. Always: the blend factor is
// in [0, 1]. After a call that simulated (`simulated`): every record whose position and velocity
// are finite and moderate (below 1e18, so that no sum can overflow) has a finite drawn position.
// After a call that rebuilt the vertex data (`rebuilt`): every slot whose drawn position, facing
// point, size and spin are finite and moderate has finite vertex positions.
std::string CheckDrawnState(const Tev_AdvancedParticleEmitter& emitter, bool simulated,
                            bool rebuilt);

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
