// The composite texture: layout, pitches, mismatched sources, messages and every failure.
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "plugin/link_table.h"
#include "render/tests/render_test_support.h"

namespace {

using Strings = std::vector<std::string>;

// Distinct pixels per image, so that any shift or mix-up shows.
std::uint32_t ParticlePixel(UINT x, UINT y) {
  return 0x11000000u | (y << 12) | x;
}
std::uint32_t AttachedPixel(UINT x, UINT y) {
  return 0x22000000u | (y << 12) | x;
}

const Strings kBothKnown = {"APE: Tex1 Format is A8R8G8B8", "APE: Tex2 Format is A8R8G8B8"};

class CompositeTextureTest : public RenderTest {
 protected:
  Qen_TextureChannel& LinkParticle(MemoryDevice& device, UINT w, UINT h,
                                   D3DFORMAT format = D3DFMT_A8R8G8B8) {
    Qen_TextureChannel& texture = MakeTexture(device, w, h, format, ParticlePixel);
    LinkTexture(kLinkParticleTexture, texture);
    return texture;
  }
  Qen_TextureChannel& LinkAttached(MemoryDevice& device, UINT w, UINT h,
                                   D3DFORMAT format = D3DFMT_A8R8G8B8) {
    Qen_TextureChannel& texture = MakeTexture(device, w, h, format, AttachedPixel);
    LinkTexture(kLinkAttachedTexture, texture);
    return texture;
  }

  TexturePixels Composite() {
    EXPECT_NE(Emitter().CompositeTexture, nullptr);
    if (Emitter().CompositeTexture == nullptr) return {};
    return ReadPixels(*Emitter().CompositeTexture);
  }

  // Every pixel: the particle image above, the attached image below, clipped to the given
  // sizes of what each source provides, transparent black elsewhere.
  static void ExpectLayout(const TexturePixels& composite, UINT w, UINT h, UINT particle_w,
                           UINT particle_h, UINT attached_w, UINT attached_h) {
    ASSERT_EQ(composite.Width, w);
    ASSERT_EQ(composite.Height, 2 * h);
    for (UINT y = 0; y < 2 * h; ++y) {
      for (UINT x = 0; x < w; ++x) {
        std::uint32_t expected = 0;
        if (y < h && x < particle_w && y < particle_h) expected = ParticlePixel(x, y);
        if (y >= h && x < attached_w && y - h < attached_h) expected = AttachedPixel(x, y - h);
        ASSERT_EQ(composite.At(x, y), expected) << "pixel (" << x << ", " << y << ")";
      }
    }
  }

