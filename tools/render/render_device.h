// The device a render draws on: the OpenGL device ("gl", real pixels) or the reference
// MemoryDevice ("null", no pixels: for timing and statistics only), behind a TimingDevice.
#pragma once

#include <memory>
#include <string>

#include "tools/render/timing_device.h"
#include "tools/scene/image.h"

namespace aperender {

class RenderDevice {
 public:
  // Null with the reason in *error when the kind is unknown or the device cannot be made.
  static std::unique_ptr<RenderDevice> Create(const std::string& kind, int width, int height,
                                              std::string* error);
  // Whether this build has the OpenGL device at all.
  static bool HasGl();

  virtual ~RenderDevice();
  RenderDevice(const RenderDevice&) = delete;
  RenderDevice& operator=(const RenderDevice&) = delete;

  // What channels draw through (the timing wrapper).
  TimingDevice* Device() { return timing_; }
  // False when the device draws no pixels.
  virtual bool ReadPixels(apescene::Image* image) = 0;
  // Drops the device's call log, which would otherwise grow every frame.
  virtual void ForgetCalls() = 0;
  // E.g. "OpenGL (llvmpipe (LLVM 15.0.6, 256 bits), EGL surfaceless)".
  virtual std::string Description() const = 0;

 protected:
  explicit RenderDevice(IDirect3DDevice9* inner);

 private:
  TimingDevice* timing_;
};

}  // namespace aperender
