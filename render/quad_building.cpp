// Camera-facing quads: every pool slot becomes the four corners 4i to 4i+3 of LocalVertices.
#include <algorithm>
#include <cmath>
#include <cstddef>

#include "plugin/advanced_particle_emitter.h"
#include "render/render_sizes.h"
#include "simulation/vector_math.h"

namespace {

constexpr D3DXVECTOR3 kUp{0.0f, 1.0f, 0.0f};
constexpr D3DXVECTOR3 kRight{1.0f, 0.0f, 0.0f};
constexpr float kHalfSizeFactor = 0.5f;     // Size is the full edge length
constexpr float kCompositeHalfSpan = 0.5f;  // each image fills half of the composite's height

struct QuadBasis {
  D3DXVECTOR3 Right;  // the quad's u direction before spin
  D3DXVECTOR3 Up;     // the quad's v direction before spin
};

// A mostly vertical facing direction is built from the Right axis, because Up would be (nearly)
// parallel to it; ties go to Up. Only the first cross product is normalized: the second is of
// two perpendicular unit vectors already.
QuadBasis BasisFor(const D3DXVECTOR3& facing) {
  const float ax = std::fabs(facing.x);
  const float ay = std::fabs(facing.y);
  const float az = std::fabs(facing.z);
  QuadBasis basis;
  if (ax + az < ay) {
    basis.Up = sim::Unit(sim::Cross(facing, kRight));
    basis.Right = sim::Cross(basis.Up, facing);
  } else {
    basis.Right = sim::Unit(sim::Cross(kUp, facing));
    basis.Up = sim::Cross(facing, basis.Right);
  }
  return basis;
}

struct HalfExtents {
  D3DXVECTOR3 A;  // along u
  D3DXVECTOR3 B;  // along v
};

// The spin angle is in radians; sine and cosine are taken in double (the C library's) and
// rounded to float before use.
HalfExtents ExtentsFor(const QuadBasis& basis, float half_size, bool spin, float spin_angle) {
  const D3DXVECTOR3 right = basis.Right * half_size;
  const D3DXVECTOR3 up = basis.Up * half_size;
  if (!spin) return {right, up};
  const float c = static_cast<float>(std::cos(static_cast<double>(spin_angle)));
  const float s = static_cast<float>(std::sin(static_cast<double>(spin_angle)));
  const D3DXVECTOR3 left = (-basis.Right) * half_size;
  return {right * c + up * s, up * c + left * s};
}

struct TextureRows {
  float Offset;  // v of the top edge
  float Span;    // v from the top edge to the bottom edge
};

// Free particles show the composite's upper image, attached ones its lower image.
TextureRows RowsFor(bool has_composite, bool attached) {
  if (!has_composite) return {0.0f, 1.0f};
  return {attached ? kCompositeHalfSpan : 0.0f, kCompositeHalfSpan};
}

// Corners in the order the fixed index list draws them: (0, 1, 2) and (2, 3, 0).
void WriteQuad(LocalVertex* corners, const D3DXVECTOR3& p, const HalfExtents& e,
               const D3DXVECTOR3& normal, std::uint32_t color, TextureRows rows) {
  const float bottom = rows.Offset + rows.Span;
  corners[0] = {p + e.A + e.B, normal, color, 0.0f, rows.Offset};
  corners[1] = {p - e.A + e.B, normal, color, 1.0f, rows.Offset};
  corners[2] = {p - e.A - e.B, normal, color, 1.0f, bottom};
  corners[3] = {p + e.A - e.B, normal, color, 0.0f, bottom};
}

}  // namespace

void Tev_AdvancedParticleEmitter::UpdateLocalVertexBuffer() {
  if (LocalVertices == nullptr) return;
  const std::size_t slots = std::min(DrawnSlotCount(ParticleCount), Particles.size());
  for (std::size_t i = 0; i < slots; ++i) {
    const Particle& particle = Particles[i];
    const D3DXVECTOR3& position = particle.RenderPosition;
    // An inactive slot collapses to a zero-area quad at its render position.
    const float half_size = particle.Active ? particle.Size * kHalfSizeFactor : 0.0f;
    const D3DXVECTOR3 facing = sim::Unit(particle.LookAtPoint - position);
    const HalfExtents extents =
        ExtentsFor(BasisFor(facing), half_size, SpinEnabled, particle.RenderSpinAngle);
    WriteQuad(LocalVertices + 4 * i, position, extents, facing, particle.Color,
              RowsFor(HasCompositeTexture, particle.Attached));
  }
}
