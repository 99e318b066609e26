// The envelope curve: interpolation modes, held ends, key order, the answers for unusual inputs,
// editing, and the prepared views agreeing with the general path.
#include <algorithm>
#include <cfloat>
#include <cmath>
#include <cstdlib>
#include <limits>
#include <utility>

#include "host/envelope_storage.h"
#include "host/tests/test_channels.h"

namespace {

using Mode = Tev_EnvelopeStorage::Interpolation;
using Key = Tev_EnvelopeStorage::Key;
using Points = std::vector<std::pair<float, float>>;

class Envelope : public HostContextTest {
 protected:
  Tev_EnvelopeStorage envelope_;
};

TEST_F(Envelope, SamplesFollowTheKeysAndHoldTheEnds) {
  struct Case {
    const char* name;
    std::vector<Key> keys;
    Points samples;  // (x, expected y)
  };
  const Case cases[] = {
      {"no keys", {}, {{-1, 0}, {kNaN, 0}, {kInf, 0}}},
      {"one key", {{0.5f, 7, Mode::Smooth}}, {{-100, 7}, {0.6f, 7}, {kNaN, 7}, {-kInf, 7}}},
      {"linear", {{0, 3}, {1, 10}, {3, 30}}, {{-1, 3}, {0.5f, 6.5f}, {2, 20}, {3, 30}, {7, 30}}},
      {"non-finite x", {{0, 3}, {1, 10}}, {{kNaN, 3}, {-kInf, 3}, {kInf, 10}}},
      {"step", {{0, 2, Mode::Step}, {1, 10}}, {{0.999f, 2}, {1, 10}}},
      // Hermite with zero tangents: y0 + (y1 - y0) t^2 (3 - 2t).
      {"smooth", {{0, 0, Mode::Smooth}, {1, 10}}, {{0.25f, 1.5625f}, {0.5f, 5}, {0.75f, 8.4375f}}},
      {"the span's first key decides",
       {{0, 0, Mode::Step}, {1, 10}, {2, 20, Mode::Step}},
       {{0.5f, 0}, {1.5f, 15}, {2.5f, 20}}},
      // Equal x keep their given order; at that x the last of them holds.
      {"equal x", {{1, 5}, {0, 0}, {1, 7}, {2, 2}}, {{0.5f, 2.5f}, {1, 7}, {1.5f, 4.5f}}},
      // Worked without overflow: y0 + (y1 - y0) / 2 in float would be infinite.
      {"extreme keys", {{-FLT_MAX, -FLT_MAX, Mode::Smooth}, {FLT_MAX, FLT_MAX}}, {{0, 0}}}};
  for (const Case& c : cases) {
    SCOPED_TRACE(c.name);
    envelope_.SetKeys(c.keys);
    for (int initialized = 0; initialized < 2; ++initialized, envelope_.Initialize())
      for (const auto& [x, y] : c.samples)
        EXPECT_NEAR(envelope_.GetEnvelopeValue(x), y, 1e-5f) << x;
  }
}

TEST_F(Envelope, KeysStaySortedAndFiniteThroughEveryEdit) {
  envelope_.SetKeys({{2, 20}, {0, 0}, {kNaN, 2}, {1, 10}, {3, -kInf}});
  envelope_.AddKey(1, 15);  // after the key already at 1
  envelope_.AddKey(1, kInf);
  EXPECT_FALSE(envelope_.RemoveKey(4) || envelope_.RemoveKey(-1) ||
               envelope_.ReplaceKey(0, {kInf, 0}));
  EXPECT_TRUE(envelope_.ReplaceKey(0, {5, 50}));  // moves past the others
  Points keys;
  for (const Key& key : envelope_.GetKeys()) keys.emplace_back(key.X, key.Y);
  EXPECT_EQ(keys, (Points{{1, 10}, {1, 15}, {2, 20}, {5, 50}}));
  EXPECT_TRUE(envelope_.GetMinIndex() == 1.0f && envelope_.GetMaxIndex() == 5.0f);
}

// Initialize prepares a view for curves without smooth spans, found by counting (few keys), by
// the even spacing, or by a binary search; every one must give exactly what the general path
// gives, at the keys, between them, beyond them, and for NaN and infinities. (The spacing of 0.1f
// steps has rounding in it.)
TEST_F(Envelope, PreparedViewsAgreeWithTheGeneralPath) {
  std::srand(20240601);
  auto random = [](float range) { return range * static_cast<float>(std::rand()) / RAND_MAX; };
  using Lookup = EnvelopeSampler::Lookup;
  struct Case {
    const char* name;
    int count;
    bool even;
    bool repeatX;  // every third key at the x of the one before
    bool smooth;
    Lookup lookup;
  };
  const Case cases[] = {{"two keys", 2, true, false, false, Lookup::Count4},
                        {"three even keys", 3, true, false, false, Lookup::Count4},
                        {"four uneven keys with equal x", 4, false, true, false, Lookup::Count4},
                        {"eight uneven keys", 8, false, false, false, Lookup::Count8},
                        {"uneven keys with equal x", 7, false, true, false, Lookup::Count8},
                        {"nine even keys", 9, true, false, false, Lookup::Direct},
                        {"64 even keys", 64, true, false, false, Lookup::Direct},
                        {"40 uneven keys", 40, false, false, false, Lookup::Search},
                        {"40 keys with equal x", 40, false, true, false, Lookup::Search},
                        {"smooth spans", 12, true, false, true, Lookup::General}};
  for (const Case& c : cases) {
    SCOPED_TRACE(c.name);
    std::vector<Key> keys;
    float x = 0.0f;
    for (int i = 0; i < c.count; ++i) {
      const bool repeat = c.repeatX && i % 3 == 2;
      if (i > 0 && !repeat) x = c.even ? 0.1f * static_cast<float>(i) : x + 0.01f + random(1.0f);
      Mode mode = i % 2 == 0 ? Mode::Linear : Mode::Step;
      if (c.smooth && i == c.count / 2) mode = Mode::Smooth;
      keys.push_back({x, random(1000) - 500, mode});
    }
    Tev_EnvelopeStorage general;
    general.SetKeys(keys);
    envelope_.SetKeys(keys);
    EXPECT_EQ(envelope_.GetSampler().GetLookup(), Lookup::General) << "before Initialize";
    envelope_.Initialize();
    const EnvelopeSampler view = envelope_.GetSampler();
    ASSERT_EQ(view.GetLookup(), c.lookup);
    std::vector<float> xs = {kNaN, -kInf, kInf, -1e30f, 1e30f};
    for (const Key& key : keys) xs.insert(xs.end(), {key.X, std::nextafter(key.X, -kInf)});
    for (int i = 0; i < 2000; ++i) xs.push_back(random(x * 1.2f + 0.2f) - 0.1f);
    for (float at : xs) {
      const float expected = general.SampleGeneral(at);
      ASSERT_EQ(view.At(at), expected) << at;
      ASSERT_EQ(envelope_.GetEnvelopeValue(at), expected) << at;
    }
  }
}

// Keys at the ends of the float range: a linear span stays finite, within its two y values,
// never decreasing along a rising span, and within a float step (or the double arithmetic's
// rounding of the larger y) of the exact line, prepared or not.
TEST_F(Envelope, ExtremeKeysStayFiniteOrderedAndClose) {
  const float tiny = std::numeric_limits<float>::denorm_min();
  struct Case {
    const char* name;
    Key from, to;
  };
  const Case cases[] = {{"whole range", {-FLT_MAX, -FLT_MAX}, {FLT_MAX, FLT_MAX}},
                        {"steepest", {0, -FLT_MAX}, {tiny, FLT_MAX}},
                        {"falling", {-1, FLT_MAX}, {1, -FLT_MAX}},
                        {"large to zero", {0, 1e30f}, {1, 0}},
                        {"flattest", {-FLT_MAX, 0}, {FLT_MAX, tiny}}};
  for (const Case& c : cases) {
    SCOPED_TRACE(c.name);
    envelope_.SetKeys({c.from, c.to});
    for (int initialized = 0; initialized < 2; ++initialized, envelope_.Initialize()) {
      const float low = std::min(c.from.Y, c.to.Y);
      const float high = std::max(c.from.Y, c.to.Y);
      const long double slope = (static_cast<long double>(c.to.Y) - c.from.Y) /
                                (static_cast<long double>(c.to.X) - c.from.X);
      float previous = c.from.Y;
      for (int i = 0; i <= 1000; ++i) {
        const float x =
            static_cast<float>(c.from.X + (static_cast<double>(c.to.X) - c.from.X) * (i / 1000.0));
        const float y = envelope_.GetEnvelopeValue(x);
        ASSERT_TRUE(std::isfinite(y) && y >= low && y <= high) << x << " " << y;
        if (c.to.Y > c.from.Y) {
          ASSERT_GE(y, previous) << x;
        }
        previous = y;
        const long double exact = c.from.Y + (static_cast<long double>(x) - c.from.X) * slope;
        const float near = static_cast<float>(std::clamp<long double>(exact, low, high));
        const float step = std::nextafter(std::fabs(near), kInf) - std::fabs(near);
        const float rounding = std::max(std::fabs(c.from.Y), std::fabs(c.to.Y)) * 0x1p-50f;
        ASSERT_LE(std::fabs(y - near), std::max(step, rounding)) << x;
      }
    }
  }
}

}  // namespace
