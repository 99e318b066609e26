// What a MemoryDevice shares with the buffers and textures it created: the call log, the object
// ids, the live count, the pending injected failures and the bindings that must not outlive
// their objects. Buffers and textures hold it, never the device, so either may die first.
#pragma once

#include <cstdint>
#include <initializer_list>
#include <memory>
#include <string>
#include <unordered_map>
#include <vector>

#include "platform/memory_device.h"

struct DeviceJournal {
  std::vector<DeviceCall> calls;
  std::unordered_map<const void*, std::uint64_t> ids;
  std::uint64_t next_id = 1;
  int live_objects = 0;

  bool fail_create_vertex_buffer = false;
  bool fail_create_index_buffer = false;
  bool fail_create_texture = false;
  bool fail_buffer_lock = false;
  bool fail_texture_lock = false;

  // Bindings do not hold a reference (as the device never AddRefs what it binds); an object
  // that dies is unbound instead of left dangling.
  IDirect3DVertexBuffer9* stream = nullptr;
  UINT stream_offset = 0;  // bytes
  UINT stream_stride = 0;  // bytes per vertex
  IDirect3DIndexBuffer9* indices = nullptr;
  IDirect3DTexture9* textures[kD3DTextureStageCount] = {};

  // Appends one call. The log never throws into a caller: under memory exhaustion the entry is
  // lost instead.
  void Log(std::string name, std::vector<std::uint64_t> args) noexcept;
  void Record(const char* name, std::initializer_list<std::uint64_t> args) noexcept;
  // The argument conventions for the calls that pass structures, shared by every device that
  // keeps a journal so that the same calls give the same log:
  // the state, then the matrix row by row as float bit patterns (only the state when null);
  void RecordSetTransform(D3DTRANSFORMSTATETYPE state, const D3DMATRIX* matrix) noexcept;
  // the six fields, floats as bit patterns (no arguments when null);
  void RecordSetViewport(const D3DVIEWPORT9* viewport) noexcept;
  // the count, each rectangle's corners (when rects is not null), flags, colour, z bits, stencil;
  void RecordClear(DWORD count, const D3DRECT* rects, DWORD flags, D3DCOLOR color, float z,
                   DWORD stencil) noexcept;
  // the texture's id, the level, the rectangle (pass the whole level for a null one), flags.
  void RecordLockRect(const void* texture, UINT level, const RECT& area, DWORD flags) noexcept;
  // Gives a new object the next id and counts it live.
  std::uint64_t Register(const void* object);
  // Drops a dying object's id, live count and bindings.
  void Forget(const void* object);
  // 0 for null, kForeignObjectId for an object this device did not create.
  std::uint64_t IdOf(const void* object) const;
  bool Owns(const void* object) const;
  // Answers whether a failure of this kind was pending, and clears it.
  static bool TakeFailure(bool& pending);
};

// Logged in place of an object id for a pointer this device never created.
inline constexpr std::uint64_t kForeignObjectId = ~std::uint64_t{0};

// Logged arguments: signed integers sign-extend, floats travel as their bit pattern.
std::uint64_t SignedArg(std::int64_t value);
std::uint64_t FloatArg(float value);
