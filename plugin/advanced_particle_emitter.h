// "AdvancedParticleEmitter": a CPU particle system channel, configured through 54 child links,
// simulated in fixed-rate logic steps and drawn as camera-facing quads or point sprites.
//
// The class is exported whole: the host and other channels may read its members. Its operations
// are defined across plugin/, simulation/ and render/, one file per concern.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

#include "host/object_data_channel.h"
#include "render/vertex_layouts.h"
#include "simulation/birth_run.h"
#include "simulation/logic_step.h"
#include "simulation/particle.h"

class Tev_DX8_DeviceChannel;
class Tev_EnvelopeStorage;
class Tev_MultiCollisionManager;
class Tev_AdvPE_SmokeSettings;
class Qen_ValueChannel;
class Qen_ValueVectorChannel;

class Tev_AdvancedParticleEmitter : public Tev_DX8_ObjectDataChannel {
 public:
  // The largest pool the emitter builds; a larger "ParticleCount" is capped with a message.
  // Pool, quads and point sprites together stay under about 400 MB at the cap.
  static constexpr std::int32_t kMaximumParticleCount = 1'000'000;
  // Per-frame caps of the catch-up loops.
  static constexpr int kMaximumBirthsPerFrame = 1000;  // the message follows birth 1001
  static constexpr int kMaximumLogicStepsPerFrame = 1000;

  Tev_AdvancedParticleEmitter();
  // A copy gets a pool of its own and starts without drawing resources (LocalVertices,
  // PointSpriteVertices, PointSpriteVertexBuffer, CompositeTexture null, Initialized false), so
  // that its first frame rebuilds them: the source keeps sole ownership of its own.
  Tev_AdvancedParticleEmitter(const Tev_AdvancedParticleEmitter& other);
  Tev_AdvancedParticleEmitter& operator=(const Tev_AdvancedParticleEmitter& other);
  ~Tev_AdvancedParticleEmitter() override;

  // --- Overrides, in slot order ---
  void CallChannel() override;
  void DoDependencyInit(Qen_List* list) override;
  void StreamTextureMatrices() override;
  bool GetIfObjectIsVisible() override;
  void DoCustomPreRenderStates() override;
  void SetTextureTransform(int set, int transform) override;
  ChannelType GetChannelType() override;

  // --- Frame driver ---
  void EnableActiveTimer(float seconds);
  int RandInt(int low, int high);

  // --- Initialization ---
  void Initialize();

  // --- Birth ---
  void BirthParticle(int birthIndex);

  // --- Pool ---
  bool GetIfParticleActive(int index);
  D3DXVECTOR3 GetParticlePosition(int index);
  int GetInactiveParticle();
  int GetOldestParticle();

  // --- Smoke collision ---
  bool SmokeCollisionResponse(float probeMinimum, float approachFactor, float radius,
                              float contactFactor, D3DXVECTOR3* position, float speed,
                              D3DXVECTOR3* direction, D3DXVECTOR3* outPosition,
                              D3DXVECTOR3* outVelocity, D3DXVECTOR3* outNormal);

  // --- Interpolation ---
  void InterpolateParticles(float t);
  // The same, building each slot's point-sprite vertex (as UpdatePointSpriteVertexBuffer does)
  // in the same pass over the pool; the buffer copy is left to CopyPointSpritesToBuffer.
  void InterpolateParticlesAndPointSprites(float t);

  // --- Quad path ---
  void UpdateLocalVertexBuffer();
  void InitializeBaseClassBuffers();
  void InitializeLocalVertexBuffer();
  bool WriteLocalVertexBufferToBaseClass();

  // --- Point-sprite path ---
  void InitializePointSpriteVertexBuffer();
  void UpdatePointSpriteVertexBuffer();  // every slot's vertex, then the buffer copy
  std::size_t PointSpriteSlots() const;  // slots with a vertex in PointSpriteVertices
  void CopyPointSpritesToBuffer();
  void StreamPointSprites();
  void RenderPointSprites();

  // --- Quad render pass ---
  void RenderSprites();

  // --- Internal stages (public because the class is exported whole; not for hosts) ---
  void ReadLinks();  // frame driver, link reading stage
  // The collision settings members and per-frame links, read at their places in the stage.
  void ReadCollisionFlags();
  void ReadAttachedSettings();
  void ReadCollisionOutcomes();
  void RunLogicStep();                 // one logic step over the pool
  void UpdateParticles();              // each record's pending updates, in index order
  void UpdateParticle(int index);      // dispatch: attached, inactive or live
  void UpdateLiveParticle(int index);  // stages L1 to L14
  void UpdateAttachedParticle(Particle& particle);
  // Live and sliding size, and colour, through Step.Envelopes: the running step's views, or
  // those UpdateParticle took.
  void ApplySizeEnvelope(Particle& particle);
  void ApplyColorEnvelopes(Particle& particle);
  void CollisionStage(Particle& particle);       // L8
  void SmokeStage(int index);                    // L9a to L9f
  void SmokeCollisionStage(Particle& particle);  // L9e
  void BuildCompositeTexture();
  void ReleaseDrawingResources();
  void ShowDebug(const char* text);     // through DebugMessages
  void ShowOverload(const char* text);  // through OverloadMessages

