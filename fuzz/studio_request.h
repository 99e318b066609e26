// A script of requests to the studio's HTTP interface, one per line:
//   [flags]METHOD PATH [BODY]
// where the flags are "!" (no token), "@" (another Host) and "~" (another site's Origin). Each
// script runs on a studio opened afresh on the fountain (reference device) in a scratch folder.
// Shared by the studio request fuzzer and the corpus replay.
//
// So that every input runs within seconds, requests that would make the studio re-simulate long
// timelines or huge pools are skipped: seeks beyond frame 240, edits of the timeline's length or
// rate, and edits of the pool size, birth rate or logic rate above 2,000. At most 16 requests are
// made, and the engine runs one frame after each.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>

class PluginLoader;

namespace apefuzz {

struct StudioOutcome {
  // "" when every answer was sound; otherwise what was not: a 500 (an exception escaped), an
  // answer of an unexpected status or that is not JSON, a refused request that changed the
  // scene, or a request without the token, Host or Origin of the studio that was answered.
  std::string Fault;
  int Requests = 0;  // made (not skipped)
  int Accepted = 0;  // answered 200
};

StudioOutcome RunStudioRequests(const std::uint8_t* data, std::size_t size,
                                const std::string& scene_directory);

}  // namespace apefuzz
