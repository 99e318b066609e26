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

// An envelope the emitter read last frame goes away; the host then asks for a birth before the
// next frame, which reads no envelope that is gone.
TEST(HostileHost, BirthAfterEnvelopeWentAway) {
  ScriptWriter w;
  w.SetValue(kLinkParticleCount, 8).SetValue(kLinkLogicUpdatesPerSecond, 60);
  w.SetValue(kLinkBirthsPerSecond, 0).SetValue(kLinkEmitterActive, 1);
  w.SetValue(kLinkVertexEmissions, 1);
  // The mesh (channel 5), then one envelope per colour link and the size (channels 6 to 10).
  w.Op(apefuzz::kOpSetLink).Byte(0).Byte(kLinkEmitter).Byte(apefuzz::kMeshLists);
  w.Byte(2).Byte(0).Vector(0, 0, 0).Byte(0).Byte(0);
  for (int link : {kLinkSizeEnvelope, kLinkVertexAlphaEnvelope, kLinkRedColorEnvelope,
                   kLinkGreenColorEnvelope, kLinkBlueColorEnvelope}) {
    w.Op(apefuzz::kOpSetLink).Byte(0).Byte(static_cast<std::uint8_t>(link));
    w.Byte(2).Byte(0).Value(0).Value(100).Byte(0).Value(1).Value(200).Byte(0);
  }
  w.Frame(0, 20).Frame(0, 20);
  for (int k = 0; k < 5; ++k) w.Op(apefuzz::kOpDestroyChannel).Byte(6);
  w.Call(0, apefuzz::kCallBirthParticle).SmallIndex(0);
  w.Call(0, apefuzz::kCallBirthParticle).SmallIndex(1);
  w.Frame(0, 20);
  EXPECT_EQ(RunScript(w), "");
}

}  // namespace
