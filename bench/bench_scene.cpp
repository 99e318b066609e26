#include "bench/bench_scene.h"

#include <cstdlib>

#include "host/link_channels.h"
#include "host/object_data_channel.h"
#include "plugin/link_table.h"

namespace bench {

float RandomBetween(float low, float high) {
  return low + (high - low) * static_cast<float>(std::rand() % 1'000'000) * 1e-6f;
}

Scene::Scene(int count, bool pointSprites)
    : device_(MemoryDevice::Create()), deviceChannel_(device_) {
  emitter_ = std::make_unique<Tev_AdvancedParticleEmitter>();
  Value(kLinkParticleCount, static_cast<float>(count));
  Value(kLinkHardwareParticles, pointSprites ? 1.0f : 0.0f);
  Value(kLinkLogicUpdatesPerSecond, 60.0f);
  Value(kLinkBirthsPerSecond, 0.0f);
  Value(kLinkEmitterActive, 1.0f);
  std::srand(1u);
}

Scene::~Scene() {
  emitter_.reset();
  owned_.clear();
  device_->Release();
}

void Scene::Value(int link, float value) {
  emitter_->SetChild(link, Own(std::make_unique<Qen_ValueChannel>(value)));
}

void Scene::Vector(int link, D3DXVECTOR3 value) {
  emitter_->SetChild(link, Own(std::make_unique<Qen_ValueVectorChannel>(value)));
}

Tev_EnvelopeStorage* Scene::Envelope(int link, float start, float end) {
  auto* envelope = Own(std::make_unique<Tev_EnvelopeStorage>());
  envelope->AddKey(0.0f, start);
  envelope->AddKey(0.5f, (start + end) * 0.5f);
  envelope->AddKey(1.0f, end);
  envelope->Initialize();
  if (link >= 0) emitter_->SetChild(link, envelope);
  return envelope;
}

void Scene::LinkBasicEffect() {
  Vector(kLinkGlobalForce, {0.0f, -0.002f, 0.0f});
  Envelope(kLinkSizeEnvelope, 1.0f, 3.0f);
  Envelope(kLinkVertexAlphaEnvelope, 255.0f, 0.0f);
  Envelope(kLinkRedColorEnvelope, 255.0f, 64.0f);
  Envelope(kLinkGreenColorEnvelope, 128.0f, 32.0f);
  Envelope(kLinkBlueColorEnvelope, 0.0f, 200.0f);
}

void Scene::LinkEmitterSquare(float size, float height) {
  auto* mesh = Own(std::make_unique<Tev_DX8_ObjectDataChannel>());
  mesh->SetVertexCount(4);
  const D3DXVECTOR3 corners[4] = {
      {0.0f, height, 0.0f}, {size, height, 0.0f}, {size, height, size}, {0.0f, height, size}};
  for (int v = 0; v < 4; ++v) {
    mesh->SetVertexPosition(corners[v], v);
    mesh->SetVertexNormal({0.0f, 1.0f, 0.0f}, v);
  }
  mesh->SetIndexCount(6);
  const DWORD indices[6] = {0, 1, 2, 2, 3, 0};
  for (int i = 0; i < 6; ++i) mesh->SetIndex(indices[i], i);
  D3DXMATRIX identity;
  D3DXMatrixIdentity(&identity);
  mesh->SetWorldMatrix(identity);
  emitter_->SetChild(kLinkEmitter, mesh);
  emitter_->SetChild(kLinkEmitterMotion, Own(std::make_unique<Qen_MatrixChannel>(identity)));
}

void Scene::Start() {
  emitter_->CallChannel();
  context_.AdvanceFrame();
  emitter_->CallChannel();
}

void Scene::RunFrame(double ms) {
  clock_.AdvanceMs(ms);
  context_.AdvanceFrame();
  emitter_->CallChannel();
  // The reference device logs every call; keep its log from growing without bound.
  if (++frames_ % 256 == 0) device_->ClearCalls();
}

void Scene::FillCloud(D3DXVECTOR3 low, float size, D3DXVECTOR3 velocity) {
  for (int i = 0; i < emitter_->ParticleCount; ++i) {
    Particle& p = emitter_->Particles[static_cast<std::size_t>(i)];
    p = Particle{};
    p.Active = true;
    p.Bouncing = true;
    p.Lifespan = RandomBetween(2.0f, 6.0f);
    p.Age = p.Lifespan * RandomBetween(0.0f, 0.95f);
    p.SizeMultiplier = RandomBetween(1.0f, 1.5f);
    p.Position = {low.x + RandomBetween(0.0f, size), low.y + RandomBetween(0.0f, size),
                  low.z + RandomBetween(0.0f, size)};
    p.RenderPosition = p.Position;
    p.Velocity = velocity;
  }
}

}  // namespace bench
