// Any byte string as a scene file: it either loads, and then runs a few frames soundly, or it is
// refused with one clear line naming the file. Shared by the scene loader fuzzer and the corpus
// replay.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>

namespace apefuzz {

// The name the scene is loaded under; every error line begins with it and a colon.
inline constexpr char kSceneDisplayName[] = "fuzz.json";

struct SceneOutcome {
  // "" when the input loaded and ran soundly or was refused clearly; otherwise the fault (an
  // unclear message, an exception out of the loader, a broken emitter invariant, a malformed
  // debug message, or a device object left once the scene is gone).
  std::string Fault;
  bool Loaded = false;
  std::string Refusal;  // the loader's message when it refused the input
};

// `base_directory` is where the files a scene names are looked up.
SceneOutcome RunSceneInput(const std::uint8_t* data, std::size_t size,
                           const std::string& base_directory);

}  // namespace apefuzz