  static int CountCalls(MemoryDevice& device, const std::string& name) {
    int count = 0;
    for (const DeviceCall& call : device.Calls()) count += call.Name == name;
    return count;
  }
};

TEST_F(CompositeTextureTest, StacksTheParticleImageAboveTheAttachedImage) {
  Qen_TextureChannel& particle = LinkParticle(*device_, 64, 64);
  Qen_TextureChannel& attached = LinkAttached(*device_, 64, 64);
  TakeCalls();
  Emitter().BuildCompositeTexture();
  EXPECT_TRUE(Emitter().HasCompositeTexture);
  const TexturePixels composite = Composite();
  EXPECT_EQ(composite.At(10, 5), ParticlePixel(10, 5));
  EXPECT_EQ(composite.At(10, 69), AttachedPixel(10, 5));
  ExpectLayout(composite, 64, 64, 64, 64, 64, 64);
  EXPECT_EQ(messages_, kBothKnown);

  // Created managed, one level, A8R8G8B8; locked after both sources and unlocked before them.
  const std::uint64_t t1 = IdOf(particle.GetTexture());
  const std::uint64_t t2 = IdOf(attached.GetTexture());
  const std::uint64_t tc = IdOf(Emitter().CompositeTexture);
  const Strings calls = TakeCalls();
  const Strings expected = {
      Call("CreateTexture", {64, 128, 1, 0, D3DFMT_A8R8G8B8, D3DPOOL_MANAGED}),
      Call("Texture.LockRect", {t1, 0, 0, 0, 64, 64, 0}),
      Call("Texture.LockRect", {t2, 0, 0, 0, 64, 64, 0}),
      Call("Texture.LockRect", {tc, 0, 0, 0, 64, 128, 0}),
      Call("Texture.UnlockRect", {tc, 0}),
      Call("Texture.UnlockRect", {t1, 0}),
      Call("Texture.UnlockRect", {t2, 0})};
  // The composite's own read-back follows the build's calls.
  ASSERT_GE(calls.size(), expected.size());
  EXPECT_EQ(Strings(calls.begin(), calls.begin() + expected.size()), expected);
}

// Widths of 3 and 5 pixels give the reference device a 16- and 32-byte row pitch (rows are
// aligned to 16 bytes): more than 4 x width, so a copy that ignored the pitch would shift rows.
TEST_F(CompositeTextureTest, RowsAreReachedThroughEachImagesOwnPitch) {
  for (UINT width : {3u, 5u}) {
    SCOPED_TRACE(testing::Message() << "width " << width);
    LinkParticle(*device_, width, 4);
    LinkAttached(*device_, width, 4);
    Emitter().BuildCompositeTexture();
    ExpectLayout(Composite(), width, 4, width, 4, width, 4);
  }
}

struct SizeCase {
  const char* Name;
  UINT ParticleW, ParticleH, AttachedW, AttachedH;
};
void PrintTo(const SizeCase& c, std::ostream* os) {
  *os << c.Name;
}

class MismatchedSizeTest : public CompositeTextureTest,
                           public testing::WithParamInterface<SizeCase> {};

// The composite follows the particle image; the attached image is cut or padded to it, and no
// copy reads or writes outside a locked image (the sanitizers watch the reference device's
// bytes).
TEST_P(MismatchedSizeTest, CopiesOnlyWhereBothImagesHavePixels) {
  const SizeCase& c = GetParam();
  LinkParticle(*device_, c.ParticleW, c.ParticleH);
  LinkAttached(*device_, c.AttachedW, c.AttachedH);
  Emitter().BuildCompositeTexture();
  ExpectLayout(Composite(), c.ParticleW, c.ParticleH, c.ParticleW, c.ParticleH, c.AttachedW,
               c.AttachedH);
  EXPECT_EQ(messages_, kBothKnown);
}

INSTANTIATE_TEST_SUITE_P(Sizes, MismatchedSizeTest,
                         testing::Values(SizeCase{"AttachedSmaller", 8, 8, 4, 2},
                                         SizeCase{"AttachedNarrower", 8, 8, 3, 8},
                                         SizeCase{"AttachedLarger", 8, 8, 16, 16},
                                         SizeCase{"AttachedWiderButShorter", 4, 8, 16, 2}),
                         [](const testing::TestParamInfo<SizeCase>& info) {
                           return info.param.Name;
                         });

TEST_F(CompositeTextureTest, OtherFormatsAreNamedUnknownAndOnlyThirtyTwoBitOnesCopied) {
  LinkParticle(*device_, 8, 8, D3DFMT_X8R8G8B8);
  Qen_TextureChannel& attached = LinkAttached(*device_, 8, 8, D3DFMT_R5G6B5);
  Emitter().BuildCompositeTexture();
  EXPECT_EQ(messages_, (Strings{"APE: Tex1 Format unknown", "APE: Tex2 Format unknown"}));
  // X8R8G8B8 is copied unchanged; the 16-bit image is not, so its half stays transparent.
  ExpectLayout(Composite(), 8, 8, 8, 8, 0, 0);
  // The 16-bit source was still locked and is unlocked again.
  D3DLOCKED_RECT locked{};
  EXPECT_TRUE(SUCCEEDED(attached.LockLevel(0, &locked)));
  attached.UnlockLevel(0);
}

TEST_F(CompositeTextureTest, FailedCreationSkipsTheCopyAndUnlocksTheSources) {
  Qen_TextureChannel& particle = LinkParticle(*device_, 8, 8);
  Qen_TextureChannel& attached = LinkAttached(*device_, 8, 8);
  device_->FailNextCreateTexture();
  Emitter().BuildCompositeTexture();
  EXPECT_EQ(Emitter().CompositeTexture, nullptr);
  EXPECT_TRUE(Emitter().HasCompositeTexture);
  EXPECT_EQ(messages_, (Strings{"APE: Tex1 Format is A8R8G8B8", "APE: Tex2 Format is A8R8G8B8",
                                "APE: Failed to create composite texture"}));
  D3DLOCKED_RECT locked{};
  for (Qen_TextureChannel* source : {&particle, &attached}) {
    EXPECT_TRUE(SUCCEEDED(source->LockLevel(0, &locked)));
    source->UnlockLevel(0);
  }
}

TEST_F(CompositeTextureTest, FailedParticleLockLeavesTheUpperHalfEmpty) {
  MemoryDevice& source_device = OtherDevice();
  LinkParticle(source_device, 8, 8);
  LinkAttached(*device_, 8, 8);
  source_device.ClearCalls();
  source_device.FailNextTextureLock();
  Emitter().BuildCompositeTexture();
  EXPECT_EQ(messages_, (Strings{"APE: Tex1 Format is A8R8G8B8", "APE: Tex2 Format is A8R8G8B8",
                                "APE: Failed to lock tex1"}));
  ExpectLayout(Composite(), 8, 8, 0, 0, 8, 8);
  EXPECT_EQ(CountCalls(source_device, "Texture.UnlockRect"), 0);  // never locked
}

TEST_F(CompositeTextureTest, FailedAttachedLockLeavesTheLowerHalfEmpty) {
  MemoryDevice& source_device = OtherDevice();
  LinkParticle(*device_, 8, 8);
  LinkAttached(source_device, 8, 8);
  source_device.ClearCalls();
  source_device.FailNextTextureLock();
  Emitter().BuildCompositeTexture();
  EXPECT_EQ(messages_, (Strings{"APE: Tex1 Format is A8R8G8B8", "APE: Tex2 Format is A8R8G8B8",
                                "APE: Failed to lock tex2"}));
  ExpectLayout(Composite(), 8, 8, 8, 8, 0, 0);
  EXPECT_EQ(CountCalls(source_device, "Texture.UnlockRect"), 0);
}

TEST_F(CompositeTextureTest, FailedCompositeLockWritesNothingAndUnlocksTheSources) {
  MemoryDevice& source_device = OtherDevice();
  LinkParticle(source_device, 8, 8);
  LinkAttached(source_device, 8, 8);
  source_device.ClearCalls();
  TakeCalls();
  device_->FailNextTextureLock();
  Emitter().BuildCompositeTexture();
  ASSERT_EQ(messages_.size(), 3u);
  EXPECT_EQ(messages_[2].rfind("APE: ", 0), 0u);
  EXPECT_EQ(CountCalls(source_device, "Texture.UnlockRect"), 2);
  EXPECT_EQ(CountCalls(*device_, "Texture.UnlockRect"), 0);
  EXPECT_NE(Emitter().CompositeTexture, nullptr);
}

TEST_F(CompositeTextureTest, RebuildingReleasesTheEarlierComposite) {
  LinkParticle(*device_, 4, 4);
  LinkAttached(*device_, 4, 4);
  Emitter().BuildCompositeTexture();
  const int live = device_->LiveObjectCount();
  Emitter().BuildCompositeTexture();
  EXPECT_EQ(device_->LiveObjectCount(), live);
}

TEST_F(CompositeTextureTest, OneLinkAloneBuildsNothingAndSaysNothing) {
  LinkAttached(*device_, 4, 4);
  TakeCalls();
  Emitter().BuildCompositeTexture();
  EXPECT_FALSE(Emitter().HasCompositeTexture);
  EXPECT_EQ(Emitter().CompositeTexture, nullptr);
  EXPECT_TRUE(messages_.empty());
  EXPECT_TRUE(TakeCalls().empty());
}

}  // namespace
