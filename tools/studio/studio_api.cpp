#include "tools/studio/studio_api.h"

#include <cmath>

#include "tools/studio/edit_rules.h"
#include "tools/studio/web_assets.h"

namespace apestudio {
namespace {

using apescene::Json;

std::string Dump(const Json& value) {
  return value.dump(-1, ' ', false, Json::error_handler_t::replace);
}

HttpResponse JsonResponse(int status, const Json& body) {
  return {status, "application/json", Dump(body), false};
}

HttpResponse Error(int status, const std::string& message) {
  return JsonResponse(status, {{"ok", false}, {"error", message}});
}

// How deeply the text's arrays and objects nest (strings skipped); stops counting past `limit`.
int NestingDepth(const std::string& text, int limit) {
  int depth = 0, deepest = 0;
  bool in_string = false, escaped = false;
  for (const char c : text) {
    if (in_string) {
      if (escaped) {
        escaped = false;
      } else if (c == '\\') {
        escaped = true;
      } else if (c == '"') {
        in_string = false;
      }
    } else if (c == '"') {
      in_string = true;
    } else if (c == '[' || c == '{') {
      deepest = std::max(deepest, ++depth);
      if (deepest > limit) return deepest;
    } else if (c == ']' || c == '}') {
      --depth;
    }
  }
  return deepest;
}

// A finite 3-vector within the studio's range.
bool ReadVector(const Json& value, D3DXVECTOR3* vector) {
  if (!value.is_array() || value.size() != 3) return false;
  float parts[3];
  for (int i = 0; i < 3; ++i) {
    if (!value[i].is_number()) return false;
    const double number = value[i].get<double>();
    if (!std::isfinite(number) || std::fabs(number) > kMaximumMagnitude) return false;
    parts[i] = static_cast<float>(number);
  }
  *vector = D3DXVECTOR3(parts[0], parts[1], parts[2]);
  return true;
}

const Json* Member(const Json& body, const char* key) {
  if (!body.is_object()) return nullptr;
  const auto found = body.find(key);
  return found == body.end() ? nullptr : &*found;
}

std::string StringMember(const Json& body, const char* key) {
  const Json* member = Member(body, key);
  return member != nullptr && member->is_string() ? member->get<std::string>() : "";
}

std::string WithToken(std::string_view page, const std::string& token) {
  std::string text(page);
  const std::string mark = "{{TOKEN}}";
  for (std::size_t at = text.find(mark); at != std::string::npos; at = text.find(mark, at))
    text.replace(at, mark.size(), token);
  return text;
}

}  // namespace

StudioApi::StudioApi(StudioEngine& engine, const RequestGuard& guard, std::string chart_js)
    : engine_(engine), guard_(guard), chart_js_(std::move(chart_js)) {}

HttpResponse StudioApi::Handle(const HttpRequest& request) {
  try {
    const auto query_token = request.Query.find("token");
    const std::string token = !request.TokenHeader.empty()         ? request.TokenHeader
                              : query_token != request.Query.end() ? query_token->second
                                                                   : "";
    if (const std::string refusal = guard_.Refusal(token, request.Host, request.Origin);
        !refusal.empty())
      return Error(403, refusal);
    if (request.Body.size() > kMaximumBodyBytes) return Error(413, "the request is too large");
    return Route(request);
  } catch (const std::exception& e) {
    return Error(500, std::string("the studio failed: ") + e.what());
  }
}

HttpResponse StudioApi::Route(const HttpRequest& request) {
  const std::string& path = request.Path;
  if (request.Method == "GET") {
    if (path == "/" || path == "/index.html")
      return {200, "text/html; charset=utf-8", WithToken(IndexHtml(), guard_.Token()), false};
    if (path == "/studio.js")
      return {200, "text/javascript; charset=utf-8", std::string(StudioJs()), false};
    if (path == "/studio.css")
      return {200, "text/css; charset=utf-8", std::string(StudioCss()), false};
    if (path == "/chart.js") {
      if (chart_js_.empty()) return Error(404, "the charting library is not installed");
      return {200, "text/javascript; charset=utf-8", chart_js_, false};
    }
    if (path == "/api/stream") return {200, "", "", true};
    Json body;
    if (path == "/api/state") {
      engine_.Call([&] { body = engine_.State(); });
    } else if (path == "/api/inspector") {
      engine_.Call([&] { body = engine_.Inspector(); });
    } else if (path == "/api/document") {
      engine_.Call([&] { body = engine_.Document(); });
    } else if (path == "/api/export") {
      engine_.Call([&] { body = engine_.ExportProgress(); });
    } else if (path == "/api/frame") {
      PublishedFrame frame;
      if (!engine_.WaitFrame(0, std::chrono::milliseconds(0), &frame))
        return Error(503, "no frame yet");
      return {200, "image/jpeg", frame.Jpeg, false};
    } else {
      return Error(404, "no such page");
    }
    return JsonResponse(200, body);
  }
  if (request.Method != "POST") return Error(405, "only GET and POST are answered");
  if (NestingDepth(request.Body, kMaximumBodyDepth) > kMaximumBodyDepth)
    return Error(400, "the request's JSON nests too deeply");
  Json body;
  try {
    body = request.Body.empty() ? Json::object() : Json::parse(request.Body);
  } catch (const Json::exception& e) {
    return Error(400, std::string("malformed JSON: ") + e.what());
  }
  if (!body.is_object()) return Error(400, "the request's body must be a JSON object");
  return Post(path, body);
}

HttpResponse StudioApi::Post(const std::string& path, const Json& body) {
  Outcome outcome;
  Json extra = Json::object();
  const auto run = [&](const std::function<Outcome()>& work) {
    engine_.Call([&] {
      outcome = work();
      extra["state"] = engine_.State();
    });
  };
  if (path == "/api/edit") {
    const Json* edit_path = Member(body, "path");
    const Json* value = Member(body, "value");
    if (edit_path == nullptr || value == nullptr)
      return Error(400, "an edit needs \"path\" and \"value\"");
    run([&] { return engine_.Edit(*edit_path, *value); });
    extra["path"] = *edit_path;
  } else if (path == "/api/undo") {
    run([&] { return engine_.Undo(); });
  } else if (path == "/api/redo") {
    run([&] { return engine_.Redo(); });
  } else if (path == "/api/play") {
    const Json* playing = Member(body, "playing");
    if (playing == nullptr || !playing->is_boolean())
      return Error(400, "expected {\"playing\": true or false}");
    run([&] {
      engine_.SetPlaying(playing->get<bool>());
      return Outcome{};
    });
  } else if (path == "/api/step") {
    run([&] { return engine_.Step(); });
  } else if (path == "/api/restart") {
    run([&] { return engine_.Restart(); });
  } else if (path == "/api/seek") {
    const Json* frame = Member(body, "frame");
    if (frame == nullptr || !frame->is_number_integer() || frame->get<double>() < 1 ||
        frame->get<double>() > kMaximumFrames)
      return Error(400, "expected {\"frame\": a whole number from 1}");
    run([&] { return engine_.Seek(frame->get<int>()); });
  } else if (path == "/api/view") {
    const Json* reset = Member(body, "reset");
    if (reset != nullptr && reset->is_boolean() && reset->get<bool>()) {
      run([&] { return engine_.ResetView(); });
    } else {
      D3DXVECTOR3 eye, target;
      const Json* eye_json = Member(body, "eye");
      const Json* target_json = Member(body, "target");
      if (eye_json == nullptr || target_json == nullptr || !ReadVector(*eye_json, &eye) ||
          !ReadVector(*target_json, &target))
        return Error(400, "expected {\"eye\": [x, y, z], \"target\": [x, y, z]} of finite numbers");
      const D3DXVECTOR3 sight = target - eye;
      if (!(D3DXVec3Length(&sight) > 1e-4f)) return Error(400, "the eye lies on the target");
      run([&] { return engine_.SetView(eye, target); });
    }
  } else if (path == "/api/save") {
    run([&] { return engine_.Save(StringMember(body, "name")); });
  } else if (path == "/api/open") {
    run([&] { return engine_.OpenFile(StringMember(body, "name")); });
  } else if (path == "/api/export") {
    run([&] { return engine_.StartExport(StringMember(body, "folder")); });
  } else {
    return Error(404, "no such request");
  }
  extra["ok"] = outcome.Ok;
  if (!outcome.Ok) extra["error"] = outcome.Message;
  return JsonResponse(outcome.Ok ? 200 : 422, extra);
}

}  // namespace apestudio
