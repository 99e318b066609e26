#include "tools/studio/scene_run.h"

namespace apestudio {

std::unique_ptr<SceneRun> SceneRun::Create(const apescene::SceneSource& source,
                                           const std::string& device_kind, PluginLoader& loader,
                                           TestClock& clock, MessageLog* messages,
                                           std::string* error) {
  apescene::RenderSettings settings;
  if (!apescene::ReadSceneSettings(source, &settings, error)) return nullptr;
  std::unique_ptr<SceneRun> run(new SceneRun());
  Qen_HostContext::ScopedCurrent current(&run->context_);
  messages->Clear();
  auto collect = [messages](const char* text) { messages->Add(text); };
  run->context_.DebugMessages.SetSink(collect);
  run->context_.OverloadMessages.SetSink(collect);
  run->device_ =
      aperender::RenderDevice::Create(device_kind, settings.Width, settings.Height, error);
  if (run->device_ == nullptr) {
    *error = "no device: " + *error;
    return nullptr;
  }
  run->device_channel_ = std::make_unique<Tev_DX8_DeviceChannel>(run->device_->Device());
  run->scene_ = apescene::LoadScene(source, loader, error);
  if (run->scene_ == nullptr) return nullptr;
  run->renderer_ = std::make_unique<aperender::SceneRenderer>(
      *run->scene_, *run->device_, run->context_, clock, settings.Width, settings.Height,
      settings.Fps, settings.Seed);
  return run;
}

SceneRun::~SceneRun() {
  Qen_HostContext::ScopedCurrent current(&context_);
  renderer_.reset();
  scene_.reset();  // the channels go while their context is current, before the device
  device_channel_.reset();
  device_.reset();
}

void SceneRun::Prime() {
  Qen_HostContext::ScopedCurrent current(&context_);
  renderer_->Prime();
}

aperender::FrameResult SceneRun::RenderNext(bool picture) {
  Qen_HostContext::ScopedCurrent current(&context_);
  return renderer_->RenderFrame(++frame_, picture);
}

void SceneRun::SetView(const D3DXVECTOR3& eye, const D3DXVECTOR3& target) {
  scene_->View.Eye = {{{0.0, eye}}, false};
  scene_->View.Target = {{{0.0, target}}, false};
}

}  // namespace apestudio
