// Camera-facing quads: every pool slot becomes the four corners 4i to 4i+3 of LocalVertices.
//
// The slots are worked a block at a time: their positions, facing points and sizes are gathered
// into one array per quantity, the facing direction and the quad's half extents are computed for
// the whole block in loops the compiler turns into vector code, and the corners are written out
// slot by slot. Every lane does exactly the float32 operations the per-slot rule below names, in
// the same order, so the corners are the same bit for bit; both basis branches are computed and
// the rule's branch is selected per lane.
#include <algorithm>
#include <cmath>
#include <cstddef>

#include "plugin/advanced_particle_emitter.h"
#include "render/render_sizes.h"

namespace {

constexpr float kHalfSizeFactor = 0.5f;     // Size is the full edge length
constexpr float kCompositeHalfSpan = 0.5f;  // each image fills half of the composite's height
constexpr int kBlock = 8;                   // slots per block

// The block steps are inlined into each build of the loop below, so each is compiled for its
// instruction set.
#if defined(__GNUC__)
#define APE_QUAD_STEP __attribute__((always_inline)) inline
#else
#define APE_QUAD_STEP inline
#endif

// One block of slots, one array per quantity.
struct QuadBlock {
  // In: the render position P, the facing point, the half size h, and cos and sin of the spin.
  float Px[kBlock], Py[kBlock], Pz[kBlock];
  float Lx[kBlock], Ly[kBlock], Lz[kBlock];
  float Half[kBlock];
  float Cos[kBlock], Sin[kBlock];
  // Out: the facing direction N and the half extents A (along u) and B (along v).
  float Nx[kBlock], Ny[kBlock], Nz[kBlock];
  float Ax[kBlock], Ay[kBlock], Az[kBlock];
  float Bx[kBlock], By[kBlock], Bz[kBlock];
  // Out: the corners P + A + B, P - A + B, P - A - B and P + A - B.
  float Cx[4][kBlock], Cy[4][kBlock], Cz[4][kBlock];
};

APE_QUAD_STEP void Gather(QuadBlock& b, const Particle* slots, int count, bool spin) {
  for (int k = 0; k < kBlock; ++k) {
    if (k >= count) {
      // Unused lanes compute on zeros and are never written out.
      b.Px[k] = b.Py[k] = b.Pz[k] = b.Lx[k] = b.Ly[k] = b.Lz[k] = b.Half[k] = 0.0f;
      b.Cos[k] = b.Sin[k] = 0.0f;
      continue;
    }
    const Particle& p = slots[k];
    b.Px[k] = p.RenderPosition.x;
    b.Py[k] = p.RenderPosition.y;
    b.Pz[k] = p.RenderPosition.z;
    b.Lx[k] = p.LookAtPoint.x;
    b.Ly[k] = p.LookAtPoint.y;
    b.Lz[k] = p.LookAtPoint.z;
    // An inactive slot collapses to a zero-area quad at its render position.
    b.Half[k] = p.Active ? p.Size * kHalfSizeFactor : 0.0f;
    if (spin) {
      // The angle is in radians; sine and cosine are the C library's, in double, rounded to
      // float before use.
      b.Cos[k] = static_cast<float>(std::cos(static_cast<double>(p.RenderSpinAngle)));
      b.Sin[k] = static_cast<float>(std::sin(static_cast<double>(p.RenderSpinAngle)));
    }
  }
}

// Per lane:
//   N = normalize(LookAtPoint - P) (D3DXVec3Normalize: a zero vector stays zero).
//   Mostly vertical N (|N.x| + |N.z| < |N.y|, ties not): U = normalize(N x Right), R = U x N;
//   otherwise R = normalize(Up x N), U = N x R; with Right = (1, 0, 0) and Up = (0, 1, 0). Only
//   the first cross product is normalized: the second is of two perpendicular unit vectors.
//   A = R h and B = U h, before any spin.
APE_QUAD_STEP void ComputeExtents(QuadBlock& b) {
  for (int k = 0; k < kBlock; ++k) {
    const float dx = b.Lx[k] - b.Px[k];
    const float dy = b.Ly[k] - b.Py[k];
    const float dz = b.Lz[k] - b.Pz[k];
    const float length = std::sqrt(dx * dx + dy * dy + dz * dz);
    // Every lane divides (straight-line code vectorizes); a zero length's quotients are dropped.
    const bool none = length == 0.0f;
    const float qx = dx / length, qy = dy / length, qz = dz / length;
    const float nx = none ? 0.0f : qx;
    const float ny = none ? 0.0f : qy;
    const float nz = none ? 0.0f : qz;

    // Mostly vertical: c = N x Right, U = normalize(c), R = U x N.
    const float cx1 = ny * 0.0f - nz * 0.0f;
    const float cy1 = nz * 1.0f - nx * 0.0f;
    const float cz1 = nx * 0.0f - ny * 1.0f;
    const float l1 = std::sqrt(cx1 * cx1 + cy1 * cy1 + cz1 * cz1);
    const bool none1 = l1 == 0.0f;
    const float qx1 = cx1 / l1, qy1 = cy1 / l1, qz1 = cz1 / l1;
    const float ux1 = none1 ? 0.0f : qx1;
    const float uy1 = none1 ? 0.0f : qy1;
    const float uz1 = none1 ? 0.0f : qz1;
    const float rx1 = uy1 * nz - uz1 * ny;
    const float ry1 = uz1 * nx - ux1 * nz;
    const float rz1 = ux1 * ny - uy1 * nx;

    // Otherwise: c = Up x N, R = normalize(c), U = N x R.
    const float cx2 = 1.0f * nz - 0.0f * ny;
    const float cy2 = 0.0f * nx - 0.0f * nz;
    const float cz2 = 0.0f * ny - 1.0f * nx;
    const float l2 = std::sqrt(cx2 * cx2 + cy2 * cy2 + cz2 * cz2);
    const bool none2 = l2 == 0.0f;
    const float qx2 = cx2 / l2, qy2 = cy2 / l2, qz2 = cz2 / l2;
    const float rx2 = none2 ? 0.0f : qx2;
    const float ry2 = none2 ? 0.0f : qy2;
    const float rz2 = none2 ? 0.0f : qz2;
    const float ux2 = ny * rz2 - nz * ry2;
    const float uy2 = nz * rx2 - nx * rz2;
    const float uz2 = nx * ry2 - ny * rx2;

    const bool vertical = std::fabs(nx) + std::fabs(nz) < std::fabs(ny);
    const float h = b.Half[k];
    b.Nx[k] = nx;
    b.Ny[k] = ny;
    b.Nz[k] = nz;
    b.Ax[k] = (vertical ? rx1 : rx2) * h;
    b.Ay[k] = (vertical ? ry1 : ry2) * h;
    b.Az[k] = (vertical ? rz1 : rz2) * h;
    b.Bx[k] = (vertical ? ux1 : ux2) * h;
    b.By[k] = (vertical ? uy1 : uy2) * h;
    b.Bz[k] = (vertical ? uz1 : uz2) * h;
  }
}

// The spin turns R h and U h (in A and B): A = (R h) cos + (U h) sin and
// B = (U h) cos + ((-R) h) sin, where (-R) h is exactly -(R h).
APE_QUAD_STEP void Spin(QuadBlock& b) {
  for (int k = 0; k < kBlock; ++k) {
    const float c = b.Cos[k];
    const float s = b.Sin[k];
    const float rx = b.Ax[k], ry = b.Ay[k], rz = b.Az[k];
    const float ux = b.Bx[k], uy = b.By[k], uz = b.Bz[k];
    b.Ax[k] = rx * c + ux * s;
    b.Ay[k] = ry * c + uy * s;
    b.Az[k] = rz * c + uz * s;
    b.Bx[k] = ux * c + -rx * s;
    b.By[k] = uy * c + -ry * s;
    b.Bz[k] = uz * c + -rz * s;
  }
}

// Each coordinate summed left to right, as the rule writes the corners.
APE_QUAD_STEP void ComputeCorners(QuadBlock& b) {
  for (int k = 0; k < kBlock; ++k) {
    b.Cx[0][k] = b.Px[k] + b.Ax[k] + b.Bx[k];
    b.Cy[0][k] = b.Py[k] + b.Ay[k] + b.By[k];
    b.Cz[0][k] = b.Pz[k] + b.Az[k] + b.Bz[k];
    b.Cx[1][k] = b.Px[k] - b.Ax[k] + b.Bx[k];
    b.Cy[1][k] = b.Py[k] - b.Ay[k] + b.By[k];
    b.Cz[1][k] = b.Pz[k] - b.Az[k] + b.Bz[k];
    b.Cx[2][k] = b.Px[k] - b.Ax[k] - b.Bx[k];
    b.Cy[2][k] = b.Py[k] - b.Ay[k] - b.By[k];
    b.Cz[2][k] = b.Pz[k] - b.Az[k] - b.Bz[k];
    b.Cx[3][k] = b.Px[k] + b.Ax[k] - b.Bx[k];
    b.Cy[3][k] = b.Py[k] + b.Ay[k] - b.By[k];
    b.Cz[3][k] = b.Pz[k] + b.Az[k] - b.Bz[k];
  }
}

struct TextureRows {
  float Offset;  // v of the top edge
  float Span;    // v from the top edge to the bottom edge
};

// Free particles show the composite's upper image, attached ones its lower image.
APE_QUAD_STEP TextureRows RowsFor(bool has_composite, bool attached) {
  if (!has_composite) return {0.0f, 1.0f};
  return {attached ? kCompositeHalfSpan : 0.0f, kCompositeHalfSpan};
}

// Corners in the order the fixed index list draws them: (0, 1, 2) and (2, 3, 0).
APE_QUAD_STEP void WriteQuads(LocalVertex* out, const QuadBlock& b, const Particle* slots,
                              int count, bool has_composite) {
  constexpr float kTu[4] = {0.0f, 1.0f, 1.0f, 0.0f};
  for (int k = 0; k < count; ++k) {
    const D3DXVECTOR3 normal(b.Nx[k], b.Ny[k], b.Nz[k]);
    const std::uint32_t color = slots[k].Color;
    const TextureRows rows = RowsFor(has_composite, slots[k].Attached);
    const float tv[4] = {rows.Offset, rows.Offset, rows.Offset + rows.Span,
                         rows.Offset + rows.Span};
    LocalVertex* corners = out + 4 * k;
    for (int c = 0; c < 4; ++c)
      corners[c] = {{b.Cx[c][k], b.Cy[c][k], b.Cz[c][k]}, normal, color, kTu[c], tv[c]};
  }
}

// Built twice where the compiler and loader support it: the AVX2 build does a block of 8 lanes
// per instruction (its divides and square roots are the same correctly rounded IEEE operations,
// and no multiply-add is formed), the default build is picked on other processors.
#if defined(__x86_64__) && defined(__GNUC__) && !defined(__clang__)
#define APE_QUAD_CLONES __attribute__((target_clones("avx2", "default")))
#else
#define APE_QUAD_CLONES
#endif

APE_QUAD_CLONES void BuildQuads(LocalVertex* out, const Particle* particles, std::size_t slots,
                                bool spin, bool has_composite) {
  QuadBlock block;
  for (std::size_t first = 0; first < slots; first += kBlock) {
    const int count = static_cast<int>(std::min<std::size_t>(kBlock, slots - first));
    const Particle* block_slots = particles + first;
    Gather(block, block_slots, count, spin);
    ComputeExtents(block);
    if (spin) Spin(block);
    ComputeCorners(block);
    WriteQuads(out + 4 * first, block, block_slots, count, has_composite);
  }
}

}  // namespace

void Tev_AdvancedParticleEmitter::UpdateLocalVertexBuffer() {
  if (LocalVertices == nullptr) return;
  const std::size_t slots = std::min(DrawnSlotCount(ParticleCount), Particles.size());
  BuildQuads(LocalVertices, Particles.data(), slots, SpinEnabled, HasCompositeTexture);
}
