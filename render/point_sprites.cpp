// The point-sprite path's buffers: the CPU array PointSpriteVertices, the emitter's own dynamic
// vertex buffer, and the draw of every slot as one point.
#include <algorithm>
#include <cstring>

#include "host/device_channel.h"
#include "plugin/advanced_particle_emitter.h"
#include "render/pass_states.h"
#include "render/point_sprite_vertex.h"
#include "render/render_sizes.h"

namespace {

constexpr DWORD kPointSpriteUsage = D3DUSAGE_WRITEONLY | D3DUSAGE_POINTS | D3DUSAGE_DYNAMIC;
constexpr UINT kPointSpriteStride = sizeof(PointSpriteVertex);

std::size_t PointSpriteCount(std::int32_t particle_count) {
  return DrawnSlotCount(particle_count);
}

}  // namespace

void Tev_AdvancedParticleEmitter::InitializePointSpriteVertexBuffer() {
  const std::size_t count = PointSpriteCount(ParticleCount);
  delete[] PointSpriteVertices;
  PointSpriteVertices = nullptr;
  // Zeroed, so that nothing reads undefined bytes before the first update.
  PointSpriteVertices = new PointSpriteVertex[count]();
  if (PointSpriteVertexBuffer != nullptr) {
    PointSpriteVertexBuffer->Release();
    PointSpriteVertexBuffer = nullptr;
  }
  const std::optional<UINT> bytes = BufferBytes(count, kPointSpriteStride);
  IDirect3DDevice9* device = CurrentDevice(DeviceChannel);
  const HRESULT created =
      device != nullptr && bytes.has_value()
          ? device->CreateVertexBuffer(*bytes, kPointSpriteUsage, kPointSpriteFvf, D3DPOOL_DEFAULT,
                                       &PointSpriteVertexBuffer, nullptr)
          : D3DERR_INVALIDCALL;
  if (FAILED(created)) {
    // A failed creation leaves no buffer: update and draw skip it until the next Initialize.
    PointSpriteVertexBuffer = nullptr;
    ShowDebug("APE: Failed to Create PS VB");
  }
}

std::size_t Tev_AdvancedParticleEmitter::PointSpriteSlots() const {
  if (PointSpriteVertices == nullptr) return 0;
  return std::min(PointSpriteCount(ParticleCount), Particles.size());
}

void Tev_AdvancedParticleEmitter::UpdatePointSpriteVertexBuffer() {
  const std::size_t count = PointSpriteSlots();
  for (std::size_t i = 0; i < count; ++i) PointSpriteVertices[i] = PointSpriteOf(Particles[i]);
  CopyPointSpritesToBuffer();
}

void Tev_AdvancedParticleEmitter::CopyPointSpritesToBuffer() {
  if (PointSpriteVertices == nullptr || PointSpriteVertexBuffer == nullptr) return;
  // The buffer was created with this very length, so it fits a UINT.
  const std::size_t bytes = PointSpriteCount(ParticleCount) * kPointSpriteStride;
  void* locked = nullptr;
  if (FAILED(PointSpriteVertexBuffer->Lock(0, static_cast<UINT>(bytes), &locked, 0))) {
    ShowDebug("APE: Failed to WRITE PS VB");
    return;
  }
  if (bytes > 0 && locked != nullptr) std::memcpy(locked, PointSpriteVertices, bytes);
  PointSpriteVertexBuffer->Unlock();
}

void Tev_AdvancedParticleEmitter::StreamPointSprites() {
  if (PointSpriteVertexBuffer == nullptr || DeviceChannel == nullptr) return;
  // The device is fetched afresh for each call: the host may replace it between them.
  const auto points = static_cast<UINT>(PointSpriteCount(ParticleCount));
  if (IDirect3DDevice9* device = CurrentDevice(DeviceChannel)) {
    device->SetStreamSource(0, PointSpriteVertexBuffer, 0, kPointSpriteStride);
  }
  if (IDirect3DDevice9* device = CurrentDevice(DeviceChannel)) device->SetFVF(kPointSpriteFvf);
  if (IDirect3DDevice9* device = CurrentDevice(DeviceChannel)) {
    device->DrawPrimitive(D3DPT_POINTLIST, 0, points);
  }
}
