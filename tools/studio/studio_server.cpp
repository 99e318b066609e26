#include "tools/studio/studio_server.h"

#include <httplib.h>

namespace apestudio {
namespace {

constexpr char kBoundary[] = "apestudioframe";
// How long a stream waits for a frame before it checks whether its reader is still there.
constexpr std::chrono::milliseconds kStreamPoll{500};

HttpRequest Convert(const httplib::Request& request) {
  HttpRequest converted;
  converted.Method = request.method;
  converted.Path = request.path;
  for (const auto& [key, value] : request.params) converted.Query.emplace(key, value);
  converted.Host = request.get_header_value("Host");
  converted.Origin = request.get_header_value("Origin");
  converted.TokenHeader = request.get_header_value("X-Studio-Token");
  converted.Body = request.body;
  return converted;
}

}  // namespace

StudioServer::StudioServer(StudioEngine& engine, StudioApi& api)
    : engine_(engine), api_(api), server_(std::make_unique<httplib::Server>()) {
  server_->set_payload_max_length(StudioApi::kMaximumBodyBytes);
  server_->set_read_timeout(5, 0);
  server_->set_write_timeout(5, 0);
  const auto handle = [this](const httplib::Request& request, httplib::Response& response) {
    const HttpResponse answer = api_.Handle(Convert(request));
    response.set_header("Cache-Control", "no-store");
    response.set_header("X-Content-Type-Options", "nosniff");
    response.set_header("Content-Security-Policy",
                        "default-src 'self'; img-src 'self' blob:; style-src 'self'");
    if (!answer.FrameStream) {
      response.status = answer.Status;
      response.set_content(answer.Body, answer.ContentType.c_str());
      return;
    }
    if (streams_.fetch_add(1) >= kMaximumStreams) {
      streams_.fetch_sub(1);
      response.status = 503;
      response.set_content("{\"ok\":false,\"error\":\"too many streams are open\"}",
                           "application/json");
      return;
    }
    auto serial = std::make_shared<std::uint64_t>(0);
    response.set_chunked_content_provider(
        std::string("multipart/x-mixed-replace; boundary=") + kBoundary,
        [this, serial](std::size_t, httplib::DataSink& sink) {
          if (!sink.is_writable()) return false;
          PublishedFrame frame;
          if (!engine_.WaitFrame(*serial, kStreamPoll, &frame)) return sink.is_writable();
          *serial = frame.Serial;
          const std::string head =
              std::string("--") + kBoundary + "\r\nContent-Type: image/jpeg\r\nContent-Length: " +
              std::to_string(frame.Jpeg.size()) + "\r\nX-Stats: " + frame.Stats + "\r\n\r\n";
          return sink.write(head.data(), head.size()) &&
                 sink.write(frame.Jpeg.data(), frame.Jpeg.size()) && sink.write("\r\n", 2);
        },
        [this](bool) { streams_.fetch_sub(1); });
  };
  server_->Get(".*", handle);
  server_->Post(".*", handle);
}

StudioServer::~StudioServer() = default;

int StudioServer::Bind(const std::string& host, int port, std::string* error) {
  const int bound = port == 0 ? server_->bind_to_any_port(host.c_str())
                              : (server_->bind_to_port(host.c_str(), port) ? port : -1);
  if (bound < 0) *error = "cannot listen on " + host + ":" + std::to_string(port);
  return bound;
}

void StudioServer::Serve() {
  server_->listen_after_bind();
}

void StudioServer::Stop() {
  server_->stop();
}

}  // namespace apestudio
