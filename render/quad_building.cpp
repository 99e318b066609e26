// Camera-facing quads: every pool slot becomes the four corners 4i to 4i+3 of LocalVertices.
//
// The slots are worked a block at a time: their positions, facing points and sizes are gathered
// into one array per quantity (a full block as 8 x 8 tiles of words turned over), the facing
// direction and the quad's half extents are computed for the whole block in loops the compiler
// turns into vector code, and the corners are written out. Every lane does exactly the float32
// operations the per-slot rule below names, in the same order, so the corners are the same bit for
// bit: each lane picks its basis branch's cross product before the one normalization, then both
// branches' second cross products are computed and the lane's own is selected. The corners leave
// the block as 8 x 8 tiles of 32-bit words turned from rows (one quantity for 8 slots) into columns
// (8 words of one slot's quad).
#include <algorithm>
#include <bit>
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <cstring>

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
// The tiles' loops are unrolled so their vectors stay in registers.
#define APE_QUAD_UNROLL _Pragma("GCC unroll 8")
#else
#define APE_QUAD_UNROLL
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
  // Passed through: the colour and the texture's top and bottom v.
  std::uint32_t Color[kBlock];
  float Top[kBlock], Bottom[kBlock];
};

#if defined(__GNUC__) && defined(__has_builtin)
#if __has_builtin(__builtin_shufflevector)
#define APE_QUAD_SHUFFLE 1
#endif
#endif

#ifdef APE_QUAD_SHUFFLE
// Eight 32-bit lanes; the shuffles below are plain word moves, so the bytes pass unchanged.
typedef std::uint32_t Lanes __attribute__((vector_size(32)));

// An 8 x 8 tile of words turned over: col[k][i] = r[i][k].
APE_QUAD_STEP void Transpose(const Lanes (&r)[8], Lanes (&col)[8]) {
  Lanes t[8], u[8];
  APE_QUAD_UNROLL
  for (int i = 0; i < 8; i += 2) {
    t[i] = __builtin_shufflevector(r[i], r[i + 1], 0, 8, 1, 9, 4, 12, 5, 13);
    t[i + 1] = __builtin_shufflevector(r[i], r[i + 1], 2, 10, 3, 11, 6, 14, 7, 15);
  }
  APE_QUAD_UNROLL
  for (int i = 0; i < 8; i += 4) {
    u[i] = __builtin_shufflevector(t[i], t[i + 2], 0, 1, 8, 9, 4, 5, 12, 13);
    u[i + 1] = __builtin_shufflevector(t[i], t[i + 2], 2, 3, 10, 11, 6, 7, 14, 15);
    u[i + 2] = __builtin_shufflevector(t[i + 1], t[i + 3], 0, 1, 8, 9, 4, 5, 12, 13);
    u[i + 3] = __builtin_shufflevector(t[i + 1], t[i + 3], 2, 3, 10, 11, 6, 7, 14, 15);
  }
  APE_QUAD_UNROLL
  for (int i = 0; i < 4; ++i) {
    col[i] = __builtin_shufflevector(u[i], u[i + 4], 0, 1, 2, 3, 8, 9, 10, 11);
    col[i + 4] = __builtin_shufflevector(u[i], u[i + 4], 4, 5, 6, 7, 12, 13, 14, 15);
  }
}
#endif

struct TextureRows {
  float Offset;  // v of the top edge
  float Span;    // v from the top edge to the bottom edge
};

// Free particles show the composite's upper image, attached ones its lower image.
APE_QUAD_STEP TextureRows RowsFor(bool has_composite, bool attached) {
  if (!has_composite) return {0.0f, 1.0f};
  return {attached ? kCompositeHalfSpan : 0.0f, kCompositeHalfSpan};
}

// The angle is in radians; sine and cosine are the C library's, in double, rounded to float
// before use.
APE_QUAD_STEP void GatherSpin(QuadBlock& b, int k, const Particle& p) {
  b.Cos[k] = static_cast<float>(std::cos(static_cast<double>(p.RenderSpinAngle)));
  b.Sin[k] = static_cast<float>(std::sin(static_cast<double>(p.RenderSpinAngle)));
}

