// A channel's "links": each link found by its own name (or index), and each value turned into
// the channel it stands for.
#include <algorithm>
#include <cctype>
#include <cstring>

#include "host/link_channels.h"
#include "host/qen_channel.h"
#include "host/type_guids.h"
#include "tools/scene/link_reference.h"
#include "tools/scene/name_suggestions.h"
#include "tools/scene/procedural_images.h"
#include "tools/scene/scene_builder.h"
#include "tools/scene/scene_error.h"

namespace apescene {
namespace {

const std::function<float(const Json&, const DocPath&)> kNumber = ReadNumber;
const std::function<D3DXVECTOR3(const Json&, const DocPath&)> kVector = ReadVector3;
const std::function<MatrixValue(const Json&, const DocPath&)> kMatrix = ReadMatrixValue;

std::string LinkName(const ChildCreation& link) {
  return std::string(link.LinkName, strnlen(link.LinkName, sizeof link.LinkName));
}

std::string TypeName(const ChildCreation& link) {
  return std::string(link.Type.TypeName, strnlen(link.Type.TypeName, sizeof link.Type.TypeName));
}

// The index of the link a key names: its name, or its index written in digits.
int FindLink(Qen_Channel* channel, const std::string& key, const DocPath& path) {
  const bool digits =
      !key.empty() && key.size() < 6 &&
      std::all_of(key.begin(), key.end(), [](unsigned char c) { return std::isdigit(c) != 0; });
  if (digits) {
    const int index = std::stoi(key);
    if (channel->GetChildCreation(index) == nullptr)
      throw SceneError(path, "no link at index " + key + " (" + TypeNameOf(channel) +
                                 " has links 0 to " +
                                 std::to_string(channel->GetChildCreationCount() - 1) + ")");
    return index;
  }
  const int index = channel->FindChildLinkByName(key);
  if (index >= 0) return index;
  std::string message = "unknown link name for " + TypeNameOf(channel);
  std::vector<std::string> names;
  for (int i = 0; i < channel->GetChildCreationCount(); ++i)
    if (const ChildCreation* link = channel->GetChildCreation(i)) names.push_back(LinkName(*link));
  const std::string suggestion = SuggestName(key, names);
  if (!suggestion.empty()) message += " (did you mean \"" + suggestion + "\"?)";
  if (!LinkReferences(TypeNameOf(channel)).empty())
    message += "; ape-render --list-links " + TypeNameOf(channel) + " lists them all";
  throw SceneError(path, message);
}

}  // namespace

void SceneBuilder::ConfigureLinks(Qen_Channel* channel, const Json& links, const DocPath& path) {
  if (!links.is_object()) ThrowExpected(path, "an object of links by name", links);
  for (const auto& item : links.items()) {
    const DocPath at = path.Key(item.key());
    const int index = FindLink(channel, item.key(), at);
    const ChildCreation& link = *channel->GetChildCreation(index);
    const bool many = link.LinkPosition == -1;
    if (many) {
      channel->ClearChild(index);
      // One channel may stand alone; several come as a list.
      if (!item.value().is_array()) {
        Link(channel, index, ResolveLinkValue(item.value(), at, link.Type.TypeGuid, TypeName(link)),
             true, at);
        continue;
      }
      for (std::size_t i = 0; i < item.value().size(); ++i)
        Link(channel, index,
             ResolveLinkValue(item.value()[i], at.Index(i), link.Type.TypeGuid, TypeName(link)),
             true, at.Index(i));
    } else if (Qen_Channel* converted =
                   ResolvePerSecond(channel, index, item.value(), at, links, path)) {
      Link(channel, index, converted, false, at);
    } else {
      Link(channel, index, ResolveLinkValue(item.value(), at, link.Type.TypeGuid, TypeName(link)),
           false, at);
    }
  }
}

void SceneBuilder::Link(Qen_Channel* owner, int index, Qen_Channel* child, bool many,
                        const DocPath& path) {
  if (child == nullptr) {
    if (!many) owner->SetChild(index, nullptr);
    return;
  }
  if (many ? owner->AddChild(index, child) : owner->SetChild(index, child)) {
    scene_->LinkSources.push_back({owner, index, child, path});
    return;
  }
  const ChildCreation& link = *owner->GetChildCreation(index);
  std::string what = "a channel (" + TypeNameOf(child) + ")";
  for (const Scene::NamedChannel& named : scene_->Named)
    if (named.Channel == child) what = "channel \"" + named.Name + "\" (" + TypeNameOf(child) + ")";
  throw SceneError(path,
                   what + " cannot be linked here: the link takes " + TypeName(link) + " channels");
}

Qen_Channel* SceneBuilder::NamedChannel(const std::string& name, const DocPath& path,
                                        const std::string& expected, const std::string& link_type) {
  if (Qen_Channel* channel = scene_->Find(name)) return channel;
  std::string message = expected.empty() ? "no channel is named \"" + name + "\""
                                         : "expected " + expected + ", got a string (\"" + name +
                                               "\" names no channel)";
  std::vector<std::string> names;
  for (const Scene::NamedChannel& named : scene_->Named) names.push_back(named.Name);
  const std::vector<std::string>& images = ProceduralImageNames();
  if (std::find(images.begin(), images.end(), name) != images.end()) {
    message += "; \"" + name + "\" is a built-in image: make a Texture channel of it, e.g. \"" +
               name + "\": {\"type\": \"Texture\", \"image\": \"" + name + "\"}";
    if (link_type == "Texture") message += ", or write {\"image\": \"" + name + "\"} here";
  } else if (const std::string suggestion = SuggestName(name, names); !suggestion.empty()) {
    message += " (did you mean \"" + suggestion + "\"?)";
  }
  throw SceneError(path, message);
}

Qen_Channel* SceneBuilder::MakeValueChannel(const Track<float>& track, const GUID& type,
                                            const std::string& type_name, const DocPath& path) {
  auto* channel = static_cast<Qen_ValueChannel*>(CreateByGuid(type, type_name, path));
  Remember(channel, "", path);
  RememberRange(channel, track);
  channel->SetValue(track.Sample(0.0));
  if (track.IsAnimated())
    scene_->Animators.push_back([channel, track](double t) { channel->SetValue(track.Sample(t)); });
  return channel;
}

Qen_Channel* SceneBuilder::MakeVectorChannel(const Track<D3DXVECTOR3>& track, const GUID& type,
                                             const std::string& type_name, const DocPath& path) {
  auto* channel = static_cast<Qen_ValueVectorChannel*>(CreateByGuid(type, type_name, path));
  Remember(channel, "", path);
  channel->SetVector(track.Sample(0.0));
  if (track.IsAnimated())
    scene_->Animators.push_back(
        [channel, track](double t) { channel->SetVector(track.Sample(t)); });
  return channel;
}

Qen_Channel* SceneBuilder::ResolveLinkValue(const Json& value, const DocPath& path,
                                            const GUID& type, const std::string& type_name) {
  if (value.is_null()) return nullptr;
  const bool inline_definition = value.is_object() && value.contains("type");
  if (type == kValueGuid && !value.is_string() && !inline_definition) {
    return MakeValueChannel(ReadTrack(value, path, kNumber), type, type_name, path);
  }
  if (type == kValueVectorGuid && !value.is_string() && !inline_definition) {
    return MakeVectorChannel(ReadTrack(value, path, kVector), type, type_name, path);
  }
  if (type == kMatrixGuid && !value.is_string() && !inline_definition) {
    const Track<MatrixValue> track = ReadTrack(value, path, kMatrix);
    auto* channel = static_cast<Qen_MatrixChannel*>(CreateByGuid(type, type_name, path));
    Remember(channel, "", path);
    channel->SetMatrix(track.Sample(0.0).Matrix);
    if (track.IsAnimated())
      scene_->Animators.push_back(
          [channel, track](double t) { channel->SetMatrix(track.Sample(t).Matrix); });
    return channel;
  }
  if (type == kEnvelopeStorageGuid && value.is_array()) {
    Qen_Channel* channel = CreateByGuid(type, type_name, path);
    Remember(channel, "", path);
    SetEnvelopeKeys(channel, value, path, "linear");
    return channel;
  }
  if (value.is_string()) {
    const char* expected = type == kValueGuid             ? "a number"
                           : type == kValueVectorGuid     ? "a 3-vector [x, y, z]"
                           : type == kMatrixGuid          ? "a 4x4 matrix or a transform object"
                           : type == kEnvelopeStorageGuid ? "a list of keys [[x, y], ...]"
                                                          : "";
    return NamedChannel(value.get<std::string>(), path, expected, type_name);
  }
  return ResolveChannel(value, path, type, type_name);
}

Qen_Channel* SceneBuilder::ResolveChannel(const Json& value, const DocPath& path, const GUID& type,
                                          const std::string& type_name) {
  if (value.is_string()) {
    Qen_Channel* channel = NamedChannel(value.get<std::string>(), path, "", type_name);
    const ChannelType record = channel->GetChannelType();
    if (!(record.TypeGuid == type) && !(record.BaseTypeGuid == type))
      throw SceneError(path, "channel \"" + value.get<std::string>() + "\" (" +
                                 TypeNameOf(channel) + ") is not a " + type_name + " channel");
    return channel;
  }
  if (!value.is_object())
    ThrowExpected(path, "the name of a " + type_name + " channel or a " + type_name + " definition",
                  value);
  Qen_Channel* channel;
  if (const Json* written = Find(value, "type")) {
    channel = CreateByName(ReadString(*written, path.Key("type")), path.Key("type"));
  } else {
    channel = CreateByGuid(type, type_name, path);
  }
  Remember(channel, "", path);
  Configure(channel, value, path);
  return channel;
}

}  // namespace apescene
