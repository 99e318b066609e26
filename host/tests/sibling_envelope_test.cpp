// The envelope curve: interpolation modes, held ends, key order, the answers for unusual inputs,
// editing, and the evenly-spaced fast path agreeing with the plain search.
#include <cfloat>
#include <cstdlib>
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

// Evenly spaced keys take a direct lookup after Initialize; it must give exactly what the
// search gives, at the keys too. (The spacing of 0.1f steps has rounding in it.)
TEST_F(Envelope, EvenlySpacedLookupAgreesWithTheSearch) {
  std::srand(20240601);
  auto random = [](float range) { return range * static_cast<float>(std::rand()) / RAND_MAX; };
  for (int count : {2, 3, 8, 64}) {
    std::vector<Key> keys;
    for (int i = 0; i < count; ++i)
      keys.push_back({0.1f * static_cast<float>(i), random(1000), static_cast<Mode>(i % 3)});
    Tev_EnvelopeStorage searched;
    searched.SetKeys(keys);
    envelope_.SetKeys(keys);
    envelope_.Initialize();
    for (int i = 0; i < 2000; ++i) {
      const float x = i < count ? keys[i].X : random(0.1f * static_cast<float>(count + 1)) - 0.1f;
      ASSERT_EQ(envelope_.GetEnvelopeValue(x), searched.GetEnvelopeValue(x)) << count << " " << x;
    }
  }
}

}  // namespace
