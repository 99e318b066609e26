#include "tools/scene/scene.h"

#include <cmath>

#include "host/link_channels.h"
#include "host/multi_collision_manager.h"

namespace apescene {

int RenderSettings::FrameCount() const {
  if (Frames > 0) return Frames;
  const double frames = std::round(DurationSeconds * Fps);
  return frames < 1.0 ? 1 : frames > 1e6 ? 1'000'000 : static_cast<int>(frames);
}

Scene::Scene() = default;

Scene::~Scene() {
  // Last made first: inline channels go before the channels that link them.
  while (!Channels.empty()) Channels.pop_back();
}

void Scene::Animate(double seconds) {
  for (const auto& animate : Animators) animate(seconds);
  if (CameraEye != nullptr) CameraEye->SetVector(View.Eye.Sample(seconds));
  if (MovingGeometry)
    for (Tev_MultiCollisionManager* manager : CollisionManagers)
      manager->RebuildAllCollisionObjects();
}

Qen_Channel* Scene::Find(const std::string& name) const {
  for (const NamedChannel& named : Named)
    if (named.Name == name) return named.Channel;
  return nullptr;
}

const Scene::ChannelSource* Scene::SourceOf(const Qen_Channel* channel) const {
  for (const ChannelSource& source : ChannelSources)
    if (source.Channel == channel) return &source;
  return nullptr;
}

const Scene::LinkSource* Scene::SourceOf(const Qen_Channel* owner, int index) const {
  for (const LinkSource& source : LinkSources)
    if (source.Owner == owner && source.Index == index) return &source;
  return nullptr;
}

}  // namespace apescene
