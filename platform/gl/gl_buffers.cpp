#include "platform/gl/gl_buffers.h"

#include <algorithm>
#include <cstdint>
#include <new>
#include <string>
#include <utility>

#include "platform/gl/call_recorder.h"

namespace {

// The lock bookkeeping and GL mirror shared by vertex and index buffers.
class GlBufferStore {
 public:
  GlBufferStore(std::shared_ptr<GlContext> context, std::shared_ptr<DeviceJournal> journal,
                const char* kind, UINT length, DWORD usage)
      : context_(std::move(context)),
        journal_(std::move(journal)),
        lock_name_(std::string(kind) + ".Lock"),
        unlock_name_(std::string(kind) + ".Unlock"),
        gl_usage_((usage & D3DUSAGE_DYNAMIC) != 0 ? GL_DYNAMIC_DRAW : GL_STATIC_DRAW),
        bytes_(length) {}

  ~GlBufferStore() {
    if (name_ == 0) return;
    context_->MakeCurrent();
    glDeleteBuffers(1, &name_);
    TakeGlErrors();
  }

  // The GL buffer, holding the (zeroed) copy.
  HRESULT MakeGlBuffer() {
    context_->MakeCurrent();
    glCreateBuffers(1, &name_);
    glNamedBufferData(name_, static_cast<GLsizeiptr>(bytes_.size()), bytes_.data(), gl_usage_);
    return TakeGlErrors();
  }

  HRESULT Lock(const void* self, UINT offset, UINT size, void** data, DWORD flags) {
    LogCall(*journal_, lock_name_.c_str(), {journal_->IdOf(self), offset, size, flags});
    if (data != nullptr) *data = nullptr;
    if (data == nullptr || offset > bytes_.size()) return D3DERR_INVALIDCALL;
    // Size 0 locks from the offset to the end.
    const std::uint64_t end = size == 0 ? bytes_.size() : std::uint64_t{offset} + size;
    if (end > bytes_.size()) return D3DERR_INVALIDCALL;
    *data = bytes_.data() + offset;
    ++lock_count_;
    if ((flags & D3DLOCK_READONLY) == 0) {
      dirty_begin_ = std::min<std::uint64_t>(dirty_begin_, offset);
      dirty_end_ = std::max<std::uint64_t>(dirty_end_, end);
    }
    if ((flags & D3DLOCK_DISCARD) != 0) discard_ = true;
    return S_OK;
  }

  HRESULT Unlock(const void* self) {
    LogCall(*journal_, unlock_name_.c_str(), {journal_->IdOf(self)});
    if (lock_count_ == 0) return D3DERR_INVALIDCALL;
    if (--lock_count_ > 0 || dirty_end_ <= dirty_begin_) return S_OK;
    context_->MakeCurrent();
    if (discard_) {
      // Orphan, then refill all of it: the GL buffer always equals the CPU copy.
      glNamedBufferData(name_, static_cast<GLsizeiptr>(bytes_.size()), nullptr, gl_usage_);
      dirty_begin_ = 0;
      dirty_end_ = bytes_.size();
    }
    glNamedBufferSubData(name_, static_cast<GLintptr>(dirty_begin_),
                         static_cast<GLsizeiptr>(dirty_end_ - dirty_begin_),
                         bytes_.data() + dirty_begin_);
    dirty_begin_ = UINT64_MAX;
    dirty_end_ = 0;
    discard_ = false;
    return TakeGlErrors();
  }

  GlBufferView View() const { return GlBufferView{name_, &bytes_}; }
  DeviceJournal& Journal() { return *journal_; }

 private:
  std::shared_ptr<GlContext> context_;
  std::shared_ptr<DeviceJournal> journal_;
  std::string lock_name_;
  std::string unlock_name_;
  GLenum gl_usage_;
  std::vector<BYTE> bytes_;
  GLuint name_ = 0;
  int lock_count_ = 0;                      // buffers may be locked more than once before unlocking
  std::uint64_t dirty_begin_ = UINT64_MAX;  // bytes written through locks since the last upload
  std::uint64_t dirty_end_ = 0;
  bool discard_ = false;
};

class GlVertexBuffer final : public IDirect3DVertexBuffer9 {
 public:
  GlVertexBuffer(std::shared_ptr<GlContext> context, std::shared_ptr<DeviceJournal> journal,
                 UINT length, DWORD usage, DWORD fvf, D3DPOOL pool)
      : store_(std::move(context), std::move(journal), "VertexBuffer", length, usage),
        desc_{D3DFMT_UNKNOWN, D3DRTYPE_VERTEXBUFFER, usage, pool, length, fvf} {}

  // Made in two steps so that a GL failure is an answer, not a half-made object.
  HRESULT Finish() {
    const HRESULT result = store_.MakeGlBuffer();
    if (SUCCEEDED(result)) store_.Journal().Register(Self());
    return result;
  }

