#include "fuzz/invariants.h"

#include <malloc.h>

#include <algorithm>
#include <cmath>
#include <cstring>

#include "host/host_context.h"
#include "plugin/advanced_particle_emitter.h"
#include "render/render_sizes.h"
#include "simulation/blend_factor.h"

namespace apefuzz {

namespace {

constexpr char kMessagePrefix[] = "APE: ";
constexpr std::size_t kCornersPerQuad = 4;

// The usable bytes of a block from new[] of a trivially destructible type (no array cookie), as
// the allocator reports them; AddressSanitizer reports exactly the bytes asked for.
std::size_t BlockBytes(const void* block) {
  return malloc_usable_size(const_cast<void*>(block));
}

std::string ShortArray(const char* name, std::size_t have, std::size_t need) {
  return std::string(name) + " holds " + std::to_string(have) + " bytes, the pool needs " +
         std::to_string(need);
}

// Finite and below 1e18 in every component: sums and squares of such values stay finite.
constexpr float kModerate = 1e18f;
bool Moderate(float value) {
  return std::fabs(value) < kModerate;
}
bool Moderate(const D3DXVECTOR3& v) {
  return Moderate(v.x) && Moderate(v.y) && Moderate(v.z);
}
bool Finite(const D3DXVECTOR3& v) {
  return std::isfinite(v.x) && std::isfinite(v.y) && std::isfinite(v.z);
}

std::string AtSlot(const char* what, std::size_t slot) {
  return std::string(what) + " of slot " + std::to_string(slot) + " is not finite";
}

std::string CheckRenderPositions(const Tev_AdvancedParticleEmitter& e) {
  for (std::size_t i = 0; i < e.Particles.size(); ++i) {
    const Particle& p = e.Particles[i];
    if (Moderate(p.Position) && Moderate(p.Velocity) && !Finite(p.RenderPosition))
      return AtSlot("the drawn position", i);
  }
  return "";
}

bool DrawnInputsModerate(const Tev_AdvancedParticleEmitter& e, const Particle& p) {
  return Moderate(p.RenderPosition) && Moderate(p.LookAtPoint) && Moderate(p.Size) &&
         (!e.SpinEnabled || std::isfinite(p.RenderSpinAngle));
}

std::string CheckVertexPositions(const Tev_AdvancedParticleEmitter& e) {
  const std::size_t slots = std::min(DrawnSlotCount(e.ParticleCount), e.Particles.size());
  for (std::size_t i = 0; i < slots; ++i) {
    if (!DrawnInputsModerate(e, e.Particles[i])) continue;
    if (e.HardwareParticles && e.PointSpriteVertices != nullptr &&
        !Finite(e.PointSpriteVertices[i].Position))
      return AtSlot("the point sprite", i);
    if (!e.HardwareParticles && e.LocalVertices != nullptr) {
      for (std::size_t corner = 0; corner < kCornersPerQuad; ++corner)
        if (!Finite(e.LocalVertices[i * kCornersPerQuad + corner].Position))
          return AtSlot("a quad corner", i);
    }
  }
  return "";
}

}  // namespace

std::string CheckDrawnState(const Tev_AdvancedParticleEmitter& e, bool simulated, bool rebuilt) {
  const float t = sim::BlendFactor(e);
  if (!(t >= 0.0f && t <= 1.0f))
    return "the blend factor " + std::to_string(t) + " is not in [0, 1]";
  if (simulated) {
    std::string fault = CheckRenderPositions(e);
    if (!fault.empty()) return fault;
  }
  return rebuilt ? CheckVertexPositions(e) : "";
}

std::string CheckEmitter(const Tev_AdvancedParticleEmitter& e) {
  if (e.ParticleCount < 0 || e.Particles.size() != static_cast<std::size_t>(e.ParticleCount))
    return "Particles.size() is " + std::to_string(e.Particles.size()) + ", ParticleCount is " +
           std::to_string(e.ParticleCount);

  const std::size_t slots = DrawnSlotCount(e.ParticleCount);
  if (e.LocalVertices != nullptr) {
    const std::size_t need = slots * kCornersPerQuad * sizeof(LocalVertex);
    const std::size_t have = BlockBytes(e.LocalVertices);
    if (have < need) return ShortArray("LocalVertices", have, need);
  }
  if (e.PointSpriteVertices != nullptr) {
    const std::size_t need = slots * sizeof(PointSpriteVertex);
    const std::size_t have = BlockBytes(e.PointSpriteVertices);
    if (have < need) return ShortArray("PointSpriteVertices", have, need);
  }
  if (e.Initialized && e.HardwareParticles && e.PointSpriteVertices == nullptr)
    return "an initialized point-sprite emitter has no PointSpriteVertices";
  if (e.Initialized && !e.HardwareParticles && e.LocalVertices == nullptr)
    return "an initialized quad emitter has no LocalVertices";
  return "";
}

MessageWatch::MessageWatch(Qen_HostContext& context) : context_(context) {
  context_.DebugMessages.SetSink([this](const char* text) { Take(text); });
  context_.OverloadMessages.SetSink([this](const char* text) { Take(text); });
}

MessageWatch::~MessageWatch() {
  // A silent sink rather than none: stderr would fill up during long runs.
  context_.DebugMessages.SetSink([](const char*) {});
  context_.OverloadMessages.SetSink([](const char*) {});
}

void MessageWatch::Take(const char* text) {
  ++count_;
  if (!fault_.empty()) return;
  if (text == nullptr)
    fault_ = "a null debug message";
  else if (std::strncmp(text, kMessagePrefix, sizeof kMessagePrefix - 1) != 0)
    fault_ = std::string("a debug message without \"APE: \": \"") + text + "\"";
}

}  // namespace apefuzz
