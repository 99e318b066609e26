// The hostile host on its hand-made seeds, on random scripts, and on the faults it found.
#include <cstdlib>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "fuzz/host_script.h"
#include "fuzz/hostile_host.h"
#include "fuzz/seeds/host_seeds.h"
#include "plugin/link_table.h"

namespace {

using apefuzz::RunHostScript;
using apefuzz::ScriptWriter;

std::string RunScript(const ScriptWriter& w) {
  return RunHostScript(w.Bytes().data(), w.Bytes().size());
}

class HostSeed : public testing::TestWithParam<apefuzz::NamedScript> {};

TEST_P(HostSeed, RunsClean) {
  EXPECT_EQ(RunHostScript(GetParam().Bytes.data(), GetParam().Bytes.size()), "");
}

INSTANTIATE_TEST_SUITE_P(Seeds, HostSeed, testing::ValuesIn(apefuzz::HostSeeds()),
                         [](const auto& info) { return info.param.Name; });

TEST(HostileHost, EmptyScriptRunsClean) {
  EXPECT_EQ(RunHostScript(nullptr, 0), "");
}

// Random bytes are scripts too: whatever they ask for must keep every invariant.
TEST(HostileHost, RandomScriptsRunClean) {
  std::srand(20261206);
  for (int script = 0; script < 150; ++script) {
    std::vector<std::uint8_t> bytes(static_cast<std::size_t>(std::rand() % 400));
    for (auto& byte : bytes) byte = static_cast<std::uint8_t>(std::rand());
    ASSERT_EQ(RunHostScript(bytes.data(), bytes.size()), "") << "script " << script;
  }
}

// Found by the fuzzer: an envelope the emitter held at the last frame is destroyed, and the host
// then asks for births before the next frame. They must not read the envelope that is gone.
TEST(HostileHost, BirthAfterEnvelopeWentAway) {
  EXPECT_EQ(RunScript(apefuzz::BirthAfterEnvelopeWentAway()), "");
}

// Found by review, now seen by the invariants: an infinite logic rate blended 0 / 0 into every
// drawn position, and a frame call after the host context went away crashed.
TEST(HostileHost, InfiniteLogicRateAndHostContextGoingFirst) {
  EXPECT_EQ(RunScript(apefuzz::InfiniteLogicRate()), "");
  EXPECT_EQ(RunScript(apefuzz::HostContextGoesFirst()), "");
}

}  // namespace
