#include "platform/memory_journal.h"

#include <utility>

void DeviceJournal::Log(std::string name, std::vector<std::uint64_t> args) noexcept {
  try {
    calls.push_back(DeviceCall{std::move(name), std::move(args)});
  } catch (...) {
    // A lost log entry is better than an exception thrown through a device call.
  }
}

void DeviceJournal::Record(const char* name, std::initializer_list<std::uint64_t> args) noexcept {
  try {
    calls.push_back(DeviceCall{name, std::vector<std::uint64_t>(args)});
  } catch (...) {
    // As in Log.
  }
}

void DeviceJournal::RecordSetTransform(D3DTRANSFORMSTATETYPE state,
                                       const D3DMATRIX* matrix) noexcept {
  try {
    std::vector<std::uint64_t> args{state};
    if (matrix != nullptr)
      for (const auto& row : matrix->m)
        for (float v : row) args.push_back(FloatArg(v));
    Log("SetTransform", std::move(args));
  } catch (...) {
    // As in Log.
  }
}

void DeviceJournal::RecordSetViewport(const D3DVIEWPORT9* viewport) noexcept {
  if (viewport == nullptr) return Record("SetViewport", {});
  const D3DVIEWPORT9& v = *viewport;
  Record("SetViewport", {v.X, v.Y, v.Width, v.Height, FloatArg(v.MinZ), FloatArg(v.MaxZ)});
}

void DeviceJournal::RecordClear(DWORD count, const D3DRECT* rects, DWORD flags, D3DCOLOR color,
                                float z, DWORD stencil) noexcept {
  try {
    std::vector<std::uint64_t> args{count};
    if (rects != nullptr)
      for (DWORD i = 0; i < count; ++i)
        for (std::int32_t c : {rects[i].x1, rects[i].y1, rects[i].x2, rects[i].y2})
          args.push_back(SignedArg(c));
    for (std::uint64_t a :
         {std::uint64_t{flags}, std::uint64_t{color}, FloatArg(z), std::uint64_t{stencil}})
      args.push_back(a);
    Log("Clear", std::move(args));
  } catch (...) {
    // As in Log.
  }
}

void DeviceJournal::RecordLockRect(const void* texture, UINT level, const RECT& area,
                                   DWORD flags) noexcept {
  Record("Texture.LockRect", {IdOf(texture), level, SignedArg(area.left), SignedArg(area.top),
                              SignedArg(area.right), SignedArg(area.bottom), flags});
}

std::uint64_t DeviceJournal::Register(const void* object) {
  const std::uint64_t id = next_id++;
  ids[object] = id;
  ++live_objects;
  return id;
}

void DeviceJournal::Forget(const void* object) {
  if (ids.erase(object) == 0) return;
  --live_objects;
  if (stream == object) {
    stream = nullptr;
    stream_offset = 0;
    stream_stride = 0;
  }
  if (indices == object) indices = nullptr;
  for (IDirect3DTexture9*& texture : textures)
    if (texture == object) texture = nullptr;
}

std::uint64_t DeviceJournal::IdOf(const void* object) const {
  if (object == nullptr) return 0;
  const auto it = ids.find(object);
  return it == ids.end() ? kForeignObjectId : it->second;
}

bool DeviceJournal::Owns(const void* object) const {
  return ids.count(object) != 0;
}

bool DeviceJournal::TakeFailure(bool& pending) {
  const bool fail = pending;
  pending = false;
  return fail;
}

std::uint64_t SignedArg(std::int64_t value) {
  return static_cast<std::uint64_t>(value);
}

std::uint64_t FloatArg(float value) {
  return FloatToStateBits(value);
}
