// The performance counter: CLOCK_MONOTONIC in 100 ns ticks, or a TestClock's ticks while one
// lives, so that tests and offline renders see exact frame lengths.
#include <cmath>
#include <cstdint>
#include <ctime>
#include <limits>

#include "platform/windows_types.h"

namespace {

constexpr std::int64_t kNanosecondsPerTick = 1'000'000'000 / TestClock::kTicksPerSecond;

struct TestClockSlot {
  const TestClock* owner = nullptr;
  std::int64_t ticks = 0;
};

TestClockSlot& Slot() {
  static TestClockSlot slot;
  return slot;
}

std::int64_t MonotonicTicks() {
  timespec now{};
  clock_gettime(CLOCK_MONOTONIC, &now);
  return static_cast<std::int64_t>(now.tv_sec) * TestClock::kTicksPerSecond +
         static_cast<std::int64_t>(now.tv_nsec) / kNanosecondsPerTick;
}

// Adds without signed overflow: a clock pinned at the end of its range is still a clock.
std::int64_t SaturatingAdd(std::int64_t a, std::int64_t b) {
  constexpr std::int64_t kMax = std::numeric_limits<std::int64_t>::max();
  constexpr std::int64_t kMin = std::numeric_limits<std::int64_t>::min();
  if (b > 0 && a > kMax - b) return kMax;
  if (b < 0 && a < kMin - b) return kMin;
  return a + b;
}

// Nearest whole tick of a real-valued tick count; NaN is no time at all and values beyond the
// 64-bit range saturate (converting them would be undefined).
std::int64_t RoundToTicks(double ticks) {
  if (std::isnan(ticks)) return 0;
  // 2^63 as a double: the first value that no longer fits.
  constexpr double kLimit = 9223372036854775808.0;
  if (ticks >= kLimit) return std::numeric_limits<std::int64_t>::max();
  if (ticks <= -kLimit) return std::numeric_limits<std::int64_t>::min();
  return std::llround(ticks);
}

}  // namespace

BOOL QueryPerformanceFrequency(LARGE_INTEGER* frequency) {
  if (frequency == nullptr) return FALSE;
  frequency->QuadPart = TestClock::kTicksPerSecond;
  return TRUE;
}

BOOL QueryPerformanceCounter(LARGE_INTEGER* count) {
  if (count == nullptr) return FALSE;
  const TestClockSlot& slot = Slot();
  count->QuadPart = slot.owner != nullptr ? slot.ticks : MonotonicTicks();
  return TRUE;
}

BOOL DisableThreadLibraryCalls(HMODULE /*module*/) {
  return TRUE;
}

TestClock::TestClock(std::int64_t start_ticks) {
  Slot().owner = this;
  Slot().ticks = start_ticks;
}

TestClock::~TestClock() {
  // Only the clock in charge hands the counter back to the monotonic clock.
  if (Slot().owner == this) Slot().owner = nullptr;
}

void TestClock::Advance(std::int64_t ticks) {
  Slot().ticks = SaturatingAdd(Slot().ticks, ticks);
}

void TestClock::AdvanceMs(double ms) {
  Advance(RoundToTicks(ms * static_cast<double>(kTicksPerSecond / 1000)));
}

void TestClock::AdvanceSeconds(double seconds) {
  Advance(RoundToTicks(seconds * static_cast<double>(kTicksPerSecond)));
}

std::int64_t TestClock::Now() const {
  return Slot().ticks;
}
