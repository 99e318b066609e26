// BirthParticle: one particle on the emitter mesh, with its first velocity, colour, size, spin
// and lifespan. The rand() draws are made in a fixed order: point, size, spin, lifespan.
#include <cstdlib>
#include <optional>

#include "host/envelope_storage.h"
#include "host/object_data_channel.h"
#include "plugin/advanced_particle_emitter.h"
#include "plugin/link_reading.h"
#include "plugin/link_table.h"
#include "simulation/envelope_sampling.h"
#include "simulation/particle_pool.h"
#include "simulation/vector_math.h"

namespace {

struct BirthPoint {
  D3DXVECTOR3 Point;   // object space, before "Emitter Motion"
  DWORD NormalVertex;  // whose normal the velocity may follow
};

std::optional<BirthPoint> PickVertex(Tev_DX8_ObjectDataChannel& mesh) {
  const int count = mesh.GetVertexCount();
  if (count <= 0) return std::nullopt;
  const DWORD v = static_cast<DWORD>(std::rand() % count);
  return BirthPoint{mesh.GetVertexPosition(v), v};
}

// A point inside a triangle of the index list: a random entry k, its triangle's other two entries,
// and two steps of 0 to 0.99 of the way, first toward the second corner, then toward the third.
// Only whole triangles are chosen, and every vertex they name must exist.
std::optional<BirthPoint> PickTrianglePoint(Tev_AdvancedParticleEmitter& e,
                                            Tev_DX8_ObjectDataChannel& mesh) {
  const int indexCount = mesh.GetIndexCount();
  const int wholeEntries = indexCount > 0 ? indexCount - indexCount % 3 : 0;
  if (wholeEntries < 3) return std::nullopt;
  const int k = std::rand() % wholeEntries;
  int second = 0;
  int third = 0;
  switch (k % 3) {
    case 0:
      second = k + 1, third = k + 2;
      break;
    case 1:
      second = k + 1, third = k - 1;
      break;
    default:
      second = k - 2, third = k - 1;
      break;
  }
  const DWORD v0 = mesh.GetIndexes(static_cast<DWORD>(k));
  const DWORD v1 = mesh.GetIndexes(static_cast<DWORD>(second));
  const DWORD v2 = mesh.GetIndexes(static_cast<DWORD>(third));
  const int vertexCount = mesh.GetVertexCount();
  const auto exists = [vertexCount](DWORD v) {
    return vertexCount > 0 && v < static_cast<DWORD>(vertexCount);
  };
  if (!exists(v0) || !exists(v1) || !exists(v2)) return std::nullopt;
  const D3DXVECTOR3 p0 = mesh.GetVertexPosition(v0);
  const D3DXVECTOR3 p1 = mesh.GetVertexPosition(v1);
  const D3DXVECTOR3 p2 = mesh.GetVertexPosition(v2);
  const float towardSecond = static_cast<float>(e.RandInt(0, 100)) * 0.01f;
  const D3DXVECTOR3 q = p0 + (p1 - p0) * towardSecond;
  const float towardThird = static_cast<float>(e.RandInt(0, 100)) * 0.01f;
  return BirthPoint{q + (p2 - q) * towardThird, v0};
}

// The record to use: a free one, else (when replacing) the oldest free-flying one; none when the
// pool is empty or every record is stuck to a surface. Within a frame's births the searches go
// on from where the last birth's ended (see BirthRunState); a direct call searches afresh.
int ChooseRecord(Tev_AdvancedParticleEmitter& e) {
  sim::BirthRunState& run = e.BirthRun;
  const int free = run.Running ? sim::FirstInactive(e.Particles, e.ParticleCount, run.FreeFrom)
                               : e.GetInactiveParticle();
  // The record found may yet stay free (a birth without a point): the next search starts at it.
  if (run.Running) run.FreeFrom = free >= 0 ? free : e.ParticleCount;
  if (free >= 0) return free;
  if (!e.ReplaceOldParticles || e.ParticleCount <= 0) return -1;
  const int oldest = run.Running && run.Oldest >= 0 ? run.Oldest : e.GetOldestParticle();
  if (run.Running) run.Oldest = oldest;
  return e.Particles[oldest].Attached ? -1 : oldest;
}

D3DXVECTOR3 FirstVelocity(Tev_AdvancedParticleEmitter& e, Tev_DX8_ObjectDataChannel& mesh,
                          const Particle& p, DWORD normalVertex) {
  if (e.HasInitialForceOverride) return e.InitialForceOverride * e.SimulationScaler;
  D3DXVECTOR3 direction;
  if (e.InitialForceAlongNormal) {
    direction = mesh.GetVertexNormals(normalVertex);
  } else {
    const D3DXMATRIX world = mesh.GetWorldMatrix();
    direction = sim::Unit(p.RenderPosition - D3DXVECTOR3(world._41, world._42, world._43));
  }
  return direction * e.InitialForceStrength * e.SimulationScaler;
}

std::uint32_t BirthColor(const Tev_AdvancedParticleEmitter& e) {
  return sim::PackColorLowBits(
      sim::ColorByteAt(e.AlphaEnvelope, 0.0f), sim::ColorByteAt(e.RedEnvelope, 0.0f),
      sim::ColorByteAt(e.GreenEnvelope, 0.0f), sim::ColorByteAt(e.BlueEnvelope, 0.0f));
}

void DrawSize(Tev_AdvancedParticleEmitter& e, Particle& p) {
  const int thousandths = e.RandInt(1000, TruncateToInt(e.SizeOffsetMax * 1000.0f));
  p.SizeMultiplier = static_cast<float>(thousandths) / 1000.0f;
  const float s = e.SizeEnvelope ? e.SizeEnvelope->GetEnvelopeValue(0.0f) : 1.0f;
  const float size = s * p.SizeMultiplier;
  p.Size = size < 0.0f ? 0.0f : size;
}

float DrawSpinSpeed(Tev_AdvancedParticleEmitter& e) {
  const float minimum = e.SpinSpeedMin;
  const float maximum = e.SpinSpeedMax;
  if (minimum > maximum) {
    e.ShowDebug("APE: min spin speed greater than max");
    return minimum;
  }
  if (minimum >= 0.0f)
    return static_cast<float>(
               e.RandInt(TruncateToInt(100.0f * minimum), TruncateToInt(100.0f * maximum))) *
           0.01f;
  const float hundredths =
      static_cast<float>(e.RandInt(0, TruncateToInt((maximum - minimum) * 100.0f))) * 0.01f;
  return maximum >= 0.0f ? minimum + hundredths : maximum - hundredths;
}

// Lifespans are in real seconds while motion is scaled, so they shrink by the time scale.
float DrawLifespan(Tev_AdvancedParticleEmitter& e) {
  const float perScale = 1.0f / e.SimulationScaler;
  if (e.LifespanMin < e.LifespanMax)
    return static_cast<float>(e.RandInt(TruncateToInt(100.0f * e.LifespanMin),
                                        TruncateToInt(100.0f * e.LifespanMax))) *
           (perScale * 0.01f);
  return perScale * e.LifespanMin;
}

}  // namespace

