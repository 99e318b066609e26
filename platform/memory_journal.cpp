#include "platform/memory_journal.h"

#include <utility>

void DeviceJournal::Log(std::string name, std::vector<std::uint64_t> args) {
  calls.push_back(DeviceCall{std::move(name), std::move(args)});
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
