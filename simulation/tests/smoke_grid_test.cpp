// The smoke pair grid on its own: when it builds and when it leaves a step to the all-pairs
// loop, and that a pool's pair forces come out the same either way.
#include <bit>
#include <cstdint>
#include <cstdlib>
#include <limits>
#include <ostream>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "host/envelope_storage.h"
#include "host/host_context.h"
#include "simulation/smoke_pairs.h"

namespace {

// `count` active particles in a jittered cube lattice with `spacing` between neighbours.
std::vector<Particle> Lattice(int count, float spacing) {
  std::srand(11);
  std::vector<Particle> pool(static_cast<std::size_t>(count));
  int side = 1;
  while (side * side * side < count) ++side;
  for (int i = 0; i < count; ++i) {
    Particle& p = pool[static_cast<std::size_t>(i)];
    p.Active = true;
    const auto jitter = [&] { return static_cast<float>(std::rand() % 1000) * 0.0002f * spacing; };
    p.Position = {static_cast<float>(i % side) * spacing + jitter(),
                  static_cast<float>(i / side % side) * spacing + jitter(),
                  static_cast<float>(i / (side * side)) * spacing + jitter()};
  }
  return pool;
}

bool SameBits(const D3DXVECTOR3& a, const D3DXVECTOR3& b) {
  return std::bit_cast<std::uint32_t>(a.x) == std::bit_cast<std::uint32_t>(b.x) &&
         std::bit_cast<std::uint32_t>(a.y) == std::bit_cast<std::uint32_t>(b.y) &&
         std::bit_cast<std::uint32_t>(a.z) == std::bit_cast<std::uint32_t>(b.z);
}

class SmokeGrid : public ::testing::Test {
 protected:
  // A repulsion window from `minimum` to `maximum` and an attraction from half of it on.
  void Windows(float minimum, float maximum) {
    repulsion_.SetKeys({{minimum, 1.0f}, {maximum, 0.25f}});
    attraction_.SetKeys({{maximum * 0.5f, 0.1f}, {maximum, 0.5f}});
    repulsion_.Initialize();
    attraction_.Initialize();
    envelopes_.Repulsion = sim::DistanceEnvelope(&repulsion_);
    envelopes_.Attraction = sim::DistanceEnvelope(&attraction_);
  }

  // Runs every active particle's pair stage in index order, through the grid and through the
  // loop, and expects the same forces bit for bit.
  void ExpectSameForces(const std::vector<Particle>& pool) {
    const int count = static_cast<int>(pool.size());
    std::vector<Particle> byGrid = pool;
    std::vector<Particle> byLoop = pool;
    ASSERT_TRUE(grid_.Reserve(count));
    grid_.Build(byGrid, count, envelopes_);
    for (int i = 0; i < count; ++i) {
      if (!pool[static_cast<std::size_t>(i)].Active) continue;
      grid_.AddPairForces(byGrid, count, i, 0.5f);
      sim::AddPairForcesAllPairs(byLoop, count, i, envelopes_, 0.5f);
    }
    int pushed = 0;
    for (int i = 0; i < count; ++i) {
      const Particle& a = byGrid[static_cast<std::size_t>(i)];
      const Particle& b = byLoop[static_cast<std::size_t>(i)];
      ASSERT_TRUE(SameBits(a.SmokeForce, b.SmokeForce)) << "particle " << i;
      if (!(a.SmokeForce == D3DXVECTOR3(0.0f, 0.0f, 0.0f))) ++pushed;
    }
    pushedCount_ = pushed;
    result_ = byGrid;
  }

