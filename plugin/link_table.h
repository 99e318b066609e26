// The emitter's 54 child links: their indices, and the table the constructor declares.
#pragma once

#include <cstdint>

#include "platform/windows_types.h"

enum EmitterLink : int {
  kLinkEmitter = 0,
  kLinkEmitterMotion = 1,
  kLinkEmitterActive = 2,
  kLinkParticleCount = 3,
  kLinkHardwareParticles = 4,
  kLinkLogicUpdatesPerSecond = 5,
  kLinkBirthsPerSecond = 6,
  kLinkReplaceOldParticles = 7,
  kLinkLifespanMin = 8,
  kLinkLifespanMax = 9,
  kLinkLookAt = 10,
  kLinkLookAtLocal = 11,
  kLinkVertexEmissions = 12,
  kLinkInitialForceStrength = 13,
  kLinkInitialForceAlongNormal = 14,
  kLinkInitialForceOverride = 15,
  kLinkGlobalForce = 16,
  kLinkMaximumSpeed = 17,
  kLinkSizeEnvelope = 18,
  kLinkSizeOffsetMax = 19,
  kLinkUseVertexAlphaFading = 20,
  kLinkVertexAlphaEnvelope = 21,
  kLinkRedColorEnvelope = 22,
  kLinkGreenColorEnvelope = 23,
  kLinkBlueColorEnvelope = 24,
  kLinkMultiCollisionManager = 25,
  kLinkBounceRate = 26,
  kLinkAttachRate = 27,
  kLinkAttachedLifespan = 28,
  kLinkAlignToNormals = 29,
  kLinkAttachedSizeOffsetEnvelope = 30,
  kLinkAttachedSizeOffsetAdditive = 31,
  kLinkAttachedAlphaOffsetEnvelope = 32,
  kLinkAttachedRedOffsetEnvelope = 33,
  kLinkAttachedGreenOffsetEnvelope = 34,
  kLinkAttachedBlueOffsetEnvelope = 35,
  kLinkAttachedSlideRate = 36,
  kLinkAttachedSlidingHeight = 37,
  kLinkSlidingSizeOffsetEnvelope = 38,
  kLinkSlidingAttractorImmunity = 39,
  kLinkCollisionReportRate = 40,
  kLinkOutCollisionId = 41,
  kLinkOutCollisionPosition = 42,
  kLinkOutCollisionNormal = 43,
  kLinkBouncingReportCollisions = 44,
  kLinkSpinSpeedMin = 45,
  kLinkSpinSpeedMax = 46,
  kLinkSpinStart = 47,
  kLinkSmoke = 48,
  kLinkSmokeSettings = 49,
  kLinkSimulationScaler = 50,
  kLinkParticleTexture = 51,
  kLinkAttachedTexture = 52,
  kLinkAttractors = 53,
};
constexpr int kEmitterLinkCount = 54;

struct EmitterLinkSpec {
  const char* LinkName;
  const char* TypeName;
  GUID TypeGuid;
  std::int32_t LinkPosition;
  std::uint8_t LinkFlag;
};

// The table in link order.
const EmitterLinkSpec& GetEmitterLinkSpec(int index);
