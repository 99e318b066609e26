// Copying an emitter. The copy gets its own pool; the drawing resources stay with the source
// (both would give them back otherwise), so the copy starts uninitialized and its first frame
// rebuilds them.
#include "plugin/advanced_particle_emitter.h"

Tev_AdvancedParticleEmitter::Tev_AdvancedParticleEmitter(const Tev_AdvancedParticleEmitter& other)
    : Tev_DX8_ObjectDataChannel(other) {
  CopySettingsFrom(other);
}

Tev_AdvancedParticleEmitter& Tev_AdvancedParticleEmitter::operator=(
    const Tev_AdvancedParticleEmitter& other) {
  if (this == &other) return *this;
  ReleaseDrawingResources();
  Tev_DX8_ObjectDataChannel::operator=(other);
  CopySettingsFrom(other);
  return *this;
}

// Every member in declaration order, except the owned drawing resources, which stay null, and
// Initialized, which stays false.
void Tev_AdvancedParticleEmitter::CopySettingsFrom(const Tev_AdvancedParticleEmitter& o) {
  Particles = o.Particles;
  ParticleCount = o.ParticleCount;
  RequestedParticleCount = o.RequestedParticleCount;
  HardwareParticles = o.HardwareParticles;
  HasCompositeTexture = false;
  DeviceChannel = o.DeviceChannel;
  VerticesDirty = o.VerticesDirty;

  Initialized = false;
  LastFrameCounter = o.LastFrameCounter;
  NewFrame = o.NewFrame;
  CounterFrequency = o.CounterFrequency;
  LastCounter = o.LastCounter;
  SimulationScaler = o.SimulationScaler;
  Paused = o.Paused;
  BirthsPerSecond = o.BirthsPerSecond;
  BirthInterval = o.BirthInterval;
  BirthAccumulator = o.BirthAccumulator;
  LogicUpdatesPerSecond = o.LogicUpdatesPerSecond;
  LogicInterval = o.LogicInterval;
  LogicAccumulator = o.LogicAccumulator;
  ActiveTimerOn = o.ActiveTimerOn;
  ActiveTimerDuration = o.ActiveTimerDuration;
  ActiveTimerElapsed = o.ActiveTimerElapsed;

  ReplaceOldParticles = o.ReplaceOldParticles;
  LifespanMin = o.LifespanMin;
  LifespanMax = o.LifespanMax;
  VertexEmissions = o.VertexEmissions;
  EmitterMotion = o.EmitterMotion;
  HasInitialForceOverride = o.HasInitialForceOverride;
  InitialForceOverride = o.InitialForceOverride;
  InitialForceStrength = o.InitialForceStrength;
  InitialForceAlongNormal = o.InitialForceAlongNormal;
  SizeOffsetMax = o.SizeOffsetMax;
  SpinEnabled = o.SpinEnabled;
  SpinSpeedMin = o.SpinSpeedMin;
  SpinSpeedMax = o.SpinSpeedMax;
  SpinStart = o.SpinStart;

  GlobalForce = o.GlobalForce;
  MaximumSpeed = o.MaximumSpeed;
  HasMaximumSpeed = o.HasMaximumSpeed;
  LookAt = o.LookAt;
  LookAtLocal = o.LookAtLocal;
  SmokeEnabled = o.SmokeEnabled;
  PlacedBySmokeCollision = o.PlacedBySmokeCollision;

  SizeEnvelope = o.SizeEnvelope;
  AlphaEnvelope = o.AlphaEnvelope;
  RedEnvelope = o.RedEnvelope;
  GreenEnvelope = o.GreenEnvelope;
  BlueEnvelope = o.BlueEnvelope;
  UseVertexAlphaFading = o.UseVertexAlphaFading;

  CollisionResponse = o.CollisionResponse;
  AttachRate = o.AttachRate;
  BounceRate = o.BounceRate;
  AttachedLifespan = o.AttachedLifespan;
  AttachedSlideRate = o.AttachedSlideRate;
  AttachedSlidingHeight = o.AttachedSlidingHeight;
  AlignToNormals = o.AlignToNormals;
  AttachedSizeOffsetAdditive = o.AttachedSizeOffsetAdditive;
  CollisionReportRate = o.CollisionReportRate;
  ReportCollisions = o.ReportCollisions;
  BouncingReportCollisions = o.BouncingReportCollisions;
  SlidingAttractorImmunity = o.SlidingAttractorImmunity;

  Frame = o.Frame;
}
