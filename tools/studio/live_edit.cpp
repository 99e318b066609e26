#include "tools/studio/live_edit.h"

#include <algorithm>
#include <cctype>

#include "host/envelope_storage.h"
#include "host/link_channels.h"
#include "host/qen_channel.h"
#include "host/type_guids.h"

namespace apestudio {
namespace {

using apescene::Json;

// The tokens of a JSON pointer ("/channels/sparks/links/Births Per Second/0").
std::vector<std::string> PointerTokens(const std::string& pointer) {
  std::vector<std::string> tokens;
  std::size_t start = 1;
  while (start <= pointer.size()) {
    std::size_t end = pointer.find('/', start);
    if (end == std::string::npos) end = pointer.size();
    std::string token = pointer.substr(start, end - start);
    std::string plain;
    for (std::size_t i = 0; i < token.size(); ++i) {
      if (token[i] == '~' && i + 1 < token.size()) {
        plain += token[i + 1] == '1' ? '/' : '~';
        ++i;
      } else {
        plain += token[i];
      }
    }
    tokens.push_back(plain);
    start = end + 1;
  }
  return tokens;
}

// A value that builds an inline channel with nothing animated: a number, a list (vector, matrix
// rows, envelope keys), or a transform object. Objects with "keys" (animation, or an envelope
// written as an object) are left to a fresh build.
bool InlineValue(const Json& value) {
  if (value.is_number() || value.is_array()) return true;
  return value.is_object() && !value.contains("type") && !value.contains("keys");
}

const Json* LinkValue(const Json& root, const LinkPlace& place) {
  const auto channels = root.find("channels");
  if (channels == root.end() || !channels->is_object()) return nullptr;
  const auto channel = channels->find(place.Channel);
  if (channel == channels->end() || !channel->is_object()) return nullptr;
  const auto links = channel->find("links");
  if (links == channel->end() || !links->is_object()) return nullptr;
  const auto value = links->find(place.LinkKey);
  return value == links->end() ? nullptr : &*value;
}

int LinkIndex(Qen_Channel* channel, const std::string& key) {
  const bool digits =
      !key.empty() && key.size() < 6 &&
      std::all_of(key.begin(), key.end(), [](unsigned char c) { return std::isdigit(c) != 0; });
  return digits ? std::stoi(key) : channel->FindChildLinkByName(key);
}

}  // namespace

bool FindLiveEditableChange(const Json& before, const Json& after, LinkPlace* place) {
  const Json patch = Json::diff(before, after);
  if (patch.empty()) return false;
  bool first = true;
  for (const Json& operation : patch) {
    const std::vector<std::string> tokens = PointerTokens(operation.at("path").get<std::string>());
    if (tokens.size() < 4 || tokens[0] != "channels" || tokens[2] != "links") return false;
    if (first) {
      *place = {tokens[1], tokens[3]};
      first = false;
    } else if (tokens[1] != place->Channel || tokens[3] != place->LinkKey) {
      return false;
    }
  }
  const Json* old_value = LinkValue(before, *place);
  const Json* new_value = LinkValue(after, *place);
  if (old_value == nullptr || new_value == nullptr) return false;
  return InlineValue(*old_value) && InlineValue(*new_value);
}

bool CopyLinkValue(const apescene::Scene& source, apescene::Scene& live, const LinkPlace& place) {
  Qen_Channel* from_owner = source.Find(place.Channel);
  Qen_Channel* to_owner = live.Find(place.Channel);
  if (from_owner == nullptr || to_owner == nullptr) return false;
  const int index = LinkIndex(to_owner, place.LinkKey);
  const ChildCreation* link = to_owner->GetChildCreation(index);
  if (link == nullptr || link->LinkPosition == -1) return false;
  Qen_Channel* from = from_owner->GetChild(index);
  Qen_Channel* to = to_owner->GetChild(index);
  if (from == nullptr || to == nullptr) return false;
  const GUID type = link->Type.TypeGuid;
  if (!(from->GetChannelType().TypeGuid == type) || !(to->GetChannelType().TypeGuid == type))
    return false;
  // A shared channel would carry the change to other links too.
  for (const apescene::Scene::NamedChannel& named : live.Named)
    if (named.Channel == to) return false;
  if (type == kValueGuid) {
    static_cast<Qen_ValueChannel*>(to)->SetValue(static_cast<Qen_ValueChannel*>(from)->GetValue());
  } else if (type == kValueVectorGuid) {
    static_cast<Qen_ValueVectorChannel*>(to)->SetVector(
        static_cast<Qen_ValueVectorChannel*>(from)->GetVector());
  } else if (type == kMatrixGuid) {
    static_cast<Qen_MatrixChannel*>(to)->SetMatrix(
        static_cast<Qen_MatrixChannel*>(from)->GetMatrix());
  } else if (type == kEnvelopeStorageGuid) {
    static_cast<Tev_EnvelopeStorage*>(to)->SetKeys(
        static_cast<Tev_EnvelopeStorage*>(from)->GetKeys());
  } else {
    return false;
  }
  return true;
}

}  // namespace apestudio
