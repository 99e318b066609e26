#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>
#include <ctime>
#include <limits>

#include "platform/d3d9_types.h"
#include "platform/windows_types.h"

namespace {

std::int64_t Counter() {
  LARGE_INTEGER now{};
  EXPECT_TRUE(QueryPerformanceCounter(&now));
  return now.QuadPart;
}

std::int64_t MonotonicTicksNow() {
  timespec t{};
  clock_gettime(CLOCK_MONOTONIC, &t);
  return std::int64_t{t.tv_sec} * 10'000'000 + t.tv_nsec / 100;
}

TEST(PerformanceCounter, FrequencyIsTenMegahertzAndExactInFloat) {
  LARGE_INTEGER frequency{};
  ASSERT_TRUE(QueryPerformanceFrequency(&frequency));
  EXPECT_EQ(frequency.QuadPart, 10'000'000);
  EXPECT_EQ(static_cast<std::int64_t>(static_cast<float>(frequency.QuadPart)), 10'000'000);
}

TEST(PerformanceCounter, NullOutputsAreRefused) {
  EXPECT_FALSE(QueryPerformanceFrequency(nullptr));
  EXPECT_FALSE(QueryPerformanceCounter(nullptr));
  EXPECT_EQ(DisableThreadLibraryCalls(nullptr), TRUE);
}

TEST(PerformanceCounter, FollowsTheMonotonicClockWithoutATestClock) {
  const std::int64_t before = MonotonicTicksNow();
  const std::int64_t counter = Counter();
  const std::int64_t after = MonotonicTicksNow();
  EXPECT_LE(before, counter);
  EXPECT_LE(counter, after);
}

TEST(TestClock, CounterAnswersItsTicks) {
  TestClock clock(1234);
  EXPECT_EQ(Counter(), 1234);
  clock.AdvanceMs(50.0);
  EXPECT_EQ(Counter(), 1234 + 500'000);
  EXPECT_EQ(clock.Now(), 1234 + 500'000);
}

struct AdvanceCase {
  const char* what;
  void (*advance)(TestClock&);
  std::int64_t ticks;
};

class TestClockAdvance : public testing::TestWithParam<AdvanceCase> {};

TEST_P(TestClockAdvance, RoundsToTheNearestTick) {
  TestClock clock(100);
  GetParam().advance(clock);
  EXPECT_EQ(clock.Now() - 100, GetParam().ticks);
}

INSTANTIATE_TEST_SUITE_P(
    Steps, TestClockAdvance,
    testing::Values(
        AdvanceCase{"ticks", [](TestClock& c) { c.Advance(7); }, 7},
        AdvanceCase{"backwards", [](TestClock& c) { c.Advance(-40); }, -40},
        AdvanceCase{"frame_ms", [](TestClock& c) { c.AdvanceMs(50.0); }, 500'000},
        AdvanceCase{"third_ms", [](TestClock& c) { c.AdvanceMs(1.0 / 3.0); }, 3'333},
        AdvanceCase{"rounds_up", [](TestClock& c) { c.AdvanceMs(0.00016); }, 2},
        AdvanceCase{"rounds_down", [](TestClock& c) { c.AdvanceMs(0.00014); }, 1},
        AdvanceCase{"seconds", [](TestClock& c) { c.AdvanceSeconds(1.5); }, 15'000'000},
        AdvanceCase{"sixtieth", [](TestClock& c) { c.AdvanceSeconds(1.0 / 60.0); }, 166'667},
        AdvanceCase{"nan_is_no_time", [](TestClock& c) { c.AdvanceMs(std::nan("")); }, 0}),
    [](const testing::TestParamInfo<AdvanceCase>& info) { return std::string(info.param.what); });

TEST(TestClock, ManyFramesAccumulateWithoutDrift) {
  TestClock clock;
  for (int frame = 0; frame < 1000; ++frame) clock.AdvanceMs(50.0);
  for (int frame = 0; frame < 600; ++frame) clock.AdvanceSeconds(0.025);
  EXPECT_EQ(Counter(), 50 * TestClock::kTicksPerSecond + 15 * TestClock::kTicksPerSecond);
}

TEST(TestClock, HugeAdvancesSaturateInsteadOfOverflowing) {
  TestClock clock(std::numeric_limits<std::int64_t>::max() - 10);
  clock.Advance(100);
  EXPECT_EQ(clock.Now(), std::numeric_limits<std::int64_t>::max());
  clock.AdvanceSeconds(1e300);
  EXPECT_EQ(clock.Now(), std::numeric_limits<std::int64_t>::max());
  clock.AdvanceSeconds(-std::numeric_limits<double>::infinity());
  EXPECT_EQ(clock.Now(), -1);  // max + min
}

TEST(TestClock, CounterReturnsToTheMonotonicClockWhenItDies) {
  { TestClock clock(5); }
  const std::int64_t before = MonotonicTicksNow();
  const std::int64_t counter = Counter();
  EXPECT_LE(before, counter);
  EXPECT_LE(counter, MonotonicTicksNow());
}

struct BitsCase {
  float value;
  DWORD bits;
};

class StateBits : public testing::TestWithParam<BitsCase> {};

TEST_P(StateBits, CarryTheFloatBitForBit) {
  EXPECT_EQ(FloatToStateBits(GetParam().value), GetParam().bits);
  const float back = StateBitsToFloat(GetParam().bits);
  EXPECT_EQ(FloatToStateBits(back), GetParam().bits);
}

INSTANTIATE_TEST_SUITE_P(Values, StateBits,
                         testing::Values(BitsCase{0.0f, 0u}, BitsCase{-0.0f, 0x80000000u},
                                         BitsCase{1.0f, 0x3F800000u}, BitsCase{64.0f, 0x42800000u},
                                         BitsCase{-2.5f, 0xC0200000u}));

TEST(StateBits, KeepANanPayload) {
  EXPECT_EQ(FloatToStateBits(StateBitsToFloat(0x7FC00123u)), 0x7FC00123u);
}

}  // namespace
