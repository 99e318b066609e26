#include "fuzz/studio_request.h"

#include <unistd.h>

#include <algorithm>
#include <filesystem>
#include <functional>

#include "host/plugin_loader.h"
#include "tools/studio/studio_api.h"

namespace apefuzz {
namespace {

using apescene::Json;
namespace fs = std::filesystem;

constexpr int kMaximumRequests = 16;
constexpr int kMaximumSeekFrame = 240;
constexpr double kMaximumHeavyValue = 2000.0;
constexpr char kToken[] = "0123456789abcdef0123456789abcdef";
constexpr char kHost[] = "127.0.0.1:8000";

PluginLoader& Loader() {
  static PluginLoader loader;
  return loader;
}

// The process's scratch folder, emptied for every script.
const fs::path& Scratch() {
  static const fs::path folder = [] {
    std::string pattern = (fs::temp_directory_path() / "ape-fuzz-studio-XXXXXX").string();
    return mkdtemp(pattern.data()) != nullptr ? fs::path(pattern) : fs::temp_directory_path();
  }();
  return folder;
}

// Whether the request would make the studio do more work than one input should.
bool TooHeavy(const std::string& path, const std::string& body) {
  Json json;
  try {
    json = Json::parse(body);
  } catch (const std::exception&) {
    return false;  // refused by the studio anyway
  }
  if (!json.is_object()) return false;
  if (path == "/api/seek") {
    const auto frame = json.find("frame");
    return frame != json.end() && frame->is_number() && frame->get<double>() > kMaximumSeekFrame;
  }
  if (path != "/api/edit") return false;
  const auto edit_path = json.find("path");
  const auto value = json.find("value");
  if (edit_path == json.end() || !edit_path->is_array() || edit_path->empty()) return false;
  const Json& first = edit_path->front();
  if (first == "frames" || first == "duration" || first == "fps") return true;
  if (value == json.end()) return false;
  // A heavy link written anywhere in the value (a whole links object, say).
  const std::string text = json.dump();
  for (const char* heavy : {"ParticleCount", "Births Per Second", "Logic Updates Per Second"})
    if (text.find(heavy) != std::string::npos) {
      bool big = false;
      std::function<void(const Json&)> scan = [&](const Json& v) {
        if (v.is_number() && v.get<double>() > kMaximumHeavyValue) big = true;
        if (v.is_structured())
          for (const Json& item : v) scan(item);
      };
      scan(*value);
      if (big) return true;
    }
  return false;
}

bool IsJson(const std::string& text) {
  return Json::accept(text);
}

}  // namespace

StudioOutcome RunStudioRequests(const std::uint8_t* data, std::size_t size,
                                const std::string& scene_directory) {
  StudioOutcome outcome;
  std::error_code ec;
  for (const auto& entry : fs::directory_iterator(Scratch(), ec)) fs::remove_all(entry.path(), ec);
  fs::copy_file(fs::path(scene_directory) / "fountain.json", Scratch() / "fountain.json",
                fs::copy_options::overwrite_existing, ec);

  apestudio::StudioOptions options;
  std::string error;
  if (!apescene::ReadSceneFile((Scratch() / "fountain.json").string(), &options.Source, &error)) {
    outcome.Fault = "the fountain cannot be read: " + error;
    return outcome;
  }
  options.Folder = Scratch().string();
  options.SaveName = "fountain.json";
  options.DeviceKind = "null";
  options.Loader = &Loader();
  apestudio::StudioEngine engine(options);
  if (!engine.Open(&error)) {
    outcome.Fault = "the fountain does not open: " + error;
    return outcome;
  }
  engine.SetPlaying(false);
  const apestudio::RequestGuard guard(kToken, {"127.0.0.1"}, 8000);
  apestudio::StudioApi api(engine, guard, "");

  const std::string input(reinterpret_cast<const char*>(data), size);
  std::size_t start = 0;
  while (start <= input.size() && outcome.Requests < kMaximumRequests) {
    std::size_t end = input.find('\n', start);
    if (end == std::string::npos) end = input.size();
    std::string line = input.substr(start, end - start);
    start = end + 1;
    apestudio::HttpRequest request;
    request.Host = kHost;
    request.TokenHeader = kToken;
    bool authorised = true;
    while (!line.empty() && (line[0] == '!' || line[0] == '@' || line[0] == '~')) {
      if (line[0] == '!') request.TokenHeader.clear();
      if (line[0] == '@') request.Host = "attacker.example:8000";
      if (line[0] == '~') request.Origin = "http://attacker.example";
      authorised = false;
      line.erase(0, 1);
    }
    const std::size_t method_end = line.find(' ');
    if (method_end == std::string::npos) continue;
    request.Method = line.substr(0, method_end);
    const std::size_t path_end = line.find(' ', method_end + 1);
    request.Path =
        line.substr(method_end + 1,
                    path_end == std::string::npos ? std::string::npos : path_end - method_end - 1);
    if (path_end != std::string::npos) request.Body = line.substr(path_end + 1);
    if (request.Path == "/api/stream") continue;  // the server's, not the handler's
    if (TooHeavy(request.Path, request.Body)) continue;

    const Json before = engine.Document();
    const apestudio::HttpResponse response = api.Handle(request);
    ++outcome.Requests;
    const int status = response.Status;
    const std::string what = request.Method + " " + request.Path + ": ";
    if (status == 500) {
      outcome.Fault = what + "the studio failed: " + response.Body;
      return outcome;
    }
    if (!authorised && status != 403) {
      outcome.Fault = what + "answered " + std::to_string(status) +
                      " without the studio's token, "
                      "Host or Origin";
      return outcome;
    }
    static const int kKnown[] = {200, 400, 403, 404, 405, 413, 422, 503};
    if (std::find(std::begin(kKnown), std::end(kKnown), status) == std::end(kKnown)) {
      outcome.Fault = what + "an unexpected status " + std::to_string(status);
      return outcome;
    }
    const bool json = response.ContentType == "application/json";
    if (json && !IsJson(response.Body)) {
      outcome.Fault = what + "an answer that is not JSON";
      return outcome;
    }
    // Only what succeeded may change the scene (a refused edit, undo or open leaves it).
    if (status != 200 && engine.Document() != before) {
      outcome.Fault = what + "refused, yet the scene changed";
      return outcome;
    }
    if (status == 200) ++outcome.Accepted;
    engine.Tick();
  }
  return outcome;
}

}  // namespace apefuzz
