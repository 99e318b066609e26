#include "platform/memory_resources.h"

#include <algorithm>
#include <cstdint>
#include <new>
#include <utility>
#include <vector>

namespace {

// The largest texture side the device accepts, as a common Direct3D 9 device reports it.
constexpr UINT kMaxTextureSide = 8192;
constexpr UINT kRowAlignment = 16;  // bytes

// The lock bookkeeping shared by vertex and index buffers.
class BufferBytes {
 public:
  BufferBytes(std::shared_ptr<DeviceJournal> journal, const char* lock_name,
              const char* unlock_name, UINT length)
      : journal_(std::move(journal)),
        lock_name_(lock_name),
        unlock_name_(unlock_name),
        bytes_(length) {}

  HRESULT Lock(const void* self, UINT offset, UINT size, void** data, DWORD flags) {
    journal_->Record(lock_name_, {journal_->IdOf(self), offset, size, flags});
    if (data != nullptr) *data = nullptr;
    if (DeviceJournal::TakeFailure(journal_->fail_buffer_lock)) return D3DERR_INVALIDCALL;
    if (data == nullptr || offset >= bytes_.size()) return D3DERR_INVALIDCALL;
    // Size 0 locks from the offset to the end.
    const std::uint64_t end = size == 0 ? bytes_.size() : std::uint64_t{offset} + size;
    if (end > bytes_.size()) return D3DERR_INVALIDCALL;
    *data = bytes_.data() + offset;
    ++lock_count_;
    return S_OK;
  }

  HRESULT Unlock(const void* self) {
    journal_->Record(unlock_name_, {journal_->IdOf(self)});
    if (lock_count_ == 0) return D3DERR_INVALIDCALL;
    --lock_count_;
    return S_OK;
  }

  UINT Size() const { return static_cast<UINT>(bytes_.size()); }
  DeviceJournal& Journal() { return *journal_; }

 private:
  std::shared_ptr<DeviceJournal> journal_;
  const char* lock_name_;
  const char* unlock_name_;
  std::vector<BYTE> bytes_;
  int lock_count_ = 0;  // buffers, unlike textures, may be locked more than once
};

class MemoryVertexBuffer final : public IDirect3DVertexBuffer9 {
 public:
  MemoryVertexBuffer(std::shared_ptr<DeviceJournal> journal, UINT length, DWORD usage, DWORD fvf,
                     D3DPOOL pool)
      : bytes_(std::move(journal), "VertexBuffer.Lock", "VertexBuffer.Unlock", length),
        desc_{D3DFMT_UNKNOWN, D3DRTYPE_VERTEXBUFFER, usage, pool, length, fvf} {
    bytes_.Journal().Register(Self());
  }

  ULONG AddRef() override { return ++refs_; }
  ULONG Release() override {
    const ULONG left = --refs_;
    if (left == 0) delete this;
    return left;
  }
  HRESULT Lock(UINT offset, UINT size, void** data, DWORD flags) override {
    return bytes_.Lock(Self(), offset, size, data, flags);
  }
  HRESULT Unlock() override { return bytes_.Unlock(Self()); }
  HRESULT GetDesc(D3DVERTEXBUFFER_DESC* desc) override {
    if (desc == nullptr) return D3DERR_INVALIDCALL;
    *desc = desc_;
    return S_OK;
  }

 private:
  ~MemoryVertexBuffer() override { bytes_.Journal().Forget(Self()); }
  const void* Self() const { return static_cast<const IDirect3DVertexBuffer9*>(this); }

  BufferBytes bytes_;
  D3DVERTEXBUFFER_DESC desc_;
  ULONG refs_ = 1;
};

class MemoryIndexBuffer final : public IDirect3DIndexBuffer9 {
 public:
  MemoryIndexBuffer(std::shared_ptr<DeviceJournal> journal, UINT length, DWORD usage,
                    D3DFORMAT format, D3DPOOL pool)
      : bytes_(std::move(journal), "IndexBuffer.Lock", "IndexBuffer.Unlock", length),
        desc_{format, D3DRTYPE_INDEXBUFFER, usage, pool, length} {
    bytes_.Journal().Register(Self());
  }

  ULONG AddRef() override { return ++refs_; }
  ULONG Release() override {
    const ULONG left = --refs_;
    if (left == 0) delete this;
    return left;
  }
  HRESULT Lock(UINT offset, UINT size, void** data, DWORD flags) override {
    return bytes_.Lock(Self(), offset, size, data, flags);
  }
  HRESULT Unlock() override { return bytes_.Unlock(Self()); }
  HRESULT GetDesc(D3DINDEXBUFFER_DESC* desc) override {
    if (desc == nullptr) return D3DERR_INVALIDCALL;
    *desc = desc_;
    return S_OK;
  }

 private:
  ~MemoryIndexBuffer() override { bytes_.Journal().Forget(Self()); }
  const void* Self() const { return static_cast<const IDirect3DIndexBuffer9*>(this); }

