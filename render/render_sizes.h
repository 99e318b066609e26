// Counts and byte sizes of the drawing buffers, computed in one place so that every buffer, loop
// and copy of a path agrees and none can wrap.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>

#include "platform/windows_types.h"

// Pool slots the drawing buffers hold: ParticleCount, with a negative count as 0 and a count
// above the emitter's largest pool as that largest pool (whose quad mesh still fits int32
// vertex numbers and index positions).
std::size_t DrawnSlotCount(std::int32_t particle_count);

// Bytes of `count` records of `stride` bytes, or nothing when a Direct3D length (UINT) cannot
// hold them.
std::optional<UINT> BufferBytes(std::size_t count, std::size_t stride);
