#include "platform/gl/gl_texture.h"

#include <algorithm>
#include <cstdint>
#include <new>
#include <utility>
#include <vector>

#include "platform/gl/call_recorder.h"
#include "platform/memory_resources.h"

namespace {

constexpr UINT kMaxTextureSide = 8192;  // as MemoryDevice, a common Direct3D 9 device's limit
constexpr UINT kBytesPerPixel = 4;

struct Level {
  UINT width = 0;   // pixels
  UINT height = 0;  // pixels
  UINT pitch = 0;   // bytes per row
  std::vector<BYTE> bytes;
  bool locked = false;
  RECT area{};  // the locked rectangle
  DWORD flags = 0;
};

class GlTexture final : public IDirect3DTexture9 {
 public:
  GlTexture(std::shared_ptr<GlContext> context, std::shared_ptr<DeviceJournal> journal, UINT width,
            UINT height, UINT levels, DWORD usage, D3DFORMAT format, D3DPOOL pool)
      : context_(std::move(context)),
        journal_(std::move(journal)),
        format_(format),
        usage_(usage),
        pool_(pool) {
    for (UINT i = 0; i < levels; ++i) {
      Level level;
      level.width = std::max<UINT>(1, width >> i);
      level.height = std::max<UINT>(1, height >> i);
      level.pitch = TextureRowPitch(level.width, kBytesPerPixel);
      level.bytes.resize(std::size_t{level.pitch} * level.height);
      levels_.push_back(std::move(level));
    }
  }

  // The GL texture with every (zeroed) level uploaded; registered with the journal on success.
  HRESULT Finish() {
    context_->MakeCurrent();
    glCreateTextures(GL_TEXTURE_2D, 1, &name_);
    glTextureStorage2D(name_, static_cast<GLsizei>(levels_.size()), GL_RGBA8,
                       static_cast<GLsizei>(levels_[0].width),
                       static_cast<GLsizei>(levels_[0].height));
    // Direct3D's default sampler: point sampling from the top level (no mip filter).
    glTextureParameteri(name_, GL_TEXTURE_MIN_FILTER, GL_NEAREST);
    glTextureParameteri(name_, GL_TEXTURE_MAG_FILTER, GL_NEAREST);
    if (format_ == D3DFMT_X8R8G8B8) glTextureParameteri(name_, GL_TEXTURE_SWIZZLE_A, GL_ONE);
    for (UINT i = 0; i < levels_.size(); ++i) {
      const Level& level = levels_[i];
      Upload(i, RECT{0, 0, static_cast<std::int32_t>(level.width),
                     static_cast<std::int32_t>(level.height)});
    }
    const HRESULT result = TakeGlErrors();
    if (SUCCEEDED(result)) journal_->Register(Self());
    return result;
  }

  ULONG AddRef() override { return ++refs_; }
  ULONG Release() override {
    const ULONG left = --refs_;
    if (left == 0) delete this;
    return left;
  }
  DWORD GetLevelCount() override { return static_cast<DWORD>(levels_.size()); }
  HRESULT GetLevelDesc(UINT level, D3DSURFACE_DESC* desc) override {
    if (desc == nullptr || level >= levels_.size()) return D3DERR_INVALIDCALL;
    *desc = D3DSURFACE_DESC{format_,
                            D3DRTYPE_SURFACE,
                            usage_,
                            pool_,
                            0,
                            0,
                            levels_[level].width,
                            levels_[level].height};
    return S_OK;
  }

  HRESULT LockRect(UINT level, D3DLOCKED_RECT* locked, const RECT* rect, DWORD flags) override {
    // A null rect stands for the whole level, and is logged so.
    RECT area{0, 0, 0, 0};
    if (rect != nullptr) {
      area = *rect;
    } else if (level < levels_.size()) {
      area = RECT{0, 0, static_cast<std::int32_t>(levels_[level].width),
                  static_cast<std::int32_t>(levels_[level].height)};
    }
    LogLockRect(*journal_, Self(), level, area, flags);
    if (locked != nullptr) *locked = D3DLOCKED_RECT{0, nullptr};
    if (locked == nullptr || level >= levels_.size()) return D3DERR_INVALIDCALL;
    Level& target = levels_[level];
    if (target.locked || !InsideLevel(area, target)) return D3DERR_INVALIDCALL;
    target.locked = true;
    target.area = area;
    target.flags = flags;
    const std::size_t first_byte =
        std::size_t(area.top) * target.pitch + std::size_t(area.left) * kBytesPerPixel;
    *locked = D3DLOCKED_RECT{static_cast<INT>(target.pitch), target.bytes.data() + first_byte};
    return S_OK;
  }

