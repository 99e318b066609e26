// The studio's HTTP interface without the sockets: a request in, a response out. Every request
// passes the RequestGuard first; bodies are JSON of limited size and depth; each answer is JSON
// except the page's files and the pictures. The server (studio_server.cpp) and the fuzzer feed
// it the same way.
#pragma once

#include <cstddef>
#include <map>
#include <string>

#include "tools/studio/request_guard.h"
#include "tools/studio/studio_engine.h"

namespace apestudio {

struct HttpRequest {
  std::string Method;  // "GET", "POST"...
  std::string Path;    // without the query
  std::map<std::string, std::string> Query;
  std::string Host;
  std::string Origin;
  std::string TokenHeader;  // X-Studio-Token
  std::string Body;
};

struct HttpResponse {
  int Status = 200;
  std::string ContentType = "application/json";
  std::string Body;
  bool FrameStream = false;  // the server streams the frames instead of sending Body
};

class StudioApi {
 public:
  // Request bodies larger than this are refused (the server's own limit is the same).
  static constexpr std::size_t kMaximumBodyBytes = 1 << 20;
  // JSON bodies nesting deeper than this are refused before they are parsed.
  static constexpr int kMaximumBodyDepth = 64;

  // `chart_js` is the charting library's text, served as /chart.js (empty: not found).
  StudioApi(StudioEngine& engine, const RequestGuard& guard, std::string chart_js);

  HttpResponse Handle(const HttpRequest& request);

 private:
  HttpResponse Route(const HttpRequest& request);
  HttpResponse Post(const std::string& path, const apescene::Json& body);

  StudioEngine& engine_;
  const RequestGuard& guard_;
  std::string chart_js_;
};

}  // namespace apestudio
