// Smoke collision: smoke steers along a surface it is about to touch and slows before one ahead,
// optionally held back when its new motion would still run into the surface.
#include "host/multi_collision_manager.h"
#include "host/smoke_settings.h"
#include "plugin/advanced_particle_emitter.h"
#include "plugin/link_reading.h"
#include "plugin/link_table.h"
#include "simulation/vector_math.h"

namespace {

// Colours the smoke collision shows with "Debug Colours?".
constexpr std::uint32_t kDebugNoSurface = 0x00FFFFFF;
constexpr std::uint32_t kDebugSteered = 0x00FF0000;
constexpr std::uint32_t kDebugHeldBack = 0x0000FF00;

}  // namespace

void Tev_AdvancedParticleEmitter::SmokeCollisionStage(Particle& p) {
  const Tev_AdvPE_SmokeSettings& smoke = *Frame.SmokeSettings;
  D3DXVECTOR3 origin = p.Position;
  const float speed = sim::Length(p.Velocity);
  D3DXVECTOR3 direction = sim::Unit(p.Velocity);
  const float radius = p.Size / 2.0f;
  D3DXVECTOR3 position;
  D3DXVECTOR3 velocity;
  D3DXVECTOR3 normal;
  if (!SmokeCollisionResponse(smoke.CollisionProbeMinimum, smoke.ApproachSpeedFactor, radius,
                              smoke.ContactSpeedFactor, &origin, speed, &direction, &position,
                              &velocity, &normal)) {
    if (smoke.DebugColours) p.Color = kDebugNoSurface;
    return;
  }
  p.Position = position;
  p.Velocity = velocity;
  if (smoke.DebugColours) p.Color = kDebugSteered;
  if (!smoke.RecheckCollision) return;

  // Would the new motion, from where the particle was, still touch the surface? Then it waits.
  const float newSpeed = sim::Length(p.Velocity);
  D3DXVECTOR3 newDirection = sim::Unit(p.Velocity);
  if (SmokeCollisionResponse(0.0f, 1.0f, radius, 1.0f, &origin, newSpeed, &newDirection, &position,
                             &velocity, &normal)) {
    p.Position = origin;
    p.Velocity = sim::kZeroVector;
    if (smoke.DebugColours) p.Color = kDebugHeldBack;
  }
  // Placed here: the move stage does not add the velocity again in this update.
  PlacedBySmokeCollision = true;
}

bool Tev_AdvancedParticleEmitter::SmokeCollisionResponse(
    float probeMinimum, float approachFactor, float radius, float contactFactor,
    D3DXVECTOR3* position, float speed, D3DXVECTOR3* direction, D3DXVECTOR3* outPosition,
    D3DXVECTOR3* outVelocity, D3DXVECTOR3* outNormal) {
  if (!position || !direction || !outPosition || !outVelocity || !outNormal) return false;
  D3DXVECTOR3 origin = *position;
  const D3DXVECTOR3 heading = *direction;
  const float reach = speed + radius;
  const D3DXVECTOR3 step = heading * reach;
  D3DXVECTOR3 probe = heading * (reach <= probeMinimum ? probeMinimum : reach);

  auto* manager = LinkAs<Tev_MultiCollisionManager>(*this, kLinkMultiCollisionManager);
  if (!manager) return false;
  D3DXVECTOR3 hitPoint;
  D3DXVECTOR3 hitNormal;
  float hitCosine = 0.0f;
  if (manager->GetClosestFrontFaceCollision(&origin, &probe, &hitPoint, &hitNormal, &hitCosine) < 0)
    return false;

  D3DXVECTOR3 velocity;
  if (sim::Length(origin - hitPoint) <= reach) {
    // Contact within this step: the motion continued along the surface plane, no faster.
    D3DXVECTOR3 along = sim::ProjectOntoPlane(origin + step, hitPoint, hitNormal) - hitPoint;
    if (sim::Length(along) > speed) along = sim::Unit(along) * speed;
    velocity = along * contactFactor;
  } else {
    // The surface lies ahead beyond this step's reach: approach it more slowly.
    velocity = heading * speed * approachFactor;
  }
  *outVelocity = velocity;
  *outPosition = origin + velocity;
  *outNormal = hitNormal;
  return true;
}