APE_QUAD_STEP void GatherSlot(QuadBlock& b, int k, const Particle& p, bool spin,
                              bool has_composite) {
  b.Px[k] = p.RenderPosition.x;
  b.Py[k] = p.RenderPosition.y;
  b.Pz[k] = p.RenderPosition.z;
  b.Lx[k] = p.LookAtPoint.x;
  b.Ly[k] = p.LookAtPoint.y;
  b.Lz[k] = p.LookAtPoint.z;
  // An inactive slot collapses to a zero-area quad at its render position.
  const float half = p.Size * kHalfSizeFactor;
  b.Half[k] = p.Active ? half : 0.0f;
  if (spin) GatherSpin(b, k, p);
  const TextureRows rows = RowsFor(has_composite, p.Attached);
  b.Top[k] = rows.Offset;
  b.Bottom[k] = rows.Offset + rows.Span;
  b.Color[k] = p.Color;
}

#ifdef APE_QUAD_SHUFFLE
// Eight words from byte `offset` of each of 8 slots, turned so col[i] holds word i of all 8.
APE_QUAD_STEP void LoadTile(const Particle* slots, std::size_t offset, Lanes (&col)[8]) {
  Lanes r[8];
  APE_QUAD_UNROLL
  for (int k = 0; k < kBlock; ++k)
    std::memcpy(&r[k], reinterpret_cast<const unsigned char*>(slots + k) + offset, sizeof(Lanes));
  Transpose(r, col);
}

// The words a full block needs, read 8 slots at a time: the record's leading words (the size,
// the active flag, the colour, the attached flag), the render position and the facing point.
// A flag is the low byte of its word on a little-endian machine; the padding bytes beside it are
// masked off.
constexpr std::size_t kLeadOffset = 0;
constexpr int kSizeWord = static_cast<int>(offsetof(Particle, Size) / 4);
constexpr int kActiveWord = static_cast<int>(offsetof(Particle, Active) / 4);
constexpr int kColorWord = static_cast<int>(offsetof(Particle, Color) / 4);
constexpr int kAttachedWord = static_cast<int>(offsetof(Particle, Attached) / 4);
static_assert(offsetof(Particle, Active) % 4 == 0 && offsetof(Particle, Attached) % 4 == 0);
static_assert(offsetof(Particle, Size) % 4 == 0 && offsetof(Particle, Color) % 4 == 0);
static_assert(offsetof(Particle, Attached) + 4 <= 8 * 4 && offsetof(Particle, Color) + 4 <= 8 * 4);
static_assert(offsetof(Particle, RenderPosition) + sizeof(Lanes) <= sizeof(Particle));
static_assert(offsetof(Particle, LookAtPoint) + sizeof(Lanes) <= sizeof(Particle));
static_assert(sizeof(bool) == 1);

APE_QUAD_STEP void GatherTiles(QuadBlock& b, const Particle* slots, bool has_composite) {
  Lanes lead[8], position[8], look_at[8];
  LoadTile(slots, kLeadOffset, lead);
  LoadTile(slots, offsetof(Particle, RenderPosition), position);
  LoadTile(slots, offsetof(Particle, LookAtPoint), look_at);
  std::memcpy(b.Px, &position[0], sizeof(Lanes));
  std::memcpy(b.Py, &position[1], sizeof(Lanes));
  std::memcpy(b.Pz, &position[2], sizeof(Lanes));
  std::memcpy(b.Lx, &look_at[0], sizeof(Lanes));
  std::memcpy(b.Ly, &look_at[1], sizeof(Lanes));
  std::memcpy(b.Lz, &look_at[2], sizeof(Lanes));
  std::memcpy(b.Color, &lead[kColorWord], sizeof(Lanes));
  float size[kBlock];
  std::memcpy(size, &lead[kSizeWord], sizeof(Lanes));
  for (int k = 0; k < kBlock; ++k) {
    const bool active = (lead[kActiveWord][k] & 0xffu) != 0;
    const bool attached = (lead[kAttachedWord][k] & 0xffu) != 0;
    const float half = size[k] * kHalfSizeFactor;
    b.Half[k] = active ? half : 0.0f;
    const TextureRows rows = RowsFor(has_composite, attached);
    b.Top[k] = rows.Offset;
    b.Bottom[k] = rows.Offset + rows.Span;
  }
}
#endif

