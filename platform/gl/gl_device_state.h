// What a GlDevice holds; shared by its sources only.
#pragma once

#include <array>
#include <memory>

#include "platform/gl/gl_context.h"
#include "platform/gl/gl_device.h"
#include "platform/gl/point_program.h"
#include "platform/memory_journal.h"

// Transform states run from D3DTS_VIEW (2) to the last world matrix, D3DTS_WORLDMATRIX(255).
inline constexpr std::uint32_t kTransformSlots = D3DTS_WORLD + 256;

struct GlDevice::State {
  std::shared_ptr<GlContext> context;
  // The log, object ids and bindings, shared with the buffers and textures (which unbind
  // themselves when they die, so bindings never dangle; the device holds no references).
  std::shared_ptr<DeviceJournal> journal = std::make_shared<DeviceJournal>();
  ULONG refs = 1;
  DWORD render_states[kD3DRenderStateCount] = {};
  DWORD stage_states[kD3DTextureStageCount][kD3DTextureStageStateCount] = {};
  std::array<D3DMATRIX, kTransformSlots> transforms{};
  D3DVIEWPORT9 viewport{};
  DWORD fvf = 0;
  bool in_scene = false;
  bool linear_filtering = false;
  PointProgram points;
};

// Whether Direct3D 9 has a transform of this number.
bool IsTransformState(std::uint32_t state);
