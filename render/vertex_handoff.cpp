// The quad path's hand-off: the CPU array LocalVertices, the mesh declared once to the
// object-data base class, and the per-frame block copy into the base's vertex buffer.
#include <algorithm>
#include <cstddef>
#include <cstring>

#include "plugin/advanced_particle_emitter.h"
#include "render/render_sizes.h"

namespace {

constexpr std::size_t kCornersPerQuad = 4;
constexpr std::size_t kIndicesPerQuad = 6;
// Index list of one quad, as corner numbers: triangles (0, 1, 2) and (2, 3, 0).
constexpr std::int32_t kQuadCorners[kIndicesPerQuad] = {0, 1, 2, 2, 3, 0};

std::size_t QuadVertexCount(std::int32_t particle_count) {
  return DrawnSlotCount(particle_count) * kCornersPerQuad;
}

}  // namespace

void Tev_AdvancedParticleEmitter::InitializeLocalVertexBuffer() {
  delete[] LocalVertices;
  LocalVertices = nullptr;
  // Zeroed, so that nothing reads undefined bytes before the first update.
  LocalVertices = new LocalVertex[QuadVertexCount(ParticleCount)]();
}

void Tev_AdvancedParticleEmitter::InitializeBaseClassBuffers() {
  Release();
  // Vertex numbers and index positions in int32: DrawnSlotCount keeps six per quad in range,
  // and the base switches to 32-bit indices itself once vertex numbers need them.
  const auto quads = static_cast<std::int32_t>(DrawnSlotCount(ParticleCount));
  const auto vertices = static_cast<std::int32_t>(quads * kCornersPerQuad);
  SetVertexCount(vertices);
  SetIndexCount(static_cast<std::int32_t>(quads * kIndicesPerQuad));
  // Only vertices that LocalVertices holds are read, whatever count the base answers.
  const std::int32_t declared = LocalVertices == nullptr ? 0 : std::min(GetVertexCount(), vertices);
  for (std::int32_t v = 0; v < declared; ++v) {
    const LocalVertex& vertex = LocalVertices[v];
    SetVertexPosition(vertex.Position, v);
    SetVertexNormal(vertex.Normal, v);
    SetVertexTUCoord(0, D3DXVECTOR2(vertex.Tu, vertex.Tv), v);
    SetVertexColor(vertex.Color, v);
  }
  for (std::int32_t q = 0; q < quads; ++q) {
    const auto first_vertex = static_cast<std::int32_t>(q * kCornersPerQuad);
    const auto first_position = static_cast<std::int32_t>(q * kIndicesPerQuad);
    for (std::size_t k = 0; k < kIndicesPerQuad; ++k) {
      SetIndex(static_cast<DWORD>(first_vertex + kQuadCorners[k]),
               first_position + static_cast<std::int32_t>(k));
    }
  }
  CreateVertexBuffer();
}

bool Tev_AdvancedParticleEmitter::WriteLocalVertexBufferToBaseClass() {
  if (VertexBuffer == nullptr) {
    ShowDebug("APE: failed to find base vertex buffer");
    return false;
  }
  // The copy never runs past the buffer the base built, whatever it was built for.
  D3DVERTEXBUFFER_DESC desc{};
  const std::size_t capacity = SUCCEEDED(VertexBuffer->GetDesc(&desc)) ? desc.Size : 0;
  void* locked = nullptr;
  // Offset 0 and size 0 lock the whole buffer; its old contents are not needed.
  if (FAILED(VertexBuffer->Lock(0, 0, &locked, D3DLOCK_DISCARD))) {
    ShowDebug("APE: Failed to lock base vertex buffer");
    return false;
  }
  const std::size_t bytes =
      std::min(QuadVertexCount(ParticleCount) * sizeof(LocalVertex), capacity);
  if (bytes > 0 && locked != nullptr && LocalVertices != nullptr) {
    std::memcpy(locked, LocalVertices, bytes);
  }
  VertexBuffer->Unlock();
  return true;
}
