#include "tools/render/render_device.h"

#include "platform/memory_device.h"
#if APE_HAVE_GL
#include "platform/gl/gl_device.h"
#endif

namespace aperender {
namespace {

class NullRenderDevice final : public RenderDevice {
 public:
  explicit NullRenderDevice(MemoryDevice* device) : RenderDevice(device), device_(device) {}
  ~NullRenderDevice() override { device_->Release(); }
  bool ReadPixels(apescene::Image*) override { return false; }
  void ForgetCalls() override { device_->ClearCalls(); }
  std::string Description() const override { return "the reference device (no pixels)"; }

 private:
  MemoryDevice* device_;
};

#if APE_HAVE_GL
class GlRenderDevice final : public RenderDevice {
 public:
  explicit GlRenderDevice(GlDevice* device) : RenderDevice(device), device_(device) {
    // Smooth sprites: nearest-texel sampling makes small particles shimmer.
    device_->SetLinearFiltering(true);
  }
  ~GlRenderDevice() override { device_->Release(); }
  bool ReadPixels(apescene::Image* image) override {
    image->Width = static_cast<int>(device_->Width());
    image->Height = static_cast<int>(device_->Height());
    device_->ReadPixels(&image->Argb);
    return true;
  }
  void ForgetCalls() override { device_->ClearCalls(); }
  std::string Description() const override {
    return "OpenGL (" + device_->Renderer() + ", " + device_->Platform() + ")";
  }

 private:
  GlDevice* device_;
};
#endif

}  // namespace

RenderDevice::RenderDevice(IDirect3DDevice9* inner) : timing_(TimingDevice::Create(inner)) {}
RenderDevice::~RenderDevice() {
  timing_->Release();
}

bool RenderDevice::HasGl() {
  return APE_HAVE_GL != 0;
}

std::unique_ptr<RenderDevice> RenderDevice::Create(const std::string& kind, int width, int height,
                                                   std::string* error) {
  if (kind == "null") return std::make_unique<NullRenderDevice>(MemoryDevice::Create());
  if (kind != "gl") {
    *error = "unknown device \"" + kind + "\" (known: gl, null)";
    return nullptr;
  }
#if APE_HAVE_GL
  GlDevice* device = GlDevice::Create(static_cast<UINT>(width), static_cast<UINT>(height), error);
  if (device == nullptr) return nullptr;
  return std::make_unique<GlRenderDevice>(device);
#else
  (void)width, (void)height;
  *error = "this build has no OpenGL device (OpenGL or EGL development files were missing)";
  return nullptr;
#endif
}

}  // namespace aperender
