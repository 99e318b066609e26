// Smoke pair forces: every pair of active smoke particles inside an envelope's distance window
// pushes the two apart (repulsion) or pulls them together (attraction), evaluated once per
// update by the lower index.
//
// The all-pairs loop is the definition. SmokePairGrid finds the same pairs in linear time: it
// visits only particles in neighbouring cells of a uniform grid, evaluates every pair with the
// same operands and adds every force in the same order, so both give bit-identical results.
#pragma once

#include <cstdint>
#include <vector>

#include "host/envelope_sampler.h"
#include "platform/d3dx_math.h"
#include "simulation/particle.h"

class Tev_EnvelopeStorage;
class Tev_AdvPE_SmokeSettings;

namespace sim {

// An envelope over distance, acting only strictly inside its index range. Sampled through a view
// taken when this is made: valid while the curve is not edited (within a logic step).
struct DistanceEnvelope {
  Tev_EnvelopeStorage* Envelope = nullptr;
  EnvelopeSampler View;
  float Minimum = 0.0f;
  float Maximum = 0.0f;

  DistanceEnvelope() = default;
  explicit DistanceEnvelope(Tev_EnvelopeStorage* envelope);
  bool Covers(float r) const { return Envelope && Minimum < r && r < Maximum; }
  // Acts at some distance above 0 (the only distances a pair can have).
  bool CanAct() const { return Envelope && Minimum < Maximum && Maximum > 0.0f; }
};

// The smoke settings' repulsion and attraction envelopes with their index ranges.
struct PairEnvelopes {
  DistanceEnvelope Repulsion;
  DistanceEnvelope Attraction;

  PairEnvelopes() = default;
  explicit PairEnvelopes(const Tev_AdvPE_SmokeSettings& smoke);
  bool Any() const { return Repulsion.Envelope || Attraction.Envelope; }
  // No pair is farther apart than this and still acted on; 0 when no envelope can act.
  float Reach() const;
};

// What one pair exerts, as its lower index evaluates it.
struct PairForce {
  bool Repels = false;
  bool Attracts = false;
  D3DXVECTOR3 Repulsion;
  D3DXVECTOR3 Attraction;
};

// The forces between two particles `d` = lower - higher apart at distance r = |d| > 0; false when
// neither envelope acts at r.
bool EvaluatePair(const PairEnvelopes& envelopes, const D3DXVECTOR3& d, float r, float strength,
                  PairForce* force);

// Adds a pair's forces to the lower particle and, equal and opposite, to the higher one.
inline void ApplyPair(Particle& lower, Particle& higher, const PairForce& force) {
  if (force.Repels) {
    lower.SmokeForce += force.Repulsion;
    higher.SmokeForce -= force.Repulsion;
  }
  if (force.Attracts) {
    lower.SmokeForce -= force.Attraction;
    higher.SmokeForce += force.Attraction;
  }
}

// The definition: particle `index` against every active particle of higher index, in ascending
// index order. Coincident particles have no direction between them and exert no force.
void AddPairForcesAllPairs(std::vector<Particle>& pool, int count, int index,
                           const PairEnvelopes& envelopes, float strength);

// How a logic step finds the pairs.
enum class PairSearch {
  Automatic,  // the grid where it helps, the all-pairs loop elsewhere
  AllPairs,   // always the all-pairs loop (the reference)
};

// A uniform grid over the active particles, built once per logic step before any particle moves
// in it, with cells at least as wide as the larger envelope's reach.
//
// Why it gives the all-pairs results: the update of particle i reads its own current position
// (its collision stages, and its own earlier updates of the step, may have moved it) and the
// positions of particles j > i, none of which has been updated yet in this step, so theirs are
// still the positions the grid was built from; so is their Active flag. Every j within reach of
// i lies in i's cell or a neighbouring one, so the grid's candidates of higher index contain
// every pair the loop would act on. The forces are evaluated from the same operands, and the
// pairs are applied in ascending index, as the loop applies them; forces added to j by
// different lower indices keep their order because the logic step runs i in ascending order.
class SmokePairGrid {
 public:
  PairSearch Search = PairSearch::Automatic;
  // Below this many active particles the all-pairs loop is as quick.
  int MinimumGridParticles = 128;
  // Pairs one update may collect; an update with more is evaluated by the all-pairs loop.
  int HitCapacity = 4096;

  // Grows the grid's memory for a pool of `count` records, so that building allocates nothing.
  // False (leaving the grid unused) when the memory cannot be had.
  bool Reserve(int count) noexcept;

  // Prepares one logic step: takes the envelopes and builds the grid from the pool as it stands,
  // or leaves this step to the all-pairs loop (too few particles, a reach the grid cannot use,
  // or no memory).
  void Build(const std::vector<Particle>& pool, int count, const PairEnvelopes& envelopes);
  // Forgets the step at its end.
  void Clear() { Prepared_ = Built_ = false; }
  bool Prepared() const { return Prepared_; }
  bool Built() const { return Built_; }

  // The pair stage of particle `index` within the prepared step (by the grid when it was built):
  // indexes must come in ascending order, as the logic step runs them.
  void AddPairForces(std::vector<Particle>& pool, int count, int index, float strength);

  // Logic steps that used the grid, and updates in them that fell back to the all-pairs loop.
  std::int64_t GridSteps = 0;
  std::int64_t FallbackUpdates = 0;

 private:
  // Candidates are screened this many at a time, in loops the compiler turns into vector code.
  static constexpr int kBlock = 8;

  struct Hit {
    std::int32_t Index;
    PairForce Force;
  };

  bool ChooseCells(double extentX, double extentY, double extentZ, int activeCount);
  int CellCoordinate(float v, double origin, int cells) const;
  // Collects the acting pairs of `index`; false when more than HitCapacity act.
  bool CollectHits(const D3DXVECTOR3& position, int index, float strength, int* hitCount);
  // The same for the entries [begin, end) of one row of neighbouring cells.
  bool ScreenSpan(int begin, int end, const D3DXVECTOR3& position, int index, float strength,
                  int* hitCount);

  PairEnvelopes Envelopes_;
  bool Prepared_ = false;
  bool Built_ = false;
  float ReachSquared_ = 0.0f;  // at least reach^2: a squared distance at or above it never acts
  double OriginX_ = 0.0, OriginY_ = 0.0, OriginZ_ = 0.0;
  double InverseCell_ = 0.0;  // cells per unit of distance
  int CellsX_ = 0, CellsY_ = 0, CellsZ_ = 0;

  std::vector<std::int32_t> CellOf_;     // per pool record; -1 when not in the grid
  std::vector<std::int32_t> CellStart_;  // first entry of each cell, and one past the last cell
  std::vector<std::int32_t> Fill_;       // per cell: the next entry to fill while building
  // The entries' positions and indexes by cell, ascending index within a cell, with kBlock
  // entries of room after the last so that a block never reads past the arrays.
  std::vector<float> X_, Y_, Z_;
  std::vector<std::int32_t> Index_;
  std::vector<Hit> Hits_;
  std::vector<std::uint64_t> Order_;  // (index << 32) | slot of each hit, sorted to apply them
};

}  // namespace sim
