// The hand-made seeds of the hostile-host corpus: each a script of what a troublesome host does.
// write_seeds writes them as files; the corpus test runs them directly too.
#pragma once

#include <cstdint>
#include <ostream>
#include <string>
#include <vector>

#include "fuzz/host_script.h"

namespace apefuzz {

struct NamedScript {
  std::string Name;
  std::vector<std::uint8_t> Bytes;
  // Failures name the case, not its bytes.
  friend void PrintTo(const NamedScript& c, std::ostream* os) { *os << c.Name; }
};

std::vector<NamedScript> HostSeeds();

// Inputs that once broke an invariant, kept as seeds and tests.
// Envelopes held at the last frame are destroyed; the host then calls BirthParticle directly.
ScriptWriter BirthAfterEnvelopeWentAway();
// An infinite "Logic Updates Per Second" while particles live: the blend was 0 / 0.
ScriptWriter InfiniteLogicRate();
// The host context is destroyed while the emitters live, and frames go on: the frame call read
// the context that was gone.
ScriptWriter HostContextGoesFirst();

}  // namespace apefuzz
