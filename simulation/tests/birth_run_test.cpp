// A frame's births, one after another: each takes the lowest free record left, then, when
// replacing, the oldest record again and again; a direct birth after the frame searches afresh.
#include "simulation/tests/emitter_fixture.h"

namespace {

constexpr float kPlacedLifespan = 50.0f;  // births get the basics' 100 s

// Eight records, three births in one 21 ms frame at 150 births per second, and no logic step
// (10 per second), so that each born record keeps its PendingSteps: birth k leaves k + 1.
class BirthRun : public EmitterTest {
 protected:
  void SetUp() override { LinkBasics(8.0f, 10.0f, 150.0f); }
};

struct RunCase {
  const char* Name;
  std::vector<bool> Active;  // the records before the frame
  bool Replace;
  std::vector<int> Pending;  // after the frame; 0 for a record that was not born into
};

TEST_F(BirthRun, EachBirthOfAFrameTakesTheNextFreeRecordOrTheSameOldestOne) {
  const RunCase cases[] = {
      {"ScatteredFreeRecords", {1, 0, 1, 1, 0, 1, 1, 0}, false, {0, 1, 0, 0, 2, 0, 0, 3}},
      {"FreeRecordsAtTheStart", {0, 0, 0, 1, 1, 1, 1, 1}, false, {1, 2, 3, 0, 0, 0, 0, 0}},
      {"TooFewFreeRecords", {1, 1, 1, 1, 1, 0, 1, 1}, false, {0, 0, 0, 0, 0, 1, 0, 0}},
      // Record 6 is the oldest; the births replace it again and again (their NormalizedAge
      // stays), and the last of them is the one that lives.
      {"FullPoolReplaced", {1, 1, 1, 1, 1, 1, 1, 1}, true, {0, 0, 0, 0, 0, 0, 3, 0}},
      // The free record is taken first, then the oldest one twice.
      {"FreeThenOldest", {1, 1, 0, 1, 1, 1, 1, 1}, true, {0, 0, 1, 0, 0, 0, 3, 0}},
  };
  Start();
  for (const RunCase& c : cases) {
    SCOPED_TRACE(c.Name);
    SetValue(kLinkReplaceOldParticles, c.Replace ? 1.0f : 0.0f);
    for (int i = 0; i < 8; ++i) {
      Particle& p = PlaceParticle(i, {9.0f, 9.0f, 9.0f}, {0.0f, 0.0f, 0.0f}, kPlacedLifespan);
      p.Active = c.Active[static_cast<std::size_t>(i)];
      p.NormalizedAge = i == 6 ? 0.9f : 0.1f * static_cast<float>(i % 4);
    }
    emitter->BirthAccumulator = 0.0f;
    emitter->LogicAccumulator = 0.0f;
    RunFrame(21.0);
    for (int i = 0; i < 8; ++i) {
      const int pending = c.Pending[static_cast<std::size_t>(i)];
      const Particle& p = P(i);
      EXPECT_EQ(p.Lifespan, pending > 0 ? 100.0f : kPlacedLifespan) << "record " << i;
      EXPECT_EQ(p.PendingSteps, pending > 0 ? pending : 1) << "record " << i;
      EXPECT_EQ(p.Active, pending > 0 || c.Active[static_cast<std::size_t>(i)]) << "record " << i;
    }
    EXPECT_FALSE(emitter->BirthRun.Running);
  }
}

TEST_F(BirthRun, ABirthOutsideTheFramesSearchesFromTheStartOfThePool) {
  Start();
  for (int i = 0; i < 8; ++i)
    PlaceParticle(i, {9.0f, 9.0f, 9.0f}, {0.0f, 0.0f, 0.0f}).Active = i < 4;
  RunFrame(21.0);  // records 4, 5 and 6
  ASSERT_EQ(ActiveCount(), 7);
  P(1).Active = false;
  emitter->BirthParticle(0);
  EXPECT_TRUE(P(1).Active);
  EXPECT_EQ(P(1).Lifespan, 100.0f);
  EXPECT_FALSE(P(7).Active);
}

}  // namespace
