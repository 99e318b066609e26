// EGL display and context set-up, and the offscreen framebuffer.
#include "platform/gl/gl_context.h"

#include <EGL/egl.h>
#include <EGL/eglext.h>
#include "platform/gl/gl_api.h"

#include <cstring>
#include <mutex>
#include <set>

#include "platform/d3d9_types.h"

struct GlContext::Egl {
  EGLDisplay display = EGL_NO_DISPLAY;
  EGLContext context = EGL_NO_CONTEXT;
};

namespace {

// A display, once initialised, stays so for the life of the process: initialising is slow,
// eglTerminate would end it for every other device on the same display too, and Mesa leaves a
// little of its driver state behind on each terminate-and-initialise cycle.
bool InitialiseDisplay(EGLDisplay display) {
  static std::mutex mutex;
  static std::set<EGLDisplay> initialised;
  std::lock_guard<std::mutex> lock(mutex);
  if (initialised.count(display) != 0) return true;
  EGLint major = 0, minor = 0;
  if (!eglInitialize(display, &major, &minor)) return false;
  initialised.insert(display);
  return true;
}

bool HasExtension(const char* list, const char* name) {
  if (list == nullptr) return false;
  const std::size_t length = std::strlen(name);
  for (const char* p = std::strstr(list, name); p != nullptr; p = std::strstr(p + 1, name)) {
    const bool starts = p == list || p[-1] == ' ';
    const bool ends = p[length] == '\0' || p[length] == ' ';
    if (starts && ends) return true;
  }
  return false;
}

// A 4.5 compatibility context on an initialised display, or EGL_NO_CONTEXT.
EGLContext MakeContext(EGLDisplay display) {
  const char* extensions = eglQueryString(display, EGL_EXTENSIONS);
  if (!HasExtension(extensions, "EGL_KHR_surfaceless_context")) return EGL_NO_CONTEXT;
  if (!eglBindAPI(EGL_OPENGL_API)) return EGL_NO_CONTEXT;
  EGLConfig config = EGL_NO_CONFIG_KHR;
  if (!HasExtension(extensions, "EGL_KHR_no_config_context")) {
    const EGLint wanted[] = {EGL_RENDERABLE_TYPE, EGL_OPENGL_BIT, EGL_NONE};
    EGLint count = 0;
    if (!eglChooseConfig(display, wanted, &config, 1, &count) || count < 1) {
      return EGL_NO_CONTEXT;
    }
  }
  const EGLint attributes[] = {EGL_CONTEXT_MAJOR_VERSION,
                               4,
                               EGL_CONTEXT_MINOR_VERSION,
                               5,
                               EGL_CONTEXT_OPENGL_PROFILE_MASK,
                               EGL_CONTEXT_OPENGL_COMPATIBILITY_PROFILE_BIT,
                               EGL_NONE};
  return eglCreateContext(display, config, EGL_NO_CONTEXT, attributes);
}

// Tries one display: initialise, make a context, make it current.
bool TryDisplay(EGLDisplay display, GlContext::Egl* egl) {
  if (display == EGL_NO_DISPLAY || !InitialiseDisplay(display)) return false;
  EGLContext context = MakeContext(display);
  if (context != EGL_NO_CONTEXT &&
      eglMakeCurrent(display, EGL_NO_SURFACE, EGL_NO_SURFACE, context)) {
    egl->display = display;
    egl->context = context;
    return true;
  }
  if (context != EGL_NO_CONTEXT) eglDestroyContext(display, context);
  return false;
}

// The first hardware EGL device that gives a context; software devices are left to the
// surfaceless platform, which picks the same renderer with less ceremony.
bool TryGpuDevices(GlContext::Egl* egl) {
  const char* client = eglQueryString(EGL_NO_DISPLAY, EGL_EXTENSIONS);
  if (!HasExtension(client, "EGL_EXT_device_enumeration") ||
      !HasExtension(client, "EGL_EXT_platform_device")) {
    return false;
  }
  auto query_devices =
      reinterpret_cast<PFNEGLQUERYDEVICESEXTPROC>(eglGetProcAddress("eglQueryDevicesEXT"));
  auto query_string = reinterpret_cast<PFNEGLQUERYDEVICESTRINGEXTPROC>(
      eglGetProcAddress("eglQueryDeviceStringEXT"));
  if (query_devices == nullptr || query_string == nullptr) return false;
  constexpr EGLint kMaxDevices = 16;
  EGLDeviceEXT devices[kMaxDevices];
  EGLint count = 0;
  if (!query_devices(kMaxDevices, devices, &count)) return false;
  for (EGLint i = 0; i < count; ++i) {
    if (HasExtension(query_string(devices[i], EGL_EXTENSIONS), "EGL_MESA_device_software")) {
      continue;
    }
    EGLDisplay display = eglGetPlatformDisplay(EGL_PLATFORM_DEVICE_EXT, devices[i], nullptr);
    if (TryDisplay(display, egl)) return true;
  }
  return false;
}

bool TrySurfaceless(GlContext::Egl* egl) {
  const char* client = eglQueryString(EGL_NO_DISPLAY, EGL_EXTENSIONS);
  if (!HasExtension(client, "EGL_MESA_platform_surfaceless")) return false;
  return TryDisplay(
      eglGetPlatformDisplay(EGL_PLATFORM_SURFACELESS_MESA, EGL_DEFAULT_DISPLAY, nullptr), egl);
}

std::string GlString(GLenum name) {
  const GLubyte* text = glGetString(name);
  return text != nullptr ? reinterpret_cast<const char*>(text) : "";
}

}  // namespace