APE_QUAD_STEP void Gather(QuadBlock& b, const Particle* slots, int count, bool spin,
                          bool has_composite) {
  if (count == kBlock) {
#ifdef APE_QUAD_SHUFFLE
    if constexpr (std::endian::native == std::endian::little) {
      GatherTiles(b, slots, has_composite);
      if (spin)
        for (int k = 0; k < kBlock; ++k) GatherSpin(b, k, slots[k]);
      return;
    }
#endif
    for (int k = 0; k < kBlock; ++k) GatherSlot(b, k, slots[k], spin, has_composite);
    return;
  }
  for (int k = 0; k < kBlock; ++k) {
    if (k < count) {
      GatherSlot(b, k, slots[k], spin, has_composite);
      continue;
    }
    // Unused lanes compute on zeros and are never written out.
    b.Px[k] = b.Py[k] = b.Pz[k] = b.Lx[k] = b.Ly[k] = b.Lz[k] = b.Half[k] = 0.0f;
    b.Cos[k] = b.Sin[k] = b.Top[k] = b.Bottom[k] = 0.0f;
    b.Color[k] = 0;
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
    // Otherwise: c = Up x N, R = normalize(c), U = N x R.
    const float cx2 = 1.0f * nz - 0.0f * ny;
    const float cy2 = 0.0f * nx - 0.0f * nz;
    const float cz2 = 0.0f * ny - 1.0f * nx;

    // Only the lane's own branch's c is normalized: one square root and three divides per lane.
    const bool vertical = std::fabs(nx) + std::fabs(nz) < std::fabs(ny);
    const float cx = vertical ? cx1 : cx2;
    const float cy = vertical ? cy1 : cy2;
    const float cz = vertical ? cz1 : cz2;
    const float lc = std::sqrt(cx * cx + cy * cy + cz * cz);
    const bool nonec = lc == 0.0f;
    const float qcx = cx / lc, qcy = cy / lc, qcz = cz / lc;
    const float ex = nonec ? 0.0f : qcx;
    const float ey = nonec ? 0.0f : qcy;
    const float ez = nonec ? 0.0f : qcz;

    // Vertical: U = e, R = U x N.
    const float rx1 = ey * nz - ez * ny;
    const float ry1 = ez * nx - ex * nz;
    const float rz1 = ex * ny - ey * nx;
    // Otherwise: R = e, U = N x R.
    const float ux2 = ny * ez - nz * ey;
    const float uy2 = nz * ex - nx * ez;
    const float uz2 = nx * ey - ny * ex;

    const float h = b.Half[k];
    b.Nx[k] = nx;
    b.Ny[k] = ny;
    b.Nz[k] = nz;
    b.Ax[k] = (vertical ? rx1 : ex) * h;
    b.Ay[k] = (vertical ? ry1 : ey) * h;
    b.Az[k] = (vertical ? rz1 : ez) * h;
    b.Bx[k] = (vertical ? ex : ux2) * h;
    b.By[k] = (vertical ? ey : uy2) * h;
    b.Bz[k] = (vertical ? ez : uz2) * h;
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

constexpr int kVertexWords = sizeof(LocalVertex) / sizeof(std::uint32_t);  // 9
constexpr int kQuadWords = 4 * kVertexWords;                               // 36 per slot
constexpr int kStagedRows = 40;  // kQuadWords rounded up to whole 8 x 8 tiles

// Where word j of every lane's quad is found in the block: row j holds it for slots 0 to 7, so
// the quads leave the block as rows turned into columns. Built once per frame: the rows are
// fixed places in the block.
struct QuadRows {
  const void* Row[kStagedRows];
};

constexpr float kTu[4][kBlock] = {{0.0f, 0.0f, 0.0f, 0.0f, 0.0f, 0.0f, 0.0f, 0.0f},
                                  {1.0f, 1.0f, 1.0f, 1.0f, 1.0f, 1.0f, 1.0f, 1.0f},
                                  {1.0f, 1.0f, 1.0f, 1.0f, 1.0f, 1.0f, 1.0f, 1.0f},
                                  {0.0f, 0.0f, 0.0f, 0.0f, 0.0f, 0.0f, 0.0f, 0.0f}};

// Corners in the order the fixed index list draws them: (0, 1, 2) and (2, 3, 0), each laid out
// as LocalVertex: position, normal, colour, u, v. The rows past the quad's words are never
// stored; they read u's zeros.
QuadRows RowsOf(const QuadBlock& b) {
  QuadRows r{};
  for (int c = 0; c < 4; ++c) {
    const void** row = r.Row + c * kVertexWords;
    row[0] = b.Cx[c];
    row[1] = b.Cy[c];
    row[2] = b.Cz[c];
    row[3] = b.Nx;
    row[4] = b.Ny;
    row[5] = b.Nz;
    row[6] = b.Color;
    row[7] = kTu[c];
    row[8] = c < 2 ? b.Top : b.Bottom;
  }
  for (int j = kQuadWords; j < kStagedRows; ++j) r.Row[j] = kTu[0];
  return r;
}

#ifdef APE_QUAD_SHUFFLE
// Rows first_row to first_row + 7 turned into columns: slot k gets words first_row.. of its quad
// (only `words` of them, the rest belong to no quad).
APE_QUAD_STEP void WriteTile(unsigned char* quads, const QuadRows& s, int first_row, int count,
                             int words) {
  Lanes r[8], col[8];
  APE_QUAD_UNROLL
  for (int i = 0; i < 8; ++i) std::memcpy(&r[i], s.Row[first_row + i], sizeof(Lanes));
  Transpose(r, col);
  APE_QUAD_UNROLL
  for (int k = 0; k < count; ++k)
    std::memcpy(quads + (k * kQuadWords + first_row) * sizeof(std::uint32_t), &col[k],
                static_cast<std::size_t>(words) * sizeof(std::uint32_t));
}

APE_QUAD_STEP void WriteQuads(LocalVertex* out, const QuadRows& s, int count) {
  unsigned char* quads = reinterpret_cast<unsigned char*>(out);
  if (count == kBlock) {
    // Fixed sizes, so every store is a whole vector.
    APE_QUAD_UNROLL
    for (int row = 0; row + 8 <= kQuadWords; row += 8) WriteTile(quads, s, row, kBlock, 8);
    WriteTile(quads, s, kQuadWords - kQuadWords % 8, kBlock, kQuadWords % 8);
    return;
  }
  for (int row = 0; row < kQuadWords; row += 8)
    WriteTile(quads, s, row, count, std::min(8, kQuadWords - row));
}
#else
APE_QUAD_STEP void WriteQuads(LocalVertex* out, const QuadRows& s, int count) {
  unsigned char* quads = reinterpret_cast<unsigned char*>(out);
  for (int k = 0; k < count; ++k)
    for (int row = 0; row < kQuadWords; ++row)
      std::memcpy(quads + (k * kQuadWords + row) * sizeof(std::uint32_t),
                  static_cast<const unsigned char*>(s.Row[row]) + k * sizeof(std::uint32_t),
                  sizeof(std::uint32_t));
}
#endif

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
  QuadBlock block{};  // RowsOf takes only addresses, but the compiler cannot tell
  const QuadRows rows = RowsOf(block);
  for (std::size_t first = 0; first < slots; first += kBlock) {
    const int count = static_cast<int>(std::min<std::size_t>(kBlock, slots - first));
    const Particle* block_slots = particles + first;
    Gather(block, block_slots, count, spin, has_composite);
    ComputeExtents(block);
    if (spin) Spin(block);
    ComputeCorners(block);
    WriteQuads(out + 4 * first, rows, count);
  }
}

}  // namespace

void Tev_AdvancedParticleEmitter::UpdateLocalVertexBuffer() {
  if (LocalVertices == nullptr) return;
  const std::size_t slots = std::min(DrawnSlotCount(ParticleCount), Particles.size());
  BuildQuads(LocalVertices, Particles.data(), slots, SpinEnabled, HasCompositeTexture);
}