  ULONG AddRef() override { return ++refs_; }
  ULONG Release() override {
    const ULONG left = --refs_;
    if (left == 0) delete this;
    return left;
  }
  HRESULT Lock(UINT offset, UINT size, void** data, DWORD flags) override {
    return store_.Lock(Self(), offset, size, data, flags);
  }
  HRESULT Unlock() override { return store_.Unlock(Self()); }
  HRESULT GetDesc(D3DVERTEXBUFFER_DESC* desc) override {
    if (desc == nullptr) return D3DERR_INVALIDCALL;
    *desc = desc_;
    return S_OK;
  }
  GlBufferView View() const { return store_.View(); }
  void Destroy() { delete this; }

 private:
  ~GlVertexBuffer() override { store_.Journal().Forget(Self()); }
  const void* Self() const { return static_cast<const IDirect3DVertexBuffer9*>(this); }

  GlBufferStore store_;
  D3DVERTEXBUFFER_DESC desc_;
  ULONG refs_ = 1;
};

class GlIndexBuffer final : public IDirect3DIndexBuffer9 {
 public:
  GlIndexBuffer(std::shared_ptr<GlContext> context, std::shared_ptr<DeviceJournal> journal,
                UINT length, DWORD usage, D3DFORMAT format, D3DPOOL pool)
      : store_(std::move(context), std::move(journal), "IndexBuffer", length, usage),
        desc_{format, D3DRTYPE_INDEXBUFFER, usage, pool, length} {}

  HRESULT Finish() {
    const HRESULT result = store_.MakeGlBuffer();
    if (SUCCEEDED(result)) store_.Journal().Register(Self());
    return result;
  }

  ULONG AddRef() override { return ++refs_; }
  ULONG Release() override {
    const ULONG left = --refs_;
    if (left == 0) delete this;
    return left;
  }
  HRESULT Lock(UINT offset, UINT size, void** data, DWORD flags) override {
    return store_.Lock(Self(), offset, size, data, flags);
  }
  HRESULT Unlock() override { return store_.Unlock(Self()); }
  HRESULT GetDesc(D3DINDEXBUFFER_DESC* desc) override {
    if (desc == nullptr) return D3DERR_INVALIDCALL;
    *desc = desc_;
    return S_OK;
  }
  GlBufferView View() const { return store_.View(); }
  void Destroy() { delete this; }

 private:
  ~GlIndexBuffer() override { store_.Journal().Forget(Self()); }
  const void* Self() const { return static_cast<const IDirect3DIndexBuffer9*>(this); }

  GlBufferStore store_;
  D3DINDEXBUFFER_DESC desc_;
  ULONG refs_ = 1;
};

// Builds and finishes a buffer; a failure after construction destroys it.
template <typename Buffer, typename Interface, typename... Args>
HRESULT MakeBuffer(Interface** out, Args&&... args) {
  Buffer* buffer = nullptr;
  try {
    buffer = new Buffer(std::forward<Args>(args)...);
  } catch (const std::bad_alloc&) {
    return E_OUTOFMEMORY;
  }
  const HRESULT result = buffer->Finish();
  if (FAILED(result)) {
    buffer->Destroy();
    return result;
  }
  *out = buffer;
  return S_OK;
}

}  // namespace

HRESULT CreateGlVertexBuffer(const std::shared_ptr<GlContext>& context,
                             const std::shared_ptr<DeviceJournal>& journal, UINT length,
                             DWORD usage, DWORD fvf, D3DPOOL pool, IDirect3DVertexBuffer9** out) {
  if (out == nullptr) return D3DERR_INVALIDCALL;
  *out = nullptr;
  if (length == 0) return D3DERR_INVALIDCALL;
  return MakeBuffer<GlVertexBuffer>(out, context, journal, length, usage, fvf, pool);
}

HRESULT CreateGlIndexBuffer(const std::shared_ptr<GlContext>& context,
                            const std::shared_ptr<DeviceJournal>& journal, UINT length, DWORD usage,
                            D3DFORMAT format, D3DPOOL pool, IDirect3DIndexBuffer9** out) {
  if (out == nullptr) return D3DERR_INVALIDCALL;
  *out = nullptr;
  if (length == 0 || (format != D3DFMT_INDEX16 && format != D3DFMT_INDEX32))
    return D3DERR_INVALIDCALL;
  return MakeBuffer<GlIndexBuffer>(out, context, journal, length, usage, format, pool);
}

GlBufferView ViewOfGlBuffer(IDirect3DVertexBuffer9* buffer) {
  return static_cast<GlVertexBuffer*>(buffer)->View();
}

GlBufferView ViewOfGlBuffer(IDirect3DIndexBuffer9* buffer) {
  return static_cast<GlIndexBuffer*>(buffer)->View();
}