  HRESULT UnlockRect(UINT level) override {
    LogCall(*journal_, "Texture.UnlockRect", {journal_->IdOf(Self()), level});
    if (level >= levels_.size() || !levels_[level].locked) return D3DERR_INVALIDCALL;
    Level& target = levels_[level];
    target.locked = false;
    if ((target.flags & D3DLOCK_READONLY) != 0) return S_OK;
    context_->MakeCurrent();
    Upload(level, target.area);
    return TakeGlErrors();
  }

  GLuint Name() const { return name_; }
  void Destroy() { delete this; }

 private:
  ~GlTexture() override {
    journal_->Forget(Self());
    if (name_ == 0) return;
    context_->MakeCurrent();
    glDeleteTextures(1, &name_);
    TakeGlErrors();
  }
  const void* Self() const { return static_cast<const IDirect3DTexture9*>(this); }

  static bool InsideLevel(const RECT& r, const Level& level) {
    return r.left >= 0 && r.top >= 0 && r.left < r.right && r.top < r.bottom &&
           static_cast<std::int64_t>(r.right) <= level.width &&
           static_cast<std::int64_t>(r.bottom) <= level.height;
  }

  // The CPU copy's rectangle into the GL level; the context is current.
  void Upload(UINT level_index, const RECT& area) {
    const Level& level = levels_[level_index];
    glPixelStorei(GL_UNPACK_ALIGNMENT, 4);
    glPixelStorei(GL_UNPACK_ROW_LENGTH, static_cast<GLint>(level.pitch / kBytesPerPixel));
    const std::size_t first_byte =
        std::size_t(area.top) * level.pitch + std::size_t(area.left) * kBytesPerPixel;
    glTextureSubImage2D(name_, static_cast<GLint>(level_index), area.left, area.top,
                        area.right - area.left, area.bottom - area.top, GL_BGRA,
                        GL_UNSIGNED_INT_8_8_8_8_REV, level.bytes.data() + first_byte);
    glPixelStorei(GL_UNPACK_ROW_LENGTH, 0);
  }

  std::shared_ptr<GlContext> context_;
  std::shared_ptr<DeviceJournal> journal_;
  D3DFORMAT format_;
  DWORD usage_;
  D3DPOOL pool_;
  std::vector<Level> levels_;
  GLuint name_ = 0;
  ULONG refs_ = 1;
};

}  // namespace

HRESULT CreateGlTexture(const std::shared_ptr<GlContext>& context,
                        const std::shared_ptr<DeviceJournal>& journal, UINT width, UINT height,
                        UINT levels, DWORD usage, D3DFORMAT format, D3DPOOL pool,
                        IDirect3DTexture9** out) {
  if (out == nullptr) return D3DERR_INVALIDCALL;
  *out = nullptr;
  if (width == 0 || height == 0 || width > kMaxTextureSide || height > kMaxTextureSide)
    return D3DERR_INVALIDCALL;
  if (format != D3DFMT_A8R8G8B8 && format != D3DFMT_X8R8G8B8) return D3DERR_INVALIDCALL;
  const UINT chain = FullMipChainLength(width, height);
  if (levels > chain) return D3DERR_INVALIDCALL;
  GlTexture* texture = nullptr;
  try {
    texture = new GlTexture(context, journal, width, height, levels == 0 ? chain : levels, usage,
                            format, pool);
  } catch (const std::bad_alloc&) {
    return E_OUTOFMEMORY;
  }
  const HRESULT result = texture->Finish();
  if (FAILED(result)) {
    texture->Destroy();
    return result;
  }
  *out = texture;
  return S_OK;
}

GLuint GlTextureName(IDirect3DTexture9* texture) {
  return static_cast<GlTexture*>(texture)->Name();
}
