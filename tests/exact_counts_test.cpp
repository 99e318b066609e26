// Births, deaths and logic steps of whole renders against what the scenes make happen, including
// particles born and killed within one frame, which a comparison of pools cannot see.
#include <gtest/gtest.h>

#include "tests/scene_test_host.h"
#include "tools/render/render_device.h"
#include "tools/render/scene_renderer.h"

namespace scenetest {
namespace {

struct Totals {
  long long Births = 0;
  long long Deaths = 0;
  long long LogicSteps = 0;
  int LiveAtEnd = 0;
  int PeakLive = 0;
};

// 25 frames at 25 fps: each frame is 40 ms of the emitter's clock, which it measures as exactly
// 40.0f. At 100 births a second (every 10 ms, strictly more banked than that for each) the first
// frame gives 3 births and banks 10 ms, every later one 4: 99 births. At 60 logic steps a second
// the interval is the float just below 1000 / 60 ms, so the 1000 ms pay for 60 steps.
Totals Render(const std::string& links, const std::string& extra_channels = "") {
  TestHost host;
  std::string error;
  const std::string text = "{\"fps\": 25, \"frames\": 25, \"channels\": {" + extra_channels +
                           (extra_channels.empty() ? "" : ", ") +
                           R"("fx": {"type": "AdvancedParticleEmitter", "links": )" + links + "}}}";
  std::unique_ptr<apescene::Scene> scene = host.Load(text, &error);
  EXPECT_NE(scene, nullptr) << error;
  if (scene == nullptr) return {};
  std::unique_ptr<aperender::RenderDevice> device =
      aperender::RenderDevice::Create("null", 64, 64, &error);
  EXPECT_NE(device, nullptr) << error;
  if (device == nullptr) return {};
  Tev_DX8_DeviceChannel device_channel(device->Device());
  aperender::SceneRenderer renderer(*scene, *device, host.Context, host.Clock, 64, 64, 25.0, 1);
  renderer.Prime();
  Totals totals;
  for (int frame = 1; frame <= 25; ++frame) {
    const aperender::FrameResult result = renderer.RenderFrame(frame);
    totals.Births += result.Particles.Births;
    totals.Deaths += result.Particles.Deaths;
    totals.LogicSteps += result.Particles.LogicSteps;
    totals.LiveAtEnd = result.Particles.Live;
    totals.PeakLive = std::max(totals.PeakLive, result.Particles.Live);
  }
  return totals;
}

std::string Links(const std::string& more, const std::string& active = "1") {
  return R"({"Emitter": {"shape": "disc", "radius": 0.1}, "Emitter_Active?": )" + active +
         R"(, "Logic Updates Per Second": 60, "Births Per Second": 100, )" + more + "}";
}

TEST(ExactCountsTest, ParticlesDyingInTheirFirstStepAreCounted) {
  // A life of 0 s ends in the first logic step, in the frame of the birth.
  const Totals totals =
      Render(Links(R"("ParticleCount": 50, "Lifespan_Min": 0, "Lifespan_Max": 0)"));
  EXPECT_EQ(totals.Births, 99);
  EXPECT_EQ(totals.Deaths, 99);
  EXPECT_EQ(totals.LiveAtEnd, 0);
  EXPECT_EQ(totals.PeakLive, 0);
  EXPECT_EQ(totals.LogicSteps, 60);
}

TEST(ExactCountsTest, ParticlesKilledByACollisionInTheirFirstStepAreCounted) {
  // Born just above a floor and thrown at it: the first collision stage kills every one.
  const Totals totals = Render(Links(R"("ParticleCount": 50, "Lifespan_Min": 5, "Lifespan_Max": 5,
               "Emitter Motion": {"translation": [0, 0.05, 0]},
               "InitialForce_Override": [0, -1, 0], "MultiCollisionManager": "floor",
               "Bounce Rate": 0)"),
                               R"("floor": {"type": "MultiCollisionManager",
                  "colliders": [{"shape": "plane", "point": [0, 0, 0], "normal": [0, 1, 0]}]})");
  EXPECT_EQ(totals.Births, 99);
  EXPECT_EQ(totals.Deaths, 99);
  EXPECT_EQ(totals.LiveAtEnd, 0);
}

TEST(ExactCountsTest, AFullPoolTakesOnlyItsFreeRecordsUnlessItReplaces) {
  const Totals kept =
      Render(Links(R"("ParticleCount": 10, "Lifespan_Min": 100, "Lifespan_Max": 100)"));
  EXPECT_EQ(kept.Births, 10);
  EXPECT_EQ(kept.Deaths, 0);
  EXPECT_EQ(kept.LiveAtEnd, 10);
  // One record, replaced by every birth: each birth but the last ends the one before.
  const Totals replaced = Render(Links(
      R"("ParticleCount": 1, "ReplaceOldParticles?": 1, "Lifespan_Min": 100, "Lifespan_Max": 100)"));
  EXPECT_EQ(replaced.Births, 99);
  EXPECT_EQ(replaced.Deaths, 98);
  EXPECT_EQ(replaced.LiveAtEnd, 1);
}

TEST(ExactCountsTest, NoBirthsWithoutAMeshOrWhileInactive) {
  EXPECT_EQ(Render(R"({"Emitter_Active?": 1, "Logic Updates Per Second": 60,
                       "Births Per Second": 100, "ParticleCount": 10})")
                .Births,
            0);
  EXPECT_EQ(Render(Links(R"("ParticleCount": 10)", "0")).Births, 0);
}

}  // namespace
}  // namespace scenetest
