// The two vertex layouts of the emitter's drawing paths, byte for byte.
#pragma once

#include <cstddef>
#include <cstdint>

#include "platform/d3d9_types.h"
#include "platform/d3dx_math.h"

// One corner of a particle quad: D3DFVF_XYZ | D3DFVF_NORMAL | D3DFVF_DIFFUSE | D3DFVF_TEX1.
struct LocalVertex {
  D3DXVECTOR3 Position;
  D3DXVECTOR3 Normal;
  std::uint32_t Color;
  float Tu;
  float Tv;
};
static_assert(sizeof(LocalVertex) == 36);
static_assert(offsetof(LocalVertex, Position) == 0);
static_assert(offsetof(LocalVertex, Normal) == 12);
static_assert(offsetof(LocalVertex, Color) == 24);
static_assert(offsetof(LocalVertex, Tu) == 28);
static_assert(offsetof(LocalVertex, Tv) == 32);

// One point sprite: D3DFVF_XYZ | D3DFVF_PSIZE | D3DFVF_DIFFUSE.
struct PointSpriteVertex {
  D3DXVECTOR3 Position;
  float Size;
  std::uint32_t Color;
};
static_assert(sizeof(PointSpriteVertex) == 20);
static_assert(offsetof(PointSpriteVertex, Position) == 0);
static_assert(offsetof(PointSpriteVertex, Size) == 12);
static_assert(offsetof(PointSpriteVertex, Color) == 16);

constexpr DWORD kPointSpriteFvf = D3DFVF_XYZ | D3DFVF_PSIZE | D3DFVF_DIFFUSE;
static_assert(kPointSpriteFvf == 0x62);
constexpr DWORD kLocalVertexFvf = D3DFVF_XYZ | D3DFVF_NORMAL | D3DFVF_DIFFUSE | D3DFVF_TEX1;
