#include "tools/render/scene_renderer.h"

#include <chrono>
#include <cmath>
#include <cstdlib>

#include "host/host_context.h"
#include "host/object_data_channel.h"
#include "host/type_guids.h"
#include "platform/windows_types.h"
#include "plugin/advanced_particle_emitter.h"
#include "tools/scene/camera.h"

namespace aperender {
namespace {

using Clock = std::chrono::steady_clock;

double MsSince(Clock::time_point start) {
  return std::chrono::duration<double, std::milli>(Clock::now() - start).count();
}

// Device states the mesh pass changes, put back afterwards so that the emitters find the
// device as they left it.
struct SavedStates {
  static constexpr D3DRENDERSTATETYPE kRender[] = {D3DRS_ALPHABLENDENABLE, D3DRS_ZENABLE,
                                                   D3DRS_ZWRITEENABLE, D3DRS_CULLMODE};
  static constexpr D3DTEXTURESTAGESTATETYPE kStage[] = {D3DTSS_COLOROP, D3DTSS_COLORARG1,
                                                        D3DTSS_ALPHAOP, D3DTSS_ALPHAARG1};
  DWORD Render[4];
  DWORD Stage[4];
};

}  // namespace

SceneRenderer::SceneRenderer(apescene::Scene& scene, RenderDevice& device, Qen_HostContext& context,
                             TestClock& clock, int width, int height, double fps, unsigned seed)
    : scene_(scene),
      device_(device),
      context_(context),
      clock_(clock),
      width_(width),
      height_(height),
      fps_(fps),
      seed_(seed),
      start_ticks_(clock.Now()),
      ticks_(clock.Now()) {
  for (const auto& channel : scene_.Channels)
    if (channel->GetChannelType().TypeGuid == kAdvancedParticleEmitterGuid)
      emitters_.push_back(static_cast<Tev_AdvancedParticleEmitter*>(channel.get()));
  census_.resize(emitters_.size());
}

void SceneRenderer::Prime() {
  std::srand(seed_);
  for (Tev_DX8_ObjectDataChannel* mesh : scene_.DrawnMeshes)
    if (mesh->GetVertexBuffer() == nullptr) mesh->CreateVertexBuffer();
  scene_.Animate(0.0);
  for (const auto& channel : scene_.Channels) channel->CallChannel();
  device_.ForgetCalls();
}

FrameResult SceneRenderer::RenderFrame(int frame) {
  FrameResult result;
  result.Frame = frame;
  result.Seconds = frame / fps_;

  // Whole ticks from the start, so that rounding never accumulates.
  const std::int64_t target =
      start_ticks_ + std::llround(frame * static_cast<double>(TestClock::kTicksPerSecond) / fps_);
  clock_.Advance(target - ticks_);
  ticks_ = target;
  context_.AdvanceFrame();
  scene_.Animate(result.Seconds);
  for (std::size_t i = 0; i < emitters_.size(); ++i) census_[i].Before(*emitters_[i]);

  IDirect3DDevice9* device = device_.Device();
  device->Clear(0, nullptr, D3DCLEAR_TARGET | D3DCLEAR_ZBUFFER, scene_.Settings.Background, 1.0f,
                0);
  device->BeginScene();
  const D3DVIEWPORT9 viewport{0,    0,   static_cast<DWORD>(width_), static_cast<DWORD>(height_),
                              0.0f, 1.0f};
  device->SetViewport(&viewport);
  // The scene has no lights: everything shows its vertex colours. (Direct3D lights by default,
  // which without lights draws black, and the emitter's blended passes leave lighting alone.)
  device->SetRenderState(D3DRS_LIGHTING, FALSE);
  const D3DXMATRIX view = apescene::CameraView(scene_.View, result.Seconds);
  const D3DXMATRIX projection = apescene::CameraProjection(scene_.View, width_, height_);
  device->SetTransform(D3DTS_VIEW, &view);
  device->SetTransform(D3DTS_PROJECTION, &projection);
  DrawMeshes();

  device_.Device()->ResetTimes();
  const Clock::time_point calls = Clock::now();
  for (const auto& channel : scene_.Channels) {
    // Blended particles are tested against the depth of what is drawn but do not write it, as
    // hosts draw transparent effects; otherwise each quad's clear corners would hide the
    // particles behind it. The emitter turns depth writing back on after its pass, so this is
    // set again before each channel.
    device->SetRenderState(D3DRS_ZWRITEENABLE, FALSE);
    channel->CallChannel();
  }
  result.ChannelMs = MsSince(calls);
  result.DrawMs = device_.Device()->DrawMs();

  const Clock::time_point readback = Clock::now();
  device->EndScene();
  result.HasPicture = device_.ReadPixels(&result.Picture);
  result.ReadbackMs = MsSince(readback);
  device_.ForgetCalls();

  for (std::size_t i = 0; i < emitters_.size(); ++i) {
    const ParticleCounts counts = census_[i].After(*emitters_[i]);
    result.Particles.Live += counts.Live;
    result.Particles.Attached += counts.Attached;
    result.Particles.Sliding += counts.Sliding;
    result.Particles.Births += counts.Births;
    result.Particles.Deaths += counts.Deaths;
    result.Particles.LogicSteps += counts.LogicSteps;
  }
  return result;
}

void SceneRenderer::DrawMeshes() {
  if (scene_.DrawnMeshes.empty()) return;
  IDirect3DDevice9* device = device_.Device();
  SavedStates saved;
  for (int i = 0; i < 4; ++i) {
    device->GetRenderState(SavedStates::kRender[i], &saved.Render[i]);
    device->GetTextureStageState(0, SavedStates::kStage[i], &saved.Stage[i]);
  }
  // Opaque, vertex colour only, seen from both sides (a wall or an OBJ may face away).
  device->SetRenderState(D3DRS_ALPHABLENDENABLE, FALSE);
  device->SetRenderState(D3DRS_CULLMODE, D3DCULL_NONE);
  device->SetRenderState(D3DRS_ZENABLE, D3DZB_TRUE);
  device->SetRenderState(D3DRS_ZWRITEENABLE, TRUE);
  device->SetTextureStageState(0, D3DTSS_COLOROP, D3DTOP_SELECTARG1);
  device->SetTextureStageState(0, D3DTSS_COLORARG1, D3DTA_DIFFUSE);
  device->SetTextureStageState(0, D3DTSS_ALPHAOP, D3DTOP_SELECTARG1);
  device->SetTextureStageState(0, D3DTSS_ALPHAARG1, D3DTA_DIFFUSE);
  device->SetTexture(0, nullptr);
  for (Tev_DX8_ObjectDataChannel* mesh : scene_.DrawnMeshes) mesh->StreamVertexData();
  for (int i = 0; i < 4; ++i) {
    device->SetRenderState(SavedStates::kRender[i], saved.Render[i]);
    device->SetTextureStageState(0, SavedStates::kStage[i], saved.Stage[i]);
  }
}

}  // namespace aperender