  Qen_HostContext context_;
  Qen_HostContext::ScopedCurrent current_{&context_};
  Tev_EnvelopeStorage repulsion_;
  Tev_EnvelopeStorage attraction_;
  sim::PairEnvelopes envelopes_;
  sim::SmokePairGrid grid_;
  int pushedCount_ = 0;
  std::vector<Particle> result_;  // the pool after the grid's pass
};

struct BuildCase {
  const char* Name;
  int Count;
  float Spacing;
  float Minimum;  // repulsion window
  float Maximum;
  int MinimumGridParticles;
  sim::PairSearch Search;
  bool Builds;
  // Failures name the case, not its bytes.
  friend void PrintTo(const BuildCase& c, std::ostream* os) { *os << c.Name; }
};

class GridBuild : public SmokeGrid, public ::testing::WithParamInterface<BuildCase> {};

TEST_P(GridBuild, BuildsOnlyWhereItHelpsAndMatchesTheLoopEitherWay) {
  const BuildCase& c = GetParam();
  Windows(c.Minimum, c.Maximum);
  grid_.MinimumGridParticles = c.MinimumGridParticles;
  grid_.Search = c.Search;
  ExpectSameForces(Lattice(c.Count, c.Spacing));
  EXPECT_EQ(grid_.Built(), c.Builds);
  EXPECT_EQ(grid_.GridSteps, c.Builds ? 1 : 0);
  EXPECT_EQ(grid_.FallbackUpdates, 0);
  // A window inside the cloud acts on some pairs; a window below 0 on none.
  EXPECT_EQ(pushedCount_ > 0, c.Maximum > 0.0f);
}

INSTANTIATE_TEST_SUITE_P(
    Cases, GridBuild,
    ::testing::Values(
        BuildCase{"CloudWithShortReach", 1000, 1.0f, 0.0f, 2.5f, 128, sim::PairSearch::Automatic,
                  true},
        BuildCase{"WindowStartingInsideTheCloud", 1000, 1.0f, 1.5f, 2.5f, 128,
                  sim::PairSearch::Automatic, true},
        BuildCase{"TooFewParticles", 100, 1.0f, 0.0f, 2.5f, 128, sim::PairSearch::Automatic, false},
        BuildCase{"FewParticlesWithALowerMinimum", 100, 1.0f, 0.0f, 1.2f, 8,
                  sim::PairSearch::Automatic, true},
        BuildCase{"ReachAcrossTheCloud", 1000, 1.0f, 0.0f, 4.0f, 128, sim::PairSearch::Automatic,
                  false},
        BuildCase{"NoWindowAbove0", 1000, 1.0f, -3.0f, -1.0f, 128, sim::PairSearch::Automatic,
                  false},
        BuildCase{"AllPairsAsked", 1000, 1.0f, 0.0f, 2.5f, 128, sim::PairSearch::AllPairs, false}),
    [](const auto& info) { return std::string(info.param.Name); });

TEST_F(SmokeGrid, AnUpdateWithMorePairsThanItCanHoldFallsBackToTheLoop) {
  Windows(0.0f, 2.5f);
  grid_.HitCapacity = 3;
  ExpectSameForces(Lattice(1000, 1.0f));
  EXPECT_TRUE(grid_.Built());
  EXPECT_GT(grid_.FallbackUpdates, 0);
  EXPECT_GT(pushedCount_, 0);
}

TEST_F(SmokeGrid, InactiveAndNonFiniteParticlesStayOutAndCoincidentOnesExertNothing) {
  Windows(0.0f, 2.5f);
  std::vector<Particle> pool = Lattice(1000, 1.0f);
  constexpr float kInf = std::numeric_limits<float>::infinity();
  pool[3].Position = {std::numeric_limits<float>::quiet_NaN(), 0.0f, 0.0f};
  pool[4].Position = {kInf, 0.0f, 0.0f};
  pool[5].Position = {0.0f, -kInf, 0.0f};
  pool[6].Active = false;
  pool[7].Position = pool[8].Position;
  ExpectSameForces(pool);
  EXPECT_TRUE(grid_.Built());
  for (int i : {3, 4, 5, 6})
    EXPECT_EQ(result_[static_cast<std::size_t>(i)].SmokeForce, D3DXVECTOR3(0.0f, 0.0f, 0.0f)) << i;
  EXPECT_GT(pushedCount_, 0);
}

TEST_F(SmokeGrid, AFarOutlierOnlyWidensTheCells) {
  Windows(0.0f, 2.5f);
  std::vector<Particle> pool = Lattice(1000, 1.0f);
  pool[0].Position = {3e38f, -3e38f, 1.0f};
  ExpectSameForces(pool);
  EXPECT_GT(pushedCount_, 0);
}

TEST_F(SmokeGrid, AStepWithoutABuildAndWithoutAWindowAddsNothing) {
  Windows(-3.0f, -1.0f);
  std::vector<Particle> pool = Lattice(10, 0.1f);
  grid_.Build(pool, 10, envelopes_);
  for (int i = 0; i < 10; ++i) grid_.AddPairForces(pool, 10, i, 1.0f);
  for (const Particle& p : pool) EXPECT_EQ(p.SmokeForce, D3DXVECTOR3(0.0f, 0.0f, 0.0f));
}

}  // namespace
