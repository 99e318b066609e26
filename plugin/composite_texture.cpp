// The composite texture: the "Particle Texture" above the "Attached Texture" in one A8R8G8B8
// image twice the particle image's height, so that free and attached particles can be drawn
// from one bound texture.
//
// Pixels are copied unchanged, 32 bits each, and only where both the source and the composite
// have them: a smaller "Attached Texture" fills only its own part of the lower half, a larger
// one is cut to the particle image's size. A source whose format is not 32 bits per pixel
// (A8R8G8B8 or X8R8G8B8) is not copied. The composite starts transparent black, so whatever no
// source fills (and a half whose source could not be locked) stays transparent.
#include <algorithm>
#include <cstddef>
#include <cstring>
#include <limits>

#include "host/device_channel.h"
#include "host/link_channels.h"
#include "plugin/advanced_particle_emitter.h"
#include "plugin/link_reading.h"
#include "plugin/link_table.h"
#include "render/pass_states.h"

namespace {

constexpr std::size_t kBytesPerPixel = 4;

bool HasThirtyTwoBitPixels(D3DFORMAT format) {
  return format == D3DFMT_A8R8G8B8 || format == D3DFMT_X8R8G8B8;
}

// A locked level, bounded by what may be read or written in it.
struct LockedImage {
  BYTE* Bits = nullptr;
  std::size_t Pitch = 0;   // bytes from one row to the next
  std::size_t Width = 0;   // pixels per row, never more than the pitch holds
  std::size_t Height = 0;  // rows
};

LockedImage ImageOf(const D3DLOCKED_RECT& locked, const D3DSURFACE_DESC& desc) {
  if (locked.pBits == nullptr || locked.Pitch <= 0) return {};
  const auto pitch = static_cast<std::size_t>(locked.Pitch);
  return {static_cast<BYTE*>(locked.pBits), pitch,
          std::min<std::size_t>(desc.Width, pitch / kBytesPerPixel), desc.Height};
}

BYTE* RowOf(const LockedImage& image, std::size_t row) {
  return image.Bits + row * image.Pitch;
}

void ClearImage(const LockedImage& image) {
  for (std::size_t y = 0; y < image.Height; ++y) {
    std::memset(RowOf(image, y), 0, image.Width * kBytesPerPixel);
  }
}

// Copies up to width x height pixels of `source` into `target` from row `first_row` on, each
// row reached through its own image's pitch, clipped to both images.
void CopyPixels(const LockedImage& source, const LockedImage& target, std::size_t first_row,
                std::size_t width, std::size_t height) {
  if (first_row >= target.Height) return;
  const std::size_t rows = std::min({height, source.Height, target.Height - first_row});
  const std::size_t columns = std::min({width, source.Width, target.Width});
  for (std::size_t y = 0; y < rows; ++y) {
    std::memcpy(RowOf(target, first_row + y), RowOf(source, y), columns * kBytesPerPixel);
  }
}

// One source texture, locked for the copy.
struct LockedSource {
  bool Locked = false;
  bool Copyable = false;  // 32-bit pixels
  LockedImage Image;
};

LockedSource LockSource(Qen_TextureChannel& texture, const D3DSURFACE_DESC& desc) {
  D3DLOCKED_RECT locked{};
  if (FAILED(texture.LockLevel(0, &locked))) return {};
  return {true, HasThirtyTwoBitPixels(desc.Format), ImageOf(locked, desc)};
}

const char* FormatLine(const D3DSURFACE_DESC& desc, const char* known, const char* unknown) {
  return desc.Format == D3DFMT_A8R8G8B8 ? known : unknown;
}

}  // namespace

void Tev_AdvancedParticleEmitter::BuildCompositeTexture() {
  // The destructor releases only the last composite, so an earlier one goes now.
  if (CompositeTexture != nullptr) {
    CompositeTexture->Release();
    CompositeTexture = nullptr;
  }
  auto* particle_texture = LinkAs<Qen_TextureChannel>(*this, kLinkParticleTexture);
  auto* attached_texture = LinkAs<Qen_TextureChannel>(*this, kLinkAttachedTexture);
  if (particle_texture == nullptr || attached_texture == nullptr) return;
  HasCompositeTexture = true;

  const D3DSURFACE_DESC particle_desc = particle_texture->GetLevelDesc(0);
  ShowDebug(FormatLine(particle_desc, "APE: Tex1 Format is A8R8G8B8", "APE: Tex1 Format unknown"));
  const D3DSURFACE_DESC attached_desc = attached_texture->GetLevelDesc(0);
  ShowDebug(FormatLine(attached_desc, "APE: Tex2 Format is A8R8G8B8", "APE: Tex2 Format unknown"));

  const UINT width = particle_desc.Width;
  const UINT height = particle_desc.Height;
  const bool height_fits = height <= std::numeric_limits<UINT>::max() / 2;
  IDirect3DDevice9* device = CurrentDevice(DeviceChannel);
  if (device == nullptr || !height_fits ||
      FAILED(D3DXCreateTexture(device, width, 2 * height, 1, 0, D3DFMT_A8R8G8B8, D3DPOOL_MANAGED,
                               &CompositeTexture))) {
    CompositeTexture = nullptr;
    ShowDebug("APE: Failed to create composite texture");
  }

  const LockedSource particle_image = LockSource(*particle_texture, particle_desc);
  if (!particle_image.Locked) ShowDebug("APE: Failed to lock tex1");
  const LockedSource attached_image = LockSource(*attached_texture, attached_desc);
  if (!attached_image.Locked) ShowDebug("APE: Failed to lock tex2");

  if (CompositeTexture != nullptr) {
    D3DSURFACE_DESC composite_desc{};
    D3DLOCKED_RECT locked{};
    if (SUCCEEDED(CompositeTexture->GetLevelDesc(0, &composite_desc)) &&
        SUCCEEDED(CompositeTexture->LockRect(0, &locked, nullptr, 0))) {
      const LockedImage composite = ImageOf(locked, composite_desc);
      ClearImage(composite);
      // Both halves are the particle image's size: the upper from row 0, the lower from row H.
      if (particle_image.Copyable) CopyPixels(particle_image.Image, composite, 0, width, height);
      if (attached_image.Copyable) {
        CopyPixels(attached_image.Image, composite, height, width, height);
      }
      CompositeTexture->UnlockRect(0);
    } else {
      ShowDebug("APE: Failed to lock composite texture");
    }
  }
  // Only what was locked is unlocked.
  if (particle_image.Locked) particle_texture->UnlockLevel(0);
  if (attached_image.Locked) attached_texture->UnlockLevel(0);
}
