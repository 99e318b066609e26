// The point-sprite vertex of one pool slot, written in one place for every loop that builds them.
#pragma once

#include "render/vertex_layouts.h"
#include "simulation/particle.h"

// At the slot's render position, in its colour; a dead particle's slot shrinks to nothing, as its
// quad collapses on the quad path.
inline PointSpriteVertex PointSpriteOf(const Particle& particle) {
  return {particle.RenderPosition, particle.Active ? particle.Size : 0.0f, particle.Color};
}