  BufferBytes bytes_;
  D3DINDEXBUFFER_DESC desc_;
  ULONG refs_ = 1;
};

struct TextureLevel {
  UINT width = 0;   // pixels
  UINT height = 0;  // pixels
  UINT pitch = 0;   // bytes per row
  std::vector<BYTE> bytes;
  bool locked = false;
};

class MemoryTexture final : public IDirect3DTexture9 {
 public:
  MemoryTexture(std::shared_ptr<DeviceJournal> journal, UINT width, UINT height, UINT levels,
                DWORD usage, D3DFORMAT format, D3DPOOL pool)
      : journal_(std::move(journal)),
        format_(format),
        usage_(usage),
        pool_(pool),
        bytes_per_pixel_(TextureBytesPerPixel(format)) {
    for (UINT i = 0; i < levels; ++i) {
      TextureLevel level;
      level.width = std::max<UINT>(1, width >> i);
      level.height = std::max<UINT>(1, height >> i);
      level.pitch = TextureRowPitch(level.width, bytes_per_pixel_);
      level.bytes.resize(std::size_t{level.pitch} * level.height);
      levels_.push_back(std::move(level));
    }
    journal_->Register(Self());
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
    // A null rect is logged as the whole level it stands for.
    RECT area{0, 0, 0, 0};
    if (rect != nullptr) {
      area = *rect;
    } else if (level < levels_.size()) {
      area = RECT{0, 0, static_cast<std::int32_t>(levels_[level].width),
                  static_cast<std::int32_t>(levels_[level].height)};
    }
    journal_->RecordLockRect(Self(), level, area, flags);
    if (locked != nullptr) *locked = D3DLOCKED_RECT{0, nullptr};
    if (DeviceJournal::TakeFailure(journal_->fail_texture_lock)) return D3DERR_INVALIDCALL;
    if (locked == nullptr || level >= levels_.size()) return D3DERR_INVALIDCALL;
    TextureLevel& target = levels_[level];
    if (target.locked || !InsideLevel(area, target)) return D3DERR_INVALIDCALL;
    target.locked = true;
    const std::size_t first_byte =
        std::size_t(area.top) * target.pitch + std::size_t(area.left) * bytes_per_pixel_;
    *locked = D3DLOCKED_RECT{static_cast<INT>(target.pitch), target.bytes.data() + first_byte};
    return S_OK;
  }

  HRESULT UnlockRect(UINT level) override {
    journal_->Record("Texture.UnlockRect", {journal_->IdOf(Self()), level});
    if (level >= levels_.size() || !levels_[level].locked) return D3DERR_INVALIDCALL;
    levels_[level].locked = false;
    return S_OK;
  }

 private:
  ~MemoryTexture() override { journal_->Forget(Self()); }
  const void* Self() const { return static_cast<const IDirect3DTexture9*>(this); }

  static bool InsideLevel(const RECT& r, const TextureLevel& level) {
    return r.left >= 0 && r.top >= 0 && r.left < r.right && r.top < r.bottom &&
           static_cast<std::int64_t>(r.right) <= level.width &&
           static_cast<std::int64_t>(r.bottom) <= level.height;
  }

  std::shared_ptr<DeviceJournal> journal_;
  D3DFORMAT format_;
  DWORD usage_;
  D3DPOOL pool_;
  UINT bytes_per_pixel_;
  std::vector<TextureLevel> levels_;
  ULONG refs_ = 1;
};

}  // namespace

UINT TextureBytesPerPixel(D3DFORMAT format) {
  switch (format) {
    case D3DFMT_A8R8G8B8:
    case D3DFMT_X8R8G8B8:
    case D3DFMT_D24S8:
      return 4;
    case D3DFMT_R8G8B8:
      return 3;
    case D3DFMT_R5G6B5:
      return 2;
    case D3DFMT_A8:
      return 1;
    default:
      return 0;
  }
}

UINT TextureRowPitch(UINT width, UINT bytes_per_pixel) {
  const UINT row = width * bytes_per_pixel;
  return (row + kRowAlignment - 1) / kRowAlignment * kRowAlignment;
}

UINT FullMipChainLength(UINT width, UINT height) {
  UINT levels = 1;
  for (UINT side = std::max(width, height); side > 1; side >>= 1) ++levels;
  return levels;
}

HRESULT CreateMemoryVertexBuffer(const std::shared_ptr<DeviceJournal>& journal, UINT length,
                                 DWORD usage, DWORD fvf, D3DPOOL pool,
                                 IDirect3DVertexBuffer9** out) {
  if (out == nullptr) return D3DERR_INVALIDCALL;
  *out = nullptr;
  if (length == 0) return D3DERR_INVALIDCALL;
  try {
    *out = new MemoryVertexBuffer(journal, length, usage, fvf, pool);
  } catch (const std::bad_alloc&) {
    return E_OUTOFMEMORY;
  }
  return S_OK;
}

HRESULT CreateMemoryIndexBuffer(const std::shared_ptr<DeviceJournal>& journal, UINT length,
                                DWORD usage, D3DFORMAT format, D3DPOOL pool,
                                IDirect3DIndexBuffer9** out) {
  if (out == nullptr) return D3DERR_INVALIDCALL;
  *out = nullptr;
  if (length == 0 || (format != D3DFMT_INDEX16 && format != D3DFMT_INDEX32))
    return D3DERR_INVALIDCALL;
  try {
    *out = new MemoryIndexBuffer(journal, length, usage, format, pool);
  } catch (const std::bad_alloc&) {
    return E_OUTOFMEMORY;
  }
  return S_OK;
}

HRESULT CreateMemoryTexture(const std::shared_ptr<DeviceJournal>& journal, UINT width, UINT height,
                            UINT levels, DWORD usage, D3DFORMAT format, D3DPOOL pool,
                            IDirect3DTexture9** out) {
  if (out == nullptr) return D3DERR_INVALIDCALL;
  *out = nullptr;
  if (width == 0 || height == 0 || width > kMaxTextureSide || height > kMaxTextureSide)
    return D3DERR_INVALIDCALL;
  if (TextureBytesPerPixel(format) == 0) return D3DERR_INVALIDCALL;
  const UINT chain = FullMipChainLength(width, height);
  if (levels > chain) return D3DERR_INVALIDCALL;
  try {
    *out = new MemoryTexture(journal, width, height, levels == 0 ? chain : levels, usage, format,
                             pool);
  } catch (const std::bad_alloc&) {
    return E_OUTOFMEMORY;
  }
  return S_OK;
}
