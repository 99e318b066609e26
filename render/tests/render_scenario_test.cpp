// The drawing as the host drives it: switching paths and sizes rebuilds everything, and nothing of
// an earlier build is left alive on the device.
#include "render/tests/render_test_support.h"

namespace {

std::uint32_t White(UINT, UINT) {
  return 0xFFFFFFFF;
}

TEST_F(RenderTest, RebuildsLeaveNoDeviceObjectsBehind) {
  Qen_ValueChannel count(2.0f), hardware(0.0f);
  ASSERT_TRUE(Emitter().SetChild(kLinkParticleCount, &count));
  ASSERT_TRUE(Emitter().SetChild(kLinkHardwareParticles, &hardware));
  LinkTexture(kLinkParticleTexture, *device_, 4, 4, White);
  LinkTexture(kLinkAttachedTexture, *device_, 4, 4, White);
  const auto frame = [this] {
    context_.AdvanceFrame();
    Emitter().CallChannel();
  };
  frame();
  frame();
  const int live = device_->LiveObjectCount();
  for (float h : {1.0f, 0.0f, 1.0f, 0.0f}) {
    hardware.SetValue(h);
    count.SetValue(h + 2.0f);
    for (int call = 0; call < 3; ++call) frame();  // notices, rebuilds, draws
  }
  EXPECT_EQ(device_->LiveObjectCount(), live);
  EXPECT_EQ(Emitter().GetVertexCount(), 8);
  emitter_.reset();  // before the links it holds
}

}  // namespace
