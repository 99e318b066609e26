#include "tools/scene/scene_loader.h"

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <sstream>

#include "host/link_channels.h"
#include "host/plugin_loader.h"
#include "tools/scene/json_locator.h"
#include "tools/scene/name_suggestions.h"
#include "tools/scene/scene_builder.h"
#include "tools/scene/scene_check.h"
#include "tools/scene/scene_error.h"

namespace apescene {
namespace {

// "parse error at line 3, column 12: syntax error while parsing object - unexpected '}'" keeps
// what follows the position, which the caller writes its own way.
std::string SyntaxDetail(const char* what) {
  const std::string text = what;
  const std::size_t column = text.find("column ");
  const std::size_t colon = column == std::string::npos ? column : text.find(": ", column);
  return colon == std::string::npos ? text : text.substr(colon + 2);
}

// "[json.exception.out_of_range.406] number overflow parsing '1e400'" without its tag.
std::string WithoutTag(const char* what) {
  const std::string text = what;
  const std::size_t tag_end = text.find("] ");
  return text.compare(0, 1, "[") == 0 && tag_end != std::string::npos ? text.substr(tag_end + 2)
                                                                      : text;
}

std::string WithLine(const std::string& name, int line) {
  return line > 0 ? name + ":" + std::to_string(line) : name;
}

// The message as one line: control characters (a newline in a channel name or a string value,
// say) are written as escapes.
std::string OneLine(const std::string& text) {
  std::string line;
  for (const char c : text) {
    const auto byte = static_cast<unsigned char>(c);
    if (c == '\n') {
      line += "\\n";
    } else if (byte < 0x20 || byte == 0x7F) {
      static constexpr char kHex[] = "0123456789ABCDEF";
      line += "\\x";
      line += kHex[byte >> 4];
      line += kHex[byte & 0xF];
    } else {
      line += c;
    }
  }
  return line;
}

}  // namespace

GUID TypeGuidOf(Qen_Channel* channel) {
  return channel->GetChannelType().TypeGuid;
}

std::string TypeNameOf(Qen_Channel* channel) {
  const ChannelType type = channel->GetChannelType();
  return std::string(type.TypeName, strnlen(type.TypeName, sizeof type.TypeName));
}

SceneBuilder::SceneBuilder(Scene* scene, PluginLoader* loader, std::string base_directory)
    : scene_(scene), loader_(loader), base_directory_(std::move(base_directory)) {}

void SceneBuilder::BuildSettings(const Json& root) {
  CheckObject(root, DocPath(),
              {"description", "resolution", "fps", "duration", "frames", "seed", "background",
               "camera", "channels"});
  if (const Json* description = Find(root, "description"))
    ReadString(*description, DocPath().Key("description"));
  ReadSettings(root);
}

void SceneBuilder::Build(const Json& root) {
  const DocPath path;
  BuildSettings(root);
  types_ = LoadPluginTypes(*loader_);
  if (const Json* camera = Find(root, "camera")) ReadCamera(*camera, path.Key("camera"));

  // The camera eye is a channel of its own, so that emitters can face it.
  auto eye = std::make_unique<Qen_ValueVectorChannel>(scene_->View.Eye.Sample(0.0));
  scene_->CameraEye = eye.get();
  scene_->Named.push_back({kCameraEyeChannelName, eye.get()});
  scene_->Channels.push_back(std::move(eye));

  if (const Json* channels = Find(root, "channels")) ReadChannels(*channels, path.Key("channels"));
  scene_->Animate(0.0);
}

void SceneBuilder::ReadSettings(const Json& root) {
  RenderSettings& settings = scene_->Settings;
  const DocPath path;
  if (const Json* resolution = Find(root, "resolution")) {
    const DocPath at = path.Key("resolution");
    if (!resolution->is_array() || resolution->size() != 2)
      ThrowExpected(at, "[width, height] in pixels", *resolution);
    settings.Width = ReadInteger((*resolution)[0], at.Index(0), 1, 8192);
    settings.Height = ReadInteger((*resolution)[1], at.Index(1), 1, 8192);
  }
  if (const Json* fps = Find(root, "fps")) {
    settings.Fps = ReadNumber(*fps, path.Key("fps"));
    if (!(settings.Fps > 0.0 && settings.Fps <= 1000.0))
      throw SceneError(path.Key("fps"),
                       "expected frames per second from above 0 to 1000, got " + fps->dump());
  }
  const Json* duration = Find(root, "duration");
  const Json* frames = Find(root, "frames");
  if (duration != nullptr && frames != nullptr)
    throw SceneError(path.Key("frames"), "give either \"duration\" or \"frames\", not both");
  if (duration != nullptr) {
    settings.DurationSeconds = ReadNumber(*duration, path.Key("duration"));
    if (!(settings.DurationSeconds > 0.0 && settings.DurationSeconds <= 3600.0))
      throw SceneError(path.Key("duration"),
                       "expected seconds from above 0 to 3600, got " + duration->dump());
  }
  if (frames != nullptr) settings.Frames = ReadInteger(*frames, path.Key("frames"), 1, 1'000'000);
  if (const Json* seed = Find(root, "seed"))
    settings.Seed = static_cast<unsigned>(ReadInteger(*seed, path.Key("seed"), 0, 2147483647));
  if (const Json* background = Find(root, "background"))
    settings.Background = ReadColor(*background, path.Key("background")) | 0xFF000000u;
}

void SceneBuilder::ReadCamera(const Json& camera, const DocPath& path) {
  CheckObject(camera, path, {"eye", "target", "up", "fov", "near", "far"});
  Camera& view = scene_->View;
  const std::function<D3DXVECTOR3(const Json&, const DocPath&)> vector = ReadVector3;
  if (const Json* eye = Find(camera, "eye")) view.Eye = ReadTrack(*eye, path.Key("eye"), vector);
  if (const Json* target = Find(camera, "target"))
    view.Target = ReadTrack(*target, path.Key("target"), vector);
  if (const Json* up = Find(camera, "up")) view.Up = ReadVector3(*up, path.Key("up"));
  if (const Json* fov = Find(camera, "fov")) {
    view.FovDegrees = ReadNumber(*fov, path.Key("fov"));
    if (!(view.FovDegrees >= 1.0f && view.FovDegrees <= 179.0f))
      throw SceneError(
          path.Key("fov"),
          "expected a vertical field of view from 1 to 179 degrees, got " + fov->dump());
  }
  if (const Json* near = Find(camera, "near")) view.Near = ReadNumber(*near, path.Key("near"));
  if (const Json* far = Find(camera, "far")) view.Far = ReadNumber(*far, path.Key("far"));
  if (!(view.Near > 0.0f)) throw SceneError(path.Key("near"), "expected a near distance above 0");
  if (!(view.Far > view.Near))
    throw SceneError(path.Key("far"), "expected a far distance beyond the near one");
  const D3DXVECTOR3 sight = view.Target.Sample(0.0) - view.Eye.Sample(0.0);
  if (D3DXVec3Length(&sight) == 0.0f)
    throw SceneError(path.Key("target"), "the camera's target lies on its eye");
}

void SceneBuilder::ReadChannels(const Json& channels, const DocPath& path) {
  if (!channels.is_object()) ThrowExpected(path, "an object of named channels", channels);
  // First every named channel exists, so that links may name channels defined further down.
  std::vector<std::pair<Qen_Channel*, const Json*>> made;
  for (const auto& item : channels.items()) {
    const DocPath at = path.Key(item.key());
    if (item.key().empty()) throw SceneError(at, "a channel needs a name");
    if (item.key() == kCameraEyeChannelName)
      throw SceneError(at, std::string("the name \"") + kCameraEyeChannelName +
                               "\" is reserved for the camera's eye position");
    if (!item.value().is_object())
      ThrowExpected(at, "a channel definition object {\"type\": ...}", item.value());
    const std::string type = ReadString(Require(item.value(), at, "type"), at.Key("type"));
    Qen_Channel* channel = CreateByName(type, at.Key("type"));
    channel->SetChannelName(item.key().c_str());
    Remember(channel, item.key(), at);
    scene_->Named.push_back({item.key(), channel});
    made.emplace_back(channel, &item.value());
  }
  std::size_t i = 0;
  for (const auto& item : channels.items()) {
    Configure(made[i].first, *made[i].second, path.Key(item.key()));
    ++i;
  }
}

Qen_Channel* SceneBuilder::CreateByName(const std::string& type_name, const DocPath& type_path) {
  std::string error;
  Qen_Channel* channel = nullptr;
  for (const std::string& known : types_.TypeNames)
    if (known == type_name) channel = loader_->CreateChannelByName(type_name, &error);
  if (channel == nullptr) {
    if (!error.empty()) throw SceneError(type_path, error);
    std::string known;
    for (const std::string& name : types_.TypeNames) known += (known.empty() ? "" : ", ") + name;
    std::string message = "unknown channel type \"" + type_name + "\"";
    if (const std::string suggestion = SuggestName(type_name, types_.TypeNames);
        !suggestion.empty())
      message += "; did you mean \"" + suggestion + "\"?";
    message += " (known: " + known + ")";
    for (const std::string& problem : types_.Problems) message += "; " + problem;
    throw SceneError(type_path, message);
  }
  scene_->Channels.emplace_back(channel);
  return channel;
}

Qen_Channel* SceneBuilder::CreateByGuid(const GUID& type, const std::string& type_name,
                                        const DocPath& path) {
  std::string error;
  Qen_Channel* channel = loader_->CreateChannel(type, &error);
  if (channel == nullptr)
    throw SceneError(path, "cannot create a \"" + type_name + "\" channel: " + error);
  scene_->Channels.emplace_back(channel);
  return channel;
}

void SceneBuilder::Remember(const Qen_Channel* channel, const std::string& name,
                            const DocPath& path) {
  scene_->ChannelSources.push_back({channel, name, path});
}

void SceneBuilder::RememberRange(const Qen_Channel* channel, const Track<float>& track) {
  if (!track.IsAnimated()) return;
  for (Scene::ChannelSource& source : scene_->ChannelSources) {
    if (source.Channel != channel) continue;
    source.Animated = true;
    source.Least = source.Greatest = track.Keys.front().Value;
    for (const auto& key : track.Keys) {
      source.Least = std::min(source.Least, key.Value);
      source.Greatest = std::max(source.Greatest, key.Value);
    }
  }
}

std::string SceneBuilder::ResolveFile(const std::string& relative) const {
  const std::filesystem::path file(relative);
  if (file.is_absolute() || base_directory_.empty()) return file.string();
  return (std::filesystem::path(base_directory_) / file).string();
}

namespace {

// Parses the text and runs `build` on it, turning every fault into one line of *error.
template <typename Build>
bool Run(const SceneSource& source, std::string* error, Build build) {
  Json root;
  try {
    root = Json::parse(source.Text, nullptr, true, /*ignore_comments=*/true);
  } catch (const Json::parse_error& e) {
    int line = 0, column = 0;
    JsonLocator::LineAndColumn(source.Text, e.byte == 0 ? 0 : e.byte - 1, &line, &column);
    *error = OneLine(source.DisplayName + ":" + std::to_string(line) + ":" +
                     std::to_string(column) + ": " + SyntaxDetail(e.what()));
    return false;
  } catch (const Json::exception& e) {
    // Faults the parser gives no position, such as a number beyond the range of a double.
    *error = OneLine(source.DisplayName + ": " + WithoutTag(e.what()));
    return false;
  }
  const JsonLocator locator(source.Text);
  if (locator.TooDeep()) {
    *error = source.DisplayName + ": the document nests deeper than " +
             std::to_string(JsonLocator::kMaximumDepth) + " levels";
    return false;
  }
  try {
    if (locator.HasDuplicateKey())
      throw SceneError(locator.DuplicateKey(), "this key is given twice in the same object");
    build(root, locator);
  } catch (const SceneError& e) {
    const std::string where = WithLine(source.DisplayName, locator.LineOf(e.Path()));
    *error = OneLine(where + ": " + (e.Path().IsRoot() ? "" : e.Path().Text() + ": ") + e.what());
    return false;
  } catch (const std::exception& e) {
    *error = OneLine(source.DisplayName + ": " + e.what());
    return false;
  }
  return true;
}

}  // namespace

std::unique_ptr<Scene> LoadScene(const SceneSource& source, PluginLoader& loader,
                                 std::string* error) {
  auto scene = std::make_unique<Scene>();
  scene->SourceName = source.DisplayName;
  const bool ok = Run(source, error, [&](const Json& root, const JsonLocator& locator) {
    SceneBuilder(scene.get(), &loader, source.BaseDirectory).Build(root);
    for (Scene::ChannelSource& place : scene->ChannelSources)
      place.Line = locator.LineOf(place.Path);
    for (Scene::LinkSource& place : scene->LinkSources) place.Line = locator.LineOf(place.Path);
    for (SceneWarning& warning : scene->LoadWarnings) warning.Line = locator.LineOf(warning.Path);
    scene->Warnings = CheckScene(*scene);
  });
  return ok ? std::move(scene) : nullptr;
}

bool ReadSceneSettings(const SceneSource& source, RenderSettings* settings, std::string* error) {
  Scene scene;
  const bool ok = Run(source, error, [&](const Json& root, const JsonLocator&) {
    SceneBuilder(&scene, nullptr, source.BaseDirectory).BuildSettings(root);
  });
  if (ok) *settings = scene.Settings;
  return ok;
}

bool ReadSceneFile(const std::string& path, SceneSource* source, std::string* error) {
  std::error_code ec;
  if (std::filesystem::is_directory(path, ec)) {
    *error = path + ": is a folder, not a scene file";
    return false;
  }
  std::ifstream file(path, std::ios::binary);
  if (!file) {
    *error = path + ": cannot open the scene file (" + std::strerror(errno) + ")";
    return false;
  }
  std::ostringstream text;
  text << file.rdbuf();
  if (file.bad()) {
    *error = path + ": cannot read the scene file";
    return false;
  }
  source->Text = text.str();
  source->DisplayName = path;
  source->BaseDirectory = std::filesystem::path(path).parent_path().string();
  return true;
}

std::unique_ptr<Scene> LoadSceneFile(const std::string& path, PluginLoader& loader,
                                     std::string* error) {
  SceneSource source;
  if (!ReadSceneFile(path, &source, error)) return nullptr;
  return LoadScene(source, loader, error);
}

}  // namespace apescene
