// A pool the process cannot allocate leaves an empty pool and a message; nothing is thrown and
// the emitter is not rebuilt every frame. Runs in its own program: it replaces operator new.
#include <cstdlib>
#include <limits>
#include <new>

#include "simulation/tests/emitter_fixture.h"

namespace {
// Allocations larger than this fail while a test sets it.
std::size_t g_fail_above = std::numeric_limits<std::size_t>::max();
}  // namespace

void* operator new(std::size_t size) {
  if (size > g_fail_above) throw std::bad_alloc();
  if (void* memory = std::malloc(size == 0 ? 1 : size)) return memory;
  throw std::bad_alloc();
}
void operator delete(void* memory) noexcept {
  std::free(memory);
}
void operator delete(void* memory, std::size_t) noexcept {
  std::free(memory);
}

namespace {

using PoolAllocation = EmitterTest;

TEST_F(PoolAllocation, FailureLeavesAnEmptyPoolWithAMessageAndIsNotRetriedEveryFrame) {
  LinkBasics(1000.0f, 50.0f, 100.0f);
  g_fail_above = 1000 * sizeof(Particle) - 1;
  emitter->CallChannel();
  g_fail_above = std::numeric_limits<std::size_t>::max();
  EXPECT_EQ(emitter->ParticleCount, 0);
  ASSERT_EQ(debugMessages.size(), 1u);
  EXPECT_EQ(debugMessages[0], "APE: not enough memory for 1000 particles; the pool is empty");
  RunFrames(3, 50.0);
  EXPECT_TRUE(emitter->Initialized);
  // A new count is tried afresh.
  SetValue(kLinkParticleCount, 10.0f);
  RunFrames(2, 20.0);
  EXPECT_EQ(emitter->ParticleCount, 10);
}

}  // namespace
