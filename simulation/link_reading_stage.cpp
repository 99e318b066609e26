// The link reading stage of a working frame: every setting is re-read from its link, in a fixed
// order (envelope and smoke settings are prepared before the collision output is reset).
#include <exception>

#include "host/envelope_storage.h"
#include "host/multi_collision_manager.h"
#include "host/smoke_settings.h"
#include "plugin/advanced_particle_emitter.h"
#include "plugin/link_reading.h"
#include "plugin/link_table.h"
#include "simulation/envelope_sampling.h"
#include "simulation/particle_pool.h"

namespace {

Tev_EnvelopeStorage* EnvelopeLink(const Tev_AdvancedParticleEmitter& e, int index) {
  return LinkAs<Tev_EnvelopeStorage>(e, index);
}

// Stores `*member` from the link when present; a missing link keeps the member.
void KeepOrRead(const Tev_AdvancedParticleEmitter& e, int index, float* member) {
  if (Qen_ValueChannel* link = ValueLink(e, index)) *member = link->GetValue();
}
void KeepOrReadYes(const Tev_AdvancedParticleEmitter& e, int index, bool* member) {
  if (Qen_ValueChannel* link = ValueLink(e, index)) *member = IsYes(link->GetValue());
}
void KeepOrReadVector(const Tev_AdvancedParticleEmitter& e, int index, D3DXVECTOR3* member) {
  if (Qen_ValueVectorChannel* link = VectorLink(e, index)) *member = link->GetVector();
}

void ReadMainEnvelopes(Tev_AdvancedParticleEmitter& e) {
  sim::HoldMainEnvelopes(e);
  for (Tev_EnvelopeStorage* envelope :
       {e.SizeEnvelope, e.AlphaEnvelope, e.RedEnvelope, e.GreenEnvelope, e.BlueEnvelope})
    if (envelope) envelope->Initialize();
}

// A changed pool size or drawing path rebuilds the emitter at the next call; this frame runs on.
void CheckRebuild(Tev_AdvancedParticleEmitter& e) {
  if (Qen_ValueChannel* count = ValueLink(e, kLinkParticleCount))
    if (sim::PoolSizeFor(count->GetValue()).Count != e.RequestedParticleCount)
      e.Initialized = false;
  if (Qen_ValueChannel* hardware = ValueLink(e, kLinkHardwareParticles))
    if (IsYes(hardware->GetValue()) != e.HardwareParticles) e.Initialized = false;
}

void ReadSmoke(Tev_AdvancedParticleEmitter& e) {
  e.SmokeEnabled = false;
  e.Frame.SmokeSettings = LinkAs<Tev_AdvPE_SmokeSettings>(e, kLinkSmokeSettings);
  Qen_ValueChannel* smoke = ValueLink(e, kLinkSmoke);
  if (smoke && e.Frame.SmokeSettings && IsYes(smoke->GetValue())) {
    e.SmokeEnabled = true;
    e.Frame.SmokeSettings->FetchAllSettings();
  }
}

// 0 or below pauses; above 3, or NaN, runs at 1.
void ReadSimulationScaler(Tev_AdvancedParticleEmitter& e) {
  e.SimulationScaler = 1.0f;
  e.Paused = false;
  Qen_ValueChannel* link = ValueLink(e, kLinkSimulationScaler);
  if (!link) return;
  const float v = link->GetValue();
  if (v <= 0.0f)
    e.Paused = true;
  else if (v <= 3.0f)
    e.SimulationScaler = v;
}

void ReadSpin(Tev_AdvancedParticleEmitter& e) {
  Qen_ValueChannel* minimum = ValueLink(e, kLinkSpinSpeedMin);
  Qen_ValueChannel* maximum = ValueLink(e, kLinkSpinSpeedMax);
  if (minimum && maximum) {
    e.SpinSpeedMin = minimum->GetValue();
    e.SpinSpeedMax = maximum->GetValue();
    e.SpinEnabled = true;
  } else {
    e.SpinSpeedMin = 0.0f;
    e.SpinSpeedMax = 0.0f;
    e.SpinEnabled = false;
  }
  // A start angle alone switches spin on.
  if (Qen_ValueChannel* start = ValueLink(e, kLinkSpinStart)) {
    e.SpinStart = start->GetValue();
    e.SpinEnabled = true;
  }
}

void ReadMotionAndBirthSettings(Tev_AdvancedParticleEmitter& e) {
  if (Qen_ValueChannel* speed = ValueLink(e, kLinkMaximumSpeed)) {
    e.MaximumSpeed = speed->GetValue();
    e.HasMaximumSpeed = true;
  } else {
    e.HasMaximumSpeed = false;
  }
  KeepOrRead(e, kLinkInitialForceStrength, &e.InitialForceStrength);
  KeepOrReadYes(e, kLinkInitialForceAlongNormal, &e.InitialForceAlongNormal);
  KeepOrReadYes(e, kLinkVertexEmissions, &e.VertexEmissions);
  KeepOrReadVector(e, kLinkLookAt, &e.LookAt);
  KeepOrReadYes(e, kLinkLookAtLocal, &e.LookAtLocal);
  KeepOrReadYes(e, kLinkReplaceOldParticles, &e.ReplaceOldParticles);
  KeepOrRead(e, kLinkLifespanMin, &e.LifespanMin);
  KeepOrRead(e, kLinkLifespanMax, &e.LifespanMax);
  e.HasInitialForceOverride = false;
  if (Qen_ValueVectorChannel* override_force = VectorLink(e, kLinkInitialForceOverride)) {
    e.InitialForceOverride = override_force->GetVector();
    e.HasInitialForceOverride = true;
  }
  KeepOrReadVector(e, kLinkGlobalForce, &e.GlobalForce);
}

// Channels the per-particle stages use, held for this frame only.
void HoldFrameLinks(Tev_AdvancedParticleEmitter& e) {
  auto& frame = e.Frame;
  frame.CollisionManager = LinkAs<Tev_MultiCollisionManager>(e, kLinkMultiCollisionManager);
  frame.AttachedSizeOffsetEnvelope = EnvelopeLink(e, kLinkAttachedSizeOffsetEnvelope);
  frame.AttachedAlphaOffsetEnvelope = EnvelopeLink(e, kLinkAttachedAlphaOffsetEnvelope);
  frame.AttachedRedOffsetEnvelope = EnvelopeLink(e, kLinkAttachedRedOffsetEnvelope);
  frame.AttachedGreenOffsetEnvelope = EnvelopeLink(e, kLinkAttachedGreenOffsetEnvelope);
  frame.AttachedBlueOffsetEnvelope = EnvelopeLink(e, kLinkAttachedBlueOffsetEnvelope);
  frame.SlidingSizeOffsetEnvelope = EnvelopeLink(e, kLinkSlidingSizeOffsetEnvelope);
}

// Room for what the logic steps take at their start, so that the steps allocate nothing. Without
// it the steps fetch per particle, as they would anyway.
void ReserveStepMemory(Tev_AdvancedParticleEmitter& e) {
  try {
    e.Step.Attractors.reserve(
        static_cast<std::size_t>(e.GetChildLinkPositionCount(kLinkAttractors)));
  } catch (const std::exception&) {
  }
  if (e.SmokeEnabled) {
    const Tev_AdvPE_SmokeSettings& smoke = *e.Frame.SmokeSettings;
    if (smoke.RepulsionEnvelope || smoke.AttractionEnvelope)
      e.Step.SmokePairs.Reserve(e.ParticleCount);
  }
}

}  // namespace

void Tev_AdvancedParticleEmitter::ReadLinks() {
  // Each link is read at its place in this order: a host may watch its channels being read.
  ReadMainEnvelopes(*this);
  AttachedSizeOffsetAdditive = YesOrNo(*this, kLinkAttachedSizeOffsetAdditive);
  CheckRebuild(*this);
  ReadCollisionFlags();
  KeepOrRead(*this, kLinkSizeOffsetMax, &SizeOffsetMax);
  ReadSmoke(*this);
  UseVertexAlphaFading = YesOrNo(*this, kLinkUseVertexAlphaFading);
  ReadAttachedSettings();
  ReadSimulationScaler(*this);
  ReadSpin(*this);
  if (auto* motion = LinkAs<Qen_MatrixChannel>(*this, kLinkEmitterMotion))
    EmitterMotion = motion->GetMatrix();
  // The reset of "Out: Collision ID" comes after the smoke settings were fetched.
  ReadCollisionOutcomes();
  ReadMotionAndBirthSettings(*this);
  HoldFrameLinks(*this);
  ReserveStepMemory(*this);
}
