// The envelope curve: interpolation modes, clamping at the ends, key order, the defined answers
// for unusual inputs, editing, and the evenly-spaced fast path agreeing with the plain search.
#include <gtest/gtest.h>

#include <cfloat>
#include <cmath>
#include <cstdlib>
#include <limits>
#include <ostream>
#include <string>
#include <vector>

#include "host/envelope_storage.h"
#include "host/host_context.h"

namespace {

using Mode = Tev_EnvelopeStorage::Interpolation;
using Key = Tev_EnvelopeStorage::Key;

constexpr float kNaN = std::numeric_limits<float>::quiet_NaN();
constexpr float kInf = std::numeric_limits<float>::infinity();

class EnvelopeTest : public ::testing::Test {
 protected:
  Qen_HostContext context_;
  Qen_HostContext::ScopedCurrent current_{&context_};
  Tev_EnvelopeStorage envelope_;
};

struct Sample {
  float X;
  float Expected;
};

struct CurveCase {
  const char* Name;
  std::vector<Key> Keys;
  std::vector<Sample> Samples;
};

void PrintTo(const CurveCase& c, std::ostream* os) {
  *os << c.Name;
}

class EnvelopeCurveTest : public EnvelopeTest, public ::testing::WithParamInterface<CurveCase> {};

TEST_P(EnvelopeCurveTest, SamplesMatchBeforeAndAfterInitialize) {
  envelope_.SetKeys(GetParam().Keys);
  for (const Sample& sample : GetParam().Samples)
    EXPECT_NEAR(envelope_.GetEnvelopeValue(sample.X), sample.Expected, 1e-5f) << "x " << sample.X;
  envelope_.Initialize();
  for (const Sample& sample : GetParam().Samples)
    EXPECT_NEAR(envelope_.GetEnvelopeValue(sample.X), sample.Expected, 1e-5f) << "x " << sample.X;
}

INSTANTIATE_TEST_SUITE_P(
    Curves, EnvelopeCurveTest,
    ::testing::Values(
        CurveCase{"LinearWithHeldEnds",
                  {{0.0f, 0.0f}, {1.0f, 10.0f}, {3.0f, 30.0f}},
                  {{-1.0f, 0.0f},
                   {0.0f, 0.0f},
                   {0.5f, 5.0f},
                   {1.0f, 10.0f},
                   {2.0f, 20.0f},
                   {3.0f, 30.0f},
                   {7.0f, 30.0f}}},
        CurveCase{"StepHoldsUntilNextKey",
                  {{0.0f, 2.0f, Mode::Step}, {1.0f, 10.0f}},
                  {{0.0f, 2.0f}, {0.999f, 2.0f}, {1.0f, 10.0f}}},
        // Hermite with zero tangents: y0 + (y1 - y0) * t^2 (3 - 2t).
        CurveCase{"SmoothEasesInAndOut",
                  {{0.0f, 0.0f, Mode::Smooth}, {1.0f, 10.0f}},
                  {{0.25f, 1.5625f}, {0.5f, 5.0f}, {0.75f, 8.4375f}, {0.01f, 0.00298f}}},
        CurveCase{
            "ModeOfTheSpansFirstKeyGoverns",
            {{0.0f, 0.0f, Mode::Step}, {1.0f, 10.0f, Mode::Linear}, {2.0f, 20.0f, Mode::Step}},
            {{0.5f, 0.0f}, {1.5f, 15.0f}, {2.5f, 20.0f}}},
        CurveCase{"DescendingValues",
                  {{0.0f, 1.0f}, {0.5f, 0.0f}, {1.0f, -1.0f}},
                  {{0.25f, 0.5f}, {0.75f, -0.5f}}}),
    [](const auto& info) { return std::string(info.param.Name); });

TEST_F(EnvelopeTest, NoKeysGiveZeroEverywhere) {
  for (float x : {-1.0f, 0.0f, 1.0f, kNaN, kInf, -kInf})
    EXPECT_EQ(envelope_.GetEnvelopeValue(x), 0.0f);
  EXPECT_EQ(envelope_.GetMinIndex(), 0.0f);
  EXPECT_EQ(envelope_.GetMaxIndex(), 0.0f);
}

TEST_F(EnvelopeTest, OneKeyGivesItsValueEverywhere) {
  envelope_.AddKey(0.5f, 7.0f, Mode::Smooth);
  envelope_.Initialize();
  for (float x : {-100.0f, 0.5f, 0.6f, 100.0f, kNaN, kInf, -kInf})
    EXPECT_EQ(envelope_.GetEnvelopeValue(x), 7.0f) << x;
  EXPECT_EQ(envelope_.GetMinIndex(), 0.5f);
  EXPECT_EQ(envelope_.GetMaxIndex(), 0.5f);
}

TEST_F(EnvelopeTest, NaNGivesTheFirstKeyAndInfinitiesClampToTheEnds) {
  envelope_.SetKeys({{0.0f, 3.0f}, {1.0f, 5.0f}, {2.0f, 9.0f}});
  EXPECT_EQ(envelope_.GetEnvelopeValue(kNaN), 3.0f);
  EXPECT_EQ(envelope_.GetEnvelopeValue(-kInf), 3.0f);
  EXPECT_EQ(envelope_.GetEnvelopeValue(kInf), 9.0f);
}

TEST_F(EnvelopeTest, KeysGivenInAnyOrderAreSortedByX) {
  envelope_.SetKeys({{2.0f, 20.0f}, {0.0f, 0.0f}, {1.0f, 10.0f}});
  envelope_.AddKey(-1.0f, -10.0f);
  envelope_.AddKey(1.5f, 15.0f);
  ASSERT_EQ(envelope_.GetKeyCount(), 5);
  std::vector<float> xs;
  for (const Key& key : envelope_.GetKeys()) xs.push_back(key.X);
  EXPECT_EQ(xs, (std::vector<float>{-1.0f, 0.0f, 1.0f, 1.5f, 2.0f}));
  EXPECT_EQ(envelope_.GetMinIndex(), -1.0f);
  EXPECT_EQ(envelope_.GetMaxIndex(), 2.0f);
  EXPECT_NEAR(envelope_.GetEnvelopeValue(1.25f), 12.5f, 1e-5f);
}

TEST_F(EnvelopeTest, EqualXKeepGivenOrderAndTheLastOneHoldsAtThatX) {
  envelope_.SetKeys({{1.0f, 5.0f}, {0.0f, 0.0f}, {1.0f, 7.0f}, {2.0f, 2.0f}});
  ASSERT_EQ(envelope_.GetKeyCount(), 4);
  EXPECT_EQ(envelope_.GetKeys()[1].Y, 5.0f);
  EXPECT_EQ(envelope_.GetKeys()[2].Y, 7.0f);
  envelope_.AddKey(1.0f, 9.0f);  // after the keys already at 1
  EXPECT_EQ(envelope_.GetKeys()[3].Y, 9.0f);
  EXPECT_NEAR(envelope_.GetEnvelopeValue(0.5f), 2.5f, 1e-6f);  // towards the first key at 1
  EXPECT_EQ(envelope_.GetEnvelopeValue(1.0f), 9.0f);
  EXPECT_NEAR(envelope_.GetEnvelopeValue(1.5f), 5.5f, 1e-6f);  // from the last key at 1
}

TEST_F(EnvelopeTest, NonFiniteKeysAreRefused) {
  envelope_.AddKey(kNaN, 1.0f);
  envelope_.AddKey(1.0f, kInf);
  EXPECT_EQ(envelope_.GetKeyCount(), 0);
  envelope_.SetKeys({{0.0f, 1.0f}, {kNaN, 2.0f}, {1.0f, -kInf}, {2.0f, 3.0f}});
  ASSERT_EQ(envelope_.GetKeyCount(), 2);
  EXPECT_FALSE(envelope_.ReplaceKey(0, {kInf, 0.0f}));
  EXPECT_EQ(envelope_.GetKeys()[0].X, 0.0f);
  EXPECT_NEAR(envelope_.GetEnvelopeValue(1.0f), 2.0f, 1e-6f);
}

TEST_F(EnvelopeTest, ExtremeKeysNeitherOverflowNorLeaveTheirRange) {
  envelope_.SetKeys({{-FLT_MAX, -FLT_MAX, Mode::Smooth}, {FLT_MAX, FLT_MAX}});
  for (float x : {-FLT_MAX, -1e38f, 0.0f, 1e30f, 3e38f, FLT_MAX}) {
    const float y = envelope_.GetEnvelopeValue(x);
    EXPECT_TRUE(std::isfinite(y)) << x;
  }
  EXPECT_NEAR(envelope_.GetEnvelopeValue(0.0f), 0.0f, 1e30f);
  EXPECT_EQ(envelope_.GetEnvelopeValue(FLT_MAX), FLT_MAX);
}

TEST_F(EnvelopeTest, RemoveAndReplaceKeepTheKeysSorted) {
  envelope_.SetKeys({{0.0f, 0.0f}, {1.0f, 10.0f}, {2.0f, 20.0f}, {3.0f, 30.0f}});
  envelope_.Initialize();
  EXPECT_FALSE(envelope_.RemoveKey(4));
  EXPECT_FALSE(envelope_.RemoveKey(-1));
  EXPECT_TRUE(envelope_.RemoveKey(1));
  EXPECT_NEAR(envelope_.GetEnvelopeValue(1.0f), 10.0f, 1e-5f);  // now on the span 0..2
  ASSERT_EQ(envelope_.GetKeyCount(), 3);

  // Moving the first key past the others re-sorts it.
  EXPECT_TRUE(envelope_.ReplaceKey(0, {5.0f, 50.0f}));
  std::vector<float> xs;
  for (const Key& key : envelope_.GetKeys()) xs.push_back(key.X);
  EXPECT_EQ(xs, (std::vector<float>{2.0f, 3.0f, 5.0f}));
  EXPECT_NEAR(envelope_.GetEnvelopeValue(4.0f), 40.0f, 1e-5f);
  EXPECT_EQ(envelope_.GetEnvelopeValue(0.0f), 20.0f);
  EXPECT_FALSE(envelope_.ReplaceKey(3, {0.0f, 0.0f}));

  envelope_.ClearKeys();
  EXPECT_EQ(envelope_.GetKeyCount(), 0);
  EXPECT_EQ(envelope_.GetEnvelopeValue(4.0f), 0.0f);
}

// Evenly spaced keys take the lookup path after Initialize; it must give exactly what the
// binary search gives, also at the keys themselves and for keys whose spacing has rounding in it.
TEST_F(EnvelopeTest, EvenlySpacedLookupAgreesWithTheSearch) {
  std::srand(20240601);
  for (int count : {2, 3, 8, 64}) {
    std::vector<Key> keys;
    for (int i = 0; i < count; ++i)
      keys.push_back({0.1f * static_cast<float>(i), static_cast<float>(std::rand() % 1000),
                      static_cast<Mode>(std::rand() % 3)});
    Tev_EnvelopeStorage searched;
    searched.SetKeys(keys);
    envelope_.SetKeys(keys);
    envelope_.Initialize();
    for (int i = 0; i < 2000; ++i) {
      const float x = -0.1f + 0.1f * static_cast<float>(count + 1) *
                                  (static_cast<float>(std::rand()) / static_cast<float>(RAND_MAX));
      ASSERT_EQ(envelope_.GetEnvelopeValue(x), searched.GetEnvelopeValue(x)) << count << " " << x;
    }
    for (const Key& key : keys)
      ASSERT_EQ(envelope_.GetEnvelopeValue(key.X), searched.GetEnvelopeValue(key.X));
  }
}

TEST_F(EnvelopeTest, EditsAfterInitializeAreSeenWithoutAnotherInitialize) {
  envelope_.SetKeys({{0.0f, 0.0f}, {1.0f, 1.0f}, {2.0f, 2.0f}, {3.0f, 3.0f}});
  envelope_.Initialize();
  envelope_.AddKey(0.5f, 100.0f);  // breaks the even spacing
  EXPECT_EQ(envelope_.GetEnvelopeValue(0.5f), 100.0f);
  EXPECT_NEAR(envelope_.GetEnvelopeValue(0.75f), 50.5f, 1e-4f);
  envelope_.Initialize();
  EXPECT_NEAR(envelope_.GetEnvelopeValue(0.75f), 50.5f, 1e-4f);
}

}  // namespace
