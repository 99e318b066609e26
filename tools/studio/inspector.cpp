#include "tools/studio/inspector.h"

#include <cstring>

#include "host/qen_channel.h"
#include "host/type_guids.h"
#include "tools/scene/link_reference.h"
#include "tools/scene/scene_builder.h"

namespace apestudio {
namespace {

using apescene::Json;

std::string Text(const char* field, std::size_t size) {
  return std::string(field, strnlen(field, size));
}

const char* KindOf(const GUID& type, const std::string& name) {
  if (type == kValueGuid) return !name.empty() && name.back() == '?' ? "yesno" : "number";
  if (type == kValueVectorGuid) return "vector";
  if (type == kMatrixGuid) return "matrix";
  if (type == kEnvelopeStorageGuid) return "envelope";
  return "channel";
}

// The document's links object of a channel, or null.
const Json* DocumentLinks(const Json& document, const std::string& channel) {
  const auto channels = document.find("channels");
  if (channels == document.end() || !channels->is_object()) return nullptr;
  const auto definition = channels->find(channel);
  if (definition == channels->end() || !definition->is_object()) return nullptr;
  const auto links = definition->find("links");
  return links == definition->end() || !links->is_object() ? nullptr : &*links;
}

Json Settings(const Json& document, const std::string& channel) {
  Json settings = Json::object();
  const auto channels = document.find("channels");
  if (channels == document.end() || !channels->is_object()) return settings;
  const auto definition = channels->find(channel);
  if (definition == channels->end() || !definition->is_object()) return settings;
  for (const auto& item : definition->items())
    if (item.key() != "type" && item.key() != "links") settings[item.key()] = item.value();
  return settings;
}

Json DescribeLinks(const apescene::Scene& scene, const std::string& name, Qen_Channel* channel,
                   const Json& document) {
  Json links = Json::array();
  const std::string type_name = apescene::TypeNameOf(channel);
  const Json* written = DocumentLinks(document, name);
  for (int index = 0; index < channel->GetChildCreationCount(); ++index) {
    const ChildCreation* link = channel->GetChildCreation(index);
    if (link == nullptr) continue;
    const std::string link_name = Text(link->LinkName, sizeof link->LinkName);
    // The document may name the link or give its index in digits.
    std::string key = link_name;
    Json value = nullptr;
    if (written != nullptr) {
      if (written->contains(link_name)) {
        value = written->at(link_name);
      } else if (written->contains(std::to_string(index))) {
        key = std::to_string(index);
        value = written->at(key);
      }
    }
    Json choices = Json::array();
    for (const apescene::Scene::NamedChannel& named : scene.Named) {
      if (named.Channel == channel) continue;  // a channel is no link of its own
      const ChannelType type = named.Channel->GetChannelType();
      if (type.TypeGuid == link->Type.TypeGuid || type.BaseTypeGuid == link->Type.TypeGuid)
        choices.push_back(named.Name);
    }
    links.push_back({{"index", index},
                     {"name", link_name},
                     {"key", key},
                     {"type", Text(link->Type.TypeName, sizeof link->Type.TypeName)},
                     {"kind", KindOf(link->Type.TypeGuid, link_name)},
                     {"many", link->LinkPosition == -1},
                     {"value", value},
                     {"choices", choices}});
    // What the link reference says of it: its group, unit, default and meaning.
    if (const apescene::LinkReference* reference =
            apescene::FindLinkReference(type_name, link_name)) {
      Json& described = links.back();
      described["group"] = std::string(reference->Group);
      described["unit"] = std::string(reference->Unit);
      described["default"] = std::string(reference->Default);
      described["help"] = std::string(reference->Meaning);
      // Some yes/no links do not end in "?"; the reference knows them.
      if (described["kind"] == "number" && reference->Unit.substr(0, 6) == "yes/no")
        described["kind"] = "yesno";
    }
  }
  return links;
}

}  // namespace

Json DescribeChannels(const apescene::Scene& scene, const Json& document) {
  Json channels = Json::array();
  for (const apescene::Scene::NamedChannel& named : scene.Named) {
    if (named.Name == apescene::kCameraEyeChannelName) continue;
    channels.push_back({{"name", named.Name},
                        {"type", apescene::TypeNameOf(named.Channel)},
                        {"settings", Settings(document, named.Name)},
                        {"links", DescribeLinks(scene, named.Name, named.Channel, document)}});
  }
  return {{"channels", channels}};
}

}  // namespace apestudio
