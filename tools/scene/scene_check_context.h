// What the scene check's parts share: reading a scene's links as the checks need them, and
// placing a warning at a link or a channel.
#pragma once

#include <string>
#include <vector>

#include "tools/scene/scene.h"
#include "tools/scene/scene_warning.h"

class Qen_Channel;
class Tev_EnvelopeStorage;
struct GUID;

namespace apescene {

// A number link's least and greatest value over the shot.
struct NumberRange {
  float Least = 0.0f;
  float Greatest = 0.0f;
};

class CheckContext {
 public:
  explicit CheckContext(const Scene& scene) : scene_(scene) {}

  const Scene& TheScene() const { return scene_; }
  // The channel linked at `index` of `owner`, or null.
  Qen_Channel* Child(const Qen_Channel* owner, int index) const;
  bool Linked(const Qen_Channel* owner, int index) const { return Child(owner, index) != nullptr; }
  // A Value link's range; false when it is not linked (or not a Value channel).
  bool Number(const Qen_Channel* owner, int index, NumberRange* range) const;
  // Whether a yes/no link can be yes at some time of the shot.
  bool CanBeYes(const Qen_Channel* owner, int index) const;
  // The envelope linked at `index`, or null.
  Tev_EnvelopeStorage* Envelope(const Qen_Channel* owner, int index) const;

  // A warning at the link, or at its owner's definition when the link was not written.
  void AtLink(const Qen_Channel* owner, int index, const std::string& message);
  // A warning at a channel's definition (the scene's root when unknown).
  void AtChannel(const Qen_Channel* channel, const std::string& message);
  std::vector<SceneWarning>& Warnings() { return warnings_; }

 private:
  const Scene& scene_;
  std::vector<SceneWarning> warnings_;
};

// "3", "0.5", "1e+06": numbers as messages write them.
std::string ShowNumber(double value);
// The quoted link name of an emitter link, e.g. "\"Bounce Rate\"".
std::string EmitterLinkName(int index);
bool IsType(const Qen_Channel* channel, const GUID& type);

// The checks of one emitter, and of the smoke settings it uses.
void CheckEmitter(CheckContext& context, Qen_Channel* emitter);

}  // namespace apescene
