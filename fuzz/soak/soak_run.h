// One scene run for many frames on the reference device, with the emitter invariants checked
// after every frame and the live heap watched for growth.
#pragma once

#include <cstddef>
#include <string>

namespace apefuzz {

struct SoakResult {
  std::string Fault;  // "" when every frame kept the invariants and memory did not grow
  int Frames = 0;     // frames run
  int Emitters = 0;
  std::size_t HeapAfterWarmUp = 0;  // bytes, once every pool has filled
  std::size_t HeapAtEnd = 0;        // bytes
  std::size_t HeapPeak = 0;         // bytes, sampled
  int Messages = 0;
};

// Frames from the warm-up on may raise the live heap by at most this many bytes.
inline constexpr std::size_t kAllowedHeapGrowth = 512 * 1024;

SoakResult SoakScene(const std::string& path, int frames);

}  // namespace apefuzz
