// One run of a scene, as ape-render makes it: its own host context, a fresh device of the
// scene's size, the scene loaded onto it, and the renderer that steps it frame by frame from 1.
// A fresh device per run means that the frames are the same, bit for bit, as ape-render's for
// the same scene text. Everything here happens on one thread.
#pragma once

#include <memory>
#include <string>

#include "host/device_channel.h"
#include "host/host_context.h"
#include "tools/render/render_device.h"
#include "tools/render/scene_renderer.h"
#include "tools/scene/scene_loader.h"
#include "tools/studio/message_log.h"

class PluginLoader;
class TestClock;

namespace apestudio {

class SceneRun {
 public:
  // Loads the scene onto a new device of `device_kind` ("gl" or "null"); null with
  // the loader's or the device's message in *error. Messages go to `messages` (kept by the
  // caller, cleared here). `clock` is shared by every run: only one runs at a time.
  static std::unique_ptr<SceneRun> Create(const apescene::SceneSource& source,
                                          const std::string& device_kind, PluginLoader& loader,
                                          TestClock& clock, MessageLog* messages,
                                          std::string* error);
  ~SceneRun();
  SceneRun(const SceneRun&) = delete;
  SceneRun& operator=(const SceneRun&) = delete;

  // Seeds rand and lets the channels initialise: call once before the first frame. A run that
  // only checks a scene is never primed, so it leaves rand alone.
  void Prime();
  // Renders the next frame (the first is 1); without `picture` it is not read back (a frame
  // passed on the way to a later one).
  aperender::FrameResult RenderNext(bool picture = true);
  // The last frame rendered (0 before the first).
  int Frame() const { return frame_; }
  apescene::Scene& GetScene() { return *scene_; }
  const apescene::RenderSettings& Settings() const { return scene_->Settings; }
  // Replaces the camera's eye and target for the frames to come (a viewport's own view).
  void SetView(const D3DXVECTOR3& eye, const D3DXVECTOR3& target);

 private:
  SceneRun() = default;

  Qen_HostContext context_;
  std::unique_ptr<aperender::RenderDevice> device_;
  std::unique_ptr<Tev_DX8_DeviceChannel> device_channel_;
  std::unique_ptr<apescene::Scene> scene_;
  std::unique_ptr<aperender::SceneRenderer> renderer_;
  int frame_ = 0;
};

}  // namespace apestudio
