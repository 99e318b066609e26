// The hand-made seeds of the hostile-host corpus: each a script of what a troublesome host does.
// write_seeds writes them as files; the corpus test runs them directly too.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace apefuzz {

struct NamedScript {
  std::string Name;
  std::vector<std::uint8_t> Bytes;
};

std::vector<NamedScript> HostSeeds();

}  // namespace apefuzz
