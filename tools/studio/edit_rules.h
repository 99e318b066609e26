// What the studio accepts beyond what the scene loader checks: numbers it can show and run
// (finite, within a sane range, and within the ranges of the links that size memory or time),
// and scenes small enough to stream and scrub live.
#pragma once

#include <string>

#include "tools/scene/json_values.h"

namespace apestudio {

// Numbers of an edit must lie within +-kMaximumMagnitude.
inline constexpr double kMaximumMagnitude = 1e6;
// Values nested deeper than this are refused.
inline constexpr int kMaximumValueDepth = 32;
// The largest picture the studio streams, and the longest timeline it re-simulates to scrub.
inline constexpr int kMaximumWidth = 1920;
inline constexpr int kMaximumHeight = 1080;
inline constexpr int kMaximumFrames = 10000;

// Empty when the value may be written at `path`, else why not (one line, for beside the field).
std::string CheckEditValue(const apescene::Json& path, const apescene::Json& value);

// Empty when the whole document's settings suit the studio (the loader checks the rest).
std::string CheckStudioLimits(const apescene::Json& root);

}  // namespace apestudio
