#include "simulation/tests/emitter_fixture.h"

#include <algorithm>
#include <cstdlib>

EmitterTest::EmitterTest() : device(MemoryDevice::Create()) {
  deviceChannel = std::make_unique<Tev_DX8_DeviceChannel>(device);
  context.DebugMessages.SetSink([this](const char* text) { debugMessages.emplace_back(text); });
  context.OverloadMessages.SetSink(
      [this](const char* text) { overloadMessages.emplace_back(text); });
  emitter = std::make_unique<Tev_AdvancedParticleEmitter>();
}

EmitterTest::~EmitterTest() {
  emitter.reset();
  channels_.clear();
  deviceChannel.reset();
  device->Release();
}

Qen_ValueChannel* EmitterTest::SetValue(int link, float value, Qen_Channel* owner) {
  if (!owner) owner = emitter.get();
  auto* channel = static_cast<Qen_ValueChannel*>(owner->GetChild(link));
  if (!channel) channel = Link(*owner, link, Make<Qen_ValueChannel>(value));
  channel->SetValue(value);
  return channel;
}

Qen_ValueVectorChannel* EmitterTest::SetVector(int link, D3DXVECTOR3 vector) {
  auto* channel = static_cast<Qen_ValueVectorChannel*>(emitter->GetChild(link));
  if (!channel) channel = Link(*emitter, link, Make<Qen_ValueVectorChannel>(vector));
  channel->SetVector(vector);
  return channel;
}

Tev_EnvelopeStorage* EmitterTest::SetEnvelope(int link, const Keys& keys, Qen_Channel* owner) {
  auto* envelope = Make<Tev_EnvelopeStorage>();
  for (const auto& [x, y] : keys) envelope->AddKey(x, y);
  return Link(owner ? *owner : *emitter, link, envelope);
}

Tev_DX8_ObjectDataChannel* EmitterTest::SetEmitterMesh(const std::vector<D3DXVECTOR3>& vertices,
                                                       const std::vector<DWORD>& indices,
                                                       const std::vector<D3DXVECTOR3>& normals) {
  auto* mesh = Make<Tev_DX8_ObjectDataChannel>();
  mesh->SetVertexCount(static_cast<int>(vertices.size()));
  for (int v = 0; v < static_cast<int>(vertices.size()); ++v) {
    mesh->SetVertexPosition(vertices[v], v);
    mesh->SetVertexNormal(v < static_cast<int>(normals.size()) ? normals[v] : D3DXVECTOR3(0, 1, 0),
                          v);
  }
  mesh->SetIndexCount(static_cast<int>(indices.size()));
  for (int i = 0; i < static_cast<int>(indices.size()); ++i) mesh->SetIndex(indices[i], i);
  return Link(*emitter, kLinkEmitter, mesh);
}

void EmitterTest::LinkBasics(float count, float logicPerSecond, float birthsPerSecond) {
  SetValue(kLinkParticleCount, count);
  SetValue(kLinkLogicUpdatesPerSecond, logicPerSecond);
  SetValue(kLinkBirthsPerSecond, birthsPerSecond);
  SetValue(kLinkEmitterActive, 1.0f);
  SetValue(kLinkVertexEmissions, 1.0f);
  SetValue(kLinkLifespanMin, 100.0f);
  SetValue(kLinkLifespanMax, 100.0f);
  D3DXMATRIX identity;
  D3DXMatrixIdentity(&identity);
  Link(*emitter, kLinkEmitterMotion, Make<Qen_MatrixChannel>(identity));
  SetEmitterMesh({{0.0f, 0.0f, 0.0f}}, {});
}

void EmitterTest::RunFrame(double ms) {
  clock.AdvanceMs(ms);
  context.AdvanceFrame();
  emitter->CallChannel();
}

Smoke* EmitterTest::LinkSmoke() {
  SetValue(kLinkSmoke, 1.0f);
  return Link(*emitter, kLinkSmokeSettings, Make<Smoke>());
}

int EmitterTest::ActiveCount() const {
  return static_cast<int>(std::count_if(emitter->Particles.begin(), emitter->Particles.end(),
                                        [](const Particle& p) { return p.Active; }));
}

Particle& EmitterTest::PlaceParticle(int index, D3DXVECTOR3 position, D3DXVECTOR3 velocity,
                                     float lifespan) {
  Particle& p = P(index);
  p = Particle{};
  p.Active = p.Bouncing = true;
  p.Position = p.RenderPosition = position;
  p.Velocity = velocity;
  p.Lifespan = lifespan;
  p.SizeMultiplier = 1.0f;
  return p;
}

void ExpectNear(const D3DXVECTOR3& actual, const D3DXVECTOR3& expected, float tolerance) {
  EXPECT_NEAR(actual.x, expected.x, tolerance);
  EXPECT_NEAR(actual.y, expected.y, tolerance);
  EXPECT_NEAR(actual.z, expected.z, tolerance);
}

std::vector<int> RandSequence(unsigned seed, int count) {
  std::srand(seed);
  std::vector<int> sequence;
  for (int i = 0; i < count; ++i) sequence.push_back(std::rand());
  std::srand(seed);
  return sequence;
}

int DrawsTaken(const std::vector<int>& sequence) {
  const auto at = std::find(sequence.begin(), sequence.end(), std::rand());
  return at == sequence.end() ? -1 : static_cast<int>(at - sequence.begin());
}
