// The composite texture: layout, pitches, mismatched sources, messages and failures.
#include <string>
#include <vector>

#include "render/tests/render_test_support.h"

namespace {

// Distinct pixels per image, so that any shift or mix-up shows.
std::uint32_t ParticlePixel(UINT x, UINT y) {
  return 0x11000000u | (y << 12) | x;
}
std::uint32_t AttachedPixel(UINT x, UINT y) {
  return 0x22000000u | (y << 12) | x;
}

const Calls kBothKnown = {"APE: Tex1 Format is A8R8G8B8", "APE: Tex2 Format is A8R8G8B8"};

class CompositeTextureTest : public RenderTest {
 protected:
  // The composite holds the particle image (w x h) above the attached image, each clipped to the
  // part its source has, transparent black elsewhere.
  void ExpectLayout(UINT w, UINT h, UINT particle_w, UINT particle_h, UINT attached_w,
                    UINT attached_h) {
    const std::vector<std::uint32_t> pixels = TexturePixels(Emitter().CompositeTexture);
    ASSERT_EQ(pixels.size(), std::size_t{w} * 2 * h);
    for (UINT y = 0; y < 2 * h; ++y) {
      for (UINT x = 0; x < w; ++x) {
        std::uint32_t expected = 0;
        if (y < h && x < particle_w && y < particle_h) expected = ParticlePixel(x, y);
        if (y >= h && x < attached_w && y - h < attached_h) expected = AttachedPixel(x, y - h);
        ASSERT_EQ(pixels[std::size_t{y} * w + x], expected) << "(" << x << ", " << y << ")";
      }
    }
  }
};

TEST_F(CompositeTextureTest, StacksTheParticleImageAboveTheAttachedImage) {
  const auto t1 =
      IdOf(LinkTexture(kLinkParticleTexture, *device_, 64, 64, ParticlePixel).GetTexture());
  const auto t2 =
      IdOf(LinkTexture(kLinkAttachedTexture, *device_, 64, 64, AttachedPixel).GetTexture());
  TakeCalls();
  Emitter().BuildCompositeTexture();
  const std::uint64_t tc = IdOf(Emitter().CompositeTexture);
  // Created managed, one level, A8R8G8B8; locked after both sources and unlocked before them.
  EXPECT_EQ(TakeCalls(),
            (Calls{Call("CreateTexture", {64, 128, 1, 0, D3DFMT_A8R8G8B8, D3DPOOL_MANAGED}),
                   Call("Texture.LockRect", {t1, 0, 0, 0, 64, 64, 0}),
                   Call("Texture.LockRect", {t2, 0, 0, 0, 64, 64, 0}),
                   Call("Texture.LockRect", {tc, 0, 0, 0, 64, 128, 0}),
                   Call("Texture.UnlockRect", {tc, 0}), Call("Texture.UnlockRect", {t1, 0}),
                   Call("Texture.UnlockRect", {t2, 0})}));
  EXPECT_TRUE(Emitter().HasCompositeTexture);
  EXPECT_EQ(messages_, kBothKnown);
  ExpectLayout(64, 64, 64, 64, 64, 64);  // e.g. T2's (10, 5) at (10, 69)
}

// Widths 3 and 5 give 16- and 32-byte row pitches: more than 4 x width, so a copy that ignored
// the pitch would shift rows. The attached image is cut or padded to the particle image.
TEST_F(CompositeTextureTest, RowsFollowEachImagesPitchAndStayInsideBothImages) {
  const UINT cases[][4] = {{3, 4, 3, 4}, {5, 4, 5, 4}, {8, 8, 4, 2}, {4, 8, 16, 2}};
  for (const auto& c : cases) {
    LinkTexture(kLinkParticleTexture, *device_, c[0], c[1], ParticlePixel);
    LinkTexture(kLinkAttachedTexture, *device_, c[2], c[3], AttachedPixel);
    Emitter().BuildCompositeTexture();
    ExpectLayout(c[0], c[1], c[0], c[1], c[2], c[3]);
  }
}

// Other formats are named unknown; only 32-bit ones are copied.
TEST_F(CompositeTextureTest, OtherFormatsAreNamedUnknown) {
  LinkTexture(kLinkParticleTexture, *device_, 8, 8, ParticlePixel, D3DFMT_X8R8G8B8);
  LinkTexture(kLinkAttachedTexture, *device_, 8, 8, AttachedPixel, D3DFMT_R5G6B5);
  Emitter().BuildCompositeTexture();
  EXPECT_EQ(messages_, (Calls{"APE: Tex1 Format unknown", "APE: Tex2 Format unknown"}));
  ExpectLayout(8, 8, 8, 8, 0, 0);
}

// Each failure says so; nothing is copied from or to what could not be had, and only what was
// locked is unlocked.
TEST_F(CompositeTextureTest, FailuresSkipTheirPartOfTheCopy) {
  const struct {
    int FailedLock;  // 0: the creation fails; 1 or 2: that source's lock
    const char* Message;
  } cases[] = {{0, "APE: Failed to create composite texture"},
               {1, "APE: Failed to lock tex1"},
               {2, "APE: Failed to lock tex2"}};
  for (const auto& c : cases) {
    MemoryDevice* sources = MemoryDevice::Create();
    Qen_TextureChannel& t1 = LinkTexture(
        kLinkParticleTexture, c.FailedLock == 1 ? *sources : *device_, 8, 8, ParticlePixel);
    Qen_TextureChannel& t2 = LinkTexture(
        kLinkAttachedTexture, c.FailedLock == 2 ? *sources : *device_, 8, 8, AttachedPixel);
    c.FailedLock ? sources->FailNextTextureLock() : device_->FailNextCreateTexture();
    messages_.clear();
    sources->ClearCalls();
    Emitter().BuildCompositeTexture();
    EXPECT_EQ(messages_.back(), c.Message);
    EXPECT_TRUE(Emitter().HasCompositeTexture);
    if (c.FailedLock)
      ExpectLayout(8, 8, c.FailedLock == 1 ? 0 : 8, 8, c.FailedLock == 2 ? 0 : 8, 8);
    for (const DeviceCall& call : sources->Calls()) EXPECT_NE(call.Name, "Texture.UnlockRect");
    D3DLOCKED_RECT locked{};
    for (Qen_TextureChannel* source : {&t1, &t2}) {
      EXPECT_TRUE(SUCCEEDED(source->LockLevel(0, &locked)));  // unlocked again
      source->UnlockLevel(0);
    }
    Emitter().ClearChild(kLinkParticleTexture);
    Emitter().ClearChild(kLinkAttachedTexture);
    textures_.clear();
    sources->Release();
  }
}

TEST_F(CompositeTextureTest, OneLinkAloneBuildsNothingAndSaysNothing) {
  LinkTexture(kLinkAttachedTexture, *device_, 4, 4, AttachedPixel);
  TakeCalls();
  Emitter().BuildCompositeTexture();
  EXPECT_FALSE(Emitter().HasCompositeTexture);
  EXPECT_TRUE(messages_.empty());
  EXPECT_TRUE(TakeCalls().empty());
}

}  // namespace