HRESULT TakeGlErrors() {
  HRESULT result = S_OK;
  // GL keeps one flag per kind of error; a bounded loop also survives a lost context, where
  // some drivers answer an error for ever.
  for (int i = 0; i < 16; ++i) {
    const GLenum error = glGetError();
    if (error == GL_NO_ERROR) break;
    if (error == GL_OUT_OF_MEMORY) {
      result = D3DERR_OUTOFVIDEOMEMORY;
    } else if (result == S_OK) {
      result = E_FAIL;
    }
  }
  return result;
}

std::shared_ptr<GlContext> GlContext::Create(std::uint32_t width, std::uint32_t height,
                                             std::string* error) {
  std::string ignored;
  if (error == nullptr) error = &ignored;
  if (width == 0 || height == 0) {
    *error = "GlDevice: the framebuffer needs a width and a height of at least 1 pixel";
    return nullptr;
  }
  std::shared_ptr<GlContext> gl(new GlContext());
  gl->egl_ = std::make_unique<Egl>();
  gl->width_ = width;
  gl->height_ = height;
  if (TryGpuDevices(gl->egl_.get())) {
    gl->platform_ = "EGL device";
  } else if (TrySurfaceless(gl->egl_.get())) {
    gl->platform_ = "EGL surfaceless";
  } else {
    *error =
        "GlDevice: no OpenGL 4.5 compatibility context could be made through EGL (neither a GPU "
        "EGL device nor Mesa's surfaceless platform answered; is Mesa's libegl-mesa0 with "
        "libgl1-mesa-dri installed?)";
    return nullptr;
  }
  gl->renderer_ = GlString(GL_RENDERER);
  GLfloat range_px[2] = {1.0f, 1.0f};
  glGetFloatv(GL_ALIASED_POINT_SIZE_RANGE, range_px);
  gl->max_point_size_px_ = range_px[1];
  if (!gl->MakeFramebuffer(error)) return nullptr;
  return gl;
}