  // --- Pool and drawing resources ---
  std::vector<Particle> Particles;
  std::int32_t ParticleCount = 0;
  // The pool size the last Initialize was asked for (after the cap). Equal to ParticleCount unless
  // the memory could not be had; the frame driver's re-initialization check compares against it,
  // so a failed allocation is not retried every frame.
  std::int32_t RequestedParticleCount = 0;
  bool HardwareParticles = false;
  LocalVertex* LocalVertices = nullptr;
  PointSpriteVertex* PointSpriteVertices = nullptr;
  IDirect3DVertexBuffer9* PointSpriteVertexBuffer = nullptr;
  IDirect3DTexture9* CompositeTexture = nullptr;
  bool HasCompositeTexture = false;
  Tev_DX8_DeviceChannel* DeviceChannel = nullptr;
  bool VerticesDirty = false;

  // --- Life cycle and timing ---
  bool Initialized = false;
  std::uint32_t LastFrameCounter = 0;
  bool NewFrame = false;
  float CounterFrequency = 0.0f;  // ticks per second
  LARGE_INTEGER LastCounter{};
  // 1 until a frame reads "Simulation Scaler", so that a birth requested before any frame
  // (BirthParticle is public) does not divide by zero.
  float SimulationScaler = 1.0f;
  bool Paused = false;
  float BirthsPerSecond = 0.0f;
  float BirthInterval = 0.0f;     // ms
  float BirthAccumulator = 0.0f;  // ms
  float LogicUpdatesPerSecond = 0.0f;
  float LogicInterval = 0.0f;     // ms
  float LogicAccumulator = 0.0f;  // ms
  bool ActiveTimerOn = false;
  float ActiveTimerDuration = 0.0f;  // seconds
  float ActiveTimerElapsed = 0.0f;   // seconds

  // --- Birth settings ---
  bool ReplaceOldParticles = false;
  float LifespanMin = 0.0f;  // seconds
  float LifespanMax = 0.0f;  // seconds
  bool VertexEmissions = false;
  D3DXMATRIX EmitterMotion{};
  bool HasInitialForceOverride = false;
  D3DXVECTOR3 InitialForceOverride{0.0f, 0.0f, 0.0f};
  float InitialForceStrength = 0.0f;
  bool InitialForceAlongNormal = false;
  float SizeOffsetMax = 0.0f;
  bool SpinEnabled = false;
  float SpinSpeedMin = 0.0f;  // radians per logic step
  float SpinSpeedMax = 0.0f;  // radians per logic step
  float SpinStart = 0.0f;     // radians

  // --- Motion, look-at and smoke ---
  D3DXVECTOR3 GlobalForce{0.0f, 0.0f, 0.0f};
  float MaximumSpeed = 0.0f;
  bool HasMaximumSpeed = false;
  D3DXVECTOR3 LookAt{0.0f, 0.0f, 0.0f};
  bool LookAtLocal = false;
  bool SmokeEnabled = false;
  bool PlacedBySmokeCollision = false;

  // --- Envelopes (not owned; re-fetched every working frame) ---
  Tev_EnvelopeStorage* SizeEnvelope = nullptr;
  Tev_EnvelopeStorage* AlphaEnvelope = nullptr;
  Tev_EnvelopeStorage* RedEnvelope = nullptr;
  Tev_EnvelopeStorage* GreenEnvelope = nullptr;
  Tev_EnvelopeStorage* BlueEnvelope = nullptr;
  bool UseVertexAlphaFading = false;

  // --- Collision settings ---
  bool CollisionResponse = false;
  float AttachRate = 0.0f;
  float BounceRate = 0.0f;
  float AttachedLifespan = 0.0f;  // seconds
  float AttachedSlideRate = 0.0f;
  float AttachedSlidingHeight = 0.0f;
  bool AlignToNormals = false;
  bool AttachedSizeOffsetAdditive = false;
  float CollisionReportRate = 0.0f;
  bool ReportCollisions = false;
  bool BouncingReportCollisions = false;
  bool SlidingAttractorImmunity = false;

  // Links held for one working frame (not owned), fetched by the link reading stage.
  struct FrameLinks {
    Tev_MultiCollisionManager* CollisionManager = nullptr;
    Tev_AdvPE_SmokeSettings* SmokeSettings = nullptr;
    Tev_EnvelopeStorage* AttachedSizeOffsetEnvelope = nullptr;
    Tev_EnvelopeStorage* AttachedAlphaOffsetEnvelope = nullptr;
    Tev_EnvelopeStorage* AttachedRedOffsetEnvelope = nullptr;
    Tev_EnvelopeStorage* AttachedGreenOffsetEnvelope = nullptr;
    Tev_EnvelopeStorage* AttachedBlueOffsetEnvelope = nullptr;
    Tev_EnvelopeStorage* SlidingSizeOffsetEnvelope = nullptr;
    Qen_ValueChannel* OutCollisionId = nullptr;
    Qen_ValueVectorChannel* OutCollisionPosition = nullptr;
    Qen_ValueVectorChannel* OutCollisionNormal = nullptr;
  };
  FrameLinks Frame;

  // Taken at the start of each logic step and dropped at its end (scratch: never copied).
  sim::LogicStepState Step;
  // Carried between the births of one frame (scratch: never copied).
  sim::BirthRunState BirthRun;

 private:
  void CopySettingsFrom(const Tev_AdvancedParticleEmitter& other);
};
