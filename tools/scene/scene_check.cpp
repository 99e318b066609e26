// The scene check's frame: reading links for the checks, placing warnings, the checks of the
// scene as a whole, and the order warnings are given in.
#include "tools/scene/scene_check.h"

#include <algorithm>
#include <cstdio>
#include <unordered_set>

#include "host/envelope_storage.h"
#include "host/link_channels.h"
#include "host/type_guids.h"
#include "tools/scene/link_reference.h"
#include "tools/scene/scene_check_context.h"

namespace apescene {

std::string ShowNumber(double value) {
  char text[32];
  std::snprintf(text, sizeof text, "%g", value);
  return text;
}

std::string EmitterLinkName(int index) {
  const auto links = LinkReferences("AdvancedParticleEmitter");
  return "\"" + std::string(links[static_cast<std::size_t>(index)].Name) + "\"";
}

bool IsType(const Qen_Channel* channel, const GUID& type) {
  // GetChannelType only reads, but the host declares it non-const.
  return channel != nullptr && const_cast<Qen_Channel*>(channel)->GetChannelType().TypeGuid == type;
}

Qen_Channel* CheckContext::Child(const Qen_Channel* owner, int index) const {
  return owner->GetChild(index);
}

bool CheckContext::Number(const Qen_Channel* owner, int index, NumberRange* range) const {
  Qen_Channel* child = Child(owner, index);
  if (!IsType(child, kValueGuid)) return false;
  const Scene::ChannelSource* source = scene_.SourceOf(child);
  if (source != nullptr && source->Animated) {
    *range = {source->Least, source->Greatest};
  } else {
    const float value = static_cast<Qen_ValueChannel*>(child)->GetValue();
    *range = {value, value};
  }
  return true;
}

bool CheckContext::CanBeYes(const Qen_Channel* owner, int index) const {
  NumberRange range;
  return Number(owner, index, &range) && range.Greatest > 0.0f;
}

Tev_EnvelopeStorage* CheckContext::Envelope(const Qen_Channel* owner, int index) const {
  Qen_Channel* child = Child(owner, index);
  return IsType(child, kEnvelopeStorageGuid) ? static_cast<Tev_EnvelopeStorage*>(child) : nullptr;
}

void CheckContext::AtLink(const Qen_Channel* owner, int index, const std::string& message) {
  if (const Scene::LinkSource* link = scene_.SourceOf(owner, index)) {
    warnings_.push_back({link->Path, link->Line, message});
    return;
  }
  AtChannel(owner, message);
}

void CheckContext::AtChannel(const Qen_Channel* channel, const std::string& message) {
  if (const Scene::ChannelSource* source = scene_.SourceOf(channel)) {
    warnings_.push_back({source->Path, source->Line, message});
    return;
  }
  warnings_.push_back({DocPath(), 0, message});
}

namespace {

// Named channels that only matter when linked: defined and never linked is a forgotten link or
// a misspelt name. (Meshes may be drawn or collided with, and emitters run by themselves.)
void CheckUnlinked(CheckContext& context) {
  const Scene& scene = context.TheScene();
  std::unordered_set<const Qen_Channel*> linked;
  for (const Scene::LinkSource& link : scene.LinkSources) linked.insert(link.Child);
  for (const Scene::ChannelSource& source : scene.ChannelSources) {
    if (source.Name.empty()) continue;
    const Qen_Channel* channel = source.Channel;
    if (IsType(channel, kObjectDataGuid) || IsType(channel, kAdvancedParticleEmitterGuid)) continue;
    if (linked.count(channel) == 0)
      context.AtChannel(channel, "\"" + source.Name +
                                     "\" is linked nowhere, so it changes nothing (a link may "
                                     "name it: \"link name\": \"" +
                                     source.Name + "\")");
  }
}

}  // namespace

std::vector<SceneWarning> CheckScene(const Scene& scene) {
  CheckContext context(scene);
  context.Warnings() = scene.LoadWarnings;
  bool any_emitter = false;
  for (const auto& channel : scene.Channels) {
    if (!IsType(channel.get(), kAdvancedParticleEmitterGuid)) continue;
    any_emitter = true;
    CheckEmitter(context, channel.get());
  }
  if (!any_emitter)
    context.Warnings().push_back(
        {DocPath(), 0,
         "the scene has no \"AdvancedParticleEmitter\" channel: no particle will be drawn"});
  CheckUnlinked(context);
  std::vector<SceneWarning> warnings = std::move(context.Warnings());
  std::stable_sort(warnings.begin(), warnings.end(),
                   [](const SceneWarning& a, const SceneWarning& b) { return a.Line < b.Line; });
  return warnings;
}

}  // namespace apescene
