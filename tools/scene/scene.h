// A loaded scene: the host graph it describes (channels owned here), the camera and the render
// settings, and the animated values to update before each frame.
#pragma once

#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "platform/d3d9_types.h"
#include "tools/scene/animation.h"
#include "tools/scene/doc_path.h"
#include "tools/scene/scene_warning.h"

class Qen_Channel;
class Qen_ValueVectorChannel;
class Tev_DX8_ObjectDataChannel;
class Tev_MultiCollisionManager;

namespace apescene {

struct Camera {
  Track<D3DXVECTOR3> Eye{{{0.0, D3DXVECTOR3(0.0f, 2.0f, -8.0f)}}, false};
  Track<D3DXVECTOR3> Target{{{0.0, D3DXVECTOR3(0.0f, 1.0f, 0.0f)}}, false};
  D3DXVECTOR3 Up{0.0f, 1.0f, 0.0f};
  float FovDegrees = 45.0f;  // vertical
  float Near = 0.1f;
  float Far = 200.0f;
};

struct RenderSettings {
  int Width = 640;
  int Height = 360;
  double Fps = 30.0;
  int Frames = 0;  // 0: from DurationSeconds
  double DurationSeconds = 4.0;
  unsigned Seed = 1;
  D3DCOLOR Background = 0xFF000000u;

  // Frames if given, else the duration at Fps, at least 1.
  int FrameCount() const;
};

// The name under which a scene reaches the camera's eye position, e.g. as an emitter's "LookAt".
inline constexpr char kCameraEyeChannelName[] = "camera.eye";

class Scene {
 public:
  struct NamedChannel {
    std::string Name;
    Qen_Channel* Channel;
  };

  Scene();
  ~Scene();  // destroys the channels (before the plug-in loader that made them goes)
  Scene(const Scene&) = delete;
  Scene& operator=(const Scene&) = delete;

  // Sets every animated value, and the camera eye channel, to its value at `seconds`; when a
  // mesh moves, the collision managers rebuild their objects.
  void Animate(double seconds);
  // A named channel (including "camera.eye"), or null.
  Qen_Channel* Find(const std::string& name) const;

  std::string SourceName;  // the file name, or what stands for it
  RenderSettings Settings;
  Camera View;

  // Every channel of the graph, named or written inline, in the order made: the order in which
  // they are called each frame.
  std::vector<std::unique_ptr<Qen_Channel>> Channels;
  std::vector<NamedChannel> Named;  // document order
  std::vector<Tev_DX8_ObjectDataChannel*> DrawnMeshes;
  std::vector<std::function<void(double seconds)>> Animators;
  std::vector<Tev_MultiCollisionManager*> CollisionManagers;
  bool MovingGeometry = false;  // some mesh has an animated transform
  Qen_ValueVectorChannel* CameraEye = nullptr;

  // Where each channel and each link was written, for messages about them (the lines are filled
  // in once the whole document is read).
  struct ChannelSource {
    const Qen_Channel* Channel;
    std::string Name;  // empty for a channel written inline in a link
    DocPath Path;
    int Line = 0;
    // A Value channel's least and greatest value over the shot (its keys), when animated.
    bool Animated = false;
    float Least = 0.0f;
    float Greatest = 0.0f;
  };
  struct LinkSource {
    const Qen_Channel* Owner;
    int Index;
    const Qen_Channel* Child;
    DocPath Path;
    int Line = 0;
  };
  std::vector<ChannelSource> ChannelSources;  // in the order made
  std::vector<LinkSource> LinkSources;        // in the order linked
  // Likely mistakes: what the loader noticed while reading (LoadWarnings), and everything the
  // scene check found when the load ended (Warnings, which includes LoadWarnings).
  std::vector<SceneWarning> LoadWarnings;
  std::vector<SceneWarning> Warnings;

  const ChannelSource* SourceOf(const Qen_Channel* channel) const;
  const LinkSource* SourceOf(const Qen_Channel* owner, int index) const;
};

}  // namespace apescene
