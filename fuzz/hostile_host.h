// The "hostile host": a host context with a recording device, a test clock, channels and up to
// four emitters, driven by a script (host_script.h) that does anything a host may do, in any
// order, with any values. Every invariant is checked after every operation.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>

namespace apefuzz {

// Runs the script on a fresh host and tears it down. Answers the first fault: a broken
// invariant, an exception out of an emitter, a malformed message, or a device object still alive
// once every channel is gone; "" when there was none.
std::string RunHostScript(const std::uint8_t* data, std::size_t size);

}  // namespace apefuzz
