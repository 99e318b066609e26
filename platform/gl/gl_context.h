// A headless OpenGL 4.5 compatibility context made through EGL, and the offscreen framebuffer
// (RGBA8 colour, 24-bit depth with 8-bit stencil) it draws into. A GPU's EGL device platform is
// tried first; Mesa's surfaceless platform (llvmpipe without a GPU) is the fallback.
#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "platform/windows_types.h"

// Drains GL's error flags: S_OK when there were none, D3DERR_OUTOFVIDEOMEMORY when GL ran out of
// memory, E_FAIL for any other error. Every operation that calls GL ends with it, so no error is
// left for the next one to find.
HRESULT TakeGlErrors();

class GlContext {
 public:
  // Null, with the reason in *error, when no context or framebuffer of that size can be made.
  static std::shared_ptr<GlContext> Create(std::uint32_t width, std::uint32_t height,
                                           std::string* error);
  ~GlContext();
  GlContext(const GlContext&) = delete;
  GlContext& operator=(const GlContext&) = delete;

  // Makes this context current on the calling thread when it is not already; every GL call of
  // the device and its resources goes through this first, so that several devices can live.
  void MakeCurrent();

  std::uint32_t Width() const { return width_; }
  std::uint32_t Height() const { return height_; }
  // "llvmpipe (LLVM ...)" or the GPU's renderer string, and which EGL platform gave it.
  const std::string& Renderer() const { return renderer_; }
  const std::string& Platform() const { return platform_; }
  // The largest point the driver rasterises, in pixels.
  float MaxPointSizePx() const { return max_point_size_px_; }

  // The framebuffer as width x height A8R8G8B8 pixels, top row first.
  void ReadPixels(std::vector<std::uint32_t>* argb);

  struct Egl;  // EGL handles, defined in the source

 private:
  GlContext() = default;
  bool MakeFramebuffer(std::string* error);

  std::unique_ptr<Egl> egl_;
  std::uint32_t width_ = 0;
  std::uint32_t height_ = 0;
  std::string renderer_;
  std::string platform_;
  float max_point_size_px_ = 1.0f;
  unsigned framebuffer_ = 0;
  unsigned colour_buffer_ = 0;
  unsigned depth_buffer_ = 0;
};
