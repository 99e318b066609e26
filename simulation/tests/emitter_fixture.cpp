#include "simulation/tests/emitter_fixture.h"

#include <algorithm>

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

Qen_ValueChannel* EmitterTest::SetValue(int link, float value) {
  auto* channel = static_cast<Qen_ValueChannel*>(emitter->GetChild(link));
  if (!channel) {
    channel = Make<Qen_ValueChannel>(value);
    EXPECT_TRUE(emitter->SetChild(link, channel)) << "link " << link;
  }
  channel->SetValue(value);
  return channel;
}

Qen_ValueVectorChannel* EmitterTest::SetVector(int link, D3DXVECTOR3 vector) {
  auto* channel = static_cast<Qen_ValueVectorChannel*>(emitter->GetChild(link));
  if (!channel) {
    channel = Make<Qen_ValueVectorChannel>(vector);
    EXPECT_TRUE(emitter->SetChild(link, channel)) << "link " << link;
  }
  channel->SetVector(vector);
  return channel;
}

Qen_MatrixChannel* EmitterTest::SetMatrix(int link, const D3DXMATRIX& matrix) {
  auto* channel = Make<Qen_MatrixChannel>(matrix);
  EXPECT_TRUE(emitter->SetChild(link, channel)) << "link " << link;
  return channel;
}

Tev_EnvelopeStorage* EmitterTest::SetEnvelope(int link, std::vector<std::pair<float, float>> keys) {
  auto* envelope = Make<Tev_EnvelopeStorage>();
  for (const auto& [x, y] : keys) envelope->AddKey(x, y);
  if (link >= 0) {
    EXPECT_TRUE(emitter->SetChild(link, envelope)) << "link " << link;
  }
  return envelope;
}

Tev_DX8_ObjectDataChannel* EmitterTest::SetEmitterMesh(const std::vector<D3DXVECTOR3>& vertices,
                                                       const std::vector<DWORD>& indices,
                                                       const std::vector<D3DXVECTOR3>& normals) {
  auto* mesh = Make<Tev_DX8_ObjectDataChannel>();
  mesh->SetVertexCount(static_cast<int>(vertices.size()));
  for (std::size_t v = 0; v < vertices.size(); ++v) {
    mesh->SetVertexPosition(vertices[v], static_cast<int>(v));
    mesh->SetVertexNormal(v < normals.size() ? normals[v] : D3DXVECTOR3(0.0f, 1.0f, 0.0f),
                          static_cast<int>(v));
  }
  mesh->SetIndexCount(static_cast<int>(indices.size()));
  for (std::size_t i = 0; i < indices.size(); ++i) mesh->SetIndex(indices[i], static_cast<int>(i));
  EXPECT_TRUE(emitter->SetChild(kLinkEmitter, mesh));
  return mesh;
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
  SetMatrix(kLinkEmitterMotion, identity);
  SetEmitterMesh({{0.0f, 0.0f, 0.0f}}, {});
}

void EmitterTest::Start() {
  emitter->CallChannel();
  ASSERT_TRUE(emitter->Initialized);
}

void EmitterTest::RunFrame(double ms) {
  clock.AdvanceMs(ms);
  context.AdvanceFrame();
  emitter->CallChannel();
}

void EmitterTest::RunFrames(int frames, double ms) {
  for (int i = 0; i < frames; ++i) RunFrame(ms);
}

void EmitterTest::StepOnce() {
  // 21 ms banked in all: one step of 20 ms, 1 ms left over.
  RunFrame(21.0 - static_cast<double>(emitter->LogicAccumulator));
}

Tev_AdvPE_SmokeSettings* EmitterTest::LinkSmoke() {
  auto* smoke = Make<Tev_AdvPE_SmokeSettings>();
  EXPECT_TRUE(emitter->SetChild(kLinkSmokeSettings, smoke));
  SetValue(kLinkSmoke, 1.0f);
  return smoke;
}

void EmitterTest::SetSmokeValue(int link, float value) {
  auto* smoke = static_cast<Tev_AdvPE_SmokeSettings*>(emitter->GetChild(kLinkSmokeSettings));
  ASSERT_NE(smoke, nullptr);
  auto* channel = static_cast<Qen_ValueChannel*>(smoke->GetChild(link));
  if (!channel) {
    channel = Make<Qen_ValueChannel>(value);
    ASSERT_TRUE(smoke->SetChild(link, channel)) << "smoke link " << link;
  }
  channel->SetValue(value);
}

Tev_EnvelopeStorage* EmitterTest::SetSmokeEnvelope(int link,
                                                   std::vector<std::pair<float, float>> keys) {
  auto* smoke = static_cast<Tev_AdvPE_SmokeSettings*>(emitter->GetChild(kLinkSmokeSettings));
  Tev_EnvelopeStorage* envelope = SetEnvelope(-1, std::move(keys));
  EXPECT_TRUE(smoke && smoke->SetChild(link, envelope)) << "smoke link " << link;
  return envelope;
}

int EmitterTest::ActiveCount() const {
  return static_cast<int>(std::count_if(emitter->Particles.begin(), emitter->Particles.end(),
                                        [](const Particle& p) { return p.Active; }));
}

Particle& EmitterTest::PlaceParticle(int index, D3DXVECTOR3 position, D3DXVECTOR3 velocity,
                                     float lifespan) {
  Particle& p = P(index);
  p = Particle{};
  p.Active = true;
  p.Bouncing = true;
  p.Position = position;
  p.RenderPosition = position;
  p.Velocity = velocity;
  p.Lifespan = lifespan;
  p.SizeMultiplier = 1.0f;
  return p;
}

int EmitterTest::CountMessages(const std::vector<std::string>& messages,
                               const std::string& text) const {
  return static_cast<int>(std::count(messages.begin(), messages.end(), text));
}

std::vector<int> RandSequence(unsigned seed, int count) {
  std::srand(seed);
  std::vector<int> sequence;
  for (int i = 0; i < count; ++i) sequence.push_back(std::rand());
  std::srand(seed);
  return sequence;
}

int DrawsTaken(const std::vector<int>& sequence) {
  const int next = std::rand();
  const auto at = std::find(sequence.begin(), sequence.end(), next);
  return at == sequence.end() ? -1 : static_cast<int>(at - sequence.begin());
}