void Tev_AdvancedParticleEmitter::BirthParticle(int birthIndex) {
  auto* mesh = LinkAs<Tev_DX8_ObjectDataChannel>(*this, kLinkEmitter);
  if (!mesh) return;
  // A host may call this between frames, after an envelope the last frame held went away. Within
  // a frame the links cannot change, so this holds what the frame's link reading stage held.
  sim::HoldMainEnvelopes(*this);
  const int index = ChooseRecord(*this);
  if (index < 0) return;

  // The point is found before the record is touched: a mesh without a usable vertex or triangle
  // gives no birth.
  const std::optional<BirthPoint> birth =
      VertexEmissions ? PickVertex(*mesh) : PickTrianglePoint(*this, *mesh);
  if (!birth) return;

  Particle& p = Particles[index];
  p.Active = true;
  D3DXVECTOR4 moved;
  D3DXVec3Transform(&moved, &birth->Point, &EmitterMotion);
  p.Position = D3DXVECTOR3(moved.x, moved.y, moved.z);
  p.RenderPosition = p.Position;

  p.Velocity = FirstVelocity(*this, *mesh, p, birth->NormalVertex);
  p.Color = BirthColor(*this);
  DrawSize(*this, p);
  if (SpinEnabled) {
    p.SpinSpeed = DrawSpinSpeed(*this);
    p.SpinAngle = SpinStart;
    p.RenderSpinAngle = SpinStart;
  }
  p.Lifespan = DrawLifespan(*this);

  p.Age = 0.0f;
  p.SmokeForce = sim::kZeroVector;
  p.Sliding = false;
  p.Attached = false;
  p.Bouncing = true;
  // The frame driver numbers at most kMaximumBirthsPerFrame + 1 births; a larger number from a
  // direct call would hold the next logic step in one particle's updates for hours.
  p.PendingSteps =
      birthIndex < kMaximumBirthsPerFrame ? birthIndex + 1 : kMaximumBirthsPerFrame + 1;
}
