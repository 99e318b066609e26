// Runs a loaded scene frame by frame on a device, with time driven exactly: each frame advances
// the test clock by 1/fps (rounded to whole clock ticks without drift) and the host context by
// one frame, updates the animated values, then clears, sets the camera, draws the visible
// meshes, calls every channel (emitters simulate and draw inside CallChannel) and reads the
// picture back. The device is unlit, and channels draw without depth writes (see RenderFrame).
#pragma once

#include <cstdint>
#include <vector>

#include "tools/render/particle_census.h"
#include "tools/render/render_device.h"
#include "tools/scene/scene.h"

class Qen_HostContext;
class TestClock;
class Tev_AdvancedParticleEmitter;

namespace aperender {

struct FrameResult {
  int Frame = 0;                      // from 1
  double Seconds = 0.0;               // scene time shown
  ParticleCounts Particles;           // all emitters together
  double ChannelMs = 0.0;             // inside CallChannel of every channel
  std::vector<double> ChannelMsEach;  // the same per channel, in the scene's channel order
  double DrawMs = 0.0;                // of which in device draw calls
  double ReadbackMs = 0.0;            // EndScene and reading the pixels back
  bool HasPicture = false;
  apescene::Image Picture;
};

class SceneRenderer {
 public:
  SceneRenderer(apescene::Scene& scene, RenderDevice& device, Qen_HostContext& context,
                TestClock& clock, int width, int height, double fps, unsigned seed);

  // Seeds rand, builds the meshes' buffers and lets every channel initialise (an emitter's first
  // call does nothing else). Call once, before the first frame.
  void Prime();
  // Frames are rendered in order from 1. Without `read_back` the picture is not read (a frame
  // passed on the way to a later one); everything else happens as with it.
  FrameResult RenderFrame(int frame, bool read_back = true);

 private:
  void DrawMeshes();

  apescene::Scene& scene_;
  RenderDevice& device_;
  Qen_HostContext& context_;
  TestClock& clock_;
  int width_;
  int height_;
  double fps_;
  unsigned seed_;
  std::int64_t start_ticks_;
  std::int64_t ticks_;
  std::vector<Tev_AdvancedParticleEmitter*> emitters_;
  std::vector<ParticleCensus> census_;
};

}  // namespace aperender
