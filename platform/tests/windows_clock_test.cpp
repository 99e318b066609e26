#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>
#include <ctime>
#include <limits>
#include <utility>

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

TEST(PerformanceCounter, CountsTheMonotonicClockAtTenMegahertzWhenNoTestClockLives) {
  LARGE_INTEGER frequency{};
  ASSERT_TRUE(QueryPerformanceFrequency(&frequency));
  EXPECT_EQ(frequency.QuadPart, 10'000'000);
  EXPECT_FALSE(QueryPerformanceFrequency(nullptr));
  EXPECT_FALSE(QueryPerformanceCounter(nullptr));
  for (int round = 0; round < 2; ++round) {
    const std::int64_t before = MonotonicTicksNow();
    const std::int64_t counter = Counter();
    EXPECT_LE(before, counter);
    EXPECT_LE(counter, MonotonicTicksNow());
    TestClock clock(5);  // the second round checks the counter after it has died
  }
}

TEST(TestClock, CounterAnswersItsTicksRoundedToTheNearest) {
  const std::pair<double, std::int64_t> ms[] = {
      {50.0, 500'000}, {1.0 / 3.0, 3'333}, {0.00016, 2}, {0.00014, 1}, {std::nan(""), 0}};
  for (const auto& [amount, ticks] : ms) {
    TestClock clock(100);
    clock.AdvanceMs(amount);
    EXPECT_EQ(Counter() - 100, ticks) << amount << " ms";
  }
  TestClock clock(100);
  clock.AdvanceSeconds(1.0 / 60.0);
  clock.Advance(-40);
  EXPECT_EQ(Counter(), 100 + 166'667 - 40);
  // Many frames accumulate without drift.
  for (int frame = 0; frame < 1000; ++frame) clock.AdvanceMs(50.0);
  for (int frame = 0; frame < 600; ++frame) clock.AdvanceSeconds(0.025);
  EXPECT_EQ(Counter(), 100 + 166'667 - 40 + 65 * TestClock::kTicksPerSecond);
}

TEST(TestClock, HugeAdvancesSaturateInsteadOfOverflowing) {
  constexpr std::int64_t kMax = std::numeric_limits<std::int64_t>::max();
  TestClock clock(kMax - 10);
  clock.Advance(100);
  EXPECT_EQ(clock.Now(), kMax);
  clock.AdvanceSeconds(1e300);
  EXPECT_EQ(clock.Now(), kMax);
  clock.AdvanceSeconds(-std::numeric_limits<double>::infinity());
  EXPECT_EQ(clock.Now(), -1);  // max + min
}

}  // namespace
