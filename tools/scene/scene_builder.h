// The workings of the scene loader, shared by its source files: settings and channels
// (scene_loader.cpp), per-type channel settings (channel_config.cpp) and links
// (link_config.cpp). Every fault throws SceneError at its path.
#pragma once

#include <string>

#include "host/channel_records.h"
#include "tools/scene/json_values.h"
#include "tools/scene/plugin_types.h"
#include "tools/scene/scene.h"

class PluginLoader;
class Qen_Channel;

namespace apescene {

class SceneBuilder {
 public:
  // `loader` may be null when only the settings are read.
  SceneBuilder(Scene* scene, PluginLoader* loader, std::string base_directory);
  void Build(const Json& root);
  void BuildSettings(const Json& root);

 private:
  // scene_loader.cpp
  void ReadSettings(const Json& root);
  void ReadCamera(const Json& camera, const DocPath& path);
  void ReadChannels(const Json& channels, const DocPath& path);
  // A new channel owned by the scene; `type_path` is blamed when the type is unknown.
  Qen_Channel* CreateByName(const std::string& type_name, const DocPath& type_path);
  Qen_Channel* CreateByGuid(const GUID& type, const std::string& type_name, const DocPath& path);
  std::string ResolveFile(const std::string& relative) const;
  // Notes where a channel was written (a named one with its name), for later messages.
  void Remember(const Qen_Channel* channel, const std::string& name, const DocPath& path);
  // Notes a Value channel's range over the shot.
  void RememberRange(const Qen_Channel* channel, const Track<float>& track);
  // A new "Value" or "Value Vector" channel set from the track now and at every animated time.
  Qen_Channel* MakeValueChannel(const Track<float>& track, const GUID& type,
                                const std::string& type_name, const DocPath& path);
  Qen_Channel* MakeVectorChannel(const Track<D3DXVECTOR3>& track, const GUID& type,
                                 const std::string& type_name, const DocPath& path);

  // channel_config.cpp: fills a channel from its definition object.
  void Configure(Qen_Channel* channel, const Json& definition, const DocPath& path);
  void ConfigureValue(Qen_Channel* channel, const Json& definition, const DocPath& path);
  void ConfigureVector(Qen_Channel* channel, const Json& definition, const DocPath& path);
  void ConfigureMatrix(Qen_Channel* channel, const Json& definition, const DocPath& path);
  void ConfigureEnvelope(Qen_Channel* channel, const Json& definition, const DocPath& path);
  void SetEnvelopeKeys(Qen_Channel* channel, const Json& keys, const DocPath& path,
                       const std::string& default_mode);
  void ConfigureTexture(Qen_Channel* channel, const Json& definition, const DocPath& path);
  void ConfigureMesh(Qen_Channel* channel, const Json& definition, const DocPath& path);
  void ConfigureCollision(Qen_Channel* channel, const Json& definition, const DocPath& path);
  void ConfigureAttractor(Qen_Channel* channel, const Json& definition, const DocPath& path);

  // link_config.cpp
  void ConfigureLinks(Qen_Channel* channel, const Json& links, const DocPath& path);
  // The channel a link value stands for: a named channel, an inline value or an inline channel
  // definition; null for JSON null (no link).
  Qen_Channel* ResolveLinkValue(const Json& value, const DocPath& path, const GUID& type,
                                const std::string& type_name);
  // A named channel of the given type, or an inline definition of one.
  Qen_Channel* ResolveChannel(const Json& value, const DocPath& path, const GUID& type,
                              const std::string& type_name);
  // `expected` names the value kind a string stood in for ("a number"), empty for a channel
  // link; `link_type` is the type the link takes, for hints.
  Qen_Channel* NamedChannel(const std::string& name, const DocPath& path,
                            const std::string& expected, const std::string& link_type = "");
  // A number or vector link written per second ({"per_second": ...} or
  // {"per_second_squared": ...}), converted to per logic step with the emitter's logic rate.
  // Null when `value` is not written per second. `links` is the owner's whole links object,
  // where the logic rate is found.
  Qen_Channel* ResolvePerSecond(Qen_Channel* owner, int index, const Json& value,
                                const DocPath& path, const Json& links, const DocPath& links_path);
  void Link(Qen_Channel* owner, int index, Qen_Channel* child, bool many, const DocPath& path);

  Scene* scene_;
  PluginLoader* loader_;
  std::string base_directory_;
  PluginTypeReport types_;
};

// The channel's type GUID and name as it reports them.
GUID TypeGuidOf(Qen_Channel* channel);
std::string TypeNameOf(Qen_Channel* channel);

}  // namespace apescene