bool GlContext::MakeFramebuffer(std::string* error) {
  GLint max_size = 0;
  glGetIntegerv(GL_MAX_RENDERBUFFER_SIZE, &max_size);
  if (max_size <= 0 || width_ > static_cast<std::uint32_t>(max_size) ||
      height_ > static_cast<std::uint32_t>(max_size)) {
    *error = "GlDevice: " + std::to_string(width_) + "x" + std::to_string(height_) +
             " is larger than the driver's largest framebuffer (" + std::to_string(max_size) +
             " pixels a side)";
    return false;
  }
  const GLsizei w = static_cast<GLsizei>(width_);
  const GLsizei h = static_cast<GLsizei>(height_);
  glGenFramebuffers(1, &framebuffer_);
  glGenRenderbuffers(1, &colour_buffer_);
  glGenRenderbuffers(1, &depth_buffer_);
  glBindRenderbuffer(GL_RENDERBUFFER, colour_buffer_);
  glRenderbufferStorage(GL_RENDERBUFFER, GL_RGBA8, w, h);
  glBindRenderbuffer(GL_RENDERBUFFER, depth_buffer_);
  glRenderbufferStorage(GL_RENDERBUFFER, GL_DEPTH24_STENCIL8, w, h);
  glBindFramebuffer(GL_FRAMEBUFFER, framebuffer_);
  glFramebufferRenderbuffer(GL_FRAMEBUFFER, GL_COLOR_ATTACHMENT0, GL_RENDERBUFFER, colour_buffer_);
  glFramebufferRenderbuffer(GL_FRAMEBUFFER, GL_DEPTH_STENCIL_ATTACHMENT, GL_RENDERBUFFER,
                            depth_buffer_);
  if (glCheckFramebufferStatus(GL_FRAMEBUFFER) != GL_FRAMEBUFFER_COMPLETE) {
    *error = "GlDevice: the offscreen framebuffer is incomplete on " + renderer_;
    return false;
  }
  glDrawBuffer(GL_COLOR_ATTACHMENT0);
  glReadBuffer(GL_COLOR_ATTACHMENT0);
  if (glGetError() != GL_NO_ERROR) {
    *error = "GlDevice: the offscreen framebuffer could not be set up on " + renderer_;
    return false;
  }
  return true;
}

GlContext::~GlContext() {
  if (!egl_ || egl_->context == EGL_NO_CONTEXT) return;
  MakeCurrent();
  if (framebuffer_ != 0) glDeleteFramebuffers(1, &framebuffer_);
  if (colour_buffer_ != 0) glDeleteRenderbuffers(1, &colour_buffer_);
  if (depth_buffer_ != 0) glDeleteRenderbuffers(1, &depth_buffer_);
  eglMakeCurrent(egl_->display, EGL_NO_SURFACE, EGL_NO_SURFACE, EGL_NO_CONTEXT);
  eglDestroyContext(egl_->display, egl_->context);
}

void GlContext::MakeCurrent() {
  if (eglGetCurrentContext() != egl_->context) {
    eglMakeCurrent(egl_->display, EGL_NO_SURFACE, EGL_NO_SURFACE, egl_->context);
  }
}

void GlContext::ReadPixels(std::vector<std::uint32_t>* argb) {
  MakeCurrent();
  const std::size_t row = width_;
  argb->assign(row * height_, 0u);
  glBindFramebuffer(GL_READ_FRAMEBUFFER, framebuffer_);
  glPixelStorei(GL_PACK_ALIGNMENT, 4);
  glPixelStorei(GL_PACK_ROW_LENGTH, 0);
  // BGRA bytes read as 8_8_8_8_REV are A8R8G8B8 words; GL's rows start at the bottom.
  std::vector<std::uint32_t> bottom_up(row * height_);
  glReadPixels(0, 0, static_cast<GLsizei>(width_), static_cast<GLsizei>(height_), GL_BGRA,
               GL_UNSIGNED_INT_8_8_8_8_REV, bottom_up.data());
  for (std::size_t y = 0; y < height_; ++y) {
    std::memcpy(argb->data() + y * row, bottom_up.data() + (height_ - 1 - y) * row,
                row * sizeof(std::uint32_t));
  }
}
