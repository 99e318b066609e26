// The drawing as the host drives it: Initialize on the first call, then a rebuild and a pass in
// every working frame.
#include <algorithm>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "plugin/link_table.h"
#include "render/tests/render_test_support.h"

namespace {

std::uint32_t White(UINT, UINT) {
  return 0xFFFFFFFF;
}

class RenderScenarioTest : public RenderTest {
 protected:
  Qen_ValueChannel& LinkValue(int link, float value) {
    values_.push_back(std::make_unique<Qen_ValueChannel>(value));
    EXPECT_TRUE(Emitter().SetChild(link, values_.back().get()));
    return *values_.back();
  }

  // One host frame: the frame counter moves on, then the host calls the emitter.
  void Frame() {
    context_.AdvanceFrame();
    Emitter().CallChannel();
  }

  static bool Contains(const std::vector<std::string>& calls, const std::string& call) {
    return std::find(calls.begin(), calls.end(), call) != calls.end();
  }

  std::vector<std::unique_ptr<Qen_ValueChannel>> values_;
};

TEST_F(RenderScenarioTest, QuadPathDeclaresOnceThenCopiesAndDrawsWithTheComposite) {
  LinkValue(kLinkParticleCount, 3.0f);
  LinkValue(kLinkUseVertexAlphaFading, 1.0f);
  LinkTexture(kLinkParticleTexture, MakeTexture(*device_, 4, 4, D3DFMT_A8R8G8B8, White));
  LinkTexture(kLinkAttachedTexture, MakeTexture(*device_, 4, 4, D3DFMT_A8R8G8B8, White));

  Emitter().CallChannel();  // initializes only
  ASSERT_TRUE(Emitter().Initialized);
  EXPECT_EQ(Emitter().GetVertexCount(), 12);
  EXPECT_EQ(Emitter().GetIndexCount(), 18);
  ASSERT_NE(Emitter().CompositeTexture, nullptr);
  ASSERT_NE(Emitter().VertexBuffer, nullptr);
  EXPECT_EQ(messages_, (std::vector<std::string>{"APE: Tex1 Format is A8R8G8B8",
                                                 "APE: Tex2 Format is A8R8G8B8"}));
  TakeCalls();

  Frame();
  const std::vector<std::string> calls = TakeCalls();
  const std::uint64_t buffer = IdOf(Emitter().VertexBuffer);
  EXPECT_TRUE(Contains(calls, Call("VertexBuffer.Lock", {buffer, 0, 0, D3DLOCK_DISCARD})));
  EXPECT_TRUE(Contains(calls, Call("SetTexture", {0, IdOf(Emitter().CompositeTexture)})));
  EXPECT_TRUE(Contains(calls, Call("SetRenderState", {D3DRS_ZWRITEENABLE, TRUE})));
  EXPECT_EQ(
      std::count_if(calls.begin(), calls.end(),
                    [](const std::string& c) { return c.rfind("DrawIndexedPrimitive", 0) == 0; }),
      1);
  EXPECT_EQ(messages_.size(), 2u);
}

TEST_F(RenderScenarioTest, PointPathCreatesFillsAndDrawsEverySlot) {
  LinkValue(kLinkParticleCount, 3.0f);
  LinkValue(kLinkHardwareParticles, 1.0f);
  Emitter().CallChannel();
  ASSERT_TRUE(Emitter().HardwareParticles);
  ASSERT_NE(Emitter().PointSpriteVertexBuffer, nullptr);
  const std::uint64_t buffer = IdOf(Emitter().PointSpriteVertexBuffer);
  const std::vector<std::string> init_calls = TakeCalls();
  EXPECT_TRUE(Contains(
      init_calls,
      Call("CreateVertexBuffer",
           {60, D3DUSAGE_WRITEONLY | D3DUSAGE_POINTS | D3DUSAGE_DYNAMIC, 0x62, D3DPOOL_DEFAULT})));
  EXPECT_TRUE(Contains(init_calls, Call("VertexBuffer.Lock", {buffer, 0, 60, 0})));

  Frame();
  const std::vector<std::string> calls = TakeCalls();
  EXPECT_TRUE(Contains(calls, Call("DrawPrimitive", {D3DPT_POINTLIST, 0, 3})));
  EXPECT_FALSE(Contains(calls, Call("SetRenderState", {D3DRS_ZWRITEENABLE, TRUE})));
  EXPECT_EQ(calls.back(), Call("SetRenderState", {D3DRS_POINTSCALEENABLE, FALSE}));
  EXPECT_TRUE(messages_.empty());
}

// Switching paths and sizes rebuilds everything; nothing of an earlier build is left alive.
TEST_F(RenderScenarioTest, RebuildsLeaveNoDeviceObjectsBehind) {
  LinkValue(kLinkParticleCount, 2.0f);
  Qen_ValueChannel& hardware = LinkValue(kLinkHardwareParticles, 0.0f);
  LinkTexture(kLinkParticleTexture, MakeTexture(*device_, 4, 4, D3DFMT_A8R8G8B8, White));
  LinkTexture(kLinkAttachedTexture, MakeTexture(*device_, 4, 4, D3DFMT_A8R8G8B8, White));
  Emitter().CallChannel();
  Frame();
  const int live = device_->LiveObjectCount();
  for (float h : {1.0f, 0.0f, 1.0f, 0.0f}) {
    hardware.SetValue(h);
    Frame();  // notices the change
    Frame();  // rebuilds
    Frame();  // draws
  }
  EXPECT_EQ(device_->LiveObjectCount(), live);
  EXPECT_FALSE(Emitter().HardwareParticles);
  EXPECT_EQ(Emitter().GetVertexCount(), 8);
}

}  // namespace
