#include "platform/gl/call_recorder.h"

#include <string>
#include <utility>
#include <vector>

namespace {

void Append(DeviceJournal& journal, const char* name, std::vector<std::uint64_t>&& args) noexcept {
  try {
    journal.Log(name, std::move(args));
  } catch (...) {
    // Out of memory: the entry is lost, the call itself goes on.
  }
}

}  // namespace

void LogCall(DeviceJournal& journal, const char* name,
             std::initializer_list<std::uint64_t> args) noexcept {
  try {
    Append(journal, name, std::vector<std::uint64_t>(args));
  } catch (...) {
  }
}

void LogSetTransform(DeviceJournal& journal, D3DTRANSFORMSTATETYPE state,
                     const D3DMATRIX* matrix) noexcept {
  try {
    std::vector<std::uint64_t> args{state};
    if (matrix != nullptr) {
      args.reserve(1 + 16);
      for (const auto& row : matrix->m)
        for (float v : row) args.push_back(FloatArg(v));
    }
    Append(journal, "SetTransform", std::move(args));
  } catch (...) {
  }
}

void LogSetViewport(DeviceJournal& journal, const D3DVIEWPORT9* viewport) noexcept {
  if (viewport == nullptr) {
    LogCall(journal, "SetViewport", {});
    return;
  }
  const D3DVIEWPORT9& v = *viewport;
  LogCall(journal, "SetViewport",
          {v.X, v.Y, v.Width, v.Height, FloatArg(v.MinZ), FloatArg(v.MaxZ)});
}

void LogClear(DeviceJournal& journal, DWORD count, const D3DRECT* rects, DWORD flags,
              D3DCOLOR color, float z, DWORD stencil) noexcept {
  try {
    std::vector<std::uint64_t> args{count};
    if (rects != nullptr) {
      for (DWORD i = 0; i < count; ++i)
        for (std::int32_t c : {rects[i].x1, rects[i].y1, rects[i].x2, rects[i].y2})
          args.push_back(SignedArg(c));
    }
    for (std::uint64_t a :
         {std::uint64_t{flags}, std::uint64_t{color}, FloatArg(z), std::uint64_t{stencil}})
      args.push_back(a);
    Append(journal, "Clear", std::move(args));
  } catch (...) {
  }
}

void LogLockRect(DeviceJournal& journal, const void* texture, UINT level, const RECT& area,
                 DWORD flags) noexcept {
  LogCall(journal, "Texture.LockRect",
          {journal.IdOf(texture), level, SignedArg(area.left), SignedArg(area.top),
           SignedArg(area.right), SignedArg(area.bottom), flags});
}
