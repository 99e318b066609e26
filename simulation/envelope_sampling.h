// How envelope samples become colour bytes and packed A8R8G8B8 colours.
#pragma once

#include <cstdint>

class Tev_EnvelopeStorage;

namespace sim {

// The envelope's value at x as a colour byte (truncated, capped at 255, no lower bound), or 0
// when the envelope is absent.
std::int32_t ColorByteAt(Tev_EnvelopeStorage* envelope, float x);

// Only the low eight bits of each component enter the colour (free particles: a component of -1
// becomes 0xFF).
std::uint32_t PackColorLowBits(std::int32_t alpha, std::int32_t red, std::int32_t green,
                               std::int32_t blue);

// Each component clamped to 0..255 first (attached particles).
std::uint32_t PackColorClamped(std::int32_t alpha, std::int32_t red, std::int32_t green,
                               std::int32_t blue);

}  // namespace sim
