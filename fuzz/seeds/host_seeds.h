// The hand-made seeds of the hostile-host corpus: each a script of what a troublesome host does.
// write_seeds writes them as files; the corpus test runs them directly too.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "fuzz/host_script.h"

namespace apefuzz {

struct NamedScript {
  std::string Name;
  std::vector<std::uint8_t> Bytes;
};

std::vector<NamedScript> HostSeeds();

// Inputs that once broke an invariant, kept as seeds and tests.
// Envelopes held at the last frame are destroyed; the host then calls BirthParticle directly.
ScriptWriter BirthAfterEnvelopeWentAway();

}  // namespace apefuzz
