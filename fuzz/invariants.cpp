#include "fuzz/invariants.h"

#include <malloc.h>

#include <cstring>

#include "host/host_context.h"
#include "plugin/advanced_particle_emitter.h"
#include "render/render_sizes.h"

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

}  // namespace

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
