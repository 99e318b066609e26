#include "simulation/smoke_pairs.h"

#include <algorithm>
#include <cmath>
#include <exception>
#include <limits>

#include "host/envelope_storage.h"
#include "host/smoke_settings.h"
#include "simulation/vector_math.h"

namespace sim {

namespace {

// Cells are a little wider than the reach, so that a pair the float distance puts inside the
// reach is never more than one cell apart after the cell coordinates' own rounding.
constexpr double kCellMargin = 1.0 + 1.0 / 1024.0;
// Below this reach a squared distance could round into the subnormal range and the margin
// above would not hold; such tiny windows go to the all-pairs loop.
constexpr float kMinimumGridReach = 1e-15f;
// The grid never has more cells than this per active particle: emptier cells only cost time.
constexpr int kCellsPerParticle = 2;
// Each cell step widens the cells by this factor until the grid fits that limit.
constexpr double kCellGrowth = 1.25;

// The smallest float at or above reach^2: a float squared distance at or above it has a float
// length at or above the reach, which no envelope window covers.
float ReachSquaredAtLeast(float reach) {
  const double exact = static_cast<double>(reach) * reach;  // exact: 48 significant bits
  float squared = static_cast<float>(exact);
  if (static_cast<double>(squared) < exact)
    squared = std::nextafter(squared, std::numeric_limits<float>::infinity());
  return squared;
}

// Hits arrive as a few ascending runs (one per neighbouring cell) and number a few dozen: an
// insertion sort beats a general one here.
void InsertionSort(std::uint64_t* keys, int count) {
  for (int i = 1; i < count; ++i) {
    const std::uint64_t key = keys[i];
    int j = i;
    for (; j > 0 && keys[j - 1] > key; --j) keys[j] = keys[j - 1];
    keys[j] = key;
  }
}

}  // namespace

DistanceEnvelope::DistanceEnvelope(Tev_EnvelopeStorage* envelope)
    : Envelope(envelope),
      View(envelope ? envelope->GetSampler() : EnvelopeSampler()),
      Minimum(envelope ? envelope->GetMinIndex() : 0.0f),
      Maximum(envelope ? envelope->GetMaxIndex() : 0.0f) {}

PairEnvelopes::PairEnvelopes(const Tev_AdvPE_SmokeSettings& smoke)
    : Repulsion(smoke.RepulsionEnvelope), Attraction(smoke.AttractionEnvelope) {}

float PairEnvelopes::Reach() const {
  float reach = 0.0f;
  if (Repulsion.CanAct()) reach = Repulsion.Maximum;
  if (Attraction.CanAct()) reach = std::max(reach, Attraction.Maximum);
  return reach;
}

bool EvaluatePair(const PairEnvelopes& envelopes, const D3DXVECTOR3& d, float r, float strength,
                  PairForce* force) {
  force->Repels = envelopes.Repulsion.Covers(r);
  force->Attracts = envelopes.Attraction.Covers(r);
  if (!force->Repels && !force->Attracts) return false;
  // The direction d / r, the same value wherever the definition writes it.
  const D3DXVECTOR3 direction = d / r;
  if (force->Repels) force->Repulsion = direction * envelopes.Repulsion.View.At(r) * strength;
  if (force->Attracts) force->Attraction = direction * envelopes.Attraction.View.At(r) * strength;
  return true;
}

void AddPairForcesAllPairs(std::vector<Particle>& pool, int count, int index,
                           const PairEnvelopes& envelopes, float strength) {
  Particle& p = pool[index];
  for (int j = index + 1; j < count; ++j) {
    Particle& other = pool[j];
    if (!other.Active) continue;
    const D3DXVECTOR3 d = p.Position - other.Position;
    const float r = Length(d);
    if (r == 0.0f) continue;
    PairForce force;
    if (EvaluatePair(envelopes, d, r, strength, &force)) ApplyPair(p, other, force);
  }
}

bool SmokePairGrid::Reserve(int count) noexcept {
  if (count <= 0) return true;
  const auto records = static_cast<std::size_t>(count);
  const std::size_t cells = records * kCellsPerParticle;
  const std::size_t entries = records + kBlock;
  const auto hits = static_cast<std::size_t>(std::max(HitCapacity, 0));
  if (CellOf_.size() >= records && Fill_.size() >= cells && Hits_.size() >= hits) return true;
  try {
    CellOf_.resize(std::max(CellOf_.size(), records));
    Fill_.resize(std::max(Fill_.size(), cells));
    CellStart_.resize(Fill_.size() + 1);
    for (auto* axis : {&X_, &Y_, &Z_}) axis->resize(std::max(axis->size(), entries));
    Index_.resize(std::max(Index_.size(), entries));
    Hits_.resize(std::max(Hits_.size(), hits));
    Order_.resize(Hits_.size());
    return true;
  } catch (const std::exception&) {
    // Without its memory the grid stays unused: every step takes the all-pairs loop.
    std::vector<std::int32_t>().swap(CellOf_);
    std::vector<std::int32_t>().swap(CellStart_);
    std::vector<std::int32_t>().swap(Fill_);
    for (auto* axis : {&X_, &Y_, &Z_}) std::vector<float>().swap(*axis);
    std::vector<std::int32_t>().swap(Index_);
    std::vector<Hit>().swap(Hits_);
    std::vector<std::uint64_t>().swap(Order_);
    return false;
  }
}

bool SmokePairGrid::ChooseCells(double extentX, double extentY, double extentZ, int activeCount) {
  const double limit = std::min(static_cast<double>(activeCount) * kCellsPerParticle,
                                static_cast<double>(Fill_.size()));
  // Start no narrower than the widest extent spread over the limit, then widen until it fits.
  double cell = std::max(static_cast<double>(Envelopes_.Reach()) * kCellMargin,
                         std::max({extentX, extentY, extentZ}) / limit);
  double x = 0.0, y = 0.0, z = 0.0;
  for (;;) {
    x = std::floor(extentX / cell) + 1.0;
    y = std::floor(extentY / cell) + 1.0;
    z = std::floor(extentZ / cell) + 1.0;
    if (x * y * z <= limit) break;
    cell *= kCellGrowth;
  }
  // With at most three cells along every axis each update would visit the whole grid.
  if (x <= 3.0 && y <= 3.0 && z <= 3.0) return false;
  CellsX_ = static_cast<int>(x);
  CellsY_ = static_cast<int>(y);
  CellsZ_ = static_cast<int>(z);
  InverseCell_ = 1.0 / cell;
  return true;
}

int SmokePairGrid::CellCoordinate(float v, double origin, int cells) const {
  const double u = std::floor((static_cast<double>(v) - origin) * InverseCell_);
  // Two cells outside the grid or farther, nothing is in reach; clamping there keeps the
  // conversion defined for any finite position.
  return static_cast<int>(std::clamp(u, -2.0, static_cast<double>(cells) + 1.0));
}

void SmokePairGrid::Build(const std::vector<Particle>& pool, int count,
                          const PairEnvelopes& envelopes) {
  Built_ = false;
  Prepared_ = true;
  Envelopes_ = envelopes;
  if (Search == PairSearch::AllPairs) return;
  const float reach = envelopes.Reach();
  if (!(reach >= kMinimumGridReach)) return;
  if (count <= 0 || pool.size() < static_cast<std::size_t>(count) ||
      CellOf_.size() < static_cast<std::size_t>(count) || Fill_.empty())
    return;

  // The box around the active particles. A particle at a non-finite position has no finite
  // distance to any other, so no pair with it ever acts: it stays out of the grid.
  float low[3] = {std::numeric_limits<float>::max(), std::numeric_limits<float>::max(),
                  std::numeric_limits<float>::max()};
  float high[3] = {std::numeric_limits<float>::lowest(), std::numeric_limits<float>::lowest(),
                   std::numeric_limits<float>::lowest()};
  int active = 0;
  for (int i = 0; i < count; ++i) {
    const Particle& p = pool[i];
    if (!p.Active || !IsFinite(p.Position)) {
      CellOf_[i] = -1;
      continue;
    }
    CellOf_[i] = 0;
    ++active;
    low[0] = std::min(low[0], p.Position.x);
    low[1] = std::min(low[1], p.Position.y);
    low[2] = std::min(low[2], p.Position.z);
    high[0] = std::max(high[0], p.Position.x);
    high[1] = std::max(high[1], p.Position.y);
    high[2] = std::max(high[2], p.Position.z);
  }
  if (active < std::max(MinimumGridParticles, 1)) return;
  OriginX_ = low[0];
  OriginY_ = low[1];
  OriginZ_ = low[2];
  if (!ChooseCells(static_cast<double>(high[0]) - low[0], static_cast<double>(high[1]) - low[1],
                   static_cast<double>(high[2]) - low[2], active))
    return;

  // Counting sort by cell; visiting the pool in index order keeps each cell ascending.
  const int cells = CellsX_ * CellsY_ * CellsZ_;
  std::fill(CellStart_.begin(), CellStart_.begin() + cells + 1, 0);
  for (int i = 0; i < count; ++i) {
    if (CellOf_[i] < 0) continue;
    const D3DXVECTOR3& position = pool[i].Position;
    const int x = std::clamp(CellCoordinate(position.x, OriginX_, CellsX_), 0, CellsX_ - 1);
    const int y = std::clamp(CellCoordinate(position.y, OriginY_, CellsY_), 0, CellsY_ - 1);
    const int z = std::clamp(CellCoordinate(position.z, OriginZ_, CellsZ_), 0, CellsZ_ - 1);
    const int cell = (z * CellsY_ + y) * CellsX_ + x;
    CellOf_[i] = cell;
    ++CellStart_[cell + 1];
  }
  for (int c = 0; c < cells; ++c) CellStart_[c + 1] += CellStart_[c];
  std::copy(CellStart_.begin(), CellStart_.begin() + cells, Fill_.begin());
  for (int i = 0; i < count; ++i) {
    const int cell = CellOf_[i];
    if (cell < 0) continue;
    const D3DXVECTOR3& position = pool[i].Position;
    const int entry = Fill_[cell]++;
    X_[entry] = position.x;
    Y_[entry] = position.y;
    Z_[entry] = position.z;
    Index_[entry] = i;
  }

  ReachSquared_ = ReachSquaredAtLeast(reach);
  Built_ = true;
  ++GridSteps;
}

bool SmokePairGrid::ScreenSpan(int begin, int end, const D3DXVECTOR3& position, int index,
                               float strength, int* hitCount) {
  const int capacity = std::min(HitCapacity, static_cast<int>(Hits_.size()));
  const float reachSquared = ReachSquared_;
  for (int base = begin; base < end; base += kBlock) {
    const float* x = X_.data() + base;
    const float* y = Y_.data() + base;
    const float* z = Z_.data() + base;
    const std::int32_t* partner = Index_.data() + base;
    // A whole block screened at once: within reach, and of higher index (lower ones, and the
    // particle itself, are never partners). Lanes past the span are ignored below.
    std::int32_t near[kBlock];
    for (int k = 0; k < kBlock; ++k) {
      const float dx = position.x - x[k];
      const float dy = position.y - y[k];
      const float dz = position.z - z[k];
      near[k] = (dx * dx + dy * dy + dz * dz < reachSquared) & (partner[k] > index);
    }
    std::int32_t any = 0;
    for (int k = 0; k < kBlock; ++k) any |= near[k];
    if (any == 0) continue;
    const int lanes = std::min(kBlock, end - base);
    for (int k = 0; k < lanes; ++k) {
      if (near[k] == 0) continue;
      // The pair as the all-pairs loop evaluates it: p.Position - other.Position and its length.
      const D3DXVECTOR3 d(position.x - x[k], position.y - y[k], position.z - z[k]);
      const float r = Length(d);
      if (r == 0.0f) continue;
      PairForce force;
      if (!EvaluatePair(Envelopes_, d, r, strength, &force)) continue;
      if (*hitCount >= capacity) return false;
      Hits_[static_cast<std::size_t>(*hitCount)] = {partner[k], force};
      ++*hitCount;
    }
  }
  return true;
}

bool SmokePairGrid::CollectHits(const D3DXVECTOR3& position, int index, float strength,
                                int* hitCount) {
  const int cx = CellCoordinate(position.x, OriginX_, CellsX_);
  const int cy = CellCoordinate(position.y, OriginY_, CellsY_);
  const int cz = CellCoordinate(position.z, OriginZ_, CellsZ_);
  const int x0 = std::max(cx - 1, 0);
  const int x1 = std::min(cx + 1, CellsX_ - 1);
  if (x0 > x1) return true;
  // The neighbouring cells of a row lie side by side: one span each.
  for (int z = std::max(cz - 1, 0); z <= std::min(cz + 1, CellsZ_ - 1); ++z) {
    for (int y = std::max(cy - 1, 0); y <= std::min(cy + 1, CellsY_ - 1); ++y) {
      const int row = (z * CellsY_ + y) * CellsX_;
      if (!ScreenSpan(CellStart_[row + x0], CellStart_[row + x1 + 1], position, index, strength,
                      hitCount))
        return false;
    }
  }
  return true;
}

void SmokePairGrid::AddPairForces(std::vector<Particle>& pool, int count, int index,
                                  float strength) {
  if (!Built_) {
    // Neither envelope acts at any distance: the loop would add nothing.
    if (Search == PairSearch::Automatic && !(Envelopes_.Reach() > 0.0f)) return;
    AddPairForcesAllPairs(pool, count, index, Envelopes_, strength);
    return;
  }
  Particle& p = pool[index];
  const D3DXVECTOR3 position = p.Position;
  // A non-finite position has no finite distance to any other: no pair acts.
  if (!IsFinite(position)) return;
  int hits = 0;
  if (!CollectHits(position, index, strength, &hits)) {
    ++FallbackUpdates;
    AddPairForcesAllPairs(pool, count, index, Envelopes_, strength);
    return;
  }
  // The loop applies the pairs in ascending index: so do we.
  for (int h = 0; h < hits; ++h) {
    Order_[static_cast<std::size_t>(h)] =
        static_cast<std::uint64_t>(Hits_[static_cast<std::size_t>(h)].Index) << 32 |
        static_cast<std::uint32_t>(h);
  }
  InsertionSort(Order_.data(), hits);
  for (int h = 0; h < hits; ++h) {
    const Hit& hit =
        Hits_[static_cast<std::size_t>(Order_[static_cast<std::size_t>(h)] & 0xFFFFFFFFu)];
    ApplyPair(p, pool[static_cast<std::size_t>(hit.Index)], hit.Force);
  }
}

}  // namespace sim
