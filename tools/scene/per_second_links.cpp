// Link values written per second ({"per_second": v} for speeds and spin, {"per_second_squared":
// v} for forces), turned into the per-logic-step values the emitter reads with the emitter's own
// logic rate.
#include <cmath>
#include <cstring>

#include "host/link_channels.h"
#include "host/type_guids.h"
#include "tools/scene/link_reference.h"
#include "tools/scene/scene_builder.h"
#include "tools/scene/scene_error.h"

namespace apescene {
namespace {

constexpr const char* kPerSecond = "per_second";
constexpr const char* kPerSecondSquared = "per_second_squared";
constexpr char kRateLink[] = "Logic Updates Per Second";
constexpr const char* kOutOfRange = "per logic step this value is beyond the range of a float";

bool IsPerSecondForm(const Json& value) {
  return value.is_object() && (value.contains(kPerSecond) || value.contains(kPerSecondSquared));
}

// The emitter's logic rate as written among its links: a number, or the name of a Value channel
// that is not animated.
float LogicRate(const Scene& scene, const Json& links, const DocPath& links_path,
                const DocPath& path) {
  const Json* rate = Find(links, kRateLink);
  DocPath at = links_path.Key(kRateLink);
  if (rate == nullptr) {
    rate = Find(links, "5");
    at = links_path.Key("5");
  }
  const std::string need = std::string("a per-second value needs the emitter's \"") + kRateLink +
                           "\" as a number above 0 among its links";
  if (rate == nullptr) throw SceneError(path, need);
  float value = 0.0f;
  if (rate->is_number()) {
    value = ReadNumber(*rate, at);
  } else if (rate->is_string()) {
    Qen_Channel* channel = scene.Find(rate->get<std::string>());
    const Scene::ChannelSource* source = channel ? scene.SourceOf(channel) : nullptr;
    if (channel == nullptr || !(channel->GetChannelType().TypeGuid == kValueGuid) ||
        (source != nullptr && source->Animated))
      throw SceneError(path, need + " (or a Value channel that is not animated)");
    value = static_cast<Qen_ValueChannel*>(channel)->GetValue();
  } else {
    throw SceneError(path, need + ", not animated");
  }
  if (!(value > 0.0f)) throw SceneError(path, need);
  return value;
}

}  // namespace

Qen_Channel* SceneBuilder::ResolvePerSecond(Qen_Channel* owner, int index, const Json& value,
                                            const DocPath& path, const Json& links,
                                            const DocPath& links_path) {
  if (!IsPerSecondForm(value)) return nullptr;
  const std::string owner_type = TypeNameOf(owner);
  const auto reference = LinkReferences(owner_type);
  const LinkReference* link = index < static_cast<int>(reference.size())
                                  ? &reference[static_cast<std::size_t>(index)]
                                  : nullptr;
  if (owner_type != "AdvancedParticleEmitter" || link == nullptr || link->StepPower == 0 ||
      (link->Type != "Value" && link->Type != "Value Vector"))
    throw SceneError(path,
                     "only the emitter's per-logic-step number and vector links may be "
                     "written per second (docs/links.md lists their units)");
  const char* key = link->StepPower == 2 ? kPerSecondSquared : kPerSecond;
  if (value.size() != 1 || !value.contains(key))
    throw SceneError(
        path, "this link's unit is " + std::string(link->Unit) + ": write {\"" + key + "\": ...}");
  const DocPath at = path.Key(key);
  const float rate = LogicRate(*scene_, links, links_path, path);
  const float scale =
      static_cast<float>(1.0 / std::pow(static_cast<double>(rate), link->StepPower));

  const GUID type = owner->GetChildCreation(index)->Type.TypeGuid;
  const std::string type_name(link->Type);
  if (type == kValueGuid) {
    Track<float> track =
        ReadTrack(value[key], at, std::function<float(const Json&, const DocPath&)>(ReadNumber));
    for (auto& k : track.Keys) {
      k.Value *= scale;
      if (!std::isfinite(k.Value)) throw SceneError(at, kOutOfRange);
    }
    return MakeValueChannel(track, type, type_name, path);
  }
  Track<D3DXVECTOR3> track = ReadTrack(
      value[key], at, std::function<D3DXVECTOR3(const Json&, const DocPath&)>(ReadVector3));
  for (auto& k : track.Keys) {
    k.Value *= scale;
    if (!std::isfinite(k.Value.x) || !std::isfinite(k.Value.y) || !std::isfinite(k.Value.z))
      throw SceneError(at, kOutOfRange);
  }
  return MakeVectorChannel(track, type, type_name, path);
}

}  // namespace apescene
